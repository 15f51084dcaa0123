#include "Language/ReaderState.h"

namespace hpn {

namespace {

SourcePosition positionOf(const NameEntry& Entry) {
    switch (Entry.Kind) {
    case SymbolKind::Type:
        return Entry.pType->Position;
    case SymbolKind::Variable:
        return Entry.pVariable->Position;
    case SymbolKind::Procedure:
        return Entry.pProcedure->Position;
    case SymbolKind::Extern:
        return Entry.pExtern->Position;
    case SymbolKind::None:
        break;
    }
    return {};
}

} // namespace

bool ReaderState::isFree(const NameEntry& Entry, SourcePosition Position) const {
    if (Entry.Kind == SymbolKind::None) {
        return true;
    }
    Messages.error(Position, quotedName(Entry.Text) + " is already declared at " +
                                 Messages.describe(positionOf(Entry)));
    return false;
}

Variable* ReaderState::makeVariable(VariableKind Kind, std::string_view Name,
                                    SourcePosition Position) {
    Variable* pVariable = &Target.Variables.emplace_back();
    pVariable->Kind = Kind;
    pVariable->Name = Name;
    pVariable->pType = Target.builtIn(BaseType::Float64);
    pVariable->Position = Position;
    pVariable->Index = static_cast<std::uint32_t>(Target.Variables.size() - 1);
    return pVariable;
}

std::string quotedName(std::string_view Name) {
    return '\'' + std::string(Name) + '\'';
}

} // namespace hpn
