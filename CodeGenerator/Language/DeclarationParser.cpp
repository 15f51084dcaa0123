#include "Language/DeclarationParser.h"

#include "Language/TypeChecker.h"

#include <utility>

namespace hpn {

void DeclarationParser::run() {
    while (!m_Cursor.is(TokenKind::End) && !m_State.Messages.isFull()) {
        parseDeclaration();
    }
}

void DeclarationParser::parseDeclaration() {
    const std::uint32_t Begin = m_Cursor.getPlace();
    bool IsRead = false;
    switch (m_Cursor.kind()) {
    case TokenKind::Type:
        IsRead = parseType();
        break;
    case TokenKind::Input:
        IsRead = parseVariable(VariableKind::Input);
        break;
    case TokenKind::Output:
        IsRead = parseVariable(VariableKind::Output);
        break;
    case TokenKind::State:
        IsRead = parseVariable(VariableKind::State);
        break;
    case TokenKind::Param:
        IsRead = parseVariable(VariableKind::Param);
        break;
    case TokenKind::Extern:
        IsRead = parseExtern();
        break;
    case TokenKind::Export:
    case TokenKind::Proc:
        return parseProcedure();
    default:
        return passStray();
    }
    if (!IsRead) {
        m_Cursor.recoverDeclaration();
        m_Cursor.markSuspect(Begin);
    } else if (!m_Cursor.expectSemicolon() && !isDeclarator(m_Cursor.kind())) {
        m_Cursor.recoverDeclaration();
    }
}

void DeclarationParser::passStray() {
    if (!std::exchange(m_IsBodyCut, false)) {
        m_Cursor.expected("a declaration");
    }
    // All up to the next declaration most likely belongs to one mistake, whatever its semicolons.
    while (!m_Cursor.is(TokenKind::End) && !isDeclarator(m_Cursor.kind())) {
        m_Cursor.recoverDeclaration();
    }
}

const Type* DeclarationParser::expectType() {
    const Type* pType = m_Expressions.acceptType();
    if (pType != nullptr) {
        return pType;
    }
    if (m_Cursor.is(TokenKind::Identifier)) {
        m_Cursor.error(m_Cursor.position(),
                       quotedName(m_Cursor.text()) + " is not the name of a type");
    } else {
        m_Cursor.expected("the name of a type");
    }
    return nullptr;
}

bool DeclarationParser::parseType() {
    m_Cursor.advance();
    if (!m_Cursor.is(TokenKind::Identifier)) {
        m_Cursor.expected("the new type's name");
        return false;
    }
    NameEntry& Entry = m_Cursor.name();
    const SourcePosition Position = m_Cursor.position();
    Type Second; // takes the options of a type declared twice
    Type* pDeclared = Entry.Kind == SymbolKind::Type ? Entry.pType : nullptr;
    if (pDeclared == nullptr || pDeclared->Position.File != Position.File ||
        pDeclared->Position.Offset != Position.Offset) {
        m_State.isFree(Entry, Position);
        pDeclared = &Second;
    }
    m_Cursor.advance();
    if (!m_Cursor.expect(TokenKind::Assign, "'='")) {
        return false;
    }
    if (!isBuiltInType(m_Cursor.kind())) {
        m_Cursor.expected("the name of a built-in type");
        return false;
    }
    pDeclared->Base = m_Expressions.acceptType()->Base;
    return parseTypeOptions(*pDeclared);
}

bool DeclarationParser::parseTypeOptions(Type& Declared) {
    TypeChecker Checker(m_State.Messages, Declared);
    while (m_Cursor.is(TokenKind::Identifier)) {
        const std::string_view Option = m_Cursor.text();
        const SourcePosition Position = m_Cursor.position();
        m_Cursor.advance();
        Checker.enterOption(Option, Position);
        if (!parseTypeOption(Declared, Option, Position)) {
            return false;
        }
    }
    Checker.check();
    return true;
}

bool DeclarationParser::parseTypeOption(Type& Declared, std::string_view Option,
                                        SourcePosition Position) {
    Expression* pRoot = nullptr;
    if (Option == "lsb") {
        return m_Expressions.parseConstant(NameUse::None, Declared.Lsb, pRoot);
    }
    if (Option == "offset") {
        return m_Expressions.parseConstant(NameUse::None, Declared.Offset, pRoot);
    }
    if (Option == "range") {
        return parseRange(Declared);
    }
    if (Option == "saturate") {
        return parseSaturation(Declared);
    }
    m_Cursor.error(Position, "expected 'lsb', 'offset', 'range', 'saturate' or ';' before " +
                                 quotedName(Option));
    return false;
}

bool DeclarationParser::parseRange(Type& Declared) {
    Expression* pRoot = nullptr;
    Declared.HasRange = true;
    return m_Cursor.expect(TokenKind::BracketOpen, "'['") &&
           m_Expressions.parseConstant(NameUse::None, Declared.Lower, pRoot) &&
           m_Cursor.expect(TokenKind::Comma, "','") &&
           m_Expressions.parseConstant(NameUse::None, Declared.Upper, pRoot) &&
           m_Cursor.expect(TokenKind::BracketClose, "']'");
}

bool DeclarationParser::parseSaturation(Type& Declared) {
    const bool IsNamed = m_Cursor.is(TokenKind::Identifier);
    const bool IsLow = IsNamed && m_Cursor.text() == "low";
    const bool IsHigh = IsNamed && m_Cursor.text() == "high";
    Declared.SaturatesLow = !IsHigh;
    Declared.SaturatesHigh = !IsLow;
    if (IsLow || IsHigh) {
        m_Cursor.advance();
    }
    return true;
}

bool DeclarationParser::parseVariable(VariableKind Kind) {
    m_Cursor.advance();
    const Type* pType = expectType();
    if (pType == nullptr) {
        return false;
    }
    if (!m_Cursor.is(TokenKind::Identifier)) {
        m_Cursor.expected("the variable's name");
        return false;
    }
    NameEntry& Entry = m_Cursor.name();
    const SourcePosition Position = m_Cursor.position();
    m_Cursor.advance();
    PendingVariable Pending;
    Pending.pVariable = m_State.makeVariable(Kind, Entry.Text, Position);
    Pending.pVariable->pType = pType;
    const bool IsFree = m_State.isFree(Entry, Position);
    const std::size_t ErrorsBefore = m_State.Messages.getErrorCount();
    const bool IsRead = parseCount(Pending) && parseInitializer(Pending);
    // Entered behind its own initialiser, which must not use it.
    if (IsFree) {
        Entry.Kind = SymbolKind::Variable;
        Entry.pVariable = Pending.pVariable;
    }
    // Numbers with a mistake in them would only be a second mistake.
    if (IsRead && m_State.Messages.getErrorCount() == ErrorsBefore) {
        m_State.Variables.push_back(Pending);
    }
    return IsRead;
}

bool DeclarationParser::parseCount(PendingVariable& Pending) {
    if (!m_Cursor.accept(TokenKind::BracketOpen)) {
        return true;
    }
    Pending.pVariable->Count = 1;
    Pending.pCount = m_Expressions.parse(NameUse::Params).pRoot;
    return Pending.pCount != nullptr && m_Cursor.expect(TokenKind::BracketClose, "']'");
}

bool DeclarationParser::parseInitializer(PendingVariable& Pending) {
    if (!m_Cursor.accept(TokenKind::Assign)) {
        return true;
    }
    Variable& Target = *Pending.pVariable;
    Target.HasInitializer = true;
    Pending.InitializerPosition = m_Cursor.position();
    Pending.HasBraces = m_Cursor.accept(TokenKind::BraceOpen);
    if (Pending.HasBraces) {
        return parseInitialList(Target.pInitializer);
    }
    Target.pInitializer = m_Expressions.parse(NameUse::Params).pRoot;
    return Target.pInitializer != nullptr;
}

/// One value at least; a comma may follow the last.
bool DeclarationParser::parseInitialList(Expression*& pFirst) {
    Expression** ppNext = &pFirst;
    do {
        if (pFirst != nullptr && m_Cursor.is(TokenKind::BraceClose)) {
            break;
        }
        Expression* pValue = m_Expressions.parse(NameUse::Params).pRoot;
        if (pValue == nullptr) {
            return false;
        }
        *ppNext = pValue;
        ppNext = &pValue->pNext;
    } while (m_Cursor.accept(TokenKind::Comma));
    return m_Cursor.expect(TokenKind::BraceClose, "'}'");
}

bool DeclarationParser::parseExtern() {
    m_Cursor.advance();
    if (!m_Cursor.is(TokenKind::Identifier)) {
        m_Cursor.expected("the extern's name");
        return false;
    }
    NameEntry& Entry = m_Cursor.name();
    Extern& Declared = m_State.Target.Externs.emplace_back();
    Declared.Name = Entry.Text;
    Declared.Position = m_Cursor.position();
    if (m_State.isFree(Entry, Declared.Position)) {
        Entry.Kind = SymbolKind::Extern;
        Entry.pExtern = &Declared;
    }
    m_Cursor.advance();
    bool IsListed[2] = {false, false};
    while (m_Cursor.is(TokenKind::Identifier)) {
        const bool IsWrite = m_Cursor.text() == "writes";
        if (!IsWrite && m_Cursor.text() != "reads") {
            m_Cursor.expected("'reads', 'writes' or ';'");
            return false;
        }
        if (std::exchange(IsListed[IsWrite ? 1 : 0], true)) {
            m_Cursor.error(m_Cursor.position(), quotedName(m_Cursor.text()) + " stands twice");
        }
        m_Cursor.advance();
        if (!parseAccesses(Declared, IsWrite)) {
            return false;
        }
    }
    return true;
}

bool DeclarationParser::parseAccesses(Extern& Declared, bool IsWrite) {
    if (!m_Cursor.expect(TokenKind::ParenOpen, "'('")) {
        return false;
    }
    if (m_Cursor.accept(TokenKind::ParenClose)) {
        return true;
    }
    do {
        if (!m_Cursor.is(TokenKind::Identifier)) {
            m_Cursor.expected("the name of a variable");
            return false;
        }
        m_State.Accesses.push_back(
            {&Declared, IsWrite, m_Cursor.current().Value, m_Cursor.position()});
        m_Cursor.advance();
    } while (m_Cursor.accept(TokenKind::Comma));
    return m_Cursor.expect(TokenKind::ParenClose, "')'");
}

void DeclarationParser::parseProcedure() {
    const std::uint32_t Begin = m_Cursor.getPlace();
    Procedure& Declared = m_State.Target.Procedures.emplace_back();
    Declared.Index = static_cast<std::uint32_t>(m_State.Target.Procedures.size() - 1);
    Declared.Position = m_Cursor.position();
    Declared.IsExported = m_Cursor.accept(TokenKind::Export);
    if (!m_Cursor.expect(TokenKind::Proc, "'proc'")) {
        return m_Cursor.recoverDeclaration();
    }
    bool HasBody = parseProcedureHeader(Declared);
    if (HasBody && !m_Cursor.is(TokenKind::BraceOpen)) {
        m_Cursor.expected("the procedure's '{'");
        HasBody = false;
    }
    if (!HasBody) {
        HasBody = m_Cursor.recoverToBody();
        m_Cursor.markSuspect(Begin);
    }
    if (HasBody) {
        m_State.Bodies.push_back({&Declared, m_File, m_Cursor.getPlace()});
        passBody();
    }
}

/// The current token is the procedure's name and not its result type. A name that is no type, with
/// no name behind it, lacks its parentheses.
bool DeclarationParser::startsName() const {
    return m_Cursor.is(TokenKind::Identifier) && (m_Cursor.nextKind() == TokenKind::ParenOpen ||
                                                  (m_Cursor.name().Kind != SymbolKind::Type &&
                                                   m_Cursor.nextKind() != TokenKind::Identifier));
}

bool DeclarationParser::parseProcedureHeader(Procedure& Declared) {
    if (!startsName()) {
        const Type* pType = expectType();
        if (pType == nullptr) {
            return false;
        }
        Declared.pResult = m_State.makeVariable(VariableKind::Result, {}, Declared.Position);
        Declared.pResult->pType = pType;
        Declared.pResult->pOwner = &Declared;
    }
    if (!m_Cursor.is(TokenKind::Identifier)) {
        m_Cursor.expected("the procedure's name");
        return false;
    }
    NameEntry& Entry = m_Cursor.name();
    Declared.Name = Entry.Text;
    Declared.Position = m_Cursor.position();
    if (Declared.pResult != nullptr) {
        Declared.pResult->Name = Entry.Text;
        Declared.pResult->Position = Declared.Position;
    }
    if (m_State.isFree(Entry, Declared.Position)) {
        Entry.Kind = SymbolKind::Procedure;
        Entry.pProcedure = &Declared;
    }
    m_Cursor.advance();
    return m_Cursor.expect(TokenKind::ParenOpen, "'('") && parseFormals(Declared);
}

bool DeclarationParser::parseFormals(Procedure& Declared) {
    if (m_Cursor.accept(TokenKind::ParenClose)) {
        return true;
    }
    do {
        const Type* pType = expectType();
        if (pType == nullptr) {
            return false;
        }
        if (!m_Cursor.is(TokenKind::Identifier)) {
            m_Cursor.expected("the formal's name");
            return false;
        }
        Variable* pFormal =
            m_State.makeVariable(VariableKind::Formal, m_Cursor.name().Text, m_Cursor.position());
        pFormal->pType = pType;
        pFormal->pOwner = &Declared;
        Declared.Formals.push_back(pFormal);
        m_Cursor.advance();
        if (m_Cursor.is(TokenKind::BracketOpen)) {
            m_Cursor.error(m_Cursor.position(), "a formal cannot be an array");
            return false;
        }
    } while (m_Cursor.accept(TokenKind::Comma));
    return m_Cursor.expect(TokenKind::ParenClose, "')'");
}

/// To behind the brace that closes the body. A declaration's first word ends it too: then the brace
/// is missing, which is reported when the body is read.
void DeclarationParser::passBody() {
    std::size_t Depth = 0;
    do {
        if (m_Cursor.is(TokenKind::BraceOpen)) {
            ++Depth;
        } else if (m_Cursor.is(TokenKind::BraceClose)) {
            --Depth;
        }
        m_Cursor.advance();
    } while (Depth > 0 && !m_Cursor.is(TokenKind::End) && !isDeclarator(m_Cursor.kind()));
    m_IsBodyCut = Depth > 0;
}

} // namespace hpn
