#include "Model/ZfCCfgSFExpression.h"

#include "Model/Conversion.h"
#include "Model/PendingWarnings.h"
#include "Model/RewriteBudget.h"
#include "Model/ZfCCfgSFVariable.h"

#include <algorithm>
#include <cmath>

using hpn::Operator;
using hpn::Term;

namespace {

/// Calls `take` for each read until it answers false; whether it never did.
template <class Visitor>
bool forEachRead(const Term* pTerm, const Visitor& take) {
    if (pTerm == nullptr)
        return true;
    // The array that a store writes is the left-hand side's business.
    if (pTerm->hasVariable() && !pTerm->isStore() && !take(pTerm->pVariable))
        return false;
    return forEachRead(pTerm->pLeft, take) && forEachRead(pTerm->pRight, take);
}

void replaceRead(Term* pTerm, ZfCCfgVariable* pOld, ZfCCfgVariable* pNew) {
    if (pTerm == nullptr)
        return;
    if (pTerm->hasVariable() && pTerm->pVariable == pOld && !pTerm->isStore())
        pTerm->pVariable = pNew;
    replaceRead(pTerm->pLeft, pOld, pNew);
    replaceRead(pTerm->pRight, pOld, pNew);
}

void becomeNumber(Term* pTerm, double Number) {
    const hpn::SourcePosition Position = pTerm->getPosition();
    *pTerm = Term();
    pTerm->Number = Number;
    pTerm->setPosition(Position);
}

void replaceConstantReads(Term* pTerm) {
    if (pTerm == nullptr)
        return;
    if (pTerm->Op == Operator::Variable) {
        const ZfCCfgValue& Value = pTerm->pVariable->getValue();
        if (Value.isConstant() &&
            hpn::mayRewrite("read replaced by a constant", pTerm->getPosition()))
            becomeNumber(pTerm, Value.getValue());
        return;
    }
    replaceConstantReads(pTerm->pLeft);
    replaceConstantReads(pTerm->pRight);
}

const Term* stripCasts(const Term* pTerm) {
    while (pTerm->Op == Operator::Cast && hpn::castChangesNothing(pTerm))
        pTerm = pTerm->pLeft;
    return pTerm;
}

/// Looks through conversions and negations; Negated turns over with each negation.
const Term* stripNegations(const Term* pTerm, bool& Negated) {
    Negated = false;
    pTerm = stripCasts(pTerm);
    while (pTerm->Op == Operator::LogicalNot) {
        Negated = !Negated;
        pTerm = stripCasts(pTerm->pLeft);
    }
    return pTerm;
}

/// The variable that a term reads, if the branch may tell the optimiser about it; else null. A
/// variable that nothing assigns, a param above all, would pay with its constant: the assignments
/// on the branches would give it a phi function at the loop around main.
ZfCCfgVariable* offeredVariable(const Term* pTerm) {
    if (pTerm->Op != Operator::Variable)
        return nullptr;
    ZfCCfgSFVariable* pOriginal = hpn::originalOf(pTerm->pVariable);
    if (pOriginal->isVolatile() || pOriginal->isArray() || !pOriginal->isAssigned())
        return nullptr;
    return pTerm->pVariable;
}

/// Whether equality with the number means that the variable holds this number, bit for bit. Both
/// zeros equal zero, and a NaN equals nothing. A Boolean is offered whatever the number is: out of
/// its range the comparison itself is constant.
bool isTellingConstant(ZfCCfgVariable* pVariable, double Number) {
    const hpn::Type& Of = hpn::originalOf(pVariable)->getType();
    if (Of.Base == hpn::BaseType::Bool)
        return true;
    if (hpn::isFloating(Of.Base) && Number == 0.0)
        return false;
    return hpn::convertNumber(Number, Of) == Number;
}

/// What the last evaluation found, for the two questions about the ends that follow it: the walks
/// over the term are the dearest part of the propagation. It holds as long as the term and the
/// variables that it reads, which are remembered with what they held, are the same.
class LastEvaluation {
public:
    const ZfCCfgValue& value() const { return m_Value; }
    const hpn::ValueRange& range() const { return m_Range; }

