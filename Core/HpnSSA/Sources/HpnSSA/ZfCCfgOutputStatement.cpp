#include "ZfCCfgOutputStatement.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgOutputStatement::ZfCCfgOutputStatement(ZfCCfgVariable* pVariable) : m_pVariable(pVariable) {
}

ZfCCfgOutputStatement::~ZfCCfgOutputStatement() = default;

ZfCCfgOutputStatement* ZfCCfgOutputStatement::isOutputStatement() {
    return this;
}

ZfCCfgStatement* ZfCCfgOutputStatement::clone() {
    return nullptr;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgOutputStatement::getDefinedVariables() {
    return leda::set<ZfCCfgVariable*, leda::avl_tree>();
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgOutputStatement::getUsedVariables() {
    leda::set<ZfCCfgVariable*, leda::avl_tree> UsedVariables;
    UsedVariables.insert(m_pVariable);
    return UsedVariables;
}

void ZfCCfgOutputStatement::acceptStart(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visitStart(this);
}
