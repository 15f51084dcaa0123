#include "GraphInterpreter.h"

#include "Model/Arithmetic.h"
#include "Model/Conversion.h"
#include "Model/Term.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace hpn::fuzz {

namespace {

constexpr std::size_t MostFaults = 4;
constexpr std::size_t DeepestCall = 200;
/// An unpassed formal holds this, so that nobody who reads it gets away with it.
constexpr double Poison = 97.0;

std::uint64_t eventOf(EventKind Kind, std::int32_t Number) {
    return (std::uint64_t{0xfff8} << 48) | (static_cast<std::uint64_t>(Kind) << 40) |
           static_cast<std::uint32_t>(Number);
}

std::uint64_t bitsOf(double Number) {
    std::uint64_t Bits;
    std::memcpy(&Bits, &Number, sizeof Bits);
    return Bits;
}

bool isSameNumber(double a, double b) {
    return visibleBits(a) == visibleBits(b);
}

std::string textOf(double Number) {
    char Text[40];
    std::snprintf(Text, sizeof Text, "%.17g", Number);
    return Text;
}

std::string textOfBits(std::uint64_t Bits) {
    double Number;
    std::memcpy(&Number, &Bits, sizeof Number);
    return textOf(Number);
}

} // namespace

std::uint64_t visibleBits(double Number) {
    return Number != Number ? std::uint64_t{0x7ff8000000000000} : bitsOf(Number);
}

// ---- traces ----

static std::string describeOutput(std::size_t Place, std::size_t Width, std::uint64_t Expected,
                                  std::uint64_t Got, const Program& Source) {
    std::size_t Element = Place % Width;
    std::string Text = "step " + std::to_string(Place / Width) + ": ";
    for (const Variable& Each : Source.Variables) {
        const std::size_t Count = Each.Kind != VariableKind::Output ? 0
                                  : Each.Count == 0                 ? 1
                                                                    : Each.Count;
        if (Element >= Count) {
            Element -= Count;
            continue;
        }
        Text +=
            std::string(Each.Name) + (Each.Count != 0 ? "[" + std::to_string(Element) + "]" : "");
        break;
    }
    return Text + " is " + textOfBits(Got) + " instead of " + textOfBits(Expected);
}

std::string Trace::compare(const Trace& Other, const Program& Source) const {
    const unsigned Steps = std::min(CompleteSteps, Other.CompleteSteps);
    if (CompleteSteps != Other.CompleteSteps && !IsExhausted && !Other.IsExhausted)
        return "a step does not end";
    const std::size_t Width = CompleteSteps != 0 ? Outputs.size() / CompleteSteps : 0;
    for (std::size_t i = 0; i < Width * Steps; ++i) {
        if (Outputs[i] != Other.Outputs[i])
            return describeOutput(i, Width, Outputs[i], Other.Outputs[i], Source);
    }
    const bool IsWhole = !IsExhausted && !Other.IsExhausted;
    const std::size_t Count = std::min(Events.size(), Other.Events.size());
    for (std::size_t i = 0; i < Count; ++i) {
        if (Events[i] != Other.Events[i])
            return "the events differ from number " + std::to_string(i) + " on";
    }
    if (IsWhole && Events.size() != Other.Events.size())
        return "there are " + std::to_string(Other.Events.size()) + " events instead of " +
               std::to_string(Events.size());
    return {};
}

// ---- the run ----

GraphInterpreter::GraphInterpreter(const GraphCode& Code, const Program& Source)
    : m_Code(Code), m_Source(Source) {
}

void GraphInterpreter::initialise() {
    m_Slots.clear();
    for (const Storage& Place : m_Code.Variables) {
        const Variable& Each = *Place.pVariable;
        for (std::size_t i = 0; i < static_cast<std::size_t>(Place.Count); ++i)
            m_Slots.push_back(
                convertNumber(i < Each.Initial.size() ? Each.Initial[i] : 0.0, *Each.pType));
    }
    m_VersionValues.assign(m_Code.Versions.size(), VersionValue());
    m_Stack.reserve(64);
    m_Resume = m_Code.Procedures[static_cast<std::size_t>(m_Code.MainProcedure)].Entry;
}

