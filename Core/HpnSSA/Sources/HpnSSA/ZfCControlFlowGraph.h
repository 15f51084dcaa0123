#ifndef ZFCCONTROLFLOWGRAPH_H
#define ZFCCONTROLFLOWGRAPH_H

#include "HpnSSAExport.h"
#include "LEDA/leda.h"
#include "WqCXString.h"
#include "ZfCBasicBlock.h"
#include "ZfCCfgAssignment.h"
#include "ZfCCfgEdgeInfo.h"
#include "ZfCCfgEntry.h"
#include "ZfCCfgExit.h"
#include "ZfCCfgExplicitVarUse.h"
#include "ZfCCfgExpression.h"
#include "ZfCCfgExternCall.h"
#include "ZfCCfgFactory.h"
#include "ZfCCfgFalseBranch.h"
#include "ZfCCfgInitAssignment.h"
#include "ZfCCfgNodeInfo.h"
#include "ZfCCfgOutputStatement.h"
#include "ZfCCfgParamStatement.h"
#include "ZfCCfgProcedure.h"
#include "ZfCCfgProcedureCall.h"
#include "ZfCCfgStatement.h"
#include "ZfCCfgTrueBranch.h"
#include "ZfCCfgValue.h"
#include "ZfCCfgValueExpression.h"
#include "ZfCCfgValueReturnStatement.h"
#include "ZfCCfgVariable.h"
#include "ZfCDominatorTree.h"
#include "ZfCModuleAllocation.h"
#include "ZfCPhiFunction.h"
#include "ZfCSSAEdge.h"
#include "ZfCSSAVariable.h"

class ZfCCfgVisitor;
class ZfCPropagationState;
class ZfCWorkList;

// The intermediate code of one whole program, and every pass over it.
//
// Each procedure is one connected component with an entry node of in-degree 0 and, after
// placeExitNodes, one exit node; no control flow edge joins two procedures, for a call is a
// statement that names its callee. Control flow edges and SSA edges live in this one graph and
// are told apart by isSSAEdge of the edge's record: who means control flow skips SSA edges.
//
// The graph owns neither records nor procedures, the factory does. Its end empties the factory,
// so there is one graph at a time, and it ends before the factory.
//
// The order of the passes is the client's. The usual road of a run:
//
//   fill -> placeExitNodes -> inlineProcedures -> placeLoopAroundMain
//        -> insertValidConditionAssignments -> transformToSSAForm -> divideBasicBlock
//        -> propagateSparseConditionalConstant
//        -> replaceConstantConditions, replaceConstantVariables, foldConstants
//        -> removeUnusedVarDefs -> hoistCodeOutOfIfElseBranches -> read the graph back
//
// Nodes and edges are walked in order of creation, procedures by name, variables by debug index:
// nothing depends on addresses. No operation recurses over the size of the program.
class HPNSSA_EXPORT ZfCControlFlowGraph : public leda::GRAPH<ZfCCfgNodeInfo*, ZfCCfgEdgeInfo*> {
public:
    HPNSSA_MODULE_BLOCKS

    // --- Frame -------------------------------------------------------------------------------

    // An empty graph without a start node and without procedures.
    ZfCControlFlowGraph();

    // The copy's nodes and edges hold the same records as the source's, and its start node still
    // names a node of the source. A copy must not end while its source is in use.
    ZfCControlFlowGraph(ZfCControlFlowGraph const& Other);
    ZfCControlFlowGraph& operator=(ZfCControlFlowGraph const& Other);

    // Empties the factory of everything, whichever graph it belonged to.
    ~ZfCControlFlowGraph() override;

    // The entry node of "#main", as the client has set it; null until then.
    leda::node getStartNode();
    void setStartNode(leda::node StartNode);

    // Present the graph itself to a ZfCCfgVisitorSSA; any other visitor sees nothing.
    void acceptStart(ZfCCfgVisitor* pVisitor);
    void acceptEnd(ZfCCfgVisitor* pVisitor);

    // --- Structure edits and consistency -------------------------------------------------------

    // Cuts the block of v in front of pStmt. Answers the node that begins with pStmt now, which
    // is v itself if the statement stands first. A node without a block, or a statement that is
    // not in the block, is an internal error.
    leda::node splitAtStatement(leda::node v, ZfCCfgStatement* pStmt);

    // Cuts the block of v in front of its condition. Answers the node with the condition, which
    // is v itself if the block has no statement. A node without a block is an internal error.
    leda::node splitAtCondition(leda::node v);

    // Follows the straight path from v, into called procedures where a block ends in a call, up
    // to the first node with a branch condition, and answers it. Internal error if that is not
    // pCondition or if the path ends before.
    leda::node findBranchNode(leda::node v, ZfCCfgExpression* pCondition);

