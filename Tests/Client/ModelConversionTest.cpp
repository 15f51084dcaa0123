// Conversions of numbers against wide arithmetic, of ranges against all their numbers, and both
// against the library's setters.

#include "Generators/ModelTestNumbers.h"
#include "Model/Conversion.h"
#include "Model/ZfCCfgSFVariable.h"

#include <gtest/gtest.h>

#include <random>

namespace {

using namespace hpn;
using namespace hpn::test;

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

// Modular arithmetic on the real line, in extended precision.
long double reduced(long double Whole, Storage To) {
    const long double Period = std::exp2(static_cast<long double>(To.Bits));
    long double Rest = std::fmod(Whole, Period);
    if (Rest < 0)
        Rest += Period;
    return To.IsSigned && Rest >= Period / 2 ? Rest - Period : Rest;
}

double judge(double Number, const Type& To) {
    if (To.SaturatesHigh && Number > To.Upper)
        return To.Upper;
    if (To.SaturatesLow && Number < To.Lower)
        return To.Lower;
    if (To.Base == BaseType::Bool)
        return std::isnan(Number) || std::fabs(Number) > 0.0 ? 1.0 : 0.0;
    if (isFloating(To.Base)) {
        const double Held = To.Base == BaseType::Float32 ? static_cast<float>(Number) : Number;
        return Held == 0.0 ? 0.0 : Held;
    }
    const Storage Target = storageOf(To.Base);
    long double Whole =
        To.IsScaled ? std::round((Number - To.Offset) / To.Lsb) : std::trunc(Number);
    // The intermediate integer: 31 or 63 bits and a sign; outside it only its smallest number is
    // left.
    const long double Limit = std::exp2(Target.IsSigned && !To.IsScaled ? 31.0L : 63.0L);
    if (!(Whole >= -Limit && Whole < Limit))
        Whole = -Limit;
    const auto Raw = static_cast<double>(reduced(Whole, Target));
    return To.IsScaled ? Raw * To.Lsb + To.Offset : Raw + 0.0;
}

TEST(ModelConversion, EveryTypeAgreesWithModularArithmetic) {
    for (const Type& To : makeTypes()) {
        for (const double Number : InterestingNumbers())
            ASSERT_TRUE(isSameNumber(convertNumber(Number, To), judge(Number, To)))
                << static_cast<int>(To.Base) << " lsb " << To.Lsb << ": " << Number << " gives "
                << convertNumber(Number, To);
    }
}

TEST(ModelConversion, StoredNumbersStayWhereLimitsAreStable) {
    for (const Type& To : makeTypes()) {
        const bool IsStable =
            To.SaturatesHigh == isUpperClipStable(To) && To.SaturatesLow == isLowerClipStable(To);
        int Moved = 0;
        for (const double Number : InterestingNumbers()) {
            const double Once = convertNumber(Number, To);
            Moved += isSameNumber(convertNumber(Once, To), Once) ? 0 : 1;
        }
        for (double Number = -300.0; Number < 300.0; Number += 0.25) {
            const double Once = convertNumber(Number, To);
            Moved += isSameNumber(convertNumber(Once, To), Once) ? 0 : 1;
        }
        EXPECT_EQ(Moved > 0, !IsStable)
            << static_cast<int>(To.Base) << " " << To.Lower << " to " << To.Upper;
    }
}

// The library's setter gets what a right-hand side converted, and has to leave it alone, number and
// kind.
TEST(ModelConversion, SettersOfTheLibraryFindNothingLeftToChange) {
    for (const Type& To : makeTypes()) {
        Variable Declaration;
        Declaration.pType = &To;
        ZfCCfgSFVariable Stored(Declaration);
        for (const double Number : InterestingNumbers()) {
            ZfCCfgValue Value(convertNumber(Number, To));
            Stored.setVarValueAndAdjustCfgValue(Value);
            ASSERT_TRUE(Value.isConstant());
            ASSERT_TRUE(isSameNumber(Value.getValue(), convertNumber(Number, To)))
                << static_cast<int>(To.Base) << " lsb " << To.Lsb << ": " << Number;
        }
    }
}

TEST(ModelConversion, RawNumbersAndNumbersAreInverse) {
    for (const Type& Of : makeTypes()) {
        if (isFloating(Of.Base))
            continue;
        const std::int64_t Low = smallestRaw(Of.Base);
        const std::int64_t High = greatestRaw(Of.Base);
        for (const std::int64_t Raw :
             {Low, Low + 1, (Low + High) / 2, (Low + High) / 3, High - 1, High}) {
            EXPECT_EQ(rawOfNumber(numberOfRaw(Raw, Of), Of), Raw)
                << static_cast<int>(Of.Base) << " lsb " << Of.Lsb;
            EXPECT_TRUE(storageRange(Of).contains(numberOfRaw(Raw, Of)));
        }
    }
}

ValueRange makeRange(double Low, double High, bool IsIntegral, bool MayBeNaN) {
    ValueRange Range = hull(rangeOfNumber(Low), rangeOfNumber(High));
    Range.IsIntegral = IsIntegral;
    Range.MayBeNaN = MayBeNaN;
    return Range;
}

// Every number of a random interval on a grid is converted, also of grids that the type lacks.
TEST(ModelConversion, RangesHoldAllNumbersAndAreExactForNearlyAllIntervals) {
    std::mt19937 Random(7);
    const double Steps[] = {0.25, 0.5, 1.0, 2.0, 3.0};
    int Exact = 0;
    int Total = 0;
    for (const Type& To : makeTypes()) {
        for (int i = 0; i < 300; ++i, ++Total) {
            const double Step = Steps[i % 5];
            const int Count = static_cast<int>(Random() % 300);
            const double Low = static_cast<int>(Random() % 1400) - 700;
            ValueRange From = makeRange(Low, Low + Count * Step, Step >= 1.0, i % 7 == 0);
            From.Step = 0.0;
            setStep(From, Step);
            const ValueRange Converted = convertRange(From, To);
            ValueRange Seen = rangeOfNumber(convertNumber(Low, To));
            for (int n = 0; n <= Count; ++n) {
                const double Number = convertNumber(Low + n * Step, To);
                ASSERT_TRUE(Converted.contains(Number))
                    << static_cast<int>(To.Base) << ": " << Low + n * Step;
                Seen = hull(Seen, rangeOfNumber(Number));
            }
            if (From.MayBeNaN) {
                ASSERT_TRUE(Converted.contains(convertNumber(std::nan(""), To)));
                Seen = hull(Seen, rangeOfNumber(convertNumber(std::nan(""), To)));
            }
            Exact += Seen.Low == Converted.Low && Seen.High == Converted.High ? 1 : 0;
        }
    }
    EXPECT_GE(Exact, Total * 95 / 100) << Total;
}

TEST(ModelConversion, RangesWithBordersAndInfinitiesHoldTheirNumbers) {
    const std::vector<double>& Numbers = InterestingNumbers();
    for (const Type& To : makeTypes()) {
        for (const double Low : Numbers) {
            for (const double High : Numbers) {
                if (!(Low <= High))
                    continue;
                const ValueRange Converted = convertRange(makeRange(Low, High, false, false), To);
                for (const double Number : Numbers) {
                    if (Number < Low || Number > High || std::isnan(Number))
                        continue;
                    ASSERT_TRUE(Converted.contains(convertNumber(Number, To)))
                        << static_cast<int>(To.Base) << " [" << Low << ", " << High
                        << "]: " << Number;
                }
            }
        }
    }
}

} // namespace
