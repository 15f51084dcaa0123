#ifndef ZFASSERTIONREPORT_H
#define ZFASSERTIONREPORT_H

#include "HpnPlatformExport.h"

// Reports to developers that a condition did not hold: file, line and the condition's text. It
// returns; the caller carries on. Callers test ShowInternalInfo() first, so that neither the
// condition nor the report costs anything in the field.
HPNPLATFORM_EXPORT void ZfReportAssertion(const char* File, int Line, const char* Condition);

#endif
