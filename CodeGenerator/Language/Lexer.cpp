#include "Language/Lexer.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <limits>
#include <utility>

namespace hpn {

namespace {

constexpr std::size_t LongestName = 255;
constexpr std::size_t LongestNumber = 1000;

enum class CharacterClass : std::uint8_t { Stray, Blank, Letter, Digit, Operator, Quote };

/// The tokens that begin with one operator character; End: no such token.
struct OperatorForms {
    TokenKind Plain = TokenKind::End;
    TokenKind WithAssign = TokenKind::End;        ///< followed by =
    TokenKind Doubled = TokenKind::End;           ///< followed by itself
    TokenKind DoubledWithAssign = TokenKind::End; ///< followed by itself and =
};

constexpr std::array<OperatorForms, 256> makeOperators() {
    std::array<OperatorForms, 256> Forms{};
    Forms['('] = {TokenKind::ParenOpen};
    Forms[')'] = {TokenKind::ParenClose};
    Forms['{'] = {TokenKind::BraceOpen};
    Forms['}'] = {TokenKind::BraceClose};
    Forms['['] = {TokenKind::BracketOpen};
    Forms[']'] = {TokenKind::BracketClose};
    Forms[','] = {TokenKind::Comma};
    Forms[';'] = {TokenKind::Semicolon};
    Forms[':'] = {TokenKind::Colon};
    Forms['~'] = {TokenKind::Tilde};
    Forms['='] = {TokenKind::Assign, TokenKind::EqualEqual};
    Forms['!'] = {TokenKind::Not, TokenKind::NotEqual};
    Forms['*'] = {TokenKind::Star, TokenKind::MultiplyAssign};
    Forms['/'] = {TokenKind::Slash, TokenKind::DivideAssign};
    Forms['%'] = {TokenKind::Percent, TokenKind::ModuloAssign};
    Forms['^'] = {TokenKind::BitXor, TokenKind::BitXorAssign};
    Forms['+'] = {TokenKind::Plus, TokenKind::AddAssign, TokenKind::PlusPlus};
    Forms['-'] = {TokenKind::Minus, TokenKind::SubtractAssign, TokenKind::MinusMinus};
    Forms['&'] = {TokenKind::BitAnd, TokenKind::BitAndAssign, TokenKind::AndAnd};
    Forms['|'] = {TokenKind::BitOr, TokenKind::BitOrAssign, TokenKind::OrOr};
    Forms['<'] = {TokenKind::Less, TokenKind::LessEqual, TokenKind::ShiftLeft,
                  TokenKind::ShiftLeftAssign};
    Forms['>'] = {TokenKind::Greater, TokenKind::GreaterEqual, TokenKind::ShiftRight,
                  TokenKind::ShiftRightAssign};
    return Forms;
}

constexpr std::array<OperatorForms, 256> Operators = makeOperators();

constexpr std::array<CharacterClass, 256> makeClasses() {
    std::array<CharacterClass, 256> Classes{};
    for (const unsigned char Blank : {' ', '\t', '\n', '\r', '\f', '\v'}) {
        Classes[Blank] = CharacterClass::Blank;
    }
    for (std::size_t Letter = 0; Letter < 26; ++Letter) {
        Classes['a' + Letter] = CharacterClass::Letter;
        Classes['A' + Letter] = CharacterClass::Letter;
    }
    Classes['_'] = CharacterClass::Letter;
    for (std::size_t Digit = 0; Digit < 10; ++Digit) {
        Classes['0' + Digit] = CharacterClass::Digit;
    }
    for (std::size_t At = 0; At < Classes.size(); ++At) {
        if (Operators[At].Plain != TokenKind::End) {
            Classes[At] = CharacterClass::Operator;
        }
    }
    Classes['"'] = CharacterClass::Quote;
    Classes['\''] = CharacterClass::Quote;
    return Classes;
}

constexpr std::array<CharacterClass, 256> Classes = makeClasses();

CharacterClass classOf(char Character) {
    return Classes[static_cast<unsigned char>(Character)];
}

bool isNamePart(char Character) {
    const CharacterClass Class = classOf(Character);
    return Class == CharacterClass::Letter || Class == CharacterClass::Digit;
}

bool isExponentSign(std::string_view Text, std::size_t At, bool IsHex) {
    return (Text[At] == '+' || Text[At] == '-') && !IsHex &&
           (Text[At - 1] == 'e' || Text[At - 1] == 'E');
}

std::string hexByte(unsigned char Byte) {
    constexpr std::string_view Digits = "0123456789abcdef";
    return {'0', 'x', Digits[Byte >> 4U], Digits[Byte & 15U]};
}

std::string quoted(std::string_view Text) {
    return '\'' + std::string(Text) + '\'';
}

} // namespace

Lexer::Lexer(const SourceFiles& Sources, std::uint32_t File, NameTable& Names,
             Diagnostics& Messages)
    : m_Text(Sources.getText(File)), m_File(File), m_Names(Names), m_Messages(Messages) {
}

TokenList Lexer::run() {
    constexpr std::size_t GreatestSize = std::numeric_limits<std::uint32_t>::max() / 2;
    if (m_Text.size() > GreatestSize) {
        error(0, "the file is too large: 2 GiB are the limit");
        m_Text = {};
    }
    // A token for three characters is about what programs have; room that stays unused is never
    // touched.
    m_List.Tokens.reserve(m_Text.size() / 3 + 2);
    skipByteOrderMark();
    for (skipBlanks(); m_At < m_Text.size() && !m_Messages.isFull(); skipBlanks()) {
        lexToken();
    }
    append(TokenKind::End, m_At);
    append(TokenKind::End, m_At);
    return std::move(m_List);
}

void Lexer::skipByteOrderMark() {
    constexpr std::string_view Mark = "\xEF\xBB\xBF";
    if (m_Text.substr(0, Mark.size()) == Mark) {
        m_At = Mark.size();
    }
}

void Lexer::skipBlanks() {
    while (m_At < m_Text.size()) {
        if (classOf(m_Text[m_At]) == CharacterClass::Blank) {
            ++m_At;
        } else if (m_Text[m_At] != '/') {
            return;
        } else if (peek(1) == '/') {
            m_At = std::min(m_Text.find('\n', m_At), m_Text.size());
        } else if (peek(1) == '*') {
            skipBlockComment();
        } else {
            return;
        }
    }
}

void Lexer::skipBlockComment() {
    const std::size_t Close = m_Text.find("*/", m_At + 2);
    if (Close == std::string_view::npos) {
        error(m_At, "the comment is not closed");
        m_At = m_Text.size();
        return;
    }
    m_At = Close + 2;
}

void Lexer::lexToken() {
    const char First = m_Text[m_At];
    switch (classOf(First)) {
    case CharacterClass::Letter:
        return lexName();
    case CharacterClass::Digit:
        return lexNumber();
    case CharacterClass::Operator:
        return lexOperator(static_cast<unsigned char>(First));
    case CharacterClass::Quote:
        return lexQuoted(First);
    default:
        break;
    }
    if (First == '.' && classOf(peek(1)) == CharacterClass::Digit) {
        return lexNumber();
    }
    lexStray();
}

void Lexer::lexName() {
    const std::size_t Start = m_At;
    const std::size_t Size = m_Text.size();
    std::uint32_t Hash = NameTable::EmptyHash;
    std::size_t At = Start;
    for (; At < Size && isNamePart(m_Text[At]); ++At) {
        Hash = NameTable::addToHash(Hash, m_Text[At]);
    }
    m_At = At;
    if (At - Start > LongestName) {
        error(Start, "the name is longer than 255 characters");
        return append(TokenKind::Bad, Start);
    }
    const std::uint32_t Name = m_Names.intern(m_Text.substr(Start, At - Start), Hash);
    const TokenKind Kind = m_Names[Name].Keyword;
    if (Kind == TokenKind::Type) {
        m_List.TypeDeclarations.push_back(static_cast<std::uint32_t>(m_List.Tokens.size()));
    }
    append(Kind, Start, Name);
}

/// Takes all that could be meant as one number, as C does, so that "12ab" is one mistake and not a
/// number and a name.
void Lexer::lexNumber() {
    const std::size_t Start = m_At;
    const bool IsHex = m_Text[Start] == '0' && (peek(1) | 0x20) == 'x';
    ++m_At;
    while (m_At < m_Text.size() && (isNamePart(m_Text[m_At]) || m_Text[m_At] == '.' ||
                                    isExponentSign(m_Text, m_At, IsHex))) {
        ++m_At;
    }
    double Number = 0.0;
    if (!readNumber(Start, Number)) {
        return append(TokenKind::Bad, Start);
    }
    append(TokenKind::Number, Start, static_cast<std::uint32_t>(m_List.Numbers.size()));
    m_List.Numbers.push_back(Number);
}

bool Lexer::readNumber(std::size_t Start, double& Number) {
    const std::string_view Text = m_Text.substr(Start, m_At - Start);
    if (Text.size() > LongestNumber) {
        error(Start, "the number is longer than 1000 characters");
        return false;
    }
    bool IsValid = false;
    if (Text.size() > 1 && Text[0] == '0' && (Text[1] | 0x20) == 'x') {
        IsValid = readInteger(Text.substr(2), 16, Number);
    } else if (Text.find_first_of(".eE") != std::string_view::npos) {
        IsValid = readFloating(Text, Number);
    } else {
        IsValid = readInteger(Text, 10, Number);
    }
    return IsValid;
}

bool Lexer::readInteger(std::string_view Text, int Radix, double& Number) {
    const std::size_t Start = m_At - Text.size();
    const std::size_t First = Radix == 16 ? Start - 2 : Start;
    const auto Whole = [&] { return quoted(m_Text.substr(First, m_At - First)); };
    std::uint64_t Value = 0;
    const std::from_chars_result Result =
        std::from_chars(Text.data(), Text.data() + Text.size(), Value, Radix);
    if (Result.ec == std::errc::invalid_argument || Result.ptr != Text.data() + Text.size()) {
        error(First, "malformed number " + Whole());
        return false;
    }
    if (Radix == 10 && Text.size() > 1 && Text[0] == '0') {
        error(First, "a decimal number does not begin with 0: " + Whole());
        return false;
    }
    Number = static_cast<double>(Value);
    // Below 2^53 every integer is a double; above, the conversion back tells. 2^64 itself must not
    // be converted back.
    constexpr double TooLarge = 18446744073709551616.0;
    if (Result.ec != std::errc() || Number >= TooLarge ||
        static_cast<std::uint64_t>(Number) != Value) {
        error(First, "integer " + Whole() + " is too large for a float64 to hold it exactly");
        return false;
    }
    return true;
}

bool Lexer::readFloating(std::string_view Text, double& Number) {
    const std::size_t Start = m_At - Text.size();
    const std::from_chars_result Result =
        std::from_chars(Text.data(), Text.data() + Text.size(), Number);
    if (Result.ec == std::errc::invalid_argument || Result.ptr != Text.data() + Text.size()) {
        error(Start, "malformed number " + quoted(Text));
        return false;
    }
    if (Result.ec != std::errc()) {
        error(Start, "number " + quoted(Text) + " is out of the range of float64");
        return false;
    }
    return true;
}

void Lexer::lexOperator(unsigned char First) {
    const OperatorForms& Forms = Operators[First];
    const std::size_t Start = m_At++;
    TokenKind Kind = Forms.Plain;
    if (Forms.Doubled != TokenKind::End && peek() == static_cast<char>(First)) {
        ++m_At;
        Kind = Forms.Doubled;
        if (Forms.DoubledWithAssign != TokenKind::End && peek() == '=') {
            ++m_At;
            Kind = Forms.DoubledWithAssign;
        }
    } else if (Forms.WithAssign != TokenKind::End && peek() == '=') {
        ++m_At;
        Kind = Forms.WithAssign;
    }
    append(Kind, Start);
}

/// Takes the whole of a quoted text, which would otherwise make a message for each of its words.
void Lexer::lexQuoted(char Quote) {
    const std::size_t Start = m_At++;
    while (m_At < m_Text.size() && m_Text[m_At] != Quote && m_Text[m_At] != '\n') {
        ++m_At;
    }
    if (peek() == Quote) {
        ++m_At;
    }
    error(Start, "texts in quotes are not part of the language");
    append(TokenKind::Bad, Start);
}

/// One message and one token for a run of characters that no token begins with.
void Lexer::lexStray() {
    const std::size_t Start = m_At;
    const std::string_view Rest = m_Text.substr(Start);
    const std::size_t Length = utf8Length(Rest);
    const auto First = static_cast<unsigned char>(Rest[0]);
    if (Length == 0) {
        error(Start, "byte " + hexByte(First) + " is not UTF-8");
    } else if (First < 0x20 || First == 0x7F) {
        error(Start, "unexpected control character " + hexByte(First));
    } else {
        error(Start, "unexpected character " + quoted(Rest.substr(0, Length)));
    }
    while (m_At < m_Text.size() && classOf(m_Text[m_At]) == CharacterClass::Stray) {
        ++m_At;
    }
    append(TokenKind::Bad, Start);
}

void Lexer::append(TokenKind Kind, std::size_t Start, std::uint32_t Value) {
    // Only Bad tokens can be longer than any name or number, and nobody looks at their text.
    constexpr std::size_t GreatestLength = 0xFFFFFF;
    Token Piece;
    Piece.Kind = Kind;
    Piece.Length = static_cast<std::uint32_t>(std::min(m_At - Start, GreatestLength)) & 0xFFFFFFU;
    Piece.Offset = static_cast<std::uint32_t>(Start);
    Piece.Value = Value;
    m_List.Tokens.push_back(Piece);
}

void Lexer::error(std::size_t Offset, std::string Text) {
    m_Messages.error({m_File, static_cast<std::uint32_t>(Offset)}, std::move(Text));
}

} // namespace hpn
