#include "ProgramComparison.h"
#include "RandomProgram.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <random>
#include <sstream>
#include <string>
#include <vector>

namespace {

using namespace hpn;

void expectSameOutputs(const ProgramComparison& Comparison, const std::string& What,
                       int Steps = 150) {
    CRunner Runner;
    Runner.write("all.c", Comparison.text(Steps));
    const std::string Messages =
        Runner.compile("all", "-O1 -fsanitize=undefined -fno-sanitize-recover=all");
    ASSERT_EQ(Messages, "") << What << " in " << Runner.directory();
    const std::string Differences = Runner.run("all");
    EXPECT_EQ(Differences, "") << What << " in " << Runner.directory();
}

/// Some of the passes, in an order that is allowed.
PassSequence randomPasses(unsigned Seed) {
    std::mt19937 Random(Seed);
    for (int Try = 0; Try < 20; ++Try) {
        std::vector<PassId> Ids;
        for (const Pass& Each : passTable())
            if (Random() % 4 != 0)
                Ids.push_back(Each.Id);
        PassSequence Result;
        std::string Message;
        if (PassSequence::make(Ids, Result, Message))
            return Result;
    }
    return PassSequence::defaultOrder();
}

TEST(Program, RandomProgramsKeepTheirOutputs) {
    constexpr unsigned BatchSize = 20;
    for (unsigned Batch = 0; Batch < 15; ++Batch) {
        ProgramComparison Comparison;
        for (unsigned i = 0; i < BatchSize; ++i) {
            const unsigned Seed = Batch * BatchSize + i;
            const std::string Text = RandomProgram(Seed).text();
            std::string Messages;
            const PassSequence Passes =
                Seed % 4 == 3 ? randomPasses(Seed) : PassSequence::defaultOrder();
            ASSERT_TRUE(Comparison.add(Text, Passes, Messages)) << Seed << "\n" << Messages << Text;
        }
        expectSameOutputs(Comparison, "seeds from " + std::to_string(Batch * BatchSize));
    }
}

TEST(Program, ExamplesKeepTheirOutputs) {
    const std::filesystem::path Folder = HPNSSA_SOURCE_DIR "/Examples";
    std::vector<std::filesystem::path> Files;
    for (const auto& Entry : std::filesystem::directory_iterator(Folder))
        if (Entry.path().extension() == ".hpn")
            Files.push_back(Entry.path());
    ASSERT_FALSE(Files.empty());
    std::sort(Files.begin(), Files.end());
    ProgramComparison Comparison;
    for (const std::filesystem::path& File : Files) {
        std::ifstream Stream(File);
        std::ostringstream Text;
        Text << Stream.rdbuf();
        std::string Messages;
        ASSERT_TRUE(Comparison.add(Text.str(), PassSequence::defaultOrder(), Messages)) << Messages;
        for (unsigned Seed = 0; Seed < 10; ++Seed)
            ASSERT_TRUE(Comparison.add(Text.str(), randomPasses(Seed), Messages)) << Messages;
    }
    expectSameOutputs(Comparison, "examples", 10000);
}

} // namespace
