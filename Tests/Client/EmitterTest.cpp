#include "Emitter/CNames.h"
#include "Oracles/CRunner.h"
#include "Oracles/ProgramComparison.h"

#include <gtest/gtest.h>

#include <string>

namespace {

using namespace hpn;

std::string emitted(const std::string& Text, const PassSequence& Passes = PassSequence(),
                    const std::string& Prefix = "") {
    const ReadText Read({{"test.hpn", Text}});
    if (!Read.isRead())
        return Read.messages();
    return ProgramComparison::emit(Read.program(), Prefix, Passes);
}

std::string optimised(const std::string& Text) {
    return emitted(Text, PassSequence::defaultOrder());
}

bool contains(const std::string& Text, const std::string& Part) {
    return Text.find(Part) != std::string::npos;
}

/// The body of a function of the text, without its head.
std::string bodyOf(const std::string& Text, const std::string& Function) {
    const std::size_t Head = Text.find(Function + ") {\n");
    if (Head == std::string::npos)
        return "no function " + Function + " in\n" + Text;
    const std::size_t Start = Text.find('\n', Head) + 1;
    return Text.substr(Start, Text.find("\n}\n", Head) + 1 - Start);
}

void expectCompiles(const std::string& Text) {
    CRunner Runner;
    Runner.write("t.c", Text);
    EXPECT_EQ(Runner.compile("t", "-O2 -c"), "") << Text;
    if (hostshell::status("command -v clang 2>&1") == 0) {
        EXPECT_EQ(Runner.compile("t", "-O2 -c", "clang"), "") << Text;
    }
}

TEST(Emitter, StatementsReadLikeTheSource) {
    const struct {
        const char* pSource;
        const char* pExpected;
    } Cases[] = {
        // Integers stay integers, the conversion is a cast.
        {"output uint8 y; input uint8 a; proc main() { y = a + 1; }",
         "    y = (uint8_t)(a + 1);\n"},
        {"output uint8 y; input uint8 a; proc main() { y = a / 2; }",
         "    y = (uint8_t)(a / 2);\n"},
        {"output int32 y; input uint8 a; proc main() { y = (a << 4) | (a & 15); }",
         "    y = (a << 4) | (a & 15);\n"},
        {"output uint8 y; input uint8 a; proc main() { y = a % 7; }",
         "    y = (uint8_t)(a % 7);\n"},
        {"output bool y; input uint32 a; input int32 b; proc main() { y = a < b; }",
         "    y = (int64_t)a < b;\n"},
        // What C computes otherwise goes through the runtime.
        {"output int32 y; input int32 a; proc main() { y = a % a; }", "    y = hpn_mod(a, a);\n"},
        {"output float64 y; input float64 a; proc main() { y = a * 0.5; }",
         "    y = hpn_nan(hpn_double(a * 0.5));\n"},
        // Scaled variables: raw numbers in copies and comparisons.
        {"type S = uint16 lsb 0.5; output S y; input S a; proc main() { if (a > 10.2) { y = a; } }",
         "    if (a > 20) {\n        y = a;\n    }\n"},
        {"type S = uint8 lsb 0.5 range [0, 100] saturate; output S y; proc main() { y = 20; }",
         "    y = 40;\n"},
        {"type S = uint8 range [0, 100] saturate; output S y; input int16 a; proc main() { y = a * "
         "2; }",
         "    y = hpn_clip32(a * 2, 0, 100);\n"},
        // Tests that only ask on behalf of another one are joined.
        {"input uint8 a; input bool b; output bool y; proc main() { if (a == 1) { if (!b) { y = 1; "
         "} } }",
         "    if (a == 1 && !b) {\n        y = true;\n    }\n"},
        // An input is read even where nothing comes of it.
        {"input bool a; proc main() { if (a) { } }", "    (void)a;\n"},
        {"output uint8 y; proc main() { if (true) { y = 1; } else { y = 2; } }", "    y = 1;\n"},
    };
    for (const auto& Case : Cases)
        EXPECT_EQ(bodyOf(emitted(Case.pSource), "test_step(void"), Case.pExpected) << Case.pSource;
}

TEST(Emitter, NamesNeverClashWithC) {
    const std::string Text = emitted(
        "state uint8 double_ = 1; output uint8 register; state uint8 sin; state uint8 test_step;\n"
        "proc exit(uint8 L1) { register = L1 + sin; sin = register; }\n"
        "proc main() { local uint8 int8_t = register; exit(int8_t); exit(2); test_step = sin; }",
        PassSequence());
    expectCompiles(Text);
    CNames Outer;
    EXPECT_EQ(Outer.take("x"), "x");
    EXPECT_EQ(Outer.take("x"), "x_2");
    EXPECT_EQ(Outer.take("#block_7"), "block_7");
    CNames Inner(&Outer);
    EXPECT_EQ(Inner.take("x"), "x_3");
    EXPECT_EQ(Inner.take("while"), "while_2");
    EXPECT_EQ(Inner.take("hpn_mod"), "xhpn_mod");
    EXPECT_EQ(Inner.take("__LINE__"), "x__LINE__");
}

TEST(Emitter, LinkageFollowsWhoTouchesAVariable) {
    const std::string Text = emitted("input uint8 i; output uint8 o = 3; state uint8 s; state "
                                     "uint8 seen[3] = {1, 2, 3}; param uint8 P = 4;\n"
                                     "extern outside reads(seen);\n"
                                     "export proc uint8 twice(uint8 a) { return 2 * a; }\n"
                                     "proc main() { outside(); s = s + i; o = s + P; }");
    EXPECT_TRUE(contains(Text, "\nvolatile uint8_t i;"));
    EXPECT_TRUE(contains(Text, "\nuint8_t o;"));
    EXPECT_TRUE(contains(Text, "\nstatic uint8_t s;"));
    EXPECT_TRUE(contains(Text, "\nuint8_t seen[3];"));
    EXPECT_TRUE(contains(Text, "\nstatic const uint8_t P = 4;"));
    EXPECT_TRUE(contains(Text, "\nextern void outside(void);"));
    EXPECT_TRUE(contains(Text, "\nuint8_t twice(uint8_t a);"));
    EXPECT_TRUE(contains(Text, "    o = 3;\n    s = 0;\n    seen[0] = 1;\n"));
    expectCompiles(Text);
}

TEST(Emitter, WhatIsNotUsedIsNotThere) {
    const char* pSource =
        "output uint8 y; state uint8 never; param bool OFF = false;\n"
        "proc lost() { never = 1; }\n"
        "proc main() { local uint8 unread = 5; unread = unread + y; if (OFF) { lost(); } y = 1; }";
    const std::string Text = optimised(pSource);
    for (const char* pGone : {"never", "lost", "unread", "OFF", "hpn_runtime"})
        EXPECT_FALSE(contains(Text, pGone)) << pGone << " in\n" << Text;
    expectCompiles(emitted(pSource));
}

TEST(Emitter, WhatIsReadOnlyInTermsThatStandAsNumbersIsNoWarning) {
    const char* pSource =
        "type Far = uint8 offset 300; type Near = uint8 offset 1;\n"
        "input int8 in; output bool out; output float64 big; output uint8 table[3];\n"
        "param int8 WIDE = 5;\n"
        "export proc a(int8 x) { if (x + 1000) { out = true; } }\n"
        "export proc b(int8 x) { big = x + 1e300; }\n"
        "export proc c(Far x, Near y) { out = x; if (y) { big = 1; } }\n"
        "export proc d(Far x) { table[x] = table[x * 0]; }\n"
        "export proc e(int8 x, int8 y) { local int8 z = x; if (z + 1000) { big = 3; }\n"
        "  if (x - y == x - y && WIDE + 1000) { big = 2; } }\n"
        // Two variables of one name: the comparison is none of a number with itself.
        "proc f(int8 x) { local int8 z = x; h(z); out = z == in; }\n"
        "proc h(int8 x) { local int8 z = x; if (z > in) { big = z; } }\n"
        "proc main() { a(in); f(in); e(in, 2); }";
    expectCompiles(emitted(pSource));
    expectCompiles(optimised(pSource));
}

TEST(Emitter, LocalsPassedOverByAJumpAreDefined) {
    const char* pSource = "input bool skip; output uint8 y;\n"
                          "proc main() { if (skip) { goto on; } local uint8 kept = 7; on: kept = "
                          "kept + 1; y = kept; }";
    expectCompiles(emitted(pSource));
    expectCompiles(optimised(pSource));
}

TEST(Emitter, StructuredSourceNeedsNoGoto) {
    const char* pSource =
        "input uint8 a; output uint8 y; output uint8 z;\n"
        "proc main() {\n"
        "  local uint8 i = 0;\n"
        "  while (i < 8) { i++; if (a == i) { continue; } if (a > 200) { break; } y += i; }\n"
        "  do { z++; } while (z < a);\n"
        "  switch (a) { case 1: y = 1; break; case 4: case 2: z = 2; break; default: y = 3; }\n"
        "  if (a == 1) { y = 5; } else if (a == 2) { y = 6; } else { y = 7; }\n"
        "}\n";
    for (const std::string& Text : {emitted(pSource), optimised(pSource)}) {
        EXPECT_FALSE(contains(Text, "goto")) << Text;
        EXPECT_TRUE(contains(Text, "} else if (")) << Text;
        expectCompiles(Text);
    }
}

TEST(Emitter, SameProgramSameBytes) {
    const char* pSource = "input int16 a; output int16 y; proc int16 f(int16 x) { if (x > 3) { "
                          "return x; } return 2; }\n"
                          "proc main() { y = f(a); y = f(y + 1); }";
    EXPECT_EQ(optimised(pSource), optimised(pSource));
    EXPECT_TRUE(contains(emitted(pSource, PassSequence(), "left_"), "left_test_step(void)"));
}

} // namespace
