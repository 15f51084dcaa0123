#ifndef GRAPHRANDOMPROGRAM_H
#define GRAPHRANDOMPROGRAM_H

#include "Generators/GraphTestProgram.h"

#include <random>
#include <vector>

namespace hpn::test {

/// Random programs that end: every loop counts to three. Flags, small constants, equal statements
/// in both arms, procedures with one and with several calls, so that every pass finds something to
/// do.
class RandomProgram : public TestProgram {
public:
    explicit RandomProgram(unsigned Seed) : m_Random(Seed) {
        m_Clipped = *Tree.builtIn(BaseType::UInt8);
        m_Clipped.HasRange = m_Clipped.SaturatesHigh = m_Clipped.SaturatesLow = true;
        m_Clipped.Lower = 2.0;
        m_Clipped.Upper = 100.0;
        m_Scaled = *Tree.builtIn(BaseType::Int16);
        m_Scaled.IsScaled = true;
        m_Scaled.Lsb = 0.5;
        m_Scaled.Offset = 1.0;
        for (const BaseType Base : {BaseType::UInt8, BaseType::Bool})
            m_Read.push_back(&variable(VariableKind::Input, "in", Base));
        for (const char* pName : {"o1", "o2"})
            m_Written.push_back(&variable(VariableKind::Output, pName,
                                          pick(2) == 0 ? BaseType::Float64 : BaseType::Int16));
        for (const BaseType Base : {BaseType::Bool, BaseType::UInt8, BaseType::Int8,
                                    BaseType::Float32, BaseType::Float64, BaseType::Bool})
            m_Written.push_back(&variable(VariableKind::State, "s", Base));
        m_Written.push_back(&variable(VariableKind::State, "clipped", &m_Clipped));
        m_Written.push_back(&variable(VariableKind::State, "scaled", &m_Scaled));
        m_Read.insert(m_Read.end(), m_Written.begin(), m_Written.end());
        m_Read.push_back(&variable(VariableKind::Param, "param", BaseType::UInt8));
        m_pArray = &variable(VariableKind::State, "array", BaseType::Int8);
        m_pArray->Count = 4;
        for (const char* pName : {"p", "q"}) {
            Procedure& Made = procedure(pName);
            variable(VariableKind::Formal, "a", BaseType::Int16, &Made);
            variable(VariableKind::Result, "r", BaseType::Int8, &Made);
            fill(Made, 4);
            m_Callable.push_back(&Made);
        }
        fill(*Tree.pMain, 9);
    }

private:
    unsigned pick(unsigned Count) { return static_cast<unsigned>(m_Random() % Count); }