    // Leaves one phi function, statement or condition in each node. The order of in-edges stays.
    void divideBasicBlock();

    // True if there are as many components as procedures. With internal checks on, it also
    // asserts that each component names its procedure and has just its entry without in-edges.
    bool checkConsistency();

    // --- Frames of procedures ------------------------------------------------------------------

    // The entry node of the procedure of that name, and the procedure in pProcedure; both are
    // made if there is none yet.
    leda::node demandProcedureEntryNode(WqCXString Name, ZfCCfgProcedure*& pProcedure);

    // Gives each procedure one exit node, reached from every node without out-edges.
    void placeExitNodes();

    // Closes "#main" into a loop with an unknown condition. Requires exit nodes, no SSA form.
    void placeLoopAroundMain();

    // --- Extraction of procedures --------------------------------------------------------------

    // Makes what begins at v a procedure, with a call in place of each edge that comes in from
    // outside, and answers one more call, which stands in no block; the factory owns it. Joins
    // inside that are entered from outside become procedures too. An edge out of an exit node is
    // reported and stays, so that its procedures stay one component. No SSA form.
    ZfCCfgProcedureCall* makeProcedureAndCall(leda::node v);

    // Hands pCall its arguments and empties both lists; Expressions is as long as Variables at
    // least. The first call of a procedure fixes its parameters; for a later call, other
    // variables or another order are an internal error.
    void setParametersOfCall(ZfCCfgProcedureCall* pCall, leda::list<ZfCCfgVariable*>& Variables,
                             leda::list<ZfCCfgExpression*>& Expressions);

    // --- SSA construction ----------------------------------------------------------------------

    // Sets the immediate dominator of every node (Lengauer and Tarjan 1979); null for the entry
    // of a procedure. Requires a graph without SSA edges in which every node is reachable.
    void computeAllIdoms();

    // Fills the dominance frontier of every node (Cytron et al. 1991). Requires immediate
    // dominators and the trees built from them.
    void computeDominanceFrontiers(leda::array<ZfCDominatorTree*>& DominatorTree);

    // Appends the phi functions of the minimal form to their blocks; an exit node that needs one
    // becomes a block with a new exit node behind it. Requires dominance frontiers. Once only.
    void placePhiFunction();

    // Turns the whole program into SSA form: boundary statements, phi functions, one version for
    // each definition. Requires exit nodes, complete call lists, blocks that hold assignments,
    // extern calls and procedure calls only, and no SSA edges. Once only.
    void transformToSSAForm();

    // --- Propagation of constants --------------------------------------------------------------

    // addSSAEdges and sparseConditionalConstant (Wegman and Zadeck 1991). Requires SSA form and
    // one item for each node. With RemoveDeadCode, what was not reached is removed; without it
    // the graph keeps its shape.
    void propagateSparseConditionalConstant(bool RemoveDeadCode);

    // Adds an SSA edge from each definition to each node that uses it. Removes none, so a second
    // call doubles them.
    void addSSAEdges();

    // Writes value, minimum and maximum into the SSA variables and the executable flags into the
    // edges. Starts from the values that are there.
    void sparseConditionalConstant(bool RemoveDeadCode);

    // Offer what the propagation has found to the client's expressions: the conditions, then the
    // right-hand sides too, then for folding. The first two must not edit the graph meanwhile.
    void replaceConstantConditions();
    void replaceConstantVariables();
    void foldConstants();

    // --- Further passes ------------------------------------------------------------------------

    // Removes definitions of erasable variables that nobody uses until none is left; their nodes
    // stay as empty blocks. Requires SSA form with one item for each node. Pointers in the
    // procedures' lists are stale afterwards: no propagation may follow.
    void removeUnusedVarDefs();

    // Fills the call lists of all procedures and dissolves each procedure with one call, unless
    // the call is marked as one of a function callable from outside. Requires exit nodes, no SSA
    // form, each call alone in its block, and no procedure whose only calls form a ring.
    void inlineProcedures();

    // Deletes the SSA edges, then moves statements that begin both arms of a branch alike in
    // front of it, as far as the client's statements can do that.
    void hoistCodeOutOfIfElseBranches();

    // States at the head of an arm what the branch tells about its variable, in a block with one
    // virtual assignment. Requires a graph without SSA edges in which every out-edge of a branch
    // is a true or a false edge; any other is an internal error.
    void insertValidConditionAssignments();

private:
    // --- Call graph and variable summaries -----------------------------------------------------

