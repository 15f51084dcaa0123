#include "ZfCScaleTool.h"

#include "ZF_Scaling.h"
#include "ZfCLinearScaling.h" // has no source of its own, and a DLL holds only what a source sees

#include <cmath>

namespace {

bool isUsable(double Lsb) {
    return std::isfinite(Lsb) && Lsb != 0.0;
}

// The product goes through memory, so that no compiler fuses it with the sum: generated code rounds
// both.
double valueOfRaw(double Raw, double Lsb, double Offset) {
    volatile double Product = Raw * Lsb;
    return Product + Offset;
}

double represent(double Value, ZF_Scaling* pScaling, double (*ToRaw)(double)) {
    if (!pScaling || !std::isfinite(Value))
        return Value;
    const double Lsb = pScaling->getLsb();
    const double Offset = pScaling->getOffset();
    if (!isUsable(Lsb))
        return Value;
    return valueOfRaw(ToRaw((Value - Offset) / Lsb), Lsb, Offset);
}

} // namespace

double ZfCScaleTool::findRepresentedValue(double Value, ZF_Scaling* pScaling) {
    return represent(Value, pScaling, [](double Quotient) { return std::round(Quotient); });
}

double ZfCScaleTool::findRepresentedValueDontRound(double Value, ZF_Scaling* pScaling) {
    return represent(Value, pScaling, [](double Quotient) { return std::trunc(Quotient); });
}
