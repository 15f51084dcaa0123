#include "Driver/Options.h"
#include "Driver/Session.h"
#include "Graph/ProcessMemory.h"

#include <cstdio>
#include <cstdlib>
#include <exception>
#include <new>
#ifdef _WIN32
#include <fcntl.h>
#include <io.h>
#endif

namespace {

// The optimiser goes on with a null object where a block is missing, and code with holes would come
// out in the end. So the process ends before anybody sees the null; the output files are written at
// once when all is done, and none has been begun.
[[noreturn]] void endWithoutMemory() {
    std::fputs("hpncg: error: out of memory\n", stderr);
    std::_Exit(hpn::ExitInternalError);
}

// Program texts and C are the same bytes on every system: nothing makes two characters of the end
// of a line.
void setStreamsToBytes() {
#ifdef _WIN32
    _setmode(_fileno(stdin), _O_BINARY);
    _setmode(_fileno(stdout), _O_BINARY);
    _setmode(_fileno(stderr), _O_BINARY);
#endif
}

} // namespace

// The driver of the reference client: program text in, optimised C out.
int main(int ArgumentCount, char** pArguments) {
    std::set_new_handler(&endWithoutMemory);
    hpn::usePooledMemory();
    setStreamsToBytes();
    try {
        hpn::Options Wanted;
        hpn::ExitStatus Status = hpn::ExitDone;
        if (!hpn::parseOptions(ArgumentCount, pArguments, Wanted, Status))
            return Status;
        return hpn::runSession(Wanted);
    } catch (const std::exception& Failure) {
        hpn::reportWrongUse(std::string("internal error: ") + Failure.what());
        return hpn::ExitInternalError;
    }
}
