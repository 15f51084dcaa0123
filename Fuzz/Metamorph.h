#ifndef METAMORPH_H
#define METAMORPH_H

#include "PassTrial.h"

namespace hpn::fuzz {

/// The other program of a pair, made of a trial's own text: renamed, its procedures in another
/// order, with dead code, with other passes or a wider input. False where there is nothing to
/// change. Works on texts as the generators write them; any other may become one that does not
/// read.
bool makeVariant(const Trial& Of, Trial& Variant);

/// What the two results, both without a failure, say of each other that cannot be; empty if
/// nothing.
std::string compareVariants(PairKind Kind, const TrialResult& Of, const TrialResult& Variant);

} // namespace hpn::fuzz

#endif
