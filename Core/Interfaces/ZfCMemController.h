#ifndef ZFCMEMCONTROLLER_H
#define ZFCMEMCONTROLLER_H

#include "HpnPlatformExport.h"

// The memory controller of the host: where a library's operator new takes its blocks from, and
// operator delete gives them back, while pZFMemory points to one. It must stay for as long as such
// a block lives.
class HPNPLATFORM_EXPORT ZfCMemController {
public:
    virtual ~ZfCMemController() = default;
    // A block of at least the given number of bytes, aligned for every type, or null when there is
    // none.
    virtual void* allocMemBlock(unsigned int Size) = 0;
    // Gives back a block of this controller.
    virtual void freeMemBlock(void* pBlock) = 0;
};

// Set by the host before the first allocation it is meant for; null: the standard heap serves.
extern HPNPLATFORM_EXPORT ZfCMemController* pZFMemory;

#endif
