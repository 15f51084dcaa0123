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

    // Info: the banner; Text1 is the name of the product, Text2 its version.
    static bool putCodeGenMessage10000(const char* Text1, const char* Text2);
    // Info: the line of copyright.
    static bool putCodeGenMessage10001();
    // Info: the step Text took so many seconds.
    static bool putCodeGenMessage10002(const char* Text, double Seconds);
    // Info: the name of the target.
    static bool putCodeGenMessage10003(const char* Text);
    // Info: two texts of the caller's, with a blank in between.
    static bool putCodeGenMessage10004(const char* Text1, const char* Text2);
    // Info: the name of the output file.
    static bool putCodeGenMessage10005(const char* Text);
    // Fatal: there were more errors than Count.
    static bool putCodeGenMessage10006(int Count);
    // Fatal: an internal error; Module is the class it was met in and Place the source line.
    static bool putCodeGenMessage10007(const char* Module, int Place);
    // Fatal: the same at a place in the user's source.
    static bool putCodeGenMessage10008(const ZfCSrcRef* pSrcRef, const char* Module, int Place);
    // Fatal: the intermediate code could not be converted; earlier messages tell why.
    static bool putCodeGenMessage10011();
    // Error: an exception ended the conversion of the intermediate code; Text is what it says.
    static bool putCodeGenMessage10012(const ZfCSrcRef* pSrcRef, const char* Text);
    // Error: the model could not be read.
    static bool putCodeGenMessage10013();
    // Error: code generation failed.
    static bool putCodeGenMessage10014();
    // Error: optimisation failed.
    static bool putCodeGenMessage10015();
    // Error: the analysis of the model failed.
    static bool putCodeGenMessage10016();
    // Fatal: what Text names could not be made.
    static bool putCodeGenMessage10017(const ZfCSrcRef* pSrcRef, const char* Text);
    // Error: inlining of functions failed.
    static bool putCodeGenMessage10018();
    // Fatal: an exception of the container layer; Text is what it says.
    static bool putCodeGenMessage10020(const char* Text);
    // Error: the analysis of connections failed.
    static bool putCodeGenMessage10021();
    // Error: an exception was raised; Text is what it says.
    static bool putCodeGenMessage10022(const char* Text);
    // Error: the propagation of scalings failed.
    static bool putCodeGenMessage10023();
    // Error: the option Text1 has the value Text2, which prototyping does not allow.
    static bool putCodeGenMessage10024(const char* Text1, const char* Text2);
    // Fatal: merging failed.
    static bool putCodeGenMessage10025();
    // Error: the option Text1 has the value Text2, which production code does not allow.
    static bool putCodeGenMessage10026(const char* Text1, const char* Text2);
    // Error: the DLL Text1 has version Text2, and Text3 was expected.
    static bool putCodeGenMessage10027(const char* Text1, const char* Text2, const char* Text3);
    // Notice: the DLL is a hotfix.
    static bool putCodeGenMessage10028(const char* Text);
    // Error: the DLL is a prerelease.
    static bool putCodeGenMessage10029(const char* Text);
    // Error: the versions of the DLLs could not be checked.
    static bool putCodeGenMessage10030();
    // Error of the category "Extract Bits Block Messages": the range of bits is not valid; Text
    // tells why.
    static bool putCodeGenMessage21652(const ZfCSrcRef* pSrcRef, const char* Text);
    // Error of the category "AUTOSAR Messages": the data dictionary lacks the function class Text.
    static bool putCodeGenMessage32008(const ZfCSrcRef* pSrcRef, const char* Text);
    // Error of the category "Code Generation from DD": function Text1 is to go into module Text2,
    // which is generated from the data dictionary.
    static bool putCodeGenMessage32118(const ZfCSrcRef* pSrcRef, const char* Text1,
                                       const char* Text2);
    // Error of the category "Variable Vector Widths Messages": Text1 is the block, Text2 the Mux
    // block that combines their lines, Text3 the property in which their variables differ.
    static bool putCodeGenMessage32221(const ZfCSrcRef* pSrcRef, const char* Text1,
                                       const char* Text2, const char* Text3);
    // Notice of the category "RTOS Messages": the EmitFile property is ignored because of the
    // function template Text.
    static bool putCodeGenMessage32300(const ZfCSrcRef* pSrcRef, const char* Text);
    // Fatal, of the category "Internal Messages" as the next three: the test passed.
    static bool putCodeGenMessage99066();
    // Fatal: the test was ended by earlier fatal errors.
    static bool putCodeGenMessage99067();
    // Internal to development: test code was called in a release.
    static bool putCodeGenMessage99068();
    // Fatal: there is no file with test options.
    static bool putCodeGenMessage99069();
};

#endif
