#include "Model/Arithmetic.h"

#include "Model/Term.h"

#include <cstdint>
#include <limits>

// The number model on plain numbers. Everything is a double; the remainder, the shifts and the bit
// operators go through signed 32 bits. The operators are those of the library's lattice values on
// two constants, with one addition: a remainder that the processor would refuse has a defined
// result here, so that no program can make it fault.

namespace hpn {

std::int32_t truncateTo32(double Number) {
    // The comparisons are false for a NaN, which so joins the numbers out of reach.
    if (Number > -2147483649.0 && Number < 2147483648.0)
        return static_cast<std::int32_t>(Number);
    return std::numeric_limits<std::int32_t>::min();
}

std::int64_t truncateTo64(double Number) {
    if (Number >= -9223372036854775808.0 && Number < 9223372036854775808.0)
        return static_cast<std::int64_t>(Number);
    return std::numeric_limits<std::int64_t>::min();
}

double roundToSingle(double Number) {
    const volatile float Single = static_cast<float>(Number);
    return static_cast<double>(Single);
}

namespace {

double remainder32(double Left, double Right) {
    const std::int32_t Divisor = truncateTo32(Right);
    // A divisor of -1 always leaves 0 and would fault on the smallest number.
    if (Divisor == 0 || Divisor == -1)
        return 0.0;
    return truncateTo32(Left) % Divisor;
}

double shiftLeft32(double Left, double Right) {
    const std::uint32_t Count = static_cast<std::uint32_t>(truncateTo32(Right)) & 31U;
    return static_cast<std::int32_t>(static_cast<std::uint32_t>(truncateTo32(Left)) << Count);
}

double shiftRight32(double Left, double Right) {
    return truncateTo32(Left) >> (static_cast<std::uint32_t>(truncateTo32(Right)) & 31U);
}

double truth(bool Holds) {
    return Holds ? 1.0 : 0.0;
}

} // namespace

double computeUnary(Operator Op, double Operand) {
    switch (Op) {
    case Operator::Negate:
        return -Operand;
    case Operator::LogicalNot:
        return truth(Operand == 0.0);
    case Operator::Complement:
        return ~truncateTo32(Operand);
    case Operator::Absolute:
        return 0.0 > Operand ? -Operand : Operand;
    case Operator::Sign:
        return 0.0 > Operand ? -1.0 : truth(Operand > 0.0);
    default:
        return Operand;
    }
}

static double computeComparison(Operator Op, double Left, double Right) {
    switch (Op) {
    case Operator::Less:
        return truth(Left < Right);
    case Operator::LessEqual:
        return truth(Left <= Right);
    case Operator::Greater:
        return truth(Left > Right);
    case Operator::GreaterEqual:
        return truth(Left >= Right);
    case Operator::Equal:
        return truth(Left == Right);
    default:
        return truth(Left != Right);
    }
}

static double computeArithmetic(Operator Op, double Left, double Right) {
    switch (Op) {
    case Operator::Multiply:
        return multiply(Left, Right);
    case Operator::Divide:
        return divide(Left, Right);
    case Operator::Modulo:
        return remainder32(Left, Right);
    case Operator::Add:
        return Left + Right;
    case Operator::Subtract:
        return Left - Right;
    case Operator::Minimum: // equal numbers and a NaN on either side give the right one
        return Right > Left ? Left : Right;
    default:
        return Left > Right ? Left : Right;
    }
}

double computeBinary(Operator Op, double Left, double Right) {
    switch (Op) {
    case Operator::ShiftLeft:
        return shiftLeft32(Left, Right);
    case Operator::ShiftRight:
        return shiftRight32(Left, Right);
    case Operator::BitAnd:
        return truncateTo32(Left) & truncateTo32(Right);
    case Operator::BitXor:
        return truncateTo32(Left) ^ truncateTo32(Right);
    case Operator::BitOr:
        return truncateTo32(Left) | truncateTo32(Right);
    case Operator::LogicalAnd:
        return truth(Left != 0.0 && Right != 0.0);
    case Operator::LogicalOr: // only 1.0 is true here
        return truth(Left == 1.0 || Right == 1.0);
    case Operator::Multiply:
    case Operator::Divide:
    case Operator::Modulo:
    case Operator::Add:
    case Operator::Subtract:
    case Operator::Minimum:
    case Operator::Maximum:
        return computeArithmetic(Op, Left, Right);
    default:
        return computeComparison(Op, Left, Right);
    }
}

} // namespace hpn
