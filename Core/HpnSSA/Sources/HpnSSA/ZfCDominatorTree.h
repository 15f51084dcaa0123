#ifndef ZFCDOMINATORTREE_H
#define ZFCDOMINATORTREE_H

#include "HpnSSAExport.h"
#include "LEDA/graph.h"
#include "ZfCCfgEdgeInfo.h"
#include "ZfCModuleAllocation.h"

// The dominator tree of one procedure.
//
// Each node of the tree carries the node of the control flow graph that it stands for; an edge
// leads from a node to each node that it immediately dominates and carries no record. The tree
// owns its own nodes and edges and nothing else: the nodes that it names belong to the graph.
//
// A tree is valid as long as the graph on which it was built is not edited. The library builds
// one for each procedure and frees them within one transformation to SSA form, so the factory
// never knows them. Children come in the node order of the graph.
class HPNSSA_EXPORT ZfCDominatorTree : public leda::GRAPH<leda::node, ZfCCfgEdgeInfo*> {
public:
    HPNSSA_MODULE_BLOCKS

    // An empty tree without a root.
    ZfCDominatorTree();

    // The copy has nodes of its own; its root still names a node of the tree that was copied.
    ZfCDominatorTree(ZfCDominatorTree const& Other);
    ZfCDominatorTree& operator=(ZfCDominatorTree const& Other);

    ~ZfCDominatorTree() override;

    // The tree node of the procedure's entry; null until it is set.
    leda::node getRoot();
    void setRoot(leda::node Root);

private:
    leda::node m_pRoot; // a node of this tree
};

#endif
