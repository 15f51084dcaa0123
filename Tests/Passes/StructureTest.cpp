#include <gtest/gtest.h>

#include "LibraryClient/TestClient.h"

namespace passes {
namespace {

// What a node leads to by each of its edges: 't' true, 'f' false, '-' plain, with the order number
// of the target among Nodes ('?' for any other).
std::string outEdges(Program& P, leda::node v, std::vector<leda::node> const& Nodes) {
    std::string Text;
    for (leda::edge e : P.graph().out_edges(v)) {
        auto Found = std::find(Nodes.begin(), Nodes.end(), P.graph().target(e));
        ZfCCfgEdgeInfo* pInf = P.graph().inf(e);
        Text += pInf->isTrueBranch()    ? "t"
                : pInf->isFalseBranch() ? "f"
                : pInf->isSSAEdge()     ? "s"
                                        : "-";
        Text += Found == Nodes.end() ? "?" : std::to_string(Found - Nodes.begin());
    }
    return Text;
}

TEST(StructureEdits, SplitMovesContentsAndOutEdgesToTheSecondHalf) {
    Program P;
    leda::node Entry = P.entry("#main"), v = P.block("a=1; b=2; ? a<b"), T = P.block(),
               F = P.block();
    P.edge(Entry, v);
    P.trueEdge(v, T);
    P.falseEdge(v, F);
    ZfCCfgStatement* pFirst = P.blockOf(v)->getStatementSeq().front();
    ZfCCfgStatement* pSecond = P.blockOf(v)->getStatementSeq().back();
    EXPECT_EQ(P.graph().splitAtStatement(v, pFirst), v);
    leda::node w = P.graph().splitAtStatement(v, pSecond);
    leda::node c = P.graph().splitAtCondition(w);
    EXPECT_EQ(P.graph().splitAtCondition(c), c);
    EXPECT_EQ(outEdges(P, v, {T, F, w, c}) + outEdges(P, w, {T, F, w, c}) +
                  outEdges(P, c, {T, F, w, c}),
              "-2-3t0f1");
    EXPECT_EQ(P.blockOf(v)->isStatement(), pFirst);
    EXPECT_EQ(P.blockOf(w)->isStatement(), pSecond);
    EXPECT_NE(P.blockOf(c)->getBranchCond(), nullptr);
    EXPECT_EQ(P.blockOf(c)->getProcedure(), P.procedure("#main"));
}

TEST(StructureEdits, DivideLeavesOneItemForEachNodeAndKeepsEdges) {
    Program P;
    leda::node Entry = P.entry("#main"), v = P.block("a=1; b=2; ? a<b"), Empty = P.block(),
               J = P.block();
    P.edge(Entry, v);
    P.trueEdge(v, v); // a block that branches to itself
    P.falseEdge(v, Empty);
    P.edge(Empty, J);
    for (int Run = 0; Run < 2; ++Run) { // a second run moves each item once more, in the same shape
        P.graph().divideBasicBlock();
        EXPECT_EQ(P.graph().number_of_nodes(), 6);
        leda::node a = P.graph().target(P.graph().first_adj_edge(Entry));
        leda::node b = P.graph().target(P.graph().first_adj_edge(a));
        leda::node c = P.graph().target(P.graph().first_adj_edge(b));
        EXPECT_EQ(outEdges(P, a, {a, b, c, Empty}) + outEdges(P, b, {a, b, c, Empty}) +
                      outEdges(P, c, {a, b, c, Empty}),
                  "-1-2t0f3");
        EXPECT_EQ(P.graph().source(P.graph().first_in_edge(a)), Entry); // in-edges in their order
        EXPECT_EQ(P.graph().indeg(a), 2);
    }
}

TEST(StructureEdits, FindBranchNodeGoesOnInTheProcedureCalledAtTheEnd) {
    Program P;
    leda::node Entry = P.entry("#main"), v = P.block("a=1;"), Call = P.block();
    P.blockOf(Call)->append(new ZfCCfgProcedureCall("f"));
    P.edge(Entry, v);
    P.edge(v, Call);
    leda::node FEntry = P.entry("f"), g = P.block("b=1;"), Branch = P.block("? b");
    P.edge(FEntry, g);
    P.edge(g, Branch);
    P.trueEdge(Branch, g);
    Reports R(true);
    EXPECT_EQ(P.graph().findBranchNode(v, P.blockOf(Branch)->getBranchCond()), Branch);
    EXPECT_TRUE(R.silent());
    EXPECT_EQ(P.graph().findBranchNode(v, P.expression("b")),
              Branch); // another condition: reported, then answered
    EXPECT_EQ(R.Messages.size(), 1u);
    EXPECT_EQ(Reports::assertions(), std::vector<std::string>{"0"});
}

TEST(Frames, EveryOpenEndLeadsToTheOneExitOfItsProcedure) {
    Program P("proc main { x = 1; } proc f { call f; }");
    P.entry("loop");
    leda::node a = P.block(), b = P.block();
    P.edge(P.procedure("loop")->getEntryNode(), a);
    P.edge(a, b);
    P.edge(b, a);
    P.entry("two");
    leda::node c = P.block("? x"), d = P.block(), e = P.block();
    P.edge(P.procedure("two")->getEntryNode(), c);
    P.trueEdge(c, d);
    P.falseEdge(c, e);
    EXPECT_TRUE(P.graph().checkConsistency());
    P.graph().placeExitNodes();
    int InEdges[] = {1, 1, 0, 2};
    char const* Names[] = {"#main", "f", "loop", "two"};
    for (int i = 0; i < 4; ++i) {
        ZfCCfgProcedure* pProcedure = P.procedure(Names[i]);
        EXPECT_NE(P.graph().inf(pProcedure->getExitNode())->isExitNode(), nullptr);
        EXPECT_EQ(P.graph().inf(pProcedure->getExitNode())->getProcedure(), pProcedure);
        EXPECT_EQ(P.graph().indeg(pProcedure->getExitNode()), InEdges[i]) << Names[i];
    }
    EXPECT_FALSE(
        P.graph().checkConsistency()); // the exit of the endless loop is a component of its own
}

TEST(Frames, LoopAroundMainHasAnUnknownConditionAndBothWays) {
    Program P("proc main { x = 1; }");
    P.graph().placeExitNodes();
    leda::node Exit = P.procedure("#main")->getExitNode();
    leda::node Body = P.graph().source(P.graph().first_in_edge(Exit));
    P.graph().placeLoopAroundMain();
    leda::node Loop = P.graph().target(P.graph().first_adj_edge(Body));
    EXPECT_EQ(outEdges(P, Loop, {Body, Exit}), "t0f1");
    EXPECT_EQ(P.graph().indeg(Exit), 1);
    EXPECT_TRUE(P.blockOf(Loop)->getBranchCond()->evaluate().isUndetermined());
    EXPECT_EQ(P.blockOf(Loop)->getProcedure(), P.procedure("#main"));
}

// Entry -> c -(t)-> a -> Shared -> Behind, c -(f)-> Shared: one plain edge and one branch edge come
// to Shared.
struct SharedCode {
    Program P;
    leda::node c, a, Shared, Behind;
    SharedCode() {
        leda::node Entry = P.entry("#main");
        c = P.block("? x"), a = P.block("y=1;"), Shared = P.block("y=2;"), Behind = P.block("y=3;");
        P.edge(Entry, c);
        P.trueEdge(c, a);
        P.edge(a, Shared);
        P.falseEdge(c, Shared);
        P.edge(Shared, Behind);
    }
};

TEST(Extraction, EachEdgeFromOutsideBecomesACall) {
    SharedCode S;
    Program& P = S.P;
    std::string Name = "#block_" + std::to_string(P.blockOf(S.Shared)->getIndex());
    ZfCCfgProcedureCall* pCall = P.graph().makeProcedureAndCall(S.Shared);
    EXPECT_STREQ(pCall->getName().cstring(), Name.c_str());
    ZfCCfgProcedure* pNew = P.procedure(Name);
    EXPECT_EQ(outEdges(P, pNew->getEntryNode(), {S.Shared}), "-0");
    EXPECT_EQ(P.graph().indeg(S.Shared), 1);
    EXPECT_EQ(P.blockOf(S.Shared)->getProcedure(), pNew);
    EXPECT_EQ(P.blockOf(S.Behind)->getProcedure(), pNew);
    // The plain edge went, and its block ends in the call; the branch edge got a block for it.
    EXPECT_EQ(P.graph().outdeg(S.a), 0);
    EXPECT_NE(P.blockOf(S.a)->getStatementSeq().back()->isProcedureCall(), nullptr);
    EXPECT_EQ(outEdges(P, S.c, {S.a}), "t0f?");
    leda::node Arm = P.graph().target(P.graph().adj_succ(P.graph().first_adj_edge(S.c)));
    EXPECT_NE(P.blockOf(Arm)->isStatement()->isProcedureCall(), nullptr);
    EXPECT_EQ(P.blockOf(Arm)->getProcedure(), P.procedure("#main"));
    EXPECT_EQ(P.calls().size(), 2u); // the answered one stands in no block
    EXPECT_TRUE(P.graph().checkConsistency());
}

TEST(Extraction, AJoinInsideEnteredFromOutsideIsExtractedToo) {
    SharedCode S;
    Program& P = S.P;
    P.edge(S.a, S.Behind); // the old procedure enters Behind as well (a then has two successors)
    Reports R(true);
    P.graph().makeProcedureAndCall(S.Shared);
    EXPECT_TRUE(R.silent());
    std::string Inner = "#block_" + std::to_string(P.blockOf(S.Behind)->getIndex());
    EXPECT_EQ(P.blockOf(S.Behind)->getProcedure(), P.procedure(Inner));
    EXPECT_EQ(P.calls().size(), 4u);
    EXPECT_TRUE(P.graph().checkConsistency());
    EXPECT_TRUE(R.silent());
}

TEST(Extraction, EveryJoinOfAChainBecomesAProcedure) {
    // a1 -> a2 -> ... in the extracted part, each entered from a branch of the old procedure as
    // well.
    Program P;
    leda::node Entry = P.entry("#main"), Outside = P.block("? x"), v = P.block("y=0;");
    P.edge(Entry, Outside);
    P.falseEdge(Outside, v);
    leda::node Last = v;
    for (int i = 0; i < 60; ++i) {
        leda::node Next = P.block("y=1;"), Way = P.block("? x");
        P.edge(Last, Next);
        P.trueEdge(Outside, Way);
        P.falseEdge(Way, Next);
        Outside = Way;
        Last = Next;
    }
    P.trueEdge(Outside, P.block());
    P.graph().makeProcedureAndCall(v);
    EXPECT_TRUE(P.graph().checkConsistency()); // as many components as procedures
    EXPECT_EQ(P.calls().size(),
              121u); // one from outside for each, one along each link of the chain
}

TEST(Extraction, BehindAnEntryNodeTheProcedureIsThatOfTheEntry) {
    Program P;
    leda::node Entry = P.entry("f"), v = P.block("x=1;"), w = P.block("x=2;");
    P.edge(Entry, v);
    P.edge(v, w);
    P.edge(w, v); // from within: left alone
    int Nodes = P.graph().number_of_nodes();
    EXPECT_STREQ(P.graph().makeProcedureAndCall(v)->getName().cstring(), "f");
    EXPECT_EQ(P.graph().number_of_nodes(), Nodes);
    EXPECT_EQ(P.graph().indeg(v), 2);
    EXPECT_TRUE(P.graph().checkConsistency());
    // Now w is entered from outside too. Its procedure takes v along, and v takes itself back.
    P.edge(P.entry("g"), w);
    leda::node OtherEntry = P.entry("h"), Outside = P.block();
    P.edge(OtherEntry, Outside);
    P.edge(Outside, w);
    P.graph().makeProcedureAndCall(v);
    EXPECT_TRUE(P.graph().checkConsistency());
    EXPECT_EQ(P.graph().indeg(v), 1);
    EXPECT_EQ(P.graph().indeg(w), 1);
    EXPECT_EQ(P.blockOf(v)->getProcedure(), P.procedure("f"));
    EXPECT_EQ(P.blockOf(w)->getProcedure(), P.procedure("g"));
    EXPECT_EQ(P.calls().size(), 3u); // at the ends of v, w and Outside
}

TEST(Extraction, TheFirstCallFixesTheParameters) {
    Program P("proc main { call f; call f; } proc f { r = a + b; }");
    std::vector<ZfCCfgProcedureCall*> Calls = P.calls();
    auto Set = [&](int i, std::vector<std::string> Names) {
        leda::list<ZfCCfgVariable*> Variables;
        leda::list<ZfCCfgExpression*> Expressions;
        for (std::string const& Name : Names) {
            Variables.append(P.var(Name));
            Expressions.append(P.expression("1"));
        }
        P.graph().setParametersOfCall(Calls[std::size_t(i)], Variables, Expressions);
        EXPECT_TRUE(Variables.empty() && Expressions.empty());
    };
    Reports R(false);
    Set(0, {"a", "b"});
    Set(1, {"a", "b"});
    EXPECT_TRUE(R.silent());
    leda::list<ZfCCfgParamStatement*> Parameters = P.procedure("f")->getParamStatements();
    ASSERT_EQ(Parameters.size(), 2);
    EXPECT_EQ(Parameters.front()->getVariable(), P.var("a"));
    EXPECT_EQ(Parameters.front()->countParamExpressions(), 2);
    Set(1, {"b", "a"});
    EXPECT_EQ(R.Messages.size(), 2u);
}

} // namespace
} // namespace passes
