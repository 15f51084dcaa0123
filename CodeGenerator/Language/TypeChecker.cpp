#include "Language/TypeChecker.h"

#include "Language/NumberText.h"
#include "Language/ReaderState.h"
#include "Model/Conversion.h"

#include <cmath>
#include <utility>

namespace hpn {

namespace {

constexpr double GreatestLsb = 1e100;
constexpr double SmallestLsb = 1e-100;

} // namespace

void TypeChecker::enterOption(std::string_view Option, SourcePosition Position) {
    constexpr std::string_view Names[OptionCount] = {"lsb", "offset", "range", "saturate"};
    for (std::size_t Which = 0; Which < OptionCount; ++Which) {
        if (Names[Which] != Option) {
            continue;
        }
        if (std::exchange(m_IsSet[Which], true)) {
            m_Messages.error(Position, quotedName(Option) + " stands twice");
        }
        m_Positions[Which] = Position;
    }
}

void TypeChecker::check() {
    if (checkScaling() && checkLimits()) {
        return;
    }
    m_Type.IsScaled = false;
    m_Type.Lsb = 1.0;
    m_Type.Offset = 0.0;
    m_Type.HasRange = false;
    m_Type.SaturatesLow = false;
    m_Type.SaturatesHigh = false;
}

bool TypeChecker::fail(Option Which, std::string Text) {
    m_Messages.error(m_Positions[Which], std::move(Text));
    return false;
}

bool TypeChecker::checkScaling() {
    const Option Which = has(Lsb) ? Lsb : Offset;
    if (!has(Lsb) && !has(Offset)) {
        return true;
    }
    if (isFloating(m_Type.Base) || m_Type.Base == BaseType::Bool) {
        return fail(Which, "only integer types can be scaled");
    }
    if (!(m_Type.Lsb >= SmallestLsb && m_Type.Lsb <= GreatestLsb)) {
        return fail(Which,
                    "lsb is " + numberText(m_Type.Lsb) + "; it must lie between 1e-100 and 1e100");
    }
    // Every raw number must lead to a number of its own and back; a double has 53 bits for that,
    // and some are kept for the rounding of the two operations.
    constexpr double RawNumbers = 4294967296.0;         // 2^32
    constexpr double ExactNumbers = 1125899906842624.0; // 2^50
    if (!(std::fabs(m_Type.Offset) / m_Type.Lsb + RawNumbers < ExactNumbers)) {
        return fail(has(Offset) ? Offset : Lsb,
                    "the offset is too large for the lsb: float64 cannot hold the numbers");
    }
    m_Type.Offset += 0.0; // a negative zero would show in every number
    m_Type.IsScaled = m_Type.Lsb != 1.0 || m_Type.Offset != 0.0;
    return true;
}

bool TypeChecker::checkLimits() {
    if (!has(Range)) {
        return !has(Saturate) || fail(Saturate, "'saturate' needs a range");
    }
    if (!placeLimit(m_Type.Lower) || !placeLimit(m_Type.Upper)) {
        return false;
    }
    if (m_Type.Lower > m_Type.Upper) {
        return fail(Range, "the lower limit " + numberText(m_Type.Lower) +
                               " is greater than the upper limit " + numberText(m_Type.Upper));
    }
    return true;
}

bool TypeChecker::placeLimit(double& Limit) {
    if (!std::isfinite(Limit)) {
        return fail(Range, "a limit must be a finite number");
    }
    if (!isFloating(m_Type.Base)) {
        return placeOnGrid(Limit);
    }
    Type Plain; // of the same storage, without the limits that are being checked
    Plain.Base = m_Type.Base;
    const double Stored = convertNumber(Limit, Plain);
    if (!std::isfinite(Stored)) {
        return fail(Range, "limit " + numberText(Limit) + " lies outside the storage");
    }
    Limit = Stored;
    return true;
}

bool TypeChecker::placeOnGrid(double& Limit) {
    constexpr double Tolerance = 1e-6; // of a step
    const double Raw = (Limit - m_Type.Offset) / m_Type.Lsb;
    const double Nearest = std::round(Raw);
    const auto Smallest = static_cast<double>(smallestRaw(m_Type.Base));
    const auto Greatest = static_cast<double>(greatestRaw(m_Type.Base));
    if (Nearest < Smallest || Nearest > Greatest) {
        return fail(Range, "limit " + numberText(Limit) +
                               " lies outside the storage, which holds " +
                               numberText(Smallest * m_Type.Lsb + m_Type.Offset) + " to " +
                               numberText(Greatest * m_Type.Lsb + m_Type.Offset));
    }
    if (std::fabs(Raw - Nearest) > Tolerance) {
        return fail(Range, "limit " + numberText(Limit) +
                               " is not on the grid of the type, whose step is " +
                               numberText(m_Type.Lsb));
    }
    Limit = numberOfRaw(static_cast<std::int64_t>(Nearest), m_Type) + 0.0;
    return true;
}

} // namespace hpn