Trace GraphInterpreter::run(const RunOptions& Options) {
    m_Trace = Trace();
    m_Faults.clear();
    m_Writes.clear();
    m_Stimulus = Stimulus(Options.StimulusSeed);
    m_Budget = Options.Budget;
    m_RecordsWrites = Options.RecordsWrites;
    m_Spent = 0;
    m_ExternCalls = 0;
    m_IsBroken = false;
    if (m_Code.MainProcedure == None) {
        report("there is no main procedure");
        return m_Trace;
    }
    initialise();
    for (unsigned Step = 0; Step < Options.Steps && !m_IsBroken; ++Step) {
        setInputs(Step);
        callFromOutside(Step);
        if (m_Trace.IsExhausted || m_IsBroken || !runStep())
            break;
        recordOutputs();
    }
    return m_Trace;
}

void GraphInterpreter::setInputs(unsigned Step) {
    for (const Storage& Place : m_Code.Variables) {
        if (Place.pVariable->Kind != VariableKind::Input)
            continue;
        for (std::int32_t i = 0; i < Place.Count; ++i)
            m_Slots[static_cast<std::size_t>(Place.Slot + i)] =
                m_Stimulus.input(Step, *Place.pVariable, static_cast<unsigned>(i));
    }
}

void GraphInterpreter::callFromOutside(unsigned Step) {
    for (std::size_t i = 0; i < m_Source.Procedures.size() && !m_Trace.IsExhausted && !m_IsBroken;
         ++i) {
        const Procedure& Exported = m_Source.Procedures[i];
        if (!Exported.IsExported || !m_Stimulus.callsExported(Step, Exported))
            continue;
        for (std::size_t j = 0; j < m_Code.Procedures.size(); ++j) {
            if (m_Code.Procedures[j].pSource != &Exported)
                continue;
            m_Frames.clear();
            m_Saved.clear();
            m_IsStepOver = false;
            const std::vector<double> Before = m_Slots;
            enterProcedure(static_cast<std::int32_t>(j));
            for (std::size_t k = 0; k < Exported.Formals.size(); ++k)
                m_Slots[static_cast<std::size_t>(
                    m_Code.Variables[Exported.Formals[k]->Index].Slot)] =
                    m_Stimulus.argument(Step, Exported, static_cast<unsigned>(k));
            m_Trace.Events.push_back(eventOf(EventKind::OutsideCall, static_cast<std::int32_t>(i)));
            m_Trace.IsExhausted = !run();
            if (Exported.pResult == nullptr || m_Trace.IsExhausted) {
                forgetOwned(Before);
                continue;
            }
            m_Trace.Events.push_back(
                eventOf(EventKind::OutsideResult, static_cast<std::int32_t>(i)));
            m_Trace.Events.push_back(visibleBits(
                m_Slots[static_cast<std::size_t>(m_Code.Variables[Exported.pResult->Index].Slot)]));
            forgetOwned(Before);
        }
    }
}

/// What a call from outside left in locals, formals and results nobody reads; but the versions that
/// main knows of them would seem to be wrong.
void GraphInterpreter::forgetOwned(const std::vector<double>& Before) {
    for (std::size_t i = 0; i < m_Slots.size(); ++i) {
        if (m_Code.SlotVariables[i]->pOwner != nullptr)
            m_Slots[i] = Before[i];
    }
}

bool GraphInterpreter::runStep() {
    m_Frames.clear();
    m_Saved.clear();
    m_IsStepOver = false;
    Frame Main{m_Code.MainProcedure, None, 0, 0, 0};
    m_Frames.push_back(Main);
    arrive(m_Resume);
    m_Trace.IsExhausted = !run();
    return !m_Trace.IsExhausted;
}

