#include "ZfCCfgParamStatement.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgParamStatement::ZfCCfgParamStatement(ZfCCfgVariable* pVariable)
    : m_pVariable(pVariable), m_ParamExpressions(nullptr) {
}

ZfCCfgParamStatement::~ZfCCfgParamStatement() = default;

ZfCCfgParamStatement* ZfCCfgParamStatement::isParamStatement() {
    return this;
}

ZfCCfgStatement* ZfCCfgParamStatement::clone() {
    return nullptr;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgParamStatement::getDefinedVariables() {
    leda::set<ZfCCfgVariable*, leda::avl_tree> DefinedVariables;
    DefinedVariables.insert(m_pVariable);
    return DefinedVariables;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgParamStatement::getUsedVariables() {
    leda::set<ZfCCfgVariable*, leda::avl_tree> UsedVariables;
    for (auto Item = m_ParamExpressions.first_item(); Item;
         Item = m_ParamExpressions.next_item(Item))
        UsedVariables.add(m_ParamExpressions.inf(Item)->getUsedVariables());
    return UsedVariables;
}

void ZfCCfgParamStatement::acceptStart(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visitStart(this);
}

void ZfCCfgParamStatement::acceptEnd(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visitEnd(this);
}

// What each argument answers, in the order in which the calls were entered.
leda::list<ZfCCfgValue>
ZfCCfgParamStatement::collectValues(ZfCCfgValue (ZfCCfgExpression::*pQuery)()) {
    leda::list<ZfCCfgValue> ValueList;
    for (auto Item = m_ParamExpressions.first_item(); Item;
         Item = m_ParamExpressions.next_item(Item))
        ValueList.append((m_ParamExpressions.inf(Item)->*pQuery)());
    return ValueList;
}

// A parameter that no call has fed is still open.
ZfCCfgValue ZfCCfgParamStatement::evaluate() {
    leda::list<ZfCCfgValue> ValueList = collectValues(&ZfCCfgExpression::evaluate);
    if (ValueList.empty())
        return eCfgValueUndetermined;
    return intersect(ValueList);
}

ZfCCfgValue ZfCCfgParamStatement::getMinimum() {
    return determineMinimum(collectValues(&ZfCCfgExpression::getMinimum));
}

ZfCCfgValue ZfCCfgParamStatement::getMaximum() {
    return determineMaximum(collectValues(&ZfCCfgExpression::getMaximum));
}
