#ifndef PASSRUNNER_H
#define PASSRUNNER_H

#include "Road/PassSequence.h"

#include <vector>

namespace hpn {

class ProgramGraph;

/// One pass of one run.
struct PassStep {
    const Pass* pPass = nullptr;
    unsigned Number = 0;  ///< place in the sequence, from 1
    double Seconds = 0.0; ///< what the pass itself took; only known after it
};

/// Sees the graph between the passes. Dumps, counts, times and progress are observers; none of them
/// changes what the passes do.
class PassObserver {
public:
    virtual ~PassObserver() = default;
    /// The graph as it was built.
    virtual void beforeAll(ProgramGraph&) {}
    virtual void beforePass(const PassStep&, ProgramGraph&) {}
    virtual void afterPass(const PassStep&, ProgramGraph&) {}
    /// The graph as it goes to the emitter; not called when the run was stopped.
    virtual void afterAll(ProgramGraph&) {}
    /// Asked after each pass: true ends the run there, for instance because the library has
    /// reported that something is broken.
    virtual bool wantsToStop() { return false; }
};

/// Runs the passes of a sequence on one graph, once. Does besides what the road asks of the client
/// itself: where SSA form is wanted without inlining, the calls are registered at their procedures
/// beforehand.
class PassRunner {
public:
    explicit PassRunner(ProgramGraph& Graph) : m_Graph(Graph) {}

    /// Observers are told in the order in which they were added, and have to outlive the run.
    void addObserver(PassObserver& Observer) { m_Observers.push_back(&Observer); }
    /// False: an observer stopped the run, and the graph is not fit for emission.
    bool run(const PassSequence& Sequence);

private:
    void runPass(PassStep& Step, bool IsAppendCallsWanted);
    bool isStopWanted();

    ProgramGraph& m_Graph;
    std::vector<PassObserver*> m_Observers;
};

} // namespace hpn

#endif
