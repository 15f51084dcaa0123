// Sparse conditional constant propagation: the visit of one node.
//
// A visit computes value, minimum and maximum from the operands, stores all three in the variable
// that the node defines, and decides which edges go onto the work lists (M. N. Wegman and F. K.
// Zadeck, Constant propagation with conditional branches, ACM Transactions on Programming
// Languages and Systems 13(2), 1991). The variable's setters know type, scaling and saturation:
// what is compared afterwards is what the target would really hold.
//
// Departures, all wanted: a change of the range alone is no change. A condition that is still
// undetermined opens both branches. A phi function reads all its operands whatever the flags of
// its in-edges, and sends no edges.

#include "ZfCControlFlowGraph.h"

#include "ZfCCfgValueMerge.h"
#include "ZfCPropagationState.h"

#include <algorithm>
#include <cstring>

namespace {

// The number counts only while it is constant, and then by its bits: this decides whether users
// look again, and a NaN or the other zero is a change for them.
bool isSame(const ZfCCfgValue& a, const ZfCCfgValue& b) {
    const double Left = a.getValue();
    const double Right = b.getValue();
    return a.getValueKind() == b.getValueKind() &&
           (!a.isConstant() || std::memcmp(&Left, &Right, sizeof(double)) == 0);
}

// Value and range of a variable before a visit.
class ChangeWatch {
public:
    explicit ChangeWatch(ZfCCfgVariable* pVariable)
        : m_pVariable(pVariable), m_Value(pVariable->getValue()), m_Min(pVariable->getMinValue()),
          m_Max(pVariable->getMaxValue()) {}

    ZfCCfgValue& oldValue() { return m_Value; }
    bool hasChanged() const {
        return !isSame(m_Value, m_pVariable->getValue()) ||
               !isSame(m_Min, m_pVariable->getMinValue()) ||
               !isSame(m_Max, m_pVariable->getMaxValue());
    }

private:
    ZfCCfgVariable* m_pVariable;
    ZfCCfgValue m_Value;
    ZfCCfgValue m_Min;
    ZfCCfgValue m_Max;
};

// The common visit of an assignment, a parameter and a value return statement; Source is what
// gives value and range.
template <class TSource>
void visitDefinition(ZfCPropagationState& State, ZfCCfgVariable* pVariable, TSource* pSource,
                     int Node, ZfCWorkList& SSAEdgeList, bool& FoundNewConstant) {
    // Step 1.
    ChangeWatch Watch(pVariable);
    ZfCCfgValue OldValue = Watch.oldValue();
    // Steps 2 and 3: afterwards the value is what the variable can hold of it.
    ZfCCfgValue RHSValue = pSource->evaluate();
    pVariable->setVarValueAndAdjustCfgValue(RHSValue);
    // Step 4: the range is stored at every visit.
    pVariable->setMinValueAndDestroyOld(pSource->getMinimum());
    pVariable->setMaxValueAndDestroyOld(pSource->getMaximum());
    if (Watch.hasChanged()) {
        State.markUsersDirty(Node);
    }
    // Step 5.
    if (OldValue.compare(RHSValue) == 0) {
        return;
    }
    // Step 6: only the step from undetermined to constant asks for another iteration.
    if (OldValue.isUndetermined() && RHSValue.isConstant()) {
        FoundNewConstant = true;
    }
    // Step 7: any change of value concerns the users.
    State.appendUsers(Node, SSAEdgeList);
}

// The distinct operands of a phi function in the order of variables. Nearly all have few.
class PhiOperands {
public:
    explicit PhiOperands(ZfCPhiFunction* pPhi) {
        leda::array<ZfCCfgVariable*> const& Operands = pPhi->showReplacementVariables();
        for (int i = 0; i < Operands.size(); ++i) {
            if (Operands[i] == nullptr || !insert(Operands[i])) {
                copy(pPhi->getUsedVariables());
                return;
            }
        }
    }

    ZfCCfgVariable* const* begin() const { return m_pFirst; }
    ZfCCfgVariable* const* end() const { return m_pFirst + m_Size; }
    int size() const { return m_Size; }

private:
    static constexpr int s_Few = 8;

    bool insert(ZfCCfgVariable* pVariable) {
        int At = m_Size;
        while (At > 0 && leda::compare(pVariable, m_Few[At - 1]) < 0) {
            --At;
        }
        if (At > 0 && m_Few[At - 1] == pVariable) {
            return true;
        }
        if (m_Size == s_Few) {
            return false;
        }
        std::copy_backward(m_Few + At, m_Few + m_Size, m_Few + m_Size + 1);
        m_Few[At] = pVariable;
        ++m_Size;
        return true;
    }

    void copy(leda::set<ZfCCfgVariable*, leda::avl_tree> const& Operands) {
        m_Many = leda::array<ZfCCfgVariable*>(Operands.size());
        m_Size = 0;
        for (ZfCCfgVariable* pVariable : Operands) {
            m_Many[m_Size++] = pVariable;
        }
        m_pFirst = &m_Many[0];
    }

    ZfCCfgVariable* m_Few[s_Few] = {};
    leda::array<ZfCCfgVariable*> m_Many;
    ZfCCfgVariable* const* m_pFirst = m_Few;
    int m_Size = 0;
};

} // namespace

