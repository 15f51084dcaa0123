#include "Seeing/Report.h"

#include "Seeing/ReportData.h"

#include <map>

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

std::string dataElements(const std::vector<ReportPart>& Parts, bool AreLater) {
    std::string Text;
    for (const ReportPart& Each : Parts) {
        if (Each.IsLater == AreLater)
            Text += "<script type=\"application/json\" id=\"data-" + Each.Name + "\">" + Each.Json +
                    "</script>\n";
    }
    return Text;
}

} // namespace

std::string makeReport(const Recording& Of, const PictureLimits& Limits) {
    const std::vector<ReportPart> Parts = writeReportData(Of, drawPictures(Of, Limits));
    const std::map<std::string, std::string> Texts = {{"TITLE", escape(Of.Program)},
                                                      {"STYLE", ReportStyle},
                                                      {"DATA", dataElements(Parts, false)},
                                                      {"SCRIPT", ReportScript},
                                                      {"LATER", dataElements(Parts, true)}};
    const std::string Template = ReportTemplate;
    std::string Page;
    std::size_t Done = 0;
    for (std::size_t Open = Template.find("@{"); Open != std::string::npos;
         Open = Template.find("@{", Done)) {
        const std::size_t Close = Template.find('}', Open);
        Page += Template.substr(Done, Open - Done);
        Page += Texts.at(Template.substr(Open + 2, Close - Open - 2));
        Done = Close + 1;
    }
    return Page + Template.substr(Done);
}

} // namespace hpn
