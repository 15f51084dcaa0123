#ifndef TARGETS_H
#define TARGETS_H

#include <cstddef>
#include <cstdint>
#include <string>

namespace hpn::fuzz {

// Entry points for a fuzzer that makes bytes and watches which code they reach. Each judges one
// input: empty if all is right, else what is wrong. The tests run the kept inputs through the same
// functions.

/// The bytes are the text of a program; a byte 0xFE, which no text holds, begins the next file. The
/// reader must refuse it with messages that point into the text, or accept it; then it must print
/// as a text that reads back and prints the same.
std::string judgeReader(const std::uint8_t* pData, std::size_t Size);

/// The bytes choose a graph of procedures, blocks and statements, edits of it, and an order of
/// passes, all within what the library allows. After each step nothing may have been reported, the
/// components and the SSA form must be sound, and the program must hand out what it did before.
std::string judgeLibrary(const std::uint8_t* pData, std::size_t Size);

} // namespace hpn::fuzz

#endif
