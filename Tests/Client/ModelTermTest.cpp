// Terms and the expression class over them: folding, ranges, values, and what a condition tells
// about a variable.

#include "Generators/GraphTestProgram.h"
#include "Generators/ModelTestNumbers.h"
#include "Model/PendingWarnings.h"
#include "Oracles/TreeRunner.h"
#include "ZfCSSAControl.h"

#include <gtest/gtest.h>

#include <memory>
#include <set>

namespace {

using namespace hpn;
using namespace hpn::test;

/// Variables of all types of the tests, an input, an array, and random terms over them.
class ModelTerm : public testing::Test {
protected:
    ModelTerm() {
        m_Control.boot();
        m_pGraph = std::make_unique<ZfCControlFlowGraph>();
        for (const Type& Of : m_Types)
            add(VariableKind::State, Of);
        add(VariableKind::Input, m_Types[static_cast<std::size_t>(BaseType::UInt8)]);
        add(VariableKind::State, m_Types[static_cast<std::size_t>(BaseType::Int16)]).Count = 3;
    }
    ~ModelTerm() override {
        m_pGraph.reset();
        m_Variables.clear();
        m_Control.shutdown();
    }

    Variable& add(VariableKind Kind, const Type& Of) {
        Variable& Made = m_Declarations.emplace_back();
        Made.Kind = Kind;
        Made.pType = &Of;
        return Made;
    }
    ZfCCfgSFVariable* variable(std::size_t Number) {
        while (m_Variables.size() < m_Declarations.size())
            m_Variables.push_back(
                std::make_unique<ZfCCfgSFVariable>(m_Declarations[m_Variables.size()]));
        return m_Variables[Number].get();
    }
    ZfCCfgSFVariable* ofBase(BaseType Base) { return variable(static_cast<std::size_t>(Base)); }
    ZfCCfgSFExpression& expression(Term* pRoot) {
        auto* pMade = new ZfCCfgSFExpression(pRoot);
        ZfCCfgFactory::getInstance()->addSFExpression(pMade);
        return *pMade;
    }
    Term* read(ZfCCfgVariable* pVariable) { return m_Terms.makeVariable(pVariable); }
    Term* compare(Operator Op, ZfCCfgVariable* pVariable, double Number) {
        return m_Terms.makeBinary(Op, read(pVariable), m_Terms.makeNumber(Number));
    }

    Term* randomTerm(int Height) {
        static const double Numbers[] = {0.0, -0.0, 1.0, -1.0, 2.0, 0.5, 255.0, 3e9};
        const unsigned Choice = m_Random() % 12;
        if (Height == 0 || Choice < 2)
            return m_Random() % 3 == 0 ? m_Terms.makeNumber(Numbers[m_Random() % 8]) : randomRead();
        if (Choice == 2)
            return m_Terms.makeCast(&m_Types[m_Random() % m_Types.size()], randomTerm(Height - 1));
        if (Choice < 5)
            return m_Terms.makeUnary(
                static_cast<Operator>(static_cast<unsigned>(Operator::Negate) + m_Random() % 5),
                randomTerm(Height - 1));
        Term* pLeft = randomTerm(Height - 1);
        return m_Terms.makeBinary(
            static_cast<Operator>(static_cast<unsigned>(Operator::Multiply) + m_Random() % 20),
            pLeft, randomTerm(Height - 1));
    }
    Term* randomRead() {
        ZfCCfgSFVariable* pVariable = variable(m_Random() % m_Declarations.size());
        Term* pRead = read(pVariable);
        if (pVariable->isArray()) {
            pRead->Op = Operator::Element;
            pRead->pLeft = m_Terms.makeNumber(m_Random() % 4);
        }
        return pRead;
    }

