#ifndef LEDA_SET_H
#define LEDA_SET_H

#include "LEDA/allocator.h"
#include "LEDA/compare.h"
#include "LEDA/sorted_chunks.h"

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <type_traits>
#include <utility>

namespace leda {

struct avl_tree {}; // names the usual implementation of a set; the layer has one only

template <class T, class Impl>
class set;

// Position of an element in a set: its key and where it was last seen. Stays valid while the
// element stays, through insertions and deletions of others. A default one is null.
class set_item {
public:
    set_item() = default;
    set_item(std::nullptr_t) {}
    explicit operator bool() const { return m_slot >= 0; }
    bool operator==(const set_item& other) const {
        return (m_slot >= 0) == (other.m_slot >= 0) && (m_slot < 0 || m_key == other.m_key);
    }
    bool operator!=(const set_item& other) const { return !(*this == other); }

private:
    template <class T, class Impl>
    friend class set;
    std::uint64_t m_key = 0; // bytes of the element
    int m_chunk = 0;         // hint: chunk of a large set
    int m_slot = -1;         // hint: place in it; -1 if null
};

// Sorted set of small values (pointers, handles, numbers: trivially copyable, up to 8 bytes),
// ordered by the comparison of its element type (LEDA/compare.h).
//
// Up to 4 elements lie in the object, up to 64 in one sorted array, more in sorted chunks: copying
// is a copy of bytes, a walk is ascending over contiguous memory. member, insert and del cost O(log
// n) comparisons, inserting behind the greatest element O(1); union and intersection merge, or
// search for the elements of a much smaller one. Copies are independent. No change of the set is
// allowed during a range-for over it; walks with items allow any change but the removal of the
// item's element.
template <class T, class Impl = avl_tree>
class set {
    static_assert(std::is_trivially_copyable_v<T> && sizeof(T) <= 8,
                  "sets hold pointers, handles and numbers");

public:
    using value_type = T;
    class const_iterator;
    using iterator = const_iterator;

    set() {}
    set(const set& other) { copy_from(other); }
    set(set&& other) noexcept { take(other); }
    set& operator=(const set& other);
    set& operator=(set&& other) noexcept;
    ~set() { release(); }

    // Inserting a present element and deleting an absent one change nothing.
    void insert(const T& x);
    void del(const T& x);
    bool member(const T& x) const;
    int size() const { return m_size; }
    bool empty() const { return m_size == 0; }
    void clear();

    // Union and intersection, in place and as new sets.
    void add(const set& other);
    void intersect_with(const set& other);
    friend set operator+(set a, const set& b) {
        a.add(b);
        return a;
    }
    friend set operator&(set a, const set& b) {
        a.intersect_with(b);
        return a;
    }

    // Items in ascending order; null at the end. min is the smallest element's.
    set_item first_item() const { return m_size ? item_at({0, 0}) : set_item(); }
    set_item next_item(set_item it) const;
    set_item min() const { return first_item(); }
    // The element of an item of this set; the reference holds until the set is changed.
    const T& key(set_item it) const { return *element(where(it)); }

    const_iterator begin() const;
    const_iterator end() const { return const_iterator(); }

    // True if the elements ascend strictly and the storage fits their number. Linear.
    bool check_consistency() const;

private:
    static constexpr int inline_slots = 4;
    static constexpr int flat_slots = 64;
    using chunks = sorted_chunks<T>;
    using position = typename chunks::position;

    bool is_flat() const { return m_capacity != 0; }
    T* data() { return m_capacity == inline_slots ? m_inline : m_array; }
    const T* data() const { return m_capacity == inline_slots ? m_inline : m_array; }
    static bool same(const T& a, const T& b) { return std::memcmp(&a, &b, sizeof(T)) == 0; }
    static int order(const T& a, const T& b) { return same(a, b) ? 0 : key_order<T>(a, b); }
    static int capacity_for(int n);

