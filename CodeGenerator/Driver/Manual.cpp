#include "Driver/Manual.h"

#include "Road/PassSequence.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <cctype>
#include <sstream>

namespace hpn {

namespace {

// A line as troff shows it: no control character at its start, no hyphen or backslash of its own.
std::string quoteLine(const std::string& Line) {
    std::string Text = !Line.empty() && (Line[0] == '.' || Line[0] == '\'') ? "\\&" : "";
    for (const char Each : Line) {
        if (Each == '\\')
            Text += "\\e";
        else if (Each == '-')
            Text += "\\-";
        else
            Text += Each;
    }
    return Text;
}

// Runs of indented lines stand as they are written, all others flow.
std::string printLines(const std::vector<std::string>& Lines) {
    std::string Text;
    bool IsFixed = false;
    for (const std::string& Line : Lines) {
        const bool IsIndented = Line.compare(0, 2, "  ") == 0;
        if (IsIndented != IsFixed)
            Text += IsIndented ? ".PP\n.nf\n" : ".fi\n.PP\n";
        IsFixed = IsIndented;
        Text += quoteLine(IsIndented ? Line.substr(2) : Line) + "\n";
    }
    return Text + (IsFixed ? ".fi\n" : "");
}

std::vector<std::vector<std::string>> splitParagraphs(const std::string& Text) {
    std::vector<std::vector<std::string>> Paragraphs(1);
    std::istringstream Stream(Text);
    for (std::string Line; std::getline(Stream, Line);) {
        if (!Line.empty())
            Paragraphs.back().push_back(Line);
        else if (!Paragraphs.back().empty())
            Paragraphs.emplace_back();
    }
    return Paragraphs;
}

// The words a paragraph opens with, where they are a heading ("Exit status: ..."), else "NOTES".
std::string headingOf(const std::string& FirstLine) {
    std::string Heading = FirstLine.substr(0, FirstLine.find_first_of(":,"));
    if (Heading.size() == FirstLine.size() || std::count(Heading.begin(), Heading.end(), ' ') > 1)
        return "NOTES";
    for (char& Each : Heading)
        Each = static_cast<char>(std::toupper(static_cast<unsigned char>(Each)));
    return Heading;
}

bool isShown(const CLI::Option& Option) {
    return !Option.get_positional() && !Option.get_group().empty();
}

std::vector<std::string> wordsOf(const CLI::Option& Option) {
    std::vector<std::string> Words;
    for (const std::string& Name : Option.get_snames())
        Words.push_back("-" + Name);
    for (const std::string& Name : Option.get_lnames())
        Words.push_back("--" + Name);
    return Words;
}

std::string printOption(const CLI::Option& Option) {
    std::string Names;
    for (const std::string& Word : wordsOf(Option))
        Names += (Names.empty() ? "\\fB" : ", \\fB") + quoteLine(Word) + "\\fR";
    if (Option.get_items_expected_max() > 0 && !Option.get_type_name().empty())
        Names += " \\fI" + quoteLine(Option.get_type_name()) + "\\fR";
    return ".TP\n" + Names + "\n" + quoteLine(Option.get_description()) + "\n";
}

// What may follow an option: a shell command that fills COMPREPLY, or nothing.
std::string completionAfter(const CLI::Option& Option) {
    if (Option.check_lname("passes")) {
        std::string Names;
        for (const Pass& Each : passTable())
            Names += std::string(Names.empty() ? "" : " ") + Each.Name;
        return "_hpncg_list \"" + Names + "\"";
    }
    if (Option.get_type_name() == "DIR")
        return "COMPREPLY=($(compgen -d -- \"$word\"))";
    if (Option.get_type_name() == "FILE")
        return "COMPREPLY=($(compgen -f -- \"$word\"))";
    return "";
}

const char* const CompletionFrame = R"(# Completion of hpncg for bash.
_hpncg_list() { # WORDS: completes the last member of a list with commas
    local begun=
    [[ $word != *,* ]] || begun=${word%,*},
    COMPREPLY=($(compgen -P "$begun" -W "$1" -- "${word##*,}"))
}
_hpncg() {
    local word=${COMP_WORDS[COMP_CWORD]} option=${COMP_WORDS[COMP_CWORD - 1]}
    # The shell takes "--option=word" apart.
    [[ $word != = ]] || word=
    [[ $option != = ]] || option=${COMP_WORDS[COMP_CWORD - 2]}
    COMPREPLY=()
    case $option in
@CASES@    esac
    case $word in
    -*) COMPREPLY=($(compgen -W "@OPTIONS@" -- "$word")) ;;
    *) COMPREPLY=($(compgen -f -X '!*.hpn' -- "$word") $(compgen -d -S / -- "$word")) ;;
    esac
}
complete -o filenames -F _hpncg hpncg
)";

void replace(std::string& Text, const std::string& Mark, const std::string& By) {
    Text.replace(Text.find(Mark), Mark.size(), By);
}

} // namespace

std::string printManualPage(const CLI::App& App) {
    const std::string& Name = App.get_name();
    std::vector<std::string> Description = splitParagraphs(App.get_description()).front();
    const std::string Summary = Description.front().substr(Description.front().find(" - ") + 3);
    Description.front() = Name + ": " + Summary;
    std::string Text = ".TH " + Name + " 1 \"\" \"" + App.version() + "\"\n";
    Text += ".SH NAME\n" + Name + " \\- " + quoteLine(Summary) + "\n";
    Text += ".SH SYNOPSIS\n.B " + Name + "\n[\\fIoptions\\fR] \\fIfiles\\fR\n";
    Text += ".SH DESCRIPTION\n" + printLines(Description) + ".SH OPTIONS\n";
    for (const CLI::Option* pOption : App.get_options())
        if (isShown(*pOption))
            Text += printOption(*pOption);
    for (const std::vector<std::string>& Each : splitParagraphs(App.get_footer()))
        Text += ".SH " + headingOf(Each.front()) + "\n" + printLines(Each);
    return Text;
}

std::string printBashCompletion(const CLI::App& App) {
    std::string Cases;
    std::string Options;
    for (const CLI::Option* pOption : App.get_options()) {
        if (!isShown(*pOption))
            continue;
        std::string Names;
        for (const std::string& Word : wordsOf(*pOption)) {
            Options += (Options.empty() ? "" : " ") + Word;
            Names += (Names.empty() ? "" : " | ") + Word;
        }
        const std::string After = completionAfter(*pOption);
        if (!After.empty())
            Cases.append("    ").append(Names).append(") ").append(After).append("; return ;;\n");
    }
    std::string Text = CompletionFrame;
    replace(Text, "@CASES@", Cases);
    replace(Text, "@OPTIONS@", Options);
    return Text;
}

} // namespace hpn
