#include "Emitter/CEmitter.h"

#include "Emitter/CLiterals.h"
#include "Emitter/CNames.h"
#include "Emitter/EmittedFunctions.h"
#include "Emitter/FunctionWriter.h"
#include "Graph/ProgramGraph.h"
#include "Model/Conversion.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <unordered_set>
#include <utility>
#include <vector>

// The order of the text:
//
//     head, includes | inputs, outputs, states, params, other variables | externs, prototypes |
//     functions | init | step
//
// Names at file scope are given first, in the order of the source, so that they do not depend on
// what the optimiser left.

namespace hpn {

namespace {

constexpr std::size_t ElementsOneByOne = 8; // arrays up to this size are initialised without a loop

class ProgramWriter {
public:
    ProgramWriter(ProgramGraph& Graph, const EmitOptions& Options)
        : m_Graph(Graph), m_Source(Graph.getProgram()), m_Options(Options), m_Functions(Graph),
          m_Writer(m_Functions, m_FileNames, m_FunctionNames, m_ExternNames, m_Names, m_Text) {}
    EmittedProgram run();

private:
    std::string fileName(std::string_view Name) {
        return m_FileNames.take(m_Options.Prefix + std::string(Name));
    }
    void findVariables();
    void nameEverything();
    bool isExternal(const Variable& Declaration) const;
    bool isAtFileScope(const Variable* pVariable) const;
    void writeVariables();
    void writeVariable(const Variable& Declaration);
    void writeInitializer(const Variable& Declaration);
    void writeTypeComment(const Type& Of);
    void writePrototypes();
    void writeFunctions();
    void writeInit();
    void writeStartValue(const Variable& Declaration);
    void writeStartLoop(const Variable& Declaration, const std::string& Name);

