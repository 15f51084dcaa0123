#include "ZfCCfgInitAssignment.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgInitAssignment::ZfCCfgInitAssignment() = default;

ZfCCfgInitAssignment::~ZfCCfgInitAssignment() = default;

ZfCCfgStatement* ZfCCfgInitAssignment::clone() {
    return nullptr;
}

void ZfCCfgInitAssignment::accept(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this);
}

void ZfCCfgInitAssignment::foldConstants() {
}
