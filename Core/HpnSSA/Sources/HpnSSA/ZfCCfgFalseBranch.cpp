#include "ZfCCfgFalseBranch.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgFalseBranch::ZfCCfgFalseBranch() = default;

ZfCCfgFalseBranch::~ZfCCfgFalseBranch() = default;

ZfCCfgFalseBranch* ZfCCfgFalseBranch::isFalseBranch() {
    return this;
}

void ZfCCfgFalseBranch::accept(ZfCCfgVisitor* pVisitor, leda::edge& Edge) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this, Edge);
}
