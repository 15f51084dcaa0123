#ifndef PASSTRIAL_H
#define PASSTRIAL_H

#include "GraphInterpreter.h"

#include "Road/PassSequence.h"

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace hpn::fuzz {

/// What the program is compared with besides itself.
enum class PairKind : std::uint8_t {
    None,
    Renamed,   ///< every name another one: same outputs, no contradicting constant
    Reordered, ///< the procedures in another order: same outputs
    DeadCode,  ///< more code, which only propagation sees to be dead: same outputs
    PassOff,   ///< one pass less: same outputs
    Widened,   ///< inputs of wider types: no constant that the narrow ones did not give
    Twice      ///< what was found is found and written once more: same C, byte for byte, unless
               ///< propagation concludes more from better ranges
};
constexpr std::size_t PairKindCount = 7;
const char* nameOfPair(PairKind Kind);

/// One program with one order of passes and one world around it.
struct Trial {
    std::string Text;
    PassSequence Passes;
    RunOptions Run;
    bool ShowsInternals = true; ///< the library's own assertions and checks are on; they cost time
    bool WantsCode = false;     ///< the program is also emitted as C, before and after the passes
    std::string CodePrefix;     ///< of all names in the C, followed by "a_" or "b_"
    PairKind Pair = PairKind::None;
    bool WantsFinalText = false; ///< the C of the last graph
    /// Called between the passes, after the pass of the given name ("" before all). For tests of
    /// the oracle itself.
    std::function<void(std::string_view, ProgramGraph&)> Tamper;
};

/// What went wrong, and after which pass. Two failures of the same kind are taken for the same
/// fault.
struct Failure {
    std::string Kind; ///< empty: nothing went wrong
    std::string Pass;
    std::string Detail;

    explicit operator bool() const { return !Kind.empty(); }
};

/// The program as C, with what the interpreter says of it in the words of the C harness.
struct CodePair {
    std::string Unoptimised;
    std::string Optimised;
    std::string Harness;  ///< runs both, one after the other
    std::string Expected; ///< what either of them prints
};

/// What the last propagation says of a version.
struct KnownVersion {
    unsigned Serial = 0;
    std::string Name; ///< of the variable
    bool IsConstant = false;
    bool IsUndetermined = false;
    double Number = 0.0; ///< or the lower end of its range
    double Highest = 0.0;
};

struct TrialCounts {
    std::uint64_t Passes[PassCount] = {};
    std::uint64_t Constants = 0;  ///< versions found constant by the last propagation
    std::uint64_t DeadNodes = 0;  ///< nodes that propagation took out
    std::uint64_t Statements = 0; ///< executed, over all variants
    std::uint64_t Exhausted = 0;  ///< 1: the program did not end within the budget
    std::uint64_t Pairs[PairKindCount] = {};
};

struct TrialResult {
    Failure Failed;
    TrialCounts Counts;
    CodePair Code;                      ///< empty unless wanted, and where the program does not end
    Trace Seen;                         ///< what the program does
    std::vector<KnownVersion> Versions; ///< by serial number
    std::string FinalText;              ///< empty unless wanted
};

/// Reads the program, runs it as it was built, then runs it again after each pass of the order and
/// compares. After each pass also: what the library reported, the SSA verifier while the graph is
/// in SSA form, `checkConsistency` until SSA edges join the components, versions and claims of
/// propagation (see GraphInterpreter). A trial with a pair runs the other program likewise, if the
/// first one is without fault, and compares the two.
TrialResult runTrial(const Trial& Wanted);

/// The order of passes for a seed: the whole road for most, else passes left out, repeated or
/// exchanged as the rules allow.
PassSequence choosePasses(std::uint64_t Seed);
/// Names of the passes separated by commas, as hpncg takes them.
std::string listPasses(const PassSequence& Passes);

} // namespace hpn::fuzz

#endif
