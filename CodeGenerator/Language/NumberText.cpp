#include "Language/NumberText.h"

#include <charconv>
#include <cmath>
#include <string_view>

namespace hpn {

void appendNumber(std::string& Out, double Number) {
    constexpr double GreatestPlain = 1e15;
    constexpr std::size_t Room = 32;
    char Buffer[Room];
    const bool IsPlain = std::fabs(Number) < GreatestPlain && Number == std::trunc(Number) &&
                         !(Number == 0.0 && std::signbit(Number));
    const std::to_chars_result Result =
        IsPlain ? std::to_chars(Buffer, Buffer + Room, static_cast<long long>(Number))
                : std::to_chars(Buffer, Buffer + Room, Number);
    const std::string_view Text(Buffer, static_cast<std::size_t>(Result.ptr - Buffer));
    Out.append(Text);
    // The shortest form of a large number can be its digits alone, which would read as an integer.
    if (!IsPlain && Text.find_first_of(".eni") == std::string_view::npos) {
        Out.append(".0");
    }
}

std::string numberText(double Number) {
    std::string Text;
    appendNumber(Text, Number);
    return Text;
}

} // namespace hpn
