#ifndef ZFCPOOLEDMEMCONTROLLER_H
#define ZFCPOOLEDMEMCONTROLLER_H

#include "ZfCMemController.h"

#include <cstddef>

// A memory controller for a host that has none of its own: a graph is many small records, which
// here lie side by side without a header, so that a run needs less memory and fewer cache lines
// than with the standard heap.
//
// Blocks up to 1024 bytes lie in pages of one size each; a page is aligned, so that a block finds
// its size by its address. Larger ones come from malloc one by one. Pages stay with the controller
// for later blocks of their size until the last small block is given back; then all of them go, and
// the next run finds its memory in order. Allocation and release cost a few instructions.
// One thread at a time, like the library. Under the address sanitizer every block is malloc's own.
class HPNPLATFORM_EXPORT ZfCPooledMemController : public ZfCMemController {
public:
    ZfCPooledMemController() = default;
    ZfCPooledMemController(const ZfCPooledMemController&) = delete;
    ZfCPooledMemController& operator=(const ZfCPooledMemController&) = delete;
    // Gives all pages back: no small block may be in use any more.
    ~ZfCPooledMemController() override;

    // A block aligned for any object of the size: to 16 bytes, or to 8 if the size rounded up to 8
    // is no multiple of 16. The caller's until freeMemBlock; null if there is no memory.
    void* allocMemBlock(unsigned int Size) override;
    // Takes back a block of this controller.
    void freeMemBlock(void* pBlock) override;

private:
    static constexpr std::size_t s_Granule = 8;
    static constexpr std::size_t s_LargestAlignment = 16;
    static constexpr std::size_t s_FirstBlock = 64; // in a page: its cache lines are the blocks'
    static constexpr std::size_t s_GreatestSmall = 1024;
    static constexpr std::size_t s_PageBytes = 64 * 1024;
    static constexpr std::size_t s_PagesInFirstChunk = 3;

    // At the begin of each page and of each large block.
    struct alignas(s_LargestAlignment) Header {
        void* pMemory;     // of a large block: what malloc gave; else null
        std::size_t Class; // of a page: the size of its blocks in granules
    };
    struct FreeBlock {
        FreeBlock* pNext;
    };
    struct alignas(s_LargestAlignment) Chunk {
        Chunk* pNext;
    };

    static Header* headerOf(void* pBlock);
    static char* alignToPage(char* pMemory);
    static void* allocateLarge(std::size_t Size);
    void* allocateFromPage(std::size_t Class);
    bool addChunk();
    void releaseChunks();

    static constexpr std::size_t s_Classes = s_GreatestSmall / s_Granule + 1;
    std::size_t m_Live = 0;             // small blocks given out
    FreeBlock* m_pFree[s_Classes] = {}; // by class: blocks given back
    char* m_pCursor[s_Classes] = {};    // by class: the unused rest of its newest page
    char* m_pEnd[s_Classes] = {};
    char* m_pNextPage = nullptr; // the unused rest of the newest chunk, and how many pages it is
    std::size_t m_PagesLeft = 0;
    std::size_t m_PagesInChunk =
        s_PagesInFirstChunk;    // of the next chunk; it grows with what is in use
    Chunk* m_pChunks = nullptr; // newest first
};

#endif
