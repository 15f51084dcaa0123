#ifndef ZFCDEBUGWQCXSTRING_H
#define ZFCDEBUGWQCXSTRING_H

#include "HpnSSAExport.h"

// Touches the string class once at the start of a run, so that a debugger finds its reading
// operation linked in.
class HPNSSA_EXPORT ZfCDebugWqCXString {
public:
    ZfCDebugWqCXString();
    virtual ~ZfCDebugWqCXString();

    // Makes an empty string, reads its text and destroys it.
    void debugString();
};

#endif
