// Valid condition assignments: what a branch tells about a variable, written into the graph.
//
// 1. Each condition that is a Boolean variable, its negation, or a comparison of a variable with a
//    constant gives up to two statements, one for each arm.
// 2. A statement stands in a block of its own on the arm's edge, so that the version it defines
//    holds for this edge alone, also where the arm begins at a join.
//
// The statements are virtual: they make no code, and the versions they define are aliases of the
// stored variable. Summaries pass over them. They have no step of their own in the propagation; J.
// R. C. Patterson, Accurate static branch prediction by value range propagation, PLDI 1995, makes
// branches speak in the same way.
//
// Linear in the nodes.

#include "ZfCControlFlowGraph.h"

#include "ZF_DataType.h"
#include "ZfCInternalCheck.h"

namespace {

bool isBooleanVariable(ZfCCfgVariable* pVariable) {
    ZF_DataType* pDataType = pVariable->getDataType();
    return pDataType != nullptr && pDataType->isBooleanType();
}

ZfCCfgAssignment* createValidConditionAssignment(ZfCCfgVariable* pVariable,
                                                 ZfCCfgValue const& Value) {
    auto* pAssignment = new ZfCCfgInitAssignment();
    pAssignment->setLHS(pVariable);
    pAssignment->setRHS(ZfCCfgFactory::getInstance()->createValueExpression(Value));
    return pAssignment;
}

// A comparison with a constant: equality holds in the then arm, with Negated in the else arm. Of a
// variable that holds more than two values, the other arm knows nothing.
void createFromComparison(ZfCCfgExpression* pCond, ZfCCfgVariable* pVariable, ZfCCfgValue Value,
                          bool Negated, ZfCCfgAssignment*& pThenAssignment,
                          ZfCCfgAssignment*& pElseAssignment) {
    if (!isBooleanVariable(pVariable)) {
        (Negated ? pElseAssignment : pThenAssignment) =
            createValidConditionAssignment(pVariable, Value);
        return;
    }
    if (Value.getValue() == 0.0 || Value.getValue() == 1.0) {
        ZfCCfgValue OtherValue = !Value;
        pThenAssignment = createValidConditionAssignment(pVariable, Negated ? OtherValue : Value);
        pElseAssignment = createValidConditionAssignment(pVariable, Negated ? Value : OtherValue);
        return;
    }
    // A Boolean never equals such a constant.
    pCond->actOnComparisonOutsideBoolRange();
    pCond->replaceConditionWithConstant(Negated ? 1.0 : 0.0);
}

void markAsValidCondition(ZfCCfgAssignment* pAssignment) {
    if (pAssignment != nullptr) {
        pAssignment->setIsVirtual(true);
        pAssignment->setIsValidConditionAssignment(true);
    }
}

// Step 3 of the insertion: a block with the statement on the edge e out of v.
void insertOnEdge(ZfCControlFlowGraph& Graph, leda::node v, leda::edge e,
                  ZfCCfgAssignment* pAssignment) {
    if (pAssignment == nullptr || e == nullptr) {
        return;
    }
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    // Step 3a.
    ZfCBasicBlock* pBlock = pFactory->createBasicBlock();
    pBlock->setProcedure(Graph.inf(v)->getProcedure());
    pBlock->append(pAssignment);
    leda::node n = Graph.new_node(pBlock);
    // Step 3b.
    Graph.new_edge(n, Graph.target(e), pFactory->createEdgeInfo());
    // Step 3c.
    Graph.move_edge(e, v, n);
}

} // namespace

void ZfCControlFlowGraph::createValidConditionAssignments(ZfCCfgExpression*& pCond,
                                                          ZfCCfgAssignment*& pThenAssignment,
                                                          ZfCCfgAssignment*& pElseAssignment) {
    pThenAssignment = nullptr;
    pElseAssignment = nullptr;
    bool Negated = false;
    ZfCCfgVariable* pVariable = pCond->isVariable(Negated);
    if (pVariable != nullptr) {
        // Step 1.
        if (isBooleanVariable(pVariable)) {
            pThenAssignment =
                createValidConditionAssignment(pVariable, ZfCCfgValue(Negated ? 0.0 : 1.0));
            pElseAssignment =
                createValidConditionAssignment(pVariable, ZfCCfgValue(Negated ? 1.0 : 0.0));
        }
    } else {
        // Step 2.
        ZfCCfgValue Value(eCfgValueUndetermined);
        if (pCond->isVariableEqualToConstant(pVariable, Value, Negated)) {
            createFromComparison(pCond, pVariable, Value, Negated, pThenAssignment,
                                 pElseAssignment);
        }
    }
    // Step 3.
    markAsValidCondition(pThenAssignment);
    markAsValidCondition(pElseAssignment);
}

void ZfCControlFlowGraph::insertValidConditionAssignments() {
    // The new blocks come behind the last node and have no condition.
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        ZfCBasicBlock* pBlock = inf(v)->isBasicBlock();
        ZfCCfgExpression* pCond = pBlock != nullptr ? pBlock->getBranchCond() : nullptr;
        if (pCond == nullptr) {
            continue;
        }
        // Step 1.
        ZfCCfgAssignment* pThenAssignment = nullptr;
        ZfCCfgAssignment* pElseAssignment = nullptr;
        createValidConditionAssignments(pCond, pThenAssignment, pElseAssignment);
        if (pThenAssignment == nullptr && pElseAssignment == nullptr) {
            continue;
        }
        // Step 2: the last edge of a kind wins.
        leda::edge ThenEdge = nullptr;
        leda::edge ElseEdge = nullptr;
        for (leda::edge e = first_adj_edge(v); e != nullptr; e = adj_succ(e)) {
            if (inf(e)->isTrueBranch() != nullptr) {
                ThenEdge = e;
                continue;
            }
            if (inf(e)->isFalseBranch() == nullptr) {
                reportInternalError("ZfCControlFlowGraph", __LINE__);
            }
            ElseEdge = e;
        }
        // Steps 3 and 4.
        insertOnEdge(*this, v, ThenEdge, pThenAssignment);
        insertOnEdge(*this, v, ElseEdge, pElseAssignment);
    }
}
