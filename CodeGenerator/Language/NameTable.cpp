#include "Language/NameTable.h"

#include <iterator>

namespace hpn {

namespace {

constexpr std::size_t FirstSlotCount = 1024;

/// In the order of TokenKind, from Type to Float64.
constexpr std::string_view Keywords[] = {
    "type",     "input",  "output", "state", "param",  "extern", "export", "proc",    "local",
    "if",       "else",   "while",  "do",    "for",    "switch", "case",   "default", "break",
    "continue", "return", "goto",   "true",  "false",  "min",    "max",    "abs",     "sgn",
    "bool",     "int8",   "uint8",  "int16", "uint16", "int32",  "uint32", "float32", "float64"};
static_assert(std::size(Keywords) == static_cast<std::size_t>(TokenKind::Float64) -
                                         static_cast<std::size_t>(TokenKind::Type) + 1);

} // namespace

NameTable::NameTable() : m_Slots(FirstSlotCount, 0) {
    auto Kind = static_cast<std::uint8_t>(TokenKind::Type);
    for (const std::string_view Word : Keywords) {
        std::uint32_t Hash = EmptyHash;
        for (const char Character : Word) {
            Hash = addToHash(Hash, Character);
        }
        m_Entries[intern(Word, Hash)].Keyword = static_cast<TokenKind>(Kind++);
    }
}

std::uint32_t NameTable::intern(std::string_view Text, std::uint32_t Hash) {
    const std::size_t Mask = m_Slots.size() - 1;
    // The upper bits are mixed in: the lower ones of this hash alone hang on few characters.
    std::size_t At = (Hash ^ (Hash >> 15)) & Mask;
    for (; m_Slots[At] != 0; At = (At + 1) & Mask) {
        const NameEntry& Entry = m_Entries[m_Slots[At] - 1];
        if (Entry.Hash == Hash && Entry.Text == Text) {
            return m_Slots[At] - 1;
        }
    }
    NameEntry& Entry = m_Entries.emplace_back();
    Entry.Text = Text;
    Entry.Hash = Hash;
    const auto Name = static_cast<std::uint32_t>(m_Entries.size() - 1);
    m_Slots[At] = Name + 1;
    if (m_Entries.size() * 2 > m_Slots.size()) {
        grow();
    }
    return Name;
}

void NameTable::grow() {
    m_Slots.assign(m_Slots.size() * 4, 0);
    const std::size_t Mask = m_Slots.size() - 1;
    for (std::uint32_t Name = 0; Name < m_Entries.size(); ++Name) {
        const std::uint32_t Hash = m_Entries[Name].Hash;
        std::size_t At = (Hash ^ (Hash >> 15)) & Mask;
        while (m_Slots[At] != 0) {
            At = (At + 1) & Mask;
        }
        m_Slots[At] = Name + 1;
    }
}

} // namespace hpn
