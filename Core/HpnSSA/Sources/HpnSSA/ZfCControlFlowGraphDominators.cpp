// Immediate dominators and dominator trees.
//
// T. Lengauer and R. E. Tarjan, A fast algorithm for finding dominators in a flowgraph, ACM
// Transactions on Programming Languages and Systems 1(1), 1979, in its sophisticated form with
// balanced linking:
//
// 1. A depth-first search numbers the nodes of a component and spans a tree.
// 2. In descending number, the semidominator of each node is found from its predecessors, by
//    eval over the forest of the nodes already linked.
// 3. The nodes of each bucket get their dominator, or a node with the same dominator.
// 4. In ascending number, the deferred dominators are filled in.
//
// Names: the paper's semi is Sdno, vertex is Ndfs, pred stands in the graph. A component is one
// procedure; its root is the node without in-edges.
//
// Departures: dfsDom and compress do not recurse, as a procedure may have a million nodes on one
// path; they keep the open path on a stack and do the same steps in the same order. The absent
// node n0 is the number 0, which no node has. Only the numbering is a map by node; the other maps
// of the paper are arrays by depth-first number, of the size of the component in hand. The order
// within a bucket does not matter to the dominators, so a bucket is a chain and not a set. Worst
// case O(m a(m, n)) for n nodes and m edges.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"

#include <utility>

namespace {

using NodeSet = leda::set<leda::node, leda::avl_tree>;
using NodeMap = leda::map<leda::node, leda::node>;

// The search in one component. Nodes go by their depth-first number; 0 is n0.
class DominatorSearch {
public:
    DominatorSearch(leda::graph& Graph, int NumberOfNodes)
        : m_Graph(Graph), Ndfs(NumberOfNodes + 1), m_Nodes(NumberOfNodes + 1) {}

    // Steps 1 to 4 of the paper; enters the dominators of all nodes but the root.
    void run(leda::node r, NodeMap& Idom);

private:
    // What the paper keeps of a node in maps of their own. As entries of n0, Sdno and Size are 0
    // and Label and Ancestor n0.
    struct Node {
        int Label = 0;
        int Parent = 0;
        int Ancestor = 0;
        int Child = 0;
        int Sdno = 0;
        int Size = 0;
        int Bucket = 0;       // first of the nodes whose semidominator is this one
        int NextInBucket = 0; // of the bucket that this node is in
        int Idom = 0;
    };

    void dfsDom(leda::node v);
    bool enter(leda::node w);
    int eval(int v);
    void compress(int v);
    void link(int v, int w);
    void findSemidominator(int w);
    void emptyBucket(int p);

