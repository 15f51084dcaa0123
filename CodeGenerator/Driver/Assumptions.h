#ifndef ASSUMPTIONS_H
#define ASSUMPTIONS_H

#include "Language/Program.h"

#include <string>
#include <vector>

namespace hpn {

/// What the user wants to hold for one run: params with another value than the declared one, and
/// inputs that are believed to stay in a range.
class Assumptions {
public:
    /// Takes "NAME=VALUE". False: `Why` says what is wrong with it.
    bool addSetting(const std::string& Text, std::string& Why);
    /// Takes "INPUT=LO..HI" likewise.
    bool addRange(const std::string& Text, std::string& Why);

    bool isEmpty() const { return m_Settings.empty() && m_Ranges.empty(); }
    /// Before the program is read: values that other declarations are computed from.
    void prepare(Program& Target) const;
    /// After it was read. False: a name or a number does not fit the program, and `Why` says how.
    bool apply(Program& Target, std::string& Why) const;
    /// One sentence each, for reports and the head of the C.
    std::vector<std::string> describe() const;

private:
    struct Setting {
        std::string Name;
        double Value;
        std::string Text; ///< of the value, as given
    };
    struct Range {
        std::string Name;
        double Low;
        double High;
        std::string Text; ///< of the range, as given
    };

    static bool applyRange(const Range& Believed, Program& Target, std::string& Why);

    std::vector<Setting> m_Settings;
    std::vector<Range> m_Ranges;
};

} // namespace hpn

#endif
