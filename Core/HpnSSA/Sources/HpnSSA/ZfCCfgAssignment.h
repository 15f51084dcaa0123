#ifndef ZFCCFGASSIGNMENT_H
#define ZFCCFGASSIGNMENT_H

#include "ZfCCfgExpression.h"
#include "ZfCCfgStatement.h"

// The assignment of an expression to a variable; neither is owned. A client derives its own
// assignment from it, gives clone and foldConstants, and answers isSFAssignment. An assignment
// without left-hand side defines nothing, one without right-hand side uses nothing and has no side
// effects.
class HPNSSA_EXPORT ZfCCfgAssignment : public ZfCCfgStatement {
public:
    // Neither side is set; enters itself in the factory as every statement does.
    ZfCCfgAssignment();
    // A copy names the same variable and the same expression; see ZfCCfgStatement for who owns it.
    ZfCCfgAssignment(const ZfCCfgAssignment&) = default;
    ZfCCfgAssignment& operator=(const ZfCCfgAssignment&) = default;

    ZfCCfgAssignment* isAssignment() override;
    bool hasSideEffects() override;
    // The left-hand variable alone: what the expression may change behind the scenes is not among
    // them.
    leda::set<ZfCCfgVariable*, leda::avl_tree> getDefinedVariables() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;

protected:
    ~ZfCCfgAssignment() override;

public:
    // Folds the constant parts of the right-hand side.
    virtual void foldConstants() = 0;

    // The variable assigned and the expression it gets; null where there is none. Setting one does
    // not end the former.
    ZfCCfgVariable* getLHS() { return m_pLHS; }
    void setLHS(ZfCCfgVariable* pVariable) { m_pLHS = pVariable; }
    ZfCCfgExpression* getRHS() { return m_pRHS; }
    void setRHS(ZfCCfgExpression* pExpression) { m_pRHS = pExpression; }

    // Whether it records what a branch condition tells about a variable.
    bool getIsValidConditionAssignment() { return m_IsValidConditionAssignment; }
    void setIsValidConditionAssignment(bool IsValidConditionAssignment) {
        m_IsValidConditionAssignment = IsValidConditionAssignment;
    }

    // Handed on to the right-hand side, if there is one.
    bool containsExternCalls();
    void markAsContainsExternCalls();
    leda::list<ZfCCfgVariable*> getExternModifiableVariables();
    void appendExternModifiableVariable(ZfCCfgVariable* pVariable);
    void appendPossiblyExternUsedVariable(ZfCCfgVariable* pVariable);

private:
    ZfCCfgVariable* m_pLHS;
    ZfCCfgExpression* m_pRHS;
    bool m_IsValidConditionAssignment;
};

#endif
