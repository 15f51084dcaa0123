#ifndef LEDA_H_ARRAY_H
#define LEDA_H_ARRAY_H

#include "LEDA/allocator.h"
#include "LEDA/map.h"

#include <cstddef>
#include <utility>

namespace leda {

// Position of an entry in a hashed array: stays valid while the entry stays; null behind the end.
struct ch_hash_elem {
    // The neighbours in order of insertion; null at the ends.
    ch_hash_elem* succ = nullptr; // in order of insertion
    ch_hash_elem* pred = nullptr;
    ch_hash_elem* chain = nullptr; // next entry of the same bucket, in an array with an index
};
// The form in which operations take and answer a position.
using h_array_item = ch_hash_elem*;

// Hashed array from pointers, handles or small integers to values, walked in the order of
// insertion: the order in which the entries were made, the same in every run, whatever the keys'
// addresses.
//
// Up to 8 entries are searched one after the other; more get an index of buckets. All operations on
// one entry are O(1) expected, copying and clear are linear. Items and references to values stay
// valid while their entry stays. The item under a walk may be deleted once the next one was
// fetched.
template <class K, class V>
class h_array {
    struct entry : ch_hash_elem {
        entry(const K& k, const V& v) : key(k), value(v) {}
        K key;
        V value;
    };

public:
    // Position of an entry.
    using item = h_array_item;

    // operator[] makes a missing entry with the default given here, or with V().
    h_array() : m_default() {}
    explicit h_array(const V& dflt) : m_default(dflt) {}
    h_array(const h_array& other) : m_default(other.m_default) { copy_from(other); }
    h_array(h_array&& other) noexcept : m_default(std::move(other.m_default)) {
        swap_entries(other);
    }
    h_array& operator=(const h_array& other);
    h_array& operator=(h_array&& other) noexcept;
    ~h_array() { clear(); }

    // The value of the key; makes the entry if it is missing.
    V& operator[](const K& key);
    // The item of the key or null.
    item lookup(const K& key) const;
    // Makes an entry for a key that has none yet.
    item fast_insert(const K& key, const V& value);
    // Removes the entry of the key, if there is one.
    void del(const K& key);
    // Whether the key has an entry.
    bool defined(const K& key) const { return lookup(key) != nullptr; }

    // Key and value of an item, which must not be null.
    const K& key(item it) const { return static_cast<entry*>(it)->key; }
    V& inf(item it) { return static_cast<entry*>(it)->value; }
    const V& inf(item it) const { return static_cast<entry*>(it)->value; }

    // Number of entries.
    int size() const { return m_size; }
    bool empty() const { return m_size == 0; }
    // Removes all entries; the default stays. Every item is stale afterwards.
    void clear();
    // Items in order of insertion; null at the end.
    item first_item() const { return m_first; }
    item next_item(item it) const { return it ? it->succ : nullptr; }

    // True if the links of both directions, the size and the index agree. Linear, expected.
    bool check_consistency() const;

private:
    static constexpr int linear_limit = 8; // entries without an index

    std::size_t bucket(const K& key) const { return hash_detail::home(key, m_log_buckets); }
    void rebuild_index();
    void drop_index();
    void copy_from(const h_array& other);
    void swap_entries(h_array& other) noexcept;