/// Runs until the outermost procedure is left or the step is over; false if the budget does not
/// suffice.
bool GraphInterpreter::run() {
    while (!m_Frames.empty() && !m_IsStepOver && !m_IsBroken) {
        const Frame& Top = m_Frames.back();
        if (Top.Node == None ||
            m_Code.Nodes[static_cast<std::size_t>(Top.Node)].Kind == NodeKind::Exit) {
            leaveProcedure();
            continue;
        }
        if (!runActions())
            continue;
        if (!goOn(m_Code.Nodes[static_cast<std::size_t>(m_Frames.back().Node)]))
            return false;
        if (m_Spent > m_Budget || m_Frames.size() > DeepestCall)
            return false;
    }
    return m_Spent <= m_Budget;
}

void GraphInterpreter::arrive(Way To) {
    Frame& Top = m_Frames.back();
    Top.Node = To.Node;
    if (To.Node == None)
        return;
    const CodeNode& Node = m_Code.Nodes[static_cast<std::size_t>(To.Node)];
    Top.NextAction = Node.FirstAction;
    // The phi functions behind a join stand in a chain of nodes; all choose by the way into its
    // first one.
    if (Node.IsJoin)
        Top.JoinPosition = To.Position;
}

/// The rest of the node's actions; false if a call was entered.
bool GraphInterpreter::runActions() {
    const CodeNode& Node = m_Code.Nodes[static_cast<std::size_t>(m_Frames.back().Node)];
    while (m_Frames.back().NextAction < Node.EndAction) {
        const ActionStep& Step =
            m_Code.Actions[static_cast<std::size_t>(m_Frames.back().NextAction++)];
        if (Step.Op == ActionOp::Call) {
            call(m_Code.CallSites[static_cast<std::size_t>(Step.A)]);
            return false;
        }
        act(Step);
    }
    return true;
}

bool GraphInterpreter::goOn(const CodeNode& Node) {
    switch (Node.Kind) {
    case NodeKind::Branch: {
        ++m_Spent;
        const bool IsTrue = compute(Node.Condition) != 0.0;
        const Way& To = IsTrue ? Node.True : Node.False;
        if (To.Node == None)
            report(std::string("a branch has no way on where its condition is ") +
                   (IsTrue ? "true" : "false"));
        arrive(To);
        return true;
    }
    case NodeKind::StepEnd:
        m_IsStepOver = true;
        m_Resume = Node.True;
        if (Node.True.Node == None)
            report("the loop around main is open");
        return true;
    default:
        m_Spent += Node.Kind == NodeKind::NeverLeft ? 1 : 0;
        arrive(Node.True);
        return true;
    }
}

void GraphInterpreter::act(const ActionStep& Step) {
    switch (Step.Op) {
    case ActionOp::Assign:
        return assign(Step);
    case ActionOp::Store:
        return store(Step);
    case ActionOp::CallExtern:
        for (std::int32_t i = 0; i < Step.B; ++i)
            checkRead(m_Code.Operands[static_cast<std::size_t>(Step.First + i)],
                      "what an extern reads");
        return callExtern(Step.A);
    case ActionOp::Phi:
        return choosePhi(Step);
    case ActionOp::ValueReturn:
        return copyVersion(Step.A, Step.B);
    case ActionOp::Parameter:
        if (m_Frames.size() == 1)
            return defineVersion(Step.B); // called from outside
        return checkClaim(Step.B);
    default:
        return defineVersion(Step.B);
    }
}

void GraphInterpreter::assign(const ActionStep& Step) {
    ++m_Spent;
    const double Number = compute(Step.Value);
    const auto Slot = static_cast<std::size_t>(Step.A);
    if (Step.MustFit)
        checkFit(Number, *m_Code.SlotVariables[Slot]->pType);
    m_Slots[Slot] = Number;
    if (Step.B != None)
        defineVersion(Step.B);
}

