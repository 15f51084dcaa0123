#include "ZfCCfgVisitorSSADot.h"

#include "LEDA/list.h"
#include "ZfCCfgFactory.h"
#include "ZfCControlFlowGraph.h"

// The dump as a DOT file, and the table of its variables. Every text below is what existing readers
// of the files know; none may change by a blank.

ZfCCfgVisitorSSADot::ZfCCfgVisitorSSADot()
    : m_pCfg(nullptr), m_PrintSSAEdges(true), m_SimpleOutput(false) {
}

ZfCCfgVisitorSSADot::ZfCCfgVisitorSSADot(ZfCControlFlowGraph* pCfg, bool PrintSSAEdges,
                                         bool SimpleOutput)
    : m_pCfg(pCfg), m_PrintSSAEdges(PrintSSAEdges), m_SimpleOutput(SimpleOutput) {
}

ZfCCfgVisitorSSADot::~ZfCCfgVisitorSSADot() = default;

WqCXString ZfCCfgVisitorSSADot::makeFileName(WqCXString FileName, const char* Ending) {
    return FileName + WqCXString("_SF_") + WqCXString(getIndex(), false, true) + WqCXString(Ending);
}

void ZfCCfgVisitorSSADot::openFile(WqCXString FileName) {
    const WqCXString DotFileName = makeFileName(FileName, ".dot");
    m_DotStream.open(DotFileName.cstring());
    m_DotStream << "digraph G {\n"
                << "size = \"100,100\";\n";
}

void ZfCCfgVisitorSSADot::closeFile() {
    m_DotStream << "\n}\n";
    m_DotStream.close();
}

// Nodes.

void ZfCCfgVisitorSSADot::visit(ZfCCfgEntry* pNodeInfo) {
    const unsigned int Index = pNodeInfo->getIndex();
    m_DotStream << "  Node_" << Index << "[label = \"EN_" << Index << "\\n"
                << pNodeInfo->getProcedure()->getName() << "\", color=green"
                << "];\n";
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgExit* pNodeInfo) {
    const unsigned int Index = pNodeInfo->getIndex();
    m_DotStream << "  Node_" << Index << "[label = \"EX_" << Index << "\", color=red];\n";
}

void ZfCCfgVisitorSSADot::visitStart(ZfCBasicBlock* pBasicBlock) {
    const unsigned int Index = pBasicBlock->getIndex();
    m_DotStream << "  Node_" << Index << "[label = \"{BB_" << Index;
}

void ZfCCfgVisitorSSADot::visitEnd(ZfCBasicBlock* pBasicBlock) {
    m_DotStream << "}\", shape=record ";
    if (pBasicBlock->isEmpty())
        m_DotStream << " , style=filled, fillcolor=yellow";
    m_DotStream << "];\n";
}

void ZfCCfgVisitorSSADot::visitBeforeCondition(ZfCBasicBlock* pBasicBlock) {
    m_DotStream << "| Branch: ";
    printUsedVariables(pBasicBlock->getBranchCond()->getUsedVariables());
}

void ZfCCfgVisitorSSADot::visitStart(ZfCControlFlowGraph*) {
}

void ZfCCfgVisitorSSADot::visitEnd(ZfCControlFlowGraph*) {
}

// Statements: each is a field of the record, which opens with a bar.

void ZfCCfgVisitorSSADot::printStatementIndex(ZfCCfgStatement* pStatement) {
    m_DotStream << "(ind:" << pStatement->getIndex() << "):";
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgAssignment* pAssignment) {
    m_DotStream << " | assignment";
    printStatementIndex(pAssignment);
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgInitAssignment* pAssignment) {
    m_DotStream << " | InitAss";
    printStatementIndex(pAssignment);
    if (isSimpleOutput())
        printVariable(pAssignment->getLHS());
    else
        printDefVariable(pAssignment->getLHS());
    m_DotStream << " = ";
    pAssignment->getRHS()->accept(this);
}

// The parenthesis stays open.
void ZfCCfgVisitorSSADot::visit(ZfCCfgExternCall* pCall) {
    m_DotStream << " | ExternCall(";
    printStatementIndex(pCall);
}

void ZfCCfgVisitorSSADot::visitStart(ZfCCfgOutputStatement* pStmt) {
    m_DotStream << " | OutStmt";
    printStatementIndex(pStmt);
}

