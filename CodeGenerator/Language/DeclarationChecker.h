#ifndef DECLARATIONCHECKER_H
#define DECLARATIONCHECKER_H

#include "Language/ReaderState.h"

#include <cstddef>
#include <vector>

namespace hpn {

/// Completes the declarations when all files' are known: numbers of elements, initial values (in
/// the order of the sources, since params stand for theirs in those that follow), access lists of
/// externs, rules of `main`.
class DeclarationChecker {
public:
    static constexpr double GreatestCount = 65536.0;      ///< elements of one array
    static constexpr std::size_t GreatestTotal = 4194304; ///< elements of all arrays

    explicit DeclarationChecker(ReaderState& State) : m_State(State) {}

    void run();

private:
    void completeVariable(const PendingVariable& Pending);
    bool completeCount(const PendingVariable& Pending);
    bool checkInitializer(const PendingVariable& Pending);
    void computeInitial(Variable& Target);
    void applySettings(Variable& Target) const;
    void completeAccess(const PendingAccess& Access);
    void checkMain();

    ReaderState& m_State;
    std::size_t m_Elements = 0; ///< of all arrays so far
    /// By Variable::Index: the access list that has named it last. A list is completed before the
    /// next begins.
    std::vector<const std::vector<Variable*>*> m_LastList;
};

} // namespace hpn

#endif
