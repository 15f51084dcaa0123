#ifndef ZFCCFGNODEINFO_H
#define ZFCCFGNODEINFO_H

#include <cstdint>

#include "HpnSSAExport.h"
#include "LEDA/graph.h"
#include "LEDA/list.h"
#include "LEDA/set.h"
#include "ZfCCfgVariable.h"
#include "ZfCModuleAllocation.h"

class ZfCBasicBlock;
class ZfCCfgEntry;
class ZfCCfgExit;
class ZfCCfgFactory;
class ZfCCfgProcedure;

// The record on a node of the graph: what the entry node, the exit node and the basic block have in
// common.
//
// Records are made and freed by the factory alone; the graph only points at them, and a node that
// leaves the graph leaves its record behind. Immediate dominator, dominance frontier and procedure
// are valid as far as the pass that wrote them is: nothing renews them when the graph is edited.
class HPNSSA_EXPORT ZfCCfgNodeInfo {
    friend class ZfCCfgFactory;

public:
    // A client may copy a record with new and end the copy through the virtual destructor.
    HPNSSA_MODULE_BLOCKS

    // A copy bears the index of its source.
    ZfCCfgNodeInfo(const ZfCCfgNodeInfo&) = default;
    ZfCCfgNodeInfo& operator=(const ZfCCfgNodeInfo&) = default;

    // The record as one of the two kinds without code, or null.
    virtual ZfCCfgEntry* isEntryNode();
    virtual ZfCCfgExit* isExitNode();
    // The variables that the node assigns; one shared empty list for a node without code.
    virtual leda::list<ZfCCfgVariable*> const& getAssignedVariables();
    // The variables that the node uses.
    virtual leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables();
    // The record as a block of code, or null.
    virtual ZfCBasicBlock* isBasicBlock();
    virtual ~ZfCCfgNodeInfo() = 0;

protected:
    ZfCCfgNodeInfo();

    // Takes a new index and nothing else: it relies on resetData having run when the record was
    // parked.
    virtual void initData();
    // Empties the record for parking: no dominator, no frontier, no procedure.
    virtual void resetData();

public:
    // Serial numbering starts at 0 again.
    static void boot() { s_GlobIndexCnt = 0; }

    // The dominance frontier, which the record owns.
    leda::set<leda::node, leda::avl_tree>* getDF() { return &m_pDF; }

    // Written by ZfCControlFlowGraph::computeAllIdoms.
    void setIdom(leda::node Idom) { m_pIdom = Idom; }
    // The immediate dominator, null until it is computed.
    leda::node getIdom() { return m_pIdom; }

    // The passes write it for the nodes that they make, the transformation to SSA form for all.
    void setProcedure(ZfCCfgProcedure* pProcedure) { m_pProcedure = pProcedure; }
    // The procedure that holds the node; not owned.
    ZfCCfgProcedure* getProcedure() { return m_pProcedure; }

    // The serial number, as dumps show it.
    unsigned int getIndex() { return m_Index; }

private:
    leda::node m_pIdom;
    ZfCCfgProcedure* m_pProcedure;
    leda::set<leda::node, leda::avl_tree> m_pDF; // by value, whatever its name says
    unsigned int m_Index;

    static unsigned int s_GlobIndexCnt;
};

namespace leda {

// Order for sorting the nodes of a graph: the difference of the immediate dominators' handles, cut
// to int. Two records with the same immediate dominator are equal; the library itself never sorts
// by it, since it differs between runs.
inline int compare(ZfCCfgNodeInfo* const& pLeft, ZfCCfgNodeInfo* const& pRight) {
    return static_cast<int>(reinterpret_cast<std::uintptr_t>(pLeft->getIdom()) -
                            reinterpret_cast<std::uintptr_t>(pRight->getIdom()));
}

} // namespace leda

#endif
