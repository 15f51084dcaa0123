#ifndef SECOND_ZFCBASICDATATYPE_H
#define SECOND_ZFCBASICDATATYPE_H

#include "ZF_DataType.h"

// This platform has one type.
class ZfCBasicDataType : public ZF_DataType {
public:
    static ZF_DataType* float64() {
        static ZfCBasicDataType s_Type;
        return &s_Type;
    }
    bool isFloat64() override { return true; }
};

#endif
