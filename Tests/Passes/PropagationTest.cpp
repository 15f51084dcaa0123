#include <gtest/gtest.h>

#include <cmath>

#include "Generators/LibraryProgram.h"
#include "LibraryClient/TestClient.h"
#include "Oracles/SSAVerifier.h"

namespace passes {
namespace {

// Values of the definitions of x, in the order of the divided nodes (the program, a callee, then
// the initial values); "|" parts the run without removal of dead code from the run with it.
TEST(Propagation, ValuesOfAllDefinitions) {
    struct {
        char const* Text;
        char const* Values;
    } Rows[] = {
        // Straight code and calls.
        {"proc main { x = 1; x = x + 2; }", "1 3 0|1 3 0"},
        {"proc main { i = 3; call f; } proc f { x = i; }", "3 3 0 0|3 3 0 0"},
        {"proc main { x = 1; call f; x = x + 1; call f; } proc f { y = x; }",
         "1 2 0 bottom|1 2 0 bottom"},
        {"proc main { x = u; }", "bottom 0|bottom 0"},
        // What the callee gives back is known behind the condition's first visit alone.
        {"proc main { call f; if r { x = 3; } else { x = 4; } } proc f { r = 0; }",
         "3 4 bottom 0|4 4 0"},
        // A phi function over equal and over different constants, and over a dead branch's
        // definition.
        {"proc main { if u { x = 3; } else { x = 3; } }", "3 3 3 0|3 3 3 0"},
        {"proc main { if u { x = 3; } else { x = 4; } }", "3 4 bottom 0|3 4 bottom 0"},
        {"proc main { c = 0; if c { x = 3; } else { x = 4; } }", "top 4 top 0|4 4 0"},
        {"proc main { c = 2; if c { x = 3; } else { x = 4; } }", "3 top top 0|3 3 0"},
        // Nested: the second iteration finds the inner condition.
        {"proc main { c = 0; d = 1; if c { d = 0; } if d { x = 7; } }", "7 bottom 0|7 7 0"},
        // Zero dominates an undetermined operand.
        {"proc main { while x < 5 { x = x + 1; } }", "top top 0|top top 0"},
        {"proc main { while u { x = x * 0; } }", "0 0 0|0 0 0"},
    };
    for (auto& Row : Rows) {
        std::string Found, Later;
        for (bool RemoveDeadCode : {false, true}) {
            Program P(Row.Text);
            P.input("u");
            Reports R(true);
            P.propagate(RemoveDeadCode);
            EXPECT_TRUE(R.silent()) << Row.Text;
            EXPECT_EQ(verifySSA(P.graph()), "") << Row.Text;
            Found += (RemoveDeadCode ? "|" : "") + P.valuesOf("x");
            // Nothing becomes constant in a second run but what waits for dead operands to go.
            P.graph().propagateSparseConditionalConstant(true);
            Later += (RemoveDeadCode ? "|" : "") + P.valuesOf("x");
        }
        EXPECT_EQ(Found, Row.Values) << Row.Text;
        std::string WithRemoval = Found.substr(Found.find('|') + 1);
        EXPECT_EQ(Later, WithRemoval + "|" + WithRemoval) << Row.Text;
    }
}

// Value and range of all definitions as bits, and the edges that control can take.
std::string whatIsKnown(Program& P) {
    std::string Text;
    for (auto& Item : P.statements())
        for (ZfCCfgVariable* pVar : Item.second->getDefinedVariables())
            for (ZfCCfgValue Value : {pVar->getValue(), pVar->getMinValue(), pVar->getMaxValue()}) {
                double Number = Value.isConstant() ? Value.getValue() : 0;
                Text += std::to_string(Value.getValueKind()) +
                        std::string(reinterpret_cast<char const*>(&Number), sizeof Number);
            }
    for (leda::edge e : P.graph().all_edges())
        if (P.graph().inf(e)->isSSAEdge() == nullptr)
            Text += P.graph().inf(e)->isEdgeExecutable() ? '+' : '-';
    return Text;
}

// A node none of whose operands has changed is not visited again. With edges that it has not added
// itself, a run visits every node each time that control or a change arrives, and knows no more.
TEST(Propagation, NodesThatAreNotVisitedAgainWouldHaveGivenTheSame) {
    for (unsigned int Run = 0; Run < 600; ++Run) {
        std::string Known[2];
        for (bool VisitsAll : {false, true}) {
            Program P(LibraryProgram(Run).text());
            P.input("in1");
            P.output("o1");
            P.boolean("f");
            P.var("s")->Limit = 3;
            // Limits and numbers without a bound of their own: ranges move where values do not.
            P.var("c")->Init = ZfCCfgValue(Run % 2 == 0 ? eCfgValueNonConstant : eCfgValueConstant);
            if (Run % 3 == 0)
                P.graph().insertValidConditionAssignments();
            P.toSSA(Run % 4 == 0);
            P.graph().divideBasicBlock();
            bool RemovesDeadCode = Run % 5 < 2;
            if (VisitsAll) {
                P.graph().addSSAEdges();
                P.graph().sparseConditionalConstant(RemovesDeadCode);
            } else {
                P.graph().propagateSparseConditionalConstant(RemovesDeadCode);
            }
            Known[VisitsAll] = whatIsKnown(P);
        }
        EXPECT_EQ(Known[0], Known[1]) << "run " << Run;
    }
}

// Phi functions alone become constant in the second iteration, behind the visit of their user: only
// a third one brings the constant to it.
TEST(Propagation, APhiFunctionThatBecomesConstantAsksForAnotherIteration) {
    Program P(
        "proc main { x = 3; while u { y = x; if u { if u { x = 3; } else { if u { extern q; } "
        "extern q; extern q; x = 3; } } else { x = 3; } } }");
    P.input("u");
    P.propagate(false);
    for (auto& Item : P.statements()) {
        auto* pAssignment = dynamic_cast<Assignment*>(Item.second);
        if (pAssignment != nullptr && originalOf(pAssignment->getLHS()) == P.var("y")) {
            EXPECT_EQ(Program::show(pAssignment->getLHS()->getValue()), "3");
        }
    }
}

TEST(Propagation, ANumberOtherThanZeroIsTrueAndAnythingElseOpensBothArms) {
    struct {
        ZfCCfgValue Value;
        int Arms;
    } Rows[] = {{ZfCCfgValue(0.0), 2},
                {ZfCCfgValue(2.0), 1},
                {ZfCCfgValue(std::nan("")), 1},
                {ZfCCfgValue(eCfgValueUndetermined), 3},
                {ZfCCfgValue(eCfgValueNonConstant), 3}};
    for (auto& Row : Rows) {
        Program P("proc main { if c { x = 1; } else { x = 2; } }");
        P.var("c")->Init = Row.Value;
        P.var("c")->pType = ZfCBasicDataType::float64();
        P.propagate(false);
        int Arms = 0;
        for (leda::edge e : P.graph().all_edges())
            if (P.graph().inf(e)->isEdgeExecutable())
                Arms |= P.graph().inf(e)->isTrueBranch()    ? 1
                        : P.graph().inf(e)->isFalseBranch() ? 2
                                                            : 0;
        EXPECT_EQ(Arms, Row.Arms);
    }
}

TEST(Propagation, ASaturatedVolatileOrMarkedDefinitionHoldsWhatTheTargetWould) {
    Program P("proc main { x = 120; y = x + 1; w = 40000; v = 1; z = v; }");
    P.var("x")->Limit = 100;
    P.input("v");
    P.propagate(false);
    EXPECT_EQ(P.valuesOf("x") + "," + P.valuesOf("y") + "," + P.valuesOf("w") + "," +
                  P.valuesOf("v") + "," + P.valuesOf("z"),
              "100 0,101 0,-25536 0,bottom bottom,bottom 0");
}

TEST(Propagation, RangesAreTheHullOfTheOperands) {
    Program P("proc main { if u { x = 3; } else { x = 5; } y = x + 1; }");
    P.input("u");
    P.propagate(false);
    for (auto& Item : P.statements())
        for (ZfCCfgVariable* pVar : Item.second->getDefinedVariables())
            if (Item.second->isPhiFunction() && originalOf(pVar) == P.var("x")) {
                EXPECT_EQ(pVar->getMinValue().getValue(), 3.0);
                EXPECT_EQ(pVar->getMaxValue().getValue(), 5.0);
            } else if (originalOf(pVar) == P.var("y") &&
                       Item.second->isAssignment()->getRHS()->getUsedVariables().size() == 1) {
                EXPECT_EQ(Program::show(pVar->getValue()), "bottom");
                EXPECT_EQ(pVar->getMaxValue().getValue(), 6.0);
            }
}

// More operands than are sorted on the way, each of them once more by a second way, and one alone
// that widens the range to either side.
TEST(Propagation, AWideJoinLooksAtAllItsOperands) {
    for (int Odd = 0; Odd < 20; ++Odd) {
        Program P;
        P.input("u");
        leda::node Last = P.entry("#main"), Join = P.block("y = x;");
        for (int i = 0; i < 20; ++i) {
            leda::node Branch = P.block("? u"), Next = P.block(),
                       Arm = P.block(i != Odd  ? "x = 3; ? u"
                                     : Odd % 2 ? "x = 7; ? u"
                                               : "x = 1; ? u");
            P.trueEdge(Arm, Join);
            P.falseEdge(Arm, Join);
            P.edge(Last, Branch);
            P.trueEdge(Branch, Arm);
            P.falseEdge(Branch, Next);
            Last = Next;
        }
        P.edge(Last, P.block());
        P.propagate(false);
        EXPECT_NE(P.valuesOf("x").find("bottom"), std::string::npos) << Odd;
        ZfCCfgVariable* pMerged = nullptr;
        for (auto& Item : P.statements())
            if (Item.second->isPhiFunction() && P.graph().indeg(Item.first) >= 40)
                pMerged = Item.second->isPhiFunction()->getVariable();
        ASSERT_NE(pMerged, nullptr);
        EXPECT_EQ(pMerged->getMinValue().getValue(), Odd % 2 ? 3 : 1) << Odd;
        EXPECT_EQ(pMerged->getMaxValue().getValue(), Odd % 2 ? 7 : 3) << Odd;
    }
}

// Where operands have ranges that are unknown in different ways, the oldest of them counts, in
// whatever order their edges come in.
TEST(Propagation, TheRangeOfAJoinIsThatOfItsOldestUnknownOperand) {
    for (char const* pText : {"if u { x = 3; } else { if 0 { x = 1; } else { x = u; } }",
                              "if u { x = 3; } else { if 0 { x = u; } else { x = u; } }",
                              "if u { x = u; } else { if 0 { x = 1; } else { x = 3; } }"})
        for (int Order = 0; Order < 6; ++Order) {
            Program P;
            P.input("u");
            leda::node Entry = P.entry("#main"), a = P.block("? u"), b = P.block("? 0"),
                       Join = P.block("y = x;"), Arms[3];
            std::string Text = pText;
            for (leda::node& Arm : Arms) {
                std::size_t At = Text.find("x =");
                Arm = P.block(Text.substr(At, 6));
                Text.erase(0, At + 6);
            }
            P.edge(Entry, a);
            P.trueEdge(a, Arms[0]);
            P.falseEdge(a, b);
            P.trueEdge(b, Arms[1]);
            P.falseEdge(b, Arms[2]);
            int First = Order % 3, Step = 1 + Order / 3;
            for (int i = 0; i < 3; ++i)
                P.edge(Arms[(First + Step * i) % 3], Join);
            P.propagate(false);
            for (auto& Item : P.statements())
                if (ZfCPhiFunction* pPhi = Item.second->isPhiFunction()) {
                    if (originalOf(pPhi->getVariable()) != P.var("x"))
                        continue;
                    tagZfECfgValueKind Expected = eCfgValueConstant;
                    for (ZfCCfgVariable* pVar : pPhi->getUsedVariables())
                        if (Expected == eCfgValueConstant)
                            Expected = pVar->getMinValue().getValueKind();
                    EXPECT_NE(Expected, eCfgValueConstant);
                    EXPECT_EQ(pPhi->getVariable()->getMinValue().getValueKind(), Expected)
                        << pText << Order;
                }
        }
}

// Nothing tells the library when the answer of a condition without variables changes.
TEST(Propagation, AConditionWithoutVariablesIsAskedInEachIteration) {
    struct Changing : Expression {
        int Asked = 0;
        ZfCCfgValue evaluate() override {
            return ++Asked == 1 ? ZfCCfgValue(eCfgValueUndetermined) : ZfCCfgValue(0.0);
        }
    };
    Program P("proc main { c = 1; if c { x = 1; } else { x = 2; } y = x; }");
    for (leda::node v : P.graph().all_nodes())
        if (P.blockOf(v) != nullptr && P.blockOf(v)->getBranchCond() != nullptr) {
            auto* pAnswer = new Changing;
            P.pFactory->addSFExpression(pAnswer);
            P.blockOf(v)->appendBranch(pAnswer);
        }
    P.propagate(true);
    EXPECT_EQ(P.valuesOf("x"), "2 2 0");
}

// Nothing is constant here, so there is one iteration, and the caller's sweep is the first.
TEST(Propagation, AChangeReachesItsUsersInTheSameIteration) {
    Program P("proc main { call f; x = r; } proc f { r = u; }");
    P.input("u");
    for (char const* Name : {"r", "x"})
        P.var(Name)->Init = ZfCCfgValue(eCfgValueNonConstant);
    P.propagate(false);
    EXPECT_EQ(P.valuesOf("x"), "bottom bottom");
}

TEST(Propagation, ASecondRunDoublesTheSSAEdgesAndChangesNoResult) {
    Program P("proc main { x = 1; if u { x = x + 1; } y = x; z = 2; }");
    P.input("u");
    P.toSSA();
    P.graph().divideBasicBlock();
    int ControlFlow = P.graph().number_of_edges();
    P.graph().propagateSparseConditionalConstant(false);
    int SSAEdges = P.graph().number_of_edges() - ControlFlow;
    std::string Values = P.valuesOf("x") + P.valuesOf("y") + P.valuesOf("z");
    P.graph().propagateSparseConditionalConstant(false);
    EXPECT_GT(SSAEdges, 0);
    EXPECT_EQ(P.graph().number_of_edges(), ControlFlow + 2 * SSAEdges);
    EXPECT_EQ(P.valuesOf("x") + P.valuesOf("y") + P.valuesOf("z"), Values);
}

TEST(Propagation, WithoutSSAEdgesAStatementIsVisitedOnceForEachIteration) {
    {
        Program P("proc main { y = x; x = 1; }");
        P.toSSA();
        P.graph().divideBasicBlock();
        P.graph().sparseConditionalConstant(true);
        EXPECT_EQ(P.valuesOf("x") + "," + P.valuesOf("y"), "1 0,0 0");
    }
    Program Empty;
    Empty.graph().sparseConditionalConstant(true); // no procedure at all
    EXPECT_EQ(Empty.graph().number_of_nodes(), 0);
}

TEST(ConstantApplication, StatementsAndConditionsAreOfferedAndShapesStay) {
    Program P("proc main { a = 1; extern a; b = a + 2; if b == 3 { x = b; } }");
    P.propagate(false);
    int Nodes = P.graph().number_of_nodes(), Edges = P.graph().number_of_edges();
    auto Numbers = [&] {
        int Count = 0;
        for (auto& Item : P.statements())
            if (auto* pAssignment = dynamic_cast<Assignment*>(Item.second))
                Count += termOf(pAssignment->getRHS()).Op == 'k';
        for (leda::node v : P.graph().all_nodes())
            if (P.blockOf(v) && P.blockOf(v)->getBranchCond())
                Count += 100 * (termOf(P.blockOf(v)->getBranchCond()).Op == 'k');
        return Count;
    };
    EXPECT_EQ(Numbers(), 1);
    P.graph().replaceConstantConditions();
    EXPECT_EQ(Numbers(), 101);
    P.graph().replaceConstantVariables();
    EXPECT_EQ(Numbers(), 102); // x = 3; b = 1 + 2 is not folded yet
    P.graph().foldConstants();
    EXPECT_EQ(Numbers(), 103);
    EXPECT_EQ(P.graph().number_of_nodes(), Nodes);
    EXPECT_EQ(P.graph().number_of_edges(), Edges);
}

TEST(ConstantApplication, ConditionsAreFoldedToo) {
    Program P("proc main { if 1 + 1 { x = 1; } }");
    P.propagate(false);
    P.graph().foldConstants();
    for (leda::node v : P.graph().all_nodes())
        if (P.blockOf(v) && P.blockOf(v)->getBranchCond()) {
            EXPECT_EQ(termOf(P.blockOf(v)->getBranchCond()).Op, 'k');
        }
}

// --- Dead code ---

// The operands of all phi functions by their values, in node order: "[1 2]".
std::string operands(Program& P) {
    std::string Text;
    for (auto& Item : P.statements())
        if (ZfCPhiFunction* pPhi = Item.second->isPhiFunction()) {
            leda::array<ZfCCfgVariable*> Operands = pPhi->getReplacementVariables();
            Text += "[";
            for (int i = 0; i < Operands.size(); ++i)
                Text += (i ? " " : "") + Program::show(Operands[i]->getValue());
            Text += "]";
        }
    return Text;
}

// Entry -> s, from which arms lead to the join. An arm of a dead branch is marked with '0', one of
// an open branch with 'u'. Arm number i assigns i + 1 to each of the variables.
void makeJoin(Program& P, std::string const& Arms, std::vector<std::string> const& Names,
              std::string const& Behind) {
    P.input("u");
    leda::node Last = P.entry("#main"), Join = P.block(Behind);
    leda::node First = P.block("d = 0;");
    P.edge(Last, First);
    Last = First;
    for (std::size_t i = 0; i < Arms.size(); ++i) {
        std::string Text;
        for (std::string const& Name : Names)
            Text += Name + " = " + std::to_string(i + 1) + "; ";
        leda::node Arm = P.block(Text), Branch = P.block(Arms[i] == '0' ? "? d" : "? u"),
                   Next = P.block();
        P.edge(Last, Branch);
        P.trueEdge(Branch, Arm);
        P.falseEdge(Branch, Next);
        P.edge(Arm, Join);
        Last = Next;
    }
    P.edge(Last, Join);
}

TEST(DeadCode, PhiFunctionsLoseTheOperandsOfDeadEdges) {
    struct {
        char const* Arms;
        char const* Operands;
    } Rows[] = {
        {"uu", "[1 2 0][1 2 0]"}, {"0u", "[2 0][2 0]"},        {"u0", "[1 0][1 0]"},
        {"00", "[0][0]"},         {"0u0u0", "[2 4 0][2 4 0]"}, {"000u", "[4 0][4 0]"},
    };
    for (auto& Row : Rows) {
        Program P;
        makeJoin(P, Row.Arms, {"x", "y"}, "z = x + y;");
        Reports R(true);
        P.propagate(true);
        EXPECT_EQ(operands(P), Row.Operands) << Row.Arms;
        EXPECT_EQ(verifySSA(P.graph()), "") << Row.Arms;
        EXPECT_TRUE(R.silent());
    }
}

TEST(DeadCode, TheChainEndsWhereTheNextJoinBegins) {
    // Two joins in a row without anything in between: the first phi function of the second is no
    // part of the first chain.
    for (int DeadArm = 0; DeadArm < 3; ++DeadArm) {
        Program P("proc main { d = 0; if u { if " + std::string(DeadArm == 0 ? "d" : "u") +
                  " { x = 1; y = 1; } else { " + (DeadArm == 1 ? "if d { x = 9; y = 9; } " : "") +
                  "x = 2; y = 2; } } else { if " + (DeadArm == 2 ? "d" : "u") +
                  " { x = 3; y = 3; } else { x = 4; y = 4; } } z = x + y; }");
        P.input("u");
        Reports R(true);
        P.toSSA();
        // Empty blocks between the joins would hide the case: take them out.
        ZfCControlFlowGraph& G = P.graph();
        for (leda::node v : leda::list<leda::node>(G.all_nodes()))
            if (P.blockOf(v) && P.blockOf(v)->isEmpty() && G.outdeg(v) == 1 && G.indeg(v) == 1) {
                G.move_edge(G.first_in_edge(v), G.source(G.first_in_edge(v)),
                            G.target(G.first_adj_edge(v)));
                G.del_node(v);
            }
        G.divideBasicBlock();
        G.propagateSparseConditionalConstant(true);
        EXPECT_EQ(verifySSA(G), "") << DeadArm;
        EXPECT_TRUE(R.silent());
    }
}

TEST(DeadCode, ParallelEdgesOfADeadNodeAreCountedWithTheFirstInPlace) {
    Program P;
    P.input("u");
    leda::node Entry = P.entry("#main"), a = P.block("d=0; x=1; ? d"), Dead = P.block("? u"),
               b = P.block("x=2; ? u"), c = P.block("x=3;"), Join = P.block("y=x;");
    P.edge(Entry, a);
    P.trueEdge(a, Dead);
    P.falseEdge(a, b);
    P.trueEdge(Dead, Join); // operands 0 and 1
    P.falseEdge(Dead, Join);
    P.trueEdge(b, c);
    P.falseEdge(b, Join); // operand 2
    P.edge(c, Join);      // operand 3
    P.propagate(true);
    EXPECT_EQ(operands(P), "[1 3]"); // the second removal took the operand one further on
}

TEST(DeadCode, ADeadCallTakesItsArgumentsAlong) {
    Program P(
        "proc main { d = 0; x = 1; if d { x = 2; call f; } x = 1; call f; } proc f { y = x; }");
    P.propagate(true);
    EXPECT_EQ(P.calls().size(), 1u);
    for (ZfCCfgParamStatement* pParam : P.procedure("f")->getParamStatements())
        EXPECT_EQ(pParam->countParamExpressions(), 1);
    EXPECT_NE(P.valuesOf("y").find("1"), std::string::npos);
    EXPECT_EQ(verifySSA(P.graph()), "");
}

TEST(UnusedDefinitions, GoInChainsUnlessSomethingKeepsThem) {
    struct {
        char const* Text;
        char const* Kept;
    } Rows[] = {
        {"x = 1; y = x; z = y;", ""},
        {"x = 1; o = x;", "x o"},
        {"x = 1; x = 2; o = x;", "x o"},
        {"s = x + 1; t = s;", ""},
        {"if u { x = 1; } else { x = 2; }", ""},
        {"while i < 3 { i = i + 1; x = x + 1; } o = i;", "i x o"}, // a ring of uses keeps itself
        {"x = 1; fixed = x;", "x fixed"},
        {"x = 1; a = x;", "x a"},
        {"x = 1; e = x;", "x e"},
    };
    for (auto& Row : Rows) {
        Program P(std::string("proc main { ") + Row.Text + " }");
        P.output("o");
        P.input("u");
        P.var("a")->markAsArray();
        for (auto& Item : P.statements())
            if (Item.second->isAssignment() && Item.second->isAssignment()->getLHS() == P.var("e"))
                static_cast<Expression*>(Item.second->isAssignment()->getRHS())->SideEffects = true;
        P.propagate(true);
        Reports R(true);
        P.graph().removeUnusedVarDefs();
        EXPECT_TRUE(R.silent()) << Row.Text;
        std::string Kept;
        for (auto& Item : P.statements())
            if (dynamic_cast<Assignment*>(Item.second) != nullptr)
                Kept +=
                    (Kept.empty() ? "" : " ") +
                    static_cast<Variable*>(originalOf(Item.second->isAssignment()->getLHS()))->Name;
        EXPECT_EQ(Kept, Row.Kept) << Row.Text;
        EXPECT_EQ(verifySSA(P.graph()), "") << Row.Text;
    }
}

// The order and the set of removals are those of sweeps over all nodes until nothing changes.
TEST(UnusedDefinitions, AChainAgainstNodeOrderGoesFromItsEnd) {
    Program P("proc main { x0 = 1; x1 = x0; x2 = x1; x3 = x2; }");
    P.propagate(false);
    int Removed = 0;
    for (auto& Item : P.statements())
        if (auto* pAssignment = dynamic_cast<Assignment*>(Item.second))
            pAssignment->pRemoved = &Removed;
    int Nodes = P.graph().number_of_nodes();
    P.graph().removeUnusedVarDefs();
    EXPECT_EQ(Removed, 4);
    EXPECT_EQ(P.graph().number_of_nodes(), Nodes); // the nodes stay, empty
    EXPECT_EQ(P.statements().size(), 0u);
}

TEST(UnusedDefinitions, AUseOfAnAliasKeepsTheRealDefinition) {
    Program P("proc main { x = u; if x == 3 { o = x; } else { o = 0; } }");
    P.input("u");
    P.output("o");
    P.graph().insertValidConditionAssignments();
    P.propagate(true);
    P.graph().replaceConstantVariables(); // o = 3 leaves nothing that uses the alias
    P.graph().removeUnusedVarDefs();
    int Virtual = 0, Real = 0;
    for (auto& Item : P.statements())
        for (ZfCCfgVariable* pVar : Item.second->getDefinedVariables())
            if (originalOf(pVar) == P.var("x"))
                ++(Item.second->getIsVirtual() ? Virtual : Real);
    EXPECT_EQ(Virtual, 0);
    EXPECT_EQ(Real, 1); // the condition still reads it; the initial value is gone
}

} // namespace
} // namespace passes
