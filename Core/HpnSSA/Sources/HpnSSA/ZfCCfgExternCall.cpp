#include "ZfCCfgExternCall.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgExternCall::ZfCCfgExternCall(leda::list<ZfCCfgVariable*>* pModifiableVariables)
    : m_ModifiableVariables(*pModifiableVariables) {
}

ZfCCfgExternCall::~ZfCCfgExternCall() = default;

ZfCCfgExternCall* ZfCCfgExternCall::isExternCall() {
    return this;
}

ZfCCfgStatement* ZfCCfgExternCall::clone() {
    return nullptr;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgExternCall::getDefinedVariables() {
    return leda::set<ZfCCfgVariable*, leda::avl_tree>();
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgExternCall::getUsedVariables() {
    return m_UsedVariables;
}

void ZfCCfgExternCall::accept(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this);
}

void ZfCCfgExternCall::replaceVariable(ZfCCfgVariable* pOld, ZfCCfgVariable* pNew) {
    m_UsedVariables.del(pOld);
    m_UsedVariables.insert(pNew);
}
