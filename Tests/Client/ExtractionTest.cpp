// Labels that become procedures, and those that must not.

#include "Generators/RandomProgram.h"
#include "Graph/LabelExtraction.h"
#include "Oracles/GraphShape.h"
#include "Oracles/ProgramComparison.h"
#include "Road/Statistics.h"

#include <gtest/gtest.h>

namespace {

using namespace hpn;

const char* const Declarations = "input uint8 i; input uint8 k; output uint8 o = 0;\n"
                                 "output uint8 p = 0; state uint8 s = 3; state uint8 t = 0;\n"
                                 "param bool OFF = false;\n";

/// What extraction makes of a program: the procedures' readable names, and `line:name why` for each
/// refused label.
struct Extracted {
    explicit Extracted(const std::string& Text) {
        Sources.add("test.hpn", Text);
        Diagnostics Messages(Sources);
        EXPECT_TRUE(readProgram(Sources, Messages, Source)) << Messages.print();
        ProgramGraph Program(Source);
        LabelExtraction(Program).run();
        EXPECT_EQ(test::shapeFaults(Program), "");
        ZfCControlFlowGraph& Graph = Program.getGraph();
        for (leda::node v : Graph.all_nodes()) {
            const std::string Name = Graph[v]->getProcedure()->getName().cstring();
            if (Graph[v]->isEntryNode() != nullptr && Program.readableNameOf(Name) != Name)
                Procedures += Program.readableNameOf(Name) + " ";
            ZfCBasicBlock* pBlock = Graph[v]->isBasicBlock();
            ZfCCfgStatement* pStatement = pBlock != nullptr ? pBlock->isStatement() : nullptr;
            ZfCCfgProcedureCall* pCall =
                pStatement != nullptr ? pStatement->isProcedureCall() : nullptr;
            if (pCall != nullptr && pCall->isSFProcedureCall() == nullptr) {
                ++Calls;
                FlaggedCalls += pCall->isCallToDirectlyOrIndirectlyFromOutsideCallableFcn();
            }
        }
        for (const Remark& Each : Program.getRemarks())
            Remarks += std::to_string(Sources.locate(Each.Position).Line) + " " + Each.Text;
    }

