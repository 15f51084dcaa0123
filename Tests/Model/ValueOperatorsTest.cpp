#include <csignal>
#include <cstdint>
#include <functional>
#include <limits>
#include <map>
#include <random>

#include "ModelTestSupport.h"

// The operators of ZfCCfgValue against tables of kinds, written out element by element, and against
// numbers that are computed another way: 32-bit operations by arithmetic on 64-bit integers, bit by
// bit where bits are meant.

namespace {

using Binary = ZfCCfgValue (*)(ZfCCfgValue&, ZfCCfgValue&);
using Unary = ZfCCfgValue (*)(ZfCCfgValue&);

constexpr double Infinity = std::numeric_limits<double>::infinity();
constexpr double NaN = std::numeric_limits<double>::quiet_NaN();

#define BINARY(Symbol)                                                                             \
    {                                                                                              \
#Symbol, [](ZfCCfgValue & a, ZfCCfgValue & b) { return a Symbol b; }                       \
    }

const std::map<std::string, Binary> BinaryOperators = {
    BINARY(+), BINARY(-),  BINARY(*), BINARY(/),  BINARY(%),         BINARY(<<),       BINARY(>>),
    BINARY(&), BINARY(|),  BINARY(^), BINARY(&&), BINARY(||),        BINARY(==),       BINARY(!=),
    BINARY(<), BINARY(<=), BINARY(>), BINARY(>=), {"min", minValue}, {"max", maxValue}};

const std::map<std::string, Unary> UnaryOperators = {{"-", [](ZfCCfgValue& a) { return -a; }},
                                                     {"!", [](ZfCCfgValue& a) { return !a; }},
                                                     {"~", [](ZfCCfgValue& a) { return ~a; }},
                                                     {"++", [](ZfCCfgValue& a) { return a++; }},
                                                     {"--", [](ZfCCfgValue& a) { return a--; }},
                                                     {"abs", absoluteValue},
                                                     {"sgn", sgn}};

// Operands by letter: u undetermined, n non-constant, else the digit as a constant.
ZfCCfgValue operandOf(char Letter) {
    if (Letter == 'u')
        return eCfgValueUndetermined;
    if (Letter == 'n')
        return eCfgValueNonConstant;
    return static_cast<double>(Letter - '0');
}

// Results by letter: u, n, a digit for that constant, c for any constant.
char letterOf(ZfCCfgValue Value, char Expected) {
    if (Value.isUndetermined())
        return 'u';
    if (Value.isNonConstant())
        return 'n';
    if (Expected == 'c')
        return 'c';
    return static_cast<char>('0' + static_cast<int>(Value.getValue()));
}

// Rows are left operands, columns right ones, both in the order u n 0 1 5.
constexpr const char* Operands = "un015";
const std::map<std::string, std::string> KindTables = {
    // The plain rule: non-constant over undetermined over constant.
    {"rule", "unuuu"
             "nnnnn"
             "unccc"
             "unccc"
             "unccc"},
    // A zero decides; then undetermined beats non-constant.
    {"*", "uu0uu"
          "un0nn"
          "00000"
          "un0cc"
          "un0cc"},
    {"&&", "uu0uu"
           "un0nn"
           "00000"
           "un011"
           "un011"},
    // A one decides, and nothing else is true.
    {"||", "uuu1u"
           "unn1n"
           "un010"
           "11111"
           "un010"},
    // The left operand decides first.
    {"/", "uuuuu"
          "nnnnn"
          "00000"
          "unccc"
          "unccc"}};

TEST(ValueOperators, KindsFollowTheTables) {
    for (const auto& [Name, Operator] : BinaryOperators) {
        const auto Own = KindTables.find(Name);
        const std::string& Table = Own != KindTables.end() ? Own->second : KindTables.at("rule");
        for (int i = 0; i < 25; ++i) {
            ZfCCfgValue Left = operandOf(Operands[i / 5]);
            ZfCCfgValue Right = operandOf(Operands[i % 5]);
            if (Name == "%" && Operands[i % 5] == '0' && Left.isConstant())
                continue; // ends in the division fault
            EXPECT_EQ(Table[i], letterOf(Operator(Left, Right), Table[i]))
                << Operands[i / 5] << ' ' << Name << ' ' << Operands[i % 5];
        }
    }
    for (const auto& [Name, Operator] : UnaryOperators)
        for (const char Letter : std::string("unc")) {
            ZfCCfgValue Operand = Letter == 'c' ? ZfCCfgValue(3.0) : operandOf(Letter);
            EXPECT_EQ(Letter, letterOf(Operator(Operand), Letter)) << Name;
        }
}

// The 32-bit rule by comparison of whole numbers: what does not fit becomes the smallest number.
std::int64_t oracleTruncate(double Number, double Low, double High, std::int64_t Otherwise) {
    const double Whole = std::trunc(Number);
    return Whole >= Low && Whole <= High ? static_cast<std::int64_t>(Whole) : Otherwise;
}

std::int64_t int32Of(double Number) {
    return oracleTruncate(Number, -2147483648.0, 2147483647.0, -2147483648LL);
}

// The number of the given width whose pattern is that of Number.
std::int64_t wrap(std::int64_t Number, int Bits, bool IsSigned) {
    const std::int64_t Size = std::int64_t(1) << Bits;
    const std::int64_t Rest = ((Number % Size) + Size) % Size;
    return IsSigned && Rest >= Size / 2 ? Rest - Size : Rest;
}

std::int64_t bitwise(char Operation, std::int64_t Left, std::int64_t Right) {
    std::int64_t Result = 0;
    for (int Bit = 0; Bit < 32; ++Bit) {
        const bool a = wrap(Left, 32, false) / (std::int64_t(1) << Bit) % 2 != 0;
        const bool b = wrap(Right, 32, false) / (std::int64_t(1) << Bit) % 2 != 0;
        const bool r = Operation == '&' ? (a && b) : Operation == '|' ? (a || b) : a != b;
        Result += r ? std::int64_t(1) << Bit : 0;
    }
    return wrap(Result, 32, true);
}

std::int64_t floorOf(std::int64_t Number, std::int64_t Divisor) {
    return (Number - ((Number % Divisor) + Divisor) % Divisor) / Divisor;
}

std::int64_t powerOf(std::int64_t Count) {
    return std::int64_t(1) << ((Count % 32 + 32) % 32);
}

// A 32-bit operator by its effect on whole numbers.
template <class Operation>
auto int32(Operation Compute) {
    return [Compute](double a, double b) {
        return static_cast<double>(Compute(int32Of(a), int32Of(b)));
    };
}

using Number = std::int64_t;
const std::map<std::string, std::function<double(double, double)>> Oracle = {
    {"%", int32([](Number a, Number b) { return a - a / b * b; })},
    {"<<", int32([](Number a, Number b) { return wrap(a * powerOf(b), 32, true); })},
    {">>", int32([](Number a, Number b) { return floorOf(a, powerOf(b)); })},
    {"&", int32([](Number a, Number b) { return bitwise('&', a, b); })},
    {"|", int32([](Number a, Number b) { return bitwise('|', a, b); })},
    {"^", int32([](Number a, Number b) { return bitwise('^', a, b); })},
    {"+", std::plus<double>()},
    {"-", std::minus<double>()},
    {"*", [](double a, double b) { return a == 0.0 || b == 0.0 ? 0.0 : a * b; }},
    {"/", [](double a, double b) { return a == 0.0 ? 0.0 : a / b; }},
    {"&&", [](double a, double b) { return a == 0.0 || b == 0.0 ? 0.0 : 1.0; }},
    {"||", [](double a, double b) { return a == 1.0 || b == 1.0 ? 1.0 : 0.0; }},
    {"==",
     [](double a, double b) {
         return a - b == 0.0 ||
                        (std::isinf(a) && std::isinf(b) && std::signbit(a) == std::signbit(b))
                    ? 1.0
                    : 0.0;
     }},
    {"!=", [](double a,
              double b) { return std::isunordered(a, b) || std::islessgreater(a, b) ? 1.0 : 0.0; }},
    {"<", [](double a, double b) { return std::isless(a, b) ? 1.0 : 0.0; }},
    {"<=", [](double a, double b) { return std::islessequal(a, b) ? 1.0 : 0.0; }},
    {">", [](double a, double b) { return std::isgreater(a, b) ? 1.0 : 0.0; }},
    {">=", [](double a, double b) { return std::isgreaterequal(a, b) ? 1.0 : 0.0; }},
    {"min", [](double a, double b) { return std::isless(a, b) ? a : b; }},
    {"max", [](double a, double b) { return std::isgreater(a, b) ? a : b; }}};

std::vector<double> borderAndRandomNumbers() {
    std::vector<double> Numbers = {0.0,      -0.0,      1.0,   -1.0,   2.0,   0.5,  -0.5,
                                   0.999,    7.9,       -7.9,  31.0,   32.0,  33.0, NaN,
                                   Infinity, -Infinity, 1e300, -1e300, 5e-324};
    for (const double Border : {128.0, 256.0, 32768.0, 65536.0, 2147483648.0, 4294967296.0,
                                9223372036854775808.0, 18446744073709551616.0})
        for (const double Offset : {-1.0, -0.5, 0.0, 0.5, 1.0}) {
            Numbers.push_back(Border + Offset);
            Numbers.push_back(-Border + Offset);
        }
    std::mt19937_64 Random(20240607);
    for (int i = 0; i < 40; ++i)
        Numbers.push_back(std::ldexp(static_cast<double>(static_cast<std::int64_t>(Random())),
                                     -static_cast<int>(Random() % 64)));
    return Numbers;
}

TEST(ValueOperators, NumbersOfConstantsAgreeWithTheOracle) {
    const std::vector<double> Numbers = borderAndRandomNumbers();
    for (const auto& [Name, Operator] : BinaryOperators)
        for (const double a : Numbers)
            for (const double b : Numbers) {
                const std::int64_t Divisor = int32Of(b);
                if (Name == "%" && (Divisor == 0 || (Divisor == -1 && int32Of(a) == -2147483648LL)))
                    continue; // ends in the division fault
                ZfCCfgValue Left = a;
                ZfCCfgValue Right = b;
                ZfCCfgValue Result = Operator(Left, Right);
                ASSERT_TRUE(Result.isConstant());
                ASSERT_PRED2(isSameNumber, Oracle.at(Name)(a, b), Result.getValue())
                    << a << ' ' << Name << ' ' << b;
                ASSERT_PRED2(isSameNumber, a, Left.getValue());
                ASSERT_PRED2(isSameNumber, b, Right.getValue());
            }
}

TEST(ValueOperators, UnaryNumbersAgreeWithTheOracle) {
    for (const double a : borderAndRandomNumbers()) {
        const std::map<std::string, double> Expected = {
            {"-", std::copysign(a, std::signbit(a) ? 1.0 : -1.0)},
            {"!", a == 0.0 ? 1.0 : 0.0},
            {"~", static_cast<double>(-1 - int32Of(a))},
            {"++", a + 1.0},
            {"--", a - 1.0},
            {"abs", std::isless(a, 0.0) ? std::fabs(a) : a},
            {"sgn", std::isless(a, 0.0)      ? -1.0
                    : std::isgreater(a, 0.0) ? 1.0
                                             : 0.0}};
        for (const auto& [Name, Operator] : UnaryOperators) {
            ZfCCfgValue Operand = a;
            SCOPED_TRACE(Name);
            EXPECT_CONSTANT(Expected.at(Name), Operator(Operand));
            EXPECT_PRED2(isSameNumber, a, Operand.getValue());
        }
    }
}

// How a process ends by a signal that nobody handles: Windows knows none and gives a status.
#ifdef _WIN32
auto endedBy(int) {
    return testing::ExitedWithCode(3);
}
#else
auto endedBy(int Signal) {
    return testing::KilledBySignal(Signal);
}
#endif

TEST(ValueOperatorsDeathTest, RemainderWithoutResultRaisesTheDivisionFault) {
    ZfCCfgValue Smallest = -2147483648.0;
    ZfCCfgValue MinusOne = -1.0;
    ZfCCfgValue AlmostZero = 0.9;
    EXPECT_EXIT((std::signal(SIGFPE, SIG_DFL), Smallest % MinusOne), endedBy(SIGFPE), "");
    EXPECT_EXIT((std::signal(SIGFPE, SIG_DFL), MinusOne % AlmostZero), endedBy(SIGFPE), "");
    // Who swallows the fault gets no number either.
    EXPECT_EXIT((std::signal(SIGFPE, SIG_IGN), MinusOne % AlmostZero), endedBy(SIGABRT), "");
}

TEST(ValueCompare, TellsLatticeElementsApartAndIgnoresNumbersThatMeanNothing) {
    ZfCCfgValue Undetermined = eCfgValueUndetermined;
    ZfCCfgValue OtherUndetermined = 3.0;
    OtherUndetermined.setValueKind(eCfgValueUndetermined);
    ZfCCfgValue One = 1.0;
    ZfCCfgValue Zero = 0.0;
    ZfCCfgValue MinusZero = -0.0;
    ZfCCfgValue NotANumber = NaN;
    EXPECT_EQ(0, Undetermined.compare(OtherUndetermined));
    EXPECT_EQ(1, One.compare(Undetermined));
    EXPECT_EQ(1, One.compare(Zero));
    EXPECT_EQ(1, Zero.compare(One));
    EXPECT_EQ(0, Zero.compare(MinusZero));
    EXPECT_EQ(1, NotANumber.compare(NotANumber));
}

leda::list<ZfCCfgValue> listOf(const std::string& Letters) {
    leda::list<ZfCCfgValue> List;
    for (const char Letter : Letters)
        List.append(Letter == '?' ? ZfCCfgValue(NaN) : operandOf(Letter));
    return List;
}

struct ListCase {
    const char* Elements; // ? is a NaN
    char Join, Minimum, Maximum;
};

TEST(ValueLists, JoinAndExtremesFollowTheOrderOfTheList) {
    const ListCase Cases[] = {
        {"3", '3', '3', '3'},
        {"33", '3', '3', '3'},
        {"213", 'n', '1', '3'},
        {"u", 'u', 'u', 'u'},
        {"n", 'n', 'n', 'n'},
        {"u3", 'u', 'u', 'u'},
        // Undetermined is not neutral, and does not hide two constants that differ.
        {"3u", 'u', 'u', 'u'},
        {"u34", 'n', 'u', 'u'},
        {"u33", 'u', 'u', 'u'},
        {"3u4", 'n', 'u', 'u'},
        {"3nu", 'n', 'n', 'n'},
        {"un", 'n', 'u', 'u'},
        {"nu", 'n', 'n', 'n'},
        {"1un", 'n', 'u', 'u'},
        {"1nu", 'n', 'n', 'n'},
        // A NaN differs from everything and takes nobody's place.
        {"1?", 'n', '1', '1'},
        {"u??", 'n', 'u', 'u'},
    };
    for (const ListCase& Case : Cases) {
        leda::list<ZfCCfgValue> List = listOf(Case.Elements);
        EXPECT_EQ(Case.Minimum, letterOf(determineMinimum(List), Case.Minimum)) << Case.Elements;
        EXPECT_EQ(Case.Maximum, letterOf(determineMaximum(List), Case.Maximum)) << Case.Elements;
        const int Size = List.size();
        EXPECT_EQ(Case.Join, letterOf(intersect(List), Case.Join)) << Case.Elements;
        EXPECT_EQ(Size - 1, List.size());
    }
    EXPECT_CONSTANT(0.0, determineMinimum(listOf("")));
    EXPECT_CONSTANT(0.0, determineMaximum(listOf("")));
    EXPECT_CONSTANT(NaN, determineMinimum(listOf("?1")));
}

// Casts. The names are those of the queries of a data type.
struct TypeCase {
    const char* Name;
    int Bits;
    bool IsSigned;
};

constexpr TypeCase IntegerTypes[] = {{"int32", 32, true},   {"int16", 16, true},
                                     {"int8", 8, true},     {"uint32", 32, false},
                                     {"uint16", 16, false}, {"uint8", 8, false}};

// A type that answers one query, and "bool" by itself and not by its base.
class NamedType : public ZF_DataType {
public:
    explicit NamedType(std::string Name, ZF_DataType* pBase = nullptr)
        : m_Name(Name), m_pBase(pBase) {}
    ZF_DataType* getBaseDataType() override { return m_pBase; }
    bool isFloat64() override { return m_Name == "float64"; }
    bool isFloat32() override { return m_Name == "float32"; }
    bool isInt8() override { return m_Name == "int8"; }
    bool isUInt8() override { return m_Name == "uint8"; }
    bool isInt16() override { return m_Name == "int16"; }
    bool isUInt16() override { return m_Name == "uint16"; }
    bool isInt32() override { return m_Name == "int32"; }
    bool isUInt32() override { return m_Name == "uint32"; }
    bool isBool() override { return m_Name == "bool"; }

private:
    std::string m_Name;
    ZF_DataType* m_pBase;
};

double castTo(const std::string& BaseName, const std::string& Name, double Number, bool Normalize) {
    NamedType Base(BaseName);
    NamedType Type(Name, &Base);
    ZfCCfgValue Value = Number;
    EXPECT_EQ(&Value, &cast(&Type, Value, Normalize));
    EXPECT_TRUE(Value.isConstant());
    return Value.getValue();
}

TEST(Cast, IntegersWrapLikeTheOracle) {
    for (const TypeCase& Type : IntegerTypes)
        for (const double Number : borderAndRandomNumbers()) {
            const std::int64_t Whole =
                Type.IsSigned
                    ? int32Of(Number)
                    : oracleTruncate(Number, -9223372036854775808.0, 9223372036854774784.0,
                                     std::numeric_limits<std::int64_t>::min());
            const double Expected = static_cast<double>(wrap(Whole, Type.Bits, Type.IsSigned));
            // The base type is asked for the width; a type with an integer base is not asked
            // whether it is Boolean.
            EXPECT_PRED2(isSameNumber, Expected, castTo(Type.Name, "bool", Number, true))
                << Type.Name << ' ' << Number;
        }
}

TEST(Cast, FloatsKeepTheirNumberAndBooleansAreNormalizedOnDemand) {
    for (const char* Float : {"float64", "float32", "unknown"})
        EXPECT_PRED2(isSameNumber, 0.1, castTo(Float, Float, 0.1, true)) << Float;
    const double Cases[][3] = {// number, normalized, low byte
                               {2.0, 1.0, 2.0},   {256.0, 1.0, 0.0}, {0.0, 0.0, 0.0},
                               {-0.0, -0.0, 0.0}, {NaN, 1.0, 0.0},   {-1.0, 1.0, 255.0},
                               {0.5, 1.0, 0.0}};
    for (const auto& [Number, Normalized, LowByte] : Cases) {
        EXPECT_PRED2(isSameNumber, Normalized, castTo("storage", "bool", Number, true)) << Number;
        EXPECT_PRED2(isSameNumber, LowByte, castTo("storage", "bool", Number, false)) << Number;
    }
}

TEST(Cast, ARepresentedValueLiesOnTheGridOfTheScaling) {
    ZfCLinearScaling Half(0.5, 0.0);
    for (ZF_Scaling* pScaling :
         {static_cast<ZF_Scaling*>(nullptr), static_cast<ZF_Scaling*>(&Half)}) {
        ZfCCfgValue Rounded = 3.3;
        ZfCCfgValue Cut = 3.3;
        Rounded.changeToRepresentedValue(pScaling);
        Cut.changeToRepresentedValueDontRound(pScaling);
        EXPECT_CONSTANT(pScaling != nullptr ? 3.5 : 3.3, Rounded);
        EXPECT_CONSTANT(pScaling != nullptr ? 3.0 : 3.3, Cut);
    }
}

TEST(Cast, WithoutTypeOrBaseTypeNothingChanges) {
    NamedType WithoutBase("int8");
    ZfCCfgValue Value = 300.5;
    cast(nullptr, Value, true);
    cast(&WithoutBase, Value);
    EXPECT_CONSTANT(300.5, Value);
    // The two-argument form does not normalize, and the kind is not looked at.
    NamedType Storage("storage");
    NamedType Bool("bool", &Storage);
    ZfCCfgValue NonConstant = 257.0;
    NonConstant.setValueKind(eCfgValueNonConstant);
    EXPECT_KIND(eCfgValueNonConstant, cast(&Bool, NonConstant));
    EXPECT_EQ(1.0, NonConstant.getValue());
    EXPECT_KIND(eCfgValueNonConstant, reference(Value));
    EXPECT_KIND(eCfgValueNonConstant, dereference(Value));
}

// What a variable holds of a number: clipped, or else scaled or wrapped.
struct StoreCase {
    double Lsb, Offset; // lsb 0: no scaling
    double Number, Expected;
};

TEST(VariableStore, ClippedValuesAreFinalOthersAreScaledOrWrapped) {
    NamedType Base("int8");
    NamedType Type("int8", &Base);
    // Limits -99.75 to 99.75 lie off the grid of 0.5 on purpose.
    const StoreCase Cases[] = {
        {0.0, 0.0, 99.7, 99.0},     {1.0, 0.0, -99.7, -99.0},     // cast
        {0.5, 0.0, 99.7, 99.5},     {0.5, 0.0, 3.3, 3.5},         // scaled
        {1.0, 2.0, 3.7, 4.0},       {1.0, 0.5, 3.7, 3.5},         // scaled by the offset alone
        {0.5, 0.0, 120.0, 99.75},   {0.0, 0.0, 120.0, 99.75},     // clipped above
        {0.5, 0.0, -120.0, -99.75}, {0.0, 0.0, -Infinity, -99.75} // and below
    };
    for (const StoreCase& Case : Cases) {
        ZfCLinearScaling Scaling(Case.Lsb, Case.Offset);
        Variable v;
        v.m_pType = &Type;
        v.m_pScaling = Case.Lsb != 0.0 ? &Scaling : nullptr;
        v.m_Upper = v.m_Lower = true;
        v.m_UpperLimit = 99.75;
        v.m_LowerLimit = -99.75;
        ZfCCfgValue Value = Case.Number;
        v.setVarValueAndAdjustCfgValue(Value);
        EXPECT_CONSTANT(Case.Expected, Value);
        EXPECT_CONSTANT(Case.Expected, v.getValue());
    }
}

TEST(VariableStore, OnlyConstantsAreAdjustedAndTrackedVariablesOnly) {
    Variable v;
    v.m_Upper = true;
    v.m_UpperLimit = 5.0;
    ZfCCfgValue Value = 9.0;
    for (const tagZfECfgValueKind Kind : {eCfgValueUndetermined, eCfgValueNonConstant}) {
        Value.setValueKind(Kind);
        v.setVarValueAndAdjustCfgValue(Value);
        EXPECT_KIND(Kind, v.getValue());
        EXPECT_EQ(9.0, Value.getValue()); // not clipped
    }
    // A limit on one side only; a NaN passes.
    Value = ZfCCfgValue(-9.0);
    EXPECT_FALSE(v.ConsiderSaturation(Value));
    Value = ZfCCfgValue(NaN);
    EXPECT_FALSE(v.ConsiderSaturation(Value));
    v.markAsVolatile();
    Value = ZfCCfgValue(3.0);
    v.setVarValueAndAdjustCfgValue(Value);
    EXPECT_TRUE(Value.isNonConstant());
    EXPECT_TRUE(v.getValue().isNonConstant());
}

} // namespace
