#ifndef ZFCCFGPARAMSTATEMENT_H
#define ZFCCFGPARAMSTATEMENT_H

#include "LEDA/h_array.h"
#include "ZfCCfgExpression.h"
#include "ZfCCfgProcedureCall.h"
#include "ZfCCfgStatement.h"

// The definition of one variable at the entry of a procedure, with one argument expression for each
// call of it.
//
// It makes the flow of values into a callee an ordinary definition. It emits no code, does not show
// itself to a visitor by accept, and cannot be copied. Neither the variable nor the expressions are
// owned. The table of arguments walks in the order in which the calls were entered.
class HPNSSA_EXPORT ZfCCfgParamStatement : public ZfCCfgStatement {
public:
    // Defines this variable; no call is entered yet.
    explicit ZfCCfgParamStatement(ZfCCfgVariable* pVariable);
    ZfCCfgParamStatement(const ZfCCfgParamStatement&) = delete;
    ZfCCfgParamStatement& operator=(const ZfCCfgParamStatement&) = delete;

    ZfCCfgParamStatement* isParamStatement() override;
    // Null: it is not cloned.
    ZfCCfgStatement* clone() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getDefinedVariables() override;
    // The variables of all arguments.
    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;

protected:
    ~ZfCCfgParamStatement() override;

public:
    // Show the statement to an SSA visitor, before and after its arguments.
    virtual void acceptStart(ZfCCfgVisitor* pVisitor);
    virtual void acceptEnd(ZfCCfgVisitor* pVisitor);

    // The variable defined: the original, and from renaming on its version.
    ZfCCfgVariable* getVariable() { return m_pVariable; }
    void setVariable(ZfCCfgVariable* pVariable) { m_pVariable = pVariable; }

    // The argument of a call. Reading that of an unknown call enters the call with null.
    ZfCCfgExpression* getParamExpression(ZfCCfgProcedureCall* pCall) {
        return m_ParamExpressions[pCall];
    }
    void setParamExpression(ZfCCfgProcedureCall* pCall, ZfCCfgExpression* pExpression) {
        m_ParamExpressions[pCall] = pExpression;
    }
    void delParamExpression(ZfCCfgProcedureCall* pCall) { m_ParamExpressions.del(pCall); }
    int countParamExpressions() { return m_ParamExpressions.size(); }
    leda::h_array<ZfCCfgProcedureCall*, ZfCCfgExpression*>& getParamExpressions() {
        return m_ParamExpressions;
    }

    // The join of the arguments' values; undetermined while no call is entered.
    ZfCCfgValue evaluate();
    // The range over all arguments; constant 0.0 while no call is entered.
    ZfCCfgValue getMinimum();
    ZfCCfgValue getMaximum();

private:
    leda::list<ZfCCfgValue> collectValues(ZfCCfgValue (ZfCCfgExpression::*pQuery)());

    ZfCCfgVariable* m_pVariable;
    leda::h_array<ZfCCfgProcedureCall*, ZfCCfgExpression*> m_ParamExpressions;
};

#endif