    /// Of a term with so many reads that they are not at hand they are looked for.
    void remember(const Term* pRoot, const ZfCCfgValue& Value, const hpn::ValueRange& Range) {
        m_NumberOfReads = 0;
        const auto take = [this](ZfCCfgVariable* pVariable) { return noteRead(pVariable); };
        m_pRoot = forEachRead(pRoot, take) ? pRoot : nullptr;
        m_Value = Value;
        m_Range = Range;
    }
    void remember(const Term* pRoot, ZfCCfgVariable* const* pReads, std::size_t Number,
                  const ZfCCfgValue& Value, const hpn::ValueRange& Range) {
        m_NumberOfReads = 0;
        std::for_each(pReads, pReads + Number, [this](ZfCCfgVariable* p) { noteRead(p); });
        m_pRoot = pRoot;
        m_Value = Value;
        m_Range = Range;
    }
    void forget() { m_pRoot = nullptr; }

    bool holdsFor(const Term* pRoot) const {
        return pRoot == m_pRoot && std::all_of(m_Reads, m_Reads + m_NumberOfReads, isUnchanged);
    }

private:
    struct Read {
        ZfCCfgVariable* pVariable;
        ZfCCfgValue Value;
        ZfCCfgValue Minimum;
        ZfCCfgValue Maximum;
    };
    static constexpr int s_MostReads = 8; // terms with more are computed again

    static bool isSame(const ZfCCfgValue& a, const ZfCCfgValue& b) {
        return a.getValueKind() == b.getValueKind() &&
               (!a.isConstant() || (a.getValue() == b.getValue() &&
                                    std::signbit(a.getValue()) == std::signbit(b.getValue())));
    }
    static bool isUnchanged(const Read& Of) {
        return isSame(Of.Value, Of.pVariable->getValue()) &&
               isSame(Of.Minimum, Of.pVariable->getMinValue()) &&
               isSame(Of.Maximum, Of.pVariable->getMaxValue());
    }

    bool noteRead(ZfCCfgVariable* pVariable) {
        if (m_NumberOfReads == s_MostReads)
            return false;
        m_Reads[m_NumberOfReads++] = {pVariable, pVariable->getValue(), pVariable->getMinValue(),
                                      pVariable->getMaxValue()};
        return true;
    }

    const Term* m_pRoot = nullptr;
    ZfCCfgValue m_Value;
    hpn::ValueRange m_Range;
    int m_NumberOfReads = 0;
    Read m_Reads[s_MostReads];
};

/// One is enough: the questions about one expression follow each other.
LastEvaluation s_LastEvaluation;

} // namespace

// The arena may give out the term of an earlier program again.
ZfCCfgSFExpression::ZfCCfgSFExpression(Term* pRoot) : m_pRoot(pRoot) {
    s_LastEvaluation.forget();
    noteReads();
}

ZfCCfgSFExpression::~ZfCCfgSFExpression() = default;

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCCfgSFExpression::getUsedVariables() {
    leda::set<ZfCCfgVariable*, leda::avl_tree> Variables;
    const auto take = [&Variables](ZfCCfgVariable* pVariable) {
        Variables.insert(pVariable);
        return true;
    };
    if (m_NumberOfReads == s_ManyReads)
        forEachRead(m_pRoot, take);
    else
        std::for_each(m_Reads, m_Reads + m_NumberOfReads, take);
    return Variables;
}

void ZfCCfgSFExpression::noteReads() {
    m_NumberOfReads = 0;
    const auto take = [this](ZfCCfgVariable* pVariable) {
        ZfCCfgVariable** pEnd = m_Reads + m_NumberOfReads;
        if (std::find(m_Reads, pEnd, pVariable) != pEnd)
            return true;
        if (m_NumberOfReads == s_MostReads)
            return false;
        m_Reads[m_NumberOfReads++] = pVariable;
        return true;
    };
    if (!forEachRead(m_pRoot, take))
        m_NumberOfReads = s_ManyReads;
}

