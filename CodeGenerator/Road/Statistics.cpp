#include "Road/Statistics.h"

#include "Graph/ProgramGraph.h"
#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"

#include <cstring>

namespace hpn {

/// Counts the sweeps of a propagation: for the time of the pass it takes the place of the condition
/// of the loop around main. That condition is visited when control first reaches its node, which
/// happens once in each sweep, and it reads no variable, so nothing else makes the library look at
/// it again.
class IterationProbe : public ZfCCfgExpression {
public:
    explicit IterationProbe(ProgramGraph& Graph);
    ~IterationProbe() override;
    std::size_t getCount() const { return m_Count; }

    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override { return {}; }
    void replaceVariable(ZfCCfgVariable*, ZfCCfgVariable*) override {}
    void replaceConditionWithConstant(double) override {}
    ZfCCfgValue evaluate() override;
    ZfCCfgValue getMinimum() override { return eCfgValueUndetermined; }
    ZfCCfgValue getMaximum() override { return eCfgValueUndetermined; }
    void replaceConstantVariables() override {}
    void replaceConstantCondition() override {}
    void foldConstants() override {}
    void actOnComparisonOutsideBoolRange() override {}

private:
    ZfCBasicBlock* m_pBlock = nullptr; ///< null: there is no loop around main
    ZfCCfgExpression* m_pReplaced = nullptr;
    std::size_t m_Count = 0;
};

namespace {

bool isOutside(ZfCCfgNodeInfo* pNode) {
    ZfCCfgProcedure* pProcedure = pNode->getProcedure();
    return pProcedure != nullptr &&
           std::strcmp(pProcedure->getName().cstring(), ProgramGraph::outsideProcedureName()) == 0;
}

bool isCode(ZfCCfgStatement* pStatement) {
    if (pStatement->getIsVirtual())
        return false;
    return pStatement->isSFAssignment() != nullptr || pStatement->isProcedureCall() != nullptr ||
           pStatement->isExternCall() != nullptr;
}

// Number of edges of control flow, up to two, among the in- or out-edges of a node; the first of
// them in Found.
int countControlFlow(ZfCControlFlowGraph& Graph, leda::node v, bool IsIn, leda::edge& Found) {
    int Count = 0;
    leda::edge e = IsIn ? Graph.first_in_edge(v) : Graph.first_adj_edge(v);
    for (; e != nullptr && Count < 2; e = IsIn ? Graph.in_succ(e) : Graph.adj_succ(e)) {
        if (Graph.inf(e)->isSSAEdge() != nullptr)
            continue;
        if (Count++ == 0)
            Found = e;
    }
    return Count;
}

// A condition with one way left decides nothing: it only stays in the code for what it reads.
bool isCodeCondition(ProgramGraph& Program, leda::node v) {
    ZfCControlFlowGraph& Graph = Program.getGraph();
    ZfCCfgExpression* pCondition = Graph.inf(v)->isBasicBlock()->getBranchCond();
    if (pCondition == nullptr || pCondition->isSFExpression() == nullptr ||
        Program.isNeverLeft(pCondition))
        return false;
    leda::edge First = nullptr;
    return countControlFlow(Graph, v, false, First) > 1 || pCondition->hasSideEffects();
}

bool isCodeNode(ProgramGraph& Program, leda::node v) {
    if (isCodeCondition(Program, v))
        return true;
    for (ZfCCfgStatement* pStatement : Program.getGraph().inf(v)->isBasicBlock()->getStatementSeq())
        if (isCode(pStatement))
            return true;
    return false;
}

// Whether a node with code begins a straight run. Going backwards it passes nodes without code,
// each of which lies in front of one node with code at most, so all calls together are linear.
bool beginsBlock(ProgramGraph& Program, leda::node v) {
    ZfCControlFlowGraph& Graph = Program.getGraph();
    const leda::node Start = v;
    leda::edge Edge = nullptr;
    while (countControlFlow(Graph, v, true, Edge) == 1) {
        v = Graph.source(Edge);
        ZfCBasicBlock* pBlock = Graph.inf(v)->isBasicBlock();
        if (v == Start || pBlock == nullptr || countControlFlow(Graph, v, false, Edge) != 1)
            return true;
        if (isCodeNode(Program, v))
            return false;
    }
    return true;
}

void countDefinitions(ZfCCfgStatement* pStatement, GraphCounts& Counts) {
    for (ZfCCfgVariable* pVariable : pStatement->getDefinedVariables()) {
        ++Counts.Definitions;
        if (pVariable->isSSAVariable() != nullptr && pVariable->getValue().isConstant() &&
            !pStatement->getIsVirtual())
            ++Counts.ConstantVersions;
    }
}

void countTerms(ZfCCfgExpression* pExpression, GraphCounts& Counts) {
    if (pExpression == nullptr || pExpression->isSFExpression() == nullptr)
        return;
    std::vector<const Term*> Stack{pExpression->isSFExpression()->getRoot()};
    while (!Stack.empty()) {
        const Term* pTerm = Stack.back();
        Stack.pop_back();
        Counts.Reads += pTerm->Op == Operator::Variable ? 1 : 0;
        Counts.Operations += pTerm->Op != Operator::Variable && pTerm->Op != Operator::Number;
        for (const Term* pOperand : {pTerm->pLeft, pTerm->pRight})
            if (pOperand != nullptr)
                Stack.push_back(pOperand);
    }
}

void countExpressions(ZfCCfgStatement* pStatement, GraphCounts& Counts) {
    if (ZfCCfgAssignment* pAssignment = pStatement->isAssignment())
        countTerms(pAssignment->getRHS(), Counts);
    ZfCCfgProcedureCall* pAnyCall = pStatement->isProcedureCall();
    ZfCCfgSFProcedureCall* pCall = pAnyCall != nullptr ? pAnyCall->isSFProcedureCall() : nullptr;
    if (pCall == nullptr)
        return;
    for (const ZfCCfgSFProcedureCall::Argument& Next : pCall->getArguments())
        countTerms(Next.pExpression, Counts);
}

void countCondition(ZfCCfgExpression* pCondition, GraphCounts& Counts) {
    countTerms(pCondition, Counts);
    ZfCCfgSFExpression* pOwn = pCondition != nullptr ? pCondition->isSFExpression() : nullptr;
    if (pOwn != nullptr && pOwn->getRoot()->Op == Operator::Number)
        ++Counts.FixedConditions;
}

void countBlock(ProgramGraph& Graph, leda::node v, ZfCBasicBlock* pBlock, GraphCounts& Counts) {
    for (ZfCPhiFunction* pPhi : pBlock->getPhiFunctions()) {
        countDefinitions(pPhi, Counts);
        ++Counts.PhiFunctions;
    }
    countCondition(pBlock->getBranchCond(), Counts);
    for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq()) {
        countDefinitions(pStatement, Counts);
        countExpressions(pStatement, Counts);
        ZfCCfgAssignment* pAssignment = pStatement->isAssignment();
        if (pAssignment != nullptr && pAssignment->getIsValidConditionAssignment())
            ++Counts.Notes;
        if (isCode(pStatement))
            ++Counts.Statements;
    }
    if (isCodeCondition(Graph, v))
        ++Counts.Conditions;
    if (isCodeNode(Graph, v) && beginsBlock(Graph, v))
        ++Counts.Blocks;
}

std::size_t difference(std::size_t Before, std::size_t After) {
    return Before > After ? Before - After : 0;
}

// What one pass did, in one figure. `Total` is where the figure goes besides, or null.
struct Effect {
    PassId Id;
    const char* What;
    std::size_t GraphCounts::*pCount;
    bool IsGain; ///< the pass makes more of what is counted; else it makes less
    std::size_t Statistics::*pTotal;
};

const Effect Effects[] = {
    {PassId::MakeProcedureAndCall, "procedures extracted", &GraphCounts::Procedures, true,
     &Statistics::ProceduresExtracted},
    {PassId::PlaceExitNodes, "exit nodes placed", &GraphCounts::Nodes, true, nullptr},
    {PassId::InlineProcedures, "procedures inlined", &GraphCounts::Procedures, false,
     &Statistics::ProceduresInlined},
    {PassId::PlaceLoopAroundMain, "loop closed", &GraphCounts::Nodes, true, nullptr},
    {PassId::InsertValidConditionAssignments, "condition assignments made", &GraphCounts::Notes,
     true, &Statistics::ConditionAssignments},
    {PassId::TransformToSSAForm, "phi functions placed", &GraphCounts::PhiFunctions, true, nullptr},
    {PassId::DivideBasicBlock, "nodes gained", &GraphCounts::Nodes, true, nullptr},
    {PassId::PropagateSparseConditionalConstant, "dead nodes removed", &GraphCounts::Nodes, false,
     &Statistics::DeadNodesRemoved},
    {PassId::ReplaceConstantConditions, "conditions decided", &GraphCounts::FixedConditions, true,
     nullptr},
    {PassId::ReplaceConstantVariables, "reads replaced by constants", &GraphCounts::Reads, false,
     nullptr},
    {PassId::FoldConstants, "operations computed", &GraphCounts::Operations, false, nullptr},
    {PassId::RemoveUnusedVarDefs, "unused definitions removed", &GraphCounts::Definitions, false,
     &Statistics::UnusedDefinitionsRemoved},
    // One of two equal statements goes for each that is moved.
    {PassId::HoistCodeOutOfIfElseBranches, "statements hoisted", &GraphCounts::Statements, false,
     &Statistics::StatementsHoisted},
};

// What a pass did, from the counts before and after it.
void noteEffect(Statistics::Record& Record, PassId Id, const GraphCounts& Before,
                Statistics& Result) {
    for (const Effect& Each : Effects) {
        if (Each.Id != Id)
            continue;
        const std::size_t Old = Before.*Each.pCount;
        const std::size_t New = Record.After.*Each.pCount;
        Record.What = Each.What;
        Record.Figure = Each.IsGain ? difference(New, Old) : difference(Old, New);
        if (Each.pTotal != nullptr)
            Result.*Each.pTotal += Record.Figure;
    }
    if (Id == PassId::PropagateSparseConditionalConstant)
        Result.ConstantsFound = Record.After.ConstantVersions;
}

// The block of the loop around main: the only condition of main that is neither the client's nor a
// way out never taken.
ZfCBasicBlock* findLoopAroundMain(ProgramGraph& Program) {
    ZfCControlFlowGraph& Graph = Program.getGraph();
    for (leda::node v = Graph.first_node(); v != nullptr; v = Graph.next_node(v)) {
        ZfCCfgNodeInfo* pNode = Graph.inf(v);
        ZfCBasicBlock* pBlock = pNode->isBasicBlock();
        if (pBlock == nullptr || pBlock->getBranchCond() == nullptr ||
            pNode->getProcedure() == nullptr)
            continue;
        ZfCCfgExpression* pCondition = pBlock->getBranchCond();
        if (pCondition->isSFExpression() == nullptr && !Program.isNeverLeft(pCondition) &&
            std::strcmp(pNode->getProcedure()->getName().cstring(), "#main") == 0)
            return pBlock;
    }
    return nullptr;
}

} // namespace

