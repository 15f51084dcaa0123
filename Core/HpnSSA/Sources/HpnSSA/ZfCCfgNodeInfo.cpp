#include "ZfCCfgNodeInfo.h"

unsigned int ZfCCfgNodeInfo::s_GlobIndexCnt = 0;

ZfCCfgNodeInfo::ZfCCfgNodeInfo()
    : m_pIdom(nullptr), m_pProcedure(nullptr), m_Index(s_GlobIndexCnt++) {
}

ZfCCfgNodeInfo::~ZfCCfgNodeInfo() = default;

ZfCCfgEntry* ZfCCfgNodeInfo::isEntryNode() {
    return nullptr;
}

ZfCCfgExit* ZfCCfgNodeInfo::isExitNode() {
    return nullptr;
}

ZfCBasicBlock* ZfCCfgNodeInfo::isBasicBlock() {
    return nullptr;
}

// Every node without code gives the same empty list and set.
leda::list<ZfCCfgVariable*> const& ZfCCfgNodeInfo::getAssignedVariables() {
    static const leda::list<ZfCCfgVariable*> NoVariables;
    return NoVariables;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgNodeInfo::getUsedVariables() {
    static const leda::set<ZfCCfgVariable*, leda::avl_tree> NoVariables;
    return NoVariables;
}

void ZfCCfgNodeInfo::initData() {
    m_Index = s_GlobIndexCnt++;
}

void ZfCCfgNodeInfo::resetData() {
    m_pIdom = nullptr;
    m_pProcedure = nullptr;
    m_pDF.clear();
    m_Index = 0;
}
