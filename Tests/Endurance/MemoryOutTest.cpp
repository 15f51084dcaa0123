// Memory that runs out at the n-th block, for every n of a small run. Without a new-handler an
// object of the library comes out null, untested by its passes, and everybody else hears
// std::bad_alloc. So a run ends with some result (a null object that nobody looked at is missing in
// it), with the exception, or with the first use of the null object, which faults at once; what
// does not end in the fault leaves a process in which a fresh run works. With a handler that ends
// the process, as the driver has one, there are no null objects and no code with holes.

#include "EnduranceSupport.h"

#include "LEDA/error.h"

#include <csignal>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <new>
#include <numeric>
#include <sstream>
#include <sys/wait.h>
#include <unistd.h>

namespace {

using namespace endurance;

// How a child ends.
enum Ending {
    UsualResult = 10,
    OtherResult = 11,
    Exception = 12,
    NullObject = 13,
    Handler = 14,
    WrongAfterwards = 20,
    Broken = 21
};

// An access behind a null pointer lies in the first page or two.
void endAtFault(int, siginfo_t* pInfo, void*) {
    const auto Address = reinterpret_cast<std::uintptr_t>(pInfo->si_addr);
    _exit(Address < 8192 ? NullObject : 128 + SIGSEGV);
}

void watchFaults() {
    struct sigaction Action = {};
    Action.sa_sigaction = &endAtFault;
    Action.sa_flags = SA_SIGINFO;
    sigaction(SIGSEGV, &Action, nullptr);
}

[[noreturn]] void endInHandler() {
    _exit(Handler);
}

// In the child.
[[noreturn]] void runShortOfMemory(long FailAt, bool HasHandler, const std::string& Expected) {
    CountingController Controller;
    const ControllerScope Scope(&Controller);
    const hpn::PassSequence Passes = wholeRoad();
    Ending Result = UsualResult;
    watchFaults();
    alarm(60); // a run without an end is a failure
    if (HasHandler)
        std::set_new_handler(&endInHandler);
    Controller.failAt(FailAt, HasHandler);
    try {
        if (runRoad(SmallProgram, Passes) != Expected)
            Result = OtherResult;
    } catch (const std::bad_alloc&) {
        Result = Exception;
    }
    Controller.failAt(0, false);
    if (runRoad(SmallProgram, Passes) != Expected)
        Result = WrongAfterwards;
    _exit(Result);
}

// What the child wrote to its error stream, and how it ended.
struct Child {
    int Status = 0;
    std::string Messages;

    template <class Body>
    explicit Child(const Body& Run) {
        int Ends[2];
        if (pipe(Ends) != 0)
            return;
        const pid_t Id = fork();
        if (Id == 0) {
            dup2(Ends[1], 2);
            Run();
        }
        close(Ends[1]);
        char Buffer[4096];
        for (ssize_t Count; (Count = read(Ends[0], Buffer, sizeof Buffer)) > 0;)
            Messages.append(Buffer, static_cast<std::size_t>(Count));
        close(Ends[0]);
        waitpid(Id, &Status, 0);
    }

    // The undefined-behaviour sanitizer reports the use of the null object before it faults.
    bool isNullReported() const {
        return Messages.find("runtime error") != std::string::npos &&
               Messages.find("null pointer") != std::string::npos &&
               Messages.find("AddressSanitizer") == std::string::npos;
    }
    Ending ending() const {
        if (isNullReported())
            return NullObject;
        return WIFEXITED(Status) ? static_cast<Ending>(WEXITSTATUS(Status)) : Broken;
    }
};

long countBlocksOfRun(std::string& Code) {
    CountingController Controller;
    const ControllerScope Scope(&Controller);
    const hpn::PassSequence Passes = wholeRoad();
    runRoad(SmallProgram, Passes);
    Controller.failAt(0, false);
    Code = runRoad(SmallProgram, Passes);
    return Controller.getTaken();
}

// Every block, or as ENDURANCE_STEP says; a sanitizer's process takes long to fork.
long stepOfFailures() {
    if (const char* const pWanted = std::getenv("ENDURANCE_STEP"))
        return std::atol(pWanted);
#ifdef ENDURANCE_ASAN
    return 7;
#else
    return 1;
#endif
}

// How the runs end, each short of another block.
struct Endings {
    long Blocks = 0;
    long Counts[256] = {};

    explicit Endings(bool HasHandler) {
        std::string Code;
        Blocks = countBlocksOfRun(Code);
        const long Step = stepOfFailures();
        for (long n = 1; n <= Blocks; n += Step) {
            const Child Run([&] { runShortOfMemory(n, HasHandler, Code); });
            const Ending Way = Run.ending();
            ++Counts[Way];
            EXPECT_TRUE(Way >= UsualResult && Way <= Handler)
                << "block " << n << " of " << Blocks << ": status " << Run.Status << "\n"
                << Run.Messages.substr(0, 4000);
        }
        std::printf("%ld blocks: %ld exceptions, %ld null objects, %ld unseen, %ld unharmed\n",
                    Blocks, Counts[Exception], Counts[NullObject], Counts[OtherResult],
                    Counts[UsualResult]);
    }
};

TEST(MemoryOut, OneMissingBlockNeverHarmsAnother) {
    const Endings Seen(false);
    EXPECT_GT(Seen.Counts[Exception], 0);
    EXPECT_GT(Seen.Counts[NullObject], 0);
}

TEST(MemoryOut, AHandlerThatEndsTheProcessLeavesNoOtherEnd) {
    const Endings Seen(true);
    EXPECT_GT(Seen.Counts[Handler], 0);
    EXPECT_EQ(Seen.Counts[Handler], std::accumulate(Seen.Counts, Seen.Counts + 256, 0L));
}

#ifndef ENDURANCE_ASAN // which reserves more of the address space than any limit leaves
// The driver under one limit of its address space after the other: code that is whole, or a message
// and no file.
TEST(MemoryOut, TheDriverSaysSoAndLeavesNoFile) {
    const std::string Directory = "hpn_memory_out_" + std::to_string(getpid());
    const std::string Stem = Directory + "/program";
    std::filesystem::create_directory(Directory);
    {
        std::ofstream Text(Stem + ".hpn");
        Text << "state int32 s; output int32 o;\nproc main() {\n";
        for (int i = 0; i < 4000; ++i)
            Text << "  if (s > " << i << ") { s = s + o; } else { o = s; }\n";
        Text << "}\n";
    }
    int Short = 0;
    int Done = 0;
    for (int MiB = 16; MiB <= 1024; MiB += MiB < 96 ? 8 : 928) {
        const std::string Command = "ulimit -v " + std::to_string(MiB * 1024) +
                                    "; exec " HPNCG_PATH + (" " + Stem + ".hpn -o ") + Stem +
                                    ".c 2>" + Stem + ".log";
        const int Status = std::system(Command.c_str());
        std::ostringstream Log;
        Log << std::ifstream(Stem + ".log").rdbuf();
        const bool IsWritten = access((Stem + ".c").c_str(), F_OK) == 0;
        EXPECT_EQ(IsWritten, Status == 0) << MiB << " MiB: " << Log.str();
        if (Status != 0) {
            EXPECT_TRUE(WIFEXITED(Status)) << MiB << " MiB: " << Status;
            EXPECT_NE(Log.str().find("out of memory"), std::string::npos) << MiB << Log.str();
        }
        ++(Status == 0 ? Done : Short);
        std::remove((Stem + ".c").c_str());
    }
    EXPECT_GT(Short, 2);
    EXPECT_GT(Done, 0);
    std::filesystem::remove_all(Directory);
}
#endif

} // namespace
