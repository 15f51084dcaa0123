#ifndef PASSSEQUENCE_H
#define PASSSEQUENCE_H

#include <array>
#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace hpn {

class ProgramGraph;

/// The passes of the road, in the order in which they usually run. The first one only runs where it
/// is asked for.
enum class PassId : unsigned char {
    MakeProcedureAndCall,
    PlaceExitNodes,
    InlineProcedures,
    PlaceLoopAroundMain,
    InsertValidConditionAssignments,
    TransformToSSAForm,
    DivideBasicBlock,
    PropagateSparseConditionalConstant,
    ReplaceConstantConditions,
    ReplaceConstantVariables,
    FoldConstants,
    RemoveUnusedVarDefs,
    HoistCodeOutOfIfElseBranches
};
constexpr std::size_t PassCount = 13;

/// What is known of one pass: the name under which the user asks for it, one line for the help, and
/// the operation of the graph.
struct Pass {
    PassId Id;
    const char* Name;
    const char* Purpose;
    void (*pRun)(ProgramGraph&);
};

/// All passes, by PassId.
const std::array<Pass, PassCount>& passTable();
const Pass& passOf(PassId Id);

/// How two passes hang together.
enum class OrderRelation : unsigned char {
    Needs,       ///< the other one has to come before
    CannotFollow ///< the other one must not have run; with itself: runs once
};

/// One rule of the order, with its reason as the second half of a sentence.
struct OrderRule {
    PassId Pass;
    OrderRelation Relation;
    PassId Other;
    const char* Reason;
};

/// Passes in an order that keeps every precondition. The library enforces no order; a sequence can
/// only be made by the functions below, so whoever holds one need not check it again. The rules are
/// a table; the checks are linear in rules times passes.
class PassSequence {
public:
    /// No pass at all: the code is emitted as it was built.
    PassSequence() = default;
    /// The whole road, without the extraction of labels.
    static PassSequence defaultOrder();
    /// Reads names separated by commas (blanks around them do not count; an empty text is no pass).
    /// False leaves `Result` alone and writes one sentence, without a full stop, that says what is
    /// wrong and why.
    static bool parse(std::string_view List, PassSequence& Result, std::string& Message);
    /// The same for passes that are there already.
    static bool make(const std::vector<PassId>& Ids, PassSequence& Result, std::string& Message);

    /// Puts the extraction of labels in front, if it is not there yet; no rule stands against it.
    void extractLabelsFirst();

    const std::vector<PassId>& getPasses() const { return m_Passes; }
    bool contains(PassId Id) const;

private:
    std::vector<PassId> m_Passes;
};

} // namespace hpn

#endif
