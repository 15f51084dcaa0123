#include <gtest/gtest.h>

#include "LibraryClient/TestClient.h"
#include "Oracles/SSAVerifier.h"

namespace passes {
namespace {

// --- Inlining ---

int inlineAndCountCalls(Program& P) {
    P.graph().placeExitNodes();
    Reports R(true);
    P.graph().inlineProcedures();
    EXPECT_TRUE(R.silent());
    EXPECT_TRUE(P.graph().checkConsistency());
    EXPECT_TRUE(R.silent());
    return int(P.calls().size());
}

TEST(Inlining, ProceduresWithExactlyOneCallDissolve) {
    struct {
        char const* Text;
        int CallsLeft;
    } Rows[] = {
        {"proc main { call f; x = 1; } proc f { y = 1; }", 0},
        {"proc main { x = 1; if x { call f; } } proc f { y = 1; }", 0},
        {"proc main { call f; call f; } proc f { y = 1; }", 2},
        {"proc main { call f; } proc f { call g; } proc g { y = 1; }", 0},
        {"proc main { call a; } proc g { y = 1; } proc a { call g; }",
         0}, // the inner one comes first in node order
        {"proc main { call f; call f; } proc f { call g; } proc g { y = 1; }", 2},
        {"proc main { x = 1; } proc alone { y = 1; }", 0},
    };
    for (auto& Row : Rows) {
        Program P(Row.Text);
        EXPECT_EQ(inlineAndCountCalls(P), Row.CallsLeft) << Row.Text;
        P.graph().transformToSSAForm();
        EXPECT_EQ(verifySSA(P.graph()), "") << Row.Text;
    }
}

TEST(Inlining, AMarkedCallStaysAndASecondRunInlinesNothing) {
    Program P("proc main { call f; call g; } proc f { y = 1; } proc g { z = 1; }");
    P.calls()[0]->setIsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(true);
    EXPECT_EQ(inlineAndCountCalls(P), 1);
    EXPECT_TRUE(P.procedure("f")->isDirectlyOrIndirectlyCallableFromOutside());
    P.calls()[0]->setIsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(false);
    P.graph().inlineProcedures();
    EXPECT_EQ(P.calls().size(), 1u);
    EXPECT_EQ(P.procedure("f")->getCalls().size(), 2);
}

TEST(Inlining, ParametersBecomeAssignmentsInFrontOfTheBody) {
    Program P("proc main { if c { call f; } } proc f { y = a + b; }");
    ZfCCfgProcedureCall* pCall = P.calls()[0];
    leda::list<ZfCCfgVariable*> Variables;
    leda::list<ZfCCfgExpression*> Expressions;
    for (char const* Name : {"a", "b"})
        Variables.append(P.var(Name));
    ZfCCfgExpression* pA = P.expression("7");
    Expressions.append(pA);
    Expressions.append(P.expression("c"));
    P.graph().setParametersOfCall(pCall, Variables, Expressions);
    EXPECT_EQ(inlineAndCountCalls(P), 0);
    leda::node Branch = nullptr;
    for (leda::node v : P.graph().all_nodes())
        if (P.blockOf(v) && P.blockOf(v)->getBranchCond())
            Branch = v;
    // The arm's first block came to the call by a plain edge, and still does to the parameter
    // block.
    leda::node Arm = P.graph().target(P.graph().first_adj_edge(Branch));
    leda::node Param = P.graph().target(P.graph().first_adj_edge(Arm));
    leda::list<ZfCCfgStatement*> const& Sequence = P.blockOf(Param)->getStatementSeq();
    ASSERT_EQ(Sequence.size(), 2);
    EXPECT_EQ(Sequence.front()->isAssignment()->getLHS(), P.var("a"));
    EXPECT_EQ(Sequence.front()->isAssignment()->getRHS(), pA);
    EXPECT_EQ(Sequence.back()->isAssignment()->getLHS(), P.var("b"));
    EXPECT_EQ(P.blockOf(Param)->getProcedure(), P.procedure("#main"));
}

// --- Hoisting ---

// Hoists by moving the statement into an empty block that the test has put in front of the branch.
struct Hoisting {
    Program P;
    leda::node Front, Branch;
    int Removed = 0;

