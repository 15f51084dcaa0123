#ifndef EMITTEDFUNCTIONS_H
#define EMITTEDFUNCTIONS_H

#include "Emitter/FlowReader.h"
#include "Emitter/VariableUse.h"

#include <string>
#include <unordered_map>
#include <vector>

class ZfCCfgProcedure;

namespace hpn {

/// One function of the C text.
struct EmittedFunction {
    leda::node EntryNode = nullptr;
    std::string ProcedureName;
    const Procedure* pSource = nullptr; ///< null: the optimiser made it
    bool IsEmitted = false;             ///< main, exported, or called by an emitted one
    ProcedureFlow Flow;
    std::vector<const Variable*> Parameters; ///< formals that it takes in C
    std::vector<const Variable*> Fed;    ///< of those, the ones that still take what callers pass
    std::vector<const Variable*> Locals; ///< without the parameters
    std::vector<const Variable*> ZeroedLocals; ///< of those, the ones that have to start as zero
};

/// All procedures of a graph as C functions, read and cleared of what would be dead in C: functions
/// that no emitted one calls, assignments to locals that nothing reads. Decides for each variable
/// where it lives.
class EmittedFunctions {
public:
    explicit EmittedFunctions(ProgramGraph& Graph);

    /// Declared procedures in their order, then the others by name. Numbers of functions are places
    /// here.
    const std::vector<EmittedFunction>& getAll() const { return m_Functions; }
    const EmittedFunction& getCallee(ZfCCfgProcedureCall* pCall) const;
    const VariableUse& getUse() const { return m_Use; }
    /// The variable is a parameter or an automatic variable of the only function that uses it.
    bool isLocal(const Variable* pVariable) const;
    /// The argument that a call gives to a formal of its callee, or null if the formal takes none
    /// any more.
    const Term* findArgument(const FlowItem& Call, const Variable* pFormal) const;

private:
    void findProcedures(ProgramGraph& Graph);
    void readFlows(FlowReader& Reader);
    void markCalled();
    void chooseParameters(EmittedFunction& Function, bool IsSSAForm);
    void countUses();
    bool leaveOutUnread(FlowReader& Reader);
    bool canBeLocal(const Variable* pVariable) const;
    void chooseLocals();

    std::vector<EmittedFunction> m_Functions;
    std::unordered_map<std::string, int> m_NumberOf; // looked up only
    VariableUse m_Use;
    std::vector<bool> m_IsLocal; // by Variable::Index
};

} // namespace hpn

#endif
