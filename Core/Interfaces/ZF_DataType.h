#ifndef ZF_DATATYPE_H
#define ZF_DATATYPE_H

#include "HpnPlatformExport.h"

// Data type of a variable on the target. A client derives its own types, or uses those of the
// platform library; the optimiser only asks. Each query answers false unless the type says
// otherwise, so a type overrides just what it is.
class HPNPLATFORM_EXPORT ZF_DataType {
public:
    virtual ~ZF_DataType() = default;
    // The underlying base type, which the number queries are asked of (a base type answers itself);
    // null if there is none.
    virtual ZF_DataType* getBaseDataType() = 0;
    virtual bool isFloat64() { return false; }
    virtual bool isFloat32() { return false; }
    virtual bool isInt8() { return false; }
    virtual bool isUInt8() { return false; }
    virtual bool isInt16() { return false; }
    virtual bool isUInt16() { return false; }
    virtual bool isInt32() { return false; }
    virtual bool isUInt32() { return false; }
    // Asked of the type itself, not of its base type: the Boolean type.
    virtual bool isBool() { return false; }
    // Asked of the type itself: a type that holds only 0 and 1.
    virtual bool isBooleanType() { return false; }
};

#endif
