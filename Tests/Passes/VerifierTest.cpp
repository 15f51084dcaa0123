// The checks are checked: for each rule, a sound graph in which just that rule is broken, through
// public operations.

#include <gtest/gtest.h>

#include "LibraryClient/TestClient.h"
#include "Oracles/SSAVerifier.h"

namespace {

using namespace passes;

using Texts = std::set<std::string>;

// --- SSA form ---

// All versions defined by the program's statements, of one variable, in node order.
std::vector<ZfCCfgVariable*> versions(Program& P, std::string const& Name) {
    std::vector<ZfCCfgVariable*> Found;
    for (auto& Item : P.statements())
        for (ZfCCfgVariable* pVar : Item.second->getDefinedVariables())
            if (originalOf(pVar) == P.var(Name))
                Found.push_back(pVar);
    return Found;
}

template <class Test>
ZfCCfgStatement* find(Program& P, Test IsIt) {
    for (auto& Item : P.statements())
        if (IsIt(Item.second))
            return Item.second;
    return nullptr;
}
// The client's own assignment to a variable.
ZfCCfgAssignment* assignment(Program& P, std::string const& Name) {
    return find(P,
                [&](ZfCCfgStatement* pStmt) {
                    auto* pFound = dynamic_cast<Assignment*>(pStmt);
                    return pFound != nullptr && originalOf(pFound->getLHS()) == P.var(Name);
                })
        ->isAssignment();
}
ZfCPhiFunction* phi(Program& P, std::string const& Name) {
    return find(P,
                [&](ZfCCfgStatement* pStmt) {
                    return pStmt->isPhiFunction() != nullptr &&
                           originalOf(pStmt->isPhiFunction()->getVariable()) == P.var(Name);
                })
        ->isPhiFunction();
}
ZfCCfgExpression* condition(Program& P) {
    for (leda::node v : P.graph().all_nodes())
        if (P.blockOf(v) != nullptr && P.blockOf(v)->getBranchCond() != nullptr)
            return P.blockOf(v)->getBranchCond();
    return nullptr;
}
ZfCCfgVariable* undefined(Program& P) {
    return P.pFactory->createSSAVariable(P.var("x"));
}
// Defined in an arm, so known neither before nor behind it.
ZfCCfgVariable* ofArm(Program& P) {
    return assignment(P, "onlyThen")->getLHS();
}
Expression* read(Program& P, ZfCCfgVariable* pVar) {
    Expression* pRead = P.expression("x");
    pRead->replaceVariable(P.var("x"), pVar);
    return pRead;
}
void setArgument(Program& P, ZfCCfgVariable* pVar) {
    ZfCCfgParamStatement* pParam = find(P, [](ZfCCfgStatement* pStmt) {
                                       return pStmt->isParamStatement() != nullptr;
                                   })->isParamStatement();
    pParam->setParamExpression(P.calls().front(), read(P, pVar));
}
void setReturned(Program& P, ZfCCfgVariable* pVar) {
    find(P, [](ZfCCfgStatement* pStmt) { return pStmt->isValueReturnStatement() != nullptr; })
        ->isValueReturnStatement()
        ->setExpression(read(P, pVar));
}
// In front of the call, at a join: there is no one way back to a call that it could belong to.
void returnTooEarly(Program& P) {
    auto* pReturn = new ZfCCfgValueReturnStatement(undefined(P));
    pReturn->setExpression(read(P, undefined(P)));
    for (auto& Item : P.statements())
        if (Item.second == assignment(P, "first"))
            P.blockOf(Item.first)->append(pReturn);
}
void readIn(Program& P, std::string const& Name, ZfCCfgVariable* pVar) {
    assignment(P, Name)->setRHS(read(P, pVar));
}
void readInCondition(Program& P, ZfCCfgVariable* pVar) {
    condition(P)->replaceVariable(*condition(P)->getUsedVariables().begin(), pVar);
}

// A parallel edge into a join: nothing but the phi functions has to know of it.
void addInEdge(Program& P) {
    for (leda::node v : P.graph().all_nodes())
        if (P.graph().indeg(v) == 2)
            return void(P.edge(P.graph().source(P.graph().first_in_edge(v)), v));
}

struct Break {
    char const* pText;
    void (*pApply)(Program&);
};

Break const SSARules[] = {
    {"a definition is no version",
     [](Program& P) { assignment(P, "first")->setLHS(P.var("first")); }},
    {"a version is defined twice",
     [](Program& P) { assignment(P, "first")->setLHS(assignment(P, "second")->getLHS()); }},
    {"a renaming stack is not empty",
     [](Program& P) { P.var("first")->pushSSAReplacement(versions(P, "first").front()); }},
    {"a variable is no version", [](Program& P) { readIn(P, "first", P.var("x")); }},
    {"a variable has no definition", [](Program& P) { readIn(P, "first", undefined(P)); }},
    {"a variable is not dominated by its definition",
     [](Program& P) { readIn(P, "first", ofArm(P)); }},
    {"a variable is not dominated by its definition", // in one block, and of itself
     [](Program& P) { readIn(P, "first", assignment(P, "second")->getLHS()); }},
    {"a variable is not dominated by its definition",
     [](Program& P) { readIn(P, "first", assignment(P, "first")->getLHS()); }},
    {"a condition's variable is no version", [](Program& P) { readInCondition(P, P.var("x")); }},
    {"a condition's variable has no definition",
     [](Program& P) { readInCondition(P, undefined(P)); }},
    {"a condition's variable is not dominated by its definition",
     [](Program& P) { readInCondition(P, ofArm(P)); }},
    {"an argument is no version", [](Program& P) { setArgument(P, P.var("x")); }},
    {"an argument has no definition", [](Program& P) { setArgument(P, undefined(P)); }},
    {"an argument is not dominated by its definition",
     [](Program& P) { setArgument(P, assignment(P, "behindCall")->getLHS()); }},
    {"a returned value is no version", [](Program& P) { setReturned(P, P.var("x")); }},
    {"a value is returned behind no call", [](Program& P) { returnTooEarly(P); }},
    {"a returned value has no definition", [](Program& P) { setReturned(P, undefined(P)); }},
    {"a returned value is not dominated by its definition",
     [](Program& P) { setReturned(P, assignment(P, "y")->getLHS()); }},
    {"a phi function's operands are not those of its in-edges",
     [](Program& P) { phi(P, "x")->delReplacement(0); }},
    {"a phi function's operands are not those of its in-edges", [](Program& P) { addInEdge(P); }},
    {"an operand is no version",
     [](Program& P) { phi(P, "x")->setReplacementVariable(0, P.var("x")); }},
    {"an operand is no version",
     [](Program& P) { phi(P, "x")->setReplacementVariable(0, nullptr); }},
    {"an operand is of another variable",
     [](Program& P) {
         phi(P, "x")->setReplacementVariable(0, assignment(P, "onlyThen")->getLHS());
     }},
    {"an operand has no definition",
     [](Program& P) { phi(P, "x")->setReplacementVariable(0, undefined(P)); }},
    {"an operand is not dominated by its definition",
     [](Program& P) {
         leda::array<ZfCCfgVariable*> Operands = phi(P, "x")->getReplacementVariables();
         phi(P, "x")->setReplacementVariable(0, Operands[1]);
         phi(P, "x")->setReplacementVariable(1, Operands[0]);
     }},
};

Texts violations(Program& P) {
    Texts Found;
    std::string All = verifySSA(P.graph());
    for (std::size_t At = 0; At < All.size(); At = All.find('\n', At) + 1)
        Found.insert(All.substr(At, All.find(" (node", At) - At));
    return Found;
}

TEST(Verifier, EachRuleOfSSAFormIsSeenWhenBrokenAlone) {
    for (Break const& Next : SSARules) {
        for (bool IsDivided : {false, true}) {
            Program P("proc main { if c < 3 { x = 2; onlyThen = 1; } else { x = 3; } first = x;"
                      " second = 1; call f; behindCall = y; }"
                      " proc f { if x < 1 { y = 2; } else { y = 3; } }");
            P.toSSA();
            if (IsDivided)
                P.graph().divideBasicBlock();
            ASSERT_EQ(violations(P), Texts{}) << Next.pText;
            Next.pApply(P);
            EXPECT_EQ(violations(P), Texts{Next.pText}) << (IsDivided ? "divided" : "whole");
        }
    }
}

// --- Components and procedures ---

leda::node bodyOf(Program& P, std::string const& Name) {
    return P.graph().target(P.graph().first_adj_edge(P.procedure(Name)->getEntryNode()));
}

struct ConsistencyBreak {
    char const* pAssertion; // null: the counts differ, nothing is asserted
    void (*pApply)(Program&);
};

ConsistencyBreak const ConsistencyRules[] = {
    {nullptr, [](Program& P) { P.block(); }}, // a component more than procedures
    {nullptr, [](Program& P) { P.edge(bodyOf(P, "f"), bodyOf(P, "#main")); }}, // one less
    {nullptr, [](Program& P) { P.graph().del_node(P.procedure("empty")->getEntryNode()); }},
    {"indeg(EntryNode) == 0",
     [](Program& P) { P.edge(bodyOf(P, "f"), P.procedure("f")->getEntryNode()); }},
    {"pInf->getProcedure() == pProcedure",
     [](Program& P) { P.blockOf(bodyOf(P, "f"))->setProcedure(P.procedure("#main")); }},
    {"pInf->getProcedure() == pProcedure",
     [](Program& P) { P.blockOf(bodyOf(P, "f"))->setProcedure(nullptr); }},
    {"v == EntryNode",
     [](Program& P) {
         leda::node Stray = P.block();
         P.blockOf(Stray)->setProcedure(P.procedure("f"));
         P.edge(Stray, bodyOf(P, "f"));
     }},
};

TEST(Verifier, EachRuleOfComponentsIsSeenWhenBrokenAloneAndAssertedOnlyWhenAskedFor) {
    for (ConsistencyBreak const& Next : ConsistencyRules) {
        for (bool IsShown : {true, false}) {
            Program P("proc main { x = 1; call f; } proc f { y = x; }");
            P.entry("empty");
            Reports R(IsShown);
            ASSERT_TRUE(P.graph().checkConsistency());
            ASSERT_TRUE(R.silent());
            Next.pApply(P);
            EXPECT_EQ(P.graph().checkConsistency(), Next.pAssertion != nullptr);
            std::vector<std::string> Expected;
            if (IsShown && Next.pAssertion != nullptr)
                Expected.push_back(Next.pAssertion);
            EXPECT_EQ(Reports::assertions(), Expected);
            EXPECT_TRUE(R.Messages.empty());
        }
    }
}

} // namespace
