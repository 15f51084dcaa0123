#ifndef REMARKS_H
#define REMARKS_H

#include "Graph/ProgramGraph.h"
#include "Seeing/Recording.h"
#include "Seeing/StateReader.h"

#include <string>

namespace hpn {

/// Which calls stay, and why. Right after the inlining pass.
void remarkOnCalls(Recording& Target, ProgramGraph& Program, const StateReader& Reader);
/// Which equal statements stay at the head of both arms of a branch, and why. Right after hoisting.
void remarkOnArms(Recording& Target, ProgramGraph& Program, StateReader& Reader);
/// All other remarks, from the finished recording, whose fates have been told; then sorts them by
/// place.
void collectRemarks(Recording& Of);

/// `file:line:column: remark: text [pass]`, one a line.
std::string printRemarks(const Recording& Of);
/// The same for tools: an array of objects.
std::string remarksToJson(const Recording& Of);

} // namespace hpn

#endif
