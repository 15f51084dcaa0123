#ifndef MODELTESTSUPPORT_H
#define MODELTESTSUPPORT_H

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <string>
#include <vector>

#include "ZF_DataType.h"
#include "ZF_Scaling.h"
#include "ZfCCfgFactory.h"
#include "ZfCLinearScaling.h"
#include "ZfCMessageSink.h"
#include "ZfCPlatformMessageServer.h"
#include "ZfCSSAControl.h"

// A minimal client of the model: a variable and an expression as a code generator would derive
// them, and what the library reports while a test runs.

class ZfCCfgSFVariable : public ZfCCfgVariable {
public:
    ZF_DataType* getDataType() override { return m_pType; }
    ZF_Scaling* getScaling() override { return m_pScaling; }
    bool isUpperBorderSaturated() override { return m_Upper; }
    bool isLowerBorderSaturated() override { return m_Lower; }
    double getUpperLimit() override { return m_UpperLimit; }
    double getLowerLimit() override { return m_LowerLimit; }
    ZfCCfgValue getInitValue() override { return m_Init; }
    bool isOutput() override { return true; }
    ZfCCfgSFVariable* isSFVariable() override { return this; }

    ZF_DataType* m_pType = nullptr;
    ZF_Scaling* m_pScaling = nullptr;
    bool m_Upper = false;
    bool m_Lower = false;
    double m_UpperLimit = 0.0;
    double m_LowerLimit = 0.0;
    ZfCCfgValue m_Init = eCfgValueUndetermined;
};

using Variable = ZfCCfgSFVariable;
using VariableSet = leda::set<ZfCCfgVariable*, leda::avl_tree>;
using NodeSet = leda::set<leda::node, leda::avl_tree>;

// Answers what it is given and writes down when it dies.
class ZfCCfgSFExpression : public ZfCCfgExpression {
public:
    explicit ZfCCfgSFExpression(std::vector<std::string>* pDeaths = nullptr) : m_pDeaths(pDeaths) {}
    ~ZfCCfgSFExpression() override {
        if (m_pDeaths != nullptr)
            m_pDeaths->push_back("client");
    }
    VariableSet getUsedVariables() override { return m_Used; }
    void replaceVariable(ZfCCfgVariable*, ZfCCfgVariable*) override {}
    void replaceConditionWithConstant(double) override {}
    ZfCCfgValue evaluate() override { return m_Value; }
    ZfCCfgValue getMinimum() override { return m_Minimum; }
    ZfCCfgValue getMaximum() override { return m_Maximum; }
    void replaceConstantVariables() override {}
    void replaceConstantCondition() override {}
    void foldConstants() override { ++m_Folds; }
    bool hasSideEffects() override { return m_HasSideEffects; }
    bool containsExternCalls() override { return m_ContainsExternCalls; }
    void markAsContainsExternCalls() override { m_ContainsExternCalls = true; }
    leda::list<ZfCCfgVariable*> getExternModifiableVariables() override { return m_Extern; }
    void appendExternModifiableVariable(ZfCCfgVariable* p) override { m_Extern.append(p); }
    void appendPossiblyExternUsedVariable(ZfCCfgVariable* p) override { m_Extern.append(p); }
    ZfCCfgSFExpression* isSFExpression() override { return this; }
    void actOnComparisonOutsideBoolRange() override {}

    VariableSet m_Used;
    ZfCCfgValue m_Value = eCfgValueUndetermined;
    ZfCCfgValue m_Minimum = eCfgValueUndetermined;
    ZfCCfgValue m_Maximum = eCfgValueUndetermined;
    leda::list<ZfCCfgVariable*> m_Extern;
    bool m_ContainsExternCalls = false;
    bool m_HasSideEffects = false;
    int m_Folds = 0;

private:
    std::vector<std::string>* m_pDeaths;
};

using Expression = ZfCCfgSFExpression;

// Collects messages as "severity number category|text" and assertions by their condition text.
class Reports : public ZfCMessageSink {
public:
    Reports() {
        s_pCurrent = this;
        m_pFormerSink = ZfCPlatformMessageServer::setSink(this);
        m_pFormerHook = ZfCPlatformMessageServer::setAssertionHook(&Reports::hear);
    }
    ~Reports() override {
        ZfCPlatformMessageServer::setSink(m_pFormerSink);
        ZfCPlatformMessageServer::setAssertionHook(m_pFormerHook);
        ZfCPlatformMessageServer::setShowInternalInfo(false);
    }
    Reports(const Reports&) = delete;
    Reports& operator=(const Reports&) = delete;

    void receiveMessage(tagERR_error_severity_etp Severity, int Number, const ZfCSrcRef* pSrcRef,
                        const char* Category, const char* Text) override {
        m_Messages.push_back(std::to_string(Severity) + " " + std::to_string(Number) + " " +
                             Category + "|" + Text);
        m_Text += std::to_string(Severity) + " " + std::to_string(Number) + " " +
                  (pSrcRef != nullptr ? "@" : "") + Category + "|" + Text + "\n";
    }

    std::vector<std::string> m_Messages;
    std::vector<std::string> m_Assertions;
    std::string m_Text; // the messages, a line each, with an @ where there is a source reference

private:
    static void hear(const char*, int, const char* Condition) {
        s_pCurrent->m_Assertions.push_back(Condition);
    }

    static inline Reports* s_pCurrent = nullptr;
    ZfCMessageSink* m_pFormerSink;
    ZfCPlatformMessageServer::tAssertionHook m_pFormerHook;
};

// One run of the library around each test.
class ModelTest : public testing::Test {
protected:
    ModelTest() { m_Control.boot(); }
    ~ModelTest() override { m_Control.shutdown(); }

    static ZfCCfgFactory& factory() { return *ZfCCfgFactory::getInstance(); }

    ZfCSSAControl m_Control;
    Reports m_Reports;
};

inline std::vector<ZfCCfgVariable*> elements(const VariableSet& Set) {
    std::vector<ZfCCfgVariable*> Result;
    for (ZfCCfgVariable* pVariable : Set)
        Result.push_back(pVariable);
    return Result;
}

template <class T>
std::vector<T> elements(const leda::list<T>& List) {
    std::vector<T> Result;
    for (const T& Element : List)
        Result.push_back(Element);
    return Result;
}

// The same bits, any NaN counting as any other.
inline bool isSameNumber(double Left, double Right) {
    return (std::isnan(Left) && std::isnan(Right)) || std::memcmp(&Left, &Right, sizeof Left) == 0;
}

#define EXPECT_CONSTANT(Expected, Actual)                                                          \
    do {                                                                                           \
        ZfCCfgValue TheValue = (Actual);                                                           \
        EXPECT_TRUE(TheValue.isConstant());                                                        \
        EXPECT_PRED2(isSameNumber, static_cast<double>(Expected), TheValue.getValue());            \
    } while (false)

#define EXPECT_KIND(Expected, Actual)                                                              \
    do {                                                                                           \
        ZfCCfgValue TheValue = (Actual);                                                           \
        EXPECT_EQ(Expected, TheValue.getValueKind());                                              \
    } while (false)

#endif
