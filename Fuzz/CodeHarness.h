#ifndef CODEHARNESS_H
#define CODEHARNESS_H

#include "GraphInterpreter.h"

#include <string>
#include <vector>

namespace hpn::fuzz {

struct CodePair;

/// The C text that drives both variants of an emitted program (its names begin with `Prefix` and
/// "a_" or "b_") through the world of a run, and prints what can be seen: function `<Prefix>run`.
/// It stands behind both texts in the same file.
std::string writeHarness(const Program& Source, const std::string& Prefix, const RunOptions& Run,
                         const std::vector<WrittenValue>& Writes);
/// What the harness prints for each variant, if the variant does what the trace says.
std::string describeTrace(const Trace& Told, const Program& Source);

/// Programs that wait for the C compiler; several go through it at once.
class CodeBatch {
public:
    /// `Name` is shown when the program's variants differ; both texts and the harness carry this
    /// prefix.
    void add(std::string Name, CodePair Code);
    std::size_t size() const { return m_Entries.size(); }
    /// Compiles and runs all in a directory that exists. Empty if every variant printed what was
    /// expected, else the name of the first program that did not, a line end, what differs, and
    /// what the compiler said. Where the whole does not compile, each program is tried alone. The
    /// batch is empty afterwards.
    std::string run(const std::string& Directory, const std::string& RuntimeDirectory);
    static std::string prefixOf(std::size_t Number) { return "p" + std::to_string(Number) + "_"; }

private:
    struct Entry {
        std::string Name;
        std::string Prefix;
        std::string Expected;
        std::string Source;
    };
    static std::string compileAndRun(const std::vector<Entry>& Entries,
                                     const std::string& Directory,
                                     const std::string& RuntimeDirectory);
    static std::string checkOutput(const std::vector<Entry>& Entries, const std::string& Output);

    std::vector<Entry> m_Entries;
};

} // namespace hpn::fuzz

#endif
