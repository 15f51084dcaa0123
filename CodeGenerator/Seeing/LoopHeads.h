#ifndef LOOPHEADS_H
#define LOOPHEADS_H

#include "Seeing/Recording.h"

#include <unordered_set>

namespace hpn {

/// Ids of the joins of the last snapshot at which a way around a loop comes in: a depth-first walk
/// finds the nodes that control comes back to; the joins of one place stand one behind the other,
/// and the first has the ways in. Linear.
std::unordered_set<unsigned> findLoopHeads(const Recording& Of);

} // namespace hpn

#endif
