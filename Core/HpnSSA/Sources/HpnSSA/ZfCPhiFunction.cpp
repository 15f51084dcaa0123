#include "ZfCPhiFunction.h"

#include <new>
#include <utility>

#include "ZfCCfgVisitorSSA.h"
#include "ZfCInternalCheck.h"

ZfCPhiFunction::ZfCPhiFunction(ZfCCfgVariable* pVariable, int Dim)
    : m_pVariable(pVariable), m_pReplacementVariable(0, Dim - 1) {
    for (int i = 0; i < Dim; ++i)
        m_pReplacementVariable[i] = nullptr;
}

ZfCPhiFunction::~ZfCPhiFunction() = default;

ZfCPhiFunction* ZfCPhiFunction::isPhiFunction() {
    return this;
}

ZfCCfgStatement* ZfCPhiFunction::clone() {
    return new ZfCPhiFunction(m_pVariable, m_pReplacementVariable.size());
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCPhiFunction::getDefinedVariables() {
    leda::set<ZfCCfgVariable*, leda::avl_tree> DefinedVariables;
    DefinedVariables.insert(m_pVariable);
    return DefinedVariables;
}

leda::set<ZfCCfgVariable*, leda::avl_tree> ZfCPhiFunction::getUsedVariables() {
    leda::set<ZfCCfgVariable*, leda::avl_tree> UsedVariables;
    const int Dim = m_pReplacementVariable.size();
    for (int i = 0; i < Dim; ++i) {
        ZfCCfgVariable* const pVariable = m_pReplacementVariable[i];
        ZF_ASSERT(pVariable);
        UsedVariables.insert(pVariable);
    }
    return UsedVariables;
}

void ZfCPhiFunction::accept(ZfCCfgVisitor* pVisitor) {
    if (ZfCCfgVisitorSSA* pVisitorSSA = dynamic_cast<ZfCCfgVisitorSSA*>(pVisitor))
        pVisitorSSA->visit(this);
}

// Takes operand Pos out:
//
// 1. A position behind the last operand is an internal error; the operation goes on, as all do.
// 2. The operand becomes null. A position that is not there is not written to: that would change
// foreign memory.
// 3. The null moves to the end, so that the operands behind it close up in their order.
// 4. What is cut off must be that null.
// 5. The array shrinks by one. After an error the last operand goes, since the in-edge is gone in
// any case; an empty array
//    has nothing to give.
void ZfCPhiFunction::delReplacement(int Pos) {
    const int Dim = m_pReplacementVariable.size();
    const bool IsThere = Pos >= 0 && Pos < Dim;
    // Step 1.
    if (!IsThere)
        reportInternalError("ZfCPhiFunction", __LINE__);
    if (Dim == 0)
        return;
    if (IsThere) {
        // Steps 2 and 3.
        m_pReplacementVariable[Pos] = nullptr;
        for (int i = Pos + 1; i < Dim; ++i)
            std::swap(m_pReplacementVariable[i - 1], m_pReplacementVariable[i]);
    }
    // Step 4.
    ZF_ASSERT_TEXT(m_pReplacementVariable[Dim - 1] == nullptr,
                   "m_pReplacementVariable[Dim - 1] == 0");
    // Step 5.
    m_pReplacementVariable.resize(0, Dim - 2);
}
