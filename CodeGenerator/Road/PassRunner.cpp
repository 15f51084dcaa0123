#include "Road/PassRunner.h"

#include "Graph/ProgramGraph.h"

#include <chrono>

namespace hpn {

bool PassRunner::run(const PassSequence& Sequence) {
    for (PassObserver* pObserver : m_Observers)
        pObserver->beforeAll(m_Graph);
    if (isStopWanted())
        return false;
    // The inlining pass registers every call itself; a second registration would double each
    // argument.
    const bool IsInlining = Sequence.contains(PassId::InlineProcedures);
    unsigned Number = 0;
    for (const PassId Id : Sequence.getPasses()) {
        PassStep Step;
        Step.pPass = &passOf(Id);
        Step.Number = ++Number;
        runPass(Step, Id == PassId::TransformToSSAForm && !IsInlining);
        if (isStopWanted())
            return false;
    }
    for (PassObserver* pObserver : m_Observers)
        pObserver->afterAll(m_Graph);
    return true;
}

void PassRunner::runPass(PassStep& Step, bool IsAppendCallsWanted) {
    for (PassObserver* pObserver : m_Observers)
        pObserver->beforePass(Step, m_Graph);
    const auto Start = std::chrono::steady_clock::now();
    if (IsAppendCallsWanted)
        m_Graph.appendCalls();
    Step.pPass->pRun(m_Graph);
    Step.Seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - Start).count();
    for (PassObserver* pObserver : m_Observers)
        pObserver->afterPass(Step, m_Graph);
}

bool PassRunner::isStopWanted() {
    for (PassObserver* pObserver : m_Observers)
        if (pObserver->wantsToStop())
            return true;
    return false;
}

} // namespace hpn
