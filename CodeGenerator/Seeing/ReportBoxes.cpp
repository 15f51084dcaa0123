#include "Seeing/ReportBoxes.h"

#include <algorithm>
#include <unordered_map>

namespace hpn {

// Folding contracts the graph of boxes by three rules until it is small enough, as structural
// analysis does (Sharir: Structural analysis, 1980):
//   1. a box and its only follower that has no other way in become one box;
//   2. arms of a branch that meet again at once are folded into the box that branches;
//   3. the body of a loop, and a way from a box to itself, are folded into the head.
// One round tries each box once, so that inner regions come before the ones around them; boxes with
// a mark inside are only folded when nothing else is left. Each contraction takes a box away, hence
// at most boxes * rounds steps; rounds are bounded by the depth of nesting.

namespace {

void addDistinct(std::vector<int>& List, int Value) {
    if (std::find(List.begin(), List.end(), Value) == List.end())
        List.push_back(Value);
}

void remove(std::vector<int>& List, int Value) {
    List.erase(std::remove(List.begin(), List.end(), Value), List.end());
}

class BoxMaker {
public:
    BoxMaker(const Recording& Of, const RecordedProcedure& Procedure,
             const std::unordered_set<unsigned>& Marked, const FoldingLimits& Limits)
        : m_Of(Of), m_Procedure(Procedure), m_Marked(Marked), m_Limits(Limits) {}

    ReportBoxes make() {
        connectNodes();
        makeRuns();
        connectBoxes();
        if (m_Nodes.size() > m_Limits.Nodes)
            fold();
        return collect();
    }

private:
    struct NodeInfo {
        int State = -1;
        std::vector<std::size_t> Out; // places in the procedure's edges
        std::size_t InCount = 0;
        int Box = -1;
    };
    struct BoxInfo {
        ReportBox Box;
        std::vector<int> Successors;   // distinct
        std::vector<int> Predecessors; // distinct
        bool IsGone = false;
        bool IsMarked = false;
        bool IsContracted = false; // its ways out are no longer those of its last node
    };

    void connectNodes() {
        for (const int State : m_Procedure.Nodes) {
            m_Places[m_Of.Nodes[static_cast<std::size_t>(State)].Id] = m_Nodes.size();
            m_Nodes.emplace_back();
            m_Nodes.back().State = State;
        }
        for (std::size_t i = 0; i < m_Procedure.Edges.size(); ++i) {
            const RecordedEdge& Edge = m_Procedure.Edges[i];
            if (!isFlow(Edge))
                continue;
            m_Nodes[m_Places[Edge.From]].Out.push_back(i);
            ++m_Nodes[m_Places[Edge.To]].InCount;
        }
    }

    bool isFlow(const RecordedEdge& Edge) const {
        return Edge.What != RecordedEdge::Kind::Ssa && m_Places.count(Edge.From) != 0 &&
               m_Places.count(Edge.To) != 0;
    }

    // The only node that can follow in the same box; null: the run ends here.
    NodeInfo* follower(const NodeInfo& Node) {
        if (Node.Out.size() != 1)
            return nullptr;
        NodeInfo& Next = m_Nodes[m_Places[m_Procedure.Edges[Node.Out.front()].To]];
        return Next.InCount == 1 ? &Next : nullptr;
    }

    void makeRuns() {
        std::vector<bool> IsInside(m_Nodes.size(), false);
        for (const NodeInfo& Each : m_Nodes) {
            if (const NodeInfo* pNext = follower(Each))
                IsInside[static_cast<std::size_t>(pNext - m_Nodes.data())] = true;
        }
        for (std::size_t i = 0; i < m_Nodes.size(); ++i) {
            if (!IsInside[i])
                makeRun(m_Nodes[i]);
        }
        for (NodeInfo& Each : m_Nodes) { // closed loops that nothing enters
            if (Each.Box < 0)
                makeRun(Each);
        }
    }

    void makeRun(NodeInfo& First) {
        BoxInfo Run;
        for (NodeInfo* pNode = &First; pNode != nullptr && pNode->Box < 0;
             pNode = follower(*pNode)) {
            pNode->Box = static_cast<int>(m_Boxes.size());
            Run.Box.Items.push_back({{pNode->State}, false});
            Run.IsMarked = Run.IsMarked || isMarked(pNode->State);
        }
        m_Boxes.push_back(std::move(Run));
    }

    bool isMarked(int State) const {
        return m_Marked.count(m_Of.Nodes[static_cast<std::size_t>(State)].Id) != 0;
    }

