#include "Road/RangeTable.h"

#include "Graph/ProgramGraph.h"
#include "Language/SourceFiles.h"
#include "Model/ZfCCfgSFAssignment.h"

#include <algorithm>
#include <cstdio>

namespace hpn {

namespace {

using Origin = VersionFinding::Origin;

std::string numberText(double Number) {
    char Text[40];
    std::snprintf(Text, sizeof Text, "%.10g", Number);
    return Text;
}

Finding findingOf(ZfCCfgVariable* pVersion) {
    Finding Result;
    const ZfCCfgValue Value = pVersion->getValue();
    const ZfCCfgValue Low = pVersion->getMinValue();
    const ZfCCfgValue High = pVersion->getMaxValue();
    // The ends of a range mean something only where the value itself is known to be known.
    if (Value.isUndetermined())
        return Result;
    if (Value.isConstant())
        return {Finding::Kind::Constant, Value.getValue(), Value.getValue()};
    if (Low.isConstant() && High.isConstant())
        return {Finding::Kind::Range, Low.getValue(), High.getValue()};
    Result.What = Finding::Kind::Anything;
    return Result;
}

// Fills origin and place from the defining statement.
void describeDefinition(ZfCCfgStatement* pStatement, const Variable& Declaration,
                        VersionFinding& Result) {
    Result.HasPosition = true;
    Result.Position = Declaration.Position;
    ZfCCfgAssignment* pAssignment = pStatement->isAssignment();
    if (ZfCCfgSFAssignment* pOwn = pStatement->isSFAssignment()) {
        Result.From = Origin::Assignment;
        Result.Position = pOwn->getPosition();
    } else if (pAssignment != nullptr && pAssignment->getIsValidConditionAssignment()) {
        Result.From = Origin::Branch;
        Result.HasPosition = false;
    } else if (pAssignment != nullptr) {
        Result.From =
            Declaration.Kind == VariableKind::Formal ? Origin::Argument : Origin::InitialValue;
    } else if (pStatement->isParamStatement() != nullptr) {
        Result.From = Origin::Argument;
        Result.HasPosition = Declaration.Kind == VariableKind::Formal;
    } else {
        Result.From = pStatement->isPhiFunction() != nullptr ? Origin::Join : Origin::Call;
        Result.HasPosition = false;
    }
}

void collectStatement(ZfCCfgStatement* pStatement, std::vector<RangeRow>& Rows) {
    for (ZfCCfgVariable* pVersion : pStatement->getDefinedVariables()) {
        const ZfCCfgSFVariable* pOriginal = originalOf(pVersion);
        if (pOriginal == nullptr)
            continue;
        const Variable& Declaration = pOriginal->getDeclaration();
        if (Declaration.Index >= Rows.size())
            continue; // a hidden one, which the source does not name
        RangeRow& Row = Rows[Declaration.Index];
        Row.pVariable = &Declaration;
        if (pVersion->isArray())
            Row.NotTracked = "not tracked: array";
        else if (pVersion->isVolatile())
            Row.NotTracked = "not tracked: can change outside";
        if (Row.NotTracked != nullptr)
            continue;
        VersionFinding Version;
        describeDefinition(pStatement, Declaration, Version);
        Version.Found = findingOf(pVersion);
        Row.Versions.push_back(Version);
    }
}

const char* originText(Origin From) {
    switch (From) {
    case Origin::InitialValue:
        return "initial value";
    case Origin::Assignment:
        return "";
    case Origin::Argument:
        return "on entry";
    case Origin::Call:
        return "after a call";
    case Origin::Join:
        return "where ways meet";
    case Origin::Branch:
        return "told by a branch";
    }
    return "";
}

std::string nameText(const Variable& Declaration) {
    std::string Text;
    if (Declaration.pOwner != nullptr)
        Text = std::string(Declaration.pOwner->Name) + ".";
    if (Declaration.Kind == VariableKind::Result)
        return Text + "(result)";
    return Text + std::string(Declaration.Name);
}

std::string typeText(const Variable& Declaration) {
    std::string Text(Declaration.pType->Name);
    if (Declaration.Count != 0)
        Text += "[" + std::to_string(Declaration.Count) + "]";
    return Text;
}

std::string placeText(const VersionFinding& Version, const SourceFiles& Sources) {
    std::string Text;
    if (Version.HasPosition) {
        Text = Sources.getName(Version.Position.File);
        Text += ":" + std::to_string(Sources.locate(Version.Position).Line);
    }
    const char* Origin = originText(Version.From);
    if (*Origin != '\0')
        Text += Text.empty() ? Origin : std::string(" (") + Origin + ")";
    return Text;
}

// The table before it is laid out: four cells in each line.
using Line = std::vector<std::string>;

void appendLines(const RangeRow& Row, const SourceFiles& Sources, std::vector<Line>& Lines) {
    const std::string Name = nameText(*Row.pVariable);
    const std::string Type = typeText(*Row.pVariable);
    if (Row.NotTracked != nullptr) {
        Lines.push_back({Name, Type, Row.NotTracked, ""});
        return;
    }
    const bool IsOne = Row.Versions.size() == 1;
    Lines.push_back({Name, Type, Row.summary().toText(),
                     IsOne ? placeText(Row.Versions.front(), Sources) : ""});
    if (IsOne)
        return;
    for (const VersionFinding& Version : Row.Versions)
        Lines.push_back({"", "", "  " + Version.Found.toText(), placeText(Version, Sources)});
}

std::string layOut(const std::vector<Line>& Lines) {
    std::size_t Widths[4] = {};
    for (const Line& Each : Lines)
        for (std::size_t Cell = 0; Cell < Each.size(); ++Cell)
            Widths[Cell] = std::max(Widths[Cell], Each[Cell].size());
    std::string Text;
    for (const Line& Each : Lines) {
        std::string Out;
        for (std::size_t Cell = 0; Cell < Each.size(); ++Cell) {
            Out += Each[Cell];
            Out.append(Widths[Cell] - Each[Cell].size() + 2, ' ');
        }
        Text += Out.substr(0, Out.find_last_not_of(' ') + 1) + "\n";
    }
    return Text;
}

} // namespace

std::string Finding::toText() const {
    switch (What) {
    case Kind::Undetermined:
        return "undetermined";
    case Kind::Constant:
        return numberText(Low);
    case Kind::Range:
        return numberText(Low) + " .. " + numberText(High);
    case Kind::Anything:
        return "any";
    }
    return "";
}

Finding RangeRow::summary() const {
    if (Versions.empty())
        return {};
    Finding Result = Versions.front().Found;
    for (const VersionFinding& Version : Versions)
        Result = joinFindings(Result, Version.Found);
    return Result;
}

std::vector<RangeRow> collectRanges(ProgramGraph& Program) {
    std::vector<RangeRow> Rows(Program.getProgram().Variables.size());
    ZfCControlFlowGraph& Graph = Program.getGraph();
    for (leda::node v = Graph.first_node(); v != nullptr; v = Graph.next_node(v)) {
        ZfCBasicBlock* pBlock = Graph.inf(v)->isBasicBlock();
        if (pBlock == nullptr)
            continue;
        for (ZfCPhiFunction* pPhi : pBlock->getPhiFunctions())
            collectStatement(pPhi, Rows);
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
            collectStatement(pStatement, Rows);
    }
    const auto isUnnamed = [](const RangeRow& Row) { return Row.pVariable == nullptr; };
    Rows.erase(std::remove_if(Rows.begin(), Rows.end(), isUnnamed), Rows.end());
    return Rows;
}

std::string printRanges(const std::vector<RangeRow>& Rows, const SourceFiles& Sources) {
    std::vector<Line> Lines{{"variable", "type", "value or range", "defined"}};
    for (const RangeRow& Row : Rows)
        appendLines(Row, Sources, Lines);
    return layOut(Lines);
}

void RangeObserver::afterPass(const PassStep& Step, ProgramGraph& Graph) {
    if (Step.pPass->Id == PassId::PropagateSparseConditionalConstant)
        m_Rows = collectRanges(Graph);
}

} // namespace hpn
