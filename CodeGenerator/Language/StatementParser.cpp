#include "Language/StatementParser.h"

namespace hpn {

namespace {

/// The operator of a compound assignment; the tokens stand in this order.
constexpr Operator CompoundOperators[] = {
    Operator::Multiply, Operator::Divide,    Operator::Modulo,     Operator::Add,
    Operator::Subtract, Operator::ShiftLeft, Operator::ShiftRight, Operator::BitAnd,
    Operator::BitXor,   Operator::BitOr};

bool isCompoundAssign(TokenKind Kind) {
    return isBetween(Kind, TokenKind::MultiplyAssign, TokenKind::BitOrAssign);
}

Operator compoundOperator(TokenKind Kind) {
    return CompoundOperators[static_cast<std::size_t>(Kind) -
                             static_cast<std::size_t>(TokenKind::MultiplyAssign)];
}

} // namespace

void StatementParser::parseBody(Procedure& Owner) {
    m_pOwner = &Owner;
    m_OpenLoops = 0;
    m_OpenSwitches = 0;
    declareFormals();
    open(FrameKind::Body, nullptr, &Owner.pBody, 0);
    while (!m_Frames.empty()) {
        parseNext();
    }
    finishProcedure();
}

void StatementParser::declareFormals() {
    for (Variable* pFormal : m_pOwner->Formals) {
        // The table finds the entry by the name's own hash; formals are few.
        std::uint32_t Hash = NameTable::EmptyHash;
        for (char Character : pFormal->Name) {
            Hash = NameTable::addToHash(Hash, Character);
        }
        declareLocal(m_State.Names[m_State.Names.intern(pFormal->Name, Hash)], pFormal);
    }
}

void StatementParser::declareLocal(NameEntry& Entry, Variable* pVariable) {
    if (Entry.pLocal != nullptr) {
        m_Cursor.error(pVariable->Position, quotedName(Entry.Text) + " is already declared at " +
                                                m_State.Messages.describe(Entry.pLocal->Position));
        return;
    }
    if (!m_State.isFree(Entry, pVariable->Position)) {
        return;
    }
    Entry.pLocal = pVariable;
    m_Visible.push_back(&Entry);
}

void StatementParser::closeScope(std::size_t FirstLocal) {
    while (m_Visible.size() > FirstLocal) {
        m_Visible.back()->pLocal = nullptr;
        m_Visible.pop_back();
    }
}

void StatementParser::resolveGotos() {
    for (const GotoRecord& Jump : m_Gotos) {
        NameEntry& Entry = m_State.Names[Jump.Name];
        if (Entry.LabelNumber == 0) {
            m_Cursor.error(Jump.pStatement->Position,
                           "label " + quotedName(Entry.Text) + " is not in this procedure");
            continue;
        }
        LabelRecord& Label = m_Labels[Entry.LabelNumber - 1];
        Label.IsUsed = true;
        Jump.pStatement->pLabel = Label.pStatement;
    }
}

void StatementParser::finishProcedure() {
    resolveGotos();
    // A mistake can have hidden the goto.
    const bool IsComplete = !m_State.Messages.hasErrors();
    for (const LabelRecord& Label : m_Labels) {
        NameEntry& Entry = m_State.Names[Label.Name];
        if (!Label.IsUsed && IsComplete) {
            m_Cursor.warning(Label.pStatement->Position,
                             "no 'goto' reaches label " + quotedName(Entry.Text));
        }
        Entry.LabelNumber = 0;
    }
    m_Labels.clear();
    m_Gotos.clear();
    m_Cases.clear();
    closeScope(0);
}

void StatementParser::parseNext() {
    if (m_Cursor.is(TokenKind::End) || isDeclarator(m_Cursor.kind())) {
        m_Cursor.expected("'}'");
        m_Frames.clear();
        return;
    }
    if (m_State.Messages.isFull()) {
        m_Frames.clear();
        return;
    }
    m_ErrorsBefore = m_State.Messages.getErrorCount();
    switch (m_Cursor.kind()) {
    case TokenKind::BraceOpen: {
        Statement* pBlock = makeStatement(StatementKind::Block, m_Cursor.position());
        append(pBlock);
        return open(FrameKind::Block, pBlock, &pBlock->pBody, m_Visible.size());
    }
    case TokenKind::BraceClose:
        return closeBrace();
    case TokenKind::If:
        return parseIf();
    case TokenKind::While:
        return parseWhile();
    case TokenKind::Do:
        return parseDo();
    case TokenKind::For:
        return parseFor();
    case TokenKind::Switch:
        return parseSwitch();
    case TokenKind::Case:
        return parseCase();
    case TokenKind::Default:
        return parseDefault();
    default:
        break;
    }
    if (m_Cursor.is(TokenKind::Identifier) && m_Cursor.nextKind() == TokenKind::Colon) {
        return parseLabel();
    }
    parseSimpleStatement();
}

void StatementParser::closeBrace() {
    // One message for all statements that end here without their inner one.
    if (!m_Frames.back().IsBraced && !m_Frames.back().HasBadHead) {
        m_Cursor.expected("a statement");
    }
    while (!m_Frames.back().IsBraced) {
        popFrame();
    }
    m_Cursor.advance();
    if (closeFrame()) {
        complete();
    }
}

Statement* StatementParser::makeStatement(StatementKind Kind, SourcePosition Position) {
    Statement* pStatement = m_State.Target.newStatement();
    pStatement->Kind = Kind;
    pStatement->Position = Position;
    return pStatement;
}

void StatementParser::append(Statement* pStatement) {
    Frame& Innermost = m_Frames.back();
    *Innermost.ppNext = pStatement;
    for (; pStatement != nullptr; pStatement = pStatement->pNext) {
        Innermost.ppNext = &pStatement->pNext;
    }
}

void StatementParser::open(FrameKind Kind, Statement* pStatement, Statement** ppFirst,
                           std::size_t FirstLocal) {
    const bool IsBraced = m_Cursor.accept(TokenKind::BraceOpen);
    const bool HasBadHead = m_State.Messages.getErrorCount() != m_ErrorsBefore;
    m_Frames.push_back({Kind, IsBraced, false, HasBadHead, pStatement, ppFirst, FirstLocal});
}

void StatementParser::complete() {
    while (!m_Frames.empty() && !m_Frames.back().IsBraced && closeFrame()) {
    }
}

bool StatementParser::closeFrame() {
    Frame& Innermost = m_Frames.back();
    closeScope(Innermost.FirstLocal);
    const FrameKind Kind = Innermost.Kind;
    Statement* pStatement = Innermost.pStatement;
    if (Kind == FrameKind::Then && m_Cursor.is(TokenKind::Else)) {
        return continueWithElse(Innermost);
    }
    popFrame();
    if (Kind == FrameKind::Do) {
        finishDo(pStatement);
    }
    return Kind != FrameKind::Body;
}

void StatementParser::popFrame() {
    const Frame& Innermost = m_Frames.back();
    const FrameKind Kind = Innermost.Kind;
    closeScope(Innermost.FirstLocal);
    if (Kind == FrameKind::While || Kind == FrameKind::For || Kind == FrameKind::Do) {
        --m_OpenLoops;
    } else if (Kind == FrameKind::Switch) {
        --m_OpenSwitches;
    }
    m_Frames.pop_back();
}

/// `else if` takes the place of its `if` on the stack, so that a long chain stays flat.
bool StatementParser::continueWithElse(Frame& Innermost) {
    m_Cursor.advance();
    Statement* pIf = Innermost.pStatement;
    const std::size_t ErrorsBefore = m_State.Messages.getErrorCount();
    if (m_Cursor.is(TokenKind::If)) {
        Statement* pNested = makeStatement(StatementKind::If, m_Cursor.position());
        m_Cursor.advance();
        pNested->pCondition = parseCondition();
        pIf->pElse = pNested;
        Innermost.pStatement = pNested;
        Innermost.ppNext = &pNested->pBody;
    } else {
        Innermost.Kind = FrameKind::Else;
        Innermost.ppNext = &pIf->pElse;
    }
    Innermost.IsBraced = m_Cursor.accept(TokenKind::BraceOpen);
    Innermost.HasBadHead = m_State.Messages.getErrorCount() != ErrorsBefore;
    return false;
}

void StatementParser::finishDo(Statement* pDo) {
    if (!m_Cursor.expect(TokenKind::While, "'while'")) {
        pDo->pCondition = m_State.Target.newExpression();
        return m_Cursor.recoverStatement();
    }
    pDo->pCondition = parseCondition();
    if (!m_Cursor.expectSemicolon()) {
        m_Cursor.recoverStatement();
    }
}

Expression* StatementParser::parseCondition() {
    if (m_Cursor.expect(TokenKind::ParenOpen, "'('")) {
        const ParsedExpression Condition = m_Expressions.parse();
        if (Condition && m_Cursor.expect(TokenKind::ParenClose, "')'")) {
            return Condition.pRoot;
        }
    }
    m_Cursor.recoverParenthesis();
    return m_State.Target.newExpression();
}

void StatementParser::parseIf() {
    Statement* pIf = makeStatement(StatementKind::If, m_Cursor.position());
    m_Cursor.advance();
    pIf->pCondition = parseCondition();
    append(pIf);
    open(FrameKind::Then, pIf, &pIf->pBody, m_Visible.size());
}

void StatementParser::parseWhile() {
    Statement* pWhile = makeStatement(StatementKind::While, m_Cursor.position());
    m_Cursor.advance();
    pWhile->pCondition = parseCondition();
    append(pWhile);
    ++m_OpenLoops;
    open(FrameKind::While, pWhile, &pWhile->pBody, m_Visible.size());
}

void StatementParser::parseDo() {
    Statement* pDo = makeStatement(StatementKind::DoWhile, m_Cursor.position());
    m_Cursor.advance();
    append(pDo);
    ++m_OpenLoops;
    open(FrameKind::Do, pDo, &pDo->pBody, m_Visible.size());
}

void StatementParser::parseFor() {
    Statement* pFor = makeStatement(StatementKind::For, m_Cursor.position());
    const std::size_t FirstLocal = m_Visible.size();
    m_Cursor.advance();
    m_IsHead = true;
    if (!parseForHead(*pFor)) {
        m_Cursor.recoverForHead();
    }
    m_IsHead = false;
    append(pFor);
    ++m_OpenLoops;
    open(FrameKind::For, pFor, &pFor->pBody, FirstLocal);
}

bool StatementParser::parseForHead(Statement& For) {
    if (!m_Cursor.expect(TokenKind::ParenOpen, "'('")) {
        return false;
    }
    if (!m_Cursor.is(TokenKind::Semicolon)) {
        For.pInit = m_Cursor.is(TokenKind::Local) ? parseLocal() : parseNamed();
        if (For.pInit == nullptr) {
            return false;
        }
    }
    if (!m_Cursor.expectSemicolon()) {
        return false;
    }
    if (!m_Cursor.is(TokenKind::Semicolon)) {
        For.pCondition = m_Expressions.parse().pRoot;
        if (For.pCondition == nullptr) {
            return false;
        }
    }
    if (!m_Cursor.expectSemicolon()) {
        return false;
    }
    if (!m_Cursor.is(TokenKind::ParenClose)) {
        const bool IsPrefix =
            m_Cursor.is(TokenKind::PlusPlus) || m_Cursor.is(TokenKind::MinusMinus);
        For.pStep = IsPrefix ? parseStepPrefix() : parseNamed();
        if (For.pStep == nullptr) {
            return false;
        }
    }
    return m_Cursor.expect(TokenKind::ParenClose, "')'");
}

void StatementParser::parseSwitch() {
    Statement* pSwitch = makeStatement(StatementKind::Switch, m_Cursor.position());
    m_Cursor.advance();
    pSwitch->pCondition = parseCondition();
    append(pSwitch);
    if (!m_Cursor.is(TokenKind::BraceOpen)) {
        m_Cursor.expected("'{'");
    }
    ++m_OpenSwitches;
    open(FrameKind::Switch, pSwitch, &pSwitch->pBody, m_Visible.size());
    // The brace has been missed already, the one that closes it most likely stands there.
    m_Frames.back().IsBraced |= m_Cursor.is(TokenKind::Case) || m_Cursor.is(TokenKind::Default);
}

StatementParser::Frame* StatementParser::innermostSwitch(const char* Label) {
    Frame& Innermost = m_Frames.back();
    if (Innermost.Kind == FrameKind::Switch) {
        return &Innermost;
    }
    m_Cursor.error(m_Cursor.position(),
                   std::string("'") + Label + "' does not stand among the statements of a switch");
    return nullptr;
}

void StatementParser::parseCase() {
    const Frame* pSwitch = innermostSwitch("case");
    Statement* pCase = makeStatement(StatementKind::Case, m_Cursor.position());
    m_Cursor.advance();
    const SourcePosition Position = m_Cursor.position();
    double Number = 0.0;
    if (!m_Expressions.parseConstant(NameUse::Params, Number, pCase->pCondition) ||
        !m_Cursor.expect(TokenKind::Colon, "':'")) {
        return m_Cursor.recoverStatement();
    }
    if (pSwitch == nullptr) {
        return;
    }
    if (Number != Number) {
        m_Cursor.error(Position, "a case must be a number");
    } else if (!m_Cases.insert({pSwitch->pStatement, Number + 0.0}).second) {
        m_Cursor.error(Position, "this case stands twice");
    }
    append(pCase);
}

void StatementParser::parseDefault() {
    Frame* pSwitch = innermostSwitch("default");
    Statement* pDefault = makeStatement(StatementKind::Default, m_Cursor.position());
    m_Cursor.advance();
    if (!m_Cursor.expect(TokenKind::Colon, "':'")) {
        return m_Cursor.recoverStatement();
    }
    if (pSwitch == nullptr) {
        return;
    }
    if (pSwitch->HasDefault) {
        m_Cursor.error(pDefault->Position, "'default' stands twice");
    }
    pSwitch->HasDefault = true;
    append(pDefault);
}

void StatementParser::parseLabel() {
    NameEntry& Entry = m_Cursor.name();
    Statement* pLabel = makeStatement(StatementKind::Label, m_Cursor.position());
    pLabel->Name = Entry.Text;
    if (Entry.LabelNumber != 0) {
        const Statement* pFirst = m_Labels[Entry.LabelNumber - 1].pStatement;
        m_Cursor.error(pLabel->Position, "label " + quotedName(Entry.Text) + " already stands at " +
                                             m_State.Messages.describe(pFirst->Position));
    } else {
        m_Labels.push_back({pLabel, m_Cursor.current().Value, false});
        Entry.LabelNumber = static_cast<std::uint32_t>(m_Labels.size());
        append(pLabel);
    }
    m_Cursor.advance();
    m_Cursor.advance();
}

void StatementParser::parseSimpleStatement() {
    const std::uint32_t Begin = m_Cursor.getPlace();
    Statement* pStatement = parseSimple();
    if (pStatement != nullptr) {
        append(pStatement);
    } else {
        if (m_Cursor.getPlace() == Begin) {
            m_Cursor.advance();
        }
        m_Cursor.recoverStatement();
    }
    if (pStatement != nullptr && !m_Cursor.expectSemicolon() && !m_Cursor.isFirstOnLine()) {
        m_Cursor.recoverStatement();
    }
    complete();
}

Statement* StatementParser::parseSimple() {
    switch (m_Cursor.kind()) {
    case TokenKind::Semicolon:
        return makeStatement(StatementKind::Empty, m_Cursor.position());
    case TokenKind::Local:
        if (!m_Frames.back().IsBraced) {
            m_Cursor.error(m_Cursor.position(), "a declaration needs braces around it here");
        }
        return parseLocal();
    case TokenKind::Break:
    case TokenKind::Continue:
        return parseLeave();
    case TokenKind::Return:
        return parseReturn();
    case TokenKind::Goto:
        return parseGoto();
    case TokenKind::PlusPlus:
    case TokenKind::MinusMinus:
        return parseStepPrefix();
    case TokenKind::Else:
        m_Cursor.error(m_Cursor.position(), "this 'else' belongs to no 'if'");
        return nullptr;
    default:
        return parseNamed();
    }
}

Statement* StatementParser::parseLeave() {
    const bool IsBreak = m_Cursor.is(TokenKind::Break);
    Statement* pLeave = makeStatement(IsBreak ? StatementKind::Break : StatementKind::Continue,
                                      m_Cursor.position());
    if (m_OpenLoops == 0 && !(IsBreak && m_OpenSwitches != 0)) {
        m_Cursor.error(pLeave->Position, IsBreak ? "'break' stands in no loop or switch"
                                                 : "'continue' stands in no loop");
    }
    m_Cursor.advance();
    return pLeave;
}

Statement* StatementParser::parseReturn() {
    Statement* pReturn = makeStatement(StatementKind::Return, m_Cursor.position());
    m_Cursor.advance();
    const bool HasResult = m_pOwner->pResult != nullptr;
    if (m_Cursor.is(TokenKind::Semicolon)) {
        if (HasResult) {
            m_Cursor.error(pReturn->Position, quotedName(m_pOwner->Name) + " must return a value");
        }
        return pReturn;
    }
    const SourcePosition Position = m_Cursor.position();
    pReturn->pValue = m_Expressions.parse().pRoot;
    if (pReturn->pValue == nullptr) {
        return nullptr;
    }
    if (!HasResult) {
        m_Cursor.error(Position, quotedName(m_pOwner->Name) + " has no result to return");
    }
    return pReturn;
}

Statement* StatementParser::parseGoto() {
    Statement* pGoto = makeStatement(StatementKind::Goto, m_Cursor.position());
    m_Cursor.advance();
    if (!m_Cursor.is(TokenKind::Identifier)) {
        m_Cursor.expected("a label");
        return nullptr;
    }
    pGoto->Name = m_Cursor.name().Text;
    m_Gotos.push_back({pGoto, m_Cursor.current().Value});
    m_Cursor.advance();
    return pGoto;
}

Statement* StatementParser::parseLocal() {
    Statement* pDecl = makeStatement(StatementKind::LocalDecl, m_Cursor.position());
    m_Cursor.advance();
    const Type* pType = m_Expressions.acceptType();
    if (pType == nullptr) {
        if (m_Cursor.is(TokenKind::Identifier)) {
            m_Cursor.error(m_Cursor.position(),
                           quotedName(m_Cursor.text()) + " is not the name of a type");
        } else {
            m_Cursor.expected("the name of a type");
        }
        return nullptr;
    }
    if (!m_Cursor.is(TokenKind::Identifier)) {
        m_Cursor.expected("the variable's name");
        return nullptr;
    }
    NameEntry& Entry = m_Cursor.name();
    Variable* pLocal = m_State.makeVariable(VariableKind::Local, Entry.Text, m_Cursor.position());
    pLocal->pType = pType;
    pLocal->pOwner = m_pOwner;
    m_pOwner->Locals.push_back(pLocal);
    pDecl->pTarget = pLocal;
    pDecl->Name = Entry.Text;
    m_Cursor.advance();
    const bool IsRead = parseLocalValue(*pDecl);
    // Visible behind its own initialiser, which must not use it; also after a mistake in that.
    declareLocal(Entry, pLocal);
    return IsRead ? pDecl : nullptr;
}

/// The cursor stands behind the name.
bool StatementParser::parseLocalValue(Statement& Decl) {
    if (m_Cursor.is(TokenKind::BracketOpen)) {
        m_Cursor.error(m_Cursor.position(), "a local cannot be an array");
        return false;
    }
    if (!m_Cursor.accept(TokenKind::Assign)) {
        return true;
    }
    if (!m_IsHead && startsCall()) {
        // A call is a statement of its own, behind the declaration.
        Decl.pNext = makeStatement(StatementKind::Call, m_Cursor.position());
        Decl.pNext->pTarget = Decl.pTarget;
        return parseCall(Decl.pNext) != nullptr;
    }
    Decl.pValue = m_Expressions.parse().pRoot;
    return Decl.pValue != nullptr;
}

Statement* StatementParser::parseStepPrefix() {
    Statement* pStep = makeStatement(StatementKind::Assign, m_Cursor.position());
    makeStep(*pStep);
    if (!m_Cursor.is(TokenKind::Identifier)) {
        m_Cursor.expected("a variable");
        return nullptr;
    }
    NameEntry& Entry = m_Cursor.name();
    m_Cursor.advance();
    return resolveTarget(*pStep, Entry) ? pStep : nullptr;
}

void StatementParser::makeStep(Statement& Assign) {
    Assign.CompoundOp = m_Cursor.is(TokenKind::PlusPlus) ? Operator::Add : Operator::Subtract;
    Assign.IsIncrement = true;
    Assign.pValue = m_State.Target.newExpression();
    Assign.pValue->Position = m_Cursor.position();
    Assign.pValue->Number = 1.0;
    m_Cursor.advance();
}

Statement* StatementParser::parseNamed() {
    if (!m_Cursor.is(TokenKind::Identifier)) {
        m_Cursor.expected(m_IsHead ? "an assignment" : "a statement");
        return nullptr;
    }
    Statement* pStatement = makeStatement(StatementKind::Assign, m_Cursor.position());
    if (m_Cursor.nextKind() != TokenKind::ParenOpen) {
        NameEntry& Entry = m_Cursor.name();
        m_Cursor.advance();
        return parseAssignment(pStatement, Entry);
    }
    if (m_IsHead) {
        m_Cursor.error(pStatement->Position, "a call cannot stand in the head of 'for'");
        return nullptr;
    }
    pStatement->Kind = StatementKind::Call;
    return parseCall(pStatement);
}

bool StatementParser::startsCall() const {
    if (!m_Cursor.is(TokenKind::Identifier) || m_Cursor.nextKind() != TokenKind::ParenOpen) {
        return false;
    }
    const NameEntry& Entry = m_Cursor.name();
    return Entry.pLocal == nullptr &&
           (Entry.Kind == SymbolKind::Procedure || Entry.Kind == SymbolKind::Extern);
}

Statement* StatementParser::parseAssignment(Statement* pAssign, NameEntry& Entry) {
    if (!resolveTarget(*pAssign, Entry)) {
        return nullptr;
    }
    if (m_Cursor.is(TokenKind::PlusPlus) || m_Cursor.is(TokenKind::MinusMinus)) {
        makeStep(*pAssign);
        return pAssign;
    }
    if (isCompoundAssign(m_Cursor.kind())) {
        pAssign->CompoundOp = compoundOperator(m_Cursor.kind());
    } else if (!m_Cursor.is(TokenKind::Assign)) {
        m_Cursor.expected("'='");
        return nullptr;
    }
    m_Cursor.advance();
    if (!m_IsHead && pAssign->CompoundOp == Operator::Number && startsCall()) {
        if (pAssign->pIndex != nullptr) {
            m_Cursor.error(m_Cursor.position(),
                           "the result of a call goes to a variable, not to an element");
        }
        pAssign->Kind = StatementKind::Call;
        return parseCall(pAssign);
    }
    pAssign->pValue = m_Expressions.parse().pRoot;
    return pAssign->pValue != nullptr ? pAssign : nullptr;
}

/// The cursor stands behind the name; an index follows if there is one.
bool StatementParser::resolveTarget(Statement& Assign, NameEntry& Entry) {
    const SourcePosition Position = Assign.Position;
    Assign.Name = Entry.Text;
    Variable* pTarget = Entry.pLocal;
    if (pTarget == nullptr && Entry.Kind == SymbolKind::Variable) {
        pTarget = Entry.pVariable;
    }
    if (pTarget == nullptr) {
        if (Entry.Kind == SymbolKind::None) {
            m_Expressions.reportUndeclared(Entry, Position);
        } else {
            m_Cursor.error(Position, quotedName(Entry.Text) + " is not a variable");
        }
    } else if (pTarget->Kind == VariableKind::Input) {
        m_Cursor.error(Position, "input " + quotedName(Entry.Text) + " cannot be assigned");
    } else if (pTarget->Kind == VariableKind::Param) {
        m_Cursor.error(Position, "param " + quotedName(Entry.Text) + " cannot be assigned");
    }
    const bool HasIndex = m_Cursor.accept(TokenKind::BracketOpen);
    if (HasIndex) {
        Assign.pIndex = m_Expressions.parse().pRoot;
        if (Assign.pIndex == nullptr || !m_Cursor.expect(TokenKind::BracketClose, "']'")) {
            return false;
        }
    }
    if (pTarget != nullptr && HasIndex != (pTarget->Count != 0)) {
        m_Cursor.error(Position, HasIndex ? quotedName(Entry.Text) + " is not an array"
                                          : "array " + quotedName(Entry.Text) + " needs an index");
    }
    Assign.pTarget = pTarget;
    return true;
}

/// The cursor stands on the name of what is called, a parenthesis behind it.
Statement* StatementParser::parseCall(Statement* pCall) {
    NameEntry& Entry = m_Cursor.name();
    const SourcePosition Position = m_Cursor.position();
    pCall->Name = Entry.Text;
    resolveCallee(*pCall, Entry, Position);
    m_Cursor.advance();
    m_Cursor.advance();
    std::size_t ArgumentCount = 0;
    if (!m_Expressions.parseArguments(pCall->pArguments, ArgumentCount)) {
        return nullptr;
    }
    if (isBetween(m_Cursor.kind(), TokenKind::Star, TokenKind::OrOr)) {
        m_Cursor.error(Position, "a call cannot stand in an expression: assign the result of " +
                                     quotedName(Entry.Text) + " to a variable first");
        return nullptr;
    }
    checkCall(*pCall, Position, ArgumentCount);
    return pCall;
}

void StatementParser::resolveCallee(Statement& Call, NameEntry& Entry, SourcePosition Position) {
    if (Entry.pLocal == nullptr && Entry.Kind == SymbolKind::Procedure) {
        Call.pProcedure = Entry.pProcedure;
        m_State.Calls.push_back({m_pOwner->Index, Call.pProcedure->Index});
        if (Entry.Text == "main") {
            m_Cursor.error(Position, "'main' cannot be called");
        }
    } else if (Entry.pLocal == nullptr && Entry.Kind == SymbolKind::Extern) {
        Call.pExtern = Entry.pExtern;
    } else if (Entry.pLocal == nullptr && Entry.Kind == SymbolKind::None) {
        m_Expressions.reportUndeclared(Entry, Position);
    } else {
        m_Cursor.error(Position, quotedName(Entry.Text) + " is not a procedure");
    }
}

void StatementParser::checkCall(const Statement& Call, SourcePosition Position,
                                std::size_t ArgumentCount) {
    const std::string Name = quotedName(Call.Name);
    if (Call.pExtern != nullptr) {
        if (ArgumentCount != 0) {
            m_Cursor.error(Position, "extern " + Name + " takes no arguments");
        }
        if (Call.pTarget != nullptr) {
            m_Cursor.error(Position, "extern " + Name + " has no result");
        }
        return;
    }
    if (Call.pProcedure == nullptr) {
        return;
    }
    const std::size_t Wanted = Call.pProcedure->Formals.size();
    if (ArgumentCount != Wanted) {
        m_Cursor.error(Position, Name + " takes " + std::to_string(Wanted) +
                                     (Wanted == 1 ? " argument, not " : " arguments, not ") +
                                     std::to_string(ArgumentCount));
    }
    if (Call.pTarget != nullptr && Call.pProcedure->pResult == nullptr) {
        m_Cursor.error(Position, Name + " has no result");
    }
}

} // namespace hpn
