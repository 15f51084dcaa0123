#ifndef RANDOMPROGRAM_H
#define RANDOMPROGRAM_H

#include "Generators/Join.h"

#include <initializer_list>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace hpn::fuzz {

/// A program text out of a seed, over the whole language: every type, scaling and saturation,
/// inputs, arrays, calls with parameters and results, a recursion, exported procedures, externs,
/// jumps, switches, unreachable code, and conditions that turn out constant early, late or never.
/// Every loop and the recursion are bounded by counters of their own, so every step ends.
class RandomProgram {
public:
    explicit RandomProgram(unsigned Seed) : m_Random(Seed) {}

    std::string text() {
        declareTypes();
        declareGlobals();
        for (int i = NumberOfProcedures; i-- > 0;)
            chooseSignature();
        for (int i = 0; i < NumberOfProcedures; ++i)
            writeProcedure(i);
        writeRecursion();
        writeMain();
        return m_Text;
    }

private:
    static constexpr int NumberOfProcedures = 4;

    struct Signature {
        std::string Result; // empty: none
        std::vector<std::pair<std::string, std::string>> Formals;
    };
    struct Scope {
        std::vector<std::string> Readable;
        std::vector<std::string> Writable;
    };

    unsigned below(unsigned Count) { return static_cast<unsigned>(m_Random() % Count); }
    bool oneIn(unsigned Count) { return below(Count) == 0; }
    std::string pick(const std::vector<std::string>& From) {
        return From[below(static_cast<unsigned>(From.size()))];
    }
    std::string pick(std::initializer_list<const char*> From) {
        return From.begin()[below(static_cast<unsigned>(From.size()))];
    }
    std::string fresh(const char* pStem) { return pStem + std::to_string(m_Names++); }
    void line(const std::string& Text) { m_Text += std::string(m_Indent * 2, ' ') + Text + "\n"; }

    // ---- declarations ----

    void declareTypes() {
        for (const char* pBase :
             {"bool", "int8", "uint8", "int16", "uint16", "int32", "uint32", "float32", "float64"})
            m_Types.push_back(pBase);
        static const char* const Declared[] = {
            "uint16 lsb 0.01 range [0, 300] saturate",
            "int16 lsb 0.5 offset -40 range [-100, 100] saturate high",
            "uint8 lsb 0.5 range [0, 100] saturate",
            "int32 lsb 0.125",
            "uint8 offset -128 range [-100, 100] saturate low",
            "uint8 range [10, 200] saturate",
            "int16 range [-1000, 1000] saturate",
            "uint32 lsb 2 offset 7",
            "float32 range [-2.5, 1000] saturate",
            "int8 lsb 0.25 range [-8, 8]",
            "float64 range [-50, 50] saturate"};
        for (int i = 0; i < 4; ++i) {
            const std::string Name = fresh("T");
            line("type " + Name + " = " +
                 Declared[below(static_cast<unsigned>(std::size(Declared)))] + ";");
            m_Types.push_back(Name);
        }
    }

    void declareGlobals() {
        for (int i = 0; i < 4; ++i)
            declare("input", i == 0 ? "bool" : pick(m_Types), false);
        for (int i = 0; i < 4; ++i)
            declare("output", pick(m_Types), true);
        for (int i = 0; i < 5; ++i)
            declare("state", pick(m_Types), true);
        line("param bool OFF = false;");
        line("param uint8 KIND = " + std::to_string(below(4)) + ";");
        line("param float64 GAIN = " + pick({"0.5", "1", "-2.25", "1e3", "0.1"}) + ";");
        m_Global.Readable.insert(m_Global.Readable.end(), {"OFF", "KIND", "GAIN"});
        // Never changes, but only propagation can know.
        line("state uint8 steady = 3;");
        m_Global.Readable.push_back("steady");
        for (int i = 0; i < 2; ++i) {
            m_Arrays.push_back(fresh("table"));
            line(std::string(i == 0 ? "state " : "output ") + pick(m_Types) + " " +
                 m_Arrays.back() + "[5];");
        }
        for (int i = 0; i < 2; ++i) {
            m_Externs.push_back(fresh("outside"));
            line(join({"extern ", m_Externs.back(),
                       oneIn(3) ? "" : " reads(" + pick(m_Global.Writable) + ")",
                       oneIn(2) ? "" : " writes(" + pick(m_Global.Writable) + ")", ";"}));
        }
    }

