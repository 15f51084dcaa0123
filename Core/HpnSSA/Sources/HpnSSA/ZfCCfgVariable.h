#ifndef ZFCCFGVARIABLE_H
#define ZFCCFGVARIABLE_H

#include "HpnSSAExport.h"
#include "LEDA/array.h"
#include "LEDA/graph.h"
#include "LEDA/set.h"
#include "LEDA/slist.h"
#include "ZfCCfgValue.h"

#include <cstdint>
#include <limits>

class ZfCCfgFactory;
class ZfCCfgSFVariable;
class ZfCCfgVariable;
class ZfCCfgVisitor;
class ZfCSSAVariable;

#ifdef LEDA_ORDER_NUMBERS
namespace leda {

// Lets sets of variables merge by number, where the layer below knows how; as compare below.
template <>
struct order_number<ZfCCfgVariable*> {
    static constexpr bool known = true;
    static inline std::int64_t of(ZfCCfgVariable* const& pVariable);
};

} // namespace leda
#endif

// A variable of the intermediate code.
//
// The base knows no data type: type, scaling and limits are the client's knowledge and are asked
// through the pure operations, which the client's variable class gives. What it keeps is what the
// optimiser needs for each variable: a lattice value, the set of nodes that use it, the stack of
// renaming, three markers and its virtual aliases. A virtual alias is a version that a statement
// without code defines: for the propagation a value of its own, for liveness the same stored
// variable as the real version that it hangs on.
//
// A client's variables are the client's to free; the versions (ZfCSSAVariable) belong to the
// factory. Sets of variables walk in the order of first construction.
class HPNSSA_EXPORT ZfCCfgVariable {
    friend class ZfCCfgFactory;

public:
    // A copy bears the numbers of its source and is registered nowhere.
    ZfCCfgVariable(const ZfCCfgVariable&) = default;
    ZfCCfgVariable& operator=(const ZfCCfgVariable&) = default;

    // The range of values; an original keeps none and reports 0.0 to 0.0.
    virtual void setMinValueAndDestroyOld(ZfCCfgValue const& Value);
    virtual void setMaxValueAndDestroyOld(ZfCCfgValue const& Value);
    virtual ZfCCfgValue getMinValue();
    virtual ZfCCfgValue getMaxValue();

    // What the client knows: the type, the scaling (null: none), whether values beyond a limit are
    // clipped, the limits.
    virtual ZF_DataType* getDataType() = 0;
    virtual ZF_Scaling* getScaling() = 0;
    virtual bool isUpperBorderSaturated() = 0;
    virtual bool isLowerBorderSaturated() = 0;
    virtual double getUpperLimit() = 0;
    virtual double getLowerLimit() = 0;

    // The value before the program starts; undetermined unless the client says otherwise.
    virtual ZfCCfgValue getInitValue();

    // Whether the variable is an output of the model.
    virtual bool isOutput();

    // The variable as one of the client's or as a version of another, or null. ZfCCfgSFVariable is
    // the client's own class: the library hands the pointer on and never looks behind it.
    virtual ZfCCfgSFVariable* isSFVariable();
    virtual ZfCSSAVariable* isSSAVariable();

    // Shows the variable to an SSA visitor; versions arrive at the same operation of the visitor.
    virtual void accept(ZfCCfgVisitor* pVisitor);

protected:
    ZfCCfgVariable();
    virtual ~ZfCCfgVariable();

    // Renews a parked object: new index, undetermined, no marker, its own alias. The debug index
    // stays.
    virtual void initData();
    // Empties the object for parking; debug index and value stay.
    virtual void resetData();

public:
    // Serial numbering starts at 0 again.
    static void boot() { s_GlobIndexCnt = 0; }

    // The serial number, as dumps show it.
    unsigned int getIndex() { return m_Index; }
    // The number of the object's first life, by which sets are ordered.
    int getDebugIndex() { return m_DebugIndex; }
    // The lattice value.
    ZfCCfgValue const& getValue() { return m_Value; }

    // The stack of renaming. pop gives the popped version; top gives null when the stack is empty.
    void pushSSAReplacement(ZfCCfgVariable* pVariable) {
        rare().m_SSAReplacements.push(pVariable);
        if (!m_IsVersion)
            m_pOrigOrTop = pVariable;
    }
    ZfCCfgVariable* popSSAReplacement() {
        ZfCCfgVariable* const pPopped = rare().m_SSAReplacements.pop();
        if (!m_IsVersion)
            m_pOrigOrTop = topOfStack();
        return pPopped;
    }
    ZfCCfgVariable* topSSAReplacement() { return m_IsVersion ? topOfStack() : m_pOrigOrTop; }

