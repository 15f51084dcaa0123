// Variable summaries of procedures over the function call graph.
//
// The closure of the direct sets over a call graph with recursion, by condensation into strongly
// connected components (R. E. Tarjan, Depth-first search and linear graph algorithms, SIAM
// Journal on Computing 1(2), 1972):
//
// 1. Each procedure's own definitions and uses are collected statement by statement.
// 2. The call graph gets a node for each procedure and an edge for each call.
// 3. Each strongly connected component shares one pair of sets, the union over its members, and
//    each component of several members is compressed into one node.
// 4. Callees hand their sets to their callers, leaves first.
// 5. The sets go back to the procedures.
//
// The steps inside the operations are numbered on their own. A caller is ready when its last
// callee is done; this is counted down instead of looked up along its edges at every callee, and
// parallel edges hand a set over once, so that many calls of one procedure cost no more than one.
// Step 4 is linear in the calls, and merges once for each pair of components that call.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"

namespace {

using VariableSet = leda::set<ZfCCfgVariable*, leda::avl_tree>;
using NodeSet = leda::set<leda::node, leda::avl_tree>;
using ProcedureDictionary = leda::dictionary<WqCXString, ZfCCfgProcedure*, leda::ab_tree>;

// Enters variables into the sets of procedures. A variable that was entered for the same
// procedure last time is passed over at once: most uses are repeats.
class SummaryCollector {
public:
    void use(ZfCCfgVariable* pVariable, ZfCCfgProcedure* pProcedure) {
        ZfCCfgProcedure*& pLast = m_LastUser[pVariable];
        if (pLast != pProcedure) {
            pLast = pProcedure;
            pProcedure->appendUsedVariable(pVariable);
        }
    }
    void use(VariableSet const& Variables, ZfCCfgProcedure* pProcedure) {
        for (ZfCCfgVariable* pVariable : Variables) {
            use(pVariable, pProcedure);
        }
    }
    void define(ZfCCfgVariable* pVariable, ZfCCfgProcedure* pProcedure) {
        ZfCCfgProcedure*& pLast = m_LastDefiner[pVariable];
        if (pLast != pProcedure) {
            pLast = pProcedure;
            pProcedure->appendDefinedVariable(pVariable);
        }
    }

private:
    leda::map<ZfCCfgVariable*, ZfCCfgProcedure*> m_LastUser;
    leda::map<ZfCCfgVariable*, ZfCCfgProcedure*> m_LastDefiner;
};

// The client's explicit arguments are read by the caller. (The implicit ones do not exist yet.)
void collectArguments(SummaryCollector& Collector, ZfCCfgProcedureCall* pCall,
                      ZfCCfgProcedure* pCallee, ZfCCfgProcedure* pProcedure) {
    for (ZfCCfgParamStatement* pParamStatement : pCallee->getParamStatements()) {
        ZfCCfgExpression* pExpression = pParamStatement->getParamExpression(pCall);
        Collector.use(pExpression->getUsedVariables(), pProcedure);
    }
}

void collectStatement(SummaryCollector& Collector, ProcedureDictionary& Procedures,
                      ZfCCfgStatement* pStmt, ZfCCfgProcedure* pProcedure) {
    if (ZfCCfgAssignment* pAssignment = pStmt->isAssignment()) {
        // What a branch tells about a variable is neither a definition nor a use.
        if (!pAssignment->getIsValidConditionAssignment()) {
            Collector.use(pAssignment->getRHS()->getUsedVariables(), pProcedure);
            Collector.define(pAssignment->getLHS(), pProcedure);
        }
    } else if (ZfCCfgExternCall* pExternCall = pStmt->isExternCall()) {
        Collector.use(pExternCall->getUsedVariables(), pProcedure);
    } else if (ZfCCfgProcedureCall* pCall = pStmt->isProcedureCall()) {
        ZfCCfgProcedure* pCallee = Procedures.inf(Procedures.lookup(pCall->getName()));
        collectArguments(Collector, pCall, pCallee, pProcedure);
    } else {
        ZF_ASSERT_UNREACHABLE();
    }
}

// The sets of the components, and which component a node of the call graph belongs to. The nodes
// that compression adds are known to CompressedComponentNum alone.
struct ComponentSummaries {
    leda::array<VariableSet> DefinedVariables;
    leda::array<VariableSet> UsedVariables;
    leda::array<NodeSet> ComponentNodes; // before compression
    leda::map<leda::node, int> CompressedComponentNum;
};

// Steps 2 and 3 of the propagation: the union over the members, and the members.
void gatherComponents(leda::graph& CallGraph, leda::node_array<int>& ComponentNum,
                      leda::map<leda::node, ZfCCfgProcedure*>& MappedProcedure,
                      ComponentSummaries& Summaries) {
    for (leda::node v = CallGraph.first_node(); v != nullptr; v = CallGraph.next_node(v)) {
        ZfCCfgProcedure* pProcedure = MappedProcedure[v];
        int i = ComponentNum[v];
        Summaries.DefinedVariables[i].add(pProcedure->getDefinedVariables());
        Summaries.UsedVariables[i].add(pProcedure->getUsedVariables());
        Summaries.ComponentNodes[i].insert(v);
        Summaries.CompressedComponentNum[v] = i;
    }
}

// Step 4 of the propagation: a component of several members gets one node for all their edges.
void compressComponents(leda::graph& CallGraph, int Count,
                        leda::map<leda::node, ZfCCfgProcedure*>& MappedProcedure,
                        ComponentSummaries& Summaries) {
    for (int i = 0; i < Count; ++i) {
        if (Summaries.ComponentNodes[i].size() <= 1) {
            continue;
        }
        leda::node v = CallGraph.new_node();
        Summaries.CompressedComponentNum[v] = i;
        MappedProcedure[v] = nullptr;
        for (leda::node w : Summaries.ComponentNodes[i]) {
            for (leda::edge e : CallGraph.in_edges(w)) {
                CallGraph.move_edge(e, CallGraph.source(e), v);
            }
            for (leda::edge e : CallGraph.out_edges(w)) {
                CallGraph.move_edge(e, v, CallGraph.target(e));
            }
        }
    }
}

// Step 5 of the propagation: what is a self-loop now was a call within a component.
void deleteSelfLoops(leda::graph& CallGraph) {
    leda::list<leda::edge> EdgeList = CallGraph.all_edges();
    while (!EdgeList.empty()) {
        leda::edge e = EdgeList.pop();
        if (CallGraph.source(e) == CallGraph.target(e)) {
            CallGraph.del_edge(e);
        }
    }
}

// Step 7 of the propagation, for one callee: its sets go to all its callers. A caller whose last
// callee this was becomes ready. LastCallee names, for each component, the component whose sets it
// was given last.
void propagateToCallers(leda::graph& CallGraph, leda::node Callee,
                        leda::node_array<int>& OpenCallees, leda::array<int>& LastCallee,
                        ComponentSummaries& Summaries, leda::list<leda::node>& NodeList) {
    int i = Summaries.CompressedComponentNum[Callee];
    for (leda::edge e = CallGraph.first_in_edge(Callee); e != nullptr; e = CallGraph.in_succ(e)) {
        --OpenCallees[CallGraph.source(e)];
    }
    for (leda::edge e = CallGraph.first_in_edge(Callee); e != nullptr; e = CallGraph.in_succ(e)) {
        leda::node Caller = CallGraph.source(e);
        int j = Summaries.CompressedComponentNum[Caller];
        if (j != i && LastCallee[j] != i) {
            LastCallee[j] = i;
            Summaries.DefinedVariables[j].add(Summaries.DefinedVariables[i]);
            Summaries.UsedVariables[j].add(Summaries.UsedVariables[i]);
        }
        if (OpenCallees[Caller] == 0) {
            NodeList.append(Caller);
        }
    }
}

// Steps 6 and 7 of the propagation.
void propagateSummaries(leda::graph& CallGraph, int Count, ComponentSummaries& Summaries) {
    leda::node_array<bool> IsPropagated(CallGraph, false);
    leda::node_array<int> OpenCallees(CallGraph, 0);
    leda::array<int> LastCallee(Count);
    for (int i = 0; i < Count; ++i) {
        LastCallee[i] = -1;
    }
    leda::list<leda::node> NodeList;
    for (leda::node v = CallGraph.first_node(); v != nullptr; v = CallGraph.next_node(v)) {
        OpenCallees[v] = CallGraph.outdeg(v);
        if (OpenCallees[v] == 0) {
            NodeList.append(v);
        }
    }
    while (!NodeList.empty()) {
        leda::node Callee = NodeList.pop();
        if (!IsPropagated[Callee]) {
            IsPropagated[Callee] = true;
            propagateToCallers(CallGraph, Callee, OpenCallees, LastCallee, Summaries, NodeList);
        }
    }
}

// Step 8 of the propagation: each member takes the sets of its component.
void storeSummaries(int Count, leda::map<leda::node, ZfCCfgProcedure*>& MappedProcedure,
                    ComponentSummaries& Summaries) {
    for (int i = 0; i < Count; ++i) {
        for (leda::node v : Summaries.ComponentNodes[i]) {
            ZfCCfgProcedure* pProcedure = MappedProcedure[v];
            if (pProcedure == nullptr) {
                continue;
            }
            for (ZfCCfgVariable* pVariable : Summaries.DefinedVariables[i]) {
                pProcedure->appendDefinedVariable(pVariable);
            }
            for (ZfCCfgVariable* pVariable : Summaries.UsedVariables[i]) {
                pProcedure->appendUsedVariable(pVariable);
            }
        }
    }
}

} // namespace

