#ifndef LEDA_SLIST_H
#define LEDA_SLIST_H

#include "LEDA/allocator.h"
#include "LEDA/error.h"

#include <utility>

namespace leda {

// Position of an element in a singly linked list.
struct slink {
    // The next element; null at the end.
    slink* succ = nullptr;
};
// The form in which operations take and answer a position.
using slist_item = slink*;

// Singly linked list that owns copies of its elements, in the layer's pools. Both ends take
// elements, the front gives them back; all O(1). Copying is linear and keeps the order.
template <class T>
class slist {
    struct cell : slink {
        explicit cell(const T& x) : element(x) {}
        T element;
    };

public:
    // Empty.
    slist() = default;
    // A copy has elements of its own; a move takes them over and leaves the other empty.
    slist(const slist& other);
    slist(slist&& other) noexcept { swap(other); }
    slist& operator=(slist other) noexcept {
        swap(other);
        return *this;
    }
    ~slist() { clear(); }

    // Adds a copy of the element at the front (push) or at the end (append) and gives its item.
    slist_item push(const T& x);
    slist_item append(const T& x);
    // Removes the first element and answers it.
    T pop();
    // The first element. Asking an empty list is an error of the handler in LEDA/error.h.
    const T& head() const { return m_first ? element(m_first) : no_head(); }
    T& head() { return m_first ? element(m_first) : no_head(); }

    // Items from the front on; null at the end.
    slist_item first_item() const { return m_first; }
    slist_item next_item(slist_item it) const { return it ? it->succ : nullptr; }
    // The element of an item, which must not be null.
    const T& contents(slist_item it) const { return element(it); }
    T& operator[](slist_item it) { return element(it); }

    // Number of elements.
    int size() const { return m_size; }
    bool empty() const { return m_size == 0; }
    // Destroys all elements; every item is stale afterwards.
    void clear();
    // Exchanges all elements, O(1).
    void swap(slist& other) noexcept;

private:
    static T& element(slink* it) { return static_cast<cell*>(it)->element; }
    static T& no_head();

    slink* m_first = nullptr; // null if empty
    slink* m_last = nullptr;  // null if empty
    int m_size = 0;
};

// Last in, first out.
template <class T>
class stack {
public:
    // Puts a copy of the element on top.
    void push(const T& x) { m_elements.push(x); }
    // Removes the top element and answers it.
    T pop() { return m_elements.pop(); }
    // The top element. Asking an empty stack, or taking from it, is an error of the handler in
    // LEDA/error.h.
    const T& top() const { return m_elements.head(); }
    T& top() { return m_elements.head(); }
    // Number of elements.
    bool empty() const { return m_elements.empty(); }
    int size() const { return m_elements.size(); }
    // Takes all elements away.
    void clear() { m_elements.clear(); }

private:
    slist<T> m_elements; // top first
};

template <class T>
slist<T>::slist(const slist& other) {
    for (slink* it = other.m_first; it; it = it->succ)
        append(element(it));
}

template <class T>
slist_item slist<T>::push(const T& x) {
    slink* it = pool_new<cell>(x);
    it->succ = m_first;
    m_first = it;
    if (!m_last)
        m_last = it;
    ++m_size;
    return it;
}

template <class T>
slist_item slist<T>::append(const T& x) {
    slink* it = pool_new<cell>(x);
    (m_last ? m_last->succ : m_first) = it;
    m_last = it;
    ++m_size;
    return it;
}

template <class T>
T slist<T>::pop() {
    if (!m_first) {
        report_error("slist: pop on empty list.", "slist.h", __LINE__);
        return error_value<T>();
    }
    slink* it = m_first;
    m_first = it->succ;
    if (!m_first)
        m_last = nullptr;
    --m_size;
    T result(std::move(element(it)));
    pool_delete(static_cast<cell*>(it));
    return result;
}

template <class T>
void slist<T>::clear() {
    for (slink* it = m_first; it;) {
        slink* next = it->succ;
        pool_delete(static_cast<cell*>(it));
        it = next;
    }
    m_first = m_last = nullptr;
    m_size = 0;
}

template <class T>
void slist<T>::swap(slist& other) noexcept {
    std::swap(m_first, other.m_first);
    std::swap(m_last, other.m_last);
    std::swap(m_size, other.m_size);
}

template <class T>
T& slist<T>::no_head() {
    report_error("slist<E>::head: empty list", "slist.h", __LINE__);
    return error_value<T>();
}

} // namespace leda

#endif
