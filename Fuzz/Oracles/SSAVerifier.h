#ifndef SSAVERIFIER_H
#define SSAVERIFIER_H

// Verifies that a graph is in SSA form, at any time between transformToSSAForm and the end of the
// run, with several items in a node or one. It knows nothing of the client's classes. The
// invariants:
//
// 1. What a phi function, assignment, parameter or value return statement defines is an SSA
// version, and no version is
//    defined twice.
// 2. What is used is a version, and its definition dominates the use. An argument is used at its
// call; the expression of
//    a value return statement is used at the callee's exit. Where control does not get there,
//    because the callee is never left, nothing is given back, and the definition may be gone with
//    the code.
// 3. A phi function has an operand for each control flow in-edge of its join, and the definition of
// operand i dominates
//    the source of in-edge i. In a divided graph, the join is the node at the head of the chain of
//    phi functions.
// 4. The renaming stacks of all variables are empty.
//
// Linear in program and phi operands, but for the dominators (iterative, by K. D. Cooper, T. J.
// Harvey and K. Kennedy), which are computed here, from control flow alone.

#include <algorithm>
#include <climits>
#include <map>
#include <string>
#include <unordered_map>
#include <vector>

#include "ZfCControlFlowGraph.h"

namespace passes {

// Once statements have moved out of the arms of branches, one stands for its twin as well, whose
// version is used without a definition: no dominance is asked for then.
enum class Strictness { Full, WithoutDominance };

class SSAVerifier {
public:
    explicit SSAVerifier(ZfCControlFlowGraph& Graph, Strictness Asked = Strictness::Full)
        : m_Graph(Graph), m_Asked(Asked) {
        computeDominators();
        collectDefinitions();
        for (leda::node v : m_Reached)
            checkNode(v);
    }

    // What is wrong, a line each; empty if nothing is.
    std::string const& violations() const { return m_Violations; }

    // Null for an entry node and for what is not reached.
    leda::node idom(leda::node v) { return m_Idom[index(v)]; }
    bool dominates(leda::node u, leda::node v) {
        while (v != nullptr && m_Number[index(v)] > m_Number[index(u)])
            v = m_Idom[index(v)];
        return u == v;
    }

private:
    struct Place {
        leda::node v = nullptr;
        int Position = 0; // -1: phi function; else the statement's
    };

    int index(leda::node v) { return m_Graph.index(v); }
    bool isControlFlow(leda::edge e) { return m_Graph.inf(e)->isSSAEdge() == nullptr; }
    bool isReached(leda::node v) { return m_Number[index(v)] >= 0; }

    std::vector<leda::edge> inEdges(leda::node v) {
        std::vector<leda::edge> Edges;
        for (leda::edge e = m_Graph.first_in_edge(v); e != nullptr; e = m_Graph.in_succ(e))
            if (isControlFlow(e))
                Edges.push_back(e);
        return Edges;
    }

    // Reverse postorder from all entry nodes; m_Number is the place in it, -1 for what is not
    // reached.
    void computeDominators() {
        m_Number.assign(std::size_t(m_Graph.max_node_index() + 1), -1);
        m_Idom.assign(m_Number.size(), nullptr);
        for (leda::node v = m_Graph.first_node(); v != nullptr; v = m_Graph.next_node(v))
            if (m_Graph.inf(v)->isEntryNode() != nullptr)
                searchFrom(v);
        std::reverse(m_Reached.begin(), m_Reached.end());
        for (std::size_t i = 0; i < m_Reached.size(); ++i)
            m_Number[index(m_Reached[i])] = int(i);
        for (bool Changed = true; Changed;) {
            Changed = false;
            for (leda::node v : m_Reached) {
                leda::node Idom = nullptr;
                for (leda::edge e = m_Graph.first_in_edge(v); e != nullptr;
                     e = m_Graph.in_succ(e)) {
                    leda::node u = m_Graph.source(e);
                    if (isControlFlow(e) && isReached(u) &&
                        (m_Idom[index(u)] != nullptr || isEntry(u)))
                        Idom = Idom == nullptr ? u : meet(Idom, u);
                }
                Changed = Changed || m_Idom[index(v)] != Idom;
                m_Idom[index(v)] = Idom;
            }
        }
    }
    bool isEntry(leda::node v) { return m_Graph.inf(v)->isEntryNode() != nullptr; }
    leda::node meet(leda::node u, leda::node v) {
        while (u != v) {
            leda::node& Later = m_Number[index(u)] > m_Number[index(v)] ? u : v;
            Later = m_Idom[index(Later)];
        }
        return u;
    }
    void searchFrom(leda::node Root) {
        std::vector<std::pair<leda::node, leda::edge>> Path{{Root, m_Graph.first_adj_edge(Root)}};
        m_Number[index(Root)] = 0;
        while (!Path.empty()) {
            leda::edge e = Path.back().second;
            if (e == nullptr) {
                m_Reached.push_back(Path.back().first);
                Path.pop_back();
                continue;
            }
            Path.back().second = m_Graph.adj_succ(e);
            leda::node w = m_Graph.target(e);
            if (isControlFlow(e) && m_Number[index(w)] < 0) {
                m_Number[index(w)] = 0;
                Path.emplace_back(w, m_Graph.first_adj_edge(w));
            }
        }
    }

