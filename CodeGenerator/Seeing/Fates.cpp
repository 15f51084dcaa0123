#include "Seeing/Fates.h"

#include "Seeing/Layout.h"

#include <algorithm>
#include <memory>
#include <unordered_map>
#include <unordered_set>

// Grounds of a removal, by what removed it:
//
// - Propagation: control does not come there. From the nodes that stayed, the walk goes into the
//   removed ones; the branch by which it enters is the reason.
// - Removal of unused definitions: nothing reads the version. What once read it, and what became of
//   that, is the rest of the story.
// - Hoisting: the equal statement of the other arm was moved in front of the branch.
//
// A statement that stays although no code reads its version: its variable can be seen from outside,
// computing it reads an input, or the value goes on, over joins, calls and steps, to code that
// reads it; failing all that, it is read by its own next value alone.

namespace hpn {

namespace {

const char* const DeadCodePass = "propagateSparseConditionalConstant";
const char* const UnusedPass = "removeUnusedVarDefs";
const char* const HoistingPass = "hoistCodeOutOfIfElseBranches";

// The text between "if (" and ")".
std::string conditionText(const RecordedStatement& Condition) {
    constexpr std::size_t Front = 4;
    return Condition.Text.size() > Front + 1
               ? Condition.Text.substr(Front, Condition.Text.size() - Front - 1)
               : Condition.Text;
}

bool isOfProgram(const RecordedStatement& Statement) {
    return Statement.MakesCode && Statement.Place.isKnown();
}

// Who reads each version in one snapshot.
class Readers {
public:
    Readers(const Recording& Of, const RecordedSnapshot& Snapshot) : m_Readers(Of.Versions.size()) {
        const Layout Where(Of, Snapshot);
        for (const Layout::Entry& Entry : Where.getEntries())
            for (const RecordedRead& Read :
                 Of.Statements[static_cast<std::size_t>(Entry.State)].Reads)
                note(Read.Version, Entry.State);
    }

    /// Indices into Statements, each once.
    const std::vector<int>& of(int Version) const {
        return m_Readers[static_cast<std::size_t>(Version)];
    }

private:
    void note(int Version, int State) {
        if (Version < 0)
            return;
        std::vector<int>& List = m_Readers[static_cast<std::size_t>(Version)];
        if (List.empty() || List.back() != State)
            List.push_back(State);
    }

    std::vector<std::vector<int>> m_Readers; // by version
};

// The branch by which control would enter each removed node.
class DeadCodeGrounds {
public:
    DeadCodeGrounds(const Recording& Of, const RecordedSnapshot& Before,
                    const RecordedSnapshot& After)
        : m_Of(Of) {
        for (int Procedure : After.Procedures)
            for (int Node : procedure(Procedure).Nodes)
                m_Stayed.insert(node(Node).Id);
        for (int Procedure : Before.Procedures)
            enter(procedure(Procedure));
    }

    /// Index of the condition in Statements, or -1.
    int find(unsigned Node) const {
        const auto Found = m_Branch.find(Node);
        return Found != m_Branch.end() ? Found->second.Condition : -1;
    }
    bool isTrueArm(unsigned Node) const { return m_Branch.find(Node)->second.IsTrueArm; }

private:
    struct Entrance {
        int Condition;
        bool IsTrueArm;
    };

    const RecordedProcedure& procedure(int Index) const {
        return m_Of.Procedures[static_cast<std::size_t>(Index)];
    }
    const RecordedNode& node(int Index) const {
        return m_Of.Nodes[static_cast<std::size_t>(Index)];
    }

    void enter(const RecordedProcedure& In) {
        std::unordered_map<unsigned, int> Conditions; // of the nodes that stayed
        for (int Index : In.Nodes) {
            const RecordedNode& Node = node(Index);
            if (!Node.Statements.empty() && m_Stayed.count(Node.Id) != 0 &&
                m_Of.Statements[static_cast<std::size_t>(Node.Statements.back())].Form ==
                    RecordedForm::Condition)
                Conditions.emplace(Node.Id, Node.Statements.back());
        }
        std::unordered_map<unsigned, std::vector<unsigned>> Next;
        std::vector<unsigned> Work;
        for (const RecordedEdge& Edge : In.Edges) {
            if (Edge.What == RecordedEdge::Kind::Ssa || m_Stayed.count(Edge.To) != 0)
                continue;
            Next[Edge.From].push_back(Edge.To);
            const auto Found = Conditions.find(Edge.From);
            const bool IsArm = Edge.What != RecordedEdge::Kind::Flow;
            if (Found != Conditions.end() && IsArm &&
                m_Branch
                    .try_emplace(Edge.To,
                                 Entrance{Found->second, Edge.What == RecordedEdge::Kind::True})
                    .second)
                Work.push_back(Edge.To);
        }
        for (std::size_t i = 0; i < Work.size(); ++i)
            for (unsigned To : Next[Work[i]])
                if (m_Branch.try_emplace(To, m_Branch.find(Work[i])->second).second)
                    Work.push_back(To);
    }

