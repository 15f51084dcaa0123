#ifndef PROGRAMCOMPARISON_H
#define PROGRAMCOMPARISON_H

#include "Emitter/CEmitter.h"
#include "Emitter/CLiterals.h"
#include "Graph/ProgramGraph.h"
#include "Model/Conversion.h"
#include "Oracles/CRunner.h"
#include "Oracles/ReadText.h"
#include "Road/PassRunner.h"
#include "Road/PassSequence.h"

#include <sstream>
#include <string>

/// Builds one C program out of many control programs, each in two variants: as it was built and
/// after the given passes. It drives both with the same inputs, lets externs write the same values,
/// calls exported procedures with the same arguments, and tells the first step in which an output,
/// an extern-visible variable, a result or the sequence of outside calls differs.
class ProgramComparison {
public:
    /// False, with messages, if the text is not accepted.
    bool add(const std::string& Text, const hpn::PassSequence& Passes, std::string& Messages) {
        const ReadText Read({{"test.hpn", Text}});
        Messages = Read.messages();
        if (!Read.isRead())
            return false;
        const hpn::Program& Source = Read.program();
        const std::string Stem = "p" + std::to_string(m_Count++);
        const std::string Before = emit(Source, Stem + "a_", hpn::PassSequence());
        const std::string After = emit(Source, Stem + "b_", Passes);
        m_Shortened += After.size() < Before.size();
        m_Programs << Before << After;
        writeExterns(Source, Stem, 'a');
        writeExterns(Source, Stem, 'b');
        writeRun(Source, Stem);
        m_Calls << "    failures += run_" << Stem << "();\n";
        return true;
    }

    /// Programs that the passes have made shorter.
    unsigned countShortened() const { return m_Shortened; }

    std::string text(int Steps) const {
        return "#include <stdio.h>\n#include <string.h>\n" + m_Programs.str() + head(Steps) +
               m_Drivers.str() + "int main(void) {\n    int failures = 0;\n" + m_Calls.str() +
               "    return failures != 0;\n}\n";
    }