    // The nodes that use this variable; valid until the graph is edited.
    void appendUse(leda::node v) { m_Uses.insert(v); }
    // Takes a use out and gives the number of those left. A node that is not there is reported as
    // an assertion.
    int delUse(leda::node v);
    leda::set<leda::node, leda::avl_tree> getUses() { return m_Uses; }
    // The nodes themselves, valid until a use comes or goes.
    leda::set<leda::node, leda::avl_tree> const& showUses() const { return m_Uses; }
    // The uses of this variable and of its virtual aliases.
    leda::set<leda::node, leda::avl_tree> getAllUses();
    void clearUses() { m_Uses.clear(); }
    int countUses() { return m_Uses.size(); }
    // A plain sum over this variable and its aliases: a node that uses two of them counts twice.
    int countAllUses();

    // Markers. An array or a volatile variable is non-constant from the marking on. Only parking
    // takes a marker back.
    bool isArray() { return m_IsArray; }
    void markAsArray();
    bool isVolatile() { return m_IsVolatile; }
    void markAsVolatile();
    // Whether a definition of this variable may be removed.
    bool isErasable() { return m_IsErasable; }
    void markAsErasable() { m_IsErasable = true; }

    // Whether the scaling differs from least significant bit 1.0 and offset 0.0.
    bool isScaled();

    // The real variable behind a virtual alias, for any other variable itself; null only while
    // parked.
    ZfCCfgVariable* getNonVirtualAlias() { return m_pNonVirtualAlias; }
    void setNonVirtualAlias(ZfCCfgVariable* pVariable) { m_pNonVirtualAlias = pVariable; }
    void appendVirtualAlias(ZfCCfgVariable* pVariable) {
        rare().m_VirtualAliases.insert(pVariable);
    }

    // Clips the number at the saturated limits; true if it was clipped. The kind is not looked at.
    bool ConsiderSaturation(ZfCCfgValue& Value);

    // Stores Value as this variable would hold it, and changes the argument alike: clipped, or else
    // scaled or wrapped. A value of an array or volatile variable becomes non-constant.
    void setVarValueAndAdjustCfgValue(ZfCCfgValue& Value);

protected:
    // Turns a constant number into what this variable holds of it: the limit if it is clipped,
    // which is then final even off the grid, else the scaled or wrapped number.
    void adjustConstant(ZfCCfgValue& Value);

private:
    friend class ZfCSSAVariable;

    // What hardly any variable has. There are many versions, and renaming puts its stack on
    // originals only; few versions have an alias.
    struct Rare {
        leda::stack<ZfCCfgVariable*> m_SSAReplacements; // balanced by renaming; else empty
        leda::set<ZfCCfgVariable*, leda::avl_tree> m_VirtualAliases;
    };

    bool hasRare() const { return m_Rare.size() != 0; }
    Rare& rare() {
        if (!hasRare())
            m_Rare.resize(1);
        return m_Rare[0];
    }

    ZfCCfgVariable* topOfStack() {
        return hasRare() && !rare().m_SSAReplacements.empty() ? rare().m_SSAReplacements.top()
                                                              : nullptr;
    }

    // What renaming asks of a variable and the propagation of an operand fills one cache line, the
    // first: the value, and of a version its original and its range, numbers and kinds. Only
    // ZfCSSAVariable uses the range.
    unsigned int m_Index;
    int m_DebugIndex; // written by the constructor alone
    ZfCCfgValue m_Value;
    // Of a version its original, not owned; of an original the top of its stack of renaming.
    ZfCCfgVariable* m_pOrigOrTop = nullptr;
    double m_MinValue = 0.0;
    double m_MaxValue = 0.0;
    unsigned char m_MinKind = eCfgValueConstant;
    unsigned char m_MaxKind = eCfgValueConstant;
    bool m_IsArray;
    bool m_IsErasable;
    bool m_IsVolatile;
    bool m_IsVersion = false;

    leda::set<leda::node, leda::avl_tree> m_Uses; // stale after any graph edit
    ZfCCfgVariable* m_pNonVirtualAlias;           // this, unless a virtual alias
    leda::array<Rare> m_Rare;                     // one, or none so far

    static unsigned int s_GlobIndexCnt;
};

namespace leda {

#ifdef LEDA_ORDER_NUMBERS
inline std::int64_t order_number<ZfCCfgVariable*>::of(ZfCCfgVariable* const& pVariable) {
    return pVariable != nullptr ? pVariable->getDebugIndex()
                                : std::numeric_limits<std::int64_t>::min();
}
#endif

// Order of sets of variables: null first, then by debug index.
inline int compare(ZfCCfgVariable* const& pLeft, ZfCCfgVariable* const& pRight) {
    if (pLeft == pRight)
        return 0;
    if (pLeft == nullptr || pRight == nullptr)
        return pLeft == nullptr ? -1 : 1;
    const int Left = pLeft->getDebugIndex();
    const int Right = pRight->getDebugIndex();
    return (Left > Right) - (Left < Right);
}

} // namespace leda

#endif
