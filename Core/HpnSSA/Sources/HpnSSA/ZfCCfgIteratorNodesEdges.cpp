#include "ZfCCfgIteratorNodesEdges.h"

#include "ZfCBasicBlock.h"
#include "ZfCCfgEdgeInfo.h"
#include "ZfCCfgEntry.h"
#include "ZfCCfgExit.h"
#include "ZfCCfgOutputStatement.h"
#include "ZfCCfgParamStatement.h"
#include "ZfCCfgValueReturnStatement.h"
#include "ZfCCfgVisitorSSA.h"
#include "ZfCControlFlowGraph.h"

namespace {

// The statements that the walker has to show itself, and the others by their own accept.
void iterateStatement(ZfCCfgIteratorNodesEdges& Walker, ZfCCfgStatement* pStmt,
                      ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgParamStatement* const pParam = pStmt->isParamStatement())
        Walker.iterate(pParam);
    else if (ZfCCfgValueReturnStatement* const pReturn = pStmt->isValueReturnStatement())
        Walker.iterate(pReturn);
    else if (ZfCCfgOutputStatement* const pOutput = pStmt->isOutputStatement())
        Walker.iterate(pOutput);
    else
        pStmt->accept(pVisitor);
}

void iterateBlock(ZfCCfgIteratorNodesEdges& Walker, ZfCBasicBlock* pBasicBlock,
                  ZfCCfgVisitor* pVisitor) {
    pBasicBlock->acceptStart(pVisitor);
    for (ZfCPhiFunction* pPhiFunction : pBasicBlock->getPhiFunctions())
        pPhiFunction->accept(pVisitor);
    for (ZfCCfgStatement* pStmt : pBasicBlock->getStatementSeq())
        iterateStatement(Walker, pStmt, pVisitor);
    if (ZfCCfgExpression* const pCondition = pBasicBlock->getBranchCond()) {
        pBasicBlock->acceptBeforeCondition(pVisitor);
        pCondition->accept(pVisitor);
    }
    pBasicBlock->acceptEnd(pVisitor);
}

} // namespace

ZfCCfgIteratorNodesEdges::ZfCCfgIteratorNodesEdges(ZfCCfgVisitor* pVisitor) : m_pVisitor(pVisitor) {
}

ZfCCfgIteratorNodesEdges::~ZfCCfgIteratorNodesEdges() = default;

// All nodes before any edge, as a DOT file may have them.
void ZfCCfgIteratorNodesEdges::iterate(ZfCControlFlowGraph* pCfg) {
    pCfg->acceptStart(m_pVisitor);
    leda::node NextNode = nullptr;
    for (leda::node v = pCfg->first_node(); v != pCfg->stop_node(); v = NextNode) {
        NextNode = pCfg->next_node(v);
        iterate(pCfg->inf(v));
    }
    leda::edge NextEdge = nullptr;
    for (leda::edge e = pCfg->first_edge(); e != pCfg->stop_edge(); e = NextEdge) {
        NextEdge = pCfg->next_edge(e);
        pCfg->inf(e)->accept(m_pVisitor, e);
    }
    pCfg->acceptEnd(m_pVisitor);
}

void ZfCCfgIteratorNodesEdges::iterate(ZfCCfgNodeInfo* pNodeInfo) {
    if (ZfCCfgEntry* const pEntry = pNodeInfo->isEntryNode())
        pEntry->accept(m_pVisitor);
    else if (ZfCBasicBlock* const pBasicBlock = pNodeInfo->isBasicBlock())
        iterateBlock(*this, pBasicBlock, m_pVisitor);
    else
        pNodeInfo->isExitNode()->accept(m_pVisitor);
}

void ZfCCfgIteratorNodesEdges::iterate(ZfCCfgParamStatement* pStmt) {
    pStmt->acceptStart(m_pVisitor);
    leda::h_array<ZfCCfgProcedureCall*, ZfCCfgExpression*>& ParamExpressions =
        pStmt->getParamExpressions();
    for (auto Item = ParamExpressions.first_item(); Item; Item = ParamExpressions.next_item(Item)) {
        ZfCCfgExpression* const pArgumentExpression = ParamExpressions.inf(Item);
        pArgumentExpression->accept(m_pVisitor);
        if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(m_pVisitor))
            pVisitorSSA->addSeperatorVariable();
    }
    pStmt->acceptEnd(m_pVisitor);
}

void ZfCCfgIteratorNodesEdges::iterate(ZfCCfgValueReturnStatement* pStmt) {
    pStmt->acceptStart(m_pVisitor);
    pStmt->getVariable()->accept(m_pVisitor);
    pStmt->acceptMiddle(m_pVisitor);
    pStmt->getExpression()->accept(m_pVisitor);
}

void ZfCCfgIteratorNodesEdges::iterate(ZfCCfgOutputStatement* pStmt) {
    pStmt->acceptStart(m_pVisitor);
    pStmt->getVariable()->accept(m_pVisitor);
}

void ZfCCfgIteratorNodesEdges::iterate(ZfCCfgEdgeInfo*) {
}
