#ifndef GRAPHSHAPE_H
#define GRAPHSHAPE_H

#include "Graph/ProgramGraph.h"

#include <algorithm>
#include <set>
#include <string>
#include <vector>

namespace hpn::test {

/// Nodes that a walk along or against the edges reaches.
inline std::set<int> reachedFrom(ZfCControlFlowGraph& Graph, std::vector<leda::node> Stack,
                                 bool Forward) {
    std::set<int> Reached;
    while (!Stack.empty()) {
        const leda::node v = Stack.back();
        Stack.pop_back();
        if (!Reached.insert(Graph.index(v)).second)
            continue;
        for (leda::edge e : Forward ? Graph.out_edges(v) : Graph.in_edges(v))
            Stack.push_back(Forward ? Graph.target(e) : Graph.source(e));
    }
    return Reached;
}

/// Empty, or what is wrong with the ways out of a node.
inline std::string waysOutFaults(ZfCControlFlowGraph& Graph, leda::node v, ZfCBasicBlock* pBlock) {
    int True = 0;
    int False = 0;
    std::set<int> Targets;
    for (leda::edge e : Graph.out_edges(v)) {
        True += Graph[e]->isTrueBranch() != nullptr ? 1 : 0;
        False += Graph[e]->isFalseBranch() != nullptr ? 1 : 0;
        Targets.insert(Graph.index(Graph.target(e)));
    }
    const int Wanted = pBlock->getBranchCond() != nullptr ? 1 : 0;
    std::string Faults;
    if (Targets.size() != static_cast<std::size_t>(Graph.outdeg(v)))
        Faults += "two ways lead to the same node\n";
    if (True != Wanted || False != Wanted || Graph.outdeg(v) > 1 + Wanted)
        Faults += "branch edges and condition do not agree\n";
    return Faults;
}

/// Empty, or what is wrong with a node alone.
inline std::string nodeFaults(ZfCControlFlowGraph& Graph, leda::node v) {
    ZfCCfgProcedure* pProcedure = Graph[v]->getProcedure();
    ZfCBasicBlock* pBlock = Graph[v]->isBasicBlock();
    if (pProcedure == nullptr)
        return "a node has no procedure\n";
    std::string Faults;
    for (leda::edge e : Graph.out_edges(v))
        if (Graph[Graph.target(e)]->getProcedure() != pProcedure)
            Faults += "an edge leads to another procedure\n";
    if ((Graph.indeg(v) == 0) != (pBlock == nullptr))
        Faults += "an entry has in-edges, or a block has none\n";
    if (pBlock == nullptr)
        return Graph.outdeg(v) == 1 && pProcedure->getEntryNode() == v
                   ? Faults
                   : Faults + "a procedure's entry has not one way out, or is not its entry\n";
    for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
        if (pStatement->isProcedureCall() != nullptr &&
            (pBlock->isStatement() != pStatement || Graph.outdeg(v) > 1))
            Faults += "a call does not stand alone in its block, or the block branches\n";
    return Faults + waysOutFaults(Graph, v, pBlock);
}

/// What holds of the control flow between any two passes, whatever they have removed; empty, or
/// what is wrong. Edges stay in one procedure; a branch has one way for each outcome at the most,
/// and at least one; other nodes have one way on, the last ones none; every node but an exit that
/// has lost its last way in is reached from an entry. Edges of the SSA graph do not count.
inline std::string flowFaults(ZfCControlFlowGraph& Graph) {
    std::string Faults;
    std::vector<leda::node> WorkList;
    std::vector<bool> Reached(static_cast<std::size_t>(Graph.max_node_index()) + 1, false);
    const auto mark = [&](leda::node v) {
        if (!Reached[static_cast<std::size_t>(Graph.index(v))])
            WorkList.push_back(v);
        Reached[static_cast<std::size_t>(Graph.index(v))] = true;
    };
    for (leda::node v = Graph.first_node(); v != nullptr; v = Graph.next_node(v))
        if (Graph.inf(v)->isEntryNode() != nullptr)
            mark(v);
    while (!WorkList.empty()) {
        const leda::node v = WorkList.back();
        WorkList.pop_back();
        int Ways[3] = {0, 0, 0}; // plain, true, false
        for (leda::edge e = Graph.first_adj_edge(v); e != nullptr; e = Graph.adj_succ(e)) {
            if (Graph.inf(e)->isSSAEdge() != nullptr)
                continue;
            mark(Graph.target(e));
            ++Ways[Graph.inf(e)->isTrueBranch() != nullptr    ? 1
                   : Graph.inf(e)->isFalseBranch() != nullptr ? 2
                                                              : 0];
            if (Graph.inf(Graph.target(e))->getProcedure() != Graph.inf(v)->getProcedure())
                Faults += "an edge leads to another procedure\n";
        }
        ZfCBasicBlock* pBlock = Graph.inf(v)->isBasicBlock();
        const bool Branches = pBlock != nullptr && pBlock->getBranchCond() != nullptr;
        if (Branches ? Ways[0] != 0 || std::max(Ways[1], Ways[2]) != 1
                     : Ways[0] + Ways[1] + Ways[2] > 1)
            Faults += "the ways out of a node do not fit its condition\n";
    }
    for (leda::node v = Graph.first_node(); v != nullptr; v = Graph.next_node(v))
        if (!Reached[static_cast<std::size_t>(Graph.index(v))] &&
            (Graph.inf(v)->isExitNode() == nullptr || Graph.indeg(v) != 0))
            Faults += "a node is reached from no entry\n";
    return Faults;
}

/// All that later passes rely on; empty, or what is wrong. The ways of a branch never lead to the
/// same node. Every block has a way out of its procedure, even where a loop has none.
inline std::string shapeFaults(ProgramGraph& Program) {
    ZfCControlFlowGraph& Graph = Program.getGraph();
    std::string Faults = Graph.checkConsistency() ? "" : "checkConsistency\n";
    std::vector<leda::node> Ends;
    std::vector<leda::node> Entries;
    for (leda::node v : Graph.all_nodes()) {
        Faults += nodeFaults(Graph, v);
        if (Graph.outdeg(v) == 0)
            Ends.push_back(v);
        if (Graph[v]->isBasicBlock() == nullptr)
            Entries.push_back(v);
    }
    const auto Count = static_cast<std::size_t>(Graph.number_of_nodes());
    if (reachedFrom(Graph, Entries, true).size() != Count)
        Faults += "a node cannot be reached\n";
    if (reachedFrom(Graph, Ends, false).size() != Count)
        Faults += "a node has no way out of its procedure\n";
    return Faults;
}

} // namespace hpn::test

#endif
