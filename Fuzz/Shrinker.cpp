#include "Shrinker.h"

#include <algorithm>
#include <cctype>
#include <sstream>

namespace hpn::fuzz {

namespace {

std::vector<std::string> splitLines(const std::string& Text) {
    std::vector<std::string> Lines;
    std::istringstream Stream(Text);
    for (std::string Line; std::getline(Stream, Line);) {
        if (Line.find_first_not_of(" \t") != std::string::npos)
            Lines.push_back(Line);
    }
    return Lines;
}

std::string joinLines(const std::vector<std::string>& Lines) {
    std::string Text;
    for (const std::string& Line : Lines)
        Text += Line + "\n";
    return Text;
}

bool isWord(char c) {
    return std::isalnum(static_cast<unsigned char>(c)) != 0 || c == '_' || c == '.';
}

std::string joinTokens(const std::vector<std::string>& Tokens) {
    std::string Line;
    for (const std::string& Token : Tokens)
        Line += (Line.empty() ? "" : " ") + Token;
    return Line;
}

int depthOf(const std::string& Token) {
    if (Token == "(" || Token == "[" || Token == "{")
        return 1;
    return Token == ")" || Token == "]" || Token == "}" ? -1 : 0;
}

int balanceOf(const std::string& Line) {
    return static_cast<int>(std::count(Line.begin(), Line.end(), '{') -
                            std::count(Line.begin(), Line.end(), '}'));
}

/// The line of a case of a switch.
bool isCase(const std::string& Line) {
    const std::size_t First = Line.find_first_not_of(" \t");
    return Line.compare(First, 5, "case ") == 0 || Line.compare(First, 7, "default") == 0;
}

bool isBalanced(const std::vector<std::string>& Tokens, std::size_t First, std::size_t End) {
    int Depth = 0;
    for (std::size_t i = First; i < End; ++i) {
        Depth += depthOf(Tokens[i]);
        if (Depth < 0)
            return false;
    }
    return Depth == 0;
}

/// The line that ends the block which begins at a line: where the depth is back, or the line of an
/// `else`; the line itself if there is no block.
std::size_t endOfBlock(const std::vector<std::string>& Lines, std::size_t First) {
    int Depth = 0;
    for (std::size_t i = First; i < Lines.size(); ++i) {
        const bool BeginsWithEnd = Lines[i].find_first_not_of(" \t") == Lines[i].find('}');
        if (i > First && BeginsWithEnd && Depth == 1)
            return i;
        // The end in front of an `else` belongs to the block before.
        Depth += balanceOf(Lines[i]) +
                 (i == First && BeginsWithEnd && Lines[i].find('{') != std::string::npos ? 1 : 0);
        if (Depth <= 0)
            return i;
    }
    return First;
}

} // namespace

std::vector<std::string> splitTokens(const std::string& Line) {
    static const char* const Long[] = {
        "<<=", ">>=", "&&", "||", "==", "!=", "<=", ">=", "<<", ">>",
        "+=",  "-=",  "*=", "/=", "%=", "&=", "|=", "^=", "++", "--"};
    std::vector<std::string> Tokens;
    for (std::size_t i = 0; i < Line.size();) {
        if (std::isspace(static_cast<unsigned char>(Line[i])) != 0) {
            ++i;
            continue;
        }
        std::size_t Length = 1;
        if (isWord(Line[i])) {
            while (i + Length < Line.size() && isWord(Line[i + Length]))
                ++Length;
        } else {
            for (const std::string Each : Long) {
                if (Length == 1 && Line.compare(i, Each.size(), Each) == 0)
                    Length = Each.size();
            }
        }
        Tokens.push_back(Line.substr(i, Length));
        i += Length;
    }
    return Tokens;
}

Trial Shrinker::shrink(Trial Failing) {
    m_Best = std::move(Failing);
    m_Lines = splitLines(m_Best.Text);
    shrinkPasses();
    shrinkSteps();
    for (bool Goes = true; Goes && m_Left > 0;) {
        Goes = shrinkLines();
        Goes = shrinkTokens() || Goes;
    }
    shrinkPasses();
    return m_Best;
}

bool Shrinker::isAccepted(const Trial& Smaller) {
    if (m_Left == 0)
        return false;
    --m_Left;
    if (!m_StillFails(Smaller))
        return false;
    m_Best = Smaller;
    return true;
}

// Step 1

void Shrinker::shrinkPasses() {
    std::string Why;
    for (std::size_t i = m_Best.Passes.getPasses().size(); i-- > 0;) {
        std::vector<PassId> Ids = m_Best.Passes.getPasses();
        if (i >= Ids.size())
            continue;
        Ids.erase(Ids.begin() + static_cast<std::ptrdiff_t>(i));
        Trial Smaller = m_Best;
        if (PassSequence::make(Ids, Smaller.Passes, Why))
            isAccepted(Smaller);
    }
}

void Shrinker::shrinkSteps() {
    while (m_Best.Run.Steps > 1) {
        Trial Smaller = m_Best;
        --Smaller.Run.Steps;
        if (!isAccepted(Smaller))
            return;
    }
}

// Step 2

bool Shrinker::tryLines(std::vector<std::string> Lines) {
    Trial Smaller = m_Best;
    Smaller.Text = joinLines(Lines);
    if (!isAccepted(Smaller))
        return false;
    m_Lines = std::move(Lines);
    return true;
}

bool Shrinker::shrinkLines() {
    bool Goes = false;
    for (std::size_t i = m_Lines.size(); i-- > 0;) {
        if (i >= m_Lines.size())
            continue;
        const std::size_t End = endOfBlock(m_Lines, i);
        // With an `else` at the end its end stays for what is in front.
        const bool LeavesEnd = End > i && m_Lines[End].find("else") != std::string::npos;
        std::vector<std::string> Without = m_Lines;
        const auto At = [&](std::size_t Line) {
            return Without.begin() + static_cast<std::ptrdiff_t>(Line);
        };
        Without.erase(At(i), At(LeavesEnd ? End : End + 1));
        if (tryLines(Without)) {
            Goes = true;
            continue;
        }
        if (m_Lines[i].find("else") != std::string::npos && End > i) {
            Without = m_Lines;
            Without[i] = "}";
            Without.erase(At(i + 1), At(End + 1));
            Goes = tryLines(Without) || Goes;
        }
        if (End > i && i < m_Lines.size()) {
            // What is in the block stays; the cases of a switch do not.
            Without = m_Lines;
            Without.erase(At(End));
            Without.erase(std::remove_if(At(i) + 1, At(End), isCase), At(End));
            Without.erase(At(i));
            Goes = tryLines(Without) || Goes;
        }
    }
    return Goes;
}

// Steps 3 and 4

bool Shrinker::shrinkTokens() {
    bool Goes = false;
    for (std::size_t i = 0; i < m_Lines.size() && m_Left > 0; ++i) {
        Goes = shrinkLineTokens(i) || Goes;
        Goes = shrinkOperands(i) || Goes;
    }
    return Goes;
}

bool Shrinker::shrinkLineTokens(std::size_t Line) {
    bool Goes = false;
    std::vector<std::string> Tokens = splitTokens(m_Lines[Line]);
    for (std::size_t Length = Tokens.size(); Length >= 1; --Length) {
        for (std::size_t i = 0; i + Length <= Tokens.size();) {
            std::vector<std::string> Fewer = Tokens;
            const auto First = Fewer.begin() + static_cast<std::ptrdiff_t>(i);
            // A pair of brackets alone can go, too.
            const bool IsPair = Length > 2 && depthOf(Tokens[i]) == 1 &&
                                depthOf(Tokens[i + Length - 1]) == -1 &&
                                isBalanced(Tokens, i + 1, i + Length - 1);
            const bool IsRun = isBalanced(Tokens, i, i + Length);
            std::vector<std::string> Lines = m_Lines;
            if (IsRun) {
                Fewer.erase(First, First + static_cast<std::ptrdiff_t>(Length));
                Lines[Line] = joinTokens(Fewer);
                if (tryLines(Lines)) {
                    Tokens = Fewer;
                    Goes = true;
                    continue;
                }
            }
            if (IsPair) {
                Fewer = Tokens;
                Fewer.erase(Fewer.begin() + static_cast<std::ptrdiff_t>(i + Length - 1));
                Fewer.erase(Fewer.begin() + static_cast<std::ptrdiff_t>(i));
                Lines[Line] = joinTokens(Fewer);
                if (tryLines(Lines)) {
                    Tokens = Fewer;
                    Goes = true;
                    continue;
                }
            }
            ++i;
        }
    }
    return Goes;
}

bool Shrinker::shrinkOperands(std::size_t Line) {
    bool Goes = false;
    std::vector<std::string> Tokens = splitTokens(m_Lines[Line]);
    for (std::size_t i = 0; i < Tokens.size(); ++i) {
        if (!isWord(Tokens[i][0]) || Tokens[i] == "0" || Tokens[i] == "1")
            continue;
        for (const char* pNumber : {"0", "1"}) {
            std::vector<std::string> Simpler = Tokens;
            Simpler[i] = pNumber;
            std::vector<std::string> Lines = m_Lines;
            Lines[Line] = joinTokens(Simpler);
            if (!tryLines(Lines))
                continue;
            Tokens = Simpler;
            Goes = true;
            break;
        }
    }
    return Goes;
}

} // namespace hpn::fuzz
