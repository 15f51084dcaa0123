#include "FuzzRun.h"

#include <CLI/CLI.hpp>

#include <cstdio>

namespace {

// "A..B" or one number.
bool parseSeeds(const std::string& Text, hpn::fuzz::FuzzOptions& Options) {
    unsigned long long First = 0;
    unsigned long long Last = 0;
    char Rest = 0;
    const int Count = std::sscanf(Text.c_str(), "%llu..%llu%c", &First, &Last, &Rest);
    if (Count != 2 || First > Last)
        return false;
    Options.FirstSeed = First;
    Options.LastSeed = Last;
    return true;
}

} // namespace

int main(int argc, char** argv) {
    hpn::fuzz::FuzzOptions Options;
    Options.RuntimeDirectory = HPNFUZZ_RUNTIME_DIRECTORY;
    std::string Seeds;
    std::uint64_t Seed = 0;
    CLI::App App("Optimises random programs and compares what they do before and after each pass.",
                 "hpnfuzz");
    App.add_option("--minutes", Options.Minutes,
                   "Stop after so many minutes (0: when the seeds are used up)");
    auto* pSeeds = App.add_option("--seeds", Seeds, "The seeds to run, as A..B");
    auto* pSeed = App.add_option("--seed", Seed, "Run this seed alone")->excludes(pSeeds);
    App.add_option("--gcc-every", Options.GccEvery,
                   "One program in so many is also emitted and compiled (0: none)")
        ->capture_default_str();
    App.add_option("--checks-every", Options.ChecksEvery,
                   "The library's own checks are on for one program in so many (0: never)")
        ->capture_default_str();
    App.add_option("--pairs-every", Options.PairsEvery,
                   "One program in so many is compared with a changed one (0: none)")
        ->capture_default_str();
    App.add_option("--failures", Options.MostFailures, "Stop after so many failures")
        ->capture_default_str();
    App.add_option("--out", Options.Directory, "Where failing programs are saved")
        ->capture_default_str();
    App.add_flag("--print", Options.IsPrintOnly,
                 "Print the program of the first seed and its passes, and run nothing");
    CLI11_PARSE(App, argc, argv);
    if (!Seeds.empty() && !parseSeeds(Seeds, Options)) {
        std::fprintf(stderr, "hpnfuzz: --seeds takes two numbers, as in 1..1000\n");
        return 2;
    }
    if (pSeed->count() != 0)
        Options.FirstSeed = Options.LastSeed = Seed;
    if (Seeds.empty() && pSeed->count() == 0 && Options.Minutes <= 0.0)
        Options.Minutes = 1.0;
    if (Options.IsPrintOnly) {
        const hpn::fuzz::Trial First = hpn::fuzz::makeTrial(Options.FirstSeed, Options);
        std::printf("// passes: %s\n%s", hpn::fuzz::listPasses(First.Passes).c_str(),
                    First.Text.c_str());
        return 0;
    }
    const hpn::fuzz::FuzzTotals Totals = hpn::fuzz::runFuzz(Options);
    std::fputs(hpn::fuzz::describeTotals(Totals).c_str(), stdout);
    return Totals.Failures == 0 ? 0 : 1;
}
