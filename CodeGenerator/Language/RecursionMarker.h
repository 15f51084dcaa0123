#ifndef RECURSIONMARKER_H
#define RECURSIONMARKER_H

#include "Language/ReaderState.h"

#include <vector>

namespace hpn {

/// Marks every procedure that calls itself, directly or in a ring: the members of a strongly
/// connected component of the calls with more than one member, or with a call of itself. Linear,
/// without recursion.
void markRecursion(Program& Target, const std::vector<CallEdge>& Calls);

} // namespace hpn

#endif
