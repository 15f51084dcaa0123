#ifndef ZFCPREFETCH_H
#define ZFCPREFETCH_H

// Says that the memory at the address will be read or written soon. A hint, which changes nothing
// but the time: what stands far apart in memory is fetched side by side that way.
inline void prefetch(const void* pMemory) {
#if defined(__GNUC__)
    __builtin_prefetch(pMemory);
#else
    (void)pMemory;
#endif
}

// Collects items of work whose memory lies far apart, and does them in the order in which they
// came, some dozens at a time: first Fetch is called for each, then Do. What is left at the end
// waits for finish, since the work may fail.
template <class TItem, class TFetch, class TDo>
class ZfCBatch {
public:
    // Fetch asks for an item's memory, Do does its work.
    ZfCBatch(TFetch Fetch, TDo Do) : m_Fetch(Fetch), m_Do(Do) {}
    ZfCBatch(const ZfCBatch&) = delete;
    ZfCBatch& operator=(const ZfCBatch&) = delete;

    // Takes an item over, to be done with others or at the end.
    void append(TItem const& Item) {
        m_Fetch(Item);
        m_Items[m_Size++] = Item;
        if (m_Size == s_Most)
            finish();
    }
    // Does what is left.
    void finish() {
        for (int i = 0; i < m_Size; ++i)
            m_Do(m_Items[i]);
        m_Size = 0;
    }

private:
    static constexpr int s_Most = 32;

    TFetch m_Fetch;
    TDo m_Do;
    TItem m_Items[s_Most];
    int m_Size = 0;
};

template <class TItem, class TFetch, class TDo>
ZfCBatch<TItem, TFetch, TDo> makeBatch(TFetch Fetch, TDo Do) {
    return {Fetch, Do};
}

#endif
