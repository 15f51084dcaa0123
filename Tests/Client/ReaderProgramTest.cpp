#include "ReaderTestSupport.h"

#include <gtest/gtest.h>

#include <cmath>
#include <random>
#include <string_view>

// What the reader makes of a text that it accepts.

namespace {

using namespace hpn;

std::string printedMain(const std::string& Statements) {
    const std::string Text = printed(inMain(Statements));
    const std::size_t Start = Text.find("proc main() {\n");
    return Start == std::string::npos ? Text : Text.substr(Start + 14, Text.size() - Start - 16);
}

TEST(ReaderProgram, StatementsHangTogetherAsInC) {
    const std::pair<const char*, const char*> Cases[] = {
        // An else belongs to the nearest if that has none.
        {"if (in) if (s) s = 1; else s = 2;", R"(  if (in) {
    if (s) {
      s = 1;
    } else {
      s = 2;
    }
  }
)"},
        {"if (in) { if (s) s = 1; } else s = 2;", R"(  if (in) {
    if (s) {
      s = 1;
    }
  } else {
    s = 2;
  }
)"},
        {"if (in) while (s) if (P) ; else s = 2; else if (P) { } else s = 3; s = 4;", R"(  if (in) {
    while (s) {
      if (P) {
        ;
      } else {
        s = 2;
      }
    }
  } else if (P) {
  } else {
    s = 3;
  }
  s = 4;
)"},
        {"do if (in) break; else continue; while (s); s = 1;", R"(  do {
    if (in) {
      break;
    } else {
      continue;
    }
  } while (s);
  s = 1;
)"},
        // Cases fall through, and stand with what follows them; labels stand before anything.
        {"switch (in) { case 1: case P + 1: s = 1; default: { s = 2; } case -1: }",
         R"(  switch (in) {
  case 1:
  case P + 1:
    s = 1;
  default:
    {
      s = 2;
    }
  case -1:
  }
)"},
        {"if (in) on: if (s) goto on; while (in) { goto out_; } out_:", R"(  if (in) {
on:
    if (s) {
      goto on;
    }
  }
  while (in) {
    goto out_;
  }
out_:
)"},
        {"goto within; { within: s = 1; } for (;;) { goto within; }", R"(  goto within;
  {
within:
    s = 1;
  }
  for (; ; ) {
    goto within;
  }
)"},
        // A call is a statement of its own.
        {"local T x = g(); local T y = 1; { local bool x2 = x; } e(); s = g(); f(x);",
         R"(  local T x;
  x = g();
  local T y = 1;
  {
    local bool x2 = x;
  }
  e();
  s = g();
  f(x);
)"},
        {"for (local uint8 i = 0; i < 3; i++) f(i); for (s = 0; ; --s) ; for (s <<= 1; s; s--) { }",
         R"(  for (local uint8 i = 0; i < 3; i++) {
    f(i);
  }
  for (s = 0; ; s--) {
    ;
  }
  for (s <<= 1; s; s--) {
  }
)"},
        {"{ local uint8 i; } { local int8 i; } a[s] |= 0x1F; a[1]++; return;", R"(  {
    local uint8 i;
  }
  {
    local int8 i;
  }
  a[s] |= 0x1F;
  a[1]++;
  return;
)"},
        // Parentheses only where the tree needs them.
        {"s = ((in)) + (s * 2) - (3 - (1)); s = -(-(1)) + +1 - -(2); s = !(in == 1) && (T)(in + "
         "1);",
         R"(  s = in + s * 2 - (3 - 1);
  s = - -1 + 1 - -2;
  s = !(in == 1) && (T)(in + 1);
)"},
    };
    for (const auto& [pText, pExpected] : Cases)
        EXPECT_EQ(printedMain(pText), pExpected) << pText;
}

