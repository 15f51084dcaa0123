#include "Ranges/RangeProof.h"

#include "Model/Conversion.h"
#include "Ranges/ExactNumbers.h"

#include <array>
#include <cstdio>
#include <utility>

// All intervals of a domain are 16 * 17 / 2 = 136, all pairs of them 18,496. What an operator gives
// for all numbers of a pair is a rectangle in a table of 16 x 16 results, so the range that is so
// comes from hulls that grow: column by column over the rows of the left interval, then column
// after column to the right. Each pair costs one hull.

namespace hpn::proof {

namespace {

constexpr std::size_t Count = 16;

struct NamedOperator {
    Operator Op;
    const char* pName;
};

constexpr NamedOperator Unary[] = {{Operator::Negate, "-x"},
                                   {Operator::LogicalNot, "!x"},
                                   {Operator::Complement, "~x"},
                                   {Operator::Absolute, "abs"},
                                   {Operator::Sign, "sgn"}};
constexpr NamedOperator Binary[] = {
    {Operator::Multiply, "*"},    {Operator::Divide, "/"},        {Operator::Modulo, "%"},
    {Operator::Add, "+"},         {Operator::Subtract, "-"},      {Operator::ShiftLeft, "<<"},
    {Operator::ShiftRight, ">>"}, {Operator::Less, "<"},          {Operator::LessEqual, "<="},
    {Operator::Greater, ">"},     {Operator::GreaterEqual, ">="}, {Operator::Equal, "=="},
    {Operator::NotEqual, "!="},   {Operator::BitAnd, "&"},        {Operator::BitXor, "^"},
    {Operator::BitOr, "|"},       {Operator::LogicalAnd, "&&"},   {Operator::LogicalOr, "||"},
    {Operator::Minimum, "min"},   {Operator::Maximum, "max"}};

using Numbers = std::array<double, Count>;
using Hulls = std::array<ValueRange, Count>;

Type storedType(BaseType Base, double Lsb = 1.0, double Offset = 0.0) {
    Type Made;
    Made.Base = Base;
    Made.IsScaled = Lsb != 1.0 || Offset != 0.0;
    Made.Lsb = Lsb;
    Made.Offset = Offset;
    return Made;
}

Type saturating(Type Of, double Lower, double Upper, bool Low, bool High) {
    Of.HasRange = true;
    Of.Lower = Lower;
    Of.Upper = Upper;
    Of.SaturatesLow = Low;
    Of.SaturatesHigh = High;
    return Of;
}

Numbers numbersOf(const Domain& Of) {
    Numbers All{};
    for (std::size_t i = 0; i < Count; ++i)
        All[i] = judgeGrid(Of.FirstRaw + static_cast<int>(i), Of.Lsb, Of.Offset);
    return All;
}

/// What the client knows of a variable of the domain's type between two numbers.
ValueRange operandRange(const Domain& Of, double Low, double High) {
    return cutRange(storageRange(storedType(BaseType::Int8, Of.Lsb, Of.Offset)), Low, High);
}

bool isSound(const Case& Next) {
    return Next.Seen.isWithin(Next.Claimed) && (!Next.Claimed.IsIntegral || Next.Seen.IsIntegral);
}

void count(Finding& Result, const Case& Next, bool KeepAllCases) {
    ++Result.Cases;
    if (!isSound(Next)) {
        if (Result.Narrow++ == 0)
            Result.FirstNarrow = Next;
    } else if (Next.Claimed.isWithin(Next.Seen)) {
        ++Result.Exact;
    } else if (KeepAllCases || Result.Wide.empty()) {
        Result.Wide.push_back(Next);
    }
}

ValueRange claimStored(const ValueRange& Result, const Store* pStore) {
    return pStore == nullptr ? Result : convertRange(Result, pStore->To);
}

double judgeStored(double Result, const Store* pStore) {
    return pStore == nullptr ? Result : judgeStore(Result, pStore->To);
}

/// The stores behind an operator, and none.
std::vector<const Store*> allStores() {
    std::vector<const Store*> All = {nullptr};
    for (const Store& Next : stores())
        All.push_back(&Next);
    return All;
}

/// `claim` is the client's range arithmetic, `judge` gives one number's result.
template <class Claim, class Judge>
Finding proveUnary(Finding Result, bool KeepAllCases, Claim claim, Judge judge) {
    const Numbers All = numbersOf(*Result.pDomain);
    for (std::size_t a = 0; a < Count; ++a) {
        ValueRange Seen = rangeOfNumber(judge(All[a]));
        for (std::size_t b = a; b < Count; ++b) {
            Seen = hull(Seen, rangeOfNumber(judge(All[b])));
            const ValueRange Operand = operandRange(*Result.pDomain, All[a], All[b]);
            count(Result, {Operand, Operand, claim(Operand), Seen}, KeepAllCases);
        }
    }
    return Result;
}

/// One operator on all pairs of intervals of two domains.
class BinaryProof {
public:
    BinaryProof(NamedOperator Op, const Domain& Left, const Domain& Right,
                std::vector<const Store*> Stores)
        : m_Op(Op.Op), m_Left(Left), m_Right(Right), m_Stores(std::move(Stores)),
          m_LeftNumbers(numbersOf(Left)), m_RightNumbers(numbersOf(Right)),
          m_Tables(m_Stores.size()), m_Columns(m_Stores.size()), m_Seen(m_Stores.size()) {
        for (std::size_t s = 0; s < m_Stores.size(); ++s) {
            m_Results.push_back({Op.pName, &Left, &Right, m_Stores[s], 0, 0, 0, {}, {}});
            for (std::size_t i = 0; i < Count; ++i) {
                for (std::size_t j = 0; j < Count; ++j)
                    m_Tables[s][i][j] = rangeOfNumber(judgeStored(
                        judgeBinary(m_Op, m_LeftNumbers[i], m_RightNumbers[j]), m_Stores[s]));
            }
        }
    }

