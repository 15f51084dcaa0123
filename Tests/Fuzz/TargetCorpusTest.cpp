// What the fuzzing targets have kept: every input through the function that the fuzzer calls.

#include "Targets/Targets.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <vector>

namespace {

using Judge = std::string (*)(const std::uint8_t*, std::size_t);

std::string bytesOf(const std::filesystem::path& File) {
    std::ostringstream Bytes;
    Bytes << std::ifstream(File, std::ios::binary).rdbuf();
    return Bytes.str();
}

void judgeAll(const char* pTarget, Judge judge) {
    std::vector<std::filesystem::path> Files;
    for (const auto& Entry : std::filesystem::directory_iterator(
             std::filesystem::path(HPNSSA_SOURCE_DIR "/Tests/Corpus") / pTarget))
        Files.push_back(Entry.path());
    std::sort(Files.begin(), Files.end());
    EXPECT_GE(Files.size(), 50U);
    for (const std::filesystem::path& File : Files) {
        const std::string Bytes = bytesOf(File);
        EXPECT_EQ(judge(reinterpret_cast<const std::uint8_t*>(Bytes.data()), Bytes.size()), "")
            << File;
    }
}

TEST(TargetCorpus, TheReaderAcceptsOrRefusesEveryInputInOrder) {
    judgeAll("Reader", hpn::fuzz::judgeReader);
}

TEST(TargetCorpus, TheLibraryKeepsFormAndOutputsOnEveryGraph) {
    judgeAll("Library", hpn::fuzz::judgeLibrary);
}

} // namespace
