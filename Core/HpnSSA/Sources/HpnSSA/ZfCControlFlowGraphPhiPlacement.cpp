// Dominance frontiers and placement of phi functions.
//
// R. Cytron, J. Ferrante, B. K. Rosen, M. N. Wegman and F. K. Zadeck, Efficiently computing static
// single assignment form and the control dependence graph, ACM Transactions on Programming
// Languages and Systems 13(4), 1991:
//
// 1. Each dominator tree is walked bottom-up. The frontier of a node is made of its successors
//    that it does not immediately dominate, and of what its children's frontiers leave over.
// 2. Each variable goes over the iterated frontier of its definitions, and each node of that gets
//    a phi function. The marks Work and HasAlready hold the number of the last variable, so they
//    are never cleared.
//
// The form is minimal, not pruned. Departure: an exit node can stand in a frontier and cannot hold
// a phi function. It becomes a block then, and a new exit node follows it.
//
// Step 1 is linear in edges and frontiers; step 2 in the sum of the frontiers that are walked.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"

namespace {

using NodeSet = leda::set<leda::node, leda::avl_tree>;

// The frontier of the node that dom_x stands for; its children's frontiers are there already.
void computeFrontier(ZfCControlFlowGraph& Graph, ZfCDominatorTree& Tree, leda::node dom_x) {
    leda::node x = Tree.inf(dom_x);
    NodeSet& Frontier = *Graph.inf(x)->getDF();
    // Step 3a.
    Frontier.clear();
    // Step 3b: the local part. There is no test for x itself: a self-loop puts x into it.
    for (leda::edge e = Graph.first_adj_edge(x); e != nullptr; e = Graph.adj_succ(e)) {
        leda::node y = Graph.target(e);
        if (Graph.inf(y)->getIdom() != x) {
            Frontier.insert(y);
        }
    }
    // Step 3c: the upward part.
    for (leda::edge e = Tree.first_adj_edge(dom_x); e != nullptr; e = Tree.adj_succ(e)) {
        leda::node z = Tree.inf(Tree.target(e));
        for (leda::node y : *Graph.inf(z)->getDF()) {
            if (Graph.inf(y)->getIdom() != x) {
                Frontier.insert(y);
            }
        }
    }
}

// Turns the exit node y into a block and hangs a new exit node with y's record behind it. The
// in-edges stay at y, and with them the positions that phi operands go by.
ZfCBasicBlock* moveExitDown(ZfCControlFlowGraph& Graph, leda::node y, ZfCCfgNodeInfo* pNodeInfo) {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    // Step 1: the record goes over. The new node stands in no tree, so it has no dominator.
    leda::node w = Graph.new_node(pNodeInfo);
    pNodeInfo->setIdom(nullptr);
    // Step 2.
    Graph.new_edge(y, w, pFactory->createEdgeInfo());
    // Step 3.
    ZfCBasicBlock* pBasicBlock = pFactory->createBasicBlock();
    Graph.assign(y, pBasicBlock);
    // Step 4.
    ZfCCfgProcedure* pProcedure = pNodeInfo->getProcedure();
    ZF_ASSERT(pProcedure);
    pBasicBlock->setProcedure(pProcedure);
    pProcedure->setExitNode(w);
    return pBasicBlock;
}

// The locals of the placement that belong to all variables.
struct PlacementMarks {
    leda::map<leda::node, int> Work;       // last variable for which the node was on the list
    leda::map<leda::node, int> HasAlready; // last variable for which it got a phi function
    leda::list<leda::node> WorkList;       // first in, first out
};

// Steps 2c1 to 2c4 for one node y of a frontier.
void placeAt(ZfCControlFlowGraph& Graph, leda::node y, ZfCCfgVariable* pVariable,
             int IterationCount, PlacementMarks& Marks) {
    int& HasAlready = Marks.HasAlready[y];
    if (HasAlready >= IterationCount) {
        return;
    }
    ZfCCfgNodeInfo* pNodeInfo = Graph.inf(y);
    ZfCBasicBlock* pBasicBlock = pNodeInfo->isExitNode() != nullptr
                                     ? moveExitDown(Graph, y, pNodeInfo)
                                     : pNodeInfo->isBasicBlock();
    pBasicBlock->append(new ZfCPhiFunction(pVariable, Graph.indeg(y)));
    HasAlready = IterationCount;
    int& Work = Marks.Work[y];
    if (Work < IterationCount) {
        Work = IterationCount;
        Marks.WorkList.append(y);
    }
}

} // namespace

void ZfCControlFlowGraph::computeDominanceFrontiers(leda::array<ZfCDominatorTree*>& DominatorTree) {
    for (int i = 0; i < DominatorTree.size(); ++i) {
        // Steps 1 and 2: the nodes of the tree in breadth-first order. The distances are kept for
        // each tree apart: one array of the whole graph would be wiped once for each procedure.
        ZfCDominatorTree* pTree = DominatorTree[i];
        leda::node_array<int> distance(*pTree, -1);
        leda::list<leda::node> NodeList = leda::BFS(*pTree, pTree->getRoot(), distance);
        // Step 3: from the back, so that children come first.
        while (!NodeList.empty()) {
            computeFrontier(*this, *pTree, NodeList.pop_back());
        }
    }
}

leda::list<ZfCCfgVariable*> ZfCControlFlowGraph::getDefinedVariables(
    leda::map<ZfCCfgVariable*, leda::list<leda::node>*>& DefiningNodes) {
    // Step 1.
    leda::list<ZfCCfgVariable*> VarList;
    // Step 2. The lists belong to the factory; the map is dropped by the caller as it is.
    for (leda::node x = first_node(); x != stop_node(); x = next_node(x)) {
        ZfCCfgNodeInfo* pInf = inf(x);
        if (pInf == nullptr) {
            continue;
        }
        for (ZfCCfgVariable* pVariable : pInf->getAssignedVariables()) {
            leda::list<leda::node>*& pNodes = DefiningNodes[pVariable];
            if (pNodes == nullptr) {
                pNodes = ZfCCfgFactory::getInstance()->createLedaList_Node();
                VarList.append(pVariable);
            }
            // A second entry of the same node would have no effect.
            if (pNodes->empty() || pNodes->back() != x) {
                pNodes->append(x);
            }
        }
    }
    // Step 3.
    return VarList;
}

void ZfCControlFlowGraph::placePhiFunction() {
    // Step 1: no node is marked; the maps' default says so.
    int IterationCount = 0;
    PlacementMarks Marks;
    leda::map<ZfCCfgVariable*, leda::list<leda::node>*> DefiningNodes;
    leda::list<ZfCCfgVariable*> VarList = getDefinedVariables(DefiningNodes);
    for (ZfCCfgVariable* pVariable : VarList) {
        // Step 2a.
        ++IterationCount;
        // Step 2b.
        for (leda::node x : *DefiningNodes[pVariable]) {
            Marks.Work[x] = IterationCount;
            Marks.WorkList.append(x);
        }
        // Step 2c: the iterated frontier. A record is exchanged for another only at an exit node,
        // whose frontier is empty, so no frontier changes while it is walked.
        while (!Marks.WorkList.empty()) {
            leda::node x = Marks.WorkList.pop();
            for (leda::node y : *inf(x)->getDF()) {
                placeAt(*this, y, pVariable, IterationCount, Marks);
            }
        }
    }
}
