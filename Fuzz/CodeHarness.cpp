#include "CodeHarness.h"

#include "PassTrial.h"

#include "Oracles/HostShell.h"

#include "Emitter/CLiterals.h"
#include "Model/Conversion.h"

#include <cstdio>
#include <cstring>
#include <fstream>

// What is printed, one line each: "E n" a call of extern n, "C n" a call from outside of procedure
// n, "S" the end of a step, and behind each the values that it shows: raw numbers of integers, bits
// of floating ones. The interpreter's trace is put into the same words.

namespace hpn::fuzz {

namespace {

std::uint64_t bitsOf(double Number) {
    std::uint64_t Bits;
    std::memcpy(&Bits, &Number, sizeof Bits);
    return Bits;
}

double numberOfBits(std::uint64_t Bits) {
    double Number;
    std::memcpy(&Number, &Bits, sizeof Number);
    return Number;
}

std::string hexOf(std::uint64_t Bits) {
    char Text[24];
    std::snprintf(Text, sizeof Text, "%llx", static_cast<unsigned long long>(Bits));
    return Text;
}

std::string shownValue(std::uint64_t Bits, const Type& Of) {
    const double Number = numberOfBits(Bits);
    return " " + (isFloating(Of.Base) ? hexOf(visibleBits(Number))
                                      : std::to_string(rawOfNumber(Number, Of)));
}

// A number as a C constant of the storage's type.
std::string storedConstant(double Number, const Type& Of) {
    if (isFloating(Of.Base))
        return std::string("(") + cTypeName(Of.Base) + ")hpn_from_bits(UINT64_C(0x" +
               hexOf(bitsOf(Number)) + "))";
    return std::string("(") + cTypeName(Of.Base) + ")INT64_C(" +
           std::to_string(rawOfNumber(Number, Of)) + ")";
}

// Writes the functions for one variant.
class VariantWriter {
public:
    VariantWriter(const Program& Source, const std::string& Prefix, const RunOptions& Run,
                  std::string& Text)
        : m_Source(Source), m_Prefix(Prefix), m_Run(Run), m_World(Run.StimulusSeed), m_Text(Text) {}

    void write(const std::string& Table) {
        for (std::size_t i = 0; i < m_Source.Externs.size(); ++i)
            writeExtern(i, Table);
        for (unsigned Step = 0; Step < m_Run.Steps; ++Step)
            writeStep(Step);
        m_Text += "static void " + m_Prefix + "all(void) {\n    " + Table + "next = 0;\n    " +
                  m_Prefix + "fuzz_init();\n";
        for (unsigned Step = 0; Step < m_Run.Steps; ++Step)
            m_Text += "    " + m_Prefix + "run" + std::to_string(Step) + "();\n";
        m_Text += "}\n";
    }

private:
    std::string nameOf(std::string_view Name) const { return m_Prefix + std::string(Name); }
    std::string elementOf(const Variable& Of, std::uint32_t Element) const {
        return nameOf(Of.Name) + (Of.Count != 0 ? "[" + std::to_string(Element) + "]" : "");
    }
    static std::uint32_t countOf(const Variable& Of) { return Of.Count == 0 ? 1 : Of.Count; }
    void show(const std::string& Name, const Type& Of) {
        m_Text += std::string(isFloating(Of.Base) ? "    fuzz_number(" : "    fuzz_whole(") + Name +
                  ");\n";
    }
    void showVariable(const Variable& Shown) {
        for (std::uint32_t i = 0; i < countOf(Shown); ++i)
            show(elementOf(Shown, i), *Shown.pType);
    }
    void writeExtern(std::size_t Number, const std::string& Table) {
        const Extern& Called = m_Source.Externs[Number];
        m_Text += "void " + nameOf(Called.Name) + "(void);\nvoid " + nameOf(Called.Name) +
                  "(void) {\n    printf(\"\\nE " + std::to_string(Number) + "\");\n";
        for (const Variable* pRead : Called.Reads)
            showVariable(*pRead);
        for (const Variable* pWritten : Called.Writes) {
            for (std::uint32_t i = 0; i < countOf(*pWritten); ++i)
                m_Text += "    " + elementOf(*pWritten, i) + " = (" +
                          cTypeName(pWritten->pType->Base) + ")" +
                          (isFloating(pWritten->pType->Base) ? "" : "(int64_t)") + "fuzz_take(" +
                          Table + "table, &" + Table + "next);\n";
        }
        m_Text += "}\n";
    }
    void writeStep(unsigned Step) {
        m_Text += "static void " + m_Prefix + "run" + std::to_string(Step) + "(void) {\n";
        for (const Variable& Each : m_Source.Variables) {
            for (std::uint32_t i = 0; Each.Kind == VariableKind::Input && i < countOf(Each); ++i)
                m_Text += "    " + elementOf(Each, i) + " = " +
                          storedConstant(m_World.input(Step, Each, i), *Each.pType) + ";\n";
        }
        for (const Procedure& Each : m_Source.Procedures) {
            if (Each.IsExported && m_World.callsExported(Step, Each))
                writeCall(Step, Each);
        }
        m_Text += "    " + m_Prefix + "fuzz_step();\n    printf(\"\\nS\");\n";
        for (const Variable& Each : m_Source.Variables) {
            if (Each.Kind == VariableKind::Output)
                showVariable(Each);
        }
        m_Text += "}\n";
    }
    void writeCall(unsigned Step, const Procedure& Exported) {
        std::string Call = nameOf(Exported.Name) + "(";
        for (unsigned i = 0; i < Exported.Formals.size(); ++i)
            Call += (i == 0 ? "" : ", ") + storedConstant(m_World.argument(Step, Exported, i),
                                                          *Exported.Formals[i]->pType);
        m_Text += "    printf(\"\\nC " + std::to_string(Exported.Index) + "\");\n";
        if (Exported.pResult != nullptr)
            show(Call + ")", *Exported.pResult->pType);
        else
            m_Text += "    " + Call + ");\n";
    }