    const Recording& m_Of;
    std::unordered_set<unsigned> m_Stayed;           // ids
    std::unordered_map<unsigned, Entrance> m_Branch; // by id of the removed node
};

class FateTeller {
public:
    explicit FateTeller(Recording& Of) : m_Of(Of) {}

    void run() {
        m_Of.Fates.clear();
        findFirstReaders();
        for (std::size_t i = 1; i < m_Of.Snapshots.size(); ++i)
            tellRemoved(i);
        tellKept();
    }

private:
    const RecordedStatement& statement(int Index) const {
        return m_Of.Statements[static_cast<std::size_t>(Index)];
    }
    RecordedSnapshot& snapshot(std::size_t Number) { return m_Of.Snapshots[Number]; }

    // Readers at the moment at which versions came to be.
    void findFirstReaders() {
        for (const RecordedSnapshot& Each : m_Of.Snapshots)
            if (Each.Pass == "transformToSSAForm")
                m_FirstReaders = std::make_unique<Readers>(m_Of, Each);
    }

    void tellRemoved(std::size_t Number) {
        const std::string& Pass = snapshot(Number).Pass;
        std::unique_ptr<DeadCodeGrounds> pGrounds;
        if (Pass == DeadCodePass)
            pGrounds =
                std::make_unique<DeadCodeGrounds>(m_Of, snapshot(Number - 1), snapshot(Number));
        for (RecordedChange& Change : snapshot(Number).Changes) {
            if (Change.What != RecordedChange::Kind::Removed)
                continue;
            RecordedFate Fate;
            Fate.Statement = Change.Before;
            Fate.IsRemoved = true;
            Fate.Snapshot = static_cast<unsigned>(Number);
            if (pGrounds != nullptr)
                tellDead(*pGrounds, Change, Fate);
            else if (Pass == UnusedPass)
                Fate.Why = unusedText(statement(Change.Before), Number);
            else if (Pass == HoistingPass)
                tellTwin(snapshot(Number), Change, Fate);
            Change.Why = Fate.Why;
            m_RemovedBy.emplace(statement(Change.Before).Id, Number);
            if (isOfProgram(statement(Change.Before)))
                m_Of.Fates.push_back(std::move(Fate));
        }
    }

    void tellDead(const DeadCodeGrounds& Grounds, const RecordedChange& Change,
                  RecordedFate& Fate) const {
        const int Condition = Grounds.find(Change.Node);
        Fate.Why = "never reached";
        if (Condition < 0)
            return;
        // If the true arm is dead, the condition is false.
        const char* Value = Grounds.isTrueArm(Change.Node) ? " is always false" : " is always true";
        Fate.Why += ": `" + conditionText(statement(Condition)) + "`" + Value;
        Fate.Because = statement(Condition).Place;
    }

    void tellTwin(const RecordedSnapshot& In, const RecordedChange& Change,
                  RecordedFate& Fate) const {
        Fate.Why = "the same statement of the other arm stands for it, in front of the branch";
        for (const RecordedChange& Each : In.Changes)
            if (Each.What == RecordedChange::Kind::Hoisted && Each.Procedure == Change.Procedure &&
                statement(Each.Before).Variable == statement(Change.Before).Variable)
                Fate.Because = statement(Each.Before).Place;
    }

    // "nothing reads x.3: its read at line 12 became a constant, that at line 15 was removed"
    std::string unusedText(const RecordedStatement& Gone, std::size_t Number) const {
        std::string Text = "nothing reads " + nameOfDefined(Gone);
        if (Gone.Version < 0 || m_FirstReaders == nullptr)
            return Text;
        constexpr unsigned Most = 3;
        unsigned Count = 0;
        const char* Separator = ": ";
        for (int Reader : m_FirstReaders->of(Gone.Version)) {
            const RecordedStatement& Each = statement(Reader);
            if (!isOfProgram(Each) || Count++ == Most)
                continue;
            const auto Removed = m_RemovedBy.find(Each.Id);
            const bool IsRemoved = Removed != m_RemovedBy.end() && Removed->second <= Number;
            Text += Separator + std::string("the read at line ") + std::to_string(Each.Place.Line) +
                    (IsRemoved ? " was removed" : " became a constant");
            Separator = ", ";
        }
        return Text;
    }

