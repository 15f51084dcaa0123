// Times the road on one program, several times in one process, and prints what it took as JSON.
//
// One run is boot, graph building, the road, emission and shutdown. The road proper goes from the
// filled graph to after removeUnusedVarDefs; hoisting, which follows it, is timed for itself. Times
// are CPU seconds of the process, so that other work on the machine hardly shows. Memory is given
// in bytes: the resident peak so far, and what the heap holds in use after a run has released
// everything.
//
//   RoadTimer PROGRAM.hpn [RUNS]      (default: 2 runs)

#include "Emitter/CEmitter.h"
#include "Graph/ProcessMemory.h"
#include "Graph/ProgramGraph.h"
#include "Language/Reader.h"
#include "Model/PendingWarnings.h"
#include "Road/PassSequence.h"

#include <malloc.h>
#include <sys/resource.h>

#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <string>
#include <utility>
#include <vector>

namespace {

double cpuSeconds() {
    timespec Now;
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &Now);
    return static_cast<double>(Now.tv_sec) + 1e-9 * static_cast<double>(Now.tv_nsec);
}

std::size_t peakBytes() {
    rusage Usage;
    getrusage(RUSAGE_SELF, &Usage);
    return static_cast<std::size_t>(Usage.ru_maxrss) * 1024;
}

std::size_t heapBytes() {
    const struct mallinfo2 Heap = mallinfo2();
    return Heap.uordblks + Heap.hblkhd;
}

// Figures in the order in which they were taken, printed as one JSON object.
class Figures {
public:
    void add(const char* Name, double Value) { m_Values.emplace_back(Name, Value); }
    // Runs the work and notes its seconds; answers them.
    template <typename Work>
    double time(const char* Name, Work&& Do) {
        const double Start = cpuSeconds();
        Do();
        const double Seconds = cpuSeconds() - Start;
        add(Name, Seconds);
        return Seconds;
    }
    void print() const {
        const char* Separator = "{";
        for (const auto& [Name, Value] : m_Values) {
            std::printf("%s\"%s\": %.9g", Separator, Name, Value);
            Separator = ", ";
        }
        std::printf("}");
    }

private:
    std::vector<std::pair<const char*, double>> m_Values;
};

void runOnce(const char* FileName, Figures& Taken) {
    hpn::SourceFiles Sources;
    hpn::Program Source;
    bool IsRead = false;
    Taken.time("read", [&] {
        std::string Why;
        hpn::Diagnostics Messages(Sources);
        IsRead = Sources.addFile(FileName, Why) && hpn::readProgram(Sources, Messages, Source);
        std::fputs(Why.c_str(), stderr);
        if (!IsRead)
            std::fputs(Messages.print().c_str(), stderr);
    });
    if (!IsRead)
        std::exit(1);
    hpn::ProgramGraph* pGraph = nullptr;
    Taken.time("build", [&] {
        pGraph = new hpn::ProgramGraph(Source);
        Source.dropBodies(); // as in the driver
    });
    double Road = 0.0;
    const hpn::PassSequence Passes = hpn::PassSequence::defaultOrder();
    for (const hpn::PassId Id : Passes.getPasses()) {
        const hpn::Pass& Each = hpn::passOf(Id);
        const double Seconds = Taken.time(Each.Name, [&] { Each.pRun(*pGraph); });
        if (Id != hpn::PassId::HoistCodeOutOfIfElseBranches)
            Road += Seconds;
    }
    Taken.add("road", Road);
    std::size_t Length = 0;
    Taken.time("emit", [&] { Length = hpn::emitProgram(*pGraph).Source.size(); });
    Taken.add("code_bytes", static_cast<double>(Length));
    Taken.add("peak_bytes", static_cast<double>(peakBytes()));
    Taken.time("release", [&] { delete pGraph; });
    hpn::pendingWarnings().clear();
}

} // namespace

int main(int ArgumentCount, char** pArguments) {
    const int Runs = ArgumentCount > 2 ? std::atoi(pArguments[2]) : 2;
    if (ArgumentCount < 2 || ArgumentCount > 3 || Runs < 1) {
        std::fprintf(stderr, "usage: RoadTimer PROGRAM.hpn [RUNS]\n");
        return 2;
    }
    hpn::usePooledMemory(); // as in the driver
    const char* Separator = "[";
    for (int Run = 0; Run < Runs; ++Run) {
        Figures Taken;
        runOnce(pArguments[1], Taken);
        Taken.add("heap_after_bytes", static_cast<double>(heapBytes()));
        std::printf("%s", Separator);
        Taken.print();
        Separator = ",\n ";
    }
    std::printf("]\n");
    return 0;
}
