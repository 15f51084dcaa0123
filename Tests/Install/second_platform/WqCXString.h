#ifndef SECOND_WQCXSTRING_H
#define SECOND_WQCXSTRING_H

#include <cstdio>
#include <cstring>
#include <ostream>
#include <string>

class WqCXString {
public:
    WqCXString() = default;
    WqCXString(const char* pText) : m_Text(pText ? pText : "") {}
    WqCXString(unsigned int Number, bool IsHexadecimal, bool IsShortest) {
        char Digits[16];
        const int Width = IsShortest ? 1 : IsHexadecimal ? 8 : 10;
        std::snprintf(Digits, sizeof Digits, IsHexadecimal ? "%0*x" : "%0*u", Width, Number);
        m_Text = Digits;
    }
    char* cstring() const { return const_cast<char*>(m_Text.c_str()); }
    std::size_t length() const { return m_Text.size(); }
    friend WqCXString operator+(const WqCXString& Left, const WqCXString& Right) {
        return WqCXString((Left.m_Text + Right.m_Text).c_str());
    }
    friend bool operator==(const WqCXString& Left, const WqCXString& Right) {
        return Left.m_Text == Right.m_Text;
    }
    friend bool operator!=(const WqCXString& Left, const WqCXString& Right) {
        return Left.m_Text != Right.m_Text;
    }
    friend std::ostream& operator<<(std::ostream& Stream, const WqCXString& Text) {
        return Stream << Text.m_Text;
    }

private:
    std::string m_Text;
};

namespace leda {
inline int compare(const WqCXString& Left, const WqCXString& Right) {
    return std::strcmp(Left.cstring(), Right.cstring());
}
} // namespace leda

#endif