TEST(ReaderProgram, DeclarationsPrintInTheirOrder) {
    EXPECT_EQ(printed(R"(
type T = int16 saturate high range [-100 + 0, 10 * 10] offset -40 lsb 0.5;
type U = uint8 lsb 1.0 offset 0; type V = float64 range [-1e22, 1180591620717411303424.0];
extern a reads () writes(w, v);
param uint8 N = 3; /* three */ state T v = -(1 + 1); output uint8 w[N] = {1, 2,}; // late
export proc T both(V x, bool y) { return x; }
proc main() { }
)"),
              R"(type T = int16 lsb 0.5 offset -40 range [-100, 100] saturate high;
type U = uint8;
type V = float64 range [-1e+22, 1180591620717411303424.0];
extern a writes(w, v);
param uint8 N = 3;
state T v = -(1 + 1);
output uint8 w[3] = {1, 2};

export proc T both(V x, bool y) {
  return x;
}

proc main() {
}
)");
}

TEST(ReaderProgram, InitialValuesAreComputedAndConverted) {
    const std::pair<const char*, double> Cases[] = {
        {"float64 x = 3 / 2", 1.5},
        {"float64 x = 0 / 0", 0.0},
        {"float64 x = 0 * (1 / 0)", 0.0},
        {"float64 x = 2 || 3", 0.0},
        {"float64 x = 2 && 3", 1.0},
        {"float64 x = 7 % 0", 0.0},
        {"float64 x = -7 % 4 + 7.9 % 4", 0.0},
        {"float64 x = 1 << 33", 2.0},
        {"float64 x = ~4294967295", 2147483647.0},
        {"float64 x = 0xFF ^ 0x0F | 256", 496.0},
        {"float64 x = min(3, max(1, 2)) + abs(-4) * sgn(-0.5)", -2.0},
        {"float64 x = P * Q", 6.5},
        {"float64 x = (uint8) 300.7 + (S) 0.3", 44.5},
        {"float64 x = -0.0", 0.0},
        {"float32 x = 0.1", 0.10000000149011612},
        {"S x = 0.75", 1.0},
        {"S x = 1000", 100.0},
        {"S x = -1", 0.0},
        {"int8 x = 200", -56.0},
        {"uint8 x = true + true", 2.0},
        {"bool x = 0.25", 1.0},
        {"int32 x = 4294967295", -2147483648.0},
        {"uint32 x = -1", 4294967295.0},
    };
    for (const auto& [pText, Expected] : Cases) {
        const ReadText Read("type S = uint8 lsb 0.5 range [0, 100] saturate; param uint8 P = 2; "
                            "param float64 Q = P + 1.25; proc main() { } state " +
                            std::string(pText) + ";");
        ASSERT_TRUE(Read.isRead()) << pText << "\n" << Read.messages();
        const std::vector<double>& Initial = Read.variable("x")->Initial;
        ASSERT_EQ(Initial.size(), 1U) << pText;
        EXPECT_EQ(Initial[0], Expected) << pText;
        EXPECT_EQ(std::signbit(Initial[0]), std::signbit(Expected)) << pText;
    }
}

TEST(ReaderProgram, EveryVariableHoldsNumbersOfItsType) {
    // Zero is beyond the lower limit of a saturating type, and not on every grid.
    const ReadText Read(R"(type S = uint8 range [5, 9] saturate; type G = int8 lsb 2 offset 1;
state S s; state S list[3] = {6}; state G g; proc S f(S formal, G other) { local S l; local G m; return l; }
proc main() { s = f(1, 2); })");
    ASSERT_TRUE(Read.isRead()) << Read.messages();
    for (const char* pName : {"s", "formal", "l"})
        EXPECT_EQ(Read.variable(pName)->Initial, std::vector<double>{5.0}) << pName;
    for (const char* pName : {"g", "other", "m"})
        EXPECT_EQ(Read.variable(pName)->Initial, std::vector<double>{-1.0}) << pName;
    EXPECT_EQ(Read.variable("list")->Initial, (std::vector<double>{6.0, 5.0, 5.0}));
    EXPECT_EQ(Read.procedure("f")->pResult->Initial, std::vector<double>{5.0});
}

TEST(ReaderProgram, LimitsLieExactlyOnTheGrid) {
    const ReadText Read("type A = uint16 lsb 0.01 range [0.1, 300.000000001] saturate;"
                        "type B = int8 lsb 0.1 offset 0.3 range [-1, 1];"
                        "type C = float32 range [-0.1, 0.1]; proc main() { }");
    ASSERT_TRUE(Read.isRead()) << Read.messages();
    const Type* pTypes = &Read.program().Types[9];
    EXPECT_EQ(pTypes[0].Lower, 10 * 0.01);
    EXPECT_EQ(pTypes[0].Upper, 30000 * 0.01);
    EXPECT_EQ(pTypes[1].Lower, -13 * 0.1 + 0.3);
    EXPECT_EQ(pTypes[1].Upper, 7 * 0.1 + 0.3);
    EXPECT_EQ(pTypes[2].Lower, static_cast<double>(-0.1F));
}