void GraphInterpreter::store(const ActionStep& Step) {
    ++m_Spent;
    const Storage& Place = m_Code.Variables[static_cast<std::size_t>(Step.A)];
    const std::size_t Slot = elementOf(Place, compute(Step.Index));
    const double Number = compute(Step.Value);
    if (Step.MustFit)
        checkFit(Number, *Place.pVariable->pType);
    m_Slots[Slot] = Number;
}

std::size_t GraphInterpreter::elementOf(const Storage& Place, double Index) const {
    const std::int32_t Whole = std::clamp(truncateTo32(Index), 0, Place.Count - 1);
    return static_cast<std::size_t>(Place.Slot + Whole);
}

void GraphInterpreter::choosePhi(const ActionStep& Step) {
    const std::int32_t Position = Step.A == 1 ? 0 : m_Frames.back().JoinPosition;
    if (Position >= Step.A)
        return report("a phi function of " + nameOf(Step.B) + " has no operand for the way in");
    copyVersion(m_Code.Operands[static_cast<std::size_t>(Step.First + Position)], Step.B);
}

// ---- calls ----

void GraphInterpreter::enterProcedure(std::int32_t Number) {
    const CodeProcedure& Procedure = m_Code.Procedures[static_cast<std::size_t>(Number)];
    Frame Next{Number, None, 0, 0, m_Saved.size()};
    for (std::int32_t Slot : Procedure.OwnSlots) {
        m_Saved.push_back(m_Slots[static_cast<std::size_t>(Slot)]);
        m_Slots[static_cast<std::size_t>(Slot)] =
            convertNumber(0.0, *m_Code.SlotVariables[static_cast<std::size_t>(Slot)]->pType);
    }
    m_Frames.push_back(Next);
    arrive(Procedure.Entry);
}

void GraphInterpreter::leaveProcedure() {
    const Frame Left = m_Frames.back();
    const CodeProcedure& Procedure = m_Code.Procedures[static_cast<std::size_t>(Left.Procedure)];
    m_Frames.pop_back();
    // Outside calls leave nothing behind that could be restored into: their activation ends here as
    // well.
    for (std::size_t i = 0; i < Procedure.OwnSlots.size(); ++i)
        m_Slots[static_cast<std::size_t>(Procedure.OwnSlots[i])] = m_Saved[Left.FirstSaved + i];
    m_Saved.resize(Left.FirstSaved);
}

/// All versions are read before the first one is written: a procedure that calls itself hands its
/// own on.
void GraphInterpreter::handOver(const CallSite& Site) {
    m_Handed.clear();
    for (std::int32_t i = Site.FirstHanded; i < Site.EndHanded; ++i)
        m_Handed.push_back(m_VersionValues[static_cast<std::size_t>(
            m_Code.Handed[static_cast<std::size_t>(i)].Given)]);
    for (std::int32_t i = Site.FirstHanded; i < Site.EndHanded; ++i)
        m_VersionValues[static_cast<std::size_t>(
            m_Code.Handed[static_cast<std::size_t>(i)].Taken)] =
            m_Handed[static_cast<std::size_t>(i - Site.FirstHanded)];
}

void GraphInterpreter::call(const CallSite& Site) {
    ++m_Spent;
    if (Site.Procedure == None)
        return report("a call of a procedure that is not there");
    handOver(Site);
    std::vector<double> Numbers;
    for (std::int32_t i = Site.FirstArgument; i < Site.EndArgument; ++i) {
        const CodeArgument& Argument = m_Code.Arguments[static_cast<std::size_t>(i)];
        Numbers.push_back(Argument.Value.isEmpty() ? convertNumber(Poison, *Argument.pType)
                                                   : compute(Argument.Value));
    }
    enterProcedure(Site.Procedure);
    for (std::size_t i = 0; i < Numbers.size(); ++i)
        m_Slots[static_cast<std::size_t>(
            m_Code.Arguments[static_cast<std::size_t>(Site.FirstArgument) + i].Slot)] = Numbers[i];
}

