#include "ZfCCfgStatement.h"

#include "ZfCCfgFactory.h"

unsigned int ZfCCfgStatement::s_GlobIndexCnt = 0;

// The registration is the last step: the factory reads the debug index.
ZfCCfgStatement::ZfCCfgStatement()
    : m_Index(s_GlobIndexCnt++), m_DebugIndex(static_cast<int>(m_Index)), m_IsVirtual(false) {
    ZfCCfgFactory::getInstance()->addNewStatement(this);
}

ZfCCfgStatement::~ZfCCfgStatement() = default;

ZfCCfgAssignment* ZfCCfgStatement::isAssignment() {
    return nullptr;
}

ZfCCfgSFAssignment* ZfCCfgStatement::isSFAssignment() {
    return nullptr;
}

ZfCCfgProcedureCall* ZfCCfgStatement::isProcedureCall() {
    return nullptr;
}

ZfCCfgSFProcedureCall* ZfCCfgStatement::isSFProcedureCall() {
    return nullptr;
}

ZfCCfgParamStatement* ZfCCfgStatement::isParamStatement() {
    return nullptr;
}

ZfCCfgValueReturnStatement* ZfCCfgStatement::isValueReturnStatement() {
    return nullptr;
}

ZfCCfgOutputStatement* ZfCCfgStatement::isOutputStatement() {
    return nullptr;
}

ZfCCfgExternCall* ZfCCfgStatement::isExternCall() {
    return nullptr;
}

ZfCPhiFunction* ZfCCfgStatement::isPhiFunction() {
    return nullptr;
}

void ZfCCfgStatement::remove() {
}

bool ZfCCfgStatement::hoistOutOfIfElseBranch(bool& SkipNext) {
    SkipNext = false;
    return false;
}

bool ZfCCfgStatement::hasSideEffects() {
    return false;
}

bool ZfCCfgStatement::generatesSameCode(ZfCCfgStatement*) {
    return false;
}

void ZfCCfgStatement::accept(ZfCCfgVisitor*) {
}
