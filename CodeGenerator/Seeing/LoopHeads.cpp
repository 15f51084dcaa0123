#include "Seeing/LoopHeads.h"

#include <unordered_map>
#include <utility>
#include <vector>

namespace hpn {

namespace {

class LoopHeadFinder {
public:
    LoopHeadFinder(const Recording& Of, const RecordedProcedure& In) : m_Of(Of) {
        for (int Index : In.Nodes) {
            const RecordedNode& Node = Of.Nodes[static_cast<std::size_t>(Index)];
            m_Places.emplace(Node.Id, m_Nodes.size());
            m_Nodes.push_back(&Node);
        }
        m_Next.resize(m_Nodes.size());
        m_WaysIn.resize(m_Nodes.size(), 0);
        for (const RecordedEdge& Edge : In.Edges) {
            if (Edge.What == RecordedEdge::Kind::Ssa)
                continue;
            m_Next[m_Places[Edge.From]].push_back(m_Places[Edge.To]);
            ++m_WaysIn[m_Places[Edge.To]];
        }
    }

    void find(std::unordered_set<unsigned>& Heads) {
        std::vector<State> States(m_Nodes.size(), State::New);
        for (std::size_t i = 0; i < m_Nodes.size(); ++i)
            if (m_Nodes[i]->What == RecordedNode::Kind::Entry)
                walk(i, States, Heads);
    }

private:
    enum class State : unsigned char { New, Open, Done };

    void walk(std::size_t Root, std::vector<State>& States, std::unordered_set<unsigned>& Heads) {
        std::vector<std::pair<std::size_t, std::size_t>> Stack{{Root, 0}};
        States[Root] = State::Open;
        while (!Stack.empty()) {
            const std::size_t Node = Stack.back().first;
            if (Stack.back().second == m_Next[Node].size()) {
                States[Node] = State::Done;
                Stack.pop_back();
                continue;
            }
            const std::size_t Next = m_Next[Node][Stack.back().second++];
            if (States[Next] == State::Open)
                noteJoins(Next, Heads);
            if (States[Next] != State::New)
                continue;
            States[Next] = State::Open;
            Stack.emplace_back(Next, 0);
        }
    }

    void noteJoins(std::size_t Node, std::unordered_set<unsigned>& Heads) const {
        for (bool IsFirst = true; IsFirst || m_WaysIn[Node] == 1; IsFirst = false) {
            bool HasJoin = false;
            for (int Index : m_Nodes[Node]->Statements) {
                const RecordedStatement& Each = m_Of.Statements[static_cast<std::size_t>(Index)];
                if (Each.Form == RecordedForm::Join) {
                    HasJoin = true;
                    Heads.insert(Each.Id);
                }
            }
            if (!HasJoin || m_Next[Node].size() != 1)
                return;
            Node = m_Next[Node].front();
        }
    }

    const Recording& m_Of;
    std::vector<const RecordedNode*> m_Nodes;
    std::unordered_map<unsigned, std::size_t> m_Places; // by id
    std::vector<std::vector<std::size_t>> m_Next;
    std::vector<unsigned> m_WaysIn;
};

} // namespace

std::unordered_set<unsigned> findLoopHeads(const Recording& Of) {
    std::unordered_set<unsigned> Heads;
    for (int Procedure : Of.Snapshots.back().Procedures)
        LoopHeadFinder(Of, Of.Procedures[static_cast<std::size_t>(Procedure)]).find(Heads);
    return Heads;
}

} // namespace hpn
