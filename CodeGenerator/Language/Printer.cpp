#include "Language/Printer.h"

#include "Language/NumberText.h"

#include <algorithm>
#include <vector>

namespace hpn {

namespace {

/// How an operator is written, and how strongly it binds.
struct Notation {
    const char* Text;
    int Precedence;
};

constexpr int UnaryPrecedence = 11;
constexpr int PrimaryPrecedence = 12;
/// Deeper nesting goes on at this margin, so that the text stays linear in the program.
constexpr std::size_t DeepestIndent = 40;

Notation notationOf(Operator Op) {
    switch (Op) {
    case Operator::LogicalOr:
        return {"||", 1};
    case Operator::LogicalAnd:
        return {"&&", 2};
    case Operator::BitOr:
        return {"|", 3};
    case Operator::BitXor:
        return {"^", 4};
    case Operator::BitAnd:
        return {"&", 5};
    case Operator::Equal:
        return {"==", 6};
    case Operator::NotEqual:
        return {"!=", 6};
    case Operator::Less:
        return {"<", 7};
    case Operator::LessEqual:
        return {"<=", 7};
    case Operator::Greater:
        return {">", 7};
    case Operator::GreaterEqual:
        return {">=", 7};
    case Operator::ShiftLeft:
        return {"<<", 8};
    case Operator::ShiftRight:
        return {">>", 8};
    case Operator::Add:
        return {"+", 9};
    case Operator::Subtract:
        return {"-", 9};
    case Operator::Multiply:
        return {"*", 10};
    case Operator::Divide:
        return {"/", 10};
    case Operator::Modulo:
        return {"%", 10};
    case Operator::Negate:
        return {"-", UnaryPrecedence};
    case Operator::LogicalNot:
        return {"!", UnaryPrecedence};
    case Operator::Complement:
        return {"~", UnaryPrecedence};
    case Operator::Cast:
        return {"", UnaryPrecedence};
    case Operator::Absolute:
        return {"abs", PrimaryPrecedence};
    case Operator::Sign:
        return {"sgn", PrimaryPrecedence};
    case Operator::Minimum:
        return {"min", PrimaryPrecedence};
    case Operator::Maximum:
        return {"max", PrimaryPrecedence};
    case Operator::Number:
    case Operator::Variable:
    case Operator::Element:
        break;
    }
    return {"", PrimaryPrecedence};
}

class Printer {
public:
    explicit Printer(const Program& Source) : m_Source(Source) {}

    std::string run();

private:
    /// What is still to be written of the open statements. The walk is no recursion, since
    /// statements nest as deep as the text has lines.
    struct Task {
        enum class Action { List, CloseIf, CloseDo, CloseBrace } What;
        const Statement* pStatement;
        std::size_t Indent;
    };

    /// A declaration of the program and its place in the sources.
    struct Item {
        SourcePosition Position;
        const Type* pType;
        const Variable* pVariable;
        const Extern* pExtern;
        const Procedure* pProcedure;
    };

    std::vector<Item> collectItems() const;
    void printType(const Type& Declared);
    void printVariable(const Variable& Declared);
    void printExtern(const Extern& Declared);
    void printAccess(const char* Word, const std::vector<Variable*>& Variables);
    void printProcedure(const Procedure& Declared);

    void printStatements(const Statement* pFirst);
    void printList(Task Present);
    void printStatement(const Statement& Each, std::size_t Indent);
    void printNested(const Statement& Each, std::size_t Indent);
    void printBranch(const Statement& If, std::size_t Indent);
    void closeIf(const Statement& If, std::size_t Indent);
    void printForHead(const Statement& For);
    void printSimple(const Statement& Each);
    void printAssign(const Statement& Assign);
    void printCall(const Statement& Call);

    void printExpression(const Expression* pRoot, int LowestPrecedence);
    void printOperation(const Expression& Root, Notation Form);
    void printList(const Expression* pFirst);
    void printNumber(const Expression& Literal);
    void indent(std::size_t Depth) { m_Out.append(2 * std::min(Depth, DeepestIndent), ' '); }

