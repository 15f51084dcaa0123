#include "ZfCCfgFactory.h"

#include <functional>
#include <new>

// Creation, parking and release of the model's objects.
//
// The common form of a create operation: take the front of the free list and renew it, or allocate
// and construct if there is none; enter the object as key and information in the live dictionary. A
// del operation resets the object, takes it out of the dictionary and appends it to the free list
// of its exact class, so that free lists are first-in first-out.
//
// Objects are allocated by the form of new that answers null. No constructor runs then, and the
// operation enters and returns null.

ZfCCfgFactory* ZfCCfgFactory::m_pCfgFactory = nullptr;

namespace {

// The sign of the difference of two addresses.
template <class T>
int compareAddresses(T* pLeft, T* pRight) {
    const std::less<T*> isBefore;
    return isBefore(pRight, pLeft) - isBefore(pLeft, pRight);
}

template <class Dictionary, class T>
T* enter(Dictionary& Live, T* pObject) {
    Live.insert(pObject, pObject);
    return pObject;
}

} // namespace

ZfCCfgFactory::ZfCCfgFactory()
    : m_NodeInfos(comparePointerNodeInfo), m_Procedures(comparePointerProcedure),
      m_EdgeInfos(comparePointerEdgeInfo), m_SSAVariables(comparePointerVariable),
      m_Expressions(comparePointerExpression), m_NodeLists(comparePointerLedaList_Node) {
}

ZfCCfgFactory::~ZfCCfgFactory() {
    releaseAllMemory();
}

// The old factory is not looked at: a second boot without shutdown abandons it and all that it
// owns, since nobody can tell who still uses its objects.
void ZfCCfgFactory::boot() {
    m_pCfgFactory = new (std::nothrow) ZfCCfgFactory;
}

void ZfCCfgFactory::shutdown() {
    delete m_pCfgFactory;
    m_pCfgFactory = nullptr;
}

// Node records.

ZfCBasicBlock* ZfCCfgFactory::createBasicBlock() {
    if (m_FreeBasicBlocks.empty())
        return enter(m_NodeInfos, new (std::nothrow) ZfCBasicBlock);
    ZfCBasicBlock* const pBasicBlock = m_FreeBasicBlocks.pop();
    pBasicBlock->initData();
    return enter(m_NodeInfos, pBasicBlock);
}

ZfCCfgEntry* ZfCCfgFactory::createEntryNode() {
    if (m_FreeEntryNodes.empty())
        return enter(m_NodeInfos, new (std::nothrow) ZfCCfgEntry);
    ZfCCfgEntry* const pEntry = m_FreeEntryNodes.pop();
    pEntry->initData();
    return enter(m_NodeInfos, pEntry);
}

ZfCCfgExit* ZfCCfgFactory::createExitNode() {
    if (m_FreeExitNodes.empty())
        return enter(m_NodeInfos, new (std::nothrow) ZfCCfgExit);
    ZfCCfgExit* const pExit = m_FreeExitNodes.pop();
    pExit->initData();
    return enter(m_NodeInfos, pExit);
}

void ZfCCfgFactory::delBasicBlock(ZfCBasicBlock* pBasicBlock) {
    pBasicBlock->resetData();
    m_NodeInfos.del(pBasicBlock);
    m_FreeBasicBlocks.append(pBasicBlock);
}

void ZfCCfgFactory::delEntryNode(ZfCCfgEntry* pEntry) {
    pEntry->resetData();
    m_NodeInfos.del(pEntry);
    m_FreeEntryNodes.append(pEntry);
}

void ZfCCfgFactory::delExitNode(ZfCCfgExit* pExit) {
    pExit->resetData();
    m_NodeInfos.del(pExit);
    m_FreeExitNodes.append(pExit);
}

void ZfCCfgFactory::delNodeInfo(ZfCCfgNodeInfo* pNodeInfo) {
    if (ZfCBasicBlock* const pBasicBlock = pNodeInfo->isBasicBlock())
        delBasicBlock(pBasicBlock);
    else if (ZfCCfgEntry* const pEntry = pNodeInfo->isEntryNode())
        delEntryNode(pEntry);
    else if (ZfCCfgExit* const pExit = pNodeInfo->isExitNode())
        delExitNode(pExit);
}

