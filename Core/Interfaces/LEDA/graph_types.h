#ifndef LEDA_GRAPH_TYPES_H
#define LEDA_GRAPH_TYPES_H

#include "LEDA/compare.h"

#include <cstdint>

namespace leda {

class graph;
struct node_struct;
struct edge_struct;
// Handles of nodes and edges; null is none. They belong to their graph.
using node = node_struct*;
using edge = edge_struct*;

// One node: its place in the graph's node list, its adjacency and the 8 bytes of its record. A walk
// over the out-edges reads
//   for (edge e = v->first_out_edge(); e != v->stop_out_edge(); e = next) { next =
//   e->next_out_edge(); ... }
// and the other ones alike; all stop values are null. Only a graph makes, links and destroys nodes.
struct node_struct {
public:
    // First and last out-edge, first in-edge; null if there is none.
    edge first_out_edge() const { return m_first_out; }
    edge stop_out_edge() const { return nullptr; }
    edge first_out_edge_rev() const;
    edge stop_out_edge_rev() const { return nullptr; }
    edge first_in_edge() const { return m_first_in; }
    edge stop_in_edge() const { return nullptr; }
    // Number of the node in its graph; keeps its value when the node is deleted.
    int index() const { return m_index; }

private:
    friend class graph;
    template <class N, class E>
    friend class GRAPH;
    friend struct order_number<node>;
    node_struct() = default;

    // 64 bytes: with the alignment of the pools a node takes one cache line. So the last out-edge
    // has no place here: it stands in the first one.
    edge m_first_out = nullptr;
    int m_index = 0;
    unsigned int m_graph = 0; // serial number of the graph
    edge m_first_in = nullptr;
    alignas(8) unsigned char m_record[8]{}; // GRAPH's node information
    // In the node list; of a deleted node, in the graph's list of deleted ones.
    node m_next = nullptr;
    node m_prev = nullptr;
    edge m_last_in = nullptr;
    int m_outdeg = 0;
    int m_indeg = 0;
};

// One edge: its place in the edge list and in two adjacency lists, its ends and the 8 bytes of its
// record.
struct edge_struct {
public:
    // The neighbours among the source's out-edges, and the next of the target's in-edges; null at
    // the ends.
    edge next_out_edge() const { return m_next_out; }
    edge pred_out_edge() const { return m_prev_out->m_next_out ? m_prev_out : nullptr; }
    edge next_in_edge() const { return m_next_in; }
    // terminal(0) is the source, terminal(1) the target.
    node terminal(int i) const { return m_end[i]; }
    // Number of the edge in its graph.
    int index() const { return m_index; }

private:
    friend class graph;
    template <class N, class E>
    friend class GRAPH;
    friend struct node_struct;
    friend struct order_number<edge>;
    edge_struct() = default;

    // What a search reads comes first, so that it mostly lies in one cache line.
    edge m_next_out = nullptr;
    node m_end[2] = {};
    edge m_next_in = nullptr;
    int m_index = 0;
    unsigned int m_graph = 0;               // serial number of the graph
    alignas(8) unsigned char m_record[8]{}; // GRAPH's edge information
    edge m_next = nullptr;                  // in the edge list
    edge m_prev = nullptr;
    edge m_prev_out = nullptr; // of the first out-edge: the last one
    edge m_prev_in = nullptr;
};

inline edge node_struct::first_out_edge_rev() const {
    return m_first_out ? m_first_out->m_prev_out : nullptr;
}

namespace order_detail {

inline std::int64_t number_of(int index, unsigned int graph) {
    return static_cast<std::int64_t>(index) << 32 | graph;
}

} // namespace order_detail

// Order of node and edge handles: by index, that is by creation; handles of different graphs with
// the same index by the creation of their graphs; null before any other. Never by address, so that
// sets of nodes look the same in every run.
template <>
struct order_number<node> {
    // As order_number says: index and graph in one number.
    static constexpr bool known = true;
    static std::int64_t of(const node& v) {
        return v ? order_detail::number_of(v->m_index, v->m_graph) : -1;
    }
};

// The same for edges.
template <>
struct order_number<edge> {
    // As for nodes.
    static constexpr bool known = true;
    static std::int64_t of(const edge& e) {
        return e ? order_detail::number_of(e->m_index, e->m_graph) : -1;
    }
};

// The same order as a comparison.
inline int compare(const node& a, const node& b) {
    const std::int64_t left = order_number<node>::of(a), right = order_number<node>::of(b);
    return (left > right) - (left < right);
}

// The same for edges.
inline int compare(const edge& a, const edge& b) {
    const std::int64_t left = order_number<edge>::of(a), right = order_number<edge>::of(b);
    return (left > right) - (left < right);
}

} // namespace leda

#endif
