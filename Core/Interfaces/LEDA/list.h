#ifndef LEDA_LIST_H
#define LEDA_LIST_H

#include "LEDA/allocator.h"
#include "LEDA/error.h"

#include <cstddef>
#include <iterator>
#include <utility>

namespace leda {

// Position of an element in a list: stays the same, and valid, while the element stays; null behind
// the end.
struct dlink {
    // The neighbours in the list; null at the ends.
    dlink* succ = nullptr;
    dlink* pred = nullptr;
};
// The form in which operations take and answer a position.
using list_item = dlink*;

// Doubly linked list that owns copies of its elements; each element is one block of the layer's
// pools.
//
// Appending, pushing, popping, deleting at an item, conc and size are O(1); copying, clear and
// search are linear; split costs the items in front of the cut. Order is insertion order. A walk
// with range-for fetches the next item before its body, so the body may delete the item it stands
// on; whether elements added during the walk are visited is open. Taking from an empty list is an
// error of the handler in LEDA/error.h.
template <class T>
class list {
    struct cell : dlink {
        explicit cell(const T& x) : element(x) {}
        T element;
    };
    template <class Value>
    class walk;

public:
    // For range-for and for code that asks a container for its types.
    using value_type = T;
    using iterator = walk<T>;
    using const_iterator = walk<const T>;

    // Empty.
    list() = default;
    // A copy has elements of its own, in the same order; a move takes the elements over with their
    // items and leaves the other empty.
    list(const list& other) { append_all(other); }
    list(list&& other) noexcept { swap(other); }
    list& operator=(const list& other);
    list& operator=(list&& other) noexcept;
    ~list() { clear(); }

    // Adds a copy of the element at the end (append) or at the front (push) and gives its item.
    list_item append(const T& x);
    list_item push(const T& x);
    // Removes the first or last element and answers it.
    T pop();
    T pop_back();
    // The first and the last element.
    const T& front() const { return m_first ? element(m_first) : no_front(); }
    T& front() { return m_first ? element(m_first) : no_front(); }
    const T& back() const { return m_last ? element(m_last) : no_back(); }
    T& back() { return m_last ? element(m_last) : no_back(); }

    // Items; null where there is none.
    list_item first() const { return m_first; }
    list_item last() const { return m_last; }
    list_item first_item() const { return m_first; }
    list_item last_item() const { return m_last; }
    list_item next_item(list_item it) const { return it ? it->succ : nullptr; }
    list_item succ(list_item it) const { return it->succ; }
    list_item pred(list_item it) const { return it->pred; }
    list_item stop_item() const { return nullptr; }

    // The element of an item.
    const T& contents(list_item it) const { return element(it); }
    const T& inf(list_item it) const { return element(it); }
    T& operator[](list_item it) { return element(it); }
    const T& operator[](list_item it) const { return element(it); }

    // Number of elements.
    int size() const { return m_size; }
    int length() const { return m_size; }
    bool empty() const { return m_size == 0; }
    // Destroys all elements; every item is stale afterwards.
    void clear();

    // Removes the item and answers its element.
    T del(list_item it);
    T del_item(list_item it) { return del(it); }
    // Takes over all items of the other list at the end; the other becomes empty. Items stay valid.
    void conc(list& other);
    // Moves the items before the given one to the first list, it and those behind to the second,
    // after clearing both; this list becomes empty. A null item puts all in the first. Items stay
    // valid. One of the two may be this list.
    void split(list_item it, list& before, list& rest);
    // First item whose element equals x, or null.
    list_item search(const T& x) const;
    // Stable merge sort, O(n log n), without moving elements: items keep their element.
    void sort(int (*cmp)(const T&, const T&));
    // Exchanges all elements; items stay valid.
    void swap(list& other) noexcept;

    // The walk of range-for, from the first element to the last.
    iterator begin() { return iterator(m_first); }
    iterator end() { return iterator(nullptr); }
    const_iterator begin() const { return const_iterator(m_first); }
    const_iterator end() const { return const_iterator(nullptr); }

    // True if the links of both directions and the size agree. Linear.
    bool check_consistency() const;

private:
    static T& element(dlink* it) { return static_cast<cell*>(it)->element; }
    void append_all(const list& other);
    void link_at_end(dlink* it);
    void unlink(dlink* it);
    static T& no_front();
    static T& no_back();
    static dlink* merge(dlink* a, dlink* b, int (*cmp)(const T&, const T&));

    dlink* m_first = nullptr; // null if empty
    dlink* m_last = nullptr;  // null if empty
    int m_size = 0;
};

// Iterator of range-for: stands on an item and already knows the next one.
template <class T>
template <class Value>
class list<T>::walk {
public:
    using iterator_category = std::input_iterator_tag;
    using value_type = T;
    using difference_type = std::ptrdiff_t;
    using pointer = Value*;
    using reference = Value&;

