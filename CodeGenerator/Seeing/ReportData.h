#ifndef REPORTDATA_H
#define REPORTDATA_H

#include "Seeing/ReportPictures.h"

#include <string>
#include <vector>

namespace hpn {

/// A part of the page's data. They are apart so that the page reads each one only when a view needs
/// it; what the first picture needs stands before the script, the others behind it.
struct ReportPart {
    std::string Name;
    std::string Json;
    bool IsLater = false;
};

/// The data of the page in parts. Tables are {"columns": [...], "rows": [[...]...]}; a place is one
/// number, file * 2^32 + line * 4096 + column, 0 where it is unknown. Nothing in it ends a script
/// element.
std::vector<ReportPart> writeReportData(const Recording& Of, const ReportPictures& Pictures);

} // namespace hpn

#endif