    void buildFunctionCallGraph(leda::graph& CallGraph,
                                leda::map<leda::node, ZfCCfgProcedure*>& MappedProcedure);
    void collectVarDefsAndUses();
    void addVarDefsAndUsesOfCalledProcs();
    void setProcedureAtNodes(leda::node StartNode, ZfCCfgProcedure* pProcedure);

    // --- Dominators ----------------------------------------------------------------------------

    void computeIdomsFast(leda::set<leda::node, leda::avl_tree> ComponentNodes,
                          leda::map<leda::node, leda::node>& Idom);
    int buildDominatorTrees(leda::array<ZfCDominatorTree*>& DominatorTree);
    void freeDominatorTrees(leda::array<ZfCDominatorTree*>& DominatorTree, int Count);

    // --- Phi placement, boundary statements and renaming ---------------------------------------

    leda::list<ZfCCfgVariable*>
    getDefinedVariables(leda::map<ZfCCfgVariable*, leda::list<leda::node>*>& DefiningNodes);

    void initVariablesAfterEntryNodes();
    void addVarInits(leda::node v, leda::set<ZfCCfgVariable*, leda::avl_tree> Variables);
    void addParamStatements(leda::node v, leda::set<ZfCCfgVariable*, leda::avl_tree> Variables,
                            ZfCCfgProcedure* pProcedure);
    void placeValueReturnStatements();
    void addValueReturnStatements(ZfCBasicBlock* pBasicBlock,
                                  leda::set<ZfCCfgVariable*, leda::avl_tree> Variables,
                                  ZfCCfgProcedure* pProcedure);
    void placeOutputStatements();

    void renameVariables(leda::array<ZfCDominatorTree*>& DominatorTree);
    void traverseDominatorTree(leda::node Root, ZfCDominatorTree* pComponentDomTree);

    // --- Propagation of constants --------------------------------------------------------------

    void buildVarUses();
    void initSparseConditionalConstant(leda::node StartNode, ZfCWorkList& CfgEdgeList,
                                       ZfCWorkList& SSAEdgeList);
    void sparseConditionalConstant(bool RemoveDeadCode, ZfCPropagationState& State);
    void serveCfgEdge(int e, ZfCWorkList& CfgEdgeList, ZfCWorkList& SSAEdgeList,
                      bool& FoundNewConstant);
    void serveSSAEdge(int Target, ZfCWorkList& CfgEdgeList, ZfCWorkList& SSAEdgeList,
                      bool& FoundNewConstant);
    void visitIfDirty(int Node, ZfCWorkList& CfgEdgeList, ZfCWorkList& SSAEdgeList,
                      bool& FoundNewConstant);

    void visitPhiFunction(ZfCPhiFunction* pPhi, int Node, bool& FoundNewConstant);
    void visitInstruction(ZfCBasicBlock* pBlock, int Node, ZfCWorkList& CfgEdgeList,
                          ZfCWorkList& SSAEdgeList, bool& FoundNewConstant);
    void visitAssignment(ZfCCfgAssignment* pAssignment, int Node, ZfCWorkList& CfgEdgeList,
                         ZfCWorkList& SSAEdgeList, bool& FoundNewConstant);
    void visitBranchCondition(ZfCCfgExpression* pCond, int Node, ZfCWorkList& CfgEdgeList);
    void appendCfgOutEdges(int Node, ZfCWorkList& CfgEdgeList);
    void visitParamStatement(ZfCCfgParamStatement* pParamStatement, int Node,
                             ZfCWorkList& CfgEdgeList, ZfCWorkList& SSAEdgeList,
                             bool& FoundNewConstant);
    void visitValueReturnStatement(ZfCCfgValueReturnStatement* pValueReturnStatement, int Node,
                                   ZfCWorkList& CfgEdgeList, ZfCWorkList& SSAEdgeList,
                                   bool& FoundNewConstant);

    // --- Further passes ------------------------------------------------------------------------

    bool eliminateDeadCode();
    void inlineProcedureCalls(leda::node x, ZfCBasicBlock* pBlock);
    void deleteSSAEdges();
    void performCodeHoisting(leda::node v);
    bool checkForHoisting(ZfCCfgStatement* pStmt, ZfCCfgExpression* pCond);
    void createValidConditionAssignments(ZfCCfgExpression*& pCond,
                                         ZfCCfgAssignment*& pThenAssignment,
                                         ZfCCfgAssignment*& pElseAssignment);

    leda::node m_StartNode; // entry of "#main"; null until set
    leda::dictionary<WqCXString, ZfCCfgProcedure*, leda::ab_tree> m_Procedures; // by name
    // What the propagation knows of nodes and edges, visited marks included; null at other times.
    ZfCPropagationState* m_pPropagation = nullptr;
};

#endif
