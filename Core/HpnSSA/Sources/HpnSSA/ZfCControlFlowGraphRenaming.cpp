// Renaming, and the driver of the transformation to SSA form.
//
// R. Cytron, J. Ferrante, B. K. Rosen, M. N. Wegman and F. K. Zadeck, Efficiently computing static
// single assignment form and the control dependence graph, ACM Transactions on Programming
// Languages and Systems 13(4), 1991, the renaming over the dominator tree:
//
// 1. On the way into a node, each of its definitions gets a new version, which goes onto the
//    stack of its variable, and each use takes the version on top.
// 2. For each out-edge, the operands of the target's phi functions take the versions on top.
// 3. After the children, the versions of the node come off the stacks.
//
// Departures: the walk keeps its tasks on a stack of its own, for a dominator tree can be as deep
// as the program. A call is no definition; its arguments are renamed in the callee's parameter
// statements, and what it returns at the edge into the callee's exit node, in the callers' value
// return statements. The position of an edge among many in-edges is looked up in a map that is
// filled once for its target, for to count it each time would be quadratic in the in-edges.
//
// Linear in the program and the phi operands; the replacement of a use is the client's.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"
#include "ZfCPrefetch.h"

namespace {

using VariableSet = leda::set<ZfCCfgVariable*, leda::avl_tree>;
using ProcedureDictionary = leda::dictionary<WqCXString, ZfCCfgProcedure*, leda::ab_tree>;

// The position of an in-edge among all in-edges of its target, counted from 0.
class InEdgePositions {
public:
    explicit InEdgePositions(leda::graph& Graph) : m_Graph(Graph) {}

    int positionOf(leda::edge e) {
        leda::node y = m_Graph.target(e);
        if (m_Graph.indeg(y) <= s_CountedDirectly) {
            return count(e, y);
        }
        if (int const* pPosition = m_Positions.lookup(e)) {
            return *pPosition;
        }
        int Position = 0;
        for (leda::edge f = m_Graph.first_in_edge(y); f != nullptr; f = m_Graph.in_succ(f)) {
            m_Positions[f] = Position++;
        }
        return m_Positions[e];
    }

private:
    static constexpr int s_CountedDirectly = 8;

    int count(leda::edge e, leda::node y) {
        int Position = 0;
        for (leda::edge f = m_Graph.first_in_edge(y); f != e; f = m_Graph.in_succ(f)) {
            ++Position;
        }
        return Position;
    }

    leda::graph& m_Graph;
    leda::map<leda::edge, int> m_Positions; // all in-edges of every wide target seen so far
};

// The renaming of one node: its contents and its out-edges.
class NodeRenamer {
public:
    NodeRenamer(ZfCControlFlowGraph& Graph, ProcedureDictionary& Procedures)
        : m_Graph(Graph), m_Procedures(Procedures), m_Positions(Graph) {}

    // The original variables that were pushed are appended to OldLhsVarList.
    void renameContents(ZfCBasicBlock* pBasicBlock, leda::list<ZfCCfgVariable*>& OldLhsVarList);

    // The edge step.
    void renameAlongEdge(leda::edge e);

private:
    void renameStatement(ZfCCfgStatement* pStmt, leda::list<ZfCCfgVariable*>& OldLhsVarList);
    void renameAssignment(ZfCCfgAssignment* pAssignment,
                          leda::list<ZfCCfgVariable*>& OldLhsVarList);
    void renameCall(ZfCCfgProcedureCall* pCall);
    void renameOutput(ZfCCfgOutputStatement* pOutput);
    void renameExternCall(ZfCCfgExternCall* pExternCall);
    void renameBranchCond(ZfCCfgExpression* pBranchCond);
    void renameUsesSoftly(ZfCCfgExpression* pExpr);
    void renamePhiOperands(ZfCBasicBlock* pBasicBlock, int Index);
    void renameReturnedValues(ZfCCfgProcedure* pProcedure);

    // Parameter, value return and phi statements: what they define is all that is renamed.
    template <class TStatement>
    void renameDefinition(TStatement* pStmt, leda::list<ZfCCfgVariable*>& OldLhsVarList);

