#include "Language/Reader.h"

#include "Language/DeclarationChecker.h"
#include "Language/DeclarationParser.h"
#include "Language/Lexer.h"
#include "Language/RecursionMarker.h"
#include "Language/StatementParser.h"
#include "Model/Conversion.h"

#include <cctype>
#include <iterator>

namespace hpn {

namespace {

constexpr std::string_view BuiltInNames[] = {"bool",  "int8",   "uint8",   "int16",  "uint16",
                                             "int32", "uint32", "float32", "float64"};

void enterBuiltInTypes(Program& Target) {
    for (std::size_t Base = 0; Base < std::size(BuiltInNames); ++Base) {
        Type& BuiltIn = Target.Types.emplace_back();
        BuiltIn.Name = BuiltInNames[Base];
        BuiltIn.Base = static_cast<BaseType>(Base);
    }
}

/// The stem of a file's name, as an identifier.
std::string programName(const std::string& FileName) {
    const std::size_t Slash = FileName.find_last_of("/\\");
    std::string Stem = Slash == std::string::npos ? FileName : FileName.substr(Slash + 1);
    const std::size_t Dot = Stem.find_last_of('.');
    if (Dot != std::string::npos && Dot > 0) {
        Stem.resize(Dot);
    }
    if (Stem.empty() || Stem == "<stdin>") {
        return "program";
    }
    for (char& Character : Stem) {
        if (std::isalnum(static_cast<unsigned char>(Character)) == 0) {
            Character = '_';
        }
    }
    return std::isdigit(static_cast<unsigned char>(Stem.front())) != 0 ? "program_" + Stem : Stem;
}

/// Enters the names of a file's types, so that they can be used in front of their declaration.
void enterTypeNames(ReaderState& State, std::uint32_t File, const TokenList& List) {
    for (std::uint32_t Place : List.TypeDeclarations) {
        const Token& Name = List.Tokens[Place + 1];
        if (Name.Kind != TokenKind::Identifier) {
            continue;
        }
        NameEntry& Entry = State.Names[Name.Value];
        if (Entry.Kind != SymbolKind::None) {
            continue;
        }
        Type& Declared = State.Target.Types.emplace_back();
        Declared.Name = Entry.Text;
        Declared.IsBuiltIn = false;
        Declared.Position = {File, Name.Offset};
        Entry.Kind = SymbolKind::Type;
        Entry.pType = &Declared;
    }
}

/// The bodies have made variables too; like all others, they hold a number of their type from the
/// start.
void completeLocals(Program& Target) {
    for (Variable& Each : Target.Variables) {
        if (Each.Initial.empty()) {
            Each.Initial.push_back(convertNumber(0.0, *Each.pType));
        }
    }
}

void readBodies(ReaderState& State, std::vector<TokenCursor>& Cursors) {
    std::vector<StatementParser> Parsers;
    Parsers.reserve(Cursors.size());
    for (TokenCursor& Cursor : Cursors) {
        Parsers.emplace_back(State, Cursor);
    }
    for (const PendingBody& Body : State.Bodies) {
        if (State.Messages.isFull()) {
            return;
        }
        Cursors[Body.File].setPlace(Body.Place);
        Parsers[Body.File].parseBody(*Body.pProcedure);
    }
}

} // namespace

bool readProgram(const SourceFiles& Sources, Diagnostics& Messages, Program& Target) {
    ReaderState State(Sources, Messages, Target);
    const auto FileCount = static_cast<std::uint32_t>(Sources.getCount());
    enterBuiltInTypes(Target);
    Target.Name = FileCount == 0 ? "program" : programName(Sources.getName(0));

    std::vector<TokenList> Files;
    Files.reserve(FileCount);
    for (std::uint32_t File = 0; File < FileCount; ++File) {
        Files.push_back(Lexer(Sources, File, State.Names, Messages).run());
        enterTypeNames(State, File, Files.back());
    }
    std::vector<TokenCursor> Cursors;
    Cursors.reserve(FileCount);
    for (std::uint32_t File = 0; File < FileCount; ++File) {
        Cursors.emplace_back(Sources, File, Files[File], State.Names, Messages);
        DeclarationParser(State, File, Cursors.back()).run();
    }
    DeclarationChecker(State).run();
    readBodies(State, Cursors);
    markRecursion(Target, State.Calls);
    completeLocals(Target);
    return !Messages.hasErrors();
}

} // namespace hpn
