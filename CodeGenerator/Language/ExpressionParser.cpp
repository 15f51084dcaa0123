#include "Language/ExpressionParser.h"

#include "Language/ConstantEvaluator.h"

#include <array>

namespace hpn {

namespace {

/// A binary operator; precedence 0: the token is none.
struct BinaryOperator {
    Operator Op = Operator::Number;
    int Precedence = 0;
};

constexpr std::size_t TokenKindCount = static_cast<std::size_t>(TokenKind::OrOr) + 1;

constexpr std::array<BinaryOperator, TokenKindCount> makeBinaryOperators() {
    std::array<BinaryOperator, TokenKindCount> Table{};
    const auto Enter = [&Table](TokenKind Kind, Operator Op, int Precedence) {
        Table[static_cast<std::size_t>(Kind)] = {Op, Precedence};
    };
    Enter(TokenKind::OrOr, Operator::LogicalOr, 1);
    Enter(TokenKind::AndAnd, Operator::LogicalAnd, 2);
    Enter(TokenKind::BitOr, Operator::BitOr, 3);
    Enter(TokenKind::BitXor, Operator::BitXor, 4);
    Enter(TokenKind::BitAnd, Operator::BitAnd, 5);
    Enter(TokenKind::EqualEqual, Operator::Equal, 6);
    Enter(TokenKind::NotEqual, Operator::NotEqual, 6);
    Enter(TokenKind::Less, Operator::Less, 7);
    Enter(TokenKind::LessEqual, Operator::LessEqual, 7);
    Enter(TokenKind::Greater, Operator::Greater, 7);
    Enter(TokenKind::GreaterEqual, Operator::GreaterEqual, 7);
    Enter(TokenKind::ShiftLeft, Operator::ShiftLeft, 8);
    Enter(TokenKind::ShiftRight, Operator::ShiftRight, 8);
    Enter(TokenKind::Plus, Operator::Add, 9);
    Enter(TokenKind::Minus, Operator::Subtract, 9);
    Enter(TokenKind::Star, Operator::Multiply, 10);
    Enter(TokenKind::Slash, Operator::Divide, 10);
    Enter(TokenKind::Percent, Operator::Modulo, 10);
    return Table;
}

constexpr std::array<BinaryOperator, TokenKindCount> BinaryOperators = makeBinaryOperators();

const BinaryOperator& binaryOperator(TokenKind Kind) {
    return BinaryOperators[static_cast<std::size_t>(Kind)];
}

/// An operator whose result is 0 or 1 whatever its operands are.
bool isDecision(Operator Op) {
    return Op == Operator::LogicalNot || Op == Operator::LogicalAnd || Op == Operator::LogicalOr ||
           (Op >= Operator::Less && Op <= Operator::NotEqual);
}

/// An operator whose result is 0 or 1 if its operands are.
bool keepsTruthValues(Operator Op) {
    return Op == Operator::BitAnd || Op == Operator::BitXor || Op == Operator::BitOr ||
           Op == Operator::Multiply || Op == Operator::Minimum || Op == Operator::Maximum ||
           Op == Operator::Absolute || Op == Operator::Sign;
}

} // namespace

ParsedExpression ExpressionParser::parse(NameUse Use) {
    m_Use = Use;
    m_Nesting = 0;
    const ParsedExpression Result = parseBinary(parseUnary(), 1);
    if (Result && m_Cursor.is(TokenKind::Assign)) {
        m_Cursor.error(m_Cursor.position(),
                       "'=' cannot stand in an expression; equality is tested by '=='");
        return {};
    }
    return Result;
}

bool ExpressionParser::parseConstant(NameUse Use, double& Number, Expression*& pRoot) {
    pRoot = parse(Use).pRoot;
    if (pRoot == nullptr) {
        return false;
    }
    Number = evaluateConstant(pRoot);
    return true;
}

const Type* ExpressionParser::acceptType() {
    const Type* pType = nullptr;
    if (isBuiltInType(m_Cursor.kind())) {
        pType = &m_State.Target.Types[static_cast<std::size_t>(m_Cursor.kind()) -
                                      static_cast<std::size_t>(TokenKind::Bool)];
    } else if (m_Cursor.is(TokenKind::Identifier) && m_Cursor.name().Kind == SymbolKind::Type) {
        pType = m_Cursor.name().pType;
    }
    if (pType != nullptr) {
        m_Cursor.advance();
    }
    return pType;
}

void ExpressionParser::reportUndeclared(NameEntry& Entry, SourcePosition Position) {
    if (!Entry.IsSuspect) {
        Entry.IsSuspect = true;
        m_Cursor.error(Position, quotedName(Entry.Text) + " is not declared");
    }
}

/// The operand to the left has been read; takes all operators that bind at least as strongly as the
/// lowest wanted. Chains of operators of one precedence are a loop; only a stronger one to the
/// right nests.
ParsedExpression ExpressionParser::parseBinary(ParsedExpression Left, int LowestPrecedence) {
    // Behind a mistake there is nothing to count: it would be reported at every level on the way
    // back.
    if (!Left) {
        return Left;
    }
    if (m_Nesting > GreatestNesting) {
        return tooDeep(m_Cursor.position());
    }
    ++m_Nesting;
    for (;;) {
        const BinaryOperator& Found = binaryOperator(m_Cursor.kind());
        if (!Left || Found.Precedence < LowestPrecedence || Found.Precedence == 0) {
            break;
        }
        const SourcePosition Position = m_Cursor.position();
        m_Cursor.advance();
        ParsedExpression Right = parseUnary();
        if (Right && binaryOperator(m_Cursor.kind()).Precedence > Found.Precedence) {
            Right = parseBinary(Right, Found.Precedence + 1);
        }
        Left = Right ? makeBinary(Found.Op, Position, Left, Right) : ParsedExpression{};
    }
    --m_Nesting;
    return Left;
}

ParsedExpression ExpressionParser::parseUnary() {
    switch (m_Cursor.kind()) {
    case TokenKind::Identifier:
        return parseName();
    case TokenKind::Number:
        return parseNumber();
    case TokenKind::True:
    case TokenKind::False: {
        ParsedExpression Result =
            makeNumber(m_Cursor.position(), m_Cursor.is(TokenKind::True) ? 1.0 : 0.0);
        Result.pRoot->IsBoolLiteral = true;
        m_Cursor.advance();
        return Result;
    }
    default:
        break;
    }
    if (m_Nesting > GreatestNesting) {
        return tooDeep(m_Cursor.position());
    }
    ++m_Nesting;
    const ParsedExpression Result = parseNested();
    --m_Nesting;
    return Result;
}

/// The forms of an operand that hold expressions themselves.
ParsedExpression ExpressionParser::parseNested() {
    switch (m_Cursor.kind()) {
    case TokenKind::ParenOpen:
        return parseParenthesis();
    case TokenKind::Minus:
        return parsePrefix(Operator::Negate);
    case TokenKind::Not:
        return parsePrefix(Operator::LogicalNot);
    case TokenKind::Tilde:
        return parsePrefix(Operator::Complement);
    case TokenKind::Plus:
        m_Cursor.advance();
        return parseUnary();
    case TokenKind::Min:
    case TokenKind::Max:
    case TokenKind::Abs:
    case TokenKind::Sgn:
        return parseFunction();
    default:
        m_Cursor.expected("an expression");
        return {};
    }
}

ParsedExpression ExpressionParser::parsePrefix(Operator Op) {
    const SourcePosition Position = m_Cursor.position();
    m_Cursor.advance();
    return makeUnary(Op, Position, parseUnary());
}

ParsedExpression ExpressionParser::parseParenthesis() {
    const SourcePosition Position = m_Cursor.position();
    m_Cursor.advance();
    const TokenKind Kind = m_Cursor.kind();
    if (isBuiltInType(Kind) ||
        (Kind == TokenKind::Identifier && m_Cursor.name().Kind == SymbolKind::Type)) {
        return parseCast(Position);
    }
    const ParsedExpression Result = parseBinary(parseUnary(), 1);
    if (!Result || !m_Cursor.expect(TokenKind::ParenClose, "')'")) {
        return {};
    }
    return Result;
}

ParsedExpression ExpressionParser::parseCast(SourcePosition Position) {
    const SourcePosition TypePosition = m_Cursor.position();
    const Type* pType = acceptType();
    if (m_Use == NameUse::None && !pType->IsBuiltIn) {
        m_Cursor.error(TypePosition,
                       quotedName(pType->Name) + " cannot stand in the declaration of a type");
        return {};
    }
    if (!m_Cursor.expect(TokenKind::ParenClose, "')'")) {
        return {};
    }
    const ParsedExpression Result = makeUnary(Operator::Cast, Position, parseUnary());
    if (Result) {
        Result.pRoot->pType = pType;
    }
    return {Result.pRoot, Result.Height, pType->Base == BaseType::Bool};
}

ParsedExpression ExpressionParser::parseFunction() {
    const SourcePosition Position = m_Cursor.position();
    const TokenKind Function = m_Cursor.kind();
    m_Cursor.advance();
    if (!m_Cursor.expect(TokenKind::ParenOpen, "'('")) {
        return {};
    }
    const ParsedExpression First = parseBinary(parseUnary(), 1);
    ParsedExpression Second;
    const bool IsBinary = Function == TokenKind::Min || Function == TokenKind::Max;
    if (!First || (IsBinary && !m_Cursor.expect(TokenKind::Comma, "','"))) {
        return {};
    }
    if (IsBinary) {
        Second = parseBinary(parseUnary(), 1);
    }
    if ((IsBinary && !Second) || !m_Cursor.expect(TokenKind::ParenClose, "')'")) {
        return {};
    }
    if (IsBinary) {
        return makeBinary(Function == TokenKind::Min ? Operator::Minimum : Operator::Maximum,
                          Position, First, Second);
    }
    return makeUnary(Function == TokenKind::Abs ? Operator::Absolute : Operator::Sign, Position,
                     First);
}

ParsedExpression ExpressionParser::parseNumber() {
    const ParsedExpression Result = makeNumber(m_Cursor.position(), m_Cursor.number());
    Result.pRoot->Text = m_Cursor.text();
    m_Cursor.advance();
    return Result;
}

ParsedExpression ExpressionParser::parseName() {
    NameEntry& Entry = m_Cursor.name();
    const SourcePosition Position = m_Cursor.position();
    m_Cursor.advance();
    if (m_Cursor.is(TokenKind::ParenOpen)) {
        return refuseCall(Entry, Position);
    }
    Variable* pVariable = resolve(Entry, Position);
    if (m_Cursor.is(TokenKind::BracketOpen)) {
        return parseElement(pVariable, Position);
    }
    ParsedExpression Result = makeNumber(Position, 0.0);
    if (pVariable == nullptr) {
        return Result;
    }
    if (pVariable->Count != 0) {
        m_Cursor.error(Position, "array " + quotedName(Entry.Text) + " needs an index");
    }
    Result.pRoot->Op = Operator::Variable;
    Result.pRoot->Text = Entry.Text;
    Result.pRoot->pVariable = pVariable;
    Result.IsTruthValue = pVariable->pType->Base == BaseType::Bool;
    return Result;
}

ParsedExpression ExpressionParser::parseElement(Variable* pVariable, SourcePosition Position) {
    if (m_Nesting > GreatestNesting) {
        return tooDeep(Position);
    }
    ++m_Nesting;
    m_Cursor.advance();
    const ParsedExpression Index = parseBinary(parseUnary(), 1);
    --m_Nesting;
    if (!Index || !m_Cursor.expect(TokenKind::BracketClose, "']'")) {
        return {};
    }
    ParsedExpression Result = makeUnary(Operator::Element, Position, Index);
    if (!Result || pVariable == nullptr) {
        return Result;
    }
    if (pVariable->Count == 0) {
        m_Cursor.error(Position, quotedName(pVariable->Name) + " is not an array");
    } else if (m_Use != NameUse::All) {
        m_Cursor.error(Position, "an array element is not a constant");
    }
    Result.pRoot->Text = pVariable->Name;
    Result.pRoot->pVariable = pVariable;
    Result.IsTruthValue = pVariable->pType->Base == BaseType::Bool;
    return Result;
}

ParsedExpression ExpressionParser::refuseCall(NameEntry& Entry, SourcePosition Position) {
    if (Entry.Kind == SymbolKind::Procedure || Entry.Kind == SymbolKind::Extern) {
        m_Cursor.error(Position, "a call cannot stand in an expression: assign the result of " +
                                     quotedName(Entry.Text) + " to a variable first");
    } else if (Entry.Kind != SymbolKind::None || Entry.pLocal != nullptr) {
        m_Cursor.error(Position, quotedName(Entry.Text) + " is not a procedure");
    } else {
        reportUndeclared(Entry, Position);
    }
    m_Cursor.advance();
    m_Cursor.recoverParenthesis();
    return makeNumber(Position, 0.0);
}

Variable* ExpressionParser::resolve(NameEntry& Entry, SourcePosition Position) {
    if (m_Use != NameUse::All) {
        return resolveConstant(Entry, Position);
    }
    if (Entry.pLocal != nullptr) {
        return Entry.pLocal;
    }
    if (Entry.Kind == SymbolKind::Variable) {
        return Entry.pVariable;
    }
    if (Entry.Kind == SymbolKind::None) {
        reportUndeclared(Entry, Position);
    } else {
        m_Cursor.error(Position, quotedName(Entry.Text) + " is not a variable");
    }
    return nullptr;
}

Variable* ExpressionParser::resolveConstant(NameEntry& Entry, SourcePosition Position) {
    const bool IsParam =
        Entry.Kind == SymbolKind::Variable && Entry.pVariable->Kind == VariableKind::Param;
    if (m_Use == NameUse::Params && IsParam) {
        return Entry.pVariable;
    }
    const bool IsDeclared = Entry.Kind != SymbolKind::None || Entry.pLocal != nullptr;
    if (IsDeclared || !Entry.IsSuspect) {
        m_Cursor.error(Position, quotedName(Entry.Text) +
                                     (m_Use == NameUse::Params
                                          ? " is no constant: it is not a param declared before"
                                          : " cannot stand in the declaration of a type"));
    }
    return nullptr;
}

bool ExpressionParser::parseArguments(Expression*& pFirst, std::size_t& Count) {
    Expression** ppNext = &pFirst;
    Count = 0;
    if (m_Cursor.accept(TokenKind::ParenClose)) {
        return true;
    }
    do {
        const ParsedExpression Argument = parse();
        if (!Argument) {
            return false;
        }
        *ppNext = Argument.pRoot;
        ppNext = &Argument.pRoot->pNext;
        ++Count;
    } while (m_Cursor.accept(TokenKind::Comma));
    return m_Cursor.expect(TokenKind::ParenClose, "')'");
}

ParsedExpression ExpressionParser::makeUnary(Operator Op, SourcePosition Position,
                                             ParsedExpression Operand) {
    if (!Operand) {
        return {};
    }
    Expression* pRoot = m_State.Target.newExpression();
    pRoot->Op = Op;
    pRoot->Position = Position;
    pRoot->pLeft = Operand.pRoot;
    const bool IsTruthValue = isDecision(Op) || (keepsTruthValues(Op) && Operand.IsTruthValue);
    return limitHeight({pRoot, Operand.Height + 1, IsTruthValue});
}

ParsedExpression ExpressionParser::makeBinary(Operator Op, SourcePosition Position,
                                              ParsedExpression Left, ParsedExpression Right) {
    Expression* pRoot = m_State.Target.newExpression();
    pRoot->Op = Op;
    pRoot->Position = Position;
    pRoot->pLeft = Left.pRoot;
    pRoot->pRight = Right.pRoot;
    if (Op == Operator::LogicalOr) {
        warnOfOr(Position, Left, Right);
    }
    const bool IsTruthValue =
        isDecision(Op) || (keepsTruthValues(Op) && Left.IsTruthValue && Right.IsTruthValue);
    return limitHeight({pRoot, std::max(Left.Height, Right.Height) + 1, IsTruthValue});
}

ParsedExpression ExpressionParser::makeNumber(SourcePosition Position, double Number) {
    Expression* pRoot = m_State.Target.newExpression();
    pRoot->Position = Position;
    pRoot->Number = Number;
    return {pRoot, 1, Number == 0.0 || Number == 1.0};
}

ParsedExpression ExpressionParser::limitHeight(ParsedExpression Result) {
    return Result.Height > GreatestHeight ? tooDeep(Result.pRoot->Position) : Result;
}

ParsedExpression ExpressionParser::tooDeep(SourcePosition Position) {
    m_Cursor.error(Position, "the expression is too deep");
    return {};
}

void ExpressionParser::warnOfOr(SourcePosition Position, const ParsedExpression& Left,
                                const ParsedExpression& Right) {
    if (!Left.IsTruthValue || !Right.IsTruthValue) {
        const char* Side = Left.IsTruthValue ? "right" : "left";
        m_Cursor.warning(Position, std::string("the ") + Side +
                                       " operand of '||' can be other than 0 and 1, and only 1 "
                                       "counts as true there");
    }
}

} // namespace hpn
