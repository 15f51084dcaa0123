#include "FuzzRun.h"

#include "Generators/PointedProgram.h"
#include "Shrinker.h"

#include "Generators/RandomProgram.h"
#include "Oracles/HostShell.h"

#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#ifndef _WIN32
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>
#endif

// Processes: the parent watches, a child works. They share one page: the seed in hand, a counter
// that shows life, the totals, and the failure that the child has stopped at. So nothing that a
// program does to the optimiser ends the run. Shrinking asks its questions in children of their
// own, for the same reason.

namespace hpn::fuzz {

#ifndef _WIN32
namespace {

using Clock = std::chrono::steady_clock;

constexpr unsigned BatchSize = 8;
constexpr unsigned MostAttempts = 6000;
constexpr double SleepSeconds = 600.0; // for a process that does nothing
constexpr double PatienceSeconds = 20.0;
constexpr double AnswerSeconds = 5.0;
constexpr double HangSeconds =
    0.5; // a small program that takes longer hangs; asked where that is the failure looked for

const char* const Hang = "does not end";

enum class ChildState : std::uint32_t { Working, Done, Failed };

// What parent and child share.
struct SharedPage {
    volatile std::uint64_t Seed;
    volatile std::uint64_t Life;
    volatile ChildState State;
    FuzzTotals Totals;
    char Kind[256];
    char Pass[64];
    char Detail[4096];
};

void put(char* pTo, std::size_t Size, const std::string& Text) {
    std::snprintf(pTo, Size, "%s", Text.c_str());
}

class SharedMemory {
public:
    SharedMemory() {
        void* pRoom = ::mmap(nullptr, sizeof(SharedPage), PROT_READ | PROT_WRITE,
                             MAP_SHARED | MAP_ANONYMOUS, -1, 0);
        if (pRoom == MAP_FAILED) {
            std::perror("hpnfuzz: mmap");
            std::_Exit(3);
        }
        m_pPage = new (pRoom) SharedPage();
    }
    ~SharedMemory() { ::munmap(m_pPage, sizeof(SharedPage)); }
    SharedMemory(const SharedMemory&) = delete;
    SharedMemory& operator=(const SharedMemory&) = delete;
    SharedPage* operator->() { return m_pPage; }

private:
    SharedPage* m_pPage;
};

void addCounts(TrialCounts& To, const TrialCounts& From) {
    for (std::size_t i = 0; i < PassCount; ++i)
        To.Passes[i] += From.Passes[i];
    To.Constants += From.Constants;
    To.DeadNodes += From.DeadNodes;
    To.Statements += From.Statements;
    To.Exhausted += From.Exhausted;
    for (std::size_t i = 0; i < PairKindCount; ++i)
        To.Pairs[i] += From.Pairs[i];
}

/// How a process ended that did not end by itself, as a kind of failure.
std::string describeEnd(int Status, bool IsStuck) {
    if (IsStuck)
        return Hang;
    return WIFSIGNALED(Status) ? std::string("crash: ") + ::strsignal(WTERMSIG(Status))
                               : "crash: exit status";
}

/// How long a process has held a core: unlike the time on the wall it says whether it hangs,
/// however busy the machine is.
double coreSeconds(pid_t Process) {
    clockid_t Id;
    timespec Time{};
    if (::clock_getcpuclockid(Process, &Id) != 0 || ::clock_gettime(Id, &Time) != 0)
        return 0.0;
    return static_cast<double>(Time.tv_sec) + static_cast<double>(Time.tv_nsec) * 1e-9;
}

class Fuzzer {
public:
    explicit Fuzzer(const FuzzOptions& Options) : m_Options(Options), m_Start(Clock::now()) {
        m_Scratch = hostshell::makeDirectory("hpnfuzz");
        if (m_Scratch.empty())
            std::perror("hpnfuzz: scratch directory");
    }
    ~Fuzzer() {
        std::error_code Ignored;
        std::filesystem::remove_all(m_Scratch, Ignored);
    }
    Fuzzer(const Fuzzer&) = delete;
    Fuzzer& operator=(const Fuzzer&) = delete;

