#include "Driver/Reports.h"

#include <nlohmann/json.hpp>

#include <cstdarg>
#include <cstdio>

namespace hpn {

namespace {

// The formats of printf are those of C on every system, whatever the system's own are.
#ifdef _WIN32
#define HPN_PRINTF gnu_printf
#else
#define HPN_PRINTF printf
#endif

// A line of a report by a format of printf; lines are short.
[[gnu::format(HPN_PRINTF, 2, 3)]] void appendLine(std::string& Text, const char* Format, ...) {
    char Line[256];
    va_list Arguments;
    va_start(Arguments, Format);
    std::vsnprintf(Line, sizeof Line, Format, Arguments);
    va_end(Arguments);
    Text += Line;
    Text += '\n';
}

void appendCounts(std::string& Text, const char* Name, const GraphCounts& Counts,
                  const std::string& Effect = "") {
    appendLine(Text, "%-36s %10zu %10zu %10zu %10zu %10zu%s", Name, Counts.Statements,
               Counts.Conditions, Counts.Procedures, Counts.Blocks, Counts.Nodes, Effect.c_str());
}

// The single figures, under the names that both forms of the report use.
struct Figure {
    const char* Key;
    const char* Title;
    std::size_t Statistics::*pValue;
};

const Figure Figures[] = {
    {"proceduresExtracted", "procedures extracted", &Statistics::ProceduresExtracted},
    {"proceduresInlined", "procedures inlined", &Statistics::ProceduresInlined},
    {"recursiveProcedures", "  not inlined: call themselves", &Statistics::RecursiveProcedures},
    {"exportedProcedures", "  not inlined: called from outside", &Statistics::ExportedProcedures},
    {"conditionAssignments", "condition assignments made", &Statistics::ConditionAssignments},
    {"iterations", "iterations of the propagation", &Statistics::Iterations},
    {"constantsFound", "constants found (versions)", &Statistics::ConstantsFound},
    {"deadNodesRemoved", "dead nodes removed", &Statistics::DeadNodesRemoved},
    {"unusedDefinitionsRemoved", "unused definitions removed",
     &Statistics::UnusedDefinitionsRemoved},
    {"statementsHoisted", "statements hoisted", &Statistics::StatementsHoisted},
};

nlohmann::ordered_json toJson(const GraphCounts& Counts) {
    return {{"statements", Counts.Statements}, {"conditions", Counts.Conditions},
            {"procedures", Counts.Procedures}, {"blocks", Counts.Blocks},
            {"nodes", Counts.Nodes},           {"edges", Counts.Edges}};
}

} // namespace

std::string printStatistics(const Statistics& Counts) {
    std::string Text;
    appendLine(Text, "%-36s %10s %10s %10s %10s %10s", "", "statements", "conditions", "procedures",
               "blocks", "nodes");
    appendCounts(Text, "as written", Counts.Before);
    for (const Statistics::Record& Each : Counts.Passes)
        appendCounts(Text, Each.PassName, Each.After,
                     "   " + std::to_string(Each.Figure) + " " + Each.What);
    Text += '\n';
    for (const Figure& Each : Figures)
        appendLine(Text, "%-36s %10zu", Each.Title, Counts.*Each.pValue);
    return Text;
}

std::string printComparison(const Statistics& Without, const Statistics& With,
                            const std::vector<std::string>& Assumptions) {
    std::string Text = "\nfor this run alone:\n";
    for (const std::string& Each : Assumptions)
        Text += "  " + Each + "\n";
    appendLine(Text, "%-36s %10s %10s %10s", "", "without", "with", "difference");
    const auto appendPair = [&Text](const char* Name, std::size_t Old, std::size_t New) {
        appendLine(Text, "%-36s %10zu %10zu %+10lld", Name, Old, New,
                   static_cast<long long>(New) - static_cast<long long>(Old));
    };
    appendPair("statements at the end", Without.After.Statements, With.After.Statements);
    appendPair("conditions at the end", Without.After.Conditions, With.After.Conditions);
    appendPair("procedures at the end", Without.After.Procedures, With.After.Procedures);
    appendPair("nodes at the end", Without.After.Nodes, With.After.Nodes);
    for (const Figure& Each : Figures)
        appendPair(Each.Title, Without.*Each.pValue, With.*Each.pValue);
    return Text;
}

std::string printStatisticsAsJson(const Statistics& Counts, const std::string& ProgramName,
                                  const std::vector<std::string>& Assumptions,
                                  const Statistics* pWithout) {
    nlohmann::ordered_json Root;
    Root["program"] = ProgramName;
    Root["before"] = toJson(Counts.Before);
    Root["after"] = toJson(Counts.After);
    for (const Figure& Each : Figures)
        Root[Each.Key] = Counts.*Each.pValue;
    if (pWithout != nullptr) {
        Root["assumptions"] = Assumptions;
        nlohmann::ordered_json& Without = Root["without"];
        Without["after"] = toJson(pWithout->After);
        for (const Figure& Each : Figures)
            Without[Each.Key] = pWithout->*Each.pValue;
    }
    Root["passes"] = nlohmann::ordered_json::array();
    for (const Statistics::Record& Each : Counts.Passes)
        Root["passes"].push_back({{"name", Each.PassName},
                                  {"figure", Each.Figure},
                                  {"what", Each.What},
                                  {"after", toJson(Each.After)}});
    using Handler = nlohmann::ordered_json::error_handler_t;
    return Root.dump(2, ' ', false, Handler::replace) + "\n";
}

std::string TimeObserver::print() const {
    double Total = 0.0;
    for (const PassStep& Step : m_Steps)
        Total += Step.Seconds;
    std::string Text;
    appendLine(Text, "%-36s %12s %7s", "pass", "seconds", "share");
    for (const PassStep& Step : m_Steps)
        appendLine(Text, "%-36s %12.6f %6.1f%%", Step.pPass->Name, Step.Seconds,
                   Total > 0.0 ? 100.0 * Step.Seconds / Total : 0.0);
    appendLine(Text, "%-36s %12.6f", "all passes", Total);
    return Text;
}

} // namespace hpn
