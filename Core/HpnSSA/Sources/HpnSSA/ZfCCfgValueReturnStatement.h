#ifndef ZFCCFGVALUERETURNSTATEMENT_H
#define ZFCCFGVALUERETURNSTATEMENT_H

#include "ZfCCfgExpression.h"
#include "ZfCCfgStatement.h"

// The definition of one variable by the return from a call: it stands behind the call, and its
// expression is the value at the callee's exit. It emits no code and cannot be copied. Neither
// variable nor expression is owned; the expression must be set before the uses are asked for.
class HPNSSA_EXPORT ZfCCfgValueReturnStatement : public ZfCCfgStatement {
public:
    // Defines this variable; the expression is null at first.
    explicit ZfCCfgValueReturnStatement(ZfCCfgVariable* pVariable);
    ZfCCfgValueReturnStatement(const ZfCCfgValueReturnStatement&) = delete;
    ZfCCfgValueReturnStatement& operator=(const ZfCCfgValueReturnStatement&) = delete;

    ZfCCfgValueReturnStatement* isValueReturnStatement() override;
    // Null: it is not cloned.
    ZfCCfgStatement* clone() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getDefinedVariables() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;

protected:
    ~ZfCCfgValueReturnStatement() override;

public:
    // Show the statement to an SSA visitor, before the variable and between variable and
    // expression.
    virtual void acceptStart(ZfCCfgVisitor* pVisitor);
    virtual void acceptMiddle(ZfCCfgVisitor* pVisitor);

    // The variable defined behind the call.
    ZfCCfgVariable* getVariable() { return m_pVariable; }
    void setVariable(ZfCCfgVariable* pVariable) { m_pVariable = pVariable; }
    // What it gets: an expression of the variable at the callee's exit.
    ZfCCfgExpression* getExpression() { return m_pExpression; }
    void setExpression(ZfCCfgExpression* pExpression) { m_pExpression = pExpression; }

private:
    ZfCCfgVariable* m_pVariable;
    ZfCCfgExpression* m_pExpression;
};

#endif
