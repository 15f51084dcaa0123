#include "FuzzRun.h"

#include <gtest/gtest.h>

using namespace hpn;
using namespace hpn::fuzz;

// A run of fixed seeds: every program reads, and no pass changes what it does.
TEST(FuzzRun, FixedSeedsStandUp) {
    FuzzOptions Options;
    Options.PairsEvery = 2;
    TrialCounts Sum;
    for (std::uint64_t Seed = 1; Seed <= 200; ++Seed) {
        const TrialResult Result = runTrial(makeTrial(Seed, Options));
        ASSERT_EQ("", Result.Failed.Kind)
            << "seed " << Seed << " after " << Result.Failed.Pass << "\n"
            << Result.Failed.Detail;
        Sum.Constants += Result.Counts.Constants;
        Sum.DeadNodes += Result.Counts.DeadNodes;
        Sum.Exhausted += Result.Counts.Exhausted;
        for (std::size_t i = 0; i < PassCount; ++i)
            Sum.Passes[i] += Result.Counts.Passes[i];
        for (std::size_t i = 0; i < PairKindCount; ++i)
            Sum.Pairs[i] += Result.Counts.Pairs[i];
    }
    // The programs give the passes something to do, and nearly all of them end.
    EXPECT_GT(Sum.Constants, 2000u);
    EXPECT_GT(Sum.DeadNodes, 2000u);
    EXPECT_LT(Sum.Exhausted, 20u);
    for (std::size_t i = 0; i < PassCount; ++i)
        EXPECT_GT(Sum.Passes[i], 10u) << passTable()[i].Name;
    for (std::size_t i = 1; i < PairKindCount; ++i)
        EXPECT_GT(Sum.Pairs[i], 5u) << nameOfPair(static_cast<PairKind>(i));
}

TEST(FuzzRun, SameSeedSameProgram) {
    const FuzzOptions Options;
    for (const std::uint64_t Seed : {3u, 15u}) {
        EXPECT_EQ(makeTrial(Seed, Options).Text, makeTrial(Seed, Options).Text);
        EXPECT_NE(makeTrial(Seed, Options).Text, makeTrial(Seed + 16, Options).Text);
    }
}
