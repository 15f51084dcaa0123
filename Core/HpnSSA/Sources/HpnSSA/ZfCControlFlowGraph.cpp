#include "ZfCControlFlowGraph.h"

#include "ZfCCfgVisitor.h"
#include "ZfCCfgVisitorSSA.h"

ZfCControlFlowGraph::ZfCControlFlowGraph() : m_StartNode(nullptr) {
}

ZfCControlFlowGraph::ZfCControlFlowGraph(ZfCControlFlowGraph const& Other) = default;

ZfCControlFlowGraph& ZfCControlFlowGraph::operator=(ZfCControlFlowGraph const& Other) = default;

// The records go first: nothing of them may be reached once the graph is being taken down.
ZfCControlFlowGraph::~ZfCControlFlowGraph() {
    ZfCCfgFactory::getInstance()->releaseAllMemory();
}

leda::node ZfCControlFlowGraph::getStartNode() {
    return m_StartNode;
}

void ZfCControlFlowGraph::setStartNode(leda::node StartNode) {
    m_StartNode = StartNode;
}

void ZfCControlFlowGraph::acceptStart(ZfCCfgVisitor* pVisitor) {
    if (auto* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor)) {
        pVisitorSSA->visitStart(this);
    }
}

void ZfCControlFlowGraph::acceptEnd(ZfCCfgVisitor* pVisitor) {
    if (auto* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor)) {
        pVisitorSSA->visitEnd(this);
    }
}
