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

    // Before the variable of the statement; visitMiddle stands between it and the expression.
    virtual void visitStart(ZfCCfgValueReturnStatement* pStmt) = 0;
    // Before all nodes; and before the arguments of a parameter statement, the variable of an
    // output statement, the phi functions of a block.
    virtual void visitStart(ZfCControlFlowGraph* pCfg) = 0;
    virtual void visitStart(ZfCCfgParamStatement* pStmt) = 0;
    virtual void visitStart(ZfCCfgOutputStatement* pStmt) = 0;
    virtual void visitStart(ZfCBasicBlock* pBasicBlock) = 0;
    // Behind all edges; behind the last argument; behind the condition of a block, or behind its
    // last statement where it has none.
    virtual void visitEnd(ZfCControlFlowGraph* pCfg) = 0;
    virtual void visitEnd(ZfCCfgParamStatement* pStmt) = 0;
    virtual void visitEnd(ZfCBasicBlock* pBasicBlock) = 0;
    // Between the last statement of a block and its condition; for blocks with a condition only.
    virtual void visitBeforeCondition(ZfCBasicBlock* pBasicBlock) = 0;
    // Reached only by who calls it: a version shows itself as a variable.
    virtual void visit(ZfCSSAVariable* pVariable) = 0;
    // A variable that a statement or an expression shows.
    virtual void visit(ZfCCfgVariable* pVariable) = 0;
    // An expression; the last form for those of the client, unless its class shows itself
    // otherwise.
    virtual void visit(ZfCCfgValueExpression* pExpression) = 0;
    virtual void visit(ZfCCfgExplicitVarUse* pExpression) = 0;
    virtual void visit(ZfCCfgExpression* pExpression) = 0;
    // A phi function or a statement of that kind. Its variables and expressions are not shown one
    // by one: the visitor asks for them.
    virtual void visit(ZfCPhiFunction* pPhiFunction) = 0;
    virtual void visit(ZfCCfgProcedureCall* pCall) = 0;
    virtual void visit(ZfCCfgExternCall* pCall) = 0;
    virtual void visit(ZfCCfgInitAssignment* pAssignment) = 0;
    // An edge: its record, which tells of what kind it is, and its handle in the graph.
    virtual void visit(ZfCSSAEdge* pEdgeInfo, leda::edge& Edge) = 0;
    virtual void visit(ZfCCfgEdgeInfo* pEdgeInfo, leda::edge& Edge) = 0;
    virtual void visit(ZfCCfgFalseBranch* pEdgeInfo, leda::edge& Edge) = 0;
    virtual void visit(ZfCCfgTrueBranch* pEdgeInfo, leda::edge& Edge) = 0;
    // The nodes that bound a procedure.
    virtual void visit(ZfCCfgExit* pNodeInfo) = 0;
    virtual void visit(ZfCCfgEntry* pNodeInfo) = 0;
    // Called behind every argument of a parameter statement, the last one too.
    virtual void addSeperatorVariable() = 0;
    // Between the variable of a value return statement and its expression.
    virtual void visitMiddle(ZfCCfgValueReturnStatement* pStmt) = 0;

protected:
    // Takes the next serial number.
    ZfCCfgVisitorSSA();

    // The serial number.
    unsigned int getIndex() { return m_Index; }

private:
    unsigned int m_Index;

    static unsigned int s_GlobIndexCnt;
};

#endif
