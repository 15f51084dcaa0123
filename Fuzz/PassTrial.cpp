#include "PassTrial.h"

#include "CodeHarness.h"
#include "Metamorph.h"

#include "Emitter/CEmitter.h"
#include "LEDA/error.h"
#include "Language/Diagnostics.h"
#include "Language/Reader.h"
#include "Language/SourceFiles.h"
#include "Model/PendingWarnings.h"
#include "Oracles/GraphShape.h"
#include "Oracles/SSAVerifier.h"
#include "Road/PassRunner.h"
#include "Road/Statistics.h"
#include "ZfCMessageSink.h"
#include "ZfCPlatformMessageServer.h"

#include <algorithm>
#include <cctype>

namespace hpn::fuzz {

namespace {

// Listens to the library while it lives. The hooks take no object, so there is one at a time.
class Listener : public ZfCMessageSink {
public:
    explicit Listener(bool ShowsInternals)
        : m_pFormerSink(ZfCPlatformMessageServer::setSink(this)) {
        s_First.clear();
        s_Kind.clear();
        m_pFormerHook = ZfCPlatformMessageServer::setAssertionHook(&hearAssertion);
        m_pFormerHandler = leda::std_error_handler;
        leda::std_error_handler = &hearLayer;
        ZfCPlatformMessageServer::setShowInternalInfo(ShowsInternals);
    }
    ~Listener() override {
        ZfCPlatformMessageServer::setShowInternalInfo(false);
        leda::std_error_handler = m_pFormerHandler;
        ZfCPlatformMessageServer::setAssertionHook(m_pFormerHook);
        ZfCPlatformMessageServer::setSink(m_pFormerSink);
    }
    Listener(const Listener&) = delete;
    Listener& operator=(const Listener&) = delete;

    void receiveMessage(tagERR_error_severity_etp Severity, int, const ZfCSrcRef*, const char*,
                        const char* Text) override {
        if (Severity == ERR_severity_fatal)
            hear("internal error", Text);
    }
    const std::string& getKind() const { return s_Kind; }
    const std::string& getText() const { return s_First; }

private:
    static void hear(const std::string& Kind, const std::string& Text) {
        if (!s_Kind.empty())
            return;
        s_Kind = Kind;
        s_First = Text;
    }
    static void hearAssertion(const char* File, int Line, const char* Condition) {
        const std::string_view Path = File;
        const std::string Name(Path.substr(Path.rfind('/') + 1));
        hear("assertion in " + Name, std::to_string(Line) + ": " + Condition);
    }
    static void hearLayer(int, const char* Text) { hear("container error", Text); }

    static std::string s_Kind;
    static std::string s_First;
    ZfCMessageSink* m_pFormerSink;
    ZfCPlatformMessageServer::tAssertionHook m_pFormerHook = nullptr;
    void (*m_pFormerHandler)(int, const char*) = nullptr;
};

std::string Listener::s_Kind;
std::string Listener::s_First;

// The message without its numbers: faults that differ in them alone are the same.
std::string withoutNumbers(const std::string& Text) {
    std::string Result;
    for (const char Each : Text.substr(0, Text.find('\n'))) {
        if (std::isdigit(static_cast<unsigned char>(Each)) == 0)
            Result += Each;
    }
    return Result;
}

// Up to the first name or number.
std::string kindOfFault(const std::string& Text) {
    const std::size_t Colon = Text.find(':');
    const std::size_t Second =
        Text.compare(0, 8, "version:") == 0 ? Text.find(':', Colon + 1) : Colon;
    if (Colon == std::string::npos)
        return withoutNumbers(Text);
    if (Text.compare(0, 6, "claim:") == 0)
        return Text.find("constant") != std::string::npos ? "claimed constant" : "claimed range";
    return withoutNumbers(Text.substr(0, Second));
}

// Looks at the graph after each pass.
class Inspector : public PassObserver {
public:
    Inspector(const Trial& Wanted, const Program& Source, Listener& Ears, TrialResult& Result)
        : m_Wanted(Wanted), m_Source(Source), m_Ears(Ears), m_Result(Result) {}

