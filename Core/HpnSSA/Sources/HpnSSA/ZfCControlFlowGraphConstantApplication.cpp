// Application of constants: plain walks that offer what the propagation has found to the client's
// statements and expressions. What is replaced, and how, is theirs. No edge is looked at and none
// is changed: a condition that became a constant keeps both its branches.
//
// Only foldConstants lets the client edit the graph and the statement sequence meanwhile.

#include "ZfCControlFlowGraph.h"

void ZfCControlFlowGraph::replaceConstantConditions() {
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        ZfCBasicBlock* pBlock = inf(v)->isBasicBlock();
        if (pBlock != nullptr && pBlock->getBranchCond() != nullptr) {
            pBlock->getBranchCond()->replaceConstantCondition();
        }
    }
}

void ZfCControlFlowGraph::replaceConstantVariables() {
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        ZfCBasicBlock* pBlock = inf(v)->isBasicBlock();
        if (pBlock == nullptr) {
            continue;
        }
        // Step 1: the right-hand sides.
        for (ZfCCfgStatement* pStmt : pBlock->getStatementSeq()) {
            if (ZfCCfgAssignment* pAssignment = pStmt->isAssignment()) {
                pAssignment->getRHS()->replaceConstantVariables();
            }
        }
        // Step 2: the condition.
        if (ZfCCfgExpression* pBranchCond = pBlock->getBranchCond()) {
            pBranchCond->replaceConstantVariables();
        }
    }
}

void ZfCControlFlowGraph::foldConstants() {
    leda::list<leda::node> WorkList = all_nodes();
    // Step 1.
    for (leda::node v : WorkList) {
        ZfCBasicBlock* pBlock = inf(v)->isBasicBlock();
        if (pBlock == nullptr) {
            continue;
        }
        // Step 2: the assignment itself is asked, not its right-hand side.
        leda::list<ZfCCfgStatement*> StmtList = pBlock->getStatementSeq();
        for (ZfCCfgStatement* pStmt : StmtList) {
            if (ZfCCfgAssignment* pAssignment = pStmt->isAssignment()) {
                pAssignment->foldConstants();
            }
        }
        // Step 3.
        if (ZfCCfgExpression* pBranchCond = pBlock->getBranchCond()) {
            pBranchCond->foldConstants();
        }
    }
}
