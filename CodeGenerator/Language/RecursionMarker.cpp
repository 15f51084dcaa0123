// Strongly connected components of the calls.
//
// R. E. Tarjan, Depth-first search and linear graph algorithms, SIAM Journal on Computing 1(2),
// 1972:
//
// 1. A depth-first search numbers the procedures; open ones lie on a stack.
// 2. The low number of a procedure is the smallest number that it reaches among the open ones.
// 3. A procedure that reaches none before itself closes a component: all above it on the stack.
//
// The search keeps its path on a stack of its own: a chain of calls can be as long as the program.
// Linear in procedures and calls.

#include "Language/RecursionMarker.h"

#include <algorithm>

namespace hpn {

namespace {

class Marker {
public:
    Marker(Program& Target, const std::vector<CallEdge>& Calls);
    void run();

private:
    struct Visit {
        std::uint32_t Procedure;
        std::uint32_t NextCall; ///< place in m_Callees
    };

    void enter(std::uint32_t Procedure);
    void advance();
    void closeComponent(std::uint32_t Root);

    Program& m_Target;
    std::vector<std::uint32_t> m_FirstCall; ///< by procedure, and one more: its callees' places
    std::vector<std::uint32_t> m_Callees;
    std::vector<std::uint32_t> m_Number; ///< 0: not visited
    std::vector<std::uint32_t> m_Low;
    std::vector<bool> m_IsOpen;
    std::vector<std::uint32_t> m_Open;
    std::vector<Visit> m_Path;
    std::uint32_t m_Count = 0;
};

Marker::Marker(Program& Target, const std::vector<CallEdge>& Calls)
    : m_Target(Target), m_FirstCall(Target.Procedures.size() + 1, 0), m_Callees(Calls.size()),
      m_Number(Target.Procedures.size(), 0), m_Low(Target.Procedures.size(), 0),
      m_IsOpen(Target.Procedures.size(), false) {
    for (const CallEdge& Call : Calls) {
        ++m_FirstCall[Call.Caller + 1];
    }
    for (std::size_t i = 1; i < m_FirstCall.size(); ++i) {
        m_FirstCall[i] += m_FirstCall[i - 1];
    }
    std::vector<std::uint32_t> Next(m_FirstCall.begin(), m_FirstCall.end() - 1);
    for (const CallEdge& Call : Calls) {
        m_Callees[Next[Call.Caller]++] = Call.Callee;
        if (Call.Caller == Call.Callee) {
            Target.Procedures[Call.Caller].IsRecursive = true;
        }
    }
}

void Marker::run() {
    for (std::uint32_t Procedure = 0; Procedure < m_Number.size(); ++Procedure) {
        if (m_Number[Procedure] == 0) {
            enter(Procedure);
        }
        while (!m_Path.empty()) {
            advance();
        }
    }
}

// Step 1.
void Marker::enter(std::uint32_t Procedure) {
    m_Number[Procedure] = m_Low[Procedure] = ++m_Count;
    m_IsOpen[Procedure] = true;
    m_Open.push_back(Procedure);
    m_Path.push_back({Procedure, m_FirstCall[Procedure]});
}

// Step 2 for the next call of the last procedure on the path, or its end.
void Marker::advance() {
    Visit& Last = m_Path.back();
    const std::uint32_t Procedure = Last.Procedure;
    if (Last.NextCall < m_FirstCall[Procedure + 1]) {
        const std::uint32_t Callee = m_Callees[Last.NextCall++];
        if (m_Number[Callee] == 0) {
            enter(Callee);
        } else if (m_IsOpen[Callee]) {
            m_Low[Procedure] = std::min(m_Low[Procedure], m_Number[Callee]);
        }
        return;
    }
    m_Path.pop_back();
    if (!m_Path.empty()) {
        const std::uint32_t Caller = m_Path.back().Procedure;
        m_Low[Caller] = std::min(m_Low[Caller], m_Low[Procedure]);
    }
    if (m_Low[Procedure] == m_Number[Procedure]) {
        closeComponent(Procedure);
    }
}

// Step 3.
void Marker::closeComponent(std::uint32_t Root) {
    const bool IsRing = m_Open.back() != Root;
    std::uint32_t Member = 0;
    do {
        Member = m_Open.back();
        m_Open.pop_back();
        m_IsOpen[Member] = false;
        if (IsRing) {
            m_Target.Procedures[Member].IsRecursive = true;
        }
    } while (Member != Root);
}

} // namespace

void markRecursion(Program& Target, const std::vector<CallEdge>& Calls) {
    Marker(Target, Calls).run();
}

} // namespace hpn
