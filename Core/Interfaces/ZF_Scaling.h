#ifndef ZF_SCALING_H
#define ZF_SCALING_H

#include "HpnPlatformExport.h"

// Linear scaling of a fixed-point variable: the value is the stored integer times the least
// significant bit plus the offset.
class HPNPLATFORM_EXPORT ZF_Scaling {
public:
    virtual ~ZF_Scaling() = default;
    // The value of one unit of the stored integer; finite and not 0, else the scaling changes
    // nothing.
    virtual double getLsb() = 0;
    // The value of the stored integer 0.
    virtual double getOffset() = 0;
};

#endif
