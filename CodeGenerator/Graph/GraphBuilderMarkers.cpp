#include "Graph/GraphBuilder.h"

#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"
#include "ZfCCfgExternCall.h"
#include "ZfCCfgFactory.h"

// What code outside the program can do, told to the optimiser:
//
// 1. "#outside" calls every exported procedure once, with arguments of which nothing is known. It
// is never emitted.
// 2. A variable is volatile where its value can change behind the optimiser's back: an extern or an
// exported procedure
//    writes it; or where there is one of it for each activation: formals and locals of recursive
//    procedures.
// 3. A definition may be removed if nobody but the optimiser's graph reads it: not that of a
// volatile variable, of an output,
//    of what an extern or an exported procedure touches, or of an exported procedure's result.
// 4. Calls to what can be called from outside, and to what calls itself, are marked, which also
// keeps them from inlining.

namespace hpn {

namespace {

bool isGlobal(const Variable& Declaration) {
    return Declaration.pOwner == nullptr;
}

} // namespace

// Point 1

void GraphBuilder::buildOutside() {
    leda::node Last = nullptr;
    for (const Procedure& Source : m_Source.Procedures) {
        if (!Source.IsExported)
            continue;
        if (Last == nullptr)
            Last = m_Graph.demandProcedureEntryNode(ProgramGraph::outsideProcedureName(),
                                                    m_pCurrentProcedure);
        leda::node Node = nullptr;
        ZfCBasicBlock* pBlock = newBlock(Node);
        callFromOutside(Source, pBlock);
        link(Last, Node, ZfCCfgFactory::getInstance()->createEdgeInfo());
        Last = Node;
    }
}

void GraphBuilder::callFromOutside(const Procedure& Exported, ZfCBasicBlock* pBlock) {
    const std::string Name(Exported.Name);
    auto* pCall = new ZfCCfgSFProcedureCall(Name.c_str(), &Exported, Exported.Position);
    pBlock->append(pCall);
    for (const Variable* pFormal : Exported.Formals) {
        ZfCCfgExpression* pUnknown =
            ZfCCfgFactory::getInstance()->createValueExpression(ZfCCfgValue(eCfgValueNonConstant));
        pCall->appendArgument(variableOf(*pFormal), pUnknown);
    }
    handOver(pCall);
}

// Point 2

void GraphBuilder::markExternVariables() {
    for (const Extern& Outside : m_Source.Externs) {
        for (const Variable* pWritten : Outside.Writes) {
            variableOf(*pWritten)->markAsVolatile();
            variableOf(*pWritten)->markAsWrittenByExtern();
        }
    }
}

void GraphBuilder::markRecursiveVariables() {
    for (const std::unique_ptr<ZfCCfgSFVariable>& pVariable : m_Target.m_Variables) {
        const Variable& Declaration = pVariable->getDeclaration();
        if (Declaration.pOwner != nullptr && Declaration.pOwner->IsRecursive &&
            Declaration.Kind != VariableKind::Result)
            pVariable->markAsVolatile();
    }
}

/// By Procedure::Index: exported, or called directly or indirectly by an exported one.
std::vector<bool> GraphBuilder::findOutsideReachable() const {
    std::vector<bool> Reachable(m_Source.Procedures.size(), false);
    std::vector<const Procedure*> Stack;
    const auto reach = [&](const Procedure* pProcedure) {
        if (Reachable[pProcedure->Index])
            return;
        Reachable[pProcedure->Index] = true;
        Stack.push_back(pProcedure);
    };
    for (const Procedure& Source : m_Source.Procedures) {
        if (Source.IsExported)
            reach(&Source);
    }
    while (!Stack.empty()) {
        const Procedure* pCaller = Stack.back();
        Stack.pop_back();
        for (const Procedure* pCallee : m_Callees[pCaller->Index])
            reach(pCallee);
    }
    return Reachable;
}

/// Walks the code that the outside can reach: globals that it writes become volatile, those that it
/// reads or writes are touched.
void GraphBuilder::markOutsideVariables(const std::vector<bool>& Reachable,
                                        std::vector<bool>& Touched) {
    for (const Extern& Outside : m_Source.Externs) {
        for (const std::vector<Variable*>* pList : {&Outside.Reads, &Outside.Writes}) {
            for (const Variable* pVariable : *pList)
                Touched[pVariable->Index] = true;
        }
    }
    std::vector<ZfCCfgProcedure*> Procedures;
    for (std::size_t i = 0; i < Reachable.size(); ++i) {
        if (Reachable[i])
            Procedures.push_back(m_Procedures[i]);
    }
    if (Procedures.empty())
        return;
    const std::unordered_set<ZfCCfgProcedure*> IsReachable(Procedures.begin(), Procedures.end());
    const auto touch = [&](ZfCCfgVariable* pVariable, bool IsWritten) {
        const Variable& Declaration = originalOf(pVariable)->getDeclaration();
        if (!isGlobal(Declaration))
            return;
        Touched[Declaration.Index] = true;
        if (IsWritten)
            pVariable->markAsVolatile();
    };
    for (leda::node v : m_Graph.all_nodes()) {
        ZfCBasicBlock* pBlock = m_Graph[v]->isBasicBlock();
        if (pBlock == nullptr || IsReachable.count(pBlock->getProcedure()) == 0)
            continue;
        for (ZfCCfgVariable* pVariable : pBlock->getUsedVariables())
            touch(pVariable, false);
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq()) {
            for (ZfCCfgVariable* pVariable : pStatement->getDefinedVariables())
                touch(pVariable, true);
        }
    }
    // Arguments are no uses of the blocks that they stand in.
    for (ZfCCfgSFProcedureCall* pCall : m_Calls) {
        for (const ZfCCfgSFProcedureCall::Argument& Next : pCall->getArguments()) {
            for (ZfCCfgVariable* pVariable : Next.pExpression->getUsedVariables())
                touch(pVariable, false);
        }
    }
}

// Point 3

void GraphBuilder::markErasable(const std::vector<bool>& Touched) {
    for (const std::unique_ptr<ZfCCfgSFVariable>& pVariable : m_Target.m_Variables) {
        const Variable& Declaration = pVariable->getDeclaration();
        const bool IsResultForOutside =
            Declaration.Kind == VariableKind::Result && Declaration.pOwner->IsExported;
        if (pVariable->isVolatile() || pVariable->isOutput() || Touched[Declaration.Index] ||
            IsResultForOutside)
            continue;
        pVariable->markAsErasable();
    }
}

// Point 4

void GraphBuilder::flagCalls(const std::vector<bool>& Reachable) {
    for (ZfCCfgSFProcedureCall* pCall : m_Calls) {
        const Procedure& Callee = *pCall->getCallee();
        if (Reachable[Callee.Index] || Callee.IsRecursive)
            pCall->setIsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(true);
    }
}

} // namespace hpn