    ZfCControlFlowGraph& m_Graph;
    ProcedureDictionary& m_Procedures;
    InEdgePositions m_Positions;
};

template <class TStatement>
void NodeRenamer::renameDefinition(TStatement* pStmt, leda::list<ZfCCfgVariable*>& OldLhsVarList) {
    ZfCCfgVariable* pOrigVar = pStmt->getVariable();
    OldLhsVarList.append(pOrigVar);
    ZfCSSAVariable* pNew = ZfCCfgFactory::getInstance()->createSSAVariable(pOrigVar);
    pStmt->setVariable(pNew);
    pOrigVar->pushSSAReplacement(pNew);
}

void NodeRenamer::renameContents(ZfCBasicBlock* pBasicBlock,
                                 leda::list<ZfCCfgVariable*>& OldLhsVarList) {
    for (ZfCPhiFunction* pPhiFunc : pBasicBlock->getPhiFunctions()) {
        renameDefinition(pPhiFunc, OldLhsVarList);
    }
    for (ZfCCfgStatement* pStmt : pBasicBlock->getStatementSeq()) {
        renameStatement(pStmt, OldLhsVarList);
    }
    if (ZfCCfgExpression* pBranchCond = pBasicBlock->getBranchCond()) {
        renameBranchCond(pBranchCond);
    }
}

void NodeRenamer::renameStatement(ZfCCfgStatement* pStmt,
                                  leda::list<ZfCCfgVariable*>& OldLhsVarList) {
    if (ZfCCfgAssignment* pAssignment = pStmt->isAssignment()) {
        renameAssignment(pAssignment, OldLhsVarList);
    } else if (ZfCCfgParamStatement* pParam = pStmt->isParamStatement()) {
        renameDefinition(pParam, OldLhsVarList);
    } else if (ZfCCfgValueReturnStatement* pReturn = pStmt->isValueReturnStatement()) {
        renameDefinition(pReturn, OldLhsVarList);
    } else if (ZfCCfgProcedureCall* pCall = pStmt->isProcedureCall()) {
        renameCall(pCall);
    } else if (ZfCCfgOutputStatement* pOutput = pStmt->isOutputStatement()) {
        renameOutput(pOutput);
    } else if (ZfCCfgExternCall* pExternCall = pStmt->isExternCall()) {
        renameExternCall(pExternCall);
    } else {
        ZF_ASSERT_UNREACHABLE();
    }
}

void NodeRenamer::renameAssignment(ZfCCfgAssignment* pAssignment,
                                   leda::list<ZfCCfgVariable*>& OldLhsVarList) {
    // (a) The uses.
    ZfCCfgExpression* pRHS = pAssignment->getRHS();
    VariableSet RHSVarUses = pRHS->getUsedVariables();
    for (ZfCCfgVariable* pOrigVar : RHSVarUses) {
        ZfCCfgVariable* pTop = pOrigVar->topSSAReplacement();
        if (pTop == nullptr) {
            reportInternalError("ZfCControlFlowGraph", __LINE__);
        }
        pRHS->replaceVariable(pOrigVar, pTop);
    }
    // (b) The definition.
    ZfCCfgVariable* pOrigVar = pAssignment->getLHS();
    OldLhsVarList.append(pOrigVar);
    ZfCSSAVariable* pNew = ZfCCfgFactory::getInstance()->createSSAVariable(pOrigVar);
    // (c) A virtual assignment stores nothing: its version stands for the stored variable that
    // the version before it stood for.
    if (pAssignment->getIsVirtual()) {
        ZfCCfgVariable* pTop = pOrigVar->topSSAReplacement();
        ZfCCfgVariable* pAlias = pTop != nullptr ? pTop->getNonVirtualAlias() : nullptr;
        if (pAlias == nullptr) {
            reportInternalError("ZfCControlFlowGraph", __LINE__);
        } else {
            pNew->setNonVirtualAlias(pAlias);
            pAlias->appendVirtualAlias(pNew);
        }
    }
    // (d) From here on it is current.
    pAssignment->setLHS(pNew);
    pOrigVar->pushSSAReplacement(pNew);
}

// The arguments are expressions of the callee's parameter statements, but they are read here.
void NodeRenamer::renameCall(ZfCCfgProcedureCall* pCall) {
    auto Item = m_Procedures.lookup(pCall->getName());
    if (!Item) {
        return;
    }
    for (ZfCCfgParamStatement* pParam : m_Procedures.inf(Item)->getParamStatements()) {
        renameUsesSoftly(pParam->getParamExpression(pCall));
    }
}

void NodeRenamer::renameOutput(ZfCCfgOutputStatement* pOutput) {
    ZfCCfgVariable* pTop = pOutput->getVariable()->topSSAReplacement();
    if (pTop == nullptr) {
        reportInternalError("ZfCControlFlowGraph", __LINE__);
    }
    pOutput->setVariable(pTop);
}

void NodeRenamer::renameExternCall(ZfCCfgExternCall* pExternCall) {
    VariableSet RHSVarUses = pExternCall->getUsedVariables();
    for (ZfCCfgVariable* pOrigVar : RHSVarUses) {
        if (ZfCCfgVariable* pTop = pOrigVar->topSSAReplacement()) {
            pExternCall->replaceVariable(pOrigVar, pTop);
        } else {
            ZF_ASSERT_UNREACHABLE();
        }
    }
}

void NodeRenamer::renameBranchCond(ZfCCfgExpression* pBranchCond) {
    VariableSet RHSVarUses = pBranchCond->getUsedVariables();
    for (ZfCCfgVariable* pOrigVar : RHSVarUses) {
        ZfCCfgVariable* pTop = pOrigVar->topSSAReplacement();
        if (pTop == nullptr) {
            reportInternalError("ZfCControlFlowGraph", __LINE__);
        }
        pBranchCond->replaceVariable(pOrigVar, pTop);
    }
}

// A variable without a current version stays as it is, for developers to hear of.
void NodeRenamer::renameUsesSoftly(ZfCCfgExpression* pExpr) {
    VariableSet RHSVarUses = pExpr->getUsedVariables();
    for (ZfCCfgVariable* pOrigVar : RHSVarUses) {
        if (ZfCCfgVariable* pTop = pOrigVar->topSSAReplacement()) {
            pExpr->replaceVariable(pOrigVar, pTop);
        } else {
            ZF_ASSERT_UNREACHABLE();
        }
    }
}

void NodeRenamer::renameAlongEdge(leda::edge e) {
    ZfCCfgNodeInfo* pInf = m_Graph.inf(m_Graph.target(e));
    if (ZfCBasicBlock* pBasicBlock = pInf->isBasicBlock()) {
        // Step 1 of the edge step.
        if (!pBasicBlock->getPhiFunctions().empty()) {
            renamePhiOperands(pBasicBlock, m_Positions.positionOf(e));
        }
    } else if (pInf->isExitNode() != nullptr) {
        // Step 2 of the edge step.
        renameReturnedValues(pInf->getProcedure());
    }
}

// The variables of a join lie far apart.
void NodeRenamer::renamePhiOperands(ZfCBasicBlock* pBasicBlock, int Index) {
    auto Operands = makeBatch<ZfCPhiFunction*>(
        [](ZfCPhiFunction* pPhiFunc) { prefetch(pPhiFunc->getVariable()); },
        [Index](ZfCPhiFunction* pPhiFunc) {
            // At a loop head the phi function has been renamed already.
            ZfCCfgVariable* pVar = pPhiFunc->getVariable();
            if (ZfCSSAVariable* pSSAVar = pVar->isSSAVariable()) {
                pVar = pSSAVar->getOrigVar();
            }
            ZfCCfgVariable* pTop = pVar->topSSAReplacement();
            if (pTop == nullptr) {
                reportInternalError("ZfCControlFlowGraph", __LINE__);
            }
            pPhiFunc->setReplacementVariable(Index, pTop);
        });
    for (ZfCPhiFunction* pPhiFunc : pBasicBlock->getPhiFunctions()) {
        Operands.append(pPhiFunc);
    }
    Operands.finish();
}

// What all calls of the procedure return is current at its exit, here. A second in-edge of the
// exit finds versions, which have no stack: then nothing changes.
void NodeRenamer::renameReturnedValues(ZfCCfgProcedure* pProcedure) {
    for (ZfCCfgValueReturnStatement* pReturn : pProcedure->getValueReturnStatements()) {
        renameUsesSoftly(pReturn->getExpression());
    }
}

} // namespace

