#ifndef READERSTATE_H
#define READERSTATE_H

#include "Language/Diagnostics.h"
#include "Language/NameTable.h"
#include "Language/Program.h"
#include "Language/SourceFiles.h"

#include <cstdint>
#include <string>
#include <vector>

namespace hpn {

/// A call somewhere in a body, by Procedure::Index.
struct CallEdge {
    std::uint32_t Caller;
    std::uint32_t Callee;
};

/// A variable of the program whose number of elements and initial values wait for the types and
/// params of all files.
struct PendingVariable {
    Variable* pVariable = nullptr;
    Expression* pCount = nullptr; ///< null: a scalar
    SourcePosition InitializerPosition;
    bool HasBraces = false;
};

/// The names behind `reads` and `writes` of an extern, which wait for the variables of all files.
struct PendingAccess {
    Extern* pExtern = nullptr;
    bool IsWrite = false;
    std::uint32_t Name = 0;
    SourcePosition Position;
};

/// A procedure's body, which waits for all declarations.
struct PendingBody {
    Procedure* pProcedure = nullptr;
    std::uint32_t File = 0;
    std::uint32_t Place = 0; ///< of its opening brace among the file's tokens
};

/// What the steps of the reader share: the program that is being built, its names and what is still
/// to be done.
struct ReaderState {
    const SourceFiles& Sources;
    Diagnostics& Messages;
    Program& Target;
    NameTable Names;
    std::vector<PendingVariable> Variables;
    std::vector<PendingAccess> Accesses;
    std::vector<PendingBody> Bodies;
    std::vector<CallEdge> Calls;

    ReaderState(const SourceFiles& AllSources, Diagnostics& AllMessages, Program& NewProgram)
        : Sources(AllSources), Messages(AllMessages), Target(NewProgram) {}

    /// False, after a message, if the name already stands for something in the whole program.
    bool isFree(const NameEntry& Entry, SourcePosition Position) const;
    /// Makes a variable and enters it in the program, not yet under its name.
    Variable* makeVariable(VariableKind Kind, std::string_view Name, SourcePosition Position);
};

std::string quotedName(std::string_view Name);

} // namespace hpn

#endif
