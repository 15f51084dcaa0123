#include "ZfCPropagationState.h"

#include "ZfCBasicBlock.h"

ZfCPropagationState::ZfCPropagationState(Graph& Of, bool SSAEdgesAreComplete)
    : m_Graph(Of), m_SkipsCleanNodes(SSAEdgesAreComplete), m_Nodes(Of.max_node_index() + 1),
      m_Blocks(Of.number_of_nodes()), m_Edges(Of.max_edge_index() + 1) {
    for (leda::node v = Of.first_node(); v != Of.stop_node(); v = Of.next_node(v)) {
        if (Of.inf(v)->isBasicBlock() != nullptr) {
            const int Index = m_Graph.index(v);
            m_Nodes[Index].IsBlock = true;
            m_Blocks[m_NumberOfBlocks++] = {v, Index};
        }
    }
    for (leda::edge e = Of.first_edge(); e != Of.stop_edge(); e = Of.next_edge(e)) {
        m_Edges[m_Graph.index(e)] = Of.inf(e)->isSSAEdge() != nullptr ? IsSSA : 0;
    }
}

void ZfCPropagationState::beginIteration() {
    for (int i = 0; i < m_Nodes.size(); ++i) {
        m_Nodes[i].IsVisited = false;
    }
    for (int i = 0; i < m_Edges.size(); ++i) {
        m_Edges[i] &= IsSSA;
    }
    m_VisitedBlocks = 0;
}

leda::list<leda::node> ZfCPropagationState::takeUnvisitedBlocks() {
    leda::list<leda::node> Unvisited;
    int Kept = 0;
    for (int i = 0; i < m_NumberOfBlocks; ++i) {
        if (m_Nodes[m_Blocks[i].Index].IsVisited) {
            m_Blocks[Kept++] = m_Blocks[i];
        } else {
            Unvisited.append(m_Blocks[i].Node);
        }
    }
    m_NumberOfBlocks = Kept;
    return Unvisited;
}

bool ZfCPropagationState::arriveAt(leda::node v) {
    Node& Known = m_Nodes[m_Graph.index(v)];
    if (Known.IsVisited) {
        return false;
    }
    Known.IsVisited = true;
    ++m_VisitedBlocks;
    return true;
}

bool ZfCPropagationState::takeDirty(leda::node v) {
    Node& Known = m_Nodes[m_Graph.index(v)];
    const bool IsDirty = Known.IsDirty || !m_SkipsCleanNodes;
    Known.IsDirty = false;
    return IsDirty;
}

void ZfCPropagationState::markParametersDirty() {
    for (leda::node v = m_Graph.first_node(); v != m_Graph.stop_node(); v = m_Graph.next_node(v)) {
        ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
        ZfCCfgStatement* pStmt = pBlock != nullptr ? pBlock->isStatement() : nullptr;
        if (pStmt != nullptr && pStmt->isParamStatement() != nullptr) {
            markDirty(v);
        }
    }
}

void ZfCPropagationState::take(leda::node v, int Position, leda::edge e,
                               leda::list<leda::edge>& CfgEdgeList) {
    CfgEdgeList.append(e);
    Node& Known = m_Nodes[m_Graph.index(v)];
    if (Position < s_MostRemembered) {
        Known.Taken = static_cast<unsigned char>(Known.Taken | (1U << Position));
    } else {
        Known.IsDirty = true; // too many to remember: always visited
    }
}

void ZfCPropagationState::takeAgain(leda::node v, leda::list<leda::edge>& CfgEdgeList) {
    unsigned int Taken = m_Nodes[m_Graph.index(v)].Taken;
    for (leda::edge e = m_Graph.first_adj_edge(v); Taken != 0; e = m_Graph.adj_succ(e)) {
        if (isSSAEdge(e)) {
            continue;
        }
        if ((Taken & 1U) != 0) {
            CfgEdgeList.append(e);
        }
        Taken >>= 1U;
    }
}

void ZfCPropagationState::markUsersDirty(leda::node v) {
    for (leda::edge e = m_Graph.first_adj_edge(v); e != nullptr; e = m_Graph.adj_succ(e)) {
        if (isSSAEdge(e)) {
            markDirty(m_Graph.target(e));
        }
    }
}

void ZfCPropagationState::appendSSAOutEdges(leda::node v, leda::list<leda::edge>& SSAEdgeList) {
    for (leda::edge e = m_Graph.first_adj_edge(v); e != nullptr; e = m_Graph.adj_succ(e)) {
        if (isSSAEdge(e)) {
            SSAEdgeList.append(e);
        }
    }
}

bool ZfCPropagationState::hasSSAInEdge(leda::node v) const {
    for (leda::edge e = m_Graph.first_in_edge(v); e != nullptr; e = m_Graph.in_succ(e)) {
        if (isSSAEdge(e)) {
            return true;
        }
    }
    return false;
}

void ZfCPropagationState::forget(leda::node v) {
    for (leda::edge e = m_Graph.first_in_edge(v); e != nullptr; e = m_Graph.in_succ(e)) {
        if (!isSSAEdge(e)) {
            Node& Before = m_Nodes[m_Graph.index(m_Graph.source(e))];
            Before.IsDescribed = false;
            Before.IsDirty = true;
        }
    }
}

void ZfCPropagationState::finish() {
    for (leda::edge e = m_Graph.first_edge(); e != m_Graph.stop_edge(); e = m_Graph.next_edge(e)) {
        if (isExecutable(e)) {
            m_Graph.inf(e)->activateEdgeExecutable();
        } else {
            m_Graph.inf(e)->deactivateEdgeExecutable();
        }
    }
}

void ZfCPropagationState::describe(leda::node v, Node& Known) {
    ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
    Known.IsPhi = pBlock != nullptr && pBlock->isPhiFunction() != nullptr;
    Known.pOnlyOut = nullptr;
    Known.IsDescribed = true;
    for (leda::edge e = m_Graph.first_adj_edge(v); e != nullptr; e = m_Graph.adj_succ(e)) {
        if (isSSAEdge(e)) {
            continue;
        }
        if (Known.pOnlyOut != nullptr) {
            Known.pOnlyOut = nullptr;
            return;
        }
        Known.pOnlyOut = e;
    }
}
