#include "Road/PassSequence.h"

#include <gtest/gtest.h>

namespace {

using hpn::PassId;
using hpn::PassSequence;

// The message of a refused list, or nothing.
std::string refusalOf(const std::string& List) {
    PassSequence Result;
    std::string Message;
    return PassSequence::parse(List, Result, Message) ? "" : Message;
}

std::string namesOf(const PassSequence& Sequence) {
    std::string Text;
    for (const PassId Id : Sequence.getPasses())
        Text += (Text.empty() ? "" : ",") + std::string(hpn::passOf(Id).Name);
    return Text;
}

const char* const Frame = "placeExitNodes,placeLoopAroundMain,transformToSSAForm,divideBasicBlock";
const char* const Propagated = "placeExitNodes,placeLoopAroundMain,transformToSSAForm,"
                               "divideBasicBlock,propagateSparseConditionalConstant";

TEST(RoadPassSequence, RefusesWhatBreaksAPreconditionAndSaysWhichOne) {
    struct Case {
        std::string List;
        const char* Beginning;
    };
    const Case Cases[] = {
        // Frame.
        {"placeLoopAroundMain", "placeLoopAroundMain needs placeExitNodes before it: "},
        {"inlineProcedures", "inlineProcedures needs placeExitNodes before it: "},
        {"insertValidConditionAssignments", "insertValidConditionAssignments needs placeExitNodes"},
        {"transformToSSAForm", "transformToSSAForm needs placeExitNodes before it: "},
        {"placeExitNodes,makeProcedureAndCall",
         "makeProcedureAndCall cannot follow placeExitNodes: "},
        // Once only.
        {"makeProcedureAndCall,makeProcedureAndCall", "makeProcedureAndCall cannot run twice: "},
        {"placeExitNodes,placeExitNodes", "placeExitNodes cannot run twice: "},
        {"placeExitNodes,inlineProcedures,inlineProcedures", "inlineProcedures cannot run twice: "},
        {std::string(Frame) + ",transformToSSAForm", "transformToSSAForm cannot run twice: "},
        {std::string(Frame) + ",divideBasicBlock", "divideBasicBlock cannot run twice: "},
        // Before SSA form only.
        {std::string(Frame) + ",inlineProcedures", "inlineProcedures cannot follow transformToSSA"},
        {std::string(Frame) + ",insertValidConditionAssignments",
         "insertValidConditionAssignments cannot follow transformToSSAForm: "},
        {"placeExitNodes,transformToSSAForm,placeLoopAroundMain",
         "placeLoopAroundMain cannot follow transformToSSAForm: "},
        // Shape and values.
        {"placeExitNodes,divideBasicBlock",
         "divideBasicBlock needs transformToSSAForm before it: "},
        {"placeExitNodes,placeLoopAroundMain,transformToSSAForm,propagateSparseConditionalConstant",
         "propagateSparseConditionalConstant needs divideBasicBlock before it: "},
        {"placeExitNodes,transformToSSAForm,divideBasicBlock,propagateSparseConditionalConstant",
         "propagateSparseConditionalConstant needs placeLoopAroundMain before it: "},
        {"placeExitNodes,transformToSSAForm,divideBasicBlock,removeUnusedVarDefs",
         "removeUnusedVarDefs needs placeLoopAroundMain before it: "},
        {std::string(Frame) + ",foldConstants", "foldConstants needs propagateSparse"},
        {std::string(Frame) + ",replaceConstantVariables", "replaceConstantVariables needs propag"},
        {std::string(Frame) + ",replaceConstantConditions", "replaceConstantConditions needs prop"},
        // What ends the work on values.
        {std::string(Propagated) + ",removeUnusedVarDefs,replaceConstantVariables",
         "replaceConstantVariables cannot follow removeUnusedVarDefs: "},
        {std::string(Propagated) + ",removeUnusedVarDefs,propagateSparseConditionalConstant",
         "propagateSparseConditionalConstant cannot follow removeUnusedVarDefs: "},
        {std::string(Propagated) + ",hoistCodeOutOfIfElseBranches,foldConstants",
         "foldConstants cannot follow hoistCodeOutOfIfElseBranches: a moved statement"},
        {std::string(Propagated) + ",hoistCodeOutOfIfElseBranches,removeUnusedVarDefs",
         "removeUnusedVarDefs cannot follow hoistCodeOutOfIfElseBranches: "},
        // Names.
        {"placeExitNodes,,divideBasicBlock", "an empty name stands in the list"},
        {"placeExitNodes,", "an empty name stands in the list"},
        {"placeexitnodes", "unknown pass 'placeexitnodes'; the passes are makeProcedureAndCall, "},
    };
    for (const Case& Each : Cases)
        EXPECT_EQ(refusalOf(Each.List).rfind(Each.Beginning, 0), 0u)
            << Each.List << "\n  gives: " << refusalOf(Each.List);
}

TEST(RoadPassSequence, AcceptsTheRoadAndItsVariations) {
    PassSequence Result;
    std::string Message;
    ASSERT_TRUE(PassSequence::parse(namesOf(PassSequence::defaultOrder()), Result, Message));
    EXPECT_EQ(Result.getPasses(), PassSequence::defaultOrder().getPasses());
    // The whole road but for the extraction, which is asked for.
    EXPECT_EQ(Result.getPasses().size(), hpn::PassCount - 1);
    Result.extractLabelsFirst();
    Result.extractLabelsFirst();
    EXPECT_EQ(Result.getPasses().size(), hpn::PassCount);
    EXPECT_EQ(refusalOf(namesOf(Result)), "");

    EXPECT_EQ(refusalOf("  "), "");
    EXPECT_EQ(refusalOf(" placeExitNodes , inlineProcedures "), "");
    EXPECT_EQ(refusalOf("placeExitNodes,insertValidConditionAssignments,placeLoopAroundMain,"
                        "inlineProcedures"),
              "");
    // A second propagation may use what the first has folded.
    EXPECT_EQ(refusalOf(std::string(Propagated) +
                        ",foldConstants,propagateSparseConditionalConstant,foldConstants"),
              "");
    EXPECT_EQ(refusalOf(std::string(Frame) + ",hoistCodeOutOfIfElseBranches"), "");
}

TEST(RoadPassSequence, RefusedListLeavesTheSequenceAlone) {
    PassSequence Result = PassSequence::defaultOrder();
    std::string Message;
    EXPECT_FALSE(PassSequence::parse("placeExitNodes,nonsense", Result, Message));
    EXPECT_EQ(Result.getPasses().size(), hpn::PassCount - 1);
}

// By hand: nothing, or exit nodes with any of inlining, loop and notes (8); SSA form on top (8);
// divided without the loop, with hoisting or not (8); divided with the loop (4 kinds of frame)
// without propagation (4 of removal and hoisting) or with it (8 of application times 4); all of
// them with the extraction in front or not.
TEST(RoadPassSequence, SubsetsOfTheRoadAreAllowedAsCountedByHand) {
    std::size_t Allowed = 0;
    for (unsigned Subset = 0; Subset < (1u << hpn::PassCount); ++Subset) {
        std::vector<PassId> Ids;
        for (unsigned Bit = 0; Bit < hpn::PassCount; ++Bit)
            if ((Subset >> Bit & 1u) != 0)
                Ids.push_back(static_cast<PassId>(Bit));
        PassSequence Result;
        std::string Message;
        Allowed += PassSequence::make(Ids, Result, Message) ? 1 : 0;
    }
    EXPECT_EQ(Allowed, 2u * (1u + 8u + 8u + 8u + 4u * (4u + 8u * 4u)));
}

} // namespace
