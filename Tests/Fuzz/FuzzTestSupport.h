#ifndef FUZZTESTSUPPORT_H
#define FUZZTESTSUPPORT_H

#include "GraphInterpreter.h"
#include "PassTrial.h"

#include "Language/Diagnostics.h"
#include "Language/Reader.h"
#include "Language/SourceFiles.h"

#include <cstring>
#include <string>
#include <vector>

namespace hpn::fuzz::test {

/// The graph of a program text, as it was built.
struct BuiltProgram {
    explicit BuiltProgram(const std::string& Text) : m_Messages(m_Sources) {
        m_Sources.add("fuzz.hpn", Text);
        IsRead = readProgram(m_Sources, m_Messages, Source);
        Messages = m_Messages.print();
    }

    Program Source;
    bool IsRead = false;
    std::string Messages;

private:
    SourceFiles m_Sources;
    Diagnostics m_Messages;
};

/// The outputs after each step of the program as it was built.
inline std::vector<double> outputsOf(const std::string& Text, unsigned Steps) {
    BuiltProgram Built(Text);
    if (!Built.IsRead)
        return {};
    ProgramGraph Graph(Built.Source);
    const GraphCode Code = readGraph(Graph);
    RunOptions Options;
    Options.Steps = Steps;
    std::vector<double> Numbers;
    for (const std::uint64_t Bits : GraphInterpreter(Code, Built.Source).run(Options).Outputs) {
        double Number;
        std::memcpy(&Number, &Bits, sizeof Number);
        Numbers.push_back(Number);
    }
    return Numbers;
}

inline Trial trialOf(const std::string& Text) {
    Trial Result;
    Result.Text = Text;
    Result.Passes = PassSequence::defaultOrder();
    return Result;
}

} // namespace hpn::fuzz::test

#endif
