#include "Language/TokenCursor.h"

namespace hpn {

bool TokenCursor::expect(TokenKind Kind, const char* What) {
    if (accept(Kind)) {
        return true;
    }
    expected(What);
    return false;
}

bool TokenCursor::expectSemicolon() {
    if (accept(TokenKind::Semicolon)) {
        return true;
    }
    const Token* pBefore = m_pToken == m_List.Tokens.data() ? m_pToken : m_pToken - 1;
    if (is(TokenKind::Bad) || pBefore->Kind == TokenKind::Bad) {
        return false;
    }
    error({m_File, pBefore->Offset + pBefore->Length}, "expected ';'");
    return false;
}

void TokenCursor::expected(const char* What) const {
    if (is(TokenKind::Bad)) {
        return;
    }
    std::string Text = std::string("expected ") + What + " before ";
    if (is(TokenKind::End)) {
        Text += "the end of the file";
    } else {
        Text.append("'").append(text()).append("'");
    }
    error(position(), std::move(Text));
}

bool TokenCursor::isFirstOnLine() const {
    if (m_pToken == m_List.Tokens.data()) {
        return true;
    }
    const std::size_t Behind = m_pToken[-1].Offset + m_pToken[-1].Length;
    const std::string_view Between = m_Text.substr(Behind, m_pToken->Offset - Behind);
    return Between.find('\n') != std::string_view::npos;
}

bool TokenCursor::isRecoveryPoint() const {
    const TokenKind Kind = kind();
    return Kind == TokenKind::End || Kind == TokenKind::BraceOpen ||
           Kind == TokenKind::BraceClose || isDeclarator(Kind) || isStatementKeyword(Kind);
}

void TokenCursor::pass() {
    if (is(TokenKind::Identifier)) {
        name().IsSuspect = true;
    }
    advance();
}

void TokenCursor::recoverStatement() {
    while (!isRecoveryPoint() && !is(TokenKind::Semicolon)) {
        pass();
    }
    accept(TokenKind::Semicolon);
}

void TokenCursor::recoverParenthesis() {
    recoverParenthesis(false);
}

void TokenCursor::recoverForHead() {
    recoverParenthesis(true);
}

void TokenCursor::recoverParenthesis(bool PassSemicolons) {
    for (std::size_t Depth = 0; !isRecoveryPoint(); pass()) {
        if (is(TokenKind::Semicolon) && !PassSemicolons) {
            return;
        }
        if (is(TokenKind::ParenOpen)) {
            ++Depth;
        } else if (is(TokenKind::ParenClose) && Depth-- == 0) {
            advance();
            return;
        }
    }
}

void TokenCursor::recoverDeclaration() {
    while (!is(TokenKind::End) && !isDeclarator(kind()) && !is(TokenKind::Semicolon)) {
        pass();
    }
    accept(TokenKind::Semicolon);
}

bool TokenCursor::recoverToBody() {
    while (!is(TokenKind::End) && !isDeclarator(kind()) && !is(TokenKind::Semicolon) &&
           !is(TokenKind::BraceOpen)) {
        pass();
    }
    if (is(TokenKind::BraceOpen)) {
        return true;
    }
    accept(TokenKind::Semicolon);
    return false;
}

void TokenCursor::markSuspect(std::uint32_t From) const {
    for (std::uint32_t Place = From; Place < getPlace(); ++Place) {
        if (m_List.Tokens[Place].Kind == TokenKind::Identifier) {
            m_Names[m_List.Tokens[Place].Value].IsSuspect = true;
        }
    }
}

} // namespace hpn
