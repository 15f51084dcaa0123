// Inlining of procedures that have exactly one call.
//
// 1. Every call is entered in the call list of its procedure.
// 2. A call that may be inlined gives way to the body, if its procedure has no other call: the
//    body's nodes move into the caller, between a block of assignments to the parameters and what
//    followed the call.
//
// Nothing is cloned, for a procedure with one call has no other user. The lists of step 1 serve
// the boundary statements later, and nobody empties them: after a second run every procedure has
// two calls at least, and nothing is inlined any more. A procedure whose only call lies in its own
// body is not recognised.
//
// Departure, in cost alone: the number of a procedure's calls is looked up once, not copied out of
// it for each of its calls. Linear in the calls and in the edges of the bodies that move.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"

namespace {

using ProcedureDictionary = leda::dictionary<WqCXString, ZfCCfgProcedure*, leda::ab_tree>;

// Step 7: assignments to the parameters take the place of the parameter statements.
void assignParameters(ZfCBasicBlock* pParamBlock, ZfCCfgProcedure* pProcedure,
                      ZfCCfgProcedureCall* pCall) {
    leda::list<ZfCCfgParamStatement*> ParamStatements = pProcedure->getParamStatements();
    while (!ParamStatements.empty()) {
        ZfCCfgParamStatement* pParamStatement = ParamStatements.pop();
        auto* pAssignment = new ZfCCfgInitAssignment();
        pAssignment->setLHS(pParamStatement->getVariable());
        pAssignment->setRHS(pParamStatement->getParamExpression(pCall));
        pParamBlock->append(pAssignment);
        ZfCCfgFactory::getInstance()->delStatement(pParamStatement);
    }
}

// Tells the calls of procedures that are called more than once. Call lists do not change while
// inlining goes on, so each is looked at once.
class SeveralCalls {
public:
    explicit SeveralCalls(ProcedureDictionary& Procedures) : m_Procedures(Procedures) {}

    bool contain(ZfCCfgProcedureCall* pCall) {
        auto Item = m_Procedures.lookup(pCall->getName());
        if (!Item) {
            return false;
        }
        int& CallCount = m_CallCount[m_Procedures.inf(Item)];
        if (CallCount == 0) {
            CallCount = m_Procedures.inf(Item)->getCalls().size();
        }
        return CallCount > 1;
    }

private:
    ProcedureDictionary& m_Procedures;
    leda::map<ZfCCfgProcedure*, int> m_CallCount; // 0: not looked at
};

} // namespace

void ZfCControlFlowGraph::inlineProcedures() {
    // Step 1.
    leda::list<leda::node> WorkList = all_nodes();
    // Step 2: the first sweep fills the call lists.
    for (leda::node x : WorkList) {
        ZfCBasicBlock* pBlock = inf(x)->isBasicBlock();
        if (pBlock == nullptr) {
            continue;
        }
        for (ZfCCfgStatement* pStmt : pBlock->getStatementSeq()) {
            if (ZfCCfgProcedureCall* pCall = pStmt->isProcedureCall()) {
                WqCXString ProcedureName = pCall->getName();
                m_Procedures.inf(m_Procedures.lookup(ProcedureName))->appendCall(pCall);
            }
        }
    }
    // Step 3: the second sweep inlines. Entry and exit nodes that went meanwhile still answer with
    // their records, which are no blocks.
    SeveralCalls CallsToKeep(m_Procedures);
    for (leda::node x : WorkList) {
        ZfCBasicBlock* pBlock = inf(x)->isBasicBlock();
        if (pBlock == nullptr) {
            continue;
        }
        for (ZfCCfgStatement* pStmt : pBlock->getStatementSeq()) {
            ZfCCfgProcedureCall* pCall = pStmt->isProcedureCall();
            if (pCall != nullptr && !pCall->isCallToDirectlyOrIndirectlyFromOutsideCallableFcn() &&
                !CallsToKeep.contain(pCall)) {
                inlineProcedureCalls(x, pBlock);
            }
        }
    }
}

void ZfCControlFlowGraph::inlineProcedureCalls(leda::node x, ZfCBasicBlock* pBlock) {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    // Step 1: the call.
    leda::list<ZfCCfgStatement*> const& StmtList = pBlock->getStatementSeq();
    ZF_ASSERT(StmtList.size() == 1);
    ZfCCfgProcedureCall* pCall = StmtList.front()->isProcedureCall();
    if (pCall == nullptr) {
        return;
    }
    // Step 2: its procedure. In a block of several calls, the first may be gone already.
    auto Item = m_Procedures.lookup(pCall->getName());
    if (!Item) {
        return;
    }
    ZfCCfgProcedure* pProcedure = m_Procedures.inf(Item);
    leda::node ProcedureEntryNode = pProcedure->getEntryNode();
    leda::node ProcedureExitNode = pProcedure->getExitNode();
    // Step 3.
    if (pProcedure->getCalls().size() != 1) {
        return;
    }
    // Steps 4 and 5: the body changes hands.
    ZfCCfgProcedure* pCallerProc = inf(x)->getProcedure();
    ZF_ASSERT(pCallerProc);
    setProcedureAtNodes(ProcedureEntryNode, pCallerProc);
    // Steps 6 and 7: the node of the parameters, also for a procedure without any.
    ZfCBasicBlock* pParamBlock = pFactory->createBasicBlock();
    pParamBlock->setProcedure(pCallerProc);
    leda::node ParamNode = new_node(pParamBlock);
    assignParameters(pParamBlock, pProcedure, pCall);
    // Step 8.
    ZF_ASSERT(outdeg(ProcedureEntryNode) == 1);
    leda::node FirstNode = target(first_adj_edge(ProcedureEntryNode));
    // Steps 9 and 10: into the body.
    for (leda::edge e : in_edges(x)) {
        move_edge(e, source(e), ParamNode);
    }
    new_edge(ParamNode, FirstNode, pFactory->createEdgeInfo());
    // Steps 11 and 12: out of the body.
    ZF_ASSERT(outdeg(x) == 1);
    leda::node NextNode = target(first_adj_edge(x));
    for (leda::edge e : in_edges(ProcedureExitNode)) {
        move_edge(e, source(e), NextNode);
    }
    // Step 13.
    del_node(x);
    del_node(ProcedureEntryNode);
    del_node(ProcedureExitNode);
    // Step 14.
    m_Procedures.del_item(Item);
}
