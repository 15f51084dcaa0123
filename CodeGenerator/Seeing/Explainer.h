#ifndef EXPLAINER_H
#define EXPLAINER_H

#include "Seeing/Recording.h"
#include "Seeing/StateReader.h"

namespace hpn {

/// Why nothing can be known of a variable, and why its definitions may not be removed: fills
/// `NotTracked` and `KeptBecause`. On the graph as it was built, whose snapshot has been read.
void explainVariables(Recording& Target, ProgramGraph& Program);

/// Fills what the propagation has found: ranges, uses and explanations of the versions, ranges of
/// the variables, and how assignments meet saturating limits. Right after a propagation, whose
/// snapshot has been read. Linear in the graph.
void explainPropagation(Recording& Target, ProgramGraph& Program, StateReader& Reader);

/// "0 .. 300", "5", "any".
std::string rangeText(const RecordedRange& Range);

} // namespace hpn

#endif
