#ifndef ZFCCODEGENMESSAGE_H
#define ZFCCODEGENMESSAGE_H

#include "HpnSSAExport.h"

class ZfCSrcRef;

// The general block of the code generator's message catalogue: one operation for each message,
// named by its number, which stays stable and is the key. The library itself sends number 10007
// only.
//
// Each operation formats the catalogue's text with its parameters, a null string standing as
// "_NULL_", hands it to the message server and gives the server's answer. A source reference goes
// to the server as it is and may be null. All share one buffer: a text that does not fit ends in "
// ..."; the operations are for one thread at a time.
class HPNSSA_EXPORT ZfCCodeGenMessage {
public:
    // The buffer of all messages, overwritten by each; 16384 bytes.
    static char* MSG_Buffer;

    static bool putCodeGenMessage10000(const char* Text1, const char* Text2);
    static bool putCodeGenMessage10001();
    static bool putCodeGenMessage10002(const char* Text, double Seconds);
    static bool putCodeGenMessage10003(const char* Text);
    static bool putCodeGenMessage10004(const char* Text1, const char* Text2);
    static bool putCodeGenMessage10005(const char* Text);
    static bool putCodeGenMessage10006(int Count);
    static bool putCodeGenMessage10007(const char* Module, int Place);
    static bool putCodeGenMessage10008(const ZfCSrcRef* pSrcRef, const char* Module, int Place);
    static bool putCodeGenMessage10011();
    static bool putCodeGenMessage10012(const ZfCSrcRef* pSrcRef, const char* Text);
    static bool putCodeGenMessage10013();
    static bool putCodeGenMessage10014();
    static bool putCodeGenMessage10015();
    static bool putCodeGenMessage10016();
    static bool putCodeGenMessage10017(const ZfCSrcRef* pSrcRef, const char* Text);
    static bool putCodeGenMessage10018();
    static bool putCodeGenMessage10020(const char* Text);
    static bool putCodeGenMessage10021();
    static bool putCodeGenMessage10022(const char* Text);
    static bool putCodeGenMessage10023();
    static bool putCodeGenMessage10024(const char* Text1, const char* Text2);
    static bool putCodeGenMessage10025();
    static bool putCodeGenMessage10026(const char* Text1, const char* Text2);
    static bool putCodeGenMessage10027(const char* Text1, const char* Text2, const char* Text3);
    static bool putCodeGenMessage10028(const char* Text);
    static bool putCodeGenMessage10029(const char* Text);
    static bool putCodeGenMessage10030();
    static bool putCodeGenMessage21652(const ZfCSrcRef* pSrcRef, const char* Text);
    static bool putCodeGenMessage32008(const ZfCSrcRef* pSrcRef, const char* Text);
    static bool putCodeGenMessage32118(const ZfCSrcRef* pSrcRef, const char* Text1,
                                       const char* Text2);
    static bool putCodeGenMessage32221(const ZfCSrcRef* pSrcRef, const char* Text1,
                                       const char* Text2, const char* Text3);
    static bool putCodeGenMessage32300(const ZfCSrcRef* pSrcRef, const char* Text);
    static bool putCodeGenMessage99066();
    static bool putCodeGenMessage99067();
    static bool putCodeGenMessage99068();
    static bool putCodeGenMessage99069();
};

#endif
