#include "Emitter/CNames.h"

#include <cstddef>

namespace hpn {

namespace {

// Keywords of C99 to C23 and C++, what <stdbool.h> and <stdint.h> define, predefined macros without
// underscores, and the functions for which compilers have built-in declarations.
constexpr std::string_view ReservedNames =
    "auto break case char const continue default do double else enum extern float for "
    "goto if inline int long register restrict return short signed sizeof static struct "
    "switch typedef union unsigned void volatile while alignas alignof bool constexpr "
    "false nullptr static_assert thread_local true typeof typeof_unqual asm and and_eq "
    "bitand bitor catch class compl const_cast delete dynamic_cast explicit export "
    "friend mutable namespace new not not_eq operator or or_eq private protected public "
    "reinterpret_cast static_cast template this throw try typeid typename using virtual "
    "wchar_t xor xor_eq main NULL linux unix i386 errno assert int8_t int16_t int32_t "
    "int64_t uint8_t uint16_t uint32_t uint64_t intptr_t uintptr_t intmax_t uintmax_t "
    "size_t ptrdiff_t abort abs acos acosf acosh acoshf acosl alloca asin asinf asinh "
    "atan atan2 atan2f atanf atanh bcmp bcopy bzero cabs cacos calloc carg casin catan "
    "cbrt ccos ceil ceilf cexp cimag clog conj copysign cos cosf cosh cpow cproj creal "
    "csin csqrt ctan dcgettext drem erf erfc execl execle execlp execv execve execvp "
    "exit exp exp10 exp2 expf expm1 fabs fabsf fdim ffs floor floorf fma fmax fmin fmod "
    "fork fprintf fputc fputs free frexp fscanf fwrite gamma gettext hypot ilogb imaxabs "
    "index isalnum isalpha isascii isblank iscntrl isdigit isfinite isgraph isinf "
    "islower isnan isnormal isprint ispunct isspace isupper isxdigit j0 j1 jn labs ldexp "
    "lgamma llabs llrint llround log log10 log1p log2 logb logf lrint lround malloc "
    "memchr memcmp memcpy memmove mempcpy memset modf nan nearbyint nextafter nexttoward "
    "pow pow10 powf printf putc putchar puts realloc remainder remquo rindex rint round "
    "roundf scalb scalbln scalbn scanf signbit significand sin sincos sinf sinh snprintf "
    "sprintf sqrt sqrtf sscanf stpcpy stpncpy strcasecmp strcat strchr strcmp strcpy "
    "strcspn strdup strfmon strftime strlen strncasecmp strncat strncmp strncpy strndup "
    "strpbrk strrchr strspn strstr tan tanf tanh tgamma toascii tolower toupper trunc "
    "vfprintf vfscanf vprintf vscanf vsnprintf vsprintf vsscanf y0 y1 yn ";

const std::unordered_set<std::string_view>& reservedNames() {
    static const std::unordered_set<std::string_view> Names = [] {
        std::unordered_set<std::string_view> Split;
        for (std::size_t Start = 0; Start < ReservedNames.size();) {
            const std::size_t End = ReservedNames.find(' ', Start);
            Split.insert(ReservedNames.substr(Start, End - Start));
            Start = End + 1;
        }
        return Split;
    }();
    return Names;
}

bool isLetterOrDigit(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_';
}

/// Names that C keeps for the implementation, that the runtime header takes, or whose spelling
/// <stdint.h> reserves.
bool isReservedForm(const std::string& Name) {
    const bool IsImplementation =
        Name.size() > 1 && Name[0] == '_' && (Name[1] == '_' || (Name[1] >= 'A' && Name[1] <= 'Z'));
    const auto startsWith = [&](const char* pStart) { return Name.rfind(pStart, 0) == 0; };
    const bool IsLimit =
        (startsWith("INT") || startsWith("UINT") || startsWith("SIZE_") || startsWith("PTRDIFF_") ||
         startsWith("SIG_ATOMIC_") || startsWith("WCHAR_") || startsWith("WINT_")) &&
        (Name.find("_M") != std::string::npos || Name.find("_C") != std::string::npos);
    return IsImplementation || IsLimit || startsWith("hpn_") || startsWith("HPN_");
}

std::string identifierLike(std::string_view Wanted) {
    std::string Name;
    for (char c : Wanted)
        if (isLetterOrDigit(c))
            Name += c;
        else if (!Name.empty())
            Name += '_';
    if (Name.empty() || (Name[0] >= '0' && Name[0] <= '9'))
        Name.insert(0, "v");
    return isReservedForm(Name) ? "x" + Name : Name;
}

} // namespace

bool CNames::isTaken(const std::string& Name) const {
    return m_Taken.count(Name) != 0 || reservedNames().count(Name) != 0 ||
           (m_pOuter && m_pOuter->isTaken(Name));
}

std::string CNames::take(std::string_view Wanted) {
    const std::string Stem = identifierLike(Wanted);
    std::string Name = Stem;
    for (int Number = 2; isTaken(Name); ++Number)
        Name = Stem + '_' + std::to_string(Number);
    m_Taken.insert(Name);
    return Name;
}

} // namespace hpn
