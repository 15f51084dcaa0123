#ifndef ZFCCFGVALUE_H
#define ZFCCFGVALUE_H

#include <cstdint>

#include "HpnSSAExport.h"
#include "LEDA/list.h"

class ZF_DataType;
class ZF_Scaling;

// The level of a value in the lattice of constant propagation. The numbers are fixed: they are
// stored and compared as they stand.
enum tagZfECfgValueKind : std::int32_t {
    eCfgValueUndetermined = 0, // nothing is known yet
    eCfgValueConstant = 1,     // the value is exactly the number
    eCfgValueNonConstant = 2   // the value can differ at run time
};

// What constant propagation knows about one value: a lattice level and a number.
//
// Every constant of every data type is held as a double; integer behaviour is restored by cast()
// and by the operators that work in signed 32 bits. The number means something only while the kind
// is constant; undetermined is not constant and must never be read as a number. The record is
// plain: copying is copying two members, there is no heap and no virtual operation, so it is passed
// and returned by value everywhere.
//
// The free operators below are the arithmetic with which a client folds its expression trees. They
// take non-const references but change no operand, intersect() apart. They depart from the textbook
// lattice where said.
class HPNSSA_EXPORT ZfCCfgValue {
public:
    // Initialises nothing, neither kind nor number: set the kind before the value is used.
    ZfCCfgValue() = default;

    // The constant Value.
    ZfCCfgValue(double Value) : m_ValueKind(eCfgValueConstant), m_Value(Value) {}

    // A value of that kind; its number means nothing. It is 0.0 and not what the memory held before
    // because the full dump prints it, and two runs have to print the same.
    ZfCCfgValue(tagZfECfgValueKind ValueKind) : m_ValueKind(ValueKind), m_Value(0.0) {}

    ZfCCfgValue(const ZfCCfgValue&) = default;
    ZfCCfgValue& operator=(const ZfCCfgValue&) = default;
    ~ZfCCfgValue() = default;

    // Writes the number only; the kind stays.
    void setValue(double Value) { m_Value = Value; }

    // The number, whatever the kind is.
    double getValue() { return m_Value; }

    // Writes the kind only; the number stays.
    void setValueKind(tagZfECfgValueKind ValueKind) { m_ValueKind = ValueKind; }

    // The lattice level.
    tagZfECfgValueKind getValueKind() { return m_ValueKind; }

    // Tests of the kind.
    bool isConstant() { return m_ValueKind == eCfgValueConstant; }
    bool isUndetermined() { return m_ValueKind == eCfgValueUndetermined; }
    bool isNonConstant() { return m_ValueKind == eCfgValueNonConstant; }

    // The same queries for a value that is reached through a constant reference, as a variable
    // gives out its own.
    double getValue() const { return m_Value; }
    tagZfECfgValueKind getValueKind() const { return m_ValueKind; }
    bool isConstant() const { return m_ValueKind == eCfgValueConstant; }
    bool isUndetermined() const { return m_ValueKind == eCfgValueUndetermined; }
    bool isNonConstant() const { return m_ValueKind == eCfgValueNonConstant; }

    // A difference test, not an ordering: 0 if both are the same lattice element, else 1. The
    // numbers of two values that are not constant are not looked at; a constant NaN differs from
    // itself.
    int compare(ZfCCfgValue& Value) {
        if (m_ValueKind != Value.m_ValueKind)
            return 1;
        return m_ValueKind == eCfgValueConstant && !(m_Value == Value.m_Value) ? 1 : 0;
    }

    // Replaces the number by the one that the scaling represents for it, rounded to its grid. The
    // kind is neither looked at nor changed; a null scaling changes nothing.
    void changeToRepresentedValue(ZF_Scaling* pScaling);

    // The same without rounding.
    void changeToRepresentedValueDontRound(ZF_Scaling* pScaling);

private:
    tagZfECfgValueKind m_ValueKind;
    double m_Value;
};

