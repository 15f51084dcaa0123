#ifndef FATES_H
#define FATES_H

#include "Seeing/Recording.h"

namespace hpn {

/// What became of the statements of the program: fills `Fates`, and with it the grounds of what was
/// removed, from the finished snapshots. A statement that stays has a fate only if nothing in the
/// code reads what it defines. Linear in the recording.
void tellFates(Recording& Of);

} // namespace hpn

#endif
