// BFS, DFS: plain graph search over handles and node arrays, O(n + m).
//
// COMPONENTS: disjoint sets by M. Rem's algorithm (E. Dijkstra, "A Discipline of Programming",
// 1976, chapter 23; measured by M. Patwary, J. Blair, F. Manne, "Experiments on union-find
// algorithms for the disjoint-set data structure", SEA 2010), as it reads the edges in the order of
// memory:
//   1. For each edge climb from both ends in turn, always at the one whose parent is larger, and
//   let it point to the smaller
//      parent, until the parents are equal or a root was linked. Parents never have the larger
//      index.
//   2. In the order of the node list, which is that of indices, a root gets the next number and any
//   other its parent's.
// O(m log n) at worst and O(n + m) in practice: an edge rarely climbs further than its two parents.
//
// STRONG_COMPONENTS: R. Tarjan, "Depth-first search and linear graph algorithms", SIAM J. Computing
// 1 (1972), in the form of D. Pearce, "A space-efficient algorithm for finding strongly connected
// components", Inf. Proc. Letters 116 (2016), O(n + m):
//   1. A depth-first search numbers the nodes in the order in which it enters them; rank[v] begins
//   as that number.
//   2. On return over an edge v -> w, rank[v] becomes the smaller of rank[v] and rank[w], unless
//   w's component is complete.
//   3. If rank[v] is still its own number when v is left, v is the root of a component: v and the
//   nodes on the component
//      stack entered after v belong to it. Otherwise v goes onto the component stack.
// Departure: the search keeps its path in an array instead of recursing, and a complete component's
// rank is an integer larger than every entry number, so that step 2 needs no test of its own.

#include "LEDA/graph_alg.h"

#include "LEDA/allocator.h"

#include <utility>
#include <vector>

namespace leda {

namespace {

template <class T>
using work_array = std::vector<T, pool_allocator<T>>;

// Asks for the memory of an edge that a search will read soon.
inline void prefetch(edge e) {
#if defined(__GNUC__)
    __builtin_prefetch(e);
#else
    static_cast<void>(e);
#endif
}

std::size_t index_count(const graph& g) {
    return std::size_t(g.max_node_index() + 1);
}

} // namespace

int COMPONENTS(const graph& g, node_array<int>& component) {
    work_array<int> parent(index_count(g)); // towards the smallest index of the set; the root's own
    for (int i = 0; i < int(parent.size()); ++i)
        parent[std::size_t(i)] = i;
    const auto at = [&](int i) -> int& { return parent[std::size_t(i)]; };
    for (edge e = g.first_edge(); e; e = g.next_edge(e)) {
        int i = e->terminal(0)->index();
        int j = e->terminal(1)->index();
        while (at(i) != at(j)) { // step 1
            if (at(i) < at(j))
                std::swap(i, j);
            const int up = at(i);
            at(i) = at(j);
            if (up == i)
                break;
            i = up;
        }
    }
    int count = 0;
    for (node v = g.first_node(); v; v = g.next_node(v)) { // step 2
        const int i = v->index();
        at(i) = at(i) == i ? count++ : at(at(i));
        component[v] = at(i);
    }
    return count;
}

namespace {

class strong_components {
public:
    strong_components(const graph& g, node_array<int>& component)
        : m_rank(index_count(g)), m_component(component) {}

    int run(const graph& g) {
        for (node v = g.first_node(); v; v = g.next_node(v))
            if (rank(v) == 0)
                search(v);
        return m_count;
    }

private:
    static constexpr int complete = 0x7fffffff;
    struct frame {
        node v;
        edge next;      // out-edge of v to look at next
        int own_number; // entry number of v
    };

    int& rank(node v) { return m_rank[std::size_t(v->index())]; }

    void search(node start) {
        enter(start);
        while (!m_path.empty()) {
            frame& top = m_path.back();
            if (!top.next) {
                leave();
                continue;
            }
            node w = top.next->terminal(1);
            top.next = top.next->next_out_edge();
            const int rank_w = rank(w);
            if (rank_w == 0)
                enter(w);
            else if (rank_w < rank(top.v)) // step 2 for an edge that enters nothing
                rank(top.v) = rank_w;
        }
    }

    // Step 1.
    void enter(node v) {
        rank(v) = ++m_entered;
        m_path.push_back({v, v->first_out_edge(), m_entered});
    }

    // Steps 3 and, for the edge by which v was entered, 2.
    void leave() {
        const frame done = m_path.back();
        m_path.pop_back();
        if (rank(done.v) < done.own_number) {
            m_members.push_back(done.v);
        } else {
            while (!m_members.empty() && rank(m_members.back()) >= done.own_number) {
                close(m_members.back());
                m_members.pop_back();
            }
            close(done.v);
            ++m_count;
        }
        if (!m_path.empty() && rank(done.v) < rank(m_path.back().v))
            rank(m_path.back().v) = rank(done.v);
    }

    void close(node v) {
        rank(v) = complete;
        m_component[v] = m_count;
    }

    work_array<int> m_rank; // by node index; 0: not entered; complete: its component is numbered
    work_array<frame> m_path;
    work_array<node> m_members; // nodes left whose component's root is still on the path
    node_array<int>& m_component;
    int m_entered = 0;
    int m_count = 0; // complete components
};

} // namespace

int STRONG_COMPONENTS(const graph& g, node_array<int>& component) {
    return strong_components(g, component).run(g);
}

// The list of reached nodes is the queue: the walk over it goes on while it grows.
list<node> BFS(const graph&, node start, node_array<int>& distance) {
    list<node> reached;
    distance[start] = 0;
    reached.append(start);
    for (list_item it = reached.first(); it; it = it->succ) {
        node v = reached[it];
        const int next_distance = distance[v] + 1;
        for (edge e = v->first_out_edge(); e; e = e->next_out_edge()) {
            node w = e->terminal(1);
            if (distance[w] >= 0)
                continue;
            distance[w] = next_distance;
            reached.append(w);
            prefetch(w->first_out_edge());
        }
    }
    return reached;
}

// The stack holds, for each node on the path, the out-edge at which its walk goes on.
list<node> DFS(const graph&, node start, node_array<bool>& reached) {
    list<node> order;
    work_array<edge> path;
    const auto enter = [&](node v) {
        if (reached[v])
            return;
        reached[v] = true;
        order.append(v);
        if (edge first = v->first_out_edge())
            path.push_back(first);
    };
    enter(start);
    while (!path.empty()) {
        edge e = path.back();
        if (edge next = e->next_out_edge())
            path.back() = next;
        else
            path.pop_back();
        enter(e->terminal(1));
    }
    return order;
}

} // namespace leda
