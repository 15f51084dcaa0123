#include "ZfCCfgExit.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgExit::ZfCCfgExit() = default;

ZfCCfgExit::~ZfCCfgExit() = default;

ZfCCfgExit* ZfCCfgExit::isExitNode() {
    return this;
}

void ZfCCfgExit::accept(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this);
}
