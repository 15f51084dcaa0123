#ifndef READER_H
#define READER_H

#include "Language/Diagnostics.h"
#include "Language/Program.h"
#include "Language/SourceFiles.h"

namespace hpn {

/// Reads all files as one program, in time linear in their length: first the tokens of every file,
/// then all declarations, then the bodies, in which every name is known by then. False if anything
/// is wrong; the messages say what, and the program is not to be used. The sources must outlive the
/// program, whose names are views into them.
bool readProgram(const SourceFiles& Sources, Diagnostics& Messages, Program& Target);

} // namespace hpn

#endif
