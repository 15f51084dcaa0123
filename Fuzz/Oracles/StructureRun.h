#ifndef STRUCTURERUN_H
#define STRUCTURERUN_H

#include "Emitter/Structurer.h"

#include <algorithm>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace hpn::test {

// Structured text beside the flow graph that it was made from: both run, both leave a trace.

/// One line of text for a structure: "if0{ A1 }else{ A2 } A3".
inline std::string textOf(const std::vector<FlowNode>& Nodes) {
    std::string Text;
    for (const StructureToken& Token : structureFlow(Nodes)) {
        const std::string Node = std::to_string(Token.Node);
        const std::string Condition = (Token.Negated ? "!" : "") + Node;
        static const char* const Words[] = {"L",      "A",     "if",       "else if", "else",
                                            "while",  "for",   "do",       "}",       "}while",
                                            "goto L", "break", "continue", "return"};
        Text += Text.empty() ? "" : " ";
        Text += Words[static_cast<int>(Token.Kind)];
        switch (Token.Kind) {
        case StructureKind::Label:
            Text += Node + ":";
            break;
        case StructureKind::Code:
        case StructureKind::Goto:
            Text += Node;
            break;
        case StructureKind::If:
        case StructureKind::ElseIf:
        case StructureKind::While:
            Text += "(" + Condition + "){";
            break;
        case StructureKind::EndDo:
            Text += "(" + Condition + ")";
            break;
        case StructureKind::Else:
        case StructureKind::Forever:
        case StructureKind::Do:
            Text += "{";
            break;
        default:
            break;
        }
    }
    return Text;
}

/// Runs structured text: which nodes' code and conditions come in which order, for given answers of
/// the conditions.
class TextRun {
public:
    explicit TextRun(std::vector<StructureToken> Tokens) : m_Tokens(std::move(Tokens)) { match(); }

    std::vector<int> run(unsigned Seed, std::size_t Steps) {
        std::mt19937 Answers(Seed);
        std::vector<int> Trace;
        bool Jumped = false;
        for (std::size_t At = 0, Moves = 0; At < m_Tokens.size() && Trace.size() < Steps; ++Moves) {
            if (Moves > Steps * 20)
                return Trace; // endless without doing anything
            At = step(At, Jumped, Answers, Trace);
        }
        return Trace;
    }

private:
    static bool opensLoop(StructureKind Kind) {
        return Kind == StructureKind::While || Kind == StructureKind::Forever ||
               Kind == StructureKind::Do;
    }

    void match() {
        m_Next.assign(m_Tokens.size(), 0);
        m_Loop.assign(m_Tokens.size(), 0);
        m_Close.assign(m_Tokens.size(), 0);
        std::vector<std::vector<std::size_t>> Open; // each: opener and its else parts
        std::vector<std::size_t> Loops;
        for (std::size_t i = 0; i < m_Tokens.size(); ++i) {
            const StructureKind Kind = m_Tokens[i].Kind;
            m_Loop[i] = Loops.empty() ? 0 : Loops.back();
            if (Kind == StructureKind::Label)
                m_Labels.resize(std::max<std::size_t>(m_Labels.size(), m_Tokens[i].Node + 1)),
                    m_Labels[m_Tokens[i].Node] = i;
            if (Kind == StructureKind::If || opensLoop(Kind))
                Open.push_back({i});
            if (opensLoop(Kind))
                Loops.push_back(i);
            if (Kind == StructureKind::Else || Kind == StructureKind::ElseIf) {
                m_Next[Open.back().back()] = i;
                Open.back().push_back(i);
            }
            if (Kind == StructureKind::End || Kind == StructureKind::EndDo) {
                m_Next[Open.back().back()] = i;
                for (std::size_t Part : Open.back())
                    m_Close[Part] = i;
                m_Close[i] = Open.back().front();
                if (opensLoop(m_Tokens[Open.back().front()].Kind))
                    Loops.pop_back();
                Open.pop_back();
            }
        }
    }

    bool ask(std::size_t At, std::mt19937& Answers, std::vector<int>& Trace) const {
        Trace.push_back(-1 - m_Tokens[At].Node);
        return ((Answers() >> 7) % 2 != 0) != m_Tokens[At].Negated;
    }

    std::size_t step(std::size_t At, bool& Jumped, std::mt19937& Answers,
                     std::vector<int>& Trace) const {
        const bool CameByJump = Jumped;
        Jumped = false;
        switch (m_Tokens[At].Kind) {
        case StructureKind::Code:
            Trace.push_back(m_Tokens[At].Node);
            return At + 1;
        case StructureKind::ElseIf:
        case StructureKind::Else:
            if (!CameByJump)
                return m_Close[At] + 1;
            if (m_Tokens[At].Kind == StructureKind::Else)
                return At + 1;
            [[fallthrough]];
        case StructureKind::If:
            if (ask(At, Answers, Trace))
                return At + 1;
            Jumped = m_Tokens[m_Next[At]].Kind != StructureKind::End;
            return Jumped ? m_Next[At] : m_Next[At] + 1;
        case StructureKind::While:
            return ask(At, Answers, Trace) ? At + 1 : m_Next[At] + 1;
        case StructureKind::End:
            return opensLoop(m_Tokens[m_Close[At]].Kind) ? m_Close[At] : At + 1;
        case StructureKind::EndDo:
            return ask(At, Answers, Trace) ? m_Close[At] : At + 1;
        case StructureKind::Goto:
            return m_Labels[m_Tokens[At].Node];
        case StructureKind::Break:
            return m_Close[m_Loop[At]] + 1;
        case StructureKind::Continue:
            return m_Tokens[m_Loop[At]].Kind == StructureKind::Do ? m_Close[m_Loop[At]]
                                                                  : m_Loop[At];
        case StructureKind::Return:
            return m_Tokens.size();
        default:
            return At + 1;
        }
    }

    std::vector<StructureToken> m_Tokens;
    std::vector<std::size_t> m_Next;  // of a condition: where to go on if it does not hold
    std::vector<std::size_t> m_Close; // of an opener its end, of an end its first opener
    std::vector<std::size_t> m_Loop;  // innermost loop's opener
    std::vector<std::size_t> m_Labels;
};

/// The trace of the graph itself.
inline std::vector<int> traceOf(const std::vector<FlowNode>& Nodes, unsigned Seed,
                                std::size_t Steps) {
    std::mt19937 Answers(Seed);
    std::vector<int> Trace;
    int At = 0;
    for (std::size_t Moves = 0; At != ReturnTarget && Trace.size() < Steps && Moves < Steps * 20;
         ++Moves) {
        if (Nodes[At].HasCode)
            Trace.push_back(At);
        if (Nodes[At].IsBranch && Trace.size() < Steps)
            Trace.push_back(-1 - At);
        At = !Nodes[At].IsBranch || (Answers() >> 7) % 2 != 0 ? Nodes[At].True : Nodes[At].False;
    }
    return Trace;
}

} // namespace hpn::test

#endif
