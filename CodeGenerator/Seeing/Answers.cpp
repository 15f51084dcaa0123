#include "Seeing/Answers.h"

#include "Seeing/Explainer.h"

#include <algorithm>
#include <charconv>
#include <set>

namespace hpn {

namespace {

class Answer {
public:
    Answer(const Recording& Of, std::string& Out) : m_Of(Of), m_Out(Out) {}

    void variable(const RecordedVariable& Asked) {
        m_Out += Asked.Owner.empty() ? Asked.Name : Asked.Owner + "::" + Asked.Name;
        m_Out += ": " + Asked.Kind + " " + Asked.Type;
        if (!Asked.Unit.empty())
            m_Out += " (" + Asked.Unit + ")";
        m_Out += at(Asked.Place) + "\n";
        if (!Asked.NotTracked.empty())
            line(1, "never taken for constant: " + Asked.NotTracked, {});
        else if (Asked.Versions.empty())
            line(1, "never used, so nothing is known of it", {});
        else
            line(1, "altogether: " + rangeText(Asked.Found), {});
        if (!Asked.KeptBecause.empty())
            line(1, "its definitions stay: " + Asked.KeptBecause, {});
        // What nothing is known of would say the same for each of its versions.
        if (Asked.NotTracked.empty())
            for (int Version : Asked.Versions)
                version(Version);
        const int Index = static_cast<int>(&Asked - m_Of.Variables.data());
        for (const RecordedFate& Each : m_Of.Fates)
            if (statement(Each.Statement).Variable == Index)
                fate(Each, 1);
        for (const RecordedSaturation& Each : m_Of.Saturations)
            if (Each.Variable == Index)
                saturation(Each, 1);
    }

    // False: no statement of the program stands there.
    bool sourceLine(unsigned File, unsigned Line) {
        std::set<unsigned> Ids; // in order of making, which follows the text
        for (const RecordedStatement& Each : m_Of.Statements)
            if (Each.MakesCode && Each.Place.Line == Line && Each.Place.File == File)
                Ids.insert(Each.Id);
        for (unsigned Id : Ids)
            history(Id);
        return !Ids.empty();
    }

private:
    const RecordedStatement& statement(int Index) const {
        return m_Of.Statements[static_cast<std::size_t>(Index)];
    }

    std::string at(RecordedPlace Place) const {
        if (!Place.isKnown())
            return "";
        return "  (" + m_Of.Sources[Place.File].Name + ":" + std::to_string(Place.Line) + ")";
    }

    void line(unsigned Depth, const std::string& Text, RecordedPlace Place) {
        m_Out.append(2 * static_cast<std::size_t>(Depth), ' ') += Text + at(Place) + "\n";
    }

    void version(int Index) {
        for (const ExplainedLine& Each : unfoldExplanation(m_Of, Index, m_IsTold))
            line(Each.Depth + 1, Each.Text, Each.Place);
    }

    void fate(const RecordedFate& Fate, unsigned Depth) {
        const RecordedStatement& Of = statement(Fate.Statement);
        if (Fate.IsRemoved)
            line(Depth,
                 "`" + Of.Text + "`" + at(Of.Place) + " removed by " +
                     m_Of.Snapshots[Fate.Snapshot].Pass + ": " + Fate.Why,
                 Fate.Because);
        else
            line(Depth, "`" + Of.Text + "`" + at(Of.Place) + " stays: " + Fate.Why, Fate.Because);
    }

    static const char* verb(RecordedSaturation::Answer Answer) {
        static const char* const Verbs[] = {"never saturates", "may saturate", "always saturates",
                                            "is not reached"};
        return Verbs[static_cast<std::size_t>(Answer)];
    }

    void saturation(const RecordedSaturation& Of, unsigned Depth) {
        using Reply = RecordedSaturation::Answer;
        const RecordedVariable& Variable = m_Of.Variables[static_cast<std::size_t>(Of.Variable)];
        if (Of.Low == Reply::NotReached)
            return;
        std::string Text =
            "`" + statement(Of.Statement).Text + "` " +
            (Of.Value.What == RecordedRange::Kind::Anything ? "can bring any number"
                                                            : "brings " + rangeText(Of.Value)) +
            ":";
        if (Variable.SaturatesLow)
            Text += std::string(" ") + verb(Of.Low) + " at its lower limit";
        if (Variable.SaturatesHigh)
            Text += std::string(Variable.SaturatesLow ? ", " : " ") + verb(Of.High) +
                    " at its upper limit";
        line(Depth, Text, Of.Place);
    }

    // A statement from pass to pass, then why.
    void history(unsigned Id) {
        int Last = -1;
        int Explained = -1; // the state before anything was replaced in it
        for (std::size_t i = 0; i < m_Of.Statements.size(); ++i) {
            if (m_Of.Statements[i].Id != Id)
                continue;
            if (Last < 0)
                m_Out += "`" + m_Of.Statements[i].Text + "`" + at(m_Of.Statements[i].Place) + "\n";
            Last = static_cast<int>(i);
        }
        for (const RecordedSnapshot& Each : m_Of.Snapshots)
            for (const RecordedChange& Change : Each.Changes)
                change(Each, Change, Id, Explained);
        if (Explained < 0)
            Explained = Last;
        for (const RecordedFate& Each : m_Of.Fates)
            if (statement(Each.Statement).Id == Id)
                fate(Each, 1);
        for (const RecordedSaturation& Each : m_Of.Saturations)
            if (statement(Each.Statement).Id == Id)
                saturation(Each, 1);
        reasons(statement(Explained));
    }

