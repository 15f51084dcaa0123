#ifndef MODELTESTNUMBERS_H
#define MODELTESTNUMBERS_H

#include "Language/Program.h"

#include <cmath>
#include <cstring>
#include <limits>
#include <vector>

namespace hpn::test {

/// Same bits; any NaN is like any other.
inline bool isSameNumber(double a, double b) {
    return (std::isnan(a) && std::isnan(b)) || std::memcmp(&a, &b, sizeof a) == 0;
}

/// Small numbers and the borders of all storages, each with its neighbours on the real line;
/// infinities, NaN, both zeros.
inline const std::vector<double>& InterestingNumbers() {
    static const std::vector<double> s_Numbers = [] {
        const double Infinity = std::numeric_limits<double>::infinity();
        std::vector<double> Numbers = {0.0,    -0.0,    std::nan(""), Infinity, -Infinity,
                                       5e-324, -5e-324, 1e300,        -1e300,   0.1};
        for (const double Border : {1.0,
                                    2.0,
                                    3.0,
                                    31.0,
                                    32.0,
                                    33.0,
                                    127.0,
                                    128.0,
                                    255.0,
                                    256.0,
                                    32767.0,
                                    32768.0,
                                    65535.0,
                                    65536.0,
                                    16777217.0,
                                    2147483647.0,
                                    2147483648.0,
                                    2147483649.0,
                                    4294967295.0,
                                    4294967296.0,
                                    9223372036854775808.0,
                                    18446744073709551616.0,
                                    3.4028235677973366e38}) {
            for (const double Sign : {1.0, -1.0}) {
                Numbers.push_back(Sign * Border);
                Numbers.push_back(Sign * std::nextafter(Border, 0.0));
                Numbers.push_back(Sign * std::nextafter(Border, Infinity));
                Numbers.push_back(Sign * (Border + 0.5));
            }
        }
        return Numbers;
    }();
    return s_Numbers;
}

/// A type as the reader would make it.
inline Type makeType(BaseType Base, double Lsb = 1.0, double Offset = 0.0) {
    Type Made;
    Made.Name = "T";
    Made.Base = Base;
    Made.IsBuiltIn = false;
    Made.IsScaled = Lsb != 1.0 || Offset != 0.0;
    Made.Lsb = Lsb;
    Made.Offset = Offset;
    return Made;
}

inline Type saturating(Type Of, double Lower, double Upper, bool Low = true, bool High = true) {
    Of.HasRange = true;
    Of.Lower = Lower;
    Of.Upper = Upper;
    Of.SaturatesLow = Low;
    Of.SaturatesHigh = High;
    return Of;
}

/// All storages, scaled ones, and each way to saturate.
inline std::vector<Type> makeTypes() {
    std::vector<Type> Types;
    for (int i = 0; i <= static_cast<int>(BaseType::Float64); ++i)
        Types.push_back(makeType(static_cast<BaseType>(i)));
    const Type Scaled = makeType(BaseType::UInt8, 0.5, -10.0);
    const Type Tenths = makeType(BaseType::Int16, 0.1, 0.0);
    for (const Type& Next :
         {Scaled, Tenths, makeType(BaseType::Int8, 0.25, 3.0),
          makeType(BaseType::UInt32, 2.0, -7.0), makeType(BaseType::Int32, 0.01, 0.0)})
        Types.push_back(Next);
    Types.push_back(saturating(Scaled, -5.0, 100.0));
    Types.push_back(saturating(Scaled, -5.0, 100.0, false, true));
    Types.push_back(saturating(makeType(BaseType::Int8), -100.0, 50.0));
    Types.push_back(saturating(makeType(BaseType::Int8), -100.0, 50.0, true, false));
    Types.push_back(saturating(makeType(BaseType::UInt8), 0.0, 200.0, false, true));
    Types.push_back(saturating(makeType(BaseType::UInt16), 10.0, 65535.0));
    Types.push_back(saturating(makeType(BaseType::Float32), -0.5, 0.5));
    Types.push_back(saturating(makeType(BaseType::Float64), 0.0, 1e6, true, false));
    return Types;
}

} // namespace hpn::test

#endif
