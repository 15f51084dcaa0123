#include "ZfCCodeGenMessage.h"

#include <cstdarg>
#include <cstdio>
#include <cstring>

#include "ZfCMessageServer.h"

namespace {

constexpr std::size_t BufferSize = 16384;

char Buffer[BufferSize];

constexpr const char* General = "General Messages";

// The severities of the catalogue.
constexpr auto Severity0 = static_cast<tagERR_error_severity_etp>(0);
constexpr auto Severity1 = static_cast<tagERR_error_severity_etp>(1);
constexpr auto Severity2 = static_cast<tagERR_error_severity_etp>(2);
constexpr auto Severity3 = static_cast<tagERR_error_severity_etp>(3);
constexpr auto Severity7 = static_cast<tagERR_error_severity_etp>(7);

#if defined(__GNUC__)
#define CHECKED_FORMAT(Format, First) __attribute__((format(printf, Format, First)))
#else
#define CHECKED_FORMAT(Format, First)
#endif

const char* orNull(const char* Text) {
    return Text != nullptr ? Text : "_NULL_";
}

// Formats into the buffer; a text that was cut gets the ending that tells so.
void format(const char* Format, std::va_list Arguments) {
    char* const Target = ZfCCodeGenMessage::MSG_Buffer;
    const int Length = std::vsnprintf(Target, BufferSize, Format, Arguments);
    if (Length < 0 || static_cast<std::size_t>(Length) >= BufferSize)
        std::memcpy(Target + BufferSize - 5, " ...", 5);
}

CHECKED_FORMAT(5, 6)
bool put(tagERR_error_severity_etp Severity, int Number, const ZfCSrcRef* pSrcRef,
         const char* Category, const char* Format, ...) {
    std::va_list Arguments;
    va_start(Arguments, Format);
    format(Format, Arguments);
    va_end(Arguments);
    return ZfCMessageServer::getMessageServer()->putMessage(Severity, Number, pSrcRef, Category,
                                                            ZfCCodeGenMessage::MSG_Buffer);
}

// The same for a message that is internal to development.
CHECKED_FORMAT(5, 6)
bool putInternal(tagERR_error_severity_etp Severity, int Number, const ZfCSrcRef* pSrcRef,
                 const char* Category, const char* Format, ...) {
    std::va_list Arguments;
    va_start(Arguments, Format);
    format(Format, Arguments);
    va_end(Arguments);
    return ZfCMessageServer::getMessageServer()->putInternalMessage(
        Severity, Number, pSrcRef, Category, ZfCCodeGenMessage::MSG_Buffer);
}

} // namespace

char* ZfCCodeGenMessage::MSG_Buffer = Buffer;

bool ZfCCodeGenMessage::putCodeGenMessage10000(const char* Text1, const char* Text2) {
    return put(Severity0, 10000, nullptr, General, "%s Production Code Generator Version %s",
               orNull(Text1), orNull(Text2));
}

bool ZfCCodeGenMessage::putCodeGenMessage10001() {
    return put(Severity0, 10001, nullptr, General,
               "HpnSSA Production Code Generator. Copyright by its authors. All rights reserved.");
}

bool ZfCCodeGenMessage::putCodeGenMessage10002(const char* Text, double Seconds) {
    return put(Severity0, 10002, nullptr, General, "%-30s in %7.3g seconds.", orNull(Text),
               Seconds);
}

