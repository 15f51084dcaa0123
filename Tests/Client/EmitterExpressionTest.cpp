#include "Emitter/CLiterals.h"
#include "Emitter/ExpressionWriter.h"
#include "Model/Conversion.h"
#include "Model/ZfCCfgSFVariable.h"
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

// Random expressions over variables of all kinds of types, written as C, compiled, run on random
// operands from the borders of their types, and compared with the client's own arithmetic on the
// same operands.

constexpr int NumberOfExpressions = 500;
constexpr int NumberOfOperandSets = 40;
constexpr std::uint32_t TableSize = 5;

class Names : public VariableNames {
public:
    std::string_view nameOf(const Variable& Declaration) const override { return Declaration.Name; }
};

/// The types, a scalar of each and two arrays.
class Workbench {
public:
    Workbench() {
        for (int i = 0; i <= static_cast<int>(BaseType::Float64); ++i)
            addType(static_cast<BaseType>(i));
        addScaled(BaseType::UInt16, 0.01, 0.0, 0.0, 300.0, true, true);
        addScaled(BaseType::Int16, 0.5, -40.0, -100.0, 100.0, false, true);
        addScaled(BaseType::UInt32, 2.0, 0.0, 0.0, 0.0, false, false);
        addScaled(BaseType::Int32, 0.125, 1000.0, 0.0, 0.0, false, false);
        addScaled(BaseType::UInt8, 1.0, -128.0, -100.0, 100.0, true, false);
        addLimited(BaseType::UInt8, 10.0, 200.0);
        addLimited(BaseType::Int32, -1000000.0, 2000000000.0);
        addLimited(BaseType::UInt32, 5.0, 4000000000.0);
        addLimited(BaseType::Float32, -2.5, 1e10);
        addLimited(BaseType::Float64, 0.0, 1e300);
        for (const Type& Of : m_Types)
            addVariable(Of, 0);
        addVariable(m_Types[3], TableSize);
        addVariable(m_Types[9], TableSize);
    }

    const std::deque<Type>& types() const { return m_Types; }
    std::vector<std::unique_ptr<ZfCCfgSFVariable>>& variables() { return m_Variables; }

private:
    Type& addType(BaseType Base) {
        Type Of;
        Of.Base = Base;
        m_Types.push_back(Of);
        return m_Types.back();
    }
    void addLimited(BaseType Base, double Lower, double Upper) {
        Type& Of = addType(Base);
        Of.IsBuiltIn = false;
        Of.HasRange = Of.SaturatesLow = Of.SaturatesHigh = true;
        Of.Lower = Lower;
        Of.Upper = Upper;
    }
    void addScaled(BaseType Base, double Lsb, double Offset, double Lower, double Upper, bool Low,
                   bool High) {
        addLimited(Base, Lower, Upper);
        Type& Of = m_Types.back();
        Of.IsScaled = true;
        Of.Lsb = Lsb;
        Of.Offset = Offset;
        Of.SaturatesLow = Low;
        Of.SaturatesHigh = High;
        Of.HasRange = Low || High;
    }
    void addVariable(const Type& Of, std::uint32_t Count) {
        Variable& Declaration = m_Declarations.emplace_back();
        m_Names.push_back((Count ? "table" : "x") + std::to_string(m_Names.size()));
        Declaration.Name = m_Names.back();
        Declaration.pType = &Of;
        Declaration.Count = Count;
        Declaration.Index = static_cast<std::uint32_t>(m_Declarations.size() - 1);
        m_Variables.push_back(std::make_unique<ZfCCfgSFVariable>(Declaration));
    }

    std::deque<Type> m_Types;
    std::deque<std::string> m_Names;
    std::deque<Variable> m_Declarations;
    std::vector<std::unique_ptr<ZfCCfgSFVariable>> m_Variables;
};

class ExpressionMaker {
public:
    ExpressionMaker(Workbench& Bench, TermArena& Terms, unsigned Seed)
        : m_Bench(Bench), m_Terms(Terms), m_Random(Seed) {}

