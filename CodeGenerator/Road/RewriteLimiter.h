#ifndef REWRITELIMITER_H
#define REWRITELIMITER_H

#include "Model/RewriteBudget.h"
#include "Road/PassRunner.h"

namespace hpn {

/// Limits the single changes of a run. Most are asked for at the client's own classes while a pass
/// runs (see `RewriteBudget`). Two passes ask nothing that could be answered one by one; for these
/// it is settled before the pass which of their changes may happen, by going through them in the
/// pass's own order:
///
/// - Inlining: a call that is held back is marked as one that can come from outside. That also
/// keeps
///   the propagation from learning from its arguments, which is less than could be known, and
///   sound.
/// - Removal of unused definitions: the pass is played through on counts alone, and each definition
///   that comes too late gets a use that nothing takes away.
///
/// Costs nothing while the limit is not reached but these two walks.
class RewriteLimiter : public PassObserver {
public:
    explicit RewriteLimiter(std::size_t Limit) : m_Budget(Limit) {}

    void beforePass(const PassStep& Step, ProgramGraph& Graph) override;
    const RewriteBudget& getBudget() const { return m_Budget; }

private:
    void holdBackCalls(ProgramGraph& Graph);
    void registerConditions(ProgramGraph& Graph);
    void holdBackRemovals(ProgramGraph& Graph);

    RewriteBudget m_Budget;
};

} // namespace hpn

#endif
