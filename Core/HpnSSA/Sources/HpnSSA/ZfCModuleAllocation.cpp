#include "ZfCModuleAllocation.h"

#include "ZfCMemController.h"

#include <cstdlib>

// The module's new and delete.
//
// The replaced operators stand in this file alone and only where HPNSSA_MODULE_ALLOCATION says so:
// the shared library always has them and binds them locally, so that the host program's own new and
// delete are not touched; a static build has them by choice, since there they serve the whole
// program. The blocks of the library's own classes go through the controller in either build; where
// there is none, a static build without operators of its own leaves them to the host's.
//
// The forms for over-aligned types are left to the language's library, which serves them as a pair
// of its own: a block of the controller promises no more than the default alignment, and the
// library has no over-aligned type.

namespace {

// One attempt. The controller counts in unsigned 32 bits, so the size is cut to them; no object of
// the library comes near.
void* tryAllocate(std::size_t Size) noexcept {
    if (pZFMemory != nullptr)
        return pZFMemory->allocMemBlock(static_cast<unsigned int>(Size));
    return std::malloc(Size != 0 ? Size : 1);
}

// Attempts until there is a block, the new-handler gives up, or there is no handler; null in the
// last case.
void* allocate(std::size_t Size) {
    for (;;) {
        if (void* pBlock = tryAllocate(Size))
            return pBlock;
        const std::new_handler Handler = std::get_new_handler();
        if (Handler == nullptr)
            return nullptr;
        Handler();
    }
}

void* allocateOrNull(std::size_t Size) noexcept {
    try {
        return allocate(Size);
    } catch (const std::bad_alloc&) { // thrown by the new-handler
        return nullptr;
    }
}

void release(void* pBlock) noexcept {
    if (pBlock == nullptr)
        return;
    if (pZFMemory != nullptr)
        pZFMemory->freeMemBlock(pBlock);
    else
        std::free(pBlock);
}

} // namespace

void* ZfAllocModuleBlock(std::size_t Size) noexcept {
#ifndef HPNSSA_MODULE_ALLOCATION
    if (pZFMemory == nullptr)
        return ::operator new(Size, std::nothrow);
#endif
    return allocateOrNull(Size);
}

void ZfFreeModuleBlock(void* pBlock) noexcept {
#ifndef HPNSSA_MODULE_ALLOCATION
    if (pZFMemory == nullptr) {
        ::operator delete(pBlock);
        return;
    }
#endif
    release(pBlock);
}

#ifdef HPNSSA_MODULE_ALLOCATION

namespace {

void* allocateOrThrow(std::size_t Size) {
    void* const pBlock = allocate(Size);
    if (pBlock == nullptr)
        throw std::bad_alloc();
    return pBlock;
}

} // namespace

// The plain forms follow the language and throw. The library's own create operations use the form
// that answers null, so that a failing allocation skips the constructor and comes out as a null
// object.
void* operator new(std::size_t Size) {
    return allocateOrThrow(Size);
}
void* operator new[](std::size_t Size) {
    return allocateOrThrow(Size);
}
void* operator new(std::size_t Size, const std::nothrow_t&) noexcept {
    return allocateOrNull(Size);
}
void* operator new[](std::size_t Size, const std::nothrow_t&) noexcept {
    return allocateOrNull(Size);
}
void operator delete(void* pBlock) noexcept {
    release(pBlock);
}
void operator delete[](void* pBlock) noexcept {
    release(pBlock);
}
void operator delete(void* pBlock, std::size_t) noexcept {
    release(pBlock);
}
void operator delete[](void* pBlock, std::size_t) noexcept {
    release(pBlock);
}
void operator delete(void* pBlock, const std::nothrow_t&) noexcept {
    release(pBlock);
}
void operator delete[](void* pBlock, const std::nothrow_t&) noexcept {
    release(pBlock);
}

#endif