void ZfCCfgSFExpression::replaceVariable(ZfCCfgVariable* pOld, ZfCCfgVariable* pNew) {
    s_LastEvaluation.forget();
    replaceRead(m_pRoot, pOld, pNew);
    // Where the new one was read before it stands here twice now, which harms nobody.
    if (m_NumberOfReads != s_ManyReads)
        std::replace(m_Reads, m_Reads + m_NumberOfReads, pOld, pNew);
    m_IsSettled = false;
}

void ZfCCfgSFExpression::replaceConditionWithConstant(double Number) {
    s_LastEvaluation.forget();
    becomeNumber(m_pRoot, Number);
    m_NumberOfReads = 0;
    m_IsSettled = false;
}

ZfCCfgValue ZfCCfgSFExpression::evaluate() {
    if (isMarkedAsEvalToNonConst())
        return ZfCCfgValue(eCfgValueNonConstant);
    hpn::RewriteBudget* pBudget = hpn::RewriteBudget::active();
    if (pBudget != nullptr && pBudget->isHeldBack(this))
        return ZfCCfgValue(eCfgValueNonConstant);
    if (m_IsSettled)
        return ZfCCfgValue(m_SettledNumber);
    ZfCCfgValue Value = hpn::latticeValueOfTerm(m_pRoot);
    if (!Value.isConstant() && m_pRoot->Op != Operator::Element) {
        // An undetermined operand counts with all that its type can hold, so a single number holds
        // whatever it becomes.
        const hpn::ValueRange Range = evaluateRange(Value);
        if (Range.isSingle())
            Value = ZfCCfgValue(Range.Low);
    }
    // The hull of ends overlooks a NaN that meets numbers: what takes its range from a constant
    // must not be given one.
    if (Value.isConstant() && std::isnan(Value.getValue()))
        return ZfCCfgValue(eCfgValueNonConstant);
    if (Value.isConstant()) {
        if (pBudget != nullptr && !pBudget->maySettle(this, m_pRoot->getPosition()))
            return ZfCCfgValue(eCfgValueNonConstant);
        m_IsSettled = true;
        m_SettledNumber = Value.getValue();
    }
    return Value;
}

ZfCCfgValue ZfCCfgSFExpression::getMinimum() {
    return getEnd(false);
}

ZfCCfgValue ZfCCfgSFExpression::getMaximum() {
    return getEnd(true);
}

ZfCCfgValue ZfCCfgSFExpression::getEndOfNumber(double Number) {
    return std::isnan(Number) ? ZfCCfgValue(eCfgValueNonConstant) : ZfCCfgValue(Number);
}

/// Remembers it with the value for the questions that follow.
hpn::ValueRange ZfCCfgSFExpression::evaluateRange(const ZfCCfgValue& Value) {
    const hpn::ValueRange Range = hpn::rangeOfTerm(m_pRoot, hpn::RangeSource::Propagation);
    if (m_NumberOfReads == s_ManyReads)
        s_LastEvaluation.remember(m_pRoot, Value, Range);
    else
        s_LastEvaluation.remember(m_pRoot, m_Reads, m_NumberOfReads, Value, Range);
    return Range;
}

ZfCCfgValue ZfCCfgSFExpression::getEnd(bool IsMaximum) {
    if (isMarkedAsEvalToNonConst() || m_pRoot->Op == Operator::Element)
        return ZfCCfgValue(eCfgValueNonConstant);
    if (m_IsSettled)
        return getEndOfNumber(m_SettledNumber);
    if (!s_LastEvaluation.holdsFor(m_pRoot)) {
        const ZfCCfgValue Value = hpn::latticeValueOfTerm(m_pRoot);
        if (Value.isConstant())
            return getEndOfNumber(Value.getValue());
        evaluateRange(Value);
    }
    const ZfCCfgValue Value = s_LastEvaluation.value();
    const hpn::ValueRange& Range = s_LastEvaluation.range();
    if (Value.isUndetermined() && !Range.isSingle())
        return Value;
    if (Range.MayBeNaN || Range.isEmpty())
        return ZfCCfgValue(eCfgValueNonConstant);
    return ZfCCfgValue(IsMaximum ? Range.High : Range.Low);
}

