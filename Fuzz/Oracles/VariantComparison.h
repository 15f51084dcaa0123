#ifndef VARIANTCOMPARISON_H
#define VARIANTCOMPARISON_H

// The C texts that choices and orders of passes make of one program, as many as differ: compiled
// into one program, driven with the same inputs, and compared step by step with the first.

#include "Emitter/CEmitter.h"
#include "Emitter/CLiterals.h"
#include "Graph/ProgramGraph.h"
#include "Language/Reader.h"
#include "Model/Conversion.h"
#include "Oracles/CRunner.h"
#include "Road/PassRunner.h"

#include <algorithm>
#include <map>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

namespace hpn::test {

// Of every name in a variant, taken away for its number.
inline const std::string Mark = "variant_";

// The first variant's hashes are what the others have to give.
inline const char* const VariantHead = R"c(#include <stdint.h>
#include <stdio.h>
#include <string.h>
enum { Steps = 12000 };
static uint64_t seen[Steps];
static uint64_t random_state, hash;
static int is_first = 1;
static int64_t draw(int64_t low, int64_t high) {
    random_state = random_state * 6364136223846793005u + 1442695040888963407u;
    return low + (int64_t)((random_state >> 33) % ((uint64_t)(high - low) + 1u));
}
/* Mostly a small move, seldom a jump. */
static int64_t vary(int64_t old, int64_t low, int64_t high) {
    int64_t next = old + draw(-8, 8);
    if (high - low < 64 || old < low || old > high || draw(0, 31) == 0)
        return draw(low, high);
    return next < low ? low : next > high ? high : next;
}
static void note(const void *at, size_t size) {
    for (const unsigned char *p = at; size-- > 0; ++p)
        hash = (hash ^ *p) * 1099511628211u;
}
static void begin(void) { random_state = 88172645463325252u; hash = 1u; }
static int end_step(int step, const char *variant) {
    if (is_first)
        seen[step] = hash;
    else if (seen[step] != hash)
        printf("%s differs in step %d\n", variant, step);
    return !is_first && seen[step] != hash;
}
)c";

inline void replaceAll(std::string& Text, const std::string& Old, const std::string& New) {
    for (std::size_t i = Text.find(Old); i != std::string::npos; i = Text.find(Old, i + New.size()))
        Text.replace(i, Old.size(), New);
}

/// One example program and its distinct C texts.
class Variants {
public:
    /// The text of a program, and a line "name low high" for each input that has normal values.
    Variants(const std::string& Name, const std::string& Text, const std::string& Inputs) {
        Sources.add(Name, Text);
        Diagnostics Messages(Sources);
        if (!readProgram(Sources, Messages, Source))
            Faults = Messages.print();
        std::istringstream Normal(Inputs);
        for (std::string Line; std::getline(Normal, Line);) {
            std::istringstream Words(Line);
            std::string Input;
            std::pair<long, long> Range;
            if (Words >> Input >> Range.first >> Range.second)
                NormalInputs[Input] = Range;
        }
    }

    void add(const PassSequence& Passes) {
        ProgramGraph Graph(Source);
        PassRunner(Graph).run(Passes);
        EmitOptions Options;
        Options.Prefix = Mark;
        const std::string Text = emitProgram(Graph, Options).Source;
        ++Count;
        if (NumberOf.emplace(Text, Texts.size()).second) {
            Texts.push_back(Text);
            std::string Names;
            for (const PassId Id : Passes.getPasses())
                Names += std::string(Names.empty() ? "" : ",") + passOf(Id).Name;
            Descriptions.push_back(Names);
        }
    }

    /// What the compared steps say: nothing if all is well.
    std::string compare() const {
        if (!Faults.empty())
            return Faults;
        CRunner Runner;
        std::string All = VariantHead;
        std::string Main;
        for (std::size_t i = 0; i < Texts.size(); ++i) {
            const std::string Name = "v" + std::to_string(i) + "_";
            std::string Text = Texts[i] + externs() + run(Descriptions[i]);
            replaceAll(Text, Mark, Name);
            All += Text;
            Main += "    failures += " + Name + "run();\n    is_first = 0;\n";
        }
        Runner.write("all.c", All + "int main(void) {\n    int failures = 0;\n" + Main +
                                  "    return failures != 0;\n}\n");
        const std::string Messages = Runner.compile("all", "-O1");
        return Messages.empty() ? Runner.run("all") : Messages;
    }

