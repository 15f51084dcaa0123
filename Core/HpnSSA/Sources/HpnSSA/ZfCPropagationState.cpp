#include "ZfCPropagationState.h"

#include "ZfCBasicBlock.h"

#include <algorithm>

void ZfCWorkList::grow() {
    const int OldSize = m_Ring.size();
    leda::array<int> Ring(std::max(2 * OldSize, 64));
    for (int i = 0; i < m_Size; ++i) {
        Ring[i] = m_Ring[(m_First + i) & (OldSize - 1)];
    }
    m_Ring = Ring;
    m_First = 0;
}

ZfCPropagationState::ZfCPropagationState(Graph& Of, bool SSAEdgesAreComplete)
    : m_Graph(Of), m_SkipsCleanNodes(SSAEdgesAreComplete), m_Nodes(Of.max_node_index() + 1),
      m_Handles(Of.max_node_index() + 1), m_Codes(Of.max_node_index() + 1),
      m_Edges(Of.max_edge_index() + 1), m_Records(Of.max_edge_index() + 1) {
    for (leda::node v = Of.first_node(); v != Of.stop_node(); v = Of.next_node(v)) {
        const int Number = m_Graph.index(v);
        Node& Known = m_Nodes[Number];
        m_Handles[Number] = v;
        if (ZfCBasicBlock* pBlock = Of.inf(v)->isBasicBlock()) {
            Known.IsBlock = true;
            ++m_NumberOfBlocks;
            if (ZfCPhiFunction* pPhi = pBlock->isPhiFunction()) {
                Known.IsPhi = true;
                m_Codes[Number].pPhi = pPhi;
            } else {
                m_Codes[Number].pBlock = pBlock;
            }
        }
        for (leda::edge e = Of.first_adj_edge(v); e != nullptr; e = Of.adj_succ(e)) {
            Edge& KnownEdge = m_Edges[m_Graph.index(e)];
            ZfCCfgEdgeInfo* const pRecord = Of.inf(e);
            const int Target = m_Graph.index(Of.target(e));
            KnownEdge.Target = static_cast<unsigned int>(Target);
            if (pRecord->isSSAEdge() != nullptr) {
                KnownEdge.IsSSA = 1;
                m_HadSSAEdges = true;
            } else {
                KnownEdge.IsTrue = pRecord->isTrueBranch() != nullptr ? 1 : 0;
                KnownEdge.IsFalse = pRecord->isFalseBranch() != nullptr ? 1 : 0;
                m_Records[m_Graph.index(e)] = pRecord;
                ++m_Nodes[Target].InCount;
            }
        }
        describe(Number);
    }
    if (m_HadSSAEdges) {
        collectUsers();
    }
}

void ZfCPropagationState::appendUser(int Definition, int Target) {
    Node& Known = m_Nodes[Definition];
    if (Known.FirstUser == s_None) {
        Known.FirstUser = m_NumberOfUsers;
    } else {
        m_Users[m_NumberOfUsers - 1].IsLast = 0;
    }
    if (m_NumberOfUsers == m_Users.size()) {
        m_Users.resize(std::max(2 * m_NumberOfUsers, m_Nodes.size()));
    }
    m_Users[m_NumberOfUsers].Target = static_cast<unsigned int>(Target);
    m_Users[m_NumberOfUsers].IsLast = 1;
    ++m_NumberOfUsers;
}

// With earlier SSA edges those of one definition do not come in a row; endOfUsers collects them.
void ZfCPropagationState::addUser(leda::node Definition, leda::node User) {
    if (!m_HadSSAEdges) {
        appendUser(m_Graph.index(Definition), m_Graph.index(User));
    }
}

void ZfCPropagationState::endOfUsers() {
    if (m_HadSSAEdges) {
        collectUsers();
    }
}

void ZfCPropagationState::collectUsers() {
    m_NumberOfUsers = 0;
    for (leda::node v = m_Graph.first_node(); v != m_Graph.stop_node(); v = m_Graph.next_node(v)) {
        const int Number = m_Graph.index(v);
        m_Nodes[Number].FirstUser = s_None;
        for (leda::edge e = m_Graph.first_adj_edge(v); e != nullptr; e = m_Graph.adj_succ(e)) {
            if (isSSAEdge(e)) {
                appendUser(Number, m_Graph.index(m_Graph.target(e)));
            }
        }
    }
}

void ZfCPropagationState::beginIteration() {
    for (int i = 0; i < m_Nodes.size(); ++i) {
        m_Nodes[i].IsVisited = false;
    }
    for (int i = 0; i < m_Edges.size(); ++i) {
        m_Edges[i].IsExecutable = 0;
    }
    m_VisitedBlocks = 0;
}

leda::list<leda::node> ZfCPropagationState::takeUnvisitedBlocks() {
    leda::list<leda::node> Unvisited;
    for (int i = 0; i < m_Nodes.size(); ++i) {
        if (m_Nodes[i].IsBlock && !m_Nodes[i].IsVisited) {
            Unvisited.append(m_Handles[i]);
            m_Nodes[i].IsBlock = false;
            --m_NumberOfBlocks;
        }
    }
    return Unvisited;
}

