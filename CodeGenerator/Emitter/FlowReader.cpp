#include "Emitter/FlowReader.h"

#include "Emitter/TestJoiner.h"
#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"
#include "ZfCBasicBlock.h"
#include "ZfCCfgAssignment.h"
#include "ZfCCfgEdgeInfo.h"
#include "ZfCCfgExternCall.h"
#include "ZfCCfgFalseBranch.h"
#include "ZfCCfgNodeInfo.h"
#include "ZfCCfgParamStatement.h"
#include "ZfCCfgTrueBranch.h"

#include <utility>

namespace hpn {

namespace {

const Term* rootOf(ZfCCfgExpression* pExpression) {
    ZfCCfgSFExpression* pOwn = pExpression ? pExpression->isSFExpression() : nullptr;
    return pOwn ? pOwn->getRoot() : nullptr;
}

/// Stores a variable's own value back unchanged.
bool isSelfCopy(const Term* pTerm, const Variable* pTarget) {
    while (pTerm->Op == Operator::Cast && pTerm->pType == pTarget->pType &&
           !pTerm->pType->SaturatesHigh && !pTerm->pType->SaturatesLow)
        pTerm = pTerm->pLeft;
    return pTerm->Op == Operator::Variable && declarationOf(pTerm->pVariable) == pTarget;
}

} // namespace

const Variable* declarationOf(ZfCCfgVariable* pVariable) {
    return &originalOf(pVariable)->getDeclaration();
}

FlowReader::FlowReader(ProgramGraph& Graph)
    : m_Graph(Graph), m_NumberOf(Graph.getGraph().max_node_index() + 1, -1) {
}

ProcedureFlow FlowReader::read(leda::node EntryNode) {
    m_Raw.clear();
    m_Items.clear();
    m_Notes = ProcedureFlow();
    leda::edge Out = EntryNode->first_out_edge();
    while (Out && m_Graph.getGraph().inf(Out)->isSSAEdge())
        Out = Out->next_out_edge();
    if (Out)
        collect(Out->terminal(1));
    skipEmptyNodes();
    ProcedureFlow Result = assemble();
    for (const RawNode& Raw : m_Raw)
        m_NumberOf[m_Graph.getGraph().index(Raw.Node)] = -1;
    return Result;
}

/// Number of a block, new ones are put at the end; `ReturnTarget` for the exit node.
int FlowReader::rawNumber(leda::node v) {
    ZfCControlFlowGraph& Graph = m_Graph.getGraph();
    if (!Graph.inf(v)->isBasicBlock())
        return ReturnTarget;
    int& Number = m_NumberOf[Graph.index(v)];
    if (Number == -1) {
        Number = static_cast<int>(m_Raw.size());
        m_Raw.emplace_back();
        m_Raw.back().Node = v;
        m_Raw.back().Resolved = Number;
    }
    return Number;
}

void FlowReader::collect(leda::node First) {
    rawNumber(First);
    for (std::size_t i = 0; i < m_Raw.size(); ++i)
        readBlock(static_cast<int>(i), m_Graph.getGraph().inf(m_Raw[i].Node)->isBasicBlock());
}

void FlowReader::readBlock(int Number, ZfCBasicBlock* pBlock) {
    m_Notes.IsSSAForm = m_Notes.IsSSAForm || !pBlock->getPhiFunctions().empty();
    m_Raw[Number].FirstItem = m_Items.size();
    for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
        readStatement(pStatement);
    m_Raw[Number].EndItem = m_Items.size();
    readExit(Number, pBlock);
}

void FlowReader::readStatement(ZfCCfgStatement* pStatement) {
    if (ZfCCfgAssignment* pAssignment = pStatement->isAssignment()) {
        readAssignment(pAssignment);
    } else if (ZfCCfgProcedureCall* pCall = pStatement->isProcedureCall()) {
        FlowItem Item{FlowItemKind::Call};
        Item.pCall = pCall->isSFProcedureCall();
        Item.pAnyCall = pCall;
        m_Items.push_back(Item);
    } else if (ZfCCfgExternCall* pExtern = pStatement->isExternCall()) {
        FlowItem Item{FlowItemKind::CallExtern};
        Item.pExtern = m_Graph.getExtern(pExtern);
        m_Items.push_back(Item);
    } else {
        m_Notes.IsSSAForm = true;
        if (ZfCCfgParamStatement* pParameter = pStatement->isParamStatement())
            m_Notes.Parameters.push_back(declarationOf(pParameter->getVariable()));
    }
}

void FlowReader::readAssignment(ZfCCfgAssignment* pAssignment) {
    m_Notes.IsSSAForm = m_Notes.IsSSAForm || pAssignment->getLHS()->isSSAVariable();
    // An assignment of one of the library's own expressions is main's start value, which the init
    // function sets.
    const Term* pTerm = rootOf(pAssignment->getRHS());
    if (!pTerm || pAssignment->getIsVirtual())
        return;
    FlowItem Item{FlowItemKind::Assign};
    Item.pTerm = pTerm;
    Item.pTarget = declarationOf(pAssignment->getLHS());
    if (!pTerm->isStore() && isSelfCopy(pTerm, Item.pTarget))
        return;
    if (m_LeftOut.count(Item.pTarget) != 0) {
        if (!readsInput(pTerm))
            return;
        Item.Kind = FlowItemKind::Discard;
    }
    m_Items.push_back(Item);
}

void FlowReader::readExit(int Number, ZfCBasicBlock* pBlock) {
    leda::edge True = nullptr;
    leda::edge False = nullptr;
    leda::edge Plain = nullptr;
    for (leda::edge e = m_Raw[Number].Node->first_out_edge(); e; e = e->next_out_edge()) {
        ZfCCfgEdgeInfo* pInfo = m_Graph.getGraph().inf(e);
        if (!pInfo->isSSAEdge())
            (pInfo->isTrueBranch() ? True : pInfo->isFalseBranch() ? False : Plain) = e;
    }
    ZfCCfgExpression* pCondition = pBlock->getBranchCond();
    const Term* pTerm = rootOf(pCondition);
    if (pCondition && !pTerm) {
        // Either a way out that is never taken, or the loop around main, which is the caller's.
        if (!m_Graph.isNeverLeft(pCondition) || !True)
            return;
        False = Plain = nullptr;
    } else if (pTerm && pTerm->Op == Operator::Number && True && False) {
        (pTerm->Number != 0.0 ? False : True) = nullptr;
    }
    const bool IsBranch = pTerm && True && False;
    const leda::edge First = True ? True : False ? False : Plain;
    // Numbers are asked for before the record is looked at again: new ones move the records.
    const int Target = First ? rawNumber(First->terminal(1)) : ReturnTarget;
    const int Other = IsBranch ? rawNumber(False->terminal(1)) : ReturnTarget;
    RawNode& Node = m_Raw[Number];
    Node.True = Target;
    Node.False = Other;
    Node.pCondition = pTerm;
    if (!IsBranch)
        becomeJump(Node, Target);
}

void FlowReader::becomeJump(RawNode& Node, int Target) {
    if (Node.pCondition && readsInput(Node.pCondition))
        Node.pDiscarded = Node.pCondition;
    Node.pCondition = nullptr;
    Node.True = Target;
    Node.False = ReturnTarget;
}

// ---- empty nodes ----

int FlowReader::resolve(int Number) {
    while (Number != ReturnTarget && m_Raw[Number].Resolved != Number) {
        int& Next = m_Raw[Number].Resolved;
        if (Next != ReturnTarget)
            Next = m_Raw[Next].Resolved;
        Number = Next;
    }
    return Number;
}

/// Targets first, so that what an emptied branch leads to is known before the branch is looked at;
/// nodes on loops are seen too early in the first round.
void FlowReader::skipEmptyNodes() {
    std::vector<std::pair<int, int>> Stack;
    std::vector<bool> Reached(m_Raw.size(), false);
    std::vector<int> PostOrder;
    if (!m_Raw.empty()) {
        Stack.emplace_back(0, 0);
        Reached[0] = true;
    }
    while (!Stack.empty()) {
        auto& [Node, Arm] = Stack.back();
        if (Arm == 2) {
            PostOrder.push_back(Node);
            Stack.pop_back();
            continue;
        }
        const int Target = Arm == 0 ? m_Raw[Node].True : m_Raw[Node].False;
        ++Arm;
        if (Target == ReturnTarget || Reached[Target])
            continue;
        Reached[Target] = true;
        Stack.emplace_back(Target, 0);
    }
    for (int Round = 0; Round < 2; ++Round) {
        for (int Number : PostOrder) {
            RawNode& Node = m_Raw[Number];
            if (Node.pCondition && resolve(Node.True) == resolve(Node.False))
                becomeJump(Node, Node.True);
            if (Node.IsEmpty() && Node.Resolved == Number)
                Node.Resolved = resolve(Node.True);
        }
    }
    for (RawNode& Node : m_Raw) {
        Node.True = resolve(Node.True);
        Node.False = resolve(Node.False);
        if (Node.pCondition && Node.True == Node.False)
            becomeJump(Node, Node.True);
    }
}

// ---- straight pieces ----

/// Number of edges to each node that is reached; the first one counts one more.
std::vector<int> FlowReader::countWaysIn(int First) const {
    std::vector<int> WaysIn(m_Raw.size(), 0);
    std::vector<int> WorkList{First};
    WaysIn[First] = 1;
    const auto go = [&](int Target) {
        if (Target != ReturnTarget && WaysIn[Target]++ == 0)
            WorkList.push_back(Target);
    };
    while (!WorkList.empty()) {
        const RawNode& Node = m_Raw[WorkList.back()];
        WorkList.pop_back();
        go(Node.True);
        if (Node.pCondition)
            go(Node.False);
    }
    return WaysIn;
}

ProcedureFlow FlowReader::assemble() {
    ProcedureFlow Result = std::move(m_Notes);
    const int First = m_Raw.empty() ? ReturnTarget : resolve(0);
    if (First == ReturnTarget)
        return Result;
    const std::vector<int> WaysIn = countWaysIn(First);
    // A piece begins at the first node, at joins and behind branches.
    std::vector<bool> IsLeader(m_Raw.size(), false);
    IsLeader[First] = true;
    for (std::size_t i = 0; i < m_Raw.size(); ++i) {
        const RawNode& Node = m_Raw[i];
        if (WaysIn[i] == 0)
            continue;
        if (Node.True != ReturnTarget && (Node.pCondition || WaysIn[Node.True] > 1))
            IsLeader[Node.True] = true;
        if (Node.pCondition && Node.False != ReturnTarget)
            IsLeader[Node.False] = true;
    }
    std::vector<int> Leaders{First};
    for (std::size_t i = 0; i < m_Raw.size(); ++i)
        if (IsLeader[i] && static_cast<int>(i) != First)
            Leaders.push_back(static_cast<int>(i));
    std::vector<int> NumberOf(m_Raw.size(), -1);
    for (std::size_t i = 0; i < Leaders.size(); ++i)
        NumberOf[Leaders[i]] = static_cast<int>(i);
    for (int Leader : Leaders)
        appendPiece(Leader, NumberOf, Result);
    Result.FirstItem.push_back(Result.Items.size());
    joinTests(Result);
    return Result;
}

void FlowReader::appendPiece(int Leader, const std::vector<int>& NumberOf, ProcedureFlow& Result) {
    Result.FirstItem.push_back(Result.Items.size());
    int Number = Leader;
    for (;;) {
        const RawNode& Node = m_Raw[Number];
        for (std::size_t i = Node.FirstItem; i < Node.EndItem; ++i)
            Result.Items.push_back(m_Items[i]);
        if (Node.pDiscarded) {
            FlowItem Item{FlowItemKind::Discard};
            Item.pTerm = Node.pDiscarded;
            Result.Items.push_back(Item);
        }
        if (Node.pCondition || Node.True == ReturnTarget || NumberOf[Node.True] != -1)
            break;
        Number = Node.True;
    }
    const auto pieceOf = [&](int Target) {
        return Target == ReturnTarget ? ReturnTarget : NumberOf[Target];
    };
    const RawNode& Last = m_Raw[Number];
    FlowNode Flow;
    Flow.HasCode = Result.Items.size() > Result.FirstItem.back();
    Flow.IsBranch = Last.pCondition != nullptr;
    Flow.True = pieceOf(Last.True);
    Flow.False = pieceOf(Last.False);
    Result.Nodes.push_back(Flow);
    Result.Tests.emplace_back();
    if (Last.pCondition)
        Result.Tests.back().push_back({Last.pCondition, false});
}

} // namespace hpn
