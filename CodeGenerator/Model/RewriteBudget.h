#ifndef REWRITEBUDGET_H
#define REWRITEBUDGET_H

#include "Language/Program.h"

#include <cstddef>
#include <string>
#include <unordered_map>

class ZfCCfgSFExpression;

namespace hpn {

/// How many single changes the passes may still make. While one of these is active, the client's
/// model classes ask it before each change that they make or allow: a read replaced by a constant,
/// a condition decided, an expression folded, a note taken from a branch, a call inlined, a
/// definition removed, a statement moved. The first so many happen, in the order in which the
/// passes come to them, and no more; so two runs with limits N and N + 1 differ by one change.
///
/// Refusing a change is always sound: the answer is that of an optimiser that does not see it. One
/// at a time in a process, like the graph that it serves; without one nothing is refused.
class RewriteBudget {
public:
    explicit RewriteBudget(std::size_t Limit) : m_Limit(Limit) { s_pActive = this; }
    ~RewriteBudget() { s_pActive = s_pActive == this ? nullptr : s_pActive; }
    RewriteBudget(const RewriteBudget&) = delete;
    RewriteBudget& operator=(const RewriteBudget&) = delete;

    static RewriteBudget* active() { return s_pActive; }

    /// Takes one change; false if none is left. `What` says in words what would be done.
    bool take(const char* What, SourcePosition Position);
    bool isExhausted() const { return m_Count == m_Limit; }
    std::size_t getCount() const { return m_Count; }
    std::size_t getLimit() const { return m_Limit; }
    /// The last change that was made; meaningful once there was one.
    const std::string& getLastText() const { return m_LastText; }
    SourcePosition getLastPosition() const { return m_LastPosition; }

    /// From now on the expression decides a branch: that it evaluates to a constant is a change of
    /// its own, since the other arm goes.
    void registerCondition(const ZfCCfgSFExpression* pCondition);
    /// Whether an expression may evaluate to a constant. Asked again and again by the propagation;
    /// a condition gets its answer once and keeps it, as a constant that was found once holds for
    /// good.
    bool maySettle(const ZfCCfgSFExpression* pExpression, SourcePosition Position);
    bool isHeldBack(const ZfCCfgSFExpression* pExpression) const;

private:
    enum class Decision : unsigned char { Open, Granted, HeldBack };

    static RewriteBudget* s_pActive;

    std::size_t m_Limit;
    std::size_t m_Count = 0;
    std::string m_LastText;
    SourcePosition m_LastPosition;
    std::unordered_map<const ZfCCfgSFExpression*, Decision> m_Conditions; // looked up only
};

/// Asks the active budget; true if there is none.
inline bool mayRewrite(const char* What, SourcePosition Position) {
    RewriteBudget* pBudget = RewriteBudget::active();
    return pBudget == nullptr || pBudget->take(What, Position);
}

} // namespace hpn

#endif
