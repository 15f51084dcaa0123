#include "ZfCBasicDataType.h"

ZfCBasicDataType* ZfCBasicDataType::float64() {
    return get(eFloat64);
}
ZfCBasicDataType* ZfCBasicDataType::float32() {
    return get(eFloat32);
}
ZfCBasicDataType* ZfCBasicDataType::int8() {
    return get(eInt8);
}
ZfCBasicDataType* ZfCBasicDataType::uint8() {
    return get(eUInt8);
}
ZfCBasicDataType* ZfCBasicDataType::int16() {
    return get(eInt16);
}
ZfCBasicDataType* ZfCBasicDataType::uint16() {
    return get(eUInt16);
}
ZfCBasicDataType* ZfCBasicDataType::int32() {
    return get(eInt32);
}
ZfCBasicDataType* ZfCBasicDataType::uint32() {
    return get(eUInt32);
}
ZfCBasicDataType* ZfCBasicDataType::boolean() {
    return get(eBool);
}

ZF_DataType* ZfCBasicDataType::getBaseDataType() {
    return m_Kind == eBool ? get(eBoolStorage) : this;
}

ZfCBasicDataType* ZfCBasicDataType::get(tKind Kind) {
    static ZfCBasicDataType s_Types[] = {
        ZfCBasicDataType(eFloat64),    ZfCBasicDataType(eFloat32), ZfCBasicDataType(eInt8),
        ZfCBasicDataType(eUInt8),      ZfCBasicDataType(eInt16),   ZfCBasicDataType(eUInt16),
        ZfCBasicDataType(eInt32),      ZfCBasicDataType(eUInt32),  ZfCBasicDataType(eBool),
        ZfCBasicDataType(eBoolStorage)};
    return &s_Types[Kind];
}
