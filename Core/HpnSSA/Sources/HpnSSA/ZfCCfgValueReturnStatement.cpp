#include "ZfCCfgValueReturnStatement.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgValueReturnStatement::ZfCCfgValueReturnStatement(ZfCCfgVariable* pVariable)
    : m_pVariable(pVariable), m_pExpression(nullptr) {
}

ZfCCfgValueReturnStatement::~ZfCCfgValueReturnStatement() = default;

ZfCCfgValueReturnStatement* ZfCCfgValueReturnStatement::isValueReturnStatement() {
    return this;
}

ZfCCfgStatement* ZfCCfgValueReturnStatement::clone() {
    return nullptr;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgValueReturnStatement::getDefinedVariables() {
    leda::set<ZfCCfgVariable*, leda::avl_tree> DefinedVariables;
    DefinedVariables.insert(m_pVariable);
    return DefinedVariables;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgValueReturnStatement::getUsedVariables() {
    return m_pExpression->getUsedVariables();
}

void ZfCCfgValueReturnStatement::acceptStart(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visitStart(this);
}

void ZfCCfgValueReturnStatement::acceptMiddle(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visitMiddle(this);
}
