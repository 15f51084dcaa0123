#include "Road/GraphDump.h"

#include "Graph/ProgramGraph.h"
#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFVariable.h"
#include "ZfCCfgIteratorNodesEdges.h"

#include <algorithm>
#include <charconv>
#include <cstdio>
#include <fstream>
#include <iterator>
#include <sstream>

namespace hpn {

namespace {

// What is still to be written: a term, or a text between terms.
struct Piece {
    const Term* pTerm;
    const char* Text;
};

const char* symbolOf(Operator Op) {
    switch (Op) {
    case Operator::Negate:
        return "-";
    case Operator::LogicalNot:
        return "!";
    case Operator::Complement:
        return "~";
    case Operator::Absolute:
        return "abs";
    case Operator::Sign:
        return "sgn";
    case Operator::Multiply:
        return " * ";
    case Operator::Divide:
        return " / ";
    case Operator::Modulo:
        return " % ";
    case Operator::Add:
        return " + ";
    case Operator::Subtract:
        return " - ";
    case Operator::ShiftLeft:
        return " << ";
    case Operator::ShiftRight:
        return " >> ";
    case Operator::Less:
        return " < ";
    case Operator::LessEqual:
        return " <= ";
    case Operator::Greater:
        return " > ";
    case Operator::GreaterEqual:
        return " >= ";
    case Operator::Equal:
        return " == ";
    case Operator::NotEqual:
        return " != ";
    case Operator::BitAnd:
        return " & ";
    case Operator::BitXor:
        return " ^ ";
    case Operator::BitOr:
        return " | ";
    case Operator::LogicalAnd:
        return " && ";
    case Operator::LogicalOr:
        return " || ";
    case Operator::Minimum:
        return " min ";
    case Operator::Maximum:
        return " max ";
    default:
        return "";
    }
}

void writeNumber(double Number, std::ostream& Stream) {
    char Text[32];
    const std::to_chars_result End = std::to_chars(Text, Text + sizeof Text, Number);
    Stream.write(Text, End.ptr - Text);
}

void writeVariable(ZfCCfgVariable* pVariable, std::ostream& Stream) {
    Stream << "Var_" << pVariable->getIndex();
    if (const ZfCCfgSFVariable* pOriginal = originalOf(pVariable))
        Stream << ':' << pOriginal->getDeclaration().Name;
}

// Writes what stands in front of a term's operands and leaves operands and the rest on the stack,
// last first.
void openTerm(const Term* pTerm, std::vector<Piece>& Stack, std::ostream& Stream) {
    const auto later = [&Stack](const Term* pOperand) { Stack.push_back({pOperand, nullptr}); };
    const auto laterText = [&Stack](const char* Text) { Stack.push_back({nullptr, Text}); };
    switch (pTerm->Op) {
    case Operator::Number:
        writeNumber(pTerm->Number, Stream);
        return;
    case Operator::Variable:
        writeVariable(pTerm->pVariable, Stream);
        return;
    case Operator::Element:
        writeVariable(pTerm->pVariable, Stream);
        Stream << '[';
        if (pTerm->isStore()) {
            later(pTerm->pRight);
            laterText("] = ");
        } else {
            laterText("]");
        }
        later(pTerm->pLeft);
        return;
    case Operator::Cast:
        Stream << '(' << pTerm->pType->Name << ") ";
        later(pTerm->pLeft);
        return;
    default:
        break;
    }
    if (pTerm->pRight == nullptr) {
        Stream << symbolOf(pTerm->Op) << '(';
    } else {
        Stream << '(';
        laterText(")");
        later(pTerm->pRight);
        laterText(symbolOf(pTerm->Op));
        later(pTerm->pLeft);
        return;
    }
    laterText(")");
    later(pTerm->pLeft);
}

// The library writes its dumps as text: a line ends as the system ends it.
bool endsWith(const std::string& FileName, const std::string& Text) {
    std::ifstream Stream(FileName, std::ios::binary);
    Stream.seekg(-2 * static_cast<std::streamoff>(Text.size()), std::ios::end);
    std::string Last{std::istreambuf_iterator<char>(Stream), {}};
    Last.erase(std::remove(Last.begin(), Last.end(), '\r'), Last.end());
    return Last.size() >= Text.size() &&
           Last.compare(Last.size() - Text.size(), Text.size(), Text) == 0;
}

} // namespace

void writeTerm(const Term* pRoot, std::ostream& Stream) {
    std::vector<Piece> Stack{{pRoot, nullptr}};
    while (!Stack.empty()) {
        const Piece Next = Stack.back();
        Stack.pop_back();
        if (Next.pTerm != nullptr)
            openTerm(Next.pTerm, Stack, Stream);
        else
            Stream << Next.Text;
    }
}

void GraphDump::visit(ZfCCfgAssignment* pAssignment) {
    ZfCCfgVisitorSSADot::visit(pAssignment);
    printDefVariable(pAssignment->getLHS());
    if (const ZfCCfgSFVariable* pOriginal = originalOf(pAssignment->getLHS()))
        m_DotStream << pOriginal->getDeclaration().Name << ' ';
    m_DotStream << "= ";
    printExpression(pAssignment->getRHS());
}

void GraphDump::visit(ZfCCfgExpression* pExpression) {
    printExpression(pExpression);
}

void GraphDump::printExpression(ZfCCfgExpression* pExpression) {
    ZfCCfgSFExpression* pOwn = pExpression != nullptr ? pExpression->isSFExpression() : nullptr;
    if (pOwn == nullptr) {
        m_DotStream << "Exp";
        return;
    }
    std::stringstream Text;
    writeTerm(pOwn->getRoot(), Text);
    handleSymbolsInStream(Text, m_DotStream);
    // The table of variables lists what the text names.
    for (ZfCCfgVariable* pVariable : pOwn->getUsedVariables())
        m_PrintedVariables.insert(pVariable);
}

DumpObserver::DumpObserver(std::string DotDirectory, std::string HtmlDirectory)
    : m_DotDirectory(std::move(DotDirectory)), m_HtmlDirectory(std::move(HtmlDirectory)) {
}

void DumpObserver::beforeAll(ProgramGraph& Graph) {
    dump(0, "asBuilt", Graph);
}

void DumpObserver::afterPass(const PassStep& Step, ProgramGraph& Graph) {
    dump(Step.Number, Step.pPass->Name, Graph);
}

void DumpObserver::dump(unsigned Number, const char* Name, ProgramGraph& Graph) {
    if (m_DotDirectory.empty() && m_HtmlDirectory.empty())
        return;
    char Prefix[16];
    std::snprintf(Prefix, sizeof Prefix, "/%02u_", Number);
    const std::string DotStem = m_DotDirectory + Prefix + Name;
    const std::string HtmlStem = m_HtmlDirectory + Prefix + Name;
    // The table lists what a walk has printed, so it takes one even where no DOT file is wanted.
    GraphDump Dump(Graph.getGraph());
    const std::string Serial = "_SF_" + std::to_string(Dump.getSerial());
    if (!m_DotDirectory.empty())
        Dump.openFile(DotStem.c_str());
    ZfCCfgIteratorNodesEdges(&Dump).iterate(&Graph.getGraph());
    if (!m_DotDirectory.empty())
        Dump.closeFile();
    if (!m_HtmlDirectory.empty())
        Dump.printAllVariables(HtmlStem.c_str());
    if (!m_DotDirectory.empty())
        checkFile(DotStem + Serial + ".dot", "\n}\n");
    if (!m_HtmlDirectory.empty())
        checkFile(HtmlStem + Serial + ".html", "</html>");
}

// The library's dump reports no error: a file that does not end as it should was not written whole.
void DumpObserver::checkFile(const std::string& FileName, const char* LastText) {
    if (m_FailedFile.empty() && !endsWith(FileName, LastText))
        m_FailedFile = FileName;
}

} // namespace hpn
