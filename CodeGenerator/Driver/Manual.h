#ifndef MANUAL_H
#define MANUAL_H

#include <string>

namespace CLI {
class App;
}

namespace hpn {

/// The manual page (section 1, troff) of the command line as it has been declared: the same names,
/// descriptions and closing text that `--help` prints.
std::string printManualPage(const CLI::App& App);

/// Completion for bash: options, the values of those that take one of a few, files and directories.
std::string printBashCompletion(const CLI::App& App);

} // namespace hpn

#endif
