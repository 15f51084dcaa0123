#include "Emitter/TestJoiner.h"

#include <cstddef>
#include <utility>

namespace hpn {

namespace {

class TestJoiner {
public:
    explicit TestJoiner(ProcedureFlow& Flow);
    void run();

private:
    bool isOnlyTest(int Node) const;
    bool absorbFalseWay(int Node);
    bool absorbTrueWay(int Node);
    void append(int Node, int Absorbed, bool Negated);
    void finish(int Absorbed, int Shared);
    void compact();

    ProcedureFlow& m_Flow;
    std::vector<int> m_WaysIn;
    std::vector<bool> m_IsGone;
    bool m_Joined = false;
};

TestJoiner::TestJoiner(ProcedureFlow& Flow)
    : m_Flow(Flow), m_WaysIn(Flow.Nodes.size(), 0), m_IsGone(Flow.Nodes.size(), false) {
    const auto count = [&](int Target) {
        if (Target != ReturnTarget)
            ++m_WaysIn[Target];
    };
    count(0);
    for (const FlowNode& Node : Flow.Nodes) {
        count(Node.True);
        if (Node.IsBranch)
            count(Node.False);
    }
}

/// A branch without code that is reached from one place.
bool TestJoiner::isOnlyTest(int Node) const {
    return Node != ReturnTarget && m_WaysIn[Node] == 1 && m_Flow.Nodes[Node].IsBranch &&
           !m_Flow.Nodes[Node].HasCode;
}

void TestJoiner::append(int Node, int Absorbed, bool Negated) {
    for (const BranchTest& Test : m_Flow.Tests[Absorbed])
        m_Flow.Tests[Node].push_back({Test.pTerm, Test.Negated != Negated});
}

void TestJoiner::finish(int Absorbed, int Shared) {
    m_IsGone[Absorbed] = true;
    m_Joined = true;
    if (Shared != ReturnTarget)
        --m_WaysIn[Shared];
}

bool TestJoiner::absorbFalseWay(int Node) {
    FlowNode& Flow = m_Flow.Nodes[Node];
    const int Second = Flow.False;
    if (!isOnlyTest(Second))
        return false;
    const FlowNode& Next = m_Flow.Nodes[Second];
    const bool Negated = Next.False == Flow.True && m_Flow.Tests[Second].size() == 1;
    if (Next.True != Flow.True && !Negated)
        return false;
    append(Node, Second, Negated);
    Flow.False = Negated ? Next.True : Next.False;
    finish(Second, Flow.True);
    return true;
}

/// The same seen from the other side: the first question is turned round.
bool TestJoiner::absorbTrueWay(int Node) {
    FlowNode& Flow = m_Flow.Nodes[Node];
    if (!isOnlyTest(Flow.True) || m_Flow.Tests[Node].size() != 1)
        return false;
    const FlowNode& Next = m_Flow.Nodes[Flow.True];
    const bool CanTurn = Next.False == Flow.False && m_Flow.Tests[Flow.True].size() == 1;
    if (Next.True != Flow.False && !CanTurn)
        return false;
    m_Flow.Tests[Node][0].Negated = !m_Flow.Tests[Node][0].Negated;
    std::swap(Flow.True, Flow.False);
    return absorbFalseWay(Node);
}

void TestJoiner::run() {
    for (std::size_t i = 0; i < m_Flow.Nodes.size(); ++i) {
        const int Node = static_cast<int>(i);
        while (!m_IsGone[i] && m_Flow.Nodes[i].IsBranch &&
               (absorbFalseWay(Node) || absorbTrueWay(Node)))
            ;
    }
    if (m_Joined)
        compact();
}

void TestJoiner::compact() {
    std::vector<int> NumberOf(m_Flow.Nodes.size(), 0);
    std::size_t Kept = 0;
    for (std::size_t i = 0; i < m_Flow.Nodes.size(); ++i) {
        if (m_IsGone[i])
            continue;
        NumberOf[i] = static_cast<int>(Kept);
        m_Flow.Nodes[Kept] = m_Flow.Nodes[i];
        m_Flow.FirstItem[Kept] = m_Flow.FirstItem[i];
        if (Kept != i)
            m_Flow.Tests[Kept] = std::move(m_Flow.Tests[i]);
        ++Kept;
    }
    m_Flow.FirstItem[Kept] = m_Flow.FirstItem[m_Flow.Nodes.size()];
    m_Flow.Nodes.resize(Kept);
    m_Flow.FirstItem.resize(Kept + 1);
    m_Flow.Tests.resize(Kept);
    for (FlowNode& Node : m_Flow.Nodes)
        for (int* pTarget : {&Node.True, &Node.False})
            if (*pTarget != ReturnTarget)
                *pTarget = NumberOf[*pTarget];
}

} // namespace

void joinTests(ProcedureFlow& Flow) {
    if (!Flow.Nodes.empty())
        TestJoiner(Flow).run();
}

} // namespace hpn
