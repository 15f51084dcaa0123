#ifndef ZFCPROPAGATIONSTATE_H
#define ZFCPROPAGATIONSTATE_H

#include "LEDA/array.h"
#include "LEDA/graph.h"
#include "LEDA/list.h"
#include "ZfCCfgEdgeInfo.h"
#include "ZfCCfgNodeInfo.h"

class ZfCBasicBlock;
class ZfCPhiFunction;

// A first-in first-out work list of numbers: of edges, or of nodes. A ring that doubles when it is
// full, so that a run allocates hardly ever.
class ZfCWorkList {
public:
    // Whether there is nothing to do; and makes it so.
    bool empty() const { return m_Size == 0; }
    void clear() { m_Size = 0; }
    // Adds a number behind all others.
    void append(int Number) {
        if (m_Size == m_Ring.size()) {
            grow();
        }
        m_Ring[(m_First + m_Size++) & (m_Ring.size() - 1)] = Number;
    }
    // The oldest number; the list must not be empty.
    int pop() {
        const int Number = m_Ring[m_First];
        m_First = (m_First + 1) & (m_Ring.size() - 1);
        --m_Size;
        return Number;
    }

private:
    void grow();

    leda::array<int> m_Ring; // its size is a power of two, or 0
    int m_First = 0;
    int m_Size = 0;
};

// What one run of constant propagation knows of the graph's nodes and edges, in flat tables by
// index.
//
// The sweeps ask the same few questions of every node and edge many times: has it been reached,
// where does an edge lead, where does control go on, could a visit find anything new, who uses what
// a node defines. Nodes, edges and records answer them too, but each answer there costs a walk
// through memory. So nodes and edges go by their numbers, which are the graph's indices, and the
// tables hold the answers of this run; finish writes the flags that outlive it back to the records.
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

    // SSAEdgesAreComplete: every use of a variable is the end of an SSA edge from its definition,
    // or will be when the caller has added them.
    ZfCPropagationState(Graph& Of, bool SSAEdgesAreComplete);

    // Each SSA edge that the caller adds to the graph, those of one definition in a row; and the
    // end of it.
    void addUser(leda::node Definition, leda::node User);
    void endOfUsers();

    // Nothing is reached, no edge is executable.
    void beginIteration();
    // Whether every basic block has been reached in this iteration.
    bool allBlocksAreVisited() const { return m_VisitedBlocks == m_NumberOfBlocks; }
    // The basic blocks that have not been reached, in the order of the graph's nodes. They are no
    // longer counted: the caller removes them.
    leda::list<leda::node> takeUnvisitedBlocks();

    // ---- nodes ----

    // The number of a node.
    int numberOf(leda::node v) const { return m_Graph.index(v); }
    // Where a visit begins: the phi function of a node that is one, the code of any other basic
    // block.
    ZfCPhiFunction* phiFunctionOf(int v) const { return m_Codes[v].pPhi; }
    ZfCBasicBlock* blockOf(int v) const { return m_Codes[v].pBlock; }
    // Whether control has arrived at the node in this iteration.
    bool isVisited(int v) const { return m_Nodes[v].IsVisited; }
    // Marks a basic block as reached; true at the first arrival.
    bool arriveAt(int v);
    // Whether the node has code, and whether that is one phi function.
    bool isBasicBlock(int v) const { return m_Nodes[v].IsBlock; }
    bool isPhiFunction(int v) const { return m_Nodes[v].IsPhi; }
    // Appends the one control flow out-edge; nothing if there is none or more than one.
    void appendOnlyCfgOutEdge(int v, ZfCWorkList& CfgEdgeList);
    // Whether a visit could find anything new. Taking the mark away comes before the visit, which
    // may set it again.
    bool takeDirty(int v);
    void markDirty(int v) { m_Nodes[v].IsDirty = true; }
    // The definitions that hang on the calls, not on their operands alone.
    void markParametersDirty();

    // Appends all control flow out-edges, those of true branches, or those of false branches, in
    // adjacency order, and remembers them.
    enum class Branch { Both, True, False };
    void takeBranch(int v, Branch Which, ZfCWorkList& CfgEdgeList);
    // Appends what the last visit appended.
    void takeAgain(int v, ZfCWorkList& CfgEdgeList);

    // The users of what v defines: dirty from now on; and the ends of the SSA edges to them, in
    // adjacency order, for the work list.
    void markUsersDirty(int v);
    void appendUsers(int v, ZfCWorkList& SSAEdgeList);

    // ---- edges ----

    // Whether the edge leads from a definition to a use.
    bool isSSAEdge(leda::edge e) const {
        const int Number = m_Graph.index(e);
        return Number >= m_Edges.size() || m_Edges[Number].IsSSA != 0;
    }
    // The number of an edge, and the number of the node that it leads to.
    int numberOf(leda::edge e) const { return m_Graph.index(e); }
    int targetOf(int e) const { return static_cast<int>(m_Edges[e].Target); }
    // Whether it is control flow that has been found to be passable in this iteration.
    bool isExecutable(int e) const { return m_Edges[e].IsExecutable != 0; }
    // Control can pass here; stays so until the next beginIteration.
    void setExecutable(int e) { m_Edges[e].IsExecutable = 1; }
    // Whether a definition reaches the node.
    bool hasSSAInEdge(int v) const { return m_Graph.indeg(m_Handles[v]) != m_Nodes[v].InCount; }

    // ---- removal ----

    // The basic block and all its edges go: those in front of it lose an edge, and look again.
    void forget(leda::node v);

    // Writes the executable flags to the edge records.
    void finish();

