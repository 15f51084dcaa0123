#include "ZfCSSAEdge.h"

#include "ZfCCfgVisitorSSA.h"

ZfCSSAEdge::ZfCSSAEdge() = default;

ZfCSSAEdge::~ZfCSSAEdge() = default;

ZfCSSAEdge* ZfCSSAEdge::isSSAEdge() {
    return this;
}

void ZfCSSAEdge::accept(ZfCCfgVisitor* pVisitor, leda::edge& Edge) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this, Edge);
}
