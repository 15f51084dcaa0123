#ifndef LEDA_MAP_H
#define LEDA_MAP_H

#include "LEDA/allocator.h"
#include "LEDA/graph_types.h"

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <new>
#include <type_traits>
#include <utility>

namespace leda {

namespace hash_detail {

constexpr std::uint64_t golden = 0x9E3779B97F4A7C15u; // 2^64 divided by the golden ratio

// The bits of a key, never all ones: a pointer or an integer of up to 32 bits.
template <class K>
std::uint64_t bits(const K& key) {
    if constexpr (std::is_pointer_v<K>) {
        return reinterpret_cast<std::uintptr_t>(key);
    } else {
        static_assert((std::is_integral_v<K> || std::is_enum_v<K>)&&sizeof(K) <= 4,
                      "keys are pointers, handles and integers of up to 32 bits");
        return std::uint32_t(key);
    }
}

// Handles lie densely in the pools: in a table of some size each page of memory has a block of 64
// slots, in the order of the page's 64 lines. Handles made one after the other then mostly are
// neighbours in the table as well, and the object behind a key need not be read.
template <class K>
constexpr bool is_handle = std::is_same_v<K, node> || std::is_same_v<K, edge>;
constexpr int log_block = 6;

template <class K>
bool by_blocks(int log_slots) {
    return is_handle<K> && log_slots >= log_block + 2;
}

// Preferred slot in a table of 2^log_slots. Integers go by their value: they are dense, so a table
// over them has hardly a collision and is walked in the order of memory. Pointers are spread by
// multiplication, or the pages are where a table goes by blocks.
template <class K>
std::size_t home(const K& key, int log_slots) {
    if constexpr (std::is_pointer_v<K>) {
        if (by_blocks<K>(log_slots)) {
            const std::uint64_t line = bits(key) >> 6;
            const std::uint64_t block =
                ((line >> log_block) * golden) >> (64 + log_block - log_slots);
            return std::size_t(block << log_block | (line & ((1u << log_block) - 1)));
        }
        return std::size_t((bits(key) * golden) >> (64 - log_slots));
    } else {
        return std::size_t(bits(key)) & ((std::size_t(1) << log_slots) - 1);
    }
}

// How far apart, by one bit of the slot's number, the slots lie that a key tries first. Where two
// pages have the same block, the keys of one go to another block side by side.
template <class K>
int log_distance(int log_slots) {
    return by_blocks<K>(log_slots) ? log_block : 0;
}

} // namespace hash_detail

// Hashed map from pointers, handles or small integers to values: one flat table with open
// addressing, no order.
//
// An entry is made by operator[] and stays until the map is cleared; there is no removal of one
// entry. Lookup and insertion take O(1) expected; the table is at most three quarters full, begins
// with 8 slots at the first entry and doubles. Clearing costs the table's size, which a map with
// few entries keeps small. A reference from operator[] or lookup holds until the next entry is
// made: never write map[a] = map[b] where map[b] may be made. What a key points to is never read.
template <class K, class V>
class map {
public:
    // A missing entry is made with the default given here, or with V().
    map() : m_default() {}
    explicit map(const V& dflt) : m_default(dflt) {}
    // A copy has values of its own and the same default; a move leaves the other empty.
    map(const map& other) : m_default(other.m_default) { copy_from(other); }
    map(map&& other) noexcept : m_default(std::move(other.m_default)) { swap_table(other); }
    map& operator=(const map& other);
    map& operator=(map&& other) noexcept;
    ~map() { release(); }

    // The value of the key; makes the entry with the default if it is missing.
    V& operator[](const K& key);
    // The value of the key or null.
    const V* lookup(const K& key) const;
    V* lookup(const K& key) { return const_cast<V*>(std::as_const(*this).lookup(key)); }
    // Whether the key has an entry; makes none.
    bool defined(const K& key) const { return lookup(key) != nullptr; }

