#ifndef EXPRESSIONWRITER_H
#define EXPRESSIONWRITER_H

#include "Emitter/BranchTest.h"
#include "Language/Program.h"
#include "Model/Term.h"

#include <string>
#include <string_view>
#include <vector>

namespace hpn {

/// Gives the C name of a variable where it is read or written.
class VariableNames {
public:
    virtual std::string_view nameOf(const Variable& Declaration) const = 0;

protected:
    ~VariableNames() = default;
};

/// Writes terms as C expressions that give the same number, bit for bit. Integer arithmetic is
/// written where the types of the operands prove that it gives the number of the double arithmetic,
/// and plain C operators where the ranges rule out the cases in which the number model differs from
/// C; otherwise the helpers of hpn_runtime.h.
///
/// The sign of a zero is kept only below a divisor: nothing else in the language can tell the zeros
/// apart, since every store to a floating variable makes a negative zero positive and `*` and `/`
/// give 0.0 where a factor or the dividend is zero. Everything is appended to the buffer given;
/// each call costs one walk over the term.
class ExpressionWriter {
public:
    ExpressionWriter(const VariableNames& Names, std::string& Out) : m_Names(Names), m_Out(Out) {}

    /// What stands in the storage of `To` after a store of the term; no `Cast` has to be on top,
    /// but one to `To` itself is taken as the store's own conversion. `KeepNaN` false: every NaN
    /// gets the same bits.
    void writeStored(const Term* pTerm, const Type& To, bool KeepNaN);
    /// The term as a C condition, or its negation.
    void writeCondition(const Term* pTerm, bool Negated);
    /// Several of them joined by `||`, or the negation of that.
    void writeTests(const BranchTests& Tests, bool Negated);
    /// `name[index]` with the index brought into the array.
    void writeElement(const Variable& Array, const Term* pIndex);
    /// The variables whose names were written as reads since `clearReads`, one for each place. A
    /// read that the text can do without, such as in `x * 0`, is not written.
    const std::vector<const Variable*>& getReads() const { return m_Reads; }
    void clearReads() { m_Reads.clear(); }
    /// An expression statement's text for the sake of the inputs that the term reads.
    void writeDiscarded(const Term* pTerm);

private:
    /// Type of a piece of C text.
    enum class CType : std::uint8_t {
        Int, ///< int, or something that is promoted to it
        UInt32,
        Int64,
        Float,
        Double
    };
    /// How a term's number is computed.
    enum class Arithmetic : std::uint8_t { Int32, Int64, Double };
    enum Precedence : std::uint8_t {
        Or = 4,
        And = 5,
        BitOr = 6,
        BitXor = 7,
        BitAnd = 8,
        Equality = 9,
        Relation = 10,
        Shift = 11,
        Sum = 12,
        Product = 13,
        Prefix = 14,
        Primary = 16
    };
    struct Piece {
        CType Type;
        Precedence Binding;
        bool IsTruth; ///< a comparison or logical operator: 0 or 1
    };
    struct Node {
        const Term* pTerm = nullptr;      ///< null: a number made up by the writer
        const hpn::Type* pType = nullptr; ///< of a variable or element read
        int Left = -1;
        int Right = -1;
        Operator Op = Operator::Number;
        Arithmetic Kind = Arithmetic::Double;
        bool ReadsInput = false;
        double Number = 0.0;
        ValueRange Range;
    };

    int analyse(const Term* pTerm);
    int analyseNumber(double Number);
    bool isConstant(const Node& Of, double& Number) const;
    void turnIntoComplement(Node& Of) const;
    Arithmetic kindOf(const Node& Of) const;
    Arithmetic kindOfCast(const Node& Of) const;
    Arithmetic kindOfArithmetic(const Node& Of) const;
    bool isWhole(int Index) const { return m_Nodes[Index].Kind != Arithmetic::Double; }

    Piece value(int Index, bool KeepZeroSign);
    Piece number(const Node& Of, bool AsDouble);
    Piece read(const Node& Of);
    Piece raw(const Node& Of);
    Piece scaled(std::size_t Start, Piece Raw, const hpn::Type& Of);
    Piece unary(const Node& Of, bool KeepZeroSign);
    Piece binary(const Node& Of, bool KeepZeroSign);
    Piece sumOrProduct(const Node& Of, bool KeepZeroSign);
    Piece quotient(const Node& Of, bool KeepZeroSign);
    Piece extreme(const Node& Of, bool KeepZeroSign);
    Piece bitOperation(const Node& Of);
    Piece bitOperand(int Index);
    Piece shift(const Node& Of);
    Piece remainder(const Node& Of);
    Piece castValue(const Node& Of);
    Piece operandAsDouble(int Index, bool KeepZeroSign);
    Piece wholeBinary(const Node& Of, const char* Sign, Precedence Binding);
    Piece infix(int Left, int Right, const char* Sign, Precedence Binding, CType Type,
                bool KeepZeroSign);
    Piece call(const char* Name, int Left, int Right, CType Type, bool KeepZeroSign);

    bool isDivisionTruncating(const Node& Of) const;
    Piece truncatedQuotient(const Node& Of);
    Piece truncated32(int Index);

    Piece condition(int Index, bool Negated);
    Piece compared(int Index);
    bool looksLikeComplement(const Node& Of) const;
    Piece unequalZero(int Index, bool Negated);
    Piece logical(const Node& Of, bool Negated);
    Piece equalOne(int Index);
    Piece comparison(const Node& Of, bool Negated);
    bool isScaledRead(int Index) const;
    bool isMaskDecided(int Masked, double Number) const;
    bool isMaskedAway(const Node& Cast, double& Number) const;
    bool isDecidedByShape(const Node& Of, double& Number) const;
    bool compareRaw(const Node& Of, Operator Op, Piece& Result);
    bool compareRawWithNumber(int Scaled, double Number, Operator Op, Piece& Result);
    Piece compareWhole(int Left, int Right, Operator Op, bool OfRaws);
    Piece decided(bool Holds);

    Piece stored(int Index, const hpn::Type& To, bool Clips);
    Piece storedBool(int Index, const hpn::Type& To, bool Low, bool High);
    Piece storedWhole(int Index, const hpn::Type& To, bool Low, bool High);
    Piece storedScaled(int Index, const hpn::Type& To, bool Low, bool High);
    Piece storedFloating(int Index, const hpn::Type& To, bool Low, bool High);
    bool mayGiveNegativeZero(int Index) const;
    void explicitCast(std::size_t Start, Piece Of, BaseType Base);
    bool isRawCopy(const Node& Of, const hpn::Type& To) const;
    Piece clipWhole(std::size_t Start, Piece Of, std::int64_t Lower, std::int64_t Upper, bool Low,
                    bool High);
    Piece clipDouble(std::size_t Start, Piece Of, const hpn::Type& To, bool Low, bool High);
    Piece wrapWhole(std::size_t Start, Piece Of, const ValueRange& Range, BaseType Base);
    Piece convertDouble(std::size_t Start, Piece Of, const ValueRange& Range, BaseType Base);

    void element(const Variable& Array, int Index);
    void parenthesize(std::size_t Start);
    void bind(std::size_t Start, Piece Of, Precedence Least);
    void bindBeside(std::size_t Start, Piece Of, Precedence Least);
    Piece cast(std::size_t Start, Piece Of, const char* Type, CType To);
    Piece wrapInCall(std::size_t Start, const char* Name, CType Type);

    const VariableNames& m_Names;
    std::string& m_Out;
    std::vector<const Variable*> m_Reads;
    std::vector<Node> m_Nodes; // of the term in hand, operands before their operators
};

} // namespace hpn

#endif
