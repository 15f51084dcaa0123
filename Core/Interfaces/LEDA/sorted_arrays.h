#ifndef LEDA_SORTED_ARRAYS_H
#define LEDA_SORTED_ARRAYS_H

#include "LEDA/compare.h"

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace leda {

// What the sets do with short sorted arrays of small values: find, unite and intersect.
//
// The outcome of a comparison is too random for the processor to predict, so the loops turn it into
// a number and add it to a position instead of branching. Elements with an order_number are read
// once each, in a loop of their own in which no read waits for another; the others are compared
// pair by pair.
namespace sorted_arrays {

// Whether two elements have the same bytes, which for these types means that they are equal.
template <class T>
bool same(const T& a, const T& b) {
    return std::memcmp(&a, &b, sizeof(T)) == 0;
}

// The order of the element type: negative, 0 or positive. Equal bytes are not compared further.
template <class T>
int order(const T& a, const T& b) {
    return same(a, b) ? 0 : key_order<T>(a, b);
}

// Order of the elements of two arrays by their places: compared pair by pair.
template <class T>
class pair_order {
public:
    // The arrays, which must stay as long as the object; their sizes are not needed.
    pair_order(const T* a, int, const T* b, int) : m_a(a), m_b(b) {}
    // How element i of the first array stands to element j of the second.
    int operator()(std::ptrdiff_t i, std::ptrdiff_t j) const {
        return key_order<T>(m_a[i], m_b[j]);
    }

private:
    const T* m_a;
    const T* m_b;
};

// The same by numbers, for arrays of up to so many elements each.
template <class T, int limit>
class number_order {
public:
    // Reads the numbers of as and bs elements, limit at most.
    number_order(const T* a, int as, const T* b, int bs) {
        for (int i = 0; i < as; ++i)
            m_a[i] = order_number<T>::of(a[i]);
        for (int j = 0; j < bs; ++j)
            m_b[j] = order_number<T>::of(b[j]);
    }
    // How element i of the first array stands to element j of the second.
    int operator()(std::ptrdiff_t i, std::ptrdiff_t j) const {
        return (m_a[i] > m_b[j]) - (m_a[i] < m_b[j]);
    }

private:
    std::int64_t m_a[limit];
    std::int64_t m_b[limit];
};

// The faster of the two that the element type has.
template <class T, int limit>
using short_order =
    std::conditional_t<order_number<T>::known, number_order<T, limit>, pair_order<T>>;

// First place whose element is not before x: n if there is none. This one branches: while the
// processor guesses on, it reads the elements of the next steps ahead.
template <class T>
int lower_bound(const T* elements, int n, const T& x) {
    int low = 0;
    while (low < n) {
        const int middle = (low + n) / 2;
        if (order(elements[middle], x) < 0)
            low = middle + 1;
        else
            n = middle;
    }
    return low;
}

// Union of two arrays, of limit elements at most each: writes it to the front of a buffer with room
// for as + bs elements and answers its size. Of equal elements that of a is taken.
//
// Both ends are merged at once as long as both sides have two elements left: the two steps of a
// round do not wait for each other.
template <class T, int limit>
int unite(const T* a, int as, const T* b, int bs, T* merged) {
    const short_order<T, limit> order(a, as, b, bs);
    std::ptrdiff_t i = 0, j = 0, i_end = as, j_end = bs;
    T* low = merged;
    T* const high_end = merged + as + bs;
    T* high = high_end;
    while (i_end - i >= 2 && j_end - j >= 2) {
        const int at_low = order(i, j);
        const int at_high = order(i_end - 1, j_end - 1);
        const T* const firsts[2] = {b + j, a + i};
        const T* const lasts[2] = {b + j_end - 1, a + i_end - 1};
        const std::size_t low_from_a = order_detail::number(at_low <= 0);
        const std::size_t high_from_a = order_detail::number(at_high >= 0);
        *low++ = *firsts[low_from_a];
        *--high = *lasts[high_from_a];
        i += std::ptrdiff_t(low_from_a);
        j += at_low >= 0;
        i_end -= std::ptrdiff_t(high_from_a);
        j_end -= at_high <= 0;
    }
    while (i != i_end && j != j_end) {
        const int at_low = order(i, j);
        *low++ = at_low <= 0 ? a[i] : b[j];
        i += at_low <= 0;
        j += at_low >= 0;
    }
    while (i != i_end)
        *low++ = a[i++];
    while (j != j_end)
        *low++ = b[j++];
    if (low != high) // there were equal ones
        std::memmove(static_cast<void*>(low), high, std::size_t(high_end - high) * sizeof(T));
    return int(low - merged) + int(high_end - high);
}

// Keeps the elements of a that b has too, in place, and answers their number; limit elements at
// most each.
template <class T, int limit>
int intersect(T* a, int as, const T* b, int bs) {
    if (as == 0 || bs == 0 || key_order<T>(a[as - 1], b[0]) < 0)
        return 0;
    const short_order<T, limit> order(a, as, b, bs);
    int kept = 0;
    for (std::ptrdiff_t i = 0, j = 0; i < as && j < bs;) {
        const int sign = order(i, j);
        a[kept] = a[i];
        kept += sign == 0;
        i += sign <= 0;
        j += sign >= 0;
    }
    return kept;
}

} // namespace sorted_arrays

} // namespace leda

#endif