    FuzzTotals run() {
        std::uint64_t Next = m_Options.FirstSeed;
        while (Next <= m_Options.LastSeed && !isTimeUp() &&
               m_Shared->Totals.Failures < m_Options.MostFailures)
            Next = workFrom(Next);
        m_Shared->Totals.Seconds = seconds(m_Start);
        return m_Shared->Totals;
    }

private:
    static double seconds(Clock::time_point Since) {
        return std::chrono::duration<double>(Clock::now() - Since).count();
    }
    bool isTimeUp() const {
        return m_Options.Minutes > 0.0 && seconds(m_Start) > m_Options.Minutes * 60.0;
    }

    // ---- the parent ----

    /// Lets a child work from a seed on; gives the seed to go on with.
    std::uint64_t workFrom(std::uint64_t First) {
        m_Shared->State = ChildState::Working;
        m_Shared->Seed = First;
        std::fflush(nullptr);
        const pid_t Child = ::fork();
        if (Child == 0) {
            ::prctl(PR_SET_PDEATHSIG, SIGKILL);
            work(First);
            std::_Exit(0);
        }
        if (Child < 0) {
            std::perror("hpnfuzz: fork");
            return m_Options.LastSeed;
        }
        bool IsStuck = false;
        const int Status = watch(Child, IsStuck);
        if (m_Shared->State == ChildState::Done)
            return m_Shared->Seed + 1;
        Failure Failed{m_Shared->Kind, m_Shared->Pass, m_Shared->Detail};
        if (m_Shared->State == ChildState::Working) {
            Failed = {describeEnd(Status, IsStuck), "", ""};
            ++m_Shared->Totals.Crashes;
        }
        const std::uint64_t Seed = m_Shared->Seed;
        ++m_Shared->Totals.Failures;
        reportFailure(Seed, Failed);
        return Seed + 1;
    }
    int watch(pid_t Child, bool& IsStuck) {
        std::uint64_t Life = m_Shared->Life;
        Clock::time_point Seen = Clock::now();
        double Held = coreSeconds(Child);
        int Status = 0;
        while (::waitpid(Child, &Status, WNOHANG) == 0) {
            ::usleep(20000);
            if (m_Shared->Life != Life) {
                Life = m_Shared->Life;
                Seen = Clock::now();
                Held = coreSeconds(Child);
            }
            // A process that waits for the C compiler holds no core.
            if (coreSeconds(Child) - Held < PatienceSeconds && seconds(Seen) < SleepSeconds)
                continue;
            IsStuck = true;
            ::kill(Child, SIGKILL);
            ::waitpid(Child, &Status, 0);
            break;
        }
        return Status;
    }

    // ---- the child ----

    void work(std::uint64_t First) {
        CodeBatch Batch;
        for (std::uint64_t Seed = First; Seed <= m_Options.LastSeed && !isTimeUp(); ++Seed) {
            m_Shared->Seed = Seed;
            m_Shared->Life = m_Shared->Life + 1;
            Trial Wanted = makeTrial(Seed, m_Options);
            Wanted.CodePrefix = CodeBatch::prefixOf(Batch.size());
            TrialResult Result = runTrial(Wanted);
            ++m_Shared->Totals.Programs;
            addCounts(m_Shared->Totals.Counts, Result.Counts);
            if (Result.Failed)
                return stopAt(Seed, Result.Failed);
            if (!Result.Code.Harness.empty()) {
                ++m_Shared->Totals.Compiled;
                Batch.add(std::to_string(Seed), std::move(Result.Code));
            }
            if (Batch.size() >= BatchSize && !isBatchFine(Batch, Seed))
                return;
        }
        if (Batch.size() == 0 || isBatchFine(Batch, m_Shared->Seed))
            m_Shared->State = ChildState::Done;
    }
    void stopAt(std::uint64_t Seed, const Failure& Failed) {
        m_Shared->Seed = Seed;
        put(m_Shared->Kind, sizeof m_Shared->Kind, Failed.Kind);
        put(m_Shared->Pass, sizeof m_Shared->Pass, Failed.Pass);
        put(m_Shared->Detail, sizeof m_Shared->Detail, Failed.Detail);
        m_Shared->State = ChildState::Failed;
    }
    bool isBatchFine(CodeBatch& Batch, std::uint64_t Last) {
        const std::string Difference = Batch.run(m_Scratch, m_Options.RuntimeDirectory);
        m_Shared->Life = m_Shared->Life + 1;
        if (Difference.empty())
            return true;
        const std::size_t End = Difference.find('\n');
        reportCompiled(std::stoull(Difference.substr(0, End)), Difference.substr(End + 1));
        // The seeds behind it were fine; the run goes on after the last of them.
        stopAt(Last, {"", "", ""});
        return false;
    }

