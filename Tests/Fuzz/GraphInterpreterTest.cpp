#include "FuzzTestSupport.h"

#include "CodeHarness.h"
#include "Oracles/HostShell.h"

#include <filesystem>
#include <gtest/gtest.h>

using namespace hpn::fuzz;
using namespace hpn::fuzz::test;

namespace {

struct Case {
    const char* Name;
    const char* Text;
    std::vector<double> Outputs; // of three steps
};

// Numbers worked out by hand.
const Case Cases[] = {
    // States last from step to step, stores wrap, clip and round.
    {"counting", "output uint8 o = 254; proc main() { o++; }", {255, 0, 1}},
    {"clipping",
     "type T = uint8 range [0, 3] saturate; output T o = 2; proc main() { o = o + 1; }",
     {3, 3, 3}},
    {"grid", "type T = int16 lsb 0.5; output T o; proc main() { o = o + 0.3; }", {0.5, 1, 1.5}},
    // Short circuits leave out what is not needed; `||` knows only 1 as true.
    {"truth",
     "output float64 a; output float64 b; proc main() { a = 2 || 3; b = 2 && 3; }",
     {0, 1, 0, 1, 0, 1}},
    // Arguments go by value, results come through a variable of the procedure, locals begin at 0
    // whenever they are declared.
    {"calls",
     "output int32 o; proc int32 f(int32 a) { a = a + 1; local int32 l; l = l + a; return l; } "
     "proc main() { o = f(o); }",
     {1, 2, 3}},
    // Each activation has its own formals and locals.
    {"recursion",
     "output int32 o; proc int32 f(int32 n) { local int32 own = n; if (n <= 1) { return 1; } local "
     "int32 r = 0; r = f(n - 1); "
     "return own * r; } proc main() { o = f(4); }",
     {24, 24, 24}},
    {"flow",
     "output int32 o; proc main() { o = 0; local int32 i; for (i = 0; i < 9; i++) { if (i == 2) { "
     "continue; } if (i > 4) { break; } o += i; } "
     "switch (o) { case 8: o = 100; case 1: o++; break; default: o = -1; } goto end; o = 7; end: "
     "o++; }",
     {102, 102, 102}},
    {"elements",
     "output uint8 o[2]; proc main() { o[-3]++; o[9] = o[0] * 2; }",
     {1, 2, 2, 4, 3, 6}},
};

TEST(GraphInterpreter, DoesWhatTheLanguageSays) {
    for (const Case& Each : Cases)
        EXPECT_EQ(Each.Outputs, outputsOf(Each.Text, 3)) << Each.Name;
}

// An endless loop is cut off, and what it did until then still counts.
TEST(GraphInterpreter, BudgetEndsALoopThatDoesNot) {
    hpn::fuzz::test::BuiltProgram Built("input uint8 i; output uint8 o; extern e reads(o); proc "
                                        "main() { o++; e(); while (o == 3) { e(); } }");
    ASSERT_TRUE(Built.IsRead) << Built.Messages;
    hpn::ProgramGraph Graph(Built.Source);
    const GraphCode Code = readGraph(Graph);
    RunOptions Options;
    Options.Steps = 5;
    const Trace Whole = GraphInterpreter(Code, Built.Source).run(Options);
    EXPECT_TRUE(Whole.IsExhausted);
    EXPECT_EQ(2u, Whole.CompleteSteps);
    Options.Budget = 100;
    const Trace Shorter = GraphInterpreter(Code, Built.Source).run(Options);
    EXPECT_LT(Shorter.Events.size(), Whole.Events.size());
    EXPECT_EQ("", Whole.compare(Shorter, Built.Source));
    Options.Steps = 1;
    EXPECT_NE("", GraphInterpreter(Code, Built.Source).run(Options).compare(Trace(), Built.Source));
}

// The interpreter and the emitted C agree, bit for bit, on programs of every kind.
TEST(GraphInterpreter, AgreesWithTheCompilerOnEmittedCode) {
    CodeBatch Batch;
    for (const Case& Each : Cases) {
        Trial Wanted = trialOf(Each.Text);
        Wanted.WantsCode = true;
        Wanted.CodePrefix = CodeBatch::prefixOf(Batch.size());
        TrialResult Result = runTrial(Wanted);
        ASSERT_EQ("", Result.Failed.Kind) << Each.Name << ": " << Result.Failed.Detail;
        Batch.add(Each.Name, std::move(Result.Code));
    }
    const std::string Directory = hostshell::makeDirectory("hpn-fuzz");
    ASSERT_NE("", Directory);
    EXPECT_EQ("", Batch.run(Directory, HPNSSA_SOURCE_DIR "/CodeGenerator/Runtime"));

    // And the comparison notices a variant that does something else.
    Trial Wanted = trialOf("output uint8 o; proc main() { o = 5; }");
    Wanted.WantsCode = true;
    Wanted.CodePrefix = CodeBatch::prefixOf(0);
    TrialResult Result = runTrial(Wanted);
    const std::size_t Place = Result.Code.Optimised.rfind("= 5");
    ASSERT_NE(std::string::npos, Place) << Result.Code.Optimised;
    Result.Code.Optimised.replace(Place, 3, "= 6");
    Batch.add("changed", std::move(Result.Code));
    EXPECT_NE(std::string::npos, Batch.run(Directory, HPNSSA_SOURCE_DIR "/CodeGenerator/Runtime")
                                     .find("changed\nvariant b"));
    std::filesystem::remove_all(Directory);
}

} // namespace
