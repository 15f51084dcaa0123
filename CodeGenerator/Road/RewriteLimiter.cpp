#include "Road/RewriteLimiter.h"

#include "Graph/ProgramGraph.h"
#include "Model/ZfCCfgSFAssignment.h"
#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"

#include <map>
#include <string>
#include <unordered_map>
#include <vector>

namespace hpn {

namespace {

// The removal of unused definitions, played through without an edit. Follows the pass to the
// letter: a first sweep over all nodes, then further ones over the definitions whose last use has
// gone, each at the moment at which a sweep over all nodes would come by.
class RemovalRehearsal {
public:
    explicit RemovalRehearsal(ZfCControlFlowGraph& Graph) : m_Graph(Graph) {
        for (leda::node v = Graph.first_node(); v != nullptr; v = Graph.next_node(v))
            for (ZfCCfgVariable* pVariable : Graph.inf(v)->getUsedVariables())
                countUse(pVariable, 1);
    }

    struct Removal {
        ZfCCfgStatement* pStatement;
        ZfCCfgVariable* pVariable;
    };

    std::vector<Removal> play() {
        for (leda::node v = m_Graph.first_node(); v != nullptr; v = m_Graph.next_node(v))
            examine(v);
        while (!m_NextSweep.empty()) {
            m_ThisSweep.swap(m_NextSweep);
            while (!m_ThisSweep.empty()) {
                const leda::node v = m_ThisSweep.begin()->second;
                m_ThisSweep.erase(m_ThisSweep.begin());
                examine(v);
            }
        }
        return std::move(m_Removals);
    }

private:
    // A virtual alias keeps its real variable alive.
    void countUse(ZfCCfgVariable* pVariable, int Step) {
        m_Uses[pVariable] += Step;
        m_AllUses[pVariable] += Step;
        ZfCCfgVariable* pReal = pVariable->getNonVirtualAlias();
        if (pReal != nullptr && pReal != pVariable)
            m_AllUses[pReal] += Step;
    }

    static ZfCCfgStatement* onlyStatement(ZfCBasicBlock* pBlock) {
        ZfCCfgStatement* pStatement = pBlock->isPhiFunction();
        return pStatement != nullptr ? pStatement : pBlock->isStatement();
    }

    void examine(leda::node v) {
        ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
        ZfCCfgStatement* pStatement = pBlock != nullptr ? onlyStatement(pBlock) : nullptr;
        if (pStatement == nullptr)
            return;
        const auto Defined = pStatement->getDefinedVariables();
        if (Defined.size() != 1)
            return;
        ZfCCfgVariable* pVariable = Defined.key(Defined.first_item());
        if (!pVariable->isErasable() || pVariable->isArray())
            return;
        if (m_AllUses[pVariable] != 0 || pStatement->hasSideEffects()) {
            m_DefiningNode[pVariable] = v;
            return;
        }
        m_DefiningNode.erase(pVariable);
        m_Removals.push_back({pStatement, pVariable});
        for (ZfCCfgVariable* pUsed : pStatement->getUsedVariables()) {
            countUse(pUsed, -1);
            if (m_Uses[pUsed] == 0)
                lookAgainAt(pUsed, v);
        }
    }

    void lookAgainAt(ZfCCfgVariable* pVariable, leda::node Current) {
        for (ZfCCfgVariable* pCandidate : {pVariable, pVariable->getNonVirtualAlias()}) {
            const auto Found = m_DefiningNode.find(pCandidate);
            if (Found == m_DefiningNode.end())
                continue;
            const int Place = m_Graph.index(Found->second);
            auto& Sweep = Place > m_Graph.index(Current) ? m_ThisSweep : m_NextSweep;
            Sweep.emplace(Place, Found->second);
        }
    }

    ZfCControlFlowGraph& m_Graph;
    std::unordered_map<ZfCCfgVariable*, int> m_Uses;    // looked up only, like the next two
    std::unordered_map<ZfCCfgVariable*, int> m_AllUses; // with those of virtual aliases
    std::unordered_map<ZfCCfgVariable*, leda::node> m_DefiningNode;
    std::map<int, leda::node> m_ThisSweep; // by index of the node, which is the order of a sweep
    std::map<int, leda::node> m_NextSweep;
    std::vector<Removal> m_Removals;
};

SourcePosition positionOf(ZfCCfgStatement* pStatement) {
    if (ZfCCfgSFAssignment* pOwn = pStatement->isSFAssignment())
        return pOwn->getPosition();
    ZfCCfgAssignment* pAssignment = pStatement->isAssignment();
    ZfCCfgSFExpression* pRight =
        pAssignment != nullptr ? pAssignment->getRHS()->isSFExpression() : nullptr;
    return pRight != nullptr ? pRight->getRoot()->getPosition() : SourcePosition{};
}

} // namespace

void RewriteLimiter::beforePass(const PassStep& Step, ProgramGraph& Graph) {
    switch (Step.pPass->Id) {
    case PassId::InlineProcedures:
        return holdBackCalls(Graph);
    case PassId::PropagateSparseConditionalConstant:
        return registerConditions(Graph);
    case PassId::RemoveUnusedVarDefs:
        return holdBackRemovals(Graph);
    default:
        return;
    }
}

void RewriteLimiter::holdBackCalls(ProgramGraph& Program) {
    const std::vector<ZfCCfgProcedureCall*> Calls = Program.listCalls();
    std::map<std::string, unsigned> Counts;
    for (ZfCCfgProcedureCall* pCall : Calls)
        ++Counts[pCall->getName().cstring()];
    for (ZfCCfgProcedureCall* pCall : Calls) {
        if (pCall->isCallToDirectlyOrIndirectlyFromOutsideCallableFcn() ||
            Counts[pCall->getName().cstring()] != 1)
            continue;
        ZfCCfgSFProcedureCall* pOwn = pCall->isSFProcedureCall();
        const std::string What = std::string("call of ") + pCall->getName().cstring() + " inlined";
        if (!m_Budget.take(What.c_str(), pOwn != nullptr ? pOwn->getPosition() : SourcePosition{}))
            pCall->setIsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(true);
    }
}

void RewriteLimiter::registerConditions(ProgramGraph& Program) {
    ZfCControlFlowGraph& Graph = Program.getGraph();
    for (leda::node v = Graph.first_node(); v != nullptr; v = Graph.next_node(v)) {
        ZfCBasicBlock* pBlock = Graph.inf(v)->isBasicBlock();
        ZfCCfgExpression* pCondition = pBlock != nullptr ? pBlock->getBranchCond() : nullptr;
        if (pCondition != nullptr && pCondition->isSFExpression() != nullptr)
            m_Budget.registerCondition(pCondition->isSFExpression());
    }
}

// An original variable serves as the use that stays: the pass counts the uses of versions, and
// clears those that it counts. Hung on a version as a virtual alias, it is counted for that one.
void RewriteLimiter::holdBackRemovals(ProgramGraph& Program) {
    if (Program.getProgram().Variables.empty())
        return;
    ZfCCfgSFVariable* pKeeper = Program.getVariable(Program.getProgram().Variables.front());
    for (const RemovalRehearsal::Removal& Each : RemovalRehearsal(Program.getGraph()).play()) {
        const std::string What = "definition of " +
                                 std::string(originalOf(Each.pVariable)->getDeclaration().Name) +
                                 " removed";
        if (m_Budget.take(What.c_str(), positionOf(Each.pStatement)))
            continue;
        pKeeper->appendUse(Program.getGraph().first_node());
        Each.pVariable->appendVirtualAlias(pKeeper);
    }
}

} // namespace hpn
