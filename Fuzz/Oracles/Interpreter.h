#ifndef INTERPRETER_H
#define INTERPRETER_H

// Runs the program in a graph of the test client, before SSA form or in it, and collects what it
// hands out at its end.
//
// A volatile variable reads the same number all through a run. An unknown condition, which is that
// of the loop around
// "#main", holds as often as Passes says. Phi functions of one join read their operands all at
// once. A virtual assignment stores nothing: its version stands for the real one, and must agree
// with it. Recursion of the program is not provided for.

#include <map>
#include <string>
#include <vector>

#include "LibraryClient/TestClient.h"

namespace passes {

class Interpreter {
public:
    Interpreter(Program& P, unsigned int Seed, int Passes, int MostSteps = 20000)
        : m_P(P), m_Graph(P.graph()), m_Seed(Seed), m_Passes(Passes), m_MostSteps(MostSteps) {}

    // The outputs in set order, then what went wrong.
    std::string run() {
        execute("#main");
        // In SSA form the output statements have told the values, else the variables hold them.
        if (!m_IsSSA)
            for (auto& Item : m_P.Variables)
                if (Item.second->Output)
                    m_Outputs[Item.first] = read(Item.second.get());
        std::string Text;
        for (auto& Item : m_Outputs)
            Text += Item.first + "=" + Program::show(Item.second) + " ";
        return Text + m_Faults;
    }

private:
    void execute(std::string const& Name) {
        leda::node v = m_P.procedure(Name)->getEntryNode();
        leda::edge Arrival = nullptr;
        while (m_Graph.inf(v)->isExitNode() == nullptr) {
            if (++m_Steps > m_MostSteps) {
                m_Faults += "too many steps";
                return;
            }
            if (ZfCBasicBlock* pBlock = m_P.blockOf(v)) {
                readPhiFunctions(v, Arrival);
                if (pBlock->isPhiFunction() == nullptr && !pBlock->isEmpty())
                    writePhiFunctions();
                for (ZfCCfgStatement* pStmt : pBlock->getStatementSeq())
                    runStatement(pStmt);
            }
            Arrival = nextEdge(v);
            if (Arrival == nullptr) {
                m_Faults += "a node without a way on";
                return;
            }
            v = m_Graph.target(Arrival);
        }
        writePhiFunctions();
    }

    leda::edge nextEdge(leda::node v) {
        ZfCBasicBlock* pBlock = m_P.blockOf(v);
        bool IsTaken = true;
        bool IsBranch = pBlock != nullptr && pBlock->getBranchCond() != nullptr;
        if (IsBranch) {
            ZfCCfgValue Value = valueOf(pBlock->getBranchCond());
            IsTaken = Value.isConstant() ? Value.getValue() != 0.0 : --m_Passes > 0;
        }
        for (leda::edge e : m_Graph.out_edges(v)) {
            ZfCCfgEdgeInfo* pInf = m_Graph.inf(e);
            if (pInf->isSSAEdge() == nullptr &&
                (!IsBranch ||
                 (IsTaken ? pInf->isTrueBranch() != nullptr : pInf->isFalseBranch() != nullptr)))
                return e;
        }
        return nullptr;
    }

    int controlFlowPosition(leda::edge e) {
        int Position = 0;
        for (leda::edge f : m_Graph.in_edges(m_Graph.target(e))) {
            if (f == e)
                return Position;
            Position += m_Graph.inf(f)->isSSAEdge() == nullptr;
        }
        return -1;
    }
    // The phi functions of one join stand in one node, or in a chain of nodes of which some may be
    // empty by now. They have an operand for each in-edge of the join; their results wait until the
    // chain is over.
    void readPhiFunctions(leda::node v, leda::edge Arrival) {
        int InDegree = cfgInDegree(v);
        leda::list<ZfCPhiFunction*> const& PhiFunctions = m_P.blockOf(v)->getPhiFunctions();
        if (InDegree != 1 || (!PhiFunctions.empty() &&
                              PhiFunctions.front()->getReplacementVariables().size() == 1)) {
            writePhiFunctions();
            m_JoinPosition = controlFlowPosition(Arrival);
        }
        for (ZfCPhiFunction* pPhi : PhiFunctions)
            m_PhiResults.emplace_back(pPhi->getVariable(),
                                      read(pPhi->getReplacementVariables()[m_JoinPosition]));
    }
    void writePhiFunctions() {
        for (auto& Result : m_PhiResults)
            m_Values[Result.first] = Result.second;
        m_PhiResults.clear();
    }
    int cfgInDegree(leda::node v) {
        int Count = 0;
        for (leda::edge e : m_Graph.in_edges(v))
            Count += m_Graph.inf(e)->isSSAEdge() == nullptr;
        return Count;
    }

