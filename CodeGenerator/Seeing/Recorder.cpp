#include "Seeing/Recorder.h"

#include "Emitter/CEmitter.h"
#include "Seeing/Explainer.h"
#include "Seeing/Fates.h"
#include "Seeing/Layout.h"
#include "Seeing/Remarks.h"

namespace hpn {

void Recorder::beforeAll(ProgramGraph& Graph) {
    m_Recording.Program = Graph.getProgram().Name;
    for (std::uint32_t File = 0; File < m_Sources.getCount(); ++File)
        m_Recording.Sources.push_back(
            {m_Sources.getName(File), std::string(m_Sources.getText(File))});
    m_pReader = std::make_unique<StateReader>(m_Recording, m_Sources, Graph);
    m_Recording.Snapshots.emplace_back().Pass = "asBuilt";
    m_Recording.Snapshots.back().Purpose = "the program as it was written";
    takeSnapshot();
    noteWrittenPlaces();
    explainVariables(m_Recording, Graph);
    m_Recording.CodeBefore = emitProgram(Graph).Source;
}

void Recorder::afterPass(const PassStep& Step, ProgramGraph& Graph) {
    RecordedSnapshot& New = m_Recording.Snapshots.emplace_back();
    New.Number = Step.Number;
    New.Pass = Step.pPass->Name;
    New.Purpose = Step.pPass->Purpose;
    New.Seconds = Step.Seconds;
    takeSnapshot();
    const PassId Id = Step.pPass->Id;
    compareLastSnapshots(m_Recording, Id == PassId::InlineProcedures,
                         Id == PassId::HoistCodeOutOfIfElseBranches);
    if (Id <= PassId::PropagateSparseConditionalConstant)
        noteDefinitions();
    if (Id == PassId::InlineProcedures)
        remarkOnCalls(m_Recording, Graph, *m_pReader);
    if (Id == PassId::HoistCodeOutOfIfElseBranches)
        remarkOnArms(m_Recording, Graph, *m_pReader);
    if (Id == PassId::PropagateSparseConditionalConstant)
        explainPropagation(m_Recording, Graph, *m_pReader);
}

void Recorder::afterAll(ProgramGraph& Graph) {
    m_Recording.CodeAfter = emitProgram(Graph).Source;
}

Recording& Recorder::finish() {
    m_pReader.reset();
    tellFates(m_Recording);
    collectRemarks(m_Recording);
    return m_Recording;
}

void Recorder::takeSnapshot() {
    m_pReader->readSnapshot(m_Recording.Snapshots.back());
}

// Where the text assigns and reads each variable. Only as it was built each place is there once.
void Recorder::noteWrittenPlaces() {
    for (const RecordedStatement& State : m_Recording.Statements) {
        if (State.MakesCode && State.Variable >= 0 && State.Place.isKnown())
            m_Recording.Variables[static_cast<std::size_t>(State.Variable)].Definitions.push_back(
                State.Place);
        for (const RecordedRead& Read : State.Reads) {
            if (State.MakesCode && Read.Variable >= 0)
                m_Recording.Variables[static_cast<std::size_t>(Read.Variable)].Uses.push_back(
                    Read.Place);
        }
    }
}

// A version's definition is the last state that a statement has had: the code that later passes
// write does not say any more where its number came from.
void Recorder::noteDefinitions() {
    for (; m_NotedStatements < m_Recording.Statements.size(); ++m_NotedStatements) {
        const RecordedStatement& State = m_Recording.Statements[m_NotedStatements];
        if (State.Version < 0)
            continue;
        RecordedVersion& Version = m_Recording.Versions[static_cast<std::size_t>(State.Version)];
        Version.Definition = static_cast<int>(m_NotedStatements);
        Version.Place = State.Place;
    }
}

} // namespace hpn
