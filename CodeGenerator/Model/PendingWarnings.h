#ifndef PENDINGWARNINGS_H
#define PENDINGWARNINGS_H

#include "Language/Program.h"

#include <string>
#include <vector>

namespace hpn {

/// A remark about the program that came up while the passes ran.
struct PendingWarning {
    SourcePosition Position;
    std::string Text;
};

/// The warnings not yet told to the user, in the order in which they arose. The expressions append,
/// the driver tells them with file, line and column, and clears the list. One list in a process, as
/// there is one graph.
std::vector<PendingWarning>& pendingWarnings();

} // namespace hpn

#endif
