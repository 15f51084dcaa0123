#include "Model/Conversion.h"

#include "Model/Arithmetic.h"

#include <algorithm>
#include <cmath>
#include <limits>

// A conversion is a clip, then a monotone step from the number to a whole raw number (truncation,
// or rounding to the grid), then a wrap. Each of these steps is done in IEEE arithmetic, whose
// rounding is monotone: of two numbers the smaller never converts to the greater raw number before
// the wrap. That is why the ends of a range, converted like numbers, are the exact ends of what its
// numbers convert to, as long as nothing wraps between them.

namespace hpn {

namespace {

constexpr double Infinity = std::numeric_limits<double>::infinity();

unsigned bitsOf(BaseType Base) {
    switch (Base) {
    case BaseType::Bool:
        return 1;
    case BaseType::Int8:
    case BaseType::UInt8:
        return 8;
    case BaseType::Int16:
    case BaseType::UInt16:
        return 16;
    default:
        return 32;
    }
}

bool isSigned(BaseType Base) {
    return Base == BaseType::Int8 || Base == BaseType::Int16 || Base == BaseType::Int32;
}

/// Keeps the low bits of a raw number as the storage does.
std::int64_t wrapRaw(std::int64_t Raw, BaseType Base) {
    const unsigned Bits = bitsOf(Base);
    const std::uint64_t Mask = (std::uint64_t{1} << Bits) - 1;
    const auto Low = static_cast<std::int64_t>(static_cast<std::uint64_t>(Raw) & Mask);
    if (isSigned(Base) && Low > greatestRaw(Base))
        return Low - (std::int64_t{1} << Bits);
    return Low;
}

/// The whole number, still as a double, that a number steps to before it is wrapped.
double stepToWhole(double Number, const Type& To) {
    return isScaled(To) ? std::round((Number - To.Offset) / To.Lsb) : std::trunc(Number);
}

/// Signed types without scaling go through 32 bits, all others through 64.
bool goesThrough32(const Type& To) {
    return isSigned(To.Base) && !isScaled(To);
}

std::int64_t rawOfWhole(double Whole, const Type& To) {
    return wrapRaw(goesThrough32(To) ? truncateTo32(Whole) : truncateTo64(Whole), To.Base);
}

double convertInStorage(double Number, const Type& To) {
    switch (To.Base) {
    case BaseType::Float64:
        return Number + 0.0; // the sum of -0.0 and 0.0 is 0.0
    case BaseType::Float32:
        return roundToSingle(Number) + 0.0;
    case BaseType::Bool:
        return Number != 0.0 ? 1.0 : 0.0;
    default:
        return numberOfRaw(rawOfWhole(stepToWhole(Number, To), To), To);
    }
}

ValueRange interval(double Low, double High, bool IsIntegral) {
    ValueRange Result;
    Result.Low = Low + 0.0;
    Result.High = High + 0.0;
    const bool IsWholeNumber = Low == High && std::trunc(Low) == Low;
    Result.IsIntegral = (IsIntegral || IsWholeNumber) && Low > -Infinity && High < Infinity;
    return Result;
}

ValueRange emptyRange() {
    ValueRange Result;
    Result.Low = Infinity;
    Result.High = -Infinity;
    Result.IsIntegral = true;
    return Result;
}

/// The distance from zero of the grid's number nearest to it, zero itself aside.
double leastOnGrid(const Type& Of) {
    if (Of.Offset == 0.0)
        return Of.Lsb;
    const auto Nearest = static_cast<std::int64_t>(std::trunc(-Of.Offset / Of.Lsb));
    double Least = Infinity;
    for (std::int64_t Raw = Nearest - 1; Raw <= Nearest + 1; ++Raw) {
        const double Distance = std::fabs(numberOfRaw(Raw, Of));
        Least = Distance > 0.0 ? std::min(Least, Distance) : Least;
    }
    return Least;
}

/// The grid is one that doubles hit exactly: its numbers are multiples of a small power of two.
bool isExactGrid(const Type& Of) {
    constexpr double UnitsPerOne = 1048576.0;
    const double Step = Of.Lsb * UnitsPerOne;
    const double Start = Of.Offset * UnitsPerOne;
    return std::trunc(Step) == Step && std::trunc(Start) == Start;
}

/// Numbers of an interval of raw numbers that lies in the storage.
ValueRange intervalOfRaws(std::int64_t Low, std::int64_t High, const Type& Of) {
    if (!isScaled(Of))
        return interval(numberOfRaw(Low, Of), numberOfRaw(High, Of), true);
    const bool IsWholeGrid = std::trunc(Of.Lsb) == Of.Lsb && std::trunc(Of.Offset) == Of.Offset;
    ValueRange Result = interval(numberOfRaw(Low, Of), numberOfRaw(High, Of), IsWholeGrid);
    if (isExactGrid(Of))
        setStep(Result, Of.Lsb);
    else
        Result.Least = leastOnGrid(Of);
    return Result;
}

/// The step of what a range with a grid becomes in raw numbers, before they wrap; 1 if it is finer
/// or unknown.
std::int64_t stepInRaws(const ValueRange& From, const Type& To) {
    const double Step = From.Step > 0.0 ? From.Step : From.IsIntegral ? 1.0 : 0.0;
    if (!isScaled(To))
        return Step >= 1.0 && From.IsIntegral ? static_cast<std::int64_t>(Step) : 1;
    const double Steps = Step / To.Lsb;
    const double First = (From.Low - To.Offset) / To.Lsb;
    const bool IsOnGrid = isExactGrid(To) && std::trunc(First) == First &&
                          std::fabs(From.Low) < 4294967296.0 && std::fabs(From.High) < 4294967296.0;
    return IsOnGrid && Steps >= 1.0 && std::trunc(Steps) == Steps && Steps < 4294967296.0
               ? static_cast<std::int64_t>(Steps)
               : 1;
}

/// Wraps an interval of raw numbers: the storage is a window that slides over it.
Residues wrapInterval(std::int64_t Low, std::int64_t High, std::int64_t Step, BaseType Base) {
    const std::int64_t First = smallestRaw(Base);
    const std::int64_t Last = greatestRaw(Base);
    if (Low >= First && High <= Last)
        return {Low, High};
    const std::int64_t Period = std::int64_t{1} << bitsOf(Base);
    // The width can exceed the signed range.
    const std::uint64_t Width = static_cast<std::uint64_t>(High) - static_cast<std::uint64_t>(Low);
    if (Step == 1 && Width >= static_cast<std::uint64_t>(Period))
        return {First, Last};
    const Residues Wrapped = residuesOf(Low % Period - First, Width, Step, Period);
    return {Wrapped.Low + First, Wrapped.High + First};
}

/// Numbers of a range to an integer storage: those in reach of the intermediate integer wrap, those
/// out of reach all become its smallest number.
ValueRange convertToInteger(const ValueRange& From, const Type& To) {
    const double WholeLow = stepToWhole(From.Low, To);
    const double WholeHigh = stepToWhole(From.High, To);
    const double Smallest = goesThrough32(To) ? -2147483648.0 : -9223372036854775808.0;
    const double Greatest = goesThrough32(To) ? 2147483647.0 : 9223372036854774784.0;
    const bool IsLost = WholeLow < Smallest || WholeHigh > Greatest;
    const std::int64_t Lost = rawOfWhole(-Infinity, To);
    if (!(WholeLow <= Greatest && WholeHigh >= Smallest))
        return intervalOfRaws(Lost, Lost, To);
    const Residues Wrapped = wrapInterval(static_cast<std::int64_t>(std::max(WholeLow, Smallest)),
                                          static_cast<std::int64_t>(std::min(WholeHigh, Greatest)),
                                          IsLost ? 1 : stepInRaws(From, To), To.Base);
    if (IsLost && !isScaled(To))
        return intervalOfRaws(std::min(Wrapped.Low, Lost), std::max(Wrapped.High, Lost), To);
    const ValueRange Result = intervalOfRaws(Wrapped.Low, Wrapped.High, To);
    return IsLost ? hull(Result, intervalOfRaws(Lost, Lost, To)) : Result;
}

ValueRange convertToBool(const ValueRange& From) {
    if (From.Low == 0.0 && From.High == 0.0)
        return rangeOfNumber(0.0);
    return cutRange(From, 0.0, 0.0).isEmpty() ? rangeOfNumber(1.0) : interval(0.0, 1.0, true);
}

ValueRange convertIntervalInStorage(const ValueRange& From, const Type& To) {
    switch (To.Base) {
    case BaseType::Float64: {
        ValueRange Result = From;
        Result.MayBeNaN = false;
        Result.MayBeNegativeZero = false;
        return Result;
    }
    case BaseType::Float32:
        return interval(roundToSingle(From.Low), roundToSingle(From.High), From.IsIntegral);
    case BaseType::Bool:
        return convertToBool(From);
    default:
        return convertToInteger(From, To);
    }
}

} // namespace

bool isFloating(BaseType Base) {
    return Base == BaseType::Float32 || Base == BaseType::Float64;
}

bool isScaled(const Type& Of) {
    return Of.IsScaled && (Of.Lsb != 1.0 || Of.Offset != 0.0);
}

std::int64_t smallestRaw(BaseType Base) {
    return isSigned(Base) ? -(std::int64_t{1} << (bitsOf(Base) - 1)) : 0;
}

std::int64_t greatestRaw(BaseType Base) {
    return (std::int64_t{1} << (bitsOf(Base) - (isSigned(Base) ? 1 : 0))) - 1;
}

double numberOfRaw(std::int64_t Raw, const Type& Of) {
    const auto Number = static_cast<double>(Raw);
    return isScaled(Of) ? Number * Of.Lsb + Of.Offset : Number;
}

std::int64_t rawOfNumber(double Number, const Type& Of) {
    return truncateTo64(stepToWhole(Number, Of));
}

double convertNumber(double Number, const Type& To) {
    if (To.SaturatesHigh && Number > To.Upper)
        return To.Upper + 0.0;
    if (To.SaturatesLow && To.Lower > Number)
        return To.Lower + 0.0;
    return convertInStorage(Number, To);
}

/// The common case: numbers that an integer type without scaling holds all, fractions aside, so
/// that nothing clips and nothing wraps.
static bool convertHeldRange(const ValueRange& From, const Type& To, ValueRange& Result) {
    if (isFloating(To.Base) || To.Base == BaseType::Bool || isScaled(To) || From.MayBeNaN ||
        From.isEmpty() || (To.SaturatesHigh && From.High > To.Upper) ||
        (To.SaturatesLow && From.Low < To.Lower))
        return false;
    const auto Smallest = static_cast<double>(smallestRaw(To.Base));
    const auto Greatest = static_cast<double>(greatestRaw(To.Base));
    if (From.Low < Smallest || From.High > Greatest)
        return false;
    Result = interval(static_cast<double>(static_cast<std::int64_t>(From.Low)),
                      static_cast<double>(static_cast<std::int64_t>(From.High)), true);
    return true;
}

ValueRange convertRange(const ValueRange& From, const Type& To) {
    ValueRange Result;
    if (convertHeldRange(From, To, Result))
        return Result;
    Result = emptyRange();
    ValueRange Rest = From;
    if (To.SaturatesHigh && !Rest.isEmpty() && Rest.High > To.Upper) {
        Result = hull(Result, rangeOfNumber(To.Upper + 0.0));
        Rest = cutRange(Rest, Rest.Low, To.Upper);
    }
    if (To.SaturatesLow && !From.isEmpty() && From.Low < To.Lower) {
        Result = hull(Result, rangeOfNumber(To.Lower + 0.0));
        Rest = cutRange(Rest, To.Lower, Rest.High);
    }
    // What the clips leave can be empty: all of the range lay beyond one limit.
    if (!Rest.isEmpty())
        Result = hull(Result, convertIntervalInStorage(Rest, To));
    if (From.MayBeNaN)
        Result = hull(Result, rangeOfNumber(convertNumber(std::nan(""), To)));
    return Result;
}

bool isUpperClipStable(const Type& Of) {
    return Of.SaturatesHigh && convertRange(rangeOfAnything(), Of).High <= Of.Upper;
}

bool isLowerClipStable(const Type& Of) {
    return Of.SaturatesLow && convertRange(rangeOfAnything(), Of).Low >= Of.Lower;
}

ValueRange storageRange(const Type& Of) {
    // Outside code can leave a negative zero in a floating variable, a store of the program cannot.
    if (isFloating(Of.Base))
        return rangeOfAnything();
    return intervalOfRaws(smallestRaw(Of.Base), greatestRaw(Of.Base), Of);
}

} // namespace hpn
