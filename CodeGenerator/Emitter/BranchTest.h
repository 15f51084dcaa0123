#ifndef BRANCHTEST_H
#define BRANCHTEST_H

#include "Model/Term.h"

#include <vector>

namespace hpn {

/// One question of a branch.
struct BranchTest {
    const Term* pTerm = nullptr;
    bool Negated = false;
};

/// Questions asked one after the other: the true way is taken at the first that holds, the others
/// are not asked then.
using BranchTests = std::vector<BranchTest>;

} // namespace hpn

#endif
