#include <gtest/gtest.h>

#include <random>
#include <set>

#include "LibraryClient/TestClient.h"
#include "Oracles/SSAVerifier.h"

namespace passes {
namespace {

std::string names(VariableSet const& Variables) {
    std::string Text;
    for (ZfCCfgVariable* pVar : Variables)
        Text += (Text.empty() ? "" : " ") + static_cast<Variable*>(originalOf(pVar))->Name;
    return Text;
}

// --- Summaries and boundary statements ---

TEST(Summaries, CalleesSetsReachEveryCallerThroughRings) {
    Program P("proc main { a = b; call p; } proc p { c = 1; call q; } proc q { d = c; if d { call "
              "p; } call leaf; }"
              "proc leaf { e = 2; call leaf; } proc alone { f = 3; call leaf; }");
    ZfCCfgAssignment* pAlone = nullptr;
    for (auto& Item : P.statements())
        if (Item.second->isAssignment() && Item.second->isAssignment()->getLHS() == P.var("f"))
            pAlone = Item.second->isAssignment();
    pAlone->setIsValidConditionAssignment(true); // counts neither as definition nor as use
    P.toSSA();
    struct {
        char const* Name;
        char const* Defined;
        char const* Used;
    } Rows[] = {{"#main", "a c d e", "b c d"},
                {"p", "c d e", "c d"},
                {"q", "c d e", "c d"},
                {"leaf", "e", ""},
                {"alone", "e", ""}};
    for (auto& Row : Rows) {
        EXPECT_EQ(names(P.procedure(Row.Name)->getDefinedVariables()), Row.Defined) << Row.Name;
        EXPECT_EQ(names(P.procedure(Row.Name)->getUsedVariables()), Row.Used) << Row.Name;
    }
}

// a is done twice as early as it seems, for it calls its leaf twice; c still waits for b.
TEST(Summaries, ACallerWaitsForItsLastCallee) {
    Program P("proc main { call c; } proc c { call a; call b; } proc a { call leaf; call leaf; }"
              "proc leaf { x = 1; } proc b { call b1; } proc b1 { call b2; } proc b2 { call b3; }"
              "proc b3 { call b4; } proc b4 { z = 1; }");
    P.toSSA();
    EXPECT_EQ(names(P.procedure("#main")->getDefinedVariables()), "x z");
}

// The closure by definition: what is reachable in the call graph.
TEST(Summaries, RandomCallGraphsAgreeWithTheClosure) {
    std::mt19937 Random(7);
    for (int Run = 0; Run < 60; ++Run) {
        int Count = 2 + int(Random() % 9);
        std::string Text;
        std::vector<std::set<int>> Reached(static_cast<std::size_t>(Count));
        for (int i = 0; i < Count; ++i) {
            Text += "proc " + (i == 0 ? std::string("main") : "p" + std::to_string(i)) + " { v" +
                    std::to_string(i) + " = 1; ";
            for (int k = int(Random() % 3); k > 0; --k) {
                int j = 1 + int(Random() % unsigned(Count - 1));
                Reached[std::size_t(i)].insert(j);
                Text += "call p" + std::to_string(j) + "; ";
            }
            Reached[std::size_t(i)].insert(i);
            Text += "} ";
        }
        for (int Round = 0; Round < Count; ++Round)
            for (auto& Set : Reached)
                for (int j : std::set<int>(Set))
                    Set.insert(Reached[std::size_t(j)].begin(), Reached[std::size_t(j)].end());
        Program P(Text);
        P.toSSA();
        for (int i = 0; i < Count; ++i) {
            std::set<std::string> Expected, Found;
            for (int j : Reached[std::size_t(i)])
                Expected.insert("v" + std::to_string(j));
            for (ZfCCfgVariable* pVar :
                 P.procedure(i == 0 ? "#main" : "p" + std::to_string(i))->getDefinedVariables())
                Found.insert(static_cast<Variable*>(pVar)->Name);
            EXPECT_EQ(Found, Expected) << Text;
        }
    }
}

// The statements of a node's block, by kind and variable: "init a", "param b 2" (arguments),
// "return c", "output d".
std::string contents(Program& P, leda::node v) {
    std::string Text;
    for (ZfCCfgStatement* pStmt : P.blockOf(v)->getStatementSeq()) {
        if (ZfCCfgParamStatement* pParam = pStmt->isParamStatement())
            Text += "param " + names(pStmt->getDefinedVariables()) + " " +
                    std::to_string(pParam->countParamExpressions());
        else if (pStmt->isValueReturnStatement())
            Text += "return " + names(pStmt->getDefinedVariables());
        else if (pStmt->isOutputStatement())
            Text += "output " + names(pStmt->getUsedVariables());
        else if (pStmt->isAssignment())
            Text += (dynamic_cast<ZfCCfgInitAssignment*>(pStmt) ? "init " : "set ") +
                    names(pStmt->getDefinedVariables());
        else
            Text += "call";
        Text += "; ";
    }
    return Text;
}

TEST(Boundary, StatementsStandInBlocksOfTheirOwnInSetOrder) {
    Program P("proc main { call f; call f; } proc f { o = i + p; } proc unused { q = 1; }");
    P.output("o");
    P.output("q"); // touched by nothing that main calls: no output statement
    P.input("i");
    // An explicit parameter comes first, and p gets no second statement.
    std::vector<ZfCCfgProcedureCall*> Calls = P.calls();
    for (ZfCCfgProcedureCall* pCall : Calls) {
        leda::list<ZfCCfgVariable*> Variables;
        leda::list<ZfCCfgExpression*> Expressions;
        Variables.append(P.var("p"));
        Expressions.append(P.expression("5 + k")); // the caller reads k, nobody else does
        P.graph().setParametersOfCall(pCall, Variables, Expressions);
    }
    Calls[0]->setIsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(true);
    P.toSSA();
    auto First = [&](char const* Name) {
        return P.graph().target(P.graph().first_adj_edge(P.procedure(Name)->getEntryNode()));
    };
    EXPECT_EQ(contents(P, First("#main")), "init o; init i; init p; init k; ");
    EXPECT_EQ(contents(P, First("f")), "param p 2; param o 2; param i 2; ");
    EXPECT_EQ(contents(P, First("unused")), "param q 0; ");
    leda::node Exit = P.procedure("#main")->getExitNode();
    EXPECT_EQ(contents(P, P.graph().source(P.graph().first_in_edge(Exit))), "output o; ");
    for (auto& Item : P.statements())
        if (Item.second->isProcedureCall()) {
            EXPECT_EQ(contents(P, Item.first), "call; return o; ");
        }
    EXPECT_EQ(P.procedure("f")->getValueReturnStatements().size(), 2);
    for (auto& Item : P.statements()) // in the order of the calls
        if (Item.second == P.procedure("f")->getValueReturnStatements().front()) {
            EXPECT_EQ(P.blockOf(Item.first)->getStatementSeq().front(), Calls[0]);
        }
    // One marked call makes all implicit arguments unknown, and leaves the explicit one alone.
    for (ZfCCfgParamStatement* pParam : P.procedure("f")->getParamStatements()) {
        bool IsExplicit = originalOf(pParam->getVariable()) == P.var("p");
        EXPECT_EQ(pParam->getParamExpression(Calls[1])->isMarkedAsEvalToNonConst(), !IsExplicit);
    }
    EXPECT_EQ(verifySSA(P.graph()), "");
}

// --- Dominators, frontiers, phi functions ---

// Reachable from an entry without passing through Without.
std::set<leda::node> reachable(ZfCControlFlowGraph& G, leda::node Without) {
    std::set<leda::node> Seen;
    std::vector<leda::node> Work;
    for (leda::node v : G.all_nodes())
        if (G.inf(v)->isEntryNode() && v != Without)
            Work.push_back(v);
    while (!Work.empty()) {
        leda::node v = Work.back();
        Work.pop_back();
        if (Seen.insert(v).second)
            for (leda::edge e : G.out_edges(v))
                if (G.target(e) != Without)
                    Work.push_back(G.target(e));
    }
    return Seen;
}

// Blocks below each other with random extra edges: back edges, self-loops and parallel edges
// included.
void makeRandomGraph(Program& P, std::mt19937& Random) {
    for (char const* Name : {"#main", "p"}) {
        leda::node Entry = P.entry(Name);
        std::vector<leda::node> Nodes;
        for (int Count = 1 + int(Random() % 12), i = 0; i < Count; ++i) {
            std::string Text = Random() % 2 ? "v" + std::to_string(Random() % 4) + " = v" +
                                                  std::to_string(Random() % 4) + ";"
                                            : "";
            leda::node v = P.block(Text);
            P.edge(i == 0 ? Entry : Nodes[Random() % Nodes.size()], v);
            Nodes.push_back(v);
        }
        for (int Extra = int(Random() % 12); Extra > 0; --Extra)
            P.edge(Nodes[Random() % Nodes.size()], Nodes[Random() % Nodes.size()]);
    }
    // A way out for each procedure: an exit node without in-edges would be a component of its own.
    for (leda::node v : leda::list<leda::node>(P.graph().all_nodes()))
        if (P.blockOf(v) && Random() % 4 == 0)
            P.edge(v, [&] {
                leda::node w = P.block();
                P.blockOf(w)->setProcedure(P.blockOf(v)->getProcedure());
                return w;
            }());
    for (char const* Name : {"#main", "p"}) {
        P.entry(Name);
        P.edge(P.graph().target(P.graph().first_adj_edge(P.procedure(Name)->getEntryNode())),
               P.block());
    }
}

TEST(Dominators, TakingTheDominatorAwayMakesTheNodeUnreachable) {
    std::mt19937 Random(1);
    for (int Run = 0; Run < 150; ++Run) {
        Program P;
        makeRandomGraph(P, Random);
        ZfCControlFlowGraph& G = P.graph();
        int Nodes = G.number_of_nodes(), MaxIndex = G.max_node_index();
        G.computeAllIdoms();
        EXPECT_EQ(G.number_of_nodes(), Nodes);
        EXPECT_EQ(G.max_node_index(), MaxIndex);
        std::map<leda::node, std::set<leda::node>> Dominators; // strict ones
        for (leda::node d : G.all_nodes()) {
            std::set<leda::node> Left = reachable(G, d);
            for (leda::node v : G.all_nodes())
                if (v != d && !Left.count(v))
                    Dominators[v].insert(d);
        }
        for (leda::node v : G.all_nodes()) {
            // The immediate one is that strict dominator which all others dominate.
            leda::node Expected = nullptr;
            for (leda::node d : Dominators[v])
                if (Dominators[d].size() + 1 == Dominators[v].size())
                    Expected = d;
            EXPECT_EQ(G.inf(v)->getIdom(), Expected) << "run " << Run << ", node " << G.index(v);
        }
    }
}

// Large enough for deep spanning trees and unbalanced forests.
TEST(Dominators, LargeGraphsAgreeWithTheIterativeAlgorithm) {
    std::mt19937 Random(3);
    for (unsigned int Spread : {2u, 10u, 3000u}) {
        Program P;
        std::vector<leda::node> Nodes{P.entry("#main"), P.block()};
        P.edge(Nodes[0], Nodes[1]);
        for (std::size_t i = 2; i < 3000; ++i) {
            Nodes.push_back(P.block());
            P.edge(Nodes[i - 1 - Random() % std::min<std::size_t>(Spread, i - 1)], Nodes[i]);
        }
        for (int Extra = 0; Extra < 1500; ++Extra) {
            std::size_t From = 1 + Random() % 2999, Step = Random() % 40;
            P.edge(Nodes[From], Nodes[1 + (From + Step) % 2999]);
        }
        P.graph().computeAllIdoms();
        SSAVerifier Iterative(P.graph());
        for (leda::node v : Nodes)
            ASSERT_EQ(P.graph().inf(v)->getIdom(), Iterative.idom(v)) << Spread;
    }
}

TEST(PhiPlacement, FrontiersAgreeWithTheirDefinitionAndTheFormIsMinimalSSA) {
    std::mt19937 Random(2);
    for (int Run = 0; Run < 150; ++Run) {
        Program P;
        makeRandomGraph(P, Random);
        P.toSSA(Run % 2 == 0);
        ZfCControlFlowGraph& G = P.graph();
        SSAVerifier Verifier(G);
        EXPECT_EQ(Verifier.violations(), "") << "run " << Run;
        for (leda::node x : G.all_nodes()) {
            // Where an exit moved down, the block in its place is younger than the frontiers.
            if (x->first_out_edge() && G.inf(G.target(x->first_out_edge()))->isExitNode() &&
                G.indeg(x) > 1)
                continue;
            std::set<leda::node> Expected, Found;
            for (leda::node y : G.all_nodes())
                for (leda::edge e : G.in_edges(y))
                    if (Verifier.dominates(x, G.source(e)) && (x == y || !Verifier.dominates(x, y)))
                        Expected.insert(y);
            for (leda::node y : *G.inf(x)->getDF())
                Found.insert(y);
            EXPECT_EQ(Found, Expected) << "run " << Run << ", node " << G.index(x);
        }
        // Minimal: each phi function stands in the iterated frontier of its variable's definitions.
        std::map<ZfCCfgVariable*, std::set<leda::node>> Definitions;
        for (auto& Item : P.statements())
            for (ZfCCfgVariable* pVar : Item.second->getDefinedVariables())
                Definitions[originalOf(pVar)].insert(Item.first);
        for (auto& Item : P.statements())
            if (ZfCPhiFunction* pPhi = Item.second->isPhiFunction()) {
                bool InFrontier = false;
                for (leda::node x : Definitions[originalOf(pPhi->getVariable())])
                    InFrontier = InFrontier || G.inf(x)->getDF()->member(Item.first);
                EXPECT_TRUE(InFrontier) << "run " << Run;
            }
    }
}

TEST(PhiPlacement, AnExitThatNeedsPhiFunctionsMovesDownOnce) {
    Program P;
    leda::node Entry = P.entry("#main"), c = P.block("? x"), a = P.block("y=1; z=1;"),
               b = P.block();
    P.edge(Entry, c);
    P.trueEdge(c, a);
    P.falseEdge(c, b);
    P.entry("other");
    leda::node q = P.block("x=y;");
    P.edge(P.procedure("other")->getEntryNode(), q);
    P.graph().placeExitNodes();
    leda::node Former = P.procedure("#main")->getExitNode();
    // Without the output block in between, the exit itself is the join.
    P.graph().computeAllIdoms();
    for (leda::node v : {a, b})
        P.graph().inf(v)->getDF()->insert(Former);
    P.graph().placePhiFunction();
    leda::node Exit = P.procedure("#main")->getExitNode();
    EXPECT_NE(Exit, Former);
    EXPECT_EQ(P.blockOf(Former)->getPhiFunctions().size(), 2);
    EXPECT_EQ(P.blockOf(Former)->getPhiFunctions().front()->getReplacementVariables().size(), 2);
    EXPECT_EQ(P.blockOf(Former)->getProcedure(), P.procedure("#main"));
    EXPECT_EQ(P.graph().target(P.graph().first_adj_edge(Former)), Exit);
    EXPECT_NE(P.graph().inf(Exit)->isExitNode(), nullptr);
    EXPECT_EQ(P.graph().inf(Exit)->getIdom(), nullptr);
}

// --- Renaming ---

TEST(Renaming, LoopHeadTakesInitialValueAndValueOfTheBackEdge) {
    Program P("proc main { i = 0; while i < 3 { i = i + 1; i = i + 2; } o = i; }");
    P.output("o");
    P.toSSA();
    EXPECT_EQ(verifySSA(P.graph()), "");
    std::vector<ZfCCfgVariable*> Versions;
    ZfCPhiFunction* pPhi = nullptr;
    for (auto& Item : P.statements())
        for (ZfCCfgVariable* pVar : Item.second->getDefinedVariables())
            if (originalOf(pVar) == P.var("i")) {
                pPhi = Item.second->isPhiFunction() ? Item.second->isPhiFunction() : pPhi;
                Versions.push_back(pVar);
            }
    // Node order: i = 0; the phi function; the two in the body; the initial value, in the youngest
    // block.
    ASSERT_EQ(Versions.size(), 5u);
    ASSERT_NE(pPhi, nullptr);
    EXPECT_EQ(pPhi->getReplacementVariables()[0], Versions[0]);
    EXPECT_EQ(pPhi->getReplacementVariables()[1], Versions[3]);
}

TEST(Renaming, BothEdgesOfABranchToOneNodeTakeTheSameVersion) {
    Program P;
    leda::node Entry = P.entry("#main"), h = P.block("x=1; ? c"), w = P.block("? x");
    P.edge(Entry, h);
    P.trueEdge(h, w);
    P.falseEdge(h, w);
    P.trueEdge(w, w); // a block that fills the phi function that it renamed itself
    P.falseEdge(w, P.block());
    P.edge(h, w);
    P.blockOf(w)->append(new ZfCCfgExternCall([] {
        static leda::list<ZfCCfgVariable*> None;
        return &None;
    }()));
    auto* pSet = new ZfCCfgInitAssignment();
    pSet->setLHS(P.var("x"));
    pSet->setRHS(P.expression("x + 1"));
    P.blockOf(w)->append(pSet);
    P.toSSA();
    EXPECT_EQ(verifySSA(P.graph()), "");
    leda::array<ZfCCfgVariable*> Operands =
        P.blockOf(w)->getPhiFunctions().front()->getReplacementVariables();
    ASSERT_EQ(Operands.size(), 4);
    EXPECT_EQ(Operands[0], Operands[1]);
    EXPECT_EQ(Operands[2], pSet->getLHS());
    EXPECT_EQ(Operands[3], Operands[0]);
}

TEST(Renaming, AVirtualAssignmentHangsOnTheRealVersion) {
    Program P("proc main { x = 2; x = 3; x = 4; y = x; }");
    int i = 0;
    for (auto& Item : P.statements())
        Item.second->setIsVirtual(++i == 2 || i == 3);
    P.toSSA();
    std::vector<ZfCCfgVariable*> Versions;
    for (auto& Item : P.statements())
        for (ZfCCfgVariable* pVar : Item.second->getDefinedVariables())
            if (originalOf(pVar) == P.var("x"))
                Versions.push_back(pVar);
    EXPECT_EQ(Versions[1]->getNonVirtualAlias(), Versions[0]);
    EXPECT_EQ(Versions[2]->getNonVirtualAlias(), Versions[0]); // an alias of an alias is flat
    P.graph().divideBasicBlock();
    P.graph().addSSAEdges();
    EXPECT_EQ(Versions[0]->countUses(), 0);
    EXPECT_EQ(Versions[0]->countAllUses(), 1);
}

TEST(Renaming, AUseWithoutAVersionReachesTheUser) {
    for (bool IsVirtual : {false, true}) {
        Program P("proc main { a = 1; }");
        // Hidden from the summaries, so that neither u nor the variable behind the alias has a
        // value at the entry.
        auto* pHidden = P.statements()[0].second->isAssignment();
        pHidden->setRHS(P.expression(IsVirtual ? "1" : "u"));
        pHidden->setIsValidConditionAssignment(true);
        pHidden->setIsVirtual(IsVirtual);
        Reports R(true);
        P.toSSA();
        EXPECT_EQ(R.Messages.size(), 1u);
        EXPECT_EQ(Reports::assertions(), std::vector<std::string>{"0"});
        EXPECT_NE(pHidden->getLHS()->isSSAVariable(), nullptr); // the walk goes on
    }
}

TEST(Renaming, ASecondWayIntoTheExitLeavesReturnedValuesAlone) {
    Program P("proc main { call f; o = r; }");
    leda::node Entry = P.entry("f"), c = P.block("r=1; ? c");
    P.edge(Entry, c);
    P.trueEdge(c, P.block());
    P.falseEdge(c, P.block());
    Reports R(true);
    P.toSSA();
    EXPECT_TRUE(R.Messages.empty());
    EXPECT_EQ(Reports::assertions(), std::vector<std::string>{"0"});
    EXPECT_EQ(verifySSA(P.graph()), "");
}

TEST(Renaming, OperandsOfAWideJoinBelongToTheirEdges) {
    Program P;
    leda::node Entry = P.entry("#main"), Branch = P.block("x=0; ? c"), Join = P.block("y = x;");
    P.edge(Entry, Branch);
    for (int i = 0; i < 300; ++i) {
        leda::node Arm = P.block("x=" + std::to_string(i) + ";");
        P.trueEdge(Branch, Arm);
        P.edge(Arm, Join);
    }
    P.toSSA(true);
    EXPECT_EQ(verifySSA(P.graph()), "");
    P.graph().divideBasicBlock();
    EXPECT_EQ(verifySSA(P.graph()), "");
}

} // namespace
} // namespace passes
