#ifndef ZFCCFGSFVARIABLE_H
#define ZFCCFGSFVARIABLE_H

#include "Language/Program.h"
#include "Model/ValueRange.h"
#include "ZF_DataType.h"
#include "ZF_Scaling.h"
#include "ZfCCfgVariable.h"

namespace hpn {

/// A declared type in the form in which the optimiser asks for it. It is its own base type.
class TargetDataType : public ZF_DataType {
public:
    explicit TargetDataType(BaseType Base) : m_Base(Base) {}
    ZF_DataType* getBaseDataType() override { return this; }
    bool isFloat64() override { return m_Base == BaseType::Float64; }
    bool isFloat32() override { return m_Base == BaseType::Float32; }
    bool isInt8() override { return m_Base == BaseType::Int8; }
    bool isUInt8() override { return m_Base == BaseType::UInt8; }
    bool isInt16() override { return m_Base == BaseType::Int16; }
    bool isUInt16() override { return m_Base == BaseType::UInt16; }
    bool isInt32() override { return m_Base == BaseType::Int32; }
    bool isUInt32() override { return m_Base == BaseType::UInt32; }
    bool isBool() override { return m_Base == BaseType::Bool; }
    bool isBooleanType() override { return m_Base == BaseType::Bool; }

private:
    BaseType m_Base;
};

/// The scaling of a declared type.
class TargetScaling : public ZF_Scaling {
public:
    explicit TargetScaling(const Type& Of) : m_Type(Of) {}
    double getLsb() override { return m_Type.Lsb; }
    double getOffset() override { return m_Type.Offset; }

private:
    const Type& m_Type;
};

} // namespace hpn

/// A variable of the source program as the optimiser sees it: the client's side of
/// `ZfCCfgVariable`. It answers type, scaling and limits out of the declaration, which it does not
/// own and which must outlive it; the graph's owner
/// (`hpn::ProgramGraph`) owns the variable. Which markers it bears is decided by the graph builder:
/// - array: declared with elements;
/// - volatile to the library: inputs, whatever an extern or an exported procedure writes,
/// parameters and locals of procedures
///   that call themselves (each activation has its own);
/// - erasable: states, locals, formals, results and params that no extern and no exported procedure
/// touches.
///
/// Saturating limits are told to the optimiser only where no stored number can lie beyond them: a
/// type that saturates at one side and wraps at the other can hold such a number, and the optimiser
/// would clip it whenever it copies it. The right-hand sides convert by themselves, so nothing is
/// lost.
class ZfCCfgSFVariable : public ZfCCfgVariable {
public:
    explicit ZfCCfgSFVariable(const hpn::Variable& Declaration);
    ~ZfCCfgSFVariable() override;

    const hpn::Variable& getDeclaration() const { return m_Declaration; }
    const hpn::Type& getType() const { return *m_Declaration.pType; }
    /// What storage of its type can hold; kept, since each read of the variable asks for it.
    const hpn::ValueRange& getStorageRange() const { return m_StorageRange; }
    /// Reading it is itself a side effect: an input, which the outside changes at any time.
    bool isReadASideEffect() const { return m_Declaration.Kind == hpn::VariableKind::Input; }
    /// Some statement of the program assigns it, as a left-hand side, a formal of a call or a
    /// result.
    bool isAssigned() const { return m_IsAssigned; }
    void markAsAssigned() { m_IsAssigned = true; }
    /// Some extern writes it.
    bool isWrittenByExtern() const { return m_IsWrittenByExtern; }
    void markAsWrittenByExtern() { m_IsWrittenByExtern = true; }

    ZF_DataType* getDataType() override;
    ZF_Scaling* getScaling() override;
    bool isUpperBorderSaturated() override;
    bool isLowerBorderSaturated() override;
    double getUpperLimit() override;
    double getLowerLimit() override;
    ZfCCfgValue getInitValue() override;
    bool isOutput() override;
    ZfCCfgSFVariable* isSFVariable() override;

private:
    const hpn::Variable& m_Declaration;
    hpn::TargetDataType m_DataType;
    hpn::TargetScaling m_Scaling;
    hpn::ValueRange m_StorageRange;
    bool m_IsUpperBorderSaturated;
    bool m_IsLowerBorderSaturated;
    bool m_IsAssigned = false;
    bool m_IsWrittenByExtern = false;
};

namespace hpn {
/// The client's variable behind a variable or any SSA version of it.
ZfCCfgSFVariable* originalOf(ZfCCfgVariable* pVariable);
} // namespace hpn

#endif
