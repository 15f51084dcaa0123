#include "Ranges/ExactNumbers.h"

#include <cmath>
#include <limits>

namespace hpn::proof {

namespace {

__extension__ typedef __int128 Wide; // NOLINT: pedantic compilers take it in this form only

constexpr Wide One = 1;

/// Mantissa * 2^Exponent; the mantissa of a number other than zero is odd.
struct Exact {
    Wide Mantissa = 0;
    int Exponent = 0;
};

Exact makeExact(Wide Mantissa, int Exponent) {
    if (Mantissa == 0)
        return {};
    while (Mantissa % 2 == 0) {
        Mantissa /= 2;
        ++Exponent;
    }
    return {Mantissa, Exponent};
}

Exact exactOf(double Number) {
    int Exponent = 0;
    const double Fraction = std::frexp(Number, &Exponent);
    return makeExact(static_cast<Wide>(std::ldexp(Fraction, 53)), Exponent - 53);
}

/// Nearest number with so many significant bits, of two equally near ones the even one.
Exact rounded(const Exact& Number, int Bits) {
    Wide Magnitude = Number.Mantissa < 0 ? -Number.Mantissa : Number.Mantissa;
    int Drop = 0;
    while ((Magnitude >> Drop) >= One << Bits)
        ++Drop;
    const Wide Unit = One << Drop;
    const Wide Rest = Magnitude % Unit;
    Magnitude /= Unit;
    if (2 * Rest > Unit || (2 * Rest == Unit && Magnitude % 2 == 1))
        ++Magnitude;
    return makeExact(Number.Mantissa < 0 ? -Magnitude : Magnitude, Number.Exponent + Drop);
}

double toDouble(const Exact& Number) {
    const Exact Short = rounded(Number, 53);
    return std::ldexp(static_cast<double>(static_cast<std::int64_t>(Short.Mantissa)),
                      Short.Exponent);
}

Exact sum(const Exact& a, const Exact& b) {
    if (a.Mantissa == 0 || b.Mantissa == 0)
        return a.Mantissa == 0 ? b : a;
    if (a.Exponent < b.Exponent)
        return sum(b, a);
    return makeExact(a.Mantissa * (One << (a.Exponent - b.Exponent)) + b.Mantissa, b.Exponent);
}

Exact negative(const Exact& a) {
    return {-a.Mantissa, a.Exponent};
}

Exact product(const Exact& a, const Exact& b) {
    return makeExact(a.Mantissa * b.Mantissa, a.Exponent + b.Exponent);
}

/// With more than 60 significant bits, the last of which is set if any were lost: enough for one
/// correct rounding. The divisor is not zero.
Exact quotient(const Exact& a, const Exact& b) {
    Wide Dividend = a.Mantissa < 0 ? -a.Mantissa : a.Mantissa;
    const Wide Divisor = b.Mantissa < 0 ? -b.Mantissa : b.Mantissa;
    int Shift = 0;
    while (Dividend != 0 && Dividend < One << 120) {
        Dividend *= 2;
        ++Shift;
    }
    const Wide Sticky = Dividend % Divisor != 0 ? 1 : 0;
    const Wide Magnitude = Dividend / Divisor * 2 + Sticky;
    const bool IsNegative = (a.Mantissa < 0) != (b.Mantissa < 0);
    return makeExact(IsNegative ? -Magnitude : Magnitude, a.Exponent - b.Exponent - Shift - 1);
}

int compare(double a, double b) {
    const Wide Difference = sum(exactOf(a), negative(exactOf(b))).Mantissa;
    return Difference < 0 ? -1 : Difference > 0 ? 1 : 0;
}

/// Toward zero, or to the nearest with halves away from zero.
Wide wholeOf(const Exact& Number, bool ToNearest) {
    if (Number.Exponent >= 0)
        return Number.Mantissa * (One << Number.Exponent);
    const Wide Unit = One << -Number.Exponent;
    const Wide Magnitude = Number.Mantissa < 0 ? -Number.Mantissa : Number.Mantissa;
    const Wide Whole = (Magnitude + (ToNearest ? Unit / 2 : 0)) / Unit;
    return Number.Mantissa < 0 ? -Whole : Whole;
}

/// Outside of so many bits with a sign only the smallest number is left.
Wide truncated(double Number, int Bits) {
    const Wide Limit = One << (Bits - 1);
    if (!std::isfinite(Number))
        return -Limit;
    const Wide Whole = wholeOf(exactOf(Number), false);
    return Whole >= -Limit && Whole < Limit ? Whole : -Limit;
}

Wide wrapped(Wide Whole, int Bits, bool IsSigned) {
    const Wide Period = One << Bits;
    Wide Rest = Whole % Period;
    if (Rest < 0)
        Rest += Period;
    return IsSigned && Rest >= Period / 2 ? Rest - Period : Rest;
}

double fromWhole(Wide Whole) {
    return static_cast<double>(static_cast<std::int64_t>(Whole));
}

double truth(bool Holds) {
    return Holds ? 1.0 : 0.0;
}

Wide judgeWhole(Operator Op, Wide Left, Wide Right) {
    const int Count = static_cast<int>(((Right % 32) + 32) % 32);
    const Wide Unit = One << Count;
    switch (Op) {
    case Operator::Modulo:
        return Right == 0 ? 0 : Left - Right * (Left / Right);
    case Operator::ShiftLeft:
        return wrapped(Left * Unit, 32, true);
    case Operator::ShiftRight: // rounds down
        return (Left - (((Left % Unit) + Unit) % Unit)) / Unit;
    case Operator::BitAnd:
        return Left & Right;
    case Operator::BitXor:
        return Left ^ Right;
    default:
        return Left | Right;
    }
}

double judgeComparison(Operator Op, double Left, double Right) {
    const int Sign = compare(Left, Right);
    switch (Op) {
    case Operator::Less:
        return truth(Sign < 0);
    case Operator::LessEqual:
        return truth(Sign <= 0);
    case Operator::Greater:
        return truth(Sign > 0);
    case Operator::GreaterEqual:
        return truth(Sign >= 0);
    case Operator::Equal:
        return truth(Sign == 0);
    default:
        return truth(Sign != 0);
    }
}

double judgeDivision(double Left, double Right) {
    if (compare(Left, 0.0) == 0)
        return 0.0;
    if (compare(Right, 0.0) == 0)
        return std::copysign(std::numeric_limits<double>::infinity(), Left);
    return toDouble(quotient(exactOf(Left), exactOf(Right)));
}

struct Storage {
    int Bits;
    bool IsSigned;
};

Storage storageOf(BaseType Base) {
    switch (Base) {
    case BaseType::Int8:
        return {8, true};
    case BaseType::UInt8:
        return {8, false};
    case BaseType::Int16:
        return {16, true};
    case BaseType::UInt16:
        return {16, false};
    case BaseType::Int32:
        return {32, true};
    default:
        return {32, false};
    }
}

double storeRaw(double Number, const Type& To) {
    const Storage Target = storageOf(To.Base);
    if (!To.IsScaled)
        return fromWhole(
            wrapped(truncated(Number, Target.IsSigned ? 32 : 64), Target.Bits, Target.IsSigned));
    Wide Raw = -(One << 63);
    if (std::isfinite(Number)) {
        const double Distance = toDouble(sum(exactOf(Number), negative(exactOf(To.Offset))));
        const double Steps = toDouble(quotient(exactOf(Distance), exactOf(To.Lsb)));
        Raw = wholeOf(exactOf(Steps), true);
    }
    Raw = wrapped(Raw, Target.Bits, Target.IsSigned);
    return judgeGrid(static_cast<int>(Raw), To.Lsb, To.Offset);
}

} // namespace

double judgeGrid(int Raw, double Lsb, double Offset) {
    const double Steps = toDouble(product({Raw, 0}, exactOf(Lsb)));
    return toDouble(sum(exactOf(Steps), exactOf(Offset)));
}

double judgeUnary(Operator Op, double Operand) {
    const int Sign = compare(Operand, 0.0);
    switch (Op) {
    case Operator::Negate:
        return Sign == 0 ? -0.0 : toDouble(negative(exactOf(Operand)));
    case Operator::LogicalNot:
        return truth(Sign == 0);
    case Operator::Complement:
        return fromWhole(-1 - truncated(Operand, 32));
    case Operator::Absolute:
        return Sign < 0 ? toDouble(negative(exactOf(Operand))) : Operand;
    default:
        return Sign;
    }
}

double judgeBinary(Operator Op, double Left, double Right) {
    switch (Op) {
    case Operator::Multiply:
        return toDouble(product(exactOf(Left), exactOf(Right)));
    case Operator::Divide:
        return judgeDivision(Left, Right);
    case Operator::Add:
        return toDouble(sum(exactOf(Left), exactOf(Right)));
    case Operator::Subtract:
        return toDouble(sum(exactOf(Left), negative(exactOf(Right))));
    case Operator::Minimum:
        return compare(Left, Right) < 0 ? Left : Right;
    case Operator::Maximum:
        return compare(Left, Right) > 0 ? Left : Right;
    case Operator::LogicalAnd:
        return truth(compare(Left, 0.0) != 0 && compare(Right, 0.0) != 0);
    case Operator::LogicalOr:
        return truth(compare(Left, 1.0) == 0 || compare(Right, 1.0) == 0);
    case Operator::Modulo:
    case Operator::ShiftLeft:
    case Operator::ShiftRight:
    case Operator::BitAnd:
    case Operator::BitXor:
    case Operator::BitOr:
        return fromWhole(judgeWhole(Op, truncated(Left, 32), truncated(Right, 32)));
    default:
        return judgeComparison(Op, Left, Right);
    }
}

double judgeStore(double Number, const Type& To) {
    // Infinities lie beyond every limit and are themselves in no other arithmetic here.
    const bool IsFinite = std::isfinite(Number);
    if (To.SaturatesHigh && (IsFinite ? compare(Number, To.Upper) > 0 : Number > 0.0))
        return To.Upper;
    if (To.SaturatesLow && (IsFinite ? compare(Number, To.Lower) < 0 : Number < 0.0))
        return To.Lower;
    switch (To.Base) {
    case BaseType::Float64:
        return IsFinite ? toDouble(exactOf(Number)) : Number;
    case BaseType::Float32:
        return IsFinite ? toDouble(rounded(exactOf(Number), 24)) : Number;
    case BaseType::Bool:
        return truth(!IsFinite || compare(Number, 0.0) != 0);
    default:
        return storeRaw(Number, To);
    }
}

} // namespace hpn::proof