    void declare(const std::string& Kind, const std::string& Type, bool IsWritable) {
        const std::string Name = fresh(Kind.substr(0, 2).c_str());
        line(join({Kind, " ", Type, " ", Name,
                   IsWritable && oneIn(2) ? " = " + pick({"0", "1", "20"}) : "", ";"}));
        m_Global.Readable.push_back(Name);
        if (IsWritable)
            m_Global.Writable.push_back(Name);
    }

    void chooseSignature() {
        Signature Made;
        if (!oneIn(3))
            Made.Result = pick(m_Types);
        for (unsigned i = below(4); i > 0; --i)
            Made.Formals.emplace_back(pick(m_Types), fresh("a"));
        m_Signatures.push_back(Made);
    }

    // ---- procedures ----

    void writeProcedure(int Number) {
        const Signature& Own = m_Signatures[Number];
        std::string Head = std::string(oneIn(4) ? "export " : "") + "proc ";
        Head += Own.Result.empty() ? "" : Own.Result + " ";
        Head += "p" + std::to_string(Number) + "(";
        for (std::size_t i = 0; i < Own.Formals.size(); ++i)
            Head += (i == 0 ? "" : ", ") + Own.Formals[i].first + " " + Own.Formals[i].second;
        line(Head + ") {");
        m_Scope = m_Global;
        for (const auto& Formal : Own.Formals) {
            m_Scope.Readable.push_back(Formal.second);
            m_Scope.Writable.push_back(Formal.second);
        }
        m_FirstCallee = Number + 1;
        m_HasResult = !Own.Result.empty();
        body(3);
        if (m_HasResult && !oneIn(4))
            lineIn("return " + expression(2) + ";");
        line("}");
    }

    /// Calls itself with a counter that falls; its locals live in each activation.
    void writeRecursion() {
        line("proc int32 again(int16 left, " + pick(m_Types) + " carried) {");
        m_Scope = m_Global;
        m_Scope.Readable.insert(m_Scope.Readable.end(), {"left", "carried"});
        m_Scope.Writable.push_back("carried");
        m_FirstCallee = NumberOfProcedures;
        m_HasResult = true;
        lineIn("local int32 own = " + expression(1) + ";");
        lineIn("if (left <= 0) { return own; }");
        m_Scope.Writable.push_back("own");
        m_Scope.Readable.push_back("own");
        m_CanRecurse = false;
        body(1);
        lineIn("own = own + again(left - 1, " + std::string("carried") + ");", true);
        lineIn("return own + left;");
        line("}");
        m_CanRecurse = true;
    }

    void writeMain() {
        line("proc main() {");
        m_Scope = m_Global;
        m_FirstCallee = 0;
        m_HasResult = false;
        body(4);
        lineIn(join({pick(m_Scope.Writable), " = ", expression(2), ";"}));
        line("}");
    }

    void lineIn(const std::string& Text, bool SplitsCall = false) {
        ++m_Indent;
        if (SplitsCall) {
            // A call cannot stand in an expression.
            line("local int32 below_ = 0;");
            line("below_ = again(left - 1, carried);");
            line("own = own / 2 + below_;");
        } else {
            line(Text);
        }
        --m_Indent;
    }

    // ---- statements ----

    void body(int Depth) {
        const Scope Outer = m_Scope;
        ++m_Indent;
        const unsigned Count = 2 + below(Depth > 2 ? 5 : 3);
        for (unsigned i = 0; i < Count; ++i)
            statement(Depth);
        --m_Indent;
        m_Scope = Outer;
    }

    void statement(int Depth) {
        switch (Depth <= 0 ? below(5) : below(22)) {
        case 0:
        case 1:
        case 2:
            return assignment();
        case 3:
            return line(join({m_Arrays[below(2)], "[", expression(1), "] = ", expression(2), ";"}));
        case 4:
            return declareLocal();
        case 5:
            return line(join({pick(m_Scope.Writable), " ",
                              pick({"+=", "-=", "*=", "/=", "%=", "<<=", ">>=", "&=", "|=", "^="}),
                              " ", expression(1), ";"}));
        case 6:
            return line(pick(m_Externs) + "();");
        case 7:
        case 8:
            return call();
        case 9:
        case 10:
        case 11:
            return ifStatement(Depth);
        case 12:
        case 13:
            return loop(Depth);
        case 14:
            return switchStatement(Depth);
        case 15:
            return jumpForward(Depth);
        case 16:
            return jumpBack(Depth);
        case 17:
            return never(Depth);
        case 18:
            return sameInBothArms();
        case 19:
            return line("steady = " + pick({"3", "steady", "KIND * 0 + 3", "min(steady, 3)"}) +
                        ";");
        case 20:
            return leave();
        default:
            return line(join({pick(m_Scope.Writable), pick({"++", "--"}), ";"}));
        }
    }