    const Program& m_Source;
    std::string m_Out;
    std::vector<Task> m_Tasks;
};

std::string Printer::run() {
    for (const Item& Each : collectItems()) {
        if (Each.pType != nullptr) {
            printType(*Each.pType);
        } else if (Each.pVariable != nullptr) {
            printVariable(*Each.pVariable);
        } else if (Each.pExtern != nullptr) {
            printExtern(*Each.pExtern);
        } else {
            printProcedure(*Each.pProcedure);
        }
    }
    return std::move(m_Out);
}

std::vector<Printer::Item> Printer::collectItems() const {
    std::vector<Item> Items;
    for (const Type& Each : m_Source.Types) {
        if (!Each.IsBuiltIn) {
            Items.push_back({Each.Position, &Each, nullptr, nullptr, nullptr});
        }
    }
    for (const Variable& Each : m_Source.Variables) {
        if (Each.pOwner == nullptr) {
            Items.push_back({Each.Position, nullptr, &Each, nullptr, nullptr});
        }
    }
    for (const Extern& Each : m_Source.Externs) {
        Items.push_back({Each.Position, nullptr, nullptr, &Each, nullptr});
    }
    for (const Procedure& Each : m_Source.Procedures) {
        Items.push_back({Each.Position, nullptr, nullptr, nullptr, &Each});
    }
    std::sort(Items.begin(), Items.end(), [](const Item& a, const Item& b) {
        return a.Position.File != b.Position.File ? a.Position.File < b.Position.File
                                                  : a.Position.Offset < b.Position.Offset;
    });
    return Items;
}

void Printer::printType(const Type& Declared) {
    m_Out.append("type ").append(Declared.Name).append(" = ");
    m_Out.append(m_Source.builtIn(Declared.Base)->Name);
    if (Declared.IsScaled) {
        m_Out.append(" lsb ");
        appendNumber(m_Out, Declared.Lsb);
        m_Out.append(" offset ");
        appendNumber(m_Out, Declared.Offset);
    }
    if (Declared.HasRange) {
        m_Out.append(" range [");
        appendNumber(m_Out, Declared.Lower);
        m_Out.append(", ");
        appendNumber(m_Out, Declared.Upper);
        m_Out.append("]");
    }
    if (Declared.SaturatesLow || Declared.SaturatesHigh) {
        m_Out.append(" saturate");
        if (Declared.SaturatesLow != Declared.SaturatesHigh) {
            m_Out.append(Declared.SaturatesLow ? " low" : " high");
        }
    }
    m_Out.append(";\n");
}

void Printer::printVariable(const Variable& Declared) {
    static const char* const Words[] = {"input ", "output ", "state ", "param "};
    m_Out.append(Words[static_cast<std::size_t>(Declared.Kind)]);
    m_Out.append(Declared.pType->Name).append(" ").append(Declared.Name);
    if (Declared.Count != 0) {
        m_Out.append("[").append(std::to_string(Declared.Count)).append("]");
    }
    if (Declared.pInitializer != nullptr) {
        m_Out.append(Declared.Count != 0 ? " = {" : " = ");
        printList(Declared.pInitializer);
        m_Out.append(Declared.Count != 0 ? "}" : "");
    }
    m_Out.append(";\n");
}

void Printer::printExtern(const Extern& Declared) {
    m_Out.append("extern ").append(Declared.Name);
    printAccess(" reads(", Declared.Reads);
    printAccess(" writes(", Declared.Writes);
    m_Out.append(";\n");
}

void Printer::printAccess(const char* Word, const std::vector<Variable*>& Variables) {
    if (Variables.empty()) {
        return;
    }
    m_Out.append(Word);
    for (const Variable* pVariable : Variables) {
        m_Out.append(pVariable == Variables.front() ? "" : ", ").append(pVariable->Name);
    }
    m_Out.append(")");
}

void Printer::printProcedure(const Procedure& Declared) {
    m_Out.append(Declared.IsExported ? "\nexport proc " : "\nproc ");
    if (Declared.pResult != nullptr) {
        m_Out.append(Declared.pResult->pType->Name).append(" ");
    }
    m_Out.append(Declared.Name).append("(");
    for (const Variable* pFormal : Declared.Formals) {
        m_Out.append(pFormal == Declared.Formals.front() ? "" : ", ");
        m_Out.append(pFormal->pType->Name).append(" ").append(pFormal->Name);
    }
    m_Out.append(") {\n");
    printStatements(Declared.pBody);
    m_Out.append("}\n");
}

void Printer::printStatements(const Statement* pFirst) {
    m_Tasks.push_back({Task::Action::List, pFirst, 1});
    while (!m_Tasks.empty()) {
        const Task Present = m_Tasks.back();
        m_Tasks.pop_back();
        switch (Present.What) {
        case Task::Action::List:
            printList(Present);
            break;
        case Task::Action::CloseIf:
            closeIf(*Present.pStatement, Present.Indent);
            break;
        case Task::Action::CloseDo:
            indent(Present.Indent);
            m_Out.append("} while (");
            printExpression(Present.pStatement->pCondition, 1);
            m_Out.append(");\n");
            break;
        case Task::Action::CloseBrace:
            indent(Present.Indent);
            m_Out.append("}\n");
            break;
        }
    }
}

/// The statements from the given one to the next that holds others.
void Printer::printList(Task Present) {
    while (Present.pStatement != nullptr) {
        const Statement& Each = *Present.pStatement;
        Present.pStatement = Each.pNext;
        const std::size_t Before = m_Tasks.size();
        m_Tasks.push_back(Present);
        printStatement(Each, Present.Indent);
        if (m_Tasks.size() > Before + 1) {
            return;
        }
        m_Tasks.pop_back();
    }
}

void Printer::printStatement(const Statement& Each, std::size_t Indent) {
    switch (Each.Kind) {
    case StatementKind::If:
    case StatementKind::While:
    case StatementKind::DoWhile:
    case StatementKind::For:
    case StatementKind::Switch:
    case StatementKind::Block:
        return printNested(Each, Indent);
    case StatementKind::Case:
        indent(Indent - 1);
        m_Out.append("case ");
        printExpression(Each.pCondition, 1);
        m_Out.append(":\n");
        return;
    case StatementKind::Default:
        indent(Indent - 1);
        m_Out.append("default:\n");
        return;
    case StatementKind::Label:
        m_Out.append(Each.Name).append(":\n");
        return;
    default:
        indent(Indent);
        printSimple(Each);
        m_Out.append(";\n");
        return;
    }
}

void Printer::printNested(const Statement& Each, std::size_t Indent) {
    indent(Indent);
    if (Each.Kind == StatementKind::If) {
        return printBranch(Each, Indent);
    }
    const bool IsDo = Each.Kind == StatementKind::DoWhile;
    const Task::Action Close = IsDo ? Task::Action::CloseDo : Task::Action::CloseBrace;
    m_Tasks.push_back({Close, &Each, Indent});
    m_Tasks.push_back({Task::Action::List, Each.pBody, Indent + 1});
    if (IsDo) {
        m_Out.append("do ");
    } else if (Each.Kind == StatementKind::For) {
        printForHead(Each);
    } else if (Each.Kind != StatementKind::Block) {
        m_Out.append(Each.Kind == StatementKind::While ? "while (" : "switch (");
        printExpression(Each.pCondition, 1);
        m_Out.append(") ");
    }
    m_Out.append("{\n");
}

void Printer::printBranch(const Statement& If, std::size_t Indent) {
    m_Out.append("if (");
    printExpression(If.pCondition, 1);
    m_Out.append(") {\n");
    m_Tasks.push_back({Task::Action::CloseIf, &If, Indent});
    m_Tasks.push_back({Task::Action::List, If.pBody, Indent + 1});
}

void Printer::closeIf(const Statement& If, std::size_t Indent) {
    indent(Indent);
    const Statement* pElse = If.pElse;
    if (pElse == nullptr) {
        m_Out.append("}\n");
        return;
    }
    m_Out.append("} else ");
    if (pElse->Kind == StatementKind::If && pElse->pNext == nullptr) {
        return printBranch(*pElse, Indent);
    }
    m_Out.append("{\n");
    m_Tasks.push_back({Task::Action::CloseBrace, &If, Indent});
    m_Tasks.push_back({Task::Action::List, pElse, Indent + 1});
}

void Printer::printForHead(const Statement& For) {
    m_Out.append("for (");
    if (For.pInit != nullptr) {
        printSimple(*For.pInit);
    }
    m_Out.append("; ");
    if (For.pCondition != nullptr) {
        printExpression(For.pCondition, 1);
    }
    m_Out.append("; ");
    if (For.pStep != nullptr) {
        printSimple(*For.pStep);
    }
    m_Out.append(") ");
}

void Printer::printSimple(const Statement& Each) {
    switch (Each.Kind) {
    case StatementKind::Assign:
        return printAssign(Each);
    case StatementKind::Call:
        return printCall(Each);
    case StatementKind::Break:
        m_Out.append("break");
        return;
    case StatementKind::Continue:
        m_Out.append("continue");
        return;
    case StatementKind::Goto:
        m_Out.append("goto ").append(Each.Name);
        return;
    case StatementKind::Return:
        m_Out.append("return");
        if (Each.pValue != nullptr) {
            m_Out.append(" ");
            printExpression(Each.pValue, 1);
        }
        return;
    case StatementKind::LocalDecl:
        m_Out.append("local ").append(Each.pTarget->pType->Name).append(" ").append(Each.Name);
        if (Each.pValue != nullptr) {
            m_Out.append(" = ");
            printExpression(Each.pValue, 1);
        }
        return;
    default:
        return;
    }
}

void Printer::printAssign(const Statement& Assign) {
    m_Out.append(Assign.pTarget->Name);
    if (Assign.pIndex != nullptr) {
        m_Out.append("[");
        printExpression(Assign.pIndex, 1);
        m_Out.append("]");
    }
    if (Assign.IsIncrement) {
        m_Out.append(Assign.CompoundOp == Operator::Add ? "++" : "--");
        return;
    }
    m_Out.append(" ");
    if (Assign.CompoundOp != Operator::Number) {
        m_Out.append(notationOf(Assign.CompoundOp).Text);
    }
    m_Out.append("= ");
    printExpression(Assign.pValue, 1);
}

void Printer::printCall(const Statement& Call) {
    if (Call.pTarget != nullptr) {
        m_Out.append(Call.pTarget->Name).append(" = ");
    }
    m_Out.append(Call.pExtern != nullptr ? Call.pExtern->Name : Call.pProcedure->Name).append("(");
    printList(Call.pArguments);
    m_Out.append(")");
}

void Printer::printList(const Expression* pFirst) {
    for (const Expression* pEach = pFirst; pEach != nullptr; pEach = pEach->pNext) {
        m_Out.append(pEach == pFirst ? "" : ", ");
        printExpression(pEach, 1);
    }
}

void Printer::printNumber(const Expression& Literal) {
    if (Literal.IsBoolLiteral) {
        m_Out.append(Literal.Number != 0.0 ? "true" : "false");
    } else if (!Literal.Text.empty()) {
        m_Out.append(Literal.Text);
    } else {
        appendNumber(m_Out, Literal.Number);
    }
}

/// Recursive, as trees are limited in height.
void Printer::printExpression(const Expression* pRoot, int LowestPrecedence) {
    if (pRoot->Op == Operator::Number) {
        return printNumber(*pRoot);
    }
    if (pRoot->Op == Operator::Variable || pRoot->Op == Operator::Element) {
        m_Out.append(pRoot->pVariable->Name);
        if (pRoot->Op == Operator::Element) {
            m_Out.append("[");
            printExpression(pRoot->pLeft, 1);
            m_Out.append("]");
        }
        return;
    }
    const Notation Form = notationOf(pRoot->Op);
    const bool NeedsParentheses = Form.Precedence < LowestPrecedence;
    m_Out.append(NeedsParentheses ? "(" : "");
    printOperation(*pRoot, Form);
    m_Out.append(NeedsParentheses ? ")" : "");
}

void Printer::printOperation(const Expression& Root, Notation Form) {
    if (Form.Precedence == PrimaryPrecedence) {
        m_Out.append(Form.Text).append("(");
        printExpression(Root.pLeft, 1);
        if (Root.pRight != nullptr) {
            m_Out.append(", ");
            printExpression(Root.pRight, 1);
        }
        m_Out.append(")");
    } else if (Form.Precedence == UnaryPrecedence) {
        if (Root.Op == Operator::Cast) {
            m_Out.append("(").append(Root.pType->Name).append(")");
        } else {
            m_Out.append(Form.Text);
        }
        // Two minus signs side by side would be one token.
        const bool IsTwoMinus = Root.Op == Operator::Negate && Root.pLeft->Op == Operator::Negate;
        m_Out.append(IsTwoMinus ? " " : "");
        printExpression(Root.pLeft, UnaryPrecedence);
    } else {
        printExpression(Root.pLeft, Form.Precedence);
        m_Out.append(" ").append(Form.Text).append(" ");
        printExpression(Root.pRight, Form.Precedence + 1);
    }
}

} // namespace

std::string printProgram(const Program& Source) {
    return Printer(Source).run();
}

} // namespace hpn
