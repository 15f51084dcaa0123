#include "Seeing/ReportData.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <cmath>
#include <unordered_map>

namespace hpn {

using Json = nlohmann::ordered_json;

namespace {

Json number(double Value) {
    if (std::isnan(Value))
        return "nan";
    if (std::isinf(Value))
        return Value > 0.0 ? "inf" : "-inf";
    return Value;
}

std::uint64_t place(const RecordedPlace& Place) {
    if (!Place.isKnown())
        return 0;
    return (std::uint64_t{Place.File} << 32) + std::uint64_t{Place.Line} * 4096 +
           std::min(Place.Column, 4095u);
}

Json places(const std::vector<RecordedPlace>& Places) {
    Json List = Json::array();
    for (const RecordedPlace& Each : Places)
        List.push_back(place(Each));
    return List;
}

Json range(const RecordedRange& Range) {
    if (Range.What == RecordedRange::Kind::Constant || Range.What == RecordedRange::Kind::Range)
        return {nameOf(Range.What), number(Range.Low), number(Range.High)};
    return Json::array({nameOf(Range.What)});
}

template <class Item, class Function>
Json table(std::initializer_list<const char*> Columns, const std::vector<Item>& Items,
           Function RowOf) {
    Json Rows = Json::array();
    for (const Item& Each : Items)
        Rows.push_back(RowOf(Each));
    return {{"columns", Columns}, {"rows", std::move(Rows)}};
}

Json sources(const Recording& Of) {
    return table({"name", "text"}, Of.Sources, [](const RecordedSource& Each) {
        return Json::array({Each.Name, Each.Text});
    });
}

Json variables(const Recording& Of) {
    return table({"name",         "owner",         "kind",      "isHidden", "type",
                  "base",         "unit",          "isScaled",  "lsb",      "offset",
                  "storageLow",   "storageHigh",   "hasLimits", "lower",    "upper",
                  "saturatesLow", "saturatesHigh", "count",     "initial",  "place",
                  "notTracked",   "keptBecause",   "found",     "versions", "definitions",
                  "uses"},
                 Of.Variables, [](const RecordedVariable& Each) {
                     return Json::array({Each.Name,
                                         Each.Owner,
                                         Each.Kind,
                                         Each.IsHidden,
                                         Each.Type,
                                         Each.Base,
                                         Each.Unit,
                                         Each.IsScaled,
                                         Each.Lsb,
                                         Each.Offset,
                                         number(Each.StorageLow),
                                         number(Each.StorageHigh),
                                         Each.HasLimits,
                                         number(Each.Lower),
                                         number(Each.Upper),
                                         Each.SaturatesLow,
                                         Each.SaturatesHigh,
                                         Each.Count,
                                         number(Each.Initial),
                                         place(Each.Place),
                                         Each.NotTracked,
                                         Each.KeptBecause,
                                         range(Each.Found),
                                         Each.Versions,
                                         places(Each.Definitions),
                                         places(Each.Uses)});
                 });
}

Json versions(const Recording& Of) {
    const auto Reasons = [](const RecordedVersion& Version) {
        Json List = Json::array();
        for (const RecordedReason& Each : Version.Explanation)
            List.push_back({Each.Text, place(Each.Place), Each.Version});
        return List;
    };
    return table(
        {"variable", "name", "definition", "isReached", "place", "found", "uses", "explanation"},
        Of.Versions, [&Reasons](const RecordedVersion& Each) {
            return Json::array({Each.Variable, Each.Name, Each.Definition, Each.IsReached,
                                place(Each.Place), range(Each.Found), places(Each.Uses),
                                Reasons(Each)});
        });
}

Json statements(const Recording& Of) {
    return table({"id", "form", "makesCode", "text", "place", "variable", "version"}, Of.Statements,
                 [](const RecordedStatement& Each) {
                     return Json::array({Each.Id, nameOf(Each.Form), Each.MakesCode ? 1 : 0,
                                         Each.Text, place(Each.Place), Each.Variable,
                                         Each.Version});
                 });
}

Json nodes(const Recording& Of) {
    return table({"id", "kind", "statements", "place"}, Of.Nodes, [](const RecordedNode& Each) {
        return Json::array({Each.Id, nameOf(Each.What), Each.Statements, place(Each.Place)});
    });
}

// SSA edges of most states are the same as in the state before: each list is stored once.
Json procedures(const Recording& Of, Json& SsaLists) {
    SsaLists = Json::array();
    std::unordered_map<std::string, std::size_t> Known; // looked up only
    return table({"name", "title", "place", "nodes", "ssa"}, Of.Procedures,
                 [&SsaLists, &Known](const RecordedProcedure& Each) {
                     Json Edges = Json::array();
                     for (const RecordedEdge& Edge : Each.Edges) {
                         if (Edge.What != RecordedEdge::Kind::Ssa)
                             continue;
                         Edges.push_back(Edge.From);
                         Edges.push_back(Edge.To);
                     }
                     const auto [Found, IsNew] = Known.emplace(Edges.dump(), SsaLists.size());
                     if (IsNew)
                         SsaLists.push_back(std::move(Edges));
                     return Json::array(
                         {Each.Name, Each.Title, place(Each.Place), Each.Nodes, Found->second});
                 });
}

Json snapshots(const Recording& Of) {
    return table({"number", "pass", "purpose", "seconds", "procedures", "nodeCount",
                  "statementCount", "conditionCount", "tally"},
                 Of.Snapshots, [](const RecordedSnapshot& Each) {
                     Json Tally;
                     for (std::size_t i = 0; i < std::size(Each.Tally); ++i)
                         Tally[nameOf(static_cast<RecordedChange::Kind>(i))] = Each.Tally[i];
                     return Json::array({Each.Number, Each.Pass, Each.Purpose, Each.Seconds,
                                         Each.Procedures, Each.NodeCount, Each.StatementCount,
                                         Each.ConditionCount, Tally});
                 });
}

Json changes(const RecordedSnapshot& Snapshot) {
    Json Table = table({"kind", "before", "after", "node", "procedure", "why"}, Snapshot.Changes,
                       [](const RecordedChange& Each) {
                           return Json::array({nameOf(Each.What), Each.Before, Each.After,
                                               Each.Node, Each.Procedure, Each.Why});
                       });
    Json Marks = Json::array();
    for (const auto& [Node, Mark] : Snapshot.Marks)
        Marks.push_back({Node, nameOf(Mark)});
    Table["marks"] = std::move(Marks);
    return Table;
}

Json fates(const Recording& Of) {
    return table({"statement", "isRemoved", "snapshot", "goesOn", "looksUnused", "why", "because"},
                 Of.Fates, [](const RecordedFate& Each) {
                     return Json::array({Each.Statement, Each.IsRemoved, Each.Snapshot, Each.GoesOn,
                                         Each.LooksUnused, Each.Why, place(Each.Because)});
                 });
}

Json saturations(const Recording& Of) {
    return table({"statement", "variable", "place", "low", "high", "value"}, Of.Saturations,
                 [](const RecordedSaturation& Each) {
                     return Json::array({Each.Statement, Each.Variable, place(Each.Place),
                                         nameOf(Each.Low), nameOf(Each.High), range(Each.Value)});
                 });
}

Json remarks(const Recording& Of) {
    return table({"kind", "pass", "name", "text", "place"}, Of.Remarks,
                 [](const RecordedRemark& Each) {
                     return Json::array(
                         {nameOf(Each.What), Each.Pass, Each.Name, Each.Text, place(Each.Place)});
                 });
}

Json layout(const PlacedPicture& Picture) {
    Json Boxes = Json::array();
    for (const PlacedPicture::Box& Each : Picture.Boxes)
        Boxes.push_back({Each.X, Each.Y, Each.Width, Each.Height});
    Json Edges = Json::array();
    for (const PlacedPicture::Edge& Each : Picture.Edges)
        Edges.push_back(Json::array({Each.From, Each.To, std::string(1, Each.What), Each.Path}));
    return {{"width", Picture.Width},
            {"height", Picture.Height},
            {"boxes", std::move(Boxes)},
            {"edges", std::move(Edges)}};
}

// Items of the boxes: a node by its number, a folded part as the list of its nodes.
Json picture(const ReportPicture& Picture) {
    Json Boxes = Json::array();
    for (const ReportBox& Box : Picture.Boxes.Boxes) {
        Json Items = Json::array();
        for (const ReportItem& Each : Box.Items)
            Items.push_back(Each.IsFolded ? Json(Each.Nodes) : Json(Each.Nodes.front()));
        Boxes.push_back(std::move(Items));
    }
    return {{"layout", Picture.Layout},
            {"isFolded", Picture.Boxes.IsFolded},
            {"isTooSlow", Picture.IsTooSlow},
            {"boxes", Picture.Layout < 0 ? Json::array() : std::move(Boxes)}};
}

Json pictures(const ReportPictures& Pictures) {
    Json Procedures = Json::array();
    for (const ReportPicture& Each : Pictures.Procedures)
        Procedures.push_back(picture(Each));
    Json Calls = Json::array();
    for (const ReportPicture& Each : Pictures.Calls)
        Calls.push_back(Each.Layout);
    return {{"isGraphvizThere", Pictures.IsGraphvizThere},
            {"leftOut", Pictures.LeftOut},
            {"procedures", std::move(Procedures)},
            {"calls", std::move(Calls)}};
}

// Bytes that are no UTF-8 become replacement characters; a "<" cannot end the element around it.
std::string writeForPage(const Json& Value) {
    const std::string Text = Value.dump(-1, ' ', false, Json::error_handler_t::replace);
    std::string Result;
    Result.reserve(Text.size());
    for (const char Each : Text) {
        if (Each == '<')
            Result += "\\u003c";
        else
            Result += Each;
    }
    return Result;
}

class PartWriter {
public:
    void add(const std::string& Name, const Json& Value, bool IsLater = true) {
        m_Parts.push_back({Name, writeForPage(Value), IsLater});
    }
    void addEarly(const std::string& Name, const Json& Value) { add(Name, Value, false); }
    std::vector<ReportPart> take() { return std::move(m_Parts); }

private:
    std::vector<ReportPart> m_Parts;
};

} // namespace

std::vector<ReportPart> writeReportData(const Recording& Of, const ReportPictures& Pictures) {
    PartWriter Writer;
    Json SsaLists;
    Writer.addEarly("about", {{"program", Of.Program}, {"assumptions", Of.Assumptions}});
    Writer.addEarly("sources", sources(Of));
    Writer.addEarly("snapshots", snapshots(Of));
    for (const RecordedSnapshot& Each : Of.Snapshots)
        Writer.addEarly("changes-" + std::to_string(Each.Number), changes(Each));
    Writer.addEarly("pictures", pictures(Pictures));
    for (std::size_t i = 0; i < Pictures.Layouts.size(); ++i)
        Writer.addEarly("layout-" + std::to_string(i), layout(Pictures.Layouts[i]));
    Writer.addEarly("procedures", procedures(Of, SsaLists));
    Writer.addEarly("nodes", nodes(Of));
    Writer.addEarly("statements", statements(Of));
    Writer.add("ssa", SsaLists);
    Writer.add("variables", variables(Of));
    Writer.add("versions", versions(Of));
    Writer.add("fates", fates(Of));
    Writer.add("saturations", saturations(Of));
    Writer.add("remarks", remarks(Of));
    Writer.add("code", {{"before", Of.CodeBefore}, {"after", Of.CodeAfter}});
    return Writer.take();
}

} // namespace hpn