void ZfCControlFlowGraph::transformToSSAForm() {
    leda::array<ZfCDominatorTree*> DominatorTree;
    // Step 1.
    collectVarDefsAndUses();
    // Steps 2 to 4: the boundary statements come first, so that they take part as ordinary
    // definitions and uses in all that follows.
    initVariablesAfterEntryNodes();
    ZF_ASSERT(checkConsistency());
    placeValueReturnStatements();
    ZF_ASSERT(checkConsistency());
    placeOutputStatements();
    ZF_ASSERT(checkConsistency());
    // Step 5.
    computeAllIdoms();
    int Count = buildDominatorTrees(DominatorTree);
    // Step 6.
    computeDominanceFrontiers(DominatorTree);
    placePhiFunction();
    ZF_ASSERT(checkConsistency());
    // Step 7.
    renameVariables(DominatorTree);
    // Step 8.
    freeDominatorTrees(DominatorTree, Count);
}

void ZfCControlFlowGraph::renameVariables(leda::array<ZfCDominatorTree*>& DominatorTree) {
    for (int i = 0; i < DominatorTree.size(); ++i) {
        ZfCDominatorTree* pComponentDomTree = DominatorTree[i];
        traverseDominatorTree(pComponentDomTree->getRoot(), pComponentDomTree);
    }
}

