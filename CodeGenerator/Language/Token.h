#ifndef TOKEN_H
#define TOKEN_H

#include <cstdint>
#include <vector>

namespace hpn {

/// What a piece of the text is. The groups are contiguous, and each is asked for by its ends below.
enum class TokenKind : std::uint8_t {
    End,
    Bad, ///< already reported by the lexer
    Identifier,
    Number,

    // Words that begin a declaration. None of them can stand in a procedure, so they are where
    // reading takes up again after a mistake.
    Type,
    Input,
    Output,
    State,
    Param,
    Extern,
    Export,
    Proc,

    Local,
    If,
    Else,
    While,
    Do,
    For,
    Switch,
    Case,
    Default,
    Break,
    Continue,
    Return,
    Goto,

    True,
    False,
    Min,
    Max,
    Abs,
    Sgn,

    // In the order of BaseType.
    Bool,
    Int8,
    UInt8,
    Int16,
    UInt16,
    Int32,
    UInt32,
    Float32,
    Float64,

    ParenOpen,
    ParenClose,
    BraceOpen,
    BraceClose,
    BracketOpen,
    BracketClose,
    Comma,
    Semicolon,
    Colon,

    Assign,
    MultiplyAssign,
    DivideAssign,
    ModuloAssign,
    AddAssign,
    SubtractAssign,
    ShiftLeftAssign,
    ShiftRightAssign,
    BitAndAssign,
    BitXorAssign,
    BitOrAssign,
    PlusPlus,
    MinusMinus,

    Not,
    Tilde,
    Star,
    Slash,
    Percent,
    Plus,
    Minus,
    ShiftLeft,
    ShiftRight,
    Less,
    LessEqual,
    Greater,
    GreaterEqual,
    EqualEqual,
    NotEqual,
    BitAnd,
    BitXor,
    BitOr,
    AndAnd,
    OrOr
};

constexpr bool isBetween(TokenKind Kind, TokenKind First, TokenKind Last) {
    return Kind >= First && Kind <= Last;
}
constexpr bool isKeyword(TokenKind Kind) {
    return isBetween(Kind, TokenKind::Type, TokenKind::Float64);
}
/// Begins a declaration of the program.
constexpr bool isDeclarator(TokenKind Kind) {
    return isBetween(Kind, TokenKind::Type, TokenKind::Proc);
}
constexpr bool isStatementKeyword(TokenKind Kind) {
    return isBetween(Kind, TokenKind::Local, TokenKind::Goto);
}
constexpr bool isBuiltInType(TokenKind Kind) {
    return isBetween(Kind, TokenKind::Bool, TokenKind::Float64);
}

/// One piece of a text. Small, because a program is held as a whole list of them while it is read.
struct Token {
    TokenKind Kind : 8;
    std::uint32_t Length : 24;
    std::uint32_t Offset;
    std::uint32_t Value; ///< Identifier: its number in the name table; Number: its place in
                         ///< TokenList::Numbers
};

/// One file's tokens. Two End tokens close the list, so that the one behind the current can always
/// be looked at.
struct TokenList {
    std::vector<Token> Tokens;
    std::vector<double> Numbers;
    std::vector<std::uint32_t> TypeDeclarations; ///< places in Tokens of the word `type`
};

} // namespace hpn

#endif
