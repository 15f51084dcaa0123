#ifndef ZFCSSACONTROL_H
#define ZFCSSACONTROL_H

#include "HpnSSAExport.h"
#include "ZfCModuleAllocation.h"

// Opens and closes a run of the library: boot before anything else is made, shutdown after the
// graph is destroyed. It has no state of its own, so any object of the class serves.
class HPNSSA_EXPORT ZfCSSAControl {
public:
    HPNSSA_MODULE_BLOCKS

    // Do nothing: there is no state to make or to copy.
    ZfCSSAControl();
    ZfCSSAControl(const ZfCSSAControl&);
    ZfCSSAControl& operator=(const ZfCSSAControl&);
    virtual ~ZfCSSAControl();

    // Makes the factory and starts all numbering at 0, that of the visitors apart. Always true.
    bool boot();
    // Ends the factory; harmless without boot. Always true.
    bool shutdown();
};

#endif