void GraphInterpreter::callExtern(std::int32_t Number) {
    ++m_Spent;
    m_Trace.Events.push_back(eventOf(EventKind::ExternCalled, Number));
    if (Number == None)
        return report("an extern call without a declaration");
    const Extern& Called = m_Source.Externs[static_cast<std::size_t>(Number)];
    for (const Variable* pRead : Called.Reads) {
        const Storage& Place = m_Code.Variables[pRead->Index];
        for (std::int32_t i = 0; i < Place.Count; ++i)
            m_Trace.Events.push_back(
                visibleBits(m_Slots[static_cast<std::size_t>(Place.Slot + i)]));
    }
    for (const Variable* pWritten : Called.Writes) {
        const Storage& Place = m_Code.Variables[pWritten->Index];
        for (std::int32_t i = 0; i < Place.Count; ++i) {
            const double Left =
                m_Stimulus.written(m_ExternCalls, *pWritten, static_cast<unsigned>(i));
            m_Slots[static_cast<std::size_t>(Place.Slot + i)] = Left;
            if (m_RecordsWrites)
                m_Writes.push_back({pWritten, Left});
        }
    }
    ++m_ExternCalls;
}

// ---- checks ----

std::string GraphInterpreter::nameOf(std::int32_t Number) const {
    const Version& Of = m_Code.Versions[static_cast<std::size_t>(Number)];
    return std::string(m_Code.SlotVariables[static_cast<std::size_t>(Of.Slot)]->Name) + " (Var_" +
           std::to_string(Of.Serial) + ")";
}

void GraphInterpreter::defineVersion(std::int32_t Number) {
    const auto Index = static_cast<std::size_t>(Number);
    m_VersionValues[Index] = {m_Slots[static_cast<std::size_t>(m_Code.Versions[Index].Slot)], true};
    checkClaim(Number);
}

/// The version takes over the value of another one, whatever the variable holds: whether that was
/// the right one shows where it is read.
void GraphInterpreter::copyVersion(std::int32_t From, std::int32_t To) {
    if (From == None)
        return defineVersion(To);
    m_VersionValues[static_cast<std::size_t>(To)] = m_VersionValues[static_cast<std::size_t>(From)];
    checkClaim(To);
}

void GraphInterpreter::checkClaim(std::int32_t Number) {
    const VersionValue& Held = m_VersionValues[static_cast<std::size_t>(Number)];
    const Claim& Claimed = m_Code.Versions[static_cast<std::size_t>(Number)].Claimed;
    if (!Held.IsDefined || Claimed.What == Claim::Kind::Nothing)
        return;
    if (Claimed.What == Claim::Kind::Constant && !isSameNumber(Held.Number, Claimed.Low))
        report("claim: " + nameOf(Number) + " is " + textOf(Held.Number) +
               ", said to be constant " + textOf(Claimed.Low));
    if (Claimed.What == Claim::Kind::Range &&
        !(Held.Number >= Claimed.Low && Held.Number <= Claimed.High))
        report("claim: " + nameOf(Number) + " is " + textOf(Held.Number) + ", said to be in " +
               textOf(Claimed.Low) + " to " + textOf(Claimed.High));
}

void GraphInterpreter::checkRead(std::int32_t Number, const char* pWhat) {
    const VersionValue& Known = m_VersionValues[static_cast<std::size_t>(Number)];
    const double Held =
        m_Slots[static_cast<std::size_t>(m_Code.Versions[static_cast<std::size_t>(Number)].Slot)];
    if (!Known.IsDefined)
        report(std::string("version: ") + pWhat + " is undefined: " + nameOf(Number));
    else if (!isSameNumber(Known.Number, Held))
        report(std::string("version: ") + pWhat + " names the wrong version: " + nameOf(Number) +
               " is " + textOf(Known.Number) + ", the variable " + textOf(Held));
}

