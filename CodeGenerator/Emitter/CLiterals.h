#ifndef CLITERALS_H
#define CLITERALS_H

#include "Language/Program.h"

#include <cstdint>
#include <string>

namespace hpn {

/// C type of a storage (C99 exact-width names, `bool`, `float`, `double`).
const char* cTypeName(BaseType Base);
/// Appends a whole number that reads back as the same number, of the type that C gives its literal
/// (`int`, else a longer one).
void appendInteger(std::string& Out, std::int64_t Number);
/// Appends the shortest decimal that reads back as the same double; the numbers without a literal
/// come from the runtime.
void appendDouble(std::string& Out, double Number);
/// The same for a number that is a float.
void appendFloat(std::string& Out, double Number);
/// Appends the constant that stands in the storage for a number that has been converted to the
/// type.
void appendStored(std::string& Out, double Number, const Type& Of);

} // namespace hpn

#endif
