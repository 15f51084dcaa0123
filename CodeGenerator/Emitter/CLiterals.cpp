#include "Emitter/CLiterals.h"

#include "Model/Conversion.h"

#include <charconv>
#include <cmath>
#include <cstddef>

namespace hpn {

const char* cTypeName(BaseType Base) {
    switch (Base) {
    case BaseType::Bool:
        return "bool";
    case BaseType::Int8:
        return "int8_t";
    case BaseType::UInt8:
        return "uint8_t";
    case BaseType::Int16:
        return "int16_t";
    case BaseType::UInt16:
        return "uint16_t";
    case BaseType::Int32:
        return "int32_t";
    case BaseType::UInt32:
        return "uint32_t";
    case BaseType::Float32:
        return "float";
    default:
        return "double";
    }
}

void appendInteger(std::string& Out, std::int64_t Number) {
    // The smallest int has no literal of type int: 2147483648 is a long already.
    if (Number == INT32_MIN) {
        Out += "(-2147483647 - 1)";
        return;
    }
    char Digits[24];
    Out.append(Digits, std::to_chars(Digits, Digits + sizeof Digits, Number).ptr);
}

namespace {

template <class Number>
void appendShortest(std::string& Out, Number Value) {
    char Digits[40];
    const char* const End = std::to_chars(Digits, Digits + sizeof Digits, Value).ptr;
    Out.append(Digits, static_cast<std::size_t>(End - Digits));
    for (const char* p = Digits; p != End; ++p)
        if (*p == '.' || *p == 'e')
            return;
    Out += ".0";
}

bool appendWithoutLiteral(std::string& Out, double Number) {
    if (std::isnan(Number))
        Out += "hpn_quiet_nan()";
    else if (std::isinf(Number))
        Out += Number > 0.0 ? "hpn_infinity()" : "-hpn_infinity()";
    return !std::isfinite(Number);
}

} // namespace

void appendDouble(std::string& Out, double Number) {
    if (!appendWithoutLiteral(Out, Number))
        appendShortest(Out, Number);
}

void appendFloat(std::string& Out, double Number) {
    if (!std::isfinite(Number)) {
        Out += "(float)";
        appendWithoutLiteral(Out, Number);
        return;
    }
    appendShortest(Out, static_cast<float>(Number));
    Out += 'f';
}

void appendStored(std::string& Out, double Number, const Type& Of) {
    switch (Of.Base) {
    case BaseType::Bool:
        Out += Number != 0.0 ? "true" : "false";
        return;
    case BaseType::Float32:
        return appendFloat(Out, Number);
    case BaseType::Float64:
        return appendDouble(Out, Number);
    default:
        appendInteger(Out, rawOfNumber(Number, Of));
        if (Of.Base == BaseType::UInt32)
            Out += 'u';
    }
}

} // namespace hpn