    // Number of entries.
    int size() const { return m_size; }
    bool empty() const { return m_size == 0; }
    // Removes all entries and gives the table back.
    void clear();
    // Removes all entries and keeps the table for the next ones, unless it is far too large for
    // what was in it.
    void clear_entries();

    // True if each entry is found under its key's probe sequence and the count agrees. Linear in
    // the table.
    bool check_consistency() const;

private:
    static constexpr std::uint64_t no_key = 0;
    struct slot {
        std::uint64_t tag; // bits of the key plus 1; no_key if free
        union {
            V value; // lives only while the slot has a key
        };
        slot() = delete;
        ~slot() = delete;
    };
    // The slots of a key in the order to try: four of one neighbourhood, then pseudo-random ones
    // that in the end reach every slot. Keys whose homes fall together so do not pile up behind
    // each other.
    struct probe {
        std::size_t base;
        std::uint64_t perturb;
        int log_distance;
        std::size_t step = 0;
        std::size_t current() const { return base ^ step << log_distance; }
        void advance(std::size_t mask) {
            if (++step < 4)
                return;
            step = 0;
            base = (base * 5 + 1 + std::size_t(perturb)) & mask;
            perturb >>= 5;
        }
    };

    static std::uint64_t tag_of(const K& key) { return hash_detail::bits(key) + 1; }
    probe probe_of(std::size_t home, std::uint64_t tag) const {
        return {home, tag * hash_detail::golden, hash_detail::log_distance<K>(m_log_slots)};
    }
    std::size_t slots() const { return m_slots ? std::size_t(1) << m_log_slots : 0; }
    std::size_t home_of_tag(std::uint64_t tag) const;

    slot* find(std::size_t home, std::uint64_t tag) const;
    V& make(slot* s, std::uint64_t tag, const K& key);
    void new_table(int log_slots);
    void grow();
    void copy_from(const map& other);
    void destroy_values();
    void release();
    void swap_table(map& other) noexcept;

