// Removal of dead code.
//
// eliminateDeadCode removes each block that the propagation has not reached:
//
// 1. Its edges into reached phi functions are found; each such phi function, and the others of the
//    same former block behind it, loses the operand of that edge.
// 2. These edges go.
// 3. Its statement goes; a call takes its arguments along.
// 4. The block and the node go.
//
// removeUnusedVarDefs removes definitions that nobody uses, sweep by sweep, until none is left.
//
// The phi functions of one former block stand in consecutive nodes. The first has the in-edges of
// the join; each later one has a single in-edge but still an operand for each of the join's. So a
// phi function with no more operands than its node has control flow in-edges begins the next join
// and keeps what it has: its operands belong to edges of its own.
//
// Departure of removeUnusedVarDefs, in cost alone: after the first sweep only those definitions
// are looked at again whose variable has lost its last use, at the moment at which a sweep over
// all nodes would come by. The same definitions go in the same order, but a long chain of unused
// definitions does not cost a sweep for each of its links.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"
#include "ZfCPropagationState.h"

namespace {

using CfgGraph = leda::GRAPH<ZfCCfgNodeInfo*, ZfCCfgEdgeInfo*>;
using VariableSet = leda::set<ZfCCfgVariable*, leda::avl_tree>;

int countCfgInEdges(CfgGraph& Graph, leda::node v) {
    int Count = 0;
    for (leda::edge e = Graph.first_in_edge(v); e != nullptr; e = Graph.in_succ(e)) {
        if (Graph.inf(e)->isSSAEdge() == nullptr) {
            ++Count;
        }
    }
    return Count;
}

// The operand index of e: the number of control flow in-edges of its target before it.
int operandPosition(CfgGraph& Graph, leda::edge e) {
    int Position = 0;
    for (leda::edge f = Graph.first_in_edge(Graph.target(e)); f != e; f = Graph.in_succ(f)) {
        if (Graph.inf(f)->isSSAEdge() == nullptr) {
            ++Position;
        }
    }
    return Position;
}

ZfCPhiFunction* phiFunctionAt(CfgGraph& Graph, leda::node v) {
    ZfCBasicBlock* pBlock = Graph.inf(v)->isBasicBlock();
    return pBlock != nullptr ? pBlock->isPhiFunction() : nullptr;
}

// The node behind w by its first control flow out-edge; null if there is none.
leda::node nextNodeInChain(CfgGraph& Graph, leda::node w) {
    leda::edge e = Graph.first_adj_edge(w);
    while (e != nullptr && Graph.inf(e)->isSSAEdge() != nullptr) {
        e = Graph.adj_succ(e);
    }
    return e != nullptr ? Graph.target(e) : nullptr;
}

// Step 2c: the other phi functions of the join at w lose the operand too.
void delOperandInChain(CfgGraph& Graph, ZfCPropagationState& State, leda::node w, int Position) {
    for (w = nextNodeInChain(Graph, w); w != nullptr; w = nextNodeInChain(Graph, w)) {
        ZfCPhiFunction* pPhi = phiFunctionAt(Graph, w);
        if (pPhi == nullptr ||
            pPhi->getReplacementVariables().size() <= countCfgInEdges(Graph, w)) {
            return;
        }
        pPhi->delReplacement(Position);
        State.markDirty(State.numberOf(w));
    }
}

// A dead call stops contributing to the parameters of its procedure.
void forgetCall(leda::dictionary<WqCXString, ZfCCfgProcedure*, leda::ab_tree>& Procedures,
                ZfCCfgProcedureCall* pCall) {
    auto Item = Procedures.lookup(pCall->getName());
    if (!Item) {
        return;
    }
    leda::list<ZfCCfgParamStatement*> ParamStatementList =
        Procedures.inf(Item)->getParamStatements();
    for (ZfCCfgParamStatement* pParamStatement : ParamStatementList) {
        pParamStatement->delParamExpression(pCall);
    }
}

ZfCCfgStatement* onlyStatement(ZfCBasicBlock* pBlock) {
    ZfCCfgStatement* pStmt = pBlock->isPhiFunction();
    return pStmt != nullptr ? pStmt : pBlock->isStatement();
}

// Nodes by the debug index of the variable that they define. The versions of one graph are mostly
// numbered in a row, so most entries stand in an array, which is no greater than some multiple of
// what is in it; a process that has made many graphs has indices anywhere.
class DefiningNodes {
public:
    void remember(int Number, leda::node v) {
        if (m_Near.size() == 0) {
            m_First = Number;
            m_Near.resize(s_Room);
        }
        ++m_Count;
        const int Place = Number - m_First;
        if (Place >= m_Near.size() && Place < s_Room * m_Count) {
            m_Near.resize(2 * Place);
        }
        if (isNear(Place)) {
            m_Near[Place] = v;
        } else {
            m_Far[Number] = v;
        }
    }
    // The node that was remembered last; null if there is none.
    leda::node lookup(int Number) const {
        if (isNear(Number - m_First) && m_Near[Number - m_First] != nullptr) {
            return m_Near[Number - m_First];
        }
        leda::node const* pNode = m_Far.lookup(Number);
        return pNode != nullptr ? *pNode : nullptr;
    }

private:
    static constexpr int s_Room = 16;