    void assignment() { line(join({pick(m_Scope.Writable), " = ", expression(3), ";"})); }

    void declareLocal() {
        const std::string Name = fresh("l");
        line(
            join({"local ", pick(m_Types), " ", Name, oneIn(4) ? "" : " = " + expression(2), ";"}));
        m_Scope.Readable.push_back(Name);
        m_Scope.Writable.push_back(Name);
    }

    void call() {
        const int Callable = NumberOfProcedures - m_FirstCallee;
        if (m_CanRecurse && (Callable == 0 || oneIn(5)))
            return line(join({pick(m_Scope.Writable), " = again(", std::to_string(below(4)), ", ",
                              expression(1), ");"}));
        if (Callable == 0)
            return assignment();
        const int Callee = m_FirstCallee + static_cast<int>(below(static_cast<unsigned>(Callable)));
        std::string Text =
            m_Signatures[Callee].Result.empty() || oneIn(4) ? "" : pick(m_Scope.Writable) + " = ";
        Text += "p" + std::to_string(Callee) + "(";
        for (std::size_t i = 0; i < m_Signatures[Callee].Formals.size(); ++i)
            Text += join({i == 0 ? "" : ", ", oneIn(2) ? number() : expression(2)});
        line(Text + ");");
    }

    void ifStatement(int Depth) {
        line("if (" + condition() + ") {");
        body(Depth - 1);
        if (oneIn(3)) {
            line("} else if (" + condition() + ") {");
            body(Depth - 1);
        }
        if (oneIn(2)) {
            line("} else {");
            body(Depth - 1);
        }
        line("}");
    }

    void loop(int Depth) {
        const std::string Counter = fresh("n");
        const std::string Bound = std::to_string(1 + below(4));
        const unsigned Kind = below(3);
        line("local uint8 " + Counter + " = 0;");
        m_Scope.Readable.push_back(Counter);
        if (Kind == 0)
            line(join(
                {"while (", Counter, " < ", Bound, oneIn(2) ? " && " + condition() : "", ") {"}));
        else if (Kind == 1)
            line("do {");
        else
            line("for (" + Counter + " = 0; " + Counter + " < " + Bound + "; " + Counter + "++) {");
        if (Kind != 2)
            lineIn(Counter + " = " + Counter + " + 1;");
        ++m_LoopDepth;
        body(m_LoopDepth > 1 ? 0 : Depth - 1);
        --m_LoopDepth;
        if (oneIn(3))
            lineIn(join({"if (", condition(), ") { ", pick({"break", "continue"}), "; }"}));
        if (oneIn(3))
            lineIn(join({pick(m_Scope.Writable), " = ", expression(1), ";"}));
        line(Kind == 1 ? "} while (" + Counter + " < " + Bound + ");" : "}");
    }

    void switchStatement(int Depth) {
        line("switch (" + expression(1) + ") {");
        const unsigned Count = 2 + below(4);
        const unsigned Default = below(6);
        for (unsigned i = 0; i < Count; ++i) {
            line(i == Default ? "default:" : "case " + std::to_string(i) + ":");
            body(Depth - 2);
            if (!oneIn(3))
                lineIn("break;");
        }
        line("}");
    }

    void jumpForward(int Depth) {
        const std::string Label = fresh("on");
        line("if (" + condition() + ") { goto " + Label + "; }");
        statementsOnly(Depth - 1);
        if (oneIn(3)) {
            line("if (" + condition() + ") {");
            body(Depth - 2);
            lineIn("goto " + Label + ";");
            line("}");
        }
        statementsOnly(Depth - 2);
        line(Label + ":");
        assignment();
    }

