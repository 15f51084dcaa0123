#include "ZfCCfgProcedureCall.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgProcedureCall::ZfCCfgProcedureCall()
    : m_IsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(false) {
}

ZfCCfgProcedureCall::ZfCCfgProcedureCall(WqCXString Name)
    : m_Name(Name), m_IsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(false) {
}

ZfCCfgProcedureCall::~ZfCCfgProcedureCall() = default;

ZfCCfgProcedureCall* ZfCCfgProcedureCall::isProcedureCall() {
    return this;
}

ZfCCfgStatement* ZfCCfgProcedureCall::clone() {
    return nullptr;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgProcedureCall::getDefinedVariables() {
    return leda::set<ZfCCfgVariable*, leda::avl_tree>();
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgProcedureCall::getUsedVariables() {
    return leda::set<ZfCCfgVariable*, leda::avl_tree>();
}

void ZfCCfgProcedureCall::accept(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this);
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgProcedureCall::getVarsDefinedByFctReturn() {
    return leda::set<ZfCCfgVariable*, leda::avl_tree>();
}

bool ZfCCfgProcedureCall::isCallToDirectlyOrIndirectlyFromOutsideCallableFcn() {
    return m_IsCallToDirectlyOrIndirectlyFromOutsideCallableFcn;
}
