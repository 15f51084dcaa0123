// Extraction of procedures.
//
// 1. What begins at v becomes a procedure: it gets an entry node, a call takes the place of each
//    edge that comes in from outside, and all nodes that are reached from v change hands.
// 2. As long as a node of the new procedure is entered from a node that the entry does not
//    reach, that node is extracted in the same way, and the search begins again.
//
// No call can take the place of an edge out of an exit node, of a second entry, or of unreachable
// code of the new procedure itself, and an exit node makes no procedure. Such edges stay, and a
// node where nothing else is left is not extracted again: the search would find it without end.
//
// Step 2 naturally is a recursion, as deep as the joins are nested. Here the extractions that are
// under way stand on a stack of their own, in the same order and with the same objects made.
// Each search takes time linear in the graph, and there is one more than there are extractions.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"

namespace {

using ProcedureDictionary = leda::dictionary<WqCXString, ZfCCfgProcedure*, leda::ab_tree>;
using NodeSet = leda::set<leda::node, leda::avl_tree>;

// One extraction that is under way.
struct Extraction {
    WqCXString ProcedureName;
    leda::node EntryNode = nullptr;
};

// The name of the procedure that already begins at v, else a new one from the block's number.
WqCXString nameOfProcedureAt(ZfCControlFlowGraph& Graph, leda::node v, ZfCBasicBlock* pBasicBlock) {
    for (leda::edge e = Graph.first_in_edge(v); e != nullptr; e = Graph.in_succ(e)) {
        ZfCCfgNodeInfo* pInf = Graph.inf(Graph.source(e));
        if (pInf->isEntryNode() != nullptr) {
            return pInf->getProcedure()->getName();
        }
    }
    return WqCXString("#block_") + WqCXString(pBasicBlock->getIndex(), false, true);
}

// Replaces the in-edge e of v by a call in the block of its source.
void replaceEdgeByCall(ZfCControlFlowGraph& Graph, leda::edge e, ZfCBasicBlock* pCaller,
                       ZfCCfgProcedure* pOldProcedure, WqCXString const& ProcedureName) {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    if (pCaller->getBranchCond() != nullptr) {
        // A call cannot stand behind a condition: the arm gets a block for it.
        pCaller = pFactory->createBasicBlock();
        pCaller->setProcedure(pOldProcedure);
        Graph.move_edge(e, Graph.source(e), Graph.new_node(pCaller));
    } else {
        pFactory->delEdgeInfo(Graph.inf(e));
        Graph.del_edge(e);
    }
    pCaller->append(new ZfCCfgProcedureCall(ProcedureName));
}

// Step 4: calls in place of the edges into v from other procedures' nodes. Answers whether there
// was one.
bool replaceInEdgesByCalls(ZfCControlFlowGraph& Graph, leda::node v, ZfCCfgProcedure* pOldProcedure,
                           ZfCCfgProcedure* pNewProcedure, WqCXString const& ProcedureName) {
    bool IsReplaced = false;
    for (leda::edge e : Graph.in_edges(v)) {
        ZfCCfgNodeInfo* pInf = Graph.inf(Graph.source(e));
        if (pInf->isEntryNode() != nullptr || pInf->getProcedure() == pNewProcedure) {
            continue;
        }
        ZfCBasicBlock* pCaller = pInf->isBasicBlock();
        if (pCaller == nullptr) {
            reportInternalError("ZfCControlFlowGraph", __LINE__);
            continue;
        }
        replaceEdgeByCall(Graph, e, pCaller, pOldProcedure, ProcedureName);
        IsReplaced = true;
    }
    return IsReplaced;
}

// Step 5: everything that is reached from v belongs to the new procedure.
void stampReachedNodes(ZfCControlFlowGraph& Graph, leda::node v, ZfCCfgProcedure* pOldProcedure,
                       ZfCCfgProcedure* pNewProcedure) {
    leda::node_array<bool> Reached(Graph, false);
    for (leda::node w : leda::DFS(Graph, v, Reached)) {
        ZfCCfgNodeInfo* pInf = Graph.inf(w);
        if (pInf == nullptr) {
            reportInternalError("ZfCControlFlowGraph", __LINE__);
            continue;
        }
        ZF_ASSERT(pInf->getProcedure() == pOldProcedure);
        pInf->setProcedure(pNewProcedure);
    }
}

// Steps 1 to 5 of the extraction at v. Answers false if v has no block. Settled holds the nodes
// that have been extracted since an edge was last replaced or a procedure made.
bool beginExtraction(ZfCControlFlowGraph& Graph, ProcedureDictionary& Procedures, leda::node v,
                     Extraction& Begun, NodeSet& Settled) {
    // Step 1: the block of v.
    ZfCBasicBlock* pBasicBlock = Graph.inf(v)->isBasicBlock();
    if (pBasicBlock == nullptr) {
        reportInternalError("ZfCControlFlowGraph", __LINE__);
        Settled.insert(v);
        return false;
    }
    ZfCCfgProcedure* pOldProcedure = pBasicBlock->getProcedure();
    // Step 2: the name.
    Begun.ProcedureName = nameOfProcedureAt(Graph, v, pBasicBlock);
    // Step 3: the procedure of that name, with its entry in front of v if it is new.
    bool IsNew = !Procedures.lookup(Begun.ProcedureName);
    ZfCCfgProcedure* pNewProcedure = nullptr;
    Begun.EntryNode = Graph.demandProcedureEntryNode(Begun.ProcedureName, pNewProcedure);
    if (IsNew) {
        Graph.new_edge(Begun.EntryNode, v, ZfCCfgFactory::getInstance()->createEdgeInfo());
    }
    if (replaceInEdgesByCalls(Graph, v, pOldProcedure, pNewProcedure, Begun.ProcedureName) ||
        IsNew) {
        Settled.clear();
    }
    Settled.insert(v);
    stampReachedNodes(Graph, v, pOldProcedure, pNewProcedure);
    return true;
}

bool isEnteredFromUnreached(ZfCControlFlowGraph& Graph, leda::node w,
                            leda::node_array<bool>& Reached) {
    for (leda::edge e = Graph.first_in_edge(w); e != nullptr; e = Graph.in_succ(e)) {
        if (!Reached[Graph.source(e)]) {
            return true;
        }
    }
    return false;
}

// One round of step 6: the last of the nodes found that is also entered from elsewhere, or null.
leda::node findForeignJoin(ZfCControlFlowGraph& Graph, leda::node EntryNode,
                           NodeSet const& Settled) {
    leda::node_array<bool> Reached(Graph, false);
    leda::list<leda::node> NodeList = leda::DFS(Graph, EntryNode, Reached);
    while (!NodeList.empty()) {
        leda::node w = NodeList.pop_back();
        if (isEnteredFromUnreached(Graph, w, Reached) && !Settled.member(w)) {
            return w;
        }
    }
    return nullptr;
}

} // namespace