    void fill(Procedure& Filled, int Count) {
        m_pOwner = &Filled;
        const std::vector<Variable*> Outer = m_Read;
        if (!Filled.Formals.empty())
            m_Read.push_back(Filled.Formals[0]);
        Filled.pBody = block(Count, 3);
        m_Read = Outer;
    }
    Expression* leaf() {
        static const double Numbers[] = {0.0, 1.0, 2.0, 3.0, -1.0, 0.5, 100.0, 255.0, 70000.0};
        if (pick(3) == 0)
            return number(Numbers[pick(9)]);
        if (pick(8) == 0)
            return read(*m_pArray, number(pick(5)));
        return read(*m_Read[pick(static_cast<unsigned>(m_Read.size()))]);
    }
    Expression* expression(int Height) {
        if (Height == 0 || pick(4) == 0)
            return leaf();
        if (pick(6) == 0)
            return unary(Height);
        if (pick(8) == 0)
            return cast(Height);
        Expression* pLeft = expression(Height - 1);
        Expression* pRight = expression(Height - 1);
        return op(static_cast<Operator>(static_cast<unsigned>(Operator::Multiply) + pick(20)),
                  pLeft, pRight);
    }
    // Each draw has a statement of its own: arguments are evaluated in no fixed order.
    Expression* unary(int Height) {
        Expression* pOperand = expression(Height - 1);
        return op(static_cast<Operator>(static_cast<unsigned>(Operator::Negate) + pick(5)),
                  pOperand);
    }
    Expression* cast(int Height) {
        Expression* pOperand = expression(Height - 1);
        return op(Operator::Cast, pOperand, nullptr,
                  pick(2) == 0 ? &m_Clipped : Tree.builtIn(static_cast<BaseType>(pick(9))));
    }
    Expression* condition() {
        Variable& Tested = *m_Read[pick(static_cast<unsigned>(m_Read.size()))];
        switch (pick(4)) {
        case 0:
            return read(Tested);
        case 1:
            return op(Operator::LogicalNot, read(Tested));
        case 2: {
            const Operator Op = pick(2) == 0 ? Operator::Equal : Operator::NotEqual;
            return op(Op, read(Tested), number(pick(4)));
        }
        default:
            return expression(2);
        }
    }
    Statement* block(int Count, int Depth) {
        std::vector<Statement*> Statements;
        for (int i = 0; i < Count; ++i)
            Statements.push_back(anyStatement(Depth));
        return list(Statements);
    }
    Statement* simple() {
        if (pick(6) == 0) {
            Expression* pValue = expression(2);
            Expression* pIndex = expression(1);
            return assign(*m_pArray, pValue, pIndex,
                          pick(2) == 0 ? Operator::Add : Operator::Number);
        }
        Variable& Target =
            *m_Written[pick(3) == 0 ? pick(2) : pick(static_cast<unsigned>(m_Written.size()))];
        Expression* pValue = pick(3) == 0 ? number(pick(3)) : expression(2);
        return assign(Target, pValue, nullptr,
                      pick(5) == 0 ? Operator::Multiply : Operator::Number);
    }
    Statement* branch(int Depth) {
        Expression* pCondition = condition();
        if (pick(3) != 0) {
            Statement* pThen = block(2, Depth - 1);
            return statement(StatementKind::If, pCondition, pThen,
                             block(static_cast<int>(pick(3)), Depth - 1));
        }
        // Equal statements at the top of both arms.
        Variable& Target = *m_Written[pick(static_cast<unsigned>(m_Written.size()))];
        Variable& Source = *m_Written[pick(static_cast<unsigned>(m_Written.size()))];
        const auto arm = [&] {
            return list({assign(Target, read(Source)), assign(*m_Written[0], number(3)), simple()});
        };
        Statement* pThen = arm();
        return statement(StatementKind::If, pCondition, pThen, arm());
    }
    Statement* leaveOrRepeat() {
        Expression* pCondition = condition();
        return statement(StatementKind::If, pCondition,
                         statement(pick(2) == 0 ? StatementKind::Break : StatementKind::Continue));
    }
    Statement* loop(int Depth) {
        Variable& Counter = variable(VariableKind::Local, "i", BaseType::UInt8, m_pOwner);
        Statement* pStart = statement(StatementKind::LocalDecl);
        pStart->pTarget = &Counter;
        Expression* pCondition = op(Operator::Less, read(Counter), number(3));
        Statement* pCount = assign(Counter, number(1), nullptr, Operator::Add);
        Statement* pBody = block(2, Depth - 1);
        if (pick(3) == 0)
            pBody = list({leaveOrRepeat(), statement(StatementKind::Block, nullptr, pBody)});
        if (pick(2) == 0) {
            Statement* pFor = statement(StatementKind::For, pCondition, pBody);
            pFor->pInit = pStart;
            pFor->pStep = pCount;
            return pFor;
        }
        Statement* pInner = statement(StatementKind::Block, nullptr, pBody);
        Statement* pLoop = statement(pick(2) == 0 ? StatementKind::While : StatementKind::DoWhile,
                                     pCondition, list({pCount, pInner}));
        return statement(StatementKind::Block, nullptr, list({pStart, pLoop}));
    }
    Statement* select(int Depth) {
        std::vector<Statement*> Body;
        for (int i = 0; i < 3; ++i) {
            Body.push_back(i == 1 && pick(2) == 0 ? statement(StatementKind::Default)
                                                  : statement(StatementKind::Case, number(i)));
            Body.push_back(anyStatement(Depth - 1));
            if (pick(2) == 0)
                Body.push_back(statement(StatementKind::Break));
        }
        Expression* pSelector = expression(1);
        return statement(StatementKind::Switch, pSelector, list(Body));
    }
    Statement* anyStatement(int Depth) {
        switch (Depth > 0 ? pick(9) : 8) {
        case 0:
        case 1:
            return branch(Depth);
        case 2:
            return loop(Depth);
        case 3:
            return select(Depth);
        case 4: {
            if (m_Callable.empty())
                return simple();
            Procedure& Callee = *m_Callable[pick(static_cast<unsigned>(m_Callable.size()))];
            Expression* pArgument = expression(1);
            return call(Callee, {pArgument}, pick(2) == 0 ? m_Written[pick(5)] : nullptr);
        }
        case 5: {
            if (m_pOwner->pResult == nullptr)
                return simple();
            Statement* pReturn = statement(StatementKind::Return);
            pReturn->pValue = expression(1);
            Expression* pCondition = condition();
            return statement(StatementKind::If, pCondition, pReturn);
        }
        default:
            return simple();
        }
    }

    std::mt19937 m_Random;
    Type m_Clipped;
    Type m_Scaled;
    std::vector<Variable*> m_Read;
    std::vector<Variable*> m_Written; // outputs first
    Variable* m_pArray = nullptr;
    std::vector<Procedure*> m_Callable;
    Procedure* m_pOwner = nullptr;
};

} // namespace hpn::test

#endif
