#include "ZfCCfgValue.h"

#include "ZfCCfgValueMerge.h"

#include <csignal>
#include <cstdint>
#include <cstdlib>
#include <limits>

#include "ZF_DataType.h"
#include "ZF_Scaling.h"
#include "ZfCScaleTool.h"

// The arithmetic of constant propagation.
//
// Each operator decides the kind of its result first and computes a number only for a constant one.
// Where an operator departs from the textbook lattice, this is on purpose: the client's expressions
// and the propagation are built on it.

namespace {

using tagKind = tagZfECfgValueKind;

// What the processor's truncating conversions answer for anything that does not fit, infinities and
// NaN included. The tests keep such numbers away from the conversion, which would be undefined for
// them.
std::int32_t truncateToInt32(double Value) {
    if (Value > -2147483649.0 && Value < 2147483648.0)
        return static_cast<std::int32_t>(Value);
    return std::numeric_limits<std::int32_t>::min();
}

std::int64_t truncateToInt64(double Value) {
    if (Value >= -9223372036854775808.0 && Value < 9223372036854775808.0)
        return static_cast<std::int64_t>(Value);
    return std::numeric_limits<std::int64_t>::min();
}

std::int32_t asSigned(std::uint32_t Bits) {
    return static_cast<std::int32_t>(Bits);
}

std::uint32_t asBits(std::int32_t Value) {
    return static_cast<std::uint32_t>(Value);
}

// Only the low five bits of a shift count count.
unsigned int shiftCount(std::int32_t Count) {
    return asBits(Count) & 31u;
}

// The end of a division that has no result. The processor's fault is raised by hand: left to the
// division itself it would be undefined to the compiler, and on some processors there is none.
// Nobody may go on with a made-up number.
[[noreturn]] void raiseDivisionFault() {
    std::raise(SIGFPE);
    std::abort();
}

std::int32_t remainderOf(std::int32_t Dividend, std::int32_t Divisor) {
    if (Divisor == 0 || (Divisor == -1 && Dividend == std::numeric_limits<std::int32_t>::min()))
        raiseDivisionFault();
    return Dividend % Divisor;
}

// The kind rule: non-constant beats undetermined, undetermined beats constant.
tagKind determineResultKind(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    if (Left.isNonConstant() || Right.isNonConstant())
        return eCfgValueNonConstant;
    if (Left.isUndetermined() || Right.isUndetermined())
        return eCfgValueUndetermined;
    return eCfgValueConstant;
}

// The kind rule of the operators with a dominating constant, where undetermined beats non-constant.
tagKind determineKindUndeterminedFirst(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    if (Left.isUndetermined() || Right.isUndetermined())
        return eCfgValueUndetermined;
    if (Left.isNonConstant() || Right.isNonConstant())
        return eCfgValueNonConstant;
    return eCfgValueConstant;
}

bool isConstantEqualTo(ZfCCfgValue& Value, double Number) {
    return Value.isConstant() && Value.getValue() == Number;
}

bool isEitherConstantEqualTo(ZfCCfgValue& Left, ZfCCfgValue& Right, double Number) {
    return isConstantEqualTo(Left, Number) || isConstantEqualTo(Right, Number);
}

// A binary operator under the kind rule with Operation on the doubles.
template <class Operation>
ZfCCfgValue applyDouble(ZfCCfgValue& Left, ZfCCfgValue& Right, Operation Compute) {
    const tagKind ResultKind = determineResultKind(Left, Right);
    if (ResultKind != eCfgValueConstant)
        return ResultKind;
    return static_cast<double>(Compute(Left.getValue(), Right.getValue()));
}

// A binary operator under the kind rule with Operation on the operands cut to signed 32 bits.
template <class Operation>
ZfCCfgValue applyInt32(ZfCCfgValue& Left, ZfCCfgValue& Right, Operation Compute) {
    return applyDouble(Left, Right, [Compute](double LeftNumber, double RightNumber) {
        const std::int32_t Result =
            Compute(truncateToInt32(LeftNumber), truncateToInt32(RightNumber));
        return static_cast<double>(Result);
    });
}

// A unary operator: the kind goes over, a number is computed for a constant.
template <class Operation>
ZfCCfgValue applyUnary(ZfCCfgValue& Value, Operation Compute) {
    if (!Value.isConstant())
        return Value.getValueKind();
    return static_cast<double>(Compute(Value.getValue()));
}

const ZfCCfgValue& itself(const ZfCCfgValue& Value) {
    return Value;
}

// The number that a variable of the type holds for Number; the first type that fits decides.
double convert(ZF_DataType* pDataType, ZF_DataType* pBaseType, double Number, bool bNormalizeBool) {
    if (pBaseType->isFloat64() || pBaseType->isFloat32())
        return Number;
    if (pBaseType->isInt32())
        return truncateToInt32(Number);
    if (pBaseType->isInt16())
        return static_cast<std::int16_t>(truncateToInt32(Number));
    if (pBaseType->isInt8())
        return static_cast<std::int8_t>(truncateToInt32(Number));
    if (pBaseType->isUInt32())
        return static_cast<std::uint32_t>(truncateToInt64(Number));
    if (pBaseType->isUInt16())
        return static_cast<std::uint16_t>(truncateToInt64(Number));
    if (pBaseType->isUInt8())
        return static_cast<std::uint8_t>(truncateToInt64(Number));
    if (!pDataType->isBool())
        return Number;
    if (bNormalizeBool)
        return Number != 0.0 ? 1.0 : Number;
    return static_cast<std::uint8_t>(truncateToInt64(Number));
}

} // namespace

