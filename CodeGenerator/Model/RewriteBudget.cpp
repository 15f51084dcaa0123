#include "Model/RewriteBudget.h"

namespace hpn {

RewriteBudget* RewriteBudget::s_pActive = nullptr;

bool RewriteBudget::take(const char* What, SourcePosition Position) {
    if (isExhausted())
        return false;
    ++m_Count;
    m_LastText = What;
    m_LastPosition = Position;
    return true;
}

void RewriteBudget::registerCondition(const ZfCCfgSFExpression* pCondition) {
    m_Conditions.emplace(pCondition, Decision::Open);
}

bool RewriteBudget::maySettle(const ZfCCfgSFExpression* pExpression, SourcePosition Position) {
    const auto Found = m_Conditions.find(pExpression);
    if (Found == m_Conditions.end())
        return true;
    if (Found->second == Decision::Open)
        Found->second = take("branch decided", Position) ? Decision::Granted : Decision::HeldBack;
    return Found->second == Decision::Granted;
}

bool RewriteBudget::isHeldBack(const ZfCCfgSFExpression* pExpression) const {
    const auto Found = m_Conditions.find(pExpression);
    return Found != m_Conditions.end() && Found->second == Decision::HeldBack;
}

} // namespace hpn
