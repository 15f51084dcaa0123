#include "Graph/LabelExtraction.h"

#include "Model/RewriteBudget.h"
#include "ZfCCfgFactory.h"
#include "ZfCCfgProcedure.h"
#include "ZfCCfgProcedureCall.h"

#include <algorithm>
#include <string_view>
#include <unordered_map>
#include <utility>

// From shared labels to procedures.
//
// 1. Find what is on a loop (strong components) and which blocks are ends: empty, and leading to
//    nothing but empty blocks. An end is given anew to each edge that comes in, so that no
//    procedure is made of doing nothing.
// 2. Each label with several ways in, the last of the source first, so that what others lead to is
//    there before them: look for an obstacle, else let the library extract.
// 3. Each call into a block of its own, each block stamped with the procedure of its component: a
//    block that the library makes for a call on a branch is stamped with the procedure of the
//    join, which can have changed hands since.
// 4. Names that tell where the code comes from; calls for code that the outside can reach are
//    marked like all such calls.
//
// The library makes further procedures by itself, of the joins in a region that are entered from
// outside of it too. Which these are is found beforehand (step 2) by giving each node of the region
// an owner, that of all its predecessors, or itself if they differ or one lies outside: the fixed
// point is the iterated dominance frontier of the label and the outside, found by plain iteration.
// None of these may be on a loop: the edge around the loop would become a call of the procedure
// that it lies in. Extraction only cuts edges into nodes that are on no loop, so step 1 stays true.

