// Every choice of passes and every order of them that the rules allow, on the example programs,
// compared with the program as written.

#include "DriverTestSupport.h"
#include "Oracles/VariantComparison.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace {

using namespace hpn;
using namespace hpn::test;

/// Calls `visit` with every sequence without repetitions that begins with the given passes and is
/// allowed. No rule forbids the beginning of an allowed sequence, so none is missed.
template <class Visit>
void forEachSequence(std::vector<PassId>& Ids, Visit&& visit) {
    PassSequence Sequence;
    std::string Message;
    if (!PassSequence::make(Ids, Sequence, Message))
        return;
    visit(Sequence);
    for (const Pass& Next : passTable()) {
        if (std::find(Ids.begin(), Ids.end(), Next.Id) != Ids.end())
            continue;
        Ids.push_back(Next.Id);
        forEachSequence(Ids, visit);
        Ids.pop_back();
    }
}

class Subset : public testing::TestWithParam<const char*> {};

TEST_P(Subset, EveryAllowedSequenceOfPassesKeepsTheOutputs) {
    const std::string Stem = std::string(HPNSSA_SOURCE_DIR "/Examples/") + GetParam();
    Variants Example(std::string(GetParam()) + ".hpn", DriverRun::readFile(Stem + ".hpn"),
                     DriverRun::readFile(Stem + ".inputs"));
    std::vector<PassId> Ids;
    forEachSequence(Ids, [&](const PassSequence& Sequence) { Example.add(Sequence); });
    // A second round may use what the first has written into the code.
    PassSequence Twice;
    std::string Message;
    ASSERT_TRUE(PassSequence::parse(
        "makeProcedureAndCall,placeExitNodes,inlineProcedures,placeLoopAroundMain,"
        "insertValidConditionAssignments,transformToSSAForm,divideBasicBlock,"
        "propagateSparseConditionalConstant,replaceConstantVariables,foldConstants,"
        "replaceConstantConditions,propagateSparseConditionalConstant,replaceConstantVariables,"
        "removeUnusedVarDefs,hoistCodeOutOfIfElseBranches",
        Twice, Message))
        << Message;
    Example.add(Twice);
    EXPECT_GE(Example.countTexts(), 20u);
    EXPECT_EQ(Example.compare(), "");
    RecordProperty("sequences", static_cast<int>(Example.countRuns()));
    RecordProperty("texts", static_cast<int>(Example.countTexts()));
}

INSTANTIATE_TEST_SUITE_P(Examples, Subset,
                         testing::Values("cruise_control", "window_lifter", "battery_controller"),
                         [](const testing::TestParamInfo<const char*>& Case) {
                             return std::string(Case.param);
                         });

} // namespace
