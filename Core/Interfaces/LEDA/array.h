#ifndef LEDA_ARRAY_H
#define LEDA_ARRAY_H

#include "LEDA/allocator.h"
#include "LEDA/error.h"

#include <cstddef>
#include <new>
#include <type_traits>
#include <utility>

namespace leda {

// Reports bounds that no array can have, with the numbers in the text.
HPNPLATFORM_EXPORT void report_bad_bounds(int a, int b, const char* header, int line);

// Array over the indices low() to high(): a value type, its elements start as default values.
// operator[] does not check its index. An upper bound more than one below the lower is an error of
// the handler in LEDA/error.h and gives an empty array. Resizing keeps the elements of the indices
// that both bounds have in common.
template <class T>
class array {
public:
    // No indices: low() is 0, high() is -1.
    array() = default;
    // Indices 0 to n - 1.
    explicit array(int n) : array(0, n - 1) {}
    // Indices a to b.
    array(int a, int b) { allocate(a, b, nullptr); }
    // A copy with elements of its own; a move takes the elements over and leaves the other without
    // any.
    array(const array& other);
    array(array&& other) noexcept { swap(other); }
    array& operator=(array other) noexcept {
        swap(other);
        return *this;
    }
    ~array() { release(); }

    // The element of an index from low() to high(), which is not checked.
    T& operator[](int i) { return m_elements[std::ptrdiff_t(i) - m_low]; }
    const T& operator[](int i) const { return m_elements[std::ptrdiff_t(i) - m_low]; }
    // Number of elements, smallest and greatest index; high() is low() - 1 without elements.
    int size() const { return m_size; }
    int low() const { return m_low; }
    int high() const { return m_low + m_size - 1; }
    // New bounds, 0 to n - 1 or a to b; costs both sizes. References to elements are stale
    // afterwards.
    void resize(int n) { resize(0, n - 1); }
    void resize(int a, int b);
    // Exchanges elements and bounds, O(1).
    void swap(array& other) noexcept;

private:
    void allocate(int a, int b, array* old);
    void release();

    T* m_elements = nullptr; // m_size elements, null if there are none
    int m_low = 0;
    int m_size = 0;
};

template <class T>
array<T>::array(const array& other) : m_low(other.m_low), m_size(other.m_size) {
    if (m_size == 0)
        return;
    m_elements = pool_allocate_array<T>(std::size_t(m_size));
    for (int i = 0; i < m_size; ++i)
        ::new (static_cast<void*>(m_elements + i)) T(other.m_elements[i]);
}

template <class T>
void array<T>::resize(int a, int b) {
    array fresh;
    fresh.allocate(a, b, this);
    swap(fresh);
}

template <class T>
void array<T>::swap(array& other) noexcept {
    std::swap(m_elements, other.m_elements);
    std::swap(m_low, other.m_low);
    std::swap(m_size, other.m_size);
}

// Storage for the indices a to b, filled from the old array where it has the index.
template <class T>
void array<T>::allocate(int a, int b, array* old) {
    const long long count = static_cast<long long>(b) - a + 1;
    if (count < 0 || count > 0x7fffffff) {
        report_bad_bounds(a, b, "array.h", __LINE__);
        return;
    }
    m_low = a;
    m_size = int(count);
    if (m_size == 0)
        return;
    m_elements = pool_allocate_array<T>(std::size_t(m_size));
    for (int i = 0; i < m_size; ++i) {
        void* place = static_cast<void*>(m_elements + i);
        const long long index = static_cast<long long>(a) + i;
        if (old && index >= old->m_low && index < static_cast<long long>(old->m_low) + old->m_size)
            ::new (place) T(std::move((*old)[int(index)]));
        else
            ::new (place) T();
    }
}

template <class T>
void array<T>::release() {
    if (!m_elements)
        return;
    if constexpr (!std::is_trivially_destructible_v<T>)
        for (int i = 0; i < m_size; ++i)
            m_elements[i].~T();
    pool_deallocate_array(m_elements, std::size_t(m_size));
}

} // namespace leda

#endif