// Procedures.

ZfCCfgProcedure* ZfCCfgFactory::createProcedure() {
    if (m_FreeProcedures.empty())
        return enter(m_Procedures, new (std::nothrow) ZfCCfgProcedure);
    ZfCCfgProcedure* const pProcedure = m_FreeProcedures.pop();
    pProcedure->initData();
    return enter(m_Procedures, pProcedure);
}

void ZfCCfgFactory::delProcedure(ZfCCfgProcedure* pProcedure) {
    pProcedure->resetData();
    m_Procedures.del(pProcedure);
    m_FreeProcedures.append(pProcedure);
}

// Edge records.

ZfCCfgEdgeInfo* ZfCCfgFactory::createEdgeInfo() {
    if (m_FreeEdgeInfos.empty())
        return enter(m_EdgeInfos, new (std::nothrow) ZfCCfgEdgeInfo);
    ZfCCfgEdgeInfo* const pEdgeInfo = m_FreeEdgeInfos.pop();
    pEdgeInfo->initData();
    return enter(m_EdgeInfos, pEdgeInfo);
}

ZfCCfgTrueBranch* ZfCCfgFactory::createTrueBranch() {
    if (m_FreeTrueBranches.empty())
        return enter(m_EdgeInfos, new (std::nothrow) ZfCCfgTrueBranch);
    ZfCCfgTrueBranch* const pTrueBranch = m_FreeTrueBranches.pop();
    pTrueBranch->initData();
    return enter(m_EdgeInfos, pTrueBranch);
}

ZfCCfgFalseBranch* ZfCCfgFactory::createFalseBranch() {
    if (m_FreeFalseBranches.empty())
        return enter(m_EdgeInfos, new (std::nothrow) ZfCCfgFalseBranch);
    ZfCCfgFalseBranch* const pFalseBranch = m_FreeFalseBranches.pop();
    pFalseBranch->initData();
    return enter(m_EdgeInfos, pFalseBranch);
}

ZfCSSAEdge* ZfCCfgFactory::createSSAEdge() {
    if (m_FreeSSAEdges.empty())
        return enter(m_EdgeInfos, new (std::nothrow) ZfCSSAEdge);
    ZfCSSAEdge* const pSSAEdge = m_FreeSSAEdges.pop();
    pSSAEdge->initData();
    return enter(m_EdgeInfos, pSSAEdge);
}

void ZfCCfgFactory::delEdgeInfo(ZfCCfgEdgeInfo* pEdgeInfo) {
    pEdgeInfo->resetData();
    if (ZfCCfgFalseBranch* const pFalseBranch = pEdgeInfo->isFalseBranch())
        m_FreeFalseBranches.append(pFalseBranch);
    else if (ZfCCfgTrueBranch* const pTrueBranch = pEdgeInfo->isTrueBranch())
        m_FreeTrueBranches.append(pTrueBranch);
    else if (ZfCSSAEdge* const pSSAEdge = pEdgeInfo->isSSAEdge())
        m_FreeSSAEdges.append(pSSAEdge);
    else
        m_FreeEdgeInfos.append(pEdgeInfo);
    m_EdgeInfos.del(pEdgeInfo);
}

// Versions of variables.

ZfCSSAVariable* ZfCCfgFactory::createSSAVariable(ZfCCfgVariable* pVariable) {
    if (m_FreeSSAVariables.empty())
        return enter(m_SSAVariables, new (std::nothrow) ZfCSSAVariable(pVariable));
    ZfCSSAVariable* const pVersion = m_FreeSSAVariables.pop();
    pVersion->initData(pVariable);
    return enter(m_SSAVariables, pVersion);
}

void ZfCCfgFactory::delSSAVariable(ZfCSSAVariable* pVariable) {
    pVariable->resetData();
    m_SSAVariables.del(pVariable);
    m_FreeSSAVariables.append(pVariable);
}

// Expressions.

