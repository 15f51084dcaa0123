// Structure edits and the consistency check.
//
// A node is cut at two levels: the block divides its contents, the graph its node and edges.
// Edges are never made anew where they can be moved: a moved edge keeps its record, and with it
// its true or false meaning, and the in-edges of a node keep their order, on which the operand
// positions of phi functions hang.
//
// Every edit is linear in the edges of the node it touches.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"

namespace {

// A block of its own for one item of the block of x, on a new node.
leda::node newItemNode(ZfCControlFlowGraph& Graph, ZfCCfgProcedure* pProcedure,
                       leda::list<leda::node>& NodeList, ZfCBasicBlock*& pNewBlock) {
    pNewBlock = ZfCCfgFactory::getInstance()->createBasicBlock();
    pNewBlock->setProcedure(pProcedure);
    leda::node pNewNode = Graph.new_node(pNewBlock);
    NodeList.append(pNewNode);
    return pNewNode;
}

// One node for each phi function, statement and condition of the block, in this order. The block
// keeps its lists, so they are walked as they stand.
void makeItemNodes(ZfCControlFlowGraph& Graph, ZfCBasicBlock* pBlock,
                   leda::list<leda::node>& NodeList) {
    ZfCCfgProcedure* pProcedure = pBlock->getProcedure();
    ZfCBasicBlock* pNewBlock = nullptr;
    for (ZfCPhiFunction* pPhi : pBlock->getPhiFunctions()) {
        newItemNode(Graph, pProcedure, NodeList, pNewBlock);
        pNewBlock->append(pPhi);
    }
    for (ZfCCfgStatement* pStmt : pBlock->getStatementSeq()) {
        newItemNode(Graph, pProcedure, NodeList, pNewBlock);
        pNewBlock->append(pStmt);
    }
    if (ZfCCfgExpression* pBranchCond = pBlock->getBranchCond()) {
        newItemNode(Graph, pProcedure, NodeList, pNewBlock);
        pNewBlock->appendBranch(pBranchCond);
    }
}

void chainNodes(ZfCControlFlowGraph& Graph, leda::list<leda::node> const& NodeList) {
    leda::node pLast = nullptr;
    for (leda::node v : NodeList) {
        if (pLast != nullptr) {
            Graph.new_edge(pLast, v, ZfCCfgFactory::getInstance()->createEdgeInfo());
        }
        pLast = v;
    }
}

void moveInEdges(ZfCControlFlowGraph& Graph, leda::node From, leda::node To) {
    leda::edge pNext = nullptr;
    for (leda::edge e = Graph.first_in_edge(From); e != nullptr; e = pNext) {
        pNext = Graph.in_succ(e);
        Graph.move_edge(e, Graph.source(e), To);
    }
}

void moveOutEdges(ZfCControlFlowGraph& Graph, leda::node From, leda::node To) {
    leda::edge pNext = nullptr;
    for (leda::edge e = Graph.first_adj_edge(From); e != nullptr; e = pNext) {
        pNext = Graph.adj_succ(e);
        Graph.move_edge(e, To, Graph.target(e));
    }
}

// Hangs the second half of a cut block behind v: it takes over the out-edges.
leda::node appendSecondHalf(ZfCControlFlowGraph& Graph, leda::node v, ZfCBasicBlock* pNewBlock) {
    leda::node w = Graph.new_node(pNewBlock);
    moveOutEdges(Graph, v, w);
    Graph.new_edge(v, w, ZfCCfgFactory::getInstance()->createEdgeInfo());
    return w;
}

// The call at the end of a block; null if it ends otherwise.
ZfCCfgProcedureCall* callAtEnd(ZfCBasicBlock* pBlock) {
    leda::list<ZfCCfgStatement*> const& StmtList = pBlock->getStatementSeq();
    return StmtList.empty() ? nullptr : StmtList.back()->isProcedureCall();
}

} // namespace

leda::node ZfCControlFlowGraph::splitAtStatement(leda::node v, ZfCCfgStatement* pStmt) {
    // Step 1: the block of v.
    ZfCCfgNodeInfo* pInf = inf(v);
    if (pInf == nullptr) {
        reportInternalError("ZfCControlFlowGraph", __LINE__);
        return v;
    }
    ZfCBasicBlock* pBasicBlock = pInf->isBasicBlock();
    if (pBasicBlock == nullptr) {
        reportInternalError("ZfCControlFlowGraph", __LINE__);
        return v;
    }
    // Step 2: its contents divide.
    ZfCBasicBlock* pNewBlock = pBasicBlock->splitAtStatement(pStmt);
    if (pNewBlock == pBasicBlock) {
        return v;
    }
    // Steps 3 and 4: the node divides.
    return appendSecondHalf(*this, v, pNewBlock);
}

