#include "ZfCCfgAssignment.h"

ZfCCfgAssignment::ZfCCfgAssignment()
    : m_pLHS(nullptr), m_pRHS(nullptr), m_IsValidConditionAssignment(false) {
}

ZfCCfgAssignment::~ZfCCfgAssignment() = default;

ZfCCfgAssignment* ZfCCfgAssignment::isAssignment() {
    return this;
}

bool ZfCCfgAssignment::hasSideEffects() {
    return m_pRHS != nullptr && m_pRHS->hasSideEffects();
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgAssignment::getDefinedVariables() {
    leda::set<ZfCCfgVariable*, leda::avl_tree> DefinedVariables;
    if (m_pLHS != nullptr)
        DefinedVariables.insert(m_pLHS);
    return DefinedVariables;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgAssignment::getUsedVariables() {
    if (m_pRHS == nullptr)
        return leda::set<ZfCCfgVariable*, leda::avl_tree>();
    return m_pRHS->getUsedVariables();
}

bool ZfCCfgAssignment::containsExternCalls() {
    return m_pRHS != nullptr && m_pRHS->containsExternCalls();
}

void ZfCCfgAssignment::markAsContainsExternCalls() {
    if (m_pRHS != nullptr)
        m_pRHS->markAsContainsExternCalls();
}

leda::list<ZfCCfgVariable*> ZfCCfgAssignment::getExternModifiableVariables() {
    if (m_pRHS == nullptr)
        return leda::list<ZfCCfgVariable*>();
    return m_pRHS->getExternModifiableVariables();
}

void ZfCCfgAssignment::appendExternModifiableVariable(ZfCCfgVariable* pVariable) {
    if (m_pRHS != nullptr)
        m_pRHS->appendExternModifiableVariable(pVariable);
}

void ZfCCfgAssignment::appendPossiblyExternUsedVariable(ZfCCfgVariable* pVariable) {
    if (m_pRHS != nullptr)
        m_pRHS->appendPossiblyExternUsedVariable(pVariable);
}