void ZfCControlFlowGraph::visitInstruction(ZfCBasicBlock* pBlock, int Node,
                                           ZfCWorkList& CfgEdgeList, ZfCWorkList& SSAEdgeList,
                                           bool& FoundNewConstant) {
    // Step 1. The kinds are asked one after the other: an answer decides.
    ZfCCfgExpression* pBranchCond = pBlock->getBranchCond();
    ZfCCfgStatement* pStmt = pBlock->isStatement();
    ZfCCfgAssignment* pAssignment = pStmt != nullptr ? pStmt->isAssignment() : nullptr;
    // Step 2.
    if (pAssignment != nullptr) {
        visitAssignment(pAssignment, Node, CfgEdgeList, SSAEdgeList, FoundNewConstant);
        return;
    }
    // Step 3.
    if (pBranchCond != nullptr) {
        visitBranchCondition(pBranchCond, Node, CfgEdgeList);
        return;
    }
    if (pStmt != nullptr) {
        // Step 4.
        if (ZfCCfgParamStatement* pParam = pStmt->isParamStatement()) {
            visitParamStatement(pParam, Node, CfgEdgeList, SSAEdgeList, FoundNewConstant);
            return;
        }
        // Step 5.
        if (ZfCCfgValueReturnStatement* pReturn = pStmt->isValueReturnStatement()) {
            visitValueReturnStatement(pReturn, Node, CfgEdgeList, SSAEdgeList, FoundNewConstant);
            return;
        }
    }
    // Step 6: nothing to evaluate. What a call does stands in the statements around it.
    appendCfgOutEdges(Node, CfgEdgeList);
}

void ZfCControlFlowGraph::appendCfgOutEdges(int Node, ZfCWorkList& CfgEdgeList) {
    m_pPropagation->takeBranch(Node, ZfCPropagationState::Branch::Both, CfgEdgeList);
}

void ZfCControlFlowGraph::visitAssignment(ZfCCfgAssignment* pAssignment, int Node,
                                          ZfCWorkList& /*CfgEdgeList*/, ZfCWorkList& SSAEdgeList,
                                          bool& FoundNewConstant) {
    visitDefinition(*m_pPropagation, pAssignment->getLHS(), pAssignment->getRHS(), Node,
                    SSAEdgeList, FoundNewConstant);
}

void ZfCControlFlowGraph::visitParamStatement(ZfCCfgParamStatement* pParamStatement, int Node,
                                              ZfCWorkList& /*CfgEdgeList*/,
                                              ZfCWorkList& SSAEdgeList, bool& FoundNewConstant) {
    visitDefinition(*m_pPropagation, pParamStatement->getVariable(), pParamStatement, Node,
                    SSAEdgeList, FoundNewConstant);
}

void ZfCControlFlowGraph::visitValueReturnStatement(
    ZfCCfgValueReturnStatement* pValueReturnStatement, int Node, ZfCWorkList& /*CfgEdgeList*/,
    ZfCWorkList& SSAEdgeList, bool& FoundNewConstant) {
    visitDefinition(*m_pPropagation, pValueReturnStatement->getVariable(),
                    pValueReturnStatement->getExpression(), Node, SSAEdgeList, FoundNewConstant);
}

void ZfCControlFlowGraph::visitBranchCondition(ZfCCfgExpression* pCond, int Node,
                                               ZfCWorkList& CfgEdgeList) {
    using Branch = ZfCPropagationState::Branch;
    // Step 1. A condition without variables is the client's alone to answer, in each iteration.
    ZfCCfgValue Value = pCond->evaluate();
    if (!m_pPropagation->hasSSAInEdge(Node)) {
        m_pPropagation->markDirty(Node);
    }
    // Step 3: optimistic about values, not about conditions.
    if (!Value.isConstant()) {
        m_pPropagation->takeBranch(Node, Branch::Both, CfgEdgeList);
        return;
    }
    // Step 2: anything but 0.0 is true, a NaN too.
    m_pPropagation->takeBranch(Node, Value.getValue() == 0.0 ? Branch::False : Branch::True,
                               CfgEdgeList);
}

void ZfCControlFlowGraph::visitPhiFunction(ZfCPhiFunction* pPhi, int Node, bool& FoundNewConstant) {
    // Step 1.
    ZfCCfgVariable* pVariable = pPhi->getVariable();
    ChangeWatch Watch(pVariable);
    // Steps 2 and 3: the distinct operands, reached or not.
    PhiOperands SSAVariables(pPhi);
    // Steps 4 and 5.
    ZfCCfgValue LHSValue =
        mergeValues(SSAVariables, [](ZfCCfgVariable* pOperand) { return pOperand->getValue(); });
    pVariable->setVarValueAndAdjustCfgValue(LHSValue);
    // Step 6: here a step up from non-constant counts as well.
    if (!Watch.oldValue().isConstant() && LHSValue.isConstant()) {
        FoundNewConstant = true;
    }
    // Steps 7 and 8. An operand may be the variable itself: its old maximum counts, and nothing
    // but its minimum has changed by then.
    ZfCCfgValue MinValue = mergeExtremes(
        SSAVariables, [](ZfCCfgVariable* pOperand) { return pOperand->getMinValue(); },
        [](double a, double b) { return a < b; });
    ZfCCfgValue MaxValue = mergeExtremes(
        SSAVariables, [](ZfCCfgVariable* pOperand) { return pOperand->getMaxValue(); },
        [](double a, double b) { return a > b; });
    pVariable->setMinValueAndDestroyOld(MinValue);
    pVariable->setMaxValueAndDestroyOld(MaxValue);
    if (Watch.hasChanged()) {
        m_pPropagation->markUsersDirty(Node);
    }
}