    void change(const RecordedSnapshot& In, const RecordedChange& Change, unsigned Id,
                int& Explained) {
        using Kind = RecordedChange::Kind;
        if (Change.Before < 0 || statement(Change.Before).Id != Id)
            return;
        if (Change.What == Kind::Inlined)
            line(1, "inlined by " + In.Pass, {});
        if (Change.What == Kind::Hoisted)
            line(1, "moved in front of its branch by " + In.Pass, {});
        if (Change.What != Kind::Replaced)
            return;
        line(1, "`" + statement(Change.After).Text + "` after " + In.Pass, {});
        if (Explained < 0 && In.Pass != "transformToSSAForm")
            Explained = Change.Before;
    }

    void reasons(const RecordedStatement& Of) {
        if (Of.Version >= 0)
            return version(Of.Version);
        std::set<int> Said;
        for (const RecordedRead& Read : Of.Reads) {
            const RecordedVariable& Variable =
                m_Of.Variables[static_cast<std::size_t>(Read.Variable)];
            if (Read.Version >= 0 && Variable.NotTracked.empty()) {
                if (Said.insert(Read.Version).second)
                    version(Read.Version);
            } else if (!Variable.NotTracked.empty() && Said.insert(-1 - Read.Variable).second) {
                line(1, Variable.Name + " is never taken for constant: " + Variable.NotTracked,
                     Variable.Place);
            }
        }
    }

    const Recording& m_Of;
    std::string& m_Out;
    std::vector<bool> m_IsTold; // versions that have been explained
};

bool parseNumber(const std::string& Text, unsigned& Number) {
    const char* pEnd = Text.data() + Text.size();
    const auto [pStop, Error] = std::from_chars(Text.data(), pEnd, Number);
    return Error == std::errc() && pStop == pEnd && Number != 0;
}

bool explainLine(const Recording& Of, const std::string& Place, std::string& Text) {
    const std::size_t Colon = Place.rfind(':');
    unsigned Line = 0;
    if (!parseNumber(Colon == std::string::npos ? Place : Place.substr(Colon + 1), Line)) {
        Text = "'" + Place + "' is no line number";
        return false;
    }
    std::size_t File = 0;
    if (Colon != std::string::npos) {
        const std::string Name = Place.substr(0, Colon);
        while (File < Of.Sources.size() && Of.Sources[File].Name != Name)
            ++File;
        if (File == Of.Sources.size()) {
            Text = "'" + Name + "' is no file of the program";
            return false;
        }
    }
    const std::string& Source = Of.Sources[File].Text;
    const auto Lines = std::count(Source.begin(), Source.end(), '\n') + 1;
    if (static_cast<long long>(Line) > static_cast<long long>(Lines)) {
        Text = Of.Sources[File].Name + " has only " + std::to_string(Lines) + " lines";
        return false;
    }
    if (!Answer(Of, Text).sourceLine(static_cast<unsigned>(File), Line))
        Text += Of.Sources[File].Name + ":" + std::to_string(Line) +
                ": no statement begins here that control can reach by the text alone\n";
    return true;
}

} // namespace

bool explain(const Recording& Of, const std::string& Question, std::string& Text) {
    const std::string LinePrefix = "line:";
    if (Question.compare(0, LinePrefix.size(), LinePrefix) == 0)
        return explainLine(Of, Question.substr(LinePrefix.size()), Text);
    bool IsFound = false;
    std::string Answers;
    for (const RecordedVariable& Each : Of.Variables) {
        if (Question != Each.Name && Question != Each.Owner + "::" + Each.Name)
            continue;
        IsFound = true;
        Answer(Of, Answers).variable(Each);
    }
    Text = IsFound ? Answers : "the program has no variable '" + Question + "'";
    return IsFound;
}

std::string printChanges(const Recording& Of) {
    using Kind = RecordedChange::Kind;
    std::string Text;
    for (const RecordedSnapshot& Each : Of.Snapshots) {
        if (Each.Number == 0)
            continue;
        Text += "== " + std::to_string(Each.Number) + " " + Each.Pass +
                (Each.Changes.empty() ? ": nothing\n" : "\n");
        const std::string* pProcedure = nullptr;
        for (const RecordedChange& Change : Each.Changes) {
            if (pProcedure == nullptr || *pProcedure != Change.Procedure)
                Text += "-- " + Change.Procedure + "\n";
            pProcedure = &Change.Procedure;
            const auto Show = [&](const char* Sign, int State) {
                const RecordedStatement& Shown = Of.Statements[static_cast<std::size_t>(State)];
                Text += Sign;
                if (Shown.Place.isKnown())
                    Text += std::to_string(Shown.Place.Line) + ": ";
                Text += Shown.Text;
            };
            if (Change.Before >= 0 && Change.What != Kind::Hoisted)
                Show("- ", Change.Before);
            if (Change.What == Kind::Inlined)
                Text += "   [inlined]";
            else if (!Change.Why.empty())
                Text += "   [" + Change.Why + "]";
            if (Change.Before >= 0 && Change.What != Kind::Hoisted)
                Text += "\n";
            if (Change.After >= 0)
                Show(Change.What == Kind::Hoisted ? "^ " : "+ ", Change.After);
            if (Change.After >= 0)
                Text += "\n";
        }
    }
    return Text;
}

} // namespace hpn
