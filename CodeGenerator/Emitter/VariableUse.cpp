#include "Emitter/VariableUse.h"

#include "Emitter/FlowDominators.h"
#include "Model/Conversion.h"
#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"

#include <unordered_map>

namespace hpn {

namespace {

/// Shows each variable that a term reads; of an element store that is not the array.
template <class Visit>
void forEachRead(const Term* pTerm, Visit&& visit) {
    if (pTerm->hasVariable() && !pTerm->isStore())
        visit(declarationOf(pTerm->pVariable));
    if (pTerm->pLeft)
        forEachRead(pTerm->pLeft, visit);
    if (pTerm->pRight)
        forEachRead(pTerm->pRight, visit);
}

template <class Visit>
void forEachArgumentRead(const FlowItem& Item, Visit&& visit) {
    if (!Item.pCall)
        return;
    for (const ZfCCfgSFProcedureCall::Argument& Argument : Item.pCall->getArguments())
        if (ZfCCfgSFExpression* pExpression = Argument.pExpression->isSFExpression())
            forEachRead(pExpression->getRoot(), visit);
}

} // namespace

VariableUse::Record& VariableUse::note(int Function, const Variable* pVariable) {
    if (pVariable->Index >= m_Records.size())
        m_Records.resize(pVariable->Index + 1);
    Record& Noted = m_Records[pVariable->Index];
    if (Noted.Function == Nowhere) {
        Noted.Function = Function;
        m_All.push_back(pVariable);
    } else if (Noted.Function != Function) {
        Noted.Function = Several;
    }
    return Noted;
}

void VariableUse::addRead(int Function, const Variable* pVariable) {
    note(Function, pVariable).IsRead = true;
}

void VariableUse::addWrite(int Function, const Variable* pVariable) {
    note(Function, pVariable);
}

namespace {

/// A name for each variable: two with one name would make a comparison look like one of a number
/// with itself.
class NumberNames : public VariableNames {
public:
    std::string_view nameOf(const Variable& Declaration) const override {
        m_Name = 'v' + std::to_string(Declaration.Index);
        return m_Name;
    }

private:
    mutable std::string m_Name;
};

/// Whether it matters that a read is not written: of a variable that is declared only if it is
/// read.
bool readsOwn(const Term* pTerm) {
    if (pTerm->hasVariable()) {
        const VariableKind Kind = declarationOf(pTerm->pVariable)->Kind;
        if (Kind == VariableKind::Local || Kind == VariableKind::Formal ||
            Kind == VariableKind::Param)
            return true;
    }
    return (pTerm->pLeft && readsOwn(pTerm->pLeft)) || (pTerm->pRight && readsOwn(pTerm->pRight));
}

/// A read that no store but one to a bool, and no condition, decides: the type's numbers are on
/// both sides of zero or include it.
bool isPlainRead(const Term* pTerm) {
    if (pTerm->Op != Operator::Variable)
        return false;
    const Type& Of = *declarationOf(pTerm->pVariable)->pType;
    return !isScaled(Of) && !Of.HasRange;
}

/// Part of a sum whose range is many numbers, however it is converted to an integer.
bool isPlainSummand(const Term* pTerm) {
    constexpr double Greatest = 65536.0;
    if (pTerm->Op == Operator::Number)
        return pTerm->Number >= -Greatest && pTerm->Number <= Greatest;
    return isPlainRead(pTerm) && !isFloating(declarationOf(pTerm->pVariable)->pType->Base);
}

/// The shapes that most terms have, in which every read is written. For any other the text tells.
bool keepsReads(const Term* pTerm, bool IsStored) {
    const bool IsPlainCast = pTerm->Op == Operator::Cast && IsStored && !isScaled(*pTerm->pType) &&
                             !pTerm->pType->HasRange && pTerm->pType->Base != BaseType::Bool;
    if (IsPlainCast)
        pTerm = pTerm->pLeft;
    if (pTerm->Op == Operator::Number || isPlainRead(pTerm))
        return true;
    return IsPlainCast && (pTerm->Op == Operator::Add || pTerm->Op == Operator::Subtract) &&
           isPlainSummand(pTerm->pLeft) && isPlainSummand(pTerm->pRight);
}

} // namespace

template <class Write>
void VariableUse::addReads(int Function, const Term* pTerm, bool IsStored, Write&& write) {
    if (keepsReads(pTerm, IsStored) || !readsOwn(pTerm))
        return forEachRead(pTerm, [&](const Variable* pVariable) { addRead(Function, pVariable); });
    m_Scratch.clear();
    const NumberNames Names;
    ExpressionWriter Writer(Names, m_Scratch);
    write(Writer);
    for (const Variable* pVariable : Writer.getReads())
        addRead(Function, pVariable);
}

void VariableUse::addArgument(int Function, const Term* pTerm, const Variable* pFormal) {
    addReads(Function, pTerm, true,
             [&](ExpressionWriter& Writer) { Writer.writeStored(pTerm, *pFormal->pType, true); });
}

void VariableUse::add(int Function, const ProcedureFlow& Flow) {
    for (const FlowItem& Item : Flow.Items) {
        const bool IsAssigned = Item.Kind == FlowItemKind::Assign;
        if (Item.pTerm)
            addReads(Function, Item.pTerm, IsAssigned, [&](ExpressionWriter& Writer) {
                if (Item.pTerm->isStore())
                    Writer.writeElement(*Item.pTarget, Item.pTerm->pLeft);
                const Term* pValue = Item.pTerm->isStore() ? Item.pTerm->pRight : Item.pTerm;
                if (IsAssigned)
                    Writer.writeStored(pValue, *Item.pTarget->pType, true);
                else
                    Writer.writeDiscarded(pValue);
            });
        if (Item.pTarget && IsAssigned)
            addWrite(Function, Item.pTarget);
    }
    for (const BranchTests& Tests : Flow.Tests)
        for (const BranchTest& Test : Tests)
            addReads(Function, Test.pTerm, false,
                     [&](ExpressionWriter& Writer) { Writer.writeCondition(Test.pTerm, false); });
}

// ---- liveness ----

namespace {

/// Backward search for each variable on its own: from the nodes that read it before they write it,
/// through those that do not write it. Linear in the sum of the live ranges.
class EntryLiveness {
public:
    EntryLiveness(const ProcedureFlow& Flow, const std::vector<const Variable*>& Candidates);
    std::vector<const Variable*> find();

private:
    struct Places {
        std::vector<int> Exposed; // nodes that read it before they write it
        std::vector<int> Written; // nodes that write it
    };

