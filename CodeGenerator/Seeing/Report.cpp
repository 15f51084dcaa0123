#include "Seeing/Report.h"

#include "Seeing/ReportData.h"

namespace hpn {

extern const char* const ReportTemplate;
extern const char* const ReportStyle;
extern const char* const ReportScript;

namespace {

std::string escape(const std::string& Text) {
    std::string Result;
    for (const char Each : Text) {
        switch (Each) {
        case '&':
            Result += "&amp;";
            break;
        case '<':
            Result += "&lt;";
            break;
        case '>':
            Result += "&gt;";
            break;
        case '"':
            Result += "&quot;";
            break;
        default:
            Result += Each;
        }
    }
    return Result;
}

std::string dataElements(const Recording& Of, const PictureLimits& Limits) {
    std::string Text;
    for (const auto& [Name, Json] : writeReportData(Of, drawPictures(Of, Limits)))
        Text +=
            "<script type=\"application/json\" id=\"data-" + Name + "\">" + Json + "</script>\n";
    return Text;
}

// The text of one place holder of the template.
std::string fill(const std::string& Name, const Recording& Of, const PictureLimits& Limits) {
    if (Name == "TITLE")
        return escape(Of.Program);
    if (Name == "STYLE")
        return ReportStyle;
    if (Name == "DATA")
        return dataElements(Of, Limits);
    return ReportScript;
}

} // namespace

std::string makeReport(const Recording& Of, const PictureLimits& Limits) {
    const std::string Template = ReportTemplate;
    std::string Page;
    std::size_t Done = 0;
    for (std::size_t Open = Template.find("@{"); Open != std::string::npos;
         Open = Template.find("@{", Done)) {
        const std::size_t Close = Template.find('}', Open);
        Page += Template.substr(Done, Open - Done);
        Page += fill(Template.substr(Open + 2, Close - Open - 2), Of, Limits);
        Done = Close + 1;
    }
    return Page + Template.substr(Done);
}

} // namespace hpn
