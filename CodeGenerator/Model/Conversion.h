#ifndef CONVERSION_H
#define CONVERSION_H

#include "Model/ValueRange.h"

#include <cstdint>

namespace hpn {

/// How a number becomes what a variable of a type holds: clip at saturating limits first; a clipped
/// number is final. Else a scaled type rounds to the nearest raw number (halves away from zero) and
/// wraps it to the storage, an integer type truncates and wraps, bool normalises to 0 and 1,
/// float32 rounds to single precision, and both floating types turn a negative zero into 0.0.
/// Total: NaN and numbers out of reach follow the truncation rules of the number model (out of
/// range of the intermediate integer: its smallest number). The intermediate integer has 32 bits
/// for signed types without scaling, else 64 (so a NaN in a scaled or unsigned type is raw 0).
/// Applying it twice changes nothing, with one exception: a type that saturates at one side only
/// wraps at the other, and the wrapped number can lie beyond the limit; a second conversion clips
/// it. See `isUpperClipStable`.
double convertNumber(double Number, const Type& To);
/// The range that the conversion gives for numbers out of a range; never too narrow.
ValueRange convertRange(const ValueRange& From, const Type& To);
/// All that the storage of a type can hold, limits disregarded (outside code may store anything).
ValueRange storageRange(const Type& Of);
/// Raw number that stands in the storage for a converted number (integer and bool types), and back.
std::int64_t rawOfNumber(double Number, const Type& Of);
double numberOfRaw(std::int64_t Raw, const Type& Of);
/// Smallest and greatest raw number of an integer storage (bool: 0 and 1).
std::int64_t smallestRaw(BaseType Base);
std::int64_t greatestRaw(BaseType Base);
bool isFloating(BaseType Base);
/// A scaling that changes anything: the least significant bit 1 with offset 0 counts as none, so
/// such a type truncates.
bool isScaled(const Type& Of);
/// No stored number can lie beyond the saturating limit at that side: converting a stored number
/// never clips it there. The optimiser sees only such limits, because it clips whatever it copies
/// from version to version.
bool isUpperClipStable(const Type& Of);
bool isLowerClipStable(const Type& Of);

} // namespace hpn

#endif
