#include "Oracles/HostShell.h"
#include "Shrinker.h"

#include "Language/Diagnostics.h"
#include "Language/Reader.h"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

// hpnreduce HPNCG PROGRAM CHECK [OPTION]...: the work behind Scripts/reduce.

namespace {

constexpr unsigned MostAttempts = 20000;

std::string quote(const std::string& Word) {
    std::string Text = "'";
    for (const char Letter : Word)
        Text += Letter == '\'' ? std::string("'\\''") : std::string(1, Letter);
    return Text + "'";
}

std::string readText(const std::string& Path) {
    std::ifstream Stream(Path, std::ios::binary);
    return {std::istreambuf_iterator<char>(Stream), {}};
}

// Most of what the shrinker tries is no program; that is seen without starting a process.
bool isProgram(const std::string& Text) {
    hpn::SourceFiles Sources;
    Sources.add("program.hpn", Text);
    hpn::Diagnostics Messages(Sources);
    hpn::Program Read;
    return hpn::readProgram(Sources, Messages, Read);
}

// Asks the user's check about a text. One whose driver reports mistakes or wrong use is no program,
// and so no failure.
class Check {
public:
    Check(const std::string& Driver, const std::string& Command,
          const std::vector<std::string>& Options) {
        m_Directory = hostshell::makeDirectory("hpnreduce");
        const std::string Source = quote(m_Directory + "/program.hpn");
        const std::string Code = quote(m_Directory + "/program.c");
        const std::string Quiet = " >/dev/null 2>&1";
        m_Generate = quote(Driver) + " " + Source + " -o " + Code;
        for (const std::string& Option : Options)
            m_Generate += " " + quote(Option);
        m_Generate += Quiet;
        m_Print = quote(Driver) + " --print " + Source + " -o " +
                  quote(m_Directory + "/printed.hpn") + Quiet;
        m_Ask = "timeout 60 bash -c " + quote(Command + " \"$@\"") + " check " + Code + " " +
                Source + Quiet;
    }
    ~Check() {
        std::error_code Ignored;
        std::filesystem::remove_all(m_Directory, Ignored);
    }
    Check(const Check&) = delete;
    Check& operator=(const Check&) = delete;

    bool fails(const std::string& Text) {
        if (Text == m_LastFailing)
            return true;
        if (!isProgram(Text))
            return false;
        std::error_code Ignored;
        std::filesystem::remove(m_Directory + "/program.c", Ignored);
        std::ofstream(m_Directory + "/program.hpn", std::ios::binary) << Text;
        const int Status = hostshell::status(m_Generate);
        if (Status == 1 || Status == 2 || hostshell::status(m_Ask) == 0)
            return false;
        m_LastFailing = Text;
        return true;
    }

    // The text with one statement in a line, as it was asked about last.
    std::string printed() {
        return hostshell::status(m_Print) == 0 ? readText(m_Directory + "/printed.hpn") : "";
    }

private:
    std::string m_Directory;
    std::string m_Generate;
    std::string m_Print;
    std::string m_Ask;
    std::string m_LastFailing;
};

} // namespace

int main(int argc, char** argv) {
    if (argc < 4) {
        std::fputs("hpnreduce: wants HPNCG PROGRAM CHECK [OPTION]...\n", stderr);
        return 2;
    }
    hpn::fuzz::Trial Failing;
    Failing.Text = readText(argv[2]);
    if (Failing.Text.empty()) {
        std::fprintf(stderr, "hpnreduce: cannot read '%s'\n", argv[2]);
        return 2;
    }
    Check Asked(argv[1], argv[3], {argv + 4, argv + argc});
    if (!Asked.fails(Failing.Text)) {
        std::fputs("hpnreduce: the check does not fail, or the text is no program\n", stderr);
        return 1;
    }
    // Whole lines go more easily when each holds one statement.
    const std::string Printed = Asked.printed();
    if (!Printed.empty() && Asked.fails(Printed))
        Failing.Text = Printed;
    const auto Question = [&Asked](const hpn::fuzz::Trial& Smaller) {
        return Asked.fails(Smaller.Text);
    };
    const hpn::fuzz::Trial Small = hpn::fuzz::Shrinker(Question, MostAttempts).shrink(Failing);
    std::fputs(Small.Text.c_str(), stdout);
    return 0;
}
