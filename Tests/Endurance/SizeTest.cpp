// Large programs of all shapes, text in and C out, on a stack of 256 KiB: nothing may need one that
// grows with the program. How time and memory grow is measured by Scripts/sizes, whose programs
// these are.

#include "EnduranceSupport.h"

#include <filesystem>
#include <sys/wait.h>
#include <unistd.h>

namespace {

struct Family {
    const char* pName;
    int Size;
    const char* pOptions;
};

class Size : public ::testing::TestWithParam<Family> {};

TEST_P(Size, NeedsNoStackOfItsOwn) {
#ifdef ENDURANCE_ASAN
    const int KiB = 2048; // its frames are wide, and its processes slow
    const int Smaller = 10;
#else
    const int KiB = 256;
    const int Smaller = 1;
#endif
    const std::string Directory =
        std::string("hpn_size_") + GetParam().pName + std::to_string(getpid());
    std::filesystem::create_directory(Directory);
    const std::string Program = Directory + "/program.hpn";
    const std::string Code = Directory + "/program.c";
    const std::string Make = std::string(HPNSSA_SOURCE_DIR "/Scripts/sizes -p ") +
                             GetParam().pName + "=" + std::to_string(GetParam().Size / Smaller) +
                             " >" + Program;
    ASSERT_EQ(std::system(Make.c_str()), 0);
    const std::string Run = "ulimit -s " + std::to_string(KiB) + "; exec " HPNCG_PATH " " +
                            Program + " " + GetParam().pOptions + " -o " + Code + " 2>/dev/null";
    const int Status = std::system(Run.c_str());
    EXPECT_TRUE(WIFEXITED(Status) && WEXITSTATUS(Status) == 0) << "status " << Status;
    EXPECT_TRUE(std::filesystem::exists(Code));
    std::filesystem::remove_all(Directory);
}

const Family Families[] = {
    {"chain", 20000, ""},
    {"diamonds", 5000, ""},
    {"join", 500, ""},
    {"ladder", 2000, ""},
    {"nested", 2000, ""},
    {"loops", 2000, ""},
    {"variables", 2000, ""},
    {"calls", 10000, ""},
    {"twice", 2000, ""},
    {"ring", 5000, ""},
    {"rows", 500, ""},
    {"terms", 10, ""},
    {"labels", 200, "--extract-labels"},
};

INSTANTIATE_TEST_SUITE_P(Families, Size, ::testing::ValuesIn(Families),
                         [](const auto& Info) { return std::string(Info.param.pName); });

} // namespace
