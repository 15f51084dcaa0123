#include <gtest/gtest.h>

#include "Generators/LibraryProgram.h"
#include "Oracles/Interpreter.h"
#include "Oracles/SSAVerifier.h"

namespace passes {
namespace {

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
        std::string Text = LibraryProgram(Run).text();
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
        Program P(LibraryProgram(11).text());
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
