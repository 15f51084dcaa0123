#ifndef LEDA_ALLOCATOR_H
#define LEDA_ALLOCATOR_H

#include "HpnPlatformExport.h"

#include <cstddef>
#include <cstdlib>
#include <new>
#include <utility>

// Under the address sanitizer every block comes from malloc of its own, so that a use after free is
// found at once. All parts of one program are to be compiled the same way.
#if defined(__SANITIZE_ADDRESS__)
#define LEDA_POOLS_OFF 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define LEDA_POOLS_OFF 1
#endif
#endif

namespace leda {

// The layer's own allocator: the storage of every graph, list, set, map and dictionary.
//
// Small blocks (up to max_pooled bytes) lie in free lists, one for each multiple of 8 bytes, which
// are filled from chunks of at least 64 KiB; larger blocks come from malloc one by one. Neither
// uses operator new, so a container may be made in one module and freed in another whatever
// operator new either of them has. A block carries no header: whoever gives it back says its size.
// Blocks are aligned to 8 bytes.
//
// allocate and deallocate cost a few instructions. Chunks stay with the manager until
// release_chunks. The object is constant-initialised and trivially destructible, so that static
// objects may use it before main and at exit. It belongs to one thread, as the whole layer does.
class memory_manager {
public:
    // A block of more bytes than this comes from malloc.
    static constexpr std::size_t max_pooled = 1088;

    // A block of at least the given size, never null: when memory runs out the error handler is
    // called and the process ends.
    void* allocate(std::size_t bytes);
    // Gives back a block that allocate gave for the same size.
    void deallocate(void* block, std::size_t bytes);

    // Number of blocks given out and not given back, pooled or not.
    std::size_t live_blocks() const { return m_live; }
    // Bytes in chunks, used or free.
    std::size_t chunk_bytes() const { return m_chunk_bytes; }
    // Gives all chunks back to the system if no block lives; false, and nothing done, if one does.
    HPNPLATFORM_EXPORT bool release_chunks();

private:
    static constexpr std::size_t granule = 8;
    struct free_block {
        free_block* next;
    };
    struct chunk {
        chunk* next;
        std::size_t bytes;
    };

    HPNPLATFORM_EXPORT void* refill(std::size_t size_class);
    HPNPLATFORM_EXPORT void* allocate_large(std::size_t bytes);
    void add_chunk();

    free_block* m_free[max_pooled / granule + 1] = {}; // by size class; slot 0 is not used
    std::size_t m_live = 0;                            // blocks given out
    std::size_t m_chunk_bytes = 0;                     // sum over m_chunks
    char* m_cursor = nullptr;                          // unused rest of the newest chunk
    char* m_end = nullptr;                             // its end
    chunk* m_chunks = nullptr;                         // all chunks, newest first
};

// The one manager of the process.
extern HPNPLATFORM_EXPORT memory_manager std_memory_mgr;

inline void* memory_manager::allocate(std::size_t bytes) {
#if !defined(LEDA_POOLS_OFF)
    if (bytes <= max_pooled) {
        const std::size_t size_class = (bytes + granule - 1) / granule;
        ++m_live;
        free_block* block = m_free[size_class];
        if (!block)
            return refill(size_class);
        m_free[size_class] = block->next;
        return block;
    }
#endif
    ++m_live;
    return allocate_large(bytes);
}

inline void memory_manager::deallocate(void* block, std::size_t bytes) {
    --m_live;
#if !defined(LEDA_POOLS_OFF)
    if (bytes <= max_pooled) {
        const std::size_t size_class = (bytes + granule - 1) / granule;
        m_free[size_class] = ::new (block) free_block{m_free[size_class]};
        return;
    }
#else
    static_cast<void>(bytes);
#endif
    std::free(block);
}

// One object in a block of the manager.
template <class T, class... Args>
T* pool_new(Args&&... args) {
    static_assert(alignof(T) <= 8, "the layer's pools align to 8 bytes");
    return ::new (std_memory_mgr.allocate(sizeof(T))) T(std::forward<Args>(args)...);
}

// Ends an object of pool_new and gives its block back. T must be the class it was made as: the
// block's size is T's.
template <class T>
void pool_delete(T* object) {
    object->~T();
    std_memory_mgr.deallocate(object, sizeof(T));
}

// Raw storage for a number of objects of a type; the caller constructs and destroys them.
template <class T>
T* pool_allocate_array(std::size_t count) {
    static_assert(alignof(T) <= 8, "the layer's pools align to 8 bytes");
    return static_cast<T*>(std_memory_mgr.allocate(count * sizeof(T)));
}

// Gives the storage of pool_allocate_array back; count is what it was asked for.
template <class T>
void pool_deallocate_array(T* first, std::size_t count) {
    std_memory_mgr.deallocate(first, count * sizeof(T));
}

// Lets the standard's containers take their storage from the manager.
template <class T>
struct pool_allocator {
    // What the standard asks of an allocator. It has no state: any object gives back what another
    // has allocated.
    using value_type = T;
    pool_allocator() = default;
    template <class U>
    pool_allocator(const pool_allocator<U>&) {}
    T* allocate(std::size_t count) { return pool_allocate_array<T>(count); }
    void deallocate(T* first, std::size_t count) { pool_deallocate_array(first, count); }
    bool operator==(const pool_allocator&) const { return true; }
    bool operator!=(const pool_allocator&) const { return false; }
};

} // namespace leda

#endif
