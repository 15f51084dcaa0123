// Sets of pointers with a comparison of their own, as the sets of variables are, and hashed maps.

#include "LayerBenchmark.h"

#include "LEDA/leda.h"

#include <algorithm>
#include <limits>
#include <memory>
#include <vector>

namespace {

// Like a variable of the model: the order is a number inside an object of some size.
struct Thing {
    virtual ~Thing() = default;
    double payload[6] = {};
    int number = 0;
};

int compare(Thing* const& pLeft, Thing* const& pRight) {
    if (pLeft == pRight)
        return 0;
    if (pLeft == nullptr || pRight == nullptr)
        return pLeft == nullptr ? -1 : 1;
    return (pLeft->number > pRight->number) - (pLeft->number < pRight->number);
}

} // namespace

namespace leda {

template <>
struct order_number<Thing*> {
    static constexpr bool known = true;
    static std::int64_t of(Thing* const& pThing) {
        return pThing != nullptr ? pThing->number : std::numeric_limits<std::int64_t>::min();
    }
};

} // namespace leda

namespace {

using Set = leda::set<Thing*, leda::avl_tree>;

class Things {
public:
    explicit Things(int count) : m_things(new Thing[std::size_t(count)]), m_count(count) {
        for (int i = 0; i < count; ++i)
            m_things[std::size_t(i)].number = i;
    }
    Thing* at(int i) { return &m_things[std::size_t(i)]; }
    int count() const { return m_count; }

private:
    std::unique_ptr<Thing[]> m_things;
    int m_count;
};

enum Relation { disjoint, half, subset, behind };

// Pairs of sets of n elements each, their elements chosen at random from a window of 8 n things, as
// a procedure's sets are; enough pairs that no branch predictor knows their order by heart.
class SetPairs {
public:
    SetPairs(Relation relation, int n) : m_things(16 * n + 4096) {
        for (unsigned int i = 0; i < pairs; ++i) {
            const std::vector<int> Numbers = choose(2 * n);
            Set A, B;
            for (int j = 0; j < n; ++j) {
                A.insert(at(relation == behind ? Numbers[std::size_t(j)] % (4 * n) + base()
                                               : Numbers[std::size_t(j)] + base()));
                B.insert(at(other(relation, Numbers, n, j) + base()));
            }
            m_pairs.push_back({A, B});
            m_base = m_random.below(4096 - 8);
        }
    }
    const std::pair<Set, Set>& next() { return m_pairs[m_next++ % pairs]; }

private:
    static constexpr unsigned int pairs = 2048;

    Thing* at(int i) { return m_things.at(i); }
    int base() const { return m_base; }
    static int other(Relation relation, const std::vector<int>& Numbers, int n, int j) {
        switch (relation) {
        case disjoint:
            return Numbers[std::size_t(n + j)];
        case half:
            return Numbers[std::size_t(n / 2 + j)];
        case subset:
            return Numbers[std::size_t(j)];
        default:
            return Numbers[std::size_t(n + j)] % (4 * n) + 8 * n;
        }
    }
    std::vector<int> choose(int count) {
        std::vector<int> Numbers;
        while (int(Numbers.size()) < count) {
            const int number = m_random.below(4 * count);
            if (std::find(Numbers.begin(), Numbers.end(), number) == Numbers.end())
                Numbers.push_back(number);
        }
        return Numbers;
    }

