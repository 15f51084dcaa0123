#include "Stimulus.h"

#include "Model/Arithmetic.h"
#include "Model/Conversion.h"

#include <cmath>
#include <cstring>
#include <limits>

namespace hpn::fuzz {

namespace {

enum Stream : std::uint64_t {
    InputStream = 1,
    HoldStream,
    WriteStream,
    CallStream,
    ArgumentStream
};

std::uint64_t placeOf(std::uint64_t Major, std::uint64_t Middle, std::uint64_t Minor) {
    return (Major << 40) ^ (Middle << 16) ^ Minor;
}

double doubleOfBits(std::uint64_t Bits) {
    double Number;
    std::memcpy(&Number, &Bits, sizeof Number);
    return Number;
}

} // namespace

double Stimulus::input(unsigned Step, const Variable& Input, unsigned Element) const {
    // Some inputs stay for a step or two, so that states have time to build up.
    const std::uint64_t Hold =
        mixBits(m_Seed ^ (HoldStream << 56), placeOf(Step, Input.Index, Element));
    const unsigned Since = Step > 0 && Hold % 3 == 0 ? Step - 1 : Step;
    return pick(mixBits(m_Seed ^ (InputStream << 56), placeOf(Since, Input.Index, Element)),
                *Input.pType);
}

double Stimulus::written(unsigned Call, const Variable& Target, unsigned Element) const {
    return pick(mixBits(m_Seed ^ (WriteStream << 56), placeOf(Call, Target.Index, Element)),
                *Target.pType);
}

bool Stimulus::callsExported(unsigned Step, const Procedure& Exported) const {
    return mixBits(m_Seed ^ (CallStream << 56), placeOf(Step, Exported.Index, 0)) % 3 == 0;
}

double Stimulus::argument(unsigned Step, const Procedure& Exported, unsigned Formal) const {
    return pick(mixBits(m_Seed ^ (ArgumentStream << 56), placeOf(Step, Exported.Index, Formal)),
                *Exported.Formals[Formal]->pType);
}

double Stimulus::pick(std::uint64_t Bits, const Type& Of) {
    if (isFloating(Of.Base))
        return pickFloating(Bits, Of);
    const std::int64_t Low = smallestRaw(Of.Base);
    const std::int64_t High = greatestRaw(Of.Base);
    const std::uint64_t Rest = Bits >> 8;
    std::int64_t Raw = 0;
    switch (Bits % 8) {
    case 0:
        Raw = Low + static_cast<std::int64_t>(Rest % 3);
        break;
    case 1:
        Raw = High - static_cast<std::int64_t>(Rest % 3);
        break;
    case 2:
        Raw = Of.HasRange ? rawOfNumber((Rest & 1) != 0 ? Of.Lower : Of.Upper, Of) +
                                static_cast<std::int64_t>((Rest >> 1) % 3) - 1
                          : static_cast<std::int64_t>(Rest % 5) - 2;
        break;
    case 3:
        Raw = Low + static_cast<std::int64_t>(Rest % static_cast<std::uint64_t>(High - Low + 1));
        break;
    default:
        Raw = static_cast<std::int64_t>(Rest % 6) - (Low < 0 ? 2 : 0);
    }
    if (Raw < Low || Raw > High)
        Raw = Low;
    return numberOfRaw(Raw, Of);
}

double Stimulus::pickFloating(std::uint64_t Bits, const Type& Of) {
    static const double Numbers[] = {0.0,
                                     1.0,
                                     -1.0,
                                     0.5,
                                     2.0,
                                     255.0,
                                     256.0,
                                     -129.0,
                                     65536.0,
                                     2147483647.0,
                                     2147483648.0,
                                     -2147483649.0,
                                     4294967295.0,
                                     1e30,
                                     -1e300,
                                     1e-40,
                                     std::numeric_limits<double>::infinity(),
                                     -std::numeric_limits<double>::infinity(),
                                     std::numeric_limits<double>::quiet_NaN()};
    const std::uint64_t Rest = Bits >> 8;
    double Number = 0.0;
    switch (Bits % 8) {
    case 0:
    case 1:
        Number = Numbers[Rest % (sizeof Numbers / sizeof *Numbers)];
        break;
    case 2:
        Number = Of.HasRange ? ((Rest & 1) != 0 ? Of.Lower : Of.Upper) +
                                   static_cast<double>((Rest >> 1) % 3) - 1.0
                             : static_cast<double>(Rest % 7) / 2.0;
        break;
    case 3:
        Number = doubleOfBits(mixBits(Bits, 7));
        break;
    default:
        Number = static_cast<double>(Rest % 4096) / 16.0 - 64.0;
    }
    // No storage holds a negative zero.
    return (Of.Base == BaseType::Float32 ? roundToSingle(Number) : Number) + 0.0;
}

} // namespace hpn::fuzz
