#ifndef ZFCCFGPROCEDURE_H
#define ZFCCFGPROCEDURE_H

#include "HpnSSAExport.h"
#include "LEDA/graph.h"
#include "LEDA/list.h"
#include "LEDA/set.h"
#include "WqCXString.h"
#include "ZfCBasicBlock.h"
#include "ZfCCfgParamStatement.h"
#include "ZfCCfgProcedureCall.h"
#include "ZfCCfgValueReturnStatement.h"
#include "ZfCCfgVariable.h"

class ZfCCfgFactory;

// A procedure of the program, that is one connected component of the graph: its entry and exit
// nodes, its calls and what it and its callees define and use.
//
// Procedures stand in the graph's dictionary by name, and calls find them there. Made and freed by
// the factory alone; nothing that it lists is owned. The containers are given out as copies.
class HPNSSA_EXPORT ZfCCfgProcedure {
    friend class ZfCCfgFactory;

public:
    ZfCCfgProcedure(const ZfCCfgProcedure&) = default;
    ZfCCfgProcedure& operator=(const ZfCCfgProcedure&) = default;

    // Serial numbering starts at 0 again.
    static void boot() { s_GlobIndexCnt = 0; }

    // The name; "#main" for the main procedure.
    WqCXString getName() { return m_Name; }
    void setName(WqCXString Name) { m_Name = Name; }

    // The two nodes that bound it; null until the graph makes them. Neither is owned.
    leda::node getEntryNode() { return m_pEntryNode; }
    void setEntryNode(leda::node EntryNode) { m_pEntryNode = EntryNode; }
    leda::node getExitNode() { return m_pExitNode; }
    void setExitNode(leda::node ExitNode) { m_pExitNode = ExitNode; }
    // The node in the function call graph, valid only while that exists.
    leda::node getFcgNode() { return m_pFcgNode; }
    void setFcgNode(leda::node FcgNode) { m_pFcgNode = FcgNode; }

    // The calls of this procedure.
    leda::list<ZfCCfgProcedureCall*> getCalls() { return m_Calls; }
    // Enters a call; one that is marked makes the procedure callable from outside for good.
    void appendCall(ZfCCfgProcedureCall* pCall);

    // The variables that it or a callee defines or uses.
    leda::set<ZfCCfgVariable*, leda::avl_tree> getDefinedVariables() { return m_DefinedVariables; }
    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() { return m_UsedVariables; }
    void appendDefinedVariable(ZfCCfgVariable* pVariable) { m_DefinedVariables.insert(pVariable); }
    void appendUsedVariable(ZfCCfgVariable* pVariable) { m_UsedVariables.insert(pVariable); }

    // The definitions at its entry, one for each variable that a call hands over.
    leda::list<ZfCCfgParamStatement*> getParamStatements() { return m_ParamStatements; }
    // Enters a definition at the entry. The factory owns it.
    void appendParamStatement(ZfCCfgParamStatement* pStmt) { m_ParamStatements.append(pStmt); }
    // The value return statements of all calls of this procedure.
    leda::list<ZfCCfgValueReturnStatement*> getValueReturnStatements() {
        return m_ValueReturnStatements;
    }
    // Enters a definition behind a call of this procedure. The factory owns it.
    void appendValueReturnStatement(ZfCCfgValueReturnStatement* pStmt) {
        m_ValueReturnStatements.append(pStmt);
    }

    // Whether it can be called from outside the generated code, as far as its calls tell.
    bool isDirectlyOrIndirectlyCallableFromOutside() { return m_IsCallableFromOutside; }

    // The number of the object's first life, by which sets are ordered.
    int getDebugIndex() { return m_DebugIndex; }

    // For reuse by the factory: a new index, no nodes, no flag; and emptied for parking, where
    // debug index and nodes stay.
    void initData();
    void resetData();

private:
    ZfCCfgProcedure();
    ~ZfCCfgProcedure();

    unsigned int m_Index;
    int m_DebugIndex; // written by the constructor alone
    WqCXString m_Name;
    leda::node m_pEntryNode;
    leda::node m_pExitNode;
    leda::node m_pFcgNode;
    leda::list<ZfCCfgProcedureCall*> m_Calls;
    leda::list<ZfCBasicBlock*> m_BasicBlocks; // kept for the record's layout; no operation fills it
    leda::set<ZfCCfgVariable*, leda::avl_tree> m_DefinedVariables;
    leda::set<ZfCCfgVariable*, leda::avl_tree> m_UsedVariables;
    leda::list<ZfCCfgParamStatement*> m_ParamStatements;
    leda::list<ZfCCfgValueReturnStatement*> m_ValueReturnStatements;
    bool m_IsCallableFromOutside;

    static unsigned int s_GlobIndexCnt;
};

namespace leda {

// Order of sets of procedures: null first, then by debug index.
inline int compare(ZfCCfgProcedure* const& pLeft, ZfCCfgProcedure* const& pRight) {
    if (pLeft == pRight)
        return 0;
    if (pLeft == nullptr || pRight == nullptr)
        return pLeft == nullptr ? -1 : 1;
    const int Left = pLeft->getDebugIndex();
    const int Right = pRight->getDebugIndex();
    return (Left > Right) - (Left < Right);
}

} // namespace leda

#endif