void ZfCControlFlowGraph::collectVarDefsAndUses() {
    // Step 1: a node belongs to the procedure of its component, whatever its record says.
    leda::node_array<int> ComponentNum(*this);
    leda::array<ZfCCfgProcedure*> ComponentProc(leda::COMPONENTS(*this, ComponentNum));
    for (auto Item = m_Procedures.first_item(); Item; Item = m_Procedures.next_item(Item)) {
        ZfCCfgProcedure* pProcedure = m_Procedures.inf(Item);
        ComponentProc[ComponentNum[pProcedure->getEntryNode()]] = pProcedure;
    }
    SummaryCollector Collector;
    for (leda::node n = first_node(); n != stop_node(); n = next_node(n)) {
        ZfCBasicBlock* pBasicBlock = inf(n)->isBasicBlock();
        if (pBasicBlock == nullptr) {
            continue;
        }
        ZfCCfgProcedure* pProcedure = ComponentProc[ComponentNum[n]];
        // Step 2: the statements.
        for (ZfCCfgStatement* pStmt : pBasicBlock->getStatementSeq()) {
            collectStatement(Collector, m_Procedures, pStmt, pProcedure);
        }
        // Step 3: the branch condition.
        if (ZfCCfgExpression* pBranchCond = pBasicBlock->getBranchCond()) {
            Collector.use(pBranchCond->getUsedVariables(), pProcedure);
        }
    }
    // Step 4: what is called.
    addVarDefsAndUsesOfCalledProcs();
}