void ZfCCfgVisitorSSADot::visitStart(ZfCCfgParamStatement* pStmt) {
    ZfCCfgVariable* const pVariable = pStmt->getVariable();
    m_DotStream << " | PaStmt";
    printStatementIndex(pStmt);
    pVariable->accept(this);
    m_DotStream << "(";
    printValue(pVariable->getValue());
    m_DotStream << ") = (";
}

void ZfCCfgVisitorSSADot::visitEnd(ZfCCfgParamStatement*) {
    m_DotStream << ")";
}

void ZfCCfgVisitorSSADot::addSeperatorVariable() {
    m_DotStream << ", ";
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgProcedureCall* pCall) {
    m_DotStream << " | ProcCall";
    printStatementIndex(pCall);
    m_DotStream << pCall->getName();
    if (pCall->isCallToDirectlyOrIndirectlyFromOutsideCallableFcn())
        m_DotStream << " (no Inlining)";
}

void ZfCCfgVisitorSSADot::visitStart(ZfCCfgValueReturnStatement* pStmt) {
    m_DotStream << " | VRStmt";
    printStatementIndex(pStmt);
}

void ZfCCfgVisitorSSADot::visitMiddle(ZfCCfgValueReturnStatement*) {
    m_DotStream << " = ";
}

void ZfCCfgVisitorSSADot::visit(ZfCPhiFunction* pPhiFunction) {
    m_DotStream << " | PhiFct";
    printStatementIndex(pPhiFunction);
    pPhiFunction->getVariable()->accept(this);
    m_DotStream << " = (";
    for (ZfCCfgVariable* pVariable : pPhiFunction->getUsedVariables()) {
        pVariable->accept(this);
        m_DotStream << ", ";
    }
    m_DotStream << ")";
}

// Variables and values.

void ZfCCfgVisitorSSADot::printVariable(ZfCCfgVariable* pVariable) {
    m_DotStream << " Var_" << pVariable->getIndex();
    if (!isSimpleOutput())
        m_DotStream << " (" << (pVariable->isArray() ? " A " : "")
                    << (pVariable->isErasable() ? " E " : "")
                    << (pVariable->isVolatile() ? " V " : "") << ")";
    m_PrintedVariables.insert(pVariable);
}

void ZfCCfgVisitorSSADot::printDefVariable(ZfCCfgVariable* pVariable) {
    m_DotStream << " Def:(";
    printVariable(pVariable);
    m_DotStream << ") ";
}

void ZfCCfgVisitorSSADot::printUsedVariables(leda::set<ZfCCfgVariable*, leda::avl_tree> Variables) {
    m_DotStream << "Use:(";
    for (ZfCCfgVariable* pVariable : Variables) {
        printVariable(pVariable);
        m_DotStream << ",";
    }
    m_DotStream << ") ";
}

// The number of a value that is not constant means nothing, and the full form shows it all the
// same.
void ZfCCfgVisitorSSADot::printValue(ZfCCfgValue Value) {
    if (Value.isConstant() || !isSimpleOutput())
        m_DotStream << Value.getValue();
    if (Value.isConstant())
        m_DotStream << "(c)";
    else if (Value.isNonConstant())
        m_DotStream << "(nc)";
    else
        m_DotStream << "(un)";
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgVariable* pVariable) {
    printVariable(pVariable);
}

void ZfCCfgVisitorSSADot::visit(ZfCSSAVariable* pVariable) {
    m_DotStream << "SSA: ";
    printVariable(pVariable);
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgValueExpression* pExpression) {
    printValue(pExpression->getValue());
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgExplicitVarUse* pExpression) {
    m_DotStream << " eVarUse: ";
    for (ZfCCfgVariable* pVariable : pExpression->getUsedVariables())
        printVariable(pVariable);
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgExpression*) {
    m_DotStream << "Exp";
}

// Edges.

void ZfCCfgVisitorSSADot::printNode(leda::node v, std::ostream& Stream) {
    Stream << "Node_" << m_pCfg->inf(v)->getIndex();
}

void ZfCCfgVisitorSSADot::printSourceNode(leda::edge Edge, std::ostream& Stream) {
    printNode(m_pCfg->source(Edge), Stream);
}

