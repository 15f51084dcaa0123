#ifndef ZFCCFGFACTORY_H
#define ZFCCFGFACTORY_H

#include "HpnSSAExport.h"
#include "LEDA/dictionary.h"
#include "LEDA/graph.h"
#include "LEDA/list.h"
#include "ZfCBasicBlock.h"
#include "ZfCCfgAssignment.h"
#include "ZfCCfgEdgeInfo.h"
#include "ZfCCfgEntry.h"
#include "ZfCCfgExit.h"
#include "ZfCCfgExplicitVarUse.h"
#include "ZfCCfgExpression.h"
#include "ZfCCfgExternCall.h"
#include "ZfCCfgFalseBranch.h"
#include "ZfCCfgInitAssignment.h"
#include "ZfCCfgNodeInfo.h"
#include "ZfCCfgOutputStatement.h"
#include "ZfCCfgParamStatement.h"
#include "ZfCCfgProcedure.h"
#include "ZfCCfgProcedureCall.h"
#include "ZfCCfgStatement.h"
#include "ZfCCfgTrueBranch.h"
#include "ZfCCfgValue.h"
#include "ZfCCfgValueExpression.h"
#include "ZfCCfgValueReturnStatement.h"
#include "ZfCCfgVariable.h"
#include "ZfCPhiFunction.h"
#include "ZfCSSAEdge.h"
#include "ZfCSSAVariable.h"

// Owner of nearly all objects of the intermediate code: one for the process, from
// ZfCSSAControl::boot to shutdown.
//
// Node records, edge records, procedures, versions of variables and the library's own expressions
// are made by a create operation and given back by a del operation, which resets and parks them;
// the next create operation of that class takes the longest parked one and renews it. Statements,
// whose classes may be the client's, enter themselves when they are built and are destroyed when
// given back, as are node lists. A client's expressions enter by addSFExpression; a client's
// variables are never the factory's. releaseAllMemory, which the end of a graph runs, frees
// everything.
//
// Costs: a create, del or entry costs one dictionary operation, O(log n); nothing is ever looked up
// in a pass. A del operation does not check that the object is live: giving back twice parks twice.
class HPNSSA_EXPORT ZfCCfgFactory {
public:
    ZfCCfgFactory(const ZfCCfgFactory&) = delete;
    ZfCCfgFactory& operator=(const ZfCCfgFactory&) = delete;

    // Makes a new factory; an earlier one that was not shut down is abandoned with all it owns.
    static void boot();
    // Ends the factory, if there is one.
    static void shutdown();
    // The factory, null before boot and after shutdown.
    static ZfCCfgFactory* getInstance() { return m_pCfgFactory; }

    // Create operations: the object is the factory's. Null only if there is no memory.
    ZfCBasicBlock* createBasicBlock();
    ZfCCfgEntry* createEntryNode();
    ZfCCfgExit* createExitNode();
    ZfCCfgProcedure* createProcedure();
    ZfCCfgEdgeInfo* createEdgeInfo();
    ZfCCfgTrueBranch* createTrueBranch();
    ZfCCfgFalseBranch* createFalseBranch();
    ZfCSSAEdge* createSSAEdge();
    // A version of pVariable or, when that is a version itself, of the variable behind it.
    ZfCSSAVariable* createSSAVariable(ZfCCfgVariable* pVariable);
    // EvalToNonConst: nothing may be assumed about the value.
    ZfCCfgExplicitVarUse* createExplicitVarUse();
    ZfCCfgExplicitVarUse* createExplicitVarUse(bool EvalToNonConst);
    // Undetermined without a value.
    ZfCCfgValueExpression* createValueExpression();
    ZfCCfgValueExpression* createValueExpression(ZfCCfgValue const& Value);
    leda::list<leda::node>* createLedaList_Node();

    // Take over a client's expression, and a statement; the statement's base constructor calls the
    // latter itself.
    void addSFExpression(ZfCCfgExpression* pExpression);
    void addNewStatement(ZfCCfgStatement* pStatement);

