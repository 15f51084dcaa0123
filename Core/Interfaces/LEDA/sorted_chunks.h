#ifndef LEDA_SORTED_CHUNKS_H
#define LEDA_SORTED_CHUNKS_H

#include "LEDA/allocator.h"

#include <cstddef>
#include <cstring>
#include <type_traits>

namespace leda {

// The sorted store behind large sets and behind the dictionary: chunks of about 1 KiB with sorted
// entries, and a directory with each chunk's first entry. Entries are trivially copyable; the order
// is the caller's.
//
// Finding costs two binary searches, adding behind the last entry O(1), adding elsewhere a move
// within one chunk and, for every half chunk of insertions, a move of the directory (16 bytes for
// each chunk); copying and walking are linear over contiguous memory. A position is good until the
// next change.
template <class E>
class sorted_chunks {
    static_assert(std::is_trivially_copyable_v<E> && alignof(E) <= 8, "entries are moved as bytes");

public:
    // Entries of a full chunk.
    static constexpr int capacity = 1024 / sizeof(E) < 128 ? int(1024 / sizeof(E)) : 128;
    // Place of an entry: its chunk and its place in it, both from 0.
    struct position {
        // Number of the chunk.
        int chunk;
        // Number of the entry in its chunk.
        int slot;
    };

    // Empty.
    sorted_chunks() = default;
    // A copy with chunks of its own, each with the same entries.
    sorted_chunks(const sorted_chunks& other);
    sorted_chunks& operator=(const sorted_chunks&) = delete;
    ~sorted_chunks() { clear(); }

    // Number of entries.
    int size() const { return m_size; }
    // Removes all entries and gives the storage back.
    void clear();
    // The entry of a position that is valid; the last of a store that is not empty.
    const E& at(position p) const { return m_directory[p.chunk].body->entries[p.slot]; }
    const E& last() const { return at({m_chunks - 1, count(m_chunks - 1) - 1}); }
    // Whether an entry has this position.
    bool valid(position p) const {
        return p.chunk >= 0 && p.chunk < m_chunks && p.slot >= 0 && p.slot < count(p.chunk);
    }
    // First position, and the one behind; not valid() where there is none.
    position first() const { return {0, 0}; }
    position next(position p) const {
        return p.slot + 1 < count(p.chunk) ? position{p.chunk, p.slot + 1}
                                           : position{p.chunk + 1, 0};
    }
    // Chunks as plain arrays, for walks.
    int chunks() const { return m_chunks; }
    int count(int chunk) const { return m_directory[chunk].body->count; }
    const E* entries(int chunk) const { return m_directory[chunk].body->entries; }

    // Looks for a key; order(entry) tells how the key stands to an entry: negative before it, 0
    // equal, positive behind. True with the entry's position, or false with the position at which
    // an insertion keeps the order. Slot 0 is answered for the very first place only.
    template <class Order>
    bool find(const Order& order, position& p) const;
    // Puts the entry at the position that find gave for it; those behind move on by one.
    void insert(position p, const E& entry);
    // Removes the entry of the position.
    void erase(position p);
    // Adds behind the last entry.
    void append(const E& entry);
    // Adds n entries, in their order, behind the last.
    void append(const E* first, int n);

    // True if chunks are neither empty nor over-full, the directory and the size agree with them,
    // and precedes holds for each entry and its successor. Linear.
    template <class Precedes>
    bool check_consistency(const Precedes& precedes) const;

private:
    struct body_struct {
        int count;
        E entries[capacity];
    };
    struct directory_entry {
        E first; // copy of body->entries[0]
        body_struct* body;
    };
    static_assert(std::is_trivially_copyable_v<directory_entry>);

    static body_struct* new_body();
    static void shift(E* to, const E* from, int n) {
        std::memmove(static_cast<void*>(to), from, std::size_t(n) * sizeof(E));
    }
    void open_directory(int at, body_struct* body);
    void close_directory(int at);
    void split(position& p);
    bool join_with_next(int chunk);

