#include "Emitter/CLiterals.h"
#include "Emitter/ExpressionWriter.h"
#include "Model/Arithmetic.h"
#include "Model/Conversion.h"
#include "Model/ZfCCfgSFVariable.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>

// Conditions and comparisons. A comparison of equally scaled variables, or of a scaled variable
// with a number, is one of raw numbers: the number grows with the raw number, so each relation to a
// number is a relation to a border on the raw side.

namespace hpn {

namespace {

Operator opposite(Operator Op) {
    switch (Op) {
    case Operator::Less:
        return Operator::GreaterEqual;
    case Operator::LessEqual:
        return Operator::Greater;
    case Operator::Greater:
        return Operator::LessEqual;
    case Operator::GreaterEqual:
        return Operator::Less;
    case Operator::Equal:
        return Operator::NotEqual;
    default:
        return Operator::Equal;
    }
}

/// The relation of b to a where `Op` is the one of a to b.
Operator mirrored(Operator Op) {
    switch (Op) {
    case Operator::Less:
        return Operator::Greater;
    case Operator::LessEqual:
        return Operator::GreaterEqual;
    case Operator::Greater:
        return Operator::Less;
    case Operator::GreaterEqual:
        return Operator::LessEqual;
    default:
        return Op;
    }
}

const char* signOf(Operator Op) {
    switch (Op) {
    case Operator::Less:
        return " < ";
    case Operator::LessEqual:
        return " <= ";
    case Operator::Greater:
        return " > ";
    case Operator::GreaterEqual:
        return " >= ";
    case Operator::Equal:
        return " == ";
    default:
        return " != ";
    }
}

bool isEquality(Operator Op) {
    return Op == Operator::Equal || Op == Operator::NotEqual;
}

unsigned widthOf(BaseType Base) {
    switch (Base) {
    case BaseType::Int8:
    case BaseType::UInt8:
        return 8;
    case BaseType::Int16:
    case BaseType::UInt16:
        return 16;
    default:
        return 32;
    }
}

/// Compilers see through a mask: `(x & 4) == 8` holds never, `(x | 1) != 0` always. Of both only
/// the bits of the width count.
bool isDecidedByMask(Operator MaskOp, double MaskNumber, double Number, unsigned Width) {
    const std::uint32_t Bits = Width == 32 ? 0xffffffffu : (1u << Width) - 1u;
    const std::uint32_t Mask = static_cast<std::uint32_t>(truncateTo32(MaskNumber)) & Bits;
    const std::uint32_t Wanted = static_cast<std::uint32_t>(truncateTo64(Number)) & Bits;
    return MaskOp == Operator::BitAnd ? (Wanted & ~Mask) != 0 : (Wanted & Mask) != Mask;
}

bool isTruthRange(const ValueRange& Range) {
    return Range.IsIntegral && !Range.MayBeNaN && Range.Low >= 0.0 && Range.High <= 1.0;
}

/// Smallest raw number that stands for `Number` or more (`OrMore`), or for more than it; one past
/// the greatest if there is none.
std::int64_t firstRaw(const Type& Of, double Number, bool OrMore) {
    std::int64_t Low = smallestRaw(Of.Base);
    std::int64_t High = greatestRaw(Of.Base) + 1;
    while (Low < High) {
        const std::int64_t Middle = Low + (High - Low) / 2;
        const double There = numberOfRaw(Middle, Of);
        if (OrMore ? There >= Number : There > Number)
            High = Middle;
        else
            Low = Middle + 1;
    }
    return Low;
}

bool isSameScale(const Type& a, const Type& b) {
    return a.Lsb == b.Lsb && a.Offset == b.Offset;
}

} // namespace

void ExpressionWriter::writeCondition(const Term* pTerm, bool Negated) {
    m_Nodes.clear();
    condition(analyse(pTerm), Negated);
}

void ExpressionWriter::writeTests(const BranchTests& Tests, bool Negated) {
    const char* pJoint = "";
    for (const BranchTest& Test : Tests) {
        m_Out += pJoint;
        const std::size_t Start = m_Out.size();
        m_Nodes.clear();
        const Piece Asked = condition(analyse(Test.pTerm), Test.Negated != Negated);
        if (Tests.size() > 1 && Asked.Binding != (Negated ? And : Or))
            bind(Start, Asked, Equality);
        pJoint = Negated ? " && " : " || ";
    }
}

ExpressionWriter::Piece ExpressionWriter::decided(bool Holds) {
    m_Out += Holds ? '1' : '0';
    return {CType::Int, Primary, false};
}

/// The number's being different from 0.0, or its being 0.0.
ExpressionWriter::Piece ExpressionWriter::condition(int Index, bool Negated) {
    const Node& Of = m_Nodes[Index];
    switch (Of.Op) {
    case Operator::Number:
        return decided((Of.Number != 0.0) != Negated);
    case Operator::LogicalNot:
        return condition(Of.Left, !Negated);
    case Operator::LogicalAnd:
    case Operator::LogicalOr:
        return logical(Of, Negated);
    case Operator::Less:
    case Operator::LessEqual:
    case Operator::Greater:
    case Operator::GreaterEqual:
    case Operator::Equal:
    case Operator::NotEqual:
        return comparison(Of, Negated);
    default:
        return unequalZero(Index, Negated);
    }
}

/// A number to be compared. Compilers take some sums and exclusive ors of narrow unsigned operands
/// for complements of promoted values, after they have put in what they know of constants, and
/// warn; behind a call they do not see it.
ExpressionWriter::Piece ExpressionWriter::compared(int Index) {
    const std::size_t Start = m_Out.size();
    const Piece Number = value(Index, false);
    while (m_Nodes[Index].Op == Operator::Cast)
        Index = m_Nodes[Index].Left;
    if (Number.Type == CType::Int && looksLikeComplement(m_Nodes[Index]))
        return wrapInCall(Start, "hpn_value32", CType::Int);
    return Number;
}

bool ExpressionWriter::looksLikeComplement(const Node& Of) const {
    const auto isLeaf = [&](int Index) { return m_Nodes[Index].Left == -1; };
    if (Of.Op == Operator::Negate)
        return !isLeaf(Of.Left);
    if (Of.Op == Operator::Subtract) {
        const Operator Left = m_Nodes[Of.Left].Op;
        return Left == Operator::Negate || (Left == Operator::Number && !isLeaf(Of.Right));
    }
    if (Of.Op != Operator::BitXor)
        return false;
    const auto isNarrowMask = [&](int Index) {
        const Node& Mask = m_Nodes[Index];
        if (Mask.Op == Operator::Variable)
            return originalOf(Mask.pTerm->pVariable)->getDeclaration().Kind == VariableKind::Param;
        return Mask.Op == Operator::Number && (Mask.Number == 255.0 || Mask.Number == 65535.0);
    };
    return isNarrowMask(Of.Left) || isNarrowMask(Of.Right);
}

/// What a mask or the range decides already, but inputs are read for, is compared as a double: no
/// compiler takes that for a slip.
ExpressionWriter::Piece ExpressionWriter::unequalZero(int Index, bool Negated) {
    const std::size_t Start = m_Out.size();
    const Operator Op = Negated ? Operator::Equal : Operator::NotEqual;
    Piece Result{};
    if (isScaledRead(Index) && compareRawWithNumber(Index, 0.0, Op, Result))
        return Result;
    const bool IsDecided = isMaskDecided(Index, 0.0) || m_Nodes[Index].Range.Low > 0.0 ||
                           m_Nodes[Index].Range.High < 0.0;
    if (IsDecided && !m_Nodes[Index].ReadsInput)
        return decided(!Negated);
    Piece Number = compared(Index);
    if (IsDecided && Number.Type != CType::Double)
        Number = cast(Start, Number, "double", CType::Double);
    if (Number.IsTruth && !Negated)
        return Number;
    if (Number.IsTruth) {
        bind(Start, Number, Prefix);
        m_Out.insert(Start, 1, '!');
        return {CType::Int, Prefix, true};
    }
    bind(Start, Number, Sum);
    m_Out += signOf(Op);
    const bool IsFloating = Number.Type == CType::Double || Number.Type == CType::Float;
    m_Out += IsFloating ? "0.0" : Number.Type == CType::UInt32 ? "0u" : "0";
    return {CType::Int, Equality, true};
}

/// `||` asks whether an operand equals 1.0, which is not the same as being different from 0.0.
ExpressionWriter::Piece ExpressionWriter::equalOne(int Index) {
    if (m_Nodes[Index].Op == Operator::Number)
        return decided(m_Nodes[Index].Number == 1.0);
    const bool IsDecided = isMaskDecided(Index, 1.0) || m_Nodes[Index].Range.Low > 1.0 ||
                           m_Nodes[Index].Range.High < 1.0;
    if (IsDecided && !m_Nodes[Index].ReadsInput)
        return decided(false);
    if (isTruthRange(m_Nodes[Index].Range))
        return condition(Index, false);
    Piece Result{};
    if (isScaledRead(Index) && compareRawWithNumber(Index, 1.0, Operator::Equal, Result))
        return Result;
    const std::size_t Start = m_Out.size();
    Piece Number = compared(Index);
    if (IsDecided && Number.Type != CType::Double)
        Number = cast(Start, Number, "double", CType::Double);
    bind(Start, Number, Sum);
    const bool IsFloating = Number.Type == CType::Double || Number.Type == CType::Float;
    m_Out += IsFloating ? " == 1.0" : Number.Type == CType::UInt32 ? " == 1u" : " == 1";
    return {CType::Int, Equality, true};
}

ExpressionWriter::Piece ExpressionWriter::logical(const Node& Of, bool Negated) {
    const bool IsAnd = Of.Op == Operator::LogicalAnd;
    const Precedence Binding = IsAnd ? And : Or;
    const std::size_t Start = m_Out.size();
    const Piece First = IsAnd ? condition(Of.Left, false) : equalOne(Of.Left);
    if (First.Binding != Binding)
        bind(Start, First, Equality);
    m_Out += IsAnd ? " && " : " || ";
    const std::size_t StartOfSecond = m_Out.size();
    const Piece Second = IsAnd ? condition(Of.Right, false) : equalOne(Of.Right);
    bind(StartOfSecond, Second, Equality);
    if (!Negated)
        return {CType::Int, Binding, true};
    parenthesize(Start);
    m_Out.insert(Start, 1, '!');
    return {CType::Int, Prefix, true};
}

/// A masked number that cannot equal the given one, also behind casts that keep its low bits.
bool ExpressionWriter::isMaskDecided(int Masked, double Number) const {
    unsigned Width = 32;
    while (m_Nodes[Masked].Op == Operator::Cast) {
        const Node& Cast = m_Nodes[Masked];
        const hpn::Type& To = *Cast.pTerm->pType;
        Masked = Cast.Left;
        const ValueRange& Range = m_Nodes[Masked].Range;
        if (Cast.Range.isWithin(Range) && Range.isWithin(Cast.Range))
            continue; // nothing of it is left in C
        const bool KeepsBits = isWhole(Masked) && Range.Low >= -2147483648.0 &&
                               Range.High <= 2147483647.0 && To.Base != BaseType::Bool &&
                               !isFloating(To.Base) && !isScaled(To) && !To.SaturatesHigh &&
                               !To.SaturatesLow;
        if (!KeepsBits)
            return false;
        Width = std::min(Width, widthOf(To.Base));
    }
    const Node& Of = m_Nodes[Masked];
    if (Of.Op != Operator::BitAnd && Of.Op != Operator::BitOr)
        return false;
    for (int Operand : {Of.Left, Of.Right})
        if (m_Nodes[Operand].Op == Operator::Number &&
            isDecidedByMask(Of.Op, m_Nodes[Operand].Number, Number, Width))
            return true;
    return false;
}

/// A cast to a narrow integer keeps only bits that a mask has set or cleared.
bool ExpressionWriter::isMaskedAway(const Node& Cast, double& Number) const {
    const hpn::Type& To = *Cast.pTerm->pType;
    const Node& Of = m_Nodes[Cast.Left];
    const unsigned Width = widthOf(To.Base);
    if (Width == 32 || isScaled(To) || To.SaturatesLow || To.SaturatesHigh ||
        (Of.Op != Operator::BitAnd && Of.Op != Operator::BitOr))
        return false;
    const std::uint32_t Bits = (1u << Width) - 1u;
    for (int Operand : {Of.Left, Of.Right}) {
        if (m_Nodes[Operand].Op != Operator::Number)
            continue;
        const std::uint32_t Mask =
            static_cast<std::uint32_t>(truncateTo32(m_Nodes[Operand].Number)) & Bits;
        if (Mask != (Of.Op == Operator::BitOr ? Bits : 0u))
            continue;
        Number = convertNumber(Mask, To);
        return true;
    }
    return false;
}

/// Comparisons that hold always or never for another reason than the ranges: equal operands, bits
/// that a mask sets or clears.
bool ExpressionWriter::isDecidedByShape(const Node& Of, double& Number) const {
    if (Of.Op == Operator::LogicalNot)
        return isMaskDecided(Of.Left, 0.0);
    if (Of.Op == Operator::Cast)
        return isMaskedAway(Of, Number);
    if (Of.Op < Operator::Less || Of.Op > Operator::NotEqual)
        return false;
    const Node& Left = m_Nodes[Of.Left];
    const Node& Right = m_Nodes[Of.Right];
    const bool IsMasked = isEquality(Of.Op) &&
                          ((Right.Op == Operator::Number && isMaskDecided(Of.Left, Right.Number)) ||
                           (Left.Op == Operator::Number && isMaskDecided(Of.Right, Left.Number)));
    if (IsMasked) {
        Number = Of.Op == Operator::NotEqual ? 1.0 : 0.0;
        return true;
    }
    if (Left.Range.MayBeNaN || !isSameTerm(Of.pTerm->pLeft, Of.pTerm->pRight))
        return false;
    Number = computeBinary(Of.Op, 0.0, 0.0);
    return true;
}

bool ExpressionWriter::isScaledRead(int Index) const {
    const Node& Of = m_Nodes[Index];
    return (Of.Op == Operator::Variable || Of.Op == Operator::Element) && isScaled(*Of.pType);
}

ExpressionWriter::Piece ExpressionWriter::comparison(const Node& Of, bool Negated) {
    const ValueRange& Left = m_Nodes[Of.Left].Range;
    const ValueRange& Right = m_Nodes[Of.Right].Range;
    // With a NaN in play the opposite of "less" is not "greater or equal".
    const bool CanTurn = isEquality(Of.Op) || (!Left.MayBeNaN && !Right.MayBeNaN);
    const std::size_t Start = m_Out.size();
    if (Negated && !CanTurn) {
        comparison(Of, false);
        parenthesize(Start);
        m_Out.insert(Start, 1, '!');
        return {CType::Int, Prefix, true};
    }
    const Operator Op = Negated ? opposite(Of.Op) : Of.Op;
    Piece Result{};
    if (compareRaw(Of, Op, Result))
        return Result;
    // What the types decide already, but inputs are read for, is compared where no compiler takes
    // it for a slip.
    double Ignored = 0.0;
    const bool IsDecided = Of.Range.isSingle() || isDecidedByShape(Of, Ignored);
    if (isWhole(Of.Left) && isWhole(Of.Right) && !IsDecided)
        return compareWhole(Of.Left, Of.Right, Op, false);
    Result = infix(Of.Left, Of.Right, signOf(Op), isEquality(Op) ? Equality : Relation, CType::Int,
                   false);
    Result.IsTruth = true;
    return Result;
}

bool ExpressionWriter::compareRaw(const Node& Of, Operator Op, Piece& Result) {
    const bool LeftScaled = isScaledRead(Of.Left);
    const bool RightScaled = isScaledRead(Of.Right);
    const Node& Left = m_Nodes[Of.Left];
    const Node& Right = m_Nodes[Of.Right];
    if (LeftScaled && RightScaled && isSameScale(*Left.pType, *Right.pType)) {
        if (Of.Range.isSingle())
            return false;
        Result = compareWhole(Of.Left, Of.Right, Op, true);
        return true;
    }
    if (LeftScaled && Right.Op == Operator::Number)
        return compareRawWithNumber(Of.Left, Right.Number, Op, Result);
    if (RightScaled && Left.Op == Operator::Number)
        return compareRawWithNumber(Of.Right, Left.Number, mirrored(Op), Result);
    return false;
}

/// False where the relation holds always or never.
bool ExpressionWriter::compareRawWithNumber(int Scaled, double Number, Operator Op, Piece& Result) {
    if (std::isnan(Number))
        return false;
    const hpn::Type& Type = *m_Nodes[Scaled].pType;
    const std::int64_t First = firstRaw(Type, Number, true);
    const std::int64_t Behind = firstRaw(Type, Number, false);
    const bool UsesFirst = Op == Operator::Less || Op == Operator::GreaterEqual;
    std::int64_t Border = UsesFirst ? First : Behind - 1;
    if (isEquality(Op) && First == Behind)
        return false;
    if (UsesFirst && (First == smallestRaw(Type.Base) || First > greatestRaw(Type.Base)))
        return false;
    if (!UsesFirst && !isEquality(Op) &&
        (Border < smallestRaw(Type.Base) || Border == greatestRaw(Type.Base)))
        return false;
    const std::size_t Start = m_Out.size();
    bind(Start, raw(m_Nodes[Scaled]), Sum);
    m_Out += signOf(Op);
    appendInteger(m_Out, Border);
    if (Type.Base == BaseType::UInt32)
        m_Out += 'u';
    Result = {CType::Int, isEquality(Op) ? Equality : Relation, true};
    return true;
}

/// Compares integers; C compares an int and an unsigned one as unsigned, so one of them is widened.
ExpressionWriter::Piece ExpressionWriter::compareWhole(int Left, int Right, Operator Op,
                                                       bool OfRaws) {
    const auto write = [&](int Index) { return OfRaws ? raw(m_Nodes[Index]) : compared(Index); };
    const std::size_t Start = m_Out.size();
    const std::size_t ReadsBefore = m_Reads.size();
    Piece First = write(Left);
    const std::size_t AfterFirst = m_Out.size();
    Piece Second = write(Right);
    std::string Rest = m_Out.substr(AfterFirst);
    const bool IsSameText = m_Out.compare(Start, AfterFirst - Start, Rest) == 0;
    if (IsSameText && !m_Nodes[Left].ReadsInput) {
        m_Out.resize(Start);
        m_Reads.resize(ReadsBefore);
        return decided(Op == Operator::Equal || Op == Operator::LessEqual ||
                       Op == Operator::GreaterEqual);
    }
    const bool FirstWidens = First.Type == CType::UInt32 && Second.Type == CType::Int;
    const bool SecondWidens = Second.Type == CType::UInt32 && First.Type == CType::Int;
    if (FirstWidens && m_Nodes[Right].Op == Operator::Number) {
        Rest += 'u';
    } else if (SecondWidens || IsSameText) {
        Second = cast(AfterFirst, Second, "int64_t", CType::Int64);
        Rest = m_Out.substr(AfterFirst);
    }
    if (Second.Binding < Sum || Rest[0] == '!')
        Rest = '(' + Rest + ')';
    m_Out.resize(AfterFirst);
    if (FirstWidens && m_Nodes[Right].Op != Operator::Number)
        First = cast(Start, First, "int64_t", CType::Int64);
    bindBeside(Start, First, Sum);
    m_Out += signOf(Op);
    m_Out += Rest;
    return {CType::Int, isEquality(Op) ? Equality : Relation, true};
}

} // namespace hpn
