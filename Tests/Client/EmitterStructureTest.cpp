#include "Emitter/Structurer.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

namespace hpn {
namespace {

FlowNode code(int Target) {
    return {true, false, Target, ReturnTarget};
}
FlowNode branch(int True, int False) {
    return {false, true, True, False};
}
FlowNode codeAndBranch(int True, int False) {
    return {true, true, True, False};
}
constexpr int Out = ReturnTarget;

/// One line of text for a structure: "if0{ A1 }else{ A2 } A3".
std::string textOf(const std::vector<FlowNode>& Nodes) {
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

TEST(EmitterStructure, KnownShapesComeBack) {
    const struct {
        const char* pExpected;
        std::vector<FlowNode> Nodes;
    } Cases[] = {
        // Branches: no empty else, negation where only the other arm has code, chains flat.
        {"if(0){ A1 } A2", {branch(1, 2), code(2), code(Out)}},
        {"if(!0){ A1 } A2", {branch(2, 1), code(2), code(Out)}},
        {"if(0){ A1 else{ A2 } A3", {branch(1, 2), code(3), code(3), code(Out)}},
        {"if(0){ A1 else if(2){ A3 else{ A4 }",
         {branch(1, 2), code(Out), branch(3, 4), code(Out), code(Out)}},
        // What a loop is left for stands behind it.
        {"while(!0){ A2 if(2){ A3 } A4 } A1",
         {branch(1, 2), code(Out), codeAndBranch(3, 4), code(4), code(0)}},
        // Loops.
        {"A0 while(1){ A2 } A3", {code(1), branch(2, 3), code(1), code(Out)}},
        {"while(!0){ A1 }", {branch(Out, 1), code(0)}},
        {"while(0){ }", {branch(0, Out)}},
        {"do{ A0 }while(0) A1", {codeAndBranch(0, 1), code(Out)}},
        {"do{ A0 if(0){ A1 } }while(2)", {codeAndBranch(1, 2), code(2), branch(0, Out)}},
        {"for{ A0 }", {code(0)}},
        {"for{ A0 if(0){ break } A1 } A2", {codeAndBranch(2, 1), code(0), code(Out)}},
        // Leaving a loop from the middle, with and without code of its own.
        {"while(0){ A1 if(1){ break } A2 } A3",
         {branch(1, 3), codeAndBranch(3, 2), code(0), code(Out)}},
        {"while(0){ A1 if(1){ A4 break } A2 } A3",
         {branch(1, 3), codeAndBranch(4, 2), code(0), code(Out), code(3)}},
        // A case that falls into the next one.
        {"if(0){ A1 else if(!2){ A4 return } A3 A5",
         {branch(1, 2), code(3), branch(3, 4), code(5), code(Out), code(Out)}},
        // Two entries into a cycle: only a goto can do that.
        {"if(0){ goto L1 } L2: A2 if(!2){ return } L1: A1 goto L2",
         {branch(1, 2), code(2), codeAndBranch(1, Out)}},
    };
    for (const auto& Case : Cases)
        EXPECT_EQ(textOf(Case.Nodes), Case.pExpected);
}

// ---- random graphs: the text does what the graph does ----

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

std::vector<int> traceOf(const std::vector<FlowNode>& Nodes, unsigned Seed, std::size_t Steps) {
    std::mt19937 Answers(Seed);
    std::vector<int> Trace;
    int At = 0;
    for (std::size_t Moves = 0; At != Out && Trace.size() < Steps && Moves < Steps * 20; ++Moves) {
        if (Nodes[At].HasCode)
            Trace.push_back(At);
        if (Nodes[At].IsBranch && Trace.size() < Steps)
            Trace.push_back(-1 - At);
        At = !Nodes[At].IsBranch || (Answers() >> 7) % 2 != 0 ? Nodes[At].True : Nodes[At].False;
    }
    return Trace;
}

/// Keeps what node 0 reaches, renumbered.
std::vector<FlowNode> reachable(const std::vector<FlowNode>& Nodes) {
    std::vector<int> Number(Nodes.size(), -1);
    std::vector<int> Order{0};
    Number[0] = 0;
    for (std::size_t i = 0; i < Order.size(); ++i)
        for (int Target :
             {Nodes[Order[i]].True, Nodes[Order[i]].IsBranch ? Nodes[Order[i]].False : Out})
            if (Target != Out && Number[Target] == -1) {
                Number[Target] = static_cast<int>(Order.size());
                Order.push_back(Target);
            }
    std::vector<FlowNode> Result;
    for (int Node : Order) {
        FlowNode Flow = Nodes[Node];
        for (int* pTarget : {&Flow.True, &Flow.False})
            *pTarget = *pTarget == Out ? Out : Number[*pTarget];
        Result.push_back(Flow);
    }
    return Result;
}

void expectSameBehaviour(const std::vector<FlowNode>& Nodes, unsigned Seed) {
    TextRun Text(structureFlow(Nodes));
    for (unsigned Run = 0; Run < 8; ++Run)
        ASSERT_EQ(Text.run(Seed * 8 + Run, 60), traceOf(Nodes, Seed * 8 + Run, 60))
            << "seed " << Seed << ": " << textOf(Nodes);
}

TEST(EmitterStructure, RandomGraphsRunAsTheirText) {
    for (unsigned Seed = 0; Seed < 4000; ++Seed) {
        std::mt19937 Random(Seed);
        const int Count = 2 + static_cast<int>(Random() % 9);
        const auto target = [&] { return static_cast<int>(Random() % (Count + 1)) - 1; };
        std::vector<FlowNode> Nodes;
        for (int i = 0; i < Count; ++i) {
            FlowNode Node{true, Random() % 2 == 0, target(), target()};
            Node.HasCode = !Node.IsBranch || Random() % 3 != 0;
            Node.IsBranch = Node.IsBranch && Node.True != Node.False;
            Node.HasCode = Node.HasCode || !Node.IsBranch;
            Nodes.push_back(Node);
        }
        expectSameBehaviour(reachable(Nodes), Seed);
    }
}

/// A random program of structured statements as a graph, built from its end.
class StructuredFlow {
public:
    explicit StructuredFlow(unsigned Seed) : m_Random(Seed) {
        m_Nodes.emplace_back();
        m_Nodes[0] = code(sequence(4, Out, Out, Out, false));
    }
    std::vector<FlowNode> take() { return reachable(m_Nodes); }

private:
    int add(const FlowNode& Node) {
        m_Nodes.push_back(Node);
        return static_cast<int>(m_Nodes.size()) - 1;
    }
    int sequence(int Depth, int Next, int Break, int Continue, bool IsInLoop) {
        for (int i = 1 + static_cast<int>(m_Random() % 3); i > 0; --i)
            Next = statement(Depth, Next, Break, Continue, IsInLoop);
        return Next;
    }
    int statement(int Depth, int Next, int Break, int Continue, bool IsInLoop) {
        const unsigned Kind = Depth == 0 ? 0 : m_Random() % 7;
        const auto body = [&](int After) {
            return add(code(sequence(Depth - 1, After, Break, Continue, IsInLoop)));
        };
        switch (Kind) {
        case 1:
            return add(branch(body(Next), Next));
        case 2: {
            const int Then = body(Next);
            return add(branch(Then, body(Next)));
        }
        case 3: {
            const int Header = add(branch(Out, Next));
            m_Nodes[Header].True = add(code(sequence(Depth - 1, Header, Next, Header, true)));
            return Header;
        }
        case 4: {
            const int Latch = add(branch(Out, Next));
            const int First = add(code(sequence(Depth - 1, Latch, Next, Latch, true)));
            m_Nodes[Latch].True = First;
            return First;
        }
        case 5:
            return IsInLoop ? add(branch(Break, Next == Break ? add(code(Next)) : Next))
                            : add(code(Next));
        default:
            return add(code(Next));
        }
    }

    std::mt19937 m_Random;
    std::vector<FlowNode> m_Nodes;
};

TEST(EmitterStructure, StructuredProgramsNeedNoGoto) {
    int WithLoops = 0;
    for (unsigned Seed = 0; Seed < 2000; ++Seed) {
        const std::vector<FlowNode> Nodes = StructuredFlow(Seed).take();
        expectSameBehaviour(Nodes, Seed);
        const std::string Text = textOf(Nodes);
        WithLoops += Text.find("while") != std::string::npos;
        EXPECT_EQ(Text.find("goto"), std::string::npos) << Seed << ": " << Text;
    }
    EXPECT_GT(WithLoops, 500);
}

TEST(EmitterStructure, LongAndDeepFlowNeedsNoStack) {
    std::vector<FlowNode> Straight;
    std::vector<FlowNode> Deep;
    constexpr int Size = 200000;
    for (int i = 0; i < Size; ++i) {
        // Every second node may be passed over; the deep one nests each branch in the one before.
        Straight.push_back(i + 2 < Size ? codeAndBranch(i + 1, i + 2)
                                        : code(i + 1 < Size ? i + 1 : Out));
        Deep.push_back(i + 1 < Size ? codeAndBranch(i + 1, Out) : code(Out));
    }
    EXPECT_GE(structureFlow(Straight).size(), static_cast<std::size_t>(Size));
    EXPECT_GE(structureFlow(Deep).size(), static_cast<std::size_t>(Size));
}

} // namespace
} // namespace hpn
