#ifndef TREERUNNER_H
#define TREERUNNER_H

#include "Graph/ProgramGraph.h"
#include "Model/Conversion.h"
#include "Model/ZfCCfgSFAssignment.h"
#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"
#include "ZfCCfgExternCall.h"

#include <algorithm>
#include <map>
#include <random>
#include <string_view>
#include <utility>
#include <vector>

namespace hpn::test {

/// What a program writes to its outputs, in order; and the numbers that its inputs give, one for
/// each read.
struct World {
    explicit World(unsigned Seed) : Inputs(Seed) {}
    std::mt19937 Inputs;
    std::vector<std::pair<std::string_view, double>> Written;
    std::map<const Variable*, std::vector<double>> Store;
    std::size_t Fuel = 2000000;

    double& at(const Variable& Of, double Index) {
        std::vector<double>& Elements = Store[&Of];
        if (Elements.empty())
            Elements.assign(Of.Count > 0 ? Of.Count : 1, convertNumber(0.0, *Of.pType));
        const double Last = static_cast<double>(Elements.size() - 1);
        const double Whole = computeBinary(Operator::BitOr, Index, 0.0);
        return Elements[static_cast<std::size_t>(Whole < 0.0 ? 0.0 : std::min(Whole, Last))];
    }
    double load(const Variable& Of, double Index) {
        if (Of.Kind != VariableKind::Input)
            return at(Of, Index);
        return numberOfRaw(
            smallestRaw(Of.pType->Base) +
                static_cast<int>(Inputs() % 256 %
                                 (greatestRaw(Of.pType->Base) - smallestRaw(Of.pType->Base) + 1)),
            *Of.pType);
    }
    void store(const Variable& To, double Index, double Number) {
        at(To, Index) = convertNumber(Number, *To.pType);
        if (To.Kind == VariableKind::Output)
            Written.push_back({To.Name, at(To, Index)});
    }
};

/// Evaluates syntax trees and terms alike: both have the same shape but for the variable.
inline const Variable& declarationOf(const Expression* p) {
    return *p->pVariable;
}
inline const Variable& declarationOf(const Term* p) {
    return originalOf(p->pVariable)->getDeclaration();
}

template <class Tree>
double evaluate(const Tree* p, World& In) {
    switch (p->Op) {
    case Operator::Number:
        return p->Number;
    case Operator::Variable:
        return In.load(declarationOf(p), 0.0);
    case Operator::Element: {
        const double Index = evaluate(p->pLeft, In);
        return In.load(declarationOf(p), Index);
    }
    case Operator::Cast:
        return convertNumber(evaluate(p->pLeft, In), *p->pType);
    default:
        break;
    }
    const double Left = evaluate(p->pLeft, In);
    if (p->pRight == nullptr)
        return computeUnary(p->Op, Left);
    if ((p->Op == Operator::LogicalAnd && Left == 0.0) ||
        (p->Op == Operator::LogicalOr && Left == 1.0))
        return p->Op == Operator::LogicalOr ? 1.0 : 0.0;
    const double Right = evaluate(p->pRight, In);
    return computeBinary(p->Op, Left, Right);
}

/// Runs the syntax tree by recursion; jumps other than goto are signals.
class TreeRunner {
public:
    explicit TreeRunner(World& In) : m_In(In) {}
    enum class Signal { Normal, Break, Continue, Return };

