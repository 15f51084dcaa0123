#include "Model/ValueRange.h"

#include "Model/Arithmetic.h"
#include "Model/Term.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <functional>
#include <limits>
#include <numeric>

// Interval arithmetic over the number model.
//
// After R. E. Moore, Interval Analysis, 1966, with two refinements:
// 1. An operand is taken apart into pieces on which the operator is monotone: for double arithmetic
// by sign and kind of
//    number (infinities, negative, the two zeros, positive), for the 32-bit operators by what the
//    truncation makes of it.
// 2. The operator is applied to the corners of each pair of pieces. IEEE rounding is monotone, so a
// corner computed in double
//    is exactly the end of what the machine computes on the pieces: no outward rounding is needed,
//    none is done.
// 3. The result is the hull of all pairs. A corner that is a NaN or a negative zero sets the flag,
// never an end. The bounds of the bit operators are H. S. Warren's (Hacker's Delight, 2nd ed. 2012,
// section 4-3), on pieces of one sign, where unsigned order and signed order agree. Every result
// only grows when an operand grows. Complexity: constant for each operator; at most 36 pairs of
// pieces, 32 shift counts or 32 bit positions.

namespace hpn {

namespace {

constexpr double Infinity = std::numeric_limits<double>::infinity();
constexpr double Smallest = std::numeric_limits<double>::denorm_min();
constexpr double Greatest = std::numeric_limits<double>::max();

bool isWhole(double Number) {
    const double Magnitude = std::fabs(Number);
    if (Magnitude < 9007199254740992.0)
        return static_cast<double>(static_cast<std::int64_t>(Number)) == Number;
    return Magnitude < Infinity; // no double beyond 2^53 has a fraction
}

bool isNegativeZero(double Number) {
    return Number == 0.0 && std::signbit(Number);
}

ValueRange emptyRange() {
    ValueRange Result;
    Result.Low = Infinity;
    Result.High = -Infinity;
    Result.IsIntegral = true;
    return Result;
}

ValueRange makeInterval(double Low, double High, bool IsIntegral) {
    ValueRange Result;
    Result.Low = Low + 0.0; // no end is a negative zero
    Result.High = High + 0.0;
    const bool IsFinite = Low > -Infinity && High < Infinity;
    Result.IsIntegral = IsFinite && (IsIntegral || (Low == High && isWhole(Low)));
    return Result;
}

ValueRange integers(std::int64_t Low, std::int64_t High) {
    return makeInterval(static_cast<double>(Low), static_cast<double>(High), true);
}

/// The numbers 0 and 1 as far as they are possible.
ValueRange truthRange(bool CanBeFalse, bool CanBeTrue) {
    if (!CanBeFalse && !CanBeTrue)
        return emptyRange();
    return makeInterval(CanBeFalse ? 0.0 : 1.0, CanBeTrue ? 1.0 : 0.0, true);
}

// Grids. The numbers on one are whole multiples of a unit and below a limit, so that sums and
// differences of them are exact.

constexpr double UnitsPerOne = 1048576.0;
constexpr double GridLimit = 4294967296.0;

bool isInUnits(double Number) {
    return std::fabs(Number) <= GridLimit && isWhole(Number * UnitsPerOne);
}

std::int64_t unitsOf(double Number) {
    return static_cast<std::int64_t>(Number * UnitsPerOne);
}

/// In units: 0 for a single number, which is on every grid that it begins; -1: on no grid.
std::int64_t stepInUnits(const ValueRange& Range) {
    if (Range.isEmpty())
        return 0;
    if (!isInUnits(Range.Low) || !isInUnits(Range.High))
        return -1;
    if (Range.Low == Range.High)
        return 0;
    return Range.Step > 0.0 ? unitsOf(Range.Step) : Range.IsIntegral ? unitsOf(1.0) : -1;
}

bool isGridded(const ValueRange& Range) {
    return Range.Step > 0.0;
}

/// The grid of sums and differences of numbers of both. Whole numbers without gaps need none.
void setStepOfSum(ValueRange& Result, const ValueRange& a, const ValueRange& b) {
    if (!isGridded(a) && !isGridded(b))
        return;
    const std::int64_t Left = stepInUnits(a);
    const std::int64_t Right = stepInUnits(b);
    if (Left >= 0 && Right >= 0)
        setStep(Result, static_cast<double>(std::gcd(Left, Right)) / UnitsPerOne);
}

/// The grid of both together.
void setStepOfHull(ValueRange& Result, const ValueRange& a, const ValueRange& b) {
    if (!isGridded(a) && !isGridded(b))
        return;
    const std::int64_t Left = stepInUnits(a);
    const std::int64_t Right = stepInUnits(b);
    if (Left < 0 || Right < 0)
        return;
    const bool HasBoth = !a.isEmpty() && !b.isEmpty();
    const std::int64_t Distance = HasBoth ? unitsOf(a.Low) - unitsOf(b.Low) : 0;
    setStep(Result, static_cast<double>(std::gcd(std::gcd(Left, Right), Distance)) / UnitsPerOne);
}

/// Infinite if there is no number but zero, 0 if nothing is known.
double leastOf(const ValueRange& Range) {
    if (Range.isEmpty() || (Range.Low == 0.0 && Range.High == 0.0))
        return Infinity;
    if (Range.Least > 0.0)
        return Range.Least;
    if (Range.Low > 0.0 || Range.High < 0.0)
        return std::min(std::fabs(Range.Low), std::fabs(Range.High));
    return Range.IsIntegral ? 1.0 : 0.0;
}

void setLeastOfHull(ValueRange& Result, const ValueRange& a, const ValueRange& b) {
    if (a.Least > 0.0 || b.Least > 0.0) {
        const double Least = std::min(leastOf(a), leastOf(b));
        Result.Least = Least < Infinity ? Least : 0.0;
    }
}

/// The first number of the range that is not below a number; infinite if there is none.
double alignUp(const ValueRange& Range, double Number) {
    if (Number <= Range.Low || Number > Range.High)
        return Number <= Range.Low ? Range.Low : Infinity;
    if (!isGridded(Range))
        return (Range.IsIntegral ? std::ceil(Number) : Number) + 0.0; // no end is a negative zero
    double Aligned = Range.Low + std::floor((Number - Range.Low) / Range.Step) * Range.Step;
    while (Aligned < Number)
        Aligned += Range.Step;
    return Aligned;
}

/// The last number of the range that is not above a number; infinite if there is none.
double alignDown(const ValueRange& Range, double Number) {
    if (Number >= Range.High || Number < Range.Low)
        return Number >= Range.High ? Range.High : -Infinity;
    if (!isGridded(Range))
        return (Range.IsIntegral ? std::floor(Number) : Number) + 0.0;
    double Aligned = Range.High - std::floor((Range.High - Number) / Range.Step) * Range.Step;
    while (Aligned > Number)
        Aligned -= Range.Step;
    return Aligned;
}

bool isOnGrid(const ValueRange& Range, double Number) {
    if (isGridded(Range))
        return std::fmod(Number - Range.Low, Range.Step) == 0.0;
    return !Range.IsIntegral || isWhole(Number);
}

bool holdsZero(const ValueRange& Range) {
    return Range.Low <= 0.0 && Range.High >= 0.0 && isOnGrid(Range, 0.0);
}

bool holdsOtherThan(const ValueRange& Range, double Number) {
    return Range.MayBeNaN || (!Range.isEmpty() && (Range.Low != Number || Range.High != Number));
}

// Double arithmetic

struct Piece {
    double Low;
    double High;
};

/// The pieces of a range, at most six. Ordinary ends are cut at the smallest numbers of each sign
/// that the range can hold.
class SignPieces {
public:
    explicit SignPieces(const ValueRange& Range) {
        if (Range.isEmpty())
            return;
        const double Nearest = std::max(Range.Least, Smallest);
        add(Range, -Infinity, -Infinity);
        add(Range, -Greatest, -Nearest);
        if (Range.MayBeNegativeZero)
            m_Pieces[m_Count++] = {-0.0, -0.0};
        if (holdsZero(Range))
            m_Pieces[m_Count++] = {0.0, 0.0};
        add(Range, Nearest, Greatest);
        add(Range, Infinity, Infinity);
    }
    const Piece* begin() const { return m_Pieces.data(); }
    const Piece* end() const { return m_Pieces.data() + m_Count; }

private:
    void add(const ValueRange& Range, double Low, double High) {
        const Piece Cut = {alignUp(Range, Low), alignDown(Range, High)};
        if (Cut.Low <= Cut.High)
            m_Pieces[m_Count++] = Cut;
    }

