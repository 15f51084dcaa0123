#ifndef EXACTNUMBERS_H
#define EXACTNUMBERS_H

#include "Language/Program.h"

namespace hpn::proof {

// The number model once more, written to judge the client's: a finite double is a whole number of
// 128 bits times a power of two, operators work on these whole numbers without any loss, and the
// one rounding that the model asks for is done at the end. No floating-point instruction computes
// anything here. Meant for small domains: operands are finite, and their magnitudes lie within
// about 2^60 of each other; results may be infinite.

/// What the operator gives for an operand that is no NaN.
double judgeUnary(Operator Op, double Operand);
/// What the operator gives for two finite operands.
double judgeBinary(Operator Op, double Left, double Right);
/// What a variable of the type holds after the number, which may be infinite, was stored in it.
double judgeStore(double Number, const Type& To);
/// Exactly `Raw * Lsb + Offset`, both steps rounded as the model says.
double judgeGrid(int Raw, double Lsb, double Offset);

} // namespace hpn::proof

#endif
