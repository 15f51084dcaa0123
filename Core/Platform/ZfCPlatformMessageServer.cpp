#include "ZfCPlatformMessageServer.h"

#include "ZfAssertionReport.h"
#include "ZfCMessageSink.h"

#include <cstdio>

namespace {

constexpr int s_SeverityCount = 8;

// Plain data, so that messages may be sent while static objects are made and destroyed.
struct tServerState {
    ZfCMessageSink* pSink;
    ZfCPlatformMessageServer::tAssertionHook pAssertionHook;
    bool IsInternalInfoShown;
    unsigned int Counts[s_SeverityCount];
};
tServerState s_State = {};

unsigned int* countOf(tagERR_error_severity_etp Severity) {
    const int Number = int(Severity);
    return Number >= 0 && Number < s_SeverityCount ? &s_State.Counts[Number] : nullptr;
}

const char* severityName(tagERR_error_severity_etp Severity) {
    switch (Severity) {
    case ERR_severity_info:
        return "info";
    case ERR_severity_notice:
        return "notice";
    case ERR_severity_error:
        return "error";
    case ERR_severity_fatal:
        return "fatal error";
    case ERR_severity_internal:
        return "internal";
    }
    return "message";
}

const char* textOf(const char* Text) {
    return Text ? Text : "";
}

void print(tagERR_error_severity_etp Severity, int Number, const ZfCSrcRef* pSrcRef,
           const char* Category, const char* Text) {
    if (pSrcRef && pSrcRef->getFile())
        std::fprintf(stderr, "%s:%d:%d: ", pSrcRef->getFile(), pSrcRef->getLine(),
                     pSrcRef->getColumn());
    std::fprintf(stderr, "%s %d (%s): %s\n", severityName(Severity), Number, textOf(Category),
                 textOf(Text));
}

bool deliver(tagERR_error_severity_etp Severity, int Number, const ZfCSrcRef* pSrcRef,
             const char* Category, const char* Text) {
    if (unsigned int* pCount = countOf(Severity))
        ++*pCount;
    if (s_State.pSink)
        s_State.pSink->receiveMessage(Severity, Number, pSrcRef, Category, Text);
    else
        print(Severity, Number, pSrcRef, Category, Text);
    return true;
}

} // namespace

ZfCMessageServer* ZfCMessageServer::getMessageServer() {
    static ZfCMessageServer s_Server;
    return &s_Server;
}

bool ZfCMessageServer::putMessage(tagERR_error_severity_etp Severity, int Number,
                                  const ZfCSrcRef* pSrcRef, const char* Category,
                                  const char* Text) {
    return deliver(Severity, Number, pSrcRef, Category, Text);
}

bool ZfCMessageServer::putInternalMessage(tagERR_error_severity_etp Severity, int Number,
                                          const ZfCSrcRef* pSrcRef, const char* Category,
                                          const char* Text) {
    return deliver(Severity, Number, pSrcRef, Category, Text);
}

bool ShowInternalInfo() {
    return s_State.IsInternalInfoShown;
}

void ZfReportAssertion(const char* File, int Line, const char* Condition) {
    if (s_State.pAssertionHook)
        s_State.pAssertionHook(File, Line, Condition);
    else
        std::fprintf(stderr, "%s:%d: assertion failed: %s\n", textOf(File), Line,
                     textOf(Condition));
}

ZfCMessageSink* ZfCPlatformMessageServer::setSink(ZfCMessageSink* pSink) {
    ZfCMessageSink* pFormer = s_State.pSink;
    s_State.pSink = pSink;
    return pFormer;
}

unsigned int ZfCPlatformMessageServer::getCount(tagERR_error_severity_etp Severity) {
    const unsigned int* pCount = countOf(Severity);
    return pCount ? *pCount : 0;
}

void ZfCPlatformMessageServer::resetCounts() {
    for (unsigned int& Count : s_State.Counts)
        Count = 0;
}

void ZfCPlatformMessageServer::setShowInternalInfo(bool IsShown) {
    s_State.IsInternalInfoShown = IsShown;
}

ZfCPlatformMessageServer::tAssertionHook
ZfCPlatformMessageServer::setAssertionHook(tAssertionHook pHook) {
    tAssertionHook pFormer = s_State.pAssertionHook;
    s_State.pAssertionHook = pHook;
    return pFormer;
}
