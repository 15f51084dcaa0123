#ifndef ZFCMODULEALLOCATION_H
#define ZFCMODULEALLOCATION_H

#include <cstddef>
#include <new>

#include "HpnSSAExport.h"

// The module's pair of allocation functions, as seen from a class that a client makes with new and
// the library's own code destroys.
//
// Every new and delete in the library's own sources is served by the module's operators
// (ZfCModuleAllocation.cpp). A new expression in a client's source is served by the client's
// operators, though, while the virtual destructor of a library class gives the block back to the
// library's: in a shared build these are two different heaps. The classes of which a client makes
// objects therefore say HPNSSA_MODULE_BLOCKS, so that their blocks come from and return to the one
// pair wherever the expression stands. This is no allocator of its own: it keeps no storage and
// only forwards.

// A block of the module, or null if there is no memory.
HPNSSA_EXPORT void* ZfAllocModuleBlock(std::size_t Size) noexcept;

// Gives a block of ZfAllocModuleBlock back; null is allowed.
HPNSSA_EXPORT void ZfFreeModuleBlock(void* pBlock) noexcept;

// The forms of new answer null instead of throwing: the language then skips the constructor and the
// expression gives null, which is how the library treats a failing allocation everywhere.
#define HPNSSA_MODULE_BLOCKS                                                                       \
    static void* operator new(std::size_t Size) noexcept {                                         \
        return ZfAllocModuleBlock(Size);                                                           \
    }                                                                                              \
    static void* operator new(std::size_t Size, const std::nothrow_t&) noexcept {                  \
        return ZfAllocModuleBlock(Size);                                                           \
    }                                                                                              \
    static void* operator new(std::size_t, void* pPlace) noexcept {                                \
        return pPlace;                                                                             \
    }                                                                                              \
    static void operator delete(void* pBlock) noexcept {                                           \
        ZfFreeModuleBlock(pBlock);                                                                 \
    }                                                                                              \
    static void operator delete(void* pBlock, const std::nothrow_t&) noexcept {                    \
        ZfFreeModuleBlock(pBlock);                                                                 \
    }                                                                                              \
    static void operator delete(void*, void*) noexcept {                                           \
    }

#endif
