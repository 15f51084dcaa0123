#ifndef STATISTICS_H
#define STATISTICS_H

#include "Road/PassRunner.h"

#include <cstddef>
#include <memory>
#include <vector>

namespace hpn {

class IterationProbe;

/// What stands on the graph at one moment. Only what makes code counts as statement or condition:
/// not what the library put in (values over calls, phi functions, notes from branches, the loop
/// around main) nor the callers outside.
struct GraphCounts {
    std::size_t Nodes = 0;
    std::size_t Edges = 0;      ///< of control flow
    std::size_t Blocks = 0;     ///< straight runs of code, whether they lie in one node or in many
    std::size_t Statements = 0; ///< assignments and calls
    std::size_t Conditions = 0;
    std::size_t Procedures = 0;
    std::size_t Definitions = 0; ///< statements of any kind that define a variable
    std::size_t Notes = 0;       ///< assignments that note what a branch tells
    std::size_t ConstantVersions =
        0; ///< SSA versions, defined on the graph, whose value is constant
    std::size_t PhiFunctions = 0;
    std::size_t Reads = 0;           ///< of variables, in the client's expressions
    std::size_t Operations = 0;      ///< operators and conversions in them
    std::size_t FixedConditions = 0; ///< branch conditions that are a number
};

/// Counts by walking the graph once; linear.
GraphCounts countGraph(ProgramGraph& Graph);

/// What one run did.
struct Statistics {
    struct Record {
        const char* PassName;
        double Seconds;
        GraphCounts After;
        std::size_t Figure; ///< what the pass did, counted
        const char* What;   ///< in words, of the figure
    };

    GraphCounts Before;
    GraphCounts After;
    std::vector<Record> Passes;
    std::size_t ConstantsFound = 0;   ///< versions constant after the last propagation
    std::size_t DeadNodesRemoved = 0; ///< nodes that no execution reaches
    std::size_t Iterations = 0;       ///< sweeps of all propagations together
    std::size_t UnusedDefinitionsRemoved = 0;
    std::size_t ProceduresExtracted = 0; ///< made of labels
    std::size_t ProceduresInlined = 0;
    std::size_t ConditionAssignments = 0;
    std::size_t StatementsHoisted = 0;
    std::size_t RecursiveProcedures = 0; ///< kept out of inlining because they call themselves
    std::size_t ExportedProcedures =
        0; ///< kept out because they can be called from outside, directly or indirectly
};

/// Gathers the statistics of a run. Costs a walk over the graph for each pass.
class StatisticsObserver : public PassObserver {
public:
    StatisticsObserver();
    ~StatisticsObserver() override;

    void beforeAll(ProgramGraph& Graph) override;
    void beforePass(const PassStep& Step, ProgramGraph& Graph) override;
    void afterPass(const PassStep& Step, ProgramGraph& Graph) override;

    const Statistics& getStatistics() const { return m_Statistics; }

private:
    Statistics m_Statistics;
    std::unique_ptr<IterationProbe> m_pProbe; ///< only while a propagation runs
};

} // namespace hpn

#endif
