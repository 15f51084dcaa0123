#include "ZfCSSAVariable.h"

ZfCSSAVariable::ZfCSSAVariable(ZfCCfgVariable* pVar) : m_MinValue(0.0), m_MaxValue(0.0) {
    bindTo(pVar);
}

ZfCSSAVariable::~ZfCSSAVariable() = default;

void ZfCSSAVariable::initData(ZfCCfgVariable* pVar) {
    ZfCCfgVariable::initData();
    bindTo(pVar);
}

// The numbers of the range mean nothing while parked.
void ZfCSSAVariable::resetData() {
    ZfCCfgVariable::resetData();
    m_MaxValue = ZfCCfgValue();
    m_MinValue = ZfCCfgValue();
    m_pOrigVar = nullptr;
}

// The markers come from the variable as given, not from the original behind it: a version may be
// volatile where its original is not.
void ZfCSSAVariable::bindTo(ZfCCfgVariable* pVar) {
    setOrigVar(pVar);
    if (pVar->isArray())
        markAsArray();
    if (pVar->isErasable())
        markAsErasable();
    if (pVar->isVolatile())
        markAsVolatile();
    m_MinValue.setValueKind(eCfgValueUndetermined);
    m_MaxValue.setValueKind(eCfgValueUndetermined);
}

void ZfCSSAVariable::setOrigVar(ZfCCfgVariable* pVar) {
    ZfCSSAVariable* const pVersion = pVar->isSSAVariable();
    m_pOrigVar = pVersion != nullptr ? pVersion->getOrigVar() : pVar;
}

void ZfCSSAVariable::setMinValueAndDestroyOld(ZfCCfgValue const& Value) {
    if (isArray() || isVolatile()) {
        m_MinValue = ZfCCfgValue(eCfgValueNonConstant);
        return;
    }
    m_MinValue = Value;
    if (m_MinValue.isConstant())
        adjustConstant(m_MinValue);
}

// Unlike the minimum, the maximum keeps its number when it becomes non-constant.
void ZfCSSAVariable::setMaxValueAndDestroyOld(ZfCCfgValue const& Value) {
    if (isArray() || isVolatile()) {
        m_MaxValue.setValueKind(eCfgValueNonConstant);
        return;
    }
    m_MaxValue = Value;
    if (m_MaxValue.isConstant())
        adjustConstant(m_MaxValue);
}

ZfCCfgValue ZfCSSAVariable::getMinValue() {
    return m_MinValue;
}

ZfCCfgValue ZfCSSAVariable::getMaxValue() {
    return m_MaxValue;
}

ZF_DataType* ZfCSSAVariable::getDataType() {
    return m_pOrigVar->getDataType();
}

ZF_Scaling* ZfCSSAVariable::getScaling() {
    return m_pOrigVar->getScaling();
}

bool ZfCSSAVariable::isUpperBorderSaturated() {
    return m_pOrigVar->isUpperBorderSaturated();
}

bool ZfCSSAVariable::isLowerBorderSaturated() {
    return m_pOrigVar->isLowerBorderSaturated();
}

double ZfCSSAVariable::getUpperLimit() {
    return m_pOrigVar->getUpperLimit();
}

double ZfCSSAVariable::getLowerLimit() {
    return m_pOrigVar->getLowerLimit();
}

ZfCCfgValue ZfCSSAVariable::getInitValue() {
    return m_pOrigVar->getInitValue();
}

ZfCSSAVariable* ZfCSSAVariable::isSSAVariable() {
    return this;
}
