#include "Model/HoistingContext.h"

#include "Model/RewriteBudget.h"
#include "Model/ZfCCfgSFAssignment.h"
#include "Model/ZfCCfgSFProcedureCall.h"
#include "Model/ZfCCfgSFVariable.h"

// Moving a statement in front of its branch.
//
// The pass compares the arms and sees to it that the condition does not read what the statement
// defines. What it cannot see is left to be checked here:
// 1. The statement stands alone in its node, and above it up to the branch there is nothing but
// nodes without code.
// 2. A call can reach externs, whose writes are no definitions: it moves over no condition that
// reads what an extern
//    writes. (Reads of inputs keep their order by themselves: the pass refuses conditions that read
//    inputs.)
// The value return statements of a moved call stay in the arms. They define versions, and whoever
// emits code by original variables needs none of them.

namespace hpn {

HoistingContext* HoistingContext::s_pActive = nullptr;

HoistingContext::HoistingContext(ZfCControlFlowGraph& Graph) : m_Graph(Graph) {
    for (leda::node v = Graph.first_node(); v != Graph.stop_node(); v = Graph.next_node(v)) {
        ZfCBasicBlock* pBlock = Graph[v]->isBasicBlock();
        if (pBlock == nullptr)
            continue;
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
            m_Nodes.emplace(pStatement, v);
    }
    s_pActive = this;
}

HoistingContext::~HoistingContext() {
    s_pActive = nullptr;
}

static bool readsWhatExternsWrite(ZfCCfgExpression* pCondition) {
    for (ZfCCfgVariable* pVariable : pCondition->getUsedVariables()) {
        if (originalOf(pVariable)->isWrittenByExtern())
            return true;
    }
    return false;
}

static SourcePosition positionOf(ZfCCfgStatement* pStatement) {
    if (ZfCCfgSFAssignment* pAssignment = pStatement->isSFAssignment())
        return pAssignment->getPosition();
    ZfCCfgSFProcedureCall* pCall = pStatement->isSFProcedureCall();
    return pCall != nullptr ? pCall->getPosition() : SourcePosition{};
}

/// The nearest branch above, along nodes with one way in; null if a join or an entry comes first.
leda::node HoistingContext::findBranch(leda::node v) {
    while (m_Graph.indeg(v) == 1) {
        v = m_Graph.source(m_Graph.first_in_edge(v));
        ZfCBasicBlock* pBlock = m_Graph[v]->isBasicBlock();
        if (pBlock == nullptr)
            return nullptr;
        if (pBlock->getBranchCond() != nullptr)
            return v;
    }
    return nullptr;
}

void HoistingContext::insertBefore(leda::node Branch, leda::node v) {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    ZfCCfgNodeInfo* pMoved = m_Graph[v];
    ZfCBasicBlock* pLeft = pFactory->createBasicBlock();
    pLeft->setProcedure(pMoved->getProcedure());
    m_Graph.assign(v, pLeft);
    const leda::node Place = m_Graph.new_node(pMoved);
    for (leda::edge e : m_Graph.in_edges(Branch))
        m_Graph.move_edge(e, m_Graph.source(e), Place);
    m_Graph.new_edge(Place, Branch, pFactory->createEdgeInfo());
}

bool HoistingContext::moveInFrontOfBranch(ZfCCfgStatement* pStatement) {
    const auto Found = m_Nodes.find(pStatement);
    if (Found == m_Nodes.end())
        return false;
    const leda::node v = Found->second;
    if (m_Graph[v]->isBasicBlock()->isStatement() != pStatement)
        return false;
    const leda::node Branch = findBranch(v);
    if (Branch == nullptr)
        return false;
    ZfCBasicBlock* pBranch = m_Graph[Branch]->isBasicBlock();
    if (!pBranch->getStatementSeq().empty() || !pBranch->getPhiFunctions().empty())
        return false;
    if (pStatement->isProcedureCall() != nullptr && readsWhatExternsWrite(pBranch->getBranchCond()))
        return false;
    if (!mayRewrite("statement moved in front of its branch", positionOf(pStatement)))
        return false;
    insertBefore(Branch, v);
    Found->second = m_Graph.source(m_Graph.first_in_edge(Branch));
    ++m_Moved;
    return true;
}

void HoistingContext::drop(ZfCCfgStatement* pStatement) {
    const auto Found = m_Nodes.find(pStatement);
    if (Found == m_Nodes.end())
        return;
    ZfCBasicBlock* pEmpty = ZfCCfgFactory::getInstance()->createBasicBlock();
    pEmpty->setProcedure(m_Graph[Found->second]->getProcedure());
    m_Graph.assign(Found->second, pEmpty);
    m_Nodes.erase(Found);
}

} // namespace hpn
