// Random programs through the passes: whatever ran, the graph read by original variables writes the
// same outputs as the syntax tree.

#include "Generators/GraphRandomProgram.h"
#include "Generators/ModelTestNumbers.h"
#include "Model/HoistingContext.h"
#include "Oracles/TreeRunner.h"

#include <gtest/gtest.h>

namespace {

using namespace hpn;
using namespace hpn::test;

constexpr int Steps = 4;
constexpr unsigned Programs = 800;

World runTree(const Program& Tree, unsigned Seed) {
    World In(Seed);
    TreeRunner Runner(In);
    for (int i = 0; i < Steps; ++i)
        Runner.call(*Tree.pMain);
    return In;
}

World runGraph(ProgramGraph& Graph, unsigned Seed, bool HasLoop) {
    World In(Seed);
    for (int i = 0; i < (HasLoop ? 1 : Steps); ++i)
        GraphRunner(Graph, In, Steps).call("#main");
    return In;
}

void expectSameOutputs(const World& Expected, const World& Seen, unsigned Seed) {
    ASSERT_EQ(Expected.Written.size(), Seen.Written.size()) << "program " << Seed;
    for (std::size_t i = 0; i < Seen.Written.size(); ++i) {
        ASSERT_EQ(Expected.Written[i].first, Seen.Written[i].first)
            << "program " << Seed << ", output " << i;
        ASSERT_TRUE(isSameNumber(Expected.Written[i].second, Seen.Written[i].second))
            << "program " << Seed << ", output " << i << ": " << Expected.Written[i].second << ", "
            << Seen.Written[i].second;
    }
    // As many reads of inputs, too: the next number is the same.
    auto Left = Expected.Inputs;
    auto Right = Seen.Inputs;
    EXPECT_EQ(Left(), Right()) << "program " << Seed;
}

enum Choice { WithInlining = 1, WithConditions = 2, WithRemoval = 4, WithHoisting = 8 };

std::size_t runRoad(ProgramGraph& Program, unsigned Choices) {
    ZfCControlFlowGraph& Graph = Program.getGraph();
    Graph.placeExitNodes();
    if ((Choices & WithInlining) != 0)
        Graph.inlineProcedures();
    else
        Program.appendCalls();
    Graph.placeLoopAroundMain();
    if ((Choices & WithConditions) != 0)
        Graph.insertValidConditionAssignments();
    Graph.transformToSSAForm();
    Graph.divideBasicBlock();
    Graph.propagateSparseConditionalConstant(true);
    Graph.replaceConstantConditions();
    Graph.replaceConstantVariables();
    Graph.foldConstants();
    if ((Choices & WithRemoval) != 0)
        Graph.removeUnusedVarDefs();
    if ((Choices & WithHoisting) == 0)
        return 0;
    HoistingContext Context(Graph);
    Graph.hoistCodeOutOfIfElseBranches();
    return Context.countMoved();
}

TEST(GraphPasses, TheGraphAsBuiltDoesWhatTheTreeSays) {
    for (unsigned Seed = 0; Seed < Programs; ++Seed) {
        const RandomProgram Made(Seed);
        ProgramGraph Graph(Made.Tree);
        expectSameOutputs(runTree(Made.Tree, Seed), runGraph(Graph, Seed, false), Seed);
        if (HasFatalFailure())
            return;
    }
}

TEST(GraphPasses, EveryChoiceOfPassesKeepsTheOutputs) {
    std::size_t Hoisted = 0;
    for (unsigned Seed = 0; Seed < Programs; ++Seed) {
        const RandomProgram Made(Seed);
        ProgramGraph Graph(Made.Tree);
        Hoisted += runRoad(Graph, Seed % 16);
        expectSameOutputs(runTree(Made.Tree, Seed), runGraph(Graph, Seed, true), Seed);
        if (HasFatalFailure())
            return;
    }
    EXPECT_GT(Hoisted, 100U);
}

} // namespace
