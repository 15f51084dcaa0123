#include "LEDA/allocator.h"

#include "LEDA/error.h"

#include <cstdint>

namespace leda {

namespace {

constexpr std::size_t first_chunk_bytes = 64 * 1024;
constexpr std::size_t largest_chunk_bytes = 1024 * 1024;
constexpr std::size_t line_bytes = 64; // of a cache line
constexpr std::size_t run_bytes =
    4 * 1024; // a free list is filled with about so many bytes at a time

[[noreturn]] void out_of_memory() {
    report_error("memory_manager: out of memory", "allocator.h", __LINE__);
    std::abort();
}

} // namespace

memory_manager std_memory_mgr;

// Takes a run of neighbouring blocks from the newest chunk into the empty free list of the class,
// in ascending order, and answers the first. Blocks of the size of a cache line, as nodes are, take
// one each. The rest of a chunk that is too short for one block is given up until release_chunks.
void* memory_manager::refill(std::size_t size_class) {
    const std::size_t bytes = (size_class ? size_class : 1) * granule;
    const auto to_line = [bytes](const char* at) {
        return bytes == line_bytes ? -reinterpret_cast<std::uintptr_t>(at) % line_bytes : 0;
    };
    if (std::size_t(m_end - m_cursor) < bytes + to_line(m_cursor))
        add_chunk();
    m_cursor += to_line(m_cursor);
    std::size_t count = bytes < run_bytes ? run_bytes / bytes : 1;
    const std::size_t room = std::size_t(m_end - m_cursor) / bytes;
    if (count > room)
        count = room;
    char* const first = m_cursor;
    m_cursor += count * bytes;
    free_block* next = nullptr;
    for (char* block = m_cursor - bytes; block != first; block -= bytes)
        next = ::new (block) free_block{next};
    m_free[size_class] = next;
    return first;
}

void* memory_manager::allocate_large(std::size_t bytes) {
    void* block = std::malloc(bytes ? bytes : 1);
    if (!block)
        out_of_memory();
    return block;
}

// Chunks grow with what is in use, so that small programs stay small and large ones need few system
// calls.
void memory_manager::add_chunk() {
    std::size_t bytes = m_chunk_bytes / 8;
    bytes = bytes < first_chunk_bytes     ? first_chunk_bytes
            : bytes > largest_chunk_bytes ? largest_chunk_bytes
                                          : bytes;
    void* memory = std::malloc(bytes);
    if (!memory)
        out_of_memory();
    m_chunks = ::new (memory) chunk{m_chunks, bytes};
    m_chunk_bytes += bytes;
    m_cursor = static_cast<char*>(memory) + sizeof(chunk);
    m_end = static_cast<char*>(memory) + bytes / granule * granule;
}

bool memory_manager::release_chunks() {
    if (m_live != 0)
        return false;
    for (free_block*& head : m_free)
        head = nullptr;
    while (m_chunks) {
        chunk* next = m_chunks->next;
        std::free(m_chunks);
        m_chunks = next;
    }
    m_chunk_bytes = 0;
    m_cursor = m_end = nullptr;
    return true;
}

} // namespace leda