void ZfCCfgValue::changeToRepresentedValue(ZF_Scaling* pScaling) {
    if (pScaling != nullptr)
        m_Value = ZfCScaleTool::findRepresentedValue(m_Value, pScaling);
}

void ZfCCfgValue::changeToRepresentedValueDontRound(ZF_Scaling* pScaling) {
    if (pScaling != nullptr)
        m_Value = ZfCScaleTool::findRepresentedValueDontRound(m_Value, pScaling);
}

ZfCCfgValue operator+(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyDouble(Left, Right, [](double a, double b) { return a + b; });
}

ZfCCfgValue operator-(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyDouble(Left, Right, [](double a, double b) { return a - b; });
}

// Zero times anything is zero, also an operand that is not known; only then does undetermined win
// over non-constant.
ZfCCfgValue operator*(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    if (isEitherConstantEqualTo(Left, Right, 0.0))
        return 0.0;
    const tagKind ResultKind = determineKindUndeterminedFirst(Left, Right);
    if (ResultKind != eCfgValueConstant)
        return ResultKind;
    return Left.getValue() * Right.getValue();
}

// The left operand alone decides first: a zero on the left stays zero even over a zero divisor. A
// zero divisor of any other constant follows IEEE.
ZfCCfgValue operator/(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    if (!Left.isConstant())
        return Left.getValueKind();
    if (Left.getValue() == 0.0)
        return 0.0;
    if (!Right.isConstant())
        return Right.getValueKind();
    return Left.getValue() / Right.getValue();
}

ZfCCfgValue operator%(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyInt32(Left, Right, remainderOf);
}

ZfCCfgValue operator<<(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyInt32(Left, Right, [](std::int32_t a, std::int32_t b) {
        return asSigned(asBits(a) << shiftCount(b));
    });
}

ZfCCfgValue operator>>(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyInt32(Left, Right,
                      [](std::int32_t a, std::int32_t b) { return a >> shiftCount(b); });
}

ZfCCfgValue operator&(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyInt32(Left, Right, [](std::int32_t a, std::int32_t b) { return a & b; });
}

ZfCCfgValue operator|(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyInt32(Left, Right, [](std::int32_t a, std::int32_t b) { return a | b; });
}

ZfCCfgValue operator^(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyInt32(Left, Right, [](std::int32_t a, std::int32_t b) { return a ^ b; });
}

// A constant false decides, whatever the other operand is.
ZfCCfgValue operator&&(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    if (isEitherConstantEqualTo(Left, Right, 0.0))
        return 0.0;
    const tagKind ResultKind = determineKindUndeterminedFirst(Left, Right);
    if (ResultKind != eCfgValueConstant)
        return ResultKind;
    return 1.0;
}

