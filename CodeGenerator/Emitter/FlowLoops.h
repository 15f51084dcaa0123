#ifndef FLOWLOOPS_H
#define FLOWLOOPS_H

#include "Emitter/FlowDominators.h"

#include <vector>

namespace hpn {

/// The natural loops of a procedure's control flow as a forest, each loop named by its header.
/// Cycles that are entered at several places have no header and are no loops here.
class FlowLoops {
public:
    FlowLoops(int NumberOfNodes, const FlowDominators& Dominators);

    bool isHeader(int Node) const { return m_IsHeader[Node]; }
    /// Header of the innermost loop that holds the node (of a header: itself); -1 if none does.
    int innermostLoop(int Node) const { return m_IsHeader[Node] ? Node : m_Enclosing[Node]; }
    /// Header of the next loop around; -1 if there is none.
    int parentLoop(int Header) const { return m_Enclosing[Header]; }
    bool contains(int Header, int Node) const;
    /// The only source of a back edge to the header; -1 if there are several.
    int onlyLatch(int Header) const { return m_OnlyLatch[Header]; }

private:
    void collect(int Header, const FlowDominators& Dominators);
    int representative(int Node);

    std::vector<bool> m_IsHeader;
    std::vector<int> m_Enclosing;
    std::vector<int> m_Depth; // of headers, outermost 1
    std::vector<int> m_OnlyLatch;
    std::vector<int> m_Representative; // outermost loop found so far
};

} // namespace hpn

#endif
