#ifndef ZFCCFGVALUEMERGE_H
#define ZFCCFGVALUEMERGE_H

#include "ZfCCfgValue.h"

// The joins of values that meet, over whatever holds them: lists for clients, the operands
// themselves on the hot path of propagation. Get tells the value of an element.

// The join of values; without any it is undetermined:
//
// 1. The first element is the reference; its kind is the working kind.
// 2. A non-constant reference decides alone.
// 3. Of the others, a non-constant one and a constant that differs from a constant reference end
// the walk as non-constant. An undetermined one makes the working kind undetermined and the walk
// goes on: unlike in the textbook it is not neutral, for a value that is not yet known on one way
// may still turn out to differ. The first constant behind an undetermined reference becomes the
// reference, so that later constants are still compared, and leaves the kind.
// 4. A working kind other than constant is the result, without a number.
template <class TElements, class TGet>
ZfCCfgValue mergeValues(const TElements& Elements, TGet Get) {
    auto Element = Elements.begin();
    if (Element == Elements.end())
        return eCfgValueUndetermined;
    // Steps 1 and 2.
    ZfCCfgValue ReferenceValue = Get(*Element);
    tagZfECfgValueKind WorkingKind = ReferenceValue.getValueKind();
    if (WorkingKind == eCfgValueNonConstant)
        return WorkingKind;
    // Step 3.
    for (++Element; Element != Elements.end(); ++Element) {
        const ZfCCfgValue Value = Get(*Element);
        if (Value.isNonConstant())
            return eCfgValueNonConstant;
        if (Value.isUndetermined())
            WorkingKind = eCfgValueUndetermined;
        else if (!ReferenceValue.isConstant())
            ReferenceValue = Value;
        else if (Value.getValue() != ReferenceValue.getValue())
            return eCfgValueNonConstant;
    }
    // Step 4.
    if (WorkingKind != eCfgValueConstant)
        return WorkingKind;
    return ReferenceValue;
}

// The extreme number; IsBetter(a, b) tells whether a takes the place of b. The first element that
// is not constant gives its kind to the result; without an element it is constant 0.0.
template <class TElements, class TGet, class TRelation>
ZfCCfgValue mergeExtremes(const TElements& Elements, TGet Get, TRelation IsBetter) {
    bool HasNumber = false;
    double Number = 0.0;
    for (const auto& Element : Elements) {
        const ZfCCfgValue Value = Get(Element);
        if (!Value.isConstant())
            return Value.getValueKind();
        if (!HasNumber || IsBetter(Value.getValue(), Number))
            Number = Value.getValue();
        HasNumber = true;
    }
    return Number;
}

#endif
