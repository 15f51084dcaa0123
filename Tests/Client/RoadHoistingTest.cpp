// Equal code in both arms of a branch: what moves in front of it and what must not.

#include "Oracles/ProgramComparison.h"
#include "Road/Statistics.h"

#include <gtest/gtest.h>

namespace {

using namespace hpn;

const char* const Declarations =
    "input uint8 i; output uint8 o = 0; output uint8 p = 0; state uint8 s = 3;\n"
    "state uint8 t = 0; state uint8 list[4]; extern e reads(o) writes(t);\n"
    "proc f(uint8 n) { o = o + n; p = i; }\nproc g() { e(); o = 5; }\n"
    "proc keep() { f(9); f(8); g(); }\n";

struct Case {
    const char* Name;
    const char* Body;
    std::size_t Hoisted;
};

const Case Cases[] = {
    {"one, then different ones", "s = i; if (s > 3) { p = s; o = 1; } else { p = s; o = 2; }", 1},
    {"three, in their order",
     "s = i; if (s > 3) { p = s; p = p + 1; o = p; t = 1; } else { p = s; p = p + 1; o = p; }", 3},
    {"different numbers", "s = i; if (s > 3) { p = 1; } else { p = 2; }", 0},
    {"equal ones behind different ones",
     "s = i; if (s > 3) { o = 1; p = s; } else { o = 2; p = s; }", 0},
    {"what the condition reads", "s = i; if (s > 3) { s = 1; o = 1; } else { s = 1; o = 2; }", 0},
    {"a condition that reads an input", "if (i > 3) { p = s; o = 1; } else { p = s; o = 2; }", 0},
    {"reads of inputs keep their order",
     "s = i; if (s > 3) { p = i; o = i; } else { p = i; o = i; t = 3; }", 2},
    {"an element of an array",
     "s = i; if (s > 3) { list[s] = 4; o = 1; } else { list[s] = 4; o = 2; } p = list[3];", 1},
    {"an element of the array that the condition reads",
     "s = i; if (list[s] > 3) { list[s] = 4; o = 1; } else { list[s] = 4; o = 2; }", 0},
    {"a call with equal arguments", "s = i; if (s > 3) { f(s); p = 1; } else { f(s); p = 2; }", 1},
    {"a call with different arguments", "s = i; if (s > 3) { f(1); } else { f(2); }", 0},
    {"a call whose extern writes what the condition reads",
     "if (t > 3) { g(); p = 1; } else { g(); p = 2; }", 0},
    {"an arm with a condition of its own",
     "s = i; if (s > 3) { if (s > 5) { p = 1; } o = 7; } else { p = 1; o = 7; }", 0},
    {"no second arm", "s = i; if (s > 3) { p = 1; } o = s;", 0},
    {"a Boolean's branch, with notes in its arms",
     "local bool b = i > 3; if (b) { o = 1; p = 4; } else { o = 1; p = 5; }", 1},
};

std::string textOf(const Case& Each) {
    return std::string(Declarations) + "proc main() { " + Each.Body + " keep(); }\n";
}

TEST(RoadHoisting, EqualStatementsMoveAsFarAsTheConditionAllows) {
    for (const Case& Each : Cases) {
        SourceFiles Sources;
        const std::string Text = textOf(Each);
        Sources.add("test.hpn", Text);
        Diagnostics Messages(Sources);
        Program Source;
        ASSERT_TRUE(readProgram(Sources, Messages, Source)) << Messages.print();
        ProgramGraph Graph(Source);
        StatisticsObserver Counting;
        PassRunner Runner(Graph);
        Runner.addObserver(Counting);
        ASSERT_TRUE(Runner.run(PassSequence::defaultOrder()));
        EXPECT_EQ(Counting.getStatistics().StatementsHoisted, Each.Hoisted) << Each.Name;
    }
}

TEST(RoadHoisting, MovedStatementsKeepTheOutputs) {
    ProgramComparison Comparison;
    for (const Case& Each : Cases) {
        std::string Messages;
        ASSERT_TRUE(Comparison.add(textOf(Each), PassSequence::defaultOrder(), Messages))
            << Messages;
    }
    CRunner Runner;
    Runner.write("all.c", Comparison.text(400));
    ASSERT_EQ(Runner.compile("all", "-O0 -include hpn_runtime.h -Wno-unused-function"), "");
    EXPECT_EQ(Runner.run("all"), "");
}

} // namespace
