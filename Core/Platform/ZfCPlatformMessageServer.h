#ifndef ZFCPLATFORMMESSAGESERVER_H
#define ZFCPLATFORMMESSAGESERVER_H

#include "ZfCMessageServer.h"

class ZfCMessageSink;

// The client's side of this platform's message server: where messages go, how many there were, and
// what developers see.
//
// Every delivered message is counted by its severity. It goes to the sink, if there is one, else as
// one line to the error stream. No severity ends the run. The state is the process's; it needs no
// start and no end.
class HPNPLATFORM_EXPORT ZfCPlatformMessageServer {
public:
    // Takes the place of the error stream for ZfReportAssertion. It returns to the caller.
    using tAssertionHook = void (*)(const char* File, int Line, const char* Condition);

    // Takes messages to the given sink, which must stay until it is replaced; null: to the error
    // stream. Answers the former.
    static ZfCMessageSink* setSink(ZfCMessageSink* pSink);
    // Messages delivered with this severity since the start or the last resetCounts.
    static unsigned int getCount(tagERR_error_severity_etp Severity);
    // All counts are 0 again.
    static void resetCounts();

    // What ShowInternalInfo answers; false at first.
    static void setShowInternalInfo(bool IsShown);
    // Gives assertion reports to this function in place of the error stream; null: back to that.
    // Answers the former.
    static tAssertionHook setAssertionHook(tAssertionHook pHook);
};

#endif
