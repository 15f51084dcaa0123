// The frames of procedures: entry nodes, exit nodes and the loop around "#main".
//
// The loop makes the values at the end of one pass through "#main" the values at the start of
// the next visible to SSA form: phi functions at its head merge the initial value with the last
// pass's, so that a variable is constant only if both are.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"

leda::node ZfCControlFlowGraph::demandProcedureEntryNode(WqCXString Name,
                                                         ZfCCfgProcedure*& pProcedure) {
    auto Item = m_Procedures.lookup(Name);
    if (Item) {
        pProcedure = m_Procedures.inf(Item);
        return pProcedure->getEntryNode();
    }
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    ZfCCfgEntry* pEntry = pFactory->createEntryNode();
    leda::node EntryNode = new_node(pEntry);
    pProcedure = pFactory->createProcedure();
    pProcedure->setName(Name);
    pProcedure->setEntryNode(EntryNode);
    pEntry->setProcedure(pProcedure);
    m_Procedures.insert(Name, pProcedure);
    return EntryNode;
}

void ZfCControlFlowGraph::placeExitNodes() {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    // Step 1: the components, before there is any new node.
    leda::node_array<int> ComponentNum(*this);
    int Count = leda::COMPONENTS(*this, ComponentNum);
    leda::array<leda::node> ComponentExitNode(Count);
    // Step 2: an exit node for each of them.
    for (int i = 0; i < Count; ++i) {
        ComponentExitNode[i] = new_node(pFactory->createExitNode());
    }
    // Step 3: every open end leads there. Only edges are made here, so the live list will do.
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        if (outdeg(v) == 0 && inf(v)->isExitNode() == nullptr) {
            new_edge(v, ComponentExitNode[ComponentNum[v]], pFactory->createEdgeInfo());
        }
    }
    // Step 4: procedure and exit node know each other. An endless loop leaves the exit node
    // without in-edges.
    for (auto Item = m_Procedures.first_item(); Item; Item = m_Procedures.next_item(Item)) {
        ZfCCfgProcedure* pProcedure = m_Procedures.inf(Item);
        leda::node ExitNode = ComponentExitNode[ComponentNum[pProcedure->getEntryNode()]];
        inf(ExitNode)->setProcedure(pProcedure);
        pProcedure->setExitNode(ExitNode);
    }
}

void ZfCControlFlowGraph::placeLoopAroundMain() {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    // Step 1: the frame of "#main".
    ZfCCfgProcedure* pProcedure = m_Procedures.inf(m_Procedures.lookup("#main"));
    leda::node EntryNode = pProcedure->getEntryNode();
    leda::node ExitNode = pProcedure->getExitNode();
    ZF_ASSERT(outdeg(EntryNode) == 1);
    // Step 2: the head of the loop.
    leda::node FirstNode = target(first_adj_edge(EntryNode));
    // Step 3: the loop's condition has no known value, so neither way out can be ruled out.
    ZfCBasicBlock* pBasicBlock = pFactory->createBasicBlock();
    pBasicBlock->setProcedure(pProcedure);
    pBasicBlock->appendBranch(pFactory->createValueExpression());
    leda::node w = new_node(pBasicBlock);
    // Step 4: everything that ended now comes to the condition.
    for (leda::edge e : in_edges(ExitNode)) {
        move_edge(e, source(e), w);
    }
    // Step 5: around once more, or out.
    new_edge(w, FirstNode, pFactory->createTrueBranch());
    new_edge(w, ExitNode, pFactory->createFalseBranch());
}
