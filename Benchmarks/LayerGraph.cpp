// Graph searches and edits on graphs of three shapes, each with one node for each number:
//   creation  a control-flow graph made in its own order: the next node, and every third node also
//             one a little ahead or behind;
//   local     two edges from each node to any of the 2,000 around it;
//   random    two edges from each node to any node.
// Searches print the time per node and edge of the whole graph.

#include "LayerBenchmark.h"

#include "LEDA/leda.h"

#include <vector>

namespace {

enum Shape { creation, local, random_ends };

using Graph = leda::GRAPH<int*, int*>;

void addEdges(Graph& G, const std::vector<leda::node>& Nodes, Shape shape) {
    RandomNumbers Random;
    const int count = int(Nodes.size());
    const auto at = [&](int i) {
        return Nodes[std::size_t(i < 0 ? 0 : i < count ? i : count - 1)];
    };
    for (int i = 0; i < count; ++i) {
        switch (shape) {
        case creation:
            if (i + 1 < count)
                G.new_edge(at(i), at(i + 1));
            if (i % 3 == 0)
                G.new_edge(at(i), at(i + Random.below(40) - 10));
            break;
        case local:
            G.new_edge(at(i), at(i + Random.below(2000) - 1000));
            G.new_edge(at(i), at(i + Random.below(2000) - 1000));
            break;
        case random_ends:
            G.new_edge(at(i), at(Random.below(count)));
            G.new_edge(at(i), at(Random.below(count)));
            break;
        }
    }
}

std::vector<leda::node> addNodes(Graph& G, int count) {
    std::vector<leda::node> Nodes;
    Nodes.reserve(std::size_t(count));
    for (int i = 0; i < count; ++i)
        Nodes.push_back(G.new_node());
    return Nodes;
}

// Only one graph is kept: the benchmarks of one shape and size follow one another.
const Graph& graphOf(Shape shape, int nodes) {
    static Graph G;
    static Shape keptShape = creation;
    static int keptNodes = 0;
    if (keptShape == shape && keptNodes == nodes)
        return G;
    G.clear();
    addEdges(G, addNodes(G, nodes), shape);
    keptShape = shape;
    keptNodes = nodes;
    return G;
}

const Graph& graphOf(const benchmark::State& State) {
    return graphOf(Shape(State.range(0)), int(State.range(1)));
}

void reportTimePerElement(benchmark::State& State, const Graph& G) {
    reportTimePer(State, "per_node_and_edge", double(G.number_of_nodes() + G.number_of_edges()));
}

void breadthFirst(benchmark::State& State) {
    const Graph& G = graphOf(State);
    for (auto _ : State) {
        leda::node_array<int> Distance(G, -1);
        benchmark::DoNotOptimize(leda::BFS(G, G.first_node(), Distance).size());
    }
    reportTimePerElement(State, G);
}

void depthFirst(benchmark::State& State) {
    const Graph& G = graphOf(State);
    for (auto _ : State) {
        leda::node_array<bool> Reached(G, false);
        benchmark::DoNotOptimize(leda::DFS(G, G.first_node(), Reached).size());
    }
    reportTimePerElement(State, G);
}

void components(benchmark::State& State) {
    const Graph& G = graphOf(State);
    for (auto _ : State) {
        leda::node_array<int> Number(G);
        benchmark::DoNotOptimize(leda::COMPONENTS(G, Number));
    }
    reportTimePerElement(State, G);
}

void strongComponents(benchmark::State& State) {
    const Graph& G = graphOf(State);
    for (auto _ : State) {
        leda::node_array<int> Number(G);
        benchmark::DoNotOptimize(leda::STRONG_COMPONENTS(G, Number));
    }
    reportTimePerElement(State, G);
}

// Every node with every out-edge, in list order.
void walk(benchmark::State& State) {
    const Graph& G = graphOf(State);
    for (auto _ : State) {
        long sum = 0;
        for (leda::node v = G.first_node(); v; v = G.next_node(v))
            for (leda::edge e = G.first_adj_edge(v); e; e = G.adj_succ(e))
                sum += G.index(G.target(e));
        benchmark::DoNotOptimize(sum);
    }
    reportTimePerElement(State, G);
}

// Makes a graph and clears it; also tells the pool's bytes for one node and edge.
void makeAndClear(benchmark::State& State) {
    const Shape shape = Shape(State.range(0));
    Graph G;
    for (auto _ : State) {
        addEdges(G, addNodes(G, int(State.range(1))), shape);
        State.counters["nodes_and_edges"] = G.number_of_nodes() + G.number_of_edges();
        G.clear();
    }
    reportTimePer(State, "per_node_and_edge", State.counters["nodes_and_edges"]);
    State.counters["node_bytes"] = sizeof(leda::node_struct);
    State.counters["edge_bytes"] = sizeof(leda::edge_struct);
}

// Deletes and makes an edge at a random node, and moves another one: what the passes do to shape a
// graph.
void editEdges(benchmark::State& State) {
    Graph G;
    const std::vector<leda::node> Nodes = addNodes(G, int(State.range(1)));
    addEdges(G, Nodes, Shape(State.range(0)));
    RandomNumbers Random;
    const auto any = [&] { return Nodes[std::size_t(Random.below(int(Nodes.size())))]; };
    for (auto _ : State) {
        leda::node v = any();
        if (leda::edge e = G.first_adj_edge(v))
            G.del_edge(e);
        leda::edge e = G.new_edge(v, any());
        G.move_edge(e, v, any());
    }
    reportTimePer(State, "per_edit", 3);
}

void shapes(benchmark::internal::Benchmark* pBenchmark) {
    pBenchmark->ArgNames({"shape", "nodes"})
        ->Args({creation, 1000})
        ->Args({creation, 1000000})
        ->Args({local, 1000000})
        ->Args({random_ends, 1000000})
        ->Unit(benchmark::kMillisecond);
}

BENCHMARK(breadthFirst)->Apply(shapes);
BENCHMARK(depthFirst)->Apply(shapes);
BENCHMARK(components)->Apply(shapes);
BENCHMARK(strongComponents)->Apply(shapes);
BENCHMARK(walk)->Apply(shapes);
BENCHMARK(makeAndClear)->Apply(shapes);
BENCHMARK(editEdges)->ArgNames({"shape", "nodes"})->Args({creation, 10000})->Args({local, 1000000});

} // namespace
