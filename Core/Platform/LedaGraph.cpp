#include "LEDA/graph.h"

#include "LEDA/allocator.h"
#include "LEDA/node_array.h"

#include <cstring>

namespace leda {

namespace {

// Never reset: handles of any two graphs of a process differ.
unsigned int next_graph_serial() {
    static unsigned int serial = 0;
    return ++serial;
}

} // namespace

graph::graph() : m_serial(next_graph_serial()) {
}

graph::graph(int, int) : graph() {
}

graph::graph(const graph& other) : graph() {
    copy_from(other);
}

graph& graph::operator=(const graph& other) {
    if (this != &other) {
        destroy();
        copy_from(other);
    }
    return *this;
}

graph::~graph() {
    destroy();
}

void graph::clear() {
    destroy();
}

const list<node>& graph::all_nodes() const {
    if (m_node_list_valid)
        return m_node_list;
    m_node_list.clear();
    for (node v = m_first_node; v; v = v->m_next)
        m_node_list.append(v);
    m_node_list_valid = true;
    return m_node_list;
}

const list<edge>& graph::all_edges() const {
    if (m_edge_list_valid)
        return m_edge_list;
    m_edge_list.clear();
    for (edge e = m_first_edge; e; e = e->m_next)
        m_edge_list.append(e);
    m_edge_list_valid = true;
    return m_edge_list;
}

list<edge> graph::in_edges(node v) const {
    list<edge> result;
    for (edge e = v->m_first_in; e; e = e->m_next_in)
        result.append(e);
    return result;
}

list<edge> graph::out_edges(node v) const {
    list<edge> result;
    for (edge e = v->m_first_out; e; e = e->m_next_out)
        result.append(e);
    return result;
}

node graph::new_node() {
    node v = ::new (std_memory_mgr.allocate(sizeof(node_struct))) node_struct;
    v->m_index = m_next_node_index++;
    v->m_graph = m_serial;
    v->m_prev = m_last_node;
    (m_last_node ? m_last_node->m_next : m_first_node) = v;
    m_last_node = v;
    ++m_nodes;
    m_node_list_valid = false;
    return v;
}

edge graph::new_edge(node v, node w) {
    edge e = ::new (std_memory_mgr.allocate(sizeof(edge_struct))) edge_struct;
    e->m_index = m_next_edge_index++;
    e->m_graph = m_serial;
    e->m_prev = m_last_edge;
    (m_last_edge ? m_last_edge->m_next : m_first_edge) = e;
    m_last_edge = e;
    ++m_edges;
    m_edge_list_valid = false;
    link_out(e, v);
    link_in(e, w);
    return e;
}

void graph::del_node(node v) {
    while (v->m_first_out)
        del_edge(v->m_first_out);
    while (v->m_first_in)
        del_edge(v->m_first_in);
    (v->m_prev ? v->m_prev->m_next : m_first_node) = v->m_next;
    (v->m_next ? v->m_next->m_prev : m_last_node) = v->m_prev;
    v->m_prev = nullptr;
    v->m_next = m_deleted_nodes;
    m_deleted_nodes = v;
    --m_nodes;
    m_node_list_valid = false;
}

void graph::del_edge(edge e) {
    unlink_out(e);
    unlink_in(e);
    (e->m_prev ? e->m_prev->m_next : m_first_edge) = e->m_next;
    (e->m_next ? e->m_next->m_prev : m_last_edge) = e->m_prev;
    --m_edges;
    m_edge_list_valid = false;
    std_memory_mgr.deallocate(e, sizeof(edge_struct));
}

void graph::move_edge(edge e, node v, node w) {
    if (e->m_end[0] != v) {
        unlink_out(e);
        link_out(e, v);
    }
    if (e->m_end[1] != w) {
        unlink_in(e);
        link_in(e, w);
    }
}

bool graph::check_consistency() const {
    int nodes = 0, outs = 0, ins = 0, edges = 0;
    node node_before = nullptr;
    for (node v = m_first_node; v; v = v->m_next, ++nodes) {
        if (v->m_prev != node_before || v->m_graph != m_serial || v->m_index >= m_next_node_index ||
            (node_before && node_before->m_index >= v->m_index) || !check_adjacency(v))
            return false;
        node_before = v;
        outs += v->m_outdeg;
        ins += v->m_indeg;
    }
    edge edge_before = nullptr;
    for (edge e = m_first_edge; e; e = e->m_next, ++edges) {
        if (e->m_prev != edge_before || e->m_graph != m_serial || e->m_index >= m_next_edge_index ||
            (edge_before && edge_before->m_index >= e->m_index))
            return false;
        edge_before = e;
    }
    return node_before == m_last_node && edge_before == m_last_edge && nodes == m_nodes &&
           edges == m_edges && outs == edges && ins == edges;
}

bool graph::check_adjacency(node v) const {
    int count = 0;
    const edge last_out = v->first_out_edge_rev();
    edge before = last_out;
    for (edge e = v->m_first_out; e; e = e->m_next_out, ++count) {
        if (e->m_end[0] != v || e->m_prev_out != before || count > m_edges)
            return false;
        before = e;
    }
    if (before != last_out || count != v->m_outdeg)
        return false;
    count = 0;
    before = nullptr;
    for (edge e = v->m_first_in; e; e = e->m_next_in, ++count) {
        if (e->m_end[1] != v || e->m_prev_in != before || count > m_edges)
            return false;
        before = e;
    }
    return before == v->m_last_in && count == v->m_indeg;
}

// The last out-edge is found by way of the first.
void graph::link_out(edge e, node v) {
    e->m_end[0] = v;
    e->m_next_out = nullptr;
    if (edge first = v->m_first_out) {
        e->m_prev_out = first->m_prev_out;
        first->m_prev_out->m_next_out = e;
        first->m_prev_out = e;
    } else {
        v->m_first_out = e->m_prev_out = e;
    }
    ++v->m_outdeg;
}

void graph::link_in(edge e, node w) {
    e->m_end[1] = w;
    e->m_next_in = nullptr;
    e->m_prev_in = w->m_last_in;
    (w->m_last_in ? w->m_last_in->m_next_in : w->m_first_in) = e;
    w->m_last_in = e;
    ++w->m_indeg;
}

void graph::unlink_out(edge e) {
    node v = e->m_end[0];
    (e != v->m_first_out ? e->m_prev_out->m_next_out : v->m_first_out) = e->m_next_out;
    if (edge behind = e->m_next_out ? e->m_next_out : v->m_first_out)
        behind->m_prev_out = e->m_prev_out; // the first one notes a new last one
    --v->m_outdeg;
}

void graph::unlink_in(edge e) {
    node w = e->m_end[1];
    (e->m_prev_in ? e->m_prev_in->m_next_in : w->m_first_in) = e->m_next_in;
    (e->m_next_in ? e->m_next_in->m_prev_in : w->m_last_in) = e->m_prev_in;
    --w->m_indeg;
}

// Edges are made in the order of the edge list; the adjacency lists, which moves may have put in
// another order, are then linked anew as they stand in the original.
void graph::copy_from(const graph& other) {
    node_array<node> node_copy(other);
    edge_array<edge> edge_copy(other);
    for (node v = other.m_first_node; v; v = v->m_next) {
        node_copy[v] = new_node();
        std::memcpy(node_copy[v]->m_record, v->m_record, sizeof(v->m_record));
    }
    for (edge e = other.m_first_edge; e; e = e->m_next) {
        edge copy = new_edge(node_copy[e->m_end[0]], node_copy[e->m_end[1]]);
        std::memcpy(copy->m_record, e->m_record, sizeof(e->m_record));
        edge_copy[e] = copy;
    }
    for (node v = other.m_first_node; v; v = v->m_next) {
        for (edge e = v->m_first_out; e; e = e->m_next_out) {
            unlink_out(edge_copy[e]);
            link_out(edge_copy[e], node_copy[v]);
        }
        for (edge e = v->m_first_in; e; e = e->m_next_in) {
            unlink_in(edge_copy[e]);
            link_in(edge_copy[e], node_copy[v]);
        }
    }
}

void graph::destroy() {
    m_node_list.clear();
    m_edge_list.clear();
    m_node_list_valid = m_edge_list_valid = false;
    for (edge e = m_first_edge; e;) {
        edge next = e->m_next;
        std_memory_mgr.deallocate(e, sizeof(edge_struct));
        e = next;
    }
    for (node first : {m_first_node, m_deleted_nodes})
        for (node v = first; v;) {
            node next = v->m_next;
            std_memory_mgr.deallocate(v, sizeof(node_struct));
            v = next;
        }
    m_first_node = m_last_node = m_deleted_nodes = nullptr;
    m_first_edge = m_last_edge = nullptr;
    m_nodes = m_edges = m_next_node_index = m_next_edge_index = 0;
}

} // namespace leda
