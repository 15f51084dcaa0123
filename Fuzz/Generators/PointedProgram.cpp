#include "Generators/PointedProgram.h"

#include "Generators/Join.h"

#include <iterator>

namespace hpn::fuzz {

namespace {

struct KnownType {
    const char* Text;
    std::vector<std::string> Borders;
};

const std::vector<KnownType>& builtInTypes() {
    static const std::vector<KnownType> Types = {
        {"bool", {"false", "true", "2", "0.5"}},
        {"int8", {"-128", "127", "128", "-129", "255"}},
        {"uint8", {"0", "255", "256", "-1", "260"}},
        {"int16", {"-32768", "32767", "32768"}},
        {"uint16", {"65535", "65536", "-1"}},
        {"int32", {"-2147483648", "2147483647", "2147483648", "4294967296"}},
        {"uint32", {"4294967295", "2147483648", "4294967296", "-1"}},
        {"float32", {"0.1", "16777217", "1e39", "1e-46", "-0.0"}},
        {"float64", {"0.1", "1e308", "-0.5", "0.0"}}};
    return Types;
}

const std::vector<KnownType>& declarableTypes() {
    static const std::vector<KnownType> Types = {
        {"uint16 lsb 0.01 range [0, 300] saturate",
         {"300", "300.01", "299.994", "-0.01", "655.35"}},
        {"int16 lsb 0.5 offset -40 range [-100, 100] saturate high",
         {"100", "100.25", "-100", "-16424", "-101", "-40.25", "-41.75"}},
        {"uint8 lsb 0.5 range [0, 100] saturate", {"100", "100.2", "127.5", "-0.3"}},
        {"int32 lsb 0.125", {"0.0625", "-0.0625", "-0.1875", "268435455.875", "268435456"}},
        {"uint8 offset -128 range [-100, 100] saturate low", {"-100", "-101", "127", "128", "101"}},
        {"uint8 range [10, 200] saturate", {"9", "10", "200", "201", "0"}},
        {"int16 range [-1000, 1000] saturate", {"1000", "1001", "-1001"}},
        {"uint32 lsb 2 offset 7", {"7", "8", "6", "8589934597"}},
        {"float32 range [-2.5, 1000] saturate", {"-2.5", "1000", "1000.5", "-3"}},
        {"int8 lsb 0.25 range [-8, 8]", {"8", "8.25", "31.75", "32", "-0.125", "-1.875"}},
        {"uint8 range [0, 5] saturate high", {"5", "6", "-1", "256"}},
        {"bool range [0, 1] saturate", {"0", "1", "0.25"}},
        {"float64 range [-50, 50] saturate", {"50", "50.5", "-51"}}};
    return Types;
}

} // namespace

std::string PointedProgram::text() {
    declareTypes();
    declareGlobals();
    declareExterns();
    chooseCallees();
    for (std::size_t i = 0; i < m_Callees.size(); ++i)
        writeCallee(i);
    m_HasRecursion = oneIn(6);
    if (m_HasRecursion)
        writeRecursion();
    writeMain();
    return std::move(m_Text);
}

// ---- declarations ----

void PointedProgram::declareTypes() {
    // Few types in one program, so that its variables meet.
    for (int i = 0; i < 3; ++i) {
        const KnownType& Picked = builtInTypes()[below(builtInTypes().size())];
        m_Types.emplace_back(Picked.Text);
        m_Borders.push_back(Picked.Borders);
    }
    for (std::uint64_t i = below(3); i > 0; --i) {
        const KnownType& Picked = declarableTypes()[below(declarableTypes().size())];
        m_Types.push_back(fresh("T"));
        m_Borders.push_back(Picked.Borders);
        line("type " + m_Types.back() + " = " + Picked.Text + ";");
    }
}

void PointedProgram::declareGlobals() {
    for (std::uint64_t i = 1 + below(3); i > 0; --i)
        declare("input", m_Types[below(m_Types.size())]);
    for (std::uint64_t i = 1 + below(3); i > 0; --i)
        declare("output", m_Types[below(m_Types.size())]);
    for (std::uint64_t i = 1 + below(4); i > 0; --i)
        declare("state", m_Types[below(m_Types.size())]);
    if (oneIn(2))
        declare("state", "bool");
    line("param bool OFF = false;");
    for (std::uint64_t i = 1 + below(3); i > 0; --i) {
        const std::string Value = std::to_string(below(4));
        m_Steady.push_back({fresh("steady"), Value});
        line("state " + std::string(oneIn(2) ? "uint8 " : "float64 ") + m_Steady.back().Name +
             " = " + Value + ";");
        m_Readable.push_back({m_Steady.back().Name, "uint8"});
    }
    if (oneIn(3)) {
        m_Array = fresh("table");
        line("state " + m_Types[below(m_Types.size())] + " " + m_Array + "[3];");
    }
}

void PointedProgram::declare(const char* pKind, const std::string& Type) {
    const bool IsInput = pKind[0] == 'i';
    const std::string Name = fresh(IsInput ? "in" : pKind[0] == 'o' ? "out" : "s");
    line(std::string(pKind) + " " + Type + " " + Name +
         (!IsInput && oneIn(2) ? " = " + std::to_string(below(3)) : "") + ";");
    m_Readable.push_back({Name, Type});
    if (!IsInput)
        m_Writable.push_back({Name, Type});
}

void PointedProgram::declareExterns() {
    if (!oneIn(3))
        return;
    m_Externs.push_back(fresh("outside"));
    line(join({"extern ", m_Externs.back(),
               oneIn(3) ? "" : " reads(" + pickNamed(m_Writable).Name + ")",
               oneIn(2) ? "" : " writes(" + pickNamed(m_Writable).Name + ")", ";"}));
}

void PointedProgram::chooseCallees() {
    for (std::uint64_t i = below(4); i > 0; --i) {
        Callee Made;
        Made.Name = fresh("p");
        Made.Result = oneIn(2) ? m_Types[below(m_Types.size())] : "";
        Made.IsExported = oneIn(10);
        for (std::uint64_t j = below(3); j > 0; --j) {
            Made.Formals.push_back({fresh("a"), m_Types[below(m_Types.size())]});
            Made.Favourites.push_back(numberOf(Made.Formals.back().Type));
        }
        m_Callees.push_back(Made);
    }
}

// ---- procedures ----

void PointedProgram::writeCallee(std::size_t Number) {
    const Callee& Own = m_Callees[Number];
    std::string Head = (Own.IsExported ? "export proc " : "proc ") + Own.Result +
                       (Own.Result.empty() ? "" : " ") + Own.Name + "(";
    const std::vector<Named> Readable = m_Readable;
    const std::vector<Named> Writable = m_Writable;
    for (std::size_t i = 0; i < Own.Formals.size(); ++i) {
        Head += (i == 0 ? "" : ", ") + Own.Formals[i].Type + " " + Own.Formals[i].Name;
        // Twice: a procedure is about its formals.
        m_Readable.insert(m_Readable.end(), 2, Own.Formals[i]);
        m_Writable.push_back(Own.Formals[i]);
    }
    line(Head + ") {");
    m_FirstCallee = Number + 1;
    m_Result = Own.Result;
    ++m_Indent;
    for (std::size_t i = 0; i < Own.Formals.size(); ++i) {
        if (oneIn(2))
            line(join({"if (", Own.Formals[i].Name, oneIn(2) ? " == " : " > ", Own.Favourites[i],
                       ") { ", pickNamed(m_Writable).Name, " = ", number(), "; }"}));
    }
    --m_Indent;
    body(2, 4);
    if (!m_Result.empty() && !oneIn(4))
        line("  return " + expression(2) + ";");
    line("}");
    m_Readable = Readable;
    m_Writable = Writable;
}

void PointedProgram::writeRecursion() {
    const std::string Type = m_Types[below(m_Types.size())];
    line("proc " + Type + " again(uint8 left, " + Type + " carried) {");
    line("  local " + Type + " own = " + expression(1) + ";");
    line("  if (left == 0 || left > 4) { return own; }");
    line("  local " + Type + " deeper = 0;");
    line("  deeper = again(left - 1, " + std::string(oneIn(2) ? "own" : "carried") + ");");
    line(join({"  ", pickNamed(m_Writable).Name, " = deeper ", pick({"+", "-", "&"}), " own;"}));
    line("  return own " + std::string(pick({"+", "*"})) + " carried;");
    line("}");
}

void PointedProgram::writeMain() {
    line("proc main() {");
    m_FirstCallee = 0;
    m_Result.clear();
    body(3, 8);
    if (oneIn(3)) {
        // Several ways out.
        line(join({"  if (", condition(), ") { ", pickNamed(m_Writable).Name, " = ", expression(1),
                   "; return; }"}));
        line(join({"  ", pickNamed(m_Writable).Name, " = ", expression(1), ";"}));
    }
    line("}");
}

// ---- statements ----

void PointedProgram::body(int Depth, std::uint64_t Most) {
    const std::vector<Named> Readable = m_Readable;
    const std::vector<Named> Writable = m_Writable;
    ++m_Indent;
    for (std::uint64_t i = 1 + below(Most); i > 0; --i)
        statement(Depth);
    --m_Indent;
    m_Readable = Readable;
    m_Writable = Writable;
}

void PointedProgram::statement(int Depth) {
    switch (below(Depth > 0 ? 20 : 9)) {
    case 0:
    case 1:
    case 2:
        return assign();
    case 3:
    case 4:
        return assignConstant();
    case 5:
        return keepSteady();
    case 6:
        return copyBack();
    case 7:
        return call();
    case 8: {
        const std::string Name = fresh("l");
        const std::string Type = m_Types[below(m_Types.size())];
        line(join({"local ", Type, " ", Name,
                   oneIn(4) ? "" : join({" = ", oneIn(2) ? numberOf(Type) : expression(1)}), ";"}));
        m_Readable.push_back({Name, Type});
        m_Writable.push_back({Name, Type});
        return;
    }
    default:
        return deepStatement(Depth);
    }
}

void PointedProgram::deepStatement(int Depth) {
    switch (below(14)) {
    case 0:
    case 1:
    case 2:
        return ifStatement(Depth);
    case 3:
    case 4:
        return deadBranch(Depth);
    case 5:
        return emptyArms();
    case 6:
    case 7:
        return loop(Depth);
    case 8:
        return jump(Depth);
    case 9:
        return switchStatement(Depth);
    case 10:
        return sameArms();
    case 11:
        return line(join({"if (", condition(), ") { return",
                          m_Result.empty() ? "" : " " + expression(1), "; }"}));
    case 12:
        return oneIn(4) ? endless() : call();
    default:
        return call();
    }
}

void PointedProgram::assign() {
    static const char* const Operators[] = {
        "=", "=", "=", "=", "+=", "-=", "*=", "/=", "%=", "<<=", ">>=", "&=", "|=", "^="};
    if (!m_Array.empty() && oneIn(6))
        return line(join({m_Array, "[", expression(1), "] = ", expression(1), ";"}));
    line(join({pickNamed(m_Writable).Name, " ", pick(Operators), " ", expression(2), ";"}));
}

void PointedProgram::assignConstant() {
    const Named Target = pickNamed(m_Writable);
    line(join({Target.Name, " = ", oneIn(3) ? number() : numberOf(Target.Type), ";"}));
}

/// Only propagation sees that nothing changes; by another such state if there is one, so that it
/// takes an iteration more.
void PointedProgram::keepSteady() {
    const Named Kept = pickNamed(m_Steady);
    const Named Other = pickNamed(m_Steady);
    switch (below(4)) {
    case 0:
        return line(Kept.Name + " = " + Kept.Type + ";");
    case 1:
        return line(Kept.Name + " = min(" + Kept.Name + ", " + Kept.Type + ");");
    case 2:
        return line("if (" + Other.Name + " != " + Other.Type + ") { " + Kept.Name + " = " +
                    number() + "; }");
    default:
        return line(Kept.Name + " = " + Other.Name + " - " + Other.Type + " + " + Kept.Type + ";");
    }
}

/// What is known of one variable goes into another of another type, and back.
void PointedProgram::copyBack() {
    const Named First = pickNamed(m_Writable);
    const Named Second = pickNamed(m_Writable);
    line(First.Name + " = " + Second.Name + ";");
    if (oneIn(2))
        line(join({"if (", First.Name, pick({" == ", " != ", " <= ", " > "}), numberOf(Second.Type),
                   ") { ", pickNamed(m_Writable).Name, " = ", First.Name,
                   pick({"", " + 1", " - 1", " * 2"}), "; }"}));
}

void PointedProgram::call() {
    if (!m_Externs.empty() && oneIn(3))
        return line(m_Externs.front() + "();");
    if (m_HasRecursion && oneIn(3))
        return line(join({pickNamed(m_Writable).Name, " = again(", std::to_string(below(4)), ", ",
                          expression(1), ");"}));
    if (m_FirstCallee >= m_Callees.size())
        return assign();
    callWith(m_Callees[m_FirstCallee + below(m_Callees.size() - m_FirstCallee)]);
}

void PointedProgram::callWith(const Callee& Called) {
    std::string Text = Called.Result.empty() || oneIn(4) ? "" : pickNamed(m_Writable).Name + " = ";
    Text += Called.Name + "(";
    for (std::size_t i = 0; i < Called.Formals.size(); ++i)
        Text += join({i == 0 ? "" : ", ", oneIn(3) ? expression(1) : Called.Favourites[i]});
    line(Text + ");");
}

void PointedProgram::ifStatement(int Depth) {
    line("if (" + condition() + ") {");
    body(Depth - 1, 3);
    if (oneIn(2)) {
        line("} else {");
        body(Depth - 1, 3);
    }
    line("}");
}

void PointedProgram::deadBranch(int Depth) {
    const bool HasElse = oneIn(3);
    line("if (" + falseCondition() + ") {");
    body(Depth - 1, 3);
    if (m_FirstCallee < m_Callees.size() && oneIn(2)) {
        // With other constants than the living calls.
        ++m_Indent;
        const Callee& Called = m_Callees[m_FirstCallee];
        std::string Text = Called.Name + "(";
        for (std::size_t i = 0; i < Called.Formals.size(); ++i)
            Text += (i == 0 ? "" : ", ") + number();
        line(Text + ");");
        --m_Indent;
    }
    if (HasElse) {
        line("} else {");
        body(Depth - 1, 2);
    }
    line("}");
}

/// A branch whose both ways lead to one join, alive and dead, and a definition in front and behind.
void PointedProgram::emptyArms() {
    const Named Target = pickNamed(m_Writable);
    const std::string Inner = "if (" + condition() + ") { } else { }";
    switch (below(3)) {
    case 0:
        return line(Inner);
    case 1:
        return line(join({"if (", falseCondition(), ") { ", Inner, " } else { ", Target.Name, " = ",
                          number(), "; }"}));
    default:
        line(join(
            {"if (", falseCondition(), ") { ", Target.Name, " = ", number(), "; ", Inner, " }"}));
        return line(join({"else { if (", condition(), ") { ", Target.Name, " = ",
                          numberOf(Target.Type), "; } }"}));
    }
}

void PointedProgram::loop(int Depth) {
    const std::string Counter = fresh("n");
    const std::string Bound = std::to_string(below(4));
    const std::string Test = Counter + " < " + Bound;
    const std::uint64_t Kind = below(4);
    line("local uint8 " + Counter + " = 0;");
    m_Readable.push_back({Counter, "uint8"});
    line(Kind == 0   ? join({"while (", Test, oneIn(3) ? " && " + condition() : "", ") {"})
         : Kind == 1 ? std::string("do {")
         : Kind == 2 ? "for (; " + Test + "; " + Counter + "++) {"
                     : std::string("while (true) {"));
    if (Kind == 3)
        line("  if (" + Counter + " >= " + Bound + ") { break; }");
    if (Kind != 2)
        line("  " + Counter + " = " + Counter + " + 1;");
    ++m_LoopDepth;
    body(m_LoopDepth > 1 ? 0 : Depth - 1, 3);
    --m_LoopDepth;
    if (oneIn(4))
        line(join({"  if (", condition(), ") { ", pick({"break", "continue"}), "; }"}));
    if (oneIn(4))
        line(join({"  ", pickNamed(m_Writable).Name, " = ", expression(1), ";"}));
    line(Kind == 1 ? "} while (" + Test + ");" : "}");
}

void PointedProgram::endless() {
    const std::string Inner = join({pickNamed(m_Writable).Name, " = ", expression(1), ";"});
    switch (below(3)) {
    case 0:
        return line("if (" + falseCondition() + ") { for (;;) { " + Inner + " } }");
    case 1: {
        const std::string Label = fresh("spin");
        return line("if (" + falseCondition() + ") { " + Label + ": " + Inner + " goto " + Label +
                    "; }");
    }
    default:
        return line(
            join({"if (", condition(), " && ", condition(), ") { while (",
                  std::string(oneIn(2) ? "true" : m_Steady[0].Name + " == " + m_Steady[0].Type),
                  ") { ", Inner, " } }"}));
    }
}

void PointedProgram::jump(int Depth) {
    const std::string Label = fresh("on");
    line("if (" + condition() + ") { goto " + Label + "; }");
    line("{");
    body(Depth - 1, 2);
    line("}");
    if (oneIn(2))
        line(join({"if (", oneIn(2) ? falseCondition() : condition(), ") { ",
                   pickNamed(m_Writable).Name, " = ", number(), "; goto ", Label, "; }"}));
    line(join({pickNamed(m_Writable).Name, " = ", number(), ";"}));
    line(Label + ":");
    assign();
}

void PointedProgram::switchStatement(int Depth) {
    line("switch (" + expression(1) + ") {");
    const std::uint64_t Default = below(4);
    for (std::uint64_t i = 0; i < 3; ++i) {
        line(i == Default ? "default:" : "case " + std::to_string(i) + ":");
        body(Depth - 2, 2);
        if (!oneIn(3))
            line("  break;");
    }
    line("}");
}

void PointedProgram::sameArms() {
    const std::string Same = join({pickNamed(m_Writable).Name, " = ", expression(1), ";"});
    const std::string Second =
        oneIn(2) ? join({" ", pickNamed(m_Writable).Name, " = ", number(), ";"}) : "";
    line(join({"if (", condition(), ") { ", Same, Second, " ", pickNamed(m_Writable).Name, " = ",
               number(), "; }"}));
    line(join(
        {"else { ", Same, Second, " ", pickNamed(m_Writable).Name, " = ", expression(1), "; }"}));
}

// ---- expressions ----

std::string PointedProgram::number() {
    static const char* const Numbers[] = {"0",    "1",    "2",   "3",   "-1",
                                          "0.5",  "-0.5", "255", "256", "2147483648",
                                          "1e10", "-0.0", "31",  "32",  "0.1"};
    return oneIn(2) ? pick(Numbers) : numberOf(m_Types[below(m_Types.size())]);
}

std::string PointedProgram::numberOf(const std::string& Type) {
    for (std::size_t i = 0; i < m_Types.size(); ++i) {
        if (m_Types[i] == Type && !oneIn(3))
            return m_Borders[i][below(m_Borders[i].size())];
    }
    return std::to_string(below(5));
}

std::string PointedProgram::condition() {
    const Named Tested = pickNamed(m_Readable);
    switch (below(10)) {
    case 0:
    case 1:
        return join({Tested.Name, pick({" == ", " != "}), numberOf(Tested.Type)});
    case 2:
        return pick({"", "!"}) + Tested.Name;
    case 3:
    case 4:
        return join({Tested.Name, pick({" < ", " <= ", " > ", " >= "}), numberOf(Tested.Type)});
    case 5:
        return falseCondition();
    case 6:
        return "!(" + falseCondition() + ")";
    default:
        return expression(2);
    }
}

/// False, as parsing, folding, propagation or late propagation can tell.
std::string PointedProgram::falseCondition() {
    const Named Kept = pickNamed(m_Steady);
    const Named Other = pickNamed(m_Steady);
    switch (below(6)) {
    case 0:
        return "OFF";
    case 1:
        return "OFF && " + condition();
    case 2:
        return Kept.Name + " > " + Kept.Type;
    case 3:
        return Kept.Name + " + " + Other.Name + " != " + Kept.Type + " + " + Other.Type;
    case 4:
        return "false";
    default:
        return Kept.Name + " != " + Kept.Type;
    }
}

std::string PointedProgram::expression(int Depth) {
    static const char* const Operators[] = {"+", "-",  "*",  "/",  "%",  "<<", ">>",
                                            "<", "<=", ">",  ">=", "==", "!=", "&",
                                            "^", "|",  "&&", "||", "+",  "-",  "*"};
    const std::uint64_t Kind = Depth == 0 ? below(3) : below(12);
    switch (Kind) {
    case 0:
        return number();
    case 1:
    case 2:
        return !m_Array.empty() && oneIn(8) ? m_Array + "[" + readable() + "]" : readable();
    case 3:
        return join({pick({"-", "!", "~"}), "(", expression(Depth - 1), ")"});
    case 4:
        return join({"(", m_Types[below(m_Types.size())], ") (", expression(Depth - 1), ")"});
    case 5:
        return join({pick({"abs", "sgn"}), "(", expression(Depth - 1), ")"});
    case 6: {
        const std::string Left = expression(Depth - 1);
        return join({pick({"min", "max"}), "(", Left, ", ", expression(Depth - 1), ")"});
    }
    default: {
        const std::string Left = expression(Depth - 1);
        const char* pOperator = pick(Operators);
        return "(" + Left + " " + pOperator + " " + expression(Depth - 1) + ")";
    }
    }
}

} // namespace hpn::fuzz