    // Edges inside a run are drawn as its order; all others run between boxes.
    bool isBetween(const RecordedEdge& Edge) {
        const NodeInfo& From = m_Nodes[m_Places[Edge.From]];
        const NodeInfo& To = m_Nodes[m_Places[Edge.To]];
        return From.Box != To.Box || box(To.Box).Box.Items.front().Nodes.front() == To.State;
    }

    void connectBoxes() {
        for (const RecordedEdge& Edge : m_Procedure.Edges) {
            if (!isFlow(Edge) || !isBetween(Edge))
                continue;
            const int From = m_Nodes[m_Places[Edge.From]].Box;
            const int To = m_Nodes[m_Places[Edge.To]].Box;
            m_Edges.push_back({From, To, Edge.What});
            addDistinct(box(From).Successors, To);
            addDistinct(box(To).Predecessors, From);
        }
        m_Alive = m_Boxes.size();
    }

    void fold() {
        m_IsFolded = true;
        for (const bool AreMarkedFolded : {false, true}) {
            bool IsChanged = true;
            while (IsChanged && m_Alive > m_Limits.Boxes)
                IsChanged = foldOnce(AreMarkedFolded);
        }
        for (BoxInfo& Each : m_Boxes)
            foldItems(Each.Box);
    }

    bool foldOnce(bool AreMarkedFolded) {
        bool IsChanged = false;
        for (std::size_t i = 0; i < m_Boxes.size() && m_Alive > m_Limits.Boxes; ++i) {
            const int Box = static_cast<int>(i);
            if (!box(Box).IsGone)
                IsChanged = foldArms(Box, AreMarkedFolded) || foldLoop(Box, AreMarkedFolded) ||
                            join(Box) || IsChanged;
        }
        return IsChanged;
    }

    // Rule 2.
    bool foldArms(int Head, bool AreMarkedFolded) {
        std::vector<int> Arms;
        int Meeting = -1;
        for (const int Each : box(Head).Successors) {
            const bool IsArm = isBelow(Each, Head) && box(Each).Successors.size() == 1 &&
                               (AreMarkedFolded || !box(Each).IsMarked);
            const int Target = IsArm ? box(Each).Successors.front() : Each;
            if (Target == Head || (Meeting >= 0 && Meeting != Target))
                return foldArm(Head, AreMarkedFolded);
            Meeting = Target;
            if (IsArm)
                Arms.push_back(Each);
        }
        if (Arms.empty() || Meeting < 0)
            return false;
        for (const int Each : Arms)
            absorb(Head, Each);
        return true;
    }

    // Rule 2 for an arm whose other side is the meeting itself: Head -> Arm -> Meeting, Head ->
    // Meeting.
    bool foldArm(int Head, bool AreMarkedFolded) {
        for (const int Arm : box(Head).Successors) {
            if (!isBelow(Arm, Head) || box(Arm).Successors.size() != 1 ||
                (box(Arm).IsMarked && !AreMarkedFolded))
                continue;
            const int Target = box(Arm).Successors.front();
            const std::vector<int>& Ways = box(Head).Successors;
            if (Target == Head || std::find(Ways.begin(), Ways.end(), Target) == Ways.end())
                continue;
            absorb(Head, Arm);
            return true;
        }
        return false;
    }

    // Rule 3.
    bool foldLoop(int Head, bool AreMarkedFolded) {
        for (const int Body : box(Head).Successors) {
            if (Body == Head) {
                remove(box(Head).Successors, Head);
                remove(box(Head).Predecessors, Head);
                box(Head).IsContracted = true;
                return true;
            }
            if (!isBelow(Body, Head) || box(Body).Successors != std::vector<int>{Head} ||
                (box(Body).IsMarked && !AreMarkedFolded))
                continue;
            absorb(Head, Body);
            remove(box(Head).Successors, Head);
            remove(box(Head).Predecessors, Head);
            return true;
        }
        return false;
    }

    // Rule 1.
    bool join(int First) {
        if (box(First).Successors.size() != 1)
            return false;
        const int Next = box(First).Successors.front();
        if (!isBelow(Next, First))
            return false;
        std::vector<ReportItem>& Items = box(First).Box.Items;
        for (ReportItem& Each : box(Next).Box.Items)
            Items.push_back(std::move(Each));
        takeOver(First, Next);
        return true;
    }

    // Its only way in comes from the other one.
    bool isBelow(int Box, int Above) {
        return Box != Above && box(Box).Predecessors == std::vector<int>{Above};
    }

    void absorb(int Head, int Inner) {
        ReportItem Folded{{}, true};
        for (const ReportItem& Each : box(Inner).Box.Items)
            Folded.Nodes.insert(Folded.Nodes.end(), Each.Nodes.begin(), Each.Nodes.end());
        box(Head).Box.Items.push_back(std::move(Folded));
        takeOver(Head, Inner);
    }

