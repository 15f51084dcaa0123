#ifndef LEDA_SET_H
#define LEDA_SET_H

#include "LEDA/allocator.h"
#include "LEDA/compare.h"
#include "LEDA/sorted_arrays.h"
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
    // Null.
    set_item(std::nullptr_t) {}
    // Whether it is not null.
    explicit operator bool() const { return m_slot >= 0; }
    // Items are equal if both are null or both stand for the same element.
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
    // For range-for; elements are never changed in place.
    using value_type = T;
    class const_iterator;
    using iterator = const_iterator;

    // Empty.
    set() {}
    // A copy has elements of its own; a move takes them over and leaves the other empty.
    set(const set& other) { copy_from(other); }
    set(set&& other) noexcept { take(other); }
    set& operator=(const set& other);
    set& operator=(set&& other) noexcept;
    ~set() { release(); }

    // Inserting a present element and deleting an absent one change nothing.
    void insert(const T& x);
    void del(const T& x);
    bool member(const T& x) const;
    // Number of elements.
    int size() const { return m_size; }
    bool empty() const { return m_size == 0; }
    // Removes all elements; every item is stale afterwards.
    void clear();

    // Union and intersection, in place.
    void add(const set& other);
    void intersect_with(const set& other);
    // What at least one of the two has; the operands stay as they are.
    friend set operator+(set a, const set& b) {
        a.add(b);
        return a;
    }
    // What both have; the operands stay as they are.
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

    // The walk of range-for, in ascending order.
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
    static bool same(const T& a, const T& b) { return sorted_arrays::same(a, b); }
    static int order(const T& a, const T& b) { return sorted_arrays::order(a, b); }
    static void copy(T* to, const T* from, int n) {
        std::memcpy(static_cast<void*>(to), from, std::size_t(n) * sizeof(T));
    }
    // Copies between arrays that have a multiple of inline_slots, so many at a time: moves of a
    // fixed size need no call.
    static void copy_blocks(T* to, const T* from, int n) {
        for (int i = 0; i < n; i += inline_slots)
            std::memcpy(static_cast<void*>(to + i), from + i, inline_slots * sizeof(T));
    }
    static int capacity_for(int n);

    bool find_flat(const T& x, int& slot) const;
    void insert_flat(const T& x, int slot);
    void reserve_flat(int capacity);
    void copy_from(const set& other);
    void take(set& other) noexcept;
    void release();
    void copy_array(const T* from);
    void assign_sorted(const T* first, int n);
    void merge_flat(const set& other);
    void replace(int from, int to, const T* elements, int n);
    void replace_in_chunks(int from, int to, const T* elements, int n);
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
    // What the standard asks of a forward iterator. A default one is the end of every walk; two are
    // equal if they stand on the same element of the same set.
    using iterator_category = std::forward_iterator_tag;
    using value_type = T;
    using difference_type = std::ptrdiff_t;
    using pointer = const T*;
    using reference = const T&;

    const_iterator() = default;
    // The element, the next one, and whether both stand on the same.
    const T& operator*() const { return *m_current; }
    const T* operator->() const { return m_current; }
    const_iterator& operator++() {
        skip(1);
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
    // Elements that stand in a row from here on, up to a limit; and a step over some of them.
    int run(int limit) const { return m_end - m_current < limit ? int(m_end - m_current) : limit; }
    void skip(int n) {
        m_current += n;
        if (m_current == m_end)
            next_run();
    }
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
    if (this == &other)
        return *this;
    if (is_flat() && other.is_flat() && other.m_size <= m_capacity &&
        m_capacity <= 2 * other.m_size) {
        copy(data(), other.data(), other.m_size); // the array fits: it is kept
        m_size = other.m_size;
        return *this;
    }
    release();
    copy_from(other);
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
    if (is_flat() && other.is_flat()) {
        m_size =
            sorted_arrays::intersect<T, flat_slots>(data(), m_size, other.data(), other.m_size);
        return;
    }
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

// Looks at the end first, as elements mostly come in ascending order.
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
    const T fresh = x; // x may lie in the storage that moves
    if (m_size == flat_slots) {
        replace_in_chunks(slot, slot, &fresh, 1);
        return;
    }
    if (m_size == m_capacity)
        reserve_flat(2 * m_capacity);
    T* elements = data();
    std::memmove(elements + slot + 1, elements + slot, std::size_t(m_size - slot) * sizeof(T));
    elements[slot] = fresh;
    ++m_size;
}

