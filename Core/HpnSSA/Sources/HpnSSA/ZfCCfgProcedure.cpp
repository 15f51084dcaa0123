#include "ZfCCfgProcedure.h"

unsigned int ZfCCfgProcedure::s_GlobIndexCnt = 0;

ZfCCfgProcedure::ZfCCfgProcedure()
    : m_Index(s_GlobIndexCnt++), m_DebugIndex(static_cast<int>(m_Index)), m_pEntryNode(nullptr),
      m_pExitNode(nullptr), m_pFcgNode(nullptr), m_IsCallableFromOutside(false) {
}

ZfCCfgProcedure::~ZfCCfgProcedure() = default;

void ZfCCfgProcedure::appendCall(ZfCCfgProcedureCall* pCall) {
    m_Calls.append(pCall);
    m_IsCallableFromOutside =
        m_IsCallableFromOutside || pCall->isCallToDirectlyOrIndirectlyFromOutsideCallableFcn();
}

void ZfCCfgProcedure::initData() {
    m_Index = s_GlobIndexCnt++;
    m_pEntryNode = nullptr;
    m_pExitNode = nullptr;
    m_pFcgNode = nullptr;
    m_IsCallableFromOutside = false;
}

void ZfCCfgProcedure::resetData() {
    m_Index = 0;
    m_Name = WqCXString();
    m_Calls.clear();
    m_BasicBlocks.clear();
    m_DefinedVariables.clear();
    m_UsedVariables.clear();
    m_ParamStatements.clear();
    m_ValueReturnStatements.clear();
    m_IsCallableFromOutside = false;
}
