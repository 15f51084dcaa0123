#ifndef FLOWREADER_H
#define FLOWREADER_H

#include "Emitter/BranchTest.h"
#include "Emitter/Structurer.h"
#include "Graph/ProgramGraph.h"

#include <deque>
#include <unordered_set>
#include <vector>

class ZfCBasicBlock;
class ZfCCfgSFProcedureCall;
class ZfCCfgStatement;

namespace hpn {

enum class FlowItemKind : std::uint8_t {
    Assign,  ///< pTarget takes pTerm; of an element store pTerm is the store
    Discard, ///< pTerm is evaluated for the inputs that it reads
    Call,
    CallExtern
};

/// One thing that a block does in C.
struct FlowItem {
    FlowItemKind Kind;
    const Term* pTerm = nullptr;
    const Variable* pTarget = nullptr;
    ZfCCfgSFProcedureCall* pCall =
        nullptr; ///< null for a call that the optimiser made: it has no arguments
    ZfCCfgProcedureCall* pAnyCall = nullptr;
    const Extern* pExtern = nullptr;
};

/// A procedure's code in straight pieces: node i of `Nodes` has the items [FirstItem[i],
/// FirstItem[i + 1]) and, if it is a branch, the tests Tests[i].
struct ProcedureFlow {
    std::vector<FlowNode> Nodes; ///< none: the procedure does nothing
    std::vector<std::size_t> FirstItem;
    std::vector<BranchTests> Tests; ///< by node, none: no branch
    std::vector<FlowItem> Items;
    std::vector<const Variable*>
        Parameters;         ///< of the parameter statements that stand in the blocks
    bool IsSSAForm = false; ///< statements of SSA form were seen
};

/// Reads procedures out of the graph by walking the control flow from their entry nodes; SSA edges
/// are passed over. Blocks that do nothing vanish, a branch with one way left becomes a jump, and
/// straight pieces become one node.
class FlowReader {
public:
    explicit FlowReader(ProgramGraph& Graph);

    /// Assignments to these variables are left out; what they read of inputs is still read.
    void leaveOut(const Variable* pVariable) { m_LeftOut.insert(pVariable); }
    ProcedureFlow read(leda::node EntryNode);

private:
    struct RawNode {
        leda::node Node = nullptr;
        std::size_t FirstItem = 0;
        std::size_t EndItem = 0;
        const Term* pCondition = nullptr; // a branch
        const Term* pDiscarded = nullptr; // a condition that decides nothing but reads inputs
        int True = ReturnTarget;
        int False = ReturnTarget;
        int Resolved = 0; // the node that is reached by going here
        bool IsEmpty() const { return FirstItem == EndItem && !pCondition && !pDiscarded; }
    };

    void collect(leda::node First);
    int rawNumber(leda::node v);
    void readBlock(int Number, ZfCBasicBlock* pBlock);
    void readStatement(ZfCCfgStatement* pStatement);
    void readAssignment(ZfCCfgAssignment* pAssignment);
    void readExit(int Number, ZfCBasicBlock* pBlock);
    void becomeJump(RawNode& Node, int Target);
    void skipEmptyNodes();
    int resolve(int Number);
    ProcedureFlow assemble();
    std::vector<int> countWaysIn(int First) const;
    void appendPiece(int Leader, const std::vector<int>& NumberOf, ProcedureFlow& Result);

    ProgramGraph& m_Graph;
    std::unordered_set<const Variable*> m_LeftOut;
    std::vector<int> m_NumberOf; // by index of the graph's node, of the procedure in hand
    std::deque<RawNode> m_Raw;   // grows without moving
    std::vector<FlowItem> m_Items;
    ProcedureFlow m_Notes; // parameters and form
};

/// The source variable behind a variable of the graph.
const Variable* declarationOf(ZfCCfgVariable* pVariable);

} // namespace hpn

#endif
