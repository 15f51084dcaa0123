#ifndef SECOND_ZF_DATATYPE_H
#define SECOND_ZF_DATATYPE_H

class ZF_DataType {
public:
    virtual ~ZF_DataType() = default;
    ZF_DataType* getBaseDataType() { return this; }
    virtual bool isFloat64() { return false; }
    virtual bool isFloat32() { return false; }
    virtual bool isInt8() { return false; }
    virtual bool isUInt8() { return false; }
    virtual bool isInt16() { return false; }
    virtual bool isUInt16() { return false; }
    virtual bool isInt32() { return false; }
    virtual bool isUInt32() { return false; }
    virtual bool isBool() { return false; }
    virtual bool isBooleanType() { return false; }
};

#endif