    void beforeAll(ProgramGraph& Graph) override {
        if (m_Wanted.WantsCode)
            m_Unoptimised = emitProgram(Graph, {m_Wanted.CodePrefix + "a_"}).Source;
        m_Pass = "the graph builder";
        tamper("", Graph);
        checkGraph(Graph);
        if (!m_Result.Failed)
            m_Expected = execute(Graph, m_Wanted.Run);
        m_Result.Counts.Exhausted = m_Expected.IsExhausted ? 1 : 0;
        m_Result.Seen = m_Expected;
    }
    void beforePass(const PassStep& Step, ProgramGraph& Graph) override {
        m_Pass = Step.pPass->Name;
        m_NodesBefore = Graph.getGraph().number_of_nodes();
    }
    void afterPass(const PassStep& Step, ProgramGraph& Graph) override {
        ++m_Result.Counts.Passes[static_cast<std::size_t>(Step.pPass->Id)];
        note(Step.pPass->Id, Graph);
        tamper(Step.pPass->Name, Graph);
        checkGraph(Graph);
        if (m_Result.Failed)
            return;
        RunOptions Options = m_Wanted.Run;
        Options.Budget *= 4; // what the passes add, such as the loop around main, must not cut the
                             // comparison short
        const Trace Got = execute(Graph, Options);
        const std::string Difference = m_Expected.compare(Got, m_Source);
        if (!m_Result.Failed && !Difference.empty())
            fail(Difference.find("event") != std::string::npos ? "events" : "outputs", Difference);
    }
    void afterAll(ProgramGraph& Graph) override {
        if (m_Wanted.WantsCode && !m_Result.Failed && !m_Expected.IsExhausted)
            makeCode(Graph);
        if (m_Wanted.WantsFinalText && !m_Result.Failed)
            m_Result.FinalText = emitProgram(Graph, {}).Source;
    }
    bool wantsToStop() override { return static_cast<bool>(m_Result.Failed); }

private:
    void tamper(std::string_view Pass, ProgramGraph& Graph) {
        if (m_Wanted.Tamper)
            m_Wanted.Tamper(Pass, Graph);
    }
    void fail(const std::string& Kind, const std::string& Detail) {
        m_Result.Failed = {Kind, m_Pass, Detail};
    }
    void note(PassId Id, ProgramGraph& Graph) {
        if (Id == PassId::TransformToSSAForm)
            m_IsSSAForm = m_WasTransformed = true;
        if (Id == PassId::HoistCodeOutOfIfElseBranches)
            m_IsSSAForm = false; // moved statements stand for their twins
        if (Id != PassId::PropagateSparseConditionalConstant)
            return;
        m_HasSSAEdges = m_IsFreshlyPropagated = true;
        m_Result.Counts.DeadNodes +=
            static_cast<std::uint64_t>(m_NodesBefore - Graph.getGraph().number_of_nodes());
    }
    void checkGraph(ProgramGraph& Graph) {
        if (!m_Ears.getKind().empty())
            return fail(m_Ears.getKind(), m_Ears.getText());
        // SSA edges go from procedure to procedure, so components mean nothing any more.
        if (!m_HasSSAEdges && !Graph.getGraph().checkConsistency())
            return fail("checkConsistency", "components and procedures do not agree");
        if (!m_Ears.getKind().empty())
            return fail("checkConsistency: " + m_Ears.getKind(), m_Ears.getText());
        const std::string Broken = test::flowFaults(Graph.getGraph());
        if (!Broken.empty())
            return fail("control flow: " + withoutNumbers(Broken), Broken);
        if (!m_WasTransformed)
            return;
        const std::string Violations =
            passes::verifySSA(Graph.getGraph(), m_IsSSAForm ? passes::Strictness::Full
                                                            : passes::Strictness::WithoutDominance);
        if (!Violations.empty())
            fail("verifier: " + withoutNumbers(Violations), Violations);
    }
    Trace execute(ProgramGraph& Graph, const RunOptions& Options) {
        CodeOptions Reading;
        Reading.IsSSAForm = m_WasTransformed;
        Reading.ChecksVersions = m_IsSSAForm;
        const GraphCode Code = readGraph(Graph, Reading);
        if (!Code.Faults.empty())
            fail("structure: " + Code.Faults.front(), Code.Faults.front());
        GraphInterpreter Machine(Code, m_Source);
        Trace Result = Machine.run(Options);
        m_Result.Counts.Statements += Machine.countActions();
        countConstants(Code);
        if (m_IsFreshlyPropagated)
            keepVersions(Code);
        m_IsFreshlyPropagated = false;
        if (!Machine.getFaults().empty() && !m_Result.Failed) {
            std::string Text;
            for (const std::string& Each : Machine.getFaults())
                Text += Each + "\n";
            fail(kindOfFault(Machine.getFaults().front()), Text);
        }
        return Result;
    }
    void keepVersions(const GraphCode& Code) {
        std::vector<KnownVersion>& Kept = m_Result.Versions;
        Kept.clear();
        for (const Version& Each : Code.Versions) {
            const auto Slot = static_cast<std::size_t>(Each.Slot);
            Kept.push_back({Each.Serial, std::string(Code.SlotVariables[Slot]->Name),
                            Each.Claimed.What == Claim::Kind::Constant, Each.IsUndetermined,
                            Each.Claimed.Low, Each.Claimed.High});
        }
        std::sort(Kept.begin(), Kept.end(),
                  [](const KnownVersion& a, const KnownVersion& b) { return a.Serial < b.Serial; });
    }
    void countConstants(const GraphCode& Code) {
        std::uint64_t Count = 0;
        for (const Version& Each : Code.Versions)
            Count += Each.Claimed.What == Claim::Kind::Constant ? 1 : 0;
        m_Result.Counts.Constants = std::max(m_Result.Counts.Constants, Count);
    }
    void makeCode(ProgramGraph& Graph) {
        CodeOptions Plain;
        Plain.IsSSAForm = m_WasTransformed;
        Plain.ChecksVersions = false;
        const GraphCode Code = readGraph(Graph, Plain);
        GraphInterpreter Machine(Code, m_Source);
        RunOptions Options = m_Wanted.Run;
        Options.Budget *= 4;
        Options.RecordsWrites = true;
        const Trace Told = Machine.run(Options);
        CodePair& Pair = m_Result.Code;
        Pair.Unoptimised = std::move(m_Unoptimised);
        Pair.Optimised = emitProgram(Graph, {m_Wanted.CodePrefix + "b_"}).Source;
        Pair.Harness =
            writeHarness(m_Source, m_Wanted.CodePrefix, m_Wanted.Run, Machine.getWrites());
        Pair.Expected = describeTrace(Told, m_Source);
    }

