#ifndef LEDA_GRAPH_H
#define LEDA_GRAPH_H

#include "HpnPlatformExport.h"
#include "LEDA/graph_types.h"
#include "LEDA/list.h"

#include <new>
#include <type_traits>

namespace leda {

// Directed graph with parallel edges and self-loops.
//
// Nodes and edges are blocks of the layer's pools, linked into the node list, the edge list and the
// two adjacency lists of each node. All lists keep the order of creation; taking an element out
// leaves the order of the others alone. A handle stays the same, and valid, through every edit of
// other nodes and edges. Indices rise from 0 and are not used again until clear; the storage of a
// deleted node is kept until clear as well, so that a stale handle still shows its index and
// record.
//
// Every edit is O(1), but for del_node (the node's edges) and clear, copying and all_nodes
// (linear). Walks that fetch the next element before the body may delete the current one, or move
// it.
class HPNPLATFORM_EXPORT graph {
public:
    graph();
    // The numbers once told how many data slots to reserve; no slots are needed here.
    graph(int, int);
    // Copies get nodes and edges of their own with the same records, in the same orders, numbered
    // anew from 0.
    graph(const graph& other);
    graph& operator=(const graph& other);
    virtual ~graph();
    // Removes all nodes and edges and begins numbering anew; handles, stale ones too, must not be
    // used after it.
    virtual void clear();

    // Walks in list order; null at the end, and next of null is null.
    node first_node() const { return m_first_node; }
    node next_node(node v) const { return v ? v->m_next : nullptr; }
    node stop_node() const { return nullptr; }
    edge first_edge() const { return m_first_edge; }
    edge next_edge(edge e) const { return e ? e->m_next : nullptr; }
    edge stop_edge() const { return nullptr; }
    // All nodes or edges of this moment: a list shared by all calls, rebuilt when the graph was
    // changed since. Copy it before an edit.
    const list<node>& all_nodes() const;
    const list<edge>& all_edges() const;

    // Adjacency in order; null at the end.
    edge first_adj_edge(node v) const { return v->m_first_out; }
    edge adj_succ(edge e) const { return e->m_next_out; }
    edge first_in_edge(node v) const { return v->m_first_in; }
    edge in_succ(edge e) const { return e->m_next_in; }
    // Copies of the adjacency.
    list<edge> in_edges(node v) const;
    list<edge> out_edges(node v) const;
    int indeg(node v) const { return v->m_indeg; }
    int outdeg(node v) const { return v->m_outdeg; }
    node source(edge e) const { return e->m_end[0]; }
    node target(edge e) const { return e->m_end[1]; }

    // Indices rise with creation; max is -1 before the first. max_node_index() + 1 bounds every
    // index.
    int index(node v) const { return v->m_index; }
    int index(edge e) const { return e->m_index; }
    int max_node_index() const { return m_next_node_index - 1; }
    int max_edge_index() const { return m_next_edge_index - 1; }
    int number_of_nodes() const { return m_nodes; }
    int number_of_edges() const { return m_edges; }

    // A node at the end of the node list; an edge at the end of the edge list, of v's out-edges and
    // of w's in-edges.
    node new_node();
    edge new_edge(node v, node w);
    // Takes the node and all its edges out. Records are left alone.
    void del_node(node v);
    void del_edge(edge e);
    // Gives the edge new ends; it keeps its handle, index and record. An end that is passed
    // unchanged keeps its place in that node's list, a new one goes to the end of the new list.
    void move_edge(edge e, node v, node w);

    // True if all links of both directions, the ends, the degrees and the counts agree. Linear.
    bool check_consistency() const;

private:
    void link_out(edge e, node v);
    void link_in(edge e, node w);
    void unlink_out(edge e);
    void unlink_in(edge e);
    void copy_from(const graph& other);
    void destroy();
    bool check_adjacency(node v) const;

    node m_first_node = nullptr;
    node m_last_node = nullptr;
    edge m_first_edge = nullptr;
    edge m_last_edge = nullptr;
    node m_deleted_nodes = nullptr; // kept until clear, linked by m_next
    int m_nodes = 0;
    int m_edges = 0;
    int m_next_node_index = 0;
    int m_next_edge_index = 0;
    unsigned int m_serial;                  // tells handles of different graphs apart
    mutable bool m_node_list_valid = false; // m_node_list holds what all_nodes answers
    mutable bool m_edge_list_valid = false; // the same for all_edges
    mutable list<node> m_node_list;
    mutable list<edge> m_edge_list;
};

// Graph whose nodes carry an N and whose edges an E: pointers, as a rule, that the graph does not
// own. A deleted node keeps showing the record that it had.
template <class N, class E>
class GRAPH : public graph {
    static_assert(std::is_trivially_copyable_v<N> && sizeof(N) <= 8 &&
                      std::is_trivially_copyable_v<E> && sizeof(E) <= 8,
                  "records are pointers or values of that size");

public:
    // Empty. The numbers of the second form reserve nothing.
    GRAPH() = default;
    GRAPH(int n, int m) : graph(n, m) {}

    // The record of a node or an edge, to be read or written. The handle must be one of this graph.
    const N& inf(node v) const { return *record<N>(v->m_record); }
    const E& inf(edge e) const { return *record<E>(e->m_record); }
    N& operator[](node v) { return *record<N>(v->m_record); }
    E& operator[](edge e) { return *record<E>(e->m_record); }
    const N& operator[](node v) const { return *record<N>(v->m_record); }
    const E& operator[](edge e) const { return *record<E>(e->m_record); }
    void assign(node v, const N& x) { *record<N>(v->m_record) = x; }
    void assign(edge e, const E& x) { *record<E>(e->m_record) = x; }

    // As graph's, with the given record or a default one.
    node new_node() { return new_node(N()); }
    node new_node(const N& x);
    edge new_edge(node v, node w) { return new_edge(v, w, E()); }
    edge new_edge(node v, node w, const E& x);

private:
    template <class T>
    static T* record(unsigned char* bytes) {
        return std::launder(reinterpret_cast<T*>(bytes));
    }
};

template <class N, class E>
node GRAPH<N, E>::new_node(const N& x) {
    node v = graph::new_node();
    ::new (static_cast<void*>(v->m_record)) N(x);
    return v;
}

template <class N, class E>
edge GRAPH<N, E>::new_edge(node v, node w, const E& x) {
    edge e = graph::new_edge(v, w);
    ::new (static_cast<void*>(e->m_record)) E(x);
    return e;
}

} // namespace leda

#endif