    std::array<Piece, 6> m_Pieces;
    std::size_t m_Count = 0;
};

void addCorner(ValueRange& Result, double Corner) {
    if (std::isnan(Corner)) {
        Result.MayBeNaN = true;
        return;
    }
    Result.MayBeNegativeZero = Result.MayBeNegativeZero || isNegativeZero(Corner);
    Result.Low = std::min(Result.Low, Corner);
    Result.High = std::max(Result.High, Corner);
}

/// Hull over all corners of all pairs of pieces; NaNs of the operands are the caller's. `compute`
/// is the operator on numbers.
template <class Operation>
ValueRange combinePieces(const ValueRange& Left, const ValueRange& Right, const Operation& compute,
                         bool IsIntegral) {
    ValueRange Result = emptyRange();
    const SignPieces RightPieces(Right);
    for (const Piece& a : SignPieces(Left)) {
        for (const Piece& b : RightPieces) {
            addCorner(Result, compute(a.Low, b.Low));
            addCorner(Result, compute(a.Low, b.High));
            addCorner(Result, compute(a.High, b.Low));
            addCorner(Result, compute(a.High, b.High));
        }
    }
    if (Result.isEmpty())
        return Result;
    ValueRange Shaped = makeInterval(Result.Low, Result.High, IsIntegral);
    Shaped.MayBeNaN = Result.MayBeNaN;
    Shaped.MayBeNegativeZero = Result.MayBeNegativeZero;
    return Shaped;
}

bool isFinite(const ValueRange& Range) {
    return -Infinity < Range.Low && Range.Low <= Range.High && Range.High < Infinity;
}

/// Its ends are those of its ordinary numbers, but for infinities next to them.
bool hasOrdinaryEnds(const ValueRange& Range) {
    const bool HoldsZeros = !Range.MayBeNegativeZero || (Range.Low <= 0.0 && Range.High >= 0.0);
    const bool IsInfinity = Range.Low == Infinity || Range.High == -Infinity;
    return !Range.isEmpty() && !IsInfinity && HoldsZeros && Range.Least == 0.0;
}

/// The hull by the outer corners alone, which is that of all pieces, where no sum can be a negative
/// zero: only -0 + -0 and -0 - 0 are. Infinities of different sign sum up to a NaN.
bool combineEnds(Operator Op, const ValueRange& Left, const ValueRange& Right, ValueRange& Result) {
    const bool AreFinite = isFinite(Left) && isFinite(Right);
    if (!AreFinite && !(hasOrdinaryEnds(Left) && hasOrdinaryEnds(Right)))
        return false;
    const bool IsIntegral = Left.IsIntegral && Right.IsIntegral;
    if (Op == Operator::Add) {
        if (Left.MayBeNegativeZero && Right.MayBeNegativeZero)
            return false;
        Result = makeInterval(Left.Low + Right.Low, Left.High + Right.High, IsIntegral);
        Result.MayBeNaN = (Left.Low == -Infinity && Right.High == Infinity) ||
                          (Left.High == Infinity && Right.Low == -Infinity);
        return true;
    }
    if (Left.MayBeNegativeZero)
        return false;
    Result = makeInterval(Left.Low - Right.High, Left.High - Right.Low, IsIntegral);
    Result.MayBeNaN = (Left.Low == -Infinity && Right.Low == -Infinity) ||
                      (Left.High == Infinity && Right.High == Infinity);
    return true;
}

ValueRange rangeOfSum(Operator Op, const ValueRange& Left, const ValueRange& Right) {
    ValueRange Result;
    if (!combineEnds(Op, Left, Right, Result)) {
        const bool IsIntegral = Left.IsIntegral && Right.IsIntegral;
        Result = Op == Operator::Add ? combinePieces(Left, Right, std::plus<>(), IsIntegral)
                                     : combinePieces(Left, Right, std::minus<>(), IsIntegral);
    }
    setStepOfSum(Result, Left, Right);
    Result.MayBeNaN = Result.MayBeNaN || Left.MayBeNaN || Right.MayBeNaN;
    return Result;
}

/// No number in it has a sign, and the ends are numbers in it.
bool isPositive(const ValueRange& Range) {
    return 0.0 <= Range.Low && Range.Low <= Range.High && !Range.MayBeNegativeZero &&
           Range.Least == 0.0;
}

/// A zero factor gives 0.0 even against a NaN; only what is not zero lets the NaN through.
ValueRange rangeOfProduct(const ValueRange& Left, const ValueRange& Right) {
    const bool AreWhole = Left.IsIntegral && Right.IsIntegral;
    if (!Left.MayBeNaN && !Right.MayBeNaN) {
        // Whole factors give no negative zero, neither by their signs nor by underflow.
        if (AreWhole && isFinite(Left) && isFinite(Right)) {
            const auto [Low, High] =
                std::minmax({multiply(Left.Low, Right.Low), multiply(Left.Low, Right.High),
                             multiply(Left.High, Right.Low), multiply(Left.High, Right.High)});
            return makeInterval(Low, High, true);
        }
        if (isPositive(Left) && isPositive(Right))
            return makeInterval(multiply(Left.Low, Right.Low), multiply(Left.High, Right.High),
                                AreWhole);
    }
    ValueRange Result = combinePieces(Left, Right, multiply, AreWhole);
    if ((Left.MayBeNaN && holdsZero(Right)) || (Right.MayBeNaN && holdsZero(Left)))
        Result = hull(Result, makeInterval(0.0, 0.0, true));
    const bool LeftNaNPasses = Left.MayBeNaN && holdsOtherThan(Right, 0.0);
    const bool RightNaNPasses = Right.MayBeNaN && holdsOtherThan(Left, 0.0);
    Result.MayBeNaN = Result.MayBeNaN || LeftNaNPasses || RightNaNPasses;
    return Result;
}

/// A zero dividend gives 0.0 even against a NaN.
ValueRange rangeOfQuotient(const ValueRange& Left, const ValueRange& Right) {
    ValueRange Result = combinePieces(Left, Right, divide, false);
    if (Right.MayBeNaN && holdsZero(Left))
        Result = hull(Result, makeInterval(0.0, 0.0, true));
    const bool RightNaNPasses = Right.MayBeNaN && holdsOtherThan(Left, 0.0);
    Result.MayBeNaN = Result.MayBeNaN || Left.MayBeNaN || RightNaNPasses;
    return Result;
}

/// min and max give the right operand when the comparison fails: on equal numbers, and on a NaN on
/// either side.
ValueRange rangeOfExtremum(Operator Op, const ValueRange& Left, const ValueRange& Right) {
    const bool IsMinimum = Op == Operator::Minimum;
    ValueRange Result = emptyRange();
    if (!Left.isEmpty() && !Right.isEmpty()) {
        Result = IsMinimum ? makeInterval(std::min(Left.Low, Right.Low),
                                          std::min(Left.High, Right.High), false)
                           : makeInterval(std::max(Left.Low, Right.Low),
                                          std::max(Left.High, Right.High), false);
        const bool LeftZeroWins = IsMinimum ? Right.High > 0.0 : Right.Low < 0.0;
        const bool RightZeroWins = IsMinimum ? Left.High >= 0.0 : Left.Low <= 0.0;
        Result.MayBeNegativeZero =
            (Left.MayBeNegativeZero && LeftZeroWins) || (Right.MayBeNegativeZero && RightZeroWins);
        Result.IsIntegral = Result.IsIntegral || (Left.IsIntegral && Right.IsIntegral);
        setStepOfHull(Result, Left, Right);
        setLeastOfHull(Result, Left, Right);
    }
    if (Left.MayBeNaN) {
        ValueRange RightNumbers = Right;
        RightNumbers.MayBeNaN = false;
        Result = hull(Result, RightNumbers);
    }
    Result.MayBeNaN = Right.MayBeNaN;
    return Result;
}

// Comparisons

/// The ranges overlap, each on its grid, and their grids can meet.
bool canBeEqual(const ValueRange& Left, const ValueRange& Right) {
    const double Low = std::max(Left.Low, Right.Low);
    const double High = std::min(Left.High, Right.High);
    const ValueRange a = cutRange(Left, Low, High);
    const ValueRange b = cutRange(Right, Low, High);
    if (a.isEmpty() || b.isEmpty() || (!isGridded(a) && !isGridded(b)))
        return !a.isEmpty() && !b.isEmpty();
    if (a.Low == a.High || b.Low == b.High)
        return a.Low == a.High ? b.contains(a.Low) : a.contains(b.Low);
    const std::int64_t StepA = stepInUnits(a);
    const std::int64_t StepB = stepInUnits(b);
    return StepA < 0 || StepB < 0 ||
           (unitsOf(a.Low) - unitsOf(b.Low)) % std::gcd(StepA, StepB) == 0;
}

ValueRange rangeOfEquality(bool HoldsOnEqual, const ValueRange& Left, const ValueRange& Right) {
    const bool BothNumbers = !Left.isEmpty() && !Right.isEmpty();
    const bool CanBeEqual = BothNumbers && canBeEqual(Left, Right);
    const bool CanDiffer =
        Left.MayBeNaN || Right.MayBeNaN ||
        (BothNumbers && (holdsOtherThan(Left, Right.Low) || holdsOtherThan(Right, Left.Low)));
    return HoldsOnEqual ? truthRange(CanDiffer, CanBeEqual) : truthRange(CanBeEqual, CanDiffer);
}

/// Left < Right, or Left <= Right.
ValueRange rangeOfOrder(bool HoldsOnEqual, const ValueRange& Left, const ValueRange& Right) {
    bool CanBeTrue = false;
    bool CanBeFalse = Left.MayBeNaN || Right.MayBeNaN;
    if (!Left.isEmpty() && !Right.isEmpty()) {
        CanBeTrue = HoldsOnEqual ? Left.Low <= Right.High : Left.Low < Right.High;
        CanBeFalse = CanBeFalse || (HoldsOnEqual ? Left.High > Right.Low : Left.High >= Right.Low);
    }
    return truthRange(CanBeFalse, CanBeTrue);
}

// 32-bit arithmetic

struct IntPiece {
    std::int64_t Low;
    std::int64_t High;
    std::int64_t Step; ///< 1 or more; what the numbers in between have in common
};

/// What the truncation to 32 bits makes of a range, in pieces of one sign: negative ones, others,
/// and the smallest number for all that does not fit.
class IntPieces {
public:
    explicit IntPieces(const ValueRange& Range) {
        bool IsLost = Range.MayBeNaN;
        if (!Range.isEmpty()) {
            IsLost = IsLost || Range.Low <= -2147483649.0 || Range.High >= 2147483648.0;
            // Whole numbers stay on their grid.
            const double Margin = Range.IsIntegral ? 0.0 : 1.0;
            const ValueRange Fitting =
                cutRange(Range, -2147483648.0 - Margin, 2147483647.0 + Margin);
            const double Low = std::max(std::trunc(Fitting.Low), -2147483648.0);
            const double High = std::min(std::trunc(Fitting.High), 2147483647.0);
            m_Step = Range.IsIntegral && Fitting.Step > 0.0
                         ? static_cast<std::int64_t>(Fitting.Step)
                         : 1;
            if (Low <= High)
                addBySign(static_cast<std::int64_t>(Low), static_cast<std::int64_t>(High));
        }
        if (IsLost)
            m_Pieces[m_Count++] = {-2147483648LL, -2147483648LL, 1};
    }
    const IntPiece* begin() const { return m_Pieces.data(); }
    const IntPiece* end() const { return m_Pieces.data() + m_Count; }

private:
    void addBySign(std::int64_t Low, std::int64_t High) {
        if (Low >= 0)
            return add(Low, High);
        // The last number below zero is the one that the distance to -1 leaves.
        const std::int64_t LastNegative = High < 0 ? High : -1 - (-1 - Low) % m_Step;
        add(Low, LastNegative);
        if (LastNegative + m_Step <= High)
            add(LastNegative + m_Step, High);
    }
    void add(std::int64_t Low, std::int64_t High) {
        m_Pieces[m_Count++] = {Low, High, Low == High ? 1 : m_Step};
    }

