#include "Model/Conversion.h"
#include "Model/Term.h"
#include "Model/ZfCCfgSFVariable.h"

#include <cmath>

// Folding of terms by numbers and types.
//
// Bottom up, at each node:
// 1. operands first;
// 2. what can only be one number, by the ranges of the types, becomes that number;
// 3. a short circuit whose left operand is a number goes, as C would not evaluate its right operand
// either;
// 4. identities that give back one operand, bit for bit, give it back; conversions that change
// nothing go. An operand that reads an input is never dropped in 2 and 4. Everything is judged by
// the declared types alone, so the result holds whatever the passes do with the variables
// afterwards. Complexity: linear, and one range walk more over each operand that takes its parent's
// place; in all quadratic in the height of the term at worst, which the reader limits.

namespace hpn {

namespace {

void becomeNumber(Term* pTerm, double Number) {
    const SourcePosition Position = pTerm->getPosition();
    *pTerm = Term();
    pTerm->Number = Number;
    pTerm->setPosition(Position);
}

void becomeOperand(Term* pTerm, const Term* pOperand) {
    const Term Copy = *pOperand;
    *pTerm = Copy;
}

ValueRange typeRange(const Term* pTerm) {
    return rangeOfTerm(pTerm, RangeSource::Types);
}

bool isNumber(const Term* pTerm, double Number) {
    return pTerm->Op == Operator::Number && pTerm->Number == Number;
}

bool isTruth(const ValueRange& Range) {
    return Range.isWithin(rangeOfUnary(Operator::LogicalNot, rangeOfAnything())) &&
           Range.IsIntegral;
}

/// The truncation to 32 bits leaves every number of the range.
bool isInt32(const ValueRange& Range) {
    return Range.IsIntegral && !Range.MayBeNaN && !Range.MayBeNegativeZero &&
           Range.Low >= -2147483648.0 && Range.High <= 2147483647.0;
}

/// The declared type of what a term gives directly, or null.
const Type* directType(const Term* pTerm) {
    if (pTerm->Op == Operator::Cast)
        return pTerm->pType;
    if (pTerm->hasVariable())
        return &originalOf(pTerm->pVariable)->getType();
    return nullptr;
}

bool isSingleAndKept(const ValueRange& Range, const Type& To) {
    return Range.isSingle() && convertNumber(Range.Low, To) == Range.Low;
}

/// All numbers of the operand lie on the grid of a scaled type and inside its storage.
bool isOnGrid(const Term* pOperand, const ValueRange& Range, const Type& To) {
    if (isSingleAndKept(Range, To))
        return true;
    const Type* pFrom = directType(pOperand);
    if (pFrom == nullptr || !isScaled(*pFrom) || pFrom->Lsb != To.Lsb || pFrom->Offset != To.Offset)
        return false;
    // A limit of the operand's own type is on its grid, so nothing but the storage is left to
    // compare.
    return Range.isWithin(storageRange(To));
}

bool isSinglePrecision(const Term* pOperand, const ValueRange& Range, const Type& To) {
    if (isSingleAndKept(Range, To))
        return true;
    if (Range.IsIntegral && Range.Low >= -16777216.0 && Range.High <= 16777216.0 && !Range.MayBeNaN)
        return true;
    const Type* pFrom = directType(pOperand);
    return pFrom != nullptr && pFrom->Base == BaseType::Float32;
}

bool isKeptByStorage(const Term* pOperand, const ValueRange& Range, const Type& To) {
    if (Range.MayBeNegativeZero)
        return false;
    if (To.Base == BaseType::Float64)
        return true;
    if (To.Base == BaseType::Float32)
        return isSinglePrecision(pOperand, Range, To);
    if (Range.MayBeNaN)
        return false;
    if (isScaled(To))
        return isOnGrid(pOperand, Range, To);
    return Range.IsIntegral && Range.isWithin(storageRange(To));
}

/// Step 4 for the 32-bit operators: shifts by 0, and the masks that let everything through.
bool keepsLeftAsBits(Operator Op, const Term* pRight) {
    switch (Op) {
    case Operator::ShiftLeft:
    case Operator::ShiftRight:
    case Operator::BitOr:
    case Operator::BitXor:
        return isNumber(pRight, 0.0);
    case Operator::BitAnd:
        return isNumber(pRight, -1.0);
    default:
        return false;
    }
}

/// Step 4 for double arithmetic with a number on the right. A negative zero on the left survives
/// few of them.
bool keepsLeftAsNumber(Operator Op, const ValueRange& Left, const Term* pRight) {
    switch (Op) {
    case Operator::Add: // -0.0 + 0.0 is 0.0, but -0.0 + -0.0 stays
        return isNumber(pRight, 0.0) && (std::signbit(pRight->Number) || !Left.MayBeNegativeZero);
    case Operator::Subtract: // the other way round
        return isNumber(pRight, 0.0) && (!std::signbit(pRight->Number) || !Left.MayBeNegativeZero);
    case Operator::Multiply:
    case Operator::Divide: // a zero of either sign gives the positive one
        return isNumber(pRight, 1.0) && !Left.MayBeNegativeZero;
    default:
        return false;
    }
}

bool keepsLeft(Operator Op, const ValueRange& Left, const Term* pRight) {
    if (pRight->Op != Operator::Number)
        return false;
    return keepsLeftAsNumber(Op, Left, pRight) || (keepsLeftAsBits(Op, pRight) && isInt32(Left));
}

bool isCommutative(Operator Op) {
    return Op == Operator::Add || Op == Operator::Multiply || Op == Operator::BitAnd ||
           Op == Operator::BitOr || Op == Operator::BitXor;
}

/// Which operand min and max always give, where the ranges do not meet.
void foldExtremum(Term* pTerm, const ValueRange& Left, const ValueRange& Right) {
    if (Left.MayBeNaN || Right.MayBeNaN || Left.isEmpty() || Right.isEmpty())
        return;
    const bool IsMinimum = pTerm->Op == Operator::Minimum;
    const bool GivesLeft = IsMinimum ? Right.Low > Left.High : Left.Low > Right.High;
    const bool GivesRight = IsMinimum ? Right.High <= Left.Low : Left.High <= Right.Low;
    if (GivesLeft && !readsInput(pTerm->pRight))
        becomeOperand(pTerm, pTerm->pLeft);
    else if (GivesRight && !readsInput(pTerm->pLeft))
        becomeOperand(pTerm, pTerm->pRight);
}

/// Makes the logical term with the operand that alone decides: `x` where it is a truth value, else
/// `x != 0` or `x == 1`.
void becomeTruthOf(Term* pTerm, Term* pDeciding, Term* pSpare) {
    if (isTruth(typeRange(pDeciding))) {
        becomeOperand(pTerm, pDeciding);
        return;
    }
    const bool IsAnd = pTerm->Op == Operator::LogicalAnd;
    becomeNumber(pSpare, IsAnd ? 0.0 : 1.0);
    pTerm->Op = IsAnd ? Operator::NotEqual : Operator::Equal;
    pTerm->pLeft = pDeciding;
    pTerm->pRight = pSpare;
}

/// Steps 3 and 4 for && and ||. A number decides, or leaves the decision to the other operand.
void foldLogical(Term* pTerm) {
    const bool IsAnd = pTerm->Op == Operator::LogicalAnd;
    const auto decides = [IsAnd](double Number) { return IsAnd ? Number == 0.0 : Number == 1.0; };
    Term* pLeft = pTerm->pLeft;
    Term* pRight = pTerm->pRight;
    if (pLeft->Op == Operator::Number) {
        if (decides(pLeft->Number))
            becomeNumber(pTerm, IsAnd ? 0.0 : 1.0);
        else
            becomeTruthOf(pTerm, pRight, pLeft);
        return;
    }
    if (pRight->Op == Operator::Number && !decides(pRight->Number))
        becomeTruthOf(pTerm, pLeft, pRight);
}

void foldBinary(Term* pTerm, const ValueRange& Left, const ValueRange& Right) {
    const Operator Op = pTerm->Op;
    if (Op == Operator::LogicalAnd || Op == Operator::LogicalOr)
        return foldLogical(pTerm);
    if (Op == Operator::Minimum || Op == Operator::Maximum)
        return foldExtremum(pTerm, Left, Right);
    if (keepsLeft(Op, Left, pTerm->pRight))
        becomeOperand(pTerm, pTerm->pLeft);
    else if (isCommutative(Op) && keepsLeft(Op, Right, pTerm->pLeft))
        becomeOperand(pTerm, pTerm->pRight);
}

void foldUnary(Term* pTerm, const ValueRange& Operand) {
    const Term* pOperand = pTerm->pLeft;
    const bool IsTwice = pOperand->Op == pTerm->Op;
    switch (pTerm->Op) {
    case Operator::Negate: // the sign bit flips twice
        if (IsTwice)
            becomeOperand(pTerm, pOperand->pLeft);
        return;
    case Operator::LogicalNot:
        if (IsTwice && isTruth(typeRange(pOperand->pLeft)))
            becomeOperand(pTerm, pOperand->pLeft);
        return;
    case Operator::Complement:
        if (IsTwice && isInt32(typeRange(pOperand->pLeft)))
            becomeOperand(pTerm, pOperand->pLeft);
        return;
    case Operator::Absolute: // a zero of either sign and a NaN pass as they are
        if (!(Operand.Low < 0.0))
            becomeOperand(pTerm, pOperand);
        return;
    default:
        return;
    }
}

bool changesNothing(const Term* pCast, const ValueRange& Operand) {
    const Type& To = *pCast->pType;
    if (!Operand.isEmpty() && To.SaturatesHigh && Operand.High > To.Upper)
        return false;
    if (!Operand.isEmpty() && To.SaturatesLow && Operand.Low < To.Lower)
        return false;
    return isKeptByStorage(pCast->pLeft, Operand, To);
}

/// Folds a term with folded operands, whose ranges and its own are given.
void foldNode(Term* pTerm, bool IsRoot, const ValueRange& Left, const ValueRange& Right,
              const ValueRange& Range) {
    if (Range.isSingle() && !readsInput(pTerm))
        return becomeNumber(pTerm, Range.Low);
    if (pTerm->Op == Operator::Cast) {
        if (!IsRoot && changesNothing(pTerm, Left))
            becomeOperand(pTerm, pTerm->pLeft);
        return;
    }
    if (pTerm->pRight == nullptr)
        return foldUnary(pTerm, Left);
    foldBinary(pTerm, Left, Right);
}

ValueRange rangeOfNode(const Term* pTerm, const ValueRange& Left, const ValueRange& Right) {
    if (pTerm->Op == Operator::Cast)
        return convertRange(Left, *pTerm->pType);
    return pTerm->pRight == nullptr ? rangeOfUnary(pTerm->Op, Left)
                                    : rangeOfBinary(pTerm->Op, Left, Right);
}

/// A term of numbers alone has an exact result, NaN and negative zero included.
bool foldNumbers(Term* pTerm) {
    if (pTerm->pLeft == nullptr || pTerm->hasVariable() || pTerm->pLeft->Op != Operator::Number)
        return false;
    if (pTerm->Op == Operator::Cast)
        becomeNumber(pTerm, convertNumber(pTerm->pLeft->Number, *pTerm->pType));
    else if (pTerm->pRight == nullptr)
        becomeNumber(pTerm, computeUnary(pTerm->Op, pTerm->pLeft->Number));
    else if (pTerm->pRight->Op == Operator::Number)
        becomeNumber(pTerm, computeBinary(pTerm->Op, pTerm->pLeft->Number, pTerm->pRight->Number));
    else
        return false;
    return true;
}

/// Folds a term with folded operands, whose ranges are given. Answers the range of what it has
/// become, and notes if it has become anything else. Never a part of the walk below, which recurs
/// as deep as the term is and should need little of the stack at each level.
[[gnu::noinline]] ValueRange foldWithOperands(Term* pTerm, bool IsRoot, const ValueRange& Left,
                                              const ValueRange& Right, bool& HasChanged) {
    if (pTerm->Op == Operator::Number || pTerm->hasVariable())
        return typeRange(pTerm);
    if (foldNumbers(pTerm)) {
        HasChanged = true;
        return typeRange(pTerm);
    }
    const Term Before = *pTerm;
    const ValueRange Range = rangeOfNode(pTerm, Left, Right);
    foldNode(pTerm, IsRoot, Left, Right, Range);
    // Whatever takes its place has another operator or other operands.
    const bool IsSame =
        pTerm->Op == Before.Op && pTerm->pLeft == Before.pLeft && pTerm->pRight == Before.pRight;
    if (IsSame)
        return Range;
    HasChanged = true;
    return typeRange(pTerm);
}

/// Folds a term and all below it; as above.
ValueRange foldSubterm(Term* pTerm, bool IsRoot, bool& HasChanged) {
    ValueRange Left;
    ValueRange Right;
    if (pTerm->pLeft != nullptr)
        Left = foldSubterm(pTerm->pLeft, false, HasChanged);
    // The value of a store is the root of its own: its conversion to the element's type stays.
    if (pTerm->pRight != nullptr)
        Right = foldSubterm(pTerm->pRight, pTerm->isStore(), HasChanged);
    return foldWithOperands(pTerm, IsRoot, Left, Right, HasChanged);
}

} // namespace

bool castChangesNothing(const Term* pCast) {
    return changesNothing(pCast, typeRange(pCast->pLeft));
}

bool foldTerm(Term* pTerm) {
    bool HasChanged = false;
    foldSubterm(pTerm, true, HasChanged);
    return HasChanged;
}

} // namespace hpn
