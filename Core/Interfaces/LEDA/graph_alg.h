#ifndef LEDA_GRAPH_ALG_H
#define LEDA_GRAPH_ALG_H

#include "HpnPlatformExport.h"
#include "LEDA/graph.h"
#include "LEDA/list.h"
#include "LEDA/node_array.h"

namespace leda {

// All algorithms are linear in nodes and edges (for COMPONENTS that is what is measured; its proved
// bound has a logarithm more), keep their state in arrays by node index and do not recurse. Node
// arrays are bound to the graph by the caller.

// Connected components with the direction of edges ignored: gives their number, and each node a
// number from 0 to that less one, in the order of the components' first nodes in the node list.
HPNPLATFORM_EXPORT int COMPONENTS(const graph& g, node_array<int>& component);

// Strongly connected components, numbered from 0 so that an edge between two of them leads to the
// smaller number.
HPNPLATFORM_EXPORT int STRONG_COMPONENTS(const graph& g, node_array<int>& component);

// Nodes reached from the start along out-edges in breadth-first order, the start first. Only nodes
// with a negative distance are entered; those reached get the number of edges on a shortest path.
HPNPLATFORM_EXPORT list<node> BFS(const graph& g, node start, node_array<int>& distance);

// Nodes reached from the start along out-edges, in preorder with each node's edges in adjacency
// order. Marked nodes, a marked start too, are not entered; those reached are marked.
HPNPLATFORM_EXPORT list<node> DFS(const graph& g, node start, node_array<bool>& reached);

} // namespace leda

#endif
