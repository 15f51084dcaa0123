#include "Ranges/RangeProof.h"

#include "Model/Conversion.h"
#include "Ranges/ExactNumbers.h"

#include <array>
#include <cstdio>

// All intervals of a domain are 16 * 17 / 2 = 136, all pairs of them 18,496. What an operator gives
// for all numbers of a pair is a rectangle in a table of 16 x 16 results, so the range that is so
// comes from hulls that grow: column by column over the rows of the left interval, then column
// after column to the right. Each pair costs one hull.

namespace hpn::proof {

namespace {

constexpr int Count = 16;

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
using Table = std::array<Numbers, Count>;
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
    for (int i = 0; i < Count; ++i)
        All[i] = judgeGrid(Of.FirstRaw + i, Of.Lsb, Of.Offset);
    return All;
}

/// What the client knows of a variable of the domain's type between two numbers.
ValueRange operandRange(const Domain& Of, double Low, double High) {
    ValueRange Range = hull(rangeOfNumber(Low), rangeOfNumber(High));
    const bool IsWholeGrid = std::int64_t(Of.Lsb) == Of.Lsb && std::int64_t(Of.Offset) == Of.Offset;
    Range.IsIntegral = Range.IsIntegral && (IsWholeGrid || Range.isSingle());
    return Range;
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
    for (int a = 0; a < Count; ++a) {
        ValueRange Seen = rangeOfNumber(judge(All[a]));
        for (int b = a; b < Count; ++b) {
            Seen = hull(Seen, rangeOfNumber(judge(All[b])));
            const ValueRange Operand = operandRange(*Result.pDomain, All[a], All[b]);
            count(Result, {Operand, Operand, claim(Operand), Seen}, KeepAllCases);
        }
    }
    return Result;
}

void proveBinary(std::vector<Finding>& Findings, NamedOperator Op, const Domain& Of,
                 bool KeepAllCases) {
    const Numbers All = numbersOf(Of);
    const std::vector<const Store*> Stores = allStores();
    std::vector<Finding> Results;
    std::vector<Table> Tables(Stores.size());
    for (std::size_t s = 0; s < Stores.size(); ++s) {
        Results.push_back({Op.pName, &Of, Stores[s], 0, 0, 0, {}, {}});
        for (int i = 0; i < Count; ++i) {
            for (int j = 0; j < Count; ++j)
                Tables[s][i][j] = judgeStored(judgeBinary(Op.Op, All[i], All[j]), Stores[s]);
        }
    }
    for (int a = 0; a < Count; ++a) {
        std::vector<Hulls> Columns(Stores.size());
        for (int b = a; b < Count; ++b) {
            const ValueRange Left = operandRange(Of, All[a], All[b]);
            for (std::size_t s = 0; s < Stores.size(); ++s) {
                for (int j = 0; j < Count; ++j) {
                    const ValueRange Next = rangeOfNumber(Tables[s][b][j]);
                    Columns[s][j] = b == a ? Next : hull(Columns[s][j], Next);
                }
            }
            for (int c = 0; c < Count; ++c) {
                Hulls Seen;
                for (int d = c; d < Count; ++d) {
                    const ValueRange Right = operandRange(Of, All[c], All[d]);
                    const ValueRange Claimed = rangeOfBinary(Op.Op, Left, Right);
                    for (std::size_t s = 0; s < Stores.size(); ++s) {
                        Seen[s] = d == c ? Columns[s][d] : hull(Seen[s], Columns[s][d]);
                        count(Results[s], {Left, Right, claimStored(Claimed, Stores[s]), Seen[s]},
                              KeepAllCases && s == 0);
                    }
                }
            }
        }
    }
    Findings.insert(Findings.end(), Results.begin(), Results.end());
}

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

std::vector<Finding> proveRanges(bool KeepAllCases) {
    std::vector<Finding> Findings;
    for (const Domain& Of : domains()) {
        for (const Store& Next : stores())
            Findings.push_back(proveUnary(
                {"(type)", &Of, &Next, 0, 0, 0, {}, {}}, KeepAllCases,
                [&](const ValueRange& Operand) { return convertRange(Operand, Next.To); },
                [&](double Number) { return judgeStore(Number, Next.To); }));
        for (const NamedOperator Op : Unary) {
            for (const Store* pStore : allStores())
                Findings.push_back(proveUnary(
                    {Op.pName, &Of, pStore, 0, 0, 0, {}, {}}, KeepAllCases && pStore == nullptr,
                    [&](const ValueRange& Operand) {
                        return claimStored(rangeOfUnary(Op.Op, Operand), pStore);
                    },
                    [&](double Number) { return judgeStored(judgeUnary(Op.Op, Number), pStore); }));
        }
        for (const NamedOperator Op : Binary)
            proveBinary(Findings, Op, Of, KeepAllCases);
    }
    return Findings;
}

std::string printTable(const std::vector<Finding>& Findings) {
    std::string Out;
    for (const Finding& Next : Findings) {
        char Buffer[256];
        if (Next.Exact == Next.Cases)
            continue;
        std::snprintf(Buffer, sizeof Buffer, "%-6s %-9s %-16s %6llu %6llu %6llu", Next.Name.c_str(),
                      Next.pDomain->Name.c_str(), Next.pStore ? Next.pStore->Name.c_str() : "-",
                      (unsigned long long)Next.Cases, (unsigned long long)Next.Narrow,
                      (unsigned long long)Next.Exact);
        Out += Buffer;
        if (!Next.Wide.empty())
            Out += "  " + text(Next.Wide[0].Left) + " , " + text(Next.Wide[0].Right) + " : " +
                   text(Next.Wide[0].Claimed) + " for " + text(Next.Wide[0].Seen);
        if (Next.Narrow)
            Out += "  NARROW " + text(Next.FirstNarrow.Left) + " , " +
                   text(Next.FirstNarrow.Right) + " : " + text(Next.FirstNarrow.Claimed) + " for " +
                   text(Next.FirstNarrow.Seen);
        Out += "\n";
    }
    return Out;
}

std::string printWideCases(const std::vector<Finding>& Findings) {
    std::string Out;
    for (const Finding& Next : Findings) {
        if (Next.pStore != nullptr && Next.Name != "(type)")
            continue;
        for (const Case& One : Next.Wide)
            Out += Next.Name + " " + Next.pDomain->Name + ": " + text(One.Left) + " , " +
                   text(One.Right) + " : " + text(One.Claimed) + " for " + text(One.Seen) + "\n";
    }
    return Out;
}

} // namespace hpn::proof
