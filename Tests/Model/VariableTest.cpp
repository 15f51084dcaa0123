#include "ModelTestSupport.h"

// Variables, versions and the two expressions of the library.

namespace {

class VariableTest : public ModelTest {
protected:
    leda::graph m_Graph;
};

TEST_F(VariableTest, MarkersOfArrayAndVolatileMakeNonConstant) {
    Variable Array, Volatile, Erasable;
    Array.markAsArray();
    Volatile.markAsVolatile();
    Volatile.markAsVolatile();
    Erasable.markAsErasable();
    EXPECT_TRUE(Array.isArray() && Array.getValue().isNonConstant());
    EXPECT_TRUE(Volatile.isVolatile() && Volatile.getValue().isNonConstant());
    EXPECT_TRUE(Erasable.isErasable() && Erasable.getValue().isUndetermined());
    EXPECT_FALSE(Array.isVolatile() || Array.isErasable() || Volatile.isArray());
    // Only a version has a range, and only the client knows an initial value.
    Array.setMinValueAndDestroyOld(ZfCCfgValue(1.0));
    Array.setMaxValueAndDestroyOld(ZfCCfgValue(1.0));
    EXPECT_KIND(eCfgValueUndetermined, Array.ZfCCfgVariable::getInitValue());
    EXPECT_CONSTANT(0.0, Array.getMinValue());
    EXPECT_CONSTANT(0.0, Array.getMaxValue());
}

TEST_F(VariableTest, VersionTakesTheMarkersOfWhatItIsMadeFromAndTheOriginalBehindIt) {
    ZfCLinearScaling Scaling(0.5, 0.0);
    Variable v;
    v.m_pScaling = &Scaling;
    v.m_Upper = true;
    v.m_UpperLimit = 7.0;
    v.m_Init = ZfCCfgValue(2.0);
    v.markAsErasable();
    ZfCSSAVariable* const pFirst = factory().createSSAVariable(&v);
    EXPECT_TRUE(pFirst->isErasable());
    pFirst->markAsVolatile();
    ZfCSSAVariable* const pSecond = factory().createSSAVariable(pFirst);
    EXPECT_EQ(&v, pSecond->getOrigVar());
    EXPECT_TRUE(pSecond->isVolatile() && pSecond->getValue().isNonConstant());
    EXPECT_FALSE(v.isVolatile());
    // Questions of type go to the original, those of kind do not.
    EXPECT_EQ(&Scaling, pSecond->getScaling());
    EXPECT_TRUE(pSecond->isUpperBorderSaturated());
    EXPECT_FALSE(pSecond->isLowerBorderSaturated());
    EXPECT_EQ(7.0, pSecond->getUpperLimit());
    EXPECT_CONSTANT(2.0, pSecond->getInitValue());
    EXPECT_FALSE(pSecond->isOutput());
    EXPECT_EQ(nullptr, pSecond->isSFVariable());
    EXPECT_EQ(pSecond, pSecond->isSSAVariable());
    EXPECT_EQ(nullptr, v.isSSAVariable());
}

TEST_F(VariableTest, RangeOfAVersionIsStoredAsTheVariableHoldsIt) {
    ZfCLinearScaling Scaling(0.5, 0.0);
    Variable v;
    v.m_pScaling = &Scaling;
    v.m_Upper = v.m_Lower = true;
    v.m_UpperLimit = 9.75;
    v.m_LowerLimit = -9.75;
    ZfCSSAVariable* const p = factory().createSSAVariable(&v);
    EXPECT_TRUE(p->getMinValue().isUndetermined() && p->getMaxValue().isUndetermined());
    const ZfCCfgValue Value = 3.3;
    p->setMinValueAndDestroyOld(Value);
    p->setMaxValueAndDestroyOld(ZfCCfgValue(12.0));
    EXPECT_CONSTANT(3.5, p->getMinValue());
    EXPECT_CONSTANT(9.75, p->getMaxValue());
    EXPECT_CONSTANT(3.3, Value);
    // What is not constant goes in as it is, without clipping.
    ZfCCfgValue Beyond = 50.0;
    Beyond.setValueKind(eCfgValueNonConstant);
    p->setMinValueAndDestroyOld(Beyond);
    EXPECT_KIND(eCfgValueNonConstant, p->getMinValue());
    EXPECT_EQ(50.0, p->getMinValue().getValue());
    // The range of an array is non-constant; the maximum alone keeps its number.
    p->markAsArray();
    p->setMinValueAndDestroyOld(ZfCCfgValue(1.0));
    p->setMaxValueAndDestroyOld(ZfCCfgValue(1.0));
    EXPECT_KIND(eCfgValueNonConstant, p->getMinValue());
    EXPECT_KIND(eCfgValueNonConstant, p->getMaxValue());
    EXPECT_EQ(9.75, p->getMaxValue().getValue());
}

TEST_F(VariableTest, UsesOfAnAliasCountForTheRealVariable) {
    const leda::node n = m_Graph.new_node();
    const leda::node m = m_Graph.new_node();
    Variable Real, Alias;
    Real.appendUse(n);
    Real.appendUse(n);
    Alias.appendUse(n);
    EXPECT_EQ(1, Real.countUses());
    EXPECT_EQ(1, Real.countAllUses());
    Real.appendVirtualAlias(&Alias);
    Real.appendVirtualAlias(&Alias);
    EXPECT_EQ(2, Real.countAllUses()); // a plain sum
    EXPECT_EQ(1, Real.getAllUses().size());
    Alias.appendUse(m);
    EXPECT_EQ(3, Real.countAllUses());
    EXPECT_EQ(2, Real.getAllUses().size());
    NodeSet Copy = Real.getUses();
    Copy.insert(m);
    EXPECT_EQ(1, Real.countUses());
    EXPECT_EQ(&Alias, Alias.getNonVirtualAlias());
    Alias.setNonVirtualAlias(&Real);
    EXPECT_EQ(&Real, Alias.getNonVirtualAlias());
}

TEST_F(VariableTest, DeletingAUseThatIsNotThereIsAnAssertionOfDevelopersOnly) {
    const leda::node n = m_Graph.new_node();
    Variable v;
    v.appendUse(n);
    EXPECT_EQ(0, v.delUse(n));
    EXPECT_EQ(0, v.delUse(n));
    EXPECT_TRUE(m_Reports.m_Assertions.empty());
    ZfCPlatformMessageServer::setShowInternalInfo(true);
    EXPECT_EQ(0, v.delUse(n));
    EXPECT_EQ((std::vector<std::string>{"m_Uses.member(v)"}), m_Reports.m_Assertions);
    EXPECT_TRUE(m_Reports.m_Messages.empty());
}

TEST_F(VariableTest, RenamingStackIsLastInFirstOutAndItsEmptyTopIsNull) {
    Variable v, First, Second;
    ZfCPlatformMessageServer::setShowInternalInfo(true);
    EXPECT_EQ(nullptr, v.topSSAReplacement());
    v.pushSSAReplacement(&First);
    v.pushSSAReplacement(&Second);
    EXPECT_EQ(&Second, v.topSSAReplacement());
    EXPECT_EQ(&Second, v.popSSAReplacement());
    EXPECT_EQ(&First, v.popSSAReplacement());
    EXPECT_EQ(nullptr, v.topSSAReplacement());
    EXPECT_TRUE(m_Reports.m_Assertions.empty());
}

TEST_F(VariableTest, ScalingCountsUnlessItIsTheIdentity) {
    const double Cases[][3] = {{1.0, 0.0, 0}, {1.0, 0.5, 1}, {0.5, 0.0, 1}, {std::nan(""), 0.0, 1}};
    Variable v;
    EXPECT_FALSE(v.isScaled());
    for (const auto& [Lsb, Offset, Expected] : Cases) {
        ZfCLinearScaling Scaling(Lsb, Offset);
        v.m_pScaling = &Scaling;
        EXPECT_EQ(Expected != 0, v.isScaled()) << Lsb << ' ' << Offset;
    }
}

TEST_F(VariableTest, CopyKeepsNumbersAndStandsForOneElement) {
    Variable v, w;
    Variable Copy(v);
    EXPECT_EQ(v.getIndex(), Copy.getIndex());
    EXPECT_EQ(&v, Copy.getNonVirtualAlias());
    VariableSet Set;
    Set.insert(&w);
    Set.insert(&v);
    Set.insert(&Copy);
    EXPECT_EQ((std::vector<ZfCCfgVariable*>{&v, &w}), elements(Set));
}

// A set built in descending order, and order by number and not by address.
TEST_F(VariableTest, SetsWalkInOrderOfFirstConstruction) {
    std::vector<Variable> Variables(50);
    std::vector<ZfCCfgVariable*> Expected;
    VariableSet Set;
    for (Variable& v : Variables)
        Expected.push_back(&v);
    std::swap(Variables[3], Variables[40]); // the numbers travel, the addresses stay
    std::swap(Expected[3], Expected[40]);
    for (int i = 49; i >= 0; --i)
        Set.insert(&Variables[(i * 7) % 50]);
    EXPECT_EQ(Expected, elements(Set));
}

using ExpressionTest = VariableTest;

TEST_F(ExpressionTest, ValueExpressionAnswersItsValueToEverything) {
    ZfCCfgValueExpression* const p = factory().createValueExpression(ZfCCfgValue(3.0));
    Variable v;
    p->replaceVariable(&v, &v);
    p->replaceConditionWithConstant(1.0);
    p->replaceConstantVariables();
    p->replaceConstantCondition();
    p->foldConstants();
    p->actOnComparisonOutsideBoolRange();
    EXPECT_CONSTANT(3.0, p->evaluate());
    EXPECT_CONSTANT(3.0, p->getMinimum());
    EXPECT_CONSTANT(3.0, p->getMaximum());
    EXPECT_TRUE(p->getUsedVariables().empty());
    p->getValue().setValueKind(eCfgValueUndetermined);
    EXPECT_KIND(eCfgValueUndetermined, p->evaluate());
    bool Negated = true;
    ZfCCfgVariable* pVariable = &v;
    ZfCCfgValue Value = 1.0;
    EXPECT_EQ(nullptr, p->isVariable(Negated));
    EXPECT_FALSE(p->isVariableEqualToConstant(pVariable, Value, Negated));
    EXPECT_FALSE(p->hasSideEffects() || p->containsExternCalls());
    EXPECT_EQ(nullptr, p->isSFExpression());
}

TEST_F(ExpressionTest, VariableUseSpeaksForOneVariableButRangesOverAll) {
    Variable a, b, c;
    ZfCCfgValue Two = 2.0;
    ZfCCfgValue Five = 5.0;
    a.setVarValueAndAdjustCfgValue(Two);
    b.setVarValueAndAdjustCfgValue(Five);
    ZfCCfgExplicitVarUse* const p = factory().createExplicitVarUse();
    EXPECT_KIND(eCfgValueUndetermined, p->evaluate());
    EXPECT_CONSTANT(0.0, p->getMinimum());
    EXPECT_CONSTANT(0.0, p->getMaximum());
    p->addVariable(&a);
    EXPECT_CONSTANT(2.0, p->evaluate());
    EXPECT_CONSTANT(2.0, p->getMaximum());
    p->addVariable(&b);
    EXPECT_KIND(eCfgValueUndetermined, p->evaluate());
    EXPECT_CONSTANT(2.0, p->getMinimum());
    EXPECT_CONSTANT(5.0, p->getMaximum());
    // The new variable goes in even if the old one was not there.
    p->replaceVariable(&a, &c);
    p->replaceVariable(&a, &a);
    EXPECT_EQ((std::vector<ZfCCfgVariable*>{&a, &b, &c}), elements(p->getUsedVariables()));
    EXPECT_KIND(eCfgValueUndetermined, p->getMinimum());
}

TEST_F(ExpressionTest, MarkedExpressionIsNonConstantWhateverItHolds) {
    Variable v;
    ZfCCfgExplicitVarUse* const p = factory().createExplicitVarUse(true);
    p->addVariable(&v);
    p->replaceConditionWithConstant(1.0);
    p->replaceConstantVariables();
    p->replaceConstantCondition();
    p->foldConstants();
    p->actOnComparisonOutsideBoolRange();
    EXPECT_KIND(eCfgValueNonConstant, p->evaluate());
    EXPECT_KIND(eCfgValueNonConstant, p->getMinimum());
    EXPECT_KIND(eCfgValueNonConstant, p->getMaximum());
    EXPECT_EQ(std::vector<ZfCCfgVariable*>{&v}, elements(p->getUsedVariables()));
}

} // namespace
