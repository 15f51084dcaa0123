// Sparse conditional constant propagation: the driver.
//
// M. N. Wegman and F. K. Zadeck, Constant propagation with conditional branches, ACM Transactions
// on Programming Languages and Systems 13(2), 1991:
//
// 1. The entry node of every procedure starts a sweep; the sweeps share the variables.
// 2. An iteration clears executable flags and visited marks and sweeps from each entry in turn.
// 3. A sweep serves a list of control flow edges and a list of SSA edges, one edge each in turn.
//    A node is evaluated when control first reaches it, and again when an operand changes.
// 4. Between iterations, what was not reached is removed if that is wanted.
// 5. If a variable became constant or a phi function lost an operand, there is another iteration.
//
// Departures, all wanted: values are not set back between iterations. A phi function looks at all
// its operands, also at those of edges that were not reached, and holds undetermined until dead
// code removal has taken such an operand away; that is why step 4 stands inside the loop. A phi
// function that changes sends no SSA edges; its users follow in the next iteration. Each of these
// keeps a value from being called constant too early.
//
// Departure, in cost alone: whether a block has an executable in-edge is read from its visited
// mark. Flags and marks are cleared together, and whoever sets the flag of an edge into a block
// marks the block, so the mark says the same as a count over the in-edges and does not take the
// square of them at a wide join.
//
// An iteration is linear in the edges of both kinds and in how often a value changes, which is at
// most a few times for each variable.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"

void ZfCControlFlowGraph::propagateSparseConditionalConstant(bool RemoveDeadCode) {
    addSSAEdges();
    sparseConditionalConstant(RemoveDeadCode);
}

void ZfCControlFlowGraph::buildVarUses() {
    // Step 1.
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        for (ZfCCfgVariable* pVariable : inf(v)->getAssignedVariables()) {
            pVariable->clearUses();
        }
    }
    // Step 2.
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        leda::set<ZfCCfgVariable*, leda::avl_tree> UsedVariables = inf(v)->getUsedVariables();
        for (ZfCCfgVariable* pVariable : UsedVariables) {
            pVariable->appendUse(v);
        }
    }
}

void ZfCControlFlowGraph::addSSAEdges() {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    // Step 1.
    buildVarUses();
    // Step 2.
    for (leda::node DefiningNode = first_node(); DefiningNode != stop_node();
         DefiningNode = next_node(DefiningNode)) {
        for (ZfCCfgVariable* pVariable : inf(DefiningNode)->getAssignedVariables()) {
            leda::set<leda::node, leda::avl_tree> UsingNodes = pVariable->getUses();
            for (leda::node UsingNode : UsingNodes) {
                new_edge(DefiningNode, UsingNode, pFactory->createSSAEdge());
            }
        }
    }
}

void ZfCControlFlowGraph::initSparseConditionalConstant(leda::node StartNode,
                                                        leda::list<leda::edge>& CfgEdgeList,
                                                        leda::list<leda::edge>& SSAEdgeList) {
    // Step 1.
    CfgEdgeList.clear();
    SSAEdgeList.clear();
    // Step 2: nothing but control flow leaves an entry node.
    for (leda::edge e = first_adj_edge(StartNode); e != nullptr; e = adj_succ(e)) {
        CfgEdgeList.append(e);
    }
}

int ZfCControlFlowGraph::countExecutableInEdges(leda::node Node) {
    int Count = 0;
    for (leda::edge e = first_in_edge(Node); e != nullptr; e = in_succ(e)) {
        if (inf(e)->isEdgeExecutable()) {
            ++Count;
        }
    }
    return Count;
}

int ZfCControlFlowGraph::countCfgOutEdges(leda::node Node) {
    int Count = 0;
    for (leda::edge e = first_adj_edge(Node); e != nullptr; e = adj_succ(e)) {
        if (inf(e)->isSSAEdge() == nullptr) {
            ++Count;
        }
    }
    return Count;
}

void ZfCControlFlowGraph::setVisited(leda::node Node) {
    m_Visited[Node] = true;
}

bool ZfCControlFlowGraph::isVisited(leda::node Node) {
    return m_Visited[Node];
}

void ZfCControlFlowGraph::clearAllVisited() {
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        m_Visited[v] = false;
    }
}

void ZfCControlFlowGraph::sparseConditionalConstant(bool RemoveDeadCode) {
    // Step 1: the entry nodes of all procedures, once for all iterations.
    leda::list<leda::node> StartNodeList;
    for (auto Item = m_Procedures.first_item(); Item; Item = m_Procedures.next_item(Item)) {
        StartNodeList.append(m_Procedures.inf(Item)->getEntryNode());
    }
    leda::list<leda::edge> CfgEdgeList;
    leda::list<leda::edge> SSAEdgeList;
    bool FoundNewConstant = false;
    bool HasLostOperand = false;

    // Steps 3c and 3d for one edge each.
    auto ServeCfgEdge = [&](leda::edge e) {
        if (inf(e)->isEdgeExecutable()) {
            return;
        }
        // Step 3c1.
        inf(e)->activateEdgeExecutable();
        leda::node Target = target(e);
        // Step 3c2: a phi function is visited over each edge, anything else on first arrival.
        if (ZfCBasicBlock* pBlock = inf(Target)->isBasicBlock()) {
            bool IsFirstArrival = !isVisited(Target);
            setVisited(Target);
            if (ZfCPhiFunction* pPhi = pBlock->isPhiFunction()) {
                visitPhiFunction(pPhi, Target, FoundNewConstant);
            } else if (IsFirstArrival) {
                ZF_ASSERT(countExecutableInEdges(Target) == 1);
                visitInstruction(pBlock, Target, CfgEdgeList, SSAEdgeList, FoundNewConstant);
            }
        }
        // Step 3c3: without a branch, control goes on.
        if (countCfgOutEdges(Target) == 1) {
            leda::edge f = first_adj_edge(Target);
            while (inf(f)->isSSAEdge() != nullptr) {
                f = adj_succ(f);
            }
            CfgEdgeList.append(f);
        }
    };
    auto ServeSSAEdge = [&](leda::edge e) {
        leda::node Target = target(e);
        ZfCBasicBlock* pBlock = inf(Target)->isBasicBlock();
        if (ZfCPhiFunction* pPhi = pBlock->isPhiFunction()) {
            visitPhiFunction(pPhi, Target, FoundNewConstant);
        } else if (isVisited(Target)) {
            ZF_ASSERT(countExecutableInEdges(Target) >= 1);
            visitInstruction(pBlock, Target, CfgEdgeList, SSAEdgeList, FoundNewConstant);
        }
        // Otherwise the change waits until control reaches the use.
    };

    do {
        // Step 2: a clean start, but for the values.
        FoundNewConstant = false;
        clearAllVisited();
        for (leda::edge e = first_edge(); e != stop_edge(); e = next_edge(e)) {
            inf(e)->deactivateEdgeExecutable();
        }
        // Step 3: the sweeps.
        for (leda::node StartNode : StartNodeList) {
            initSparseConditionalConstant(StartNode, CfgEdgeList, SSAEdgeList);
            while (!CfgEdgeList.empty() || !SSAEdgeList.empty()) {
                if (!CfgEdgeList.empty()) {
                    ServeCfgEdge(CfgEdgeList.pop());
                }
                if (!SSAEdgeList.empty()) {
                    ServeSSAEdge(SSAEdgeList.pop());
                }
            }
        }
        // Step 4.
        if (RemoveDeadCode) {
            HasLostOperand = eliminateDeadCode();
        }
        // Step 5.
    } while (FoundNewConstant || HasLostOperand);
}
