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
// Departures, in cost alone. Flags and marks of the run are kept in flat tables and written to the
// records at its end, and the work lists hold the numbers by which the tables go: of control flow
// edges, and of the nodes at the ends of SSA edges. Whether a block has an executable in-edge is
// read from its visited mark: whoever sets the flag of an edge into a block marks the block, so the
// mark says the same as a count over the in-edges and does not take the square of them at a wide
// join. A node none of whose operands has changed since its last visit is not evaluated again, for
// that would give what is there already; see ZfCPropagationState.h.
//
// An iteration is linear in the edges of both kinds and in how often a value changes, which is at
// most a few times for each variable.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"
#include "ZfCPrefetch.h"
#include "ZfCPropagationState.h"

void ZfCControlFlowGraph::propagateSparseConditionalConstant(bool RemoveDeadCode) {
    // The tables are made first: the addition of SSA edges has their ends at hand.
    ZfCPropagationState State(*this, true);
    m_pPropagation = &State;
    addSSAEdges();
    State.endOfUsers();
    sparseConditionalConstant(RemoveDeadCode, State);
}

void ZfCControlFlowGraph::sparseConditionalConstant(bool RemoveDeadCode) {
    ZfCPropagationState State(*this, false);
    sparseConditionalConstant(RemoveDeadCode, State);
}

// No block but a basic block assigns or uses a variable.
void ZfCControlFlowGraph::buildVarUses() {
    // Step 1.
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        if (ZfCBasicBlock* pBlock = inf(v)->isBasicBlock()) {
            pBlock->forEachAssignedVariable(
                [](ZfCCfgVariable* pVariable) { pVariable->clearUses(); });
        }
    }
    // Step 2. Variables lie far apart, so their uses are entered in batches.
    struct Use {
        ZfCCfgVariable* pVariable;
        leda::node Node;
    };
    auto Uses = makeBatch<Use>([](Use const& Item) { prefetch(&Item.pVariable->showUses()); },
                               [](Use const& Item) { Item.pVariable->appendUse(Item.Node); });
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        if (ZfCBasicBlock* pBlock = inf(v)->isBasicBlock()) {
            pBlock->forEachUsedVariable([&Uses, v](ZfCCfgVariable* pVariable) {
                Uses.append({pVariable, v});
            });
        }
    }
    Uses.finish();
}

void ZfCControlFlowGraph::addSSAEdges() {
    // Step 1.
    buildVarUses();
    // Step 2. Users lie far apart, so the edges are made in batches.
    struct Pair {
        leda::node DefiningNode;
        leda::node UsingNode;
    };
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    auto Pairs =
        makeBatch<Pair>([](Pair const& Item) { prefetch(Item.UsingNode); },
                        [this, pFactory](Pair const& Item) {
                            new_edge(Item.DefiningNode, Item.UsingNode, pFactory->createSSAEdge());
                            if (m_pPropagation != nullptr) {
                                m_pPropagation->addUser(Item.DefiningNode, Item.UsingNode);
                            }
                        });
    for (leda::node DefiningNode = first_node(); DefiningNode != stop_node();
         DefiningNode = next_node(DefiningNode)) {
        ZfCBasicBlock* pBlock = inf(DefiningNode)->isBasicBlock();
        if (pBlock == nullptr) {
            continue;
        }
        pBlock->forEachAssignedVariable([&Pairs, DefiningNode](ZfCCfgVariable* pVariable) {
            for (leda::node UsingNode : pVariable->showUses()) {
                Pairs.append({DefiningNode, UsingNode});
            }
        });
    }
    Pairs.finish();
}

void ZfCControlFlowGraph::initSparseConditionalConstant(leda::node StartNode,
                                                        ZfCWorkList& CfgEdgeList,
                                                        ZfCWorkList& SSAEdgeList) {
    // Step 1.
    CfgEdgeList.clear();
    SSAEdgeList.clear();
    // Step 2: nothing but control flow leaves an entry node.
    for (leda::edge e = first_adj_edge(StartNode); e != nullptr; e = adj_succ(e)) {
        CfgEdgeList.append(m_pPropagation->numberOf(e));
    }
}

