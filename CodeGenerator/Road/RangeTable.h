#ifndef RANGETABLE_H
#define RANGETABLE_H

#include "Language/Program.h"
#include "Road/PassRunner.h"

#include <algorithm>
#include <string>
#include <vector>

namespace hpn {

class SourceFiles;

/// What the propagation has found of one number.
struct Finding {
    enum class Kind : unsigned char {
        Undetermined, ///< nothing: never reached, or a loop that only feeds itself
        Constant,     ///< always Low
        Range,        ///< between Low and High
        Anything      ///< whatever the type can hold
    };
    Kind What = Kind::Undetermined;
    double Low = 0.0;
    double High = 0.0;

    std::string toText() const;
};

/// What is found where one of two values arrives: the hull, and nothing while one of them is
/// undetermined. For `Finding` and structures of its shape.
template <class TFinding>
TFinding joinFindings(const TFinding& a, const TFinding& b) {
    using Kind = typename TFinding::Kind;
    if (a.What == Kind::Undetermined || b.What == Kind::Undetermined)
        return {Kind::Undetermined, 0.0, 0.0};
    if (a.What == Kind::Anything || b.What == Kind::Anything)
        return {Kind::Anything, 0.0, 0.0};
    const double Low = std::min(a.Low, b.Low);
    const double High = std::max(a.High, b.High);
    const bool IsOne = a.What == Kind::Constant && b.What == Kind::Constant && Low == High;
    return {IsOne ? Kind::Constant : Kind::Range, Low, High};
}

/// One definition of a variable and what its version was found to be.
struct VersionFinding {
    enum class Origin : unsigned char {
        InitialValue,
        Assignment,
        Argument,
        Call,  ///< what a call leaves in the variable
        Join,  ///< where ways of control meet
        Branch ///< what a condition tells
    };
    Origin From = Origin::Assignment;
    bool HasPosition = false;
    SourcePosition Position;
    Finding Found;
};

/// One variable of the source. Arrays and what the outside changes at any time are not tracked and
/// have no versions.
struct RangeRow {
    const Variable* pVariable = nullptr;
    const char* NotTracked = nullptr; ///< the reason, or null
    std::vector<VersionFinding> Versions;

    /// Over all versions: undetermined as soon as one of them is, since the rest tells only a part.
    Finding summary() const;
};

/// The findings by variable, in the order of declaration; variables that no definition on the graph
/// names are left out.
std::vector<RangeRow> collectRanges(ProgramGraph& Graph);
/// The table as text: one line for each variable, and below it one for each definition where there
/// are several.
std::string printRanges(const std::vector<RangeRow>& Rows, const SourceFiles& Sources);

/// Keeps the findings of the last propagation, before later passes take definitions away.
class RangeObserver : public PassObserver {
public:
    void afterPass(const PassStep& Step, ProgramGraph& Graph) override;
    const std::vector<RangeRow>& getRows() const { return m_Rows; }

private:
    std::vector<RangeRow> m_Rows;
};

} // namespace hpn

#endif
