#include "ZfCCfgVisitorSSA.h"

unsigned int ZfCCfgVisitorSSA::s_GlobIndexCnt = 0;

ZfCCfgVisitorSSA::ZfCCfgVisitorSSA() : m_Index(s_GlobIndexCnt++) {
}

ZfCCfgVisitorSSA::~ZfCCfgVisitorSSA() = default;
