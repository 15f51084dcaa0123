#ifndef WQCXSTRING_H
#define WQCXSTRING_H

#include "HpnPlatformExport.h"

#include <cstddef>
#include <iosfwd>

// Text as a value: names of procedures, calls and files.
//
// A text of up to 23 characters lies in the object, a longer one in a block of malloc's of its own,
// so that a string may be made in one module and destroyed in another. Copies are independent. The
// text ends with a zero character and holds none.
class HPNPLATFORM_EXPORT WqCXString {
public:
    // The empty text.
    WqCXString();
    // A copy has a text of its own; a move leaves the other empty.
    WqCXString(const WqCXString& Other);
    WqCXString(WqCXString&& Other) noexcept;
    // A copy of the text; null counts as empty.
    WqCXString(const char* pText);
    // A number as text: decimal digits, or hexadecimal ones in lower case. With the second flag the
    // shortest text, as "12" or "c"; without it padded with zeros to the full width of 32 bits, ten
    // decimal or eight hexadecimal digits.
    WqCXString(unsigned int Number, bool IsHexadecimal, bool IsShortest);
    ~WqCXString();

    // The same for a string that exists; its former text is gone.
    WqCXString& operator=(const WqCXString& Other);
    WqCXString& operator=(WqCXString&& Other) noexcept;

    // The text. It belongs to the string and holds until the string is assigned to or destroyed.
    char* cstring() const;
    // Number of characters.
    std::size_t length() const;

private:
    friend HPNPLATFORM_EXPORT WqCXString operator+(const WqCXString& Left, const WqCXString& Right);
    static constexpr std::size_t s_InlineLength = 23;

    char* reserve(std::size_t Length);
    void release();
    void take(WqCXString& Other);

    // The text itself, or the pointer to it and its length. The last byte tells: 23 less the
    // length, which is the zero behind a text of 23 characters, or s_LongMark.
    static constexpr char s_LongMark = 127;
    alignas(8) char m_Data[s_InlineLength + 1];
};

// Both texts, the right one behind the left one.
HPNPLATFORM_EXPORT WqCXString operator+(const WqCXString& Left, const WqCXString& Right);
// Writes the text as it is.
HPNPLATFORM_EXPORT std::ostream& operator<<(std::ostream& Stream, const WqCXString& Text);
// Whether both texts have the same characters.
HPNPLATFORM_EXPORT bool operator==(const WqCXString& Left, const WqCXString& Right);
inline bool operator!=(const WqCXString& Left, const WqCXString& Right) {
    return !(Left == Right);
}

namespace leda {
// Order of strings as keys: -1, 0 or 1, character by character as unsigned numbers.
HPNPLATFORM_EXPORT int compare(const WqCXString& Left, const WqCXString& Right);
} // namespace leda

#endif
