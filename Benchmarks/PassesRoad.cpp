// Single passes on the families of Scripts/generate, in nanoseconds per assignment (dominators: per
// node and edge of control flow), and reading and emission beside them. Each iteration takes a
// fresh graph through the passes before the measured one; only that one is timed, in CPU time.

#include "Emitter/CEmitter.h"
#include "Graph/ProgramGraph.h"
#include "Language/Reader.h"
#include "Model/PendingWarnings.h"
#include "Road/PassSequence.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <memory>
#include <string>

namespace {

const char* const Families[] = {"chain", "diamonds", "loops", "state", "procedures", "mixture"};

double cpuSeconds() {
    timespec Now;
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &Now);
    return static_cast<double>(Now.tv_sec) + 1e-9 * static_cast<double>(Now.tv_nsec);
}

// Only the last text is kept: the benchmarks of one family follow one another.
const std::string& textOf(const char* Family, long Count) {
    static std::string Text;
    static std::string Kept;
    const std::string Wanted = std::string(Family) + " " + std::to_string(Count) + " 1";
    if (Kept == Wanted)
        return Text;
    Text.clear();
    Kept = Wanted;
    std::FILE* pPipe = popen((HPN_SCRIPTS "/generate " + Wanted).c_str(), "r");
    char Piece[1 << 16];
    while (const std::size_t Length = pPipe ? std::fread(Piece, 1, sizeof Piece, pPipe) : 0)
        Text.append(Piece, Length);
    if (pPipe == nullptr || pclose(pPipe) != 0) {
        std::fprintf(stderr, "BenchmarkPasses: cannot run Scripts/generate\n");
        std::exit(1);
    }
    return Text;
}

// A program on its graph, taken along the road up to a pass.
struct Run {
    Run(const char* Family, long Count) {
        Sources.add("program.hpn", textOf(Family, Count));
        hpn::Diagnostics Messages(Sources);
        if (!hpn::readProgram(Sources, Messages, Source)) {
            std::fputs(Messages.print().c_str(), stderr);
            std::exit(1);
        }
    }
    ~Run() {
        pGraph.reset();
        hpn::pendingWarnings().clear();
    }
    void goTo(hpn::PassId End) {
        pGraph = std::make_unique<hpn::ProgramGraph>(Source);
        const hpn::PassSequence Road = hpn::PassSequence::defaultOrder();
        for (const hpn::PassId Id : Road.getPasses()) {
            if (Id == End)
                return;
            hpn::passOf(Id).pRun(*pGraph);
        }
    }

    hpn::SourceFiles Sources;
    hpn::Program Source;
    std::unique_ptr<hpn::ProgramGraph> pGraph;
};

// Notes the time of one iteration and the share of one unit of `Units` in it.
template <typename Work>
double timeWork(benchmark::State& State, Work&& Do) {
    const double Start = cpuSeconds();
    Do();
    const double Seconds = cpuSeconds() - Start;
    State.SetIterationTime(Seconds);
    return Seconds;
}

void show(benchmark::State& State, const char* Name, double Seconds, double Units) {
    State.counters[Name] = 1e9 * Seconds / (Units * static_cast<double>(State.iterations()));
}

void passOfRoad(benchmark::State& State, const char* Family, hpn::PassId Id) {
    double Seconds = 0.0;
    for (auto Each : State) {
        (void)Each;
        Run Fresh(Family, State.range(0));
        Fresh.goTo(Id);
        Seconds += timeWork(State, [&] { hpn::passOf(Id).pRun(*Fresh.pGraph); });
    }
    show(State, "ns_per_assignment", Seconds, static_cast<double>(State.range(0)));
}

// Immediate dominators of all procedures, on the graph as SSA construction finds it.
void immediateDominators(benchmark::State& State, const char* Family) {
    double Seconds = 0.0;
    double Units = 0.0;
    for (auto Each : State) {
        (void)Each;
        Run Fresh(Family, State.range(0));
        Fresh.goTo(hpn::PassId::TransformToSSAForm);
        ZfCControlFlowGraph& Graph = Fresh.pGraph->getGraph();
        Units = Graph.number_of_nodes() + Graph.number_of_edges();
        Seconds += timeWork(State, [&] { Graph.computeAllIdoms(); });
    }
    show(State, "ns_per_node_and_edge", Seconds, Units);
}

void addSSAEdges(benchmark::State& State, const char* Family) {
    double Seconds = 0.0;
    for (auto Each : State) {
        (void)Each;
        Run Fresh(Family, State.range(0));
        Fresh.goTo(hpn::PassId::PropagateSparseConditionalConstant);
        Seconds += timeWork(State, [&] { Fresh.pGraph->getGraph().addSSAEdges(); });
    }
    show(State, "ns_per_assignment", Seconds, static_cast<double>(State.range(0)));
}

void sparseConditionalConstant(benchmark::State& State, const char* Family) {
    double Seconds = 0.0;
    for (auto Each : State) {
        (void)Each;
        Run Fresh(Family, State.range(0));
        Fresh.goTo(hpn::PassId::PropagateSparseConditionalConstant);
        Fresh.pGraph->getGraph().addSSAEdges();
        Seconds +=
            timeWork(State, [&] { Fresh.pGraph->getGraph().sparseConditionalConstant(true); });
    }
    show(State, "ns_per_assignment", Seconds, static_cast<double>(State.range(0)));
}

void read(benchmark::State& State, const char* Family) {
    double Seconds = 0.0;
    textOf(Family, State.range(0));
    for (auto Each : State) {
        (void)Each;
        Seconds += timeWork(State, [&] { Run Fresh(Family, State.range(0)); });
    }
    show(State, "ns_per_assignment", Seconds, static_cast<double>(State.range(0)));
}

void emit(benchmark::State& State, const char* Family) {
    double Seconds = 0.0;
    for (auto Each : State) {
        (void)Each;
        Run Fresh(Family, State.range(0));
        Fresh.goTo(hpn::PassId::HoistCodeOutOfIfElseBranches);
        Seconds += timeWork(State, [&] {
            benchmark::DoNotOptimize(hpn::emitProgram(*Fresh.pGraph).Source.size());
        });
    }
    show(State, "ns_per_assignment", Seconds, static_cast<double>(State.range(0)));
}

template <typename Function, typename... Rest>
void add(const std::string& Name, const char* Family, Function What, Rest... More) {
    benchmark::RegisterBenchmark((Name + "/" + Family).c_str(), What, Family, More...)
        ->Arg(10000)
        ->Arg(100000)
        ->Iterations(3)
        ->UseManualTime()
        ->Unit(benchmark::kMillisecond);
}

// Family by family, so that each text is made once.
const bool AreRegistered = [] {
    const hpn::PassSequence Road = hpn::PassSequence::defaultOrder();
    for (const char* Family : Families) {
        add("read", Family, read);
        add("immediateDominators", Family, immediateDominators);
        add("addSSAEdges", Family, addSSAEdges);
        add("sparseConditionalConstant", Family, sparseConditionalConstant);
        for (const hpn::PassId Id : Road.getPasses())
            add(hpn::passOf(Id).Name, Family, passOfRoad, Id);
        add("emit", Family, emit);
    }
    return true;
}();

} // namespace