private:
    // What is known of a node.
    struct Node {
        Node()
            : IsVisited(false), IsDirty(true), IsBlock(false), IsDescribed(false), IsPhi(false),
              IsGone(false) {}

        int Out[2] = {s_None, s_None}; // the first two control flow out-edges
        int FirstUser = s_None;        // place in m_Users
        int InCount = 0;               // control flow in-edges
        bool IsVisited : 1;
        bool IsDirty : 1;
        bool IsBlock : 1;
        bool IsDescribed : 1; // Out and OutCount hold; lost when an out-edge goes
        bool IsPhi : 1;
        bool IsGone : 1;
        unsigned char Taken = 0;    // control flow out-edges by position, of the last visit
        unsigned char OutCount = 0; // control flow out-edges; s_MostRemembered + 1 for more
    };
    // What is known of an edge that was there when the run began.
    struct Edge {
        Edge() : Target(0), IsTrue(0), IsFalse(0), IsSSA(0), IsExecutable(0) {}

        unsigned int Target : 28;
        unsigned int IsTrue : 1; // by its record
        unsigned int IsFalse : 1;
        unsigned int IsSSA : 1;
        unsigned int IsExecutable : 1;
    };
    // The end of an SSA edge.
    struct User {
        User() : Target(0), IsLast(0) {}

        unsigned int Target : 31;
        unsigned int IsLast : 1; // of those of one definition
    };
    // See phiFunctionOf and blockOf.
    union Code {
        Code() : pBlock(nullptr) {}

        ZfCBasicBlock* pBlock;
        ZfCPhiFunction* pPhi;
    };
    static constexpr int s_None = -1;
    static constexpr int s_MostRemembered = 2;

    void describe(int v);
    bool isTaken(int e, Branch Which) const {
        return Which == Branch::Both ||
               (Which == Branch::True ? m_Edges[e].IsTrue : m_Edges[e].IsFalse) != 0;
    }
    void collectUsers();
    void appendUser(int Definition, int Target);
    template <class Action>
    void forEachUser(int v, Action Do);

    Graph& m_Graph;
    bool m_SkipsCleanNodes;
    bool m_HadSSAEdges = false;
    int m_NumberOfBlocks = 0;
    int m_VisitedBlocks = 0;
    int m_NumberOfUsers = 0;
    leda::array<Node> m_Nodes;
    leda::array<leda::node> m_Handles; // of the nodes
    leda::array<Code> m_Codes;
    leda::array<Edge> m_Edges;
    leda::array<ZfCCfgEdgeInfo*> m_Records; // of the control flow edges; null for others
    leda::array<User> m_Users;              // those of one definition in a row
};

#endif
