#include "Generators/FlowPrograms.h"
#include "Oracles/StructureRun.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace hpn {
namespace {

using namespace test;

TEST(EmitterStructure, KnownShapesComeBack) {
    const struct {
        const char* pExpected;
        std::vector<FlowNode> Nodes;
    } Cases[] = {
        // Branches: no empty else, negation where only the other arm has code, chains flat.
        {"if(0){ A1 } A2", {branch(1, 2), code(2), code(Out)}},
        {"if(!0){ A1 } A2", {branch(2, 1), code(2), code(Out)}},
        {"if(0){ A1 else{ A2 } A3", {branch(1, 2), code(3), code(3), code(Out)}},
        {"if(0){ A1 else if(2){ A3 else{ A4 }",
         {branch(1, 2), code(Out), branch(3, 4), code(Out), code(Out)}},
        // What a loop is left for stands behind it.
        {"while(!0){ A2 if(2){ A3 } A4 } A1",
         {branch(1, 2), code(Out), codeAndBranch(3, 4), code(4), code(0)}},
        // Loops.
        {"A0 while(1){ A2 } A3", {code(1), branch(2, 3), code(1), code(Out)}},
        {"while(!0){ A1 }", {branch(Out, 1), code(0)}},
        {"while(0){ }", {branch(0, Out)}},
        {"do{ A0 }while(0) A1", {codeAndBranch(0, 1), code(Out)}},
        {"do{ A0 if(0){ A1 } }while(2)", {codeAndBranch(1, 2), code(2), branch(0, Out)}},
        {"for{ A0 }", {code(0)}},
        {"for{ A0 if(0){ break } A1 } A2", {codeAndBranch(2, 1), code(0), code(Out)}},
        // Leaving a loop from the middle, with and without code of its own.
        {"while(0){ A1 if(1){ break } A2 } A3",
         {branch(1, 3), codeAndBranch(3, 2), code(0), code(Out)}},
        {"while(0){ A1 if(1){ A4 break } A2 } A3",
         {branch(1, 3), codeAndBranch(4, 2), code(0), code(Out), code(3)}},
        // A case that falls into the next one.
        {"if(0){ A1 else if(!2){ A4 return } A3 A5",
         {branch(1, 2), code(3), branch(3, 4), code(5), code(Out), code(Out)}},
        // Two entries into a cycle: only a goto can do that.
        {"if(0){ goto L1 } L2: A2 if(!2){ return } L1: A1 goto L2",
         {branch(1, 2), code(2), codeAndBranch(1, Out)}},
    };
    for (const auto& Case : Cases)
        EXPECT_EQ(textOf(Case.Nodes), Case.pExpected);
}

void expectSameBehaviour(const std::vector<FlowNode>& Nodes, unsigned Seed) {
    TextRun Text(structureFlow(Nodes));
    for (unsigned Run = 0; Run < 8; ++Run)
        ASSERT_EQ(Text.run(Seed * 8 + Run, 60), traceOf(Nodes, Seed * 8 + Run, 60))
            << "seed " << Seed << ": " << textOf(Nodes);
}

TEST(EmitterStructure, RandomGraphsRunAsTheirText) {
    for (unsigned Seed = 0; Seed < 4000; ++Seed)
        expectSameBehaviour(randomFlow(Seed), Seed);
}

TEST(EmitterStructure, StructuredProgramsNeedNoGoto) {
    int WithLoops = 0;
    for (unsigned Seed = 0; Seed < 2000; ++Seed) {
        const std::vector<FlowNode> Nodes = StructuredFlow(Seed).take();
        expectSameBehaviour(Nodes, Seed);
        const std::string Text = textOf(Nodes);
        WithLoops += Text.find("while") != std::string::npos;
        EXPECT_EQ(Text.find("goto"), std::string::npos) << Seed << ": " << Text;
    }
    EXPECT_GT(WithLoops, 500);
}

TEST(EmitterStructure, LongAndDeepFlowNeedsNoStack) {
    std::vector<FlowNode> Straight;
    std::vector<FlowNode> Deep;
    constexpr int Size = 200000;
    for (int i = 0; i < Size; ++i) {
        // Every second node may be passed over; the deep one nests each branch in the one before.
        Straight.push_back(i + 2 < Size ? codeAndBranch(i + 1, i + 2)
                                        : code(i + 1 < Size ? i + 1 : Out));
        Deep.push_back(i + 1 < Size ? codeAndBranch(i + 1, Out) : code(Out));
    }
    EXPECT_GE(structureFlow(Straight).size(), static_cast<std::size_t>(Size));
    EXPECT_GE(structureFlow(Deep).size(), static_cast<std::size_t>(Size));
}

} // namespace
} // namespace hpn
