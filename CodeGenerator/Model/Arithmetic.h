#ifndef ARITHMETIC_H
#define ARITHMETIC_H

#include <cstdint>

namespace hpn {

// The roundings of the number model, shared by its arithmetic, its conversions and its ranges.

/// Toward zero to signed 32 bits; what does not fit, infinities and NaNs become the smallest
/// number.
std::int32_t truncateTo32(double Number);
/// Toward zero to signed 64 bits, with the same rule.
std::int64_t truncateTo64(double Number);

/// To the nearest number of single precision. The detour over memory is needed: two such
/// conversions side by side are vectorised by gcc 12 into none at all, so the numbers would stay in
/// double precision.
double roundToSingle(double Number);

// The two operators of double arithmetic that depart from the processor's.

/// A zero factor wins over infinities and NaNs, and gives the positive zero.
inline double multiply(double Left, double Right) {
    return Left == 0.0 || Right == 0.0 ? 0.0 : Left * Right;
}
/// A zero dividend wins over every divisor, zero included.
inline double divide(double Left, double Right) {
    return Left == 0.0 ? 0.0 : Left / Right;
}

} // namespace hpn

#endif
