#ifndef FUZZRUN_H
#define FUZZRUN_H

#include "CodeHarness.h"
#include "PassTrial.h"

#include <cstdint>
#include <string>

namespace hpn::fuzz {

struct FuzzOptions {
    std::uint64_t FirstSeed = 1;
    std::uint64_t LastSeed = ~std::uint64_t{0};
    double Minutes = 0.0;    ///< 0: until the seeds are used up
    unsigned GccEvery = 100; ///< one program in so many goes through the C compiler; 0: none
    unsigned ChecksEvery =
        4; ///< the library's own assertions are on for one program in so many; 0: never
    unsigned PairsEvery = 6; ///< one program in so many is compared with a changed one; 0: none
    unsigned MostFailures = 10;
    std::string Directory = "fuzz-failures";
    std::string RuntimeDirectory; ///< holds hpn_runtime.h
    bool IsPrintOnly = false;     ///< print the program of the first seed and its order of passes
};

struct FuzzTotals {
    std::uint64_t Programs = 0;
    std::uint64_t Failures = 0;
    std::uint64_t Crashes = 0;
    std::uint64_t Compiled = 0; ///< pairs of C variants compared
    double Seconds = 0.0;
    TrialCounts Counts;
};

/// The trial for a seed: the program, its world and its passes. Fifteen in sixteen are small and
/// pointed, the rest large.
Trial makeTrial(std::uint64_t Seed, const FuzzOptions& Options);

/// Runs seed after seed in a child process and starts another one behind a seed that brought it
/// down or held it up. Each failure is saved as `<Directory>/seed-N.hpn` (as generated),
/// `seed-N.small.hpn` (shrunk) and `seed-N.txt` (what happened), and printed.
FuzzTotals runFuzz(const FuzzOptions& Options);
std::string describeTotals(const FuzzTotals& Totals);

} // namespace hpn::fuzz

#endif
