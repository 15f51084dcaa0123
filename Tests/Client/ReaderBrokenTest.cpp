#include "Generators/RandomProgram.h"
#include "ReaderTestSupport.h"

#include <gtest/gtest.h>

#include <random>

// Whatever the text is, reading comes to an end, and either a program or a message comes of it.

namespace {

/// Reads a text; what is accepted must print and read back. Gives what is wrong with that.
std::string judge(const std::string& Text) {
    std::string Difference;
    if (printsAndReadsBack(Text, Difference))
        return Difference;
    const ReadText Read(Text);
    const std::size_t Errors = Read.diagnostics().getErrorCount();
    if (Errors == 0 || Errors > hpn::Diagnostics::Limit)
        return std::to_string(Errors) + " errors";
    return Read.messages().empty() ? "no place in the messages" : "";
}

std::vector<std::string> goodTexts() {
    std::vector<std::string> Texts = exampleTexts();
    Texts.push_back(sampleText());
    return Texts;
}

TEST(ReaderBroken, EveryPrefixIsAcceptedOrReported) {
    std::size_t Accepted = 0;
    for (const std::string& Text : goodTexts())
        for (std::size_t Length = 0; Length <= Text.size(); ++Length) {
            const std::string Prefix = Text.substr(0, Length);
            std::string Difference;
            if (printsAndReadsBack(Prefix, Difference))
                ++Accepted;
            else
                EXPECT_TRUE(ReadText(Prefix).diagnostics().hasErrors()) << Prefix;
            ASSERT_EQ(Difference, "") << Prefix;
        }
    EXPECT_GE(Accepted, goodTexts().size());
}

/// One to four places changed: a byte replaced, pieces removed, repeated or brought in from
/// elsewhere.
std::string mutateBytes(std::string Text, std::mt19937& Random) {
    for (unsigned Count = 1 + Random() % 4; Count > 0 && !Text.empty(); --Count) {
        const std::size_t At = Random() % Text.size();
        const std::size_t Length = 1 + Random() % 20;
        switch (Random() % 5) {
        case 0:
            Text[At] = static_cast<char>(Random() % 256);
            break;
        case 1:
            Text.erase(At, Length);
            break;
        case 2:
            Text.insert(Random() % Text.size(), Text.substr(At, Length));
            break;
        case 3:
            Text[At] = "(){}[];:,=+-*/<>&|!~^%0.'\"\n"[Random() % 27];
            break;
        default:
            Text.resize(At);
        }
    }
    return Text;
}

/// Words, numbers and operators of a text, one after the other.
std::vector<std::string> splitWords(const std::string& Text) {
    std::vector<std::string> Words(1);
    for (const char Character : Text) {
        const bool IsWord = std::isalnum(static_cast<unsigned char>(Character)) != 0 ||
                            Character == '_' || Character == '.';
        const bool IsAfterWord =
            !Words.back().empty() &&
            (std::isalnum(static_cast<unsigned char>(Words.back().back())) != 0 ||
             Words.back().back() == '_');
        if (!Words.back().empty() && !(IsWord && IsAfterWord))
            Words.emplace_back();
        Words.back() += Character;
    }
    return Words;
}

/// The same on whole words, so that the text stays good to the lexer.
std::string mutateWords(std::vector<std::string> Words, std::mt19937& Random) {
    static const char* const Brought[] = {"if (s) ",  "else ",   "while (",  "do ",     "for (",
                                          "switch (", "case ",   "default:", "break;",  "{",
                                          "}",        "goto x;", "x:",       "return ", "local ",
                                          "uint8 ",   "proc ",   "state ",   "type ",   "export ",
                                          "extern ",  "(bool)",  "min(",     "= f(",    "++",
                                          "--",       "[",       "]",        ";",       "1e308",
                                          "0x",       "saturate"};
    for (unsigned Count = 1 + Random() % 6; Count > 0; --Count) {
        const auto At = static_cast<std::ptrdiff_t>(Random() % Words.size());
        switch (Random() % 4) {
        case 0:
            Words.erase(Words.begin() + At);
            Words.emplace_back(" ");
            break;
        case 1:
            std::swap(Words[static_cast<std::size_t>(At)], Words[Random() % Words.size()]);
            break;
        case 2:
            Words.insert(Words.begin() + At, Words[Random() % Words.size()] + " ");
            break;
        default:
            Words.insert(Words.begin() + At, Brought[Random() % std::size(Brought)]);
        }
    }
    std::string Text;
    for (const std::string& Word : Words)
        Text += Word;
    return Text;
}

TEST(ReaderBroken, ChangedBytesAreAcceptedOrReported) {
    std::mt19937 Random(1);
    const std::vector<std::string> Texts = goodTexts();
    for (int Try = 0; Try < 4000; ++Try) {
        const std::string Text = mutateBytes(Texts[Random() % Texts.size()], Random);
        ASSERT_EQ(judge(Text), "") << Text;
    }
}

TEST(ReaderBroken, ChangedWordsAreAcceptedOrReported) {
    std::mt19937 Random(2);
    std::vector<std::vector<std::string>> Texts;
    for (const std::string& Text : goodTexts())
        Texts.push_back(splitWords(Text));
    for (unsigned Seed = 0; Seed < 20; ++Seed)
        Texts.push_back(splitWords(hpn::fuzz::RandomProgram(Seed).text()));
    for (int Try = 0; Try < 4000; ++Try) {
        const std::string Text = mutateWords(Texts[Random() % Texts.size()], Random);
        ASSERT_EQ(judge(Text), "") << Text;
    }
}

TEST(ReaderBroken, WordsInAnyOrderAreAcceptedOrReported) {
    std::mt19937 Random(3);
    for (int Try = 0; Try < 500; ++Try) {
        std::vector<std::string> Words =
            splitWords(inMain(hpn::fuzz::RandomProgram(Random() % 100).text()));
        Words.resize(20 + Random() % 200);
        std::shuffle(Words.begin() + 1, Words.end(), Random);
        std::string Text = Try % 2 == 0 ? "" : "proc main() { ";
        for (const std::string& Word : Words)
            Text += Word + " ";
        ASSERT_EQ(judge(Text), "") << Text;
    }
}

TEST(ReaderBroken, BytesAloneAreReported) {
    std::mt19937 Random(4);
    for (int Try = 0; Try < 500; ++Try) {
        std::string Text;
        for (unsigned Length = Random() % 300; Length > 0; --Length)
            Text += static_cast<char>(Random() % (Try % 2 == 0 ? 256 : 128));
        ASSERT_EQ(judge(Text), "") << Text;
    }
}

TEST(ReaderBroken, PrintedProgramsReadBackTheSame) {
    for (const std::string& Text : goodTexts()) {
        std::string Difference;
        EXPECT_TRUE(printsAndReadsBack(Text, Difference)) << printed(Text);
        EXPECT_EQ(Difference, "");
    }
    for (unsigned Seed = 0; Seed < 300; ++Seed) {
        const std::string Text = hpn::fuzz::RandomProgram(Seed).text();
        std::string Difference;
        EXPECT_TRUE(printsAndReadsBack(Text, Difference)) << printed(Text) << Text;
        ASSERT_EQ(Difference, "");
    }
}

} // namespace