bool ZfCCodeGenMessage::putCodeGenMessage10003(const char* Text) {
    return put(Severity0, 10003, nullptr, General, "Target name : %s", orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage10004(const char* Text1, const char* Text2) {
    return put(Severity0, 10004, nullptr, General, "%s %s", orNull(Text1), orNull(Text2));
}

bool ZfCCodeGenMessage::putCodeGenMessage10005(const char* Text) {
    return put(Severity0, 10005, nullptr, General, "Output file name : %s", orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage10006(int Count) {
    return put(Severity3, 10006, nullptr, General, "Error count exceeds %d.", Count);
}

bool ZfCCodeGenMessage::putCodeGenMessage10007(const char* Module, int Place) {
    return put(Severity3, 10007, nullptr, General,
               "Internal error. Error code: %s %d. Contact Orvane's technical support team.",
               orNull(Module), Place);
}

bool ZfCCodeGenMessage::putCodeGenMessage10008(const ZfCSrcRef* pSrcRef, const char* Module,
                                               int Place) {
    return put(Severity3, 10008, pSrcRef, General,
               "Internal error. Error code: %s %d. Contact Orvane's technical support team.",
               orNull(Module), Place);
}

bool ZfCCodeGenMessage::putCodeGenMessage10011() {
    return put(Severity3, 10011, nullptr, General,
               "Problem in intermediate code conversion made code generation impossible. Refer to "
               "the preceding messages.");
}

bool ZfCCodeGenMessage::putCodeGenMessage10012(const ZfCSrcRef* pSrcRef, const char* Text) {
    return put(
        Severity2, 10012, pSrcRef, General,
        "Internal exception in intermediate code conversion made code generation impossible. %s.",
        orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage10013() {
    return put(Severity2, 10013, nullptr, General,
               "Could not read the model. Check the error messages above for further details.");
}

bool ZfCCodeGenMessage::putCodeGenMessage10014() {
    return put(
        Severity2, 10014, nullptr, General,
        "The code generation process failed. Check the error messages above for further details.");
}

bool ZfCCodeGenMessage::putCodeGenMessage10015() {
    return put(Severity2, 10015, nullptr, General, "The code optimization process failed.");
}

bool ZfCCodeGenMessage::putCodeGenMessage10016() {
    return put(Severity2, 10016, nullptr, General,
               "The model analysis failed. Check the error messages above for further details.");
}

bool ZfCCodeGenMessage::putCodeGenMessage10017(const ZfCSrcRef* pSrcRef, const char* Text) {
    return put(Severity3, 10017, pSrcRef, General,
               "Could not create %s. Check the error messages above for further details.",
               orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage10018() {
    return put(Severity2, 10018, nullptr, General,
               "The function inlining process failed. Check the error messages above for further "
               "details.");
}

bool ZfCCodeGenMessage::putCodeGenMessage10020(const char* Text) {
    return put(Severity3, 10020, nullptr, General,
               "An internal error (LEDA exception: %s) has occurred.", orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage10021() {
    return put(Severity2, 10021, nullptr, General,
               "Connection analysis failed. See the error messages above for further details.");
}

bool ZfCCodeGenMessage::putCodeGenMessage10022(const char* Text) {
    return put(Severity2, 10022, nullptr, General, "Raised exception: %s", orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage10023() {
    return put(Severity2, 10023, nullptr, General,
               "Scale propagation failed. See the error messages above for further details.");
}

bool ZfCCodeGenMessage::putCodeGenMessage10024(const char* Text1, const char* Text2) {
    return put(Severity2, 10024, nullptr, General,
               "On the RTOS page of the Lumora Main Dialog the option '%s' is set to '%s'. This is "
               "invalid for the Prototyping Mode.",
               orNull(Text1), orNull(Text2));
}

bool ZfCCodeGenMessage::putCodeGenMessage10025() {
    return put(Severity3, 10025, nullptr, General,
               "Merge mechanism failed. See the error messages above for further details.");
}

bool ZfCCodeGenMessage::putCodeGenMessage10026(const char* Text1, const char* Text2) {
    return put(Severity2, 10026, nullptr, General,
               "On the RTOS page of the Lumora Main Dialog the option '%s' is set to '%s'. This is "
               "invalid for the production code generation.",
               orNull(Text1), orNull(Text2));
}

bool ZfCCodeGenMessage::putCodeGenMessage10027(const char* Text1, const char* Text2,
                                               const char* Text3) {
    return put(Severity2, 10027, nullptr, General,
               "The DLL %s has version %s, but version %s was expected.", orNull(Text1),
               orNull(Text2), orNull(Text3));
}

bool ZfCCodeGenMessage::putCodeGenMessage10028(const char* Text) {
    return put(Severity1, 10028, nullptr, General, "The DLL %s is a hotfix version.", orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage10029(const char* Text) {
    return put(Severity2, 10029, nullptr, General, "The DLL %s is a prerelease version.",
               orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage10030() {
    return put(Severity2, 10030, nullptr, General, "The DLL versions could not be validated.");
}

bool ZfCCodeGenMessage::putCodeGenMessage21652(const ZfCSrcRef* pSrcRef, const char* Text) {
    return put(Severity2, 21652, pSrcRef, "Extract Bits Block Messages",
               "Validation of range to be extracted has failed. %s", orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage32008(const ZfCSrcRef* pSrcRef, const char* Text) {
    return put(Severity2, 32008, pSrcRef, "AUTOSAR Messages",
               "Function class %s is needed for AUTOSAR code generation but is not available in "
               "Data Dictionary.",
               orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage32118(const ZfCSrcRef* pSrcRef, const char* Text1,
                                               const char* Text2) {
    return put(Severity2, 32118, pSrcRef, "Code Generation from DD",
               "Function %s is specified to be generated into module %s whose CodeGenerationBasis "
               "property is set to DDBased.",
               orNull(Text1), orNull(Text2));
}

bool ZfCCodeGenMessage::putCodeGenMessage32221(const ZfCSrcRef* pSrcRef, const char* Text1,
                                               const char* Text2, const char* Text3) {
    return put(Severity2, 32221, pSrcRef, "Variable Vector Widths Messages",
               "The block is specified with variable vector width, and its signal line is combined "
               "with a signal line of block '%s' by Mux block '%s'. This is currently not "
               "supported, because the blocks' output variables differ in property '%s'.",
               orNull(Text1), orNull(Text2), orNull(Text3));
}

bool ZfCCodeGenMessage::putCodeGenMessage32300(const ZfCSrcRef* pSrcRef, const char* Text) {
    return put(Severity1, 32300, pSrcRef, "RTOS Messages",
               "At least one FileSpecification object of the module has EmitFile set to 'on' and "
               "is referenced by RTOS function template %s. The EmitFile property is ignored.",
               orNull(Text));
}

bool ZfCCodeGenMessage::putCodeGenMessage99066() {
    return put(Severity3, 99066, nullptr, "Internal Messages",
               "The test was successful without any errors.");
}

bool ZfCCodeGenMessage::putCodeGenMessage99067() {
    return put(Severity3, 99067, nullptr, "Internal Messages",
               "Test aborted because of one or more fatal errors. See messages above.");
}

bool ZfCCodeGenMessage::putCodeGenMessage99068() {
    return putInternal(Severity7, 99068, nullptr, "Internal Messages",
                       "Illegal call of test code in release.");
}

bool ZfCCodeGenMessage::putCodeGenMessage99069() {
    return put(Severity3, 99069, nullptr, "Internal Messages", "File with test options not found.");
}
