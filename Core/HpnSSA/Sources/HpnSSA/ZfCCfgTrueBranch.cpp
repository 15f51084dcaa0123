#include "ZfCCfgTrueBranch.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgTrueBranch::ZfCCfgTrueBranch() = default;

ZfCCfgTrueBranch::~ZfCCfgTrueBranch() = default;

ZfCCfgTrueBranch* ZfCCfgTrueBranch::isTrueBranch() {
    return this;
}

void ZfCCfgTrueBranch::accept(ZfCCfgVisitor* pVisitor, leda::edge& Edge) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this, Edge);
}
