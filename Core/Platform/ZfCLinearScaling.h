#ifndef ZFCLINEARSCALING_H
#define ZFCLINEARSCALING_H

#include "ZF_Scaling.h"

// Ready-made scaling: value = stored integer * lsb + offset.
class HPNPLATFORM_EXPORT ZfCLinearScaling : public ZF_Scaling {
public:
    ZfCLinearScaling(double Lsb, double Offset) : m_Lsb(Lsb), m_Offset(Offset) {}
    double getLsb() override { return m_Lsb; }
    double getOffset() override { return m_Offset; }

private:
    double m_Lsb;
    double m_Offset;
};

#endif