    bool isNear(int Place) const { return Place >= 0 && Place < m_Near.size(); }

    leda::array<leda::node> m_Near; // by distance to the first number
    leda::map<int, leda::node> m_Far;
    int m_First = 0;
    int m_Count = 0;
};

// The sweeps of removeUnusedVarDefs. Sets of nodes are in node order.
class UnusedDefinitionSweeper {
public:
    explicit UnusedDefinitionSweeper(CfgGraph& Graph) : m_Graph(Graph) {}

    // Step 3 for one node.
    void examine(leda::node v);

    // The sweeps that follow the first one.
    void sweepAgain();

private:
    bool isUnused(ZfCCfgVariable* pVariable, ZfCCfgStatement* pStmt);
    void remember(ZfCCfgVariable* pVariable, leda::node v);
    void lookAgainAt(ZfCCfgVariable* pVariable, leda::node Current);

    CfgGraph& m_Graph;
    DefiningNodes m_DefiningNodes;                     // candidates that still had uses
    leda::set<leda::node, leda::avl_tree> m_ThisSweep; // behind the current node
    leda::set<leda::node, leda::avl_tree> m_NextSweep; // at or before it
};

void UnusedDefinitionSweeper::examine(leda::node v) {
    // Step 3a.
    ZfCCfgNodeInfo* pInf = m_Graph.inf(v);
    if (pInf == nullptr) {
        reportInternalError("ZfCControlFlowGraph", __LINE__);
        return;
    }
    // Step 3b.
    ZfCBasicBlock* pBlock = pInf->isBasicBlock();
    ZfCCfgStatement* pStmt = pBlock != nullptr ? onlyStatement(pBlock) : nullptr;
    if (pStmt == nullptr) {
        return;
    }
    // Step 3c.
    VariableSet DefinedVariables = pStmt->getDefinedVariables();
    ZF_ASSERT(DefinedVariables.size() <= 1);
    if (DefinedVariables.size() != 1) {
        return;
    }
    ZfCCfgVariable* pVariable = DefinedVariables.key(DefinedVariables.first_item());
    // Step 3d.
    if (!isUnused(pVariable, pStmt)) {
        remember(pVariable, v);
        return;
    }
    // Step 3e.
    VariableSet UsedVariables = pStmt->getUsedVariables();
    for (ZfCCfgVariable* pUsedVariable : UsedVariables) {
        if (pUsedVariable->delUse(v) == 0) {
            lookAgainAt(pUsedVariable, v);
        }
    }
    // Step 3f.
    pBlock->del(pStmt);
}

bool UnusedDefinitionSweeper::isUnused(ZfCCfgVariable* pVariable, ZfCCfgStatement* pStmt) {
    return pVariable->isErasable() && !pVariable->isArray() && pVariable->countAllUses() == 0 &&
           !pStmt->hasSideEffects();
}

void UnusedDefinitionSweeper::remember(ZfCCfgVariable* pVariable, leda::node v) {
    if (!pVariable->isErasable() || pVariable->isArray()) {
        return;
    }
    m_DefiningNodes.remember(pVariable->getDebugIndex(), v);
}

// The last use of the variable went at Current. A virtual alias keeps its real variable alive, so
// that one is looked at too. In the first sweep, a definition behind Current is not known yet; the
// sweep will come to it.
void UnusedDefinitionSweeper::lookAgainAt(ZfCCfgVariable* pVariable, leda::node Current) {
    for (ZfCCfgVariable* pCandidate : {pVariable, pVariable->getNonVirtualAlias()}) {
        leda::node const Node = m_DefiningNodes.lookup(pCandidate->getDebugIndex());
        if (Node == nullptr) {
            continue;
        }
        if (m_Graph.index(Node) > m_Graph.index(Current)) {
            m_ThisSweep.insert(Node);
        } else {
            m_NextSweep.insert(Node);
        }
    }
}

void UnusedDefinitionSweeper::sweepAgain() {
    while (!m_NextSweep.empty()) {
        m_ThisSweep = m_NextSweep;
        m_NextSweep.clear();
        while (!m_ThisSweep.empty()) {
            leda::node v = m_ThisSweep.key(m_ThisSweep.first_item());
            m_ThisSweep.del(v);
            examine(v);
        }
    }
}

} // namespace