    std::string nameOfDefined(const RecordedStatement& Statement) const {
        if (Statement.Version >= 0)
            return m_Of.Versions[static_cast<std::size_t>(Statement.Version)].Name;
        return Statement.Variable >= 0
                   ? m_Of.Variables[static_cast<std::size_t>(Statement.Variable)].Name
                   : Statement.Text;
    }

    // Kept

    void tellKept() {
        const RecordedSnapshot& Last = m_Of.Snapshots.back();
        const Readers Final(m_Of, Last);
        const Layout Where(m_Of, Last);
        bool HasRemovalRun = false;
        for (const RecordedSnapshot& Each : m_Of.Snapshots)
            HasRemovalRun = HasRemovalRun || Each.Pass == UnusedPass;
        std::unordered_set<int> IsRead; // variables
        for (const Layout::Entry& Entry : Where.getEntries())
            if (statement(Entry.State).MakesCode)
                for (const RecordedRead& Read : statement(Entry.State).Reads)
                    IsRead.insert(Read.Variable);
        for (const Layout::Entry& Entry : Where.getEntries()) {
            const RecordedStatement& Each = statement(Entry.State);
            const bool IsDefinition = Each.Form == RecordedForm::Assignment ||
                                      Each.Form == RecordedForm::Store ||
                                      Each.Form == RecordedForm::Argument;
            if (!IsDefinition || !isOfProgram(Each) || isReadByCode(Final, Each.Version))
                continue;
            RecordedFate Fate;
            Fate.Statement = Entry.State;
            Fate.Snapshot = Last.Number;
            Fate.LooksUnused = IsRead.count(Each.Variable) == 0;
            tellWhyKept(Each, Final, HasRemovalRun, Fate);
            m_Of.Fates.push_back(std::move(Fate));
        }
    }

    bool isReadByCode(const Readers& Final, int Version) const {
        if (Version < 0)
            return false;
        const std::vector<int>& List = Final.of(Version);
        return std::any_of(List.begin(), List.end(),
                           [this](int Reader) { return statement(Reader).MakesCode; });
    }

    void tellWhyKept(const RecordedStatement& Kept, const Readers& Final, bool HasRemovalRun,
                     RecordedFate& Fate) const {
        const RecordedVariable& Variable = m_Of.Variables[static_cast<std::size_t>(Kept.Variable)];
        if (!Variable.KeptBecause.empty()) {
            Fate.Why = Variable.Name + ": " + Variable.KeptBecause;
            Fate.Because = Variable.Place;
            return;
        }
        for (const RecordedRead& Read : Kept.Reads) {
            const RecordedVariable& Input = m_Of.Variables[static_cast<std::size_t>(Read.Variable)];
            if (Input.Kind == "input") {
                Fate.Why = "it reads input " + Input.Name + ", and a read of an input stays";
                Fate.Because = Read.Place;
                return;
            }
        }
        if (Kept.Version < 0 || !HasRemovalRun) {
            Fate.Why = "removeUnusedVarDefs has not run";
            return;
        }
        tellDistantReader(Kept, Final, Fate);
    }

    // Follows the value over statements without code to the first code that reads it.
    void tellDistantReader(const RecordedStatement& Kept, const Readers& Final,
                           RecordedFate& Fate) const {
        std::vector<int> Work{Kept.Version};
        std::unordered_set<int> Seen{Kept.Version};
        for (std::size_t i = 0; i < Work.size(); ++i) {
            for (int Reader : Final.of(Work[i])) {
                const RecordedStatement& Each = statement(Reader);
                if (Each.MakesCode || Each.Form == RecordedForm::Output) {
                    Fate.GoesOn = Each.MakesCode;
                    Fate.Why = "the value goes on to `" + Each.Text + "`";
                    Fate.Because = Each.Place;
                    return;
                }
                if (Each.Version >= 0 && Seen.insert(Each.Version).second)
                    Work.push_back(Each.Version);
            }
        }
        Fate.Why = Final.of(Kept.Version).empty()
                       ? "nothing reads it any more, and its removal was held back"
                       : "only its own next value reads it, around a loop";
    }

    Recording& m_Of;
    std::unique_ptr<Readers> m_FirstReaders;
    std::unordered_map<unsigned, std::size_t> m_RemovedBy; // number of the snapshot, by id
};

} // namespace

void tellFates(Recording& Of) {
    if (!Of.Snapshots.empty())
        FateTeller(Of).run();
}

} // namespace hpn
