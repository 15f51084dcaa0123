#ifndef ZFCMESSAGESINK_H
#define ZFCMESSAGESINK_H

#include "ZfCMessageServer.h"

// Where a client takes the messages from, once it has given its sink to ZfCPlatformMessageServer.
// The client owns it.
class HPNPLATFORM_EXPORT ZfCMessageSink {
public:
    virtual ~ZfCMessageSink() = default;
    // One message; the source reference may be null, the texts hold during the call only.
    virtual void receiveMessage(tagERR_error_severity_etp Severity, int Number,
                                const ZfCSrcRef* pSrcRef, const char* Category,
                                const char* Text) = 0;
};

#endif