leda::node ZfCControlFlowGraph::splitAtCondition(leda::node v) {
    // Step 1: the block of v.
    ZfCCfgNodeInfo* pInf = inf(v);
    if (pInf == nullptr) {
        reportInternalError("ZfCControlFlowGraph", __LINE__);
        return v;
    }
    ZfCBasicBlock* pBasicBlock = pInf->isBasicBlock();
    if (pBasicBlock == nullptr) {
        reportInternalError("ZfCControlFlowGraph", __LINE__);
        return v;
    }
    // Step 2: its contents divide.
    ZfCBasicBlock* pNewBlock = pBasicBlock->splitAtCondition();
    if (pNewBlock == pBasicBlock) {
        return v;
    }
    // Steps 3 and 4: the node divides.
    return appendSecondHalf(*this, v, pNewBlock);
}

leda::node ZfCControlFlowGraph::findBranchNode(leda::node v, ZfCCfgExpression* pCondition) {
    leda::node x = v;
    for (;;) {
        // Step 1: the block of x.
        ZfCBasicBlock* pBasicBlock = inf(x)->isBasicBlock();
        if (pBasicBlock == nullptr) {
            reportInternalError("ZfCControlFlowGraph", __LINE__);
            return nullptr;
        }
        ZfCCfgExpression* pBranch = pBasicBlock->getBranchCond();
        // Step 2: along the straight path.
        while (pBranch == nullptr && outdeg(x) == 1) {
            x = target(first_adj_edge(x));
            pBasicBlock = inf(x)->isBasicBlock();
            if (pBasicBlock == nullptr) {
                reportInternalError("ZfCControlFlowGraph", __LINE__);
                return nullptr;
            }
            pBranch = pBasicBlock->getBranchCond();
        }
        // Step 3: the first branch on the path has to be the one that is looked for.
        if (pBranch != nullptr) {
            if (pBranch != pCondition) {
                reportInternalError("ZfCControlFlowGraph", __LINE__);
            }
            return x;
        }
        // Step 4: without a branch the path goes on in the procedure that is called at its end.
        if (outdeg(x) != 0) {
            reportInternalError("ZfCControlFlowGraph", __LINE__);
        }
        ZfCCfgProcedureCall* pCall = callAtEnd(pBasicBlock);
        if (pCall == nullptr) {
            reportInternalError("ZfCControlFlowGraph", __LINE__);
            return nullptr;
        }
        leda::node EntryNode =
            m_Procedures.inf(m_Procedures.lookup(pCall->getName()))->getEntryNode();
        x = target(first_adj_edge(EntryNode));
    }
}

void ZfCControlFlowGraph::divideBasicBlock() {
    // The nodes made here come behind the last one and are not visited.
    int Left = number_of_nodes();
    leda::list<leda::node> NodeList;
    leda::node pNext = nullptr;
    for (leda::node x = first_node(); Left > 0; x = pNext, --Left) {
        pNext = next_node(x);
        ZfCBasicBlock* pBlock = inf(x)->isBasicBlock();
        if (pBlock == nullptr) {
            continue;
        }
        // Steps 1 to 4: a node for each item.
        NodeList.clear();
        makeItemNodes(*this, pBlock, NodeList);
        // Step 7: a block without contents stays.
        if (NodeList.empty()) {
            continue;
        }
        // Step 5: the new nodes form a chain.
        chainNodes(*this, NodeList);
        // Step 6: the chain takes the place of x. An edge from x to itself is moved twice.
        moveInEdges(*this, x, NodeList.front());
        moveOutEdges(*this, x, NodeList.back());
        del_node(x);
    }
}

bool ZfCControlFlowGraph::checkConsistency() {
    // Step 1: the counts decide the result.
    leda::node_array<int> ComponentNum(*this);
    int Count = leda::COMPONENTS(*this, ComponentNum);
    if (Count != m_Procedures.size()) {
        return false;
    }
    if (!ShowInternalInfo()) {
        return true;
    }
    // Step 2: the rules for each component. The nodes are sorted by component first, so that the
    // check does not take procedures times nodes.
    leda::array<leda::list<leda::node>> ComponentNodes(Count);
    for (leda::node v : all_nodes()) {
        ComponentNodes[ComponentNum[v]].append(v);
    }
    for (auto Item = m_Procedures.first_item(); Item; Item = m_Procedures.next_item(Item)) {
        ZfCCfgProcedure* pProcedure = m_Procedures.inf(Item);
        leda::node EntryNode = pProcedure->getEntryNode();
        ZF_ASSERT(indeg(EntryNode) == 0);
        for (leda::node v : ComponentNodes[ComponentNum[EntryNode]]) {
            ZfCCfgNodeInfo* pInf = inf(v);
            ZF_ASSERT(pInf->getProcedure() == pProcedure);
            if (indeg(v) == 0) {
                ZF_ASSERT(v == EntryNode);
            }
        }
    }
    // Step 3.
    return true;
}
