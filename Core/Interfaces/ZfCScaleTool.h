#ifndef ZFCSCALETOOL_H
#define ZFCSCALETOOL_H

#include "HpnPlatformExport.h"

class ZF_Scaling;

// What a scaled variable can hold of a number. With the quotient q = (Value - offset) / lsb the
// result is raw * lsb + offset, where raw is q rounded to the nearest integer, halves away from
// zero, or q with its fraction cut off. Each operation of the formula is rounded to double on its
// own, in this order: generated code that repeats it gets the same bits. A NaN or an infinity, a
// null scaling, and an lsb of 0 or one that is not finite give the value back as it is.
class HPNPLATFORM_EXPORT ZfCScaleTool {
public:
    // The number on the grid of the scaling that is nearest to Value.
    static double findRepresentedValue(double Value, ZF_Scaling* pScaling);
    // The one next to Value on the side of the stored integer 0.
    static double findRepresentedValueDontRound(double Value, ZF_Scaling* pScaling);
};

#endif
