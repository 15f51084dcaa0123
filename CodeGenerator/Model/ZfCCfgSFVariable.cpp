#include "Model/ZfCCfgSFVariable.h"

#include "Model/Conversion.h"
#include "ZfCSSAVariable.h"

ZfCCfgSFVariable::ZfCCfgSFVariable(const hpn::Variable& Declaration)
    : m_Declaration(Declaration), m_DataType(Declaration.pType->Base),
      m_Scaling(*Declaration.pType), m_StorageRange(hpn::storageRange(*Declaration.pType)),
      m_IsUpperBorderSaturated(hpn::isUpperClipStable(*Declaration.pType)),
      m_IsLowerBorderSaturated(hpn::isLowerClipStable(*Declaration.pType)) {
    if (Declaration.Count > 0)
        markAsArray();
    if (isReadASideEffect())
        markAsVolatile();
}

ZfCCfgSFVariable::~ZfCCfgSFVariable() = default;

ZF_DataType* ZfCCfgSFVariable::getDataType() {
    return &m_DataType;
}

ZF_Scaling* ZfCCfgSFVariable::getScaling() {
    return hpn::isScaled(getType()) ? &m_Scaling : nullptr;
}

bool ZfCCfgSFVariable::isUpperBorderSaturated() {
    return m_IsUpperBorderSaturated;
}

bool ZfCCfgSFVariable::isLowerBorderSaturated() {
    return m_IsLowerBorderSaturated;
}

double ZfCCfgSFVariable::getUpperLimit() {
    return getType().Upper + 0.0;
}

double ZfCCfgSFVariable::getLowerLimit() {
    return getType().Lower + 0.0;
}

ZfCCfgValue ZfCCfgSFVariable::getInitValue() {
    if (isArray() || isVolatile())
        return ZfCCfgValue(eCfgValueNonConstant);
    const double Initial = m_Declaration.Initial.empty() ? 0.0 : m_Declaration.Initial.front();
    return ZfCCfgValue(hpn::convertNumber(Initial, getType()));
}

bool ZfCCfgSFVariable::isOutput() {
    return m_Declaration.Kind == hpn::VariableKind::Output;
}

ZfCCfgSFVariable* ZfCCfgSFVariable::isSFVariable() {
    return this;
}

namespace hpn {

ZfCCfgSFVariable* originalOf(ZfCCfgVariable* pVariable) {
    ZfCSSAVariable* pVersion = pVariable->isSSAVariable();
    return pVersion != nullptr ? pVersion->getOrigVar()->isSFVariable() : pVariable->isSFVariable();
}

} // namespace hpn
