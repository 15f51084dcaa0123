#include "ZfCSSAVariable.h"

namespace {

ZfCCfgValue valueOf(double Number, unsigned char Kind) {
    ZfCCfgValue Value(Number);
    Value.setValueKind(static_cast<tagZfECfgValueKind>(Kind));
    return Value;
}

} // namespace

ZfCSSAVariable::ZfCSSAVariable(ZfCCfgVariable* pVar) {
    m_IsVersion = true;
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
    setMax(ZfCCfgValue());
    setMin(ZfCCfgValue());
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
    m_MinKind = eCfgValueUndetermined;
    m_MaxKind = eCfgValueUndetermined;
}

void ZfCSSAVariable::setOrigVar(ZfCCfgVariable* pVar) {
    ZfCSSAVariable* const pVersion = pVar->isSSAVariable();
    m_pOrigOrTop = pVersion != nullptr ? pVersion->getOrigVar() : pVar;
}

void ZfCSSAVariable::setMinValueAndDestroyOld(ZfCCfgValue const& Value) {
    if (isArray() || isVolatile()) {
        setMin(ZfCCfgValue(eCfgValueNonConstant));
        return;
    }
    setMin(asStored(Value));
}

// Unlike the minimum, the maximum keeps its number when it becomes non-constant.
void ZfCSSAVariable::setMaxValueAndDestroyOld(ZfCCfgValue const& Value) {
    if (isArray() || isVolatile()) {
        m_MaxKind = eCfgValueNonConstant;
        return;
    }
    setMax(asStored(Value));
}

ZfCCfgValue ZfCSSAVariable::getMinValue() {
    return valueOf(m_MinValue, m_MinKind);
}

ZfCCfgValue ZfCSSAVariable::getMaxValue() {
    return valueOf(m_MaxValue, m_MaxKind);
}

// An end of the range as this variable would hold it.
ZfCCfgValue ZfCSSAVariable::asStored(ZfCCfgValue Value) {
    if (Value.isConstant())
        adjustConstant(Value);
    return Value;
}

void ZfCSSAVariable::setMin(ZfCCfgValue const& Value) {
    m_MinValue = Value.getValue();
    m_MinKind = static_cast<unsigned char>(Value.getValueKind());
}

void ZfCSSAVariable::setMax(ZfCCfgValue const& Value) {
    m_MaxValue = Value.getValue();
    m_MaxKind = static_cast<unsigned char>(Value.getValueKind());
}

ZF_DataType* ZfCSSAVariable::getDataType() {
    return m_pOrigOrTop->getDataType();
}

ZF_Scaling* ZfCSSAVariable::getScaling() {
    return m_pOrigOrTop->getScaling();
}

bool ZfCSSAVariable::isUpperBorderSaturated() {
    return m_pOrigOrTop->isUpperBorderSaturated();
}

bool ZfCSSAVariable::isLowerBorderSaturated() {
    return m_pOrigOrTop->isLowerBorderSaturated();
}

double ZfCSSAVariable::getUpperLimit() {
    return m_pOrigOrTop->getUpperLimit();
}

double ZfCSSAVariable::getLowerLimit() {
    return m_pOrigOrTop->getLowerLimit();
}

ZfCCfgValue ZfCSSAVariable::getInitValue() {
    return m_pOrigOrTop->getInitValue();
}

ZfCSSAVariable* ZfCSSAVariable::isSSAVariable() {
    return this;
}
