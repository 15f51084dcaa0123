#ifndef SECOND_ZFCMESSAGESERVER_H
#define SECOND_ZFCMESSAGESERVER_H

#include <cstdio>

enum tagERR_error_severity_etp {
    ERR_severity_info = 0,
    ERR_severity_notice = 1,
    ERR_severity_error = 2,
    ERR_severity_fatal = 3,
    ERR_severity_internal = 7
};

class ZfCSrcRef;

// Prints every message.
class ZfCMessageServer {
public:
    static ZfCMessageServer* getMessageServer() {
        static ZfCMessageServer s_Server;
        return &s_Server;
    }
    bool putMessage(tagERR_error_severity_etp Severity, int Number, const ZfCSrcRef*,
                    const char* Category, const char* Text) {
        return std::printf("message %d, %d, %s: %s\n", int(Severity), Number, Category, Text) > 0;
    }
    bool putInternalMessage(tagERR_error_severity_etp Severity, int Number, const ZfCSrcRef* pPlace,
                            const char* Category, const char* Text) {
        return putMessage(Severity, Number, pPlace, Category, Text);
    }
};

// The optimiser's own checks are always on here.
inline bool ShowInternalInfo() { return true; }

#endif
