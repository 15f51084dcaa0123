#ifndef PROGRAM_H
#define PROGRAM_H

#include <cstddef>
#include <cstdint>
#include <deque>
#include <memory>
#include <new>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

namespace hpn {

// The syntax tree of one program: what the parser makes, the checker resolves, the printer writes
// back and the graph builder reads. It is plain data: nodes are linked by pointers, live in the
// arena of their `Program` and go with it; nothing in it is changed after the checker has accepted
// it. Names are views into the source texts, which the `SourceFiles` of the reader keep alive as
// long as the program. Lists are linked by `pNext` or are vectors in the order of the source.
// Nothing here knows the optimiser.

struct Procedure;
struct Statement;
struct Variable;

/// A place in the sources: file by number of reading, byte offset in it. Line and column are worked
/// out on demand.
struct SourcePosition {
    std::uint32_t File = 0;
    std::uint32_t Offset = 0;
};

/// The storage of a value on the target.
enum class BaseType : std::uint8_t {
    Bool,
    Int8,
    UInt8,
    Int16,
    UInt16,
    Int32,
    UInt32,
    Float32,
    Float64
};

/// What the data dictionary says of a type: storage, scaling, limits. One object for each built-in
/// and declared type. A scaled type stands for `raw * Lsb + Offset`, its raw number being an
/// integer of the base type. Limits are physical numbers; the checker has put them on the grid of
/// the type and inside its storage.
struct Type {
    std::string_view Name; ///< name in the source; of a built-in type its keyword
    BaseType Base = BaseType::Float64;
    bool IsBuiltIn = true;
    bool IsScaled = false; ///< `Lsb` and `Offset` count (integers only)
    double Lsb = 1.0;      ///< greater than 0
    double Offset = 0.0;
    bool HasRange = false; ///< a range was declared; it acts on values only where it saturates
    double Lower = 0.0;
    double Upper = 0.0;
    bool SaturatesLow = false;
    bool SaturatesHigh = false;
    SourcePosition Position;
};

/// Operators of expressions; the arity follows from the kind.
enum class Operator : std::uint8_t {
    Number,   ///< literal; `Number`
    Variable, ///< read of a scalar; `pVariable`
    Element,  ///< read of an array element; `pVariable`, index in `pLeft`
    Cast,     ///< conversion to `pType` of `pLeft`
    Negate,
    LogicalNot,
    Complement,
    Absolute, ///< abs(x)
    Sign,     ///< sgn(x)
    Multiply,
    Divide,
    Modulo,
    Add,
    Subtract,
    ShiftLeft,
    ShiftRight,
    Less,
    LessEqual,
    Greater,
    GreaterEqual,
    Equal,
    NotEqual,
    BitAnd,
    BitXor,
    BitOr,
    LogicalAnd,
    LogicalOr,
    Minimum, ///< min(a, b)
    Maximum  ///< max(a, b)
};

/// One node of an expression.
struct Expression {
    Operator Op = Operator::Number;
    SourcePosition Position;
    Expression* pLeft = nullptr; ///< only operand, or left one
    Expression* pRight = nullptr;
    Expression* pNext = nullptr; ///< next argument of the same call
    double Number = 0.0;
    bool IsBoolLiteral = false;    ///< `true` or `false` in the source, for printing
    std::string_view Text;         ///< literal's or name's text in the source
    Variable* pVariable = nullptr; ///< set by the checker for Variable and Element
    const Type* pType = nullptr;   ///< Cast
};

enum class VariableKind : std::uint8_t { Input, Output, State, Param, Local, Formal, Result };

/// A declared variable. `Result` is the hidden variable that carries a procedure's result to its
/// caller.
struct Variable {
    VariableKind Kind = VariableKind::State;
    std::string_view Name;
    const Type* pType = nullptr;
    std::uint32_t Count = 0; ///< number of elements, 0: a scalar
    bool HasInitializer = false;
    std::vector<double> Initial; ///< converted to the type; one number, or one for each element
                                 ///< (missing ones are 0)
    Expression* pInitializer = nullptr; ///< as written, first of a list by pNext; null: none
    Procedure* pOwner = nullptr;        ///< of Local, Formal, Result
    SourcePosition Position;
    std::uint32_t Index = 0; ///< place in Program::Variables
    /// Input: for this run the user vouches that it stays between the two, in place of all that its
    /// storage can hold.
    bool HasBelievedRange = false;
    double BelievedLow = 0.0;
    double BelievedHigh = 0.0;
};

/// Code outside the program: may read and write the listed variables whenever it is called.
struct Extern {
    std::string_view Name;
    std::vector<Variable*> Reads;
    std::vector<Variable*> Writes;
    SourcePosition Position;
};

enum class StatementKind : std::uint8_t {
    Assign,  ///< pTarget[pIndex] op= pValue
    Call,    ///< [pTarget =] pProcedure(pArguments) or pExtern()
    If,      ///< pCondition, pBody, pElse
    While,   ///< pCondition, pBody
    DoWhile, ///< pBody, pCondition
    For,     ///< pInit; pCondition (null: forever); pStep; pBody
    Switch,  ///< pCondition, Case and Default labels among the statements of pBody
    Case,    ///< pCondition: the constant
    Default,
    Break,
    Continue,
    Return,    ///< pValue or null
    Goto,      ///< Name, pLabel
    Label,     ///< Name
    Block,     ///< pBody
    LocalDecl, ///< pTarget, its initialiser in pValue or null (then 0)
    Empty
};

/// One statement. A list of statements is linked by `pNext`.
struct Statement {
    StatementKind Kind = StatementKind::Empty;
    /// Assign: the operator of a compound assignment (`Add` for `+=`), `Number` for the plain one.
    Operator CompoundOp = Operator::Number;
    bool IsIncrement = false; ///< written as `x++` or `x--`
    SourcePosition Position;
    std::string_view Name; ///< of the label, the goto's label, the called procedure, the target
    Variable* pTarget = nullptr;
    Expression* pIndex = nullptr;
    Expression* pValue = nullptr;
    Expression* pCondition = nullptr;
    Expression* pArguments = nullptr;
    Procedure* pProcedure = nullptr;
    Extern* pExtern = nullptr;
    Statement* pLabel = nullptr; ///< of a Goto: its Label statement
    Statement* pInit = nullptr;
    Statement* pStep = nullptr;
    Statement* pBody = nullptr;
    Statement* pElse = nullptr;
    Statement* pNext = nullptr;
};

/// One procedure. The one named "main" is the program's step.
struct Procedure {
    std::string_view Name;
    bool IsExported = false;
    bool IsMain = false;
    bool IsRecursive = false; ///< calls itself, directly or in a ring; set by the checker
    std::vector<Variable*> Formals;
    std::vector<Variable*> Locals; ///< all of the body's declarations, in order of the source
    Variable* pResult = nullptr;   ///< null: no result
    Statement* pBody = nullptr;    ///< first statement, linked by pNext
    SourcePosition Position;
    std::uint32_t Index = 0; ///< place in Program::Procedures
};

/// Storage for the many small nodes of one kind, given out one after the other from chunks and
/// freed all at once. Nodes need no destructor, and never move.
template <class Node>
class NodeArena {
public:
    static_assert(std::is_trivially_destructible_v<Node>);