TEST(ReaderProgram, PositionsPointToWhatTheyAreOf) {
    const std::string Text = "state uint8 x; proc uint8 g() { return 1; }\n"
                             "proc main() { x = x + 1; local uint8 l = g(); if (x) { } }";
    const ReadText Read(Text);
    ASSERT_TRUE(Read.isRead());
    const Statement* pStatement = Read.procedure("main")->pBody;
    EXPECT_EQ(pStatement->Position.Offset, Text.find("x = x"));
    EXPECT_EQ(pStatement->pValue->Position.Offset, Text.find("+ 1"));
    pStatement = pStatement->pNext;
    EXPECT_EQ(pStatement->Position.Offset, Text.find("local"));
    EXPECT_EQ(pStatement->pTarget->Position.Offset, Text.find("l = g"));
    pStatement = pStatement->pNext;
    ASSERT_EQ(pStatement->Kind, StatementKind::Call);
    EXPECT_EQ(pStatement->Position.Offset, Text.find("g();"));
    EXPECT_EQ(pStatement->pTarget->Name, "l");
    EXPECT_EQ(pStatement->pNext->Position.Offset, Text.find("if"));
    EXPECT_EQ(Read.procedure("g")->pResult->Name, "g");
}

/// Binary operators by precedence as C has them, the strongest first.
const std::vector<std::vector<std::string_view>> Strengths = {
    {"*", "/", "%"}, {"+", "-"}, {"<<", ">>"}, {"<", "<=", ">", ">="}, {"==", "!="}, {"&"}, {"^"},
    {"|"},           {"&&"},     {"||"}};

/// The oracle: groups a flat chain in one pass for each strength, from the left.
std::string groupChain(std::vector<std::string> Operands, std::vector<std::string> Operators) {
    for (const auto& Strength : Strengths)
        for (std::size_t At = 0; At < Operators.size();) {
            if (std::find(Strength.begin(), Strength.end(), Operators[At]) == Strength.end()) {
                ++At;
                continue;
            }
            Operands[At] = "(" + Operands[At] + " " + Operators[At] + " " + Operands[At + 1] + ")";
            Operands.erase(Operands.begin() + static_cast<std::ptrdiff_t>(At) + 1);
            Operators.erase(Operators.begin() + static_cast<std::ptrdiff_t>(At));
        }
    return Operands[0];
}

std::string grouped(const Expression* pRoot) {
    static const char* const Texts[] = {"*", "/",  "%",  "+",  "-", "<<", ">>", "<",  "<=",
                                        ">", ">=", "==", "!=", "&", "^",  "|",  "&&", "||"};
    switch (pRoot->Op) {
    case Operator::Number:
    case Operator::Variable:
        return std::string(pRoot->Text);
    case Operator::Negate:
        return "-" + grouped(pRoot->pLeft);
    case Operator::LogicalNot:
        return "!" + grouped(pRoot->pLeft);
    case Operator::Complement:
        return "~" + grouped(pRoot->pLeft);
    case Operator::Cast:
        return "(" + std::string(pRoot->pType->Name) + ")" + grouped(pRoot->pLeft);
    default:
        return "(" + grouped(pRoot->pLeft) + " " +
               Texts[static_cast<int>(pRoot->Op) - static_cast<int>(Operator::Multiply)] + " " +
               grouped(pRoot->pRight) + ")";
    }
}

