#ifndef TOKENCURSOR_H
#define TOKENCURSOR_H

#include "Language/Diagnostics.h"
#include "Language/NameTable.h"
#include "Language/SourceFiles.h"
#include "Language/Token.h"

#include <cstdint>
#include <string>
#include <string_view>

namespace hpn {

/// A place in one file's tokens, with what every parser needs there: look, go on, complain, take up
/// again after a mistake. Never leaves the list: the End token is not passed.
class TokenCursor {
public:
    TokenCursor(const SourceFiles& Sources, std::uint32_t File, const TokenList& List,
                NameTable& Names, Diagnostics& Messages)
        : m_Text(Sources.getText(File)), m_File(File), m_List(List), m_Names(Names),
          m_Messages(Messages), m_pToken(List.Tokens.data()) {}

    const Token& current() const { return *m_pToken; }
    TokenKind kind() const { return m_pToken->Kind; }
    /// Kind of the token behind the current one.
    TokenKind nextKind() const { return kind() == TokenKind::End ? kind() : m_pToken[1].Kind; }
    bool is(TokenKind Kind) const { return m_pToken->Kind == Kind; }
    void advance() {
        if (m_pToken->Kind != TokenKind::End) {
            ++m_pToken;
        }
    }
    bool accept(TokenKind Kind) {
        if (m_pToken->Kind != Kind) {
            return false;
        }
        advance();
        return true;
    }
    /// Passes the token or says "expected WHAT before ...".
    bool expect(TokenKind Kind, const char* What);
    /// A semicolon. If it is missing, the mistake is shown behind the token before, where it should
    /// have been.
    bool expectSemicolon();

    std::uint32_t getPlace() const {
        return static_cast<std::uint32_t>(m_pToken - m_List.Tokens.data());
    }
    void setPlace(std::uint32_t Place) { m_pToken = &m_List.Tokens[Place]; }

    std::string_view text() const { return m_Text.substr(m_pToken->Offset, m_pToken->Length); }
    double number() const { return m_List.Numbers[m_pToken->Value]; }
    NameEntry& name() const { return m_Names[m_pToken->Value]; }
    SourcePosition position() const { return {m_File, m_pToken->Offset}; }
    const Diagnostics& messages() const { return m_Messages; }

    void error(SourcePosition Position, std::string Text) const {
        m_Messages.error(Position, std::move(Text));
    }
    void warning(SourcePosition Position, std::string Text) const {
        m_Messages.warning(Position, std::move(Text));
    }
    /// "expected WHAT before the current token"; silent if the lexer has complained about that
    /// token.
    void expected(const char* What) const;
    /// The token begins a line.
    bool isFirstOnLine() const;

    // Taking up again after a mistake. Names that are passed over become suspect: what they would
    // have declared is unknown.

    /// To behind the next semicolon, or in front of a brace, a statement's keyword, a declaration
    /// or the end.
    void recoverStatement();
    /// To behind the parenthesis that closes the one already open, or in front of what begins or
    /// ends a statement.
    void recoverParenthesis();
    /// The same in the head of a `for`, which holds semicolons.
    void recoverForHead();
    /// To behind the next semicolon, or in front of the next declaration.
    void recoverDeclaration();
    /// To the opening brace of a procedure's body; false if none comes.
    bool recoverToBody();
    void markSuspect(std::uint32_t From) const;

private:
    bool isRecoveryPoint() const;
    void recoverParenthesis(bool PassSemicolons);
    void pass();

    std::string_view m_Text;
    std::uint32_t m_File;
    const TokenList& m_List;
    NameTable& m_Names;
    Diagnostics& m_Messages;
    const Token* m_pToken;
};

} // namespace hpn

#endif