    // Arms are statement texts, one for each node; "+" in front of one marks it as virtual.
    Hoisting(std::string const& Condition, std::vector<std::string> Then,
             std::vector<std::string> Else) {
        leda::node Entry = P.entry("#main"), Join = P.block();
        Front = P.block();
        Branch = P.block("? " + Condition);
        P.edge(Entry, Front);
        P.edge(Front, Branch);
        arm(Then, Join, true);
        arm(Else, Join, false);
    }
    void arm(std::vector<std::string> const& Texts, leda::node Join, bool IsThen) {
        leda::node Last = nullptr;
        for (std::string Text : Texts) {
            bool IsVirtual = Text[0] == '+', Skips = Text[0] == '~';
            leda::node v = P.block(IsVirtual || Skips ? Text.substr(1) : Text);
            if (auto* pAssignment = dynamic_cast<Assignment*>(P.blockOf(v)->isStatement())) {
                pAssignment->setIsVirtual(IsVirtual);
                pAssignment->pRemoved = &Removed;
                pAssignment->Hoist = [this, pAssignment, Skips](bool& IgnoreNext) {
                    P.blockOf(Front)->append(pAssignment);
                    IgnoreNext = Skips;
                    return true;
                };
            }
            if (Last != nullptr)
                P.edge(Last, v);
            else
                IsThen ? P.trueEdge(Branch, v) : P.falseEdge(Branch, v);
            Last = v;
        }
        P.edge(Last, Join);
    }
    std::string run() {
        P.graph().hoistCodeOutOfIfElseBranches();
        std::string Moved;
        for (ZfCCfgStatement* pStmt : P.blockOf(Front)->getStatementSeq())
            Moved += static_cast<Variable*>(pStmt->isAssignment()->getLHS())->Name;
        EXPECT_EQ(Removed, int(Moved.size()));
        return Moved;
    }
};

TEST(Hoisting, EqualLeadingStatementsMoveUnlessTheConditionDependsOnThem) {
    using Arm = std::vector<std::string>;
    struct {
        char const* Condition;
        Arm Then, Else;
        char const* Moved;
    } Rows[] = {
        {"c", {"a=1;", "b=1;"}, {"a=1;", "b=2;"}, "a"},
        {"c", {"a=1;", "b=1;", "d=1;"}, {"a=1;", "b=1;", "d=1;"}, "abd"},
        {"a", {"a=1;"}, {"a=1;"}, ""},
        {"c", {"+c=1;", "a=1;"}, {"a=1;"}, "a"},
        {"c", {"", "a=1;", ""}, {"a=1;", "", "b=1;"}, "a"},
        {"c", {"a=1; b=1;"}, {"a=1; b=1;"}, ""}, // more than one statement in a node
        {"c",
         {"a=1;", "x=1;", "b=1;"},
         {"~a=1;", "x=2;", "b=1;"},
         "ab"}, // the next one is passed over
        {"c", {"a=1;", "? d"}, {"a=1;", "? d"}, "a"},
        {"c", {"extern c;"}, {"extern c;"}, ""},
    };
    for (auto& Row : Rows)
        EXPECT_EQ(Hoisting(Row.Condition, Row.Then, Row.Else).run(), Row.Moved)
            << Row.Condition << Row.Then[0];
}

TEST(Hoisting, AJoinEndsAnArmAndSideEffectsOrAMissingArmForbidAll) {
    {
        Hoisting H("c", {"a=1;", "b=1;"}, {"a=1;", "b=1;"});
        leda::node Second = H.P.graph().target(
            H.P.graph().first_adj_edge(H.P.graph().target(H.P.graph().first_adj_edge(H.Branch))));
        H.P.edge(H.P.block(), Second);
        EXPECT_EQ(H.run(), "a");
    }
    {
        Hoisting H("c", {"a=1;"}, {"a=1;"});
        static_cast<Expression*>(H.P.blockOf(H.Branch)->getBranchCond())->SideEffects = true;
        EXPECT_EQ(H.run(), "");
    }
    Hoisting H("c", {"a=1;"}, {"a=1;"});
    H.P.graph().del_edge(H.P.graph().adj_succ(H.P.graph().first_adj_edge(H.Branch)));
    EXPECT_EQ(H.run(), "");
}

TEST(Hoisting, VersionsCountAsTheirOriginalsAndSSAEdgesGoFirst) {
    for (char const* Condition : {"c", "a"}) {
        Hoisting H(Condition, {"a=1;"}, {"a=1;"});
        H.P.propagate(false);
        // The blocks were divided: the statements stand in new nodes, Front stayed, being empty.
        H.P.graph().hoistCodeOutOfIfElseBranches();
        EXPECT_EQ(H.Removed, Condition[0] == 'c' ? 1 : 0);
        for (leda::edge e : H.P.graph().all_edges())
            EXPECT_EQ(H.P.graph().inf(e)->isSSAEdge(), nullptr);
    }
}

// A call that other statements of the same class are equal to and that always says it has moved.
struct HoistableCall : ZfCCfgProcedureCall {
    using ZfCCfgProcedureCall::ZfCCfgProcedureCall;
    int* pMoved = nullptr;
    ZfCCfgVariable* pResult = nullptr;
    bool generatesSameCode(ZfCCfgStatement* pOther) override {
        return pOther->isProcedureCall() != nullptr;
    }
    bool hoistOutOfIfElseBranch(bool& IgnoreNext) override {
        IgnoreNext = false;
        ++*pMoved;
        return true;
    }
    VariableSet getVarsDefinedByFctReturn() override {
        VariableSet Result;
        if (pResult != nullptr)
            Result.insert(pResult);
        return Result;
    }
};

TEST(Hoisting, ACallDefinesWhatItsProcedureDoesAndItsResult) {
    struct {
        char const* Condition;
        char const* Result;
        int Moved;
    } Rows[] = {{"c", "r", 1}, {"y", "r", 0}, {"r", "r", 0}};
    for (auto& Row : Rows) {
        Hoisting H(Row.Condition, {""}, {""});
        int Moved = 0;
        for (leda::edge e : H.P.graph().out_edges(H.Branch)) {
            auto* pCall = new HoistableCall("f");
            pCall->pMoved = &Moved;
            pCall->pResult = H.P.var(Row.Result);
            H.P.blockOf(H.P.graph().target(e))->append(pCall);
        }
        H.P.procedure("f")->appendDefinedVariable(H.P.var("y"));
        H.P.graph().hoistCodeOutOfIfElseBranches();
        EXPECT_EQ(Moved, Row.Moved) << Row.Condition;
    }
}

// --- Valid conditions ---

// What stands on the true and on the false edge of the branch: "x=3 -".
TEST(ValidConditions, EachFormOfConditionTellsItsArms) {
    struct {
        char const* Condition;
        char const* Arms;
        int Outside;
        double Replaced;
    } Rows[] = {
        {"x == 3", "x=3 -", 0, -1},   {"x != 3", "- x=3", 0, -1},   {"x == 0", "x=0 -", 0, -1},
        {"b", "b=1 b=0", 0, -1},      {"!b", "b=0 b=1", 0, -1},     {"b == 0", "b=0 b=1", 0, -1},
        {"b == 1", "b=1 b=0", 0, -1}, {"b != 1", "b=0 b=1", 0, -1}, {"b != 0", "b=1 b=0", 0, -1},
        {"b == 2", "- -", 1, 0},      {"b != 2", "- -", 1, 1},      {"x", "- -", 0, -1},
        {"x < 3", "- -", 0, -1},
    };
    for (auto& Row : Rows) {
        Program P;
        P.boolean("b");
        leda::node Entry = P.entry("#main"), v = P.block(std::string("? ") + Row.Condition),
                   J = P.block();
        P.edge(Entry, v);
        P.edge(v, J);
        P.graph().del_edge(P.graph().first_adj_edge(v));
        leda::edge Edges[] = {P.trueEdge(v, J), P.falseEdge(v, J)}; // both arms begin at a join
        auto* pCond = static_cast<Expression*>(P.blockOf(v)->getBranchCond());
        Reports R(true);
        P.graph().insertValidConditionAssignments();
        std::string Arms;
        for (leda::edge e : Edges) {
            EXPECT_EQ(P.graph().source(e), v);
            leda::node n = P.graph().target(e);
            Arms += Arms.empty() ? "" : " ";
            if (n == J) {
                Arms += "-";
                continue;
            }
            ZfCCfgAssignment* pSet = P.blockOf(n)->isStatement()->isAssignment();
            EXPECT_TRUE(pSet->getIsVirtual() && pSet->getIsValidConditionAssignment());
            Arms += static_cast<Variable*>(pSet->getLHS())->Name + "=" +
                    Program::show(pSet->getRHS()->evaluate());
            EXPECT_EQ(P.graph().target(P.graph().first_adj_edge(n)), J);
        }
        EXPECT_EQ(Arms, Row.Arms) << Row.Condition;
        EXPECT_EQ(pCond->OutsideBoolRange, Row.Outside) << Row.Condition;
        if (Row.Outside != 0) {
            EXPECT_EQ(pCond->evaluate().getValue(), Row.Replaced) << Row.Condition;
        }
        EXPECT_TRUE(P.graph().checkConsistency());
        EXPECT_TRUE(R.silent());
    }
}

TEST(ValidConditions, APlainEdgeOfABranchIsReportedAndServesAsElseEdge) {
    Program P;
    leda::node Entry = P.entry("#main"), v = P.block("? x != 3"), J = P.block();
    P.edge(Entry, v);
    P.edge(v, J);
    Reports R(false);
    P.graph().insertValidConditionAssignments();
    EXPECT_EQ(R.Messages.size(), 1u);
    EXPECT_NE(P.graph().target(P.graph().first_adj_edge(v)), J);
}

} // namespace
} // namespace passes
