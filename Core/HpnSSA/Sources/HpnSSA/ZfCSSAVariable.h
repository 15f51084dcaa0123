#ifndef ZFCSSAVARIABLE_H
#define ZFCSSAVARIABLE_H

#include "ZfCCfgVariable.h"
#include "ZfCModuleAllocation.h"

// One SSA version of a variable, made for one definition by renaming.
//
// A version points at its original variable, which is never itself a version, and forwards the
// questions of type, scaling and limits to it. It has what an original lacks: a range of values.
// Versions are made, parked and freed by the factory (ZfCCfgFactory::createSSAVariable).
class HPNSSA_EXPORT ZfCSSAVariable : public ZfCCfgVariable {
    friend class ZfCCfgFactory;

public:
    HPNSSA_MODULE_BLOCKS

    ZfCSSAVariable(const ZfCSSAVariable&) = default;
    ZfCSSAVariable& operator=(const ZfCSSAVariable&) = default;

    // Store an end of the range as the variable would hold it: a constant is clipped, or else
    // scaled or wrapped; for an array or volatile variable the end becomes non-constant.
    void setMinValueAndDestroyOld(ZfCCfgValue const& Value) override;
    void setMaxValueAndDestroyOld(ZfCCfgValue const& Value) override;
    ZfCCfgValue getMinValue() override;
    ZfCCfgValue getMaxValue() override;

    // Forwarded to the original.
    ZF_DataType* getDataType() override;
    ZF_Scaling* getScaling() override;
    bool isUpperBorderSaturated() override;
    bool isLowerBorderSaturated() override;
    double getUpperLimit() override;
    double getLowerLimit() override;
    ZfCCfgValue getInitValue() override;

    // This version.
    ZfCSSAVariable* isSSAVariable() override;

    // The variable that this is a version of; null while parked.
    ZfCCfgVariable* getOrigVar() { return m_pOrigOrTop; }
    // Takes the original behind pVar when that is a version itself, so that there are no chains.
    void setOrigVar(ZfCCfgVariable* pVar);

protected:
    // A version of pVar, or of the original behind it, with pVar's markers; its value and its range
    // are undetermined, but for markers that make the value non-constant.
    explicit ZfCSSAVariable(ZfCCfgVariable* pVar);
    ~ZfCSSAVariable() override;

    using ZfCCfgVariable::initData;
    // Renews a parked version for pVar, whose markers it takes.
    void initData(ZfCCfgVariable* pVar);
    void resetData() override;

private:
    void bindTo(ZfCCfgVariable* pVar);
    ZfCCfgValue asStored(ZfCCfgValue Value);
    void setMin(ZfCCfgValue const& Value);
    void setMax(ZfCCfgValue const& Value);

    // Original and range stand in the base, beside the value: see there.
};

#endif
