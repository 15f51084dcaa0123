#ifndef ZFCCFGITERATORNODESEDGES_H
#define ZFCCFGITERATORNODESEDGES_H

#include "HpnSSAExport.h"
#include "ZfCModuleAllocation.h"

class ZfCCfgEdgeInfo;
class ZfCCfgNodeInfo;
class ZfCCfgOutputStatement;
class ZfCCfgParamStatement;
class ZfCCfgValueReturnStatement;
class ZfCCfgVisitor;
class ZfCControlFlowGraph;

// The fixed walk over a graph: all nodes in the graph's order, each with what stands on it, then
// all edges, SSA edges among them. Changes nothing; one walker serves any number of walks. The
// visitor is not owned.
class HPNSSA_EXPORT ZfCCfgIteratorNodesEdges {
public:
    HPNSSA_MODULE_BLOCKS

    // A walker for this visitor, which has to stay as long as walks are made. One that is no
    // ZfCCfgVisitorSSA sees nothing.
    explicit ZfCCfgIteratorNodesEdges(ZfCCfgVisitor* pVisitor);
    virtual ~ZfCCfgIteratorNodesEdges();

    // The whole walk.
    void iterate(ZfCControlFlowGraph* pCfg);
    // One node with its phi functions, statements and condition.
    void iterate(ZfCCfgNodeInfo* pNodeInfo);
    // The statements that do not show themselves by accept, with their variables and expressions.
    void iterate(ZfCCfgParamStatement* pStmt);
    void iterate(ZfCCfgValueReturnStatement* pStmt);
    void iterate(ZfCCfgOutputStatement* pStmt);
    // Nothing: edges are shown by the whole walk, which knows their handles.
    void iterate(ZfCCfgEdgeInfo* pEdgeInfo);

private:
    ZfCCfgVisitor* m_pVisitor;
};

#endif
