#ifndef ZFCCFGVISITORSSADOT_H
#define ZFCCFGVISITORSSADOT_H

#include <fstream>
#include <ostream>

#include "HpnSSAExport.h"
#include "LEDA/graph.h"
#include "LEDA/set.h"
#include "WqCXString.h"
#include "ZfCCfgStatement.h"
#include "ZfCCfgValue.h"
#include "ZfCCfgVariable.h"
#include "ZfCCfgVisitor.h"
#include "ZfCCfgVisitorSSA.h"
#include "ZfCModuleAllocation.h"

class ZfCCfgAssignment;

// Writes a graph as a Graphviz DOT file, each basic block as a record that lists its statements,
// and on demand an HTML table of the variables that the dump showed.
//
// Use: openFile, a walk of ZfCCfgIteratorNodesEdges, closeFile, then printAllVariables. A client
// derives its own dump from it to print its assignments and expressions; the protected operations
// and the stream are for that. A file that cannot be opened swallows the output without a report.
// Doubles are written in the stream's default format.
class HPNSSA_EXPORT ZfCCfgVisitorSSADot : public ZfCCfgVisitor, public ZfCCfgVisitorSSA {
public:
    HPNSSA_MODULE_BLOCKS

    // Without a graph only nodes can be visited, no edges; SSA edges are on, the simple form is
    // off.
    ZfCCfgVisitorSSADot();
    // PrintSSAEdges: whether SSA edges are written. SimpleOutput: without markers of variables and
    // without the numbers of values that are not constant. The graph is not owned.
    ZfCCfgVisitorSSADot(ZfCControlFlowGraph* pCfg, bool PrintSSAEdges, bool SimpleOutput);
    ~ZfCCfgVisitorSSADot() override;

    // The start of an assignment's field; the client's class adds the rest.
    virtual void visit(ZfCCfgAssignment* pAssignment);
    // Opens FileName + "_SF_" + serial number + ".dot".
    virtual void openFile(WqCXString FileName);
    // Writes the end of the graph and closes the file.
    virtual void closeFile();

    void visitStart(ZfCCfgValueReturnStatement* pStmt) override;
    void visitStart(ZfCControlFlowGraph* pCfg) override;
    void visitStart(ZfCCfgParamStatement* pStmt) override;
    void visitStart(ZfCCfgOutputStatement* pStmt) override;
    void visitStart(ZfCBasicBlock* pBasicBlock) override;
    void visitEnd(ZfCControlFlowGraph* pCfg) override;
    void visitEnd(ZfCCfgParamStatement* pStmt) override;
    void visitEnd(ZfCBasicBlock* pBasicBlock) override;
    void visitBeforeCondition(ZfCBasicBlock* pBasicBlock) override;
    void visit(ZfCSSAVariable* pVariable) override;
    void visit(ZfCCfgVariable* pVariable) override;
    void visit(ZfCCfgValueExpression* pExpression) override;
    void visit(ZfCCfgExplicitVarUse* pExpression) override;
    void visit(ZfCCfgExpression* pExpression) override;
    void visit(ZfCPhiFunction* pPhiFunction) override;
    void visit(ZfCCfgProcedureCall* pCall) override;
    void visit(ZfCCfgExternCall* pCall) override;
    void visit(ZfCCfgInitAssignment* pAssignment) override;
    void visit(ZfCSSAEdge* pEdgeInfo, leda::edge& Edge) override;
    void visit(ZfCCfgEdgeInfo* pEdgeInfo, leda::edge& Edge) override;
    void visit(ZfCCfgFalseBranch* pEdgeInfo, leda::edge& Edge) override;
    void visit(ZfCCfgTrueBranch* pEdgeInfo, leda::edge& Edge) override;
    void visit(ZfCCfgExit* pNodeInfo) override;
    void visit(ZfCCfgEntry* pNodeInfo) override;
    void addSeperatorVariable() override;
    void visitMiddle(ZfCCfgValueReturnStatement* pStmt) override;

    // Writes FileName + "_SF_" + serial number + ".html": a row for every variable printed so far,
    // by rising index.
    void printAllVariables(WqCXString FileName);
    // Order by index as unsigned numbers: 1, 0 or -1.
    static int compareVariableByIndex(ZfCCfgVariable* const& pLeft, ZfCCfgVariable* const& pRight);

protected:
    // Writes the variable and remembers it for the table.
    void printVariable(ZfCCfgVariable* pVariable);
    void printDefVariable(ZfCCfgVariable* pVariable);
    void printUsedVariables(leda::set<ZfCCfgVariable*, leda::avl_tree> Variables);
    void printValue(ZfCCfgValue Value);
    void printStatementIndex(ZfCCfgStatement* pStatement);

    // The ends of an edge as the names of their nodes.
    void printEdge(leda::edge Edge, std::ostream& Stream);
    void printSourceNode(leda::edge Edge, std::ostream& Stream);
    void printTargetNode(leda::edge Edge, std::ostream& Stream);

    // Copies the text of a string stream and masks what has a meaning in a record label. A
    // template, so that the string in between is made and freed in one module.
    template <class StringStream>
    void handleSymbolsInStream(const StringStream& In, std::ostream& Out) {
        for (const char Symbol : In.str()) {
            if (Symbol == '<' || Symbol == '>' || Symbol == '|')
                Out << '\\';
            Out << Symbol;
        }
    }

    // Whether the simple form is written.
    bool isSimpleOutput() { return m_SimpleOutput; }

    // Where the dump goes; open between openFile and closeFile.
    std::ofstream m_DotStream;
    ZfCControlFlowGraph* m_pCfg; // not owned; finds the nodes of an edge
    // What the constructor was given: whether SSA edges are written, and whether the form is the
    // simple one.
    bool m_PrintSSAEdges;
    bool m_SimpleOutput;
    leda::set<ZfCCfgVariable*, leda::avl_tree> m_PrintedVariables; // grows over all walks

private:
    void printNode(leda::node v, std::ostream& Stream);
    void printLabelledEdge(leda::edge Edge, const char* Attributes);
    WqCXString makeFileName(WqCXString FileName, const char* Ending);
};

#endif
