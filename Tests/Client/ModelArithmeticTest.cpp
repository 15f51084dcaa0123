// The number model's arithmetic against two judges: exact integer arithmetic written another way,
// and the operators of the library's lattice values.

#include "Generators/ModelTestNumbers.h"
#include "Model/Arithmetic.h"
#include "Model/Term.h"

#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <limits>
#include <map>

namespace {

using hpn::Operator;
using hpn::test::InterestingNumbers;
using hpn::test::isSameNumber;

// Whole numbers in 64 bits, bit by bit and by division, never with the machine's 32-bit operators.

std::int64_t wholeOf(double Number) {
    const long double Whole = std::floor(std::fabs(static_cast<long double>(Number)));
    if (!(Whole <= 4294967296.0L))
        return -2147483648LL;
    const std::int64_t Signed =
        std::signbit(Number) ? -static_cast<std::int64_t>(Whole) : static_cast<std::int64_t>(Whole);
    return Signed >= -2147483648LL && Signed <= 2147483647LL ? Signed : -2147483648LL;
}

std::int64_t wrapped(std::int64_t Number) {
    std::int64_t Rest = Number % 4294967296LL;
    if (Rest < 0)
        Rest += 4294967296LL;
    return Rest >= 2147483648LL ? Rest - 4294967296LL : Rest;
}

int bitOf(std::int64_t Number, int Bit) {
    std::int64_t Rest = Number % 4294967296LL;
    if (Rest < 0)
        Rest += 4294967296LL;
    return static_cast<int>(Rest / (std::int64_t{1} << Bit) % 2);
}

double bitwise(double Left, double Right, const std::function<int(int, int)>& Rule) {
    std::int64_t Sum = 0;
    for (int Bit = 0; Bit < 32; ++Bit)
        Sum +=
            Rule(bitOf(wholeOf(Left), Bit), bitOf(wholeOf(Right), Bit)) * (std::int64_t{1} << Bit);
    return static_cast<double>(wrapped(Sum));
}

std::int64_t countOf(double Number) {
    return ((wholeOf(Number) % 32) + 32) % 32;
}

double shiftedLeft(double Left, double Right) {
    std::int64_t Number = wholeOf(Left);
    for (std::int64_t i = 0; i < countOf(Right); ++i)
        Number = wrapped(2 * Number);
    return static_cast<double>(Number);
}

double shiftedRight(double Left, double Right) {
    return std::floor(static_cast<double>(wholeOf(Left)) /
                      static_cast<double>(std::int64_t{1} << countOf(Right)));
}

double remainderOf(double Left, double Right) {
    const std::int64_t a = wholeOf(Left);
    const std::int64_t b = wholeOf(Right);
    return b == 0 ? 0.0 : static_cast<double>(a - b * (a / b)) + 0.0;
}

TEST(ModelArithmetic, IntegerOperatorsAreThoseOfWholeNumbersIn32Bits) {
    const std::map<Operator, std::function<double(double, double)>> Judges = {
        {Operator::Modulo, remainderOf},
        {Operator::ShiftLeft, shiftedLeft},
        {Operator::ShiftRight, shiftedRight},
        {Operator::BitAnd,
         [](double a, double b) { return bitwise(a, b, [](int x, int y) { return x * y; }); }},
        {Operator::BitOr,
         [](double a, double b) { return bitwise(a, b, [](int x, int y) { return x + y > 0; }); }},
        {Operator::BitXor, [](double a, double b) {
             return bitwise(a, b, [](int x, int y) { return (x + y) % 2; });
         }}};
    for (const auto& [Op, Judge] : Judges) {
        for (const double Left : InterestingNumbers()) {
            for (const double Right : InterestingNumbers())
                ASSERT_TRUE(isSameNumber(hpn::computeBinary(Op, Left, Right), Judge(Left, Right)))
                    << static_cast<int>(Op) << ": " << Left << ", " << Right;
        }
    }
}

TEST(ModelArithmetic, TruncationTo64BitsAgreesWithExtendedPrecision) {
    for (const double Number : InterestingNumbers()) {
        const long double Whole = std::trunc(static_cast<long double>(Number));
        const bool Fits = Whole >= -9223372036854775808.0L && Whole <= 9223372036854775807.0L;
        EXPECT_EQ(hpn::truncateTo64(Number), Fits ? static_cast<std::int64_t>(Whole)
                                                  : std::numeric_limits<std::int64_t>::min())
            << Number;
    }
}

// Each operator of the client against the library's on two constants. The library leaves a zero
// divisor of `%` to the processor.
TEST(ModelArithmetic, AgreesWithTheLatticeOperatorsOnConstants) {
    const auto valueOf = [](Operator Op, double Left, double Right) {
        hpn::TermArena Arena;
        return hpn::valueOfTerm(
            Arena.makeBinary(Op, Arena.makeNumber(Left), Arena.makeNumber(Right)));
    };
    for (int i = static_cast<int>(Operator::Multiply); i <= static_cast<int>(Operator::Maximum);
         ++i) {
        const auto Op = static_cast<Operator>(i);
        for (const double Left : InterestingNumbers()) {
            for (const double Right : InterestingNumbers()) {
                const ZfCCfgValue Value = valueOf(Op, Left, Right);
                ASSERT_TRUE(Value.isConstant());
                ASSERT_TRUE(isSameNumber(Value.getValue(), hpn::computeBinary(Op, Left, Right)))
                    << i << ": " << Left << ", " << Right;
            }
        }
    }
    for (const Operator Op : {Operator::Negate, Operator::LogicalNot, Operator::Complement,
                              Operator::Absolute, Operator::Sign}) {
        for (const double Operand : InterestingNumbers()) {
            hpn::TermArena Arena;
            const ZfCCfgValue Value =
                hpn::valueOfTerm(Arena.makeUnary(Op, Arena.makeNumber(Operand)));
            EXPECT_TRUE(isSameNumber(Value.getValue(), hpn::computeUnary(Op, Operand))) << Operand;
        }
    }
}

TEST(ModelArithmetic, ZeroDivisorsAndTheSmallestNumberNeverFault) {
    const double Nothing = std::nan("");
    EXPECT_EQ(hpn::computeBinary(Operator::Modulo, 7.0, 0.5), 0.0);
    EXPECT_EQ(hpn::computeBinary(Operator::Modulo, -2147483648.0, -1.0), 0.0);
    EXPECT_EQ(hpn::computeBinary(Operator::Modulo, Nothing, Nothing), 0.0);
    EXPECT_EQ(hpn::computeBinary(Operator::Divide, 0.0, 0.0), 0.0);
    EXPECT_EQ(hpn::computeBinary(Operator::Multiply, Nothing, -0.0), 0.0);
    EXPECT_FALSE(std::signbit(hpn::computeBinary(Operator::Multiply, -1.0, 0.0)));
}

} // namespace
