#ifndef ZFCCFGVALUEEXPRESSION_H
#define ZFCCFGVALUEEXPRESSION_H

#include "ZfCCfgExpression.h"

// An expression that is one value. It reads no variable and is changed by no pass. Made by the
// factory alone.
class HPNSSA_EXPORT ZfCCfgValueExpression : public ZfCCfgExpression {
    friend class ZfCCfgFactory;

public:
    ZfCCfgValueExpression(const ZfCCfgValueExpression&) = default;
    ZfCCfgValueExpression& operator=(const ZfCCfgValueExpression&) = default;

    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;
    void replaceVariable(ZfCCfgVariable* pOld, ZfCCfgVariable* pNew) override;
    void replaceConditionWithConstant(double Value) override;
    // All three: the value, or non-constant if the expression is so marked.
    ZfCCfgValue evaluate() override;
    ZfCCfgValue getMinimum() override;
    ZfCCfgValue getMaximum() override;
    void replaceConstantVariables() override;
    void replaceConstantCondition() override;
    void foldConstants() override;
    void actOnComparisonOutsideBoolRange() override;
    void accept(ZfCCfgVisitor* pVisitor) override;

private:
    ZfCCfgValueExpression();
    explicit ZfCCfgValueExpression(bool EvalToNonConst);
    explicit ZfCCfgValueExpression(const ZfCCfgValue& Value);
    ZfCCfgValueExpression(const ZfCCfgValue& Value, bool EvalToNonConst);
    ~ZfCCfgValueExpression() override;

protected:
    void initData(bool EvalToNonConst) override;
    void initData() override;
    // Leaves constant 0.0, and not undetermined, in the parked object.
    void resetData() override;
    virtual void initData(const ZfCCfgValue& Value, bool EvalToNonConst);
    virtual void initData(const ZfCCfgValue& Value);

public:
    // The value itself, to be read or written.
    ZfCCfgValue& getValue() { return m_Value; }

private:
    ZfCCfgValue m_Value;
};

#endif
