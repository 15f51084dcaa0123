#ifndef CNAMES_H
#define CNAMES_H

#include <string>
#include <string_view>
#include <unordered_set>

namespace hpn {

/// Gives out C identifiers that clash neither with each other nor with C: keywords, what the
/// included headers declare or define, and functions that compilers know by name. A name that is
/// taken gets the suffix `_2`, `_3` and so on. A scope inside another one sees the names of the
/// outer one as taken; the outer one must be complete by then.
class CNames {
public:
    explicit CNames(const CNames* pOuter = nullptr) : m_pOuter(pOuter) {}

    /// An identifier like `Wanted`, characters that C does not know in names replaced.
    std::string take(std::string_view Wanted);

private:
    bool isTaken(const std::string& Name) const;

    const CNames* m_pOuter;
    std::unordered_set<std::string> m_Taken;
};

} // namespace hpn

#endif
