#ifndef POINTEDPROGRAM_H
#define POINTEDPROGRAM_H

#include "Stimulus.h"

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

namespace hpn::fuzz {

/// A small program text out of a seed, aimed at what optimisers get wrong: numbers at the borders
/// of types and declared ranges, conditions that become constant late (states that only ever hold
/// their start value, chains of those), phi functions behind dead branches, calls in dead branches,
/// one procedure called with equal and with different constants, notes from branches on clipped and
/// scaled variables, joins with parallel ways in, several ways out of a procedure, equal code in
/// both arms, loops that are left in the middle, jumps into them, endless ones that are never
/// entered, and a few that are. Twenty to sixty statements; nearly all programs end.
class PointedProgram {
public:
    explicit PointedProgram(std::uint64_t Seed) : m_Seed(Seed) {}
    std::string text();

private:
    struct Named {
        std::string Name;
        std::string Type;
    };
    struct Callee {
        std::string Name;
        std::string Result; // empty: none
        std::vector<Named> Formals;
        std::vector<std::string> Favourites; // a constant for each formal that most calls pass
        bool IsExported = false;
    };

    std::uint64_t below(std::uint64_t Count) { return mixBits(m_Seed, m_Counter++) % Count; }
    bool oneIn(std::uint64_t Count) { return below(Count) == 0; }
    template <std::size_t N>
    const char* pick(const char* const (&From)[N]) {
        return From[below(N)];
    }
    const Named& pickNamed(const std::vector<Named>& From) { return From[below(From.size())]; }
    std::string fresh(const char* pStem) { return pStem + std::to_string(m_Names++); }
    void line(const std::string& Text) {
        m_Text.append(m_Indent * 2, ' ');
        m_Text += Text + "\n";
    }

    void declareTypes();
    void declareGlobals();
    void declare(const char* pKind, const std::string& Type);
    void declareExterns();
    void chooseCallees();
    void writeCallee(std::size_t Number);
    void writeRecursion();
    void writeMain();

    void body(int Depth, std::uint64_t Most);
    void statement(int Depth);
    void deepStatement(int Depth);
    void assign();
    void assignConstant();
    void keepSteady();
    void call();
    void callWith(const Callee& Called);
    void ifStatement(int Depth);
    void deadBranch(int Depth);
    void emptyArms();
    void loop(int Depth);
    void endless();
    void jump(int Depth);
    void switchStatement(int Depth);
    void sameArms();
    void copyBack();

    std::string number();
    std::string numberOf(const std::string& Type);
    std::string condition();
    std::string falseCondition();
    std::string expression(int Depth);
    const std::string& readable() { return pickNamed(m_Readable).Name; }

    std::uint64_t m_Seed;
    std::uint64_t m_Counter = 0;
    std::string m_Text;
    std::size_t m_Indent = 0;
    unsigned m_Names = 0;
    std::vector<std::string> m_Types;
    std::vector<std::vector<std::string>> m_Borders; // by type
    std::vector<Named> m_Readable;
    std::vector<Named> m_Writable;
    std::vector<Named>
        m_Steady; // states that hold their start value for good; the type is the value
    std::vector<std::string> m_Externs;
    std::vector<Callee> m_Callees;
    std::string m_Array;
    std::size_t m_FirstCallee = 0;
    std::string m_Result; // type of the procedure in hand
    bool m_HasRecursion = false;
    int m_LoopDepth = 0;
};

} // namespace hpn::fuzz

#endif