bool ZfCControlFlowGraph::eliminateDeadCode() {
    ZfCPropagationState& State = *m_pPropagation;
    if (State.allBlocksAreVisited()) {
        return false;
    }
    bool HasLostOperand = false;
    bool HasLostCall = false;
    leda::list<leda::edge> EdgesToDelete;
    for (leda::node v : State.takeUnvisitedBlocks()) {
        ZfCBasicBlock* pBlock = inf(v)->isBasicBlock();
        State.forget(v);
        // Step 1.
        EdgesToDelete.clear();
        // Step 2: dead paths into live code. The edges stay until all are found, so a second edge
        // into the same phi function is counted with the first still in place.
        for (leda::edge e = first_adj_edge(v); e != nullptr; e = adj_succ(e)) {
            leda::node w = target(e);
            if (State.isSSAEdge(e) || !State.isVisited(State.numberOf(w))) {
                continue;
            }
            ZfCPhiFunction* pPhi = phiFunctionAt(*this, w);
            if (pPhi == nullptr) {
                continue;
            }
            // Steps 2a, 2b and 2c.
            int Position = operandPosition(*this, e);
            pPhi->delReplacement(Position);
            State.markDirty(State.numberOf(w));
            HasLostOperand = true;
            EdgesToDelete.append(e);
            delOperandInChain(*this, State, w, Position);
        }
        // Step 3.
        while (!EdgesToDelete.empty()) {
            del_edge(EdgesToDelete.pop());
        }
        // Step 4.
        if (ZfCCfgStatement* pStmt = onlyStatement(pBlock)) {
            if (ZfCCfgProcedureCall* pCall = pStmt->isProcedureCall()) {
                forgetCall(m_Procedures, pCall);
                HasLostCall = true;
            }
            pBlock->del(pStmt);
        }
        // Step 5.
        ZfCCfgFactory::getInstance()->delBasicBlock(pBlock);
        del_node(v);
    }
    if (HasLostCall) {
        State.markParametersDirty();
    }
    return HasLostOperand;
}

void ZfCControlFlowGraph::removeUnusedVarDefs() {
    // Step 1.
    buildVarUses();
    // Steps 2 and 3: the first sweep.
    UnusedDefinitionSweeper Sweeper(*this);
    leda::node pNext = nullptr;
    for (leda::node v = first_node(); v != stop_node(); v = pNext) {
        pNext = next_node(v);
        Sweeper.examine(v);
    }
    // Step 4: again, as long as a variable has lost its last use.
    Sweeper.sweepAgain();
}
