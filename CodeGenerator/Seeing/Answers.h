#ifndef ANSWERS_H
#define ANSWERS_H

#include "Seeing/Recording.h"

#include <string>

namespace hpn {

/// Answers "why" about a variable (`throttle`, or `regulate::error` for one of several locals of
/// one name) or a line of the program (`line:17`, `line:b.hpn:17` in a program of several files),
/// from a finished recording. False: the question names nothing; `Text` is then what is wrong with
/// it.
bool explain(const Recording& Of, const std::string& Question, std::string& Text);

/// Pass by pass and procedure by procedure the text of what changed, and nothing else.
std::string printChanges(const Recording& Of);

} // namespace hpn

#endif