    const Program& m_Source;
    const std::string m_Prefix;
    const RunOptions& m_Run;
    Stimulus m_World;
    std::string& m_Text;
};

constexpr int MostMessageLines = 12; // of a compiler

const char* const HarnessHead = R"(#include <stdio.h>
#include <stdint.h>
#include <stdbool.h>
#include "hpn_runtime.h"
static inline void fuzz_whole(int64_t n) { printf(" %lld", (long long)n); }
static inline void fuzz_number(double x) { union { double x; uint64_t bits; } v; v.x = hpn_nan(x); printf(" %llx", (unsigned long long)v.bits); }
static inline double fuzz_take(const uint64_t* table, unsigned* next) { return hpn_from_bits(table[(*next)++ % (unsigned)table[0] + 1]); }
)";

} // namespace

std::string writeHarness(const Program& Source, const std::string& Prefix, const RunOptions& Run,
                         const std::vector<WrittenValue>& Writes) {
    // Element 0 is the number of those that follow, so that a variant that takes too many still
    // ends.
    std::string Text = "static const uint64_t " + Prefix + "table[] = {" +
                       std::to_string(Writes.empty() ? 1 : Writes.size());
    if (Writes.empty())
        Text += ", 0";
    for (const WrittenValue& Each : Writes) {
        const Type& Of = *Each.pVariable->pType;
        const double Stored =
            isFloating(Of.Base) ? Each.Number : static_cast<double>(rawOfNumber(Each.Number, Of));
        Text += ", UINT64_C(0x" + hexOf(bitsOf(Stored)) + ")";
    }
    Text += "};\nstatic unsigned " + Prefix + "next;\n";
    for (const char* pVariant : {"a_", "b_"})
        VariantWriter(Source, Prefix + pVariant, Run, Text).write(Prefix);
    Text += "static void " + Prefix + "run(void) {\n    (void)" + Prefix +
            "table;\n    printf(\"\\n# " + Prefix + "a\");\n    " + Prefix +
            "a_all();\n    printf(\"\\n# " + Prefix + "b\");\n    " + Prefix + "b_all();\n}\n";
    return Text;
}

