#ifndef HOISTINGCONTEXT_H
#define HOISTINGCONTEXT_H

#include "ZfCControlFlowGraph.h"

#include <cstddef>
#include <unordered_map>

namespace hpn {

/// Where statements stand while code is hoisted. The optimiser asks a statement to move in front of
/// its branch without telling it where it is, so the driver of the pass keeps one of these around
/// the pass: the client's statements look themselves up in the active one, and without one nothing
/// is hoisted.
///
/// Requires the divided graph, one statement or condition for each node. A moved statement gets a
/// node of its own between the branch's in-edges and the branch; the node that it leaves, and that
/// of a dropped twin, keep an empty block. Nothing that reads SSA versions may run afterwards: a
/// moved statement stands for its twin as well. Cost: one walk over the graph.
class HoistingContext {
public:
    /// Notes the place of every statement, and becomes the active one.
    explicit HoistingContext(ZfCControlFlowGraph& Graph);
    ~HoistingContext();
    HoistingContext(const HoistingContext&) = delete;
    HoistingContext& operator=(const HoistingContext&) = delete;

    /// The present one, or null.
    static HoistingContext* active() { return s_pActive; }
    /// Moves a statement out of the arm that it begins to the place in front of the branch; false,
    /// and nothing changed, if it does not stand alone at the top of an arm or if moving it over
    /// the condition could change a number.
    bool moveInFrontOfBranch(ZfCCfgStatement* pStatement);
    /// Takes a statement out of the program; one that stands nowhere is left alone.
    void drop(ZfCCfgStatement* pStatement);
    std::size_t countMoved() const { return m_Moved; }

private:
    leda::node findBranch(leda::node v);
    void insertBefore(leda::node Branch, leda::node v);

    static HoistingContext* s_pActive;
    ZfCControlFlowGraph& m_Graph;
    std::unordered_map<ZfCCfgStatement*, leda::node> m_Nodes; // looked up only, never walked
    std::size_t m_Moved = 0;
};

} // namespace hpn

#endif
