#include "ZfCSSAControl.h"

#include "ZfCCfgFactory.h"
#include "ZfCDebugWqCXString.h"

ZfCSSAControl::ZfCSSAControl() = default;

ZfCSSAControl::ZfCSSAControl(const ZfCSSAControl&) {
}

ZfCSSAControl& ZfCSSAControl::operator=(const ZfCSSAControl&) {
    return *this;
}

ZfCSSAControl::~ZfCSSAControl() = default;

bool ZfCSSAControl::boot() {
    ZfCDebugWqCXString DebugString;
    DebugString.debugString();
    ZfCCfgFactory::boot();
    ZfCCfgNodeInfo::boot();
    ZfCCfgStatement::boot();
    ZfCCfgEdgeInfo::boot();
    ZfCCfgProcedure::boot();
    ZfCCfgVariable::boot();
    ZfCCfgExpression::boot();
    return true;
}

bool ZfCSSAControl::shutdown() {
    ZfCCfgFactory::shutdown();
    return true;
}
