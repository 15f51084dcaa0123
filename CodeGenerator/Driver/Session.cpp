#include "Driver/Session.h"

#include "Driver/InternalErrors.h"
#include "Driver/OutputFiles.h"
#include "Driver/Progress.h"
#include "Driver/Reports.h"
#include "Emitter/CEmitter.h"
#include "Graph/ProgramGraph.h"
#include "Language/Printer.h"
#include "Language/Reader.h"
#include "Model/PendingWarnings.h"
#include "Road/GraphDump.h"
#include "Road/PassRunner.h"
#include "Road/RangeTable.h"
#include "Road/RewriteLimiter.h"
#include "Road/Statistics.h"
#include "Seeing/Answers.h"
#include "Seeing/Recorder.h"
#include "Seeing/Remarks.h"
#include "Seeing/Report.h"

#include <cstdio>
#include <filesystem>
#include <memory>
#include <string_view>

namespace hpn {

extern const char* const RuntimeHeaderText;

namespace {

const char* const RuntimeHeaderName = "hpn_runtime.h";

bool readSources(const Options& Wanted, SourceFiles& Sources) {
    for (const std::string& Name : Wanted.Files) {
        std::string Why;
        if (Name == "-" ? Sources.addStandardInput(Why) : Sources.addFile(Name, Why))
            continue;
        reportWrongUse("cannot read '" + Name + "': " + Why);
        return false;
    }
    return true;
}

bool makeDirectory(const std::string& Directory) {
    std::error_code Error;
    if (!Directory.empty())
        std::filesystem::create_directories(Directory, Error);
    if (Error)
        reportWrongUse("cannot make the directory '" + Directory + "': " + Error.message());
    return !Error;
}

// The code with the text of the runtime header in the place of its include.
std::string insertRuntime(const std::string& Source) {
    const std::string Include = std::string("#include \"") + RuntimeHeaderName + "\"\n";
    const std::size_t Place = Source.find(Include);
    if (Place == std::string::npos)
        return Source;
    std::string Text = Source;
    return Text.replace(Place, Include.size(), RuntimeHeaderText);
}

// Complete files beside the C: path and text.
using FurtherFiles = std::vector<std::pair<std::string, std::string>>;

bool writeFiles(const Options& Wanted, const std::string& Source, bool NeedsRuntime,
                const FurtherFiles& Further) {
    const std::string Runtime = RuntimeHeaderText;
    OutputFiles Files;
    for (const auto& [Path, Text] : Further)
        Files.add(Path, Text);
    const std::string Header =
        (std::filesystem::path(Wanted.OutputFile).parent_path() / RuntimeHeaderName).string();
    if (Wanted.isOutputToFile())
        Files.add(Wanted.OutputFile, Source);
    // A header that is there already keeps its time, so that nothing is built again for it.
    if (Wanted.isOutputToFile() && NeedsRuntime && !holdsText(Header, Runtime))
        Files.add(Header, Runtime);
    std::string Why;
    if (Files.write(Why))
        return true;
    reportWrongUse(Why);
    return false;
}

ExitStatus writeToStandardOutput(const std::string& Text) {
    if (writeStandardOutput(Text))
        return ExitDone;
    reportWrongUse("cannot write to standard output");
    return ExitWrongUse;
}

ExitStatus writeText(const Options& Wanted, const std::string& Text) {
    if (!Wanted.isOutputToFile())
        return writeToStandardOutput(Text);
    return writeFiles(Wanted, Text, false, {}) ? ExitDone : ExitWrongUse;
}

// What the expressions found strange while the passes ran.
void printWarnings(const SourceFiles& Sources) {
    Diagnostics Messages(Sources);
    for (const PendingWarning& Each : pendingWarnings())
        Messages.warning(Each.Position, Each.Text);
    pendingWarnings().clear();
    std::fputs(Messages.print().c_str(), stderr);
}

// What the passes found worth telling; nothing of it is a mistake.
void printRemarks(const SourceFiles& Sources, const std::vector<Remark>& Remarks) {
    for (const Remark& Each : Remarks) {
        const LineAndColumn Place = Sources.locate(Each.Position);
        std::fprintf(stderr, "%s:%zu:%zu: remark: %s\n",
                     Sources.getName(Each.Position.File).c_str(),
                     static_cast<std::size_t>(Place.Line), static_cast<std::size_t>(Place.Column),
                     Each.Text.c_str());
    }
}

// The observers of one run, as far as they are wanted.
struct Watchers {
    Watchers(const Options& Wanted, const SourceFiles& Sources, PassRunner& Runner,
             InternalErrors& Errors)
        : Record(Sources), Dump(Wanted.DotDirectory, Wanted.HtmlDirectory) {
        if (Wanted.isRewriteLimited()) {
            pLimit = std::make_unique<RewriteLimiter>(Wanted.RewriteLimit);
            Runner.addObserver(*pLimit);
        }
        if (Wanted.Statistics != StatisticsForm::None)
            Runner.addObserver(Counts);
        if (Wanted.IsRangesWanted)
            Runner.addObserver(Ranges);
        if (Wanted.isRecordingWanted())
            Runner.addObserver(Record);
        Runner.addObserver(Dump);
        Runner.addObserver(Times);
        Runner.addObserver(Errors);
        Runner.addObserver(Progress);
    }

