#ifndef EMITTEDEXPRESSIONS_H
#define EMITTEDEXPRESSIONS_H

#include "Model/Conversion.h"
#include "Model/Term.h"
#include "Model/ZfCCfgSFVariable.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <deque>
#include <iterator>
#include <limits>
#include <memory>
#include <random>
#include <string>
#include <vector>

namespace hpn::test {

// Random expressions over variables of all kinds of types, operands from the borders of the types,
// and the client's own arithmetic on them.

inline constexpr std::uint32_t TableSize = 5;

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

/// Terms of all operators over the variables of a workbench.
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

/// A number from the borders of a type, as its storage holds it.
inline double randomStored(const Type& Of, std::mt19937& Random) {
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

/// What the client's arithmetic makes of a term.
inline double evaluate(const Term* pTerm, const Operands& Values) {
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

} // namespace hpn::test

#endif