IterationProbe::IterationProbe(ProgramGraph& Graph) : m_pBlock(findLoopAroundMain(Graph)) {
    if (m_pBlock == nullptr)
        return;
    m_pReplaced = m_pBlock->getBranchCond();
    m_pBlock->appendBranch(this);
}

// An endless program may have lost the block as dead code, and with it the condition.
IterationProbe::~IterationProbe() {
    if (m_pBlock != nullptr && m_pBlock->getBranchCond() == this)
        m_pBlock->appendBranch(m_pReplaced);
}

ZfCCfgValue IterationProbe::evaluate() {
    ++m_Count;
    return eCfgValueUndetermined;
}

GraphCounts countGraph(ProgramGraph& Program) {
    ZfCControlFlowGraph& Graph = Program.getGraph();
    GraphCounts Counts;
    for (leda::node v = Graph.first_node(); v != nullptr; v = Graph.next_node(v)) {
        ZfCCfgNodeInfo* pNode = Graph.inf(v);
        ++Counts.Nodes;
        if (isOutside(pNode))
            continue;
        if (pNode->isEntryNode() != nullptr)
            ++Counts.Procedures;
        if (ZfCBasicBlock* pBlock = pNode->isBasicBlock())
            countBlock(Program, v, pBlock, Counts);
    }
    for (leda::edge e = Graph.first_edge(); e != nullptr; e = Graph.next_edge(e))
        if (Graph.inf(e)->isSSAEdge() == nullptr)
            ++Counts.Edges;
    return Counts;
}

