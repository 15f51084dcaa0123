#include "ZfCCfgExpression.h"

#include "ZfCCfgVisitorSSA.h"

unsigned int ZfCCfgExpression::s_GlobIndexCnt = 0;

ZfCCfgExpression::ZfCCfgExpression() : m_Index(s_GlobIndexCnt++), m_EvalToNonConst(false) {
}

ZfCCfgExpression::ZfCCfgExpression(bool EvalToNonConst)
    : m_Index(s_GlobIndexCnt++), m_EvalToNonConst(EvalToNonConst) {
}

ZfCCfgExpression::~ZfCCfgExpression() = default;

leda::list<ZfCCfgVariable*> ZfCCfgExpression::getExternModifiableVariables() {
    return leda::list<ZfCCfgVariable*>();
}

void ZfCCfgExpression::appendExternModifiableVariable(ZfCCfgVariable*) {
}

void ZfCCfgExpression::appendPossiblyExternUsedVariable(ZfCCfgVariable*) {
}

ZfCCfgVariable* ZfCCfgExpression::isVariable(bool&) {
    return nullptr;
}

bool ZfCCfgExpression::isVariableEqualToConstant(ZfCCfgVariable*&, ZfCCfgValue&, bool&) {
    return false;
}

bool ZfCCfgExpression::hasSideEffects() {
    return false;
}

bool ZfCCfgExpression::containsExternCalls() {
    return false;
}

void ZfCCfgExpression::markAsContainsExternCalls() {
}

ZfCCfgSFExpression* ZfCCfgExpression::isSFExpression() {
    return nullptr;
}

void ZfCCfgExpression::accept(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this);
}

void ZfCCfgExpression::initData(bool EvalToNonConst) {
    m_Index = s_GlobIndexCnt++;
    m_EvalToNonConst = EvalToNonConst;
}

void ZfCCfgExpression::initData() {
    m_Index = s_GlobIndexCnt++;
    m_EvalToNonConst = false;
}

void ZfCCfgExpression::resetData() {
    m_Index = 0;
    m_EvalToNonConst = false;
}
