#ifndef ZFCCFGEXPLICITVARUSE_H
#define ZFCCFGEXPLICITVARUSE_H

#include "ZfCCfgExpression.h"

// An expression that is nothing but the use of variables: it stands where no expression of the
// client exists, so that a variable that crosses a call shows as used, is renamed and takes part in
// propagation. In the library's own use it holds exactly one variable. Variables are not owned; the
// factory makes and frees the objects.
//
// The value and the range differ on purpose for other numbers of variables: the value speaks for a
// single one and is undetermined otherwise, the range goes over the values of all.
class HPNSSA_EXPORT ZfCCfgExplicitVarUse : public ZfCCfgExpression {
    friend class ZfCCfgFactory;

public:
    // Holds no variable. EvalToNonConst: nothing may be assumed about the value, whatever the
    // variables hold.
    ZfCCfgExplicitVarUse();
    explicit ZfCCfgExplicitVarUse(bool EvalToNonConst);
    ZfCCfgExplicitVarUse(const ZfCCfgExplicitVarUse&) = default;
    ZfCCfgExplicitVarUse& operator=(const ZfCCfgExplicitVarUse&) = default;

    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;
    // Takes pOld out and enters pNew, which also happens when pOld is not there.
    void replaceVariable(ZfCCfgVariable* pOld, ZfCCfgVariable* pNew) override;
    void replaceConditionWithConstant(double Value) override;
    // The value of the one variable held; undetermined for none or several.
    ZfCCfgValue evaluate() override;
    // The range over the present values of all variables held; constant 0.0 for none.
    ZfCCfgValue getMinimum() override;
    ZfCCfgValue getMaximum() override;
    void replaceConstantVariables() override;
    void replaceConstantCondition() override;
    void foldConstants() override;
    void actOnComparisonOutsideBoolRange() override;
    void accept(ZfCCfgVisitor* pVisitor) override;

protected:
    ~ZfCCfgExplicitVarUse() override;
    void resetData() override;

public:
    // Enters a variable as used; one that is held already changes nothing.
    void addVariable(ZfCCfgVariable* pVariable) { m_UsedVariables.insert(pVariable); }

private:
    leda::list<ZfCCfgValue> collectValues();

    leda::set<ZfCCfgVariable*, leda::avl_tree> m_UsedVariables;
};

#endif
