#include "Model/ValueRange.h"

#include "Model/Arithmetic.h"
#include "Model/Term.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <limits>

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
    return std::trunc(Number) == Number && std::fabs(Number) < Infinity;
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

bool holdsZero(const ValueRange& Range) {
    return Range.Low <= 0.0 && Range.High >= 0.0;
}

bool holdsOtherThan(const ValueRange& Range, double Number) {
    return Range.MayBeNaN || (!Range.isEmpty() && (Range.Low != Number || Range.High != Number));
}

// Double arithmetic

struct Piece {
    double Low;
    double High;
};

/// The pieces of a range, at most six. Ordinary ends are cut at the smallest number of each sign,
/// whole ranges at 1.
class SignPieces {
public:
    explicit SignPieces(const ValueRange& Range) {
        if (Range.isEmpty())
            return;
        const double Step = Range.IsIntegral ? 1.0 : Smallest;
        add(Range, -Infinity, -Infinity);
        add(Range, -Greatest, -Step);
        if (Range.MayBeNegativeZero)
            m_Pieces[m_Count++] = {-0.0, -0.0};
        add(Range, 0.0, 0.0);
        add(Range, Step, Greatest);
        add(Range, Infinity, Infinity);
    }
    const Piece* begin() const { return m_Pieces.data(); }
    const Piece* end() const { return m_Pieces.data() + m_Count; }

private:
    void add(const ValueRange& Range, double Low, double High) {
        const Piece Cut = {std::max(Range.Low, Low), std::min(Range.High, High)};
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

/// Hull over all corners of all pairs of pieces; NaNs of the operands are the caller's.
ValueRange combinePieces(Operator Op, const ValueRange& Left, const ValueRange& Right) {
    ValueRange Result = emptyRange();
    const SignPieces RightPieces(Right);
    for (const Piece& a : SignPieces(Left)) {
        for (const Piece& b : RightPieces) {
            addCorner(Result, computeBinary(Op, a.Low, b.Low));
            addCorner(Result, computeBinary(Op, a.Low, b.High));
            addCorner(Result, computeBinary(Op, a.High, b.Low));
            addCorner(Result, computeBinary(Op, a.High, b.High));
        }
    }
    if (Result.isEmpty())
        return Result;
    const bool IsIntegral = Op != Operator::Divide && Left.IsIntegral && Right.IsIntegral;
    ValueRange Shaped = makeInterval(Result.Low, Result.High, IsIntegral);
    Shaped.MayBeNaN = Result.MayBeNaN;
    Shaped.MayBeNegativeZero = Result.MayBeNegativeZero;
    return Shaped;
}

ValueRange rangeOfSum(Operator Op, const ValueRange& Left, const ValueRange& Right) {
    ValueRange Result = combinePieces(Op, Left, Right);
    Result.MayBeNaN = Result.MayBeNaN || Left.MayBeNaN || Right.MayBeNaN;
    return Result;
}

/// A zero factor gives 0.0 even against a NaN; only what is not zero lets the NaN through.
ValueRange rangeOfProduct(const ValueRange& Left, const ValueRange& Right) {
    ValueRange Result = combinePieces(Operator::Multiply, Left, Right);
    if ((Left.MayBeNaN && holdsZero(Right)) || (Right.MayBeNaN && holdsZero(Left)))
        Result = hull(Result, makeInterval(0.0, 0.0, true));
    const bool LeftNaNPasses = Left.MayBeNaN && holdsOtherThan(Right, 0.0);
    const bool RightNaNPasses = Right.MayBeNaN && holdsOtherThan(Left, 0.0);
    Result.MayBeNaN = Result.MayBeNaN || LeftNaNPasses || RightNaNPasses;
    return Result;
}

/// A zero dividend gives 0.0 even against a NaN.
ValueRange rangeOfQuotient(const ValueRange& Left, const ValueRange& Right) {
    ValueRange Result = combinePieces(Operator::Divide, Left, Right);
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

bool canBeEqual(const ValueRange& Left, const ValueRange& Right) {
    double Low = std::max(Left.Low, Right.Low);
    double High = std::min(Left.High, Right.High);
    if (Left.IsIntegral || Right.IsIntegral) {
        Low = std::ceil(Low);
        High = std::floor(High);
    }
    return Low <= High;
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
};

/// What the truncation to 32 bits makes of a range, in pieces of one sign: negative ones, others,
/// and the smallest number for all that does not fit.
class IntPieces {
public:
    explicit IntPieces(const ValueRange& Range) {
        bool IsLost = Range.MayBeNaN;
        if (!Range.isEmpty()) {
            IsLost = IsLost || Range.Low <= -2147483649.0 || Range.High >= 2147483648.0;
            const double Low = std::max(std::trunc(Range.Low), -2147483648.0);
            const double High = std::min(std::trunc(Range.High), 2147483647.0);
            if (Low <= High)
                addBySign(static_cast<std::int64_t>(Low), static_cast<std::int64_t>(High));
        }
        if (IsLost)
            m_Pieces[m_Count++] = {-2147483648LL, -2147483648LL};
    }
    const IntPiece* begin() const { return m_Pieces.data(); }
    const IntPiece* end() const { return m_Pieces.data() + m_Count; }

private:
    void addBySign(std::int64_t Low, std::int64_t High) {
        if (Low < 0)
            m_Pieces[m_Count++] = {Low, std::min<std::int64_t>(High, -1)};
        if (High >= 0)
            m_Pieces[m_Count++] = {std::max<std::int64_t>(Low, 0), High};
    }

    std::array<IntPiece, 3> m_Pieces;
    std::size_t m_Count = 0;
};

/// Remainders of numbers that are not negative by one divisor.
IntPiece remainderBy(const IntPiece& Dividend, std::int64_t Divisor) {
    const std::int64_t Low = Dividend.Low % Divisor;
    const std::int64_t High = Dividend.High % Divisor;
    if (Dividend.High - Dividend.Low < Divisor && Low <= High)
        return {Low, High};
    return {0, Divisor - 1};
}

/// Remainders of numbers that are not negative by divisors from 1 up. Few divisors are gone through
/// one by one.
IntPiece remainder(const IntPiece& Dividend, const IntPiece& Divisor) {
    constexpr std::int64_t FewDivisors = 32;
    if (Dividend.High < Divisor.Low)
        return Dividend;
    if (Divisor.High - Divisor.Low >= FewDivisors)
        return {0, std::min(Dividend.High, Divisor.High - 1)};
    IntPiece Result = remainderBy(Dividend, Divisor.Low);
    for (std::int64_t m = Divisor.Low + 1; m <= Divisor.High; ++m) {
        const IntPiece Next = remainderBy(Dividend, m);
        Result = {std::min(Result.Low, Next.Low), std::max(Result.High, Next.High)};
    }
    return Result;
}

IntPiece magnitude(const IntPiece& Range) {
    return Range.Low < 0 ? IntPiece{-Range.High, -Range.Low} : Range;
}

/// The sign of a remainder is the dividend's, the divisor's does not count; a divisor of zero gives
/// 0.
ValueRange remainderOfPieces(const IntPiece& Left, const IntPiece& Right) {
    ValueRange Result = emptyRange();
    IntPiece Divisor = magnitude(Right);
    if (Divisor.Low == 0) {
        Result = integers(0, 0);
        Divisor.Low = 1;
    }
    if (Divisor.Low > Divisor.High)
        return Result;
    const IntPiece Rest = remainder(magnitude(Left), Divisor);
    return hull(Result,
                Left.Low < 0 ? integers(-Rest.High, -Rest.Low) : integers(Rest.Low, Rest.High));
}

/// Shifting by one count. To the left the window of 32 bits slides over the result: inside one
/// window the ends hold, across a border both the smallest number and the greatest multiple of the
/// shift's unit occur.
ValueRange shiftByCount(Operator Op, const IntPiece& Left, unsigned Count) {
    if (Op == Operator::ShiftRight)
        return integers(Left.Low >> Count, Left.High >> Count);
    constexpr std::int64_t Half = std::int64_t{1} << 31;
    constexpr std::int64_t Window = std::int64_t{1} << 32;
    const std::int64_t Unit = std::int64_t{1} << Count;
    const std::int64_t Low = Left.Low * Unit + Half;
    const std::int64_t High = Left.High * Unit + Half;
    const std::int64_t Base = Low & ~(Window - 1);
    if (High - Base >= Window)
        return integers(-Half, Half - Unit);
    return integers(Low - Base - Half, High - Base - Half);
}

/// All counts of a piece; only their low five bits count.
ValueRange shiftByPiece(Operator Op, const IntPiece& Left, const IntPiece& Counts) {
    ValueRange Result = emptyRange();
    const std::int64_t Last = std::min(Counts.High, Counts.Low + 31);
    for (std::int64_t Count = Counts.Low; Count <= Last; ++Count)
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

/// Bits of pieces of one sign each: the sign bit of the result is the same throughout.
ValueRange bitsOfPieces(Operator Op, const IntPiece& Left, const IntPiece& Right) {
    const auto a = static_cast<std::uint32_t>(Left.Low);
    const auto b = static_cast<std::uint32_t>(Left.High);
    const auto c = static_cast<std::uint32_t>(Right.Low);
    const auto d = static_cast<std::uint32_t>(Right.High);
    if (Op == Operator::BitOr)
        return signedRange(smallestOr(a, b, c, d), greatestOr(a, b, c, d));
    if (Op == Operator::BitXor)
        return signedRange(smallestXor(a, b, c, d), greatestXor(a, b, c, d));
    // x & y is ~(~x | ~y); the complement turns the order round.
    return signedRange(~greatestOr(~b, ~a, ~d, ~c), ~smallestOr(~b, ~a, ~d, ~c));
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
    ValueRange Result = Operand;
    if (Operand.isEmpty() || Operand.Low >= 0.0)
        return Result;
    Result.High = std::max(-Operand.Low, Operand.High);
    Result.Low = Operand.High < 0.0 ? -Operand.High : 0.0;
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
    return Low <= Number && Number <= High && (!IsIntegral || isWhole(Number));
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

ValueRange hull(const ValueRange& a, const ValueRange& b) {
    ValueRange Result;
    Result.Low = std::min(a.Low, b.Low);
    Result.High = std::max(a.High, b.High);
    Result.MayBeNaN = a.MayBeNaN || b.MayBeNaN;
    Result.MayBeNegativeZero = a.MayBeNegativeZero || b.MayBeNegativeZero;
    Result.IsIntegral = (a.IsIntegral || a.isEmpty()) && (b.IsIntegral || b.isEmpty());
    return Result;
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
