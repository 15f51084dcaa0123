#include "ModelTestSupport.h"

#include <type_traits>

// The factory's recycling, numbering and release, and what the access levels promise.

namespace {

TEST(Control, BootAndShutdownAreAlwaysTrueAndFrameTheFactory) {
    ZfCSSAControl Control;
    EXPECT_TRUE(Control.shutdown()); // without boot
    EXPECT_EQ(nullptr, ZfCCfgFactory::getInstance());
    EXPECT_TRUE(Control.boot());
    EXPECT_NE(nullptr, ZfCCfgFactory::getInstance());
    EXPECT_TRUE(Control.shutdown());
    EXPECT_TRUE(Control.shutdown());
    EXPECT_EQ(nullptr, ZfCCfgFactory::getInstance());
}

TEST(Control, EveryBootStartsTheNumbersAtZero) {
    ZfCSSAControl Control;
    for (int Run = 0; Run < 2; ++Run) {
        Control.boot();
        ZfCCfgFactory& Factory = *ZfCCfgFactory::getInstance();
        // Node and edge records of all classes share one counter each.
        EXPECT_EQ(0u, Factory.createEntryNode()->getIndex());
        EXPECT_EQ(1u, Factory.createBasicBlock()->getIndex());
        EXPECT_EQ(2u, Factory.createExitNode()->getIndex());
        EXPECT_EQ(0u, Factory.createEdgeInfo()->getIndex());
        EXPECT_EQ(1u, Factory.createSSAEdge()->getIndex());
        EXPECT_EQ(0, Factory.createProcedure()->getDebugIndex());
        Variable v;
        EXPECT_EQ(0u, v.getIndex());
        EXPECT_EQ(1u, Factory.createSSAVariable(&v)->getIndex());
        for (unsigned int i = 0; i < 2; ++i) {
            ZfCCfgInitAssignment* const pStmt = new ZfCCfgInitAssignment;
            EXPECT_EQ(i, pStmt->getIndex());
            EXPECT_EQ(static_cast<int>(i), pStmt->getDebugIndex());
            EXPECT_FALSE(pStmt->getIsVirtual());
        }
        Control.shutdown();
    }
}

class Factory : public ModelTest {};

// Create, give back, create: the object comes back with a new number; the longest parked one comes
// first.
template <class T>
void expectFifo(T* (ZfCCfgFactory::*pCreate)(), void (ZfCCfgFactory::*pDel)(T*)) {
    ZfCCfgFactory& Factory = *ZfCCfgFactory::getInstance();
    T* const pFirst = (Factory.*pCreate)();
    T* const pSecond = (Factory.*pCreate)();
    T* const pThird = (Factory.*pCreate)();
    (Factory.*pDel)(pSecond);
    (Factory.*pDel)(pFirst);
    (Factory.*pDel)(pThird);
    EXPECT_EQ(pSecond, (Factory.*pCreate)());
    EXPECT_EQ(pFirst, (Factory.*pCreate)());
    // Given back twice, parked twice.
    (Factory.*pDel)(pFirst);
    (Factory.*pDel)(pFirst);
    EXPECT_EQ(pThird, (Factory.*pCreate)());
    EXPECT_EQ(pFirst, (Factory.*pCreate)());
    EXPECT_EQ(pFirst, (Factory.*pCreate)());
}

template <class T>
void delEdge(ZfCCfgFactory& Factory, T* pEdge) {
    Factory.delEdgeInfo(pEdge);
}

TEST_F(Factory, FreeListsAreFirstInFirstOut) {
    expectFifo(&ZfCCfgFactory::createBasicBlock, &ZfCCfgFactory::delBasicBlock);
    expectFifo(&ZfCCfgFactory::createEntryNode, &ZfCCfgFactory::delEntryNode);
    expectFifo(&ZfCCfgFactory::createExitNode, &ZfCCfgFactory::delExitNode);
    expectFifo(&ZfCCfgFactory::createProcedure, &ZfCCfgFactory::delProcedure);
    expectFifo(&ZfCCfgFactory::createEdgeInfo, &ZfCCfgFactory::delEdgeInfo);
    expectFifo<ZfCCfgExplicitVarUse>(&ZfCCfgFactory::createExplicitVarUse,
                                     &ZfCCfgFactory::delExplicitVarUse);
    expectFifo<ZfCCfgValueExpression>(&ZfCCfgFactory::createValueExpression,
                                      &ZfCCfgFactory::delValueExpression);
}

TEST_F(Factory, EachEdgeClassHasItsOwnFreeListAndParkedEdgesSurviveTheRelease) {
    ZfCCfgEdgeInfo* const pPlain = factory().createEdgeInfo();
    ZfCCfgTrueBranch* const pTrue = factory().createTrueBranch();
    ZfCCfgFalseBranch* const pFalse = factory().createFalseBranch();
    ZfCSSAEdge* const pSSA = factory().createSSAEdge();
    pTrue->activateEdgeExecutable();
    for (ZfCCfgEdgeInfo* pEdge :
         {pPlain, static_cast<ZfCCfgEdgeInfo*>(pTrue), static_cast<ZfCCfgEdgeInfo*>(pFalse),
          static_cast<ZfCCfgEdgeInfo*>(pSSA)}) {
        factory().delEdgeInfo(pEdge);
        EXPECT_EQ(0u, pEdge->getIndex());
    }
    factory().releaseAllMemory();
    EXPECT_EQ(pSSA, factory().createSSAEdge());
    EXPECT_EQ(pTrue, factory().createTrueBranch());
    EXPECT_EQ(pFalse, factory().createFalseBranch());
    EXPECT_EQ(pPlain, factory().createEdgeInfo());
    EXPECT_FALSE(pTrue->isEdgeExecutable());
    EXPECT_EQ(4u, pSSA->getIndex());
    EXPECT_NE(pPlain, factory().createEdgeInfo());
}

TEST_F(Factory, RecycledBlockIsCleanButRecycledEntryKeepsItsPast) {
    leda::graph Graph;
    const leda::node v = Graph.new_node();
    ZfCCfgProcedure* const pProcedure = factory().createProcedure();
    ZfCBasicBlock* const pBlock = factory().createBasicBlock();
    ZfCCfgEntry* const pEntry = factory().createEntryNode();
    ZfCCfgExit* const pExit = factory().createExitNode();
    pBlock->append(new ZfCCfgInitAssignment);
    pBlock->append(new ZfCPhiFunction(nullptr, 0));
    pBlock->appendBranch(factory().createValueExpression());
    pBlock->getAssignedVariables();
    for (ZfCCfgNodeInfo* pNodeInfo :
         {static_cast<ZfCCfgNodeInfo*>(pBlock), static_cast<ZfCCfgNodeInfo*>(pEntry)}) {
        pNodeInfo->setProcedure(pProcedure);
        pNodeInfo->setIdom(v);
        pNodeInfo->getDF()->insert(v);
        factory().delNodeInfo(pNodeInfo);
    }
    factory().delNodeInfo(pExit);
    EXPECT_EQ(pExit, factory().createExitNode());
    EXPECT_EQ(1u, pEntry->getIndex());
    EXPECT_EQ(pBlock, factory().createBasicBlock());
    EXPECT_EQ(pEntry, factory().createEntryNode());
    EXPECT_EQ(4u, pBlock->getIndex());
    EXPECT_TRUE(pBlock->isEmpty());
    EXPECT_TRUE(pBlock->getAssignedVariables().empty());
    EXPECT_EQ(nullptr, pBlock->getProcedure());
    EXPECT_EQ(nullptr, pBlock->getIdom());
    EXPECT_TRUE(pBlock->getDF()->empty());
    EXPECT_EQ(5u, pEntry->getIndex());
    EXPECT_EQ(pProcedure, pEntry->getProcedure());
    EXPECT_EQ(v, pEntry->getIdom());
    EXPECT_TRUE(pEntry->getDF()->member(v));
}

class ForeignNodeInfo : public ZfCCfgNodeInfo {};

TEST_F(Factory, RecordOfAForeignClassIsLeftAlone) {
    ForeignNodeInfo Foreign;
    Foreign.getDF()->insert(nullptr);
    factory().delNodeInfo(&Foreign);
    EXPECT_EQ(1, Foreign.getDF()->size());
    EXPECT_NE(static_cast<ZfCCfgNodeInfo*>(&Foreign), factory().createBasicBlock());
}

TEST_F(Factory, RecycledVersionSortsByTheNumberOfItsFirstLife) {
    Variable v;
    ZfCSSAVariable* const pOld = factory().createSSAVariable(&v);
    ZfCSSAVariable* const pYoung = factory().createSSAVariable(&v);
    pOld->markAsVolatile();
    pOld->markAsErasable();
    pOld->markAsArray();
    pOld->pushSSAReplacement(pYoung);
    pOld->appendVirtualAlias(pYoung);
    pOld->setMinValueAndDestroyOld(ZfCCfgValue(1.0));
    factory().delSSAVariable(pOld);
    EXPECT_EQ(0u, pOld->getIndex());
    EXPECT_FALSE(pOld->isErasable() || pOld->isArray() || pOld->isVolatile());
    EXPECT_EQ(nullptr, pOld->getOrigVar());
    EXPECT_EQ(nullptr, pOld->getNonVirtualAlias());
    EXPECT_EQ(pOld, factory().createSSAVariable(pYoung));
    EXPECT_EQ(3u, pOld->getIndex());
    EXPECT_EQ(1, pOld->getDebugIndex());
    EXPECT_EQ(&v, pOld->getOrigVar());
    EXPECT_EQ(pOld, pOld->getNonVirtualAlias());
    EXPECT_EQ(nullptr, pOld->topSSAReplacement());
    EXPECT_FALSE(pOld->isVolatile() || pOld->isErasable() || pOld->isArray());
    EXPECT_EQ(0, pOld->countAllUses());
    EXPECT_TRUE(pOld->getValue().isUndetermined());
    EXPECT_TRUE(pOld->getMinValue().isUndetermined());
    VariableSet Set;
    for (ZfCCfgVariable* pVariable : std::vector<ZfCCfgVariable*>{pYoung, nullptr, pOld, &v, pOld})
        Set.insert(pVariable);
    EXPECT_EQ((std::vector<ZfCCfgVariable*>{nullptr, &v, pOld, pYoung}), elements(Set));
}

TEST_F(Factory, ParkedExpressionsAreRenewedByEachFormOfTheCreateOperation) {
    Variable v;
    ZfCCfgValueExpression* const pValue = factory().createValueExpression(ZfCCfgValue(3.0));
    factory().delValueExpression(pValue);
    EXPECT_CONSTANT(0.0, pValue->getValue());
    EXPECT_EQ(pValue, factory().createValueExpression());
    EXPECT_TRUE(pValue->getValue().isUndetermined());
    factory().delValueExpression(pValue);
    EXPECT_EQ(pValue, factory().createValueExpression(ZfCCfgValue(4.0)));
    EXPECT_CONSTANT(4.0, pValue->evaluate());

    ZfCCfgExplicitVarUse* const pUse = factory().createExplicitVarUse(true);
    EXPECT_TRUE(pUse->isMarkedAsEvalToNonConst());
    pUse->addVariable(&v);
    factory().delExplicitVarUse(pUse);
    EXPECT_EQ(pUse, factory().createExplicitVarUse());
    EXPECT_FALSE(pUse->isMarkedAsEvalToNonConst());
    EXPECT_TRUE(pUse->getUsedVariables().empty());
    factory().delExplicitVarUse(pUse);
    EXPECT_TRUE(factory().createExplicitVarUse(true)->isMarkedAsEvalToNonConst());
}

// A statement that writes down its death.
class MortalStatement : public ZfCCfgOutputStatement {
public:
    MortalStatement(std::vector<std::string>& Deaths, std::string Name)
        : ZfCCfgOutputStatement(nullptr), m_Deaths(Deaths), m_Name(Name) {}
    ~MortalStatement() override { m_Deaths.push_back(m_Name); }

private:
    std::vector<std::string>& m_Deaths;
    std::string m_Name;
};

TEST_F(Factory, ReleaseEndsClientExpressionsBeforeStatementsAndTheseInOrderOfCreation) {
    std::vector<std::string> Deaths;
    new MortalStatement(Deaths, "first");
    MortalStatement* const pEnded = new MortalStatement(Deaths, "ended");
    new MortalStatement(Deaths, "last");
    factory().addSFExpression(new Expression(&Deaths));
    Expression* const pHandedBack = new Expression(&Deaths);
    factory().addSFExpression(pHandedBack);
    factory().delSFExpression(pHandedBack);
    factory().delStatement(pEnded);
    factory().delStatement(nullptr);
    factory().delLedaList_Node(factory().createLedaList_Node());
    factory().createLedaList_Node()->append(nullptr); // left to the release
    factory().delLedaList_Node(nullptr);
    // What is parked when the factory empties goes too: the leak checker watches.
    Variable v;
    factory().delSSAVariable(factory().createSSAVariable(&v));
    factory().delExplicitVarUse(factory().createExplicitVarUse());
    factory().delEntryNode(factory().createEntryNode());
    factory().delExitNode(factory().createExitNode());
    factory().delProcedure(factory().createProcedure());
    EXPECT_EQ((std::vector<std::string>{"ended"}), Deaths);
    factory().releaseAllMemory();
    EXPECT_EQ((std::vector<std::string>{"ended", "client", "first", "last"}), Deaths);
    delete pHandedBack;
    EXPECT_EQ(5u, Deaths.size());
}

// A client expression that uses the factory while it dies.
class LateExpression : public Expression {
public:
    ~LateExpression() override {
        ZfCCfgFactory* const pFactory = ZfCCfgFactory::getInstance();
        pFactory->delValueExpression(pFactory->createValueExpression());
        pFactory->delSFExpression(this);
    }
};

TEST_F(Factory, ClientExpressionsMayUseTheFactoryWhileTheyAreReleased) {
    for (int i = 0; i < 40; ++i)
        factory().addSFExpression(new LateExpression);
    factory().releaseAllMemory(); // the sanitizers watch
    EXPECT_TRUE(factory().createValueExpression()->getValue().isUndetermined());
}

TEST_F(Factory, PointerComparisonsAnswerTheSignOfTheDifference) {
    ZfCCfgEdgeInfo* Edges[] = {factory().createEdgeInfo(), factory().createTrueBranch()};
    ZfCCfgEdgeInfo* const pLow = std::min(Edges[0], Edges[1]);
    ZfCCfgEdgeInfo* const pHigh = std::max(Edges[0], Edges[1]);
    EXPECT_EQ(-1, ZfCCfgFactory::comparePointerEdgeInfo(pLow, pHigh));
    EXPECT_EQ(1, ZfCCfgFactory::comparePointerEdgeInfo(pHigh, pLow));
    EXPECT_EQ(0, ZfCCfgFactory::comparePointerEdgeInfo(pLow, pLow));
}

// What only the factory may do, as a client sees it.
static_assert(!std::is_constructible_v<ZfCBasicBlock> && !std::is_destructible_v<ZfCBasicBlock>);
static_assert(!std::is_constructible_v<ZfCCfgEntry> && !std::is_destructible_v<ZfCCfgEntry>);
static_assert(!std::is_constructible_v<ZfCCfgProcedure>);
static_assert(!std::is_destructible_v<ZfCCfgProcedure>);
static_assert(!std::is_constructible_v<ZfCCfgEdgeInfo>);
static_assert(std::is_copy_constructible_v<ZfCCfgEdgeInfo>);
static_assert(!std::is_destructible_v<ZfCSSAVariable>);
static_assert(!std::is_destructible_v<ZfCCfgInitAssignment>);
static_assert(!std::is_destructible_v<ZfCCfgValueExpression>);
static_assert(!std::is_copy_assignable_v<ZfCCfgParamStatement>);
static_assert(std::is_copy_assignable_v<ZfCPhiFunction>);
static_assert(std::is_trivially_copyable_v<ZfCCfgValue> && sizeof(ZfCCfgValue) == 16);

} // namespace
