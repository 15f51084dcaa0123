#ifndef LIBRARYPROGRAM_H
#define LIBRARYPROGRAM_H

#include "Generators/Join.h"

#include <random>
#include <string>

namespace passes {

using hpn::fuzz::join;

// Random programs in the language of the library's test client: nested branches and counted loops
// over a few variables, and calls of procedures with higher numbers.
class LibraryProgram {
public:
    explicit LibraryProgram(unsigned int Seed) : m_Random(Seed) {}

    std::string text() {
        m_Procedures = 1 + int(m_Random() % 4);
        std::string Text;
        for (m_Current = 0; m_Current < m_Procedures; ++m_Current)
            Text += "proc " +
                    (m_Current == 0 ? std::string("main { o1 = o1; o2 = o2; ")
                                    : "p" + std::to_string(m_Current) + " { ") +
                    statements(3) + "} ";
        return Text;
    }

private:
    int pick(int Count) { return int(m_Random() % unsigned(Count)); }
    std::string variable() {
        static char const* const Names[] = {"a", "b", "c", "s", "f", "o1", "o2"};
        return Names[pick(7)];
    }
    std::string operand() {
        int Kind = pick(8);
        return Kind < 3    ? std::to_string(pick(4))
               : Kind == 3 ? (pick(2) ? "in1" : "in2")
                           : variable();
    }
    std::string expression() {
        static char const* const Operators[] = {"+", "-", "*", "<", "==", "!=", "&", "|"};
        std::string Text = pick(6) == 0 ? "!" + operand() : operand();
        for (int Count = pick(3); Count > 0; --Count)
            Text += join({" ", Operators[pick(8)], " ", operand()});
        return Text;
    }
    // Conditions are often of a form that tells something, or known.
    std::string condition() {
        switch (pick(5)) {
        case 0:
            return join({variable(), " == ", std::to_string(pick(3))});
        case 1:
            return join({variable(), " != ", std::to_string(pick(3))});
        case 2:
            return pick(2) ? "f" : "!f";
        case 3:
            return pick(2) ? "0" : "1";
        default:
            return expression();
        }
    }
    std::string statements(int Depth) {
        std::string Text;
        for (int Count = pick(5); Count > 0; --Count)
            Text += statement(Depth);
        return Text;
    }
    std::string statement(int Depth) {
        int Kind = pick(Depth > 0 ? 10 : 5);
        if (Kind < 5)
            return join({variable(), " = ", expression(), "; "});
        if (Kind < 7)
            return join({"if ", condition(), " { ", statements(Depth - 1), "} else { ",
                         statements(Depth - 1), "} "});
        if (Kind == 7) {
            std::string Counter = "i" + std::to_string(m_Loops++);
            return join({Counter, " = 0; while ", Counter, " < ", std::to_string(pick(4)), " { ",
                         Counter, " = ", Counter, " + 1; ", statements(Depth - 1), "} "});
        }
        if (Kind == 8)
            return "extern " + variable() + "; ";
        return m_Current + 1 < m_Procedures
                   ? "call p" + std::to_string(m_Current + 1 + pick(m_Procedures - m_Current - 1)) +
                         "; "
                   : "";
    }

    std::mt19937 m_Random;
    int m_Procedures = 0;
    int m_Current = 0;
    int m_Loops = 0;
};

} // namespace passes

#endif
