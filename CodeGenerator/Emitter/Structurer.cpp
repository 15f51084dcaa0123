#include "Emitter/Structurer.h"

#include "Emitter/FlowDominators.h"
#include "Emitter/FlowLoops.h"

#include <cstddef>
#include <utility>

// After N. Ramsey, "Beyond Relooper: Recursive Translation of Unstructured Control Flow to
// Structured Control Flow", ICFP 2022 (functional pearl):
//   1. order the nodes, find dominators and loops;
//   2. give each join a place behind the node that dominates it immediately ("follower"), in
//   reverse postorder; every other node
//      stands in the arm of the branch that leads to it;
//   3. walk the dominator tree from the entry and write each node, a loop around it where it is a
//   header, then its followers.
// Departures:
//   - the target language has goto, so a jump that is neither a fall-through nor a `break` or
//   `continue` needs no enclosing
//     block, and a cycle with several entries (irreducible) needs no code copied: its joins are
//     labels;
//   - a node behind a loop whose dominator lies inside the loop becomes a follower of the whole
//   loop, so that what comes after a
//     loop does not end up in it;
//   - the walk keeps its open work on a stack of its own.
// Near-linear: each node and edge is written once; finding the end of a `do` loop follows one chain
// for each loop.

namespace hpn {

namespace {

constexpr int NoTarget = -2;
constexpr int LoopTail = -3; // the condition of a `do` loop, where its body may end

/// A leaf that leaves goes ahead of its sibling without an `else` from this nesting on, so that
/// chains of guards stay flat.
constexpr int FlatDepth = 6;

/// Where control gets to without a goto at some place of the text.
struct Surroundings {
    int Next = ReturnTarget; // by falling through
    int Break = NoTarget;
    int Continue = NoTarget;
    int Depth = 0;
};

enum class BranchShape { Both, TrueOnly, FalseOnly, TrueGuard, FalseGuard };

class Structurer {
public:
    explicit Structurer(const std::vector<FlowNode>& Nodes);
    std::vector<StructureToken> run();

private:
    enum class Work { Tree, Edge, Chain, Token };
    struct Task {
        Work Kind;
        int Node;
        Surroundings Around;
        StructureToken Token;
    };
    /// Followers of one kind, linked through `m_NextFollower`.
    struct Followers {
        int First = -1;
        int Last = -1;
    };

    void placeFollowers();
    int loopToLeave(int Node) const;
    bool isJoin(int Node) const;
    bool isMainExit(int Node, int Loop) const;
    void append(Followers& List, int Node);

    bool isInlineEdge(int From, int To) const {
        return To >= 0 && !m_IsFollower[To] && m_Dominators.getIdom(To) == From && To != From;
    }
    bool isLeaf(int Node) const;
    int leafTarget(int Node) const { return m_Nodes[Node].True; }
    bool canBeElseIf(int From, int To) const;
    BranchShape shapeOf(int Node, const Surroundings& Around, bool IsInElse) const;
    int endOfBody(int Header, int Latch, const Surroundings& Around) const;

    void perform(const Task& Next);
    void writeTree(int Node, const Surroundings& Around);
    void writeLoop(int Header, const Surroundings& Around);
    bool writeWhile(int Header, const Surroundings& Inside);
    bool writeDo(int Header, const Surroundings& Around);
    void writeBody(int Node, const Surroundings& Around);
    void writeExit(int Node, const Surroundings& Around, bool IsInElse);
    void writeJump(int Target, const Surroundings& Around);

    void token(StructureKind Kind, int Node = ReturnTarget, bool Negated = false) {
        m_Tokens.push_back({Kind, Negated, Node});
    }
    // What is queued is done in the order of the queueing once `perform` is through.
    void later(Work Kind, int Node, const Surroundings& Around) {
        m_Queued.push_back({Kind, Node, Around, {}});
    }
    void laterToken(StructureKind Kind, int Node = ReturnTarget, bool Negated = false) {
        m_Queued.push_back({Work::Token, Node, {}, {Kind, Negated, Node}});
    }
    void laterFollowers(int First, Surroundings Around);
    void dropNeedlessLabels();

