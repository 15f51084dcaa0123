#include "ZfCInternalCheck.h"

#include "ZfCCodeGenMessage.h"

void reportInternalError(const char* Module, int Place, const char* File) {
    if (ShowInternalInfo())
        ZfReportAssertion(File, Place, "0");
    ZfCCodeGenMessage::putCodeGenMessage10007(Module, Place);
}
