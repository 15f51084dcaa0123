#ifndef ZFCCFGVISITORSSA_H
#define ZFCCFGVISITORSSA_H

#include "HpnSSAExport.h"
#include "LEDA/graph.h"
#include "ZfCCfgVisitor.h"

class ZfCBasicBlock;
class ZfCCfgEdgeInfo;
class ZfCCfgEntry;
class ZfCCfgExit;
class ZfCCfgExplicitVarUse;
class ZfCCfgExpression;
class ZfCCfgExternCall;
class ZfCCfgFalseBranch;
class ZfCCfgInitAssignment;
class ZfCCfgOutputStatement;
class ZfCCfgParamStatement;
class ZfCCfgProcedureCall;
class ZfCCfgTrueBranch;
class ZfCCfgValueExpression;
class ZfCCfgValueReturnStatement;
class ZfCCfgVariable;
class ZfCControlFlowGraph;
class ZfCPhiFunction;
class ZfCSSAEdge;
class ZfCSSAVariable;

// What a visitor is told of a graph: one operation for each kind of object, in the order of
// ZfCCfgIteratorNodesEdges.
//
// A visitor derives from ZfCCfgVisitor and from this class. It has a serial number that runs for
// the life of the process and is never reset, so that the files of successive dumps bear different
// names.
class HPNSSA_EXPORT ZfCCfgVisitorSSA {
public:
    virtual ~ZfCCfgVisitorSSA();

    virtual void visitStart(ZfCCfgValueReturnStatement* pStmt) = 0;
    virtual void visitStart(ZfCControlFlowGraph* pCfg) = 0;
    virtual void visitStart(ZfCCfgParamStatement* pStmt) = 0;
    virtual void visitStart(ZfCCfgOutputStatement* pStmt) = 0;
    virtual void visitStart(ZfCBasicBlock* pBasicBlock) = 0;
    virtual void visitEnd(ZfCControlFlowGraph* pCfg) = 0;
    virtual void visitEnd(ZfCCfgParamStatement* pStmt) = 0;
    virtual void visitEnd(ZfCBasicBlock* pBasicBlock) = 0;
    virtual void visitBeforeCondition(ZfCBasicBlock* pBasicBlock) = 0;
    // Reached only by who calls it: a version shows itself as a variable.
    virtual void visit(ZfCSSAVariable* pVariable) = 0;
    virtual void visit(ZfCCfgVariable* pVariable) = 0;
    virtual void visit(ZfCCfgValueExpression* pExpression) = 0;
    virtual void visit(ZfCCfgExplicitVarUse* pExpression) = 0;
    virtual void visit(ZfCCfgExpression* pExpression) = 0;
    virtual void visit(ZfCPhiFunction* pPhiFunction) = 0;
    virtual void visit(ZfCCfgProcedureCall* pCall) = 0;
    virtual void visit(ZfCCfgExternCall* pCall) = 0;
    virtual void visit(ZfCCfgInitAssignment* pAssignment) = 0;
    virtual void visit(ZfCSSAEdge* pEdgeInfo, leda::edge& Edge) = 0;
    virtual void visit(ZfCCfgEdgeInfo* pEdgeInfo, leda::edge& Edge) = 0;
    virtual void visit(ZfCCfgFalseBranch* pEdgeInfo, leda::edge& Edge) = 0;
    virtual void visit(ZfCCfgTrueBranch* pEdgeInfo, leda::edge& Edge) = 0;
    virtual void visit(ZfCCfgExit* pNodeInfo) = 0;
    virtual void visit(ZfCCfgEntry* pNodeInfo) = 0;
    // Called behind every argument of a parameter statement, the last one too.
    virtual void addSeperatorVariable() = 0;
    virtual void visitMiddle(ZfCCfgValueReturnStatement* pStmt) = 0;

protected:
    ZfCCfgVisitorSSA();

    // The serial number.
    unsigned int getIndex() { return m_Index; }

private:
    unsigned int m_Index;

    static unsigned int s_GlobIndexCnt;
};

#endif
