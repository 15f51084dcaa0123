#ifndef REPORTBOXES_H
#define REPORTBOXES_H

#include "Seeing/Recording.h"

#include <cstddef>
#include <unordered_set>
#include <vector>

namespace hpn {

/// What a line (or several) of a box stands for: one node, or a folded part of the graph.
struct ReportItem {
    std::vector<int> Nodes; ///< indices into Nodes; just one unless folded
    bool IsFolded = false;
};

/// A straight run of nodes, drawn as one box with its nodes below each other.
struct ReportBox {
    std::vector<ReportItem> Items;
};

struct ReportBoxEdge {
    int From = 0;
    int To = 0;
    RecordedEdge::Kind What = RecordedEdge::Kind::Flow;
};

/// The flow of one procedure as boxes. SSA edges are no part of it: they are drawn over the
/// picture.
struct ReportBoxes {
    std::vector<ReportBox> Boxes;
    std::vector<ReportBoxEdge> Edges;
    bool IsFolded = false;
};

/// When a procedure is folded, and down to what.
struct FoldingLimits {
    std::size_t Nodes = 1000; ///< up to so many nodes each one is shown
    std::size_t Boxes = 120;  ///< above, regions are folded until so few boxes are left
    std::size_t Items = 30;   ///< and no box shows more than about so many items
};

/// Makes the boxes of a procedure. Above the limit, stretches of straight lines and regions with
/// one way in and one way out are folded, the innermost first, and those without a marked node
/// before the others; what jumps make of a graph may leave more boxes than wanted. `Marked` holds
/// ids.
ReportBoxes makeBoxes(const Recording& Of, const RecordedProcedure& Procedure,
                      const std::unordered_set<unsigned>& Marked, const FoldingLimits& Limits);

} // namespace hpn

#endif
