#ifndef STIMULUS_H
#define STIMULUS_H

#include "Language/Program.h"

#include <cstdint>

namespace hpn::fuzz {

/// Number `Counter` of a stream of well mixed bits, without a state: the same arguments give the
/// same bits in every run.
inline std::uint64_t mixBits(std::uint64_t Stream, std::uint64_t Counter) {
    std::uint64_t x = Stream + 0x9e3779b97f4a7c15u * (Counter + 1);
    x = (x ^ (x >> 30)) * 0xbf58476d1ce4e5b9u;
    x = (x ^ (x >> 27)) * 0x94d049bb133111ebu;
    return x ^ (x >> 31);
}

/// What the world outside does to a program: numbers that arrive in inputs, what externs write,
/// when exported procedures are called and with what. All of it hangs on the seed and on the place
/// alone, so every variant of a program meets the same world. Numbers are such as the storage of
/// their type can hold, with a liking for the borders of storages and declared ranges.
class Stimulus {
public:
    explicit Stimulus(std::uint64_t Seed) : m_Seed(Seed) {}

    /// In an element of an input during a step.
    double input(unsigned Step, const Variable& Input, unsigned Element) const;
    /// What the call of an extern, the Call-th one of the run, leaves in an element.
    double written(unsigned Call, const Variable& Target, unsigned Element) const;
    /// Before a step, in front of the others: whether the outside calls this exported procedure.
    bool callsExported(unsigned Step, const Procedure& Exported) const;
    double argument(unsigned Step, const Procedure& Exported, unsigned Formal) const;

private:
    static double pick(std::uint64_t Bits, const Type& Of);
    static double pickFloating(std::uint64_t Bits, const Type& Of);

    std::uint64_t m_Seed;
};

} // namespace hpn::fuzz

#endif
