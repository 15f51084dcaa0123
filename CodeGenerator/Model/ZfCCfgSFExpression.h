#ifndef ZFCCFGSFEXPRESSION_H
#define ZFCCFGSFEXPRESSION_H

#include "Model/Term.h"
#include "ZfCCfgExpression.h"

#include <cstddef>
#include <cstdint>

/// The client's expression: a right-hand side, a branch condition or a call argument. It is a thin
/// owner-less shell over a tree of `hpn::Term`s, which the term arena of the program graph owns;
/// the shell itself belongs to the factory from `addSFExpression` on, which its maker calls. A
/// right-hand side's and an argument's root converts to the type it is stored in (value and range),
/// so that the setters of the variable find nothing left to clip, round or wrap.
///
/// A minimum and a maximum are given only together, and only if the number cannot be a NaN: an end
/// that is a NaN would get lost where ranges meet.
class ZfCCfgSFExpression : public ZfCCfgExpression {
public:
    explicit ZfCCfgSFExpression(hpn::Term* pRoot);

    hpn::Term* getRoot() const { return m_pRoot; }

    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;
    void replaceVariable(ZfCCfgVariable* pOld, ZfCCfgVariable* pNew) override;
    void replaceConditionWithConstant(double Number) override;
    ZfCCfgValue evaluate() override;
    ZfCCfgValue getMinimum() override;
    ZfCCfgValue getMaximum() override;
    void replaceConstantVariables() override;
    void replaceConstantCondition() override;
    void foldConstants() override;
    ZfCCfgVariable* isVariable(bool& Negated) override;
    bool isVariableEqualToConstant(ZfCCfgVariable*& pVariable, ZfCCfgValue& Value,
                                   bool& Negated) override;
    bool hasSideEffects() override;
    ZfCCfgSFExpression* isSFExpression() override;
    void actOnComparisonOutsideBoolRange() override;

protected:
    ~ZfCCfgSFExpression() override;

private:
    ZfCCfgValue getEnd(bool IsMaximum);
    static ZfCCfgValue getEndOfNumber(double Number);
    hpn::ValueRange evaluateRange(const ZfCCfgValue& Value);
    bool mayReadConstant() const;
    void noteReads();

    /// What the term reads, each variable once, kept because every pass asks for it and the walk
    /// over the term is far dearer; with more than fit, s_ManyReads, the term is walked.
    static constexpr std::size_t s_MostReads = 3;
    static constexpr std::uint8_t s_ManyReads = 255;
    std::uint8_t m_NumberOfReads = 0;
    /// It has evaluated to a constant, and stays at it: what propagation concludes holds for every
    /// run, also where an operand's kind moves on and would hide it again. Without that, a value
    /// could swing between constant and not for ever, each step up asking for another iteration.
    bool m_IsSettled = false;
    double m_SettledNumber = 0.0; ///< holds while m_IsSettled
    hpn::Term* m_pRoot;
    ZfCCfgVariable* m_Reads[s_MostReads];
};

#endif
