#include "Emitter/ExpressionWriter.h"

#include "Emitter/CLiterals.h"
#include "Model/Arithmetic.h"
#include "Model/Conversion.h"
#include "Model/ZfCCfgSFVariable.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstring>

// How a term becomes C:
//   1. `analyse` walks it once, operands first, and notes for each operator the range of its number
//   by the types alone and
//      whether integer arithmetic gives that number;
//   2. the writing operations append an operator's text with its operands and answer its C type and
//   how strongly it binds; a cast
//      or parentheses that turn out to be needed are inserted in front of what was just written.
// Stores and comparisons are in ExpressionStores.cpp and ExpressionConditions.cpp.

namespace hpn {

namespace {

constexpr double GreatestExact = 9007199254740992.0; // up to here every whole number is a double

bool isWholeWithin(const ValueRange& Range, double Low, double High) {
    return Range.IsIntegral && !Range.MayBeNaN && !Range.isEmpty() && Range.Low >= Low &&
           Range.High <= High;
}

bool fits32(const ValueRange& Range) {
    return isWholeWithin(Range, -2147483648.0, 2147483647.0);
}

bool mayBe(const ValueRange& Range, double Number) {
    return Range.Low <= Number && Number <= Range.High;
}

bool isFinite(const ValueRange& Range) {
    return !Range.MayBeNaN && Range.Low >= -1.7976931348623157e308 &&
           Range.High <= 1.7976931348623157e308;
}

bool isUnary(Operator Op) {
    switch (Op) {
    case Operator::Negate:
    case Operator::LogicalNot:
    case Operator::Complement:
    case Operator::Absolute:
    case Operator::Sign:
        return true;
    default:
        return false;
    }
}

} // namespace

// ---- step 1 ----

int ExpressionWriter::analyseNumber(double Number) {
    Node Result;
    Result.Number = Number;
    Result.Range = rangeOfNumber(Number);
    Result.Kind = kindOf(Result);
    m_Nodes.push_back(Result);
    return static_cast<int>(m_Nodes.size()) - 1;
}

int ExpressionWriter::analyse(const Term* pTerm) {
    if (pTerm->Op == Operator::Number)
        return analyseNumber(pTerm->Number);
    Node Result;
    Result.pTerm = pTerm;
    Result.Op = pTerm->Op;
    if (pTerm->pLeft)
        Result.Left = analyse(pTerm->pLeft);
    if (pTerm->pRight)
        Result.Right = analyse(pTerm->pRight);
    Result.ReadsInput = (Result.Left != -1 && m_Nodes[Result.Left].ReadsInput) ||
                        (Result.Right != -1 && m_Nodes[Result.Right].ReadsInput);
    if (pTerm->Op == Operator::Variable || pTerm->Op == Operator::Element) {
        const Variable& Declaration = originalOf(pTerm->pVariable)->getDeclaration();
        Result.pType = Declaration.pType;
        Result.ReadsInput = Result.ReadsInput || Declaration.Kind == VariableKind::Input;
        Result.Range = rangeOfTerm(pTerm, RangeSource::Types);
    } else if (pTerm->Op == Operator::Cast) {
        Result.Range = convertRange(m_Nodes[Result.Left].Range, *pTerm->pType);
    } else if (isUnary(pTerm->Op)) {
        Result.Range = rangeOfUnary(pTerm->Op, m_Nodes[Result.Left].Range);
    } else {
        Result.Range =
            rangeOfBinary(pTerm->Op, m_Nodes[Result.Left].Range, m_Nodes[Result.Right].Range);
    }
    // What can only be one number is written as that number: a C compiler would fold it as well,
    // and then warn.
    if (Result.Range.isSingle() && !Result.ReadsInput)
        return analyseNumber(Result.Range.Low);
    double Number = 0.0;
    if (isConstant(Result, Number))
        return analyseNumber(Number);
    if (!Result.ReadsInput && isDecidedByShape(Result, Number))
        return analyseNumber(Number);
    turnIntoComplement(Result);
    Result.Kind = kindOf(Result);
    m_Nodes.push_back(Result);
    return static_cast<int>(m_Nodes.size()) - 1;
}

/// An operator on numbers only.
bool ExpressionWriter::isConstant(const Node& Of, double& Number) const {
    const auto isNumber = [&](int Index) { return m_Nodes[Index].Op == Operator::Number; };
    if (Of.pType || !isNumber(Of.Left) || (Of.Right != -1 && !isNumber(Of.Right)))
        return false;
    const double Left = m_Nodes[Of.Left].Number;
    if (Of.Op == Operator::Cast)
        Number = convertNumber(Left, *Of.pTerm->pType);
    else
        Number = Of.Right == -1 ? computeUnary(Of.Op, Left)
                                : computeBinary(Of.Op, Left, m_Nodes[Of.Right].Number);
    return true;
}

/// `x ^ -1` and `-1 - x` are complements to a C compiler, so they are written like those.
void ExpressionWriter::turnIntoComplement(Node& Of) const {
    if (Of.Op != Operator::BitXor && Of.Op != Operator::Subtract)
        return;
    const auto isMinusOne = [&](int Index) {
        return m_Nodes[Index].Op == Operator::Number && truncateTo32(m_Nodes[Index].Number) == -1;
    };
    if (Of.Op == Operator::BitXor && isMinusOne(Of.Right)) {
        Of.Op = Operator::Complement;
    } else if (isMinusOne(Of.Left) &&
               (Of.Op == Operator::BitXor ||
                (m_Nodes[Of.Right].Kind == Arithmetic::Int32 && m_Nodes[Of.Left].Number == -1.0))) {
        Of.Op = Operator::Complement;
        Of.Left = Of.Right;
    }
}

ExpressionWriter::Arithmetic ExpressionWriter::kindOf(const Node& Of) const {
    switch (Of.Op) {
    case Operator::Number:
        if (Of.Range.MayBeNegativeZero || !isWholeWithin(Of.Range, -GreatestExact, GreatestExact))
            return Arithmetic::Double;
        return fits32(Of.Range) ? Arithmetic::Int32 : Arithmetic::Int64;
    case Operator::Variable:
    case Operator::Element:
        if (isFloating(Of.pType->Base) || isScaled(*Of.pType))
            return Arithmetic::Double;
        return Of.pType->Base == BaseType::UInt32 ? Arithmetic::Int64 : Arithmetic::Int32;
    case Operator::Cast:
        return kindOfCast(Of);
    case Operator::Add:
    case Operator::Subtract:
    case Operator::Multiply:
    case Operator::Negate:
    case Operator::Absolute:
    case Operator::Minimum:
    case Operator::Maximum:
        return kindOfArithmetic(Of);
    case Operator::Divide:
        return Arithmetic::Double;
    default:
        return Arithmetic::Int32;
    }
}

ExpressionWriter::Arithmetic ExpressionWriter::kindOfCast(const Node& Of) const {
    const hpn::Type& To = *Of.pTerm->pType;
    const Node& From = m_Nodes[Of.Left];
    if (isScaled(To) || isFloating(To.Base)) {
        const double Exact = To.Base == BaseType::Float32 ? 16777216.0 : GreatestExact;
        const bool IsCopy = isFloating(To.Base) && !To.SaturatesHigh && !To.SaturatesLow &&
                            From.Kind != Arithmetic::Double &&
                            isWholeWithin(From.Range, -Exact, Exact);
        return IsCopy ? From.Kind : Arithmetic::Double;
    }
    return To.Base == BaseType::UInt32 ? Arithmetic::Int64 : Arithmetic::Int32;
}

ExpressionWriter::Arithmetic ExpressionWriter::kindOfArithmetic(const Node& Of) const {
    const Arithmetic Left = m_Nodes[Of.Left].Kind;
    const Arithmetic Right = Of.Right == -1 ? Left : m_Nodes[Of.Right].Kind;
    const Arithmetic Wider = std::max(Left, Right);
    if (Wider == Arithmetic::Double || !isWholeWithin(Of.Range, -GreatestExact, GreatestExact))
        return Arithmetic::Double;
    return fits32(Of.Range) ? Wider : Arithmetic::Int64;
}

// ---- step 2: pieces of text ----

void ExpressionWriter::parenthesize(std::size_t Start) {
    m_Out.insert(Start, 1, '(');
    m_Out += ')';
}

void ExpressionWriter::bind(std::size_t Start, Piece Of, Precedence Least) {
    if (Of.Binding < Least)
        parenthesize(Start);
}

/// The same for an operand of a bit operation or comparison, where compilers take a `!` in front
/// for a slip.
void ExpressionWriter::bindBeside(std::size_t Start, Piece Of, Precedence Least) {
    if (Of.Binding < Least || m_Out[Start] == '!')
        parenthesize(Start);
}

ExpressionWriter::Piece ExpressionWriter::cast(std::size_t Start, Piece Of, const char* Type,
                                               CType To) {
    bind(Start, Of, Prefix);
    char Text[16] = "(";
    std::strcat(Text, Type);
    std::strcat(Text, ")");
    m_Out.insert(Start, Text);
    return {To, Prefix, false};
}

ExpressionWriter::Piece ExpressionWriter::wrapInCall(std::size_t Start, const char* Name,
                                                     CType Type) {
    parenthesize(Start);
    m_Out.insert(Start, Name);
    return {Type, Primary, false};
}

ExpressionWriter::Piece ExpressionWriter::call(const char* Name, int Left, int Right, CType Type,
                                               bool KeepZeroSign) {
    m_Out += Name;
    m_Out += '(';
    value(Left, KeepZeroSign);
    if (Right != -1) {
        m_Out += ", ";
        value(Right, KeepZeroSign);
    }
    m_Out += ')';
    return {Type, Primary, false};
}

/// Left and right operand as doubles, with a sign between them. The operands bind as C's precedence
/// has it.
ExpressionWriter::Piece ExpressionWriter::infix(int Left, int Right, const char* Sign,
                                                Precedence Binding, CType Type, bool KeepZeroSign) {
    const bool IsArithmetic = Binding == Sum || Binding == Product;
    const auto operand = [&](int Index) {
        const bool IsCompared = !IsArithmetic && m_Nodes[Index].Op != Operator::Number;
        return IsCompared ? compared(Index) : operandAsDouble(Index, KeepZeroSign);
    };
    const std::size_t Start = m_Out.size();
    Piece First = operand(Left);
    const std::size_t AfterFirst = m_Out.size();
    m_Out += Sign;
    const std::size_t StartOfSecond = m_Out.size();
    const Piece Second = operand(Right);
    bindBeside(StartOfSecond, Second, static_cast<Precedence>(IsArithmetic ? Binding + 1 : Sum));
    // C computes in the wider of the two types, which must not be float or an integer type.
    const bool NeedsCast = First.Type != CType::Double && Second.Type != CType::Double &&
                           (IsArithmetic || First.Type != Second.Type);
    const std::string Rest = m_Out.substr(AfterFirst);
    m_Out.resize(AfterFirst);
    if (NeedsCast)
        First = cast(Start, First, "double", CType::Double);
    bindBeside(Start, First, IsArithmetic ? Binding : Sum);
    m_Out += Rest;
    return {Type, Binding, false};
}

/// A number stands as a floating literal where it meets another operand.
ExpressionWriter::Piece ExpressionWriter::operandAsDouble(int Index, bool KeepZeroSign) {
    const Node& Of = m_Nodes[Index];
    return Of.Op == Operator::Number ? number(Of, true) : value(Index, KeepZeroSign);
}

ExpressionWriter::Piece ExpressionWriter::number(const Node& Of, bool AsDouble) {
    const std::size_t Start = m_Out.size();
    const bool IsWhole = Of.Kind != Arithmetic::Double && !AsDouble;
    if (IsWhole)
        appendInteger(m_Out, static_cast<std::int64_t>(Of.Number));
    else
        appendDouble(m_Out, Of.Number);
    const CType Type = !IsWhole                       ? CType::Double
                       : Of.Kind == Arithmetic::Int32 ? CType::Int
                                                      : CType::Int64;
    return {Type, m_Out[Start] == '-' ? Prefix : Primary, false};
}

// ---- step 2: values ----

/// The number itself. Its C type is Int where `kindOf` says Int32, one of the integer types where
/// it says Int64, else a floating one. `KeepZeroSign`: a negative zero has to stay one.
ExpressionWriter::Piece ExpressionWriter::value(int Index, bool KeepZeroSign) {
    const Node& Of = m_Nodes[Index];
    switch (Of.Op) {
    case Operator::Number:
        return number(Of, false);
    case Operator::Variable:
    case Operator::Element:
        return read(Of);
    case Operator::Cast:
        return castValue(Of);
    case Operator::LogicalNot:
    case Operator::Less:
    case Operator::LessEqual:
    case Operator::Greater:
    case Operator::GreaterEqual:
    case Operator::Equal:
    case Operator::NotEqual:
    case Operator::LogicalAnd:
    case Operator::LogicalOr:
        return condition(Index, false);
    default:
        return isUnary(Of.Op) ? unary(Of, KeepZeroSign) : binary(Of, KeepZeroSign);
    }
}

ExpressionWriter::Piece ExpressionWriter::raw(const Node& Of) {
    const Variable& Declaration = originalOf(Of.pTerm->pVariable)->getDeclaration();
    m_Reads.push_back(&Declaration);
    if (Of.Op == Operator::Element)
        element(Declaration, Of.Left);
    else
        m_Out += m_Names.nameOf(Declaration);
    switch (Of.pType->Base) {
    case BaseType::UInt32:
        return {CType::UInt32, Primary, false};
    case BaseType::Float32:
        return {CType::Float, Primary, false};
    case BaseType::Float64:
        return {CType::Double, Primary, false};
    default:
        return {CType::Int, Primary, Of.pType->Base == BaseType::Bool};
    }
}

ExpressionWriter::Piece ExpressionWriter::read(const Node& Of) {
    const std::size_t Start = m_Out.size();
    const Piece Raw = raw(Of);
    return isScaled(*Of.pType) ? scaled(Start, Raw, *Of.pType) : Raw;
}

ExpressionWriter::Piece ExpressionWriter::scaled(std::size_t Start, Piece Raw,
                                                 const hpn::Type& Of) {
    Precedence Binding = Raw.Binding;
    if (Of.Lsb != 1.0) {
        bind(Start, Raw, Product);
        m_Out += " * ";
        appendDouble(m_Out, Of.Lsb);
        Binding = Product;
    }
    if (Of.Offset != 0.0) {
        if (Of.Lsb == 1.0)
            bind(Start, Raw, Sum);
        m_Out += Of.Offset < 0.0 ? " - " : " + ";
        appendDouble(m_Out, std::fabs(Of.Offset));
        Binding = Sum;
    }
    return {CType::Double, Binding, false};
}

ExpressionWriter::Piece ExpressionWriter::unary(const Node& Of, bool KeepZeroSign) {
    const bool IsWide = Of.Kind == Arithmetic::Int64;
    const bool IsWholeOperand = isWhole(Of.Left);
    const bool KeepsSign = KeepZeroSign && Of.Range.MayBeNegativeZero;
    const std::size_t Start = m_Out.size();
    switch (Of.Op) {
    case Operator::Complement:
        truncated32(Of.Left);
        return wrapInCall(Start, "hpn_not", CType::Int);
    case Operator::Absolute:
        if (Of.Kind == Arithmetic::Double || KeepsSign)
            return call("hpn_abs", Of.Left, -1, CType::Double, KeepZeroSign);
        return call(IsWide ? "hpn_abs64" : "hpn_abs32", Of.Left, -1,
                    IsWide ? CType::Int64 : CType::Int, false);
    case Operator::Sign:
        return call(!IsWholeOperand                              ? "hpn_sgn"
                    : m_Nodes[Of.Left].Kind == Arithmetic::Int64 ? "hpn_sgn64"
                                                                 : "hpn_sgn32",
                    Of.Left, -1, CType::Int, false);
    default:
        break;
    }
    // Negation: of an integer zero there is no negative one, and of the smallest int no negative at
    // all.
    Piece Operand = value(Of.Left, KeepZeroSign);
    const bool NeedsDouble = Operand.Type != CType::Double && Operand.Type != CType::Float &&
                             (Of.Kind == Arithmetic::Double || KeepsSign);
    if (NeedsDouble)
        Operand = cast(Start, Operand, "double", CType::Double);
    else if (IsWide && Operand.Type != CType::Int64)
        Operand = cast(Start, Operand, "int64_t", CType::Int64);
    if (Operand.Binding < Prefix || m_Out[Start] == '-')
        parenthesize(Start);
    m_Out.insert(Start, 1, '-');
    return {Operand.Type, Prefix, false};
}

ExpressionWriter::Piece ExpressionWriter::binary(const Node& Of, bool KeepZeroSign) {
    switch (Of.Op) {
    case Operator::Add:
    case Operator::Subtract:
    case Operator::Multiply:
        return sumOrProduct(Of, KeepZeroSign);
    case Operator::Divide:
        return quotient(Of, KeepZeroSign);
    case Operator::Modulo:
        return remainder(Of);
    case Operator::ShiftLeft:
    case Operator::ShiftRight:
        return shift(Of);
    case Operator::Minimum:
    case Operator::Maximum:
        return extreme(Of, KeepZeroSign);
    default:
        return bitOperation(Of);
    }
}

/// Sum, difference or product in the integers.
ExpressionWriter::Piece ExpressionWriter::wholeBinary(const Node& Of, const char* Sign,
                                                      Precedence Binding) {
    const bool IsWide = Of.Kind == Arithmetic::Int64;
    const std::size_t Start = m_Out.size();
    Piece First = value(Of.Left, false);
    const std::size_t AfterFirst = m_Out.size();
    m_Out += Sign;
    const std::size_t StartOfSecond = m_Out.size();
    Piece Second = value(Of.Right, false);
    const bool NeedsCast = IsWide && First.Type != CType::Int64 && Second.Type != CType::Int64;
    const bool CastsSecond = NeedsCast && m_Nodes[Of.Left].Op == Operator::Number;
    if (CastsSecond)
        Second = cast(StartOfSecond, Second, "int64_t", CType::Int64);
    bind(StartOfSecond, Second, static_cast<Precedence>(Binding + 1));
    const std::string Rest = m_Out.substr(AfterFirst);
    m_Out.resize(AfterFirst);
    if (NeedsCast && !CastsSecond)
        First = cast(Start, First, "int64_t", CType::Int64);
    bind(Start, First, Binding);
    m_Out += Rest;
    return {IsWide ? CType::Int64 : CType::Int, Binding, false};
}

ExpressionWriter::Piece ExpressionWriter::sumOrProduct(const Node& Of, bool KeepZeroSign) {
    const bool IsProduct = Of.Op == Operator::Multiply;
    const char* Sign = IsProduct ? " * " : Of.Op == Operator::Add ? " + " : " - ";
    const bool KeepsSign = KeepZeroSign && Of.Range.MayBeNegativeZero;
    if (Of.Kind != Arithmetic::Double && !KeepsSign)
        return wholeBinary(Of, Sign, IsProduct ? Product : Sum);
    if (!IsProduct)
        return infix(Of.Left, Of.Right, Sign, Sum, CType::Double, KeepZeroSign);
    const ValueRange& Left = m_Nodes[Of.Left].Range;
    const ValueRange& Right = m_Nodes[Of.Right].Range;
    const bool MayBeZero = mayBe(Left, 0.0) || mayBe(Right, 0.0);
    const bool IsPlain = !MayBeZero || (!KeepZeroSign && (!mayBe(Left, 0.0) || isFinite(Right)) &&
                                        (!mayBe(Right, 0.0) || isFinite(Left)));
    if (IsPlain)
        return infix(Of.Left, Of.Right, Sign, Product, CType::Double, false);
    return call("hpn_mul", Of.Left, Of.Right, CType::Double, false);
}

/// Below a divisor the sign of a zero is told from the other by the infinity that it gives.
ExpressionWriter::Piece ExpressionWriter::quotient(const Node& Of, bool KeepZeroSign) {
    const ValueRange& Left = m_Nodes[Of.Left].Range;
    const ValueRange& Right = m_Nodes[Of.Right].Range;
    const bool IsPlain =
        !mayBe(Left, 0.0) || (!KeepZeroSign && !mayBe(Right, 0.0) && !Right.MayBeNaN);
    const std::size_t Start = m_Out.size();
    if (!IsPlain)
        m_Out += "hpn_div(";
    Piece First = operandAsDouble(Of.Left, false);
    const std::size_t AfterFirst = m_Out.size();
    m_Out += IsPlain ? " / " : ", ";
    const std::size_t StartOfSecond = m_Out.size();
    Piece Second = operandAsDouble(Of.Right, true);
    // A condition that is never true; a compiler would warn of the integer 0.
    if (m_Out.compare(StartOfSecond, std::string::npos, "0") == 0) {
        m_Out += ".0";
        Second.Type = CType::Double;
    }
    if (!IsPlain) {
        m_Out += ')';
        return {CType::Double, Primary, false};
    }
    bind(StartOfSecond, Second, Prefix);
    const std::string Rest = m_Out.substr(AfterFirst);
    m_Out.resize(AfterFirst);
    if (First.Type != CType::Double && Second.Type != CType::Double)
        First = cast(Start, First, "double", CType::Double);
    bind(Start, First, Product);
    m_Out += Rest;
    return {CType::Double, Product, false};
}

ExpressionWriter::Piece ExpressionWriter::extreme(const Node& Of, bool KeepZeroSign) {
    const bool IsMinimum = Of.Op == Operator::Minimum;
    if (Of.Kind == Arithmetic::Double || (KeepZeroSign && Of.Range.MayBeNegativeZero))
        return call(IsMinimum ? "hpn_min" : "hpn_max", Of.Left, Of.Right, CType::Double,
                    KeepZeroSign);
    if (Of.Kind == Arithmetic::Int32)
        return call(IsMinimum ? "hpn_min32" : "hpn_max32", Of.Left, Of.Right, CType::Int, false);
    return call(IsMinimum ? "hpn_min64" : "hpn_max64", Of.Left, Of.Right, CType::Int64, false);
}

// ---- step 2: operators of signed 32 bits ----

/// The quotient of two integers, cut off, is the integer quotient: the double quotient is too close
/// to the real one to reach the next whole number while the dividend has no more than 52 bits.
bool ExpressionWriter::isDivisionTruncating(const Node& Of) const {
    if (Of.Op != Operator::Divide || !isWhole(Of.Left) || !isWhole(Of.Right))
        return false;
    const ValueRange& Left = m_Nodes[Of.Left].Range;
    const ValueRange& Right = m_Nodes[Of.Right].Range;
    constexpr double Greatest = GreatestExact / 4.0;
    return !mayBe(Right, 0.0) && isWholeWithin(Left, -Greatest, Greatest) &&
           isWholeWithin(Right, -2147483648.0, 4294967295.0);
}

ExpressionWriter::Piece ExpressionWriter::truncatedQuotient(const Node& Of) {
    Node Quotient = Of;
    const bool IsNarrow =
        m_Nodes[Of.Left].Kind == Arithmetic::Int32 && m_Nodes[Of.Right].Kind == Arithmetic::Int32 &&
        !(mayBe(m_Nodes[Of.Left].Range, -2147483648.0) && mayBe(m_Nodes[Of.Right].Range, -1.0));
    Quotient.Kind = IsNarrow ? Arithmetic::Int32 : Arithmetic::Int64;
    return wholeBinary(Quotient, " / ", Product);
}

/// A number cut off to signed 32 bits; of C type Int.
ExpressionWriter::Piece ExpressionWriter::truncated32(int Index) {
    const Node& Of = m_Nodes[Index];
    const std::size_t Start = m_Out.size();
    if (Of.Op == Operator::Number) {
        appendInteger(m_Out, truncateTo32(Of.Number));
        return {CType::Int, m_Out[Start] == '-' ? Prefix : Primary, false};
    }
    const bool Divides = isDivisionTruncating(Of);
    if (Divides || isWhole(Index)) {
        const Piece Whole = Divides ? truncatedQuotient(Of) : value(Index, false);
        if (Whole.Type == CType::Int)
            return Whole;
        if (Of.Range.Low >= -2147483648.0 && Of.Range.High <= 2147483647.0)
            return cast(Start, Whole, "int32_t", CType::Int);
        return wrapInCall(Start, "hpn_int32_of64", CType::Int);
    }
    const Piece Number = value(Index, false);
    if (!Of.Range.MayBeNaN && Of.Range.Low > -2147483649.0 && Of.Range.High < 2147483648.0)
        return cast(Start, Number, "int32_t", CType::Int);
    return wrapInCall(Start, "hpn_int32", CType::Int);
}

/// An operand of a bit operation. Only there does `~` stand as such: compilers take the complement
/// of a truth value, and the comparison of a promoted one, for slips.
ExpressionWriter::Piece ExpressionWriter::bitOperand(int Index) {
    const Node& Of = m_Nodes[Index];
    if (Of.Op != Operator::Complement)
        return truncated32(Index);
    const std::size_t Start = m_Out.size();
    const Piece Operand = truncated32(Of.Left);
    if (Operand.IsTruth)
        return wrapInCall(Start, "hpn_not", CType::Int);
    bind(Start, Operand, Prefix);
    m_Out.insert(Start, 1, '~');
    return {CType::Int, Prefix, false};
}

ExpressionWriter::Piece ExpressionWriter::bitOperation(const Node& Of) {
    const bool IsAnd = Of.Op == Operator::BitAnd;
    const bool IsOr = Of.Op == Operator::BitOr;
    const Precedence Binding = IsAnd ? BitAnd : IsOr ? BitOr : BitXor;
    const std::size_t Start = m_Out.size();
    const Piece First = bitOperand(Of.Left);
    // Operators of different kinds side by side are always bracketed.
    if (First.Binding != Binding)
        bindBeside(Start, First, Prefix);
    m_Out += IsAnd ? " & " : IsOr ? " | " : " ^ ";
    const std::size_t StartOfSecond = m_Out.size();
    Piece Second = bitOperand(Of.Right);
    // Of two truth values a compiler would rather see them joined by a logical operator.
    if (First.IsTruth && Second.IsTruth)
        Second = cast(StartOfSecond, Second, "int32_t", CType::Int);
    bindBeside(StartOfSecond, Second, Prefix);
    return {CType::Int, Binding, false};
}

ExpressionWriter::Piece ExpressionWriter::shift(const Node& Of) {
    const bool IsLeft = Of.Op == Operator::ShiftLeft;
    const ValueRange& Left = m_Nodes[Of.Left].Range;
    const ValueRange& Count = m_Nodes[Of.Right].Range;
    const bool IsPlain =
        fits32(Left) && Left.Low >= 0.0 && isWhole(Of.Right) && isWholeWithin(Count, 0.0, 31.0) &&
        (!IsLeft || std::ldexp(Left.High, static_cast<int>(Count.High)) <= 2147483647.0);
    if (!IsPlain)
        m_Out += IsLeft ? "hpn_shl(" : "hpn_shr(";
    const std::size_t Start = m_Out.size();
    const Piece First = truncated32(Of.Left);
    if (IsPlain)
        bind(Start, First, Prefix);
    m_Out += !IsPlain ? ", " : IsLeft ? " << " : " >> ";
    const std::size_t StartOfSecond = m_Out.size();
    const Piece Second = truncated32(Of.Right);
    if (IsPlain) {
        bind(StartOfSecond, Second, Prefix);
        return {CType::Int, Shift, false};
    }
    m_Out += ')';
    return {CType::Int, Primary, false};
}

ExpressionWriter::Piece ExpressionWriter::remainder(const Node& Of) {
    const ValueRange& Left = m_Nodes[Of.Left].Range;
    const ValueRange& Right = m_Nodes[Of.Right].Range;
    const bool IsPlain = fits32(Left) && fits32(Right) && !mayBe(Right, 0.0) &&
                         (Left.Low > -2147483648.0 || !mayBe(Right, -1.0));
    if (!IsPlain)
        m_Out += "hpn_mod(";
    const std::size_t Start = m_Out.size();
    const Piece First = truncated32(Of.Left);
    if (IsPlain)
        bind(Start, First, Product);
    m_Out += IsPlain ? " % " : ", ";
    const std::size_t StartOfSecond = m_Out.size();
    const Piece Second = truncated32(Of.Right);
    if (IsPlain) {
        bind(StartOfSecond, Second, Prefix);
        return {CType::Int, Product, false};
    }
    m_Out += ')';
    return {CType::Int, Primary, false};
}

// ---- elements and what is only evaluated ----

void ExpressionWriter::element(const Variable& Array, int Index) {
    const Node& Of = m_Nodes[Index];
    const std::int64_t Last = static_cast<std::int64_t>(Array.Count) - 1;
    m_Out += m_Names.nameOf(Array);
    m_Out += '[';
    if (Of.Op == Operator::Number) {
        appendInteger(m_Out, std::clamp<std::int64_t>(truncateTo32(Of.Number), 0, Last));
    } else if (!Of.Range.MayBeNaN && Of.Range.Low > -1.0 && Of.Range.High < Array.Count) {
        truncated32(Index);
    } else {
        m_Out += "hpn_index(";
        truncated32(Index);
        m_Out += ", ";
        appendInteger(m_Out, Array.Count);
        m_Out += ')';
    }
    m_Out += ']';
}

void ExpressionWriter::writeElement(const Variable& Array, const Term* pIndex) {
    m_Nodes.clear();
    element(Array, analyse(pIndex));
}

void ExpressionWriter::writeDiscarded(const Term* pTerm) {
    m_Nodes.clear();
    const int Root = analyse(pTerm);
    const std::size_t Start = m_Out.size();
    cast(Start, value(Root, false), "void", CType::Int);
}

} // namespace hpn