void ZfCControlFlowGraph::buildFunctionCallGraph(
    leda::graph& CallGraph, leda::map<leda::node, ZfCCfgProcedure*>& MappedProcedure) {
    // Step 1: a node for each procedure. The stamps of all nodes are brought up to date, for
    // step 2 goes by them.
    for (auto Item = m_Procedures.first_item(); Item; Item = m_Procedures.next_item(Item)) {
        ZfCCfgProcedure* pProcedure = m_Procedures.inf(Item);
        leda::node FcgNode = CallGraph.new_node();
        pProcedure->setFcgNode(FcgNode);
        MappedProcedure[FcgNode] = pProcedure;
        setProcedureAtNodes(pProcedure->getEntryNode(), pProcedure);
    }
    // Step 2: an edge for each call of another procedure.
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        ZfCBasicBlock* pBasicBlock = inf(v)->isBasicBlock();
        if (pBasicBlock == nullptr) {
            continue;
        }
        leda::node CallerNode = pBasicBlock->getProcedure()->getFcgNode();
        for (ZfCCfgStatement* pStmt : pBasicBlock->getStatementSeq()) {
            ZfCCfgProcedureCall* pCall = pStmt->isProcedureCall();
            if (pCall == nullptr) {
                continue;
            }
            leda::node CalleeNode =
                m_Procedures.inf(m_Procedures.lookup(pCall->getName()))->getFcgNode();
            if (CalleeNode == nullptr) {
                reportInternalError("ZfCControlFlowGraph", __LINE__);
            } else if (CalleeNode != CallerNode) {
                CallGraph.new_edge(CallerNode, CalleeNode);
            }
        }
    }
}

void ZfCControlFlowGraph::setProcedureAtNodes(leda::node StartNode, ZfCCfgProcedure* pProcedure) {
    // Step 1.
    leda::stack<leda::node> ProcedureNodesToExamine;
    ProcedureNodesToExamine.push(StartNode);
    // Step 2: the mark itself stops the walk. A node that is pushed twice costs one more look.
    while (!ProcedureNodesToExamine.empty()) {
        leda::node v = ProcedureNodesToExamine.pop();
        inf(v)->setProcedure(pProcedure);
        for (leda::edge e = first_adj_edge(v); e != nullptr; e = adj_succ(e)) {
            leda::node nextNode = target(e);
            if (inf(nextNode)->getProcedure() != pProcedure) {
                ProcedureNodesToExamine.push(nextNode);
            }
        }
    }
}

void ZfCControlFlowGraph::addVarDefsAndUsesOfCalledProcs() {
    // Step 1: the call graph and its components.
    leda::graph CallGraph;
    leda::map<leda::node, ZfCCfgProcedure*> MappedProcedure;
    buildFunctionCallGraph(CallGraph, MappedProcedure);
    leda::node_array<int> ComponentNum(CallGraph);
    int Count = leda::STRONG_COMPONENTS(CallGraph, ComponentNum);
    ComponentSummaries Summaries;
    Summaries.DefinedVariables = leda::array<VariableSet>(Count);
    Summaries.UsedVariables = leda::array<VariableSet>(Count);
    Summaries.ComponentNodes = leda::array<NodeSet>(Count);
    // Steps 2 and 3.
    gatherComponents(CallGraph, ComponentNum, MappedProcedure, Summaries);
    // Steps 4 and 5: the condensed graph has no cycle, so a walk from the leaves reaches all.
    compressComponents(CallGraph, Count, MappedProcedure, Summaries);
    deleteSelfLoops(CallGraph);
    // Steps 6 and 7.
    propagateSummaries(CallGraph, Count, Summaries);
    // Step 8.
    storeSummaries(Count, MappedProcedure, Summaries);
}
