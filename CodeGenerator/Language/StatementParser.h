#ifndef STATEMENTPARSER_H
#define STATEMENTPARSER_H

#include "Language/ExpressionParser.h"
#include "Language/ReaderState.h"
#include "Language/TokenCursor.h"

#include <cstdint>
#include <functional>
#include <unordered_set>
#include <vector>

namespace hpn {

/// Reads the bodies of one file's procedures, resolves and checks all that stands in them. Open
/// statements are held on a stack of its own, so that nesting costs no recursion; a chain of `else
/// if` stays on one place of it. A local is visible from its declaration to the end of the block
/// (branch, loop) that holds it; while it is, its name cannot be declared again.
class StatementParser {
public:
    StatementParser(ReaderState& State, TokenCursor& Cursor)
        : m_State(State), m_Cursor(Cursor), m_Expressions(State, Cursor) {}

    /// The cursor stands on the opening brace.
    void parseBody(Procedure& Owner);

private:
    enum class FrameKind : std::uint8_t { Body, Block, Then, Else, While, Do, For, Switch };

    /// A statement whose inner statements are being read.
    struct Frame {
        FrameKind Kind;
        bool IsBraced;
        bool HasDefault;
        bool HasBadHead;        ///< a mistake was reported in front of its inner statements
        Statement* pStatement;  ///< null for Body
        Statement** ppNext;     ///< where the next inner statement is linked
        std::size_t FirstLocal; ///< number of locals that were visible before
    };

    struct LabelRecord {
        Statement* pStatement;
        std::uint32_t Name;
        bool IsUsed;
    };

    struct GotoRecord {
        Statement* pStatement;
        std::uint32_t Name;
    };

    /// A number of one of the switches, to find it twice. Zeros of both signs are the same.
    struct CaseNumber {
        const Statement* pSwitch;
        double Number;
        bool operator==(const CaseNumber& Other) const {
            return pSwitch == Other.pSwitch && Number == Other.Number;
        }
    };
    struct CaseNumberHash {
        std::size_t operator()(const CaseNumber& Case) const {
            return std::hash<double>()(Case.Number) * 31 + std::hash<const void*>()(Case.pSwitch);
        }
    };

    void declareFormals();
    void declareLocal(NameEntry& Entry, Variable* pVariable);
    void closeScope(std::size_t FirstLocal);
    void resolveGotos();
    void finishProcedure();

    /// One step: a statement, the head of one, or the brace that closes one.
    void parseNext();
    void closeBrace();

    // Statements that hold no others: made, not yet linked. Null after a message.
    void parseSimpleStatement();
    Statement* parseSimple();
    Statement* parseStepPrefix();
    Statement* parseNamed();
    Statement* parseAssignment(Statement* pAssign, NameEntry& Entry);
    Statement* parseCall(Statement* pCall);
    Statement* parseLocal();
    bool parseLocalValue(Statement& Decl);
    Statement* parseReturn();
    Statement* parseGoto();
    Statement* parseLeave();
    void parseLabel();
    void parseCase();
    void parseDefault();

    void parseIf();
    void parseWhile();
    void parseDo();
    void parseFor();
    bool parseForHead(Statement& For);
    void parseSwitch();
    /// "(condition)"; after a mistake in it a number stands for it.
    Expression* parseCondition();

    bool resolveTarget(Statement& Assign, NameEntry& Entry);
    void resolveCallee(Statement& Call, NameEntry& Entry, SourcePosition Position);
    void checkCall(const Statement& Call, SourcePosition Position, std::size_t ArgumentCount);
    /// The statement is `x++` or `x--`; passes the operator.
    void makeStep(Statement& Assign);
    bool startsCall() const;

    Statement* makeStatement(StatementKind Kind, SourcePosition Position);
    /// Links a statement, and those linked behind it, to the innermost open one.
    void append(Statement* pStatement);
    /// Opens a statement; its inner ones follow, in braces or not.
    void open(FrameKind Kind, Statement* pStatement, Statement** ppFirst, std::size_t FirstLocal);
    /// A whole statement has been read: closes those that hold no more than one.
    void complete();
    /// Ends the innermost statement. False if it goes on (`else`).
    bool closeFrame();
    /// Takes the innermost statement off the stack, whether it is whole or not.
    void popFrame();
    bool continueWithElse(Frame& Innermost);
    void finishDo(Statement* pDo);
    /// Innermost open switch, if nothing else is open in it; else null, after a message.
    Frame* innermostSwitch(const char* Label);

    ReaderState& m_State;
    TokenCursor& m_Cursor;
    ExpressionParser m_Expressions;
    Procedure* m_pOwner = nullptr;
    std::vector<Frame> m_Frames;
    std::vector<NameEntry*>
        m_Visible; ///< names of the locals that are visible, in order of declaration
    std::size_t m_ErrorsBefore = 0; ///< errors when the present step began
    std::size_t m_OpenLoops = 0;
    std::size_t m_OpenSwitches = 0;
    bool m_IsHead = false; ///< in the head of a `for`, where no call can stand
    std::vector<LabelRecord> m_Labels;
    std::vector<GotoRecord> m_Gotos;
    std::unordered_set<CaseNumber, CaseNumberHash> m_Cases;
};

} // namespace hpn

#endif
