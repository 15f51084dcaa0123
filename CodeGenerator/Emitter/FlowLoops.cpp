#include "Emitter/FlowLoops.h"

#include <cstddef>
#include <numeric>

// Loop forest after P. Havlak, "Nesting of Reducible and Irreducible Loops", TOPLAS 1997, the
// reducible part of it: headers are taken from the last to the first in reverse postorder; from the
// sources of its back edges each walks backwards, loops that are known already counting as one node
// (union-find), until it meets itself. Near-linear.

namespace hpn {

FlowLoops::FlowLoops(int NumberOfNodes, const FlowDominators& Dominators)
    : m_IsHeader(NumberOfNodes, false), m_Enclosing(NumberOfNodes, -1), m_Depth(NumberOfNodes, 0),
      m_OnlyLatch(NumberOfNodes, -1), m_Representative(NumberOfNodes) {
    std::iota(m_Representative.begin(), m_Representative.end(), 0);
    const std::vector<int>& Order = Dominators.getOrder();
    for (std::size_t i = Order.size(); i-- > 0;)
        collect(Order[i], Dominators);
    for (int Node : Order)
        if (m_IsHeader[Node])
            m_Depth[Node] = m_Enclosing[Node] == -1 ? 1 : m_Depth[m_Enclosing[Node]] + 1;
}

int FlowLoops::representative(int Node) {
    while (m_Representative[Node] != Node) {
        m_Representative[Node] = m_Representative[m_Representative[Node]];
        Node = m_Representative[Node];
    }
    return Node;
}

void FlowLoops::collect(int Header, const FlowDominators& Dominators) {
    std::vector<int> WorkList;
    int NumberOfLatches = 0;
    for (const int* p = Dominators.beginPredecessors(Header);
         p != Dominators.endPredecessors(Header); ++p) {
        if (!Dominators.dominates(Header, *p))
            continue;
        ++NumberOfLatches;
        m_IsHeader[Header] = true;
        m_OnlyLatch[Header] = NumberOfLatches == 1 ? *p : -1;
        WorkList.push_back(representative(*p));
    }
    while (!WorkList.empty()) {
        const int Node = WorkList.back();
        WorkList.pop_back();
        if (Node == Header || m_Representative[Node] != Node)
            continue;
        m_Representative[Node] = Header;
        m_Enclosing[Node] = Header;
        for (const int* p = Dominators.beginPredecessors(Node);
             p != Dominators.endPredecessors(Node); ++p) {
            const int Source = representative(*p);
            if (Source != Header && Dominators.dominates(Header, Source))
                WorkList.push_back(Source);
        }
    }
}

bool FlowLoops::contains(int Header, int Node) const {
    int Loop = innermostLoop(Node);
    while (Loop != -1 && m_Depth[Loop] > m_Depth[Header])
        Loop = m_Enclosing[Loop];
    return Loop == Header;
}

} // namespace hpn