    void jumpBack(int Depth) {
        if (m_LoopDepth > 0)
            return assignment();
        const std::string Label = fresh("back");
        const std::string Counter = fresh("n");
        line("local uint8 " + Counter + " = 0;");
        m_Scope.Readable.push_back(Counter);
        if (oneIn(3))
            line("if (" + condition() + ") { goto " + Label + "_in; }");
        line(Label + ":");
        ++m_LoopDepth;
        statementsOnly(Depth - 2);
        line(Label + "_in:");
        line(Counter + " = " + Counter + " + 1;");
        statementsOnly(Depth - 2);
        --m_LoopDepth;
        line("if (" + Counter + " < 3) { goto " + Label + "; }");
    }

    /// A block of statements whose locals cannot be seen behind it.
    void statementsOnly(int Depth) {
        line("{");
        body(Depth);
        line("}");
    }

    void never(int Depth) {
        switch (below(4)) {
        case 0:
            line("if (OFF) {");
            lineIn(join({"while (true) { ", pick(m_Scope.Writable), " = ", expression(1), "; }"}));
            break;
        case 1:
            line("if (steady != 3) {");
            body(Depth - 1);
            break;
        case 2:
            line("if (OFF && " + condition() + ") {");
            lineIn("for (;;) { }");
            break;
        default:
            line("if (KIND > 3) {");
            body(Depth - 1);
        }
        line("}");
    }

    void sameInBothArms() {
        const std::string Same = join({pick(m_Scope.Writable), " = ", expression(2), ";"});
        line("if (" + condition() + ") {");
        lineIn(Same);
        body(0);
        line("} else {");
        lineIn(Same);
        body(0);
        line("}");
    }

    /// Leaves the procedure in the middle; what follows may be unreachable.
    void leave() {
        const std::string Return = m_HasResult ? "return " + expression(1) + ";" : "return;";
        line(oneIn(6) ? Return : "if (" + condition() + ") { " + Return + " }");
    }

    // ---- expressions ----

    std::string number() {
        return pick({"0",     "1",     "2",          "3",          "7",           "8",
                     "31",    "100",   "127",        "128",        "255",         "256",
                     "32767", "65535", "2147483647", "2147483648", "4294967295",  "0.5",
                     "0.1",   "2.5",   "1e10",       "1e-3",       "300",         "true",
                     "false", "-1",    "-128",       "-40",        "-2147483648", "1e300"});
    }

    std::string condition() {
        switch (below(8)) {
        case 0:
            return join({pick(m_Scope.Readable), pick({" == ", " != "}), number()});
        case 1:
            return pick({"", "!"}) + m_Scope.Readable[0];
        case 2:
            return pick(
                {"steady == 3", "steady > 4", "KIND == 1", "OFF", "!OFF", "steady + KIND > 10"});
        default:
            return expression(2);
        }
    }

    std::string expression(int Depth) {
        const unsigned Kind = Depth == 0 ? below(3) : below(14);
        if (Kind == 0)
            return number();
        if (Kind < 3)
            return oneIn(8)
                       ? join({pick(m_Arrays), "[",
                               Depth > 0 ? expression(Depth - 1) : pick(m_Scope.Readable), "]"})
                       : pick(m_Scope.Readable);
        if (Kind == 3)
            return join({pick({"-", "!", "~"}), "(", expression(Depth - 1), ")"});
        if (Kind == 4)
            return join({"(", pick(m_Types), ") (", expression(Depth - 1), ")"});
        if (Kind == 5)
            return join({pick({"abs", "sgn"}), "(", expression(Depth - 1), ")"});
        if (Kind == 6)
            return join({pick({"min", "max"}), "(", expression(Depth - 1), ", ",
                         expression(Depth - 1), ")"});
        const std::string Op = pick({"+",  "-",  "*", "/", "%", "<<", ">>", "<", "<=", ">", ">=",
                                     "==", "!=", "&", "^", "|", "&&", "||", "+", "-",  "*"});
        return join({"(", expression(Depth - 1), " ", Op, " ", expression(Depth - 1), ")"});
    }

    std::mt19937 m_Random;
    std::string m_Text;
    std::size_t m_Indent = 0;
    unsigned m_Names = 0;
    std::vector<std::string> m_Types;
    std::vector<std::string> m_Arrays;
    std::vector<std::string> m_Externs;
    std::vector<Signature> m_Signatures;
    Scope m_Global;
    Scope m_Scope;
    int m_FirstCallee = 0;
    int m_LoopDepth = 0;
    bool m_HasResult = false;
    bool m_CanRecurse = true;
};

} // namespace hpn::fuzz

#endif