    const ProgramGraph& m_Graph;
    const Program& m_Source;
    const EmitOptions& m_Options;
    EmittedFunctions m_Functions;
    std::unordered_set<const Variable*> m_ExternTouched; // looked up only
    std::unordered_set<const Extern*> m_CalledExterns;   // looked up only
    std::vector<const Variable*> m_AtFileScope;          // in the order of the text
    CNames m_FileNames;
    std::string m_InitName;
    std::vector<std::string> m_FunctionNames;
    ExternNameTable m_ExternNames;
    VariableNameTable m_Names;
    std::string m_Text;
    FunctionWriter m_Writer;
};

double startOf(const Variable& Declaration, std::size_t Element) {
    return Element < Declaration.Initial.size() ? Declaration.Initial[Element]
                                                : convertNumber(0.0, *Declaration.pType);
}

// ---- what there is ----

bool ProgramWriter::isExternal(const Variable& Declaration) const {
    return Declaration.Kind == VariableKind::Input || Declaration.Kind == VariableKind::Output ||
           m_ExternTouched.count(&Declaration) != 0;
}

bool ProgramWriter::isAtFileScope(const Variable* pVariable) const {
    if (isExternal(*pVariable))
        return true;
    // A constant that nothing reads would be one too many for the compiler.
    if (pVariable->Kind == VariableKind::Param)
        return m_Functions.getUse().isRead(pVariable);
    return m_Functions.getUse().isUsed(pVariable) && !m_Functions.isLocal(pVariable);
}

void ProgramWriter::findVariables() {
    for (const Extern& Outside : m_Source.Externs) {
        m_ExternTouched.insert(Outside.Reads.begin(), Outside.Reads.end());
        m_ExternTouched.insert(Outside.Writes.begin(), Outside.Writes.end());
    }
    for (const EmittedFunction& Function : m_Functions.getAll())
        for (const FlowItem& Item : Function.Flow.Items)
            if (Function.IsEmitted && Item.pExtern)
                m_CalledExterns.insert(Item.pExtern);
    std::vector<const Variable*> All;
    for (const Variable& Declaration : m_Source.Variables)
        All.push_back(&Declaration);
    // The variables that the graph's builder made have the numbers behind those.
    std::vector<const Variable*> Hidden;
    for (const Variable* pVariable : m_Functions.getUse().getAll())
        if (pVariable->Index >= All.size())
            Hidden.push_back(pVariable);
    const auto byIndex = [](const Variable* a, const Variable* b) { return a->Index < b->Index; };
    std::sort(Hidden.begin(), Hidden.end(), byIndex);
    All.insert(All.end(), Hidden.begin(), Hidden.end());
    for (const Variable* pVariable : All)
        if (isAtFileScope(pVariable))
            m_AtFileScope.push_back(pVariable);
    const auto byKind = [](const Variable* a, const Variable* b) { return a->Kind < b->Kind; };
    std::stable_sort(m_AtFileScope.begin(), m_AtFileScope.end(), byKind);
}

void ProgramWriter::nameEverything() {
    for (const Variable& Declaration : m_Source.Variables)
        if (!Declaration.pOwner)
            m_Names.set(Declaration, fileName(Declaration.Name));
    for (const Extern& Outside : m_Source.Externs)
        m_ExternNames[&Outside] = fileName(Outside.Name);
    m_InitName = fileName(m_Source.Name + "_init");
    const std::string StepName = fileName(m_Source.Name + "_step");
    for (const EmittedFunction& Function : m_Functions.getAll())
        m_FunctionNames.push_back(Function.pSource && Function.pSource->IsMain ? StepName
                                  : Function.pSource
                                      ? fileName(Function.pSource->Name)
                                      : fileName(m_Graph.readableNameOf(Function.ProcedureName)));
    for (const Variable* pVariable : m_AtFileScope) {
        if (!pVariable->pOwner)
            continue;
        const std::string Owner(pVariable->pOwner->Name);
        const bool IsResult = pVariable->Kind == VariableKind::Result;
        m_Names.set(*pVariable,
                    fileName(IsResult ? Owner + "_result" : std::string(pVariable->Name)));
    }
}

// ---- declarations ----

void ProgramWriter::writeTypeComment(const Type& Of) {
    std::string Comment;
    if (isScaled(Of)) {
        Comment += " lsb ";
        appendDouble(Comment, Of.Lsb);
        if (Of.Offset != 0.0) {
            Comment += ", offset ";
            appendDouble(Comment, Of.Offset);
        }
    }
    if (Of.HasRange) {
        Comment += Comment.empty() ? " " : ", ";
        appendDouble(Comment, Of.Lower);
        Comment += " to ";
        appendDouble(Comment, Of.Upper);
    }
    if (!Comment.empty())
        m_Text.append(" /*").append(Comment) += " */";
}

void ProgramWriter::writeInitializer(const Variable& Declaration) {
    if (Declaration.Count == 0)
        return appendStored(m_Text, startOf(Declaration, 0), *Declaration.pType);
    m_Text += '{';
    for (std::size_t i = 0; i < Declaration.Count; ++i) {
        m_Text += i == 0 ? "" : ", ";
        appendStored(m_Text, startOf(Declaration, i), *Declaration.pType);
    }
    m_Text += '}';
}

void ProgramWriter::writeVariable(const Variable& Declaration) {
    const bool IsParam = Declaration.Kind == VariableKind::Param;
    m_Text += isExternal(Declaration) ? "" : "static ";
    m_Text += Declaration.Kind == VariableKind::Input ? "volatile " : IsParam ? "const " : "";
    m_Text += cTypeName(Declaration.pType->Base);
    m_Text += ' ';
    m_Text += m_Names.nameOf(Declaration);
    if (Declaration.Count != 0)
        m_Text.append("[").append(std::to_string(Declaration.Count)) += ']';
    if (IsParam) {
        m_Text += " = ";
        writeInitializer(Declaration);
    }
    m_Text += ';';
    writeTypeComment(*Declaration.pType);
    m_Text += '\n';
}

void ProgramWriter::writeVariables() {
    static constexpr std::array<const char*, 4> Headings{
        "/* Inputs: changed outside at any time. */\n", "/* Outputs. */\n", "/* States. */\n",
        "/* Parameters. */\n"};
    const Variable* pLast = nullptr;
    for (const Variable* pVariable : m_AtFileScope) {
        const auto Group = std::min<std::size_t>(static_cast<std::size_t>(pVariable->Kind), 4);
        const auto LastGroup =
            pLast ? std::min<std::size_t>(static_cast<std::size_t>(pLast->Kind), 4) : 5;
        if (Group != LastGroup)
            m_Text.append("\n") += Group < Headings.size()
                                       ? Headings[Group]
                                       : "/* Shared by functions, or kept from call to call. */\n";
        writeVariable(*pVariable);
        pLast = pVariable;
    }
}

void ProgramWriter::writePrototypes() {
    m_Text += '\n';
    for (const Extern& Outside : m_Source.Externs)
        if (m_CalledExterns.count(&Outside) != 0)
            m_Text.append("extern void ").append(m_ExternNames[&Outside]) += "(void);\n";
    m_Text.append("void ").append(m_InitName) += "(void);\n";
    for (std::size_t i = 0; i < m_FunctionNames.size(); ++i) {
        if (!m_Functions.getAll()[i].IsEmitted)
            continue;
        m_Writer.writeHead(static_cast<int>(i));
        m_Text += ";\n";
    }
}

// ---- functions ----

void ProgramWriter::writeFunctions() {
    const auto isMain = [&](std::size_t i) {
        const Procedure* pSource = m_Functions.getAll()[i].pSource;
        return pSource && pSource->IsMain;
    };
    for (bool WritesMain : {false, true}) {
        if (WritesMain)
            writeInit();
        for (std::size_t i = 0; i < m_FunctionNames.size(); ++i) {
            if (!m_Functions.getAll()[i].IsEmitted || isMain(i) != WritesMain)
                continue;
            m_Text += '\n';
            m_Writer.writeHead(static_cast<int>(i));
            m_Writer.writeBody(static_cast<int>(i));
        }
    }
}

bool isUniform(const Variable& Declaration) {
    for (std::size_t i = 1; i < Declaration.Count; ++i)
        if (startOf(Declaration, i) != startOf(Declaration, 0))
            return false;
    return true;
}

/// All elements in a loop, out of a table where they differ.
void ProgramWriter::writeStartLoop(const Variable& Declaration, const std::string& Name) {
    CNames Local(&m_FileNames);
    const std::string Index = Local.take("i");
    const std::string Table = Local.take("start");
    const std::string Count = std::to_string(Declaration.Count);
    m_Text +=
        "    for (int32_t " + Index + " = 0; " + Index + " < " + Count + "; ++" + Index + ") {\n";
    if (!isUniform(Declaration)) {
        m_Text.append("        static const ").append(cTypeName(Declaration.pType->Base)) += ' ';
        m_Text += Table + '[' + Count + "] = ";
        writeInitializer(Declaration);
        m_Text += ";\n";
    }
    m_Text += "        " + Name + '[' + Index + "] = ";
    if (isUniform(Declaration))
        appendStored(m_Text, startOf(Declaration, 0), *Declaration.pType);
    else
        m_Text += Table + '[' + Index + ']';
    m_Text += ";\n    }\n";
}

void ProgramWriter::writeStartValue(const Variable& Declaration) {
    const std::string Name(m_Names.nameOf(Declaration));
    if (Declaration.Count > ElementsOneByOne)
        return writeStartLoop(Declaration, Name);
    for (std::size_t i = 0; i < std::max<std::size_t>(Declaration.Count, 1); ++i) {
        m_Text.append("    ") += Name;
        if (Declaration.Count != 0)
            m_Text.append("[").append(std::to_string(i)) += ']';
        m_Text += " = ";
        appendStored(m_Text, startOf(Declaration, i), *Declaration.pType);
        m_Text += ";\n";
    }
}

void ProgramWriter::writeInit() {
    m_Text.append("\nvoid ").append(m_InitName) += "(void) {\n";
    for (const Variable* pVariable : m_AtFileScope)
        if (pVariable->Kind != VariableKind::Input && pVariable->Kind != VariableKind::Param)
            writeStartValue(*pVariable);
    m_Text += "}\n";
}

EmittedProgram ProgramWriter::run() {
    findVariables();
    nameEverything();
    writeVariables();
    writePrototypes();
    writeFunctions();
    EmittedProgram Result;
    Result.NeedsRuntime = m_Text.find("hpn_") != std::string::npos;
    Result.Source = "/* " + m_Source.Name + ": generated control code, do not edit. */\n\n";
    Result.Source += "#include <stdbool.h>\n#include <stdint.h>\n";
    if (Result.NeedsRuntime)
        Result.Source += "\n#include \"hpn_runtime.h\"\n";
    Result.Source += m_Text;
    return Result;
}

} // namespace

EmittedProgram emitProgram(ProgramGraph& Graph, const EmitOptions& Options) {
    return ProgramWriter(Graph, Options).run();
}

} // namespace hpn
