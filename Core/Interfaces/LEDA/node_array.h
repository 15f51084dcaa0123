#ifndef LEDA_NODE_ARRAY_H
#define LEDA_NODE_ARRAY_H

#include "LEDA/array.h"
#include "LEDA/graph.h"

namespace leda {

// Values for the nodes of a graph, found by the node's index: a plain array, copyable, of storage
// linear in the largest index. It covers the nodes that exist when it is bound to the graph; later
// ones must not be used with it, which is not checked.
template <class T>
class node_array {
public:
    node_array() = default;
    // Bound to a graph, with T() or the given value for each node.
    explicit node_array(const graph& g) { init(g); }
    node_array(const graph& g, const T& x) { init(g, x); }
    // Binds it to a graph, whatever it was bound to, and renews all values. Linear.
    void init(const graph& g) {
        m_values.resize(0);
        m_values.resize(g.max_node_index() + 1);
    }
    void init(const graph& g, const T& x);
    // The value of a node of that graph.
    T& operator[](node v) { return m_values[v->index()]; }
    const T& operator[](node v) const { return m_values[v->index()]; }

private:
    array<T> m_values;
};

// The same for edges.
template <class T>
class edge_array {
public:
    // Bound to no graph; bound to one, with T() or the given value for each edge.
    edge_array() = default;
    explicit edge_array(const graph& g) { init(g); }
    edge_array(const graph& g, const T& x) { init(g, x); }
    // Binds it to a graph, whatever it was bound to, and renews all values. Linear.
    void init(const graph& g) {
        m_values.resize(0);
        m_values.resize(g.max_edge_index() + 1);
    }
    void init(const graph& g, const T& x);
    // The value of an edge of that graph.
    T& operator[](edge e) { return m_values[e->index()]; }
    const T& operator[](edge e) const { return m_values[e->index()]; }

private:
    array<T> m_values;
};

template <class T>
void node_array<T>::init(const graph& g, const T& x) {
    init(g);
    for (int i = 0; i < m_values.size(); ++i)
        m_values[i] = x;
}

template <class T>
void edge_array<T>::init(const graph& g, const T& x) {
    init(g);
    for (int i = 0; i < m_values.size(); ++i)
        m_values[i] = x;
}

} // namespace leda

#endif
