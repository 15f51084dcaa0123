#ifndef GRAPHINTERPRETER_H
#define GRAPHINTERPRETER_H

#include "GraphCode.h"
#include "Stimulus.h"

#include <cstdint>
#include <string>
#include <vector>

namespace hpn::fuzz {

/// The bits of a number as the outside sees them: all NaNs are one.
std::uint64_t visibleBits(double Number);

/// Heads of events; the number of the input, extern or procedure goes with them.
enum class EventKind : std::uint8_t {
    InputRead = 1,
    ExternCalled, ///< followed by what the extern read
    OutsideCall,
    OutsideResult ///< followed by the result
};
inline EventKind kindOfEvent(std::uint64_t Head) {
    return static_cast<EventKind>((Head >> 40) & 0xff);
}
inline std::uint32_t numberOfEvent(std::uint64_t Head) {
    return static_cast<std::uint32_t>(Head);
}

/// What can be seen of a run from outside.
struct Trace {
    /// All outputs after each complete step, in the order of declaration, element by element.
    std::vector<std::uint64_t> Outputs;
    /// Calls of externs with what they read, reads of inputs, results of exported procedures, in
    /// order.
    std::vector<std::uint64_t> Events;
    std::vector<std::size_t> EventsAfterStep; ///< by complete step
    unsigned CompleteSteps = 0;
    bool IsExhausted = false; ///< the budget ended the run inside a step

    /// What the other trace does not agree with, as one sentence; empty if nothing. A run that was
    /// cut off is compared as far as it went.
    std::string compare(const Trace& Other, const Program& Source) const;
};

/// What one extern has left, for a replay in another world.
struct WrittenValue {
    const Variable* pVariable;
    double Number;
};

struct RunOptions {
    unsigned Steps = 4;
    std::uint64_t StimulusSeed = 1;
    unsigned Budget = 3000; ///< assignments, calls and decisions of a whole run
    bool RecordsWrites = false;
};

/// Runs the program of a graph step after step.
///
/// Values live by original variable, which is what the emitted C does: versions are other names of
/// their variable, phi functions, boundary statements and virtual assignments do nothing, arguments
/// are assigned to formals, and the formals and locals of a recursive procedure exist once for each
/// activation. Beside that each SSA version has a value of its own: phi functions choose by the way
/// in, parameters take over what their call hands to them, value returns what the callee leaves. It
/// is compared with the variable wherever a version is read: so the run also shows whether each use
/// names the version that reaches it, each phi function has its operands at the right in-edges, and
/// each argument and returned value belongs to its call. And each definition is held against what
/// propagation claims of the version.
///
/// Numbers are those of the client's number model for plain numbers, not the optimiser's
/// evaluation. Cost: about 20 ns for a step of an expression. No recursion.
class GraphInterpreter {
public:
    /// The code must outlive this object.
    GraphInterpreter(const GraphCode& Code, const Program& Source);

    Trace run(const RunOptions& Options);
    /// What contradicted itself during the run: versions, claims, ways that are missing; the first
    /// few of them.
    const std::vector<std::string>& getFaults() const { return m_Faults; }
    const std::vector<WrittenValue>& getWrites() const { return m_Writes; }
    std::size_t countActions() const { return m_Spent; }

private:
    struct VersionValue {
        double Number = 0.0;
        bool IsDefined = false;
    };
    struct Frame {
        std::int32_t Procedure;
        std::int32_t Node;
        std::int32_t NextAction;
        std::int32_t JoinPosition;
        std::size_t FirstSaved;
    };

    void initialise();
    void setInputs(unsigned Step);
    void callFromOutside(unsigned Step);
    void forgetOwned(const std::vector<double>& Before);
    bool runStep();
    bool run();
    void arrive(Way To);
    bool goOn(const CodeNode& Node);
    bool runActions();
    void act(const ActionStep& Step);
    void assign(const ActionStep& Step);
    void store(const ActionStep& Step);
    void choosePhi(const ActionStep& Step);
    void enterProcedure(std::int32_t Procedure);
    void leaveProcedure();
    void call(const CallSite& Site);
    void callExtern(std::int32_t Number);
    void handOver(const CallSite& Site);
    void defineVersion(std::int32_t Version);
    void copyVersion(std::int32_t From, std::int32_t To);
    void checkClaim(std::int32_t Version);
    void checkRead(std::int32_t Version, const char* pWhat);
    void checkFit(double Number, const Type& To);
    double compute(CodeRange Range);
    std::size_t elementOf(const Storage& Place, double Index) const;
    void recordOutputs();
    void report(std::string Text);
    std::string nameOf(std::int32_t Version) const;

    const GraphCode& m_Code;
    const Program& m_Source;
    Stimulus m_Stimulus{0};
    std::vector<double> m_Slots;
    std::vector<VersionValue> m_VersionValues; // by version
    std::vector<VersionValue> m_Handed;        // during a call
    std::vector<double> m_Stack;
    std::vector<Frame> m_Frames;
    std::vector<double> m_Saved; // the slots of outer activations
    Way m_Resume;                // where the next step goes on, once main has a loop around it
    std::size_t m_Spent = 0;
    std::size_t m_Budget = 0;
    unsigned m_ExternCalls = 0;
    bool m_IsStepOver = false;
    bool m_IsBroken = false;
    bool m_RecordsWrites = false;
    Trace m_Trace;
    std::vector<WrittenValue> m_Writes;
    std::vector<std::string> m_Faults;
};

} // namespace hpn::fuzz

#endif
