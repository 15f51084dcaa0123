#include "ZfCPooledMemController.h"

#include "LEDA/allocator.h"

#include <cstdint>
#include <cstdlib>
#include <new>

namespace {
constexpr std::size_t s_MostPagesInChunk = 63;
} // namespace

ZfCPooledMemController::~ZfCPooledMemController() {
    releaseChunks();
}

void ZfCPooledMemController::releaseChunks() {
    while (m_pChunks != nullptr) {
        Chunk* const pNext = m_pChunks->pNext;
        std::free(m_pChunks);
        m_pChunks = pNext;
    }
    for (std::size_t Class = 0; Class < s_Classes; ++Class) {
        m_pFree[Class] = nullptr;
        m_pCursor[Class] = m_pEnd[Class] = nullptr;
    }
    m_pNextPage = nullptr;
    m_PagesLeft = 0;
    m_PagesInChunk = s_PagesInFirstChunk;
}

ZfCPooledMemController::Header* ZfCPooledMemController::headerOf(void* pBlock) {
    return reinterpret_cast<Header*>(reinterpret_cast<std::uintptr_t>(pBlock) &
                                     ~std::uintptr_t{s_PageBytes - 1});
}

char* ZfCPooledMemController::alignToPage(char* pMemory) {
    return pMemory + (-reinterpret_cast<std::uintptr_t>(pMemory) & (s_PageBytes - 1));
}

void* ZfCPooledMemController::allocMemBlock(unsigned int Size) {
#if defined(LEDA_POOLS_OFF)
    return std::malloc(Size != 0 ? Size : 1);
#else
    if (Size > s_GreatestSmall)
        return allocateLarge(Size);
    const std::size_t Class = Size != 0 ? (Size + s_Granule - 1) / s_Granule : 1;
    if (FreeBlock* const pBlock = m_pFree[Class]) {
        m_pFree[Class] = pBlock->pNext;
        ++m_Live;
        return pBlock;
    }
    void* const pBlock = allocateFromPage(Class);
    m_Live += pBlock != nullptr ? 1 : 0;
    return pBlock;
#endif
}

void ZfCPooledMemController::freeMemBlock(void* pBlock) {
#if defined(LEDA_POOLS_OFF)
    std::free(pBlock);
#else
    if (pBlock == nullptr)
        return;
    const Header* const pHeader = headerOf(pBlock);
    if (pHeader->pMemory != nullptr) {
        std::free(pHeader->pMemory);
        return;
    }
    m_pFree[pHeader->Class] = ::new (pBlock) FreeBlock{m_pFree[pHeader->Class]};
    if (--m_Live == 0)
        releaseChunks();
#endif
}

// The header stands where a page would begin, so that the block finds it like a small one.
void* ZfCPooledMemController::allocateLarge(std::size_t Size) {
    void* const pMemory = std::malloc(Size + sizeof(Header) + s_PageBytes);
    if (pMemory == nullptr)
        return nullptr;
    return ::new (alignToPage(static_cast<char*>(pMemory))) Header{pMemory, 0} + 1;
}

// Blocks of a fresh page are given out in the order of their addresses.
void* ZfCPooledMemController::allocateFromPage(std::size_t Class) {
    const std::size_t Bytes = Class * s_Granule;
    if (static_cast<std::size_t>(m_pEnd[Class] - m_pCursor[Class]) < Bytes) {
        if (m_PagesLeft == 0 && !addChunk())
            return nullptr;
        ::new (m_pNextPage) Header{nullptr, Class};
        m_pCursor[Class] = m_pNextPage + s_FirstBlock;
        m_pEnd[Class] = m_pNextPage + s_PageBytes;
        m_pNextPage += s_PageBytes;
        --m_PagesLeft;
    }
    void* const pBlock = m_pCursor[Class];
    m_pCursor[Class] += Bytes;
    return pBlock;
}

// One page's worth of the memory goes to the chunk's own record, which stands first, and to the
// alignment of the pages.
bool ZfCPooledMemController::addChunk() {
    const std::size_t Bytes = (m_PagesInChunk + 1) * s_PageBytes;
    char* const pMemory = static_cast<char*>(std::malloc(Bytes));
    if (pMemory == nullptr)
        return false;
    m_pChunks = ::new (pMemory) Chunk{m_pChunks};
    m_pNextPage = alignToPage(pMemory + sizeof(Chunk));
    m_PagesLeft = m_PagesInChunk;
    if (m_PagesInChunk < s_MostPagesInChunk)
        m_PagesInChunk = m_PagesInChunk * 2 + 1;
    return true;
}
