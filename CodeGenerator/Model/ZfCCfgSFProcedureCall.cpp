#include "Model/ZfCCfgSFProcedureCall.h"

#include "Model/HoistingContext.h"
#include "Model/ZfCCfgSFExpression.h"

ZfCCfgSFProcedureCall::ZfCCfgSFProcedureCall(WqCXString Name, const hpn::Procedure* pCallee,
                                             hpn::SourcePosition Position)
    : ZfCCfgProcedureCall(Name), m_pCallee(pCallee), m_Position(Position) {
}

ZfCCfgSFProcedureCall::~ZfCCfgSFProcedureCall() = default;

void ZfCCfgSFProcedureCall::appendArgument(ZfCCfgSFVariable* pFormal,
                                           ZfCCfgExpression* pExpression) {
    m_Arguments.push_back({pFormal, pExpression});
}

ZfCCfgSFProcedureCall* ZfCCfgSFProcedureCall::isSFProcedureCall() {
    return this;
}

static bool isSameArgument(const ZfCCfgSFProcedureCall::Argument& a,
                           const ZfCCfgSFProcedureCall::Argument& b) {
    ZfCCfgSFExpression* pLeft = a.pExpression->isSFExpression();
    ZfCCfgSFExpression* pRight = b.pExpression->isSFExpression();
    return a.pFormal == b.pFormal && pLeft != nullptr && pRight != nullptr &&
           hpn::isSameTerm(pLeft->getRoot(), pRight->getRoot());
}

bool ZfCCfgSFProcedureCall::generatesSameCode(ZfCCfgStatement* pOther) {
    ZfCCfgSFProcedureCall* pTwin = pOther->isSFProcedureCall();
    if (pTwin == nullptr || getName() != pTwin->getName() ||
        m_Arguments.size() != pTwin->m_Arguments.size())
        return false;
    for (std::size_t i = 0; i < m_Arguments.size(); ++i) {
        if (!isSameArgument(m_Arguments[i], pTwin->m_Arguments[i]))
            return false;
    }
    return true;
}

bool ZfCCfgSFProcedureCall::hoistOutOfIfElseBranch(bool& IgnoreNextStatement) {
    IgnoreNextStatement = false;
    hpn::HoistingContext* pContext = hpn::HoistingContext::active();
    return pContext != nullptr && pContext->moveInFrontOfBranch(this);
}

// Deletion from a block calls this as well, after it has taken the statement out itself; then no
// hoisting is active.
void ZfCCfgSFProcedureCall::remove() {
    if (hpn::HoistingContext* pContext = hpn::HoistingContext::active())
        pContext->drop(this);
}
