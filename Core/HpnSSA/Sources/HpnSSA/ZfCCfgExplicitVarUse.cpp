#include "ZfCCfgExplicitVarUse.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgExplicitVarUse::ZfCCfgExplicitVarUse() = default;

ZfCCfgExplicitVarUse::ZfCCfgExplicitVarUse(bool EvalToNonConst) : ZfCCfgExpression(EvalToNonConst) {
}

ZfCCfgExplicitVarUse::~ZfCCfgExplicitVarUse() = default;

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgExplicitVarUse::getUsedVariables() {
    return m_UsedVariables;
}

void ZfCCfgExplicitVarUse::replaceVariable(ZfCCfgVariable* pOld, ZfCCfgVariable* pNew) {
    m_UsedVariables.del(pOld);
    m_UsedVariables.insert(pNew);
}

void ZfCCfgExplicitVarUse::replaceConditionWithConstant(double) {
}

ZfCCfgValue ZfCCfgExplicitVarUse::evaluate() {
    if (isMarkedAsEvalToNonConst())
        return eCfgValueNonConstant;
    if (m_UsedVariables.size() != 1)
        return eCfgValueUndetermined;
    return m_UsedVariables.key(m_UsedVariables.min())->getValue();
}

// The present values of the variables held, not their own ranges: the parameter or return that this
// expression feeds is given what the variable is known to be, and nothing for a variable whose
// value still varies.
leda::list<ZfCCfgValue> ZfCCfgExplicitVarUse::collectValues() {
    leda::list<ZfCCfgValue> ValueList;
    for (ZfCCfgVariable* pVariable : m_UsedVariables)
        ValueList.append(pVariable->getValue());
    return ValueList;
}

ZfCCfgValue ZfCCfgExplicitVarUse::getMinimum() {
    if (isMarkedAsEvalToNonConst())
        return eCfgValueNonConstant;
    return determineMinimum(collectValues());
}

ZfCCfgValue ZfCCfgExplicitVarUse::getMaximum() {
    if (isMarkedAsEvalToNonConst())
        return eCfgValueNonConstant;
    return determineMaximum(collectValues());
}

void ZfCCfgExplicitVarUse::replaceConstantVariables() {
}

void ZfCCfgExplicitVarUse::replaceConstantCondition() {
}

void ZfCCfgExplicitVarUse::foldConstants() {
}

void ZfCCfgExplicitVarUse::actOnComparisonOutsideBoolRange() {
}

void ZfCCfgExplicitVarUse::accept(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this);
}

void ZfCCfgExplicitVarUse::resetData() {
    ZfCCfgExpression::resetData();
    m_UsedVariables.clear();
}
