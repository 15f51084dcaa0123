#ifndef ENDURANCESUPPORT_H
#define ENDURANCESUPPORT_H

#include "Emitter/CEmitter.h"
#include "Graph/ProgramGraph.h"
#include "LEDA/allocator.h"
#include "Language/Diagnostics.h"
#include "Language/Reader.h"
#include "Language/SourceFiles.h"
#include "Model/PendingWarnings.h"
#include "Road/GraphDump.h"
#include "Road/PassRunner.h"
#include "Road/PassSequence.h"
#include "ZfCMemController.h"

#include <cstddef>
#include <cstdlib>
#include <gtest/gtest.h>
#include <malloc.h>
#include <string>

#if defined(__SANITIZE_ADDRESS__)
#define ENDURANCE_ASAN 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define ENDURANCE_ASAN 1
#endif
#endif
#ifdef ENDURANCE_ASAN
// gcc ships the runtime without this header of it.
extern "C" std::size_t __sanitizer_get_current_allocated_bytes();
#endif

namespace endurance {

/// Uses every pass: shared labels, a call that dissolves and one that stays, a loop, equal code in
/// both arms, a condition that tells a value, something to fold, something unused.
inline const char* const SmallProgram = R"(
input uint8 in0; output int32 out0; output int32 out1; state int32 s = 1; param bool OPT = false;
extern ping reads(s);
proc int32 twice(int32 a) { local int32 unused = 3; return a + a; }
proc note(int32 b) { if (b == 4) { s = b + 1; } else { s = 2; } ping(); }
proc main() {
  local int32 i; local int32 x;
  if (in0 > 7) goto shared;
  if (OPT) { s = 100; }
  x = twice(2); note(x); x = twice(x + in0); note(4);
  while (i < 3) { i++; if (in0 == 5) goto shared; }
  if (x > 3) { out1 = 9; s = i; } else { out1 = 9; }
  goto done;
shared: s = s + 1;
done: out0 = s + i;
}
)";

inline hpn::PassSequence wholeRoad() {
    hpn::PassSequence Passes = hpn::PassSequence::defaultOrder();
    Passes.extractLabelsFirst();
    return Passes;
}

/// Text in, C out, as the driver does it; everything that it made has gone when it returns. An
/// empty result: the text is not accepted.
inline std::string runRoad(const std::string& Text, const hpn::PassSequence& Passes,
                           hpn::PassObserver* pObserver = nullptr) {
    hpn::SourceFiles Sources;
    hpn::Diagnostics Messages(Sources);
    hpn::Program Source;
    Sources.add("test.hpn", Text);
    if (!hpn::readProgram(Sources, Messages, Source))
        return "";
    hpn::ProgramGraph Graph(Source);
    hpn::PassRunner Runner(Graph);
    if (pObserver != nullptr)
        Runner.addObserver(*pObserver);
    Runner.run(Passes);
    hpn::pendingWarnings().clear();
    return hpn::emitProgram(Graph).Source;
}

/// Counts the blocks that go through it; the n-th can be made to fail, alone or with all after it.
class CountingController : public ZfCMemController {
public:
    void* allocMemBlock(unsigned int Size) override {
        ++m_Taken;
        if (m_Taken == m_FailAt || (m_IsLasting && m_FailAt != 0 && m_Taken > m_FailAt))
            return nullptr;
        ++m_Live;
        return std::malloc(Size != 0 ? Size : 1);
    }
    void freeMemBlock(void* pBlock) override {
        --m_Live;
        std::free(pBlock);
    }
    /// Counts from here on; 0: nothing fails.
    void failAt(long Number, bool IsLasting) {
        m_Taken = 0;
        m_FailAt = Number;
        m_IsLasting = IsLasting;
    }
    long getTaken() const { return m_Taken; }
    long getLive() const { return m_Live; }

private:
    long m_Taken = 0;
    long m_Live = 0;
    long m_FailAt = 0;
    bool m_IsLasting = false;
};

/// Sets a controller for a scope.
class ControllerScope {
public:
    explicit ControllerScope(ZfCMemController* pController) { pZFMemory = pController; }
    ~ControllerScope() { pZFMemory = nullptr; }
    ControllerScope(const ControllerScope&) = delete;
    ControllerScope& operator=(const ControllerScope&) = delete;
};

/// Bytes that malloc has given out to anybody in the process.
inline std::size_t heapBytes() {
#ifdef ENDURANCE_ASAN
    return __sanitizer_get_current_allocated_bytes();
#else
    const struct mallinfo2 Info = mallinfo2();
    return Info.uordblks + Info.hblkhd;
#endif
}

} // namespace endurance

#endif
