#include "Driver/Options.h"
#include "Driver/Session.h"

#include <exception>

// The driver of the reference client: program text in, optimised C out.
int main(int ArgumentCount, char** pArguments) {
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
