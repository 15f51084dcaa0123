#ifndef SECOND_ZFCSCALETOOL_H
#define SECOND_ZFCSCALETOOL_H

#include "ZF_Scaling.h"

#include <cmath>

class ZfCScaleTool {
public:
    static double findRepresentedValue(double Value, ZF_Scaling*) { return std::round(Value); }
    static double findRepresentedValueDontRound(double Value, ZF_Scaling*) {
        return std::trunc(Value);
    }
};

#endif