    /// One variant's C text.
    static std::string emit(const hpn::Program& Source, const std::string& Prefix,
                            const hpn::PassSequence& Passes) {
        hpn::ProgramGraph Graph(Source);
        hpn::PassRunner(Graph).run(Passes);
        hpn::EmitOptions Options;
        Options.Prefix = Prefix;
        return hpn::emitProgram(Graph, Options).Source;
    }

private:
    static std::string head(int Steps) {
        return "enum { Steps = " + std::to_string(Steps) + R"c( };
static uint64_t random_state = 88172645463325252u;
static uint64_t extern_state[2];
static uint64_t trace[2];
static uint32_t draw(uint64_t *state) {
    *state = *state * 6364136223846793005u + 1442695040888963407u;
    return (uint32_t)(*state >> 33);
}
static int64_t draw_whole(uint64_t *state, int64_t low, int64_t high) {
    switch (draw(state) % 6u) {
    case 0: return low;
    case 1: return high;
    case 2: return low <= 0 ? 0 : low;
    case 3: return low <= 1 && high >= 1 ? 1 : high;
    case 4: { int64_t small = (int64_t)(draw(state) % 64u); return small > high ? high : small; }
    default: return low + (int64_t)((((uint64_t)draw(state) << 31) | draw(state)) % ((uint64_t)(high - low) + 1u));
    }
}
static double draw_double(uint64_t *state) {
    static const double numbers[] = {0.0, 1.0, -1.0, 0.5, -2.5, 100.0, 1e10, -3e9, 1e-3, 255.5};
    switch (draw(state) % 10u) {
    case 0: return hpn_infinity();
    case 1: return hpn_quiet_nan();
    case 2: return -0.0;
    case 3: return ((double)draw(state) - 1e9) / 1e3;
    default: return numbers[draw(state) % 10u];
    }
}
static uint64_t bits_of(double x) {
    uint64_t bits = 1;
    if (x == x) {
        memcpy(&bits, &x, sizeof bits);
    }
    return bits;
}
static uint64_t exact_bits_of(double x) {
    uint64_t bits;
    memcpy(&bits, &x, sizeof bits);
    return bits;
}
static void note(int variant, uint64_t bits) { trace[variant] = trace[variant] * 31u + bits; }
static int differs(const char *what, int step, uint64_t a, uint64_t b) {
    if (a != b) {
        printf("%s step %d: %016llx %016llx\n", what, step, (unsigned long long)a, (unsigned long long)b);
    }
    return a != b;
}
)c";
    }

    /// C text that draws a value of a storage.
    static std::string drawn(const hpn::Type& Of, const std::string& State) {
        const std::string Type = hpn::cTypeName(Of.Base);
        if (hpn::isFloating(Of.Base))
            return "(" + Type + ")draw_double(" + State + ")";
        return "(" + Type + ")draw_whole(" + State + ", " +
               std::to_string(hpn::smallestRaw(Of.Base)) + ", " +
               std::to_string(hpn::greatestRaw(Of.Base)) + ")";
    }

    template <class Visit>
    static void forEachElement(const hpn::Variable& Of, Visit&& visit) {
        const std::string Name(Of.Name);
        if (Of.Count == 0)
            visit(Name);
        for (std::uint32_t i = 0; i < Of.Count; ++i)
            visit(Name + "[" + std::to_string(i) + "]");
    }

    void writeExterns(const hpn::Program& Source, const std::string& Stem, char Variant) {
        const std::string Prefix = Stem + Variant + "_";
        const std::string Number = std::to_string(Variant - 'a');
        int Call = 7;
        for (const hpn::Extern& Outside : Source.Externs) {
            m_Drivers << "void " << Prefix << Outside.Name << "(void);\nvoid " << Prefix
                      << Outside.Name << "(void) {\n    note(" << Number << ", " << Call++
                      << ");\n";
            for (const hpn::Variable* pRead : Outside.Reads)
                forEachElement(*pRead, [&](const std::string& Name) {
                    m_Drivers << "    note(" << Number << ", bits_of(" << Prefix << Name << "));\n";
                });
            for (const hpn::Variable* pWritten : Outside.Writes)
                forEachElement(*pWritten, [&](const std::string& Name) {
                    m_Drivers << "    " << Prefix << Name << " = "
                              << drawn(*pWritten->pType, "&extern_state[" + Number + "]") << ";\n";
                });
            m_Drivers << "}\n";
        }
    }

    void writeExportedCalls(const hpn::Program& Source, const std::string& Stem) {
        for (const hpn::Procedure& Called : Source.Procedures) {
            if (!Called.IsExported)
                continue;
            m_Drivers << "        if (draw(&random_state) % 3u == 0u) {\n";
            std::string Arguments;
            for (const hpn::Variable* pFormal : Called.Formals) {
                m_Drivers << "            " << hpn::cTypeName(pFormal->pType->Base) << " "
                          << pFormal->Name << " = " << drawn(*pFormal->pType, "&random_state")
                          << ";\n";
                Arguments += (Arguments.empty() ? "" : ", ") + std::string(pFormal->Name);
            }
            const auto call = [&](char Variant) {
                return Stem + Variant + "_" + std::string(Called.Name) + "(" + Arguments + ")";
            };
            if (Called.pResult)
                m_Drivers << "            double ra = " << call('a')
                          << ";\n            double rb = " << call('b')
                          << ";\n            failed |= differs(\"" << Stem << " " << Called.Name
                          << "()\", step, bits_of(ra), bits_of(rb));\n";
            else
                m_Drivers << "            " << call('a') << ";\n            " << call('b') << ";\n";
            m_Drivers << "        }\n";
        }
    }

    void writeRun(const hpn::Program& Source, const std::string& Stem) {
        const std::string a = Stem + "a_";
        const std::string b = Stem + "b_";
        m_Drivers << "static int run_" << Stem
                  << "(void) {\n    int failed = 0;\n    extern_state[0] = extern_state[1] = 5u;\n"
                  << "    trace[0] = trace[1] = 0u;\n    " << a << Source.Name << "_init();\n    "
                  << b << Source.Name
                  << "_init();\n    for (int step = 0; step < Steps && !failed; ++step) {\n";
        for (const hpn::Variable& Declaration : Source.Variables)
            if (Declaration.Kind == hpn::VariableKind::Input)
                forEachElement(Declaration, [&](const std::string& Name) {
                    m_Drivers << "        if (draw(&random_state) % 2u == 0u) {\n            " << a
                              << Name << " = " << drawn(*Declaration.pType, "&random_state")
                              << ";\n            " << b << Name << " = " << a << Name
                              << ";\n        }\n";
                });
        m_Drivers << "        " << a << Source.Name << "_step();\n        " << b << Source.Name
                  << "_step();\n";
        writeExportedCalls(Source, Stem);
        for (const hpn::Variable& Declaration : Source.Variables)
            if (Declaration.Kind == hpn::VariableKind::Output)
                forEachElement(Declaration, [&](const std::string& Name) {
                    m_Drivers << "        failed |= differs(\"" << Stem << " " << Name
                              << "\", step, exact_bits_of(" << a << Name << "), exact_bits_of(" << b
                              << Name << "));\n";
                });
        m_Drivers << "        failed |= differs(\"" << Stem
                  << " outside calls\", step, trace[0], trace[1]);\n    }\n    return failed;\n}\n";
    }

    int m_Count = 0;
    unsigned m_Shortened = 0;
    std::ostringstream m_Programs;
    std::ostringstream m_Drivers;
    std::ostringstream m_Calls;
};

#endif