    SourceFiles Sources;
    Program Source;
    std::string Procedures;
    std::string Remarks;
    int Calls = 0;
    int FlaggedCalls = 0;
};

struct Case {
    const char* Name;
    const char* Text;
    const char* Procedures; ///< in the order of their making
    int Calls;
    const char* Remark; ///< a part of it; "": none
};

const Case Cases[] = {
    {"two gotos",
     "proc main() { if (i == 1) { o = 1; goto L; } if (k == 1) { goto L; }\n"
     "o = 2; return; L: p = o + s; s = i; }",
     "main_L ", 2, ""},
    {"a goto and what stands in front",
     "proc main() { if (i == 1) { goto L; } o = 2; L: p = p + o; }", "main_L ", 2, ""},
    {"one way in only", "proc main() { if (i == 1) { goto L; } o = 2; return; L: p = 7; }", "", 0,
     ""},
    {"both arms of a branch",
     "proc main() { if (OFF) { s = 9; if (i == 1) { goto L; } else { goto "
     "L; } } s = 4; L: o = s; }",
     "main_L ", 3, ""},
    {"a label that leads to another",
     "proc main() { local uint8 x = i; if (x == 1) { goto A; } if (x == 2) { goto B; } if (x == 3) "
     "{ goto A; }\no = 9; goto B; A: o = x; s = x; B: p = s; t = x; o = o + t; }",
     "main_B main_A ", 5, ""},
    {"a label inside an arm, whose join is shared as well",
     "proc main() { if (i == 1) { goto L; } if (i == 2) { goto L; }\n"
     "if (k == 1) { o = 1; L: o = o + 2; } else { o = 3; } p = o; }",
     "main_L main_shared ", 5, ""},
    {"a loop behind the label",
     "proc main() { local uint8 n = 0; if (i == 1) { n = 4; goto L; }\n"
     "o = 2; L: while (n < 9) { n = n + 1; o = o + n; } p = n; }",
     "main_L ", 2, ""},
    {"an endless loop behind the label",
     "proc main() { if (i == 1) { goto L; } o = 2; L: s = 1; if (OFF) { while (true) { o = o + 1; "
     "} } p = 1; }",
     "main_L ", 2, ""},
    {"a call in front of the goto",
     "proc main() { if (i == 1) { f(i); goto L; } f(3); o = 2; L: p = p + s; f(p); }\n"
     "proc f(uint8 n) { s = s + n; }",
     "main_L ", 2, ""},
    {"results, formals and locals that both sides use",
     "proc main() { o = f(i, 3); p = f(k, o); }\n"
     "proc uint8 f(uint8 a, uint8 b) { local uint8 x = a + 1; if (a > 9) { x = 2; goto L; }\n"
     "if (b > 8) { return a; } if (b == 3) { goto L; } x = x + b; L: x = x + a; return x; }",
     "f_L ", 3, ""},
    {"a procedure that the outside calls",
     "proc main() { o = s; p = t; }\n"
     "export proc uint8 g(uint8 a) { if (a > 9) { goto L; } s = a; L: t = s + a; return t; }",
     "g_L ", 2, ""},
    {"its own region jumps back",
     "proc main() { local uint8 n = 0; if (i == 1) { n = 5; goto L; }\n"
     "L: n = n + 1; if (n < 8) { goto L; } o = n; }",
     "", 0, "2 label 'L' stays a label: the code behind it jumps back to it"},
    {"a loop that is entered in its middle",
     "proc main() { local uint8 n = i; if (i == 1) { goto M; } if (i == 2) { goto L; }\n"
     "o = 1; L: p = 2;\nwhile (n < 9) { M: n = n + 1; } o = n; }",
     "", 0, "2 label 'L' stays a label: a loop behind it is also entered from elsewhere"},
    {"nothing behind the label",
     "proc main() { if (i == 1) { goto L; } if (i == 2) { goto L; } o = 3;\nL: }", "", 0,
     "2 label 'L' stays a label: nothing is left to do"},
    {"a procedure that calls itself",
     "proc main() { f(i % 8); }\nproc f(uint8 n) { local uint8 x = n; if (n == 0) { goto L; } if "
     "(n == 3) { goto L; } f(n - 1); L: o = o + x; }",
     "", 0, "2 label 'L' stays a label: its procedure calls itself"},
};

TEST(Extraction, SharedLabelsBecomeProceduresWhereNoLoopWouldBecomeARecursion) {
    for (const Case& Each : Cases) {
        SCOPED_TRACE(Each.Name);
        const Extracted Result(std::string(Each.Text) + "\n" + Declarations);
        EXPECT_EQ(Result.Procedures, Each.Procedures);
        EXPECT_EQ(Result.Calls, Each.Calls);
        if (*Each.Remark == '\0')
            EXPECT_EQ(Result.Remarks, "");
        else
            EXPECT_NE(Result.Remarks.find(Each.Remark), std::string::npos) << Result.Remarks;
        const bool IsExported = std::string(Each.Text).find("export") != std::string::npos;
        EXPECT_EQ(Result.FlaggedCalls, IsExported ? Each.Calls : 0);
    }
}

void expectSameOutputs(const ProgramComparison& Comparison) {
    CRunner Runner;
    Runner.write("all.c", Comparison.text(400));
    ASSERT_EQ(Runner.compile("all", "-O0 -include hpn_runtime.h -Wno-unused-function"), "")
        << Runner.directory();
    EXPECT_EQ(Runner.run("all"), "") << Runner.directory();
}

TEST(Extraction, ExtractedProgramsGiveTheSameOutputs) {
    ProgramComparison Comparison;
    PassSequence Extraction;
    PassSequence Road = PassSequence::defaultOrder();
    Extraction.extractLabelsFirst();
    Road.extractLabelsFirst();
    for (const Case& Each : Cases) {
        std::string Messages;
        const std::string Text = std::string(Declarations) + Each.Text + "\n";
        ASSERT_TRUE(Comparison.add(Text, Extraction, Messages)) << Messages;
        ASSERT_TRUE(Comparison.add(Text, Road, Messages)) << Messages;
    }
    expectSameOutputs(Comparison);
}

// The generator jumps forwards, backwards and into arms and loops.
TEST(Extraction, RandomProgramsKeepShapeAndOutputs) {
    std::size_t Procedures = 0;
    std::size_t Remarks = 0;
    for (unsigned Batch = 0; Batch < 2; ++Batch) {
        ProgramComparison Comparison;
        for (unsigned i = 0; i < 15; ++i) {
            const std::string Text = hpn::fuzz::RandomProgram(7000 + Batch * 15 + i).text();
            const Extracted Result(Text);
            Procedures += Result.Procedures.empty() ? 0 : 1;
            Remarks += Result.Remarks.empty() ? 0 : 1;
            PassSequence Passes = i % 3 == 0 ? PassSequence() : PassSequence::defaultOrder();
            Passes.extractLabelsFirst();
            std::string Messages;
            ASSERT_TRUE(Comparison.add(Text, Passes, Messages)) << Messages << Text;
        }
        expectSameOutputs(Comparison);
    }
    EXPECT_GE(Procedures, 10u);
    EXPECT_GE(Remarks, 3u);
}

// Both arms of a branch that is never reached jump to one label. Were both edges to end there, the
// removal of the branch would take a living operand from the phi function at the label.
TEST(Extraction, DeadBranchWithBothArmsToOneLabelLeavesTheOtherWaysIn) {
    ProgramComparison Comparison;
    const char* const Bodies[] = {
        "if (OFF) { s = 5; if (i == 1) { goto L; } else { goto L; } } s = i; L: o = s;",
        "s = i; if (OFF) { s = 5; if (k == 1) { } } o = s; s = 5; if (k == 2) { s = i; } p = s;",
        "s = i; if (OFF) { s = 5; switch (k) { case 1: case 2: default: } } o = s;",
        "s = i; if (OFF) { s = 5; switch (k) { } while (k > 3) { } } o = s;",
        "s = i; if (OFF) { s = 5; for (; k > 3; ) { } do { } while (k > 7); } o = s;",
        "s = i; if (OFF) { while (true) { if (k == 3) { continue; } else { continue; } } } o = s;",
    };
    for (const char* Body : Bodies) {
        const std::string Text = std::string(Declarations) + "proc main() { " + Body + " }\n";
        std::string Messages;
        ASSERT_TRUE(Comparison.add(Text, PassSequence::defaultOrder(), Messages)) << Messages;
        const Extracted CheckedShape(Text);
    }
    expectSameOutputs(Comparison);
}

} // namespace
