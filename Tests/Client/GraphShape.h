#ifndef GRAPHSHAPE_H
#define GRAPHSHAPE_H

#include "Graph/ProgramGraph.h"

#include <gtest/gtest.h>

#include <set>
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

inline void checkWaysOut(ZfCControlFlowGraph& Graph, leda::node v, ZfCBasicBlock* pBlock) {
    int True = 0;
    int False = 0;
    std::set<int> Targets;
    for (leda::edge e : Graph.out_edges(v)) {
        True += Graph[e]->isTrueBranch() != nullptr ? 1 : 0;
        False += Graph[e]->isFalseBranch() != nullptr ? 1 : 0;
    }
    for (leda::edge e : Graph.out_edges(v))
        Targets.insert(Graph.index(Graph.target(e)));
    EXPECT_EQ(Targets.size(), static_cast<std::size_t>(Graph.outdeg(v)));
    const int Wanted = pBlock->getBranchCond() != nullptr ? 1 : 0;
    EXPECT_EQ(True, Wanted);
    EXPECT_EQ(False, Wanted);
    EXPECT_LE(Graph.outdeg(v), 1 + Wanted);
}

/// All that later passes rely on. The ways of a branch never lead to the same node. Every block has
/// a way out of its procedure, even where a loop has none.
inline void checkShape(ProgramGraph& Program) {
    ZfCControlFlowGraph& Graph = Program.getGraph();
    EXPECT_TRUE(Graph.checkConsistency());
    std::vector<leda::node> Ends;
    std::vector<leda::node> Entries;
    for (leda::node v : Graph.all_nodes()) {
        ASSERT_NE(Graph[v]->getProcedure(), nullptr);
        for (leda::edge e : Graph.out_edges(v))
            EXPECT_EQ(Graph[Graph.target(e)]->getProcedure(), Graph[v]->getProcedure());
        if (Graph.outdeg(v) == 0)
            Ends.push_back(v);
        ZfCBasicBlock* pBlock = Graph[v]->isBasicBlock();
        EXPECT_EQ(Graph.indeg(v) == 0, pBlock == nullptr);
        if (pBlock == nullptr) {
            Entries.push_back(v);
            EXPECT_EQ(Graph.outdeg(v), 1);
            EXPECT_EQ(Graph[v]->getProcedure()->getEntryNode(), v);
            continue;
        }
        checkWaysOut(Graph, v, pBlock);
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq()) {
            if (pStatement->isProcedureCall() != nullptr) {
                EXPECT_TRUE(pBlock->isStatement() == pStatement && Graph.outdeg(v) <= 1);
            }
        }
    }
    const auto Count = static_cast<std::size_t>(Graph.number_of_nodes());
    EXPECT_EQ(reachedFrom(Graph, Entries, true).size(), Count);
    EXPECT_EQ(reachedFrom(Graph, Ends, false).size(), Count);
}

} // namespace hpn::test

#endif