    leda::graph& m_Graph;
    leda::map<leda::node, int> m_Number; // of the nodes entered
    leda::array<leda::node> Ndfs;
    leda::array<Node> m_Nodes; // by number
    int n = 0;
};

void DominatorSearch::run(leda::node r, NodeMap& Idom) {
    dfsDom(r);
    // Semidominators, and dominators as far as they are known at once.
    for (int w = n; w >= 2; --w) {
        findSemidominator(w);
        const int p = m_Nodes[w].Parent;
        link(p, w);
        emptyBucket(p);
    }
    // The deferred dominators.
    for (int w = 2; w <= n; ++w) {
        Node& Of = m_Nodes[w];
        if (Of.Idom != Of.Sdno) {
            Of.Idom = m_Nodes[Of.Idom].Idom;
        }
        Idom[Ndfs[w]] = Ndfs[Of.Idom];
    }
}

void DominatorSearch::findSemidominator(int w) {
    int SdnoOfW = m_Nodes[w].Sdno;
    for (leda::edge e = m_Graph.first_in_edge(Ndfs[w]); e != nullptr; e = m_Graph.in_succ(e)) {
        const int* pSource = m_Number.lookup(m_Graph.source(e));
        if (pSource == nullptr) {
            continue; // the search has not been there, so no path comes from there
        }
        const int SdnoOfU = m_Nodes[eval(*pSource)].Sdno;
        if (SdnoOfU < SdnoOfW) {
            SdnoOfW = SdnoOfU;
        }
    }
    m_Nodes[w].Sdno = SdnoOfW;
    m_Nodes[w].NextInBucket = m_Nodes[SdnoOfW].Bucket;
    m_Nodes[SdnoOfW].Bucket = w;
}

void DominatorSearch::emptyBucket(int p) {
    for (int v = m_Nodes[p].Bucket; v != 0; v = m_Nodes[v].NextInBucket) {
        const int u = eval(v);
        m_Nodes[v].Idom = m_Nodes[u].Sdno < m_Nodes[v].Sdno ? u : p;
    }
    m_Nodes[p].Bucket = 0;
}

// Gives the node the next number; false, and nothing done, if it has one.
bool DominatorSearch::enter(leda::node w) {
    int& Number = m_Number[w];
    if (Number != 0) {
        return false;
    }
    Number = ++n;
    Ndfs[n] = w;
    m_Nodes[n].Sdno = n;
    m_Nodes[n].Label = n;
    m_Nodes[n].Size = 1;
    return true;
}

// The open path of the search stands in Path, as the tree edges by which its nodes were entered.
void DominatorSearch::dfsDom(leda::node v) {
    leda::stack<leda::edge> Path;
    enter(v);
    int Number = n;
    leda::edge e = m_Graph.first_adj_edge(v);
    for (;;) {
        while (e != nullptr && !enter(m_Graph.target(e))) {
            e = m_Graph.adj_succ(e);
        }
        if (e != nullptr) {
            // Down to the new node.
            m_Nodes[n].Parent = Number;
            Number = n;
            Path.push(e);
            e = m_Graph.first_adj_edge(m_Graph.target(e));
        } else if (!Path.empty()) {
            // Back, and on with the next out-edge of the parent.
            Number = m_Nodes[Number].Parent;
            e = m_Graph.adj_succ(Path.pop());
        } else {
            return;
        }
    }
}

int DominatorSearch::eval(int v) {
    if (m_Nodes[v].Ancestor == 0) {
        return m_Nodes[v].Label;
    }
    compress(v);
    const int LabelOfV = m_Nodes[v].Label;
    const int LabelOfA = m_Nodes[m_Nodes[v].Ancestor].Label;
    return m_Nodes[LabelOfA].Sdno >= m_Nodes[LabelOfV].Sdno ? LabelOfV : LabelOfA;
}

// The way up is turned round while it is walked, by the links in Ancestor themselves; then it is
// done from the top down, in which order a recursion would come back. Each node on it ends with the
// same ancestor, the one below the root of its tree.
void DominatorSearch::compress(int v) {
    int Below = 0;
    int a = m_Nodes[v].Ancestor;
    while (m_Nodes[a].Ancestor != 0) {
        const int Above = m_Nodes[v].Ancestor;
        m_Nodes[v].Ancestor = Below;
        Below = v;
        v = Above;
        a = m_Nodes[v].Ancestor;
    }
    const int Root = a;
    int Former = v; // as the recursion left it: its ancestor is the root
    while (Below != 0) {
        const int Next = m_Nodes[Below].Ancestor;
        const int LabelOfA = m_Nodes[Former].Label;
        if (m_Nodes[LabelOfA].Sdno < m_Nodes[m_Nodes[Below].Label].Sdno) {
            m_Nodes[Below].Label = LabelOfA;
        }
        m_Nodes[Below].Ancestor = Root;
        Former = Below;
        Below = Next;
    }
}

void DominatorSearch::link(int v, int w) {
    int s = w;
    // Step 1: Sdno of n0 is smaller than any other, so the loop ends there at the latest.
    const int LabelOfW = m_Nodes[w].Label;
    const int SdnoOfW = m_Nodes[LabelOfW].Sdno;
    for (;;) {
        const int c = m_Nodes[s].Child;
        if (SdnoOfW >= m_Nodes[m_Nodes[c].Label].Sdno) {
            break;
        }
        const int ChildOfC = m_Nodes[c].Child;
        if (m_Nodes[s].Size + m_Nodes[ChildOfC].Size >= 2 * m_Nodes[c].Size) {
            m_Nodes[c].Ancestor = s;
            m_Nodes[s].Child = ChildOfC;
        } else {
            m_Nodes[c].Size = m_Nodes[s].Size;
            m_Nodes[s].Ancestor = c;
            s = c;
        }
    }
    // Step 2.
    m_Nodes[s].Label = LabelOfW;
    // Step 3.
    m_Nodes[v].Size += m_Nodes[w].Size;
    // Step 4.
    if (m_Nodes[v].Size < 2 * m_Nodes[w].Size) {
        std::swap(s, m_Nodes[v].Child);
    }
    // Step 5.
    while (s != 0) {
        m_Nodes[s].Ancestor = v;
        s = m_Nodes[s].Child;
    }
}

} // namespace

