#ifndef ZFCPHIFUNCTION_H
#define ZFCPHIFUNCTION_H

#include "LEDA/array.h"
#include "ZfCCfgStatement.h"

// A phi function: defines a variable by that operand that belongs to the in-edge by which control
// arrived.
//
// Operand i belongs to the i-th control-flow in-edge of the node. The variable is the original
// until renaming puts a version in its place; the operands are null until then.
class HPNSSA_EXPORT ZfCPhiFunction : public ZfCCfgStatement {
public:
    // Dim is the number of operands, all null at first.
    ZfCPhiFunction(ZfCCfgVariable* pVariable, int Dim);
    ZfCPhiFunction(const ZfCPhiFunction&) = default;
    ZfCPhiFunction& operator=(const ZfCPhiFunction&) = default;

    ZfCPhiFunction* isPhiFunction() override;
    // A new phi function of the same variable and number of operands, all of them null.
    ZfCCfgStatement* clone() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getDefinedVariables() override;
    // The set of all operands; a null one is reported as an assertion and stands in the set.
    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;
    void accept(ZfCCfgVisitor* pVisitor) override;

protected:
    ~ZfCPhiFunction() override;

public:
    // The variable defined; not owned.
    void setVariable(ZfCCfgVariable* pVariable) { m_pVariable = pVariable; }
    ZfCCfgVariable* getVariable() { return m_pVariable; }

    // Writes operand Pos, which must be from 0 to the number of operands less one.
    void setReplacementVariable(int Pos, ZfCCfgVariable* pVariable) {
        m_pReplacementVariable[Pos] = pVariable;
    }
    // A copy of the operands.
    leda::array<ZfCCfgVariable*> getReplacementVariables() { return m_pReplacementVariable; }
    // The operands themselves, valid until the phi function changes.
    leda::array<ZfCCfgVariable*> const& showReplacementVariables() const {
        return m_pReplacementVariable;
    }
    // Takes operand Pos out; those behind it close up in their order. A position that is not there
    // is an internal error, and the last operand goes.
    void delReplacement(int Pos);

private:
    ZfCCfgVariable* m_pVariable;
    leda::array<ZfCCfgVariable*> m_pReplacementVariable;
};

#endif
