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

namespace {

using CfgGraph = leda::GRAPH<ZfCCfgNodeInfo*, ZfCCfgEdgeInfo*>;

// The common visit of an assignment, a parameter and a value return statement; Source is what
// gives value and range.
template <class TSource>
void visitDefinition(CfgGraph& Graph, ZfCCfgVariable* pVariable, TSource* pSource, leda::node Node,
                     leda::list<leda::edge>& SSAEdgeList, bool& FoundNewConstant) {
    // Step 1.
    ZfCCfgValue OldValue = pVariable->getValue();
    // Steps 2 and 3: afterwards the value is what the variable can hold of it.
    ZfCCfgValue RHSValue = pSource->evaluate();
    pVariable->setVarValueAndAdjustCfgValue(RHSValue);
    // Step 4: the range is stored at every visit.
    pVariable->setMinValueAndDestroyOld(pSource->getMinimum());
    pVariable->setMaxValueAndDestroyOld(pSource->getMaximum());
    // Step 5.
    if (OldValue.compare(RHSValue) == 0) {
        return;
    }
    // Step 6: only the step from undetermined to constant asks for another iteration.
    if (OldValue.isUndetermined() && RHSValue.isConstant()) {
        FoundNewConstant = true;
    }
    // Step 7: any change of value concerns the users.
    for (leda::edge e = Graph.first_adj_edge(Node); e != nullptr; e = Graph.adj_succ(e)) {
        if (Graph.inf(e)->isSSAEdge() != nullptr) {
            SSAEdgeList.append(e);
        }
    }
}

void appendCfgOutEdges(CfgGraph& Graph, leda::node Node, leda::list<leda::edge>& CfgEdgeList) {
    for (leda::edge e = Graph.first_adj_edge(Node); e != nullptr; e = Graph.adj_succ(e)) {
        if (Graph.inf(e)->isSSAEdge() == nullptr) {
            CfgEdgeList.append(e);
        }
    }
}

} // namespace

void ZfCControlFlowGraph::visitInstruction(ZfCBasicBlock* pBlock, leda::node Node,
                                           leda::list<leda::edge>& CfgEdgeList,
                                           leda::list<leda::edge>& SSAEdgeList,
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
    appendCfgOutEdges(*this, Node, CfgEdgeList);
}

void ZfCControlFlowGraph::visitAssignment(ZfCCfgAssignment* pAssignment, leda::node Node,
                                          leda::list<leda::edge>& /*CfgEdgeList*/,
                                          leda::list<leda::edge>& SSAEdgeList,
                                          bool& FoundNewConstant) {
    visitDefinition(*this, pAssignment->getLHS(), pAssignment->getRHS(), Node, SSAEdgeList,
                    FoundNewConstant);
}

void ZfCControlFlowGraph::visitParamStatement(ZfCCfgParamStatement* pParamStatement,
                                              leda::node Node,
                                              leda::list<leda::edge>& /*CfgEdgeList*/,
                                              leda::list<leda::edge>& SSAEdgeList,
                                              bool& FoundNewConstant) {
    visitDefinition(*this, pParamStatement->getVariable(), pParamStatement, Node, SSAEdgeList,
                    FoundNewConstant);
}

void ZfCControlFlowGraph::visitValueReturnStatement(
    ZfCCfgValueReturnStatement* pValueReturnStatement, leda::node Node,
    leda::list<leda::edge>& /*CfgEdgeList*/, leda::list<leda::edge>& SSAEdgeList,
    bool& FoundNewConstant) {
    visitDefinition(*this, pValueReturnStatement->getVariable(),
                    pValueReturnStatement->getExpression(), Node, SSAEdgeList, FoundNewConstant);
}

void ZfCControlFlowGraph::visitBranchCondition(ZfCCfgExpression* pCond, leda::node Node,
                                               leda::list<leda::edge>& CfgEdgeList) {
    // Step 1.
    ZfCCfgValue Value = pCond->evaluate();
    // Step 3: optimistic about values, not about conditions.
    if (!Value.isConstant()) {
        appendCfgOutEdges(*this, Node, CfgEdgeList);
        return;
    }
    // Step 2: anything but 0.0 is true, a NaN too.
    bool IsFalse = Value.getValue() == 0.0;
    for (leda::edge e = first_adj_edge(Node); e != nullptr; e = adj_succ(e)) {
        bool IsTaken =
            IsFalse ? inf(e)->isFalseBranch() != nullptr : inf(e)->isTrueBranch() != nullptr;
        if (IsTaken) {
            CfgEdgeList.append(e);
        }
    }
}

void ZfCControlFlowGraph::visitPhiFunction(ZfCPhiFunction* pPhi, leda::node /*Node*/,
                                           bool& FoundNewConstant) {
    // Step 1.
    ZfCCfgVariable* pVariable = pPhi->getVariable();
    ZfCCfgValue OldValue = pVariable->getValue();
    // Steps 2 and 3: the distinct operands, reached or not.
    leda::set<ZfCCfgVariable*, leda::avl_tree> SSAVariables = pPhi->getUsedVariables();
    leda::list<ZfCCfgValue> ValueList;
    leda::list<ZfCCfgValue> MinValueList;
    leda::list<ZfCCfgValue> MaxValueList;
    for (ZfCCfgVariable* pOperand : SSAVariables) {
        ValueList.append(pOperand->getValue());
        MinValueList.append(pOperand->getMinValue());
        MaxValueList.append(pOperand->getMaxValue());
    }
    // Steps 4 and 5.
    ZfCCfgValue LHSValue = intersect(ValueList);
    pVariable->setVarValueAndAdjustCfgValue(LHSValue);
    // Step 6: here a step up from non-constant counts as well.
    if (!OldValue.isConstant() && LHSValue.isConstant()) {
        FoundNewConstant = true;
    }
    // Steps 7 and 8.
    ZfCCfgValue MinValue = determineMinimum(MinValueList);
    pVariable->setMinValueAndDestroyOld(MinValue);
    ZfCCfgValue MaxValue = determineMaximum(MaxValueList);
    pVariable->setMaxValueAndDestroyOld(MaxValue);
}
