#include "Graph/GraphBuilder.h"

#include "Model/ZfCCfgSFAssignment.h"
#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"
#include "ZfCCfgExternCall.h"
#include "ZfCCfgFactory.h"

#include <string>

// From the syntax tree to the graph.
//
// 1. Variables for all declarations, entry nodes for all procedures, so that calls can be bound in
// any order.
// 2. Each procedure in the order of the source: its sketch, a node for each reached block, the
// edges, the statements.
// 3. "#outside", which stands for all callers that are not in the program.
// 4. The markers of variables and calls (GraphBuilderMarkers.cpp), for which all procedures must be
// known. Recursion goes over the height of one expression only.

namespace hpn {

GraphBuilder::GraphBuilder(ProgramGraph& Target)
    : m_Target(Target), m_Source(Target.getProgram()), m_Graph(Target.getGraph()),
      m_Terms(Target.getTerms()) {
}

void GraphBuilder::build() {
    makeVariables();
    makeProcedures();
    for (const Procedure& Source : m_Source.Procedures)
        buildProcedure(Source);
    buildOutside();
    if (!m_Target.getHiddenVariables().empty())
        variableOf(m_Target.getHiddenVariables().back()); // all get their object, unread ones too
    const std::vector<bool> Reachable = findOutsideReachable();
    std::vector<bool> Touched(m_Target.m_Variables.size(), false);
    markExternVariables();
    markRecursiveVariables();
    markOutsideVariables(Reachable, Touched);
    markErasable(Touched);
    flagCalls(Reachable);
    m_Target.m_OutsideReachable = Reachable;
}

// Step 1

void GraphBuilder::makeVariables() {
    m_Target.m_Variables.reserve(m_Source.Variables.size());
    for (const Variable& Declaration : m_Source.Variables)
        m_Target.m_Variables.push_back(std::make_unique<ZfCCfgSFVariable>(Declaration));
}

void GraphBuilder::makeProcedures() {
    m_Procedures.reserve(m_Source.Procedures.size());
    m_Callees.resize(m_Source.Procedures.size());
    for (const Procedure& Source : m_Source.Procedures) {
        const std::string Name(Source.IsMain ? "#main" : Source.Name);
        ZfCCfgProcedure* pProcedure = nullptr;
        const leda::node Entry = m_Graph.demandProcedureEntryNode(Name.c_str(), pProcedure);
        m_Procedures.push_back(pProcedure);
        if (Source.IsMain)
            m_Graph.setStartNode(Entry);
    }
}

// Step 2

void GraphBuilder::buildProcedure(const Procedure& Source) {
    m_pCurrent = &Source;
    m_pCurrentProcedure = m_Procedures[Source.Index];
    FlowSketch Sketch(m_Target.m_Hidden);
    Sketch.draw(Source);
    makeBlocks(Sketch);
    linkBlocks(Sketch);
    noteLabels(Source, Sketch);
    buildPrologue(Source, Sketch.canBypassDeclarations());
    for (const Action& Next : Sketch.getActions()) {
        if (m_Blocks[Next.Block] != nullptr)
            buildAction(Next, m_Blocks[Next.Block]);
    }
}

ZfCBasicBlock* GraphBuilder::newBlock(leda::node& Node) {
    ZfCBasicBlock* pBlock = ZfCCfgFactory::getInstance()->createBasicBlock();
    pBlock->setProcedure(m_pCurrentProcedure);
    Node = m_Graph.new_node(pBlock);
    return pBlock;
}

void GraphBuilder::link(leda::node From, leda::node To, ZfCCfgEdgeInfo* pEdge) {
    m_Graph.new_edge(From, To, pEdge);
}

void GraphBuilder::makeBlocks(const FlowSketch& Sketch) {
    const std::vector<SketchBlock>& Blocks = Sketch.getBlocks();
    m_Nodes.assign(Blocks.size(), nullptr);
    m_Blocks.assign(Blocks.size(), nullptr);
    for (std::size_t i = 0; i < Blocks.size(); ++i) {
        if (Blocks[i].IsReached)
            m_Blocks[i] = newBlock(m_Nodes[i]);
    }
}

void GraphBuilder::linkBlocks(const FlowSketch& Sketch) {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    link(m_pCurrentProcedure->getEntryNode(), m_Nodes[0], pFactory->createEdgeInfo());
    const std::vector<SketchBlock>& Blocks = Sketch.getBlocks();
    for (std::size_t i = 0; i < Blocks.size(); ++i) {
        const SketchBlock& Block = Blocks[i];
        if (!Block.IsReached || Block.Next == SketchBlock::None)
            continue;
        const leda::node Next = m_Nodes[static_cast<std::size_t>(Block.Next)];
        ZfCCfgExpression* pCondition = makeCondition(Block);
        if (pCondition == nullptr) {
            link(m_Nodes[i], Next, pFactory->createEdgeInfo());
            continue;
        }
        m_Blocks[i]->appendBranch(pCondition);
        link(m_Nodes[i], Next, pFactory->createTrueBranch());
        link(m_Nodes[i], m_Nodes[static_cast<std::size_t>(Block.Otherwise)],
             pFactory->createFalseBranch());
    }
}

void GraphBuilder::noteLabels(const Procedure& Source, const FlowSketch& Sketch) {
    for (const auto& [pLabel, Block] : Sketch.getLabels()) {
        if (m_Nodes[static_cast<std::size_t>(Block)] != nullptr)
            m_Target.m_Labels.push_back({pLabel->Position, pLabel->Name, &Source,
                                         m_Nodes[static_cast<std::size_t>(Block)]});
    }
}

ZfCCfgExpression* GraphBuilder::makeCondition(const SketchBlock& Block) {
    if (Block.IsNeverLeft) {
        ZfCCfgExpression* pUnknown = ZfCCfgFactory::getInstance()->createValueExpression();
        m_Target.m_NeverLeft.insert(pUnknown);
        return pUnknown;
    }
    if (Block.pCondition == nullptr)
        return nullptr;
    Term* pTerm = makeTerm(Block.pCondition);
    if (Block.pSelector != nullptr) {
        pTerm = m_Terms.makeBinary(Operator::Equal,
                                   m_Terms.makeVariable(variableOf(*Block.pSelector)), pTerm);
        pTerm->setPosition(Block.pCondition->Position);
    }
    return makeExpression(pTerm);
}

/// A result that no return sets is 0. Locals are set to 0 here only where control can come past
/// their declarations; what is not needed of it the optimiser removes.
void GraphBuilder::buildPrologue(const Procedure& Source, bool ZeroesLocals) {
    const auto zero = [this, &Source](const Variable& Zeroed) {
        append(variableOf(Zeroed), convert(Zeroed.pType, m_Terms.makeNumber(0.0), Source.Position),
               Source.Position, m_Blocks[0]);
    };
    if (Source.pResult != nullptr)
        zero(*Source.pResult);
    if (!ZeroesLocals)
        return;
    for (const Variable* pLocal : Source.Locals) {
        if (pLocal->Count == 0)
            zero(*pLocal);
    }
}

void GraphBuilder::buildAction(const Action& Next, ZfCBasicBlock* pBlock) {
    const Statement& Source = *Next.pStatement;
    switch (Next.Kind) {
    case ActionKind::Assign:
        return buildAssignment(Source, pBlock);
    case ActionKind::Zero:
        return append(variableOf(*Next.pVariable),
                      convert(Next.pVariable->pType, m_Terms.makeNumber(0.0), Source.Position),
                      Source.Position, pBlock);
    case ActionKind::Select:
        return assignHidden(*Next.pVariable, makeTerm(Source.pCondition), Source.Position, pBlock);
    case ActionKind::PrepareCall:
        return prepareCall(Source, pBlock);
    case ActionKind::Call:
        return buildCall(Source, pBlock);
    case ActionKind::TakeResult:
        return takeResult(Source, pBlock);
    case ActionKind::CallExtern:
        return callExtern(Source, pBlock);
    case ActionKind::Return: {
        const Variable& Result = *m_pCurrent->pResult;
        return append(variableOf(Result),
                      convert(Result.pType, makeTerm(Source.pValue), Source.Position),
                      Source.Position, pBlock);
    }
    }
}

// Statements

void GraphBuilder::append(ZfCCfgSFVariable* pLHS, Term* pRHS, SourcePosition Position,
                          ZfCBasicBlock* pBlock) {
    auto* pAssignment = new ZfCCfgSFAssignment(Position);
    pAssignment->setLHS(pLHS);
    pAssignment->setRHS(makeExpression(pRHS));
    pBlock->append(pAssignment);
    pLHS->markAsAssigned();
}

void GraphBuilder::buildAssignment(const Statement& Source, ZfCBasicBlock* pBlock) {
    if (Source.pIndex != nullptr)
        return buildElementAssignment(Source, pBlock);
    const Variable& Target = *Source.pTarget;
    Term* pValue =
        Source.pValue != nullptr ? makeTerm(Source.pValue) : m_Terms.makeNumber(1.0); // x++
    if (Source.Kind == StatementKind::Assign && Source.CompoundOp != Operator::Number) {
        Term* pOld = m_Terms.makeVariable(variableOf(Target));
        pValue = m_Terms.makeBinary(Source.CompoundOp, pOld, pValue);
        pValue->setPosition(Source.Position);
    }
    append(variableOf(Target), convert(Target.pType, pValue, Source.Position), Source.Position,
           pBlock);
}

/// A compound assignment names its index once, but the graph reads it twice; where that reads an
/// input it is read ahead.
void GraphBuilder::buildElementAssignment(const Statement& Source, ZfCBasicBlock* pBlock) {
    const bool IsCompound = Source.CompoundOp != Operator::Number;
    const Variable* pHidden = nullptr;
    if (IsCompound && readsInput(Source.pIndex)) {
        pHidden = &makeHidden("index", Source.Position);
        assignHidden(*pHidden, makeTerm(Source.pIndex), Source.Position, pBlock);
    }
    const auto makeIndex = [&] {
        return pHidden != nullptr ? m_Terms.makeVariable(variableOf(*pHidden))
                                  : makeTerm(Source.pIndex);
    };
    Term* pValue = Source.pValue != nullptr ? makeTerm(Source.pValue) : m_Terms.makeNumber(1.0);
    if (IsCompound) {
        Term* pOld = makeElement(*Source.pTarget, makeIndex(), Source.Position);
        pValue = m_Terms.makeBinary(Source.CompoundOp, pOld, pValue);
        pValue->setPosition(Source.Position);
    }
    appendStore(Source, makeIndex(), pValue, pBlock);
}

void GraphBuilder::appendStore(const Statement& Source, Term* pIndex, Term* pValue,
                               ZfCBasicBlock* pBlock) {
    const Variable& Array = *Source.pTarget;
    Term* pStore = makeElement(Array, pIndex, Source.Position);
    pStore->pRight = convert(Array.pType, pValue, Source.Position);
    append(variableOf(Array), pStore, Source.Position, pBlock);
}

void GraphBuilder::assignHidden(const Variable& Hidden, Term* pValue, SourcePosition Position,
                                ZfCBasicBlock* pBlock) {
    append(variableOf(Hidden), convert(Hidden.pType, pValue, Position), Position, pBlock);
}

void GraphBuilder::prepareCall(const Statement& Source, ZfCBasicBlock* pBlock) {
    m_PreparedArguments.clear();
    for (const Expression* p = Source.pArguments; p != nullptr; p = p->pNext) {
        const Variable* pHidden = nullptr;
        if (mustPrepareArgument(p, *m_pCurrent, *Source.pProcedure)) {
            pHidden = &makeHidden("argument", p->Position);
            assignHidden(*pHidden, makeTerm(p), p->Position, pBlock);
        }
        m_PreparedArguments.push_back(pHidden);
    }
}

/// The library keeps the arguments at the callee's parameter statements; the call keeps them as
/// well, by formal.
void GraphBuilder::handOver(ZfCCfgSFProcedureCall* pCall) {
    leda::list<ZfCCfgVariable*> Formals;
    leda::list<ZfCCfgExpression*> Expressions;
    for (const ZfCCfgSFProcedureCall::Argument& Next : pCall->getArguments()) {
        Formals.append(Next.pFormal);
        Expressions.append(Next.pExpression);
        Next.pFormal->markAsAssigned();
    }
    m_Graph.setParametersOfCall(pCall, Formals, Expressions);
    m_Calls.push_back(pCall);
}

void GraphBuilder::buildCall(const Statement& Source, ZfCBasicBlock* pBlock) {
    const Procedure& Callee = *Source.pProcedure;
    const std::string Name(Callee.Name);
    auto* pCall = new ZfCCfgSFProcedureCall(Name.c_str(), &Callee, Source.Position);
    pBlock->append(pCall);
    const Expression* pArgument = Source.pArguments;
    for (std::size_t i = 0; i < Callee.Formals.size(); ++i, pArgument = pArgument->pNext) {
        const Variable& Formal = *Callee.Formals[i];
        const Variable* pHidden = m_PreparedArguments.empty() ? nullptr : m_PreparedArguments[i];
        Term* pValue =
            pHidden != nullptr ? m_Terms.makeVariable(variableOf(*pHidden)) : makeTerm(pArgument);
        Term* pRoot = convert(Formal.pType, pValue, pArgument->Position);
        pCall->appendArgument(variableOf(Formal), makeExpression(pRoot));
    }
    m_PreparedArguments.clear();
    handOver(pCall);
    m_Callees[m_pCurrent->Index].push_back(&Callee);
}

void GraphBuilder::takeResult(const Statement& Source, ZfCBasicBlock* pBlock) {
    Term* pResult = m_Terms.makeVariable(variableOf(*Source.pProcedure->pResult));
    if (Source.pIndex != nullptr)
        return appendStore(Source, makeTerm(Source.pIndex), pResult, pBlock);
    append(variableOf(*Source.pTarget), convert(Source.pTarget->pType, pResult, Source.Position),
           Source.Position, pBlock);
}

void GraphBuilder::callExtern(const Statement& Source, ZfCBasicBlock* pBlock) {
    leda::list<ZfCCfgVariable*> Modifiable;
    for (const Variable* pWritten : Source.pExtern->Writes)
        Modifiable.append(variableOf(*pWritten));
    auto* pCall = new ZfCCfgExternCall(&Modifiable);
    for (const Variable* pRead : Source.pExtern->Reads)
        pCall->appendUsedVariable(variableOf(*pRead));
    pBlock->append(pCall);
    m_Target.m_Externs.emplace(pCall, ProgramGraph::ExternUse{Source.pExtern, Source.Position});
}

// Terms

Term* GraphBuilder::makeTerm(const Expression* pSource) {
    if (pSource == nullptr)
        return nullptr;
    Term* pTerm = m_Terms.make();
    pTerm->Op = pSource->Op;
    pTerm->setPosition(pSource->Position);
    if (pSource->Op == Operator::Number)
        pTerm->Number = pSource->Number;
    else if (pSource->Op == Operator::Cast)
        pTerm->pType = pSource->pType;
    else if (pTerm->hasVariable())
        pTerm->pVariable = variableOf(*pSource->pVariable);
    pTerm->pLeft = makeTerm(pSource->pLeft);
    pTerm->pRight = makeTerm(pSource->pRight);
    return pTerm;
}

Term* GraphBuilder::makeElement(const Variable& Array, Term* pIndex, SourcePosition Position) {
    Term* pTerm = m_Terms.makeUnary(Operator::Element, pIndex);
    pTerm->pVariable = variableOf(Array);
    pTerm->setPosition(Position);
    return pTerm;
}

Term* GraphBuilder::convert(const Type* pType, Term* pValue, SourcePosition Position) {
    Term* pTerm = m_Terms.makeCast(pType, pValue);
    pTerm->setPosition(Position);
    return pTerm;
}

ZfCCfgSFExpression* GraphBuilder::makeExpression(Term* pRoot) {
    auto* pExpression = new ZfCCfgSFExpression(pRoot);
    ZfCCfgFactory::getInstance()->addSFExpression(pExpression);
    return pExpression;
}

/// Hidden variables get their object when they are first named.
ZfCCfgSFVariable* GraphBuilder::variableOf(const Variable& Declaration) {
    std::vector<std::unique_ptr<ZfCCfgSFVariable>>& Variables = m_Target.m_Variables;
    while (Variables.size() <= Declaration.Index) {
        const std::size_t Next = Variables.size() - m_Source.Variables.size();
        Variables.push_back(
            std::make_unique<ZfCCfgSFVariable>(m_Target.getHiddenVariables()[Next]));
    }
    return Variables[Declaration.Index].get();
}

const Variable& GraphBuilder::makeHidden(const char* pStem, SourcePosition Position) {
    return m_Target.m_Hidden.make(pStem, *m_pCurrent, Position);
}

} // namespace hpn
