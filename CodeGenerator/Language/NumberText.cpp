#include "Language/NumberText.h"

#include <charconv>
#include <cmath>

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
    Out.append(Buffer, Result.ptr);
}

std::string numberText(double Number) {
    std::string Text;
    appendNumber(Text, Number);
    return Text;
}

} // namespace hpn
