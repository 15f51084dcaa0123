#ifndef FUNCTIONWRITER_H
#define FUNCTIONWRITER_H

#include "Emitter/CNames.h"
#include "Emitter/EmittedFunctions.h"
#include "Emitter/ExpressionWriter.h"

#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

namespace hpn {

/// The C names of variables: one table for the whole text, in which the function in hand enters its
/// own.
class VariableNameTable : public VariableNames {
public:
    std::string_view nameOf(const Variable& Declaration) const override {
        return m_Names[Declaration.Index];
    }
    void set(const Variable& Declaration, std::string Name);

private:
    std::vector<std::string> m_Names; // by Variable::Index
};

using ExternNameTable = std::unordered_map<const Extern*, std::string>; // looked up only

/// Writes functions: declarations of locals, then the flow as structured statements.
class FunctionWriter {
public:
    FunctionWriter(const EmittedFunctions& Functions, const CNames& FileNames,
                   const std::vector<std::string>& FunctionNames,
                   const ExternNameTable& ExternNames, VariableNameTable& Names, std::string& Out)
        : m_Functions(Functions), m_FileNames(FileNames), m_FunctionNames(FunctionNames),
          m_ExternNames(ExternNames), m_Names(Names), m_Out(Out), m_Expressions(Names, Out) {}

    /// `static void name(uint8_t a)`, without what follows; the parameters get their names.
    void writeHead(int Function);
    void writeBody(int Function);

private:
    void nameLocals(const EmittedFunction& Function);
    void writeLocals(const EmittedFunction& Function);
    std::string unreadParameters(const EmittedFunction& Function) const;
    void writeFlow(const EmittedFunction& Function);
    void writeToken(const StructureToken& Token, bool IsLast);
    void writeItem(const FlowItem& Item);
    void writeAssignment(const FlowItem& Item);
    void writeCall(const FlowItem& Item);
    void writeReturn();
    void open(const char* pText, const StructureToken& Token);
    void indent();
    std::string labelOf(int Node);

    const EmittedFunctions& m_Functions;
    const CNames& m_FileNames;
    const std::vector<std::string>& m_FunctionNames;
    const ExternNameTable& m_ExternNames;
    VariableNameTable& m_Names;
    std::string& m_Out;
    ExpressionWriter m_Expressions;

    // Of the function in hand.
    const EmittedFunction* m_pFunction = nullptr;
    std::vector<std::pair<const Variable*, std::string>> m_CopiedParameters;
    std::vector<int> m_Labels; // by node, 0: none yet
    int m_NumberOfLabels = 0;
    std::size_t m_Depth = 1;
};

} // namespace hpn

#endif
