#include "LEDA/error.h"

#include "LEDA/array.h"

#include <cstdio>

namespace leda {

namespace {

void print_and_abort(int number, const char* text) {
    std::fprintf(stderr, "error %d: %s\n", number, text);
    std::abort();
}

} // namespace

error_handler std_error_handler = &print_and_abort;

void report_error(const char* message, const char* header, int line) {
    char text[256];
    std::snprintf(text, sizeof(text), "%s (%s:%d)", message, header, line);
    (std_error_handler ? std_error_handler : &print_and_abort)(1, text);
}

void report_bad_bounds(int a, int b, const char* header, int line) {
    char message[128];
    std::snprintf(message, sizeof(message), "array: bad array bounds [%d..%d]", a, b);
    report_error(message, header, line);
}

} // namespace leda
