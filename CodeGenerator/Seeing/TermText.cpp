#include "Seeing/TermText.h"

#include "Language/NumberText.h"
#include "Model/ZfCCfgSFVariable.h"

namespace hpn {

namespace {

/// How an operator is written, and how strongly it binds.
struct Notation {
    const char* Text;
    int Precedence;
};

constexpr int UnaryPrecedence = 11;

// By Operator. Precedence 0: written as a function.
const Notation Notations[] = {{"", 0},
                              {"", 0},
                              {"", 0},
                              {"", UnaryPrecedence},
                              {"-", UnaryPrecedence},
                              {"!", UnaryPrecedence},
                              {"~", UnaryPrecedence},
                              {"abs", 0},
                              {"sgn", 0},
                              {" * ", 10},
                              {" / ", 10},
                              {" % ", 10},
                              {" + ", 9},
                              {" - ", 9},
                              {" << ", 8},
                              {" >> ", 8},
                              {" < ", 7},
                              {" <= ", 7},
                              {" > ", 7},
                              {" >= ", 7},
                              {" == ", 6},
                              {" != ", 6},
                              {" & ", 5},
                              {" ^ ", 4},
                              {" | ", 3},
                              {" && ", 2},
                              {" || ", 1},
                              {"min", 0},
                              {"max", 0}};
static_assert(sizeof Notations / sizeof *Notations ==
              static_cast<std::size_t>(Operator::Maximum) + 1);

class TermWriter {
public:
    TermWriter(VariableNames& Names, std::string& Out) : m_Names(Names), m_Out(Out) {}

    // `Context` is the precedence that the surroundings need at least.
    void write(const Term* pTerm, int Context) {
        switch (pTerm->Op) {
        case Operator::Number:
            return appendNumber(m_Out, pTerm->Number);
        case Operator::Variable:
            return m_Names.appendName(pTerm->pVariable, m_Out);
        case Operator::Element:
            return writeElement(pTerm);
        default:
            break;
        }
        const Notation& Used = Notations[static_cast<std::size_t>(pTerm->Op)];
        if (Used.Precedence == 0)
            return writeFunction(pTerm, Used.Text);
        const bool IsInParentheses = Used.Precedence < Context;
        if (IsInParentheses)
            m_Out += '(';
        writeOperation(pTerm, Used);
        if (IsInParentheses)
            m_Out += ')';
    }

private:
    void writeElement(const Term* pTerm) {
        m_Names.appendName(pTerm->pVariable, m_Out);
        m_Out += '[';
        write(pTerm->pLeft, 0);
        m_Out += ']';
        if (!pTerm->isStore())
            return;
        m_Out += " = ";
        appendStored(pTerm->pRight, *originalOf(pTerm->pVariable)->getDeclaration().pType, m_Names,
                     m_Out);
    }

    void writeFunction(const Term* pTerm, const char* Name) {
        m_Out.append(Name).append("(");
        write(pTerm->pLeft, 0);
        if (pTerm->pRight != nullptr) {
            m_Out += ", ";
            write(pTerm->pRight, 0);
        }
        m_Out += ')';
    }

    void writeOperation(const Term* pTerm, const Notation& Used) {
        if (pTerm->Op == Operator::Cast) {
            m_Out.append("(").append(pTerm->pType->Name).append(") ");
            return write(pTerm->pLeft, UnaryPrecedence);
        }
        if (pTerm->pRight == nullptr) {
            m_Out += Used.Text;
            return write(pTerm->pLeft, UnaryPrecedence + 1);
        }
        write(pTerm->pLeft, Used.Precedence);
        m_Out += Used.Text;
        write(pTerm->pRight, Used.Precedence + 1);
    }

    VariableNames& m_Names;
    std::string& m_Out;
};

} // namespace

void appendTerm(const Term* pTerm, VariableNames& Names, std::string& Out) {
    TermWriter(Names, Out).write(pTerm, 0);
}

void appendStored(const Term* pRoot, const Type& To, VariableNames& Names, std::string& Out) {
    const bool IsUnderstood = pRoot->Op == Operator::Cast && pRoot->pType == &To;
    const Term* pTerm = IsUnderstood ? pRoot->pLeft : pRoot;
    if (pTerm->Op == Operator::Number && To.Base == BaseType::Bool &&
        (pTerm->Number == 0.0 || pTerm->Number == 1.0))
        Out += pTerm->Number == 0.0 ? "false" : "true";
    else
        appendTerm(pTerm, Names, Out);
}

} // namespace hpn
