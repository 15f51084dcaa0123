#include "Model/ZfCCfgSFAssignment.h"

#include "Model/HoistingContext.h"
#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFVariable.h"
#include "ZfCCfgFactory.h"
#include "ZfCCfgVisitorSSADot.h"

ZfCCfgSFAssignment::ZfCCfgSFAssignment(hpn::SourcePosition Position) : m_Position(Position) {
}

ZfCCfgSFAssignment::~ZfCCfgSFAssignment() = default;

ZfCCfgSFAssignment* ZfCCfgSFAssignment::isSFAssignment() {
    return this;
}

bool ZfCCfgSFAssignment::generatesSameCode(ZfCCfgStatement* pOther) {
    ZfCCfgSFAssignment* pTwin = pOther->isSFAssignment();
    if (pTwin == nullptr || hpn::originalOf(getLHS()) != hpn::originalOf(pTwin->getLHS()))
        return false;
    ZfCCfgSFExpression* pOwn = getRHS()->isSFExpression();
    ZfCCfgSFExpression* pTheirs = pTwin->getRHS()->isSFExpression();
    return pOwn != nullptr && pTheirs != nullptr &&
           hpn::isSameTerm(pOwn->getRoot(), pTheirs->getRoot());
}

// The flag asks to pass over a following statement that goes with this one. This client has no such
// pairs.
bool ZfCCfgSFAssignment::hoistOutOfIfElseBranch(bool& IgnoreNextStatement) {
    IgnoreNextStatement = false;
    hpn::HoistingContext* pContext = hpn::HoistingContext::active();
    return pContext != nullptr && pContext->moveInFrontOfBranch(this);
}

// Deletion from a block calls this as well, after it has taken the statement out itself; then no
// hoisting is active.
void ZfCCfgSFAssignment::remove() {
    if (hpn::HoistingContext* pContext = hpn::HoistingContext::active())
        pContext->drop(this);
}

ZfCCfgStatement* ZfCCfgSFAssignment::clone() {
    auto* pClone = new ZfCCfgSFAssignment(m_Position);
    pClone->setLHS(getLHS());
    pClone->setRHS(getRHS());
    ZfCCfgSFExpression* pExpression = getRHS() != nullptr ? getRHS()->isSFExpression() : nullptr;
    hpn::TermArena* pArena = hpn::TermArena::active();
    if (pExpression != nullptr && pArena != nullptr) {
        auto* pCopy = new ZfCCfgSFExpression(pArena->copy(pExpression->getRoot()));
        ZfCCfgFactory::getInstance()->addSFExpression(pCopy);
        pClone->setRHS(pCopy);
    }
    return pClone;
}

void ZfCCfgSFAssignment::accept(ZfCCfgVisitor* pVisitor) {
    if (auto* pDump = dynamic_cast<ZfCCfgVisitorSSADot*>(pVisitor))
        pDump->visit(static_cast<ZfCCfgAssignment*>(this));
}

void ZfCCfgSFAssignment::foldConstants() {
    if (getRHS() != nullptr)
        getRHS()->foldConstants();
}
