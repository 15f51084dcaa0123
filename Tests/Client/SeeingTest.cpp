#include "DriverTestSupport.h"

#include "Emitter/CEmitter.h"
#include "Generators/RandomProgram.h"
#include "Graph/ProgramGraph.h"
#include "Language/Reader.h"
#include "Road/RewriteLimiter.h"
#include "Seeing/Answers.h"
#include "Seeing/Layout.h"
#include "Seeing/Recorder.h"

#include <gtest/gtest.h>

#include <map>
#include <sstream>

namespace {

using namespace hpn;

/// One program, read and taken along the whole road with a recorder, a limit or neither.
struct SeenRun {
    explicit SeenRun(const std::string& Text, PassObserver* pFirst = nullptr, bool IsSeen = true) {
        Sources.add("test.hpn", Text);
        Diagnostics Messages(Sources);
        EXPECT_TRUE(readProgram(Sources, Messages, Source)) << Messages.print();
        ProgramGraph Graph(Source);
        PassRunner Runner(Graph);
        Recorder Watching(Sources);
        if (pFirst != nullptr)
            Runner.addObserver(*pFirst);
        if (IsSeen)
            Runner.addObserver(Watching);
        EXPECT_TRUE(Runner.run(PassSequence::defaultOrder()));
        Code = emitProgram(Graph).Source;
        if (IsSeen)
            Whole = Watching.finish();
    }

