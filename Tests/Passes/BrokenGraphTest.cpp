#include <gtest/gtest.h>

#include "LibraryClient/TestClient.h"

#include <functional>

// What a client may hand over by mistake: each broken place reaches the user as internal error
// 10007 with the name of the class, developers also as an assertion, and the library goes on.

namespace passes {
namespace {

// No kind that the library knows.
class StrangeStatement : public ZfCCfgStatement {
public:
    ZfCCfgStatement* clone() override { return nullptr; }
    leda::set<ZfCCfgVariable*, leda::avl_tree> getDefinedVariables() override { return {}; }
    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override { return {}; }
};

struct BrokenPlace {
    char const* Name;
    char const* Text;  // the program
    int Messages;      // to the user
    char const* Hints; // assertions beside the messages, which only developers see; null: nothing
                       // is asserted at all
    std::function<bool(Program&)> IsPassedOver;
};

leda::node mainEntry(Program& P) {
    return P.procedure("#main")->getEntryNode();
}

leda::node behind(Program& P, leda::node v) {
    return P.graph().target(P.graph().first_adj_edge(v));
}

bool answersNoBranch(Program& P, leda::node v) {
    return P.graph().findBranchNode(v, nullptr) == nullptr;
}

// Sets as many arguments as there are names at a call.
bool takesArguments(Program& P, ZfCCfgProcedureCall* pCall, std::vector<std::string> Names) {
    leda::list<ZfCCfgVariable*> Variables;
    leda::list<ZfCCfgExpression*> Expressions;
    for (std::string const& Name : Names) {
        Variables.append(P.var(Name));
        Expressions.append(P.expression("1"));
    }
    P.graph().setParametersOfCall(pCall, Variables, Expressions);
    return Variables.empty() && Expressions.empty();
}

leda::node exitOf(Program& P, char const* Name) {
    P.graph().placeExitNodes();
    return P.procedure(Name)->getExitNode();
}

// Extracts what begins behind the entry of main. u enters it, or a join inside it.
bool extractsAndKeeps(Program& P, leda::node u, bool IsJoin) {
    leda::node v = behind(P, mainEntry(P)), w = IsJoin ? P.block() : v;
    P.blockOf(v)->setProcedure(P.procedure("#main"));
    P.blockOf(w)->setProcedure(P.procedure("#main"));
    if (IsJoin)
        P.edge(v, w);
    leda::edge e = P.edge(u, w);
    return P.graph().makeProcedureAndCall(v) != nullptr && P.graph().indeg(w) == 2 &&
           P.graph().source(e) == u && P.graph().target(e) == w;
}

std::vector<BrokenPlace> structurePlaces() {
    return {
        // A node that is no block, and one without a record, cannot be divided.
        {"statement of an entry", "proc main { }", 1, "",
         [](Program& P) {
             return P.graph().splitAtStatement(mainEntry(P), nullptr) == mainEntry(P);
         }},
        {"statement of nothing", "", 1, "",
         [](Program& P) {
             leda::node v = P.graph().new_node(nullptr);
             return P.graph().splitAtStatement(v, nullptr) == v;
         }},
        {"condition of an entry", "proc main { }", 1, "",
         [](Program& P) { return P.graph().splitAtCondition(mainEntry(P)) == mainEntry(P); }},
        {"condition of nothing", "", 1, "",
         [](Program& P) {
             leda::node v = P.graph().new_node(nullptr);
             return P.graph().splitAtCondition(v) == v;
         }},
        // The path to a branch leads nowhere.
        {"branch from an entry", "proc main { }", 1, "",
         [](Program& P) { return answersNoBranch(P, mainEntry(P)); }},
        {"branch behind the exit", "proc main { }", 1, "",
         [](Program& P) {
             P.graph().placeExitNodes();
             return answersNoBranch(P, behind(P, mainEntry(P)));
         }},
        {"branch behind the end", "proc main { x = 1; }", 1, "",
         [](Program& P) { return answersNoBranch(P, behind(P, mainEntry(P))); }},
        {"two ways without a branch", "proc main { x = 1; }", 2, "",
         [](Program& P) {
             leda::node v = behind(P, mainEntry(P));
             P.trueEdge(v, P.block());
             P.falseEdge(v, P.block());
             return answersNoBranch(P, v);
         }},
        // Extraction needs blocks.
        {"extraction of an entry", "proc main { }", 1, "",
         [](Program& P) { return P.graph().makeProcedureAndCall(mainEntry(P)) == nullptr; }},
        {"extraction of nothing behind", "proc main { x = 1; }", 1, "",
         [](Program& P) {
             leda::node v = behind(P, mainEntry(P));
             P.edge(v, P.graph().new_node(nullptr));
             return P.graph().makeProcedureAndCall(v) != nullptr;
         }},
        // In-edges that no call can replace stay, and the search for joins ends all the same.
        {"extraction behind an exit", "proc main { x = 1; } proc f { }", 1, "",
         [](Program& P) { return extractsAndKeeps(P, exitOf(P, "f"), false); }},
        {"extraction of a join behind an exit", "proc main { x = 1; } proc f { }", 1, "",
         [](Program& P) { return extractsAndKeeps(P, exitOf(P, "f"), true); }},
        {"extraction behind two entries", "proc main { x = 1; } proc f { }", 0, nullptr,
         [](Program& P) { return extractsAndKeeps(P, P.procedure("f")->getEntryNode(), false); }},
        {"extraction behind unreachable code", "proc main { x = 1; }", 0, nullptr,
         [](Program& P) { return extractsAndKeeps(P, P.block(), false); }},
        {"extraction in front of an exit that unreachable code enters", "proc main { x = 1; }", 1,
         "",
         [](Program& P) {
             leda::node Exit = exitOf(P, "#main"), v = behind(P, mainEntry(P)), w = P.block(),
                        Outside = P.block();
             P.edge(Outside, w); // a join beside it becomes a procedure all the same
             P.edge(v, w);
             P.edge(P.block(), Exit);
             return P.graph().makeProcedureAndCall(v) != nullptr && P.graph().indeg(Exit) == 2 &&
                    P.graph().indeg(w) == 1 && P.graph().outdeg(Outside) == 0;
         }},
        {"extraction of a procedure that leads into another", "proc main { x = 1; } proc f { }", 1,
         "pInf->getProcedure() == pOldProcedure;pInf->getProcedure() == pOldProcedure;",
         [](Program& P) {
             leda::node Exit = exitOf(P, "#main"), Dead = P.block();
             P.blockOf(Dead)->setProcedure(P.procedure("#main"));
             P.edge(Exit, behind(P, P.procedure("f")->getEntryNode()));
             P.edge(Dead, behind(P, mainEntry(P)));
             return P.graph().makeProcedureAndCall(behind(P, mainEntry(P))) != nullptr;
         }},
        // Arguments of nobody, and more of them than the first call had.
        {"arguments of nobody", "proc main { call f; }", 1, "",
         [](Program& P) { return !takesArguments(P, P.calls()[0], {"a"}); }},
        {"too many arguments", "proc main { call f; call f; } proc f { }", 1, "",
         [](Program& P) {
             return takesArguments(P, P.calls()[0], {"a"}) &&
                    takesArguments(P, P.calls()[1], {"a", "b"}) &&
                    P.procedure("f")->getParamStatements().size() == 1;
         }},
    };
}

std::vector<BrokenPlace> formPlaces() {
    return {
        {"a procedure of cycles alone", "", 1, "",
         [](Program& P) {
             P.entry("#main");
             leda::node v = P.block();
             P.edge(v, v);
             P.graph().computeAllIdoms();
             return P.graph().inf(v)->getIdom() == nullptr;
         }},
        // A virtual assignment that no summary counts: the other arm has no value for the join.
        {"operand without a version", "proc main { if u { x = 1; } }", 1, "",
         [](Program& P) {
             P.statements()[0].second->isAssignment()->setIsValidConditionAssignment(true);
             P.toSSA();
             return P.valuesOf("x") == "top top";
         }},
        // A call that does not stand alone: only the first statement of a block is inlined.
        {"inlining behind a statement", "proc main { x = 1; } proc f { }", 0,
         "StmtList.size() == 1;",
         [](Program& P) {
             P.blockOf(behind(P, mainEntry(P)))->append(new ZfCCfgProcedureCall("f"));
             P.graph().placeExitNodes();
             P.graph().inlineProcedures();
             return P.calls().size() == 1;
         }},
        {"inlining of two calls", "proc main { } proc f { } proc g { }", 0,
         "StmtList.size() == 1;StmtList.size() == 1;",
         [](Program& P) {
             for (char const* Name : {"f", "g"})
                 P.blockOf(behind(P, mainEntry(P)))->append(new ZfCCfgProcedureCall(Name));
             P.graph().placeExitNodes();
             P.graph().inlineProcedures();
             return P.calls().empty();
         }},
        {"a statement of no kind", "proc main { x = 1; }", 0, "",
         [](Program& P) {
             P.blockOf(behind(P, mainEntry(P)))->append(new StrangeStatement);
             P.toSSA();
             return P.valuesOf("x") == "top top";
         }},
    };
}

void expectPassedOver(std::vector<BrokenPlace> const& Places) {
    for (BrokenPlace const& Place : Places)
        for (bool IsShown : {false, true}) {
            SCOPED_TRACE(Place.Name);
            Program P(Place.Text);
            Reports R(IsShown);
            EXPECT_TRUE(Place.IsPassedOver(P)) << Place.Name;
            EXPECT_EQ(R.Messages.size(), std::size_t(Place.Messages)) << Place.Name;
            for (std::string const& Message : R.Messages)
                EXPECT_EQ(
                    Message.rfind("10007: Internal error. Error code: ZfCControlFlowGraph ", 0),
                    0u);
            std::string Found;
            for (std::string const& Assertion : Reports::assertions())
                Found += Assertion == "0" ? "" : Assertion + ";";
            EXPECT_EQ(Found, IsShown && Place.Hints != nullptr ? Place.Hints : "") << Place.Name;
            EXPECT_EQ(Reports::assertions().empty(), !IsShown || Place.Hints == nullptr)
                << Place.Name;
        }
}

TEST(BrokenGraph, EditsReportThePlaceAndGoOn) {
    expectPassedOver(structurePlaces());
}

TEST(BrokenGraph, PassesReportThePlaceAndGoOn) {
    expectPassedOver(formPlaces());
}

} // namespace
} // namespace passes
