#ifndef GRAPHTESTPROGRAM_H
#define GRAPHTESTPROGRAM_H

#include "Language/Program.h"
#include "Model/Conversion.h"

#include <initializer_list>
#include <vector>

namespace hpn::test {

/// Syntax trees without a reader: what the checker would leave, made by hand or at random.
class TestProgram {
public:
    Program Tree;

    TestProgram() {
        static const char* const Names[] = {"bool",  "int8",   "uint8",   "int16",  "uint16",
                                            "int32", "uint32", "float32", "float64"};
        for (int i = 0; i < 9; ++i) {
            Type& BuiltIn = Tree.Types.emplace_back();
            BuiltIn.Name = Names[i];
            BuiltIn.Base = static_cast<BaseType>(i);
        }
        Tree.pMain = &procedure("main");
        Tree.pMain->IsMain = true;
    }

    Procedure& procedure(const char* pName) {
        Procedure& Made = Tree.Procedures.emplace_back();
        Made.Name = pName;
        Made.Index = static_cast<std::uint32_t>(Tree.Procedures.size() - 1);
        return Made;
    }

    Variable& variable(VariableKind Kind, const char* pName, const Type* pType,
                       Procedure* pOwner = nullptr) {
        Variable& Made = Tree.Variables.emplace_back();
        Made.Kind = Kind;
        Made.Name = pName;
        Made.pType = pType;
        Made.pOwner = pOwner;
        Made.Index = static_cast<std::uint32_t>(Tree.Variables.size() - 1);
        Made.Initial = {convertNumber(0.0, *pType)};
        if (Kind == VariableKind::Formal)
            pOwner->Formals.push_back(&Made);
        else if (Kind == VariableKind::Local)
            pOwner->Locals.push_back(&Made);
        else if (Kind == VariableKind::Result)
            pOwner->pResult = &Made;
        return Made;
    }
    Variable& variable(VariableKind Kind, const char* pName, BaseType Base,
                       Procedure* pOwner = nullptr) {
        return variable(Kind, pName, Tree.builtIn(Base), pOwner);
    }

    Expression* number(double Number) {
        Expression* pMade = Tree.newExpression();
        pMade->Number = Number;
        return pMade;
    }
    Expression* read(Variable& Read, Expression* pIndex = nullptr) {
        Expression* pMade = Tree.newExpression();
        pMade->Op = pIndex != nullptr ? Operator::Element : Operator::Variable;
        pMade->pVariable = &Read;
        pMade->pLeft = pIndex;
        return pMade;
    }
    Expression* op(Operator Op, Expression* pLeft, Expression* pRight = nullptr,
                   const Type* pType = nullptr) {
        Expression* pMade = Tree.newExpression();
        pMade->Op = Op;
        pMade->pLeft = pLeft;
        pMade->pRight = pRight;
        pMade->pType = pType;
        return pMade;
    }

    Statement* statement(StatementKind Kind, Expression* pCondition = nullptr,
                         Statement* pBody = nullptr, Statement* pElse = nullptr) {
        Statement* pMade = Tree.newStatement();
        pMade->Kind = Kind;
        pMade->pCondition = pCondition;
        pMade->pBody = pBody;
        pMade->pElse = pElse;
        return pMade;
    }
    Statement* assign(Variable& Target, Expression* pValue, Expression* pIndex = nullptr,
                      Operator Compound = Operator::Number) {
        Statement* pMade = statement(StatementKind::Assign);
        pMade->pTarget = &Target;
        pMade->pValue = pValue;
        pMade->pIndex = pIndex;
        pMade->CompoundOp = Compound;
        return pMade;
    }
    Statement* call(Procedure& Callee, std::initializer_list<Expression*> Arguments = {},
                    Variable* pTarget = nullptr) {
        Statement* pMade = statement(StatementKind::Call);
        pMade->pProcedure = &Callee;
        pMade->pTarget = pTarget;
        Expression** ppNext = &pMade->pArguments;
        for (Expression* pArgument : Arguments) {
            *ppNext = pArgument;
            ppNext = &pArgument->pNext;
        }
        return pMade;
    }
    static Statement* list(const std::vector<Statement*>& Statements) {
        for (std::size_t i = 0; i + 1 < Statements.size(); ++i)
            Statements[i]->pNext = Statements[i + 1];
        return Statements.empty() ? nullptr : Statements.front();
    }
};

} // namespace hpn::test

#endif
