#include "Emitter/CLiterals.h"
#include "Emitter/ExpressionWriter.h"
#include "Model/Conversion.h"
#include "Model/ZfCCfgSFVariable.h"

#include <algorithm>
#include <cmath>
#include <cstddef>

// Stores and casts: clip at the limits that the number can be beyond, then round, truncate or wrap
// into the storage. Each step is left out where the range of the number shows that it changes
// nothing.

namespace hpn {

namespace {

bool isInStorage(const ValueRange& Range, BaseType Base) {
    return Range.Low >= static_cast<double>(smallestRaw(Base)) &&
           Range.High <= static_cast<double>(greatestRaw(Base));
}

bool isUnsigned(BaseType Base) {
    return Base == BaseType::UInt8 || Base == BaseType::UInt16 || Base == BaseType::UInt32;
}

ValueRange clipped(ValueRange Range, const Type& To, bool Low, bool High) {
    if (High)
        Range.High = std::min(Range.High, To.Upper);
    if (Low)
        Range.Low = std::max(Range.Low, To.Lower);
    if (High)
        Range.Low = std::min(Range.Low, To.Upper);
    if (Low)
        Range.High = std::max(Range.High, To.Lower);
    return Range;
}

} // namespace

void ExpressionWriter::writeStored(const Term* pTerm, const Type& To, bool KeepNaN) {
    m_Nodes.clear();
    if (pTerm->Op == Operator::Number)
        return appendStored(m_Out, pTerm->Number, To);
    // Any other root than the store's own conversion is a number that needs none any more, at most
    // its storage.
    const bool Converts = pTerm->Op == Operator::Cast && pTerm->pType == &To;
    const int Root = analyse(Converts ? pTerm->pLeft : pTerm);
    const std::size_t Start = m_Out.size();
    const Piece Stored = stored(Root, To, Converts);
    const ValueRange Range = Converts ? convertRange(m_Nodes[Root].Range, To) : m_Nodes[Root].Range;
    if (!KeepNaN && isFloating(To.Base) && Range.MayBeNaN) {
        const Piece Same = wrapInCall(Start, "hpn_nan", CType::Double);
        if (To.Base == BaseType::Float32)
            cast(Start, Same, "float", CType::Float);
        return;
    }
    explicitCast(Start, Stored, To.Base);
}

/// C converts by itself on assignment; the cast says that it is meant to where more than one value
/// was computed with.
void ExpressionWriter::explicitCast(std::size_t Start, Piece Of, BaseType Base) {
    const bool IsPlain = Of.Binding >= Prefix && Of.Type != CType::Int64;
    if (IsPlain || Base == BaseType::Bool || Base == BaseType::Float64)
        return;
    if (Base == BaseType::Int32 && Of.Type == CType::Int)
        return;
    if (Base == BaseType::UInt32 && Of.Type == CType::UInt32)
        return;
    cast(Start, Of, cTypeName(Base), CType::Int);
}

/// What the storage of a type holds after a store of the number. `Clips` false: the number has been
/// through the limits.
ExpressionWriter::Piece ExpressionWriter::stored(int Index, const hpn::Type& To, bool Clips) {
    const Node& Of = m_Nodes[Index];
    if (Of.Op == Operator::Number) {
        const std::size_t Start = m_Out.size();
        const double Number = Clips ? convertNumber(Of.Number, To) : Of.Number;
        appendStored(m_Out, Number, To);
        const CType Type = To.Base == BaseType::Float32   ? CType::Float
                           : To.Base == BaseType::Float64 ? CType::Double
                           : To.Base == BaseType::UInt32  ? CType::UInt32
                                                          : CType::Int;
        return {Type, m_Out[Start] == '-' ? Prefix : Primary, To.Base == BaseType::Bool};
    }
    const bool MayClip = Clips && !Of.Range.isEmpty();
    const bool Low = MayClip && To.SaturatesLow && Of.Range.Low < To.Lower;
    const bool High = MayClip && To.SaturatesHigh && Of.Range.High > To.Upper;
    if (To.Base == BaseType::Bool)
        return storedBool(Index, To, Low, High);
    if (isFloating(To.Base))
        return storedFloating(Index, To, Low, High);
    return isScaled(To) ? storedScaled(Index, To, Low, High) : storedWhole(Index, To, Low, High);
}

ExpressionWriter::Piece ExpressionWriter::storedBool(int Index, const hpn::Type& To, bool Low,
                                                     bool High) {
    if (!Low && !High)
        return condition(Index, false);
    const std::size_t Start = m_Out.size();
    const Piece Number = clipDouble(Start, value(Index, false), To, Low, High);
    bind(Start, Number, Sum);
    m_Out += " != 0.0";
    return {CType::Int, Equality, true};
}

ExpressionWriter::Piece ExpressionWriter::storedWhole(int Index, const hpn::Type& To, bool Low,
                                                      bool High) {
    const Node& Of = m_Nodes[Index];
    const std::size_t Start = m_Out.size();
    ValueRange Range = clipped(Of.Range, To, Low, High);
    const bool Divides = isDivisionTruncating(Of);
    if (Divides) {
        Range.Low = std::trunc(Range.Low);
        Range.High = std::trunc(Range.High);
    }
    if (!Divides && !isWhole(Index)) {
        const Piece Number = clipDouble(Start, value(Index, false), To, Low, High);
        return convertDouble(Start, Number, Range, To.Base);
    }
    Piece Whole = Divides ? truncatedQuotient(Of) : value(Index, false);
    if (Low || High)
        Whole = clipWhole(Start, Whole, rawOfNumber(To.Lower, To), rawOfNumber(To.Upper, To), Low,
                          High);
    return wrapWhole(Start, Whole, Range, To.Base);
}

ExpressionWriter::Piece ExpressionWriter::clipDouble(std::size_t Start, Piece Of,
                                                     const hpn::Type& To, bool Low, bool High) {
    if (!Low && !High)
        return Of;
    if (Low) {
        m_Out += ", ";
        appendDouble(m_Out, To.Lower);
    }
    if (High) {
        m_Out += ", ";
        appendDouble(m_Out, To.Upper);
    }
    return wrapInCall(Start,
                      Low && High ? "hpn_clip"
                      : Low       ? "hpn_clip_low"
                                  : "hpn_clip_high",
                      CType::Double);
}

ExpressionWriter::Piece ExpressionWriter::clipWhole(std::size_t Start, Piece Of, std::int64_t Lower,
                                                    std::int64_t Upper, bool Low, bool High) {
    const auto isNarrow = [](std::int64_t Limit) {
        return Limit >= INT32_MIN && Limit <= INT32_MAX;
    };
    const bool Is32 =
        Of.Type == CType::Int && (!Low || isNarrow(Lower)) && (!High || isNarrow(Upper));
    if (Low) {
        m_Out += ", ";
        appendInteger(m_Out, Lower);
    }
    if (High) {
        m_Out += ", ";
        appendInteger(m_Out, Upper);
    }
    const char* Name = Low && High ? (Is32 ? "hpn_clip32" : "hpn_clip64")
                       : Low       ? (Is32 ? "hpn_max32" : "hpn_max64")
                                   : (Is32 ? "hpn_min32" : "hpn_min64");
    return wrapInCall(Start, Name, Is32 ? CType::Int : CType::Int64);
}

/// An integer into a storage: signed storages are reached through 32 bits, unsigned ones count
/// modulo their size.
ExpressionWriter::Piece ExpressionWriter::wrapWhole(std::size_t Start, Piece Of,
                                                    const ValueRange& Range, BaseType Base) {
    const bool IsWide = Of.Type != CType::Int;
    if (isUnsigned(Base)) {
        const CType Type = Base == BaseType::UInt32 ? CType::UInt32 : CType::Int;
        const bool Fits = isInStorage(Range, Base);
        if (Fits && (!IsWide || Of.Type == Type))
            return Of;
        return cast(Start, Of, cTypeName(Base), Type);
    }
    if (IsWide) {
        if (isInStorage(Range, BaseType::Int32))
            Of = cast(Start, Of, "int32_t", CType::Int);
        else
            Of = wrapInCall(Start, "hpn_int32_of64", CType::Int);
    }
    if (isInStorage(Range, Base))
        return Of;
    return Base == BaseType::Int32 ? Of : cast(Start, Of, cTypeName(Base), CType::Int);
}

ExpressionWriter::Piece ExpressionWriter::convertDouble(std::size_t Start, Piece Of,
                                                        const ValueRange& Range, BaseType Base) {
    const CType Type = Base == BaseType::UInt32 ? CType::UInt32 : CType::Int;
    if (!Range.MayBeNaN && !Range.isEmpty() && isInStorage(Range, Base))
        return cast(Start, Of, cTypeName(Base), Type);
    Of = isUnsigned(Base) ? wrapInCall(Start, "hpn_int64", CType::Int64)
                          : wrapInCall(Start, "hpn_int32", CType::Int);
    return Base == BaseType::Int32 ? Of : cast(Start, Of, cTypeName(Base), Type);
}

bool ExpressionWriter::isRawCopy(const Node& Of, const hpn::Type& To) const {
    if (Of.Op != Operator::Variable && Of.Op != Operator::Element)
        return false;
    return isScaled(*Of.pType) && Of.pType->Lsb == To.Lsb && Of.pType->Offset == To.Offset;
}

ExpressionWriter::Piece ExpressionWriter::storedScaled(int Index, const hpn::Type& To, bool Low,
                                                       bool High) {
    const Node& Of = m_Nodes[Index];
    const std::size_t Start = m_Out.size();
    const bool Copies = isRawCopy(Of, To);
    const bool Fits = Copies && smallestRaw(Of.pType->Base) >= smallestRaw(To.Base) &&
                      greatestRaw(Of.pType->Base) <= greatestRaw(To.Base);
    const CType Type = To.Base == BaseType::UInt32 ? CType::UInt32 : CType::Int;
    if (Fits) {
        const Piece Raw = raw(Of);
        if (!Low && !High)
            return Raw;
        const Piece Clipped =
            clipWhole(Start, Raw, rawOfNumber(To.Lower, To), rawOfNumber(To.Upper, To), Low, High);
        return Clipped.Type == CType::Int ? Clipped
                                          : cast(Start, Clipped, cTypeName(To.Base), Type);
    }
    clipDouble(Start, value(Index, false), To, Low, High);
    m_Out += ", ";
    appendDouble(m_Out, To.Lsb);
    m_Out += ", ";
    appendDouble(m_Out, To.Offset);
    const Piece Raw = wrapInCall(Start, "hpn_raw", CType::Int64);
    return cast(Start, Raw, cTypeName(To.Base), Type);
}

ExpressionWriter::Piece ExpressionWriter::storedFloating(int Index, const hpn::Type& To, bool Low,
                                                         bool High) {
    const Node& Of = m_Nodes[Index];
    const std::size_t Start = m_Out.size();
    Piece Number = clipDouble(Start, value(Index, false), To, Low, High);
    const bool IsWhole = Number.Type != CType::Double && Number.Type != CType::Float;
    const bool MayBeNegativeZero = !IsWhole && mayGiveNegativeZero(Index);
    if (To.Base == BaseType::Float64)
        return MayBeNegativeZero ? wrapInCall(Start, "hpn_double", CType::Double) : Number;
    // Single precision already, or an integer, or nothing negative that rounding could make a zero.
    if (!MayBeNegativeZero && Number.Type == CType::Float)
        return Number;
    if (IsWhole || (!MayBeNegativeZero && Of.Range.Low >= 0.0))
        return cast(Start, Number, "float", CType::Float);
    return wrapInCall(Start, "hpn_float", CType::Float);
}

/// The C text of a floating term can give a negative zero. That is not the same as the term's own
/// number being one: the writer takes no care of the sign of a zero where nothing can tell it.
bool ExpressionWriter::mayGiveNegativeZero(int Index) const {
    const Node& Of = m_Nodes[Index];
    const auto mayBeZero = [](const ValueRange& Range) {
        return Range.Low <= 0.0 && Range.High >= 0.0;
    };
    switch (Of.Op) {
    case Operator::Number:
    case Operator::Variable:
    case Operator::Element:
        return Of.Range.MayBeNegativeZero;
    case Operator::Negate:
        return mayBeZero(m_Nodes[Of.Left].Range);
    case Operator::Absolute:
    case Operator::Subtract:
        return mayGiveNegativeZero(Of.Left);
    case Operator::Add:
        return mayGiveNegativeZero(Of.Left) && mayGiveNegativeZero(Of.Right);
    case Operator::Minimum:
    case Operator::Maximum:
        return mayGiveNegativeZero(Of.Left) || mayGiveNegativeZero(Of.Right);
    case Operator::Multiply:
    case Operator::Divide:
        return Of.Range.MayBeNegativeZero ||
               (mayBeZero(Of.Range) &&
                (m_Nodes[Of.Left].Range.Low < 0.0 || m_Nodes[Of.Right].Range.Low < 0.0 ||
                 mayGiveNegativeZero(Of.Left) || mayGiveNegativeZero(Of.Right)));
    default:
        return false;
    }
}

/// The number of a cast: what the storage holds, read back.
ExpressionWriter::Piece ExpressionWriter::castValue(const Node& Of) {
    const hpn::Type& To = *Of.pTerm->pType;
    const std::size_t Start = m_Out.size();
    if (isFloating(To.Base) && Of.Kind != Arithmetic::Double)
        return value(Of.Left, false);
    const Piece Stored = stored(Of.Left, To, true);
    return isScaled(To) ? scaled(Start, Stored, To) : Stored;
}

} // namespace hpn
