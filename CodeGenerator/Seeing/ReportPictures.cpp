#include "Seeing/ReportPictures.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <map>
#include <thread>
#include <unordered_map>

namespace hpn {

namespace {

// The page draws with these measures: pixels, and characters of a font of fixed width.
constexpr std::size_t LongestText = 64;
constexpr int CharacterWidth = 7;
constexpr int RowHeight = 16;
constexpr int Padding = 8;
constexpr std::size_t MostRowsOfNode = 60;
constexpr std::size_t WidthStep = 4; // characters; makes more pictures equal

std::size_t shownLength(const std::string& Text) {
    const auto IsStart = [](char Each) {
        return (static_cast<unsigned char>(Each) & 0xC0) != 0x80;
    };
    const auto Count = static_cast<std::size_t>(std::count_if(Text.begin(), Text.end(), IsStart));
    return std::min(Count, LongestText);
}

int widthOf(std::size_t Characters) {
    const std::size_t Steps = (std::max<std::size_t>(Characters, 6) + WidthStep - 1) / WidthStep;
    return static_cast<int>(Steps * WidthStep) * CharacterWidth + 2 * Padding;
}

class Painter {
public:
    Painter(const Recording& Of, const PictureLimits& Limits) : m_Of(Of), m_Limits(Limits) {}

    ReportPictures paint() {
        m_Result.Procedures.resize(m_Of.Procedures.size());
        m_Result.Calls.resize(m_Of.Snapshots.size());
        collectMarks();
        for (std::size_t i = 0; i < m_Of.Snapshots.size(); ++i)
            order(m_Result.Calls[i], callTask(m_Of.Snapshots[i]));
        for (const int State : statesByInterest())
            orderProcedure(static_cast<std::size_t>(State));
        layOutAll();
        collect();
        return std::move(m_Result);
    }

private:
    // One text for graphviz and the pictures that wait for it.
    struct Work {
        std::string Dot;
        std::size_t BoxCount = 0;
        std::vector<ReportPicture*> Waiting;
        DotAnswer Answer = DotAnswer::TooSlow;
        bool IsStarted = false;
        PlacedPicture Placed;
    };

    // Marks of a state: against the snapshot before it and against the one after it.
    void collectMarks() {
        m_Marks.resize(m_Of.Procedures.size());
        for (std::size_t i = 1; i < m_Of.Snapshots.size(); ++i) {
            std::unordered_map<unsigned, RecordedMark> Marks; // looked up only
            for (const auto& [Node, Mark] : m_Of.Snapshots[i].Marks)
                Marks.emplace(Node, Mark);
            for (const std::size_t Side : {i - 1, i})
                collectMarks(m_Of.Snapshots[Side], Marks);
        }
    }

    void collectMarks(const RecordedSnapshot& Side,
                      const std::unordered_map<unsigned, RecordedMark>& Marks) {
        for (const int State : Side.Procedures) {
            for (const int Node : procedure(State).Nodes) {
                if (Marks.count(node(Node).Id) != 0)
                    m_Marks[static_cast<std::size_t>(State)].insert(node(Node).Id);
            }
        }
    }

    // First what changed most in each pass, after and before it; then what is left.
    std::vector<int> statesByInterest() const {
        struct Wish {
            std::size_t Rank;
            std::size_t Weight;
            int State;
        };
        std::vector<Wish> Wishes;
        for (std::size_t i = 1; i < m_Of.Snapshots.size(); ++i) {
            std::map<std::string, std::size_t> Weights;
            for (const RecordedChange& Each : m_Of.Snapshots[i].Changes)
                Weights[Each.Procedure] += Each.What == RecordedChange::Kind::Added ? 1 : 4;
            std::vector<std::pair<std::size_t, std::string>> Ranking;
            Ranking.reserve(Weights.size());
            for (const auto& [Name, Weight] : Weights)
                Ranking.emplace_back(Weight, Name);
            std::sort(Ranking.rbegin(), Ranking.rend());
            for (std::size_t Rank = 0; Rank < Ranking.size(); ++Rank) {
                for (const std::size_t Side : {i, i - 1}) {
                    const int State = find(m_Of.Snapshots[Side], Ranking[Rank].second);
                    if (State >= 0)
                        Wishes.push_back({Rank, Ranking[Rank].first, State});
                }
            }
        }
        std::stable_sort(Wishes.begin(), Wishes.end(), [](const Wish& a, const Wish& b) {
            return a.Rank != b.Rank ? a.Rank < b.Rank : a.Weight > b.Weight;
        });
        std::vector<int> States;
        std::vector<bool> IsListed(m_Of.Procedures.size(), false);
        const auto List = [&](int State) {
            if (!IsListed[static_cast<std::size_t>(State)])
                States.push_back(State);
            IsListed[static_cast<std::size_t>(State)] = true;
        };
        for (const Wish& Each : Wishes)
            List(Each.State);
        for (std::size_t i = 0; i < m_Of.Procedures.size(); ++i)
            List(static_cast<int>(i));
        return States;
    }

    int find(const RecordedSnapshot& Snapshot, const std::string& Name) const {
        for (const int Each : Snapshot.Procedures) {
            if (procedure(Each).Name == Name)
                return Each;
        }
        return -1;
    }

    void orderProcedure(std::size_t State) {
        ReportPicture& Picture = m_Result.Procedures[State];
        Picture.Boxes = makeBoxes(m_Of, m_Of.Procedures[State], m_Marks[State], m_Limits.Folding);
        LayoutTask Task;
        for (const ReportBox& Each : Picture.Boxes.Boxes)
            Task.Boxes.push_back(sizeOf(Each));
        for (const ReportBoxEdge& Each : Picture.Boxes.Edges)
            Task.Edges.push_back({Each.From, Each.To, kindOf(Each.What)});
        order(Picture, Task);
    }

