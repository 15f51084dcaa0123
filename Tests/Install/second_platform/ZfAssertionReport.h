#ifndef SECOND_ZFASSERTIONREPORT_H
#define SECOND_ZFASSERTIONREPORT_H

#include <cstdio>

inline void ZfReportAssertion(const char* File, int Line, const char* Condition) {
    std::printf("%s:%d: does not hold: %s\n", File, Line, Condition);
}

#endif
