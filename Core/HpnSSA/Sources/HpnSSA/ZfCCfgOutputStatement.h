#ifndef ZFCCFGOUTPUTSTATEMENT_H
#define ZFCCFGOUTPUTSTATEMENT_H

#include "ZfCCfgStatement.h"

// The use of an output variable by the outside world: keeps the variable's definition alive. It
// emits no code and cannot be copied. The variable is not owned.
class HPNSSA_EXPORT ZfCCfgOutputStatement : public ZfCCfgStatement {
public:
    // Uses this variable.
    explicit ZfCCfgOutputStatement(ZfCCfgVariable* pVariable);
    ZfCCfgOutputStatement(const ZfCCfgOutputStatement&) = delete;
    ZfCCfgOutputStatement& operator=(const ZfCCfgOutputStatement&) = delete;

    ZfCCfgOutputStatement* isOutputStatement() override;
    // Null: it is not cloned.
    ZfCCfgStatement* clone() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getDefinedVariables() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;

protected:
    ~ZfCCfgOutputStatement() override;

public:
    // Shows the statement to an SSA visitor.
    virtual void acceptStart(ZfCCfgVisitor* pVisitor);

    // The variable used: the original, and from renaming on the version that reaches the end.
    ZfCCfgVariable* getVariable() { return m_pVariable; }
    void setVariable(ZfCCfgVariable* pVariable) { m_pVariable = pVariable; }

private:
    ZfCCfgVariable* m_pVariable;
};

#endif