    std::size_t countRuns() const { return Count; }
    std::size_t countTexts() const { return Texts.size(); }

private:
    std::string externs() const {
        std::string Text;
        for (const Extern& Outside : Source.Externs) {
            const std::string Head = "void " + Mark + std::string(Outside.Name) + "(void)";
            Text += Head + ";\n" + Head + " {\n    note(\"call\", 4);\n";
            for (const Variable* pRead : Outside.Reads)
                Text += "    " + noteOf(*pRead);
            Text += "}\n";
        }
        return Text;
    }

    static std::string noteOf(const Variable& Noted) {
        const std::string Name = Mark + std::string(Noted.Name);
        return "note(&" + Name + ", sizeof " + Name + ");\n";
    }

    /// Inputs change often or hardly ever, by phases, so that timers can run out; in two phases of
    /// three they stay inside what is normal for them, else they now and then become anything.
    std::string setInput(const Variable& Input) const {
        const BaseType Base = Input.pType->Base;
        const std::string Name = Mark + std::string(Input.Name);
        const auto Normal = NormalInputs.find(std::string(Input.Name));
        const long Low = isFloating(Base) ? -1000 : static_cast<long>(smallestRaw(Base));
        const long High = isFloating(Base) ? 1000 : static_cast<long>(greatestRaw(Base));
        const auto drawn = [&](const std::string& Call, long a, long b) {
            return "(" + std::string(cTypeName(Base)) + ")" + Call + std::to_string(a) + ", " +
                   std::to_string(b) + ")";
        };
        const std::string Wild = drawn("draw(", Low, High);
        const std::string Vary = "vary((int64_t)" + Name + ", ";
        const std::string Usual = Normal != NormalInputs.end()
                                      ? drawn(Vary, Normal->second.first, Normal->second.second)
                                      : drawn(Vary, Low, std::min(High, 6L));
        return "        if (draw(0, rate) == 0) " + Name + " = wild && draw(0, 3) == 0 ? " + Wild +
               " : " + Usual + ";\n";
    }

    std::string run(const std::string& Description) const {
        std::string Text =
            "int " + Mark + "run(void);\nint " + Mark + "run(void) {\n    begin();\n";
        Text += "    " + Mark + Source.Name + "_init();\n";
        for (const Variable& Each : Source.Variables)
            if (Each.Kind == VariableKind::Input)
                Text += "    " + Mark + std::string(Each.Name) + " = 0;\n";
        Text += "    int rate = 0, wild = 0;\n    for (int step = 0; step < Steps; ++step) {\n"
                "        if (step % 600 == 0) {\n            rate = 1 << (3 * draw(0, 3));\n"
                "            wild = draw(0, 2) == 0;\n        }\n";
        for (const Variable& Each : Source.Variables)
            if (Each.Kind == VariableKind::Input)
                Text += setInput(Each);
        Text += "        " + Mark + Source.Name + "_step();\n";
        for (const Procedure& Each : Source.Procedures) {
            if (!Each.IsExported)
                continue;
            Text += "        if (draw(0, 63) == 0) " + Mark + std::string(Each.Name) + "(";
            for (std::size_t i = 0; i < Each.Formals.size(); ++i)
                Text += i == 0 ? "(double)draw(0, 100)" : ", 1";
            Text += ");\n";
        }
        for (const Variable& Each : Source.Variables)
            if (Each.Kind == VariableKind::Output)
                Text += "        " + noteOf(Each);
        return Text + "        if (end_step(step, \"" + Description +
               "\"))\n            return 1;\n    }\n    return 0;\n}\n";
    }

    SourceFiles Sources;
    std::string Faults; // of the reading
    Program Source;
    std::map<std::string, std::pair<long, long>> NormalInputs;
    std::map<std::string, std::size_t> NumberOf;
    std::vector<std::string> Texts;
    std::vector<std::string> Descriptions;
    std::size_t Count = 0;
};

} // namespace hpn::test

#endif
