#include "Graph/ProgramGraph.h"
#include "Language/Reader.h"
#include "Road/GraphDump.h"
#include "Road/RangeTable.h"
#include "Road/Statistics.h"

#include <gtest/gtest.h>

#include <sstream>

namespace {

using namespace hpn;

/// One program, read and taken through a sequence of passes with everything watching.
struct WatchedRun {
    explicit WatchedRun(const char* Text, PassSequence Passes = PassSequence::defaultOrder()) {
        Sources.add("test.hpn", Text);
        Diagnostics Messages(Sources);
        EXPECT_TRUE(readProgram(Sources, Messages, Source)) << Messages.print();
        ProgramGraph Graph(Source);
        PassRunner Runner(Graph);
        StatisticsObserver Counting;
        RangeObserver Watching;
        Runner.addObserver(Counting);
        Runner.addObserver(Watching);
        EXPECT_TRUE(Runner.run(Passes));
        Counts = Counting.getStatistics();
        for (const RangeRow& Row : Watching.getRows())
            Ranges += std::string(Row.pVariable->Name) + "=" +
                      (Row.NotTracked != nullptr ? "?" : Row.summary().toText()) + ";";
        Table = printRanges(Watching.getRows(), Sources);
    }

    SourceFiles Sources;
    Program Source;
    Statistics Counts;
    std::string Ranges;
    std::string Table;
};

PassSequence sequenceOf(const char* List) {
    PassSequence Result;
    std::string Message;
    EXPECT_TRUE(PassSequence::parse(List, Result, Message)) << Message;
    return Result;
}

TEST(RoadStatistics, CountsOnlyWhatMakesCode) {
    const WatchedRun Run("output uint8 o = 0; state uint8 s = 0;\n"
                         "proc main() { if (s == 3) { o = 1; f(); } else { o = 2; } s = s + 1; }\n"
                         "proc f() { o = 5; }\n"
                         "export proc g() { o = 7; }\n",
                         sequenceOf(""));
    const GraphCounts& Counts = Run.Counts.Before;
    EXPECT_EQ(Counts.Statements, 6u);
    EXPECT_EQ(Counts.Conditions, 1u);
    EXPECT_EQ(Counts.Procedures, 3u);
    EXPECT_EQ(Counts.Notes, 0u);
}

// Dividing blocks, boundary statements and phi functions change nodes, but none of the figures that
// stand for code.
TEST(RoadStatistics, FiguresOfCodeDoNotHangOnTheShapeOfTheGraph) {
    const WatchedRun Run("output uint8 o = 0; state uint8 s = 0; input uint8 i;\n"
                         "proc main() { while (s < 9) { s = s + 1; o = s; }\n"
                         "  if (i == 1) { s = 0; f(); } f(); o = s; }\n"
                         "proc f() { if (i == 2) { o = 1; } }\n",
                         sequenceOf("placeExitNodes,placeLoopAroundMain,transformToSSAForm,"
                                    "divideBasicBlock"));
    ASSERT_EQ(Run.Counts.Passes.size(), 4u);
    for (const Statistics::Record& Each : Run.Counts.Passes) {
        EXPECT_EQ(Each.After.Statements, Run.Counts.Before.Statements) << Each.PassName;
        EXPECT_EQ(Each.After.Conditions, Run.Counts.Before.Conditions) << Each.PassName;
        EXPECT_EQ(Each.After.Procedures, 2u) << Each.PassName;
        EXPECT_EQ(Each.After.Blocks, Run.Counts.Before.Blocks) << Each.PassName;
    }
    EXPECT_GT(Run.Counts.After.Nodes, Run.Counts.Before.Nodes);
}

TEST(RoadStatistics, EveryPassShowsWhatItDid) {
    const WatchedRun Run("output uint8 o = 0; output uint8 p = 0; state bool flag = false;\n"
                         "state uint8 unused = 0; input uint8 i; param bool ON = true;\n"
                         "proc main() {\n"
                         "  if (ON) { o = 1; } else { o = 2; }\n"
                         "  if (flag) { flag = false; } else { flag = i == 1; }\n"
                         "  unused = i == 4;\n"
                         "  if (flag) { p = 3; o = 4; } else { p = 3; o = 5; }\n"
                         "  once();\n"
                         "}\n"
                         "proc once() { p = p + 1; }\n");
    const Statistics& Counts = Run.Counts;
    EXPECT_EQ(Counts.ProceduresInlined, 1u);
    EXPECT_EQ(Counts.After.Procedures, 1u);
    EXPECT_EQ(Counts.ConditionAssignments, 4u); // both arms of both branches on the flag
    EXPECT_GE(Counts.Iterations, 2u); // the removal of the dead arm asks for another sweep
    EXPECT_GE(Counts.DeadNodesRemoved, 1u);
    EXPECT_GE(Counts.ConstantsFound, 3u);
    EXPECT_GE(Counts.UnusedDefinitionsRemoved, 1u);
    EXPECT_EQ(Counts.StatementsHoisted, 1u); // p = 3
    EXPECT_LT(Counts.After.Statements, Counts.Before.Statements);
    EXPECT_LT(Counts.After.Conditions, Counts.Before.Conditions);
    for (const Statistics::Record& Each : Counts.Passes)
        EXPECT_GE(Each.Figure, 1u) << Each.PassName << ": " << Each.What;
}

TEST(RoadStatistics, ProceduresKeptFromInliningAreNamedByCause) {
    const WatchedRun Run("output uint8 o = 0;\n"
                         "proc main() { f(3); }\n"
                         "proc f(uint8 n) { if (n > 0) { o = n; f(n - 1); } }\n"
                         "export proc g() { o = 7; }\n");
    EXPECT_EQ(Run.Counts.RecursiveProcedures, 1u);
    EXPECT_EQ(Run.Counts.ExportedProcedures, 1u);
    EXPECT_EQ(Run.Counts.ProceduresInlined, 0u);

    // What an exported procedure calls is reachable from outside as well, and stays.
    const WatchedRun Ring("output uint8 o = 0;\n"
                          "proc main() { f(3); }\n"
                          "proc f(uint8 n) { if (n > 0) { g(n - 1); } }\n"
                          "proc g(uint8 n) { if (n > 0) { o = n; f(n - 1); } }\n"
                          "export proc h() { k(); }\n"
                          "proc k() { o = 7; }\n");
    EXPECT_EQ(Ring.Counts.RecursiveProcedures, 2u);
    EXPECT_EQ(Ring.Counts.ExportedProcedures, 2u);
    EXPECT_EQ(Ring.Counts.ProceduresInlined, 0u);
}

// The program never comes round to the loop around main, so the probe's node goes as dead code.
TEST(RoadStatistics, EndlessProgramIsCountedWithoutHarm) {
    const WatchedRun Run("output uint8 o = 0; param bool ON = true;\n"
                         "proc main() { while (ON) { o = o + 1; } }\n");
    EXPECT_EQ(Run.Counts.After.Procedures, 1u);
    EXPECT_GE(Run.Counts.After.Statements, 1u);
}

TEST(RoadRanges, RangeIsOnlyClaimedWhereTheValueIsDetermined) {
    const WatchedRun Run("type T = uint8 range [0, 100] saturate;\n"
                         "input uint8 i; output uint8 o = 0; state T a = 0; state uint8 list[3];\n"
                         "param uint8 P = 4;\n"
                         "proc main() { a = i; list[0] = i; o = P; if (o == 5) { o = a; } }\n");
    EXPECT_NE(Run.Ranges.find("a=0 .. 100;"), std::string::npos) << Run.Ranges;
    EXPECT_NE(Run.Ranges.find("list=?;"), std::string::npos) << Run.Ranges;
    EXPECT_NE(Run.Ranges.find("P=4;"), std::string::npos) << Run.Ranges;
    EXPECT_NE(Run.Table.find("test.hpn:4"), std::string::npos) << Run.Table;
}

TEST(RoadRanges, SummaryClaimsNoMoreThanItsWeakestVersion) {
    const auto versionOf = [](Finding::Kind What, double Low, double High) {
        VersionFinding Result;
        Result.Found = {What, Low, High};
        return Result;
    };
    using Kind = Finding::Kind;
    const VersionFinding One = versionOf(Kind::Constant, 1, 1);
    const VersionFinding Two = versionOf(Kind::Constant, 2, 2);
    const VersionFinding Some = versionOf(Kind::Range, -3, 1);
    const VersionFinding Any = versionOf(Kind::Anything, 0, 0);
    const VersionFinding None = versionOf(Kind::Undetermined, 0, 0);
    struct Case {
        std::vector<VersionFinding> Versions;
        const char* Text;
    };
    const Case Cases[] = {
        {{}, "undetermined"},          {{One, One}, "1"},         {{One, Two}, "1 .. 2"},
        {{One, Some}, "-3 .. 1"},      {{Some, Any, One}, "any"}, {{None, One}, "undetermined"},
        {{Any, None}, "undetermined"},
    };
    for (const Case& Each : Cases) {
        RangeRow Row;
        Row.Versions = Each.Versions;
        EXPECT_EQ(Row.summary().toText(), Each.Text);
    }
}

// Every kind of term, and one so deep that a recursive writer would run out of stack.
TEST(RoadDump, TermsAreWrittenWholeAtAnyDepth) {
    TermArena Arena;
    Term* pNumber = Arena.makeNumber(0.1);
    std::ostringstream Text;
    writeTerm(Arena.makeBinary(Operator::Maximum,
                               Arena.makeUnary(Operator::Negate, Arena.makeNumber(2)), pNumber),
              Text);
    EXPECT_EQ(Text.str(), "(-(2) max 0.1)");

    Term* pDeep = Arena.makeNumber(1);
    for (int Depth = 0; Depth < 500000; ++Depth)
        pDeep = Arena.makeBinary(Operator::Add, pDeep, Arena.makeNumber(1));
    std::ostringstream DeepText;
    writeTerm(pDeep, DeepText);
    EXPECT_EQ(DeepText.str().size(), 500000u * 6u + 1u);
}

} // namespace