    directory_entry* m_directory = nullptr; // m_chunks used of m_slots
    int m_chunks = 0;
    int m_slots = 0;
    int m_size = 0; // entries in all chunks
};

template <class E>
sorted_chunks<E>::sorted_chunks(const sorted_chunks& other)
    : m_chunks(other.m_chunks), m_slots(other.m_chunks), m_size(other.m_size) {
    if (m_chunks == 0)
        return;
    m_directory = pool_allocate_array<directory_entry>(std::size_t(m_slots));
    for (int i = 0; i < m_chunks; ++i) {
        const body_struct* from = other.m_directory[i].body;
        body_struct* to = new_body();
        to->count = from->count;
        shift(to->entries, from->entries, from->count);
        ::new (static_cast<void*>(m_directory + i)) directory_entry{from->entries[0], to};
    }
}

template <class E>
void sorted_chunks<E>::clear() {
    for (int i = 0; i < m_chunks; ++i)
        std_memory_mgr.deallocate(m_directory[i].body, sizeof(body_struct));
    if (m_directory)
        pool_deallocate_array(m_directory, std::size_t(m_slots));
    m_directory = nullptr;
    m_chunks = m_slots = m_size = 0;
}

template <class E>
template <class Order>
bool sorted_chunks<E>::find(const Order& order, position& p) const {
    p = {0, 0};
    if (m_size == 0)
        return false;
    p.chunk = m_chunks - 1;
    p.slot = count(p.chunk) - 1;
    const int at_last = order(last());
    if (at_last == 0)
        return true;
    if (at_last > 0) {
        ++p.slot;
        return false;
    }
    int low = 0; // chunks before low begin at or before the key
    for (int high = m_chunks; low < high;) {
        const int middle = low + (high - low) / 2;
        if (order(m_directory[middle].first) >= 0)
            low = middle + 1;
        else
            high = middle;
    }
    if (low == 0) {
        p = {0, 0};
        return false;
    }
    p.chunk = low - 1;
    const E* entry = entries(p.chunk);
    int from = 0;
    for (int to = count(p.chunk); from < to;) {
        const int middle = from + (to - from) / 2;
        const int sign = order(entry[middle]);
        if (sign == 0) {
            p.slot = middle;
            return true;
        }
        if (sign > 0)
            from = middle + 1;
        else
            to = middle;
    }
    p.slot = from;
    return false;
}

template <class E>
void sorted_chunks<E>::insert(position p, const E& entry) {
    if (m_chunks == 0 || (p.chunk == m_chunks - 1 && p.slot == count(p.chunk))) {
        append(entry);
        return;
    }
    if (count(p.chunk) == capacity)
        split(p);
    directory_entry& place = m_directory[p.chunk];
    body_struct* body = place.body;
    shift(body->entries + p.slot + 1, body->entries + p.slot, body->count - p.slot);
    body->entries[p.slot] = entry;
    ++body->count;
    ++m_size;
    if (p.slot == 0)
        place.first = entry;
}

template <class E>
void sorted_chunks<E>::append(const E& entry) {
    if (m_chunks == 0 || count(m_chunks - 1) == capacity) {
        body_struct* body = new_body();
        body->count = 0;
        body->entries[0] = entry;
        open_directory(m_chunks, body);
    }
    body_struct* body = m_directory[m_chunks - 1].body;
    body->entries[body->count++] = entry;
    ++m_size;
}

template <class E>
void sorted_chunks<E>::append(const E* first, int n) {
    while (n > 0) {
        if (m_chunks == 0 || count(m_chunks - 1) == capacity) {
            append(*first++);
            --n;
            continue;
        }
        body_struct* body = m_directory[m_chunks - 1].body;
        const int room = capacity - body->count;
        const int part = n < room ? n : room;
        shift(body->entries + body->count, first, part);
        body->count += part;
        m_size += part;
        first += part;
        n -= part;
    }
}

// A chunk that has become small joins a neighbour if the two leave room to grow, so that chunks
// stay half full on average.
template <class E>
void sorted_chunks<E>::erase(position p) {
    directory_entry& place = m_directory[p.chunk];
    body_struct* body = place.body;
    --body->count;
    --m_size;
    if (body->count == 0) {
        std_memory_mgr.deallocate(body, sizeof(body_struct));
        close_directory(p.chunk);
        return;
    }
    shift(body->entries + p.slot, body->entries + p.slot + 1, body->count - p.slot);
    place.first = body->entries[0];
    if (body->count < capacity / 4 && !join_with_next(p.chunk) && p.chunk > 0)
        join_with_next(p.chunk - 1);
}

template <class E>
template <class Precedes>
bool sorted_chunks<E>::check_consistency(const Precedes& precedes) const {
    int total = 0;
    const E* before = nullptr;
    for (int i = 0; i < m_chunks; ++i) {
        const body_struct* body = m_directory[i].body;
        if (body->count < 1 || body->count > capacity ||
            std::memcmp(&m_directory[i].first, &body->entries[0], sizeof(E)) != 0)
            return false;
        for (int j = 0; j < body->count; ++j) {
            if (before && !precedes(*before, body->entries[j]))
                return false;
            before = &body->entries[j];
        }
        total += body->count;
    }
    return total == m_size && m_chunks <= m_slots;
}

template <class E>
typename sorted_chunks<E>::body_struct* sorted_chunks<E>::new_body() {
    return static_cast<body_struct*>(std_memory_mgr.allocate(sizeof(body_struct)));
}

template <class E>
void sorted_chunks<E>::open_directory(int at, body_struct* body) {
    if (m_chunks == m_slots) {
        const int slots = m_slots ? 2 * m_slots : 4;
        directory_entry* grown = pool_allocate_array<directory_entry>(std::size_t(slots));
        if (m_directory) {
            std::memcpy(static_cast<void*>(grown), m_directory,
                        std::size_t(m_chunks) * sizeof(directory_entry));
            pool_deallocate_array(m_directory, std::size_t(m_slots));
        }
        m_directory = grown;
        m_slots = slots;
    }
    std::memmove(static_cast<void*>(m_directory + at + 1), m_directory + at,
                 std::size_t(m_chunks - at) * sizeof(directory_entry));
    ::new (static_cast<void*>(m_directory + at)) directory_entry{body->entries[0], body};
    ++m_chunks;
}

template <class E>
void sorted_chunks<E>::close_directory(int at) {
    --m_chunks;
    std::memmove(static_cast<void*>(m_directory + at), m_directory + at + 1,
                 std::size_t(m_chunks - at) * sizeof(directory_entry));
}

// Halves a full chunk and moves the position along with the entries.
template <class E>
void sorted_chunks<E>::split(position& p) {
    body_struct* left = m_directory[p.chunk].body;
    body_struct* right = new_body();
    const int half = left->count / 2;
    right->count = left->count - half;
    shift(right->entries, left->entries + half, right->count);
    left->count = half;
    open_directory(p.chunk + 1, right);
    if (p.slot > half)
        p = {p.chunk + 1, p.slot - half};
}

template <class E>
bool sorted_chunks<E>::join_with_next(int chunk) {
    if (chunk + 1 >= m_chunks)
        return false;
    body_struct* left = m_directory[chunk].body;
    body_struct* right = m_directory[chunk + 1].body;
    if (left->count + right->count > capacity * 3 / 4)
        return false;
    shift(left->entries + left->count, right->entries, right->count);
    left->count += right->count;
    std_memory_mgr.deallocate(right, sizeof(body_struct));
    close_directory(chunk + 1);
    return true;
}

} // namespace leda

#endif