void ZfCCfgVisitorSSADot::printTargetNode(leda::edge Edge, std::ostream& Stream) {
    printNode(m_pCfg->target(Edge), Stream);
}

void ZfCCfgVisitorSSADot::printEdge(leda::edge Edge, std::ostream& Stream) {
    printSourceNode(Edge, Stream);
    Stream << " -> ";
    printTargetNode(Edge, Stream);
}

void ZfCCfgVisitorSSADot::printLabelledEdge(leda::edge Edge, const char* Attributes) {
    printEdge(Edge, m_DotStream);
    m_DotStream << Attributes << ";\n";
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgTrueBranch*, leda::edge& Edge) {
    printLabelledEdge(Edge, "[label=\"true\", color = green]");
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgFalseBranch*, leda::edge& Edge) {
    printLabelledEdge(Edge, "[label=\"false\", color = red]");
}

void ZfCCfgVisitorSSADot::visit(ZfCCfgEdgeInfo*, leda::edge& Edge) {
    printLabelledEdge(Edge, "");
}

void ZfCCfgVisitorSSADot::visit(ZfCSSAEdge*, leda::edge& Edge) {
    if (m_PrintSSAEdges)
        printLabelledEdge(Edge, "[label=\"ssa\", color = blue]");
}

// The table of variables.

namespace {

void printTypeCell(ZfCCfgVariable* pVariable, std::ostream& Stream) {
    Stream << "<td>";
    if (pVariable->isSFVariable() != nullptr)
        Stream << "SF";
    else if (ZfCSSAVariable* const pVersion = pVariable->isSSAVariable())
        Stream << "SSA (Orig: Var_" << WqCXString(pVersion->getOrigVar()->getIndex(), false, true)
               << "_)";
    else
        Stream << "NA";
    Stream << "</td>";
}

// Unlike the dump, the table shows the number of a constant only.
void printValueCell(ZfCCfgVariable* pVariable, std::ostream& Stream) {
    ZfCCfgValue Value = pVariable->getValue();
    Stream << "<td>";
    if (Value.isConstant())
        Stream << Value.getValue() << "(c)";
    else if (Value.isNonConstant())
        Stream << "(nc)";
    else
        Stream << "(un)";
    Stream << "</td>";
}

void printMarkerCell(const char* Opening, bool IsMarked, std::ostream& Stream) {
    Stream << Opening << (IsMarked ? "X" : "&#160;") << "</td>";
}

void printRow(ZfCCfgVariable* pVariable, std::ostream& Stream) {
    Stream << "  <tr>"
           << "<td>Var_" << WqCXString(pVariable->getIndex(), false, true) << "_</td>";
    printTypeCell(pVariable, Stream);
    printValueCell(pVariable, Stream);
    printMarkerCell("<td>", pVariable->isArray(), Stream);
    printMarkerCell("<td>", pVariable->isErasable(), Stream);
    printMarkerCell("<td> ", pVariable->isVolatile(), Stream);
    Stream << "</tr>\n";
}

} // namespace

int ZfCCfgVisitorSSADot::compareVariableByIndex(ZfCCfgVariable* const& pLeft,
                                                ZfCCfgVariable* const& pRight) {
    const unsigned int Left = pLeft->getIndex();
    const unsigned int Right = pRight->getIndex();
    return (Left > Right) - (Left < Right);
}

void ZfCCfgVisitorSSADot::printAllVariables(WqCXString FileName) {
    leda::list<ZfCCfgVariable*> ListPrintedVariables;
    for (ZfCCfgVariable* pVariable : m_PrintedVariables)
        ListPrintedVariables.append(pVariable);
    ListPrintedVariables.sort(compareVariableByIndex);

    const WqCXString NewFileName = makeFileName(FileName, ".html");
    std::ofstream VariableOutStream(NewFileName.cstring());
    VariableOutStream << "<html>\n"
                      << "<table border=\"1\">\n"
                      << "  <tr><td colspan=\"6\" align=center><h1>Used Variables</h1></td></tr>\n"
                      << "  <tr><td>Variable</td><td>Type</td><td>Value</td>"
                      << "<td>Array</td><td>Erasable</td><td>Volatile</td></tr>\n";
    for (ZfCCfgVariable* pVariable : ListPrintedVariables)
        printRow(pVariable, VariableOutStream);
    VariableOutStream << "</table>\n"
                      << "</html>";
}
