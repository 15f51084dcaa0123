#include "ZfCBasicBlock.h"

#include "ZfCCfgFactory.h"
#include "ZfCCfgVisitorSSA.h"
#include "ZfCInternalCheck.h"

ZfCBasicBlock::ZfCBasicBlock() : m_pBranchCond(nullptr) {
}

ZfCBasicBlock::~ZfCBasicBlock() = default;

ZfCBasicBlock* ZfCBasicBlock::isBasicBlock() {
    return this;
}

void ZfCBasicBlock::initData() {
    ZfCCfgNodeInfo::initData();
    m_pBranchCond = nullptr;
}

void ZfCBasicBlock::resetData() {
    m_pBranchCond = nullptr;
    m_StatementSeq.clear();
    m_PhiFunctions.clear();
    m_AssignedVariables.clear();
    ZfCCfgNodeInfo::resetData();
}

// A list that holds anything is final until the block is parked: blocks are asked in the divided
// graph, where each holds one element and is not changed any more.
leda::list<ZfCCfgVariable*> const& ZfCBasicBlock::getAssignedVariables() {
    if (!m_AssignedVariables.empty())
        return m_AssignedVariables;
    for (ZfCPhiFunction* pPhiFunction : m_PhiFunctions)
        m_AssignedVariables.append(pPhiFunction->getVariable());
    for (ZfCCfgStatement* pStmt : m_StatementSeq)
        for (ZfCCfgVariable* pVariable : pStmt->getDefinedVariables())
            m_AssignedVariables.append(pVariable);
    return m_AssignedVariables;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCBasicBlock::getUsedVariables() {
    leda::set<ZfCCfgVariable*, leda::avl_tree> UsedVariables;
    for (ZfCPhiFunction* pPhiFunction : m_PhiFunctions)
        UsedVariables.add(pPhiFunction->getUsedVariables());
    for (ZfCCfgStatement* pStmt : m_StatementSeq)
        UsedVariables.add(pStmt->getUsedVariables());
    if (m_pBranchCond != nullptr)
        UsedVariables.add(m_pBranchCond->getUsedVariables());
    return UsedVariables;
}

void ZfCBasicBlock::append(leda::list<ZfCCfgStatement*> const& Statements) {
    for (ZfCCfgStatement* pStmt : Statements)
        m_StatementSeq.append(pStmt);
}

void ZfCBasicBlock::append(leda::list<ZfCPhiFunction*> const& PhiFunctions) {
    for (ZfCPhiFunction* pPhiFunction : PhiFunctions)
        m_PhiFunctions.append(pPhiFunction);
}

void ZfCBasicBlock::del(ZfCCfgStatement* pStmt) {
    if (ZfCPhiFunction* const pPhiFunction = pStmt->isPhiFunction()) {
        const auto Item = m_PhiFunctions.search(pPhiFunction);
        if (!Item) {
            ZF_ASSERT_UNREACHABLE();
            return;
        }
        m_PhiFunctions.del_item(Item);
    } else {
        const auto Item = m_StatementSeq.search(pStmt);
        if (!Item) {
            ZF_ASSERT_UNREACHABLE();
            return;
        }
        m_StatementSeq.del_item(Item);
    }
    pStmt->remove();
    ZfCCfgFactory::getInstance()->delStatement(pStmt);
}

// Cuts the statements in two:
//
// 1. Nothing is to be done for the first statement. An empty block has none: the list reports that
// as it does.
// 2. A statement of another block is an internal error; the block is left as it is.
// 3. The list is cut before the statement.
// 4. The new block takes the second part, the phi functions and the condition. The phi functions
// belong in front of the
//    first part, but blocks are cut before SSA form, when there are none.
// 5. This block keeps the first part.
ZfCBasicBlock* ZfCBasicBlock::splitAtStatement(ZfCCfgStatement* pStmt) {
    // Step 1.
    if (m_StatementSeq.front() == pStmt)
        return this;
    // Step 2.
    const auto Item = m_StatementSeq.search(pStmt);
    if (!Item) {
        reportInternalError("ZfCBasicBlock", __LINE__);
        return this;
    }
    // Step 3.
    leda::list<ZfCCfgStatement*> FirstPart;
    leda::list<ZfCCfgStatement*> SecondPart;
    m_StatementSeq.split(Item, FirstPart, SecondPart);
    // Step 4.
    ZfCBasicBlock* const pNewBlock = ZfCCfgFactory::getInstance()->createBasicBlock();
    pNewBlock->setProcedure(getProcedure());
    pNewBlock->m_StatementSeq.conc(SecondPart);
    pNewBlock->m_PhiFunctions.conc(m_PhiFunctions);
    pNewBlock->appendBranch(m_pBranchCond);
    // Step 5.
    ZF_ASSERT(m_StatementSeq.empty());
    m_StatementSeq.conc(FirstPart);
    m_PhiFunctions.clear();
    m_pBranchCond = nullptr;
    return pNewBlock;
}

ZfCBasicBlock* ZfCBasicBlock::splitAtCondition() {
    if (m_StatementSeq.empty())
        return this;
    ZfCBasicBlock* const pNewBlock = ZfCCfgFactory::getInstance()->createBasicBlock();
    pNewBlock->setProcedure(getProcedure());
    pNewBlock->appendBranch(m_pBranchCond);
    m_pBranchCond = nullptr;
    return pNewBlock;
}

ZfCPhiFunction* ZfCBasicBlock::isPhiFunction() {
    if (m_PhiFunctions.size() != 1 || !m_StatementSeq.empty() || m_pBranchCond != nullptr)
        return nullptr;
    return m_PhiFunctions.front();
}

ZfCCfgStatement* ZfCBasicBlock::isStatement() {
    if (m_StatementSeq.size() != 1 || !m_PhiFunctions.empty() || m_pBranchCond != nullptr)
        return nullptr;
    return m_StatementSeq.front();
}

// The statement is asked for its clone, which may tell the client that it is about to stand twice,
// but the new block gets the statement itself: both blocks show the same one.
ZfCBasicBlock* ZfCBasicBlock::clone() {
    ZfCCfgFactory* const pFactory = ZfCCfgFactory::getInstance();
    ZfCBasicBlock* pBlock = nullptr;
    if (ZfCCfgStatement* const pStmt = isStatement()) {
        pStmt->clone();
        pBlock = pFactory->createBasicBlock();
        pBlock->append(pStmt);
    }
    if (ZfCPhiFunction* const pPhiFunction = isPhiFunction()) {
        pPhiFunction->clone();
        pBlock = pFactory->createBasicBlock();
        pBlock->append(pPhiFunction);
    }
    return pBlock;
}

void ZfCBasicBlock::acceptStart(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visitStart(this);
}

void ZfCBasicBlock::acceptBeforeCondition(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visitBeforeCondition(this);
}

void ZfCBasicBlock::acceptEnd(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visitEnd(this);
}
