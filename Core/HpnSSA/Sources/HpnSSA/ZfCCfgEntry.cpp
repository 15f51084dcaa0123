#include "ZfCCfgEntry.h"

#include "ZfCCfgVisitorSSA.h"

ZfCCfgEntry::ZfCCfgEntry() = default;

ZfCCfgEntry::~ZfCCfgEntry() = default;

ZfCCfgEntry* ZfCCfgEntry::isEntryNode() {
    return this;
}

// The base's reset is left out on purpose: procedure, dominator, frontier and index of a parked
// entry node stay, and whoever reuses it sets them anew.
void ZfCCfgEntry::resetData() {
    m_Assignments.clear();
}

void ZfCCfgEntry::accept(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this);
}
