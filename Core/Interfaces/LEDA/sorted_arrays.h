#ifndef LEDA_SORTED_ARRAYS_H
#define LEDA_SORTED_ARRAYS_H

#include "LEDA/compare.h"

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <limits>
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

// A short array with its numbers, read once, and at either end a number that stops a merge there.
template <class T, int limit>
class numbered_array {
public:
    // An element and its number.
    struct entry {
        // What order_number says.
        std::int64_t number;
        // The element.
        T element;
    };

    // Reads n elements, limit at most.
    numbered_array(const T* elements, int n) : m_last(m_entries + n) {
        for (int i = 0; i < n; ++i)
            m_entries[i + 1] = {order_number<T>::of(elements[i]), elements[i]};
        m_entries[0].number = std::numeric_limits<std::int64_t>::min();
        m_entries[n + 1].number = std::numeric_limits<std::int64_t>::max();
    }
    // The ends, for merges that move them towards each other.
    const entry* first() const { return m_entries + 1; }
    const entry* last() const { return m_last; }

private:
    entry m_entries[limit + 2];
    const entry* m_last;
};

// unite by numbers, for arrays that are not empty. The elements of both stand in one order, equal
// ones of a in front of those of b; its first half is merged from the front and the other from
// behind. Neither waits for the other, and the number of steps is known before, so that the
// processor has nothing to guess: an equal element takes a step too, but no place. Of an odd number
// the one in the middle is taken by both, as if there were two of it.
template <class T, int limit>
int unite_numbered(const T* a, int as, const T* b, int bs, T* merged) {
    using array = numbered_array<T, limit>;
    using entry = typename array::entry;
    const array of_a(a, as), of_b(b, bs);
    const entry *a_low = of_a.first(), *a_high = of_a.last();
    const entry *b_low = of_b.first(), *b_high = of_b.last();
    T* low = merged;
    T* const end = merged + as + bs;
    T* high = end;
    // The numbers taken last; none at first.
    std::int64_t at_low = ~(a_low->number < b_low->number ? a_low : b_low)->number;
    std::int64_t at_high = ~(a_high->number > b_high->number ? a_high : b_high)->number;
    for (int steps = (as + bs + 1) / 2; steps > 0; --steps) {
        const std::size_t from_a = order_detail::number(a_low->number <= b_low->number);
        const entry* const first = from_a ? a_low : b_low;
        a_low += from_a;
        b_low += 1 - from_a;
        *low = first->element; // the next is written over it if it equals the one before
        low += first->number != at_low;
        at_low = first->number;
        const std::size_t from_b = order_detail::number(a_high->number <= b_high->number);
        const entry* const last = from_b ? b_high : a_high;
        b_high -= from_b;
        a_high -= 1 - from_b;
        high -= last->number != at_high; // if not, it is a's and written over that of b
        at_high = last->number;
        *high = last->element;
    }
    high += at_low == at_high;
    const int rest = int(end - high);
    if (low != high)
        std::memmove(static_cast<void*>(low), high, std::size_t(rest) * sizeof(T));
    return int(low - merged) + rest;
}

// Union of two arrays, of limit elements at most each and not empty: writes it to the front of a
// buffer with room for as + bs elements and answers its size. Of equal elements that of a is taken.
template <class T, int limit>
int unite(const T* a, int as, const T* b, int bs, T* merged) {
    if constexpr (order_number<T>::known)
        return unite_numbered<T, limit>(a, as, b, bs, merged);
    T* end = merged;
    int i = 0, j = 0;
    while (i != as && j != bs) {
        const int sign = key_order<T>(a[i], b[j]);
        *end++ = sign <= 0 ? a[i] : b[j];
        i += sign <= 0;
        j += sign >= 0;
    }
    while (i != as)
        *end++ = a[i++];
    while (j != bs)
        *end++ = b[j++];
    return int(end - merged);
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
