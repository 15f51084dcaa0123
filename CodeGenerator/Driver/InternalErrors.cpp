#include "Driver/InternalErrors.h"

#include "Driver/Options.h"
#include "LEDA/error.h"

#include <cstdio>
#include <cstdlib>

namespace hpn {

unsigned InternalErrors::s_Count = 0;

InternalErrors::InternalErrors(bool IsCheckWanted)
    : m_pFormerSink(ZfCPlatformMessageServer::setSink(this)),
      m_pFormerHook(ZfCPlatformMessageServer::setAssertionHook(&countAssertion)),
      m_pFormerHandler(leda::std_error_handler) {
    s_Count = 0;
    leda::std_error_handler = &endAfterLayerError;
    ZfCPlatformMessageServer::setShowInternalInfo(IsCheckWanted);
}

InternalErrors::~InternalErrors() {
    ZfCPlatformMessageServer::setShowInternalInfo(false);
    leda::std_error_handler = m_pFormerHandler;
    ZfCPlatformMessageServer::setAssertionHook(m_pFormerHook);
    ZfCPlatformMessageServer::setSink(m_pFormerSink);
}

void InternalErrors::receiveMessage(tagERR_error_severity_etp Severity, int,
                                    const ZfCSrcRef* pSource, const char*, const char* Text) {
    if (pSource != nullptr && pSource->getFile() != nullptr)
        std::fprintf(stderr, "%s:%d:%d: ", pSource->getFile(), pSource->getLine(),
                     pSource->getColumn());
    else
        std::fputs("hpncg: ", stderr);
    const bool IsBroken = Severity == ERR_severity_fatal;
    const char* Kind = IsBroken || Severity == ERR_severity_error ? "error" : "warning";
    std::fprintf(stderr, "%s: %s\n", Kind, Text);
    s_Count += IsBroken ? 1 : 0;
}

void InternalErrors::countAssertion(const char* File, int Line, const char* Condition) {
    std::fprintf(stderr, "hpncg: error: assertion failed at %s:%d: %s\n", File, Line, Condition);
    ++s_Count;
}

// A container was misused and would go on with a value that means nothing. No output file has been
// begun at this point, so the process can end at once.
void InternalErrors::endAfterLayerError(int Number, const char* Text) {
    std::fprintf(stderr, "hpncg: error: internal error %d: %s\n", Number, Text);
    std::fflush(nullptr);
    std::_Exit(ExitInternalError);
}

} // namespace hpn
