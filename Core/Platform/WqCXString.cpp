#include "WqCXString.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <new>
#include <ostream>

WqCXString::WqCXString() {
    reserve(0);
}

WqCXString::WqCXString(const WqCXString& Other) {
    const std::size_t Length = Other.length();
    std::memcpy(reserve(Length), Other.cstring(), Length);
}

WqCXString::WqCXString(WqCXString&& Other) noexcept {
    take(Other);
}

WqCXString::WqCXString(const char* pText) {
    const std::size_t Length = pText ? std::strlen(pText) : 0;
    char* pOwn = reserve(Length);
    if (Length)
        std::memcpy(pOwn, pText, Length);
}

WqCXString::WqCXString(unsigned int Number, bool IsHexadecimal, bool IsShortest) {
    char Digits[16];
    const int Width = IsShortest ? 1 : IsHexadecimal ? 8 : 10;
    const int Length =
        std::snprintf(Digits, sizeof(Digits), IsHexadecimal ? "%0*x" : "%0*u", Width, Number);
    std::memcpy(reserve(std::size_t(Length)), Digits, std::size_t(Length));
}

WqCXString::~WqCXString() {
    release();
}

WqCXString& WqCXString::operator=(const WqCXString& Other) {
    if (this != &Other) {
        WqCXString Copy(Other);
        release();
        take(Copy);
    }
    return *this;
}

WqCXString& WqCXString::operator=(WqCXString&& Other) noexcept {
    if (this != &Other) {
        release();
        take(Other);
    }
    return *this;
}

char* WqCXString::cstring() const {
    if (m_Data[s_InlineLength] != s_LongMark)
        return const_cast<char*>(m_Data);
    char* pText;
    std::memcpy(&pText, m_Data, sizeof(pText));
    return pText;
}

std::size_t WqCXString::length() const {
    if (m_Data[s_InlineLength] != s_LongMark)
        return s_InlineLength - std::size_t(m_Data[s_InlineLength]);
    std::size_t Length;
    std::memcpy(&Length, m_Data + sizeof(char*), sizeof(Length));
    return Length;
}

// Makes a text of the given length with its closing zero and answers the place of its characters.
// Whatever the object held before was released.
char* WqCXString::reserve(std::size_t Length) {
    if (Length <= s_InlineLength) {
        m_Data[Length] = 0;
        m_Data[s_InlineLength] = char(s_InlineLength - Length);
        return m_Data;
    }
    char* pText = static_cast<char*>(std::malloc(Length + 1));
    if (!pText)
        throw std::bad_alloc();
    pText[Length] = 0;
    std::memcpy(m_Data, &pText, sizeof(pText));
    std::memcpy(m_Data + sizeof(pText), &Length, sizeof(Length));
    m_Data[s_InlineLength] = s_LongMark;
    return pText;
}

void WqCXString::release() {
    if (m_Data[s_InlineLength] == s_LongMark)
        std::free(cstring());
}

// Takes over the other's text, which becomes empty.
void WqCXString::take(WqCXString& Other) {
    std::memcpy(m_Data, Other.m_Data, sizeof(m_Data));
    Other.reserve(0);
}

WqCXString operator+(const WqCXString& Left, const WqCXString& Right) {
    const std::size_t LeftLength = Left.length();
    const std::size_t RightLength = Right.length();
    WqCXString Result;
    char* pText = Result.reserve(LeftLength + RightLength);
    std::memcpy(pText, Left.cstring(), LeftLength);
    std::memcpy(pText + LeftLength, Right.cstring(), RightLength);
    return Result;
}

std::ostream& operator<<(std::ostream& Stream, const WqCXString& Text) {
    return Stream << Text.cstring();
}

bool operator==(const WqCXString& Left, const WqCXString& Right) {
    const std::size_t Length = Left.length();
    return Length == Right.length() && std::memcmp(Left.cstring(), Right.cstring(), Length) == 0;
}

namespace leda {

int compare(const WqCXString& Left, const WqCXString& Right) {
    const int Order = std::strcmp(Left.cstring(), Right.cstring());
    return (Order > 0) - (Order < 0);
}

} // namespace leda
