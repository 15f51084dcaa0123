#include "Seeing/Remarks.h"

#include "Model/ZfCCfgSFExpression.h"
#include "Seeing/Explainer.h"

#include <algorithm>
#include <map>
#include <tuple>

namespace hpn {

namespace {

void remark(Recording& Target, RecordedRemark::Kind What, const char* Pass, const char* Name,
            std::string Text, RecordedPlace Place) {
    if (Place.isKnown())
        Target.Remarks.push_back({What, Pass, Name, std::move(Text), Place});
}

constexpr RecordedRemark::Kind Passed = RecordedRemark::Kind::Passed;
constexpr RecordedRemark::Kind Missed = RecordedRemark::Kind::Missed;
constexpr RecordedRemark::Kind Analysis = RecordedRemark::Kind::Analysis;

// The first statement of an arm that makes code; null if the arm meets another way before.
ZfCCfgStatement* firstStatement(ZfCControlFlowGraph& Graph, leda::edge Arm) {
    while (Arm != nullptr) {
        const leda::node v = Graph.target(Arm);
        ZfCBasicBlock* pBlock = Graph.inf(v)->isBasicBlock();
        if (pBlock == nullptr || pBlock->getBranchCond() != nullptr || Graph.indeg(v) > 1)
            return nullptr;
        ZfCCfgStatement* pStatement = pBlock->isStatement();
        if (pStatement != nullptr && !pStatement->getIsVirtual() &&
            pStatement->isValueReturnStatement() == nullptr)
            return pStatement;
        Arm = Graph.first_adj_edge(v);
    }
    return nullptr;
}

class ArmRemarks {
public:
    ArmRemarks(Recording& Target, ProgramGraph& Program, StateReader& Reader)
        : m_Target(Target), m_Graph(Program.getGraph()), m_Reader(Reader) {}

    void run() {
        for (leda::node v = m_Graph.first_node(); v != nullptr; v = m_Graph.next_node(v)) {
            ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
            ZfCCfgExpression* pCondition = pBlock != nullptr ? pBlock->getBranchCond() : nullptr;
            if (pCondition != nullptr && pCondition->isSFExpression() != nullptr)
                examine(v, pCondition);
        }
    }

private:
    void examine(leda::node v, ZfCCfgExpression* pCondition) {
        leda::edge Then = nullptr;
        leda::edge Else = nullptr;
        for (leda::edge e = m_Graph.first_adj_edge(v); e != nullptr; e = m_Graph.adj_succ(e)) {
            Then = m_Graph.inf(e)->isTrueBranch() != nullptr ? e : Then;
            Else = m_Graph.inf(e)->isFalseBranch() != nullptr ? e : Else;
        }
        ZfCCfgStatement* pThen = firstStatement(m_Graph, Then);
        ZfCCfgStatement* pElse = firstStatement(m_Graph, Else);
        if (pThen == nullptr || pElse == nullptr || !pThen->generatesSameCode(pElse))
            return;
        const int State = m_Reader.stateOf(pThen->getIndex());
        if (State < 0)
            return;
        const RecordedStatement& Statement = m_Target.Statements[static_cast<std::size_t>(State)];
        remark(m_Target, Missed, "hoistCodeOutOfIfElseBranches", "NotHoisted",
               "not moved in front of the branch, though both arms begin with it: " +
                   whyNot(pThen, pCondition),
               Statement.Place);
    }

    std::string whyNot(ZfCCfgStatement* pStatement, ZfCCfgExpression* pCondition) {
        if (pCondition->hasSideEffects())
            return "the condition reads an input, and the order of reads stays";
        for (ZfCCfgVariable* pDefined : pStatement->getDefinedVariables())
            for (ZfCCfgVariable* pRead : pCondition->getUsedVariables())
                if (originalOf(pDefined) == originalOf(pRead))
                    return "the condition reads " +
                           std::string(originalOf(pRead)->getDeclaration().Name) +
                           ", which it defines";
        return "moving it over the condition could change a number";
    }

    Recording& m_Target;
    ZfCControlFlowGraph& m_Graph;
    StateReader& m_Reader;
};

// Remarks that follow from the recording alone
class RemarkCollector {
public:
    explicit RemarkCollector(Recording& Of) : m_Of(Of) {}