    SourceFiles Sources;
    Program Source;
    std::string Code;
    Recording Whole;
};

std::string exampleText(const char* Name) {
    return DriverRun::readFile(std::string(HPNSSA_SOURCE_DIR) + "/Examples/" + Name + ".hpn");
}

const char* const Examples[] = {"cruise_control", "window_lifter", "battery_controller"};

/// The lines of a text that hold all the words; what a question must be answered with is one line.
bool hasLine(const std::string& Text, const std::vector<std::string>& Words) {
    std::istringstream Lines(Text);
    for (std::string Line; std::getline(Lines, Line);) {
        bool HasAll = true;
        for (const std::string& Word : Words)
            HasAll = HasAll && Line.find(Word) != std::string::npos;
        if (HasAll)
            return true;
    }
    return false;
}

TEST(Seeing, QuestionsAreAnsweredOnTheExamples) {
    struct Case {
        const char* Program;
        const char* Arguments;
        std::vector<std::string> Words; ///< of one line of the answer
    };
    const Case Cases[] = {
        // Why is it constant, why is it not
        {"cruise_control",
         "--explain=HAS_RESUME",
         {"is 0: a param, which nothing assigns", ":37)"}},
        {"cruise_control", "--explain=lamp", {"lamp.6 is 0", "reads constants alone", ":73)"}},
        {"cruise_control", "--explain=vehicle_speed", {"never taken for constant: an input"}},
        {"cruise_control", "--explain=throttle", {"reads vehicle_speed, an input", ":52)"}},
        {"cruise_control", "--explain=by", {"its calls hand over different numbers"}},
        {"cruise_control", "--explain=fault_code", {"two constants meet that differ"}},
        {"cruise_control", "--explain=integral", {"loop-carried, the step before"}},
        {"cruise_control", "--explain=line:110", {"HAS_RESUME.1 is 0: a param"}},
        // What became of a statement
        {"cruise_control",
         "--explain=debug_state",
         {"removed by propagateSparseConditionalConstant", "`DEVELOPMENT.1` is always false"}},
        {"cruise_control", "--explain=line:149", {"the same statement of the other arm"}},
        {"cruise_control", "--explain=MIN_SPEED", {"is 30: a param"}},
        {"cruise_control", "--explain=wanted", {"removed by removeUnusedVarDefs: nothing reads"}},
        // What keeps one that looks unused
        {"cruise_control", "--explain=shown_target", {"stays", "an output"}},
        {"cruise_control", "--explain=active", {"stays", "extern log_event reads it"}},
        {"cruise_control", "--explain=fault_timer", {"stays: the value goes on to"}},
        // Limits
        {"cruise_control", "--explain=acceleration", {"may saturate at its upper limit", ":96)"}},
        {"cruise_control", "--explain=target", {"never saturates at its lower limit", ":127)"}},
        // Only what changed
        {"cruise_control", "--print-changed", {"- 89: if (DEVELOPMENT.1)"}},
        {"cruise_control", "--print-changed", {"+ 89: if (0)"}},
        {"window_lifter", "--print-changed", {"[inlined]"}},
        // What if
        {"cruise_control", "--stats --set HAS_RESUME=true", {"statements at the end", "+1"}},
        {"cruise_control", "--stats --range vehicle_speed=0..120", {"believed to stay in 0..120"}},
        {"cruise_control",
         "--range vehicle_speed=0..120 --explain=line:52",
         {"never saturates at its upper limit"}},
        {"battery_controller", "--rewrite-limit=3", {"rewrites made: 3 of at most 3"}},
        {"window_lifter", "--remarks=json", {"\"name\": \"Inlined\""}},
    };
    DriverRun Run;
    for (const Case& Each : Cases) {
        const std::string Program =
            std::string(HPNSSA_SOURCE_DIR) + "/Examples/" + Each.Program + ".hpn";
        ASSERT_EQ(Run.run("'" + Program + "' -o out.c " + Each.Arguments), 0) << Run.errors();
        EXPECT_TRUE(hasLine(Run.output(), Each.Words))
            << Each.Program << " " << Each.Arguments << "\n"
            << Run.output();
    }
}

TEST(Seeing, RemarksTellWhatWasDoneAndWhatNot) {
    DriverRun Run;
    const std::string Program = std::string(HPNSSA_SOURCE_DIR) + "/Examples/cruise_control.hpn";
    ASSERT_EQ(Run.run("'" + Program + "' -o out.c --remarks"), 0);
    const std::vector<std::string> Lines[] = {
        {":56:3: remark: ", "inlined: its procedure's only call"},
        {":63:26: remark: call of switch_off not inlined: it has 2 calls"},
        {":89:22: remark: ", "removed: never reached"},
        {":107:28: remark: read of MIN_SPEED.1 replaced by 30"},
        {":150:28: remark: ", "moved in front of the branch"},
        {":55:21: remark: ", "not decided: it reads sensor_status, an input"},
    };
    for (const std::vector<std::string>& Words : Lines)
        EXPECT_TRUE(hasLine(Run.errors(), Words)) << Words.front() << "\n" << Run.errors();
}

TEST(Seeing, WhatDoesNotFitTheProgramIsRefused) {
    const struct {
        const char* Arguments;
        const char* Message;
    } Cases[] = {
        {"--explain=nope", "--explain: the program has no variable 'nope'"},
        {"--explain=line:99999", "--explain: "},
        {"--explain=line:one", "--explain: 'one' is no line number"},
        {"--set NOPE=1", "--set: the program has no param 'NOPE'"},
        {"--set brake=1", "--set: 'brake' is no param"},
        {"--set HAS_RESUME=7", "--set: 7 is no value of 'HAS_RESUME'"},
        {"--set KP=", "--set: 'KP=' is not of the form NAME=VALUE"},
        {"--set KP=1x", "--set: '1x' is no number"},
        {"--range KP=0..1", "--range: 'KP' is no input"},
        {"--range brake=0..2", "--range: 0..2 is more than 'brake' can hold: 0..1"},
        {"--range button=3..2", "--range: '3..2' is empty"},
        {"--range button=0.2..0.4", "--range: 'button' can hold no number in 0.2..0.4"},
        {"--remarks=xml", "--remarks: 'xml' is neither"},
        {"--rewrite-limit=some", "--rewrite-limit"},
    };
    DriverRun Run;
    const std::string Program = std::string(HPNSSA_SOURCE_DIR) + "/Examples/cruise_control.hpn";
    for (const auto& Each : Cases) {
        EXPECT_EQ(Run.run("'" + Program + "' -o out.c " + Each.Arguments), 2) << Each.Arguments;
        EXPECT_NE(Run.errors().find(Each.Message), std::string::npos) << Each.Arguments << "\n"
                                                                      << Run.errors();
        EXPECT_EQ(Run.read("out.c"), "") << Each.Arguments;
    }
}

// A param that another one is computed from takes it along, and the C says what it was made under.
TEST(Seeing, ASettingReachesWhatIsComputedFromIt) {
    DriverRun Run;
    Run.write("p.hpn", "param uint8 A = 1; param uint8 B = A + 1; output uint8 o = 0;\n"
                       "proc main() { o = B; }\n");
    ASSERT_EQ(Run.run("p.hpn -o p.c --set A=6"), 0);
    EXPECT_NE(Run.read("p.c").find("o = 7;"), std::string::npos) << Run.read("p.c");
    EXPECT_EQ(Run.read("p.c").find("/* For this run alone: param A is 6 (--set). */"), 0U);
}

// Snapshot and changes tell the same: what stood before, less what is said to be gone, changed or
// new, is what stands now. And every statement of the text that is gone has grounds.
void checkRecording(const Recording& Of) {
    using Kind = RecordedChange::Kind;
    std::map<unsigned, std::string> Texts;
    for (std::size_t i = 0; i < Of.Snapshots.size(); ++i) {
        const RecordedSnapshot& Now = Of.Snapshots[i];
        for (const RecordedChange& Each : Now.Changes) {
            if (Each.Before >= 0) {
                const RecordedStatement& Before =
                    Of.Statements[static_cast<std::size_t>(Each.Before)];
                ASSERT_EQ(Texts[Before.Id], Before.Text);
                Texts.erase(Before.Id);
            }
            if (Each.After >= 0) {
                const RecordedStatement& After =
                    Of.Statements[static_cast<std::size_t>(Each.After)];
                ASSERT_TRUE(Texts.emplace(After.Id, After.Text).second) << After.Text;
            }
            const bool IsOfText = Each.What == Kind::Removed &&
                                  Of.Statements[static_cast<std::size_t>(Each.Before)].MakesCode;
            EXPECT_TRUE(!IsOfText || !Each.Why.empty())
                << Of.Statements[static_cast<std::size_t>(Each.Before)].Text;
        }
        std::map<unsigned, std::string> Standing;
        const Layout Where(Of, Now);
        for (const Layout::Entry& Entry : Where.getEntries()) {
            const RecordedStatement& Each = Of.Statements[static_cast<std::size_t>(Entry.State)];
            Standing[Each.Id] = Each.Text;
        }
        if (i == 0)
            Texts = Standing;
        ASSERT_EQ(Texts, Standing) << Now.Pass;
    }
}

TEST(Seeing, RecordingsOfRandomProgramsHoldTogether) {
    for (std::uint32_t Seed = 1; Seed <= 20; ++Seed) {
        const std::string Text = fuzz::RandomProgram(Seed).text();
        const SeenRun Seen(Text);
        const SeenRun Unseen(Text, nullptr, false);
        ASSERT_EQ(Seen.Code, Unseen.Code) << "watching changed the code of seed " << Seed;
        ASSERT_NO_FATAL_FAILURE(checkRecording(Seen.Whole)) << "seed " << Seed;
        for (std::size_t i = 0; i < Seen.Whole.Versions.size(); ++i)
            EXPECT_FALSE(unfoldExplanation(Seen.Whole, static_cast<int>(i)).empty())
                << Seen.Whole.Versions[i].Name << ", seed " << Seed;
        ASSERT_EQ(recordingToJson(Seen.Whole).find("\"kind\":\"\""), std::string::npos);
    }
}

// With the limit N just N changes happen; with as many as there are, the code is that without a
// limit.
TEST(Seeing, TheLimitIsMetByEveryNumberOfChanges) {
    for (const char* Name : Examples) {
        const std::string Text = exampleText(Name);
        const SeenRun Free(Text, nullptr, false);
        std::size_t Count = 0;
        {
            RewriteLimiter All(1000000);
            EXPECT_EQ(SeenRun(Text, &All, false).Code, Free.Code);
            Count = All.getBudget().getCount();
        }
        ASSERT_GT(Count, 50U);
        for (std::size_t Limit = 0; Limit <= Count; Limit += 1 + Limit / 8) {
            RewriteLimiter Some(Limit);
            const SeenRun Limited(Text, &Some, true);
            EXPECT_EQ(Some.getBudget().getCount(), Limit) << Name;
            std::size_t Removed = 0;
            for (const RecordedSnapshot& Each : Limited.Whole.Snapshots)
                if (Each.Pass == "removeUnusedVarDefs")
                    Removed = Each.Tally[static_cast<std::size_t>(RecordedChange::Kind::Removed)];
            EXPECT_LE(Removed, Limit) << "the pass removed more than was allowed: " << Name;
        }
    }
}

} // namespace
