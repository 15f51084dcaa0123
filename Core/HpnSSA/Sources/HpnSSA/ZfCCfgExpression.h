#ifndef ZFCCFGEXPRESSION_H
#define ZFCCFGEXPRESSION_H

#include "HpnSSAExport.h"
#include "LEDA/list.h"
#include "LEDA/set.h"
#include "ZfCCfgValue.h"
#include "ZfCCfgVariable.h"

class ZfCCfgFactory;
class ZfCCfgSFExpression;
class ZfCCfgVisitor;

// An expression: a right-hand side, a branch condition or an argument.
//
// The library does not know the client's expression language and asks everything by the operations
// below; the client derives its expression class from this one and hands the objects to
// ZfCCfgFactory::addSFExpression, after which the factory owns them. The library's own expressions
// are ZfCCfgValueExpression and ZfCCfgExplicitVarUse.
class HPNSSA_EXPORT ZfCCfgExpression {
    friend class ZfCCfgFactory;

public:
    // A copy bears the serial number of its source.
    ZfCCfgExpression(const ZfCCfgExpression&) = default;
    ZfCCfgExpression& operator=(const ZfCCfgExpression&) = default;

    // All variables that the expression reads; a fresh set.
    virtual leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() = 0;

    // What a call inside the expression may change, or read, from outside; the base holds nothing.
    virtual leda::list<ZfCCfgVariable*> getExternModifiableVariables();
    virtual void appendExternModifiableVariable(ZfCCfgVariable* pVariable);
    virtual void appendPossiblyExternUsedVariable(ZfCCfgVariable* pVariable);

    // Replaces every read of pOld by pNew.
    virtual void replaceVariable(ZfCCfgVariable* pOld, ZfCCfgVariable* pNew) = 0;
    // Makes the whole condition the constant 0.0 or 1.0.
    virtual void replaceConditionWithConstant(double Value) = 0;

    // The value under the variables' current values, and the smallest and greatest one that the
    // expression can have. Non-constant if isMarkedAsEvalToNonConst().
    virtual ZfCCfgValue evaluate() = 0;
    virtual ZfCCfgValue getMinimum() = 0;
    virtual ZfCCfgValue getMaximum() = 0;

    // Replaces each read of a variable whose value is constant by that constant.
    virtual void replaceConstantVariables() = 0;
    // Turns a condition that evaluates to a constant into that constant.
    virtual void replaceConstantCondition() = 0;
    // Folds constant parts.
    virtual void foldConstants() = 0;

    // The variable, if the expression is the plain read of one or its negation, which Negated
    // tells; else null.
    virtual ZfCCfgVariable* isVariable(bool& Negated);
    // Whether the expression compares one variable with a constant; Negated is true for the
    // not-equal form.
    virtual bool isVariableEqualToConstant(ZfCCfgVariable*& pVariable, ZfCCfgValue& Value,
                                           bool& Negated);

    // Whether evaluating it does more than compute a value.
    virtual bool hasSideEffects();
    virtual bool containsExternCalls();
    virtual void markAsContainsExternCalls();
    virtual ZfCCfgSFExpression* isSFExpression();

    // The condition compares a Boolean variable with a constant other than 0.0 and 1.0 and is about
    // to be replaced.
    virtual void actOnComparisonOutsideBoolRange() = 0;

    // Shows the expression to an SSA visitor.
    virtual void accept(ZfCCfgVisitor* pVisitor);

protected:
    // With the next serial number. EvalToNonConst: nothing may be assumed about the value, whatever
    // the expression holds; false in the first form.
    ZfCCfgExpression();
    explicit ZfCCfgExpression(bool EvalToNonConst);
    virtual ~ZfCCfgExpression();

    // Renew a parked object as the constructor with the same arguments would make it.
    virtual void initData(bool EvalToNonConst);
    virtual void initData();

    // Empties the object for parking.
    virtual void resetData();

    // Changes what isMarkedAsEvalToNonConst answers.
    void setEvalToNonConst(bool EvalToNonConst) { m_EvalToNonConst = EvalToNonConst; }

public:
    // Serial numbering starts at 0 again.
    static void boot() { s_GlobIndexCnt = 0; }

    // Whether nothing may be assumed about the value, whatever the expression holds.
    bool isMarkedAsEvalToNonConst() { return m_EvalToNonConst; }

private:
    unsigned int m_Index;
    bool m_EvalToNonConst;

    static unsigned int s_GlobIndexCnt;
};

#endif
