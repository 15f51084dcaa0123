#ifndef TYPECHECKER_H
#define TYPECHECKER_H

#include "Language/Diagnostics.h"
#include "Language/Program.h"

#include <cstdint>
#include <string>
#include <string_view>

namespace hpn {

/// Judges the options of one declared type: which may stand together, whether its grid is exact in
/// a double, whether its limits lie in the storage and on the grid. Puts limits on the grid
/// exactly, so that a clipped number is one the variable can hold. A type with a mistake is left
/// unscaled and without a range, so that it causes no others.
class TypeChecker {
public:
    TypeChecker(Diagnostics& Messages, Type& Declared) : m_Messages(Messages), m_Type(Declared) {}

    /// Notes an option, and complains if it has been there before.
    void enterOption(std::string_view Option, SourcePosition Position);
    void check();

private:
    enum Option : std::uint8_t { Lsb, Offset, Range, Saturate, OptionCount };

    bool has(Option Which) const { return m_IsSet[Which]; }
    bool checkScaling();
    bool checkLimits();
    bool placeLimit(double& Limit);
    bool placeOnGrid(double& Limit);
    bool fail(Option Which, std::string Text);

    Diagnostics& m_Messages;
    Type& m_Type;
    bool m_IsSet[OptionCount] = {};
    SourcePosition m_Positions[OptionCount];
};

} // namespace hpn

#endif
