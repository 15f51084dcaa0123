#ifndef SESSION_H
#define SESSION_H

#include "Driver/Options.h"

namespace hpn {

/// One run of the driver: reads the program, optimises it, writes the code and the reports.
/// Messages go to the error stream; output files are written last, whole or not at all.
ExitStatus runSession(const Options& Wanted);

} // namespace hpn

#endif