    std::vector<Finding> run(bool KeepAllCases) {
        for (std::size_t a = 0; a < Count; ++a) {
            for (std::size_t b = a; b < Count; ++b) {
                addRow(b, b == a);
                for (std::size_t c = 0; c < Count; ++c)
                    runRightIntervals(operandRange(m_Left, m_LeftNumbers[a], m_LeftNumbers[b]), c,
                                      KeepAllCases);
            }
        }
        return m_Results;
    }

private:
    void addRow(std::size_t Row, bool IsFirst) {
        for (std::size_t s = 0; s < m_Stores.size(); ++s) {
            for (std::size_t j = 0; j < Count; ++j)
                m_Columns[s][j] =
                    IsFirst ? m_Tables[s][Row][j] : hull(m_Columns[s][j], m_Tables[s][Row][j]);
        }
    }
    void runRightIntervals(const ValueRange& Left, std::size_t c, bool KeepAllCases) {
        for (std::size_t d = c; d < Count; ++d) {
            const ValueRange Right = operandRange(m_Right, m_RightNumbers[c], m_RightNumbers[d]);
            const ValueRange Claimed = rangeOfBinary(m_Op, Left, Right);
            for (std::size_t s = 0; s < m_Stores.size(); ++s) {
                m_Seen[s] = d == c ? m_Columns[s][d] : hull(m_Seen[s], m_Columns[s][d]);
                count(m_Results[s], {Left, Right, claimStored(Claimed, m_Stores[s]), m_Seen[s]},
                      KeepAllCases && m_Stores[s] == nullptr);
            }
        }
    }

