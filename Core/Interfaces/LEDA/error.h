#ifndef LEDA_ERROR_H
#define LEDA_ERROR_H

#include "HpnPlatformExport.h"

#include <cstdlib>
#include <type_traits>

namespace leda {

// Misuse of a container (front of an empty list, impossible bounds of an array) goes to this
// handler, with the number 1 and a text of the form "message (header:line)". The default one of the
// platform library prints the text and aborts; a program may install its own, which may throw or
// jump away. If it returns, the operation answers a default value.
using error_handler = void (*)(int, const char*);
extern HPNPLATFORM_EXPORT error_handler std_error_handler;

// Formats the text and calls the handler.
HPNPLATFORM_EXPORT void report_error(const char* message, const char* header, int line);

// What an operation that has nothing to refer to answers after its error was handled: a fresh
// default value.
template <class T>
T& error_value() {
    if constexpr (std::is_default_constructible_v<T> && std::is_copy_assignable_v<T>) {
        static T value{};
        value = T{};
        return value;
    } else {
        std::abort();
    }
}

} // namespace leda

#endif