    const std::vector<FlowNode>& m_Nodes;
    FlowDominators m_Dominators;
    FlowLoops m_Loops;
    std::vector<bool> m_IsFollower;
    std::vector<Followers> m_Inner; // by node: joins that it dominates immediately
    std::vector<Followers> m_Outer; // by header: what comes behind the loop
    std::vector<int> m_NextFollower;
    std::vector<int> m_NumberOfExits; // by header: places to go on at behind the loop
    std::vector<bool> m_IsLoopTail;   // its branch is the condition of a `do` loop
    std::vector<bool> m_NeedsLabel;
    std::vector<StructureToken> m_Tokens;
    std::vector<Task> m_Stack;
    std::vector<Task> m_Queued;
};

Structurer::Structurer(const std::vector<FlowNode>& Nodes)
    : m_Nodes(Nodes), m_Dominators(Nodes), m_Loops(static_cast<int>(Nodes.size()), m_Dominators),
      m_IsFollower(Nodes.size(), false), m_Inner(Nodes.size()), m_Outer(Nodes.size()),
      m_NextFollower(Nodes.size(), -1), m_NumberOfExits(Nodes.size(), 0),
      m_IsLoopTail(Nodes.size(), false), m_NeedsLabel(Nodes.size(), false) {
}

std::vector<StructureToken> Structurer::run() {
    placeFollowers();
    m_Stack.push_back({Work::Tree, 0, {}, {}});
    while (!m_Stack.empty()) {
        const Task Next = m_Stack.back();
        m_Stack.pop_back();
        perform(Next);
        m_Stack.insert(m_Stack.end(), m_Queued.rbegin(), m_Queued.rend());
        m_Queued.clear();
    }
    dropNeedlessLabels();
    return std::move(m_Tokens);
}

void Structurer::perform(const Task& Next) {
    switch (Next.Kind) {
    case Work::Tree:
        return writeTree(Next.Node, Next.Around);
    case Work::Chain:
        return writeExit(Next.Node, Next.Around, true);
    case Work::Edge:
        return writeJump(Next.Node, Next.Around);
    case Work::Token:
        m_Tokens.push_back(Next.Token);
    }
}

// ---- step 2: places ----

/// Outermost loop that holds the immediate dominator of a node but not the node; -1 if there is
/// none.
int Structurer::loopToLeave(int Node) const {
    int Left = -1;
    int Loop = m_Loops.innermostLoop(m_Dominators.getIdom(Node));
    while (Loop != -1 && !m_Loops.contains(Loop, Node)) {
        Left = Loop;
        Loop = m_Loops.parentLoop(Loop);
    }
    return Left;
}

bool Structurer::isJoin(int Node) const {
    int Forward = 0;
    for (const int* p = m_Dominators.beginPredecessors(Node);
         p != m_Dominators.endPredecessors(Node); ++p)
        Forward += m_Dominators.dominates(Node, *p) ? 0 : 1;
    return Forward > 1;
}

/// Of the nodes that a loop is left for by one edge only, the one to stand behind the loop; the
/// others stay in the arms that lead to them.
bool Structurer::isMainExit(int Node, int Loop) const {
    const int Source = m_Dominators.getIdom(Node);
    if (Source == Loop || m_NumberOfExits[Loop] == 1)
        return true;
    const FlowNode& Header = m_Nodes[Loop];
    const auto stays = [&](int Target) { return Target >= 0 && m_Loops.contains(Loop, Target); };
    const bool HeaderStays = stays(Header.True) && (!Header.IsBranch || stays(Header.False));
    return HeaderStays && Source == m_Loops.onlyLatch(Loop);
}

void Structurer::append(Followers& List, int Node) {
    m_IsFollower[Node] = true;
    if (List.First == -1)
        List.First = Node;
    else
        m_NextFollower[List.Last] = Node;
    List.Last = Node;
}

void Structurer::placeFollowers() {
    const std::vector<int>& Order = m_Dominators.getOrder();
    std::vector<int> LeftLoop(m_Nodes.size(), -1);
    for (std::size_t i = 1; i < Order.size(); ++i) {
        const int Loop = loopToLeave(Order[i]);
        LeftLoop[Order[i]] = Loop;
        if (Loop != -1)
            ++m_NumberOfExits[Loop];
    }
    for (std::size_t i = 1; i < Order.size(); ++i) {
        const int Node = Order[i];
        const int Loop = LeftLoop[Node];
        const bool IsJoin = isJoin(Node);
        if (Loop != -1 && (IsJoin || isMainExit(Node, Loop)))
            append(m_Outer[Loop], Node);
        else if (IsJoin)
            append(m_Inner[m_Dominators.getIdom(Node)], Node);
    }
}

// ---- step 3: text ----

void Structurer::laterFollowers(int First, Surroundings Around) {
    const int Last = Around.Next;
    for (int Node = First; Node != -1; Node = m_NextFollower[Node]) {
        Around.Next = m_NextFollower[Node] == -1 ? Last : m_NextFollower[Node];
        later(Work::Tree, Node, Around);
    }
}

void Structurer::writeTree(int Node, const Surroundings& Around) {
    token(StructureKind::Label, Node);
    if (!m_Loops.isHeader(Node))
        return writeBody(Node, Around);
    Surroundings Before = Around;
    if (m_Outer[Node].First != -1)
        Before.Next = m_Outer[Node].First;
    writeLoop(Node, Before);
    laterFollowers(m_Outer[Node].First, Around);
}

void Structurer::writeLoop(int Header, const Surroundings& Around) {
    const Surroundings Inside{Header, Around.Next, Header, Around.Depth + 1};
    if (writeWhile(Header, Inside) || writeDo(Header, Around))
        return;
    token(StructureKind::Forever);
    writeBody(Header, Inside);
    laterToken(StructureKind::End);
}

/// The header only decides whether the loop is left for what comes behind it.
bool Structurer::writeWhile(int Header, const Surroundings& Inside) {
    const FlowNode& Node = m_Nodes[Header];
    if (Node.HasCode || !Node.IsBranch)
        return false;
    const bool Negated = Node.True == Inside.Break;
    const int Out = Negated ? Node.True : Node.False;
    const int In = Negated ? Node.False : Node.True;
    if (Out != Inside.Break || In < 0 || !m_Loops.contains(Header, In))
        return false;
    token(StructureKind::While, Header, Negated);
    Surroundings Before = Inside;
    if (m_Inner[Header].First != -1)
        Before.Next = m_Inner[Header].First;
    later(isInlineEdge(Header, In) ? Work::Tree : Work::Edge, In, Before);
    laterFollowers(m_Inner[Header].First, Inside);
    laterToken(StructureKind::End);
    return true;
}

/// The only way back to the header is a branch at the very end of the body, whose other way leads
/// behind the loop.
bool Structurer::writeDo(int Header, const Surroundings& Around) {
    const int Latch = m_Loops.onlyLatch(Header);
    if (Latch == -1 || !m_Nodes[Latch].IsBranch)
        return false;
    const bool Negated = m_Nodes[Latch].False == Header;
    if ((Negated ? m_Nodes[Latch].True : m_Nodes[Latch].False) != Around.Next)
        return false;
    const int Continue = m_Nodes[Latch].HasCode ? NoTarget : Latch;
    const Surroundings Inside{LoopTail, Around.Next, Continue, Around.Depth + 1};
    if (endOfBody(Header, Latch, Inside) != Latch)
        return false;
    m_IsLoopTail[Latch] = true;
    token(StructureKind::Do);
    writeBody(Header, Inside);
    laterToken(StructureKind::EndDo, Latch, Negated);
    return true;
}

/// The last node of a loop's body that is not nested in an arm, -1 if there is no such node: the
/// same steps that the writing takes.
int Structurer::endOfBody(int Header, int Latch, const Surroundings& Around) const {
    int Node = Header;
    for (;;) {
        const Followers& List =
            Node != Header && m_Loops.isHeader(Node) ? m_Outer[Node] : m_Inner[Node];
        if (List.First != -1) {
            Node = List.Last;
            continue;
        }
        if (Node == Latch || !m_Nodes[Node].IsBranch || (Node != Header && m_Loops.isHeader(Node)))
            return Node;
        const BranchShape Shape = shapeOf(Node, Around, false);
        if (Shape != BranchShape::TrueGuard && Shape != BranchShape::FalseGuard)
            return Node;
        const int Rest = Shape == BranchShape::TrueGuard ? m_Nodes[Node].False : m_Nodes[Node].True;
        if (!isInlineEdge(Node, Rest))
            return -1;
        Node = Rest;
    }
}

void Structurer::writeBody(int Node, const Surroundings& Around) {
    if (m_Nodes[Node].HasCode)
        token(StructureKind::Code, Node);
    Surroundings Before = Around;
    if (m_Inner[Node].First != -1)
        Before.Next = m_Inner[Node].First;
    if (!m_IsLoopTail[Node])
        writeExit(Node, Before, false);
    laterFollowers(m_Inner[Node].First, Around);
}

bool Structurer::isLeaf(int Node) const {
    return !m_Nodes[Node].IsBranch && !m_Loops.isHeader(Node) &&
           !isInlineEdge(Node, m_Nodes[Node].True);
}

bool Structurer::canBeElseIf(int From, int To) const {
    return isInlineEdge(From, To) && !m_Nodes[To].HasCode && m_Nodes[To].IsBranch &&
           !m_Loops.isHeader(To) && m_Inner[To].First == -1 && !m_IsLoopTail[To];
}

BranchShape Structurer::shapeOf(int Node, const Surroundings& Around, bool IsInElse) const {
    const FlowNode& Flow = m_Nodes[Node];
    if (Flow.True == Around.Next)
        return BranchShape::FalseOnly;
    if (Flow.False == Around.Next)
        return BranchShape::TrueOnly;
    if (IsInElse)
        return BranchShape::Both;
    const bool TrueInline = isInlineEdge(Node, Flow.True);
    const bool FalseInline = isInlineEdge(Node, Flow.False);
    if (!TrueInline || !FalseInline)
        return TrueInline ? BranchShape::FalseGuard : BranchShape::TrueGuard;
    // Of two real arms, a short one that leaves becomes a guard in front of the other.
    const bool TrueIsLeaf = isLeaf(Flow.True);
    const bool FalseIsLeaf = isLeaf(Flow.False);
    const bool TrueLeaves = TrueIsLeaf && leafTarget(Flow.True) != Around.Next;
    const bool FalseLeaves = FalseIsLeaf && leafTarget(Flow.False) != Around.Next;
    if (TrueLeaves != FalseLeaves)
        return TrueLeaves ? BranchShape::TrueGuard : BranchShape::FalseGuard;
    const bool IsFlat = Around.Next != ReturnTarget || Around.Depth < FlatDepth;
    if (IsFlat || TrueIsLeaf == FalseIsLeaf)
        return BranchShape::Both;
    return TrueIsLeaf ? BranchShape::TrueGuard : BranchShape::FalseGuard;
}

void Structurer::writeExit(int Node, const Surroundings& Around, bool IsInElse) {
    const FlowNode& Flow = m_Nodes[Node];
    const auto laterEdge = [&](int Target, const Surroundings& Where) {
        later(isInlineEdge(Node, Target) ? Work::Tree : Work::Edge, Target, Where);
    };
    if (!Flow.IsBranch)
        return laterEdge(Flow.True, Around);
    const BranchShape Shape = shapeOf(Node, Around, IsInElse);
    const bool Negated = Shape == BranchShape::FalseOnly || Shape == BranchShape::FalseGuard;
    const bool IsGuard = Shape == BranchShape::TrueGuard || Shape == BranchShape::FalseGuard;
    const int First = Negated ? Flow.False : Flow.True;
    const int Second = Negated ? Flow.True : Flow.False;
    Surroundings Inside = Around;
    ++Inside.Depth;
    Surroundings Guarded = Inside;
    Guarded.Next = IsGuard ? NoTarget : Around.Next;
    token(IsInElse ? StructureKind::ElseIf : StructureKind::If, Node, Negated);
    laterEdge(First, Guarded);
    if (IsGuard) {
        laterToken(StructureKind::End);
        return laterEdge(Second, Around);
    }
    if (Shape == BranchShape::Both && canBeElseIf(Node, Second)) {
        later(Work::Chain, Second, Around);
    } else if (Shape == BranchShape::Both) {
        laterToken(StructureKind::Else);
        laterEdge(Second, Inside);
    }
    if (!IsInElse)
        laterToken(StructureKind::End);
}

void Structurer::writeJump(int Target, const Surroundings& Around) {
    if (Target == Around.Next)
        return;
    if (Target == ReturnTarget)
        return token(StructureKind::Return);
    if (Target == Around.Continue)
        return token(StructureKind::Continue);
    if (Target == Around.Break)
        return token(StructureKind::Break);
    m_NeedsLabel[Target] = true;
    token(StructureKind::Goto, Target);
}

void Structurer::dropNeedlessLabels() {
    std::size_t Kept = 0;
    for (const StructureToken& Token : m_Tokens)
        if (Token.Kind != StructureKind::Label || m_NeedsLabel[Token.Node])
            m_Tokens[Kept++] = Token;
    m_Tokens.resize(Kept);
}

} // namespace

std::vector<StructureToken> structureFlow(const std::vector<FlowNode>& Nodes) {
    return Structurer(Nodes).run();
}

} // namespace hpn
