#ifndef NAMETABLE_H
#define NAMETABLE_H

#include "Language/Program.h"
#include "Language/Token.h"

#include <cstdint>
#include <string_view>
#include <vector>

namespace hpn {

/// What a name stands for in the whole program.
enum class SymbolKind : std::uint8_t { None, Type, Variable, Procedure, Extern };

/// One name of the program and what it means at the point that is being read.
struct NameEntry {
    std::string_view Text;
    std::uint32_t Hash = 0;
    TokenKind Keyword = TokenKind::Identifier; ///< Identifier: no keyword
    SymbolKind Kind = SymbolKind::None;
    /// A mistake around its declaration has been reported, or its lack of one: no more is said
    /// about it.
    bool IsSuspect = false;
    union {
        Type* pType = nullptr;
        Variable* pVariable;
        Procedure* pProcedure;
        Extern* pExtern;
    };
    Variable* pLocal = nullptr; ///< formal or local that is visible now
    std::uint32_t LabelNumber =
        0; ///< 1 more than its place in the list of the procedure's labels; 0: none
};

/// All names of a program, each once. The lexer looks every name up once, by hashing; from then on
/// a name is a number and what it means is found by indexing. So nothing behind the lexer hashes or
/// compares texts. Keywords are entered first.
class NameTable {
public:
    NameTable();

    /// Number of a name, entered if it is new. `Hash` comes from `addToHash` over its characters.
    std::uint32_t intern(std::string_view Text, std::uint32_t Hash);
    NameEntry& operator[](std::uint32_t Name) { return m_Entries[Name]; }

    static constexpr std::uint32_t EmptyHash = 2166136261U;
    /// Fowler, Noll and Vo's hash (1a), one character further.
    static constexpr std::uint32_t addToHash(std::uint32_t Hash, char Character) {
        return (Hash ^ static_cast<unsigned char>(Character)) * 16777619U;
    }

private:
    void grow();

    std::vector<NameEntry> m_Entries;
    std::vector<std::uint32_t>
        m_Slots; ///< open addressing; 0: free, else 1 more than the name's number
};

} // namespace hpn

#endif
