#include "ZfCCfgEdgeInfo.h"

#include "ZfCCfgVisitorSSA.h"

unsigned int ZfCCfgEdgeInfo::s_GlobIndexCnt = 0;

ZfCCfgEdgeInfo::ZfCCfgEdgeInfo() : m_IsExecutable(false), m_Index(s_GlobIndexCnt++) {
}

ZfCCfgEdgeInfo::~ZfCCfgEdgeInfo() = default;

ZfCCfgTrueBranch* ZfCCfgEdgeInfo::isTrueBranch() {
    return nullptr;
}

ZfCCfgFalseBranch* ZfCCfgEdgeInfo::isFalseBranch() {
    return nullptr;
}

ZfCSSAEdge* ZfCCfgEdgeInfo::isSSAEdge() {
    return nullptr;
}

void ZfCCfgEdgeInfo::accept(ZfCCfgVisitor* pVisitor, leda::edge& Edge) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this, Edge);
}

void ZfCCfgEdgeInfo::initData() {
    m_Index = s_GlobIndexCnt++;
    m_IsExecutable = false;
}

void ZfCCfgEdgeInfo::resetData() {
    m_Index = 0;
    m_IsExecutable = false;
}
