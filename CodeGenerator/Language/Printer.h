#ifndef PRINTER_H
#define PRINTER_H

#include "Language/Program.h"

#include <string>

namespace hpn {

/// The program in the reader's own text form, in one layout: declarations in the order of the
/// sources, one statement a line, braces everywhere, parentheses only where the tree needs them.
/// Reading it again gives the same program; comments are lost, and several files become one.
std::string printProgram(const Program& Source);

} // namespace hpn

#endif