bool ZfCPropagationState::arriveAt(int v) {
    Node& Known = m_Nodes[v];
    if (Known.IsVisited) {
        return false;
    }
    Known.IsVisited = true;
    ++m_VisitedBlocks;
    return true;
}

bool ZfCPropagationState::takeDirty(int v) {
    Node& Known = m_Nodes[v];
    const bool IsDirty = Known.IsDirty || !m_SkipsCleanNodes;
    Known.IsDirty = false;
    return IsDirty;
}

void ZfCPropagationState::markParametersDirty() {
    for (int i = 0; i < m_Nodes.size(); ++i) {
        if (!m_Nodes[i].IsBlock) {
            continue;
        }
        ZfCCfgStatement* pStmt = m_Nodes[i].IsPhi ? nullptr : blockOf(i)->isStatement();
        if (pStmt != nullptr && pStmt->isParamStatement() != nullptr) {
            markDirty(i);
        }
    }
}

void ZfCPropagationState::appendOnlyCfgOutEdge(int v, ZfCWorkList& CfgEdgeList) {
    Node const& Known = m_Nodes[v];
    if (!Known.IsDescribed) {
        describe(v);
    }
    if (Known.OutCount == 1) {
        CfgEdgeList.append(Known.Out[0]);
    }
}

// Of more edges than are remembered any may be taken, so the node stays dirty.
void ZfCPropagationState::takeBranch(int v, Branch Which, ZfCWorkList& CfgEdgeList) {
    Node& Known = m_Nodes[v];
    if (!Known.IsDescribed) {
        describe(v);
    }
    Known.Taken = 0;
    if (Known.OutCount <= s_MostRemembered) {
        for (int i = 0; i < Known.OutCount; ++i) {
            if (isTaken(Known.Out[i], Which)) {
                CfgEdgeList.append(Known.Out[i]);
                Known.Taken = static_cast<unsigned char>(Known.Taken | (1U << i));
            }
        }
        return;
    }
    Known.IsDirty = true;
    for (leda::edge e = m_Graph.first_adj_edge(m_Handles[v]); e != nullptr;
         e = m_Graph.adj_succ(e)) {
        if (!isSSAEdge(e) && isTaken(m_Graph.index(e), Which)) {
            CfgEdgeList.append(m_Graph.index(e));
        }
    }
}

void ZfCPropagationState::takeAgain(int v, ZfCWorkList& CfgEdgeList) {
    Node const& Known = m_Nodes[v];
    if (Known.Taken == 0) {
        return;
    }
    if (!Known.IsDescribed) {
        describe(v);
    }
    for (int i = 0; i < s_MostRemembered; ++i) {
        if ((Known.Taken & (1U << i)) != 0) {
            CfgEdgeList.append(Known.Out[i]);
        }
    }
}

template <class Action>
void ZfCPropagationState::forEachUser(int v, Action Do) {
    int i = m_Nodes[v].FirstUser;
    if (i == s_None) {
        return;
    }
    User Present;
    do {
        Present = m_Users[i++];
        const int Target = static_cast<int>(Present.Target);
        if (!m_Nodes[Target].IsGone) {
            Do(Target);
        }
    } while (Present.IsLast == 0);
}

void ZfCPropagationState::markUsersDirty(int v) {
    forEachUser(v, [this](int Target) { markDirty(Target); });
}

void ZfCPropagationState::appendUsers(int v, ZfCWorkList& SSAEdgeList) {
    forEachUser(v, [&SSAEdgeList](int Target) { SSAEdgeList.append(Target); });
}

void ZfCPropagationState::forget(leda::node v) {
    for (leda::edge e = m_Graph.first_in_edge(v); e != nullptr; e = m_Graph.in_succ(e)) {
        if (!isSSAEdge(e)) {
            Node& Before = m_Nodes[m_Graph.index(m_Graph.source(e))];
            Before.IsDescribed = false;
            Before.IsDirty = true;
            m_Records[m_Graph.index(e)] = nullptr;
        }
    }
    for (leda::edge e = m_Graph.first_adj_edge(v); e != nullptr; e = m_Graph.adj_succ(e)) {
        if (!isSSAEdge(e)) {
            m_Records[m_Graph.index(e)] = nullptr;
            --m_Nodes[m_Graph.index(m_Graph.target(e))].InCount;
        }
    }
    m_Nodes[m_Graph.index(v)].IsGone = true;
}

// The flag of an SSA edge is never set.
void ZfCPropagationState::finish() {
    for (int i = 0; i < m_Records.size(); ++i) {
        if (m_Records[i] == nullptr) {
            continue;
        }
        if (isExecutable(i)) {
            m_Records[i]->activateEdgeExecutable();
        } else {
            m_Records[i]->deactivateEdgeExecutable();
        }
    }
}

void ZfCPropagationState::describe(int v) {
    Node& Known = m_Nodes[v];
    Known.OutCount = 0;
    Known.IsDescribed = true;
    leda::node const Handle = m_Handles[v];
    for (leda::edge e = m_Graph.first_adj_edge(Handle); e != nullptr; e = m_Graph.adj_succ(e)) {
        if (isSSAEdge(e)) {
            continue;
        }
        if (Known.OutCount == s_MostRemembered) {
            ++Known.OutCount;
            return;
        }
        Known.Out[Known.OutCount++] = m_Graph.index(e);
    }
}