    const Trial& m_Wanted;
    const Program& m_Source;
    Listener& m_Ears;
    TrialResult& m_Result;
    Trace m_Expected;
    std::string m_Pass;
    std::string m_Unoptimised;
    int m_NodesBefore = 0;
    bool m_WasTransformed = false;
    bool m_IsSSAForm = false; // and versions still stand where they belong
    bool m_HasSSAEdges = false;
    bool m_IsFreshlyPropagated = false;
};

TrialResult runAlone(const Trial& Wanted) {
    TrialResult Result;
    SourceFiles Sources;
    Sources.add("fuzz.hpn", Wanted.Text);
    Diagnostics Messages(Sources);
    Program Source;
    if (!readProgram(Sources, Messages, Source)) {
        Result.Failed = {"reader", "the reader", Messages.print()};
        return Result;
    }
    Listener Ears(Wanted.ShowsInternals);
    {
        ProgramGraph Graph(Source);
        Inspector Looking(Wanted, Source, Ears, Result);
        PassRunner Runner(Graph);
        Runner.addObserver(Looking);
        Runner.run(Wanted.Passes);
    }
    pendingWarnings().clear();
    if (!Result.Failed && !Ears.getKind().empty())
        Result.Failed = {Ears.getKind(), "shutdown", Ears.getText()};
    return Result;
}

void addTrial(TrialCounts& To, const TrialCounts& From) {
    for (std::size_t i = 0; i < PassCount; ++i)
        To.Passes[i] += From.Passes[i];
    To.Statements += From.Statements;
}

} // namespace

const char* nameOfPair(PairKind Kind) {
    static const char* const Names[] = {"none",     "renamed", "reordered", "dead code",
                                        "pass off", "widened", "twice"};
    return Names[static_cast<std::size_t>(Kind)];
}

TrialResult runTrial(const Trial& Wanted) {
    Trial First = Wanted;
    First.WantsFinalText = Wanted.WantsFinalText || Wanted.Pair == PairKind::Twice;
    TrialResult Result = runAlone(First);
    Trial Variant;
    if (Result.Failed || !makeVariant(First, Variant))
        return Result;
    const TrialResult Other = runAlone(Variant);
    const std::string Kind = std::string("pair ") + nameOfPair(Wanted.Pair);
    // A text that was shrunk into a shape that the change was not made for proves nothing.
    if (Other.Failed.Kind == "reader")
        return Result;
    ++Result.Counts.Pairs[static_cast<std::size_t>(Wanted.Pair)];
    addTrial(Result.Counts, Other.Counts);
    if (Other.Failed) {
        Result.Failed = {Kind + ": " + Other.Failed.Kind, Other.Failed.Pass, Other.Failed.Detail};
        return Result;
    }
    const std::string Difference = compareVariants(Wanted.Pair, Result, Other);
    if (!Difference.empty())
        Result.Failed = {Kind + ": " + withoutNumbers(Difference.substr(0, Difference.find('('))),
                         "the whole road", Difference + "\n" + Variant.Text};
    return Result;
}

// ---- orders of passes ----

static std::vector<PassId> shufflePasses(std::uint64_t Seed) {
    std::uint64_t Counter = 0;
    const auto below = [&](std::uint64_t Count) { return mixBits(Seed, Counter++) % Count; };
    std::vector<PassId> Early{PassId::InlineProcedures, PassId::PlaceLoopAroundMain,
                              PassId::InsertValidConditionAssignments};
    std::vector<PassId> Applying{PassId::ReplaceConstantConditions,
                                 PassId::ReplaceConstantVariables, PassId::FoldConstants};
    const auto shuffle = [&](std::vector<PassId>& Ids) {
        for (std::size_t i = Ids.size(); i > 1; --i)
            std::swap(Ids[i - 1], Ids[below(i)]);
    };
    shuffle(Early);
    shuffle(Applying);
    std::vector<PassId> Ids;
    if (below(4) == 0)
        Ids.push_back(PassId::MakeProcedureAndCall);
    Ids.push_back(PassId::PlaceExitNodes);
    const auto append = [&](PassId Id) {
        if (below(6) != 0)
            Ids.push_back(Id);
    };
    std::for_each(Early.begin(), Early.end(), append);
    Ids.push_back(PassId::TransformToSSAForm);
    Ids.push_back(PassId::DivideBasicBlock);
    for (std::uint64_t Round = 1 + below(2); Round > 0; --Round) {
        append(PassId::PropagateSparseConditionalConstant);
        std::for_each(Applying.begin(), Applying.end(), append);
    }
    append(PassId::RemoveUnusedVarDefs);
    append(PassId::HoistCodeOutOfIfElseBranches);
    Ids.resize(Ids.size() - (below(4) == 0 ? below(Ids.size()) : 0));
    return Ids;
}

PassSequence choosePasses(std::uint64_t Seed) {
    PassSequence Result = PassSequence::defaultOrder();
    const std::uint64_t Kind = mixBits(Seed, 0) % 9;
    if (Kind == 0)
        Result.extractLabelsFirst();
    if (Kind < 6)
        return Result;
    std::string Why;
    for (std::uint64_t Attempt = 1; Attempt <= 10; ++Attempt) {
        if (PassSequence::make(shufflePasses(mixBits(Seed, Attempt)), Result, Why))
            break;
    }
    return Result;
}

std::string listPasses(const PassSequence& Passes) {
    std::string Result;
    for (const PassId Id : Passes.getPasses())
        Result += (Result.empty() ? "" : ",") + std::string(passOf(Id).Name);
    return Result;
}

} // namespace hpn::fuzz