    NodeArena() = default;
    NodeArena(const NodeArena&) = delete;
    NodeArena& operator=(const NodeArena&) = delete;

    Node* make() {
        if (m_Left == 0) {
            m_Chunks.emplace_back(new Room[ChunkSize]);
            m_pNext = m_Chunks.back().get();
            m_Left = ChunkSize;
        }
        --m_Left;
        return ::new (static_cast<void*>((m_pNext++)->Bytes)) Node;
    }
    void clear() {
        m_Chunks.clear();
        m_Left = 0;
    }

private:
    struct Room {
        alignas(Node) std::byte Bytes[sizeof(Node)];
    };
    static constexpr std::size_t ChunkSize = 512;

    std::vector<std::unique_ptr<Room[]>> m_Chunks;
    Room* m_pNext = nullptr; ///< next free place of the last chunk
    std::size_t m_Left = 0;  ///< places from there on
};

/// The whole program. Owns every node; pointers stay valid for its life.
struct Program {
    std::string Name;                 ///< stem of the first source file's name, an identifier
    std::deque<Type> Types;           ///< built-in ones first, in the order of BaseType
    std::deque<Variable> Variables;   ///< in the order of declaration
    std::deque<Procedure> Procedures; ///< in the order of declaration
    std::deque<Extern> Externs;
    Procedure* pMain = nullptr;
    /// For this run: params, by name, with another value than the one in the text. Filled before
    /// the program is read, since other declarations may be computed from them.
    std::vector<std::pair<std::string, double>> Settings;

    /// Takes room for a node; the node lives as long as the program.
    Expression* newExpression() { return m_Expressions.make(); }
    Statement* newStatement() { return m_Statements.make(); }
    /// Frees all statements and expressions, the greater part of a program by far, once nobody
    /// needs them any more; declarations stay.
    void dropBodies() {
        for (Procedure& Each : Procedures)
            Each.pBody = nullptr;
        for (Variable& Each : Variables)
            Each.pInitializer = nullptr;
        m_Expressions.clear();
        m_Statements.clear();
    }
    /// The built-in type of a storage.
    const Type* builtIn(BaseType Base) const { return &Types[static_cast<std::size_t>(Base)]; }

    Program() = default;
    Program(const Program&) = delete;
    Program& operator=(const Program&) = delete;

private:
    NodeArena<Expression> m_Expressions;
    NodeArena<Statement> m_Statements;
};

} // namespace hpn

#endif
