#ifndef OPTIONS_H
#define OPTIONS_H

#include "Driver/Assumptions.h"
#include "Road/PassSequence.h"

#include <cstddef>
#include <string>
#include <vector>

namespace hpn {

/// What the process ends with.
enum ExitStatus { ExitDone = 0, ExitProgramMistakes = 1, ExitWrongUse = 2, ExitInternalError = 3 };

enum class StatisticsForm : unsigned char { None, Text, Json };

/// What the user asked for.
struct Options {
    std::vector<std::string> Files; ///< "-": standard input
    std::string OutputFile;         ///< empty or "-": standard output
    PassSequence Passes;
    std::string DotDirectory; ///< empty: no dump
    std::string HtmlDirectory;
    std::vector<std::string> Questions; ///< of --explain
    StatisticsForm Remarks = StatisticsForm::None;
    bool IsChangesWanted = false;
    static constexpr std::size_t NoLimit = static_cast<std::size_t>(-1);
    std::size_t RewriteLimit = NoLimit;
    Assumptions Assumed;         ///< --set and --range
    std::string RecordFile;      ///< the recording as JSON; empty: none
    std::string ReportDirectory; ///< of the page that shows the run; empty: none
    StatisticsForm Statistics = StatisticsForm::None;
    bool IsTimeWanted = false;
    bool IsCheckWanted = false;
    bool IsRangesWanted = false;
    bool IsPrintWanted = false;

    /// Something is asked for that is answered from a recording.
    bool isRecordingWanted() const {
        return !RecordFile.empty() || !ReportDirectory.empty() || !Questions.empty() ||
               IsChangesWanted || Remarks != StatisticsForm::None;
    }
    bool isRewriteLimited() const { return RewriteLimit != NoLimit; }
    bool isOutputToFile() const { return !OutputFile.empty() && OutputFile != "-"; }
};

/// Reads the command line. False: the process ends now with `Status`; help, version or the mistake
/// has been printed.
bool parseOptions(int ArgumentCount, const char* const* pArguments, Options& Result,
                  ExitStatus& Status);

/// Prints one line "hpncg: error: ..." to the error stream.
void reportWrongUse(const std::string& Message);

} // namespace hpn

#endif