ZfCCfgExplicitVarUse* ZfCCfgFactory::createExplicitVarUse() {
    if (m_FreeExplicitVarUses.empty())
        return enter(m_Expressions, new (std::nothrow) ZfCCfgExplicitVarUse);
    ZfCCfgExplicitVarUse* const pExpression = m_FreeExplicitVarUses.pop();
    pExpression->initData();
    return enter(m_Expressions, pExpression);
}

ZfCCfgExplicitVarUse* ZfCCfgFactory::createExplicitVarUse(bool EvalToNonConst) {
    if (m_FreeExplicitVarUses.empty())
        return enter(m_Expressions, new (std::nothrow) ZfCCfgExplicitVarUse(EvalToNonConst));
    ZfCCfgExplicitVarUse* const pExpression = m_FreeExplicitVarUses.pop();
    pExpression->initData(EvalToNonConst);
    return enter(m_Expressions, pExpression);
}

ZfCCfgValueExpression* ZfCCfgFactory::createValueExpression() {
    if (m_FreeValueExpressions.empty())
        return enter(m_Expressions, new (std::nothrow) ZfCCfgValueExpression);
    ZfCCfgValueExpression* const pExpression = m_FreeValueExpressions.pop();
    pExpression->initData();
    return enter(m_Expressions, pExpression);
}

ZfCCfgValueExpression* ZfCCfgFactory::createValueExpression(ZfCCfgValue const& Value) {
    if (m_FreeValueExpressions.empty())
        return enter(m_Expressions, new (std::nothrow) ZfCCfgValueExpression(Value));
    ZfCCfgValueExpression* const pExpression = m_FreeValueExpressions.pop();
    pExpression->initData(Value);
    return enter(m_Expressions, pExpression);
}

void ZfCCfgFactory::addSFExpression(ZfCCfgExpression* pExpression) {
    enter(m_Expressions, pExpression);
}

void ZfCCfgFactory::delValueExpression(ZfCCfgValueExpression* pExpression) {
    pExpression->resetData();
    m_Expressions.del(pExpression);
    m_FreeValueExpressions.append(pExpression);
}

void ZfCCfgFactory::delExplicitVarUse(ZfCCfgExplicitVarUse* pExpression) {
    pExpression->resetData();
    m_Expressions.del(pExpression);
    m_FreeExplicitVarUses.append(pExpression);
}

void ZfCCfgFactory::delSFExpression(ZfCCfgExpression* pExpression) {
    m_Expressions.del(pExpression);
}

// Node lists and statements, which are not parked.

leda::list<leda::node>* ZfCCfgFactory::createLedaList_Node() {
    return enter(m_NodeLists, new (std::nothrow) leda::list<leda::node>);
}

void ZfCCfgFactory::delLedaList_Node(leda::list<leda::node>* pList) {
    m_NodeLists.del(pList);
    delete pList;
}

void ZfCCfgFactory::addNewStatement(ZfCCfgStatement* pStatement) {
    enter(m_Statements, pStatement);
}

void ZfCCfgFactory::delStatement(ZfCCfgStatement* pStatement) {
    m_Statements.del(pStatement);
    delete pStatement;
}

// Release.

// A client's expressions die after the library's own, and while m_Expressions is still filled and
// not being walked: their destructors may use the factory.
void ZfCCfgFactory::releaseAllExpressions() {
    leda::list<ZfCCfgExpression*> ClientExpressions;
    for (auto Item = m_Expressions.first_item(); Item; Item = m_Expressions.next_item(Item)) {
        ZfCCfgExpression* const pExpression = m_Expressions.inf(Item);
        if (pExpression != nullptr && pExpression->isSFExpression() != nullptr)
            ClientExpressions.append(pExpression);
        else
            delete pExpression;
    }
    for (ZfCCfgExpression* pExpression : ClientExpressions)
        delete pExpression;
    for (ZfCCfgValueExpression* pExpression : m_FreeValueExpressions)
        delete pExpression;
    for (ZfCCfgExplicitVarUse* pExpression : m_FreeExplicitVarUses)
        delete pExpression;
    m_Expressions.clear();
    m_FreeExplicitVarUses.clear();
    m_FreeValueExpressions.clear();
}

