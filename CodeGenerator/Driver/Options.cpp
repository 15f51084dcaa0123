#include "Driver/Options.h"

#include "Driver/Manual.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <cstdio>

namespace hpn {

namespace {

const char* const Description =
    "hpncg - reads a control program, optimises it as a whole and writes readable C.\n"
    "Several files make one program; it is named after the first of them. '-' is standard input.\n"
    "The C has two entry points, <program>_init and <program>_step (one pass of main).";

const char* const Examples =
    "Examples:\n"
    "  hpncg cruise.hpn -o cruise.c            write cruise.c, and hpn_runtime.h beside it\n"
    "  hpncg cruise.hpn --ranges -o cruise.c   show what is known of each variable\n"
    "  hpncg cruise.hpn --stats -o cruise.c    show what each pass did\n"
    "  hpncg cruise.hpn --dump-dot=dots -o cruise.c\n"
    "                                          one picture of the graph after each pass, for "
    "graphviz:\n"
    "                                          dot -Tsvg dots/08_*.dot -o step8.svg\n"
    "  hpncg cruise.hpn --extract-labels -o cruise.c\n"
    "                                          shared labels become procedures; remarks tell which "
    "do not\n"
    "  hpncg cruise.hpn --explain=throttle --explain=line:17 -o cruise.c\n"
    "                                          why it is constant or not, what became of the line\n"
    "  hpncg cruise.hpn --set HAS_RESUME=true --range vehicle_speed=0..120 --stats -o cruise.c\n"
    "                                          what another option and a believed input change\n"
    "  hpncg --no-optimize - < cruise.hpn      the code as written, to standard output\n"
    "  hpncg --print a.hpn b.hpn               the program in its canonical form\n"
    "\n"
    "Reports go to standard output when the code goes to a file, else to the error stream.\n"
    "\n"
    "Exit status: 0 done, 1 mistakes in the program, 2 wrong use, 3 internal error.\n"
    "After any other status than 0 no output file has been written or changed.";

std::string describePasses() {
    std::string Text = "Passes, in the order in which they run by default (--passes=LIST runs "
                       "others; an order\nthat cannot work is refused with the reason):\n";
    for (const Pass& Each : passTable()) {
        std::string Line = std::string("  ") + Each.Name;
        Line.resize(std::max<std::size_t>(Line.size() + 2, 40), ' ');
        Text += Line + Each.Purpose + "\n";
    }
    return Text + "\n" + Examples;
}

// The words of the command line before they are checked against each other.
struct Words {
    bool IsNotOptimized = false;
    bool IsExtractionWanted = false;
    std::string Passes;
    std::string Statistics;
    std::string Remarks;
    std::vector<std::string> Settings;
    std::vector<std::string> Ranges;
};

void declareOptions(CLI::App& App, Options& Result, Words& Given) {
    App.set_version_flag("--version", "hpncg 1.0.0");
    App.add_option("FILES", Result.Files, "Program texts (.hpn), '-' for standard input")
        ->required()
        ->type_name("");
    App.add_option("-o,--output", Result.OutputFile, "Write the C there; '-': standard output")
        ->type_name("FILE");
    CLI::Option* pNone = App.add_flag("--no-optimize", Given.IsNotOptimized, "Run no pass at all");
    App.add_option("--passes", Given.Passes, "Run these passes, separated by commas")
        ->type_name("LIST")
        ->expected(1)
        ->excludes(pNone);
    App.add_flag("--extract-labels", Given.IsExtractionWanted,
                 "First make procedures of the labels that are reached from several places");
    App.add_option("--dump-dot", Result.DotDirectory, "Write the graph after each pass as DOT file")
        ->type_name("DIR");
    App.add_option("--dump-html", Result.HtmlDirectory,
                   "Write the table of variables after each pass")
        ->type_name("DIR");
    App.add_option("--explain", Result.Questions,
                   "Tell why a variable is constant or not, and what became of its "
                   "definitions; line:17 tells it of a line")
        ->type_name("NAME")
        ->allow_extra_args(false);
    App.add_flag("--remarks{text}", Given.Remarks,
                 "Tell what was replaced, removed, inlined and moved, and what was not and why; "
                 "--remarks=json for tools");
    App.add_flag("--print-changed", Result.IsChangesWanted,
                 "Print pass by pass the text of what changed, and nothing else");
    App.add_option("--set", Given.Settings, "For this run a param has another value")
        ->type_name("NAME=VALUE")
        ->allow_extra_args(false);
    App.add_option("--range", Given.Ranges,
                   "For this run believe that an input stays in a range; --stats shows what "
                   "--set and --range change")
        ->type_name("INPUT=LO..HI")
        ->allow_extra_args(false);
    App.add_option("--rewrite-limit", Result.RewriteLimit,
                   "Let the first N single changes happen and no more (see Scripts/bisect)")
        ->type_name("N");
    App.add_option("--report", Result.ReportDirectory,
                   "Write a page for the browser, index.html, that shows the run: passes, graphs, "
                   "ranges, explanations")
        ->type_name("DIR");
    App.add_option("--record", Result.RecordFile,
                   "Write everything about the run as JSON, for tools")
        ->type_name("FILE");
    App.add_flag("--stats{text}", Given.Statistics,
                 "Print what each pass did; --stats=json for tools");
    App.add_flag("--time-passes", Result.IsTimeWanted, "Print how long each pass took");
    App.add_flag("--ranges", Result.IsRangesWanted,
                 "Print value, or minimum and maximum, of each variable");
    App.add_flag("--check", Result.IsCheckWanted,
                 "Turn the optimiser's own checks on (slow; for developers)");
    App.add_flag("--print", Result.IsPrintWanted,
                 "Print the program in its canonical form and do nothing else");
}

bool readForm(const CLI::App& App, const char* Option, const std::string& Word,
              StatisticsForm& Result, std::string& Message) {
    if (App.count(Option) == 0)
        return true;
    Result = Word == "json" ? StatisticsForm::Json : StatisticsForm::Text;
    if (Word == "json" || Word == "text")
        return true;
    Message = std::string(Option) + ": '" + Word + "' is neither 'text' nor 'json'";
    return false;
}

// For the installation, and so not among what --help lists: prints the manual page or the
// completion that these very declarations make.
void declareGenerator(CLI::App& App) {
    const auto generate = [&App](const std::string& What) {
        if (What != "man" && What != "bash")
            throw CLI::ValidationError("--generate", "'" + What + "' is neither 'man' nor 'bash'");
        const std::string Text = What == "man" ? printManualPage(App) : printBashCompletion(App);
        std::fputs(Text.c_str(), stdout);
        throw CLI::Success();
    };
    App.add_option_function<std::string>("--generate", generate)->group("");
}

// What is wrong with the words taken together, or nothing.
std::string checkOptions(const CLI::App& App, const Words& Given, Options& Result) {
    std::string Message;
    if (App.count("--passes") != 0) {
        if (!PassSequence::parse(Given.Passes, Result.Passes, Message))
            return "--passes: " + Message;
    } else if (!Given.IsNotOptimized) {
        Result.Passes = PassSequence::defaultOrder();
    }
    if (Given.IsExtractionWanted)
        Result.Passes.extractLabelsFirst();
    if (!readForm(App, "--stats", Given.Statistics, Result.Statistics, Message) ||
        !readForm(App, "--remarks", Given.Remarks, Result.Remarks, Message))
        return Message;
    for (const std::string& Each : Given.Settings)
        if (!Result.Assumed.addSetting(Each, Message))
            return "--set: " + Message;
    for (const std::string& Each : Given.Ranges)
        if (!Result.Assumed.addRange(Each, Message))
            return "--range: " + Message;
    if (Result.IsRangesWanted &&
        !Result.Passes.contains(PassId::PropagateSparseConditionalConstant))
        return "--ranges: without propagateSparseConditionalConstant nothing is known of any "
               "variable";
    if (std::count(Result.Files.begin(), Result.Files.end(), "-") > 1)
        return "standard input can be read only once";
    if (Result.isOutputToFile() &&
        std::count(Result.Files.begin(), Result.Files.end(), Result.OutputFile) != 0)
        return "the output '" + Result.OutputFile + "' is one of the program texts";
    return "";
}

} // namespace

bool parseOptions(int ArgumentCount, const char* const* pArguments, Options& Result,
                  ExitStatus& Status) {
    CLI::App App(Description, "hpncg");
    // A word that begins with a slash names a file on every system.
    App.allow_windows_style_options(false);
    App.footer(describePasses());
    Words Given;
    declareOptions(App, Result, Given);
    declareGenerator(App);
    Status = ExitWrongUse;
    try {
        App.parse(ArgumentCount, pArguments);
    } catch (const CLI::Success& Request) {
        Status = App.exit(Request) == 0 ? ExitDone : ExitWrongUse;
        return false;
    } catch (const CLI::Error& Mistake) {
        reportWrongUse(Mistake.what());
        return false;
    }
    const std::string Message = checkOptions(App, Given, Result);
    if (Message.empty())
        return true;
    reportWrongUse(Message);
    return false;
}

void reportWrongUse(const std::string& Message) {
    std::fprintf(stderr, "hpncg: error: %s\n", Message.c_str());
}

} // namespace hpn
