#include "LEDA/graph.h"

#include "LEDA/graph_alg.h"
#include "LEDA/set.h"

#include <algorithm>
#include <functional>
#include <gtest/gtest.h>
#include <map>
#include <random>
#include <vector>

namespace {

using Graph = leda::GRAPH<int*, int*>;

template <class T>
std::vector<T> contents(const leda::list<T>& L) {
    return std::vector<T>(L.begin(), L.end());
}

std::vector<leda::edge> outEdges(leda::node v) {
    std::vector<leda::edge> result;
    for (leda::edge e = v->first_out_edge(); e != v->stop_out_edge(); e = e->next_out_edge())
        result.push_back(e);
    return result;
}

std::vector<leda::edge> outEdgesBackward(leda::node v) {
    std::vector<leda::edge> result;
    for (leda::edge e = v->first_out_edge_rev(); e != v->stop_out_edge_rev();
         e = e->pred_out_edge())
        result.push_back(e);
    return result;
}

std::vector<leda::edge> inEdges(leda::node v) {
    std::vector<leda::edge> result;
    for (leda::edge e = v->first_in_edge(); e != v->stop_in_edge(); e = e->next_in_edge())
        result.push_back(e);
    return result;
}

// The promises about order, in the plainest form: vectors.
struct Model {
    std::vector<leda::node> nodes;
    std::vector<leda::edge> edges;
    std::map<leda::node, std::vector<leda::edge>> out, in;
    std::map<leda::edge, std::pair<leda::node, leda::node>> ends;

