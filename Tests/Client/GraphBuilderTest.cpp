// The shape of the graph as built, and what the builder tells the optimiser about variables and
// calls.

#include "Generators/GraphRandomProgram.h"
#include "Model/HoistingContext.h"
#include "Oracles/GraphShape.h"
#include "Oracles/TreeRunner.h"

#include <gtest/gtest.h>

#include <set>

namespace {

using namespace hpn;
using namespace hpn::test;

/// Statements of the graph that define a variable.
int countDefinitions(ProgramGraph& Program, const Variable& Of) {
    int Count = 0;
    for (leda::node v : Program.getGraph().all_nodes()) {
        for (ZfCCfgVariable* pVariable : Program.getGraph()[v]->getAssignedVariables())
            Count += pVariable == Program.getVariable(Of) ? 1 : 0;
    }
    return Count;
}

TEST(GraphBuilder, EveryProcedureIsOneComponentWithOneEntry) {
    for (unsigned Seed = 0; Seed < 100; ++Seed) {
        const RandomProgram Made(Seed);
        ProgramGraph Graph(Made.Tree);
        EXPECT_EQ(shapeFaults(Graph), "");
        ASSERT_FALSE(HasFailure()) << "program " << Seed;
    }
}

TEST(GraphBuilder, StatementsBehindAJumpAreNotBuilt) {
    TestProgram Made;
    Variable& Output = Made.variable(VariableKind::Output, "o", BaseType::Int16);
    Statement* pDead =
        Made.statement(StatementKind::While, Made.number(1), Made.assign(Output, Made.number(2)));
    Made.Tree.pMain->pBody = TestProgram::list(
        {Made.assign(Output, Made.number(1)), Made.statement(StatementKind::Return), pDead});
    ProgramGraph Graph(Made.Tree);
    EXPECT_EQ(shapeFaults(Graph), "");
    EXPECT_EQ(countDefinitions(Graph, Output), 1);
}

TEST(GraphBuilder, AnEmptyMainIsOneEmptyBlock) {
    TestProgram Made;
    ProgramGraph Graph(Made.Tree);
    EXPECT_EQ(shapeFaults(Graph), "");
    EXPECT_EQ(Graph.getGraph().number_of_nodes(), 2);
    EXPECT_EQ(Graph.findProcedure("#main"), Made.Tree.pMain);
}

// Loops that nothing leaves: alone, nested, two that share a block, one block that jumps to itself.
TEST(GraphBuilder, EndlessLoopsGetAWayOutThatIsNeverTaken) {
    for (int Shape = 0; Shape < 4; ++Shape) {
        TestProgram Made;
        Variable& Output = Made.variable(VariableKind::Output, "o", BaseType::Int16);
        Variable& Input = Made.variable(VariableKind::Input, "in", BaseType::Bool);
        Statement* pBody = Made.assign(Output, Made.number(1));
        const auto forever = [&](Statement* pInner) {
            return Made.statement(StatementKind::For, nullptr, pInner);
        };
        Statement* pLabel = Made.statement(StatementKind::Label);
        Statement* pGoto = Made.statement(StatementKind::Goto);
        pGoto->pLabel = pLabel;
        Statement* pIf = Made.statement(StatementKind::If, Made.read(Input),
                                        Made.statement(StatementKind::Continue), pBody);
        Statement* const Bodies[] = {forever(pBody), forever(forever(pBody)), forever(pIf),
                                     TestProgram::list({pLabel, pGoto})};
        Made.Tree.pMain->pBody = Bodies[Shape];
        ProgramGraph Graph(Made.Tree);
        EXPECT_EQ(shapeFaults(Graph), "");
        int NeverLeft = 0;
        for (leda::node v : Graph.getGraph().all_nodes()) {
            ZfCBasicBlock* pBlock = Graph.getGraph()[v]->isBasicBlock();
            NeverLeft += pBlock != nullptr && Graph.isNeverLeft(pBlock->getBranchCond()) ? 1 : 0;
        }
        EXPECT_GE(NeverLeft, 1) << Shape;
        Graph.getGraph().placeExitNodes();
        EXPECT_TRUE(Graph.getGraph().checkConsistency()) << Shape;
    }
}

TEST(GraphBuilder, NestingCostsNoStack) {
    TestProgram Made;
    Variable& Output = Made.variable(VariableKind::Output, "o", BaseType::Int16);
    Statement* pBody = Made.assign(Output, Made.number(1));
    for (int i = 0; i < 200000; ++i)
        pBody = i % 2 == 0 ? Made.statement(StatementKind::Block, nullptr, pBody)
                           : Made.statement(StatementKind::If, Made.number(1), pBody);
    Made.Tree.pMain->pBody = pBody;
    ProgramGraph Graph(Made.Tree);
    EXPECT_EQ(countDefinitions(Graph, Output), 1);
}

TEST(GraphBuilder, AnActivationsVariablesAreVolatileAndItsCallsNotInlined) {
    TestProgram Made;
    Variable& State = Made.variable(VariableKind::State, "s", BaseType::Int16);
    Procedure& Recursive = Made.procedure("f");
    Recursive.IsRecursive = true;
    Variable& Formal = Made.variable(VariableKind::Formal, "a", BaseType::Int16, &Recursive);
    Variable& Result = Made.variable(VariableKind::Result, "f", BaseType::Int16, &Recursive);
    Statement* pSelf = Made.call(
        Recursive, {Made.op(Operator::Subtract, Made.read(Formal), Made.number(1))}, &State);
    Recursive.pBody = Made.statement(StatementKind::If, Made.read(Formal), pSelf);
    Made.Tree.pMain->pBody = Made.call(Recursive, {Made.number(3)});
    ProgramGraph Graph(Made.Tree);
    EXPECT_EQ(shapeFaults(Graph), "");
    EXPECT_TRUE(Graph.getVariable(Formal)->isVolatile());
    EXPECT_FALSE(Graph.getVariable(Result)->isVolatile());
    // The argument reads the formal that the call sets, so it goes through a hidden local, which is
    // one of the activation, too.
    ASSERT_EQ(Graph.getHiddenVariables().size(), 1U);
    EXPECT_TRUE(Graph.getVariable(Graph.getHiddenVariables()[0])->isVolatile());
    Graph.getGraph().placeExitNodes();
    Graph.getGraph().inlineProcedures();
    ZfCCfgProcedure* pProcedure = nullptr;
    Graph.getGraph().demandProcedureEntryNode("f", pProcedure);
    EXPECT_EQ(pProcedure->getCalls().size(), 2);
    EXPECT_TRUE(pProcedure->isDirectlyOrIndirectlyCallableFromOutside());
}

// main calls exported, exported calls inner; both write states of their own.
TEST(GraphBuilder, NothingIsKnownOfWhatTheOutsideCanReach) {
    TestProgram Made;
    Variable& Seen = Made.variable(VariableKind::State, "seen", BaseType::Int16);
    Variable& Changed = Made.variable(VariableKind::State, "changed", BaseType::Int16);
    Variable& Own = Made.variable(VariableKind::State, "own", BaseType::Int16);
    Variable& Output = Made.variable(VariableKind::Output, "o", BaseType::Int16);
    Procedure& Inner = Made.procedure("inner");
    Inner.pBody = Made.assign(Changed, Made.read(Seen));
    Procedure& Exported = Made.procedure("exported");
    Exported.IsExported = true;
    Variable& Formal = Made.variable(VariableKind::Formal, "a", BaseType::Int16, &Exported);
    Variable& Result = Made.variable(VariableKind::Result, "exported", BaseType::Int16, &Exported);
    Exported.pBody = Made.call(Inner);
    Made.Tree.pMain->pBody = TestProgram::list(
        {Made.call(Exported, {Made.number(3)}, &Own), Made.assign(Output, Made.number(1))});
    ProgramGraph Graph(Made.Tree);
    EXPECT_EQ(shapeFaults(Graph), "");
    struct {
        const Variable& Declared;
        bool IsVolatile;
        bool IsErasable;
    } const Cases[] = {{Seen, false, false},   {Changed, true, false}, {Own, false, true},
                       {Output, false, false}, {Formal, false, true},  {Result, false, false}};
    for (const auto& Case : Cases) {
        EXPECT_EQ(Graph.getVariable(Case.Declared)->isVolatile(), Case.IsVolatile)
            << Case.Declared.Name;
        EXPECT_EQ(Graph.getVariable(Case.Declared)->isErasable(), Case.IsErasable)
            << Case.Declared.Name;
    }
    Graph.appendCalls();
    ZfCCfgProcedure* pProcedure = nullptr;
    Graph.getGraph().demandProcedureEntryNode("inner", pProcedure);
    EXPECT_TRUE(pProcedure->isDirectlyOrIndirectlyCallableFromOutside());
    Graph.getGraph().demandProcedureEntryNode("exported", pProcedure);
    EXPECT_EQ(pProcedure->getCalls().size(), 2); // main's and the outside's
    EXPECT_TRUE(pProcedure->getParamStatements().front()->evaluate().isNonConstant());
}

TEST(GraphBuilder, AnExternsVariablesAreOutOfSight) {
    TestProgram Made;
    Variable& Read = Made.variable(VariableKind::State, "read", BaseType::Int16);
    Variable& Written = Made.variable(VariableKind::State, "written", BaseType::Int16);
    Extern& Outside = Made.Tree.Externs.emplace_back();
    Outside.Reads = {&Read};
    Outside.Writes = {&Written};
    Statement* pCall = Made.statement(StatementKind::Call);
    pCall->pExtern = &Outside;
    Made.Tree.pMain->pBody = TestProgram::list({Made.assign(Read, Made.number(1)), pCall});
    ProgramGraph Graph(Made.Tree);
    EXPECT_FALSE(Graph.getVariable(Read)->isVolatile());
    EXPECT_FALSE(Graph.getVariable(Read)->isErasable());
    EXPECT_TRUE(Graph.getVariable(Written)->isVolatile());
    EXPECT_FALSE(Graph.getVariable(Written)->isErasable());
}

TEST(GraphBuilder, AJumpPastADeclarationFindsZero) {
    TestProgram Made;
    Variable& Local = Made.variable(VariableKind::Local, "l", BaseType::Int16, Made.Tree.pMain);
    Statement* pDeclaration = Made.statement(StatementKind::LocalDecl);
    pDeclaration->pTarget = &Local;
    Statement* pSwitch = Made.statement(
        StatementKind::Switch, Made.number(1),
        TestProgram::list({pDeclaration, Made.statement(StatementKind::Case, Made.number(1))}));
    Made.Tree.pMain->pBody = pSwitch;
    ProgramGraph Jumped(Made.Tree);
    EXPECT_EQ(countDefinitions(Jumped, Local),
              1); // at the entry; the declaration itself is not reached
}

TEST(GraphBuilder, AnIndexOfACompoundAssignmentIsReadOnce) {
    TestProgram Made;
    Variable& Input = Made.variable(VariableKind::Input, "in", BaseType::UInt8);
    Variable& Array = Made.variable(VariableKind::State, "h", BaseType::Int16);
    Array.Count = 300;
    Made.Tree.pMain->pBody = Made.assign(Array, Made.number(1), Made.read(Input), Operator::Add);
    ProgramGraph Graph(Made.Tree);
    World In(5);
    auto Untouched = In.Inputs;
    GraphRunner(Graph, In, 1).call("#main");
    Untouched.discard(1);
    EXPECT_EQ(In.Inputs(), Untouched());
}

// if (c) { f(); } else { f(); }: f calls an extern that writes c's second variable, which is no
// definition to the optimiser.
TEST(GraphBuilder, ACallIsNotHoistedOverAConditionThatItsExternsChange) {
    for (const bool ReadsChanged : {false, true}) {
        TestProgram Made;
        Variable& Flag = Made.variable(VariableKind::State, "flag", BaseType::Bool);
        Variable& Other = Made.variable(VariableKind::State, "other", BaseType::Bool);
        Extern& Outside = Made.Tree.Externs.emplace_back();
        Outside.Writes = {ReadsChanged ? &Flag : &Other};
        Procedure& Caller = Made.procedure("f");
        Caller.pBody = Made.statement(StatementKind::Call);
        Caller.pBody->pExtern = &Outside;
        Statement* pIf = Made.statement(StatementKind::If, Made.read(Flag), Made.call(Caller),
                                        Made.call(Caller));
        Made.Tree.pMain->pBody = TestProgram::list(
            {pIf, Made.assign(Flag, Made.op(Operator::LogicalNot, Made.read(Other)))});
        ProgramGraph Graph(Made.Tree);
        Graph.getGraph().placeExitNodes();
        Graph.appendCalls();
        Graph.getGraph().placeLoopAroundMain();
        Graph.getGraph().transformToSSAForm();
        Graph.getGraph().divideBasicBlock();
        HoistingContext Context(Graph.getGraph());
        Graph.getGraph().hoistCodeOutOfIfElseBranches();
        EXPECT_EQ(Context.countMoved(), ReadsChanged ? 0U : 1U);
    }
}

} // namespace