std::string describeTrace(const Trace& Told, const Program& Source) {
    std::string Text;
    std::size_t Event = 0;
    std::size_t Output = 0;
    const auto showVariable = [&](const Variable& Of, const std::vector<std::uint64_t>& From,
                                  std::size_t& Place) {
        for (std::uint32_t i = 0; i < (Of.Count == 0 ? 1 : Of.Count); ++i)
            Text += shownValue(From[Place++], *Of.pType);
    };
    for (unsigned Step = 0; Step < Told.CompleteSteps; ++Step) {
        while (Event < Told.EventsAfterStep[Step]) {
            const std::uint64_t Head = Told.Events[Event++];
            const std::uint32_t Number = numberOfEvent(Head);
            const EventKind Kind = kindOfEvent(Head);
            if (Kind == EventKind::OutsideCall)
                Text += "\nC " + std::to_string(Number);
            if (Kind == EventKind::OutsideResult)
                Text += shownValue(Told.Events[Event++], *Source.Procedures[Number].pResult->pType);
            if (Kind != EventKind::ExternCalled)
                continue;
            Text += "\nE " + std::to_string(Number);
            for (const Variable* pRead : Source.Externs[Number].Reads)
                showVariable(*pRead, Told.Events, Event);
        }
        Text += "\nS";
        for (const Variable& Each : Source.Variables) {
            if (Each.Kind == VariableKind::Output)
                showVariable(Each, Told.Outputs, Output);
        }
    }
    return Text;
}

// ---- batches ----

void CodeBatch::add(std::string Name, CodePair Code) {
    const std::size_t End = Code.Harness.find("_table[]");
    const std::size_t Start = Code.Harness.rfind(' ', End) + 1;
    m_Entries.push_back({std::move(Name), Code.Harness.substr(Start, End + 1 - Start),
                         std::move(Code.Expected),
                         Code.Unoptimised + Code.Optimised + Code.Harness});
}

std::string CodeBatch::run(const std::string& Directory, const std::string& RuntimeDirectory) {
    std::string Difference = compileAndRun(m_Entries, Directory, RuntimeDirectory);
    // Where nothing ran, any of them can be to blame.
    for (std::size_t i = 0; i < m_Entries.size() && m_Entries.size() > 1; ++i) {
        if (Difference.empty())
            break;
        std::string Alone = compileAndRun({m_Entries[i]}, Directory, RuntimeDirectory);
        if (!Alone.empty()) {
            Difference = std::move(Alone);
            break;
        }
    }
    m_Entries.clear();
    return Difference;
}

std::string CodeBatch::compileAndRun(const std::vector<Entry>& Entries,
                                     const std::string& Directory,
                                     const std::string& RuntimeDirectory) {
    std::string Source = HarnessHead;
    for (const Entry& Each : Entries)
        Source += Each.Source;
    Source += "int main(void) {\n";
    for (const Entry& Each : Entries)
        Source += "    " + Each.Prefix + "run();\n";
    Source += "    printf(\"\\n# end\\n\");\n    return 0;\n}\n";
    std::ofstream(Directory + "/batch.c", std::ios::binary) << Source;
    const std::string Command =
        "cd '" + Directory + "' && gcc -std=c99 -O1 -Wall -Wextra -Werror -I'" + RuntimeDirectory +
        "' batch.c -o batch >messages 2>&1 && timeout 120 ./batch";
    int Status = 0;
    const std::string Output = hostshell::run(Command, Status);
    std::string Difference = checkOutput(Entries, Output);
    if (Difference.empty() && Status != 0)
        Difference =
            Entries.front().Name + "\nthe batch ended with status " + std::to_string(Status);
    if (!Difference.empty()) { // what the compiler says of it, if it says anything
        std::ifstream Messages(Directory + "/messages", std::ios::binary);
        std::string Line;
        for (int i = 0; i < MostMessageLines && std::getline(Messages, Line); ++i)
            Difference += '\n' + Line;
    }
    return Difference;
}

std::string CodeBatch::checkOutput(const std::vector<Entry>& Entries, const std::string& Output) {
    for (const Entry& Each : Entries) {
        for (const char* pVariant : {"a", "b"}) {
            const std::string Head = "\n# " + Each.Prefix + pVariant;
            const std::size_t Start = Output.find(Head + "\n");
            const std::size_t End =
                Start == std::string::npos ? Start : Output.find("\n#", Start + 1);
            if (End == std::string::npos)
                return Each.Name + "\nvariant " + pVariant + ": does not compile or does not end";
            const std::string Got = Output.substr(Start + Head.size(), End - Start - Head.size());
            if (Got != Each.Expected)
                return Each.Name + "\nvariant " + pVariant + " printed" + Got + "\nexpected" +
                       Each.Expected;
        }
    }
    return {};
}

} // namespace hpn::fuzz