    slot* m_slots = nullptr; // null before the first entry
    int m_log_slots = 0;
    int m_size = 0;
    V m_default;
};

template <class K, class V>
map<K, V>& map<K, V>::operator=(const map& other) {
    if (this != &other) {
        clear();
        m_default = other.m_default;
        copy_from(other);
    }
    return *this;
}

template <class K, class V>
map<K, V>& map<K, V>::operator=(map&& other) noexcept {
    if (this != &other) {
        clear();
        m_default = std::move(other.m_default);
        swap_table(other);
    }
    return *this;
}

template <class K, class V>
V& map<K, V>::operator[](const K& key) {
    const std::uint64_t tag = tag_of(key);
    slot* s = m_slots ? find(hash_detail::home(key, m_log_slots), tag) : nullptr;
    if (s && s->tag == tag)
        return s->value;
    return make(s, tag, key);
}

template <class K, class V>
const V* map<K, V>::lookup(const K& key) const {
    if (!m_slots)
        return nullptr;
    const std::uint64_t tag = tag_of(key);
    const slot* s = find(hash_detail::home(key, m_log_slots), tag);
    return s->tag == tag ? &s->value : nullptr;
}

template <class K, class V>
void map<K, V>::clear() {
    release();
    m_slots = nullptr;
    m_log_slots = 0;
    m_size = 0;
}

template <class K, class V>
void map<K, V>::clear_entries() {
    if (std::size_t(m_size) * 16 < slots() && slots() > 64) {
        clear();
        return;
    }
    destroy_values();
    for (std::size_t i = 0; i < slots(); ++i)
        m_slots[i].tag = no_key;
    m_size = 0;
}

template <class K, class V>
bool map<K, V>::check_consistency() const {
    int count = 0;
    for (std::size_t i = 0; i < slots(); ++i) {
        if (m_slots[i].tag == no_key)
            continue;
        ++count;
        const std::uint64_t tag = m_slots[i].tag;
        probe p = probe_of(home_of_tag(tag), tag);
        while (p.current() != i && m_slots[p.current()].tag != no_key &&
               m_slots[p.current()].tag != tag)
            p.advance(slots() - 1);
        if (p.current() != i)
            return false;
    }
    return count == m_size && (!m_slots || std::size_t(m_size) * 4 <= slots() * 3);
}

// Turns the bits back into the key, for the slots of an existing entry.
template <class K, class V>
std::size_t map<K, V>::home_of_tag(std::uint64_t tag) const {
    if constexpr (std::is_pointer_v<K>)
        return hash_detail::home(reinterpret_cast<K>(std::uintptr_t(tag - 1)), m_log_slots);
    else
        return hash_detail::home(K(std::uint32_t(tag - 1)), m_log_slots);
}

// The slot of the key, or the free one that it would take; there always is a free one.
template <class K, class V>
typename map<K, V>::slot* map<K, V>::find(std::size_t home, std::uint64_t tag) const {
    slot* s = m_slots + home;
    if (s->tag == tag || s->tag == no_key)
        return s;
    const std::size_t mask = slots() - 1;
    probe p = probe_of(home, tag);
    do {
        p.advance(mask);
        s = m_slots + p.current();
    } while (s->tag != tag && s->tag != no_key);
    return s;
}

// Makes the entry in the slot that find gave for its key, unless the table has to grow.
template <class K, class V>
V& map<K, V>::make(slot* s, std::uint64_t tag, const K& key) {
    if (std::size_t(m_size + 1) * 4 > slots() * 3) {
        grow();
        s = find(hash_detail::home(key, m_log_slots), tag);
    }
    ::new (static_cast<void*>(&s->value)) V(m_default);
    s->tag = tag;
    ++m_size;
    return s->value;
}

template <class K, class V>
void map<K, V>::new_table(int log_slots) {
    m_log_slots = log_slots;
    m_slots = pool_allocate_array<slot>(std::size_t(1) << log_slots);
    for (std::size_t i = 0; i < slots(); ++i)
        m_slots[i].tag = no_key;
}

template <class K, class V>
void map<K, V>::grow() {
    slot* old = m_slots;
    const std::size_t old_slots = slots();
    new_table(old ? m_log_slots + 1 : 3);
    for (std::size_t i = 0; i < old_slots; ++i) {
        if (old[i].tag == no_key)
            continue;
        slot* s = find(home_of_tag(old[i].tag), old[i].tag);
        ::new (static_cast<void*>(&s->value)) V(std::move(old[i].value));
        s->tag = old[i].tag;
        old[i].value.~V();
    }
    if (old)
        pool_deallocate_array(old, old_slots);
}

template <class K, class V>
void map<K, V>::copy_from(const map& other) {
    if (!other.m_slots)
        return;
    new_table(other.m_log_slots);
    for (std::size_t i = 0; i < slots(); ++i) {
        if (other.m_slots[i].tag == no_key)
            continue;
        ::new (static_cast<void*>(&m_slots[i].value)) V(other.m_slots[i].value);
        m_slots[i].tag = other.m_slots[i].tag;
    }
    m_size = other.m_size;
}

template <class K, class V>
void map<K, V>::destroy_values() {
    if constexpr (!std::is_trivially_destructible_v<V>)
        for (std::size_t i = 0; i < slots(); ++i)
            if (m_slots[i].tag != no_key)
                m_slots[i].value.~V();
}

template <class K, class V>
void map<K, V>::release() {
    if (!m_slots)
        return;
    destroy_values();
    pool_deallocate_array(m_slots, slots());
}

template <class K, class V>
void map<K, V>::swap_table(map& other) noexcept {
    std::swap(m_slots, other.m_slots);
    std::swap(m_log_slots, other.m_log_slots);
    std::swap(m_size, other.m_size);
}

} // namespace leda

#endif