/// A number that is stored without a conversion must be one of the type.
void GraphInterpreter::checkFit(double Number, const Type& To) {
    bool IsFitting = !(Number == 0.0 && std::signbit(Number));
    if (To.Base == BaseType::Float32)
        IsFitting = IsFitting && isSameNumber(roundToSingle(Number), Number);
    else if (!isFloating(To.Base))
        IsFitting = IsFitting && numberOfRaw(rawOfNumber(Number, To), To) == Number;
    if (!IsFitting)
        report("store: " + textOf(Number) + " is no number of its type");
}

void GraphInterpreter::report(std::string Text) {
    // What would make the run go astray ends it.
    m_IsBroken =
        m_IsBroken || (Text.compare(0, 6, "claim:") != 0 && Text.compare(0, 8, "version:") != 0 &&
                       Text.compare(0, 6, "store:") != 0);
    if (m_Faults.size() < MostFaults)
        m_Faults.push_back(std::move(Text));
}

void GraphInterpreter::recordOutputs() {
    for (const Storage& Place : m_Code.Variables) {
        if (Place.pVariable->Kind != VariableKind::Output)
            continue;
        for (std::int32_t i = 0; i < Place.Count; ++i)
            m_Trace.Outputs.push_back(
                visibleBits(m_Slots[static_cast<std::size_t>(Place.Slot + i)]));
    }
    ++m_Trace.CompleteSteps;
    m_Trace.EventsAfterStep.push_back(m_Trace.Events.size());
}

// ---- expressions ----

double GraphInterpreter::compute(CodeRange Range) {
    m_Stack.clear();
    for (std::int32_t i = Range.First; i < Range.End; ++i) {
        const CodeStep& Step = m_Code.Code[static_cast<std::size_t>(i)];
        switch (Step.Op) {
        case CodeOp::Number:
            m_Stack.push_back(Step.Number);
            break;
        case CodeOp::Load:
            if (Step.B != None)
                checkRead(Step.B, "a read");
            m_Stack.push_back(m_Slots[static_cast<std::size_t>(Step.A)]);
            break;
        case CodeOp::LoadInput:
            m_Trace.Events.push_back(eventOf(EventKind::InputRead, Step.B));
            m_Stack.push_back(m_Slots[static_cast<std::size_t>(Step.A)]);
            break;
        case CodeOp::LoadElement: {
            const Storage& Place = m_Code.Variables[static_cast<std::size_t>(Step.A)];
            if (Place.pVariable->Kind == VariableKind::Input)
                m_Trace.Events.push_back(eventOf(EventKind::InputRead, Step.A));
            m_Stack.back() = m_Slots[elementOf(Place, m_Stack.back())];
            break;
        }
        case CodeOp::Unary:
            m_Stack.back() = computeUnary(Step.Kind, m_Stack.back());
            break;
        case CodeOp::Binary: {
            const double Right = m_Stack.back();
            m_Stack.pop_back();
            m_Stack.back() = computeBinary(Step.Kind, m_Stack.back(), Right);
            break;
        }
        case CodeOp::Cast:
            m_Stack.back() = convertNumber(m_Stack.back(), *Step.pType);
            break;
        case CodeOp::SkipIfFalse:
        case CodeOp::SkipIfOne: {
            const bool IsDecided =
                Step.Op == CodeOp::SkipIfOne ? m_Stack.back() == 1.0 : m_Stack.back() == 0.0;
            if (!IsDecided)
                m_Stack.pop_back();
            else
                i = Step.A - 1; // the operand that decides is the result
            if (IsDecided && Step.Op == CodeOp::SkipIfFalse)
                m_Stack.back() = 0.0;
            break;
        }
        case CodeOp::IsNotZero:
            m_Stack.back() = m_Stack.back() != 0.0 ? 1.0 : 0.0;
            break;
        case CodeOp::IsOne:
            m_Stack.back() = m_Stack.back() == 1.0 ? 1.0 : 0.0;
            break;
        }
    }
    return m_Stack.back();
}

} // namespace hpn::fuzz