    void takeOver(int Head, int Inner) {
        remove(box(Head).Successors, Inner);
        for (const int Each : box(Inner).Successors) {
            remove(box(Each).Predecessors, Inner);
            addDistinct(box(Each).Predecessors, Head);
            addDistinct(box(Head).Successors, Each);
        }
        box(Head).IsMarked = box(Head).IsMarked || box(Inner).IsMarked;
        box(Head).IsContracted = true;
        box(Inner).IsGone = true;
        box(Inner).Box.Items.clear();
        --m_Alive;
    }

    // Neighbours that are folded become one item, stretches without marks too; if that leaves too
    // many, the middle goes as well.
    void foldItems(ReportBox& Box) {
        foldWhere(Box, [](const ReportItem&, std::size_t) { return false; });
        const std::size_t Count = Box.Items.size();
        if (Count > m_Limits.Items / 2) {
            foldWhere(Box, [this, Count](const ReportItem& Item, std::size_t At) {
                return At >= 2 && At + 2 < Count && !isMarked(Item.Nodes.front());
            });
        }
        const std::size_t Half = m_Limits.Items / 2;
        const std::size_t Left = Box.Items.size();
        if (Left > m_Limits.Items) {
            foldWhere(Box, [Half, Left](const ReportItem&, std::size_t At) {
                return At >= Half && At + Half < Left;
            });
        }
        for (ReportItem& Each : Box.Items)
            Each.IsFolded = Each.IsFolded && Each.Nodes.size() > 1;
    }

    template <class Condition>
    static void foldWhere(ReportBox& Box, Condition IsFoldedToo) {
        std::vector<ReportItem> Kept;
        for (std::size_t i = 0; i < Box.Items.size(); ++i) {
            if (Box.Items[i].IsFolded || IsFoldedToo(Box.Items[i], i))
                appendFolded(Kept, Box.Items[i]);
            else
                Kept.push_back(std::move(Box.Items[i]));
        }
        Box.Items = std::move(Kept);
    }

    static void appendFolded(std::vector<ReportItem>& Items, const ReportItem& More) {
        if (Items.empty() || !Items.back().IsFolded)
            Items.push_back({{}, true});
        std::vector<int>& Nodes = Items.back().Nodes;
        Nodes.insert(Nodes.end(), More.Nodes.begin(), More.Nodes.end());
    }

    ReportBoxes collect() {
        ReportBoxes Result;
        Result.IsFolded = m_IsFolded;
        std::vector<int> Numbers(m_Boxes.size(), -1);
        for (std::size_t i = 0; i < m_Boxes.size(); ++i) {
            if (m_Boxes[i].IsGone)
                continue;
            Numbers[i] = static_cast<int>(Result.Boxes.size());
            Result.Boxes.push_back(std::move(m_Boxes[i].Box));
        }
        for (const ReportBoxEdge& Each : m_Edges) { // as they were, in untouched boxes
            if (!box(Each.From).IsContracted && !box(Each.To).IsGone && !box(Each.From).IsGone)
                Result.Edges.push_back(
                    {number(Numbers, Each.From), number(Numbers, Each.To), Each.What});
        }
        for (std::size_t i = 0; i < m_Boxes.size(); ++i) {
            if (m_Boxes[i].IsGone || !m_Boxes[i].IsContracted)
                continue;
            for (const int To : m_Boxes[i].Successors)
                Result.Edges.push_back({Numbers[i], number(Numbers, To), RecordedEdge::Kind::Flow});
        }
        return Result;
    }

    static int number(const std::vector<int>& Numbers, int Box) {
        return Numbers[static_cast<std::size_t>(Box)];
    }
    BoxInfo& box(int Place) { return m_Boxes[static_cast<std::size_t>(Place)]; }

    const Recording& m_Of;
    const RecordedProcedure& m_Procedure;
    const std::unordered_set<unsigned>& m_Marked;
    const FoldingLimits& m_Limits;
    std::unordered_map<unsigned, std::size_t> m_Places; // by node id; looked up only
    std::vector<NodeInfo> m_Nodes;
    std::vector<BoxInfo> m_Boxes;
    std::vector<ReportBoxEdge> m_Edges;
    std::size_t m_Alive = 0;
    bool m_IsFolded = false;
};

} // namespace

ReportBoxes makeBoxes(const Recording& Of, const RecordedProcedure& Procedure,
                      const std::unordered_set<unsigned>& Marked, const FoldingLimits& Limits) {
    return BoxMaker(Of, Procedure, Marked, Limits).make();
}

} // namespace hpn