    void run() {
        for (const RecordedSnapshot& Each : m_Of.Snapshots)
            for (const RecordedChange& Change : Each.Changes)
                remarkOnChange(Each, Change);
        for (const RecordedFate& Each : m_Of.Fates)
            remarkOnFate(Each);
        for (const RecordedSaturation& Each : m_Of.Saturations)
            remarkOnSaturation(Each);
        remarkOnConditions();
        const auto Key = [](const RecordedRemark& Each) {
            return std::make_tuple(Each.Place.File, Each.Place.Line, Each.Place.Column);
        };
        std::stable_sort(
            m_Of.Remarks.begin(), m_Of.Remarks.end(),
            [&Key](const RecordedRemark& a, const RecordedRemark& b) { return Key(a) < Key(b); });
    }

private:
    const RecordedStatement& statement(int Index) const {
        return m_Of.Statements[static_cast<std::size_t>(Index)];
    }
    const RecordedVersion& version(int Index) const {
        return m_Of.Versions[static_cast<std::size_t>(Index)];
    }

    void remarkOnChange(const RecordedSnapshot& In, const RecordedChange& Change) {
        using Kind = RecordedChange::Kind;
        if (Change.What == Kind::Inlined)
            remark(m_Of, Passed, In.Pass.c_str(), "Inlined",
                   "`" + statement(Change.Before).Text + "` inlined: its procedure's only call",
                   statement(Change.Before).Place);
        if (Change.What == Kind::Hoisted)
            remark(m_Of, Passed, In.Pass.c_str(), "Hoisted",
                   "`" + statement(Change.After).Text +
                       "` moved in front of the branch whose arms both begin with it",
                   statement(Change.After).Place);
        if (Change.What != Kind::Replaced || !statement(Change.After).MakesCode)
            return;
        if (In.Pass == "replaceConstantVariables")
            return remarkOnReads(In, Change);
        if (In.Pass == "replaceConstantConditions" || In.Pass == "foldConstants")
            remark(m_Of, Passed, In.Pass.c_str(),
                   In.Pass == "foldConstants" ? "Folded" : "ConditionDecided",
                   "`" + statement(Change.Before).Text + "` became `" +
                       statement(Change.After).Text + "`",
                   statement(Change.Before).Place);
    }

    // The reads that the new text lacks were replaced, each at its own place.
    void remarkOnReads(const RecordedSnapshot& In, const RecordedChange& Change) {
        std::map<std::tuple<int, unsigned, unsigned>, int> Left;
        const auto Key = [](const RecordedRead& Read) {
            return std::make_tuple(Read.Version, Read.Place.Line, Read.Place.Column);
        };
        for (const RecordedRead& Read : statement(Change.After).Reads)
            ++Left[Key(Read)];
        for (const RecordedRead& Read : statement(Change.Before).Reads)
            if (Left[Key(Read)]-- <= 0 && Read.Version >= 0)
                remark(m_Of, Passed, In.Pass.c_str(), "ConstantRead",
                       "read of " + version(Read.Version).Name + " replaced by " +
                           rangeText(version(Read.Version).Found),
                       Read.Place.isKnown() ? Read.Place : statement(Change.Before).Place);
    }

    void remarkOnFate(const RecordedFate& Fate) {
        const RecordedStatement& Of = statement(Fate.Statement);
        if (!Fate.IsRemoved) {
            if (Fate.LooksUnused && !Fate.GoesOn)
                remark(m_Of, Missed, "removeUnusedVarDefs", "NotRemoved",
                       "`" + Of.Text + "` stays though no code reads its variable: " + Fate.Why,
                       Of.Place);
            return;
        }
        const std::string& Pass = m_Of.Snapshots[Fate.Snapshot].Pass;
        remark(m_Of, Passed, Pass.c_str(), "Removed", "`" + Of.Text + "` removed: " + Fate.Why,
               Of.Place);
    }

