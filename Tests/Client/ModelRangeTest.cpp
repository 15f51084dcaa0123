// Interval arithmetic against all numbers of small domains: never too narrow, and as narrow as an
// interval can be.

#include "Generators/ModelTestNumbers.h"
#include "Model/Term.h"
#include "Model/ValueRange.h"
#include "Ranges/RangeProof.h"

#include <gtest/gtest.h>

#include <fstream>
#include <limits>
#include <random>
#include <sstream>
#include <vector>

namespace {

using namespace hpn;
using namespace hpn::test;

std::vector<Operator> binaryOperators() {
    std::vector<Operator> Operators;
    for (int i = static_cast<int>(Operator::Multiply); i <= static_cast<int>(Operator::Maximum);
         ++i)
        Operators.push_back(static_cast<Operator>(i));
    return Operators;
}

const std::vector<Operator> UnaryOperators = {Operator::Negate, Operator::LogicalNot,
                                              Operator::Complement, Operator::Absolute,
                                              Operator::Sign};

/// Counts how often a range equals what was seen, and fails where it lacks something.
struct Tally {
    int Total = 0;
    int Exact = 0;

    void add(const ValueRange& Claimed, const std::vector<double>& Seen) {
        ValueRange Hull = rangeOfNumber(Seen.front());
        for (const double Number : Seen) {
            ASSERT_TRUE(Claimed.contains(Number))
                << Number << " in " << Claimed.Low << " to " << Claimed.High;
            Hull = hull(Hull, rangeOfNumber(Number));
        }
        ++Total;
        Exact += Hull.Low == Claimed.Low && Hull.High == Claimed.High &&
                         Hull.MayBeNaN == Claimed.MayBeNaN &&
                         Hull.MayBeNegativeZero == Claimed.MayBeNegativeZero
                     ? 1
                     : 0;
    }
};

// All intervals and pairs of intervals of types of sixteen numbers, judged by exact arithmetic. The
// operators are as narrow as intervals can be; what is lost between an operator and a store behind
// it is counted in the table, which hpnranges prints.
TEST(ModelRange, SmallDomainsAreProved) {
    const std::vector<proof::Finding> Findings = proof::proveRanges(false);
    for (const proof::Finding& Next : Findings) {
        EXPECT_EQ(Next.Narrow, 0U) << proof::describe(Next);
        if (Next.pStore == nullptr && Next.pRight == Next.pDomain) {
            EXPECT_GE(Next.Exact * 100, Next.Cases * 95) << proof::describe(Next);
        }
    }
    std::ostringstream Kept;
    Kept << std::ifstream(HPNSSA_SOURCE_DIR "/Documentation/Ranges.txt").rdbuf();
    EXPECT_EQ(proof::printTable(Findings), Kept.str()) << "hpnranges > Documentation/Ranges.txt";
}

// Numbers on a grid, next to each other or with gaps.
struct Row {
    ValueRange Range;
    std::vector<double> Numbers;
};

Row makeRow(double Low, double Step, int Count) {
    Row Made;
    for (int i = 0; i < Count; ++i)
        Made.Numbers.push_back(Low + i * Step);
    Made.Range = hull(rangeOfNumber(Low), rangeOfNumber(Made.Numbers.back()));
    Made.Range.Step = 0.0; // two numbers know that there is none between them
    setStep(Made.Range, Step);
    return Made;
}

// Bit operators and shifts where the sign bit and the window of 32 bits matter: numbers around the
// borders, up to more than are looked at one by one.
TEST(ModelRange, IntegerOperatorsAtTheBordersOf32Bits) {
    std::mt19937 Random(11);
    const double Borders[] = {-2147483648.0, -1073741824.0, -65536.0,     0.0,
                              65536.0,       1073741824.0,  2147483640.0, 2147483648.0};
    const double Steps[] = {1.0, 1.0, 2.0, 3.0, 4.0, 16.0};
    for (const Operator Op : {Operator::BitAnd, Operator::BitOr, Operator::BitXor,
                              Operator::ShiftLeft, Operator::ShiftRight, Operator::Modulo}) {
        Tally Result;
        for (int i = 0; i < 4000; ++i) {
            const double a = Borders[Random() % 8] + static_cast<int>(Random() % 24) - 12;
            const double c = (Random() % 2 != 0 ? Borders[Random() % 8] : 0.0) +
                             static_cast<int>(Random() % 40) - 8;
            const Row Left = makeRow(a, Steps[Random() % 6], 1 + static_cast<int>(Random() % 48));
            const Row Right = makeRow(c, Steps[Random() % 6], 1 + static_cast<int>(Random() % 12));
            std::vector<double> Seen;
            for (const double x : Left.Numbers) {
                for (const double y : Right.Numbers)
                    Seen.push_back(computeBinary(Op, x, y));
            }
            Result.add(rangeOfBinary(Op, Left.Range, Right.Range), Seen);
            if (HasFatalFailure())
                return;
        }
        EXPECT_GE(Result.Exact * 100, Result.Total * 85)
            << static_cast<int>(Op) << ": " << Result.Exact;
    }
}

// Numbers without a neighbour: every range over them, with and without NaN and negative zero.
const double Special[] = {-std::numeric_limits<double>::infinity(),
                          -1e308,
                          -2.5,
                          -1.0,
                          -5e-324,
                          0.0,
                          5e-324,
                          0.5,
                          1.0,
                          3e9,
                          1e308,
                          std::numeric_limits<double>::infinity()};

struct SpecialRange {
    ValueRange Range;
    std::vector<double> Numbers;
};

std::vector<SpecialRange> specialRanges() {
    std::vector<SpecialRange> Ranges;
    const auto add = [&Ranges](std::vector<double> Numbers, const ValueRange& Ends) {
        ValueRange Range = Ends;
        for (const double Number : Numbers)
            Range = hull(Range, rangeOfNumber(Number));
        Ranges.push_back({Range, Numbers});
    };
    for (std::size_t i = 0; i < 12; ++i) {
        std::vector<double> Numbers;
        for (std::size_t j = i; j < 12; ++j) {
            Numbers.push_back(Special[j]);
            const ValueRange Ends = rangeOfNumber(Special[i]);
            add(Numbers, Ends);
            std::vector<double> More = Numbers;
            More.push_back(std::nan(""));
            add(More, Ends);
            if (i <= 5 && j >= 5) {
                More.push_back(-0.0);
                add(More, Ends);
            }
        }
    }
    Ranges.push_back({rangeOfNumber(std::nan("")), {std::nan("")}});
    return Ranges;
}

TEST(ModelRange, SpecialNumbersAreNeverLost) {
    const std::vector<SpecialRange> Ranges = specialRanges();
    for (const Operator Op : binaryOperators()) {
        for (const SpecialRange& Left : Ranges) {
            for (const SpecialRange& Right : Ranges) {
                const ValueRange Claimed = rangeOfBinary(Op, Left.Range, Right.Range);
                for (const double a : Left.Numbers) {
                    for (const double b : Right.Numbers)
                        ASSERT_TRUE(Claimed.contains(computeBinary(Op, a, b)))
                            << static_cast<int>(Op) << ": " << a << ", " << b << " in "
                            << Claimed.Low << " to " << Claimed.High;
                }
            }
        }
    }
    for (const Operator Op : UnaryOperators) {
        for (const SpecialRange& Next : Ranges) {
            for (const double Number : Next.Numbers)
                ASSERT_TRUE(rangeOfUnary(Op, Next.Range).contains(computeUnary(Op, Number)))
                    << Number;
        }
    }
}

// A greater operand never gives a smaller result: otherwise propagation could narrow a range that
// had to grow.
TEST(ModelRange, ResultsGrowWithTheirOperands) {
    const std::vector<SpecialRange> Ranges = specialRanges();
    std::mt19937 Random(3);
    const auto pick = [&]() -> const ValueRange& { return Ranges[Random() % Ranges.size()].Range; };
    for (const Operator Op : binaryOperators()) {
        for (int i = 0; i < 4000; ++i) {
            const ValueRange Left = pick();
            const ValueRange Right = pick();
            const ValueRange Narrow = rangeOfBinary(Op, Left, Right);
            ASSERT_TRUE(Narrow.isWithin(rangeOfBinary(Op, hull(Left, pick()), hull(Right, pick()))))
                << static_cast<int>(Op);
        }
    }
}

} // namespace
