#ifndef ZFCPROPAGATIONSTATE_H
#define ZFCPROPAGATIONSTATE_H

#include "LEDA/array.h"
#include "LEDA/graph.h"
#include "LEDA/list.h"
#include "ZfCCfgEdgeInfo.h"
#include "ZfCCfgNodeInfo.h"

class ZfCControlFlowGraph;

// What one run of constant propagation knows of the graph's nodes and edges, in two flat tables by
// index.
//
// The sweeps ask the same few questions of every node and edge many times: has it been reached, is
// it an SSA edge, where does control go on, could a visit find anything new. The records answer
// them too, but each answer there costs a walk through memory. The tables hold the answers of this
// run; finish writes the flags that outlive it back to the records.
//
// A visit computes value and range from the variables that the node uses and from nothing else, so
// a visit of a node none of whose operands has changed since the last one changes nothing either.
// Such a node is called clean; what its visit would have put on the work list of control flow is
// put there without it. Changes travel along SSA edges, so this holds for a caller that has just
// added them; any other has every node visited.
class ZfCPropagationState {
public:
    // The graph whose nodes and edges the tables are for.
    using Graph = leda::GRAPH<ZfCCfgNodeInfo*, ZfCCfgEdgeInfo*>;

    // SSAEdgesAreComplete: every use of a variable is the end of an SSA edge from its definition.
    ZfCPropagationState(Graph& Of, bool SSAEdgesAreComplete);

    // Nothing is reached, no edge is executable.
    void beginIteration();
    // Whether every basic block has been reached in this iteration.
    bool allBlocksAreVisited() const { return m_VisitedBlocks == m_NumberOfBlocks; }
    // The basic blocks that have not been reached, in the order of the graph's nodes. They are no
    // longer counted: the caller removes them.
    leda::list<leda::node> takeUnvisitedBlocks();

    // ---- nodes ----

    // Whether control has arrived at the node in this iteration.
    bool isVisited(leda::node v) const { return m_Nodes[m_Graph.index(v)].IsVisited; }
    // Marks a basic block as reached; true at the first arrival.
    bool arriveAt(leda::node v);
    // Whether the node has code, and whether that is one phi function.
    bool isBasicBlock(leda::node v) const { return m_Nodes[m_Graph.index(v)].IsBlock; }
    bool isPhiFunction(leda::node v) { return described(v).IsPhi; }
    // The one control flow out-edge; null if there is none or more than one.
    leda::edge onlyCfgOutEdge(leda::node v) { return described(v).pOnlyOut; }
    // Whether a visit could find anything new. Taking the mark away comes before the visit, which
    // may set it again.
    bool takeDirty(leda::node v);
    void markDirty(leda::node v) { m_Nodes[m_Graph.index(v)].IsDirty = true; }
    // The definitions that hang on the calls, not on their operands alone.
    void markParametersDirty();

    // The visit appends control flow out-edges: from here on they are remembered.
    void beginBranch(leda::node v) { m_Nodes[m_Graph.index(v)].Taken = 0; }
    // Appends the CFG out-edge at that place among them, and remembers that.
    void take(leda::node v, int Position, leda::edge e, leda::list<leda::edge>& CfgEdgeList);
    // Appends what the last visit appended.
    void takeAgain(leda::node v, leda::list<leda::edge>& CfgEdgeList);

    // The users of what v defines: dirty from now on; and the SSA edges to them, for the work list.
    void markUsersDirty(leda::node v);
    void appendSSAOutEdges(leda::node v, leda::list<leda::edge>& SSAEdgeList);

    // ---- edges ----

    // Whether the edge leads from a definition to a use; whether it is control flow that has been
    // found to be passable in this iteration.
    bool isSSAEdge(leda::edge e) const { return (m_Edges[m_Graph.index(e)] & IsSSA) != 0; }
    bool isExecutable(leda::edge e) const {
        return (m_Edges[m_Graph.index(e)] & IsExecutable) != 0;
    }
    // Whether a definition reaches the node; costs the in-edges up to the first SSA edge.
    bool hasSSAInEdge(leda::node v) const;
    // Control can pass here; stays so until the next beginIteration.
    void setExecutable(leda::edge e) { m_Edges[m_Graph.index(e)] |= IsExecutable; }

    // ---- removal ----

    // The basic block goes: those in front of it lose an edge, and look again.
    void forget(leda::node v);

    // Writes the executable flags to the edge records.
    void finish();

private:
    // What is known of a node. The second group is found out at the first question.
    struct Node {
        bool IsVisited = false;
        bool IsDirty = true;
        bool IsBlock = false;
        bool IsDescribed = false;
        bool IsPhi = false;
        unsigned char Taken = 0; // control flow out-edges by position, of the last visit
        leda::edge pOnlyOut = nullptr;
    };
    // A basic block with its index, which so is known without a look at the node.
    struct Block {
        leda::node Node;
        int Index;
    };
    enum : unsigned char { IsSSA = 1, IsExecutable = 2 };
    static constexpr int s_MostRemembered = 8; // bits of Taken

    Node& described(leda::node v) {
        Node& Known = m_Nodes[m_Graph.index(v)];
        if (!Known.IsDescribed)
            describe(v, Known);
        return Known;
    }
    void describe(leda::node v, Node& Known);

    Graph& m_Graph;
    bool m_SkipsCleanNodes;
    int m_NumberOfBlocks = 0;
    int m_VisitedBlocks = 0;
    leda::array<Node> m_Nodes;          // by node index
    leda::array<Block> m_Blocks;        // in the order of the graph's nodes
    leda::array<unsigned char> m_Edges; // by edge index
};

#endif