    // ---- failures ----

    /// Whether a trial fails in the given way, found out in a process of its own.
    bool failsAs(const Trial& Asked, const std::string& Kind) {
        m_Answer->State = ChildState::Working;
        std::fflush(nullptr);
        const pid_t Child = ::fork();
        if (Child == 0) {
            ::prctl(PR_SET_PDEATHSIG, SIGKILL);
            put(m_Answer->Kind, sizeof m_Answer->Kind, findKind(Asked));
            m_Answer->State = ChildState::Done;
            std::_Exit(0);
        }
        const Clock::time_point Asking = Clock::now();
        const double Patience = Kind == Hang ? HangSeconds : AnswerSeconds;
        int Status = 0;
        bool IsStuck = false;
        while (::waitpid(Child, &Status, WNOHANG) == 0) {
            ::usleep(200);
            if ((coreSeconds(Child) < Patience && seconds(Asking) < SleepSeconds) || IsStuck)
                continue;
            IsStuck = true;
            ::kill(Child, SIGKILL);
        }
        const std::string Found =
            m_Answer->State == ChildState::Done ? m_Answer->Kind : describeEnd(Status, IsStuck);
        return Found == Kind;
    }
    std::string findKind(const Trial& Asked) {
        TrialResult Result = runTrial(Asked);
        if (Result.Failed || Result.Code.Harness.empty())
            return Result.Failed.Kind;
        CodeBatch Batch;
        Batch.add("1", std::move(Result.Code));
        return kindOfDifference(Batch.run(m_Scratch, m_Options.RuntimeDirectory));
    }
    static std::string kindOfDifference(const std::string& Difference) {
        if (Difference.empty())
            return {};
        if (Difference.find("does not compile") != std::string::npos ||
            Difference.find("ended with") != std::string::npos)
            return "C: does not compile or end";
        return Difference.find("variant a") != std::string::npos ? "C: unoptimised differs"
                                                                 : "C: optimised differs";
    }
    void reportCompiled(std::uint64_t Seed, const std::string& Difference) {
        ++m_Shared->Totals.Failures;
        reportFailure(Seed, {kindOfDifference("1\n" + Difference), "the emitter", Difference});
    }
    void reportFailure(std::uint64_t Seed, const Failure& Failed) {
        if (Failed.Kind.empty())
            return; // told already
        Trial Wanted = makeTrial(Seed, m_Options);
        Wanted.WantsCode = Failed.Kind.compare(0, 2, "C:") == 0;
        Wanted.CodePrefix = CodeBatch::prefixOf(0);
        std::printf("seed %llu: %s%s%s\n%s\n", static_cast<unsigned long long>(Seed),
                    Failed.Kind.c_str(), Failed.Pass.empty() ? "" : " after ", Failed.Pass.c_str(),
                    Failed.Detail.c_str());
        std::fflush(stdout);
        save(Seed, ".hpn", Wanted.Text);
        const unsigned Attempts = Wanted.WantsCode ? MostAttempts / 20 : MostAttempts;
        Shrinker Smaller(
            [&](const Trial& Asked) {
                m_Shared->Life = m_Shared->Life + 1;
                return failsAs(Asked, Failed.Kind);
            },
            Attempts);
        const Trial Small = Smaller.shrink(Wanted);
        save(Seed, ".small.hpn", Small.Text);
        save(Seed, ".txt",
             "seed " + std::to_string(Seed) + "\nkind " + Failed.Kind + "\npass " + Failed.Pass +
                 "\npasses " + listPasses(Wanted.Passes) + "\npasses needed " +
                 listPasses(Small.Passes) + "\nsteps " + std::to_string(Small.Run.Steps) + "\n" +
                 Failed.Detail + "\n");
        std::printf("passes: %s\nsteps: %u\n%s\n", listPasses(Small.Passes).c_str(),
                    Small.Run.Steps, Small.Text.c_str());
        std::fflush(stdout);
    }
    void save(std::uint64_t Seed, const char* pEnding, const std::string& Text) const {
        std::error_code Error;
        std::filesystem::create_directories(m_Options.Directory, Error);
        const std::string Path = m_Options.Directory + "/seed-" + std::to_string(Seed) + pEnding;
        if (!(std::ofstream(Path, std::ios::binary) << Text))
            std::fprintf(stderr, "hpnfuzz: cannot write %s\n", Path.c_str());
    }