    // Give an object back: it is reset and parked.
    void delBasicBlock(ZfCBasicBlock* pBasicBlock);
    void delEntryNode(ZfCCfgEntry* pEntry);
    void delExitNode(ZfCCfgExit* pExit);
    // Gives a record back by its class; one of another class is left alone.
    void delNodeInfo(ZfCCfgNodeInfo* pNodeInfo);
    void delProcedure(ZfCCfgProcedure* pProcedure);
    void delEdgeInfo(ZfCCfgEdgeInfo* pEdgeInfo);
    void delSSAVariable(ZfCSSAVariable* pVariable);
    void delValueExpression(ZfCCfgValueExpression* pExpression);
    void delExplicitVarUse(ZfCCfgExplicitVarUse* pExpression);
    // Hands a client's expression back to the client; it is not destroyed.
    void delSFExpression(ZfCCfgExpression* pExpression);
    // Destroy the object; null is allowed.
    void delLedaList_Node(leda::list<leda::node>* pList);
    void delStatement(ZfCCfgStatement* pStatement);

    // Free all objects of a kind, live ones and parked ones; of edge records the live ones only.
    void releaseAllNodes();
    void releaseAllProcedures();
    void releaseAllEdgeInfos();
    void releaseAllVariables();
    void releaseAllExpressions();
    void releaseAllLedaList_Node();
    void releaseAllStatements();
    // All of these: expressions, node lists, variables, nodes, edges, procedures, statements.
    void releaseAllMemory();

    // Key orders of the dictionaries: by address, 1, 0 or -1.
    static int comparePointerNodeInfo(ZfCCfgNodeInfo* const& pLeft, ZfCCfgNodeInfo* const& pRight);
    static int comparePointerEdgeInfo(ZfCCfgEdgeInfo* const& pLeft, ZfCCfgEdgeInfo* const& pRight);
    static int comparePointerProcedure(ZfCCfgProcedure* const& pLeft,
                                       ZfCCfgProcedure* const& pRight);
    static int comparePointerExpression(ZfCCfgExpression* const& pLeft,
                                        ZfCCfgExpression* const& pRight);
    static int comparePointerVariable(ZfCCfgVariable* const& pLeft, ZfCCfgVariable* const& pRight);
    static int comparePointerLedaList_Node(leda::list<leda::node>* const& pLeft,
                                           leda::list<leda::node>* const& pRight);

private:
    ZfCCfgFactory();
    ~ZfCCfgFactory();

    static ZfCCfgFactory* m_pCfgFactory;

    // Live objects, keyed by themselves, and parked ones, the longest parked in front.
    leda::dictionary<ZfCCfgNodeInfo*, ZfCCfgNodeInfo*, leda::ab_tree> m_NodeInfos;
    leda::list<ZfCBasicBlock*> m_FreeBasicBlocks;
    leda::list<ZfCCfgEntry*> m_FreeEntryNodes;
    leda::list<ZfCCfgExit*> m_FreeExitNodes;
    leda::dictionary<ZfCCfgProcedure*, ZfCCfgProcedure*, leda::ab_tree> m_Procedures;
    leda::list<ZfCCfgProcedure*> m_FreeProcedures;
    leda::dictionary<ZfCCfgEdgeInfo*, ZfCCfgEdgeInfo*, leda::ab_tree> m_EdgeInfos;
    leda::list<ZfCCfgEdgeInfo*> m_FreeEdgeInfos;
    leda::list<ZfCCfgTrueBranch*> m_FreeTrueBranches;
    leda::list<ZfCCfgFalseBranch*> m_FreeFalseBranches;
    leda::list<ZfCSSAEdge*> m_FreeSSAEdges;
    leda::dictionary<ZfCCfgVariable*, ZfCCfgVariable*, leda::ab_tree> m_SSAVariables;
    leda::list<ZfCSSAVariable*> m_FreeSSAVariables;
    leda::dictionary<ZfCCfgExpression*, ZfCCfgExpression*, leda::ab_tree> m_Expressions;
    leda::list<ZfCCfgValueExpression*> m_FreeValueExpressions;
    leda::list<ZfCCfgExplicitVarUse*> m_FreeExplicitVarUses;
    leda::dictionary<leda::list<leda::node>*, leda::list<leda::node>*, leda::ab_tree> m_NodeLists;
    leda::dictionary<ZfCCfgStatement*, ZfCCfgStatement*, leda::ab_tree> m_Statements;
};

#endif