TEST(ReaderProgram, OperatorsBindAsInC) {
    std::mt19937 Random(5);
    static const char* const Leaves[] = {"s", "in", "1", "-s", "!in", "~2", "(T)s", "-(bool)in"};
    for (int Try = 0; Try < 2000; ++Try) {
        std::vector<std::string> Operands{Leaves[Random() % std::size(Leaves)]};
        std::vector<std::string> Operators;
        std::string Chain = Operands[0];
        for (unsigned Count = Random() % 12; Count > 0; --Count) {
            const auto& Strength = Strengths[Random() % Strengths.size()];
            Operators.emplace_back(Strength[Random() % Strength.size()]);
            Operands.emplace_back(Leaves[Random() % std::size(Leaves)]);
            Chain += " " + Operators.back() + " " + Operands.back();
        }
        const std::string Expected = groupChain(Operands, Operators);
        const ReadText Flat(inMain("s = " + Chain + ";"));
        ASSERT_TRUE(Flat.isRead()) << Chain;
        EXPECT_EQ(grouped(Flat.procedure("main")->pBody->pValue), Expected) << Chain;
        // The printer needs the same rule to leave parentheses out.
        EXPECT_EQ(printedMain("s = " + Expected + ";"), "  s = " + Chain + ";\n");
    }
}

TEST(ReaderProgram, RecursionIsReachingOneself) {
    std::mt19937 Random(6);
    for (int Try = 0; Try < 200; ++Try) {
        const std::size_t Count = 1 + Random() % 9;
        std::vector<std::vector<bool>> Reaches(Count, std::vector<bool>(Count));
        std::string Text = "proc main() { }\n";
        for (std::size_t i = 0; i < Count; ++i) {
            Text += "proc p" + std::to_string(i) + "() {";
            for (unsigned Calls = Random() % 3; Calls > 0; --Calls) {
                const std::size_t Callee = Random() % Count;
                Reaches[i][Callee] = true;
                Text += " p" + std::to_string(Callee) + "();";
            }
            Text += " }\n";
        }
        for (std::size_t Via = 0; Via < Count; ++Via)
            for (std::size_t From = 0; From < Count; ++From)
                for (std::size_t To = 0; To < Count; ++To)
                    if (Reaches[From][Via] && Reaches[Via][To])
                        Reaches[From][To] = true;
        const ReadText Read(Text);
        ASSERT_TRUE(Read.isRead());
        for (std::size_t i = 0; i < Count; ++i)
            EXPECT_EQ(Read.procedure("p" + std::to_string(i))->IsRecursive, Reaches[i][i])
                << i << "\n"
                << Text;
    }
}

/// The program texts of the language's description, and the declarations of its tables with the
/// numbers that they are said to give.
struct Description {
    std::vector<std::string> Texts;
    std::vector<std::pair<std::string, double>> Rows;
};

Description readDescription() {
    Description Found;
    std::ifstream Stream(HPNSSA_SOURCE_DIR "/Documentation/Language.md");
    bool IsInside = false;
    for (std::string Line; std::getline(Stream, Line);) {
        if (Line == "```hpn")
            Found.Texts.emplace_back();
        const std::size_t End = Line.find("` | ");
        if (IsInside && Line != "```")
            Found.Texts.back() += Line + "\n";
        else if (Line.rfind("| `", 0) == 0 && Line.find(" x = ") < End) {
            std::string Declaration = Line.substr(3, End - 3);
            Declaration.erase(std::remove(Declaration.begin(), Declaration.end(), '\\'),
                              Declaration.end());
            Found.Rows.emplace_back(Declaration, std::stod(Line.substr(End + 4)));
        }
        IsInside = Line == "```hpn" || (IsInside && Line != "```");
    }
    return Found;
}

TEST(ReaderProgram, DescriptionOfTheLanguageIsTrue) {
    const Description Described = readDescription();
    ASSERT_GT(Described.Texts.size(), 4U);
    ASSERT_GT(Described.Rows.size(), 30U);
    std::string Types;
    for (const std::string& Text : Described.Texts) {
        const bool HasMain = Text.find("proc main()") != std::string::npos;
        const ReadText Read(Text + (HasMain ? "" : "proc main() { }\n"));
        EXPECT_EQ(Read.messages(), "") << Text;
        if (Text.rfind("type", 0) == 0 && Types.empty())
            Types = Text;
    }
    for (const auto& [Declaration, Expected] : Described.Rows) {
        const ReadText Read(Types + "proc main() { }\nparam " + Declaration + ";");
        ASSERT_TRUE(Read.isRead()) << Declaration << Read.messages();
        EXPECT_EQ(Read.variable("x")->Initial[0], Expected) << Declaration;
    }
}

} // namespace