    template <class T>
    static void take(std::vector<T>& from, T x) {
        from.erase(std::find(from.begin(), from.end(), x));
    }
    void addEdge(leda::edge e, leda::node v, leda::node w) {
        edges.push_back(e);
        out[v].push_back(e);
        in[w].push_back(e);
        ends[e] = {v, w};
    }
    void delEdge(leda::edge e) {
        take(out[ends[e].first], e);
        take(in[ends[e].second], e);
        take(edges, e);
        ends.erase(e);
    }
    void delNode(leda::node v) {
        for (leda::edge e : std::vector<leda::edge>(out[v]))
            delEdge(e);
        for (leda::edge e : std::vector<leda::edge>(in[v]))
            delEdge(e);
        take(nodes, v);
    }
    void moveEdge(leda::edge e, leda::node v, leda::node w) {
        if (ends[e].first != v) {
            take(out[ends[e].first], e);
            out[v].push_back(e);
        }
        if (ends[e].second != w) {
            take(in[ends[e].second], e);
            in[w].push_back(e);
        }
        ends[e] = {v, w};
    }
};

void expectSame(const Graph& g, Model& m) {
    ASSERT_TRUE(g.check_consistency());
    ASSERT_EQ(contents(g.all_nodes()), m.nodes);
    ASSERT_EQ(contents(g.all_edges()), m.edges);
    for (leda::node v : m.nodes) {
        ASSERT_EQ(outEdges(v), m.out[v]);
        ASSERT_EQ(inEdges(v), m.in[v]);
        ASSERT_EQ(contents(g.in_edges(v)), m.in[v]);
        std::reverse(m.out[v].begin(), m.out[v].end());
        ASSERT_EQ(outEdgesBackward(v), m.out[v]);
        std::reverse(m.out[v].begin(), m.out[v].end());
        ASSERT_EQ(g.outdeg(v), int(m.out[v].size()));
        ASSERT_EQ(g.indeg(v), int(m.in[v].size()));
    }
}

TEST(Graph, KeepsAllOrdersUnderRandomEdits) {
    std::mt19937 rng(7);
    Graph g;
    Model m;
    std::vector<int> records(100001);
    std::map<leda::node, int*> nodeRecords;
    const auto anyNode = [&] { return m.nodes[rng() % m.nodes.size()]; };
    const auto anyEdge = [&] { return m.edges[rng() % m.edges.size()]; };
    for (int step = 0; step < 100000; ++step) {
        const unsigned kind = rng() % 16;
        if (m.nodes.size() < 3 || (kind == 0 && m.nodes.size() < 40)) {
            m.nodes.push_back(g.new_node(&records[step]));
            nodeRecords[m.nodes.back()] = &records[step];
        } else if (kind == 1) {
            leda::node v = anyNode();
            m.delNode(v);
            g.del_node(v);
            ASSERT_EQ(g.inf(v), nodeRecords[v]) << "a stale handle shows its record";
        } else if (kind < 8 && m.edges.size() < 90) {
            leda::node v = anyNode(), w = anyNode();
            m.addEdge(g.new_edge(v, w, &records[step]), v, w);
        } else if (!m.edges.empty() && kind < 12) {
            leda::edge e = anyEdge();
            m.delEdge(e);
            g.del_edge(e);
        } else if (!m.edges.empty()) {
            leda::edge e = anyEdge();
            leda::node v = rng() % 3 ? anyNode() : g.source(e),
                       w = rng() % 3 ? anyNode() : g.target(e);
            int* const record = g.inf(e);
            m.moveEdge(e, v, w);
            g.move_edge(e, v, w);
            ASSERT_EQ(g.inf(e), record);
            ASSERT_EQ(e->terminal(0), v);
            ASSERT_EQ(e->terminal(1), w);
        }
        if (step % 100 == 0) {
            ASSERT_NO_FATAL_FAILURE(expectSame(g, m));
        }
    }
    for (leda::node v : m.nodes)
        ASSERT_EQ(g[v], nodeRecords[v]);
}

TEST(Graph, WalksSurviveDeletingAndMovingTheCurrentElement) {
    Graph g;
    leda::node v[4];
    for (leda::node& x : v)
        x = g.new_node();
    for (int i = 0; i < 3; ++i)
        g.new_edge(v[0], v[1]);
    for (leda::edge e = v[0]->first_out_edge(), next; e != v[0]->stop_out_edge(); e = next) {
        next = e->next_out_edge();
        g.move_edge(e, v[2], v[1]);
    }
    EXPECT_EQ(g.outdeg(v[2]), 3);
    EXPECT_EQ(g.indeg(v[1]), 3);
    int visited = 0;
    for (leda::node x = g.first_node(), next; x != g.stop_node(); x = next, ++visited) {
        next = g.next_node(x);
        g.del_node(x);
    }
    EXPECT_EQ(visited, 4);
    EXPECT_EQ(g.number_of_edges(), 0);
    EXPECT_TRUE(g.check_consistency());
}

TEST(Graph, NodesOrderByCreationAndStaleHandlesKeepTheirPlace) {
    Graph g, other;
    leda::node first = g.new_node(), second = g.new_node();
    leda::node foreign = other.new_node();
    g.del_node(first);
    leda::node third = g.new_node();
    EXPECT_NE(third, first) << "storage of a deleted node is not used again";
    EXPECT_EQ(g.index(third), 2);
    EXPECT_LT(leda::compare(first, second), 0);
    EXPECT_GT(leda::compare(third, second), 0);
    EXPECT_NE(leda::compare(first, foreign), 0) << "same index in another graph";
    EXPECT_EQ(leda::compare(first, foreign), -leda::compare(foreign, first));
    EXPECT_LT(leda::compare(leda::node(nullptr), first), 0);
    g.clear();
    EXPECT_EQ(g.max_node_index(), -1);
    EXPECT_EQ(g.index(g.new_node()), 0);
}

TEST(Graph, CopyHasTheSameRecordsAndOrders) {
    Graph g;
    int records[8] = {};
    leda::node v[4];
    for (int i = 0; i < 4; ++i)
        v[i] = g.new_node(&records[i]);
    leda::edge e[4];
    for (int i = 0; i < 4; ++i)
        e[i] = g.new_edge(v[1], v[2], &records[4 + i]);
    g.move_edge(e[1], v[3], v[2]);
    g.move_edge(e[1], v[1], v[2]); // now last out, still second in
    g.del_node(v[0]);
    Graph copy(g), assigned;
    assigned.new_node();
    assigned = g;
    for (const Graph* c : {&copy, &assigned}) {
        ASSERT_TRUE(c->check_consistency());
        ASSERT_EQ(c->number_of_nodes(), 3);
        leda::node from = c->first_node(), to = c->next_node(from);
        EXPECT_NE(from, v[1]);
        EXPECT_EQ(c->inf(from), &records[1]);
        std::vector<int*> out, in;
        for (leda::edge x : outEdges(from))
            out.push_back(c->inf(x));
        for (leda::edge x : inEdges(to))
            in.push_back(c->inf(x));
        EXPECT_EQ(out, (std::vector<int*>{&records[4], &records[6], &records[7], &records[5]}));
        EXPECT_EQ(in, (std::vector<int*>{&records[4], &records[5], &records[6], &records[7]}));
    }
}

// Random graphs with self-loops, parallel edges and gaps in the numbering.
struct RandomGraph : leda::graph {
    explicit RandomGraph(unsigned seed) {
        std::mt19937 rng(seed);
        std::vector<leda::node> v(1 + rng() % 24);
        for (leda::node& x : v)
            x = new_node();
        for (unsigned i = rng() % (2 * v.size() + 1); i; --i)
            new_edge(v[rng() % v.size()], v[rng() % v.size()]);
        if (v.size() > 4)
            del_node(v[rng() % v.size()]);
    }
    // Reachability along the steps given, by brute force.
    std::map<leda::node, std::map<leda::node, bool>> closure(bool undirected) const {
        std::map<leda::node, std::map<leda::node, bool>> r;
        for (leda::node v : all_nodes())
            r[v][v] = true;
        for (leda::edge e : all_edges()) {
            r[source(e)][target(e)] = true;
            if (undirected)
                r[target(e)][source(e)] = true;
        }
        for (leda::node k : all_nodes())
            for (leda::node i : all_nodes())
                for (leda::node j : all_nodes())
                    if (r[i][k] && r[k][j])
                        r[i][j] = true;
        return r;
    }
};

TEST(GraphAlgorithms, ComponentsAreTheClassesOfMutualReachability) {
    for (unsigned seed = 0; seed < 300; ++seed) {
        RandomGraph g(seed);
        leda::node_array<int> weak(g), strong(g);
        const int weakCount = leda::COMPONENTS(g, weak),
                  strongCount = leda::STRONG_COMPONENTS(g, strong);
        auto connected = g.closure(true), reaches = g.closure(false);
        std::vector<bool> weakSeen(std::size_t(weakCount), false),
            strongSeen(std::size_t(strongCount), false);
        for (leda::node v : g.all_nodes()) {
            ASSERT_TRUE(weak[v] >= 0 && weak[v] < weakCount && strong[v] >= 0 &&
                        strong[v] < strongCount);
            weakSeen[std::size_t(weak[v])] = strongSeen[std::size_t(strong[v])] = true;
            for (leda::node w : g.all_nodes()) {
                ASSERT_EQ(weak[v] == weak[w], connected[v][w]) << "seed " << seed;
                ASSERT_EQ(strong[v] == strong[w], reaches[v][w] && reaches[w][v])
                    << "seed " << seed;
                ASSERT_TRUE(!reaches[v][w] || strong[v] >= strong[w]);
            }
        }
        ASSERT_EQ(std::count(weakSeen.begin(), weakSeen.end(), true), weakCount);
        ASSERT_EQ(std::count(strongSeen.begin(), strongSeen.end(), true), strongCount);
    }
}

TEST(GraphAlgorithms, SearchesGiveTheOrderOfTheRecursiveForm) {
    for (unsigned seed = 0; seed < 300; ++seed) {
        RandomGraph g(seed);
        std::mt19937 rng(seed);
        leda::node start = g.first_node();
        leda::node_array<bool> marks(g, false);
        for (leda::node v : g.all_nodes())
            marks[v] = v != start && rng() % 5 == 0;
        leda::node_array<bool> expectedMarks = marks;
        std::vector<leda::node> preorder;
        std::function<void(leda::node)> visit = [&](leda::node v) {
            if (expectedMarks[v])
                return;
            expectedMarks[v] = true;
            preorder.push_back(v);
            for (leda::edge e : outEdges(v))
                visit(g.target(e));
        };
        visit(start);
        ASSERT_EQ(contents(leda::DFS(g, start, marks)), preorder);
        for (leda::node v : g.all_nodes())
            ASSERT_EQ(marks[v], expectedMarks[v]);
        EXPECT_TRUE(leda::DFS(g, start, marks).empty()) << "a marked start is not entered";

        leda::node_array<int> distance(g, -1), levels(g, -1);
        std::vector<leda::node> queue{start};
        levels[start] = 0;
        for (std::size_t i = 0; i < queue.size(); ++i)
            for (leda::edge e : outEdges(queue[i]))
                if (levels[g.target(e)] < 0) {
                    levels[g.target(e)] = levels[queue[i]] + 1;
                    queue.push_back(g.target(e));
                }
        ASSERT_EQ(contents(leda::BFS(g, start, distance)), queue);
        for (leda::node v : g.all_nodes())
            ASSERT_EQ(distance[v], levels[v]);
    }
}

TEST(GraphAlgorithms, LongChainsNeedNoStack) {
    leda::graph g;
    leda::node last = g.new_node(), first = last;
    for (int i = 1; i < 1000000; ++i) {
        leda::node v = g.new_node();
        g.new_edge(last, v);
        last = v;
    }
    leda::node_array<bool> reached(g, false);
    leda::node_array<int> number(g);
    EXPECT_EQ(leda::DFS(g, first, reached).back(), last);
    EXPECT_EQ(leda::STRONG_COMPONENTS(g, number), 1000000);
    EXPECT_EQ(leda::COMPONENTS(g, number), 1);
}

} // namespace