    explicit walk(dlink* it) : m_item(it), m_next(it ? it->succ : nullptr) {}
    Value& operator*() const { return element(m_item); }
    Value* operator->() const { return &element(m_item); }
    walk& operator++() {
        m_item = m_next;
        m_next = m_item ? m_item->succ : nullptr;
        return *this;
    }
    walk operator++(int) {
        walk old = *this;
        ++*this;
        return old;
    }
    bool operator==(const walk& other) const { return m_item == other.m_item; }
    bool operator!=(const walk& other) const { return m_item != other.m_item; }

private:
    dlink* m_item;
    dlink* m_next;
};

template <class T>
list<T>& list<T>::operator=(const list& other) {
    if (this != &other) {
        list copy(other);
        swap(copy);
    }
    return *this;
}

template <class T>
list<T>& list<T>::operator=(list&& other) noexcept {
    if (this != &other) {
        clear();
        swap(other);
    }
    return *this;
}

template <class T>
list_item list<T>::append(const T& x) {
    dlink* it = pool_new<cell>(x);
    link_at_end(it);
    return it;
}

template <class T>
list_item list<T>::push(const T& x) {
    dlink* it = pool_new<cell>(x);
    it->succ = m_first;
    (m_first ? m_first->pred : m_last) = it;
    m_first = it;
    ++m_size;
    return it;
}

template <class T>
T list<T>::pop() {
    return m_first ? del(m_first) : T(no_front());
}

template <class T>
T list<T>::pop_back() {
    return m_last ? del(m_last) : T(no_back());
}

template <class T>
void list<T>::clear() {
    for (dlink* it = m_first; it;) {
        dlink* next = it->succ;
        pool_delete(static_cast<cell*>(it));
        it = next;
    }
    m_first = m_last = nullptr;
    m_size = 0;
}

template <class T>
T list<T>::del(list_item it) {
    unlink(it);
    T result(std::move(element(it)));
    pool_delete(static_cast<cell*>(it));
    return result;
}

template <class T>
void list<T>::conc(list& other) {
    if (this == &other || !other.m_first)
        return;
    other.m_first->pred = m_last;
    (m_last ? m_last->succ : m_first) = other.m_first;
    m_last = other.m_last;
    m_size += other.m_size;
    other.m_first = other.m_last = nullptr;
    other.m_size = 0;
}

template <class T>
void list<T>::split(list_item it, list& before, list& rest) {
    list all;
    swap(all);
    before.clear();
    rest.clear();
    if (!it) {
        before.swap(all);
        return;
    }
    if (!it->pred) {
        rest.swap(all);
        return;
    }
    int count = 0;
    for (dlink* i = all.m_first; i != it; i = i->succ)
        ++count;
    before.m_first = all.m_first;
    before.m_last = it->pred;
    before.m_size = count;
    rest.m_first = it;
    rest.m_last = all.m_last;
    rest.m_size = all.m_size - count;
    before.m_last->succ = nullptr;
    it->pred = nullptr;
    all.m_first = all.m_last = nullptr;
    all.m_size = 0;
}

template <class T>
list_item list<T>::search(const T& x) const {
    for (dlink* it = m_first; it; it = it->succ)
        if (element(it) == x)
            return it;
    return nullptr;
}

// Bottom-up merging of runs: run i holds 2^i items or none, as the digits of a binary counter.
template <class T>
void list<T>::sort(int (*cmp)(const T&, const T&)) {
    dlink* runs[32] = {};
    int used = 0;
    for (dlink* it = m_first; it;) {
        dlink* next = it->succ;
        it->succ = nullptr;
        int i = 0;
        for (; i < used && runs[i]; ++i) {
            it = merge(runs[i], it, cmp);
            runs[i] = nullptr;
        }
        if (i == used)
            ++used;
        runs[i] = it;
        it = next;
    }
    dlink* sorted = nullptr;
    for (int i = 0; i < used; ++i)
        if (runs[i])
            sorted = sorted ? merge(runs[i], sorted, cmp) : runs[i];
    m_first = sorted;
    m_last = nullptr;
    for (dlink* it = sorted; it; it = it->succ) {
        it->pred = m_last;
        m_last = it;
    }
}

// Merges two runs along succ alone; on equal elements those of a go first.
template <class T>
dlink* list<T>::merge(dlink* a, dlink* b, int (*cmp)(const T&, const T&)) {
    dlink* first = nullptr;
    dlink** end = &first;
    while (a && b) {
        dlink*& smaller = cmp(element(b), element(a)) < 0 ? b : a;
        *end = smaller;
        end = &(*end)->succ;
        smaller = *end;
    }
    *end = a ? a : b;
    return first;
}

template <class T>
void list<T>::swap(list& other) noexcept {
    std::swap(m_first, other.m_first);
    std::swap(m_last, other.m_last);
    std::swap(m_size, other.m_size);
}

template <class T>
bool list<T>::check_consistency() const {
    int count = 0;
    dlink* before = nullptr;
    for (dlink* it = m_first; it; it = it->succ, ++count) {
        if (it->pred != before || count > m_size)
            return false;
        before = it;
    }
    return before == m_last && count == m_size;
}

template <class T>
void list<T>::append_all(const list& other) {
    for (dlink* it = other.m_first; it; it = it->succ)
        append(element(it));
}

template <class T>
void list<T>::link_at_end(dlink* it) {
    it->pred = m_last;
    (m_last ? m_last->succ : m_first) = it;
    m_last = it;
    ++m_size;
}

template <class T>
void list<T>::unlink(dlink* it) {
    (it->pred ? it->pred->succ : m_first) = it->succ;
    (it->succ ? it->succ->pred : m_last) = it->pred;
    --m_size;
}

template <class T>
T& list<T>::no_front() {
    report_error("list::front(): empty list", "list.h", __LINE__);
    return error_value<T>();
}

template <class T>
T& list<T>::no_back() {
    report_error("list::back(): empty list", "list.h", __LINE__);
    return error_value<T>();
}

} // namespace leda

#endif