template <class T, class Impl>
void set<T, Impl>::reserve_flat(int capacity) {
    T* grown = pool_allocate_array<T>(std::size_t(capacity));
    copy(grown, data(), m_size);
    release();
    m_array = grown;
    m_capacity = capacity;
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

// Takes m_size elements from another set's array.
template <class T, class Impl>
void set<T, Impl>::copy_array(const T* from) {
    if (m_size > inline_slots) {
        m_capacity = capacity_for(m_size);
        m_array = pool_allocate_array<T>(std::size_t(m_capacity));
    }
    copy_blocks(data(), from, m_size);
}

// Makes the elements those of a sorted array outside this set that has a multiple of inline_slots;
// the present storage is inline or an array.
template <class T, class Impl>
void set<T, Impl>::assign_sorted(const T* first, int n) {
    if (n > m_capacity) {
        release();
        m_capacity = capacity_for(n);
        m_array = pool_allocate_array<T>(std::size_t(m_capacity));
    }
    copy_blocks(data(), first, n);
    m_size = n;
}

// Elements that both sets have at the front or at the end are equal bytes: they cost no comparison.
// What is left of the other set is nothing, or lies behind all that is left of this one, or is
// merged with it.
template <class T, class Impl>
void set<T, Impl>::merge_flat(const set& other) {
    const T* a = data();
    const T* b = other.data();
    int from = 0, to = m_size, b_to = other.m_size;
    while (from < to && from < b_to && same(a[from], b[from]))
        ++from;
    while (from < to && from < b_to && same(a[to - 1], b[b_to - 1])) {
        --to;
        --b_to;
    }
    if (from == b_to)
        return;
    if (from == to || key_order<T>(a[to - 1], b[from]) < 0) {
        replace(to, to, b + from, b_to - from);
        return;
    }
    T merged[2 * flat_slots];
    const int n =
        sorted_arrays::unite<T, flat_slots>(a + from, to - from, b + from, b_to - from, merged);
    if (n == to - from)
        return;
    if (to - from == m_size && n <= flat_slots)
        assign_sorted(merged, n);
    else
        replace(from, to, merged, n);
}

// Puts elements from outside this set in place of a part of it, which is not longer; they keep the
// order.
template <class T, class Impl>
void set<T, Impl>::replace(int from, int to, const T* elements, int n) {
    const int rest = m_size - to;
    if (from + n + rest > flat_slots) {
        replace_in_chunks(from, to, elements, n);
        return;
    }
    T* target = data();
    const T* old = target;
    if (from + n + rest > m_capacity) {
        const int capacity = capacity_for(from + n + rest);
        target = pool_allocate_array<T>(std::size_t(capacity));
        if (from)
            copy(target, old, from);
        if (rest)
            copy(target + from + n, old + to, rest);
        copy(target + from, elements, n);
        release();
        m_array = target;
        m_capacity = capacity;
    } else {
        std::memmove(static_cast<void*>(target + from + n), target + to,
                     std::size_t(rest) * sizeof(T));
        copy(target + from, elements, n);
    }
    m_size = from + n + rest;
}

// The same for a set that becomes too large for an array.
template <class T, class Impl>
void set<T, Impl>::replace_in_chunks(int from, int to, const T* elements, int n) {
    chunks* large = pool_new<chunks>();
    large->append(data(), from);
    large->append(elements, n);
    large->append(data() + to, m_size - to);
    release();
    m_chunks = large;
    m_capacity = 0;
    m_size = large->size();
}

// Merges block by block: of the two next blocks as much as lies up to the smaller one's end.
template <class T, class Impl>
void set<T, Impl>::merge_chunks(const set& other) {
    chunks* merged = pool_new<chunks>();
    const_iterator a = begin(), b = other.begin();
    T block[2 * flat_slots];
    while (a != end() && b != end()) {
        int as = a.run(flat_slots), bs = b.run(flat_slots);
        const T& a_last = a.m_current[as - 1];
        const T& b_last = b.m_current[bs - 1];
        const int sign = order(a_last, b_last);
        if (sign < 0) {
            bs = sorted_arrays::lower_bound(b.m_current, bs, a_last);
            bs += order(b.m_current[bs], a_last) == 0;
        } else if (sign > 0) {
            as = sorted_arrays::lower_bound(a.m_current, as, b_last);
            as += order(a.m_current[as], b_last) == 0;
        }
        if (bs == 0 ||
            (as == bs && std::memcmp(a.m_current, b.m_current, std::size_t(as) * sizeof(T)) == 0))
            merged->append(a.m_current, as);
        else if (as == 0)
            merged->append(b.m_current, bs);
        else
            merged->append(block, sorted_arrays::unite<T, flat_slots>(a.m_current, as, b.m_current,
                                                                      bs, block));
        a.skip(as);
        b.skip(bs);
    }
    for (; a != end(); a.next_run())
        merged->append(a.m_current, a.run(chunks::capacity));
    for (; b != end(); b.next_run())
        merged->append(b.m_current, b.run(chunks::capacity));
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