bool ZfCCfgSFExpression::mayReadConstant() const {
    return m_NumberOfReads == s_ManyReads ||
           std::any_of(m_Reads, m_Reads + m_NumberOfReads,
                       [](ZfCCfgVariable* p) { return p->getValue().isConstant(); });
}

void ZfCCfgSFExpression::replaceConstantVariables() {
    if (!mayReadConstant())
        return;
    s_LastEvaluation.forget();
    replaceConstantReads(m_pRoot);
    noteReads();
}

void ZfCCfgSFExpression::replaceConstantCondition() {
    // The reads of inputs stay; the emitter makes them where only one way is left.
    if (hasSideEffects())
        return;
    ZfCCfgValue Value = evaluate();
    if (Value.isConstant() && m_pRoot->Op != Operator::Number &&
        hpn::mayRewrite("condition replaced by its value", m_pRoot->getPosition())) {
        s_LastEvaluation.forget();
        becomeNumber(m_pRoot, Value.getValue());
        m_NumberOfReads = 0;
    }
}

// What folding would change is seen on a copy, where that matters.
void ZfCCfgSFExpression::foldConstants() {
    s_LastEvaluation.forget();
    hpn::TermArena* pArena = hpn::TermArena::active();
    if (hpn::RewriteBudget::active() != nullptr && pArena != nullptr) {
        Term* pFolded = pArena->copy(m_pRoot);
        hpn::foldTerm(pFolded);
        if (hpn::isSameTerm(pFolded, m_pRoot) ||
            !hpn::mayRewrite("expression folded", m_pRoot->getPosition()))
            return;
    }
    if (hpn::foldTerm(m_pRoot))
        noteReads();
}

ZfCCfgVariable* ZfCCfgSFExpression::isVariable(bool& Negated) {
    ZfCCfgVariable* pVariable = offeredVariable(stripNegations(m_pRoot, Negated));
    if (pVariable != nullptr &&
        !hpn::mayRewrite("note taken from a branch", m_pRoot->getPosition()))
        return nullptr;
    return pVariable;
}

bool ZfCCfgSFExpression::isVariableEqualToConstant(ZfCCfgVariable*& pVariable, ZfCCfgValue& Value,
                                                   bool& Negated) {
    const Term* pTerm = stripNegations(m_pRoot, Negated);
    if (pTerm->Op != Operator::Equal && pTerm->Op != Operator::NotEqual)
        return false;
    const Term* pLeft = stripCasts(pTerm->pLeft);
    const Term* pRight = stripCasts(pTerm->pRight);
    if (pLeft->Op == Operator::Number)
        std::swap(pLeft, pRight);
    ZfCCfgVariable* pRead = offeredVariable(pLeft);
    if (pRead == nullptr || pRight->Op != Operator::Number ||
        !isTellingConstant(pRead, pRight->Number) ||
        !hpn::mayRewrite("note taken from a branch", m_pRoot->getPosition()))
        return false;
    pVariable = pRead;
    Value = ZfCCfgValue(pRight->Number);
    Negated = Negated != (pTerm->Op == Operator::NotEqual);
    return true;
}

bool ZfCCfgSFExpression::hasSideEffects() {
    if (m_NumberOfReads == s_ManyReads)
        return hpn::readsInput(m_pRoot);
    return std::any_of(m_Reads, m_Reads + m_NumberOfReads,
                       [](ZfCCfgVariable* p) { return hpn::originalOf(p)->isReadASideEffect(); });
}

ZfCCfgSFExpression* ZfCCfgSFExpression::isSFExpression() {
    return this;
}

void ZfCCfgSFExpression::actOnComparisonOutsideBoolRange() {
    hpn::pendingWarnings().push_back(
        {m_pRoot->getPosition(),
         "a Boolean variable is compared with a number other than 0 and 1"});
}
