#include "Seeing/Layout.h"

#include <algorithm>
#include <map>
#include <string>

namespace hpn {

namespace {

// State of each node of a snapshot, by id: in order, so that marks come in order.
std::map<unsigned, int> nodesOf(const Recording& Of, const RecordedSnapshot& Snapshot) {
    std::map<unsigned, int> Nodes;
    for (int Procedure : Snapshot.Procedures)
        for (int Node : Of.Procedures[static_cast<std::size_t>(Procedure)].Nodes)
            Nodes.emplace(Of.Nodes[static_cast<std::size_t>(Node)].Id, Node);
    return Nodes;
}

void markNodes(const Recording& Of, const RecordedSnapshot& Former, RecordedSnapshot& Last) {
    const std::map<unsigned, int> Old = nodesOf(Of, Former);
    const std::map<unsigned, int> New = nodesOf(Of, Last);
    for (const auto& [Id, State] : New) {
        const auto Found = Old.find(Id);
        if (Found == Old.end())
            Last.Marks.emplace_back(Id, RecordedMark::Added);
        else if (Found->second != State)
            Last.Marks.emplace_back(Id, RecordedMark::Changed);
    }
    for (const auto& [Id, State] : Old)
        if (New.count(Id) == 0)
            Last.Marks.emplace_back(Id, RecordedMark::Removed);
    std::sort(Last.Marks.begin(), Last.Marks.end());
}

class Comparison {
public:
    Comparison(Recording& Of, bool IsInlining, bool IsHoisting)
        : m_Of(Of), m_IsInlining(IsInlining), m_IsHoisting(IsHoisting),
          m_Old(Of, Of.Snapshots[Of.Snapshots.size() - 2]), m_New(Of, Of.Snapshots.back()) {}

    std::vector<RecordedChange> compare() {
        for (const Layout::Entry& Entry : m_New.getEntries())
            compareNew(Entry);
        for (const Layout::Entry& Entry : m_Old.getEntries())
            if (m_New.find(statement(Entry.State).Id) == nullptr)
                noteRemoved(Entry);
        sort();
        return std::move(m_Changes);
    }

private:
    const RecordedStatement& statement(int State) const {
        return m_Of.Statements[static_cast<std::size_t>(State)];
    }

    void note(RecordedChange::Kind What, int Before, int After, const Layout::Entry& Entry) {
        RecordedChange Change;
        Change.What = What;
        Change.Before = Before;
        Change.After = After;
        Change.Node = Entry.Node;
        Change.Procedure = m_Of.Procedures[static_cast<std::size_t>(Entry.Procedure)].Name;
        m_Changes.push_back(std::move(Change));
    }

    void compareNew(const Layout::Entry& Entry) {
        using Kind = RecordedChange::Kind;
        const Layout::Entry* pOld = m_Old.find(statement(Entry.State).Id);
        if (pOld == nullptr)
            return note(Kind::Added, -1, Entry.State, Entry);
        if (m_IsHoisting && pOld->Node != Entry.Node)
            return note(Kind::Hoisted, pOld->State, Entry.State, Entry);
        if (statement(pOld->State).Text != statement(Entry.State).Text)
            note(Kind::Replaced, pOld->State, Entry.State, Entry);
    }

    void noteRemoved(const Layout::Entry& Entry) {
        const bool IsInlined = m_IsInlining && statement(Entry.State).Form == RecordedForm::Call;
        note(IsInlined ? RecordedChange::Kind::Inlined : RecordedChange::Kind::Removed, Entry.State,
             -1, Entry);
    }

    // By procedure, as the last snapshot lists them, those that are gone behind; within it by node.
    void sort() {
        std::map<std::string, std::size_t> Ranks;
        const std::size_t Last = m_Of.Snapshots.size() - 1;
        for (std::size_t Number : {Last, Last - 1})
            for (int Procedure : m_Of.Snapshots[Number].Procedures)
                Ranks.emplace(m_Of.Procedures[static_cast<std::size_t>(Procedure)].Name,
                              Ranks.size());
        const auto Comes = [&Ranks](const RecordedChange& a, const RecordedChange& b) {
            const std::size_t RankA = Ranks.find(a.Procedure)->second;
            const std::size_t RankB = Ranks.find(b.Procedure)->second;
            return RankA != RankB ? RankA < RankB : a.Node < b.Node;
        };
        std::stable_sort(m_Changes.begin(), m_Changes.end(), Comes);
    }

    Recording& m_Of;
    bool m_IsInlining;
    bool m_IsHoisting;
    Layout m_Old;
    Layout m_New;
    std::vector<RecordedChange> m_Changes;
};

} // namespace

Layout::Layout(const Recording& Of, const RecordedSnapshot& Snapshot) {
    for (int Procedure : Snapshot.Procedures) {
        for (int Node : Of.Procedures[static_cast<std::size_t>(Procedure)].Nodes) {
            const RecordedNode& State = Of.Nodes[static_cast<std::size_t>(Node)];
            for (int Statement : State.Statements) {
                m_Places.emplace(Of.Statements[static_cast<std::size_t>(Statement)].Id,
                                 m_Entries.size());
                m_Entries.push_back({Statement, State.Id, Procedure});
            }
        }
    }
}

const Layout::Entry* Layout::find(unsigned StatementId) const {
    const auto Found = m_Places.find(StatementId);
    return Found != m_Places.end() ? &m_Entries[Found->second] : nullptr;
}

void compareLastSnapshots(Recording& Of, bool IsInlining, bool IsHoisting) {
    if (Of.Snapshots.size() < 2)
        return;
    RecordedSnapshot& Last = Of.Snapshots.back();
    markNodes(Of, Of.Snapshots[Of.Snapshots.size() - 2], Last);
    Last.Changes = Comparison(Of, IsInlining, IsHoisting).compare();
    for (const RecordedChange& Each : Last.Changes)
        ++Last.Tally[static_cast<std::size_t>(Each.What)];
}

} // namespace hpn