    void call(const Procedure& Called) {
        if (Called.pResult != nullptr)
            m_In.store(*Called.pResult, 0.0, 0.0);
        m_Procedures.push_back(&Called);
        run(Called.pBody);
        m_Procedures.pop_back();
    }

private:
    Signal run(const Statement* p) {
        for (; p != nullptr && m_In.Fuel > 0; p = p->pNext) {
            const Signal Next = step(p);
            if (Next != Signal::Normal)
                return Next;
        }
        return Signal::Normal;
    }
    double value(const Statement* p, double Index) {
        const double Right = evaluate(p->pValue, m_In);
        return p->CompoundOp == Operator::Number
                   ? Right
                   : computeBinary(p->CompoundOp, m_In.load(*p->pTarget, Index), Right);
    }
    Signal loop(const Statement* p) {
        if (p->pInit != nullptr)
            run(p->pInit);
        bool IsFirst = p->Kind == StatementKind::DoWhile;
        for (; m_In.Fuel > 0 &&
               (IsFirst || p->pCondition == nullptr || evaluate(p->pCondition, m_In) != 0.0);
             IsFirst = false) {
            --m_In.Fuel;
            const Signal Next = run(p->pBody);
            if (Next == Signal::Return)
                return Next;
            if (Next == Signal::Break)
                break;
            run(p->pStep);
        }
        return Signal::Normal;
    }
    Signal select(const Statement* p) {
        const double Value = evaluate(p->pCondition, m_In);
        const Statement* pFrom = nullptr;
        for (const Statement* s = p->pBody; s != nullptr; s = s->pNext) {
            if (s->Kind == StatementKind::Case && evaluate(s->pCondition, m_In) == Value) {
                pFrom = s;
                break;
            }
            if (s->Kind == StatementKind::Default)
                pFrom = s;
        }
        const Signal Next = run(pFrom);
        return Next == Signal::Break ? Signal::Normal : Next;
    }
    void call(const Statement* p) {
        std::vector<double> Arguments;
        for (const Expression* a = p->pArguments; a != nullptr; a = a->pNext)
            Arguments.push_back(evaluate(a, m_In));
        for (std::size_t i = 0; i < Arguments.size(); ++i)
            m_In.store(*p->pProcedure->Formals[i], 0.0, Arguments[i]);
        call(*p->pProcedure);
        if (p->pTarget != nullptr)
            m_In.store(*p->pTarget, 0.0, m_In.load(*p->pProcedure->pResult, 0.0));
    }
    Signal step(const Statement* p) {
        switch (p->Kind) {
        case StatementKind::Assign:
        case StatementKind::LocalDecl: {
            const double Index = p->pIndex != nullptr ? evaluate(p->pIndex, m_In) : 0.0;
            m_In.store(*p->pTarget, Index, p->pValue != nullptr ? value(p, Index) : 0.0);
            return Signal::Normal;
        }
        case StatementKind::Call:
            call(p);
            return Signal::Normal;
        case StatementKind::If:
            return run(evaluate(p->pCondition, m_In) != 0.0 ? p->pBody : p->pElse);
        case StatementKind::While:
        case StatementKind::DoWhile:
        case StatementKind::For:
            return loop(p);
        case StatementKind::Switch:
            return select(p);
        case StatementKind::Block:
            return run(p->pBody);
        case StatementKind::Break:
            return Signal::Break;
        case StatementKind::Continue:
            return Signal::Continue;
        case StatementKind::Return:
            if (p->pValue != nullptr)
                m_In.store(*m_Procedures.back()->pResult, 0.0, evaluate(p->pValue, m_In));
            return Signal::Return;
        default:
            return Signal::Normal;
        }
    }

    World& m_In;
    std::vector<const Procedure*> m_Procedures;
};

/// Runs the graph as the emitter reads it: by original variables, statements for the analysis alone
/// passed over. The loop around main is followed Steps times.
class GraphRunner {
public:
    GraphRunner(ProgramGraph& Graph, World& In, int Steps)
        : m_Graph(Graph.getGraph()), m_In(In), m_Steps(Steps) {}

    void call(const char* pName) {
        ZfCCfgProcedure* pProcedure = nullptr;
        leda::node v = m_Graph.demandProcedureEntryNode(pName, pProcedure);
        while (v != nullptr && m_In.Fuel-- > 0) {
            ZfCBasicBlock* pBlock = m_Graph[v]->isBasicBlock();
            if (pBlock != nullptr) {
                for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
                    run(pStatement);
            }
            v = next(v, pBlock);
        }
    }

private:
    leda::node next(leda::node v, ZfCBasicBlock* pBlock) {
        std::vector<leda::edge> Ways;
        for (leda::edge e : m_Graph.out_edges(v)) {
            if (m_Graph[e]->isSSAEdge() == nullptr)
                Ways.push_back(e);
        }
        bool Holds = true;
        if (pBlock != nullptr && pBlock->getBranchCond() != nullptr)
            Holds = holds(pBlock->getBranchCond());
        if (Ways.size() < 2)
            return Ways.empty() ? nullptr : m_Graph.target(Ways.front());
        return m_Graph.target((m_Graph[Ways[0]]->isTrueBranch() != nullptr) == Holds ? Ways[0]
                                                                                     : Ways[1]);
    }
    bool holds(ZfCCfgExpression* pCondition) {
        ZfCCfgSFExpression* pOwn = pCondition->isSFExpression();
        return pOwn != nullptr ? evaluate(pOwn->getRoot(), m_In) != 0.0 : --m_Steps > 0;
    }
    void run(ZfCCfgStatement* pStatement) {
        if (pStatement->getIsVirtual())
            return;
        if (ZfCCfgAssignment* pAssignment = pStatement->isAssignment())
            return assign(pAssignment);
        if (ZfCCfgSFProcedureCall* pCall = pStatement->isSFProcedureCall()) {
            for (const ZfCCfgSFProcedureCall::Argument& Next : pCall->getArguments())
                m_In.store(Next.pFormal->getDeclaration(), 0.0,
                           evaluate(Next.pExpression->isSFExpression()->getRoot(), m_In));
            call(pCall->getName().cstring());
        }
    }
    void assign(ZfCCfgAssignment* pAssignment) {
        const Variable& Target = originalOf(pAssignment->getLHS())->getDeclaration();
        ZfCCfgSFExpression* pOwn = pAssignment->getRHS()->isSFExpression();
        if (pOwn == nullptr)
            return; // an initial value
        const Term* pRoot = pOwn->getRoot();
        const double Index = pRoot->isStore() ? evaluate(pRoot->pLeft, m_In) : 0.0;
        m_In.store(Target, Index, evaluate(pRoot->isStore() ? pRoot->pRight : pRoot, m_In));
    }

    ZfCControlFlowGraph& m_Graph;
    World& m_In;
    int m_Steps;
};

} // namespace hpn::test

#endif
