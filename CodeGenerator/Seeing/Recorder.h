#ifndef RECORDER_H
#define RECORDER_H

#include "Road/PassRunner.h"
#include "Seeing/Recording.h"
#include "Seeing/StateReader.h"

#include <memory>

namespace hpn {

/// Records a run: what the graph holds between the passes, what each pass changed, what the
/// propagation found and why, and the C before and after. As an observer it only looks; the passes
/// do the same with and without it. The recording is complete after `finish`.
///
/// Cost: a walk over the graph and its text for each pass.
class Recorder : public PassObserver {
public:
    /// The sources must outlive this object.
    explicit Recorder(const SourceFiles& Sources) : m_Sources(Sources) {}

    void beforeAll(ProgramGraph& Graph) override;
    void afterPass(const PassStep& Step, ProgramGraph& Graph) override;
    void afterAll(ProgramGraph& Graph) override;

    /// Draws the conclusions that need the whole run. Call it once, after the run; the graph may be
    /// gone by then.
    Recording& finish();
    Recording& getRecording() { return m_Recording; }

private:
    void takeSnapshot();
    void noteWrittenPlaces();
    void noteDefinitions();

    const SourceFiles& m_Sources;
    Recording m_Recording;
    std::unique_ptr<StateReader> m_pReader;
    std::size_t m_NotedStatements = 0; // so many states of the pool have been looked at
};

} // namespace hpn

#endif