void ZfCCfgFactory::releaseAllLedaList_Node() {
    for (auto Item = m_NodeLists.first_item(); Item; Item = m_NodeLists.next_item(Item))
        delete m_NodeLists.inf(Item);
    m_NodeLists.clear();
}

void ZfCCfgFactory::releaseAllVariables() {
    for (auto Item = m_SSAVariables.first_item(); Item; Item = m_SSAVariables.next_item(Item))
        delete m_SSAVariables.inf(Item);
    for (ZfCSSAVariable* pVariable : m_FreeSSAVariables)
        delete pVariable;
    m_SSAVariables.clear();
    m_FreeSSAVariables.clear();
}

void ZfCCfgFactory::releaseAllNodes() {
    for (auto Item = m_NodeInfos.first_item(); Item; Item = m_NodeInfos.next_item(Item))
        delete m_NodeInfos.inf(Item);
    for (ZfCBasicBlock* pBasicBlock : m_FreeBasicBlocks)
        delete pBasicBlock;
    for (ZfCCfgEntry* pEntry : m_FreeEntryNodes)
        delete pEntry;
    for (ZfCCfgExit* pExit : m_FreeExitNodes)
        delete pExit;
    m_NodeInfos.clear();
    m_FreeBasicBlocks.clear();
    m_FreeEntryNodes.clear();
    m_FreeExitNodes.clear();
}

// Parked edge records survive and are handed out again: SSA edges are made and dropped in great
// numbers, and the next graph finds them ready.
void ZfCCfgFactory::releaseAllEdgeInfos() {
    for (auto Item = m_EdgeInfos.first_item(); Item; Item = m_EdgeInfos.next_item(Item))
        delete m_EdgeInfos.inf(Item);
    m_EdgeInfos.clear();
}

void ZfCCfgFactory::releaseAllProcedures() {
    for (auto Item = m_Procedures.first_item(); Item; Item = m_Procedures.next_item(Item))
        delete m_Procedures.inf(Item);
    for (ZfCCfgProcedure* pProcedure : m_FreeProcedures)
        delete pProcedure;
    m_Procedures.clear();
    m_FreeProcedures.clear();
}

// In order of creation.
void ZfCCfgFactory::releaseAllStatements() {
    for (auto Item = m_Statements.first_item(); Item; Item = m_Statements.next_item(Item))
        delete m_Statements.inf(Item);
    m_Statements.clear();
}

void ZfCCfgFactory::releaseAllMemory() {
    releaseAllExpressions();
    releaseAllLedaList_Node();
    releaseAllVariables();
    releaseAllNodes();
    releaseAllEdgeInfos();
    releaseAllProcedures();
    releaseAllStatements();
}

// Key orders.

int ZfCCfgFactory::comparePointerNodeInfo(ZfCCfgNodeInfo* const& pLeft,
                                          ZfCCfgNodeInfo* const& pRight) {
    return compareAddresses(pLeft, pRight);
}

int ZfCCfgFactory::comparePointerEdgeInfo(ZfCCfgEdgeInfo* const& pLeft,
                                          ZfCCfgEdgeInfo* const& pRight) {
    return compareAddresses(pLeft, pRight);
}

int ZfCCfgFactory::comparePointerProcedure(ZfCCfgProcedure* const& pLeft,
                                           ZfCCfgProcedure* const& pRight) {
    return compareAddresses(pLeft, pRight);
}

int ZfCCfgFactory::comparePointerExpression(ZfCCfgExpression* const& pLeft,
                                            ZfCCfgExpression* const& pRight) {
    return compareAddresses(pLeft, pRight);
}

int ZfCCfgFactory::comparePointerVariable(ZfCCfgVariable* const& pLeft,
                                          ZfCCfgVariable* const& pRight) {
    return compareAddresses(pLeft, pRight);
}

int ZfCCfgFactory::comparePointerLedaList_Node(leda::list<leda::node>* const& pLeft,
                                               leda::list<leda::node>* const& pRight) {
    return compareAddresses(pLeft, pRight);
}
