#ifndef FLOWDOMINATORS_H
#define FLOWDOMINATORS_H

#include "Emitter/Structurer.h"

#include <vector>

namespace hpn {

/// Orders and dominator tree of a procedure's control flow: made once from the nodes, then only
/// read. All numbers are node numbers of the flow unless said otherwise.
class FlowDominators {
public:
    explicit FlowDominators(const std::vector<FlowNode>& Nodes);

    /// Nodes in reverse postorder, the arm of the true branch before the other one.
    const std::vector<int>& getOrder() const { return m_Order; }
    /// Place of a node in the order.
    int getNumber(int Node) const { return m_Number[Node]; }
    int getIdom(int Node) const { return m_Idom[Node]; }
    const std::vector<int>& getIdoms() const { return m_Idom; }
    /// Every way from the entry to `Node` leads over `Dominator`; each node dominates itself.
    bool dominates(int Dominator, int Node) const {
        const int Place = m_TreePlace[Node] - m_TreePlace[Dominator];
        return Place >= 0 && Place < m_TreeSize[Dominator];
    }
    /// Sources of the edges to a node, in node order.
    const int* beginPredecessors(int Node) const {
        return m_Predecessors.data() + m_FirstPredecessor[Node];
    }
    const int* endPredecessors(int Node) const {
        return m_Predecessors.data() + m_FirstPredecessor[Node + 1];
    }

private:
    void findOrder(const std::vector<FlowNode>& Nodes);
    void findPredecessors(const std::vector<FlowNode>& Nodes);
    void findIdoms();
    int commonDominator(int a, int b) const;
    void numberTree();

    std::vector<int> m_Order;
    std::vector<int> m_Number;
    std::vector<int> m_Idom;
    std::vector<int> m_TreePlace; // preorder number in the dominator tree
    std::vector<int> m_TreeSize;  // nodes in the subtree
    std::vector<int> m_FirstPredecessor;
    std::vector<int> m_Predecessors;
};

} // namespace hpn

#endif
