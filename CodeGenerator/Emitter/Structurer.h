#ifndef STRUCTURER_H
#define STRUCTURER_H

#include <cstdint>
#include <vector>

namespace hpn {

/// What stands for leaving the procedure where a node is asked for.
constexpr int ReturnTarget = -1;

/// One node of a procedure's control flow, as far as its structure goes: some code or none, then a
/// jump or a branch to other nodes (by number) or to `ReturnTarget`. A branch has two different
/// targets.
struct FlowNode {
    bool HasCode = false;
    bool IsBranch = false;
    int True = ReturnTarget;  ///< target of the jump, or of the branch where its condition holds
    int False = ReturnTarget; ///< branch only
};

enum class StructureKind : std::uint8_t {
    Label,   ///< place a goto leads to; only the ones that are needed are given
    Code,    ///< the node's own code
    If,      ///< if (condition) {
    ElseIf,  ///< } else if (condition) {
    Else,    ///< } else {
    While,   ///< while (condition) {
    Forever, ///< for (;;) {
    Do,      ///< do {
    End,     ///< }
    EndDo,   ///< } while (condition);
    Goto,    ///< goto the node's label
    Break,
    Continue,
    Return
};

/// One step of the structured program text.
struct StructureToken {
    StructureKind Kind;
    bool Negated = false; ///< If, ElseIf, While, EndDo: the node's condition is to be negated
    int Node = ReturnTarget;
};

/// The control flow of a procedure as structured text: node 0 is entered first, every node has to
/// be reachable from it, and each node's code comes out exactly once. Loops come out as `while`,
/// `do` and `for (;;)`; a goto is left where a jump is not a `break` or a `continue` of the
/// innermost loop, and where the graph is irreducible. The same graph gives the same tokens. Costs
/// near-linear time, no recursion.
std::vector<StructureToken> structureFlow(const std::vector<FlowNode>& Nodes);

/// Immediate dominators by node (of node 0: itself), each node reachable from node 0.
std::vector<int> immediateDominators(const std::vector<FlowNode>& Nodes);

} // namespace hpn

#endif