ZfCCfgProcedureCall* ZfCControlFlowGraph::makeProcedureAndCall(leda::node v) {
    Extraction Begun;
    NodeSet Settled;
    if (!beginExtraction(*this, m_Procedures, v, Begun, Settled)) {
        return nullptr;
    }
    leda::stack<Extraction> Open;
    Open.push(Begun);
    for (;;) {
        // Step 6: further joins, innermost extraction first.
        leda::node w = findForeignJoin(*this, Open.top().EntryNode, Settled);
        if (w != nullptr) {
            if (beginExtraction(*this, m_Procedures, w, Begun, Settled)) {
                Open.push(Begun);
            }
            continue;
        }
        // Step 7: a call of the finished procedure. Nobody wants the call of an inner one; it is
        // made and deleted all the same, so that statements are numbered as in the recursion.
        auto* pCall = new ZfCCfgProcedureCall(Open.pop().ProcedureName);
        if (Open.empty()) {
            return pCall;
        }
        ZfCCfgFactory::getInstance()->delStatement(pCall);
    }
}

void ZfCControlFlowGraph::setParametersOfCall(ZfCCfgProcedureCall* pCall,
                                              leda::list<ZfCCfgVariable*>& Variables,
                                              leda::list<ZfCCfgExpression*>& Expressions) {
    // Step 1: the procedure that is called.
    auto Item = m_Procedures.lookup(pCall->getName());
    ZfCCfgProcedure* pProcedure = Item ? m_Procedures.inf(Item) : nullptr;
    if (pProcedure == nullptr) {
        reportInternalError("ZfCControlFlowGraph", __LINE__);
        return;
    }
    // Step 2: the first call of a procedure fixes its parameters.
    leda::list<ZfCCfgParamStatement*> ParamStatements = pProcedure->getParamStatements();
    bool IsFirstCall = ParamStatements.empty();
    // Step 3: an argument for each of them.
    while (!Variables.empty()) {
        ZfCCfgVariable* pVariable = Variables.pop();
        ZfCCfgExpression* pExpression = Expressions.pop();
        ZfCCfgParamStatement* pParamStatement = nullptr;
        if (IsFirstCall) {
            pParamStatement = new ZfCCfgParamStatement(pVariable);
        } else {
            if (!ParamStatements.empty()) {
                pParamStatement = ParamStatements.pop();
            }
            if (pParamStatement == nullptr || pParamStatement->getVariable() != pVariable) {
                reportInternalError("ZfCControlFlowGraph", __LINE__);
            }
            if (pParamStatement == nullptr) {
                continue;
            }
        }
        pParamStatement->setParamExpression(pCall, pExpression);
        if (IsFirstCall) {
            pProcedure->appendParamStatement(pParamStatement);
        }
    }
}
