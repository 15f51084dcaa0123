#ifndef LEXER_H
#define LEXER_H

#include "Language/Diagnostics.h"
#include "Language/NameTable.h"
#include "Language/SourceFiles.h"
#include "Language/Token.h"

#include <cstdint>
#include <string>
#include <string_view>

namespace hpn {

/// Cuts one file into tokens, in one pass over its bytes. Whatever the bytes are, it comes to the
/// end: what is no part of the language becomes a Bad token and one message, and the parser keeps
/// quiet about it. Comments may hold any bytes.
class Lexer {
public:
    Lexer(const SourceFiles& Sources, std::uint32_t File, NameTable& Names, Diagnostics& Messages);

    TokenList run();

private:
    void skipByteOrderMark();
    /// Passes over blanks and comments.
    void skipBlanks();
    void skipBlockComment();
    void lexToken();
    void lexName();
    void lexNumber();
    void lexOperator(unsigned char First);
    void lexQuoted(char Quote);
    void lexStray();

    /// Value of the literal [Start, m_At). False after a message.
    bool readNumber(std::size_t Start, double& Number);
    bool readInteger(std::string_view Text, int Radix, double& Number);
    bool readFloating(std::string_view Text, double& Number);

    char peek(std::size_t Ahead = 0) const {
        return m_At + Ahead < m_Text.size() ? m_Text[m_At + Ahead] : '\0';
    }
    void append(TokenKind Kind, std::size_t Start, std::uint32_t Value = 0);
    void error(std::size_t Offset, std::string Text);

    std::string_view m_Text;
    std::uint32_t m_File;
    NameTable& m_Names;
    Diagnostics& m_Messages;
    std::size_t m_At = 0;
    TokenList m_List;
};

} // namespace hpn

#endif
