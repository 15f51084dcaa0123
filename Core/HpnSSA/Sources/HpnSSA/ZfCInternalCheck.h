#ifndef ZFCINTERNALCHECK_H
#define ZFCINTERNALCHECK_H

#include "HpnSSAExport.h"
#include "ZfAssertionReport.h"
#include "ZfCMessageServer.h"

// The two strengths in which the library reports a broken state of its own. Both report and go on:
// neither ends the run, so the code behind a check must live with what it has.
//
// An assertion speaks to developers. Its condition is evaluated only while ShowInternalInfo()
// answers true, so a costly check costs a user nothing. The text that is reported is a fixed part
// of the report; where the expression in the code is not that text, ZF_ASSERT_TEXT takes both.
//
// An internal error speaks to the user as well: message 10007 goes out in every run.
#define ZF_ASSERT_TEXT(Condition, Text)                                                            \
    do {                                                                                           \
        if (ShowInternalInfo() && !(Condition))                                                    \
            ZfReportAssertion(__FILE__, __LINE__, Text);                                           \
    } while (false)

#define ZF_ASSERT(Condition) ZF_ASSERT_TEXT(Condition, #Condition)

// The unreachable place that only developers hear of.
#define ZF_ASSERT_UNREACHABLE() ZF_ASSERT_TEXT(false, "0")

// Reports a place that must not be reached: the assertion "0" while internal info is on, and
// message 10007 in every case. Module is the name of the class in which the place lies, Place its
// source line, which the user is shown as the error code. Called as
// reportInternalError("ZfCBasicBlock", __LINE__); File is filled in by the compiler.
HPNSSA_EXPORT void reportInternalError(const char* Module, int Place,
                                       const char* File = __builtin_FILE());

#endif