void ZfCControlFlowGraph::computeAllIdoms() {
    // Step 1: the nodes by component.
    leda::node_array<int> ComponentNum(*this);
    int Count = leda::COMPONENTS(*this, ComponentNum);
    leda::array<NodeSet> ComponentNodes(Count);
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        ComponentNodes[ComponentNum[v]].insert(v);
    }
    // Step 2: one map for all components.
    NodeMap Idom;
    // Step 3: component by component. The sets are given away, and the results are stored when all
    // are there: a component does not look at another's.
    for (int i = 0; i < Count; ++i) {
        computeIdomsFast(std::move(ComponentNodes[i]), Idom);
    }
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        leda::node const* pIdom = Idom.lookup(v);
        inf(v)->setIdom(pIdom != nullptr ? *pIdom : nullptr);
    }
}

void ZfCControlFlowGraph::computeIdomsFast(NodeSet ComponentNodes, NodeMap& Idom) {
    // Step 2: the root.
    leda::node r = nullptr;
    for (leda::node v : ComponentNodes) {
        if (indeg(v) == 0) {
            r = v;
        }
    }
    // Step 3: a component that is nothing but cycles cannot be searched.
    if (r == nullptr) {
        reportInternalError("ZfCControlFlowGraph", __LINE__);
        return;
    }
    // Steps 1 and 4 to 7.
    DominatorSearch(*this, ComponentNodes.size()).run(r, Idom);
}

int ZfCControlFlowGraph::buildDominatorTrees(leda::array<ZfCDominatorTree*>& DominatorTree) {
    // Step 1: a slot for each component.
    leda::node_array<int> ComponentNum(*this);
    int Count = leda::COMPONENTS(*this, ComponentNum);
    DominatorTree = leda::array<ZfCDominatorTree*>(Count);
    leda::array<leda::list<leda::node>> NodeList(Count);
    leda::map<leda::node, leda::node> DominatorNode;
    // Step 2: the trees.
    for (int i = 0; i < Count; ++i) {
        DominatorTree[i] = new ZfCDominatorTree();
    }
    // Step 3: their nodes.
    for (leda::node cfg_x = first_node(); cfg_x != stop_node(); cfg_x = next_node(cfg_x)) {
        int i = ComponentNum[cfg_x];
        leda::node dom_x = DominatorTree[i]->new_node(cfg_x);
        NodeList[i].append(dom_x);
        DominatorNode[cfg_x] = dom_x;
    }
    // Step 4: their edges, from parent to child. The root is an entry node by its kind.
    for (int i = 0; i < Count; ++i) {
        for (leda::node dom_x : NodeList[i]) {
            ZfCCfgNodeInfo* pInf = inf(DominatorTree[i]->inf(dom_x));
            if (pInf->isEntryNode() != nullptr) {
                DominatorTree[i]->setRoot(dom_x);
            } else {
                DominatorTree[i]->new_edge(DominatorNode[pInf->getIdom()], dom_x);
            }
        }
    }
    // Step 5.
    return Count;
}

void ZfCControlFlowGraph::freeDominatorTrees(leda::array<ZfCDominatorTree*>& DominatorTree,
                                             int Count) {
    for (int i = 0; i < Count; ++i) {
        delete DominatorTree[i];
    }
}
