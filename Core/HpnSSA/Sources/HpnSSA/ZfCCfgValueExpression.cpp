#include "ZfCCfgValueExpression.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgValueExpression::ZfCCfgValueExpression() : m_Value(eCfgValueUndetermined) {
}

ZfCCfgValueExpression::ZfCCfgValueExpression(bool EvalToNonConst)
    : ZfCCfgExpression(EvalToNonConst), m_Value(eCfgValueUndetermined) {
}

ZfCCfgValueExpression::ZfCCfgValueExpression(const ZfCCfgValue& Value) : m_Value(Value) {
}

ZfCCfgValueExpression::ZfCCfgValueExpression(const ZfCCfgValue& Value, bool EvalToNonConst)
    : ZfCCfgExpression(EvalToNonConst), m_Value(Value) {
}

ZfCCfgValueExpression::~ZfCCfgValueExpression() = default;

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgValueExpression::getUsedVariables() {
    return leda::set<ZfCCfgVariable*, leda::avl_tree>();
}

void ZfCCfgValueExpression::replaceVariable(ZfCCfgVariable*, ZfCCfgVariable*) {
}

void ZfCCfgValueExpression::replaceConditionWithConstant(double) {
}

ZfCCfgValue ZfCCfgValueExpression::evaluate() {
    if (isMarkedAsEvalToNonConst())
        return eCfgValueNonConstant;
    return m_Value;
}

ZfCCfgValue ZfCCfgValueExpression::getMinimum() {
    return ZfCCfgValueExpression::evaluate();
}

ZfCCfgValue ZfCCfgValueExpression::getMaximum() {
    return ZfCCfgValueExpression::evaluate();
}

void ZfCCfgValueExpression::replaceConstantVariables() {
}

void ZfCCfgValueExpression::replaceConstantCondition() {
}

void ZfCCfgValueExpression::foldConstants() {
}

void ZfCCfgValueExpression::actOnComparisonOutsideBoolRange() {
}

void ZfCCfgValueExpression::accept(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this);
}

void ZfCCfgValueExpression::initData(bool EvalToNonConst) {
    ZfCCfgExpression::initData(EvalToNonConst);
    m_Value.setValueKind(eCfgValueUndetermined);
}

void ZfCCfgValueExpression::initData() {
    ZfCCfgExpression::initData();
    m_Value.setValueKind(eCfgValueUndetermined);
}

void ZfCCfgValueExpression::initData(const ZfCCfgValue& Value, bool EvalToNonConst) {
    ZfCCfgExpression::initData(EvalToNonConst);
    m_Value = Value;
}

void ZfCCfgValueExpression::initData(const ZfCCfgValue& Value) {
    ZfCCfgExpression::initData();
    m_Value = Value;
}

void ZfCCfgValueExpression::resetData() {
    ZfCCfgExpression::resetData();
    m_Value = ZfCCfgValue(0.0);
}
