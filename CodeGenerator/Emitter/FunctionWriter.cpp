#include "Emitter/FunctionWriter.h"

#include "Emitter/CLiterals.h"
#include "Model/Conversion.h"
#include "Model/ZfCCfgSFProcedureCall.h"

#include <algorithm>
#include <cstddef>
#include <utility>

namespace hpn {

namespace {

constexpr std::size_t IndentWidth = 4;
constexpr std::size_t DeepestIndent = 24; // deeper nesting goes on at this margin

} // namespace

void VariableNameTable::set(const Variable& Declaration, std::string Name) {
    if (Declaration.Index >= m_Names.size())
        m_Names.resize(Declaration.Index + 1);
    m_Names[Declaration.Index] = std::move(Name);
}

// ---- names and declarations ----

void FunctionWriter::nameLocals(const EmittedFunction& Function) {
    CNames Local(&m_FileNames);
    m_CopiedParameters.clear();
    for (const Variable* pFormal : Function.Parameters) {
        std::string Name = Local.take(pFormal->Name);
        if (m_Functions.isLocal(pFormal))
            m_Names.set(*pFormal, std::move(Name));
        else
            m_CopiedParameters.emplace_back(pFormal, std::move(Name));
    }
    for (const Variable* pVariable : Function.Locals)
        m_Names.set(*pVariable, Local.take(pVariable->Name));
}

void FunctionWriter::writeHead(int Number) {
    const EmittedFunction& Function = m_Functions.getAll()[Number];
    nameLocals(Function);
    const Procedure* pSource = Function.pSource;
    const bool IsExternal = pSource && (pSource->IsExported || pSource->IsMain);
    m_Out += IsExternal ? "" : "static ";
    m_Out += pSource && pSource->IsExported && pSource->pResult
                 ? cTypeName(pSource->pResult->pType->Base)
                 : "void";
    m_Out += ' ';
    m_Out += m_FunctionNames[Number];
    m_Out += '(';
    auto Copied = m_CopiedParameters.begin();
    for (const Variable* pFormal : Function.Parameters) {
        if (pFormal != Function.Parameters.front())
            m_Out += ", ";
        m_Out += cTypeName(pFormal->pType->Base);
        m_Out += ' ';
        m_Out += m_Functions.isLocal(pFormal) ? m_Names.nameOf(*pFormal) : (Copied++)->second;
    }
    m_Out += Function.Parameters.empty() ? "void)" : ")";
}

void FunctionWriter::writeLocals(const EmittedFunction& Function) {
    for (const Variable* pVariable : Function.Locals) {
        m_Out += "    ";
        m_Out += cTypeName(pVariable->pType->Base);
        m_Out += ' ';
        m_Out += m_Names.nameOf(*pVariable);
        const auto& Zeroed = Function.ZeroedLocals;
        if (std::find(Zeroed.begin(), Zeroed.end(), pVariable) != Zeroed.end())
            m_Out += " = 0";
        m_Out += ";\n";
    }
    if (!Function.Locals.empty())
        m_Out += '\n';
    for (const auto& [pFormal, Name] : m_CopiedParameters)
        m_Out.append("    ").append(m_Names.nameOf(*pFormal)).append(" = ").append(Name) += ";\n";
}

/// Parameters that the body's text does not read; it may have them in terms that stand as numbers.
std::string FunctionWriter::unreadParameters(const EmittedFunction& Function) const {
    const std::vector<const Variable*>& Reads = m_Expressions.getReads();
    std::string Text;
    for (const Variable* pFormal : Function.Parameters)
        if (m_Functions.isLocal(pFormal) &&
            std::find(Reads.begin(), Reads.end(), pFormal) == Reads.end())
            Text.append("    (void)").append(m_Names.nameOf(*pFormal)) += ";\n";
    return Text;
}

void FunctionWriter::writeBody(int Number) {
    const EmittedFunction& Function = m_Functions.getAll()[Number];
    m_pFunction = &Function;
    m_Depth = 1;
    m_Out += " {\n";
    writeLocals(Function);
    m_Expressions.clearReads();
    const std::size_t Start = m_Out.size();
    if (!Function.Flow.Nodes.empty())
        writeFlow(Function);
    m_Out.insert(Start, unreadParameters(Function));
    if (Function.pSource && Function.pSource->IsExported && Function.pSource->pResult)
        writeReturn();
    m_Out += "}\n";
}

// ---- statements ----

void FunctionWriter::writeFlow(const EmittedFunction& Function) {
    m_Labels.assign(Function.Flow.Nodes.size(), 0);
    m_NumberOfLabels = 0;
    const std::vector<StructureToken> Tokens = structureFlow(Function.Flow.Nodes);
    for (const StructureToken& Token : Tokens)
        if (Token.Kind == StructureKind::Label)
            m_Labels[Token.Node] = ++m_NumberOfLabels;
    for (std::size_t i = 0; i < Tokens.size(); ++i) {
        // A label needs a statement behind it.
        const bool IsLast = i + 1 == Tokens.size() || Tokens[i + 1].Kind == StructureKind::End ||
                            Tokens[i + 1].Kind == StructureKind::Else ||
                            Tokens[i + 1].Kind == StructureKind::ElseIf ||
                            Tokens[i + 1].Kind == StructureKind::EndDo;
        writeToken(Tokens[i], IsLast);
    }
}

void FunctionWriter::indent() {
    m_Out.append(std::min(m_Depth, DeepestIndent) * IndentWidth, ' ');
}

std::string FunctionWriter::labelOf(int Node) {
    return "L" + std::to_string(m_Labels[Node]);
}

void FunctionWriter::open(const char* pText, const StructureToken& Token) {
    indent();
    m_Out += pText;
    m_Expressions.writeTests(m_pFunction->Flow.Tests[Token.Node], Token.Negated);
    m_Out += ") {\n";
    ++m_Depth;
}

void FunctionWriter::writeReturn() {
    indent();
    const Procedure* pSource = m_pFunction->pSource;
    m_Out += "return";
    if (pSource && pSource->IsExported && pSource->pResult)
        m_Out.append(" ").append(m_Names.nameOf(*pSource->pResult));
    m_Out += ";\n";
}

void FunctionWriter::writeToken(const StructureToken& Token, bool IsLast) {
    switch (Token.Kind) {
    case StructureKind::Label:
        m_Out.append(labelOf(Token.Node)) += IsLast ? ":;\n" : ":\n";
        return;
    case StructureKind::Code:
        for (std::size_t i = m_pFunction->Flow.FirstItem[Token.Node];
             i < m_pFunction->Flow.FirstItem[Token.Node + 1]; ++i)
            writeItem(m_pFunction->Flow.Items[i]);
        return;
    case StructureKind::If:
        return open("if (", Token);
    case StructureKind::ElseIf:
        --m_Depth;
        return open("} else if (", Token);
    case StructureKind::While:
        return open("while (", Token);
    case StructureKind::Return:
        return writeReturn();
    default:
        break;
    }
    const bool Closes = Token.Kind == StructureKind::End || Token.Kind == StructureKind::Else ||
                        Token.Kind == StructureKind::EndDo;
    m_Depth -= Closes ? 1 : 0;
    indent();
    switch (Token.Kind) {
    case StructureKind::Else:
        m_Out += "} else {\n";
        break;
    case StructureKind::Forever:
        m_Out += "for (;;) {\n";
        break;
    case StructureKind::Do:
        m_Out += "do {\n";
        break;
    case StructureKind::EndDo:
        m_Out += "} while (";
        m_Expressions.writeTests(m_pFunction->Flow.Tests[Token.Node], Token.Negated);
        m_Out += ");\n";
        break;
    case StructureKind::Goto:
        m_Out.append("goto ").append(labelOf(Token.Node)) += ";\n";
        break;
    case StructureKind::End:
        m_Out += "}\n";
        break;
    default:
        m_Out += Token.Kind == StructureKind::Break ? "break;\n" : "continue;\n";
    }
    const bool Opens = Token.Kind == StructureKind::Else || Token.Kind == StructureKind::Forever ||
                       Token.Kind == StructureKind::Do;
    m_Depth += Opens ? 1 : 0;
}

void FunctionWriter::writeItem(const FlowItem& Item) {
    indent();
    switch (Item.Kind) {
    case FlowItemKind::Assign:
        writeAssignment(Item);
        break;
    case FlowItemKind::Discard:
        m_Expressions.writeDiscarded(Item.pTerm);
        break;
    case FlowItemKind::Call:
        writeCall(Item);
        break;
    case FlowItemKind::CallExtern:
        m_Out.append(m_ExternNames.find(Item.pExtern)->second) += "()";
    }
    m_Out += ";\n";
}

void FunctionWriter::writeAssignment(const FlowItem& Item) {
    const Variable& Target = *Item.pTarget;
    const Term* pValue = Item.pTerm;
    if (pValue->isStore()) {
        m_Expressions.writeElement(Target, pValue->pLeft);
        pValue = pValue->pRight;
    } else {
        m_Out += m_Names.nameOf(Target);
    }
    m_Out += " = ";
    m_Expressions.writeStored(pValue, *Target.pType, Target.Kind != VariableKind::Output);
}

void FunctionWriter::writeCall(const FlowItem& Item) {
    const EmittedFunction& Callee = m_Functions.getCallee(Item.pAnyCall);
    m_Out += m_FunctionNames[&Callee - m_Functions.getAll().data()];
    m_Out += '(';
    for (const Variable* pFormal : Callee.Parameters) {
        if (pFormal != Callee.Parameters.front())
            m_Out += ", ";
        if (const Term* pArgument = m_Functions.findArgument(Item, pFormal))
            m_Expressions.writeStored(pArgument, *pFormal->pType, true);
        else
            m_Out += '0';
    }
    m_Out += ')';
}

} // namespace hpn