    void remarkOnSaturation(const RecordedSaturation& Of) {
        using Answer = RecordedSaturation::Answer;
        const RecordedVariable& Variable = m_Of.Variables[static_cast<std::size_t>(Of.Variable)];
        const char* Pass = "propagateSparseConditionalConstant";
        for (const bool IsHigh : {false, true}) {
            const Answer Found = IsHigh ? Of.High : Of.Low;
            if (Found != Answer::May && Found != Answer::Always)
                continue;
            remark(m_Of, Analysis, Pass, Found == Answer::May ? "MaySaturate" : "AlwaysSaturates",
                   Variable.Name + (Found == Answer::May ? " may" : " always") +
                       (Found == Answer::May ? " saturate" : " saturates") +
                       (IsHigh ? " at its upper limit: " : " at its lower limit: ") +
                       rangeText(Of.Value) + " is assigned",
                   Of.Place);
        }
    }

    // Conditions that are left, with the first thing that keeps them from being decided.
    void remarkOnConditions() {
        if (m_Of.Snapshots.empty())
            return;
        bool IsPropagated = false;
        for (const RecordedSnapshot& Each : m_Of.Snapshots)
            IsPropagated = IsPropagated || Each.Pass == "propagateSparseConditionalConstant";
        if (!IsPropagated)
            return;
        for (int Procedure : m_Of.Snapshots.back().Procedures)
            for (int Node : m_Of.Procedures[static_cast<std::size_t>(Procedure)].Nodes)
                for (int Each : m_Of.Nodes[static_cast<std::size_t>(Node)].Statements)
                    remarkOnCondition(statement(Each));
    }

    void remarkOnCondition(const RecordedStatement& Condition) {
        if (Condition.Form != RecordedForm::Condition || !Condition.MakesCode)
            return;
        for (const RecordedRead& Read : Condition.Reads) {
            const RecordedVariable& Variable =
                m_Of.Variables[static_cast<std::size_t>(Read.Variable)];
            const bool IsTracked = Variable.NotTracked.empty() && Read.Version >= 0;
            if (IsTracked && version(Read.Version).Found.What == RecordedRange::Kind::Constant)
                continue;
            std::string Text = "`" + Condition.Text + "` not decided: it reads " + Variable.Name;
            Text += IsTracked ? ", which is " + rangeText(version(Read.Version).Found) + " here"
                              : ", " + Variable.NotTracked;
            return remark(m_Of, Missed, "replaceConstantConditions", "NotDecided", std::move(Text),
                          Condition.Place);
        }
    }

    Recording& m_Of;
};

} // namespace

void remarkOnCalls(Recording& Target, ProgramGraph& Program, const StateReader& Reader) {
    ZfCControlFlowGraph& Graph = Program.getGraph();
    std::map<std::string, unsigned> Calls;
    std::vector<ZfCCfgProcedureCall*> Left;
    for (leda::node v = Graph.first_node(); v != nullptr; v = Graph.next_node(v)) {
        ZfCBasicBlock* pBlock = Graph.inf(v)->isBasicBlock();
        if (pBlock == nullptr)
            continue;
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
            if (ZfCCfgProcedureCall* pCall = pStatement->isProcedureCall()) {
                ++Calls[pCall->getName().cstring()];
                Left.push_back(pCall);
            }
    }
    for (ZfCCfgProcedureCall* pCall : Left) {
        const std::string Name = pCall->getName().cstring();
        const Procedure* pCallee = Program.findProcedure(Name.c_str());
        std::string Why = "it has " + std::to_string(Calls[Name]) + " calls";
        if (pCallee != nullptr && pCallee->IsRecursive)
            Why = "it calls itself";
        else if (pCallee != nullptr && Program.isReachableFromOutside(*pCallee))
            Why = "it can be called from outside";
        else if (Calls[Name] == 1)
            Why = "it was held back";
        remark(Target, Missed, "inlineProcedures", "NotInlined",
               "call of " + Program.readableNameOf(Name) + " not inlined: " + Why,
               Reader.placeOfCall(pCall));
    }
}

void remarkOnArms(Recording& Target, ProgramGraph& Program, StateReader& Reader) {
    ArmRemarks(Target, Program, Reader).run();
}

void collectRemarks(Recording& Of) {
    RemarkCollector(Of).run();
}

std::string printRemarks(const Recording& Of) {
    std::string Text;
    for (const RecordedRemark& Each : Of.Remarks)
        Text += Of.Sources[Each.Place.File].Name + ":" + std::to_string(Each.Place.Line) + ":" +
                std::to_string(Each.Place.Column) + ": remark: " + Each.Text + " [" + Each.Pass +
                "]\n";
    return Text;
}

} // namespace hpn
