#include "Generators/RandomProgram.h"
#include "Oracles/ProgramComparison.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <random>
#include <sstream>
#include <string>
#include <vector>

namespace {

using namespace hpn;

void expectSameOutputs(const ProgramComparison& Comparison, const std::string& What, int Steps,
                       const char* pOptions = "-O1") {
    CRunner Runner;
    Runner.write("all.c", Comparison.text(Steps));
    const std::string Messages = Runner.compile("all", pOptions);
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

/// For long runs: HPN_FIRST_SEED and HPN_PROGRAMS choose other programs than the usual ones.
unsigned fromEnvironment(const char* pName, unsigned Otherwise) {
    const char* pText = std::getenv(pName);
    return pText ? static_cast<unsigned>(std::strtoul(pText, nullptr, 10)) : Otherwise;
}

TEST(Program, RandomProgramsKeepTheirOutputs) {
    constexpr unsigned BatchSize = 20;
    const unsigned First = fromEnvironment("HPN_FIRST_SEED", 0);
    const unsigned End = First + fromEnvironment("HPN_PROGRAMS", 200);
    unsigned Changed = 0;
    for (unsigned Batch = First; Batch < End; Batch += BatchSize) {
        ProgramComparison Comparison;
        for (unsigned Seed = Batch; Seed < std::min(Batch + BatchSize, End); ++Seed) {
            const std::string Text = hpn::fuzz::RandomProgram(Seed).text();
            std::string Messages;
            const PassSequence Passes =
                Seed % 4 == 3 ? randomPasses(Seed) : PassSequence::defaultOrder();
            ASSERT_TRUE(Comparison.add(Text, Passes, Messages)) << Seed << "\n" << Messages << Text;
        }
        // The sanitizer proves that the text has no undefined behaviour; it doubles the compiler's
        // time.
        const bool IsSanitized = Batch / BatchSize % 4 == 0;
        expectSameOutputs(Comparison, "seeds from " + std::to_string(Batch), 150,
                          IsSanitized ? "-O1 -fsanitize=undefined -fno-sanitize-recover=all"
                                      : "-O1");
        Changed += Comparison.countShortened();
    }
    // A comparison of a program with itself would prove nothing.
    EXPECT_GT(Changed, (End - First) * 3 / 4);
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
