#ifndef ZFCLINEARSCALING_H
#define ZFCLINEARSCALING_H

#include "ZF_Scaling.h"

// Ready-made scaling: value = stored integer * lsb + offset.
class HPNPLATFORM_EXPORT ZfCLinearScaling : public ZF_Scaling {
public:
    // Lsb should be finite and not 0; what holds otherwise is said at ZfCScaleTool.
    ZfCLinearScaling(double Lsb, double Offset) : m_Lsb(Lsb), m_Offset(Offset) {}
    // As given to the constructor.
    double getLsb() override { return m_Lsb; }
    double getOffset() override { return m_Offset; }

private:
    double m_Lsb;
    double m_Offset;
};

#endif
