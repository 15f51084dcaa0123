#ifndef FLOWPROGRAMS_H
#define FLOWPROGRAMS_H

#include "Emitter/Structurer.h"

#include <random>
#include <vector>

namespace hpn::test {

// Flow graphs for the emitter: hand-made nodes, any graph, and graphs of structured programs.

inline FlowNode code(int Target) {
    return {true, false, Target, ReturnTarget};
}
inline FlowNode branch(int True, int False) {
    return {false, true, True, False};
}
inline FlowNode codeAndBranch(int True, int False) {
    return {true, true, True, False};
}
inline constexpr int Out = ReturnTarget;

/// Keeps what node 0 reaches, renumbered.
inline std::vector<FlowNode> reachable(const std::vector<FlowNode>& Nodes) {
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

/// Any graph: up to ten nodes that lead anywhere.
inline std::vector<FlowNode> randomFlow(unsigned Seed) {
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
    return reachable(Nodes);
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

} // namespace hpn::test

#endif