    static char kindOf(RecordedEdge::Kind Kind) {
        return Kind == RecordedEdge::Kind::True    ? 't'
               : Kind == RecordedEdge::Kind::False ? 'n'
                                                   : 'f';
    }

    LayoutTask::Box sizeOf(const ReportBox& Box) const {
        std::size_t Rows = 0;
        std::size_t Length = 0;
        for (const ReportItem& Item : Box.Items) {
            const RecordedNode& First = node(Item.Nodes.front());
            Rows += Item.IsFolded ? 1 : rowsOf(First);
            Length = std::max<std::size_t>(Length, Item.IsFolded ? 24 : 0);
            if (Item.IsFolded)
                continue;
            for (const int Each : First.Statements)
                Length = std::max(
                    Length, shownLength(m_Of.Statements[static_cast<std::size_t>(Each)].Text));
        }
        return {widthOf(Length), static_cast<int>(Rows) * RowHeight + Padding};
    }

    LayoutTask callTask(const RecordedSnapshot& Snapshot) const {
        LayoutTask Task;
        std::map<std::string, int> Places;
        for (const int Each : Snapshot.Procedures) {
            Places[procedure(Each).Name] = static_cast<int>(Task.Boxes.size());
            Task.Boxes.push_back(
                {widthOf(std::max<std::size_t>(shownLength(procedure(Each).Title), 16)),
                 2 * RowHeight + Padding});
        }
        for (std::size_t i = 0; i < Snapshot.Procedures.size(); ++i) {
            std::vector<int> Callees;
            for (const RecordedCall& Each : procedure(Snapshot.Procedures[i]).Calls) {
                const auto Found = Places.find(Each.Callee);
                if (Found != Places.end())
                    Callees.push_back(Found->second);
            }
            std::sort(Callees.begin(), Callees.end());
            Callees.erase(std::unique(Callees.begin(), Callees.end()), Callees.end());
            for (const int Each : Callees)
                Task.Edges.push_back({static_cast<int>(i), Each, 'f'});
        }
        return Task;
    }

    void order(ReportPicture& Picture, const LayoutTask& Task) {
        const std::string Dot = writeDot(Task);
        const auto [Place, IsNew] = m_Known.emplace(Dot, m_Works.size());
        if (IsNew) {
            m_Works.emplace_back();
            m_Works.back().Dot = Dot;
            m_Works.back().BoxCount = Task.Boxes.size();
        }
        m_Works[Place->second].Waiting.push_back(&Picture);
    }

    // Each thread takes the next text from the list until the time is up or graphviz is missing.
    void layOutAll() {
        using Clock = std::chrono::steady_clock;
        const Clock::time_point Start = Clock::now();
        std::atomic<std::size_t> Next{0};
        std::atomic<bool> IsMissing{false};
        const auto Run = [&] {
            for (std::size_t i = Next++; i < m_Works.size() && !IsMissing; i = Next++) {
                const double Left = m_Limits.SecondsAltogether -
                                    std::chrono::duration<double>(Clock::now() - Start).count();
                if (Left <= 0.0)
                    return;
                layOut(m_Works[i], std::min(Left, m_Limits.SecondsEach));
                IsMissing = IsMissing || m_Works[i].Answer == DotAnswer::NotThere;
            }
        };
        std::vector<std::thread> Helpers;
        for (unsigned i = 1; i < std::min(8u, std::thread::hardware_concurrency()); ++i)
            Helpers.emplace_back(Run);
        Run();
        for (std::thread& Each : Helpers)
            Each.join();
        m_Result.IsGraphvizThere = !IsMissing;
    }

    static void layOut(Work& Task, double Seconds) {
        Task.IsStarted = true;
        std::string Plain;
        Task.Answer = runDot(Task.Dot, Seconds, Plain);
        if (Task.Answer == DotAnswer::Done && !readPlain(Plain, Task.BoxCount, Task.Placed))
            Task.Answer = DotAnswer::Failed;
    }

    void collect() {
        for (Work& Each : m_Works) {
            const bool IsDone = Each.IsStarted && Each.Answer == DotAnswer::Done;
            for (ReportPicture* pPicture : Each.Waiting) {
                pPicture->Layout = IsDone ? static_cast<int>(m_Result.Layouts.size()) : -1;
                pPicture->IsTooSlow = Each.IsStarted && Each.Answer == DotAnswer::TooSlow;
            }
            if (IsDone)
                m_Result.Layouts.push_back(std::move(Each.Placed));
        }
        for (const ReportPicture& Each : m_Result.Procedures)
            m_Result.LeftOut += Each.Layout < 0 ? 1 : 0;
    }

    const RecordedProcedure& procedure(int Index) const {
        return m_Of.Procedures[static_cast<std::size_t>(Index)];
    }
    const RecordedNode& node(int Index) const {
        return m_Of.Nodes[static_cast<std::size_t>(Index)];
    }

    const Recording& m_Of;
    const PictureLimits& m_Limits;
    std::vector<std::unordered_set<unsigned>> m_Marks; // by index of the procedure state
    std::vector<Work> m_Works;
    std::unordered_map<std::string, std::size_t> m_Known; // looked up only
    ReportPictures m_Result;
};

} // namespace

std::size_t rowsOf(const RecordedNode& Node) {
    return std::clamp<std::size_t>(Node.Statements.size(), 1, MostRowsOfNode);
}

ReportPictures drawPictures(const Recording& Of, const PictureLimits& Limits) {
    return Painter(Of, Limits).paint();
}

} // namespace hpn
