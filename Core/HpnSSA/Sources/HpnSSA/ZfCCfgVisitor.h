#ifndef ZFCCFGVISITOR_H
#define ZFCCFGVISITOR_H

#include "HpnSSAExport.h"

// Whatever can be sent over a graph. This base knows no object of it: every accept asks at run time
// whether the visitor is an SSA visitor as well (ZfCCfgVisitorSSA), and does nothing if it is not.
class HPNSSA_EXPORT ZfCCfgVisitor {
public:
    virtual ~ZfCCfgVisitor() = 0;
};

#endif
