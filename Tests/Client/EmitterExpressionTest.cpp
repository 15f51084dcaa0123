#include "Emitter/CLiterals.h"
#include "Emitter/ExpressionWriter.h"
#include "Generators/EmittedExpressions.h"
#include "Oracles/CRunner.h"
#include "ZfCSSAControl.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <deque>
#include <limits>
#include <memory>
#include <random>
#include <sstream>
#include <string>
#include <vector>

namespace hpn {
namespace {

using namespace test;

// Random expressions over variables of all kinds of types, written as C, compiled, run on random
// operands from the borders of their types, and compared with the client's own arithmetic on the
// same operands.

constexpr int NumberOfExpressions = 500;
constexpr int NumberOfOperandSets = 40;

class Names : public VariableNames {
public:
    std::string_view nameOf(const Variable& Declaration) const override { return Declaration.Name; }
};

std::string bitsOf(double Number) {
    char Text[24];
    std::uint64_t Bits = 0;
    std::memcpy(&Bits, &Number, sizeof Bits);
    std::snprintf(Text, sizeof Text, "%016llx", static_cast<unsigned long long>(Bits));
    return std::isnan(Number) ? "nan" : Text;
}

struct Sample {
    Term* pTerm;
    const Type* pTarget;
};

std::string functionText(const Sample& Of, int Number, const VariableNames& Scope) {
    std::string Text;
    ExpressionWriter Writer(Scope, Text);
    Text += "static void e" + std::to_string(Number) + "(void) {\n    ";
    Text += std::string(cTypeName(Of.pTarget->Base)) + " y = ";
    Writer.writeStored(Of.pTerm, *Of.pTarget, Number % 2 == 0);
    Text += ";\n    show(y);\n    if (";
    Writer.writeCondition(Of.pTerm, false);
    Text += ") {\n        putchar('1');\n    }\n    if (";
    Writer.writeCondition(Of.pTerm, true);
    return Text + ") {\n        putchar('0');\n    }\n    putchar('\\n');\n}\n";
}

std::string programText(const std::vector<Sample>& Samples, const std::vector<Operands>& Sets,
                        Workbench& Bench) {
    std::ostringstream Text;
    Text << "#include <stdbool.h>\n#include <stdint.h>\n#include <stdio.h>\n#include "
            "<string.h>\n#include \"hpn_runtime.h\"\n";
    for (const auto& pVariable : Bench.variables()) {
        const Variable& Declaration = pVariable->getDeclaration();
        Text << "static " << cTypeName(Declaration.pType->Base) << ' ' << Declaration.Name;
        Text << (Declaration.Count ? "[" + std::to_string(Declaration.Count) + "]" : "") << ";\n";
    }
    Text << "static void show(double y) {\n    uint64_t bits;\n    memcpy(&bits, &y, sizeof "
            "bits);\n    if (y != y) {\n"
            "        printf(\"nan \");\n    } else {\n        printf(\"%016llx \", (unsigned long "
            "long)bits);\n    }\n}\n";
    const Names Scope;
    for (std::size_t i = 0; i < Samples.size(); ++i)
        Text << functionText(Samples[i], static_cast<int>(i), Scope);
    Text << "static void all(void) {\n";
    for (std::size_t i = 0; i < Samples.size(); ++i)
        Text << "    e" << i << "();\n";
    Text << "}\nint main(void) {\n";
    for (const Operands& Set : Sets) {
        for (std::size_t v = 0; v < Set.size(); ++v) {
            const Variable& Declaration = Bench.variables()[v]->getDeclaration();
            for (std::size_t i = 0; i < Set[v].size(); ++i) {
                std::string Number;
                appendStored(Number, Set[v][i], *Declaration.pType);
                Text << "    " << Declaration.Name
                     << (Declaration.Count ? "[" + std::to_string(i) + "]" : "") << " = " << Number
                     << ";\n";
            }
        }
        Text << "    all();\n";
    }
    Text << "    return 0;\n}\n";
    return Text.str();
}

std::string expectedLine(const Sample& Of, const Operands& Set) {
    const double Number = evaluate(Of.pTerm, Set);
    double Stored = Number; // the root is the conversion to the target
    if (!isFloating(Of.pTarget->Base))
        Stored = static_cast<double>(rawOfNumber(Stored, *Of.pTarget));
    return bitsOf(Stored) + ' ' + (Number != 0.0 ? '1' : '0');
}

/// Boots the library for a scope.
class LibraryRun {
public:
    LibraryRun() { m_Control.boot(); }
    ~LibraryRun() { m_Control.shutdown(); }

private:
    ZfCSSAControl m_Control;
};

void compareWithOracle(unsigned Seed) {
    const LibraryRun Library;
    Workbench Bench;
    TermArena Terms;
    ExpressionMaker Maker(Bench, Terms, Seed);
    std::mt19937 Random(Seed + 1);
    std::vector<Sample> Samples;
    for (int i = 0; i < NumberOfExpressions; ++i) {
        const Type& Target = Maker.type();
        Samples.push_back({Maker.make(1 + i % 4), &Target});
        Samples.back().pTerm = Terms.makeCast(&Target, Samples.back().pTerm);
    }
    std::vector<Operands> Sets(NumberOfOperandSets);
    for (Operands& Set : Sets)
        for (const auto& pVariable : Bench.variables()) {
            Set.emplace_back();
            for (std::uint32_t i = 0; i < std::max(pVariable->getDeclaration().Count, 1u); ++i)
                Set.back().push_back(randomStored(pVariable->getType(), Random));
        }
    CRunner Runner;
    Runner.write("e.c", programText(Samples, Sets, Bench));
    ASSERT_EQ(Runner.compile("e", "-O1 -fsanitize=undefined -fno-sanitize-recover=all"), "");
    std::istringstream Output(Runner.run("e"));
    std::string Line;
    const Names Scope;
    int Faults = 0;
    for (const Operands& Set : Sets)
        for (std::size_t i = 0; i < Samples.size(); ++i) {
            ASSERT_TRUE(std::getline(Output, Line));
            const std::string Expected = expectedLine(Samples[i], Set);
            EXPECT_EQ(Line, Expected) << functionText(Samples[i], static_cast<int>(i), Scope);
            Faults += Line != Expected;
            if (Faults > 5) {
                Runner.keep();
                FAIL() << Runner.directory();
            }
        }
}

TEST(EmitterExpression, CGivesTheNumbersOfTheModel) {
    for (unsigned Seed : {1u, 2u, 3u})
        compareWithOracle(Seed);
}

} // namespace
} // namespace hpn