// Double arithmetic. Of the two kinds non-constant beats undetermined, and undetermined beats
// constant, except:
// - `*` is constant 0.0 as soon as one operand is; after that test undetermined beats non-constant;
// - `/` looks at the left operand alone first: undetermined, constant 0.0 and non-constant decide
// at once, so that
//   0.0 / 0.0 is constant 0.0. Otherwise a zero divisor gives an infinity or NaN of kind constant.
HPNSSA_EXPORT ZfCCfgValue operator+(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator-(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator*(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator/(ZfCCfgValue& Left, ZfCCfgValue& Right);

// Signed 32-bit arithmetic: operands are truncated toward zero; what does not fit, infinities and
// NaN become -2147483648. Only the low five bits of a shift count are used; `>>` copies the sign
// bit in. A divisor of `%` that truncates to 0, and -2147483648 % -1, end in the processor's
// division fault: keep them away.
HPNSSA_EXPORT ZfCCfgValue operator%(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator<<(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator>>(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator&(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator|(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator^(ZfCCfgValue& Left, ZfCCfgValue& Right);

// Logic: constant 0.0 decides `&&`, constant 1.0 decides `||`, whatever the other operand is; after
// that undetermined beats non-constant. `||` knows only 1.0 as true: 2.0 || 3.0 is constant 0.0.
// Both operands are always evaluated.
HPNSSA_EXPORT ZfCCfgValue operator&&(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator||(ZfCCfgValue& Left, ZfCCfgValue& Right);

// Relations of the doubles: constant 1.0 or 0.0.
HPNSSA_EXPORT ZfCCfgValue operator==(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator!=(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator<(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator<=(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator>(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue operator>=(ZfCCfgValue& Left, ZfCCfgValue& Right);

// The smaller or greater number; equal numbers and a NaN in either place give the right one.
HPNSSA_EXPORT ZfCCfgValue minValue(ZfCCfgValue& Left, ZfCCfgValue& Right);
HPNSSA_EXPORT ZfCCfgValue maxValue(ZfCCfgValue& Left, ZfCCfgValue& Right);

// Unary operators take the kind over and compute a number for a constant only. `++` and `--` answer
// the neighbouring value and do not store it into the operand.
HPNSSA_EXPORT ZfCCfgValue operator-(ZfCCfgValue& Value);
HPNSSA_EXPORT ZfCCfgValue operator!(ZfCCfgValue& Value);
HPNSSA_EXPORT ZfCCfgValue operator~(ZfCCfgValue& Value);
HPNSSA_EXPORT ZfCCfgValue operator++(ZfCCfgValue& Value, int);
HPNSSA_EXPORT ZfCCfgValue operator--(ZfCCfgValue& Value, int);
HPNSSA_EXPORT ZfCCfgValue absoluteValue(ZfCCfgValue& Value);
HPNSSA_EXPORT ZfCCfgValue sgn(ZfCCfgValue& Value);

// The join of a phi function's operands or a parameter's arguments. Takes the first element out of
// the list, which must not be empty. Not the textbook meet: an undetermined element makes the
// result undetermined unless a non-constant one or two differing constants are met later.
HPNSSA_EXPORT ZfCCfgValue intersect(leda::list<ZfCCfgValue>& ValueList);

// The smallest and greatest number of a list. The first element that is not constant, in list
// order, gives its kind to the result. An empty list gives constant 0.0.
HPNSSA_EXPORT ZfCCfgValue determineMinimum(const leda::list<ZfCCfgValue>& ValueList);
HPNSSA_EXPORT ZfCCfgValue determineMaximum(const leda::list<ZfCCfgValue>& ValueList);

// Addresses and what they point at are not tracked: always non-constant.
HPNSSA_EXPORT ZfCCfgValue reference(const ZfCCfgValue& Value);
HPNSSA_EXPORT ZfCCfgValue dereference(const ZfCCfgValue& Value);

// Converts the number in place to what the data type holds, wrapping around as the target's
// conversion does, and returns Value. The kind is not looked at. A null type, or one without a base
// type, changes nothing; floating types neither: there is no rounding to single precision.
// bNormalizeBool makes any number but 0.0 a 1.0 for the Boolean type, where otherwise the low byte
// is kept; the form without it means false.
HPNSSA_EXPORT ZfCCfgValue& cast(ZF_DataType* pDataType, ZfCCfgValue& Value);
HPNSSA_EXPORT ZfCCfgValue& cast(ZF_DataType* pDataType, ZfCCfgValue& Value, bool bNormalizeBool);

#endif