    std::vector<Type> m_Types = makeTypes();
    ZfCSSAControl m_Control;
    std::unique_ptr<ZfCControlFlowGraph> m_pGraph;
    std::deque<Variable> m_Declarations;
    std::vector<std::unique_ptr<ZfCCfgSFVariable>> m_Variables;
    TermArena m_Terms;
    std::mt19937 m_Random{17};
};

// Every variable holds some number that a store can leave; folding changes neither the number nor
// what is read of the input.
TEST_F(ModelTerm, FoldingKeepsEveryBitAndEveryReadAndRangesHoldTheNumber) {
    int Folded = 0;
    for (int i = 0; i < 60000; ++i) {
        Term* pTerm = randomTerm(4);
        Term* pCopy = m_Terms.copy(pTerm);
        foldTerm(pCopy);
        Folded += isSameTerm(pTerm, pCopy) ? 0 : 1;
        World Before(static_cast<unsigned>(i));
        for (const Variable& Declaration : m_Declarations) {
            const double Number = InterestingNumbers()[m_Random() % InterestingNumbers().size()];
            Before.at(Declaration, 0.0) = convertNumber(Number, *Declaration.pType);
        }
        World After = Before;
        const double Number = evaluate(pTerm, Before);
        ASSERT_TRUE(isSameNumber(Number, evaluate(pCopy, After))) << "term " << i << ": " << Number;
        ASSERT_EQ(Before.Inputs(), After.Inputs()) << "term " << i;
        ASSERT_TRUE(rangeOfTerm(pTerm, RangeSource::Types).contains(Number))
            << "term " << i << ": " << Number;
    }
    EXPECT_GT(Folded, 20000);
}

TEST_F(ModelTerm, AConversionThatChangesNothingIsKnown) {
    const auto keeps = [this](const Type& To, Term* pOperand) {
        return castChangesNothing(m_Terms.makeCast(&To, pOperand));
    };
    const Type& Float64 = m_Types[static_cast<std::size_t>(BaseType::Float64)];
    const Type& Float32 = m_Types[static_cast<std::size_t>(BaseType::Float32)];
    const Type& UInt8 = m_Types[static_cast<std::size_t>(BaseType::UInt8)];
    const Type& Int16 = m_Types[static_cast<std::size_t>(BaseType::Int16)];
    EXPECT_TRUE(keeps(Float64, read(ofBase(BaseType::Float32))));
    EXPECT_FALSE(keeps(Float32, read(ofBase(BaseType::Float64))));
    EXPECT_TRUE(keeps(Float32, read(ofBase(BaseType::Int16))));
    EXPECT_FALSE(keeps(Float32, read(ofBase(BaseType::Int32))));
    EXPECT_TRUE(keeps(Int16, read(ofBase(BaseType::UInt8))));
    EXPECT_FALSE(keeps(UInt8, read(ofBase(BaseType::Int8))));
    EXPECT_FALSE(keeps(UInt8, m_Terms.makeUnary(Operator::Negate, read(ofBase(BaseType::Bool)))));
    EXPECT_FALSE(
        keeps(Float64, m_Terms.makeUnary(Operator::Negate,
                                         read(ofBase(BaseType::UInt8))))); // -0.0 loses its sign
    for (std::size_t i = 0; i < m_Types.size(); ++i) {
        const bool IsStable = m_Types[i].SaturatesHigh == isUpperClipStable(m_Types[i]) &&
                              m_Types[i].SaturatesLow == isLowerClipStable(m_Types[i]);
        EXPECT_TRUE(!keeps(m_Types[i], read(variable(i))) || IsStable) << i;
    }
}

TEST_F(ModelTerm, AConditionOffersItsVariableOrNothing) {
    bool Negated = true;
    ZfCCfgSFVariable* pBool = ofBase(BaseType::Bool);
    pBool->markAsAssigned();
    EXPECT_EQ(expression(read(pBool)).isVariable(Negated), pBool);
    EXPECT_FALSE(Negated);
    Term* pNot =
        m_Terms.makeUnary(Operator::LogicalNot, m_Terms.makeCast(&m_Types[1], read(pBool)));
    EXPECT_EQ(expression(pNot).isVariable(Negated), pBool);
    EXPECT_TRUE(Negated);
    EXPECT_EQ(expression(read(ofBase(BaseType::Int8))).isVariable(Negated),
              nullptr); // never assigned
    EXPECT_EQ(expression(read(variable(m_Types.size()))).isVariable(Negated), nullptr); // input
}

TEST_F(ModelTerm, AComparisonOffersItsVariableOnlyWhereEqualityTellsTheBits) {
    struct {
        BaseType Base;
        double Number;
        bool IsOffered;
    } const Cases[] = {{BaseType::UInt8, 3.0, true},
                       {BaseType::UInt8, 0.0, true},
                       {BaseType::UInt8, 300.0, false},
                       {BaseType::UInt8, 0.5, false},
                       {BaseType::Bool, 1.0, true},
                       {BaseType::Bool, 2.0, true},
                       {BaseType::Float64, 0.0, false},
                       {BaseType::Float64, -0.0, false},
                       {BaseType::Float64, 0.1, true},
                       {BaseType::Float32, 0.1, false},
                       {BaseType::Float64, std::nan(""), false}};
    for (const auto& Case : Cases) {
        ZfCCfgSFVariable* pTested = ofBase(Case.Base);
        pTested->markAsAssigned();
        for (const bool IsEqual : {true, false}) {
            for (const bool IsSwapped : {true, false}) {
                Term* pTerm =
                    compare(IsEqual ? Operator::Equal : Operator::NotEqual, pTested, Case.Number);
                if (IsSwapped)
                    std::swap(pTerm->pLeft, pTerm->pRight);
                ZfCCfgVariable* pVariable = nullptr;
                ZfCCfgValue Value(eCfgValueUndetermined);
                bool Negated = IsEqual;
                ASSERT_EQ(expression(pTerm).isVariableEqualToConstant(pVariable, Value, Negated),
                          Case.IsOffered)
                    << Case.Number;
                if (!Case.IsOffered)
                    continue;
                EXPECT_EQ(pVariable, pTested);
                EXPECT_EQ(Value.getValue(), Case.Number);
                EXPECT_EQ(Negated, !IsEqual);
            }
        }
    }
}

TEST_F(ModelTerm, ValuesAndEndsComeFromTheVersionsAsFarAsTheyAreKnown) {
    ZfCSSAVariable* pVersion =
        ZfCCfgFactory::getInstance()->createSSAVariable(ofBase(BaseType::UInt8));
    const Type& UInt8 = m_Types[static_cast<std::size_t>(BaseType::UInt8)];
    const auto sum = [&](double Number) {
        return m_Terms.makeCast(
            &UInt8, m_Terms.makeBinary(Operator::Add, read(pVersion), m_Terms.makeNumber(Number)));
    };
    EXPECT_TRUE(expression(sum(1)).evaluate().isUndetermined());
    EXPECT_TRUE(expression(sum(1)).getMinimum().isUndetermined());
    // Whatever the version turns out to be, its type decides; a range means nothing yet.
    pVersion->setMinValueAndDestroyOld(ZfCCfgValue(0.0));
    pVersion->setMaxValueAndDestroyOld(ZfCCfgValue(0.0));
    EXPECT_TRUE(expression(compare(Operator::Less, pVersion, 255.0)).evaluate().isUndetermined());
    EXPECT_EQ(expression(compare(Operator::Less, pVersion, 256.0)).evaluate().getValue(), 1.0);

    ZfCCfgValue NonConstant(eCfgValueNonConstant);
    pVersion->setVarValueAndAdjustCfgValue(NonConstant);
    pVersion->setMaxValueAndDestroyOld(NonConstant);
    EXPECT_EQ(expression(sum(1)).getMaximum().getValue(), 255.0); // half a range: the type's
    pVersion->setMinValueAndDestroyOld(ZfCCfgValue(10.0));
    pVersion->setMaxValueAndDestroyOld(ZfCCfgValue(20.0));
    EXPECT_TRUE(expression(sum(1)).evaluate().isNonConstant());
    EXPECT_EQ(expression(sum(1)).getMinimum().getValue(), 11.0);
    EXPECT_EQ(expression(sum(240)).getMinimum().getValue(), 0.0); // wraps: 250 to 260
    EXPECT_EQ(expression(compare(Operator::Greater, pVersion, 20.0)).evaluate().getValue(), 0.0);

    ZfCCfgValue Constant(12.0);
    pVersion->setVarValueAndAdjustCfgValue(Constant);
    ZfCCfgSFExpression& Replaced = expression(sum(1));
    Replaced.replaceConstantVariables();
    EXPECT_EQ(Replaced.getUsedVariables().size(), 0);
    Replaced.foldConstants();
    EXPECT_EQ(Replaced.getRoot()->Op, Operator::Number);
    EXPECT_EQ(Replaced.getRoot()->Number, 13.0);
}

// Many random terms read more variables than an expression keeps, and many the same one twice.
TEST_F(ModelTerm, AnExpressionKnowsWhatItReadsWhateverIsDoneToIt) {
    using Variables = std::set<ZfCCfgVariable*>;
    const auto check = [](ZfCCfgSFExpression& Of) {
        Variables Expected;
        std::vector<const Term*> Stack{Of.getRoot()};
        while (!Stack.empty()) {
            const Term* pTerm = Stack.back();
            Stack.pop_back();
            if (pTerm == nullptr)
                continue;
            if (pTerm->hasVariable())
                Expected.insert(pTerm->pVariable);
            Stack.insert(Stack.end(), {pTerm->pLeft, pTerm->pRight});
        }
        Variables Found;
        for (ZfCCfgVariable* pVariable : Of.getUsedVariables())
            Found.insert(pVariable);
        EXPECT_EQ(Found, Expected);
        EXPECT_EQ(Of.hasSideEffects(), readsInput(Of.getRoot()));
        return Expected;
    };
    std::size_t Most = 0;
    for (int i = 0; i < 2000; ++i) {
        ZfCCfgSFExpression& Made = expression(randomTerm(i % 5));
        const Variables Originals = check(Made);
        Most = std::max(Most, Originals.size());
        for (ZfCCfgVariable* pOriginal : Originals) {
            ZfCSSAVariable* pVersion = ZfCCfgFactory::getInstance()->createSSAVariable(pOriginal);
            if (ZfCCfgValue Value(1.0); m_Random() % 2 == 0)
                pVersion->setVarValueAndAdjustCfgValue(Value);
            Made.replaceVariable(pOriginal, pVersion);
            check(Made);
        }
        Made.replaceConstantVariables();
        const Variables Left = check(Made);
        Made.foldConstants();
        check(Made);
        if (Left.size() > 1) {
            Made.replaceVariable(*Left.begin(), *Left.rbegin());
            check(Made);
        }
        Made.replaceConditionWithConstant(1.0);
        check(Made);
        ASSERT_FALSE(HasFailure()) << "term " << i;
    }
    EXPECT_GT(Most, 4U);
}

TEST_F(ModelTerm, ANaNIsNoConstantAndNeverTheEndOfARange) {
    Term* pNaN = m_Terms.makeBinary(Operator::Subtract, m_Terms.makeNumber(INFINITY),
                                    m_Terms.makeNumber(INFINITY));
    EXPECT_TRUE(expression(pNaN).evaluate().isNonConstant());
    EXPECT_TRUE(expression(pNaN).getMinimum().isNonConstant());
    EXPECT_TRUE(expression(pNaN).getMaximum().isNonConstant());
}

TEST_F(ModelTerm, AConditionThatReadsAnInputStaysInPlace) {
    Term* pRead = m_Terms.makeBinary(Operator::Less, read(variable(m_Types.size())),
                                     m_Terms.makeNumber(256.0));
    ZfCCfgSFExpression& Condition = expression(pRead);
    EXPECT_EQ(Condition.evaluate().getValue(), 1.0);
    Condition.replaceConstantCondition();
    Condition.foldConstants();
    EXPECT_TRUE(Condition.hasSideEffects());
    pendingWarnings().clear();
    Condition.actOnComparisonOutsideBoolRange();
    EXPECT_EQ(pendingWarnings().size(), 1U);
    pendingWarnings().clear();
}

} // namespace