    void collectDefinitions() {
        m_Definitions.reserve(std::size_t(m_Graph.number_of_nodes()));
        for (leda::node v = m_Graph.first_node(); v != nullptr; v = m_Graph.next_node(v)) {
            ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
            if (isEntry(v))
                m_Procedures[m_Graph.inf(v)->getProcedure()->getName().cstring()] =
                    m_Graph.inf(v)->getProcedure();
            if (pBlock == nullptr)
                continue;
            for (ZfCPhiFunction* pPhi : pBlock->getPhiFunctions())
                define(pPhi->getVariable(), {v, -1});
            int Position = 0;
            for (ZfCCfgStatement* pStmt : pBlock->getStatementSeq()) {
                for (ZfCCfgVariable* pVar : pStmt->getDefinedVariables())
                    define(pVar, {v, Position});
                if (ZfCCfgProcedureCall* pCall = pStmt->isProcedureCall())
                    m_Calls[pCall] = {v, Position};
                ++Position;
            }
        }
    }
    void define(ZfCCfgVariable* pVar, Place At) {
        if (pVar == nullptr || pVar->isSSAVariable() == nullptr) {
            report("a definition is no version", At.v);
            return;
        }
        if (!m_Definitions.emplace(pVar, At).second)
            report("a version is defined twice", At.v);
        if (pVar->isSSAVariable()->getOrigVar()->topSSAReplacement() != nullptr)
            report("a renaming stack is not empty", At.v);
    }

    bool isDefinedBefore(ZfCCfgVariable* pVar, Place Use, char const* pWhat) {
        auto Found = m_Definitions.find(pVar);
        bool IsVersion = pVar != nullptr && pVar->isSSAVariable() != nullptr;
        if (m_Asked == Strictness::WithoutDominance && IsVersion)
            return true;
        if (Found == m_Definitions.end()) {
            report(std::string(pWhat) + (IsVersion ? " has no definition" : " is no version"),
                   Use.v);
            return false;
        }
        Place Def = Found->second;
        bool Before = Def.v == Use.v ? Def.Position < Use.Position
                                     : isReached(Def.v) && dominates(Def.v, Use.v);
        if (!Before)
            report(std::string(pWhat) + " is not dominated by its definition", Use.v);
        return Before;
    }
    void checkUses(leda::set<ZfCCfgVariable*, leda::avl_tree> const& Uses, Place At,
                   char const* pWhat) {
        for (ZfCCfgVariable* pVar : Uses)
            isDefinedBefore(pVar, At, pWhat);
    }

