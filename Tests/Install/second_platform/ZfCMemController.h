#ifndef SECOND_ZFCMEMCONTROLLER_H
#define SECOND_ZFCMEMCONTROLLER_H

#include <cstdlib>

// Counts the blocks that it has given out and not got back.
class ZfCMemController {
public:
    void* allocMemBlock(unsigned int Size) {
        ++m_Live;
        return std::malloc(Size ? Size : 1);
    }
    void freeMemBlock(void* pBlock) {
        --m_Live;
        std::free(pBlock);
    }
    int getLiveBlocks() const { return m_Live; }

private:
    int m_Live = 0;
};

inline ZfCMemController* pZFMemory = nullptr;

#endif
