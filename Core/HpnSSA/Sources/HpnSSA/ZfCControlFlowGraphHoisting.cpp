// Hoisting of equal code out of both arms of a branch.
//
// 1. The SSA edges go, so that degrees count control flow alone.
// 2. For each branch, the next real statement of each arm is found.
// 3. If both give the same code and the condition does not depend on what they define, the one of
//    the else arm is moved in front of the branch and the one of the then arm is dropped.
// 4. From behind them, step 2 again.
//
// What is the same code and how a statement moves is the client's knowledge. The tests compare
// original variables, for in front of the condition a moved definition would reach uses of another
// version too.
//
// Linear in the statements that are looked at.

#include "ZfCControlFlowGraph.h"

namespace {

using CfgGraph = leda::GRAPH<ZfCCfgNodeInfo*, ZfCCfgEdgeInfo*>;
using VariableSet = leda::set<ZfCCfgVariable*, leda::avl_tree>;

// The next real statement of an arm, with ArmEdge moved behind it; null if the arm ends before, at
// a join, at a nested branch or at the exit. Virtual and value return statements make no code and
// are passed over; with SkipNext, so is one real statement.
ZfCCfgStatement* nextRealStatement(CfgGraph& Graph, leda::edge& ArmEdge, bool SkipNext) {
    while (ArmEdge != nullptr) {
        // Steps 4a and 4b.
        leda::node t = Graph.target(ArmEdge);
        ZfCBasicBlock* pBlock = Graph.inf(t)->isBasicBlock();
        if (pBlock == nullptr || pBlock->getBranchCond() != nullptr || Graph.indeg(t) > 1) {
            return nullptr;
        }
        // Step 4c.
        ZfCCfgStatement* pStmt = pBlock->isStatement();
        if (pStmt != nullptr &&
            (pStmt->getIsVirtual() || pStmt->isValueReturnStatement() != nullptr)) {
            pStmt = nullptr;
        }
        // Step 4d.
        if (pStmt != nullptr && SkipNext) {
            pStmt = nullptr;
            SkipNext = false;
        }
        // Step 4e.
        ArmEdge = Graph.first_adj_edge(t);
        // Step 4f.
        if (pStmt != nullptr) {
            return pStmt;
        }
    }
    return nullptr;
}

VariableSet originalsOf(VariableSet const& Variables) {
    VariableSet Originals;
    for (ZfCCfgVariable* pVariable : Variables) {
        ZfCSSAVariable* pSSAVariable = pVariable->isSSAVariable();
        ZfCCfgVariable* pOrigVar = pSSAVariable != nullptr ? pSSAVariable->getOrigVar() : pVariable;
        Originals.insert(pOrigVar);
    }
    return Originals;
}

} // namespace

void ZfCControlFlowGraph::hoistCodeOutOfIfElseBranches() {
    // Step 1.
    deleteSSAEdges();
    // Step 2.
    leda::node pNext = nullptr;
    for (leda::node v = first_node(); v != stop_node(); v = pNext) {
        pNext = next_node(v);
        ZfCBasicBlock* pBlock = inf(v)->isBasicBlock();
        if (pBlock != nullptr && pBlock->getBranchCond() != nullptr) {
            performCodeHoisting(v);
        }
    }
}

void ZfCControlFlowGraph::deleteSSAEdges() {
    leda::edge pNext = nullptr;
    for (leda::edge e = first_edge(); e != stop_edge(); e = pNext) {
        pNext = next_edge(e);
        if (inf(e)->isSSAEdge() != nullptr) {
            del_edge(e);
        }
    }
}

void ZfCControlFlowGraph::performCodeHoisting(leda::node v) {
    // Step 1.
    ZfCCfgExpression* pCond = inf(v)->isBasicBlock()->getBranchCond();
    if (pCond == nullptr || pCond->hasSideEffects()) {
        return;
    }
    // Step 2: the last edge of a kind wins.
    leda::edge ThenEdge = nullptr;
    leda::edge ElseEdge = nullptr;
    for (leda::edge e = first_adj_edge(v); e != nullptr; e = adj_succ(e)) {
        if (inf(e)->isTrueBranch() != nullptr) {
            ThenEdge = e;
        } else if (inf(e)->isFalseBranch() != nullptr) {
            ElseEdge = e;
        }
    }
    if (ThenEdge == nullptr || ElseEdge == nullptr) {
        return;
    }
    // Step 3.
    bool IgnoreNextStatement = false;
    for (;;) {
        // Steps 4 and 5: the then arm.
        ZfCCfgStatement* pThenStmt = nextRealStatement(*this, ThenEdge, IgnoreNextStatement);
        if (pThenStmt == nullptr) {
            return;
        }
        // Steps 6 and 7: the else arm.
        ZfCCfgStatement* pElseStmt = nextRealStatement(*this, ElseEdge, IgnoreNextStatement);
        if (pElseStmt == nullptr) {
            return;
        }
        // Steps 8, 9 and 10: everything that forbids it, then the move itself.
        if (!pThenStmt->generatesSameCode(pElseStmt) || !checkForHoisting(pElseStmt, pCond) ||
            !pElseStmt->hoistOutOfIfElseBranch(IgnoreNextStatement)) {
            return;
        }
        // Steps 11 and 12: the twin goes, and both edges already stand behind the two.
        pThenStmt->remove();
    }
}

bool ZfCControlFlowGraph::checkForHoisting(ZfCCfgStatement* pStmt, ZfCCfgExpression* pCond) {
    // Step 1.
    if (pCond->hasSideEffects()) {
        return false;
    }
    // Step 2: a call defines what its procedure does, and where its result goes.
    VariableSet DefinedSSAVariables;
    if (ZfCCfgProcedureCall* pCall = pStmt->isProcedureCall()) {
        ZfCCfgProcedure* pProcedure = m_Procedures.inf(m_Procedures.lookup(pCall->getName()));
        VariableSet DefinedInProcedure = pProcedure->getDefinedVariables();
        VariableSet DefinedByFctReturn = pCall->getVarsDefinedByFctReturn();
        DefinedSSAVariables = DefinedInProcedure;
        DefinedSSAVariables.add(DefinedByFctReturn);
    } else {
        DefinedSSAVariables = pStmt->getDefinedVariables();
    }
    // Step 3.
    VariableSet VarsDefinedByStmtToHoist = originalsOf(DefinedSSAVariables);
    // Step 4.
    VariableSet UsedSSAVariables = pCond->getUsedVariables();
    VariableSet VarsUsedInCondition = originalsOf(UsedSSAVariables);
    // Step 5.
    VariableSet Intersection = VarsDefinedByStmtToHoist;
    Intersection.intersect_with(VarsUsedInCondition);
    return Intersection.empty();
}