    void runStatement(ZfCCfgStatement* pStmt) {
        if (ZfCCfgAssignment* pAssignment = pStmt->isAssignment())
            runAssignment(pAssignment);
        else if (ZfCCfgProcedureCall* pCall = pStmt->isProcedureCall())
            runCall(pCall);
        else if (ZfCCfgValueReturnStatement* pReturn = pStmt->isValueReturnStatement())
            m_Values[pReturn->getVariable()] = valueOf(pReturn->getExpression());
        else if (ZfCCfgOutputStatement* pOutput = pStmt->isOutputStatement())
            m_Outputs[static_cast<Variable*>(originalOf(pOutput->getVariable()))->Name] =
                read(pOutput->getVariable());
    }
    void runAssignment(ZfCCfgAssignment* pAssignment) {
        ZfCCfgVariable* pLHS = pAssignment->getLHS();
        ZfCCfgValue Value = valueOf(pAssignment->getRHS());
        m_IsSSA = m_IsSSA || pLHS->isSSAVariable() != nullptr;
        if (pAssignment->getIsVirtual() && !pLHS->isSSAVariable())
            return;
        if (pAssignment->getIsVirtual()) {
            ZfCCfgValue Real = read(pLHS->getNonVirtualAlias());
            if (Real.compare(Value) != 0)
                m_Faults += "a branch told something wrong";
            Value = Real;
        }
        // What the variable makes of it: saturated, or else cast.
        if (!pLHS->ConsiderSaturation(Value))
            cast(pLHS->getDataType(), Value, true);
        m_Values[pLHS] = Value;
    }
    // All arguments are read before the first parameter is written.
    void runCall(ZfCCfgProcedureCall* pCall) {
        std::vector<std::pair<ZfCCfgVariable*, ZfCCfgValue>> Arguments;
        ZfCCfgProcedure* pCallee = m_P.procedure(pCall->getName().cstring());
        for (auto& Item : m_P.statements())
            if (ZfCCfgParamStatement* pParam = Item.second->isParamStatement())
                if (m_Graph.inf(Item.first)->getProcedure() == pCallee)
                    Arguments.emplace_back(pParam->getVariable(),
                                           valueOf(pParam->getParamExpression(pCall)));
        for (auto& Argument : Arguments)
            m_Values[Argument.first] = Argument.second;
        execute(pCall->getName().cstring());
    }

    ZfCCfgValue valueOf(ZfCCfgExpression* pExpression) {
        if (auto* pOwn = dynamic_cast<Expression*>(pExpression))
            return Expression::compute(pOwn->Root,
                                       [this](ZfCCfgVariable* pVar) { return read(pVar); });
        if (auto* pUse = dynamic_cast<ZfCCfgExplicitVarUse*>(pExpression)) {
            VariableSet Used = pUse->getUsedVariables();
            return read(Used.key(Used.first_item()));
        }
        return pExpression->evaluate();
    }
    ZfCCfgValue read(ZfCCfgVariable* pVar) {
        auto* pOriginal = static_cast<Variable*>(originalOf(pVar));
        if (pOriginal->isVolatile())
            return ZfCCfgValue(
                double((std::hash<std::string>()(pOriginal->Name) ^ m_Seed * 2654435761u) % 4));
        auto Found = m_Values.find(pVar);
        if (Found != m_Values.end())
            return Found->second;
        if (pVar != pOriginal)
            m_Faults += "a version of " + pOriginal->Name + " is read before it is written";
        return pOriginal->Init;
    }

    Program& m_P;
    ZfCControlFlowGraph& m_Graph;
    unsigned int m_Seed;
    int m_Passes;
    int m_MostSteps;
    int m_Steps = 0;
    int m_JoinPosition = 0; // of the last join that control came to
    bool m_IsSSA = false;
    std::vector<std::pair<ZfCCfgVariable*, ZfCCfgValue>> m_PhiResults;
    std::map<ZfCCfgVariable*, ZfCCfgValue> m_Values;
    std::map<std::string, ZfCCfgValue> m_Outputs;
    std::string m_Faults;
};

} // namespace passes

#endif