    void scan(int Node);
    void read(int Node, const Variable* pVariable);
    void write(int Node, const Variable* pVariable);
    bool reachesEntry(const Places& Of);

    const ProcedureFlow& m_Flow;
    const std::vector<const Variable*>& m_Candidates;
    std::unordered_map<const Variable*, Places> m_Places; // looked up only, never walked
    FlowDominators m_Order;                               // for the predecessors
    std::vector<std::size_t> m_SeenFor;
    std::size_t m_Search = 0;
};

EntryLiveness::EntryLiveness(const ProcedureFlow& Flow,
                             const std::vector<const Variable*>& Candidates)
    : m_Flow(Flow), m_Candidates(Candidates), m_Order(Flow.Nodes), m_SeenFor(Flow.Nodes.size(), 0) {
    for (const Variable* pVariable : Candidates)
        m_Places[pVariable];
    for (std::size_t i = 0; i < Flow.Nodes.size(); ++i)
        scan(static_cast<int>(i));
}

void EntryLiveness::read(int Node, const Variable* pVariable) {
    const auto Found = m_Places.find(pVariable);
    if (Found == m_Places.end())
        return;
    Places& Of = Found->second;
    if (Of.Written.empty() || Of.Written.back() != Node)
        if (Of.Exposed.empty() || Of.Exposed.back() != Node)
            Of.Exposed.push_back(Node);
}

void EntryLiveness::write(int Node, const Variable* pVariable) {
    const auto Found = m_Places.find(pVariable);
    if (Found != m_Places.end() &&
        (Found->second.Written.empty() || Found->second.Written.back() != Node))
        Found->second.Written.push_back(Node);
}

void EntryLiveness::scan(int Node) {
    const auto reads = [&](const Variable* pVariable) { read(Node, pVariable); };
    for (std::size_t i = m_Flow.FirstItem[Node]; i < m_Flow.FirstItem[Node + 1]; ++i) {
        const FlowItem& Item = m_Flow.Items[i];
        if (Item.pTerm)
            forEachRead(Item.pTerm, reads);
        forEachArgumentRead(Item, reads);
        if (Item.pTarget)
            write(Node, Item.pTarget);
    }
    for (const BranchTest& Test : m_Flow.Tests[Node])
        forEachRead(Test.pTerm, reads);
}

bool EntryLiveness::reachesEntry(const Places& Of) {
    // Nodes that write it are marked as stops of this search, nodes that were passed as done.
    const std::size_t Stop = ++m_Search;
    for (int Node : Of.Written)
        m_SeenFor[Node] = Stop;
    std::vector<int> WorkList(Of.Exposed);
    while (!WorkList.empty()) {
        const int Node = WorkList.back();
        WorkList.pop_back();
        if (Node == 0)
            return true;
        for (const int* p = m_Order.beginPredecessors(Node); p != m_Order.endPredecessors(Node);
             ++p) {
            if (m_SeenFor[*p] == Stop)
                continue;
            m_SeenFor[*p] = Stop;
            WorkList.push_back(*p);
        }
    }
    return false;
}

std::vector<const Variable*> EntryLiveness::find() {
    std::vector<const Variable*> Result;
    for (const Variable* pVariable : m_Candidates)
        if (reachesEntry(m_Places[pVariable]))
            Result.push_back(pVariable);
    return Result;
}

} // namespace

std::vector<const Variable*> liveAtEntry(const ProcedureFlow& Flow,
                                         const std::vector<const Variable*>& Candidates) {
    if (Flow.Nodes.empty() || Candidates.empty())
        return {};
    return EntryLiveness(Flow, Candidates).find();
}

} // namespace hpn