// A constant true decides. Boolean constants are 0.0 and 1.0, so any other number is not true here,
// although `&&` takes it for one.
ZfCCfgValue operator||(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    if (isEitherConstantEqualTo(Left, Right, 1.0))
        return 1.0;
    const tagKind ResultKind = determineKindUndeterminedFirst(Left, Right);
    if (ResultKind != eCfgValueConstant)
        return ResultKind;
    return 0.0;
}

ZfCCfgValue operator==(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyDouble(Left, Right, [](double a, double b) { return a == b; });
}

ZfCCfgValue operator!=(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyDouble(Left, Right, [](double a, double b) { return a != b; });
}

ZfCCfgValue operator<(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyDouble(Left, Right, [](double a, double b) { return a < b; });
}

ZfCCfgValue operator<=(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyDouble(Left, Right, [](double a, double b) { return a <= b; });
}

ZfCCfgValue operator>(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyDouble(Left, Right, [](double a, double b) { return a > b; });
}

ZfCCfgValue operator>=(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyDouble(Left, Right, [](double a, double b) { return a >= b; });
}

ZfCCfgValue minValue(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyDouble(Left, Right, [](double a, double b) { return b > a ? a : b; });
}

ZfCCfgValue maxValue(ZfCCfgValue& Left, ZfCCfgValue& Right) {
    return applyDouble(Left, Right, [](double a, double b) { return a > b ? a : b; });
}

ZfCCfgValue operator-(ZfCCfgValue& Value) {
    return applyUnary(Value, [](double a) { return -a; });
}

ZfCCfgValue operator!(ZfCCfgValue& Value) {
    return applyUnary(Value, [](double a) { return a == 0.0; });
}

ZfCCfgValue operator~(ZfCCfgValue& Value) {
    return applyUnary(Value, [](double a) { return ~truncateToInt32(a); });
}

ZfCCfgValue operator++(ZfCCfgValue& Value, int) {
    return applyUnary(Value, [](double a) { return a + 1.0; });
}

ZfCCfgValue operator--(ZfCCfgValue& Value, int) {
    return applyUnary(Value, [](double a) { return a - 1.0; });
}

ZfCCfgValue absoluteValue(ZfCCfgValue& Value) {
    return applyUnary(Value, [](double a) { return 0.0 > a ? -a : a; });
}

ZfCCfgValue sgn(ZfCCfgValue& Value) {
    return applyUnary(Value, [](double a) { return (a > 0.0) - (0.0 > a); });
}

// The first element leaves the list, as it always has.
ZfCCfgValue intersect(leda::list<ZfCCfgValue>& ValueList) {
    if (ValueList.empty())
        return ValueList.pop(); // reported by the list
    const ZfCCfgValue Result = mergeValues(ValueList, itself);
    ValueList.pop();
    return Result;
}

ZfCCfgValue determineMinimum(const leda::list<ZfCCfgValue>& ValueList) {
    return mergeExtremes(ValueList, itself, [](double a, double b) { return a < b; });
}

ZfCCfgValue determineMaximum(const leda::list<ZfCCfgValue>& ValueList) {
    return mergeExtremes(ValueList, itself, [](double a, double b) { return a > b; });
}

ZfCCfgValue reference(const ZfCCfgValue&) {
    return eCfgValueNonConstant;
}

ZfCCfgValue dereference(const ZfCCfgValue&) {
    return eCfgValueNonConstant;
}

ZfCCfgValue& cast(ZF_DataType* pDataType, ZfCCfgValue& Value) {
    return cast(pDataType, Value, false);
}

ZfCCfgValue& cast(ZF_DataType* pDataType, ZfCCfgValue& Value, bool bNormalizeBool) {
    if (pDataType == nullptr)
        return Value;
    ZF_DataType* const pBaseType = pDataType->getBaseDataType();
    if (pBaseType != nullptr)
        Value.setValue(convert(pDataType, pBaseType, Value.getValue(), bNormalizeBool));
    return Value;
}
