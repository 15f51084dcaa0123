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
// node n0 is a node of a graph of its own, so that the numbering of the program's nodes stays
// dense. Worst case O(m a(m, n)) for n nodes and m edges.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"

#include <utility>

namespace {

using NodeSet = leda::set<leda::node, leda::avl_tree>;
using NodeMap = leda::map<leda::node, leda::node>;

// The node that stands for no node. It lies in no program, so it can serve every computation.
leda::node absentNode() {
    static leda::graph Holder;
    if (Holder.first_node() == nullptr) {
        Holder.new_node();
    }
    return Holder.first_node();
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
    // Step 1: the maps. A bucket that nobody has filled is empty, so none is entered beforehand.
    NodeMap Label, Parent, Ancestor, Child;
    leda::map<int, leda::node> Ndfs;
    leda::map<leda::node, int> Sdno, Size;
    leda::map<leda::node, NodeSet> Bucket;
    leda::node r = nullptr;
    leda::node n0 = absentNode();
    // Step 2: the root, and no node numbered.
    for (leda::node v : ComponentNodes) {
        Sdno[v] = 0;
        if (indeg(v) == 0) {
            r = v;
        }
    }
    // Step 3: a component that is nothing but cycles cannot be searched.
    if (r == nullptr) {
        reportInternalError("ZfCControlFlowGraph", __LINE__);
        return;
    }
    // Step 4: the numbering.
    Sdno[n0] = 0;
    Size[n0] = 0;
    Label[n0] = n0;
    Ancestor[n0] = n0;
    int n = 0;
    dfsDom(r, n0, n, Label, Parent, Ancestor, Child, Ndfs, Sdno, Size);
    // Step 5: semidominators, and dominators as far as they are known at once.
    for (int i = n; i >= 2; --i) {
        leda::node w = Ndfs[i];
        // Step 5a.
        int SdnoOfW = Sdno[w];
        for (leda::edge e = first_in_edge(w); e != nullptr; e = in_succ(e)) {
            leda::node u = eval(source(e), n0, Label, Ancestor, Sdno);
            int SdnoOfU = Sdno[u];
            if (SdnoOfU < SdnoOfW) {
                SdnoOfW = SdnoOfU;
            }
        }
        Sdno[w] = SdnoOfW;
        // Step 5b.
        Bucket[Ndfs[SdnoOfW]].insert(w);
        // Step 5c.
        leda::node p = Parent[w];
        link(p, w, n0, Label, Ancestor, Child, Sdno, Size);
        // Step 5d.
        NodeSet* pBucket = Bucket.lookup(p);
        while (pBucket != nullptr && !pBucket->empty()) {
            leda::node v = pBucket->key(pBucket->first_item());
            pBucket->del(v);
            leda::node u = eval(v, n0, Label, Ancestor, Sdno);
            int SdnoOfU = Sdno[u];
            Idom[v] = SdnoOfU < Sdno[v] ? u : p;
        }
    }
    // Step 6: the deferred dominators.
    for (int i = 2; i <= n; ++i) {
        leda::node w = Ndfs[i];
        leda::node d = Idom[w];
        if (d != Ndfs[Sdno[w]]) {
            leda::node IdomOfD = Idom[d];
            Idom[w] = IdomOfD;
        }
    }
    // Step 7: nothing to take out of the graph, as n0 never was in it.
}

// The open path of the search stands in Path, as the tree edges by which its nodes were entered.
void ZfCControlFlowGraph::dfsDom(leda::node v, leda::node n0, int& n, NodeMap& Label,
                                 NodeMap& Parent, NodeMap& Ancestor, NodeMap& Child,
                                 leda::map<int, leda::node>& Ndfs, leda::map<leda::node, int>& Sdno,
                                 leda::map<leda::node, int>& Size) {
    leda::stack<leda::edge> Path;
    auto Enter = [&](leda::node w) {
        ++n;
        Sdno[w] = n;
        Label[w] = w;
        Ndfs[n] = w;
        Ancestor[w] = n0;
        Child[w] = n0;
        Size[w] = 1;
        return first_adj_edge(w);
    };
    leda::edge e = Enter(v);
    for (;;) {
        while (e != nullptr && Sdno[target(e)] != 0) {
            e = adj_succ(e);
        }
        if (e != nullptr) {
            // Down to a new node.
            leda::node w = target(e);
            Parent[w] = source(e);
            Path.push(e);
            e = Enter(w);
        } else if (!Path.empty()) {
            // Back, and on with the next out-edge of the parent.
            e = adj_succ(Path.pop());
        } else {
            return;
        }
    }
}

leda::node ZfCControlFlowGraph::eval(leda::node v, leda::node n0, NodeMap& Label, NodeMap& Ancestor,
                                     leda::map<leda::node, int>& Sdno) {
    if (Ancestor[v] == n0) {
        return Label[v];
    }
    compress(v, n0, Label, Ancestor, Sdno);
    leda::node LabelOfV = Label[v];
    leda::node LabelOfA = Label[Ancestor[v]];
    int SdnoOfA = Sdno[LabelOfA];
    return SdnoOfA >= Sdno[LabelOfV] ? LabelOfV : LabelOfA;
}

// The way up is collected first; then it is done from the top down, in which order a recursion
// would come back.
void ZfCControlFlowGraph::compress(leda::node v, leda::node n0, NodeMap& Label, NodeMap& Ancestor,
                                   leda::map<leda::node, int>& Sdno) {
    leda::stack<leda::node> Path;
    leda::node a = Ancestor[v];
    for (leda::node AncestorOfA = Ancestor[a]; AncestorOfA != n0; AncestorOfA = Ancestor[a]) {
        Path.push(v);
        v = a;
        a = AncestorOfA;
    }
    while (!Path.empty()) {
        v = Path.pop();
        a = Ancestor[v];
        leda::node LabelOfA = Label[a];
        int SdnoOfA = Sdno[LabelOfA];
        if (SdnoOfA < Sdno[Label[v]]) {
            Label[v] = LabelOfA;
        }
        leda::node AncestorOfA = Ancestor[a];
        Ancestor[v] = AncestorOfA;
    }
}

void ZfCControlFlowGraph::link(leda::node v, leda::node w, leda::node n0, NodeMap& Label,
                               NodeMap& Ancestor, NodeMap& Child, leda::map<leda::node, int>& Sdno,
                               leda::map<leda::node, int>& Size) {
    leda::node s = w;
    // Step 1: Sdno of n0 is smaller than any other, so the loop ends there at the latest.
    leda::node LabelOfW = Label[w];
    int SdnoOfW = Sdno[LabelOfW];
    for (;;) {
        leda::node c = Child[s];
        if (SdnoOfW >= Sdno[Label[c]]) {
            break;
        }
        leda::node ChildOfC = Child[c];
        int SizeOfS = Size[s];
        int SizeOfC = Size[c];
        if (SizeOfS + Size[ChildOfC] >= 2 * SizeOfC) {
            Ancestor[c] = s;
            Child[s] = ChildOfC;
        } else {
            Size[c] = SizeOfS;
            Ancestor[s] = c;
            s = c;
        }
    }
    // Step 2.
    Label[s] = LabelOfW;
    // Step 3.
    int SizeOfW = Size[w];
    int& SizeOfV = Size[v];
    SizeOfV += SizeOfW;
    // Step 4.
    if (SizeOfV < 2 * SizeOfW) {
        leda::node& ChildOfV = Child[v];
        leda::node Former = ChildOfV;
        ChildOfV = s;
        s = Former;
    }
    // Step 5.
    while (s != n0) {
        Ancestor[s] = v;
        s = Child[s];
    }
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
