#include "Model/Term.h"

#include "Model/Conversion.h"
#include "Model/ZfCCfgSFVariable.h"
#include "ZfCSSAVariable.h"

#include <cmath>
#include <cstring>

// Terms are walked by recursion: their height is that of one expression of the source, which the
// reader limits.

namespace hpn {

TermArena* TermArena::s_pActive = nullptr;

void TermArena::addChunk() {
    m_Chunks.push_back(std::make_unique<Term[]>(s_ChunkSize));
    m_Used = 0;
}

Term* TermArena::makeNumber(double Number) {
    Term* pTerm = make();
    pTerm->Number = Number;
    return pTerm;
}

Term* TermArena::makeVariable(ZfCCfgVariable* pVariable) {
    Term* pTerm = make();
    pTerm->Op = Operator::Variable;
    pTerm->pVariable = pVariable;
    return pTerm;
}

Term* TermArena::makeUnary(Operator Op, Term* pOperand) {
    Term* pTerm = make();
    pTerm->Op = Op;
    pTerm->pLeft = pOperand;
    return pTerm;
}

Term* TermArena::makeBinary(Operator Op, Term* pLeft, Term* pRight) {
    Term* pTerm = makeUnary(Op, pLeft);
    pTerm->pRight = pRight;
    return pTerm;
}

Term* TermArena::makeCast(const Type* pType, Term* pOperand) {
    Term* pTerm = makeUnary(Operator::Cast, pOperand);
    pTerm->pType = pType;
    return pTerm;
}

Term* TermArena::copy(const Term* pTerm) {
    if (pTerm == nullptr)
        return nullptr;
    Term* pCopy = make();
    *pCopy = *pTerm;
    pCopy->pLeft = copy(pTerm->pLeft);
    pCopy->pRight = copy(pTerm->pRight);
    return pCopy;
}

namespace {

ValueRange rangeOfDeclaredType(ZfCCfgVariable* pVariable) {
    ZfCCfgSFVariable* pOriginal = originalOf(pVariable);
    ValueRange Range = pOriginal->getStorageRange();
    // Stores leave no negative zero; only code outside the optimiser's sight can have written one.
    if (!pOriginal->isVolatile())
        Range.MayBeNegativeZero = false;
    const Variable& Declared = pOriginal->getDeclaration();
    if (!Declared.HasBelievedRange)
        return Range;
    Range.Low = Declared.BelievedLow;
    Range.High = Declared.BelievedHigh;
    Range.MayBeNaN = false;
    Range.MayBeNegativeZero = Range.MayBeNegativeZero && Range.Low <= 0.0 && Range.High >= 0.0;
    return Range;
}

/// A propagated range means something only while the value is not undetermined, and only versions
/// have one.
ValueRange rangeOfRead(ZfCCfgVariable* pVariable, RangeSource Source) {
    if (Source == RangeSource::Types)
        return rangeOfDeclaredType(pVariable);
    const ZfCCfgValue& Value = pVariable->getValue();
    if (Value.isConstant())
        return rangeOfNumber(Value.getValue());
    ValueRange Range = rangeOfDeclaredType(pVariable);
    if (Value.isUndetermined() || pVariable->isSSAVariable() == nullptr)
        return Range;
    const ZfCCfgValue Minimum = pVariable->getMinValue();
    const ZfCCfgValue Maximum = pVariable->getMaxValue();
    if (!Minimum.isConstant() || !Maximum.isConstant() ||
        !(Minimum.getValue() <= Maximum.getValue()))
        return Range;
    Range = cutRange(Range, Minimum.getValue(), Maximum.getValue());
    Range.MayBeNaN = false;
    return Range;
}

bool isUnary(Operator Op) {
    return Op == Operator::Negate || Op == Operator::LogicalNot || Op == Operator::Complement ||
           Op == Operator::Absolute || Op == Operator::Sign;
}

ZfCCfgValue valueOfUnary(Operator Op, ZfCCfgValue Operand) {
    switch (Op) {
    case Operator::Negate:
        return -Operand;
    case Operator::LogicalNot:
        return !Operand;
    case Operator::Complement:
        return ~Operand;
    case Operator::Absolute:
        return absoluteValue(Operand);
    default:
        return sgn(Operand);
    }
}

/// The library leaves a zero divisor to the processor's fault, so two constants never reach its
/// operator.
ZfCCfgValue valueOfModulo(ZfCCfgValue Left, ZfCCfgValue Right) {
    if (Left.isConstant() && Right.isConstant())
        return ZfCCfgValue(computeBinary(Operator::Modulo, Left.getValue(), Right.getValue()));
    return Left % Right;
}

ZfCCfgValue valueOfComparison(Operator Op, ZfCCfgValue Left, ZfCCfgValue Right) {
    switch (Op) {
    case Operator::Less:
        return Left < Right;
    case Operator::LessEqual:
        return Left <= Right;
    case Operator::Greater:
        return Left > Right;
    case Operator::GreaterEqual:
        return Left >= Right;
    case Operator::Equal:
        return Left == Right;
    default:
        return Left != Right;
    }
}

ZfCCfgValue valueOfBits(Operator Op, ZfCCfgValue Left, ZfCCfgValue Right) {
    switch (Op) {
    case Operator::ShiftLeft:
        return Left << Right;
    case Operator::ShiftRight:
        return Left >> Right;
    case Operator::BitAnd:
        return Left & Right;
    case Operator::BitXor:
        return Left ^ Right;
    case Operator::BitOr:
        return Left | Right;
    case Operator::LogicalAnd:
        return Left && Right;
    case Operator::LogicalOr:
        return Left || Right;
    default:
        return valueOfComparison(Op, Left, Right);
    }
}

ZfCCfgValue valueOfBinary(Operator Op, ZfCCfgValue Left, ZfCCfgValue Right) {
    switch (Op) {
    case Operator::Multiply:
        return Left * Right;
    case Operator::Divide:
        return Left / Right;
    case Operator::Modulo:
        return valueOfModulo(Left, Right);
    case Operator::Add:
        return Left + Right;
    case Operator::Subtract:
        return Left - Right;
    case Operator::Minimum:
        return minValue(Left, Right);
    case Operator::Maximum:
        return maxValue(Left, Right);
    default:
        return valueOfBits(Op, Left, Right);
    }
}

} // namespace

ZfCCfgValue latticeValueOfTerm(const Term* pTerm) {
    switch (pTerm->Op) {
    case Operator::Number:
        return ZfCCfgValue(pTerm->Number);
    case Operator::Variable:
        return pTerm->pVariable->getValue();
    case Operator::Element: // elements are not tracked; a store is a value of its array
        return ZfCCfgValue(eCfgValueNonConstant);
    case Operator::Cast: {
        ZfCCfgValue Value = latticeValueOfTerm(pTerm->pLeft);
        if (Value.isConstant())
            Value.setValue(convertNumber(Value.getValue(), *pTerm->pType));
        return Value;
    }
    default:
        if (isUnary(pTerm->Op))
            return valueOfUnary(pTerm->Op, latticeValueOfTerm(pTerm->pLeft));
        return valueOfBinary(pTerm->Op, latticeValueOfTerm(pTerm->pLeft),
                             latticeValueOfTerm(pTerm->pRight));
    }
}

ValueRange rangeOfTerm(const Term* pTerm, RangeSource Source) {
    switch (pTerm->Op) {
    case Operator::Number:
        return rangeOfNumber(pTerm->Number);
    case Operator::Variable:
        return rangeOfRead(pTerm->pVariable, Source);
    case Operator::Element:
        return rangeOfDeclaredType(pTerm->pVariable);
    case Operator::Cast:
        return convertRange(rangeOfTerm(pTerm->pLeft, Source), *pTerm->pType);
    default:
        if (isUnary(pTerm->Op))
            return rangeOfUnary(pTerm->Op, rangeOfTerm(pTerm->pLeft, Source));
        return rangeOfBinary(pTerm->Op, rangeOfTerm(pTerm->pLeft, Source),
                             rangeOfTerm(pTerm->pRight, Source));
    }
}

ZfCCfgValue valueOfTerm(const Term* pTerm) {
    const ZfCCfgValue Value = latticeValueOfTerm(pTerm);
    if (Value.isConstant() || pTerm->Op == Operator::Element)
        return Value;
    // An undetermined operand counts with all that its type can hold, so a single number holds
    // whatever it becomes.
    const ValueRange Range = rangeOfTerm(pTerm, RangeSource::Propagation);
    return Range.isSingle() ? ZfCCfgValue(Range.Low) : Value;
}

bool readsInput(const Term* pTerm) {
    if (pTerm == nullptr)
        return false;
    if (pTerm->hasVariable() && !pTerm->isStore() &&
        originalOf(pTerm->pVariable)->isReadASideEffect())
        return true;
    return readsInput(pTerm->pLeft) || readsInput(pTerm->pRight);
}

bool isSameTerm(const Term* a, const Term* b) {
    if (a == nullptr || b == nullptr)
        return a == b;
    if (a->Op != b->Op)
        return false;
    if (a->Op == Operator::Number)
        return std::memcmp(&a->Number, &b->Number, sizeof a->Number) == 0;
    if (a->Op == Operator::Cast && a->pType != b->pType)
        return false;
    if (a->hasVariable() && originalOf(a->pVariable) != originalOf(b->pVariable))
        return false;
    return isSameTerm(a->pLeft, b->pLeft) && isSameTerm(a->pRight, b->pRight);
}

} // namespace hpn