void ZfCControlFlowGraph::traverseDominatorTree(leda::node Root,
                                                ZfCDominatorTree* pComponentDomTree) {
    NodeRenamer Renamer(*this, m_Procedures);
    // Step 1.
    leda::stack<leda::two_tuple<leda::node, bool>> NodeStack;
    leda::stack<leda::list<ZfCCfgVariable*>> OldLhsVarListStack;
    NodeStack.push(leda::two_tuple<leda::node, bool>(Root, false));
    // Step 2.
    while (!NodeStack.empty()) {
        leda::two_tuple<leda::node, bool> Task = NodeStack.pop();
        leda::node dom_x = Task.first();
        // Step 3: the subtree is done.
        if (Task.second()) {
            for (ZfCCfgVariable* pOrigVar : OldLhsVarListStack.top()) {
                pOrigVar->popSSAReplacement();
            }
            OldLhsVarListStack.pop();
            continue;
        }
        // Steps 4 and 5: the node's own contents.
        leda::list<ZfCCfgVariable*> OldLhsVarList;
        leda::node x = pComponentDomTree->inf(dom_x);
        if (ZfCBasicBlock* pBasicBlock = inf(x)->isBasicBlock()) {
            Renamer.renameContents(pBasicBlock, OldLhsVarList);
        }
        // Step 6: the operands at the ends of its out-edges.
        for (leda::edge e = first_adj_edge(x); e != nullptr; e = adj_succ(e)) {
            Renamer.renameAlongEdge(e);
        }
        // Step 7: the list is handed over, not copied.
        NodeStack.push(leda::two_tuple<leda::node, bool>(dom_x, true));
        OldLhsVarListStack.push(leda::list<ZfCCfgVariable*>());
        OldLhsVarListStack.top().conc(OldLhsVarList);
        // Step 8: children from the last to the first, so that they come off in order.
        for (leda::edge e = dom_x->first_out_edge_rev(); e != dom_x->stop_out_edge_rev();
             e = e->pred_out_edge()) {
            NodeStack.push(leda::two_tuple<leda::node, bool>(e->terminal(1), false));
        }
    }
}