    std::string report(const Options& Wanted, const SourceFiles& Sources, const Program& Source,
                       const Statistics* pWithout) const {
        std::string Text;
        const std::vector<std::string> Assumed = Wanted.Assumed.describe();
        if (Wanted.Statistics == StatisticsForm::Text) {
            Text += printStatistics(Counts.getStatistics());
            if (pWithout != nullptr)
                Text += printComparison(*pWithout, Counts.getStatistics(), Assumed);
        }
        if (Wanted.Statistics == StatisticsForm::Json)
            Text += printStatisticsAsJson(Counts.getStatistics(), Source.Name, Assumed, pWithout);
        if (Wanted.IsRangesWanted)
            Text += printRanges(Ranges.getRows(), Sources);
        if (Wanted.IsTimeWanted)
            Text += Times.print();
        return Text;
    }

    // How many changes were made, and the last of them.
    std::string reportRewrites(const SourceFiles& Sources) const {
        if (pLimit == nullptr)
            return "";
        const RewriteBudget& Budget = pLimit->getBudget();
        std::string Text = "rewrites made: " + std::to_string(Budget.getCount()) + " of at most " +
                           std::to_string(Budget.getLimit()) + "\n";
        if (Budget.getCount() == 0)
            return Text;
        const SourcePosition Place = Budget.getLastPosition();
        Text += "last rewrite: ";
        if (Place.File != 0 || Place.Offset != 0) {
            const LineAndColumn At = Sources.locate(Place);
            Text += Sources.getName(Place.File) + ":" + std::to_string(At.Line) + ":" +
                    std::to_string(At.Column) + ": ";
        }
        return Text + Budget.getLastText() + "\n";
    }

    // What is answered from the recording. False: a question names nothing, and `Text` says so.
    bool answer(const Options& Wanted, std::string& Text) {
        if (!Wanted.isRecordingWanted())
            return true;
        const Recording& Whole = Record.finish();
        if (Wanted.IsChangesWanted)
            Text += printChanges(Whole);
        if (Wanted.Remarks == StatisticsForm::Json)
            Text += remarksToJson(Whole);
        else if (Wanted.Remarks == StatisticsForm::Text)
            std::fputs(hpn::printRemarks(Whole).c_str(), stderr);
        for (const std::string& Question : Wanted.Questions) {
            std::string Reply;
            if (!explain(Whole, Question, Reply)) {
                Text = "--explain: " + Reply;
                return false;
            }
            Text += Reply;
        }
        return true;
    }

