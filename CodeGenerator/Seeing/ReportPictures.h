#ifndef REPORTPICTURES_H
#define REPORTPICTURES_H

#include "Seeing/ReportBoxes.h"
#include "Seeing/ReportLayout.h"

#include <string>
#include <vector>

namespace hpn {

/// How much time the pictures of a page may take, and when they are folded.
struct PictureLimits {
    double SecondsEach = 10.0;
    double SecondsAltogether = 20.0;
    FoldingLimits Folding;
};

/// The picture of one state of a procedure, or of the calls of one snapshot.
struct ReportPicture {
    ReportBoxes Boxes; ///< empty for calls: a box for each procedure of the snapshot
    int Layout = -1;   ///< index into Layouts; -1: left out
    bool IsTooSlow = false;
};

/// All pictures of a page. Layouts are shared: what looks the same is placed once.
struct ReportPictures {
    std::vector<PlacedPicture> Layouts;
    std::vector<ReportPicture> Procedures; ///< by index into Procedures of the recording
    std::vector<ReportPicture> Calls;      ///< by number of the snapshot
    bool IsGraphvizThere = true;
    std::size_t LeftOut = 0; ///< so many procedure states have none
};

/// Rows that a node takes in a picture; the page follows the same rule.
std::size_t rowsOf(const RecordedNode& Node);

/// Lays out the states that differ. The passes that changed most of what makes code come first, and
/// of each pass the procedures that it changed most; what does not fit into the time is left out.
ReportPictures drawPictures(const Recording& Of, const PictureLimits& Limits);

} // namespace hpn

#endif