// Step 3c: a phi function is visited over each edge, anything else on first arrival.
void ZfCControlFlowGraph::serveCfgEdge(int e, ZfCWorkList& CfgEdgeList, ZfCWorkList& SSAEdgeList,
                                       bool& FoundNewConstant) {
    ZfCPropagationState& State = *m_pPropagation;
    if (State.isExecutable(e)) {
        return;
    }
    // Step 3c1.
    State.setExecutable(e);
    const int Target = State.targetOf(e);
    // Step 3c2.
    if (State.isBasicBlock(Target)) {
        bool IsFirstArrival = State.arriveAt(Target);
        if (IsFirstArrival || State.isPhiFunction(Target)) {
            visitIfDirty(Target, CfgEdgeList, SSAEdgeList, FoundNewConstant);
        }
    }
    // Step 3c3: without a branch, control goes on.
    State.appendOnlyCfgOutEdge(Target, CfgEdgeList);
}

// Step 3d, for the SSA edge's end.
void ZfCControlFlowGraph::serveSSAEdge(int Target, ZfCWorkList& CfgEdgeList,
                                       ZfCWorkList& SSAEdgeList, bool& FoundNewConstant) {
    // A change waits until control reaches the use.
    if (m_pPropagation->isVisited(Target) || m_pPropagation->isPhiFunction(Target)) {
        visitIfDirty(Target, CfgEdgeList, SSAEdgeList, FoundNewConstant);
    }
}

void ZfCControlFlowGraph::visitIfDirty(int Node, ZfCWorkList& CfgEdgeList, ZfCWorkList& SSAEdgeList,
                                       bool& FoundNewConstant) {
    ZfCPropagationState& State = *m_pPropagation;
    if (!State.takeDirty(Node)) {
        State.takeAgain(Node, CfgEdgeList);
    } else if (State.isPhiFunction(Node)) {
        visitPhiFunction(State.phiFunctionOf(Node), Node, FoundNewConstant);
    } else {
        ZF_ASSERT(State.isVisited(Node)); // so one of its in-edges is executable
        visitInstruction(State.blockOf(Node), Node, CfgEdgeList, SSAEdgeList, FoundNewConstant);
    }
}

void ZfCControlFlowGraph::sparseConditionalConstant(bool RemoveDeadCode,
                                                    ZfCPropagationState& State) {
    m_pPropagation = &State;
    // Step 1: the entry nodes of all procedures, once for all iterations.
    leda::list<leda::node> StartNodeList;
    for (auto Item = m_Procedures.first_item(); Item; Item = m_Procedures.next_item(Item)) {
        StartNodeList.append(m_Procedures.inf(Item)->getEntryNode());
    }
    ZfCWorkList CfgEdgeList;
    ZfCWorkList SSAEdgeList;
    bool FoundNewConstant = false;
    bool HasLostOperand = false;
    do {
        // Step 2: a clean start, but for the values.
        FoundNewConstant = false;
        State.beginIteration();
        // Step 3: the sweeps.
        for (leda::node StartNode : StartNodeList) {
            initSparseConditionalConstant(StartNode, CfgEdgeList, SSAEdgeList);
            while (!CfgEdgeList.empty() || !SSAEdgeList.empty()) {
                if (!CfgEdgeList.empty()) {
                    serveCfgEdge(CfgEdgeList.pop(), CfgEdgeList, SSAEdgeList, FoundNewConstant);
                }
                if (!SSAEdgeList.empty()) {
                    serveSSAEdge(SSAEdgeList.pop(), CfgEdgeList, SSAEdgeList, FoundNewConstant);
                }
            }
        }
        // Step 4.
        if (RemoveDeadCode) {
            HasLostOperand = eliminateDeadCode();
        }
        // Step 5.
    } while (FoundNewConstant || HasLostOperand);
    // The flags of the last iteration stay.
    State.finish();
    m_pPropagation = nullptr;
}
