#ifndef ZFCMESSAGESERVER_H
#define ZFCMESSAGESERVER_H

#include "HpnPlatformExport.h"

// Severity of a message. Banners and file names come with the first, notices with the second,
// failures with the next two; the last marks messages that only development should ever see.
enum tagERR_error_severity_etp {
    ERR_severity_info = 0,
    ERR_severity_notice = 1,
    ERR_severity_error = 2,
    ERR_severity_fatal = 3,
    ERR_severity_internal = 7
};

// A place in a source, for a message that has one. The file name belongs to the caller and must
// outlive the object.
class ZfCSrcRef {
public:
    // Line and column count from 1; 0 means unknown.
    ZfCSrcRef(const char* pFile, int Line, int Column)
        : m_pFile(pFile), m_Line(Line), m_Column(Column) {}
    // What the constructor was given; a null file means that there is none.
    const char* getFile() const { return m_pFile; }
    int getLine() const { return m_Line; }
    int getColumn() const { return m_Column; }

private:
    const char* m_pFile; // null: no file
    int m_Line;
    int m_Column;
};

// The process-wide receiver of messages. What becomes of a message, and whether messages are
// counted, is the server's.
class HPNPLATFORM_EXPORT ZfCMessageServer {
public:
    // The one server; never null, and not the caller's to end.
    static ZfCMessageServer* getMessageServer();

    // Delivers a message: severity, number, source reference or null, category, text. Texts are
    // read before the call ends. True if the message was delivered.
    bool putMessage(tagERR_error_severity_etp Severity, int Number, const ZfCSrcRef* pSrcRef,
                    const char* Category, const char* Text);
    // The same for messages that are internal to development.
    bool putInternalMessage(tagERR_error_severity_etp Severity, int Number,
                            const ZfCSrcRef* pSrcRef, const char* Category, const char* Text);

private:
    ZfCMessageServer() = default;
};

// True while internal checks are to be active and visible.
HPNPLATFORM_EXPORT bool ShowInternalInfo();

#endif
