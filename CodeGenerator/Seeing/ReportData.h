#ifndef REPORTDATA_H
#define REPORTDATA_H

#include "Seeing/ReportPictures.h"

#include <string>
#include <utility>
#include <vector>

namespace hpn {

/// The parts of the page's data: name and JSON. They are apart so that the page reads each one only
/// when a view needs it. Tables are {"columns": [...], "rows": [[...]...]}; a place is one number,
/// file * 2^32 + line * 4096 + column, 0 where it is unknown. Nothing in it ends a script element.
std::vector<std::pair<std::string, std::string>> writeReportData(const Recording& Of,
                                                                 const ReportPictures& Pictures);

} // namespace hpn

#endif