    Operator m_Op;
    const Domain& m_Left;
    const Domain& m_Right;
    std::vector<const Store*> m_Stores; ///< null: none
    Numbers m_LeftNumbers;
    Numbers m_RightNumbers;
    std::vector<std::array<Hulls, Count>> m_Tables; ///< of each store: result by left and right
    std::vector<Hulls> m_Columns;                   ///< hulls over the rows of the left interval
    std::vector<ValueRange> m_Seen;
    std::vector<Finding> m_Results;
};

/// Grids that meet seldom or never, and one that doubles do not hit.
const std::vector<std::pair<std::size_t, std::size_t>> MixedDomains = {
    {0, 2}, {5, 6}, {6, 0}, {4, 5}, {1, 6}};

std::string text(const ValueRange& Range) {
    char Buffer[128];
    std::snprintf(Buffer, sizeof Buffer, "%.6g..%.6g%s%s", Range.Low, Range.High,
                  Range.MayBeNaN ? " NaN" : "", Range.MayBeNegativeZero ? " -0" : "");
    return Buffer;
}

} // namespace

const std::vector<Domain>& domains() {
    static const std::vector<Domain> s_Domains = {
        {"signed", -8, 1.0, 0.0},    {"unsigned", 0, 1.0, 0.0}, {"halves", -8, 0.5, 0.0},
        {"quarters", -8, 0.25, 1.0}, {"tenths", -8, 0.1, 0.0},  {"odd", -8, 2.0, -5.0},
        {"fours", 0, 4.0, 0.0}};
    return s_Domains;
}

const std::vector<Store>& stores() {
    static const std::vector<Store> s_Stores = [] {
        const Type Sixteenths = storedType(BaseType::Int8, 0.0625);
        const Type Unsigned = storedType(BaseType::UInt8, 0.0625);
        return std::vector<Store>{
            {"int8", storedType(BaseType::Int8)},
            {"uint8", storedType(BaseType::UInt8)},
            {"int8 clip", saturating(storedType(BaseType::Int8), -8.0, 7.0, true, true)},
            {"uint8 clip high", saturating(storedType(BaseType::UInt8), 0.0, 15.0, false, true)},
            {"int8/16", Sixteenths},
            {"int8/16 clip", saturating(Sixteenths, -4.0, 3.5, true, true)},
            {"int8/16 clip low", saturating(Sixteenths, -4.0, 3.5, true, false)},
            {"uint8/16", Unsigned},
            {"uint8/10-3", storedType(BaseType::UInt8, 0.1, -3.0)},
            {"uint32", storedType(BaseType::UInt32)},
            {"bool", storedType(BaseType::Bool)},
            {"float32", storedType(BaseType::Float32)},
            {"float64", storedType(BaseType::Float64)}};
    }();
    return s_Stores;
}

/// The conversions, and the unary operators with and without a store behind.
static void proveUnaryOperators(std::vector<Finding>& Findings, const Domain& Of,
                                bool KeepAllCases) {
    for (const Store& Next : stores())
        Findings.push_back(proveUnary(
            {"(type)", &Of, &Of, &Next, 0, 0, 0, {}, {}}, KeepAllCases,
            [&](const ValueRange& Operand) { return convertRange(Operand, Next.To); },
            [&](double Number) { return judgeStore(Number, Next.To); }));
    for (const NamedOperator Op : Unary) {
        for (const Store* pStore : allStores())
            Findings.push_back(proveUnary(
                {Op.pName, &Of, &Of, pStore, 0, 0, 0, {}, {}}, KeepAllCases && pStore == nullptr,
                [&](const ValueRange& Operand) {
                    return claimStored(rangeOfUnary(Op.Op, Operand), pStore);
                },
                [&](double Number) { return judgeStored(judgeUnary(Op.Op, Number), pStore); }));
    }
}

std::vector<Finding> proveRanges(bool KeepAllCases) {
    std::vector<Finding> Findings;
    const auto add = [&](NamedOperator Op, const Domain& Left, const Domain& Right,
                         std::vector<const Store*> Stores) {
        for (Finding& Next : BinaryProof(Op, Left, Right, std::move(Stores)).run(KeepAllCases))
            Findings.push_back(std::move(Next));
    };
    for (const Domain& Of : domains()) {
        proveUnaryOperators(Findings, Of, KeepAllCases);
        for (const NamedOperator Op : Binary)
            add(Op, Of, Of, allStores());
    }
    for (const auto& [Left, Right] : MixedDomains) {
        for (const NamedOperator Op : Binary)
            add(Op, domains()[Left], domains()[Right], {nullptr});
    }
    return Findings;
}

std::string describe(const Finding& Of) {
    std::string Domains = Of.pDomain->Name;
    if (Of.pRight != Of.pDomain)
        Domains += "," + Of.pRight->Name;
    char Buffer[128];
    std::snprintf(Buffer, sizeof Buffer, "%-7s %-16s %-16s %6llu %6llu %5.1f%%", Of.Name.c_str(),
                  Domains.c_str(), Of.pStore != nullptr ? Of.pStore->Name.c_str() : "-",
                  static_cast<unsigned long long>(Of.Cases),
                  static_cast<unsigned long long>(Of.Exact),
                  100.0 * static_cast<double>(Of.Exact) / static_cast<double>(Of.Cases));
    return Buffer;
}

static std::string describe(const Case& Of, bool IsUnary) {
    return text(Of.Left) + (IsUnary ? "" : " , " + text(Of.Right)) + ": " + text(Of.Claimed) +
           " for " + text(Of.Seen);
}

static bool isUnaryName(const Finding& Of) {
    return Of.Cases == Count * (Count + 1) / 2;
}

/// One line of sums over the findings with or without a store.
static std::string summary(const std::vector<Finding>& Findings, bool WithStore) {
    std::uint64_t Cases = 0, Exact = 0, Narrow = 0;
    for (const Finding& Next : Findings) {
        if ((Next.pStore != nullptr) != WithStore)
            continue;
        Cases += Next.Cases;
        Exact += Next.Exact;
        Narrow += Next.Narrow;
    }
    char Buffer[160];
    std::snprintf(Buffer, sizeof Buffer, "%s: %llu cases, %llu too narrow, %llu exact (%.2f%%)\n",
                  WithStore ? "Operators and casts with a store behind" : "Operators alone",
                  static_cast<unsigned long long>(Cases), static_cast<unsigned long long>(Narrow),
                  static_cast<unsigned long long>(Exact),
                  100.0 * static_cast<double>(Exact) / static_cast<double>(Cases));
    return Buffer;
}

std::string printTable(const std::vector<Finding>& Findings) {
    std::string Out =
        summary(Findings, false) + summary(Findings, true) +
        "\nAll that is wider than it could be somewhere: operator, domains, store, cases, exact "
        "ones,\nand the first other: operands, the range claimed and what it was claimed for.\n\n";
    for (const Finding& Next : Findings) {
        if (Next.Narrow != 0)
            Out += describe(Next) + "  TOO NARROW " +
                   describe(Next.FirstNarrow, isUnaryName(Next)) + "\n";
        if (!Next.Wide.empty())
            Out += describe(Next) + "  " + describe(Next.Wide[0], isUnaryName(Next)) + "\n";
    }
    return Out;
}

std::string printWideCases(const std::vector<Finding>& Findings) {
    std::string Out;
    for (const Finding& Next : Findings) {
        for (const Case& One : Next.Wide)
            Out += Next.Name + " " + Next.pDomain->Name + " " +
                   (Next.pStore != nullptr ? Next.pStore->Name : "-") + "  " +
                   describe(One, isUnaryName(Next)) + "\n";
    }
    return Out;
}

} // namespace hpn::proof
