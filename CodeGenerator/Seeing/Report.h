#ifndef REPORT_H
#define REPORT_H

#include "Seeing/ReportPictures.h"

#include <string>

namespace hpn {

/// One HTML page that shows a recorded run: passes, graphs before and after each one, the sources,
/// variables and their ranges, explanations, and the C before and after. It needs nothing beside
/// itself, neither files nor a network. Without graphviz it comes without the pictures and says so.
std::string makeReport(const Recording& Of, const PictureLimits& Limits = {});

} // namespace hpn

#endif
