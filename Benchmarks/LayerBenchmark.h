#ifndef LAYERBENCHMARK_H
#define LAYERBENCHMARK_H

#include <benchmark/benchmark.h>

#include <cstdint>

// Helpers of the layer's benchmarks.

// The same numbers in every run and on every machine (xorshift).
class RandomNumbers {
public:
    // At least 0 and less than limit.
    int below(int limit) {
        m_state ^= m_state << 13;
        m_state ^= m_state >> 7;
        m_state ^= m_state << 17;
        return int((m_state >> 11) % std::uint64_t(limit));
    }

private:
    std::uint64_t m_state = 0x2545F4914F6CDD1Du;
};

// Prints the time of one of the elements that each iteration handles.
inline void reportTimePer(benchmark::State& State, const char* name, double elements) {
    State.counters[name] = benchmark::Counter(
        elements, benchmark::Counter::kIsIterationInvariantRate | benchmark::Counter::kInvert);
}

#endif