    const FuzzOptions& m_Options;
    Clock::time_point m_Start;
    std::string m_Scratch;
    SharedMemory m_Shared;
    SharedMemory m_Answer;
};

} // namespace

FuzzTotals runFuzz(const FuzzOptions& Options) {
    return Fuzzer(Options).run();
}
#endif

Trial makeTrial(std::uint64_t Seed, const FuzzOptions& Options) {
    Trial Result;
    Result.Text = Seed % 16 == 15 ? RandomProgram(static_cast<unsigned>(Seed)).text()
                                  : PointedProgram(mixBits(11, Seed)).text();
    Result.Passes = choosePasses(mixBits(12, Seed));
    Result.Run.StimulusSeed = mixBits(13, Seed);
    Result.ShowsInternals =
        Options.ChecksEvery != 0 && mixBits(14, Seed) % Options.ChecksEvery == 0;
    Result.WantsCode = Options.GccEvery != 0 && mixBits(15, Seed) % Options.GccEvery == 0;
    if (Options.PairsEvery != 0 && mixBits(16, Seed) % Options.PairsEvery == 0)
        Result.Pair = static_cast<PairKind>(1 + mixBits(17, Seed) % (PairKindCount - 1));
    return Result;
}

std::string describeTotals(const FuzzTotals& Totals) {
    const auto number = [](std::uint64_t Number) { return std::to_string(Number); };
    char Rate[64];
    std::snprintf(Rate, sizeof Rate, "%.0f programs/s",
                  Totals.Seconds > 0.0 ? static_cast<double>(Totals.Programs) / Totals.Seconds
                                       : 0.0);
    std::string Text = "programs " + number(Totals.Programs) + " (" + Rate + ", " +
                       number(Totals.Counts.Exhausted) + " without end)\n";
    Text += "statements executed " + number(Totals.Counts.Statements) + "\n";
    Text += "constants found " + number(Totals.Counts.Constants) +
            ", nodes removed by propagation " + number(Totals.Counts.DeadNodes) + "\n";
    Text += "pairs of C variants compared " + number(Totals.Compiled) + "\n";
    for (std::size_t i = 1; i < PairKindCount; ++i)
        Text += std::string("other program ") + nameOfPair(static_cast<PairKind>(i)) + " " +
                number(Totals.Counts.Pairs[i]) + "\n";
    for (std::size_t i = 0; i < PassCount; ++i)
        Text += std::string("pass ") + passTable()[i].Name + " " + number(Totals.Counts.Passes[i]) +
                "\n";
    return Text + "failures " + number(Totals.Failures) + ", crashes among them " +
           number(Totals.Crashes) + "\n";
}

} // namespace hpn::fuzz
