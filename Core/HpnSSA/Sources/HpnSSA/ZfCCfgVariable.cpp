#include "ZfCCfgVariable.h"

#include "ZF_Scaling.h"
#include "ZfCCfgVisitorSSA.h"
#include "ZfCInternalCheck.h"

unsigned int ZfCCfgVariable::s_GlobIndexCnt = 0;

ZfCCfgVariable::ZfCCfgVariable()
    : m_Index(s_GlobIndexCnt++), m_DebugIndex(static_cast<int>(m_Index)),
      m_Value(eCfgValueUndetermined), m_IsArray(false), m_IsErasable(false), m_IsVolatile(false),
      m_pNonVirtualAlias(this) {
}

ZfCCfgVariable::~ZfCCfgVariable() = default;

void ZfCCfgVariable::setMinValueAndDestroyOld(ZfCCfgValue const&) {
}

void ZfCCfgVariable::setMaxValueAndDestroyOld(ZfCCfgValue const&) {
}

ZfCCfgValue ZfCCfgVariable::getMinValue() {
    return 0.0;
}

ZfCCfgValue ZfCCfgVariable::getMaxValue() {
    return 0.0;
}

ZfCCfgValue ZfCCfgVariable::getInitValue() {
    return eCfgValueUndetermined;
}

bool ZfCCfgVariable::isOutput() {
    return false;
}

ZfCCfgSFVariable* ZfCCfgVariable::isSFVariable() {
    return nullptr;
}

ZfCSSAVariable* ZfCCfgVariable::isSSAVariable() {
    return nullptr;
}

void ZfCCfgVariable::accept(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this);
}

// The stack, the uses and the aliases were emptied by resetData. The debug index stays: it keeps
// the variable's place in every ordering over its lives.
void ZfCCfgVariable::initData() {
    m_Index = s_GlobIndexCnt++;
    m_Value.setValueKind(eCfgValueUndetermined);
    m_IsArray = false;
    m_IsErasable = false;
    m_IsVolatile = false;
    m_pNonVirtualAlias = this;
}

void ZfCCfgVariable::resetData() {
    m_Index = 0;
    m_Uses.clear();
    m_Rare.resize(0);
    m_pOrigOrTop = nullptr;
    m_IsArray = false;
    m_IsErasable = false;
    m_IsVolatile = false;
    m_pNonVirtualAlias = nullptr;
}

int ZfCCfgVariable::delUse(leda::node v) {
    ZF_ASSERT(m_Uses.member(v));
    m_Uses.del(v);
    return m_Uses.size();
}

leda::set<leda::node, leda::avl_tree> ZfCCfgVariable::getAllUses() {
    leda::set<leda::node, leda::avl_tree> AllUses = m_Uses;
    if (hasRare()) {
        for (ZfCCfgVariable* pAlias : rare().m_VirtualAliases)
            AllUses.add(pAlias->m_Uses);
    }
    return AllUses;
}

int ZfCCfgVariable::countAllUses() {
    int Count = countUses();
    if (hasRare()) {
        for (ZfCCfgVariable* pAlias : rare().m_VirtualAliases)
            Count += pAlias->countUses();
    }
    return Count;
}

void ZfCCfgVariable::markAsArray() {
    m_IsArray = true;
    m_Value.setValueKind(eCfgValueNonConstant);
}

void ZfCCfgVariable::markAsVolatile() {
    m_IsVolatile = true;
    m_Value.setValueKind(eCfgValueNonConstant);
}

bool ZfCCfgVariable::isScaled() {
    ZF_Scaling* const pScaling = getScaling();
    if (pScaling == nullptr)
        return false;
    return pScaling->getLsb() != 1.0 || pScaling->getOffset() != 0.0;
}

// Both borders are tested, the lower one on what the upper one left.
bool ZfCCfgVariable::ConsiderSaturation(ZfCCfgValue& Value) {
    bool IsClipped = false;
    if (isUpperBorderSaturated()) {
        const double Limit = getUpperLimit();
        if (Value.getValue() > Limit) {
            Value.setValue(Limit);
            IsClipped = true;
        }
    }
    if (isLowerBorderSaturated()) {
        const double Limit = getLowerLimit();
        if (Limit > Value.getValue()) {
            Value.setValue(Limit);
            IsClipped = true;
        }
    }
    return IsClipped;
}

// Saturation goes first and is final: what hits the limit keeps it exactly, also where the limit
// lies off the grid.
void ZfCCfgVariable::adjustConstant(ZfCCfgValue& Value) {
    if (ConsiderSaturation(Value))
        return;
    if (isScaled())
        Value.changeToRepresentedValue(getScaling());
    else
        cast(getDataType(), Value, true);
}

void ZfCCfgVariable::setVarValueAndAdjustCfgValue(ZfCCfgValue& Value) {
    if (m_IsArray || m_IsVolatile) {
        Value.setValueKind(eCfgValueNonConstant);
        m_Value.setValueKind(eCfgValueNonConstant);
        return;
    }
    if (Value.isConstant())
        adjustConstant(Value);
    m_Value = Value;
}
