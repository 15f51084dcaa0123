#include "Road/PassSequence.h"

#include "Graph/LabelExtraction.h"
#include "Graph/ProgramGraph.h"
#include "Model/HoistingContext.h"

#include <algorithm>
#include <cctype>

namespace hpn {

namespace {

using Id = PassId;
constexpr OrderRelation Needs = OrderRelation::Needs;
constexpr OrderRelation CannotFollow = OrderRelation::CannotFollow;

// The reasons that more than one rule has.
const char* const NeedsFrame = "the frame of every procedure comes first";
const char* const VersionsAreFixed = "SSA form has already given each definition its version";
const char* const NeedsDivided = "it works on nodes that hold one statement or condition each";
const char* const NeedsLoop =
    "without the loop a state would seem to hold its initial value at every "
    "step, and what a step leaves for the next one would seem unused";
const char* const NeedsValues = "what it writes into the code is what the propagation has found";
const char* const UnusedAreGone =
    "definitions are gone that procedures and calls still list, and what "
    "it sets free would stay";
const char* const ArmsAreMixed = "a moved statement may read the version of one arm only, whose "
                                 "constant does not hold for the other";
const char* const TwinIsGone =
    "a moved statement stands for its removed twin as well, whose uses it "
    "does not count";

// Reported is the first rule broken, in this order, by the first pass that breaks one.
const OrderRule OrderRules[] = {
    {Id::MakeProcedureAndCall, CannotFollow, Id::PlaceExitNodes,
     "a call that takes the place of a jump ends its procedure, which has its exit by then"},
    {Id::MakeProcedureAndCall, CannotFollow, Id::MakeProcedureAndCall,
     "every label that can be has been made a procedure"},
    {Id::PlaceExitNodes, CannotFollow, Id::PlaceExitNodes, "a procedure has one exit node"},
    {Id::InlineProcedures, CannotFollow, Id::TransformToSSAForm, VersionsAreFixed},
    {Id::InlineProcedures, Needs, Id::PlaceExitNodes,
     "a dissolved body is joined to what follows its call at its exit node"},
    {Id::InlineProcedures, CannotFollow, Id::InlineProcedures,
     "every call would be listed a second time and nothing inlined"},
    {Id::PlaceLoopAroundMain, CannotFollow, Id::TransformToSSAForm, VersionsAreFixed},
    {Id::PlaceLoopAroundMain, Needs, Id::PlaceExitNodes, "the loop is closed at the exit node"},
    {Id::PlaceLoopAroundMain, CannotFollow, Id::PlaceLoopAroundMain,
     "one loop around main is enough"},
    {Id::InsertValidConditionAssignments, CannotFollow, Id::TransformToSSAForm, VersionsAreFixed},
    {Id::InsertValidConditionAssignments, Needs, Id::PlaceExitNodes, NeedsFrame},
    {Id::InsertValidConditionAssignments, CannotFollow, Id::InsertValidConditionAssignments,
     "it would make the same assignments again"},
    {Id::TransformToSSAForm, CannotFollow, Id::TransformToSSAForm, VersionsAreFixed},
    {Id::TransformToSSAForm, Needs, Id::PlaceExitNodes,
     "the values that a procedure gives back are those at its exit node"},
    {Id::DivideBasicBlock, CannotFollow, Id::DivideBasicBlock, "there is nothing left to divide"},
    {Id::DivideBasicBlock, Needs, Id::TransformToSSAForm,
     "SSA form would put new statements into the divided blocks"},
    {Id::PropagateSparseConditionalConstant, CannotFollow, Id::HoistCodeOutOfIfElseBranches,
     ArmsAreMixed},
    {Id::PropagateSparseConditionalConstant, CannotFollow, Id::RemoveUnusedVarDefs, UnusedAreGone},
    {Id::PropagateSparseConditionalConstant, Needs, Id::DivideBasicBlock, NeedsDivided},
    {Id::PropagateSparseConditionalConstant, Needs, Id::PlaceLoopAroundMain, NeedsLoop},
    {Id::ReplaceConstantConditions, CannotFollow, Id::HoistCodeOutOfIfElseBranches, ArmsAreMixed},
    {Id::ReplaceConstantConditions, CannotFollow, Id::RemoveUnusedVarDefs, UnusedAreGone},
    {Id::ReplaceConstantConditions, Needs, Id::PropagateSparseConditionalConstant, NeedsValues},
    {Id::ReplaceConstantVariables, CannotFollow, Id::HoistCodeOutOfIfElseBranches, ArmsAreMixed},
    {Id::ReplaceConstantVariables, CannotFollow, Id::RemoveUnusedVarDefs, UnusedAreGone},
    {Id::ReplaceConstantVariables, Needs, Id::PropagateSparseConditionalConstant, NeedsValues},
    {Id::FoldConstants, CannotFollow, Id::HoistCodeOutOfIfElseBranches, ArmsAreMixed},
    {Id::FoldConstants, CannotFollow, Id::RemoveUnusedVarDefs, UnusedAreGone},
    {Id::FoldConstants, Needs, Id::PropagateSparseConditionalConstant, NeedsValues},
    {Id::RemoveUnusedVarDefs, CannotFollow, Id::HoistCodeOutOfIfElseBranches, TwinIsGone},
    {Id::RemoveUnusedVarDefs, CannotFollow, Id::RemoveUnusedVarDefs,
     "it goes on by itself until nothing unused is left"},
    {Id::RemoveUnusedVarDefs, Needs, Id::DivideBasicBlock, NeedsDivided},
    {Id::RemoveUnusedVarDefs, Needs, Id::PlaceLoopAroundMain, NeedsLoop},
    {Id::HoistCodeOutOfIfElseBranches, CannotFollow, Id::HoistCodeOutOfIfElseBranches,
     "it has moved all that can be moved"},
    {Id::HoistCodeOutOfIfElseBranches, Needs, Id::DivideBasicBlock, NeedsDivided},
};

bool has(const std::vector<PassId>& Ids, std::size_t Count, PassId Wanted) {
    return std::find(Ids.begin(), Ids.begin() + static_cast<std::ptrdiff_t>(Count), Wanted) !=
           Ids.begin() + static_cast<std::ptrdiff_t>(Count);
}

std::string describe(const OrderRule& Rule) {
    std::string Text = passOf(Rule.Pass).Name;
    if (Rule.Relation == Needs)
        Text += std::string(" needs ") + passOf(Rule.Other).Name + " before it: ";
    else if (Rule.Pass == Rule.Other)
        Text += " cannot run twice: ";
    else
        Text += std::string(" cannot follow ") + passOf(Rule.Other).Name + ": ";
    return Text + Rule.Reason;
}

// The first rule that the pass at a place breaks, or null.
const OrderRule* findBrokenRule(const std::vector<PassId>& Ids, std::size_t Place) {
    for (const OrderRule& Rule : OrderRules) {
        if (Rule.Pass != Ids[Place])
            continue;
        if (has(Ids, Place, Rule.Other) != (Rule.Relation == Needs))
            return &Rule;
    }
    return nullptr;
}

// The client's statements find their places in the graph through the context.
void hoistCode(ProgramGraph& Program) {
    const HoistingContext Context(Program.getGraph());
    Program.getGraph().hoistCodeOutOfIfElseBranches();
}

std::string_view trim(std::string_view Text) {
    while (!Text.empty() && std::isspace(static_cast<unsigned char>(Text.front())) != 0)
        Text.remove_prefix(1);
    while (!Text.empty() && std::isspace(static_cast<unsigned char>(Text.back())) != 0)
        Text.remove_suffix(1);
    return Text;
}

const Pass* findPass(std::string_view Name) {
    for (const Pass& Candidate : passTable())
        if (Name == Candidate.Name)
            return &Candidate;
    return nullptr;
}

std::string describeUnknown(std::string_view Name) {
    if (Name.empty())
        return "an empty name stands in the list of passes";
    std::string Text = "unknown pass '" + std::string(Name) + "'; the passes are";
    const char* Separator = " ";
    for (const Pass& Known : passTable()) {
        Text += Separator;
        Text += Known.Name;
        Separator = ", ";
    }
    return Text;
}

} // namespace

const std::array<Pass, PassCount>& passTable() {
    using Graph = ProgramGraph;
    static const std::array<Pass, PassCount> Table = {{
        {Id::MakeProcedureAndCall, "makeProcedureAndCall",
         "makes procedures of shared labels (with --extract-labels)",
         [](Graph& G) { LabelExtraction(G).run(); }},
        {Id::PlaceExitNodes, "placeExitNodes", "gives each procedure one exit node",
         [](Graph& G) { G.getGraph().placeExitNodes(); }},
        {Id::InlineProcedures, "inlineProcedures",
         "dissolves each procedure that has a single call",
         [](Graph& G) { G.getGraph().inlineProcedures(); }},
        {Id::PlaceLoopAroundMain, "placeLoopAroundMain", "closes main into a loop, step after step",
         [](Graph& G) { G.getGraph().placeLoopAroundMain(); }},
        {Id::InsertValidConditionAssignments, "insertValidConditionAssignments",
         "notes what a branch tells about its variable",
         [](Graph& G) { G.getGraph().insertValidConditionAssignments(); }},
        {Id::TransformToSSAForm, "transformToSSAForm",
         "gives each definition a version of its variable",
         [](Graph& G) {
             G.joinExits();
             G.getGraph().transformToSSAForm();
         }},
        {Id::DivideBasicBlock, "divideBasicBlock", "leaves one statement or condition in each node",
         [](Graph& G) { G.getGraph().divideBasicBlock(); }},
        {Id::PropagateSparseConditionalConstant, "propagateSparseConditionalConstant",
         "finds constants and ranges, removes what is never reached",
         [](Graph& G) { G.getGraph().propagateSparseConditionalConstant(true); }},
        {Id::ReplaceConstantConditions, "replaceConstantConditions",
         "writes constant conditions into the code",
         [](Graph& G) { G.getGraph().replaceConstantConditions(); }},
        {Id::ReplaceConstantVariables, "replaceConstantVariables",
         "writes constants in place of variables",
         [](Graph& G) { G.getGraph().replaceConstantVariables(); }},
        {Id::FoldConstants, "foldConstants", "computes what has become constant",
         [](Graph& G) { G.getGraph().foldConstants(); }},
        {Id::RemoveUnusedVarDefs, "removeUnusedVarDefs", "removes definitions that nobody uses",
         [](Graph& G) { G.getGraph().removeUnusedVarDefs(); }},
        {Id::HoistCodeOutOfIfElseBranches, "hoistCodeOutOfIfElseBranches",
         "moves equal code of both arms in front of the branch", &hoistCode},
    }};
    return Table;
}

const Pass& passOf(PassId Id) {
    return passTable()[static_cast<std::size_t>(Id)];
}

PassSequence PassSequence::defaultOrder() {
    PassSequence Result;
    for (const Pass& Each : passTable())
        if (Each.Id != PassId::MakeProcedureAndCall)
            Result.m_Passes.push_back(Each.Id);
    return Result;
}

void PassSequence::extractLabelsFirst() {
    if (!contains(PassId::MakeProcedureAndCall))
        m_Passes.insert(m_Passes.begin(), PassId::MakeProcedureAndCall);
}

bool PassSequence::make(const std::vector<PassId>& Ids, PassSequence& Result,
                        std::string& Message) {
    for (std::size_t Place = 0; Place < Ids.size(); ++Place) {
        if (const OrderRule* pBroken = findBrokenRule(Ids, Place)) {
            Message = describe(*pBroken);
            return false;
        }
    }
    Result.m_Passes = Ids;
    return true;
}

bool PassSequence::parse(std::string_view List, PassSequence& Result, std::string& Message) {
    std::vector<PassId> Ids;
    bool IsMore = !trim(List).empty();
    while (IsMore) {
        const std::size_t Comma = List.find(',');
        const std::string_view Name = trim(List.substr(0, Comma));
        const Pass* pPass = findPass(Name);
        if (pPass == nullptr) {
            Message = describeUnknown(Name);
            return false;
        }
        Ids.push_back(pPass->Id);
        IsMore = Comma != std::string_view::npos;
        if (IsMore)
            List.remove_prefix(Comma + 1);
    }
    return make(Ids, Result, Message);
}

bool PassSequence::contains(PassId Id) const {
    return has(m_Passes, m_Passes.size(), Id);
}

} // namespace hpn
