#include "Metamorph.h"

#include "Language/Diagnostics.h"
#include "Language/Reader.h"
#include "Language/SourceFiles.h"
#include "Stimulus.h"

#include <algorithm>
#include <cctype>
#include <cstring>
#include <set>

namespace hpn::fuzz {

namespace {

using Lines = std::vector<std::string>;

Lines linesOf(const std::string& Text) {
    Lines Result;
    for (std::size_t Start = 0; Start < Text.size();) {
        const std::size_t End = std::min(Text.find('\n', Start), Text.size());
        Result.push_back(Text.substr(Start, End - Start));
        Start = End + 1;
    }
    return Result;
}

std::string textOf(const Lines& All) {
    std::string Result;
    for (const std::string& Each : All)
        Result += Each + "\n";
    return Result;
}

bool startsWith(const std::string& Text, const char* pWord) {
    return Text.compare(0, std::strlen(pWord), pWord) == 0;
}

bool isHead(const std::string& Line) {
    return startsWith(Line, "proc ") || startsWith(Line, "export proc ");
}

// Draws numbers for one variant.
class Draw {
public:
    explicit Draw(std::uint64_t Seed) : m_Seed(Seed) {}
    std::size_t below(std::size_t Count) { return mixBits(m_Seed, m_Counter++) % Count; }

private:
    std::uint64_t m_Seed;
    std::uint64_t m_Counter = 0;
};

// ---- other names ----

bool isReserved(const std::string& Word) {
    static const std::set<std::string> Words = {
        "bool",    "int8",    "uint8", "int16",    "uint16", "int32",    "uint32", "float32",
        "float64", "type",    "lsb",   "offset",   "range",  "saturate", "low",    "high",
        "input",   "output",  "state", "param",    "extern", "reads",    "writes", "export",
        "proc",    "local",   "if",    "else",     "while",  "for",      "do",     "switch",
        "case",    "default", "break", "continue", "goto",   "return",   "true",   "false",
        "min",     "max",     "abs",   "sgn",      "main"};
    return Words.count(Word) != 0;
}

bool isWordPart(char Each) {
    return std::isalnum(static_cast<unsigned char>(Each)) != 0 || Each == '_';
}

// Every name backwards, so that they sort otherwise as well.
std::string renamed(const std::string& Text) {
    std::string Result;
    for (std::size_t i = 0; i < Text.size();) {
        std::size_t End = i;
        while (End < Text.size() && isWordPart(Text[End]))
            ++End;
        if (End == i) {
            Result += Text[i++];
            continue;
        }
        const std::string Word = Text.substr(i, End - i);
        const bool IsName = std::isdigit(static_cast<unsigned char>(Word[0])) == 0;
        Result += IsName && !isReserved(Word) ? "z" + std::string(Word.rbegin(), Word.rend()) + "_"
                                              : Word;
        i = End;
    }
    return Result;
}

// ---- another order ----

// Exported procedures keep their places, for the outside calls them by number.
std::string reordered(const std::string& Text, Draw& Random) {
    Lines Front;
    std::vector<Lines> Procedures;
    for (const std::string& Line : linesOf(Text)) {
        if (isHead(Line))
            Procedures.emplace_back();
        (Procedures.empty() ? Front : Procedures.back()).push_back(Line);
    }
    std::vector<std::size_t> Movable;
    for (std::size_t i = 0; i < Procedures.size(); ++i) {
        if (startsWith(Procedures[i].front(), "proc "))
            Movable.push_back(i);
    }
    if (Movable.size() < 2)
        return {};
    std::vector<std::size_t> From = Movable;
    std::rotate(From.begin(),
                From.begin() + 1 + static_cast<std::ptrdiff_t>(Random.below(From.size() - 1)),
                From.end());
    const std::vector<Lines> Before = Procedures;
    for (std::size_t i = 0; i < Movable.size(); ++i)
        Procedures[Movable[i]] = Before[From[i]];
    std::string Result = textOf(Front);
    for (const Lines& Each : Procedures)
        Result += textOf(Each);
    return Result;
}

// ---- dead code ----

std::vector<std::string> writableNames(const std::string& Text) {
    SourceFiles Sources;
    Sources.add("fuzz.hpn", Text);
    Diagnostics Messages(Sources);
    Program Source;
    std::vector<std::string> Names;
    if (!readProgram(Sources, Messages, Source))
        return Names;
    for (const Variable& Each : Source.Variables) {
        if (Each.Count == 0 &&
            (Each.Kind == VariableKind::Output || Each.Kind == VariableKind::State))
            Names.emplace_back(Each.Name);
    }
    return Names;
}

bool isBetweenStatements(const Lines& All, std::size_t Behind) {
    const std::string& Line = All[Behind];
    const std::size_t Next =
        Behind + 1 < All.size() ? All[Behind + 1].find_first_not_of(' ') : std::string::npos;
    if (Line.empty() || Line[0] != ' ' || Next == std::string::npos)
        return false;
    const std::string Following = All[Behind + 1].substr(Next);
    return (Line.back() == ';' || Line.back() == '}') && !startsWith(Following, "else") &&
           !startsWith(Following, "} else");
}

// Behind a state that never leaves its initial value. It is written there alone, so that only
// propagation can know.
std::string withDeadCode(const std::string& Text, Draw& Random) {
    const std::vector<std::string> Names = writableNames(Text);
    Lines All = linesOf(Text);
    const auto FirstHead = std::find_if(All.begin(), All.end(), isHead);
    if (Names.empty() || FirstHead == All.end())
        return {};
    All.insert(FirstHead, "state uint8 zz_never = 0;");
    for (int i = 0; i < 3; ++i) {
        const std::size_t Behind = Random.below(All.size());
        if (!isBetweenStatements(All, Behind))
            continue;
        const std::string& First = Names[Random.below(Names.size())];
        const std::string& Second = Names[Random.below(Names.size())];
        All.insert(All.begin() + static_cast<std::ptrdiff_t>(Behind) + 1,
                   "  if (zz_never > 0) { " + First + " = " + Second + " + 1; zz_never = 5; " +
                       Second + " = 77; }");
    }
    return textOf(All);
}

// ---- wider inputs ----

std::string widened(const std::string& Text) {
    static const char* const Wider[][2] = {
        {"bool", "uint8"},   {"int8", "int16"},    {"uint8", "int16"},    {"int16", "int32"},
        {"uint16", "int32"}, {"int32", "float64"}, {"uint32", "float64"}, {"float32", "float64"}};
    Lines All = linesOf(Text);
    bool Found = false;
    for (std::string& Line : All) {
        for (const auto& Each : Wider) {
            const std::string Old = std::string("input ") + Each[0] + " ";
            if (!startsWith(Line, Old.c_str()))
                continue;
            Line = std::string("input ") + Each[1] + " " + Line.substr(Old.size());
            Found = true;
            break;
        }
    }
    return Found ? textOf(All) : std::string();
}

// ---- other passes ----

bool isAllowed(const std::vector<PassId>& Ids, PassSequence& Result) {
    std::string Why;
    return PassSequence::make(Ids, Result, Why);
}

// Without one of the passes, and without those that cannot do without it.
PassSequence withoutOne(const PassSequence& Of, Draw& Random) {
    const std::vector<PassId>& All = Of.getPasses();
    PassSequence Result;
    if (All.empty())
        return Result;
    const PassId Left = All[Random.below(All.size())];
    std::vector<PassId> Kept;
    for (const PassId Each : All) {
        Kept.push_back(Each);
        if (Each == Left || !isAllowed(Kept, Result))
            Kept.pop_back();
    }
    isAllowed(Kept, Result);
    return Result;
}

// Folded before constants took the place of variables, the code has more to fold the next time.
bool foldsLast(const std::vector<PassId>& Ids) {
    bool IsFolded = true;
    for (const PassId Each : Ids) {
        if (Each == PassId::ReplaceConstantConditions || Each == PassId::ReplaceConstantVariables)
            IsFolded = false;
        if (Each == PassId::FoldConstants)
            IsFolded = true;
    }
    return IsFolded;
}

// What propagation finds is written into the code, and then once more.
bool makeTwice(const PassSequence& Of, PassSequence& Result) {
    std::vector<PassId> Ids;
    std::vector<PassId> Round;
    const auto isRepeatable = [](PassId Id) {
        return Id == PassId::PropagateSparseConditionalConstant ||
               Id == PassId::ReplaceConstantConditions || Id == PassId::ReplaceConstantVariables ||
               Id == PassId::FoldConstants;
    };
    for (const PassId Each : Of.getPasses()) {
        if (isRepeatable(Each)) {
            Round.push_back(Each);
        } else {
            Ids.insert(Ids.end(), Round.begin(), Round.end());
            Round.clear();
        }
        Ids.push_back(Each);
    }
    Ids.insert(Ids.end(), Round.begin(), Round.end());
    return Ids.size() > Of.getPasses().size() && foldsLast(Ids) && isAllowed(Ids, Result);
}

// ---- comparisons ----

const KnownVersion* findVersion(const std::vector<KnownVersion>& In, unsigned Serial) {
    const auto Found = std::lower_bound(
        In.begin(), In.end(), Serial,
        [](const KnownVersion& Each, unsigned Wanted) { return Each.Serial < Wanted; });
    return Found != In.end() && Found->Serial == Serial ? &*Found : nullptr;
}

bool isSame(double a, double b) {
    return std::memcmp(&a, &b, sizeof a) == 0;
}

std::string describe(const KnownVersion& Of) {
    return Of.Name + " (Var_" + std::to_string(Of.Serial) + ")";
}

// A version that is missing in the narrow program stands in code that is dead there. Where the
// narrow program leaves a version undetermined that the wide one knows (it depends on nothing but
// itself there, round a loop), evaluation takes all numbers of its type for it, and the wide
// program may well conclude more from its range.
std::string compareWidened(const TrialResult& Narrow, const TrialResult& Wide) {
    for (const KnownVersion& Each : Wide.Versions) {
        const KnownVersion* pOther = findVersion(Narrow.Versions, Each.Serial);
        if (pOther != nullptr && pOther->IsUndetermined && !Each.IsUndetermined)
            return {};
    }
    for (const KnownVersion& Each : Wide.Versions) {
        const KnownVersion* pOther = findVersion(Narrow.Versions, Each.Serial);
        if (!Each.IsConstant || pOther == nullptr || pOther->IsUndetermined)
            continue;
        if (pOther->Name != Each.Name)
            return {}; // the builder has made other statements for the other types
        if (!pOther->IsConstant || !isSame(pOther->Number, Each.Number))
            return describe(Each) + " became constant";
    }
    return {};
}

// Procedures are visited in the order of their names, and where a conclusion rests on ranges the
// order can cost one. But no two conclusions contradict each other.
std::string compareVersions(const TrialResult& Of, const TrialResult& Variant) {
    for (const KnownVersion& Each : Of.Versions) {
        const KnownVersion* pOther = findVersion(Variant.Versions, Each.Serial);
        if (pOther != nullptr && Each.IsConstant && pOther->IsConstant &&
            !isSame(Each.Number, pOther->Number))
            return describe(Each) + " is constant, but another one";
    }
    return {};
}

// Propagation goes on for new constants only, not for ranges that have become narrower; so the
// second time it may start from better ranges and conclude more. It must then keep what it had
// concluded, and the code can only differ where something is new.
std::string compareTwice(const TrialResult& Once, const TrialResult& Twice) {
    if (Once.FinalText == Twice.FinalText)
        return {};
    bool IsNew = false;
    for (const KnownVersion& Each : Once.Versions) {
        const KnownVersion* pLater = findVersion(Twice.Versions, Each.Serial);
        const bool IsSameConstant =
            pLater != nullptr && pLater->IsConstant && isSame(pLater->Number, Each.Number);
        // What only a call defined that is dead by now is undetermined again.
        const bool IsLost = pLater != nullptr && !pLater->IsUndetermined && !IsSameConstant;
        if (Each.IsConstant && IsLost)
            return describe(Each) + " was constant the first time alone";
        IsNew = IsNew || pLater == nullptr || (!Each.IsConstant && pLater->IsConstant) ||
                !isSame(Each.Number, pLater->Number) || !isSame(Each.Highest, pLater->Highest);
    }
    return IsNew
               ? std::string()
               : "the second time changed the code\n" + Once.FinalText + "----\n" + Twice.FinalText;
}

} // namespace

bool makeVariant(const Trial& Of, Trial& Variant) {
    Variant = Of;
    Variant.Pair = PairKind::None;
    Variant.WantsCode = false;
    Draw Random(Of.Run.StimulusSeed);
    switch (Of.Pair) {
    case PairKind::None:
        return false;
    case PairKind::Renamed:
        Variant.Text = renamed(Of.Text);
        break;
    case PairKind::Reordered:
        Variant.Text = reordered(Of.Text, Random);
        break;
    case PairKind::DeadCode:
        Variant.Text = withDeadCode(Of.Text, Random);
        break;
    case PairKind::Widened:
        Variant.Text = widened(Of.Text);
        break;
    case PairKind::PassOff:
        Variant.Passes = withoutOne(Of.Passes, Random);
        break;
    case PairKind::Twice:
        return makeTwice(Of.Passes, Variant.Passes);
    }
    return !Variant.Text.empty();
}

std::string compareVariants(PairKind Kind, const TrialResult& Of, const TrialResult& Variant) {
    if (Kind == PairKind::Widened)
        return compareWidened(Of, Variant);
    if (Of.Counts.Exhausted + Variant.Counts.Exhausted != 0)
        return {};
    if (Of.Seen.Outputs != Variant.Seen.Outputs)
        return "the outputs differ";
    if (Of.Seen.Events != Variant.Seen.Events)
        return "the events differ";
    if (Kind == PairKind::Renamed)
        return compareVersions(Of, Variant);
    return Kind == PairKind::Twice ? compareTwice(Of, Variant) : std::string();
}

} // namespace hpn::fuzz