StatisticsObserver::StatisticsObserver() = default;
StatisticsObserver::~StatisticsObserver() = default;

void StatisticsObserver::beforeAll(ProgramGraph& Graph) {
    m_Statistics.Before = m_Statistics.After = countGraph(Graph);
    for (const Procedure& Each : Graph.getProgram().Procedures) {
        m_Statistics.RecursiveProcedures += Each.IsRecursive ? 1 : 0;
        m_Statistics.ExportedProcedures +=
            Graph.isReachableFromOutside(Each) && !Each.IsRecursive ? 1 : 0;
    }
}

void StatisticsObserver::beforePass(const PassStep& Step, ProgramGraph& Graph) {
    if (Step.pPass->Id == PassId::PropagateSparseConditionalConstant)
        m_pProbe = std::make_unique<IterationProbe>(Graph);
}

void StatisticsObserver::afterPass(const PassStep& Step, ProgramGraph& Graph) {
    if (m_pProbe != nullptr)
        m_Statistics.Iterations += m_pProbe->getCount();
    m_pProbe.reset();
    const GraphCounts Before = m_Statistics.After;
    m_Statistics.After = countGraph(Graph);
    m_Statistics.Passes.push_back({Step.pPass->Name, Step.Seconds, m_Statistics.After, 0, ""});
    noteEffect(m_Statistics.Passes.back(), Step.pPass->Id, Before, m_Statistics);
}

} // namespace hpn
