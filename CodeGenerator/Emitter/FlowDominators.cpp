#include "Emitter/FlowDominators.h"

#include <cstddef>
#include <utility>

// Dominators by K. Cooper, T. Harvey and K. Kennedy, "A Simple, Fast Dominance Algorithm", 2001:
//   1. number the nodes in reverse postorder;
//   2. until nothing changes, walk them in that order and give each the nearest common dominator of
//   its predecessors that
//      have one already;
//   3. (ours) number the tree in preorder, so that "dominates" is a comparison of two numbers.
// A reducible graph needs two rounds of step 2; the walks up the tree make the worst case
// quadratic.

namespace hpn {

namespace {

template <class Visit>
void forEachTarget(const FlowNode& Node, Visit&& visit) {
    if (Node.True != ReturnTarget)
        visit(Node.True);
    if (Node.IsBranch && Node.False != ReturnTarget)
        visit(Node.False);
}

} // namespace

FlowDominators::FlowDominators(const std::vector<FlowNode>& Nodes) {
    findOrder(Nodes);
    findPredecessors(Nodes);
    findIdoms();
    numberTree();
}

void FlowDominators::findOrder(const std::vector<FlowNode>& Nodes) {
    // Step 1. The arm of the false branch is walked first and so ends up behind the other.
    std::vector<std::pair<int, int>> Stack{{0, 0}};
    std::vector<bool> Reached(Nodes.size(), false);
    Reached[0] = true;
    while (!Stack.empty()) {
        auto& [Node, Arm] = Stack.back();
        const FlowNode& Flow = Nodes[Node];
        if (Arm == 2) {
            m_Order.push_back(Node);
            Stack.pop_back();
            continue;
        }
        const int Target = Arm == 1 ? Flow.True : Flow.IsBranch ? Flow.False : ReturnTarget;
        ++Arm;
        if (Target == ReturnTarget || Reached[Target])
            continue;
        Reached[Target] = true;
        Stack.emplace_back(Target, 0);
    }
    m_Order = std::vector<int>(m_Order.rbegin(), m_Order.rend());
    m_Number.assign(Nodes.size(), -1);
    for (std::size_t i = 0; i < m_Order.size(); ++i)
        m_Number[m_Order[i]] = static_cast<int>(i);
}

void FlowDominators::findPredecessors(const std::vector<FlowNode>& Nodes) {
    m_FirstPredecessor.assign(Nodes.size() + 1, 0);
    for (const FlowNode& Node : Nodes)
        forEachTarget(Node, [&](int Target) { ++m_FirstPredecessor[Target + 1]; });
    for (std::size_t i = 1; i < m_FirstPredecessor.size(); ++i)
        m_FirstPredecessor[i] += m_FirstPredecessor[i - 1];
    m_Predecessors.resize(m_FirstPredecessor.back());
    std::vector<int> Place(m_FirstPredecessor);
    for (std::size_t i = 0; i < Nodes.size(); ++i)
        forEachTarget(Nodes[i],
                      [&](int Target) { m_Predecessors[Place[Target]++] = static_cast<int>(i); });
}

int FlowDominators::commonDominator(int a, int b) const {
    while (a != b) {
        if (m_Number[a] > m_Number[b])
            a = m_Idom[a];
        else
            b = m_Idom[b];
    }
    return a;
}

void FlowDominators::findIdoms() {
    // Step 2.
    m_Idom.assign(m_Number.size(), -1);
    m_Idom[0] = 0;
    bool Changed = true;
    while (Changed) {
        Changed = false;
        for (std::size_t i = 1; i < m_Order.size(); ++i) {
            const int Node = m_Order[i];
            int Common = -1;
            for (const int* p = beginPredecessors(Node); p != endPredecessors(Node); ++p)
                if (m_Idom[*p] != -1)
                    Common = Common == -1 ? *p : commonDominator(Common, *p);
            Changed = Changed || m_Idom[Node] != Common;
            m_Idom[Node] = Common;
        }
    }
}

void FlowDominators::numberTree() {
    // Step 3. A node comes behind its dominator in the order, so sizes gather backwards and places
    // spread forwards.
    m_TreeSize.assign(m_Number.size(), 1);
    m_TreePlace.assign(m_Number.size(), 0);
    for (std::size_t i = m_Order.size(); i-- > 1;)
        m_TreeSize[m_Idom[m_Order[i]]] += m_TreeSize[m_Order[i]];
    std::vector<int> NextPlace(m_Number.size(), 1);
    for (std::size_t i = 1; i < m_Order.size(); ++i) {
        const int Node = m_Order[i];
        int& Next = NextPlace[m_Idom[Node]];
        m_TreePlace[Node] = Next;
        Next += m_TreeSize[Node];
        NextPlace[Node] = m_TreePlace[Node] + 1;
    }
}

std::vector<int> immediateDominators(const std::vector<FlowNode>& Nodes) {
    return FlowDominators(Nodes).getIdoms();
}

} // namespace hpn
