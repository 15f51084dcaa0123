#include <gtest/gtest.h>

#include <random>

#include "Oracles/Interpreter.h"
#include "Oracles/SSAVerifier.h"

namespace passes {
namespace {

// Random programs: nested branches and counted loops over a few variables, and calls of procedures
// with higher numbers.
class Generator {
public:
    explicit Generator(unsigned int Seed) : m_Random(Seed) {}

    std::string program() {
        m_Procedures = 1 + int(m_Random() % 4);
        std::string Text;
        for (m_Current = 0; m_Current < m_Procedures; ++m_Current)
            Text += "proc " +
                    (m_Current == 0 ? std::string("main { o1 = o1; o2 = o2; ")
                                    : "p" + std::to_string(m_Current) + " { ") +
                    statements(3) + "} ";
        return Text;
    }

private:
    int pick(int Count) { return int(m_Random() % unsigned(Count)); }
    std::string variable() {
        static char const* const Names[] = {"a", "b", "c", "s", "f", "o1", "o2"};
        return Names[pick(7)];
    }
    std::string operand() {
        int Kind = pick(8);
        return Kind < 3    ? std::to_string(pick(4))
               : Kind == 3 ? (pick(2) ? "in1" : "in2")
                           : variable();
    }
    std::string expression() {
        static char const* const Operators[] = {"+", "-", "*", "<", "==", "!=", "&", "|"};
        std::string Text = pick(6) == 0 ? "!" + operand() : operand();
        for (int Count = pick(3); Count > 0; --Count)
            Text += std::string(" ") + Operators[pick(8)] + " " + operand();
        return Text;
    }
    // Conditions are often of a form that tells something, or known.
    std::string condition() {
        switch (pick(5)) {
        case 0:
            return variable() + " == " + std::to_string(pick(3));
        case 1:
            return variable() + " != " + std::to_string(pick(3));
        case 2:
            return pick(2) ? "f" : "!f";
        case 3:
            return pick(2) ? "0" : "1";
        default:
            return expression();
        }
    }
    std::string statements(int Depth) {
        std::string Text;
        for (int Count = pick(5); Count > 0; --Count)
            Text += statement(Depth);
        return Text;
    }
    std::string statement(int Depth) {
        int Kind = pick(Depth > 0 ? 10 : 5);
        if (Kind < 5)
            return variable() + " = " + expression() + "; ";
        if (Kind < 7)
            return "if " + condition() + " { " + statements(Depth - 1) + "} else { " +
                   statements(Depth - 1) + "} ";
        if (Kind == 7) {
            std::string Counter = "i" + std::to_string(m_Loops++);
            return Counter + " = 0; while " + Counter + " < " + std::to_string(pick(4)) + " { " +
                   Counter + " = " + Counter + " + 1; " + statements(Depth - 1) + "} ";
        }
        if (Kind == 8)
            return "extern " + variable() + "; ";
        return m_Current + 1 < m_Procedures
                   ? "call p" + std::to_string(m_Current + 1 + pick(m_Procedures - m_Current - 1)) +
                         "; "
                   : "";
    }

