#include "ModelTestSupport.h"

// Statements, basic blocks and procedures.

namespace {

using Variables = std::vector<ZfCCfgVariable*>;
using Assertions = std::vector<std::string>;

class StatementTest : public ModelTest {
protected:
    static ZfCPhiFunction* makePhi(ZfCCfgVariable* pVariable, const Variables& Operands) {
        ZfCPhiFunction* const p = new ZfCPhiFunction(pVariable, static_cast<int>(Operands.size()));
        for (std::size_t i = 0; i < Operands.size(); ++i)
            p->setReplacementVariable(static_cast<int>(i), Operands[i]);
        return p;
    }

    static Variables operands(ZfCPhiFunction* pPhi) {
        leda::array<ZfCCfgVariable*> Array = pPhi->getReplacementVariables();
        Variables Result;
        for (int i = 0; i < Array.size(); ++i)
            Result.push_back(Array[i]);
        return Result;
    }

    Variable a, b, c;
};

TEST_F(StatementTest, EachKindAnswersOnlyItsOwnDowncast) {
    leda::list<ZfCCfgVariable*> None;
    ZfCCfgStatement* const Statements[] = {
        new ZfCCfgInitAssignment,     new ZfCCfgProcedureCall("f"),
        new ZfCCfgExternCall(&None),  new ZfCPhiFunction(&a, 1),
        new ZfCCfgParamStatement(&a), new ZfCCfgValueReturnStatement(&a),
        new ZfCCfgOutputStatement(&a)};
    for (int i = 0; i < 7; ++i) {
        ZfCCfgStatement* const p = Statements[i];
        const void* const Casts[] = {p->isAssignment(),     p->isProcedureCall(),
                                     p->isExternCall(),     p->isPhiFunction(),
                                     p->isParamStatement(), p->isValueReturnStatement(),
                                     p->isOutputStatement()};
        for (int Kind = 0; Kind < 7; ++Kind)
            EXPECT_EQ(i == Kind ? p : nullptr, Casts[Kind]) << i << ' ' << Kind;
        EXPECT_EQ(nullptr, p->isSFAssignment());
        EXPECT_EQ(nullptr, p->isSFProcedureCall());
        bool SkipNext = true;
        EXPECT_FALSE(p->hoistOutOfIfElseBranch(SkipNext) || SkipNext);
        EXPECT_FALSE(p->hasSideEffects() || p->generatesSameCode(p));
        EXPECT_EQ(i == 3, p->clone() != nullptr); // only a phi function is cloned
    }
}

TEST_F(StatementTest, AssignmentHandsEverythingOnToItsRightHandSide) {
    ZfCCfgInitAssignment* const p = new ZfCCfgInitAssignment;
    EXPECT_TRUE(p->getDefinedVariables().empty());
    EXPECT_TRUE(p->getUsedVariables().empty());
    EXPECT_TRUE(p->getExternModifiableVariables().empty());
    EXPECT_FALSE(p->containsExternCalls() || p->getIsValidConditionAssignment());
    p->markAsContainsExternCalls();
    p->appendExternModifiableVariable(&a);
    p->appendPossiblyExternUsedVariable(&a);
    Expression* const pRHS = new Expression;
    factory().addSFExpression(pRHS);
    pRHS->m_Used.insert(&b);
    pRHS->m_HasSideEffects = true;
    p->setLHS(&a);
    p->setRHS(pRHS);
    p->foldConstants();
    EXPECT_EQ(0, pRHS->m_Folds); // an init assignment stays as it is
    p->markAsContainsExternCalls();
    p->appendExternModifiableVariable(&b);
    p->appendPossiblyExternUsedVariable(&c);
    EXPECT_TRUE(p->containsExternCalls());
    EXPECT_EQ((Variables{&b, &c}), elements(p->getExternModifiableVariables()));
    p->setRHS(factory().createValueExpression()); // an expression that knows no extern calls
    p->markAsContainsExternCalls();
    p->appendExternModifiableVariable(&b);
    p->appendPossiblyExternUsedVariable(&c);
    EXPECT_FALSE(p->containsExternCalls());
    EXPECT_TRUE(p->getExternModifiableVariables().empty());
    p->setRHS(pRHS);
    EXPECT_TRUE(p->hasSideEffects());
    EXPECT_EQ(Variables{&a}, elements(p->getDefinedVariables()));
    EXPECT_EQ(Variables{&b}, elements(p->getUsedVariables()));
}

TEST_F(StatementTest, CopyHasTheNumbersOfItsSourceAndIsNotOwnedByTheFactory) {
    struct Copyable : ZfCCfgInitAssignment {
        ~Copyable() override = default;
    };
    Copyable* const pSource = new Copyable;
    pSource->setIsVirtual(true);
    pSource->setLHS(&a);
    Copyable* const pCopy = new Copyable(*pSource);
    EXPECT_EQ(pSource->getIndex(), pCopy->getIndex());
    EXPECT_TRUE(pCopy->getIsVirtual() && pCopy->getLHS() == &a);
    EXPECT_EQ(pSource->getIndex() + 1, (new ZfCCfgInitAssignment)->getIndex());
    factory().releaseAllStatements();
    EXPECT_EQ(&a, pCopy->getLHS()); // still alive
    delete pCopy;
}

TEST_F(StatementTest, ExternCallDefinesNothingAndReplacesUnconditionally) {
    leda::list<ZfCCfgVariable*> Modifiable;
    Modifiable.append(&a);
    ZfCCfgExternCall* const p = new ZfCCfgExternCall(&Modifiable);
    Modifiable.clear();
    p->appendModifiableVariable(&b);
    EXPECT_EQ((Variables{&a, &b}), elements(p->getModifiableVariables()));
    EXPECT_TRUE(p->getDefinedVariables().empty());
    p->appendUsedVariable(&c);
    p->replaceVariable(&a, &b); // a is not there
    p->replaceVariable(&c, &a);
    EXPECT_EQ((Variables{&a, &b}), elements(p->getUsedVariables()));
    EXPECT_EQ((Variables{&a, &b}), elements(p->getModifiableVariables()));
}

TEST_F(StatementTest, DeletedOperandClosesUpInOrder) {
    const Variables All = {&a, &b, &c};
    for (int Pos = 0; Pos < 3; ++Pos) {
        ZfCPhiFunction* const p = makePhi(&a, All);
        p->delReplacement(Pos);
        Variables Expected = All;
        Expected.erase(Expected.begin() + Pos);
        EXPECT_EQ(Expected, operands(p));
    }
    ZfCPhiFunction* const pSingle = makePhi(&a, {&b});
    pSingle->delReplacement(0);
    EXPECT_TRUE(operands(pSingle).empty());
    EXPECT_TRUE(m_Reports.m_Messages.empty());
}

TEST_F(StatementTest, OperandThatIsNotThereIsAnInternalErrorAndTheLastOneGoes) {
    for (const bool IsShown : {false, true}) {
        ZfCPlatformMessageServer::setShowInternalInfo(IsShown);
        ZfCPhiFunction* const p = makePhi(&a, {&b, &c});
        p->delReplacement(2);
        EXPECT_EQ(Variables{&b}, operands(p));
        ASSERT_EQ(1u, m_Reports.m_Messages.size());
        EXPECT_EQ(0u, m_Reports.m_Messages[0].find(
                          "3 10007 General Messages|Internal error. Error code: ZfCPhiFunction "));
        EXPECT_EQ(IsShown ? (Assertions{"0", "m_pReplacementVariable[Dim - 1] == 0"})
                          : Assertions{},
                  m_Reports.m_Assertions);
        m_Reports.m_Messages.clear();
    }
    makePhi(&a, {})->delReplacement(0); // nothing to give
    EXPECT_EQ(1u, m_Reports.m_Messages.size());
}

TEST_F(StatementTest, UsesOfAPhiFunctionAreTheSetOfItsOperands) {
    ZfCPlatformMessageServer::setShowInternalInfo(true);
    ZfCPhiFunction* const p = makePhi(&a, {&c, &b, &c});
    EXPECT_EQ((Variables{&b, &c}), elements(p->getUsedVariables()));
    EXPECT_TRUE(m_Reports.m_Assertions.empty());
    ZfCPhiFunction* const pClone = p->clone()->isPhiFunction();
    EXPECT_EQ(&a, pClone->getVariable());
    EXPECT_EQ((Variables{nullptr, nullptr, nullptr}), operands(pClone));
    EXPECT_EQ((Variables{nullptr}), elements(pClone->getUsedVariables()));
    EXPECT_EQ((Assertions{"pVariable", "pVariable", "pVariable"}), m_Reports.m_Assertions);
}

TEST_F(StatementTest, ParameterJoinsTheArgumentsOfItsCalls) {
    ZfCCfgParamStatement* const p = new ZfCCfgParamStatement(&a);
    EXPECT_KIND(eCfgValueUndetermined, p->evaluate());
    EXPECT_CONSTANT(0.0, p->getMinimum());
    ZfCCfgProcedureCall* Calls[] = {new ZfCCfgProcedureCall("f"), new ZfCCfgProcedureCall};
    Expression* Arguments[] = {new Expression, new Expression};
    for (int i = 0; i < 2; ++i) {
        factory().addSFExpression(Arguments[i]);
        Arguments[i]->m_Value = ZfCCfgValue(4.0);
        Arguments[i]->m_Minimum = ZfCCfgValue(2.0 - i);
        Arguments[i]->m_Maximum = ZfCCfgValue(7.0 - i);
        p->setParamExpression(Calls[i], Arguments[i]);
    }
    Arguments[0]->m_Used.insert(&c);
    Arguments[1]->m_Used.insert(&b);
    EXPECT_CONSTANT(4.0, p->evaluate());
    EXPECT_CONSTANT(1.0, p->getMinimum());
    EXPECT_CONSTANT(7.0, p->getMaximum());
    EXPECT_EQ(Variables{&a}, elements(p->getDefinedVariables()));
    EXPECT_EQ((Variables{&b, &c}), elements(p->getUsedVariables()));
    Arguments[1]->m_Value = ZfCCfgValue(5.0);
    EXPECT_KIND(eCfgValueNonConstant, p->evaluate());
    p->delParamExpression(Calls[1]);
    EXPECT_CONSTANT(2.0, p->getMinimum());
    EXPECT_EQ(nullptr, p->getParamExpression(Calls[1])); // entered by the question
    EXPECT_EQ(2, p->countParamExpressions());
    EXPECT_EQ(2, p->getParamExpressions().size());
}

using BlockTest = StatementTest;

TEST_F(BlockTest, SingleElementIsFoundOnlyWhereItStandsAlone) {
    ZfCBasicBlock* const p = factory().createBasicBlock();
    EXPECT_TRUE(p->isEmpty());
    p->appendBranch(factory().createValueExpression());
    EXPECT_FALSE(p->isEmpty());
    ZfCCfgStatement* const pStmt = new ZfCCfgOutputStatement(&a);
    p->append(pStmt);
    EXPECT_EQ(nullptr, p->isStatement());
    p->appendBranch(nullptr);
    EXPECT_EQ(pStmt, p->isStatement());
    EXPECT_EQ(nullptr, p->isPhiFunction());
    ZfCBasicBlock* const pPhis = factory().createBasicBlock();
    ZfCPhiFunction* const pPhi = makePhi(&b, {});
    pPhis->append(pPhi);
    EXPECT_EQ(pPhi, pPhis->isPhiFunction());
    EXPECT_EQ(nullptr, pPhis->isStatement());
    p->append(pPhis->getPhiFunctions());
    EXPECT_EQ(nullptr, p->isStatement());
    EXPECT_EQ(nullptr, p->isPhiFunction());
    pPhis->append(makePhi(&a, {}));
    EXPECT_EQ(nullptr, pPhis->isPhiFunction());
}

TEST_F(BlockTest, AssignedVariablesAreKeptFromTheFirstQuestionThatFindsAny) {
    ZfCBasicBlock* const p = factory().createBasicBlock();
    EXPECT_TRUE(p->getAssignedVariables().empty());
    p->append(new ZfCCfgParamStatement(&c));
    p->append(makePhi(&b, {&a}));
    p->append(new ZfCCfgParamStatement(&b));
    EXPECT_EQ((Variables{&b, &c, &b}), elements(p->getAssignedVariables()));
    p->append(new ZfCCfgParamStatement(&a));
    EXPECT_EQ((Variables{&b, &c, &b}), elements(p->getAssignedVariables()));
    // Uses are collected anew.
    p->append(new ZfCCfgOutputStatement(&c));
    Expression* const pCondition = new Expression;
    factory().addSFExpression(pCondition);
    pCondition->m_Used.insert(&b);
    p->appendBranch(pCondition);
    EXPECT_EQ((Variables{&a, &b, &c}), elements(p->getUsedVariables()));
}

TEST_F(BlockTest, NodesWithoutCodeShareOneEmptyList) {
    ZfCCfgNodeInfo* const pEntry = factory().createEntryNode();
    ZfCCfgNodeInfo* const pExit = factory().createExitNode();
    EXPECT_EQ(&pEntry->getAssignedVariables(), &pExit->getAssignedVariables());
    EXPECT_TRUE(pEntry->getAssignedVariables().empty() && pExit->getUsedVariables().empty());
    EXPECT_EQ(pEntry, pEntry->isEntryNode());
    EXPECT_EQ(nullptr, pExit->isEntryNode());
    EXPECT_EQ(0, leda::compare(pEntry, pExit)); // no dominators yet
}

TEST_F(BlockTest, DeleteEndsOnlyWhatStandsInTheBlock) {
    struct Witness : ZfCCfgOutputStatement {
        Witness(ZfCCfgVariable* p, std::string& Log) : ZfCCfgOutputStatement(p), m_Log(Log) {}
        ~Witness() override { m_Log += 'd'; }
        void remove() override { m_Log += 'r'; }
        std::string& m_Log;
    };
    std::string Log;
    Witness* const pStmt = new Witness(&a, Log);
    ZfCPhiFunction* const pPhi = makePhi(&a, {});
    ZfCBasicBlock* const p = factory().createBasicBlock();
    ZfCBasicBlock* const pOther = factory().createBasicBlock();
    p->append(pStmt);
    p->append(pPhi);
    for (const bool IsShown : {false, true}) {
        ZfCPlatformMessageServer::setShowInternalInfo(IsShown);
        pOther->del(pStmt);
        pOther->del(pPhi);
    }
    EXPECT_EQ("", Log);
    EXPECT_EQ((Assertions{"0", "0"}), m_Reports.m_Assertions);
    p->del(pPhi);
    p->del(pStmt);
    EXPECT_EQ("rd", Log);
    EXPECT_TRUE(p->isEmpty());
}

TEST_F(BlockTest, SplitGivesTheSecondHalfWithPhiFunctionsAndCondition) {
    ZfCPlatformMessageServer::setShowInternalInfo(true);
    ZfCBasicBlock* const p = factory().createBasicBlock();
    ZfCCfgStatement* Statements[] = {new ZfCCfgOutputStatement(&a), new ZfCCfgOutputStatement(&b),
                                     new ZfCCfgOutputStatement(&c)};
    leda::list<ZfCCfgStatement*> Rest;
    Rest.append(Statements[1]);
    Rest.append(Statements[2]);
    p->append(Statements[0]);
    p->append(Rest);
    ZfCCfgExpression* const pCondition = factory().createValueExpression();
    p->append(makePhi(&a, {}));
    p->appendBranch(factory().createValueExpression());
    p->appendBranch(pCondition);
    p->setProcedure(factory().createProcedure());
    EXPECT_EQ(p, p->splitAtStatement(Statements[0]));
    EXPECT_EQ(3, p->getStatementSeq().size());

    ZfCBasicBlock* const pNew = p->splitAtStatement(Statements[1]);
    EXPECT_EQ((std::vector<ZfCCfgStatement*>{Statements[0]}), elements(p->getStatementSeq()));
    EXPECT_EQ((std::vector<ZfCCfgStatement*>{Statements[1], Statements[2]}),
              elements(pNew->getStatementSeq()));
    EXPECT_TRUE(p->getPhiFunctions().empty());
    EXPECT_EQ(1, pNew->getPhiFunctions().size());
    EXPECT_EQ(nullptr, p->getBranchCond());
    EXPECT_EQ(pCondition, pNew->getBranchCond());
    EXPECT_EQ(p->getProcedure(), pNew->getProcedure());

    ZfCBasicBlock* const pTail = pNew->splitAtCondition();
    EXPECT_EQ(pCondition, pTail->getBranchCond());
    EXPECT_EQ(nullptr, pNew->getBranchCond());
    EXPECT_EQ(1, pNew->getPhiFunctions().size()); // they stay here
    EXPECT_EQ(p->getProcedure(), pTail->getProcedure());
    EXPECT_EQ(pTail, pTail->splitAtCondition());
    EXPECT_TRUE(m_Reports.m_Assertions.empty());

    EXPECT_EQ(p, p->splitAtStatement(Statements[2])); // stands elsewhere by now
    EXPECT_EQ(1, p->getStatementSeq().size());
    EXPECT_EQ((Assertions{"0"}), m_Reports.m_Assertions);
    ASSERT_EQ(1u, m_Reports.m_Messages.size());
    EXPECT_NE(std::string::npos, m_Reports.m_Messages[0].find("ZfCBasicBlock "));
}

TEST_F(BlockTest, CloneSharesTheSingleStatement) {
    ZfCBasicBlock* const pStatement = factory().createBasicBlock();
    ZfCBasicBlock* const pPhi = factory().createBasicBlock();
    ZfCBasicBlock* const pEmpty = factory().createBasicBlock();
    pStatement->append(new ZfCCfgOutputStatement(&a));
    pPhi->append(makePhi(&a, {&b}));
    EXPECT_EQ(pStatement->isStatement(), pStatement->clone()->isStatement());
    EXPECT_EQ(pPhi->isPhiFunction(), pPhi->clone()->isPhiFunction());
    EXPECT_EQ(nullptr, pEmpty->clone());
}

TEST_F(StatementTest, ProcedureStaysCallableFromOutsideOnceACallSaysSo) {
    ZfCCfgProcedure* const p = factory().createProcedure();
    ZfCCfgProcedureCall* const pMarked = new ZfCCfgProcedureCall("f");
    pMarked->setIsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(true);
    p->appendCall(new ZfCCfgProcedureCall("f"));
    EXPECT_FALSE(p->isDirectlyOrIndirectlyCallableFromOutside());
    p->appendCall(pMarked);
    p->appendCall(new ZfCCfgProcedureCall("f"));
    EXPECT_TRUE(p->isDirectlyOrIndirectlyCallableFromOutside());
    EXPECT_EQ(3, p->getCalls().size());
    EXPECT_EQ(pMarked, elements(p->getCalls())[1]); // in the order of the calls
    p->appendUsedVariable(&c);
    p->appendDefinedVariable(&a);
    p->getDefinedVariables().insert(&b); // changes a copy
    EXPECT_EQ(1, p->getDefinedVariables().size());
    p->setName("f");
    leda::graph Graph;
    const leda::node v = Graph.new_node();
    p->setEntryNode(v);
    p->resetData();
    EXPECT_STREQ("", p->getName().cstring());
    EXPECT_TRUE(p->getCalls().empty() && p->getUsedVariables().empty());
    EXPECT_FALSE(p->isDirectlyOrIndirectlyCallableFromOutside());
    EXPECT_EQ(v, p->getEntryNode()); // nodes stay while parked
    p->initData();
    EXPECT_EQ(nullptr, p->getEntryNode());
    EXPECT_EQ(0, p->getDebugIndex());
    EXPECT_TRUE(p->getCalls().empty() && p->getDefinedVariables().empty());
    EXPECT_FALSE(p->isDirectlyOrIndirectlyCallableFromOutside());
}

} // namespace