namespace hpn {

LabelExtraction::LabelExtraction(ProgramGraph& Target)
    : m_Target(Target), m_Graph(Target.getGraph()) {
}

void LabelExtraction::run() {
    noteProcedures();
    findLoops();
    findEnds();
    const std::vector<LabelPlace> Labels = findSharedLabels();
    if (Labels.empty())
        return;
    splitEnds();
    splitBranches();
    m_Target.expectParkedEdges(m_Graph.number_of_edges());
    for (const LabelPlace& Label : Labels)
        extract(Label);
    putCallsAlone();
    stampProcedures();
    nameProcedures();
}

/// Those with more than one way in, last first; refuses those with nothing behind them.
std::vector<LabelPlace> LabelExtraction::findSharedLabels() {
    std::vector<LabelPlace> Shared;
    for (const LabelPlace& Label : m_Target.getLabels()) {
        if (m_Graph.indeg(Label.Node) < 2)
            continue;
        if (isEnd(Label.Node))
            refuse(Label, "nothing is left to do behind it");
        else
            Shared.push_back(Label);
    }
    std::sort(Shared.begin(), Shared.end(), [](const LabelPlace& a, const LabelPlace& b) {
        const SourcePosition Left = a.Position;
        const SourcePosition Right = b.Position;
        return Left.File != Right.File ? Left.File > Right.File : Left.Offset > Right.Offset;
    });
    return Shared;
}

// Step 1

void LabelExtraction::noteProcedures() {
    m_OldProcedures.assign(static_cast<std::size_t>(m_Graph.max_node_index()) + 1, nullptr);
    for (leda::node v : m_Graph.all_nodes())
        m_OldProcedures[static_cast<std::size_t>(m_Graph.index(v))] = m_Graph[v]->getProcedure();
}

void LabelExtraction::findLoops() {
    leda::node_array<int> Component(m_Graph, 0);
    const int Count = leda::STRONG_COMPONENTS(m_Graph, Component);
    std::vector<int> Sizes(static_cast<std::size_t>(Count), 0);
    for (leda::node v : m_Graph.all_nodes())
        ++Sizes[static_cast<std::size_t>(Component[v])];
    m_IsOnLoop.assign(static_cast<std::size_t>(m_Graph.max_node_index()) + 1, false);
    for (leda::node v : m_Graph.all_nodes())
        m_IsOnLoop[static_cast<std::size_t>(m_Graph.index(v))] =
            Sizes[static_cast<std::size_t>(Component[v])] > 1;
    for (leda::edge e : m_Graph.all_edges()) {
        if (m_Graph.source(e) == m_Graph.target(e))
            m_IsOnLoop[static_cast<std::size_t>(m_Graph.index(m_Graph.source(e)))] = true;
    }
}

/// Blocks made since the search for loops end with a call and lead nowhere.
bool LabelExtraction::isOnLoop(leda::node v) const {
    const auto Index = static_cast<std::size_t>(m_Graph.index(v));
    return Index < m_IsOnLoop.size() && m_IsOnLoop[Index];
}

/// Backwards from the empty blocks without a way on.
void LabelExtraction::findEnds() {
    m_IsEnd.assign(static_cast<std::size_t>(m_Graph.max_node_index()) + 1, false);
    std::vector<leda::node> Stack;
    const auto add = [&](leda::node v, int WaysOn) {
        ZfCBasicBlock* pBlock = m_Graph[v]->isBasicBlock();
        if (pBlock == nullptr || m_Graph.outdeg(v) != WaysOn || isEnd(v) ||
            pBlock->getBranchCond() != nullptr || !pBlock->getStatementSeq().empty())
            return;
        m_IsEnd[static_cast<std::size_t>(m_Graph.index(v))] = true;
        Stack.push_back(v);
    };
    for (leda::node v : m_Graph.all_nodes())
        add(v, 0);
    while (!Stack.empty()) {
        const leda::node v = Stack.back();
        Stack.pop_back();
        for (leda::edge e : m_Graph.in_edges(v))
            add(m_Graph.source(e), 1);
    }
}

bool LabelExtraction::isEnd(leda::node v) const {
    const auto Index = static_cast<std::size_t>(m_Graph.index(v));
    return Index < m_IsEnd.size() && m_IsEnd[Index];
}

/// A procedure that is nothing but ends keeps them.
void LabelExtraction::splitEnds() {
    const leda::list<leda::edge> Edges = m_Graph.all_edges();
    std::vector<bool> IsKept(m_IsEnd.size(), false);
    for (leda::edge e : Edges) {
        leda::node v = m_Graph.target(e);
        if (m_Graph[m_Graph.source(e)]->isEntryNode() == nullptr || !isEnd(v))
            continue;
        for (; v != nullptr;
             v = m_Graph.outdeg(v) == 0 ? nullptr : m_Graph.target(m_Graph.first_adj_edge(v)))
            IsKept[static_cast<std::size_t>(m_Graph.index(v))] = true;
    }
    for (leda::edge e : Edges) {
        if (isEnd(m_Graph.target(e)) && !isEnd(m_Graph.source(e)) &&
            !IsKept[static_cast<std::size_t>(m_Graph.index(m_Graph.target(e)))])
            leaveByItself(e);
    }
    const leda::list<leda::node> Nodes = m_Graph.all_nodes();
    for (leda::node v : Nodes) {
        if (isEnd(v) && !IsKept[static_cast<std::size_t>(m_Graph.index(v))])
            m_Graph.del_node(v);
    }
}

void LabelExtraction::leaveByItself(leda::edge e) {
    ZfCBasicBlock* pBlock = ZfCCfgFactory::getInstance()->createBasicBlock();
    pBlock->setProcedure(m_Graph[m_Graph.source(e)]->getProcedure());
    m_Graph.move_edge(e, m_Graph.source(e), m_Graph.new_node(pBlock));
}

/// A branch into a join goes through a block of its own, which then takes the call. Else the
/// library would make that block, and where it extracts one join after the other it would stamp it
/// with a procedure that the branch does not lie in.
void LabelExtraction::splitBranches() {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    const leda::list<leda::edge> Edges = m_Graph.all_edges();
    for (leda::edge e : Edges) {
        leda::node v = m_Graph.target(e);
        const ZfCBasicBlock* pSource = m_Graph[m_Graph.source(e)]->isBasicBlock();
        if (pSource == nullptr || m_Graph.outdeg(m_Graph.source(e)) < 2 || m_Graph.indeg(v) < 2 ||
            isOnLoop(v))
            continue;
        leaveByItself(e);
        m_Graph.new_edge(m_Graph.target(e), v, pFactory->createEdgeInfo());
    }
}

// Step 2

void LabelExtraction::extract(const LabelPlace& Label) {
    // What an earlier extraction needed of the label may have been a procedure of it already.
    if (m_Graph.indeg(Label.Node) < 2)
        return;
    if (const char* pWhy = findObstacle(Label))
        return refuse(Label, pWhy);
    if (!mayRewrite("procedure made of a label", Label.Position))
        return;
    // The call that the library gives back would be one more than there were jumps.
    ZfCCfgFactory::getInstance()->delStatement(m_Graph.makeProcedureAndCall(Label.Node));
}

const char* LabelExtraction::findObstacle(const LabelPlace& Label) {
    if (Label.pOwner->IsRecursive)
        return "its procedure calls itself and has its variables once for each call in progress";
    if (isOnLoop(Label.Node))
        return "the code behind it jumps back to it, and the loop would become a recursion";
    walkRegion(Label.Node);
    const bool IsLoopShared = entersLoopFromElsewhere();
    for (leda::node v : m_Region)
        m_PlaceOf[static_cast<std::size_t>(m_Graph.index(v))] = -1;
    if (IsLoopShared)
        return "a loop behind it is also entered from elsewhere, and would become a recursion";
    return nullptr;
}

/// All that the label leads to, by an explicit depth-first walk.
void LabelExtraction::walkRegion(leda::node v) {
    m_PlaceOf.resize(static_cast<std::size_t>(m_Graph.max_node_index()) + 1, -1);
    m_Region.clear();
    std::vector<std::pair<leda::node, leda::edge>> Path;
    const auto visit = [&](leda::node w) {
        m_PlaceOf[static_cast<std::size_t>(m_Graph.index(w))] = 0;
        Path.emplace_back(w, m_Graph.first_adj_edge(w));
    };
    visit(v);
    while (!Path.empty()) {
        const auto [w, e] = Path.back();
        if (e == nullptr) {
            m_Region.push_back(w);
            Path.pop_back();
            continue;
        }
        Path.back().second = m_Graph.adj_succ(e);
        if (m_PlaceOf[static_cast<std::size_t>(m_Graph.index(m_Graph.target(e)))] < 0)
            visit(m_Graph.target(e));
    }
    std::reverse(m_Region.begin(), m_Region.end());
    for (std::size_t i = 0; i < m_Region.size(); ++i)
        m_PlaceOf[static_cast<std::size_t>(m_Graph.index(m_Region[i]))] = static_cast<int>(i);
}

/// The common owner of the predecessors that have one, or the node itself.
int LabelExtraction::findOwner(std::size_t Place, const std::vector<int>& Owners) {
    const int Self = static_cast<int>(Place);
    int Found = -1;
    for (leda::edge e : m_Graph.in_edges(m_Region[Place])) {
        const int Source = m_PlaceOf[static_cast<std::size_t>(m_Graph.index(m_Graph.source(e)))];
        const int Owner = Source < 0 ? Self : Owners[static_cast<std::size_t>(Source)];
        if (Owner >= 0 && Found >= 0 && Owner != Found)
            return Self;
        Found = Owner >= 0 ? Owner : Found;
    }
    return Found;
}

bool LabelExtraction::entersLoopFromElsewhere() {
    std::vector<int> Owners(m_Region.size(), -1);
    Owners[0] = 0;
    for (bool IsChanged = true; IsChanged;) {
        IsChanged = false;
        for (std::size_t i = 1; i < m_Region.size(); ++i) {
            const int Owner = Owners[i] == static_cast<int>(i) ? Owners[i] : findOwner(i, Owners);
            IsChanged = IsChanged || Owner != Owners[i];
            Owners[i] = Owner;
        }
    }
    for (std::size_t i = 1; i < m_Region.size(); ++i) {
        if (Owners[i] == static_cast<int>(i) && isOnLoop(m_Region[i]))
            return true;
    }
    return false;
}

void LabelExtraction::refuse(const LabelPlace& Label, const char* Why) {
    m_Target.getRemarks().push_back(
        {Label.Position, "label '" + std::string(Label.Name) + "' stays a label: " + Why});
}

// Step 3

void LabelExtraction::putCallsAlone() {
    const leda::list<leda::node> Nodes = m_Graph.all_nodes();
    for (leda::node v : Nodes) {
        ZfCBasicBlock* pBlock = m_Graph[v]->isBasicBlock();
        if (pBlock == nullptr || pBlock->getStatementSeq().size() < 2)
            continue;
        ZfCCfgStatement* pLast = pBlock->getStatementSeq().back();
        if (pLast->isProcedureCall() != nullptr)
            m_Graph.splitAtStatement(v, pLast);
    }
}

void LabelExtraction::stampProcedures() {
    std::vector<leda::node> Stack;
    std::vector<bool> IsStamped(static_cast<std::size_t>(m_Graph.max_node_index()) + 1, false);
    for (leda::node Entry : m_Graph.all_nodes()) {
        if (m_Graph[Entry]->isEntryNode() == nullptr)
            continue;
        Stack.push_back(Entry);
        while (!Stack.empty()) {
            const leda::node v = Stack.back();
            Stack.pop_back();
            m_Graph[v]->setProcedure(m_Graph[Entry]->getProcedure());
            for (leda::edge e : m_Graph.out_edges(v)) {
                const auto Index = static_cast<std::size_t>(m_Graph.index(m_Graph.target(e)));
                if (!IsStamped[Index])
                    Stack.push_back(m_Graph.target(e));
                IsStamped[Index] = true;
            }
        }
    }
}

// Step 4

/// The procedure of the source that an extracted one comes from; null for those of the source.
const Procedure* LabelExtraction::findOrigin(leda::node Entry) const {
    const std::string Name = m_Graph[Entry]->getProcedure()->getName().cstring();
    if (Name == ProgramGraph::outsideProcedureName() ||
        m_Target.findProcedure(Name.c_str()) != nullptr)
        return nullptr;
    const leda::node First = m_Graph.target(m_Graph.first_adj_edge(Entry));
    return m_Target.findProcedure(
        m_OldProcedures[static_cast<std::size_t>(m_Graph.index(First))]->getName().cstring());
}

/// An extracted procedure begins with what a label began, or else with a join behind one.
void LabelExtraction::nameProcedures() {
    std::unordered_map<leda::node, std::string_view> LabelAt; // looked up only
    for (const LabelPlace& Label : m_Target.getLabels())
        LabelAt.emplace(Label.Node, Label.Name);
    std::unordered_set<std::string> Marked; // looked up only
    for (leda::node v : m_Graph.all_nodes()) {
        const Procedure* pOrigin = m_Graph[v]->isEntryNode() != nullptr ? findOrigin(v) : nullptr;
        if (pOrigin == nullptr)
            continue;
        const auto Label = LabelAt.find(m_Graph.target(m_Graph.first_adj_edge(v)));
        const std::string_view Kind = Label != LabelAt.end() ? Label->second : "shared";
        const std::string Name = m_Graph[v]->getProcedure()->getName().cstring();
        m_Target.noteExtracted(Name, std::string(pOrigin->Name) + "_" + std::string(Kind));
        if (m_Target.isReachableFromOutside(*pOrigin))
            Marked.insert(Name);
    }
    markCalls(Marked);
}

void LabelExtraction::markCalls(const std::unordered_set<std::string>& Callees) {
    for (leda::node v : m_Graph.all_nodes()) {
        ZfCBasicBlock* pBlock = m_Graph[v]->isBasicBlock();
        if (pBlock == nullptr || pBlock->isStatement() == nullptr)
            continue;
        ZfCCfgProcedureCall* pCall = pBlock->isStatement()->isProcedureCall();
        if (pCall != nullptr && Callees.count(pCall->getName().cstring()) != 0)
            pCall->setIsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(true);
    }
}

} // namespace hpn
