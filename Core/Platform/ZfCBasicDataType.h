#ifndef ZFCBASICDATATYPE_H
#define ZFCBASICDATATYPE_H

#include "ZF_DataType.h"

// Ready-made data types for clients that need none of their own: one object for each base type, for
// the life of the process.
//
// The number types are their own base type. The Boolean type is none of the integers: its base type
// is an object of its own that answers no number query, so that it is told apart by isBool alone.
class HPNPLATFORM_EXPORT ZfCBasicDataType : public ZF_DataType {
public:
    // The type of that name; always the same object, never to be ended by the caller.
    static ZfCBasicDataType* float64();
    static ZfCBasicDataType* float32();
    static ZfCBasicDataType* int8();
    static ZfCBasicDataType* uint8();
    static ZfCBasicDataType* int16();
    static ZfCBasicDataType* uint16();
    static ZfCBasicDataType* int32();
    static ZfCBasicDataType* uint32();
    static ZfCBasicDataType* boolean();

    ZF_DataType* getBaseDataType() override;
    bool isFloat64() override { return m_Kind == eFloat64; }
    bool isFloat32() override { return m_Kind == eFloat32; }
    bool isInt8() override { return m_Kind == eInt8; }
    bool isUInt8() override { return m_Kind == eUInt8; }
    bool isInt16() override { return m_Kind == eInt16; }
    bool isUInt16() override { return m_Kind == eUInt16; }
    bool isInt32() override { return m_Kind == eInt32; }
    bool isUInt32() override { return m_Kind == eUInt32; }
    bool isBool() override { return m_Kind == eBool; }
    bool isBooleanType() override { return m_Kind == eBool; }

private:
    enum tKind {
        eFloat64,
        eFloat32,
        eInt8,
        eUInt8,
        eInt16,
        eUInt16,
        eInt32,
        eUInt32,
        eBool,
        eBoolStorage
    };
    explicit ZfCBasicDataType(tKind Kind) : m_Kind(Kind) {}
    static ZfCBasicDataType* get(tKind Kind);

    const tKind m_Kind; // eBoolStorage: what Boolean values are stored in
};

#endif