    std::array<IntPiece, 3> m_Pieces;
    std::size_t m_Count = 0;
    std::int64_t m_Step = 1;
};

/// Remainders of numbers that are not negative by divisors from 1 up. Few divisors are gone through
/// one by one.
Residues remainder(const IntPiece& Dividend, const IntPiece& Divisor) {
    constexpr std::int64_t FewDivisors = 32;
    if (Dividend.High < Divisor.Low)
        return {Dividend.Low, Dividend.High};
    if ((Divisor.High - Divisor.Low) / Divisor.Step >= FewDivisors)
        return {0, std::min(Dividend.High, Divisor.High - 1)};
    const auto Width = static_cast<std::uint64_t>(Dividend.High - Dividend.Low);
    Residues Result = residuesOf(Dividend.Low, Width, Dividend.Step, Divisor.Low);
    for (std::int64_t m = Divisor.Low + Divisor.Step; m <= Divisor.High; m += Divisor.Step) {
        const Residues Next = residuesOf(Dividend.Low, Width, Dividend.Step, m);
        Result = {std::min(Result.Low, Next.Low), std::max(Result.High, Next.High)};
    }
    return Result;
}

IntPiece magnitude(const IntPiece& Range) {
    return Range.Low < 0 ? IntPiece{-Range.High, -Range.Low, Range.Step} : Range;
}

/// The sign of a remainder is the dividend's, the divisor's does not count; a divisor of zero gives
/// 0.
ValueRange remainderOfPieces(const IntPiece& Left, const IntPiece& Right) {
    ValueRange Result = emptyRange();
    IntPiece Divisor = magnitude(Right);
    if (Divisor.Low == 0) {
        Result = integers(0, 0);
        Divisor.Low = Divisor.Step;
    }
    if (Divisor.Low > Divisor.High)
        return Result;
    const Residues Rest = remainder(magnitude(Left), Divisor);
    return hull(Result,
                Left.Low < 0 ? integers(-Rest.High, -Rest.Low) : integers(Rest.Low, Rest.High));
}

/// Shifting by one count. To the left the window of 32 bits slides over the result.
ValueRange shiftByCount(Operator Op, const IntPiece& Left, unsigned Count) {
    if (Op == Operator::ShiftRight)
        return integers(Left.Low >> Count, Left.High >> Count);
    constexpr std::int64_t Half = std::int64_t{1} << 31;
    constexpr std::int64_t Window = std::int64_t{1} << 32;
    const std::int64_t Unit = std::int64_t{1} << Count;
    const auto Width = static_cast<std::uint64_t>((Left.High - Left.Low) * Unit);
    const Residues Shifted = residuesOf(Left.Low * Unit + Half, Width, Left.Step * Unit, Window);
    return integers(Shifted.Low - Half, Shifted.High - Half);
}

/// All counts of a piece; only their low five bits count, so they repeat after 32 of them.
ValueRange shiftByPiece(Operator Op, const IntPiece& Left, const IntPiece& Counts) {
    ValueRange Result = emptyRange();
    std::int64_t Count = Counts.Low;
    for (int i = 0; i < 32 && Count <= Counts.High; ++i, Count += Counts.Step)
        Result = hull(Result, shiftByCount(Op, Left, static_cast<unsigned>(Count & 31)));
    return Result;
}

// Bounds of the bit operators on unsigned intervals; the names of the operands are Warren's.

std::uint32_t smallestOr(std::uint32_t a, std::uint32_t b, std::uint32_t c, std::uint32_t d) {
    for (std::uint32_t m = 0x80000000U; m != 0; m >>= 1) {
        if ((~a & c & m) != 0) {
            const std::uint32_t Raised = (a | m) & (0U - m);
            if (Raised <= b) {
                a = Raised;
                break;
            }
        } else if ((a & ~c & m) != 0) {
            const std::uint32_t Raised = (c | m) & (0U - m);
            if (Raised <= d) {
                c = Raised;
                break;
            }
        }
    }
    return a | c;
}

std::uint32_t greatestOr(std::uint32_t a, std::uint32_t b, std::uint32_t c, std::uint32_t d) {
    for (std::uint32_t m = 0x80000000U; m != 0; m >>= 1) {
        if ((b & d & m) == 0)
            continue;
        const std::uint32_t LoweredB = (b - m) | (m - 1);
        if (LoweredB >= a)
            return LoweredB | d;
        const std::uint32_t LoweredD = (d - m) | (m - 1);
        if (LoweredD >= c)
            return b | LoweredD;
    }
    return b | d;
}

std::uint32_t smallestXor(std::uint32_t a, std::uint32_t b, std::uint32_t c, std::uint32_t d) {
    for (std::uint32_t m = 0x80000000U; m != 0; m >>= 1) {
        if ((~a & c & m) != 0) {
            const std::uint32_t Raised = (a | m) & (0U - m);
            if (Raised <= b)
                a = Raised;
        } else if ((a & ~c & m) != 0) {
            const std::uint32_t Raised = (c | m) & (0U - m);
            if (Raised <= d)
                c = Raised;
        }
    }
    return a ^ c;
}

std::uint32_t greatestXor(std::uint32_t a, std::uint32_t b, std::uint32_t c, std::uint32_t d) {
    for (std::uint32_t m = 0x80000000U; m != 0; m >>= 1) {
        if ((b & d & m) == 0)
            continue;
        const std::uint32_t LoweredB = (b - m) | (m - 1);
        if (LoweredB >= a) {
            b = LoweredB;
            continue;
        }
        const std::uint32_t LoweredD = (d - m) | (m - 1);
        if (LoweredD >= c)
            d = LoweredD;
    }
    return b ^ d;
}

ValueRange signedRange(std::uint32_t Low, std::uint32_t High) {
    return integers(static_cast<std::int32_t>(Low), static_cast<std::int32_t>(High));
}

/// How many low bits all numbers of a piece have in common.
unsigned commonLowBits(const IntPiece& Piece) {
    if (Piece.Low == Piece.High)
        return 31;
    unsigned Bits = 0;
    while ((Piece.Step >> Bits & 1) == 0)
        ++Bits;
    return std::min(Bits, 31U);
}

/// Bounds of the bits from bit Low up, the lower ones cut off.
Residues boundsOfHighBits(Operator Op, const IntPiece& Left, const IntPiece& Right, unsigned Low) {
    const auto a = static_cast<std::uint32_t>(Left.Low) >> Low;
    const auto b = static_cast<std::uint32_t>(Left.High) >> Low;
    const auto c = static_cast<std::uint32_t>(Right.Low) >> Low;
    const auto d = static_cast<std::uint32_t>(Right.High) >> Low;
    if (Op == Operator::BitOr)
        return {smallestOr(a, b, c, d), greatestOr(a, b, c, d)};
    if (Op == Operator::BitXor)
        return {smallestXor(a, b, c, d), greatestXor(a, b, c, d)};
    // x & y is ~(~x | ~y); the complement turns the order round.
    return {~greatestOr(~b, ~a, ~d, ~c), ~smallestOr(~b, ~a, ~d, ~c)};
}

/// Puts the bounds of the low bits below those of the high ones.
ValueRange joinBits(const Residues& HighBits, unsigned Low, std::uint32_t Least,
                    std::uint32_t Most) {
    return signedRange(static_cast<std::uint32_t>(HighBits.Low) << Low | Least,
                       static_cast<std::uint32_t>(HighBits.High) << Low | Most);
}

/// Bits of pieces of one sign each: the sign bit of the result is the same throughout. Low bits
/// that are the same throughout both pieces give the same low bits, and the bounds are those of the
/// others. Low bits that are the same in one piece only bound those of `&` and `|`.
ValueRange bitsOfPieces(Operator Op, const IntPiece& Left, const IntPiece& Right) {
    const unsigned LeftBits = commonLowBits(Left);
    const unsigned RightBits = commonLowBits(Right);
    const unsigned Both = std::min(LeftBits, RightBits);
    const unsigned One = std::max(LeftBits, RightBits);
    const std::uint32_t Mask = (1U << Both) - 1;
    const auto Same = static_cast<std::uint32_t>(static_cast<std::int64_t>(
        computeBinary(Op, static_cast<double>(Left.Low), static_cast<double>(Right.Low))));
    const ValueRange Result =
        joinBits(boundsOfHighBits(Op, Left, Right, Both), Both, Same & Mask, Same & Mask);
    if (One == Both || One == 31 || Op == Operator::BitXor)
        return Result;
    const std::uint32_t Wide = (1U << One) - 1;
    const auto Known = static_cast<std::uint32_t>(LeftBits == One ? Left.Low : Right.Low) & Wide;
    const Residues HighBits = boundsOfHighBits(Op, Left, Right, One);
    const ValueRange Other = Op == Operator::BitAnd ? joinBits(HighBits, One, 0, Known)
                                                    : joinBits(HighBits, One, Known, Wide);
    return cutRange(Result, Other.Low, Other.High);
}

ValueRange rangeOfIntegerOperator(Operator Op, const ValueRange& Left, const ValueRange& Right) {
    ValueRange Result = emptyRange();
    const IntPieces RightPieces(Right);
    for (const IntPiece& a : IntPieces(Left)) {
        for (const IntPiece& b : RightPieces) {
            if (Op == Operator::Modulo)
                Result = hull(Result, remainderOfPieces(a, b));
            else if (Op == Operator::ShiftLeft || Op == Operator::ShiftRight)
                Result = hull(Result, shiftByPiece(Op, a, b));
            else
                Result = hull(Result, bitsOfPieces(Op, a, b));
        }
    }
    return Result;
}

// Logic and unary operators

ValueRange rangeOfConjunction(const ValueRange& Left, const ValueRange& Right) {
    const bool BothPossible =
        (!Left.isEmpty() || Left.MayBeNaN) && (!Right.isEmpty() || Right.MayBeNaN);
    return truthRange(BothPossible && (holdsZero(Left) || holdsZero(Right)),
                      holdsOtherThan(Left, 0.0) && holdsOtherThan(Right, 0.0));
}

ValueRange rangeOfDisjunction(const ValueRange& Left, const ValueRange& Right) {
    return truthRange(holdsOtherThan(Left, 1.0) && holdsOtherThan(Right, 1.0),
                      Left.contains(1.0) || Right.contains(1.0));
}

ValueRange rangeOfNegation(const ValueRange& Operand) {
    ValueRange Result = Operand;
    if (Operand.isEmpty())
        return Result;
    Result.Low = 0.0 - Operand.High;
    Result.High = 0.0 - Operand.Low;
    Result.MayBeNegativeZero = holdsZero(Operand);
    return Result;
}

ValueRange rangeOfComplement(const ValueRange& Operand) {
    ValueRange Result = emptyRange();
    for (const IntPiece& a : IntPieces(Operand))
        Result = hull(Result, integers(~a.High, ~a.Low));
    return Result;
}

ValueRange rangeOfAbsolute(const ValueRange& Operand) {
    if (Operand.isEmpty() || Operand.Low >= 0.0)
        return Operand;
    // A negative zero stays one.
    ValueRange Result = hull(rangeOfNegation(cutRange(Operand, -Infinity, -Smallest)),
                             cutRange(Operand, 0.0, Infinity));
    Result.MayBeNegativeZero = Operand.MayBeNegativeZero;
    return Result;
}

ValueRange rangeOfSign(const ValueRange& Operand) {
    ValueRange Result = emptyRange();
    if (Operand.Low < 0.0)
        Result = hull(Result, integers(-1, -1));
    if (holdsZero(Operand) || Operand.MayBeNaN)
        Result = hull(Result, integers(0, 0));
    if (Operand.High > 0.0)
        Result = hull(Result, integers(1, 1));
    return Result;
}

} // namespace

bool ValueRange::contains(double Number) const {
    if (std::isnan(Number))
        return MayBeNaN;
    if (isNegativeZero(Number) && !MayBeNegativeZero)
        return false;
    if (Least > 0.0 && Number != 0.0 && std::fabs(Number) < Least)
        return false;
    return Low <= Number && Number <= High && isOnGrid(*this, Number);
}

bool ValueRange::isWithin(const ValueRange& Other) const {
    if ((MayBeNaN && !Other.MayBeNaN) || (MayBeNegativeZero && !Other.MayBeNegativeZero))
        return false;
    return isEmpty() || (Low >= Other.Low && High <= Other.High);
}

ValueRange rangeOfNumber(double Number) {
    if (std::isnan(Number)) {
        ValueRange Result = emptyRange();
        Result.MayBeNaN = true;
        return Result;
    }
    ValueRange Result = makeInterval(Number, Number, false);
    Result.MayBeNegativeZero = isNegativeZero(Number);
    return Result;
}

ValueRange rangeOfAnything() {
    ValueRange Result = makeInterval(-Infinity, Infinity, false);
    Result.MayBeNaN = true;
    Result.MayBeNegativeZero = true;
    return Result;
}

void setGapsOfHull(ValueRange& Result, const ValueRange& a, const ValueRange& b) {
    setStepOfHull(Result, a, b);
    setLeastOfHull(Result, a, b);
}

void setStep(ValueRange& Range, double Step) {
    if (Range.Low < Range.High && Step > 0.0 && !(Range.IsIntegral && Step == 1.0) &&
        isInUnits(Range.Low) && isInUnits(Range.High) && isInUnits(Step))
        Range.Step = Step;
}

ValueRange cutRange(const ValueRange& Range, double Low, double High) {
    ValueRange Cut = Range;
    if (Range.isEmpty())
        return Cut;
    if (Low > Range.Low)
        Cut.Low = alignUp(Range, Low);
    if (High < Range.High)
        Cut.High = alignDown(Range, High);
    if (Cut.Low > Cut.High) {
        Cut = emptyRange();
        Cut.MayBeNaN = Range.MayBeNaN;
        Cut.MayBeNegativeZero = Range.MayBeNegativeZero;
    }
    return Cut;
}

Residues residuesOf(std::int64_t First, std::uint64_t Width, std::int64_t Step,
                    std::int64_t Period) {
    constexpr std::uint64_t Few = 32;
    const auto Modulus = static_cast<std::uint64_t>(Period);
    const auto Begin = static_cast<std::uint64_t>((First % Period + Period) % Period);
    if (Width < Modulus && Begin + Width < Modulus)
        return {static_cast<std::int64_t>(Begin), static_cast<std::int64_t>(Begin + Width)};
    const auto Gap = static_cast<std::uint64_t>(Step);
    if (Width / Gap < Few) {
        std::uint64_t Low = Begin;
        std::uint64_t High = Begin;
        for (std::uint64_t i = 1; i <= Width / Gap; ++i) {
            const std::uint64_t Next = (Begin + i * Gap % Modulus) % Modulus;
            Low = std::min(Low, Next);
            High = std::max(High, Next);
        }
        return {static_cast<std::int64_t>(Low), static_cast<std::int64_t>(High)};
    }
    // A border is crossed, so both ends of what the common step leaves are met if it divides the
    // period.
    const std::uint64_t Common = std::gcd(Gap, Modulus);
    const std::uint64_t Low = Begin % Common;
    return {static_cast<std::int64_t>(Low),
            static_cast<std::int64_t>(Low + (Modulus - 1 - Low) / Common * Common)};
}

ValueRange rangeOfUnary(Operator Op, const ValueRange& Operand) {
    switch (Op) {
    case Operator::Negate:
        return rangeOfNegation(Operand);
    case Operator::LogicalNot:
        return truthRange(holdsOtherThan(Operand, 0.0), holdsZero(Operand));
    case Operator::Complement:
        return rangeOfComplement(Operand);
    case Operator::Absolute:
        return rangeOfAbsolute(Operand);
    default:
        return rangeOfSign(Operand);
    }
}

static ValueRange rangeOfComparison(Operator Op, const ValueRange& Left, const ValueRange& Right) {
    switch (Op) {
    case Operator::Less:
        return rangeOfOrder(false, Left, Right);
    case Operator::LessEqual:
        return rangeOfOrder(true, Left, Right);
    case Operator::Greater:
        return rangeOfOrder(false, Right, Left);
    case Operator::GreaterEqual:
        return rangeOfOrder(true, Right, Left);
    default:
        return rangeOfEquality(Op == Operator::Equal, Left, Right);
    }
}

ValueRange rangeOfBinary(Operator Op, const ValueRange& Left, const ValueRange& Right) {
    switch (Op) {
    case Operator::Add:
    case Operator::Subtract:
        return rangeOfSum(Op, Left, Right);
    case Operator::Multiply:
        return rangeOfProduct(Left, Right);
    case Operator::Divide:
        return rangeOfQuotient(Left, Right);
    case Operator::Minimum:
    case Operator::Maximum:
        return rangeOfExtremum(Op, Left, Right);
    case Operator::LogicalAnd:
        return rangeOfConjunction(Left, Right);
    case Operator::LogicalOr:
        return rangeOfDisjunction(Left, Right);
    case Operator::Modulo:
    case Operator::ShiftLeft:
    case Operator::ShiftRight:
    case Operator::BitAnd:
    case Operator::BitXor:
    case Operator::BitOr:
        return rangeOfIntegerOperator(Op, Left, Right);
    default:
        return rangeOfComparison(Op, Left, Right);
    }
}

} // namespace hpn