    bool find_flat(const T& x, int& slot) const;
    void insert_flat(const T& x, int slot);
    void reserve_flat(int capacity);
    void turn_into_chunks();
    void copy_from(const set& other);
    void take(set& other) noexcept;
    void release();
    void copy_array(const T* from);
    void assign_sorted(const T* first, int n);
    void merge_flat(const set& other);
    void assign_merged(const T* low, int lows, const T* high, int highs);
    void merge_chunks(const set& other);

    position where(set_item it) const;
    set_item item_at(position p) const;
    const T* element(position p) const { return is_flat() ? data() + p.slot : &m_chunks->at(p); }
    bool position_holds(position p, const T& x) const;

    int m_size = 0;
    int m_capacity = inline_slots; // slots of the array; inline_slots: in the object; 0: chunks
    union {
        T m_inline[inline_slots]{};
        T* m_array;
        chunks* m_chunks;
    };
};

// Walks the runs of contiguous elements one after the other.
template <class T, class Impl>
class set<T, Impl>::const_iterator {
public:
    using iterator_category = std::forward_iterator_tag;
    using value_type = T;
    using difference_type = std::ptrdiff_t;
    using pointer = const T*;
    using reference = const T&;

    const_iterator() = default;
    const T& operator*() const { return *m_current; }
    const T* operator->() const { return m_current; }
    const_iterator& operator++() {
        if (++m_current == m_end)
            next_run();
        return *this;
    }
    const_iterator operator++(int) {
        const_iterator old = *this;
        ++*this;
        return old;
    }
    bool operator==(const const_iterator& other) const { return m_current == other.m_current; }
    bool operator!=(const const_iterator& other) const { return m_current != other.m_current; }

private:
    friend class set;
    void next_run() {
        m_current = m_end = nullptr;
        if (m_chunks && m_chunk < m_chunks->chunks()) {
            m_current = m_chunks->entries(m_chunk);
            m_end = m_current + m_chunks->count(m_chunk);
            ++m_chunk;
        }
    }

