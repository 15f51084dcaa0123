#ifndef SECOND_GRAPH_ALG_H
#define SECOND_GRAPH_ALG_H

#include "LEDA/leda.h"

namespace leda {

// Nodes that can be reached along out-edges, in preorder; marks stop the search and are set by it.
inline list<node> DFS(const graph&, node start, node_array<bool>& reached) {
    list<node> order;
    std::vector<node> waiting;
    if (!reached[start])
        waiting.push_back(start);
    while (!waiting.empty()) {
        const node v = waiting.back();
        waiting.pop_back();
        if (reached[v])
            continue;
        reached[v] = true;
        order.append(v);
        // The first out-edge is followed first, so it is put on top.
        for (auto e = v->out.rbegin(); e != v->out.rend(); ++e)
            waiting.push_back((*e)->ends[1]);
    }
    return order;
}

// Nodes by their distance from the start; those at -1 have not been seen.
inline list<node> BFS(const graph&, node start, node_array<int>& distance) {
    list<node> order;
    distance[start] = 0;
    order.append(start);
    for (auto at = order.first(); at; at = at->next)
        for (edge e : at->value->out)
            if (distance[e->ends[1]] < 0) {
                distance[e->ends[1]] = distance[at->value] + 1;
                order.append(e->ends[1]);
            }
    return order;
}

// Numbers from 0; nodes have the same one if they are connected, whatever the direction.
inline int COMPONENTS(const graph& g, node_array<int>& component) {
    int count = 0;
    for (node v : g.all_nodes())
        component[v] = -1;
    for (node start : g.all_nodes()) {
        if (component[start] >= 0)
            continue;
        std::vector<node> waiting{start};
        while (!waiting.empty()) {
            const node v = waiting.back();
            waiting.pop_back();
            if (component[v] >= 0)
                continue;
            component[v] = count;
            for (edge e : v->out)
                waiting.push_back(e->ends[1]);
            for (edge e : v->in)
                waiting.push_back(e->ends[0]);
        }
        ++count;
    }
    return count;
}

// The same for nodes that reach each other: one search for each node. A component gets its number
// after those that can be reached from it.
inline int STRONG_COMPONENTS(const graph& g, node_array<int>& component) {
    std::map<node, std::set<node>> reach;
    for (node v : g.all_nodes()) {
        node_array<bool> reached(g, false);
        for (node w : DFS(g, v, reached))
            reach[v].insert(w);
        component[v] = -1;
    }
    int count = 0;
    for (int left = g.number_of_nodes(); left > 0;) {
        for (node v : g.all_nodes()) {
            if (component[v] >= 0)
                continue;
            bool is_next = true;
            for (node w : reach[v])
                is_next = is_next && (component[w] >= 0 || reach[w].count(v) != 0);
            if (!is_next)
                continue;
            for (node w : reach[v])
                if (component[w] < 0) {
                    component[w] = count;
                    --left;
                }
            ++count;
        }
    }
    return count;
}

} // namespace leda

#endif
