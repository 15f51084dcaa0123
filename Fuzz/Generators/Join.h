#ifndef JOIN_H
#define JOIN_H

#include <initializer_list>
#include <string>

namespace hpn::fuzz {

/// The texts one behind the other. A generator whose parts draw random numbers writes them in
/// braces, because there, and not between the operands of +, they are evaluated from left to
/// right: so a seed gives the same program whatever compiler built the generator.
inline std::string join(std::initializer_list<std::string> Parts) {
    std::size_t Length = 0;
    for (const std::string& Part : Parts)
        Length += Part.size();
    std::string Text;
    Text.reserve(Length);
    for (const std::string& Part : Parts)
        Text += Part;
    return Text;
}

} // namespace hpn::fuzz

#endif
