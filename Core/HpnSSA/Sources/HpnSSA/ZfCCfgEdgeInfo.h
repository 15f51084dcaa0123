#ifndef ZFCCFGEDGEINFO_H
#define ZFCCFGEDGEINFO_H

#include "HpnSSAExport.h"
#include "LEDA/graph.h"
#include "ZfCModuleAllocation.h"

class ZfCCfgFactory;
class ZfCCfgFalseBranch;
class ZfCCfgTrueBranch;
class ZfCCfgVisitor;
class ZfCSSAEdge;

// The record on an edge of the graph. This class itself stands for plain control flow.
//
// Control flow edges and SSA edges share the graph: an edge is an SSA edge if and only if its
// record answers isSSAEdge(). Whoever means control flow has to skip such edges. Records are made
// and freed by the factory alone.
class HPNSSA_EXPORT ZfCCfgEdgeInfo {
    friend class ZfCCfgFactory;

public:
    // A client may copy a record with new and end the copy through the virtual destructor.
    HPNSSA_MODULE_BLOCKS

    // A copy bears the index of its source.
    ZfCCfgEdgeInfo(const ZfCCfgEdgeInfo&) = default;
    ZfCCfgEdgeInfo& operator=(const ZfCCfgEdgeInfo&) = default;

    // The record as one of these kinds, or null; all three are null for plain control flow.
    virtual ZfCCfgTrueBranch* isTrueBranch();
    virtual ZfCCfgFalseBranch* isFalseBranch();
    virtual ZfCSSAEdge* isSSAEdge();
    // Shows the edge to an SSA visitor.
    virtual void accept(ZfCCfgVisitor* pVisitor, leda::edge& Edge);
    virtual ~ZfCCfgEdgeInfo();

protected:
    // Not executable, with the next serial number.
    ZfCCfgEdgeInfo();

    // Renew a parked record with the next serial number; empty it for parking. Both make it not
    // executable.
    virtual void initData();
    virtual void resetData();

public:
    // Serial numbering starts at 0 again.
    static void boot() { s_GlobIndexCnt = 0; }

    // Whether constant propagation has found that control can pass here.
    bool isEdgeExecutable() { return m_IsExecutable; }
    void activateEdgeExecutable() { m_IsExecutable = true; }
    void deactivateEdgeExecutable() { m_IsExecutable = false; }

    // The serial number.
    unsigned int getIndex() { return m_Index; }

private:
    bool m_IsExecutable;
    unsigned int m_Index;

    static unsigned int s_GlobIndexCnt;
};

namespace leda {

// Order for sorting the edges of a graph: the unsigned difference of the indices read as int. Null
// is not handled.
inline int compare(ZfCCfgEdgeInfo* const& pLeft, ZfCCfgEdgeInfo* const& pRight) {
    return static_cast<int>(pLeft->getIndex() - pRight->getIndex());
}

} // namespace leda

#endif