    void checkNode(leda::node v) {
        ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
        if (pBlock == nullptr)
            return;
        for (ZfCPhiFunction* pPhi : pBlock->getPhiFunctions())
            checkPhi(pPhi, v);
        int Position = 0;
        for (ZfCCfgStatement* pStmt : pBlock->getStatementSeq()) {
            checkStatement(pStmt, {v, Position});
            ++Position;
        }
        if (pBlock->getBranchCond() != nullptr)
            checkUses(pBlock->getBranchCond()->getUsedVariables(), {v, INT_MAX},
                      "a condition's variable");
    }
    void checkStatement(ZfCCfgStatement* pStmt, Place At) {
        if (ZfCCfgParamStatement* pParam = pStmt->isParamStatement()) {
            auto& Arguments = pParam->getParamExpressions();
            for (auto Item = Arguments.first_item(); Item != nullptr;
                 Item = Arguments.next_item(Item)) {
                auto Call = m_Calls.find(Arguments.key(Item));
                if (Call != m_Calls.end() && isReached(Call->second.v))
                    checkUses(Arguments.inf(Item)->getUsedVariables(), Call->second, "an argument");
            }
        } else if (ZfCCfgValueReturnStatement* pReturn = pStmt->isValueReturnStatement()) {
            for (ZfCCfgVariable* pVar : pReturn->getUsedVariables())
                checkReturned(pVar, At);
        } else {
            checkUses(pStmt->getUsedVariables(), At, "a variable");
        }
    }
    void checkReturned(ZfCCfgVariable* pVar, Place At) {
        auto Found = m_Definitions.find(pVar);
        ZfCCfgProcedure* pCallee = Found != m_Definitions.end()
                                       ? m_Graph.inf(Found->second.v)->getProcedure()
                                       : calleeBefore(At);
        leda::node Exit = pCallee != nullptr ? pCallee->getExitNode() : nullptr;
        if (Exit == nullptr)
            report("a value is returned behind no call", At.v);
        else if (isReached(Exit))
            isDefinedBefore(pVar, {Exit, 0}, "a returned value");
    }
    // Of the call that a value return statement belongs to: the last one before it on the only way
    // there.
    ZfCCfgProcedure* calleeBefore(Place At) {
        for (int Steps = m_Graph.number_of_nodes(); Steps > 0; --Steps) {
            ZfCCfgProcedureCall* pCall = nullptr;
            int Position = 0;
            if (ZfCBasicBlock* pBlock = m_Graph.inf(At.v)->isBasicBlock())
                for (ZfCCfgStatement* pStmt : pBlock->getStatementSeq())
                    if (Position++ < At.Position && pStmt->isProcedureCall() != nullptr)
                        pCall = pStmt->isProcedureCall();
            if (pCall != nullptr)
                return m_Procedures[pCall->getName().cstring()];
            std::vector<leda::edge> Edges = inEdges(At.v);
            if (Edges.size() != 1)
                break;
            At = {m_Graph.source(Edges[0]), INT_MAX};
        }
        return nullptr;
    }

    // Up the chain of phi functions to the node with the in-edges of the join.
    leda::node joinOf(leda::node v, int Operands) {
        for (;;) {
            std::vector<leda::edge> Edges = inEdges(v);
            if (int(Edges.size()) == Operands || Edges.size() != 1)
                return v;
            v = m_Graph.source(Edges[0]);
        }
    }
    void checkPhi(ZfCPhiFunction* pPhi, leda::node v) {
        leda::array<ZfCCfgVariable*> Operands = pPhi->getReplacementVariables();
        std::vector<leda::edge> Edges = inEdges(joinOf(v, Operands.size()));
        if (int(Edges.size()) != Operands.size()) {
            report("a phi function's operands are not those of its in-edges", v);
            return;
        }
        for (std::size_t i = 0; i < Edges.size(); ++i) {
            leda::node u = m_Graph.source(Edges[i]);
            ZfCCfgVariable* pOperand = Operands[int(i)];
            if (pOperand == nullptr || pOperand->isSSAVariable() == nullptr)
                report("an operand is no version", v);
            else if (pOperand->isSSAVariable()->getOrigVar() !=
                     pPhi->getVariable()->isSSAVariable()->getOrigVar())
                report("an operand is of another variable", v);
            else if (isReached(u))
                isDefinedBefore(pOperand, {u, INT_MAX}, "an operand");
        }
    }

    void report(std::string const& Text, leda::node v) {
        m_Violations += Text + " (node " + std::to_string(index(v)) + ")\n";
    }

    ZfCControlFlowGraph& m_Graph;
    Strictness m_Asked;
    std::vector<int> m_Number;
    std::vector<leda::node> m_Idom;
    std::vector<leda::node> m_Reached;                        // in reverse postorder
    std::unordered_map<ZfCCfgVariable*, Place> m_Definitions; // looked up only, as the next
    std::unordered_map<ZfCCfgProcedureCall*, Place> m_Calls;
    std::map<std::string, ZfCCfgProcedure*> m_Procedures;
    std::string m_Violations;
};

inline std::string verifySSA(ZfCControlFlowGraph& Graph, Strictness Asked = Strictness::Full) {
    return SSAVerifier(Graph, Asked).violations();
}

} // namespace passes

#endif