    ch_hash_elem* m_first = nullptr;
    ch_hash_elem* m_last = nullptr;
    ch_hash_elem** m_buckets =
        nullptr; // index of 2^m_log_buckets chains; null while the array is small
    int m_log_buckets = 0;
    int m_size = 0;
    V m_default;
};

template <class K, class V>
h_array<K, V>& h_array<K, V>::operator=(const h_array& other) {
    if (this != &other) {
        clear();
        m_default = other.m_default;
        copy_from(other);
    }
    return *this;
}

template <class K, class V>
h_array<K, V>& h_array<K, V>::operator=(h_array&& other) noexcept {
    if (this != &other) {
        clear();
        m_default = std::move(other.m_default);
        swap_entries(other);
    }
    return *this;
}

template <class K, class V>
V& h_array<K, V>::operator[](const K& key) {
    item it = lookup(key);
    return inf(it ? it : fast_insert(key, m_default));
}

template <class K, class V>
h_array_item h_array<K, V>::lookup(const K& key) const {
    if (m_buckets) {
        ch_hash_elem* it = m_buckets[bucket(key)];
        while (it && this->key(it) != key)
            it = it->chain;
        return it;
    }
    ch_hash_elem* it = m_first;
    while (it && this->key(it) != key)
        it = it->succ;
    return it;
}

template <class K, class V>
h_array_item h_array<K, V>::fast_insert(const K& key, const V& value) {
    entry* it = pool_new<entry>(key, value);
    it->pred = m_last;
    (m_last ? m_last->succ : m_first) = it;
    m_last = it;
    ++m_size;
    if (m_size > (m_buckets ? 1 << m_log_buckets : linear_limit)) {
        rebuild_index();
    } else if (m_buckets) {
        ch_hash_elem*& head = m_buckets[bucket(key)];
        it->chain = head;
        head = it;
    }
    return it;
}

template <class K, class V>
void h_array<K, V>::del(const K& key) {
    ch_hash_elem* it = lookup(key);
    if (!it)
        return;
    if (m_buckets) {
        ch_hash_elem** link = &m_buckets[bucket(key)];
        while (*link != it)
            link = &(*link)->chain;
        *link = it->chain;
    }
    (it->pred ? it->pred->succ : m_first) = it->succ;
    (it->succ ? it->succ->pred : m_last) = it->pred;
    --m_size;
    pool_delete(static_cast<entry*>(it));
}

template <class K, class V>
void h_array<K, V>::clear() {
    for (ch_hash_elem* it = m_first; it;) {
        ch_hash_elem* next = it->succ;
        pool_delete(static_cast<entry*>(it));
        it = next;
    }
    drop_index();
    m_first = m_last = nullptr;
    m_size = 0;
}

template <class K, class V>
bool h_array<K, V>::check_consistency() const {
    int count = 0;
    ch_hash_elem* before = nullptr;
    for (ch_hash_elem* it = m_first; it; it = it->succ, ++count) {
        if (it->pred != before || count > m_size || lookup(key(it)) != it)
            return false;
        before = it;
    }
    return before == m_last && count == m_size;
}

// Four buckets for each entry at first, down to one before the next doubling.
template <class K, class V>
void h_array<K, V>::rebuild_index() {
    drop_index();
    m_log_buckets = 5;
    while ((1 << m_log_buckets) < 2 * m_size)
        ++m_log_buckets;
    const std::size_t buckets = std::size_t(1) << m_log_buckets;
    m_buckets = pool_allocate_array<ch_hash_elem*>(buckets);
    for (std::size_t i = 0; i < buckets; ++i)
        m_buckets[i] = nullptr;
    for (ch_hash_elem* it = m_first; it; it = it->succ) {
        ch_hash_elem*& head = m_buckets[bucket(key(it))];
        it->chain = head;
        head = it;
    }
}

template <class K, class V>
void h_array<K, V>::drop_index() {
    if (m_buckets)
        pool_deallocate_array(m_buckets, std::size_t(1) << m_log_buckets);
    m_buckets = nullptr;
}

template <class K, class V>
void h_array<K, V>::copy_from(const h_array& other) {
    for (ch_hash_elem* it = other.m_first; it; it = it->succ)
        fast_insert(other.key(it), other.inf(it));
}

template <class K, class V>
void h_array<K, V>::swap_entries(h_array& other) noexcept {
    std::swap(m_first, other.m_first);
    std::swap(m_last, other.m_last);
    std::swap(m_buckets, other.m_buckets);
    std::swap(m_log_buckets, other.m_log_buckets);
    std::swap(m_size, other.m_size);
}

} // namespace leda

#endif
