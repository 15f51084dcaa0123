#include "DriverTestSupport.h"
#include "ReaderTestSupport.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>
#include <vector>

namespace {

const char* const Small = "input uint8 key;\n"
                          "output uint8 lamp = 0;\n"
                          "state uint8 count = 0;\n"
                          "param bool LOUD = false;\n"
                          "proc main() {\n"
                          "  if (LOUD) { lamp = 9; } else { lamp = 3; }\n"
                          "  if (key == 1) { count = count + 1; }\n"
                          "}\n";

bool contains(const std::string& Text, const std::string& Part) {
    return Text.find(Part) != std::string::npos;
}

TEST(Driver, ExitStatusTellsTheKindOfFailure) {
    struct Case {
        const char* Arguments;
        int Status;
        const char* Message; ///< beginning of the error output
    };
    const Case Cases[] = {
        {"small.hpn -o out.c", 0, ""},
        {"--help", 0, ""},
        {"--version", 0, ""},
        {"small.hpn --print", 0, ""},
        {"bad.hpn -o out.c", 1, "bad.hpn:1:"},
        {"small.hpn bad.hpn", 1, "bad.hpn:1:"},
        {"", 2, "hpncg: error: FILES"},
        {"absent.hpn", 2, "hpncg: error: cannot read 'absent.hpn': "},
        {"small.hpn --nonsense", 2, "hpncg: error: "},
        {"small.hpn --stats=xml", 2, "hpncg: error: --stats: 'xml' is neither"},
        {"small.hpn --passes=foldConstants", 2, "hpncg: error: --passes: foldConstants needs prop"},
        {"small.hpn --no-optimize --ranges", 2, "hpncg: error: --ranges: without propagate"},
        {"small.hpn -o small.hpn", 2, "hpncg: error: the output 'small.hpn' is one of the program"},
        {"small.hpn -o absent/out.c", 2, "hpncg: error: cannot write "},
        {"small.hpn --dump-dot=small.hpn/x", 2, "hpncg: error: cannot make the directory"},
        {"- - </dev/null", 2, "hpncg: error: standard input can be read only once"},
#ifndef _WIN32 // which has no such device
        {"small.hpn -o /dev/full", 2, "hpncg: error: cannot write '/dev/full': "},
#endif
    };
    for (const Case& Each : Cases) {
        DriverRun Run;
        Run.write("small.hpn", Small);
        Run.write("bad.hpn", "proc main( {\n");
        EXPECT_EQ(Run.run(Each.Arguments), Each.Status) << Each.Arguments << "\n" << Run.errors();
        EXPECT_EQ(Run.errors().rfind(Each.Message, 0), 0u) << Each.Arguments << Run.errors();
        if (*Each.Message == '\0') {
            EXPECT_EQ(Run.errors(), "") << Each.Arguments;
        }
    }
}

TEST(Driver, FailedRunLeavesEveryFileAsItWas) {
    const char* const Failing[] = {"bad.hpn -o out.c", "small.hpn -o out.c --passes=foldConstants",
                                   "small.hpn bad.hpn -o out.c --stats",
                                   "small.hpn -o out.c --dump-dot=out.c/sub"};
    for (const char* Arguments : Failing) {
        DriverRun Run;
        Run.write("small.hpn", Small);
        Run.write("bad.hpn", std::string(Small) + "proc broken() { lamp = ; }\n");
        Run.write("out.c", "kept");
        Run.write("stdout", "");
        Run.write("stderr", "");
        const auto Before = Run.files();
        EXPECT_NE(Run.run(Arguments), 0) << Arguments;
        auto After = Run.files();
        After["stdout"] = After["stderr"] = "";
        EXPECT_EQ(After, Before) << Arguments;
    }
}

TEST(Driver, ReplacesTheOutputWholeAndLeavesNothingElseBehind) {
    DriverRun Run;
    Run.write("small.hpn", Small);
    Run.write("real.c", "old");
    std::error_code NoLinks; // not every system lets everyone make them
    std::filesystem::create_symlink("real.c", Run.directory() + "/link.c", NoLinks);
    const std::string Target = NoLinks ? "real.c" : "link.c";
    ASSERT_EQ(Run.run("small.hpn -o " + Target), 0) << Run.errors();
    EXPECT_TRUE(contains(Run.read("real.c"), "small_step"));
    EXPECT_TRUE(NoLinks || std::filesystem::is_symlink(Run.directory() + "/link.c"));
    for (const auto& [Name, Text] : Run.files())
        EXPECT_FALSE(contains(Name, ".tmp")) << Name;
}

TEST(Driver, StandardInputAndOutputCarryTheSameProgramAsFiles) {
    DriverRun Run;
    Run.write("small.hpn", Small);
    ASSERT_EQ(Run.run("--print small.hpn"), 0) << Run.errors();
    const std::string Printed = Run.output();
    ASSERT_EQ(Run.run("--print - <small.hpn"), 0) << Run.errors();
    EXPECT_EQ(Run.output(), Printed);
    Run.write("printed.hpn", Printed);
    ASSERT_EQ(Run.run("--print printed.hpn"), 0) << Run.errors();
    EXPECT_EQ(Run.output(), Printed);

    // Without a file the code needs nothing beside it: it compiles alone, in an empty directory.
    ASSERT_EQ(Run.run("small.hpn"), 0) << Run.errors();
    std::filesystem::create_directory(Run.directory() + "/alone");
    Run.write("alone/small.c", Run.output());
    const std::string Compile = "cd " + Run.directory() +
                                "/alone && gcc -std=c99 -Wall -Wextra "
                                "-Werror -O2 -c small.c";
    EXPECT_EQ(hostshell::status(Compile), 0);
}

TEST(Driver, ReportsGoBesideTheCodeAndNotIntoIt) {
    DriverRun Run;
    Run.write("small.hpn", Small);
    ASSERT_EQ(Run.run("small.hpn"), 0);
    const std::string Code = Run.output();
    ASSERT_EQ(Run.run("small.hpn --stats --ranges --time-passes"), 0);
    EXPECT_EQ(Run.output(), Code);
    EXPECT_TRUE(contains(Run.errors(), "constants found"));
    ASSERT_EQ(Run.run("small.hpn --stats=json -o out.c"), 0);
    EXPECT_EQ(Run.errors(), "");
    EXPECT_EQ(Run.output().rfind("{\n  \"program\": \"small\",\n  \"before\": {", 0), 0u);
}

TEST(Driver, ExtractionIsAskedForAndSaysWhatItLeaves) {
    const char* const Jumps = "input uint8 key; output uint8 lamp = 0; output uint8 count = 0;\n"
                              "proc main() {\n"
                              "  if (key == 1) { lamp = 1; goto fault; }\n"
                              "  if (key == 2) { goto fault; }\n"
                              "again:\n"
                              "  count = count + 1;\n"
                              "  if (count < key) { goto again; }\n"
                              "  return;\n"
                              "fault:\n"
                              "  lamp = lamp + 2;\n"
                              "}\n";
    DriverRun Run;
    Run.write("jumps.hpn", Jumps);
    ASSERT_EQ(Run.run("jumps.hpn --stats=json -o plain.c"), 0);
    EXPECT_EQ(Run.errors(), "");
    EXPECT_TRUE(contains(Run.output(), "\"proceduresExtracted\": 0"));
    EXPECT_FALSE(contains(Run.read("plain.c"), "main_fault"));
    ASSERT_EQ(Run.run("jumps.hpn --extract-labels --stats=json --dump-dot=d --dump-html=h -o x.c"),
              0);
    EXPECT_EQ(Run.errors().rfind("jumps.hpn:5:1: remark: label 'again' stays a label: the code "
                                 "behind it jumps back to it",
                                 0),
              0u)
        << Run.errors();
    const std::string Remarks = Run.errors();
    EXPECT_EQ(std::count(Remarks.begin(), Remarks.end(), '\n'), 1) << Remarks;
    EXPECT_TRUE(contains(Run.output(), "\"proceduresExtracted\": 1"));
    EXPECT_TRUE(contains(Run.read("x.c"), "static void main_fault(void)"));
    EXPECT_EQ(Run.files("d").size(), 14u);
    EXPECT_EQ(Run.files("h").count("01_makeProcedureAndCall_SF_1.html"), 1u);
    // The road alone, the pass by its name, the option with a list, and with no pass at all.
    ASSERT_EQ(Run.run("jumps.hpn --passes=makeProcedureAndCall"), 0);
    const std::string Alone = Run.output();
    EXPECT_TRUE(contains(Alone, "main_fault"));
    for (const char* Same : {"--passes=\" \" --extract-labels", "--no-optimize --extract-labels",
                             "--passes=makeProcedureAndCall --extract-labels"}) {
        ASSERT_EQ(Run.run(std::string("jumps.hpn ") + Same), 0) << Same << Run.errors();
        EXPECT_EQ(Run.output(), Alone) << Same;
    }
}

TEST(Driver, ComparisonOfABooleanWithAnotherNumberIsWarnedOfWithItsPlace) {
    DriverRun Run;
    Run.write("flag.hpn", "input uint8 i; output uint8 o = 0; state bool b = false;\n"
                          "proc main() {\n"
                          "  b = i == 1;\n"
                          "  if (b == 2) { o = 1; }\n"
                          "}\n");
    ASSERT_EQ(Run.run("flag.hpn -o flag.c"), 0);
    EXPECT_EQ(Run.errors().rfind("flag.hpn:4:9: warning: a Boolean variable is compared", 0), 0u)
        << Run.errors();
}

// Addresses differ from run to run by themselves; another environment, a fixed layout and another
// allocator's settings shift them further.
TEST(Driver, RunsUnderDifferentAddressesGiveIdenticalBytes) {
    std::vector<const char*> Surroundings = {
        "", "env PADDING=$(head -c 40000 /dev/zero | tr '\\0' x)",
        "env MALLOC_ARENA_MAX=1 MALLOC_MMAP_THRESHOLD_=64 MALLOC_PERTURB_=85"};
    // Not allowed in every container.
    if (hostshell::status("setarch -R true 2>/dev/null") == 0)
        Surroundings.push_back("setarch -R");
    std::map<std::string, std::string> First;
    for (const char* Before : Surroundings) {
        DriverRun Run;
        Run.write("cruise.hpn", sampleText());
        std::filesystem::create_directory(Run.directory() + "/out");
        ASSERT_EQ(Run.run("cruise.hpn -o out/cruise.c --dump-dot=out --dump-html=out "
                          "--stats --ranges",
                          Before),
                  0)
            << Run.errors();
        auto Files = Run.files("out");
        Files["report"] = Run.output();
        EXPECT_EQ(Files.size(), 2u * 13u + 3u);
        if (First.empty())
            First = Files;
        for (const auto& [Name, Text] : First)
            EXPECT_EQ(Files[Name], Text) << Name << " under: " << Before;
    }
}

TEST(Driver, DumpsAreNamedByNumberAndPassAndNameEveryVariable) {
    DriverRun Run;
    Run.write("small.hpn", Small);
    ASSERT_EQ(Run.run("small.hpn -o out.c --dump-dot=d/e --dump-html=h "
                      "--passes=placeExitNodes,placeLoopAroundMain,transformToSSAForm"),
              0)
        << Run.errors();
    const auto Dots = Run.files("d/e");
    std::vector<std::string> Names;
    for (const auto& [Name, Text] : Dots)
        Names.push_back(Name);
    EXPECT_EQ(Names, (std::vector<std::string>{"00_asBuilt_SF_0.dot", "01_placeExitNodes_SF_1.dot",
                                               "02_placeLoopAroundMain_SF_2.dot",
                                               "03_transformToSSAForm_SF_3.dot"}));
    EXPECT_TRUE(contains(Dots.at("00_asBuilt_SF_0.dot"), "(Var_") ||
                contains(Dots.at("00_asBuilt_SF_0.dot"), ":key"));
    EXPECT_EQ(Run.files("h").size(), 4u);
    EXPECT_TRUE(contains(Run.files("h").at("03_transformToSSAForm_SF_3.html"), "SSA (Orig: Var_"));
}

TEST(Driver, CruiseControlLosesTheOptionThatThisVehicleLacks) {
    DriverRun Run;
    Run.write("cruise.hpn", sampleText());
    ASSERT_EQ(Run.run("cruise.hpn -o cruise.c --ranges --stats --check"), 0) << Run.errors();
    const std::string Code = Run.read("cruise.c");
    EXPECT_FALSE(contains(Code, "HAS_RESUME")) << Code;
    EXPECT_FALSE(contains(Code, "== 2")) << Code;
    EXPECT_TRUE(contains(Code, "== 1")) << Code;
    EXPECT_FALSE(Run.read("hpn_runtime.h").empty());
    // One line for each variable, by name; the ranges are those of the types or better.
    const std::string Report = Run.output();
    for (const char* Name : {"\ntarget ", "\nintegral ", "\nregulate.i ", "\nthrottle "})
        EXPECT_TRUE(contains(Report, Name)) << Name << Report;
    EXPECT_TRUE(contains(Report, "not tracked: array")) << Report;
    ASSERT_EQ(Run.run("cruise.hpn --no-optimize"), 0);
    EXPECT_TRUE(contains(Run.output(), "HAS_RESUME"));
}

// The C before and after that the README shows is what the tool gives for the program above it.
TEST(Driver, ReadmeShowsWhatTheToolGives) {
    const std::string Readme = DriverRun::readFile(HPNSSA_SOURCE_DIR "/README.md");
    std::size_t At = 0;
    const auto blockOf = [&](const std::string& Opening, const std::string& Closing) {
        const std::size_t Begin = Readme.find(Opening, At) + Opening.size();
        At = Readme.find(Closing, Begin);
        std::string Text = Readme.substr(Begin, At - Begin);
        for (std::size_t Break = 0; (Break = Text.find("<br>")) != std::string::npos;)
            Text.replace(Break, 4, "\n");
        return Text;
    };
    DriverRun Run;
    Run.write("option.hpn", blockOf("```text\n", "```"));
    for (const char* Options : {"option.hpn --no-optimize", "option.hpn"}) {
        const std::string Shown = blockOf("<pre>", "</pre>");
        ASSERT_TRUE(contains(Shown, "void option_step(void)")) << Shown;
        ASSERT_EQ(Run.run(Options), 0) << Run.errors();
        EXPECT_TRUE(contains(Run.output(), Shown)) << Run.output();
    }
}

} // namespace
