#ifndef DECLARATIONPARSER_H
#define DECLARATIONPARSER_H

#include "Language/ExpressionParser.h"
#include "Language/ReaderState.h"
#include "Language/TokenCursor.h"

#include <cstdint>

namespace hpn {

/// Reads the declarations of one file and enters their names; passes over the bodies of procedures,
/// which can be read only when all files' declarations are known. What a declaration needs from
/// others (numbers of elements, initial values, access lists) is left to the `DeclarationChecker`.
/// The names of all types have been entered before.
class DeclarationParser {
public:
    DeclarationParser(ReaderState& State, std::uint32_t File, TokenCursor& Cursor)
        : m_State(State), m_File(File), m_Cursor(Cursor), m_Expressions(State, Cursor) {}

    void run();

private:
    void parseDeclaration();
    bool parseType();
    bool parseTypeOptions(Type& Declared);
    bool parseTypeOption(Type& Declared, std::string_view Option, SourcePosition Position);
    bool parseRange(Type& Declared);
    bool parseSaturation(Type& Declared);

    bool parseVariable(VariableKind Kind);
    bool parseCount(PendingVariable& Pending);
    bool parseInitializer(PendingVariable& Pending);
    bool parseInitialList(Expression*& pFirst);

    bool parseExtern();
    bool parseAccesses(Extern& Declared, bool IsWrite);

    void parseProcedure();
    bool startsName() const;
    bool parseProcedureHeader(Procedure& Declared);
    bool parseFormals(Procedure& Declared);
    void passBody();

    /// Something that begins no declaration: one message, and on to the next declaration.
    void passStray();
    /// A type's name, or a message.
    const Type* expectType();

    ReaderState& m_State;
    std::uint32_t m_File;
    TokenCursor& m_Cursor;
    ExpressionParser m_Expressions;
    /// A declaration cut the last body short: what is left of that body belongs to the same
    /// mistake, which is reported when the body is read.
    bool m_IsBodyCut = false;
};

} // namespace hpn

#endif
