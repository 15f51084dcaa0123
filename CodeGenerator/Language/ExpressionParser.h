#ifndef EXPRESSIONPARSER_H
#define EXPRESSIONPARSER_H

#include "Language/Program.h"
#include "Language/ReaderState.h"
#include "Language/TokenCursor.h"

#include <cstdint>

namespace hpn {

/// An expression just read, and what is known of it without walking over it.
struct ParsedExpression {
    Expression* pRoot = nullptr; ///< null: a mistake, already reported
    std::uint32_t Height = 0;
    bool IsTruthValue = false; ///< can be nothing but 0 and 1

    explicit operator bool() const { return pRoot != nullptr; }
};

/// Which names an expression may hold.
enum class NameUse : std::uint8_t {
    All,    ///< whatever is visible in a procedure
    Params, ///< a constant: scalar params that are declared before
    None    ///< a constant of a type: no names at all, casts to built-in types only
};

/// Reads expressions by precedence climbing and resolves their names at once. No tree it gives is
/// higher than `GreatestHeight`, so that whoever comes later may walk over it recursively; neither
/// do its own calls nest deeper than `GreatestNesting`.
class ExpressionParser {
public:
    static constexpr std::uint32_t GreatestHeight = 1000;
    static constexpr std::uint32_t GreatestNesting = 2000;

    ExpressionParser(ReaderState& State, TokenCursor& Cursor) : m_State(State), m_Cursor(Cursor) {}

    ParsedExpression parse(NameUse Use = NameUse::All);
    /// Parses a constant and computes it. False after a message.
    bool parseConstant(NameUse Use, double& Number, Expression*& pRoot);
    /// The type that the current token names, passing it; null without a message if it names none.
    const Type* acceptType();
    /// "NAME is not declared", once for each name of the program.
    void reportUndeclared(NameEntry& Entry, SourcePosition Position);
    /// A list of expressions up to the closing parenthesis, which is passed. False after a message.
    bool parseArguments(Expression*& pFirst, std::size_t& Count);

private:
    ParsedExpression parseBinary(ParsedExpression Left, int LowestPrecedence);
    ParsedExpression parseUnary();
    ParsedExpression parseNested();
    ParsedExpression parsePrefix(Operator Op);
    ParsedExpression parseParenthesis();
    ParsedExpression parseCast(SourcePosition Position);
    ParsedExpression parseFunction();
    ParsedExpression parseNumber();
    ParsedExpression parseName();
    ParsedExpression parseElement(Variable* pVariable, SourcePosition Position);
    /// A call, which may not stand in an expression: complains and passes it.
    ParsedExpression refuseCall(NameEntry& Entry, SourcePosition Position);
    /// The variable that a name stands for; null after a message.
    Variable* resolve(NameEntry& Entry, SourcePosition Position);
    Variable* resolveConstant(NameEntry& Entry, SourcePosition Position);

    ParsedExpression makeUnary(Operator Op, SourcePosition Position, ParsedExpression Operand);
    ParsedExpression makeBinary(Operator Op, SourcePosition Position, ParsedExpression Left,
                                ParsedExpression Right);
    ParsedExpression makeNumber(SourcePosition Position, double Number);
    ParsedExpression limitHeight(ParsedExpression Result);
    ParsedExpression tooDeep(SourcePosition Position);
    void warnOfOr(SourcePosition Position, const ParsedExpression& Left,
                  const ParsedExpression& Right);

    ReaderState& m_State;
    TokenCursor& m_Cursor;
    NameUse m_Use = NameUse::All;
    std::uint32_t m_Nesting = 0;
};

} // namespace hpn

#endif
