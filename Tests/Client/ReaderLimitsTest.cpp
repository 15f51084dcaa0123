#include "ReaderTestSupport.h"

#include <gtest/gtest.h>

#include <functional>

// Large programs and the borders of what is accepted. Nothing here may need a stack that grows with
// the text.

namespace {

std::string repeat(const std::string& Piece, std::size_t Count) {
    std::string Text;
    Text.reserve(Piece.size() * Count);
    for (std::size_t i = 0; i < Count; ++i)
        Text += Piece;
    return Text;
}

TEST(ReaderLimits, DeepAndLongStatementsPrintAndReadBack) {
    constexpr std::size_t Many = 10000;
    const std::pair<const char*, std::string> Texts[] = {
        {"branches in braces", repeat("if (in) {\n", Many) + "s = 1;" + repeat("}", Many)},
        {"branches without", repeat("if (in)\n", Many) + "s = 1;"},
        {"each with its else",
         repeat("if (in)\n", Many) + "s = 1;" + repeat(" else s = 2;\n", Many)},
        {"else if", "if (in) s = 0;" + repeat(" else if (in == 1) { s = 1; }\n", Many)},
        {"else with braces", repeat("if (in) { } else {", Many) + repeat("}", Many)},
        {"blocks", repeat("{", Many) + repeat("}", Many)},
        {"loops of all kinds", repeat("while (in) for (;in;) do { ", Many / 4) + "continue;" +
                                   repeat("} while (in);", Many / 4)},
        {"switches", repeat("switch (in) { case 1: ", Many) + repeat("}", Many)},
        {"cases", "switch (in) {" +
                      [] {
                          std::string Cases;
                          for (std::size_t i = 0; i < Many; ++i)
                              Cases += "case " + std::to_string(i) + ": s = 1; ";
                          return Cases;
                      }() +
                      "}"},
        {"one line", repeat("s = s + 1; ", 100000)},
        {"many lines", repeat("s = s + 1;\n", 100000)},
        {"empty statements", repeat(";", 100000)},
    };
    for (const auto& [What, Text] : Texts) {
        std::string Difference;
        EXPECT_TRUE(printsAndReadsBack(inMain(Text), Difference))
            << What << "\n"
            << ReadText(inMain(Text)).messages().substr(0, 1000);
        EXPECT_TRUE(Difference.empty()) << What;
    }
}

/// The greatest count that is accepted, found by halving; the text beyond it is refused by the
/// message.
std::size_t greatestAccepted(const std::function<std::string(std::size_t)>& Make, std::size_t Bad,
                             const std::string& Why) {
    std::size_t Good = 1;
    EXPECT_TRUE(ReadText(Make(Good)).isRead()) << ReadText(Make(Good)).messages();
    while (Bad - Good > 1) {
        const std::size_t Middle = (Good + Bad) / 2;
        (ReadText(Make(Middle)).isRead() ? Good : Bad) = Middle;
    }
    const std::string Messages = ReadText(Make(Bad)).messages();
    EXPECT_NE(Messages.find("error: " + Why), std::string::npos) << Messages;
    EXPECT_EQ(Messages.find('\n') + 1, Messages.size()) << Messages;
    return Good;
}

TEST(ReaderLimits, ExpressionsNestToTheirLimitAndNoFurther) {
    const std::string TooDeep = "the expression is too deep";
    const auto Inside = [](const char* pOpen, const char* pClose) {
        return [=](std::size_t Count) {
            return inMain("s = " + repeat(pOpen, Count) + "in" + repeat(pClose, Count) + ";");
        };
    };
    EXPECT_EQ(greatestAccepted(Inside("- ", ""), 1 << 20, TooDeep), 999U);
    EXPECT_EQ(greatestAccepted(Inside("in + ", ""), 1 << 20, TooDeep), 999U);
    EXPECT_EQ(greatestAccepted(Inside("a[", "]"), 1 << 20, TooDeep), 999U);
    EXPECT_GE(greatestAccepted(Inside("(", ")"), 1 << 20, TooDeep), 900U);
    EXPECT_GE(greatestAccepted(Inside("min(1, ", ")"), 1 << 20, TooDeep), 900U);
    EXPECT_GE(greatestAccepted(Inside("1 ^ (in * ", ")"), 1 << 20, TooDeep), 300U);
}

TEST(ReaderLimits, NamesNumbersAndArraysHaveALimit) {
    EXPECT_EQ(greatestAccepted(
                  [](std::size_t Count) {
                      return inMain("local uint8 " + std::string(Count, 'n') + ";");
                  },
                  1 << 12, "the name is longer than 255 characters"),
              255U);
    EXPECT_EQ(greatestAccepted(
                  [](std::size_t Count) { return inMain("s = 0." + repeat("1", Count) + ";"); },
                  1 << 12, "the number is longer than 1000 characters"),
              998U);
    EXPECT_EQ(greatestAccepted(
                  [](std::size_t Count) {
                      return inMain("") + "state uint8 big[" + std::to_string(Count) + "];";
                  },
                  1 << 20, "an array has 1 to 65536 elements, not"),
              65536U);
    EXPECT_EQ(greatestAccepted(
                  [](std::size_t Count) {
                      std::string Text = inMain("") + "param float64 N = 65532;\n";
                      for (std::size_t i = 0; i < Count; ++i)
                          Text += "state uint8 big" + std::to_string(i) + "[N];\n";
                      return Text;
                  },
                  65, "the arrays of a program have at most 4194304 elements together"),
              64U);
}

TEST(ReaderLimits, ManyDeclarationsKeepTheirOrder) {
    std::string Text;
    for (std::size_t i = 0; i < 5000; ++i) {
        const std::string Number = std::to_string(i);
        Text += "type T" + Number + " = uint8 lsb 0.5;\nparam T" + Number + " N" + Number + " = " +
                (i == 0 ? "1" : "N" + std::to_string(i - 1)) + ";\nextern e" + Number +
                ";\nproc f" + Number + "(uint8 x) {\n  f" + std::to_string(i + 1) + "(x);\n}\n";
    }
    Text += "proc f5000(uint8 x) {\n}\nproc main() {\n  f0(1);\n}\n";
    const ReadText Read(Text);
    ASSERT_TRUE(Read.isRead()) << Read.messages();
    EXPECT_EQ(Read.variable("N4999")->Initial, std::vector<double>{1.0});
    EXPECT_FALSE(Read.procedure("f0")->IsRecursive);
    std::string Difference;
    EXPECT_TRUE(printsAndReadsBack(Text, Difference));
    EXPECT_EQ(Difference, "");
}

TEST(ReaderLimits, LongLinesAreShownAroundThePlace) {
    const std::string Text =
        inMain(repeat("s = 1; ", 10000) + "oops = 1; " + repeat("s = 2; ", 10000));
    const std::string Messages = ReadText(Text).diagnostics().print();
    EXPECT_LT(Messages.size(), 600U);
    const std::size_t Line = Messages.find('\n') + 1;
    const std::size_t Caret = Messages.find('\n', Line) + 1;
    EXPECT_EQ(Messages.substr(0, Line), "t:2:70001: error: 'oops' is not declared\n");
    EXPECT_EQ(Messages.find("oops", Line) - Line, Messages.find('^') - Caret);
}

} // namespace