    std::mt19937 m_Random;
    int m_Procedures = 0;
    int m_Current = 0;
    int m_Loops = 0;
};

void declare(Program& P) {
    P.output("o1");
    P.output("o2");
    P.input("in1");
    P.input("in2");
    P.boolean("f");
    P.var("s")->Limit = 3;
}

std::string outputs(Program& P) {
    std::string Text;
    for (unsigned int Seed = 0; Seed < 3; ++Seed)
        for (int Passes = 1; Passes <= 3; ++Passes)
            Text += Interpreter(P, Seed, Passes).run() + "\n";
    return Text;
}

// The whole road on random programs: the form holds after every pass, and the outputs stay the
// same.
TEST(Road, RandomProgramsKeepTheirOutputsAndTheForm) {
    int Removed = 0, Folded = 0;
    for (unsigned int Run = 0; Run < 400; ++Run) {
        std::string Text = Generator(Run).program();
        bool Inlines = Run % 2 == 0, TellsConditions = Run % 3 != 0, RemovesDeadCode = Run % 5 != 0;
        SCOPED_TRACE("run " + std::to_string(Run) + ": " + Text);
        Program P(Text);
        declare(P);
        ZfCControlFlowGraph& G = P.graph();
        Reports R(true);
        G.placeExitNodes();
        if (!Inlines)
            P.registerCalls();
        // The loop first, so that both runs go round it; inlining is held against the same outputs.
        G.placeLoopAroundMain();
        std::string Expected = outputs(P);
        if (Inlines) {
            G.inlineProcedures();
            ASSERT_EQ(outputs(P), Expected) << "inlining";
        }
        if (TellsConditions)
            G.insertValidConditionAssignments();
        G.transformToSSAForm();
        ASSERT_EQ(verifySSA(G), "") << "transformation";
        ASSERT_EQ(outputs(P), Expected) << "transformation";
        G.divideBasicBlock();
        ASSERT_EQ(verifySSA(G), "") << "division";
        int Nodes = G.number_of_nodes();
        G.propagateSparseConditionalConstant(RemovesDeadCode);
        Removed += Nodes - G.number_of_nodes();
        ASSERT_EQ(verifySSA(G), "") << "propagation";
        ASSERT_EQ(outputs(P), Expected) << "propagation";
        G.replaceConstantConditions();
        G.replaceConstantVariables();
        G.foldConstants();
        ASSERT_EQ(outputs(P), Expected) << "constants";
        std::size_t Statements = P.statements().size();
        G.removeUnusedVarDefs();
        Folded += int(Statements - P.statements().size());
        ASSERT_EQ(verifySSA(G), "") << "unused definitions";
        ASSERT_EQ(outputs(P), Expected) << "unused definitions";
        G.hoistCodeOutOfIfElseBranches();
        ASSERT_EQ(outputs(P), Expected) << "hoisting";
        ASSERT_TRUE(R.silent());
    }
    EXPECT_GT(Removed, 1000); // the programs give the passes something to do
    EXPECT_GT(Folded, 1000);
}

// Nothing recurses over the size of the program: a path of many nodes, and a chain of nested loops'
// ends.
TEST(Road, ALongStraightProcedurePassesOnAnOrdinaryStack) {
    Program P;
    constexpr int Length = 200000;
    leda::node Last = P.entry("#main");
    for (int i = 0; i < Length; ++i) {
        leda::node v = P.block(i % 2 ? "x = x + 1;" : "y = 1;");
        P.edge(Last, v);
        Last = v;
    }
    P.output("x");
    P.propagate(true, true);
    EXPECT_EQ(verifySSA(P.graph()), "");
    P.graph().removeUnusedVarDefs();
    EXPECT_EQ(P.statements().size(),
              std::size_t(Length / 2 + 3)); // the increments, a phi function, initial value, output
}

// The numbers that dumps show do not hang on the addresses of a run.
TEST(Road, TwoRunsGiveTheSameNumbers) {
    std::string Runs[2];
    for (std::string& Text : Runs) {
        auto Shift = std::make_unique<char[]>(
            Text.data() == Runs[1].data() ? 100000 : 10); // other addresses
        Program P(Generator(11).program());
        declare(P);
        P.propagate(true, true);
        for (auto& Item : P.statements()) {
            Text += std::to_string(P.graph().index(Item.first)) + ":" +
                    std::to_string(Item.second->getIndex());
            for (ZfCCfgVariable* pVar : Item.second->getUsedVariables())
                Text += "," + std::to_string(pVar->getIndex());
            Text += " ";
        }
    }
    EXPECT_FALSE(Runs[0].empty());
    EXPECT_EQ(Runs[0], Runs[1]);
}

} // namespace
} // namespace passes