    const Type& type() { return m_Bench.types()[m_Random() % m_Bench.types().size()]; }
    Term* make(int Depth) {
        const unsigned Choice = m_Random() % 16;
        if (Depth == 0 || Choice < 2)
            return leaf();
        if (Choice < 4) {
            static constexpr Operator Unary[] = {Operator::Negate, Operator::LogicalNot,
                                                 Operator::Complement, Operator::Absolute,
                                                 Operator::Sign};
            return m_Terms.makeUnary(Unary[m_Random() % 5], make(Depth - 1));
        }
        if (Choice < 6)
            return m_Terms.makeCast(&type(), make(Depth - 1));
        const int First = static_cast<int>(Operator::Multiply);
        const int Count = static_cast<int>(Operator::Maximum) - First + 1;
        const auto Op = static_cast<Operator>(First + static_cast<int>(m_Random() % Count));
        Term* pLeft = make(Depth - 1);
        return m_Terms.makeBinary(Op, pLeft, make(Depth - 1));
    }

private:
    Term* leaf() {
        static constexpr double Numbers[] = {
            0.0,  1.0,           2.0,   3.0,     5.0,          8.0,          31.0,
            32.0, 100.0,         255.0, 256.0,   0.5,          0.1,          2.5,
            -1.0, -0.0,          127.0, 32768.0, 2147483647.0, 2147483648.0, 4294967295.0,
            1e10, -2147483648.0, 1e300, 299.995, 1e-300};
        if (m_Random() % 3 == 0)
            return m_Terms.makeNumber(Numbers[m_Random() % std::size(Numbers)]);
        auto& Variables = m_Bench.variables();
        ZfCCfgSFVariable* pVariable = Variables[m_Random() % Variables.size()].get();
        Term* pRead = m_Terms.makeVariable(pVariable);
        if (pVariable->getDeclaration().Count == 0)
            return pRead;
        pRead->Op = Operator::Element;
        pRead->pLeft = make(1);
        return pRead;
    }

    Workbench& m_Bench;
    TermArena& m_Terms;
    std::mt19937 m_Random;
};

/// One value for each variable and element: numbers as the storage holds them.
using Operands = std::vector<std::vector<double>>;

double randomStored(const Type& Of, std::mt19937& Random) {
    static const double Floats[] = {0.0,
                                    1.0,
                                    -1.0,
                                    0.5,
                                    2.5,
                                    -3.75,
                                    1e10,
                                    -1e10,
                                    2147483648.0,
                                    -2147483649.0,
                                    1e-40,
                                    3e38,
                                    std::numeric_limits<double>::infinity(),
                                    -std::numeric_limits<double>::infinity(),
                                    std::nan("")};
    if (isFloating(Of.Base)) {
        BaseType Base = Of.Base;
        Type Plain;
        Plain.Base = Base;
        const double Number = Random() % 4 == 0 ? std::ldexp(1.0 + Random() % 1000,
                                                             static_cast<int>(Random() % 40) - 20)
                                                : Floats[Random() % std::size(Floats)];
        return convertNumber(Number, Plain);
    }
    const std::int64_t Smallest = smallestRaw(Of.Base);
    const std::int64_t Greatest = greatestRaw(Of.Base);
    const std::int64_t Raws[] = {Smallest,
                                 Smallest + 1,
                                 Greatest,
                                 Greatest - 1,
                                 0,
                                 1,
                                 2,
                                 Greatest / 2,
                                 Smallest + static_cast<std::int64_t>(Random() % 1000)};
    const std::int64_t Raw = Raws[Random() % std::size(Raws)];
    return numberOfRaw(Raw < Smallest ? Smallest : Raw > Greatest ? Greatest : Raw, Of);
}

double evaluate(const Term* pTerm, const Operands& Values) {
    switch (pTerm->Op) {
    case Operator::Number:
        return pTerm->Number;
    case Operator::Variable:
        return Values[originalOf(pTerm->pVariable)->getDeclaration().Index][0];
    case Operator::Element: {
        const double Index = computeBinary(Operator::BitOr, evaluate(pTerm->pLeft, Values), 0.0);
        const auto& Elements = Values[originalOf(pTerm->pVariable)->getDeclaration().Index];
        return Elements[static_cast<std::size_t>(std::min(std::max(Index, 0.0), TableSize - 1.0))];
    }
    case Operator::Cast:
        return convertNumber(evaluate(pTerm->pLeft, Values), *pTerm->pType);
    default:
        break;
    }
    const double Left = evaluate(pTerm->pLeft, Values);
    return pTerm->pRight ? computeBinary(pTerm->Op, Left, evaluate(pTerm->pRight, Values))
                         : computeUnary(pTerm->Op, Left);
}

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
