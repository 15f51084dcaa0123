#include "ZfCDebugWqCXString.h"

#include "WqCXString.h"

ZfCDebugWqCXString::ZfCDebugWqCXString() = default;

ZfCDebugWqCXString::~ZfCDebugWqCXString() = default;

void ZfCDebugWqCXString::debugString() {
    const WqCXString String;
    static_cast<void>(String.cstring());
}
