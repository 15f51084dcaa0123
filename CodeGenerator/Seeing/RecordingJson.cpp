#include "Seeing/Recording.h"
#include "Seeing/Remarks.h"

#include <nlohmann/json.hpp>

#include <cmath>

namespace hpn {

using Json = nlohmann::ordered_json;

// The functions of one name are found by their argument from inside `listOf`, whatever the order,
// which an unnamed namespace would prevent: hence static.

// JSON knows no infinities and no NaN: they are strings.
static Json number(double Value) {
    if (std::isnan(Value))
        return "nan";
    if (std::isinf(Value))
        return Value > 0.0 ? "inf" : "-inf";
    return Value;
}

static Json toJson(const RecordedPlace& Place) {
    if (!Place.isKnown())
        return nullptr;
    return {{"file", Place.File}, {"line", Place.Line}, {"column", Place.Column}};
}

template <class Item>
static Json listOf(const std::vector<Item>& Items) {
    Json List = Json::array();
    for (const Item& Each : Items)
        List.push_back(toJson(Each));
    return List;
}

static Json toJson(const RecordedSource& Source) {
    return {{"name", Source.Name}, {"text", Source.Text}};
}

static Json toJson(const RecordedRange& Range) {
    return {{"kind", nameOf(Range.What)}, {"low", number(Range.Low)}, {"high", number(Range.High)}};
}

static Json toJson(const RecordedRead& Read) {
    return {{"variable", Read.Variable}, {"version", Read.Version}, {"place", toJson(Read.Place)}};
}

static Json toJson(const RecordedStatement& Statement) {
    return {{"id", Statement.Id},
            {"form", nameOf(Statement.Form)},
            {"makesCode", Statement.MakesCode},
            {"text", Statement.Text},
            {"place", toJson(Statement.Place)},
            {"variable", Statement.Variable},
            {"version", Statement.Version},
            {"reads", listOf(Statement.Reads)}};
}

static Json toJson(const RecordedNode& Node) {
    return {{"id", Node.Id},
            {"kind", nameOf(Node.What)},
            {"statements", Node.Statements},
            {"place", toJson(Node.Place)}};
}

// Edges are by far the most of a recording, so they are short: from, to, kind.
static Json toJson(const RecordedEdge& Edge) {
    return Json::array({Edge.From, Edge.To, nameOf(Edge.What)});
}

static Json toJson(const RecordedCall& Call) {
    return {{"node", Call.Node}, {"callee", Call.Callee}, {"place", toJson(Call.Place)}};
}

static Json toJson(const RecordedProcedure& Procedure) {
    return {{"name", Procedure.Name},           {"title", Procedure.Title},
            {"place", toJson(Procedure.Place)}, {"nodes", Procedure.Nodes},
            {"edges", listOf(Procedure.Edges)}, {"calls", listOf(Procedure.Calls)}};
}

static Json toJson(const RecordedChange& Change) {
    return {{"kind", nameOf(Change.What)}, {"before", Change.Before},       {"after", Change.After},
            {"node", Change.Node},         {"procedure", Change.Procedure}, {"why", Change.Why}};
}

static Json toJson(const std::pair<unsigned, RecordedMark>& Mark) {
    return {{"node", Mark.first}, {"mark", nameOf(Mark.second)}};
}

static Json toJson(const RecordedSnapshot& Snapshot) {
    Json Tally;
    for (std::size_t i = 0; i < std::size(Snapshot.Tally); ++i)
        Tally[nameOf(static_cast<RecordedChange::Kind>(i))] = Snapshot.Tally[i];
    return {{"number", Snapshot.Number},
            {"pass", Snapshot.Pass},
            {"purpose", Snapshot.Purpose},
            {"seconds", Snapshot.Seconds},
            {"nodeCount", Snapshot.NodeCount},
            {"statementCount", Snapshot.StatementCount},
            {"conditionCount", Snapshot.ConditionCount},
            {"tally", Tally},
            {"procedures", Snapshot.Procedures},
            {"changes", listOf(Snapshot.Changes)},
            {"marks", listOf(Snapshot.Marks)}};
}

static Json toJson(const RecordedReason& Reason) {
    return {{"text", Reason.Text}, {"place", toJson(Reason.Place)}, {"version", Reason.Version}};
}

static Json toJson(const RecordedVersion& Version) {
    return {{"variable", Version.Variable},
            {"number", Version.Number},
            {"name", Version.Name},
            {"definition", Version.Definition},
            {"isReached", Version.IsReached},
            {"place", toJson(Version.Place)},
            {"found", toJson(Version.Found)},
            {"uses", listOf(Version.Uses)},
            {"explanation", listOf(Version.Explanation)}};
}

static Json toJson(const RecordedVariable& Variable) {
    return {{"name", Variable.Name},
            {"owner", Variable.Owner},
            {"kind", Variable.Kind},
            {"isHidden", Variable.IsHidden},
            {"type", Variable.Type},
            {"base", Variable.Base},
            {"unit", Variable.Unit},
            {"isScaled", Variable.IsScaled},
            {"lsb", Variable.Lsb},
            {"offset", Variable.Offset},
            {"storageLow", number(Variable.StorageLow)},
            {"storageHigh", number(Variable.StorageHigh)},
            {"hasLimits", Variable.HasLimits},
            {"lower", number(Variable.Lower)},
            {"upper", number(Variable.Upper)},
            {"saturatesLow", Variable.SaturatesLow},
            {"saturatesHigh", Variable.SaturatesHigh},
            {"count", Variable.Count},
            {"initial", number(Variable.Initial)},
            {"place", toJson(Variable.Place)},
            {"notTracked", Variable.NotTracked},
            {"keptBecause", Variable.KeptBecause},
            {"found", toJson(Variable.Found)},
            {"versions", Variable.Versions},
            {"definitions", listOf(Variable.Definitions)},
            {"uses", listOf(Variable.Uses)}};
}

static Json toJson(const RecordedSaturation& Saturation) {
    return {{"statement", Saturation.Statement}, {"variable", Saturation.Variable},
            {"place", toJson(Saturation.Place)}, {"low", nameOf(Saturation.Low)},
            {"high", nameOf(Saturation.High)},   {"value", toJson(Saturation.Value)}};
}

static Json toJson(const RecordedFate& Fate) {
    return {{"statement", Fate.Statement},     {"isRemoved", Fate.IsRemoved},
            {"snapshot", Fate.Snapshot},       {"goesOn", Fate.GoesOn},
            {"looksUnused", Fate.LooksUnused}, {"why", Fate.Why},
            {"because", toJson(Fate.Because)}};
}

static Json toJson(const RecordedRemark& Remark) {
    return {{"kind", nameOf(Remark.What)},
            {"pass", Remark.Pass},
            {"name", Remark.Name},
            {"text", Remark.Text},
            {"place", toJson(Remark.Place)}};
}

const char* nameOf(RecordedRange::Kind Kind) {
    static const char* const Names[] = {"unknown", "undetermined", "constant", "range", "anything"};
    return Names[static_cast<std::size_t>(Kind)];
}

const char* nameOf(RecordedForm Form) {
    static const char* const Names[] = {"assignment",  "store",     "call",         "externCall",
                                        "argument",    "condition", "initialValue", "parameter",
                                        "valueReturn", "output",    "join",         "note"};
    return Names[static_cast<std::size_t>(Form)];
}

const char* nameOf(RecordedNode::Kind Kind) {
    static const char* const Names[] = {"entry", "exit", "block"};
    return Names[static_cast<std::size_t>(Kind)];
}

const char* nameOf(RecordedEdge::Kind Kind) {
    static const char* const Names[] = {"flow", "true", "false", "ssa"};
    return Names[static_cast<std::size_t>(Kind)];
}

const char* nameOf(RecordedMark Mark) {
    static const char* const Names[] = {"added", "removed", "changed"};
    return Names[static_cast<std::size_t>(Mark)];
}

const char* nameOf(RecordedChange::Kind Kind) {
    static const char* const Names[] = {"added", "removed", "replaced", "inlined", "hoisted"};
    return Names[static_cast<std::size_t>(Kind)];
}

const char* nameOf(RecordedSaturation::Answer Answer) {
    static const char* const Names[] = {"never", "may", "always", "notReached"};
    return Names[static_cast<std::size_t>(Answer)];
}

const char* nameOf(RecordedRemark::Kind Kind) {
    static const char* const Names[] = {"passed", "missed", "analysis"};
    return Names[static_cast<std::size_t>(Kind)];
}

std::string remarksToJson(const Recording& Of) {
    Json List = Json::array();
    for (const RecordedRemark& Each : Of.Remarks)
        List.push_back({{"file", Of.Sources[Each.Place.File].Name},
                        {"line", Each.Place.Line},
                        {"column", Each.Place.Column},
                        {"kind", nameOf(Each.What)},
                        {"pass", Each.Pass},
                        {"name", Each.Name},
                        {"text", Each.Text}});
    return List.dump(1, ' ', false, Json::error_handler_t::replace) + "\n";
}

std::string recordingToJson(const Recording& Of) {
    Json Root = {{"program", Of.Program},
                 {"assumptions", Of.Assumptions},
                 {"sources", listOf(Of.Sources)},
                 {"variables", listOf(Of.Variables)},
                 {"versions", listOf(Of.Versions)},
                 {"statements", listOf(Of.Statements)},
                 {"nodes", listOf(Of.Nodes)},
                 {"procedures", listOf(Of.Procedures)},
                 {"snapshots", listOf(Of.Snapshots)},
                 {"fates", listOf(Of.Fates)},
                 {"saturations", listOf(Of.Saturations)},
                 {"remarks", listOf(Of.Remarks)},
                 {"codeBefore", Of.CodeBefore},
                 {"codeAfter", Of.CodeAfter}};
    return Root.dump(-1, ' ', false, Json::error_handler_t::replace) + "\n";
}

} // namespace hpn
