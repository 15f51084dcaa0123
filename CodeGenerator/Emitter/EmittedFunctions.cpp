#include "Emitter/EmittedFunctions.h"

#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"
#include "ZfCCfgNodeInfo.h"
#include "ZfCCfgProcedure.h"

#include <algorithm>
#include <unordered_set>
#include <utility>

// Steps:
//   1. find the procedures by their entry nodes;
//   2. read their flows, see which are called, choose what is passed as parameters, count reads and
//   writes;
//   3. leave out assignments to locals that nothing reads and go to 2, until there are none: each
//   round can make others unread;
//   4. choose where the variables live.

namespace hpn {

EmittedFunctions::EmittedFunctions(ProgramGraph& Graph) {
    findProcedures(Graph);
    FlowReader Reader(Graph);
    do {
        readFlows(Reader);
        markCalled();
        countUses();
    } while (leaveOutUnread(Reader));
    chooseLocals();
}

void EmittedFunctions::findProcedures(ProgramGraph& Graph) {
    ZfCControlFlowGraph& Nodes = Graph.getGraph();
    for (leda::node v = Nodes.first_node(); v != Nodes.stop_node(); v = Nodes.next_node(v)) {
        ZfCCfgNodeInfo* pInfo = Nodes.inf(v);
        if (!pInfo->isEntryNode())
            continue;
        EmittedFunction Function;
        Function.EntryNode = v;
        Function.ProcedureName = pInfo->getProcedure()->getName().cstring();
        if (Function.ProcedureName == ProgramGraph::outsideProcedureName())
            continue;
        Function.pSource = Graph.findProcedure(Function.ProcedureName.c_str());
        m_Functions.push_back(std::move(Function));
    }
    std::sort(m_Functions.begin(), m_Functions.end(),
              [](const EmittedFunction& a, const EmittedFunction& b) {
                  if (a.pSource && b.pSource)
                      return a.pSource->Index < b.pSource->Index;
                  if (a.pSource || b.pSource)
                      return a.pSource != nullptr;
                  return a.ProcedureName < b.ProcedureName;
              });
    for (std::size_t i = 0; i < m_Functions.size(); ++i)
        m_NumberOf[m_Functions[i].ProcedureName] = static_cast<int>(i);
}

const EmittedFunction& EmittedFunctions::getCallee(ZfCCfgProcedureCall* pCall) const {
    return m_Functions[m_NumberOf.find(pCall->getName().cstring())->second];
}

void EmittedFunctions::readFlows(FlowReader& Reader) {
    bool IsSSAForm = false;
    for (EmittedFunction& Function : m_Functions) {
        Function.Flow = Reader.read(Function.EntryNode);
        IsSSAForm = IsSSAForm || Function.Flow.IsSSAForm;
    }
    for (EmittedFunction& Function : m_Functions)
        chooseParameters(Function, IsSSAForm);
}

/// A formal is passed while its parameter statement stands, and always before there are any. An
/// exported procedure keeps the signature that its callers outside know.
void EmittedFunctions::chooseParameters(EmittedFunction& Function, bool IsSSAForm) {
    Function.Parameters.clear();
    Function.Fed.clear();
    if (!Function.pSource)
        return;
    const std::vector<const Variable*>& Standing = Function.Flow.Parameters;
    for (const Variable* pFormal : Function.pSource->Formals) {
        const bool IsFed =
            !IsSSAForm || std::find(Standing.begin(), Standing.end(), pFormal) != Standing.end();
        if (IsFed)
            Function.Fed.push_back(pFormal);
        if (IsFed || Function.pSource->IsExported)
            Function.Parameters.push_back(pFormal);
    }
}

void EmittedFunctions::markCalled() {
    std::vector<int> WorkList;
    for (std::size_t i = 0; i < m_Functions.size(); ++i) {
        EmittedFunction& Function = m_Functions[i];
        Function.IsEmitted =
            Function.pSource && (Function.pSource->IsMain || Function.pSource->IsExported);
        if (Function.IsEmitted)
            WorkList.push_back(static_cast<int>(i));
    }
    while (!WorkList.empty()) {
        const int Caller = WorkList.back();
        WorkList.pop_back();
        for (const FlowItem& Item : m_Functions[Caller].Flow.Items) {
            if (Item.Kind != FlowItemKind::Call)
                continue;
            const int Callee = m_NumberOf.find(Item.pAnyCall->getName().cstring())->second;
            if (!m_Functions[Callee].IsEmitted)
                WorkList.push_back(Callee);
            m_Functions[Callee].IsEmitted = true;
        }
    }
}

const Term* EmittedFunctions::findArgument(const FlowItem& Call, const Variable* pFormal) const {
    const std::vector<const Variable*>& Fed = getCallee(Call.pAnyCall).Fed;
    if (!Call.pCall || std::find(Fed.begin(), Fed.end(), pFormal) == Fed.end())
        return nullptr;
    for (const ZfCCfgSFProcedureCall::Argument& Argument : Call.pCall->getArguments())
        if (&Argument.pFormal->getDeclaration() == pFormal)
            if (ZfCCfgSFExpression* pExpression = Argument.pExpression->isSFExpression())
                return pExpression->getRoot();
    return nullptr;
}

void EmittedFunctions::countUses() {
    m_Use = VariableUse();
    for (std::size_t i = 0; i < m_Functions.size(); ++i) {
        const EmittedFunction& Function = m_Functions[i];
        if (!Function.IsEmitted)
            continue;
        const int Number = static_cast<int>(i);
        m_Use.add(Number, Function.Flow);
        for (const Variable* pFormal : Function.Parameters)
            m_Use.addWrite(Number, pFormal);
        if (Function.pSource && Function.pSource->IsExported && Function.pSource->pResult)
            m_Use.addRead(Number, Function.pSource->pResult);
        for (const FlowItem& Item : Function.Flow.Items) {
            if (Item.Kind != FlowItemKind::Call)
                continue;
            for (const Variable* pFormal : getCallee(Item.pAnyCall).Fed)
                if (const Term* pArgument = findArgument(Item, pFormal))
                    m_Use.addArgument(Number, pArgument, pFormal);
        }
    }
}

bool EmittedFunctions::canBeLocal(const Variable* pVariable) const {
    return (pVariable->Kind == VariableKind::Local || pVariable->Kind == VariableKind::Formal) &&
           pVariable->Count == 0 && m_Use.onlyFunction(pVariable) >= 0;
}

bool EmittedFunctions::leaveOutUnread(FlowReader& Reader) {
    bool Found = false;
    for (const EmittedFunction& Function : m_Functions) {
        if (!Function.IsEmitted)
            continue;
        for (const FlowItem& Item : Function.Flow.Items) {
            if (Item.Kind != FlowItemKind::Assign || !canBeLocal(Item.pTarget) ||
                m_Use.isRead(Item.pTarget))
                continue;
            Reader.leaveOut(Item.pTarget);
            Found = true;
        }
    }
    return Found;
}

/// A variable of one function lives in it unless it can be read before it is written there: then it
/// keeps its value from one call to the next, as it does for the optimiser. The variables of a
/// procedure that calls itself are each activation's own.
void EmittedFunctions::chooseLocals() {
    std::vector<std::vector<const Variable*>> Candidates(m_Functions.size());
    for (const Variable* pVariable : m_Use.getAll()) {
        if (pVariable->Index >= m_IsLocal.size())
            m_IsLocal.resize(pVariable->Index + 1, false);
        if (canBeLocal(pVariable))
            Candidates[m_Use.onlyFunction(pVariable)].push_back(pVariable);
    }
    for (std::size_t i = 0; i < m_Functions.size(); ++i) {
        EmittedFunction& Function = m_Functions[i];
        const std::vector<const Variable*> AllLive = liveAtEntry(Function.Flow, Candidates[i]);
        // Asked for membership only, never walked.
        const std::unordered_set<const Variable*> Live(AllLive.begin(), AllLive.end());
        const std::unordered_set<const Variable*> Parameters(Function.Parameters.begin(),
                                                             Function.Parameters.end());
        for (const Variable* pVariable : Candidates[i]) {
            const bool IsParameter = Parameters.count(pVariable) != 0;
            const bool IsLive = !IsParameter && Live.count(pVariable) != 0;
            const bool IsOwn = pVariable->pOwner && pVariable->pOwner->IsRecursive;
            m_IsLocal[pVariable->Index] = !IsLive || IsOwn;
            if (!IsParameter && m_IsLocal[pVariable->Index])
                Function.Locals.push_back(pVariable);
            if (IsLive && IsOwn)
                Function.ZeroedLocals.push_back(pVariable);
        }
    }
}

bool EmittedFunctions::isLocal(const Variable* pVariable) const {
    return pVariable->Index < m_IsLocal.size() && m_IsLocal[pVariable->Index];
}

} // namespace hpn