    const T* m_current = nullptr; // null at the end of the walk
    const T* m_end = nullptr;     // end of the run
    const chunks* m_chunks = nullptr;
    int m_chunk = 0; // next run
};

template <class T, class Impl>
typename set<T, Impl>::const_iterator set<T, Impl>::begin() const {
    const_iterator it;
    if (m_size == 0)
        return it;
    if (is_flat()) {
        it.m_current = data();
        it.m_end = it.m_current + m_size;
    } else {
        it.m_chunks = m_chunks;
        it.next_run();
    }
    return it;
}

template <class T, class Impl>
set<T, Impl>& set<T, Impl>::operator=(const set& other) {
    if (this != &other) {
        release();
        copy_from(other);
    }
    return *this;
}

template <class T, class Impl>
set<T, Impl>& set<T, Impl>::operator=(set&& other) noexcept {
    if (this != &other) {
        release();
        take(other);
    }
    return *this;
}

template <class T, class Impl>
void set<T, Impl>::insert(const T& x) {
    if (is_flat()) {
        int slot;
        if (!find_flat(x, slot))
            insert_flat(x, slot);
        return;
    }
    position p;
    if (m_chunks->find([&x](const T& y) { return order(x, y); }, p))
        return;
    m_chunks->insert(p, T(x));
    ++m_size;
}

template <class T, class Impl>
void set<T, Impl>::del(const T& x) {
    if (is_flat()) {
        int slot;
        if (!find_flat(x, slot))
            return;
        T* elements = data();
        --m_size;
        std::memmove(elements + slot, elements + slot + 1, std::size_t(m_size - slot) * sizeof(T));
        return;
    }
    position p;
    if (!m_chunks->find([&x](const T& y) { return order(x, y); }, p))
        return;
    m_chunks->erase(p);
    --m_size;
}

template <class T, class Impl>
bool set<T, Impl>::member(const T& x) const {
    if (is_flat()) {
        int slot;
        return find_flat(x, slot);
    }
    position p;
    return m_chunks->find([&x](const T& y) { return order(x, y); }, p);
}

template <class T, class Impl>
void set<T, Impl>::clear() {
    release();
    m_size = 0;
    m_capacity = inline_slots;
}

template <class T, class Impl>
void set<T, Impl>::add(const set& other) {
    if (this == &other || other.m_size == 0)
        return;
    if (m_size == 0) {
        *this = other;
        return;
    }
    if (is_flat() && other.is_flat()) {
        merge_flat(other);
        return;
    }
    if (other.m_size < m_size / 16) {
        for (const T& x : other)
            insert(x);
        return;
    }
    merge_chunks(other);
}

template <class T, class Impl>
void set<T, Impl>::intersect_with(const set& other) {
    if (this == &other)
        return;
    set result;
    if (m_size < other.m_size / 16) {
        for (const T& x : *this)
            if (other.member(x))
                result.insert(x);
    } else if (other.m_size < m_size / 16) {
        for (const T& x : other)
            if (member(x))
                result.insert(x);
    } else {
        const_iterator a = begin(), b = other.begin();
        while (a != end() && b != end()) {
            const int sign = key_order<T>(*a, *b);
            if (sign == 0)
                result.insert(*a);
            if (sign <= 0)
                ++a;
            if (sign >= 0)
                ++b;
        }
    }
    *this = std::move(result);
}

template <class T, class Impl>
set_item set<T, Impl>::next_item(set_item it) const {
    if (!it)
        return set_item();
    position p = where(it);
    if (is_flat())
        return p.slot + 1 < m_size ? item_at({0, p.slot + 1}) : set_item();
    p = m_chunks->next(p);
    return m_chunks->valid(p) ? item_at(p) : set_item();
}

template <class T, class Impl>
bool set<T, Impl>::check_consistency() const {
    const auto precedes = [](const T& a, const T& b) { return key_order<T>(a, b) < 0; };
    if (!is_flat())
        return m_chunks->size() == m_size && m_chunks->check_consistency(precedes);
    for (int i = 1; i < m_size; ++i)
        if (!precedes(data()[i - 1], data()[i]))
            return false;
    return m_size >= 0 && m_size <= m_capacity;
}

template <class T, class Impl>
int set<T, Impl>::capacity_for(int n) {
    int capacity = inline_slots;
    while (capacity < n)
        capacity *= 2;
    return capacity;
}

// Looks from the end first, as elements mostly come in ascending order.
template <class T, class Impl>
bool set<T, Impl>::find_flat(const T& x, int& slot) const {
    const T* elements = data();
    int low = 0;
    int high = m_size;
    if (high > 0) {
        const int sign = order(x, elements[high - 1]);
        if (sign >= 0) {
            slot = sign == 0 ? high - 1 : high;
            return sign == 0;
        }
        --high;
    }
    while (low < high) {
        const int middle = (low + high) / 2;
        const int sign = order(x, elements[middle]);
        if (sign == 0) {
            slot = middle;
            return true;
        }
        if (sign > 0)
            low = middle + 1;
        else
            high = middle;
    }
    slot = low;
    return false;
}

template <class T, class Impl>
void set<T, Impl>::insert_flat(const T& x, int slot) {
    const T copy = x; // x may lie in the storage that moves
    if (m_size == flat_slots) {
        turn_into_chunks();
        m_chunks->insert({0, slot}, copy);
        ++m_size;
        return;
    }
    if (m_size == m_capacity)
        reserve_flat(2 * m_capacity);
    T* elements = data();
    std::memmove(elements + slot + 1, elements + slot, std::size_t(m_size - slot) * sizeof(T));
    elements[slot] = copy;
    ++m_size;
}

template <class T, class Impl>
void set<T, Impl>::reserve_flat(int capacity) {
    T* grown = pool_allocate_array<T>(std::size_t(capacity));
    std::memcpy(grown, data(), std::size_t(m_size) * sizeof(T));
    release();
    m_array = grown;
    m_capacity = capacity;
}

template <class T, class Impl>
void set<T, Impl>::turn_into_chunks() {
    static_assert(chunks::capacity > flat_slots);
    chunks* large = pool_new<chunks>();
    for (int i = 0; i < m_size; ++i)
        large->append(data()[i]);
    release();
    m_chunks = large;
    m_capacity = 0;
}

template <class T, class Impl>
void set<T, Impl>::copy_from(const set& other) {
    if (!other.is_flat() && other.m_size > flat_slots) {
        m_chunks = pool_new<chunks>(*other.m_chunks);
        m_size = other.m_size;
        m_capacity = 0;
        return;
    }
    m_capacity = inline_slots;
    m_size = other.m_size;
    if (other.m_capacity == inline_slots) {
        std::memcpy(static_cast<void*>(m_inline), other.m_inline, sizeof(m_inline));
        return;
    }
    if (other.is_flat()) {
        copy_array(other.m_array);
        return;
    }
    T elements[flat_slots];
    int n = 0;
    for (const T& x : other)
        elements[n++] = x;
    assign_sorted(elements, n);
}

template <class T, class Impl>
void set<T, Impl>::take(set& other) noexcept {
    m_size = other.m_size;
    m_capacity = other.m_capacity;
    if (m_capacity == inline_slots)
        std::memcpy(static_cast<void*>(m_inline), other.m_inline, sizeof(m_inline));
    else if (is_flat())
        m_array = other.m_array;
    else
        m_chunks = other.m_chunks;
    other.m_size = 0;
    other.m_capacity = inline_slots;
}

template <class T, class Impl>
void set<T, Impl>::release() {
    if (m_capacity == inline_slots)
        return;
    if (is_flat())
        pool_deallocate_array(m_array, std::size_t(m_capacity));
    else
        pool_delete(m_chunks);
}

// Takes m_size elements from another set's array. It has a multiple of inline_slots, as the new
// storage has, and is copied by so many at a time: moves of a fixed size need no call.
template <class T, class Impl>
void set<T, Impl>::copy_array(const T* from) {
    if (m_size > inline_slots) {
        m_capacity = capacity_for(m_size);
        m_array = pool_allocate_array<T>(std::size_t(m_capacity));
    }
    T* to = data();
    for (int i = 0; i < m_size; i += inline_slots)
        std::memcpy(static_cast<void*>(to + i), from + i, inline_slots * sizeof(T));
}

// Makes the elements those of a sorted array outside this set; the present storage is inline or an
// array.
template <class T, class Impl>
void set<T, Impl>::assign_sorted(const T* first, int n) {
    if (n > m_capacity) {
        release();
        m_capacity = capacity_for(n);
        m_array = pool_allocate_array<T>(std::size_t(m_capacity));
    }
    std::memcpy(static_cast<void*>(data()), first, std::size_t(n) * sizeof(T));
    m_size = n;
}

// Elements that both sets have at the front or at the end are equal bytes: they cost no comparison.
// The rest is merged from both ends at once, as long as both sides have two elements left: the two
// steps of a round do not wait for each other.
template <class T, class Impl>
void set<T, Impl>::merge_flat(const set& other) {
    T merged[2 * flat_slots];
    const T* a = data();
    const T* b = other.data();
    const T* a_end = a + m_size;
    const T* b_end = b + other.m_size;
    T* low = merged;
    T* const high_end = merged + 2 * flat_slots;
    T* high = high_end;
    while (a != a_end && b != b_end && same(*a, *b)) {
        *low++ = *a++;
        ++b;
    }
    while (a != a_end && b != b_end && same(a_end[-1], b_end[-1])) {
        *--high = *--a_end;
        --b_end;
    }
    while (a_end - a >= 2 && b_end - b >= 2) {
        const int at_low = key_order<T>(*a, *b);
        const int at_high = key_order<T>(a_end[-1], b_end[-1]);
        const T* const firsts[2] = {b, a};
        const T* const ends[2] = {b_end, a_end};
        const std::size_t low_from_a = order_detail::number(at_low <= 0);
        const std::size_t high_from_a = order_detail::number(at_high >= 0);
        *low++ = *firsts[low_from_a];
        *--high = ends[high_from_a][-1];
        a += low_from_a;
        b += order_detail::number(at_low >= 0);
        a_end -= high_from_a;
        b_end -= order_detail::number(at_high <= 0);
    }
    while (a != a_end && b != b_end) {
        const int sign = key_order<T>(*a, *b);
        const T* const firsts[2] = {b, a};
        const std::size_t from_a = order_detail::number(sign <= 0);
        *low++ = *firsts[from_a];
        a += from_a;
        b += order_detail::number(sign >= 0);
    }
    while (a != a_end)
        *low++ = *a++;
    while (b != b_end)
        *low++ = *b++;
    assign_merged(merged, int(low - merged), high, int(high_end - high));
}

// Makes the elements those of two runs, the second behind the first, outside this set. There are no
// fewer than now, and no more without a change.
template <class T, class Impl>
void set<T, Impl>::assign_merged(const T* low, int lows, const T* high, int highs) {
    const int n = lows + highs;
    if (n == m_size)
        return;
    if (n <= flat_slots) {
        if (n > m_capacity)
            reserve_flat(capacity_for(n));
        T* to = data();
        for (int i = 0; i < lows; ++i)
            *to++ = low[i];
        for (int i = 0; i < highs; ++i)
            *to++ = high[i];
        m_size = n;
        return;
    }
    turn_into_chunks();
    m_chunks->clear();
    for (int i = 0; i < lows; ++i)
        m_chunks->append(low[i]);
    for (int i = 0; i < highs; ++i)
        m_chunks->append(high[i]);
    m_size = n;
}

template <class T, class Impl>
void set<T, Impl>::merge_chunks(const set& other) {
    chunks* merged = pool_new<chunks>();
    const_iterator a = begin(), b = other.begin();
    while (a != end() && b != end()) {
        const int sign = order(*a, *b);
        merged->append(sign <= 0 ? *a : *b);
        if (sign <= 0)
            ++a;
        if (sign >= 0)
            ++b;
    }
    for (; a != end(); ++a)
        merged->append(*a);
    for (; b != end(); ++b)
        merged->append(*b);
    release();
    m_chunks = merged;
    m_capacity = 0;
    m_size = merged->size();
}

template <class T, class Impl>
bool set<T, Impl>::position_holds(position p, const T& x) const {
    if (is_flat())
        return p.chunk == 0 && p.slot < m_size && same(data()[p.slot], x);
    return m_chunks->valid(p) && same(m_chunks->at(p), x);
}

// Where the item's element stands now: mostly where it stood.
template <class T, class Impl>
typename set<T, Impl>::position set<T, Impl>::where(set_item it) const {
    T x;
    std::memcpy(static_cast<void*>(&x), &it.m_key, sizeof(T));
    position p{it.m_chunk, it.m_slot};
    if (position_holds(p, x))
        return p;
    if (is_flat()) {
        p.chunk = 0;
        find_flat(x, p.slot);
        return p;
    }
    m_chunks->find([&x](const T& y) { return order(x, y); }, p);
    return p;
}

template <class T, class Impl>
set_item set<T, Impl>::item_at(position p) const {
    set_item it;
    std::memcpy(&it.m_key, element(p), sizeof(T));
    it.m_chunk = p.chunk;
    it.m_slot = p.slot;
    return it;
}

} // namespace leda

#endif