    std::unique_ptr<RewriteLimiter> pLimit; // null: no limit
    StatisticsObserver Counts;
    RangeObserver Ranges;
    Recorder Record;
    DumpObserver Dump;
    TimeObserver Times;
    ProgressObserver Progress;
};

ExitStatus writeResults(const Options& Wanted, const EmittedProgram& Code,
                        const std::string& Report, const FurtherFiles& Further) {
    // The texts first: what fails then, fails before a file has been touched.
    if (!Wanted.isOutputToFile()) {
        std::fputs(Report.c_str(), stderr);
        if (writeToStandardOutput(insertRuntime(Code.Source)) != ExitDone)
            return ExitWrongUse;
    } else if (writeToStandardOutput(Report) != ExitDone) {
        return ExitWrongUse;
    }
    return writeFiles(Wanted, Code.Source, Code.NeedsRuntime, Further) ? ExitDone : ExitWrongUse;
}

// What holds for this run alone, at the head of the C: whoever finds the file later must know.
std::string describeAssumptions(const std::vector<std::string>& Sentences) {
    std::string Text;
    for (const std::string& Each : Sentences)
        Text += "/* For this run alone: " + Each + ". */\n";
    return Text;
}

ExitStatus optimise(const Options& Wanted, const SourceFiles& Sources, Program& Source,
                    const Statistics* pWithout) {
    InternalErrors Errors(Wanted.IsCheckWanted);
    ProgramGraph Graph(Source);
    Source.dropBodies();
    PassRunner Runner(Graph);
    Watchers Watching(Wanted, Sources, Runner, Errors);
    if (!makeDirectory(Wanted.DotDirectory) || !makeDirectory(Wanted.HtmlDirectory) ||
        !makeDirectory(Wanted.ReportDirectory))
        return ExitWrongUse;
    const bool IsRun = Runner.run(Wanted.Passes);
    printWarnings(Sources);
    printRemarks(Sources, Graph.getRemarks());
    if (!Watching.Dump.getFailedFile().empty()) {
        reportWrongUse("cannot write '" + Watching.Dump.getFailedFile() + "'");
        return ExitWrongUse;
    }
    if (!IsRun)
        return ExitInternalError;
    const std::string Rewrites = Watching.reportRewrites(Sources);
    EmittedProgram Code = emitProgram(Graph);
    std::vector<std::string> Assumed = Wanted.Assumed.describe();
    if (Wanted.isRewriteLimited())
        Assumed.push_back("at most " + std::to_string(Wanted.RewriteLimit) +
                          " single changes happen (--rewrite-limit)");
    Code.Source.insert(0, describeAssumptions(Assumed));
    Watching.Record.getRecording().Assumptions = Assumed;
    if (Errors.hasAny())
        return ExitInternalError;
    std::string Answers;
    if (!Watching.answer(Wanted, Answers)) {
        reportWrongUse(Answers);
        return ExitWrongUse;
    }
    FurtherFiles Further;
    if (!Wanted.RecordFile.empty())
        Further.emplace_back(Wanted.RecordFile, recordingToJson(Watching.Record.getRecording()));
    if (!Wanted.ReportDirectory.empty())
        Further.emplace_back(
            (std::filesystem::path(Wanted.ReportDirectory) / "index.html").string(),
            makeReport(Watching.Record.getRecording()));
    return writeResults(Wanted, Code,
                        Watching.report(Wanted, Sources, Source, pWithout) + Rewrites + Answers,
                        Further);
}

// The statistics of the run without its assumptions. False: something inside is broken.
bool runWithout(const Options& Wanted, const SourceFiles& Sources, Statistics& Without) {
    Diagnostics Messages(Sources); // said again by the run proper
    Program Source;
    if (!readProgram(Sources, Messages, Source))
        return true;
    InternalErrors Errors(Wanted.IsCheckWanted);
    ProgramGraph Graph(Source);
    PassRunner Runner(Graph);
    StatisticsObserver Counts;
    Runner.addObserver(Counts);
    Runner.addObserver(Errors);
    const bool IsRun = Runner.run(Wanted.Passes);
    pendingWarnings().clear();
    Without = Counts.getStatistics();
    return IsRun;
}

} // namespace

ExitStatus runSession(const Options& Wanted) {
    SourceFiles Sources;
    if (!readSources(Wanted, Sources))
        return ExitWrongUse;
    Diagnostics Messages(Sources);
    Program Source;
    Wanted.Assumed.prepare(Source);
    const bool IsRead = readProgram(Sources, Messages, Source);
    std::fputs(Messages.print().c_str(), stderr);
    if (!IsRead)
        return ExitProgramMistakes;
    std::string Why;
    if (!Wanted.Assumed.apply(Source, Why)) {
        reportWrongUse(Why);
        return ExitWrongUse;
    }
    if (Wanted.IsPrintWanted)
        return writeText(Wanted, printProgram(Source));
    const bool IsCompared = !Wanted.Assumed.isEmpty() && Wanted.Statistics != StatisticsForm::None;
    Statistics Without;
    if (IsCompared && !runWithout(Wanted, Sources, Without))
        return ExitInternalError;
    return optimise(Wanted, Sources, Source, IsCompared ? &Without : nullptr);
}

} // namespace hpn