    Things m_things;
    RandomNumbers m_random;
    std::vector<std::pair<Set, Set>> m_pairs;
    unsigned int m_next = 0;
    int m_base = 0;
};

void copyAndUnite(benchmark::State& State) {
    SetPairs Pairs(Relation(State.range(0)), int(State.range(1)));
    for (auto _ : State) {
        const std::pair<Set, Set>& Pair = Pairs.next();
        Set Union(Pair.first);
        Union.add(Pair.second);
        benchmark::DoNotOptimize(Union.size());
    }
}

void assignCopy(benchmark::State& State) {
    SetPairs Pairs(disjoint, int(State.range(0)));
    Set Target;
    for (auto _ : State) {
        Target = Pairs.next().first;
        benchmark::DoNotOptimize(Target.size());
    }
}

void intersect(benchmark::State& State) {
    SetPairs Pairs(Relation(State.range(0)), int(State.range(1)));
    for (auto _ : State) {
        const std::pair<Set, Set>& Pair = Pairs.next();
        Set Common(Pair.first);
        Common.intersect_with(Pair.second);
        benchmark::DoNotOptimize(Common.size());
    }
}

// Inserts n elements, in random orders or in ascending one, and walks them.
void insertAndWalk(benchmark::State& State) {
    const int n = int(State.range(0));
    Things All(n);
    RandomNumbers Random;
    std::vector<std::vector<Thing*>> Orders(std::size_t(1 + 30000 / n));
    for (std::vector<Thing*>& Order : Orders) {
        for (int i = 0; i < n; ++i)
            Order.push_back(All.at(i));
        if (State.range(1))
            for (int i = n - 1; i > 0; --i)
                std::swap(Order[std::size_t(i)], Order[std::size_t(Random.below(i + 1))]);
    }
    std::size_t next = 0;
    for (auto _ : State) {
        Set S;
        for (Thing* pThing : Orders[next++ % Orders.size()])
            S.insert(pThing);
        long sum = 0;
        for (Thing* pThing : S)
            sum += pThing->number;
        benchmark::DoNotOptimize(sum);
    }
    reportTimePer(State, "per_element", n);
}

enum KeyOrder { ordered, shuffled };

// Keys as the passes have them: nodes or edges of a graph, or objects of some other kind.
template <class Key>
std::vector<Key> keys(leda::graph& G, Things& All, int count);

template <>
std::vector<leda::node> keys(leda::graph& G, Things&, int count) {
    std::vector<leda::node> Keys;
    for (int i = 0; i < count; ++i)
        Keys.push_back(G.new_node());
    return Keys;
}

template <>
std::vector<leda::edge> keys(leda::graph& G, Things&, int count) {
    std::vector<leda::edge> Keys;
    leda::node v = G.new_node();
    for (int i = 0; i < count; ++i)
        Keys.push_back(G.new_edge(v, v));
    return Keys;
}

template <>
std::vector<Thing*> keys(leda::graph&, Things& All, int count) {
    std::vector<Thing*> Keys;
    for (int i = 0; i < count; ++i)
        Keys.push_back(All.at(i));
    return Keys;
}

template <class Key>
class KeyCase {
public:
    explicit KeyCase(const benchmark::State& State)
        : m_things(int(State.range(1))), Keys(keys<Key>(m_graph, m_things, int(State.range(1)))) {
        RandomNumbers Random;
        if (State.range(0) == shuffled)
            for (std::size_t i = Keys.size() - 1; i > 0; --i)
                std::swap(Keys[i], Keys[std::size_t(Random.below(int(i) + 1))]);
    }

private:
    leda::graph m_graph;
    Things m_things;

public:
    std::vector<Key> Keys;
};

template <class Key>
void mapInsert(benchmark::State& State) {
    const KeyCase<Key> Case(State);
    for (auto _ : State) {
        leda::map<Key, int> Map;
        for (Key key : Case.Keys)
            Map[key] = 1;
        benchmark::DoNotOptimize(Map.size());
    }
    reportTimePer(State, "per_insert", double(Case.Keys.size()));
}

template <class Key>
void mapHit(benchmark::State& State) {
    const KeyCase<Key> Case(State);
    leda::map<Key, int> Map;
    for (Key key : Case.Keys)
        Map[key] = 1;
    for (auto _ : State) {
        long sum = 0;
        for (Key key : Case.Keys)
            sum += *Map.lookup(key);
        benchmark::DoNotOptimize(sum);
    }
    reportTimePer(State, "per_hit", double(Case.Keys.size()));
}

void hashedArray(benchmark::State& State) {
    const KeyCase<Thing*> Case(State);
    for (auto _ : State) {
        leda::h_array<Thing*, void*> Array;
        for (Thing* key : Case.Keys)
            Array[key] = key;
        benchmark::DoNotOptimize(Array.size());
    }
    reportTimePer(State, "per_insert", double(Case.Keys.size()));
}

void dictionary(benchmark::State& State) {
    const KeyCase<Thing*> Case(State);
    for (auto _ : State) {
        leda::dictionary<Thing*, void*> Dictionary;
        for (Thing* key : Case.Keys)
            Dictionary.insert(key, key);
        benchmark::DoNotOptimize(Dictionary.size());
    }
    reportTimePer(State, "per_insert", double(Case.Keys.size()));
}

void relations(benchmark::internal::Benchmark* pBenchmark) {
    pBenchmark->ArgNames({"relation", "n"})
        ->ArgsProduct({{disjoint, half, subset, behind}, {4, 16, 64, 1000}});
}

void keyOrders(benchmark::internal::Benchmark* pBenchmark) {
    pBenchmark->ArgNames({"shuffled", "n"})->ArgsProduct({{ordered, shuffled}, {8, 100000}});
}

BENCHMARK(copyAndUnite)->Apply(relations);
BENCHMARK(intersect)->Apply(relations);
BENCHMARK(assignCopy)->ArgName("n")->Arg(4)->Arg(16)->Arg(64)->Arg(1000);
BENCHMARK(insertAndWalk)
    ->ArgNames({"n", "shuffled"})
    ->ArgsProduct({{4, 16, 64, 10000}, {ordered, shuffled}});
BENCHMARK_TEMPLATE(mapInsert, leda::node)->Apply(keyOrders);
BENCHMARK_TEMPLATE(mapInsert, leda::edge)->Apply(keyOrders);
BENCHMARK_TEMPLATE(mapInsert, Thing*)->Apply(keyOrders);
BENCHMARK_TEMPLATE(mapHit, leda::node)->Apply(keyOrders);
BENCHMARK_TEMPLATE(mapHit, leda::edge)->Apply(keyOrders);
BENCHMARK_TEMPLATE(mapHit, Thing*)->Apply(keyOrders);
BENCHMARK(hashedArray)->Apply(keyOrders);
BENCHMARK(dictionary)->Apply(keyOrders);

} // namespace
