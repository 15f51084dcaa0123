#include "Seeing/Explainer.h"

#include "Language/NumberText.h"
#include "Model/Conversion.h"
#include "Model/ZfCCfgSFAssignment.h"
#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"
#include "Road/RangeTable.h"
#include "Seeing/LoopHeads.h"

#include <algorithm>

// Why a version is constant, or why not.
//
// 1. What the propagation has found is copied from the versions on the graph.
// 2. Versions that hang on each other in a ring are found (R. Tarjan, Depth-first search and linear
//    graph algorithms, SIAM Journal on Computing 1(2), 1972): a join with an operand of its own
//    ring is carried around a loop.
// 3. Each version gets one step of explanation from its defining statement: for a constant all that
//    it was made of, else the first thing that is none. The steps name versions, so that a chain is
//    told once and followed by whoever wants to know.

namespace hpn {

namespace {

using Kind = RecordedRange::Kind;

RecordedRange rangeOf(ZfCCfgValue Value, ZfCCfgValue Low, ZfCCfgValue High) {
    if (Value.isUndetermined())
        return {Kind::Undetermined, 0.0, 0.0};
    if (Value.isConstant())
        return {Kind::Constant, Value.getValue(), Value.getValue()};
    if (Low.isConstant() && High.isConstant())
        return {Kind::Range, Low.getValue(), High.getValue()};
    return {Kind::Anything, 0.0, 0.0};
}

RecordedRange rangeOf(const ValueRange& Range) {
    if (Range.isEmpty())
        return {Kind::Anything, 0.0, 0.0};
    if (Range.isSingle())
        return {Kind::Constant, Range.Low, Range.Low};
    return {Kind::Range, Range.Low, Range.High};
}

// Every statement and phi function, in order of the nodes.
template <class Action>
void forEachStatement(ZfCControlFlowGraph& Graph, Action Do) {
    for (leda::node v = Graph.first_node(); v != nullptr; v = Graph.next_node(v)) {
        ZfCBasicBlock* pBlock = Graph.inf(v)->isBasicBlock();
        if (pBlock == nullptr)
            continue;
        for (ZfCPhiFunction* pPhi : pBlock->getPhiFunctions())
            Do(static_cast<ZfCCfgStatement*>(pPhi));
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
            Do(pStatement);
    }
}

// What is known of the variables themselves

class VariableExplainer {
public:
    VariableExplainer(Recording& Target, ProgramGraph& Program)
        : m_Target(Target), m_Program(Program), m_Touching(Target.Variables.size(), nullptr),
          m_Writing(Target.Variables.size(), nullptr) {}

    void run() {
        findOutsideUses();
        const Program& Source = m_Program.getProgram();
        for (const Variable& Each : Source.Variables)
            explain(Each);
        for (const Variable& Each : m_Program.getHiddenVariables())
            explain(Each);
    }

private:
    // The first procedure that the outside can reach and that reads or writes a variable.
    void findOutsideUses() {
        for (int Index : m_Target.Snapshots.front().Procedures) {
            const RecordedProcedure& State = m_Target.Procedures[static_cast<std::size_t>(Index)];
            const Procedure* pSource = m_Program.findProcedure(State.Name.c_str());
            if (pSource == nullptr || !m_Program.isReachableFromOutside(*pSource))
                continue;
            for (int Node : State.Nodes)
                for (int Each : m_Target.Nodes[static_cast<std::size_t>(Node)].Statements)
                    noteUses(m_Target.Statements[static_cast<std::size_t>(Each)], *pSource);
        }
    }

    void noteUses(const RecordedStatement& Statement, const Procedure& By) {
        if (Statement.Variable >= 0) {
            noteFirst(m_Writing, Statement.Variable, By);
            noteFirst(m_Touching, Statement.Variable, By);
        }
        for (const RecordedRead& Read : Statement.Reads)
            noteFirst(m_Touching, Read.Variable, By);
    }

    static void noteFirst(std::vector<const Procedure*>& Table, int Variable, const Procedure& By) {
        const Procedure*& pFirst = Table[static_cast<std::size_t>(Variable)];
        pFirst = pFirst != nullptr ? pFirst : &By;
    }

    const Extern* findExtern(const Variable& Of, bool IsWriting) const {
        for (const Extern& Each : m_Program.getProgram().Externs) {
            const std::vector<Variable*>& List = IsWriting ? Each.Writes : Each.Reads;
            if (std::find(List.begin(), List.end(), &Of) != List.end())
                return &Each;
        }
        return nullptr;
    }

    static std::string outsideText(const Procedure& By, const char* Verb) {
        const char* How = By.IsExported ? ", which can be called from outside, "
                                        : ", which a procedure callable from outside calls, ";
        return std::string(By.Name) + How + Verb + " it";
    }

    static bool isPerActivation(const Variable& Of) {
        return Of.pOwner != nullptr && Of.pOwner->IsRecursive && Of.Kind != VariableKind::Result;
    }

    std::string whyNotTracked(const Variable& Of) const {
        ZfCCfgSFVariable* pVariable = m_Program.getVariable(Of);
        if (Of.Kind == VariableKind::Input)
            return "an input, which changes outside at any time";
        if (pVariable->isArray())
            return "an array, whose elements are not tracked";
        if (!pVariable->isVolatile())
            return "";
        if (const Extern* pExtern = findExtern(Of, true))
            return "extern " + std::string(pExtern->Name) + " writes it";
        if (isPerActivation(Of))
            return std::string(Of.pOwner->Name) + " calls itself, and each call has its own";
        const Procedure* pWriting = m_Writing[Of.Index];
        return pWriting != nullptr ? outsideText(*pWriting, "writes") : "it can change outside";
    }

    std::string whyKept(const Variable& Of) const {
        ZfCCfgSFVariable* pVariable = m_Program.getVariable(Of);
        if (pVariable->isOutput())
            return "an output, which the outside may read at any time";
        if (pVariable->isArray())
            return "an array, of which no store is removed";
        if (pVariable->isErasable())
            return "";
        if (const Extern* pExtern = findExtern(Of, false))
            return "extern " + std::string(pExtern->Name) + " reads it";
        if (const Extern* pExtern = findExtern(Of, true))
            return "extern " + std::string(pExtern->Name) + " writes it";
        if (Of.Kind == VariableKind::Result && Of.pOwner->IsExported)
            return std::string(Of.pOwner->Name) + " hands it to callers outside";
        if (isPerActivation(Of))
            return std::string(Of.pOwner->Name) + " calls itself, and each call has its own";
        const Procedure* pTouching = m_Touching[Of.Index];
        return pTouching != nullptr ? outsideText(*pTouching, "reads or writes")
                                    : "it can be seen outside";
    }

    void explain(const Variable& Of) {
        RecordedVariable& Result = m_Target.Variables[Of.Index];
        Result.NotTracked = whyNotTracked(Of);
        Result.KeptBecause = whyKept(Of);
    }

    Recording& m_Target;
    ProgramGraph& m_Program;
    std::vector<const Procedure*> m_Touching; // by Variable::Index
    std::vector<const Procedure*> m_Writing;  // likewise
};

// Step 2: the rings among the versions, each version reading what its definition reads.
class RingFinder {
public:
    explicit RingFinder(const Recording& Of)
        : m_Of(Of), m_Ring(Of.Versions.size(), -1), m_Number(Of.Versions.size(), -1),
          m_Low(Of.Versions.size(), 0) {
        for (std::size_t i = 0; i < Of.Versions.size(); ++i)
            if (m_Number[i] < 0)
                visit(static_cast<int>(i));
    }

    // Two versions have the same ring if each hangs on the other; alone, a version has its own.
    const std::vector<int>& getRings() const { return m_Ring; }

private:
    struct Frame {
        int Version;
        std::size_t Next; // read to follow
    };

    const std::vector<RecordedRead>& readsOf(int Version) const {
        static const std::vector<RecordedRead> None;
        const int Definition = m_Of.Versions[static_cast<std::size_t>(Version)].Definition;
        return Definition < 0 ? None : m_Of.Statements[static_cast<std::size_t>(Definition)].Reads;
    }

    void enter(int Version) {
        const auto Place = static_cast<std::size_t>(Version);
        m_Number[Place] = m_Low[Place] = m_Count++;
        m_Open.push_back(Version);
        m_Frames.push_back({Version, 0});
    }

    void visit(int Root) {
        enter(Root);
        while (!m_Frames.empty()) {
            Frame& Top = m_Frames.back();
            const std::vector<RecordedRead>& Reads = readsOf(Top.Version);
            if (Top.Next == Reads.size()) {
                leave();
                continue;
            }
            const int Read = Reads[Top.Next++].Version;
            if (Read < 0)
                continue;
            const auto Place = static_cast<std::size_t>(Read);
            if (m_Number[Place] < 0)
                enter(Read);
            else if (m_Ring[Place] < 0)
                lower(Top.Version, m_Number[Place]);
        }
    }

    void lower(int Version, int To) {
        int& Low = m_Low[static_cast<std::size_t>(Version)];
        Low = std::min(Low, To);
    }

    void leave() {
        const int Version = m_Frames.back().Version;
        const auto Place = static_cast<std::size_t>(Version);
        m_Frames.pop_back();
        if (!m_Frames.empty())
            lower(m_Frames.back().Version, m_Low[Place]);
        if (m_Low[Place] != m_Number[Place])
            return;
        for (int Member = -1; Member != Version;) {
            Member = m_Open.back();
            m_Open.pop_back();
            m_Ring[static_cast<std::size_t>(Member)] = Version;
        }
    }

    const Recording& m_Of;
    std::vector<int> m_Ring; // -1: not closed yet
    std::vector<int> m_Number;
    std::vector<int> m_Low;
    std::vector<int> m_Open;
    std::vector<Frame> m_Frames;
    int m_Count = 0;
};

// Steps 1 and 3
class VersionExplainer {
public:
    VersionExplainer(Recording& Target, ProgramGraph& Program, StateReader& Reader)
        : m_Target(Target), m_Program(Program), m_Reader(Reader) {}

    void run() {
        copyFindings();
        noteUses();
        summarise();
        const RingFinder Rings(m_Target);
        m_pRings = &Rings.getRings();
        m_IsLoopHead = findLoopHeads(m_Target);
        for (std::size_t i = 0; i < m_Target.Versions.size(); ++i)
            explain(static_cast<int>(i));
        m_pRings = nullptr;
    }

private:
    // What one call hands over for a parameter.
    struct Argument {
        RecordedRange Value;
        std::string Text;
        RecordedPlace Place;
        bool IsFromOutside;
        int Version; // first read that is not constant, or -1
    };

    RecordedVersion& version(int Index) {
        return m_Target.Versions[static_cast<std::size_t>(Index)];
    }
    const RecordedVariable& variable(int Index) const {
        return m_Target.Variables[static_cast<std::size_t>(Index)];
    }

    // Step 1

    void copyFindings() {
        for (RecordedVersion& Each : m_Target.Versions) {
            Each.IsReached = false;
            Each.Found = {};
            Each.Uses.clear();
            Each.Explanation.clear();
        }
        forEachStatement(m_Program.getGraph(), [this](ZfCCfgStatement* pStatement) {
            for (ZfCCfgVariable* pVariable : pStatement->getDefinedVariables())
                copyFinding(pVariable);
            if (ZfCCfgParamStatement* pParameter = pStatement->isParamStatement())
                noteArguments(pParameter);
        });
    }

    void copyFinding(ZfCCfgVariable* pVariable) {
        const int Index = m_Reader.versionOf(pVariable);
        if (Index < 0)
            return;
        RecordedVersion& Target = version(Index);
        Target.IsReached = true;
        if (pVariable->isArray() || pVariable->isVolatile())
            return;
        Target.Found =
            rangeOf(pVariable->getValue(), pVariable->getMinValue(), pVariable->getMaxValue());
    }

    void noteArguments(ZfCCfgParamStatement* pParameter) {
        const int Index = m_Reader.versionOf(pParameter->getVariable());
        if (Index < 0)
            return;
        std::vector<Argument>& List = m_Arguments[Index];
        auto& Expressions = pParameter->getParamExpressions();
        for (auto Item = Expressions.first_item(); Item; Item = Expressions.next_item(Item))
            List.push_back(argumentOf(Expressions.key(Item), Expressions.inf(Item)));
    }

    Argument argumentOf(ZfCCfgProcedureCall* pCall, ZfCCfgExpression* pExpression) {
        Argument Result{{}, "?", m_Reader.placeOfCall(pCall), false, -1};
        if (pExpression == nullptr)
            return Result;
        Result.Text = m_Reader.textOf(pExpression);
        Result.Value =
            rangeOf(pExpression->evaluate(), pExpression->getMinimum(), pExpression->getMaximum());
        Result.IsFromOutside =
            pExpression->isSFExpression() == nullptr && pExpression->getUsedVariables().empty();
        for (ZfCCfgVariable* pRead : pExpression->getUsedVariables()) {
            if (Result.Version < 0 && !pRead->getValue().isConstant())
                Result.Version = m_Reader.versionOf(pRead);
        }
        return Result;
    }

    void noteUses() {
        for (int Procedure : m_Target.Snapshots.back().Procedures)
            for (int Node : m_Target.Procedures[static_cast<std::size_t>(Procedure)].Nodes)
                for (int Each : m_Target.Nodes[static_cast<std::size_t>(Node)].Statements)
                    noteUsesIn(m_Target.Statements[static_cast<std::size_t>(Each)]);
    }

    void noteUsesIn(const RecordedStatement& Statement) {
        for (const RecordedRead& Read : Statement.Reads)
            if (Read.Version >= 0 && Statement.MakesCode && Read.Place.isKnown())
                version(Read.Version).Uses.push_back(Read.Place);
    }

    void summarise() {
        for (RecordedVariable& Each : m_Target.Variables) {
            bool IsFirst = true;
            Each.Found = {};
            for (int Index : Each.Versions) {
                if (!version(Index).IsReached)
                    continue;
                Each.Found =
                    IsFirst ? version(Index).Found : joinFindings(Each.Found, version(Index).Found);
                IsFirst = false;
            }
            if (!Each.NotTracked.empty())
                Each.Found = {};
        }
    }

    // Step 3

    void explain(int Index) {
        RecordedVersion& Of = version(Index);
        const RecordedVariable& Variable = variable(Of.Variable);
        if (!Variable.NotTracked.empty())
            return say(Index, Of.Name + " is never taken for constant: " + Variable.NotTracked,
                       Variable.Place);
        if (!Of.IsReached)
            return say(Index, Of.Name + " is never given a value: its definition is not reached",
                       Of.Place);
        if (Of.Found.What == Kind::Constant)
            return explainConstant(Index);
        explainOther(Index);
    }

    void say(int Index, std::string Text, RecordedPlace Place, int Next = -1) {
        version(Index).Explanation.push_back({std::move(Text), Place, Next});
    }

    const RecordedStatement& definitionOf(int Index) {
        return m_Target.Statements[static_cast<std::size_t>(version(Index).Definition)];
    }

    std::string isText(int Index) {
        return version(Index).Name + " is " + rangeText(version(Index).Found);
    }

    void explainConstant(int Index) {
        const RecordedStatement& By = definitionOf(Index);
        switch (By.Form) {
        case RecordedForm::InitialValue:
            return say(Index, isText(Index) + initialText(version(Index).Variable), By.Place);
        case RecordedForm::Note:
            return say(Index, isText(Index) + ": the branch tells it", By.Place);
        case RecordedForm::Join:
            say(Index, isText(Index) + ": all ways that meet here bring this number", By.Place);
            return sayReads(Index, By);
        case RecordedForm::ValueReturn:
            say(Index, isText(Index) + ": the call leaves this number", By.Place);
            return sayReads(Index, By);
        case RecordedForm::Parameter:
            return sayArguments(Index);
        default:
            return explainComputed(Index, By);
        }
    }

    std::string initialText(int Variable) const {
        return variable(Variable).Kind == "param" ? ": a param, which nothing assigns"
                                                  : ": its value before the first step";
    }

    bool isConstant(const RecordedRead& Read) {
        return Read.Version >= 0 && version(Read.Version).Found.What == Kind::Constant;
    }

    void explainComputed(int Index, const RecordedStatement& By) {
        const std::string Code = ": `" + By.Text + "`";
        if (By.Reads.empty())
            return say(Index, isText(Index) + Code, By.Place);
        const bool IsAll =
            std::all_of(By.Reads.begin(), By.Reads.end(),
                        [this](const RecordedRead& Read) { return isConstant(Read); });
        say(Index,
            isText(Index) + Code +
                (IsAll ? ", which reads constants alone"
                       : ", which gives this number whatever the values in their ranges"),
            By.Place);
        sayReads(Index, By);
    }

    void sayReads(int Index, const RecordedStatement& By) {
        std::vector<int> Said;
        for (const RecordedRead& Read : By.Reads) {
            if (Read.Version < 0 || std::find(Said.begin(), Said.end(), Read.Version) != Said.end())
                continue;
            Said.push_back(Read.Version);
            say(Index, isText(Read.Version), version(Read.Version).Place, Read.Version);
        }
    }

    void sayArguments(int Index) {
        say(Index, isText(Index) + ": every call hands over this number", version(Index).Place);
        for (const Argument& Each : m_Arguments[Index])
            say(Index, "`" + Each.Text + "` is " + rangeText(Each.Value), Each.Place, Each.Version);
    }

    void explainOther(int Index) {
        const RecordedStatement& By = definitionOf(Index);
        switch (By.Form) {
        case RecordedForm::Join:
            return explainJoin(Index, By);
        case RecordedForm::Parameter:
            return explainParameter(Index);
        case RecordedForm::ValueReturn:
            return explainRead(Index, By, "the call leaves ");
        default:
            return explainRead(Index, By, "`" + By.Text + "` reads ");
        }
    }

    std::string notText(int Index) {
        const RecordedRange& Found = version(Index).Found;
        const bool IsTelling = Found.What == Kind::Range || Found.What == Kind::Undetermined;
        const std::string Range = IsTelling ? " (" + rangeText(Found) + ")" : std::string();
        return version(Index).Name + " is not constant" + Range + ": ";
    }

    // The first thing read that is not constant is the reason.
    void explainRead(int Index, const RecordedStatement& By, const std::string& Reads) {
        for (const RecordedRead& Read : By.Reads) {
            const RecordedVariable& Variable = variable(Read.Variable);
            if (isConstant(Read))
                continue;
            if (!Variable.NotTracked.empty())
                return say(Index,
                           notText(Index) + Reads + Variable.Name + ", " + Variable.NotTracked,
                           Read.Place.isKnown() ? Read.Place : By.Place);
            if (Read.Version < 0)
                continue;
            say(Index,
                notText(Index) + Reads + version(Read.Version).Name + ", which is not constant",
                Read.Place.isKnown() ? Read.Place : By.Place);
            return say(Index, isText(Read.Version), version(Read.Version).Place, Read.Version);
        }
        say(Index, notText(Index) + "`" + By.Text + "` has no number that is always the same",
            By.Place);
    }

    void explainJoin(int Index, const RecordedStatement& By) {
        int FirstConstant = -1;
        int FirstOther = -1;
        int FirstCarried = -1;
        for (const RecordedRead& Read : By.Reads) {
            if (Read.Version < 0)
                continue;
            if (isConstant(Read)) {
                if (FirstConstant >= 0 && isAnother(FirstConstant, Read.Version))
                    return sayTwo(Index, FirstConstant, Read.Version);
                FirstConstant = FirstConstant < 0 ? Read.Version : FirstConstant;
            } else if (isOfSameRing(Index, Read.Version)) {
                FirstCarried = FirstCarried < 0 ? Read.Version : FirstCarried;
            } else {
                FirstOther = FirstOther < 0 ? Read.Version : FirstOther;
            }
        }
        const bool IsCarried = FirstCarried >= 0 && m_IsLoopHead.count(By.Id) != 0;
        if (IsCarried && FirstOther < 0)
            return sayCarried(Index, By, FirstCarried);
        const int First = FirstOther >= 0 ? FirstOther : FirstCarried;
        if (First < 0)
            return say(Index, notText(Index) + "the ways that meet here bring different numbers",
                       By.Place);
        say(Index, notText(Index) + "one way that leads here brings " + version(First).Name,
            By.Place);
        say(Index, isText(First), version(First).Place, First);
    }

    void sayCarried(int Index, const RecordedStatement& By, int Carried) {
        say(Index,
            notText(Index) + "loop-carried, " + carriedText(By) + " brings " +
                version(Carried).Name + ", which is made from it",
            By.Place);
        const int Maker = findMaker(Index, Carried);
        if (Maker >= 0)
            say(Index, "`" + definitionOf(Maker).Text + "`", version(Maker).Place);
    }

    // The first assignment on the way from a carried value back to the join that carries it.
    int findMaker(int Index, int Carried) {
        constexpr unsigned Farthest = 64;
        for (unsigned Steps = 0; Steps < Farthest && Carried != Index; ++Steps) {
            const RecordedStatement& By = definitionOf(Carried);
            if (By.Form == RecordedForm::Assignment)
                return Carried;
            int Next = -1;
            for (const RecordedRead& Read : By.Reads)
                if (Next < 0 && Read.Version >= 0 && Read.Version != Carried &&
                    isOfSameRing(Index, Read.Version))
                    Next = Read.Version;
            if (Next < 0)
                return -1;
            Carried = Next;
        }
        return -1;
    }

    // A join that also takes the value before the first step is that of the loop around main.
    std::string carriedText(const RecordedStatement& By) {
        for (const RecordedRead& Read : By.Reads)
            if (Read.Version >= 0 && version(Read.Version).Definition >= 0 &&
                definitionOf(Read.Version).Form == RecordedForm::InitialValue)
                return "the step before";
        return "the way around the loop";
    }

    bool isAnother(int a, int b) { return version(a).Found.Low != version(b).Found.Low; }
    bool isOfSameRing(int a, int b) const {
        return (*m_pRings)[static_cast<std::size_t>(a)] == (*m_pRings)[static_cast<std::size_t>(b)];
    }

    void sayTwo(int Index, int First, int Second) {
        say(Index, notText(Index) + "two constants meet that differ", version(Index).Place);
        say(Index, isText(First), version(First).Place, First);
        say(Index, isText(Second), version(Second).Place, Second);
    }

    void explainParameter(int Index) {
        const std::vector<Argument>& List = m_Arguments[Index];
        const Argument* pConstant = nullptr;
        for (const Argument& Each : List) {
            if (Each.IsFromOutside)
                return say(Index, notText(Index) + "it can be called from outside, with any number",
                           Each.Place);
            if (Each.Value.What == Kind::Constant && pConstant == nullptr)
                pConstant = &Each;
            if (Each.Value.What == Kind::Constant && Each.Value.Low != pConstant->Value.Low)
                return sayTwoArguments(Index, *pConstant, Each);
        }
        for (const Argument& Each : List) {
            if (Each.Value.What == Kind::Constant)
                continue;
            say(Index,
                notText(Index) + "a call hands over `" + Each.Text + "`, which is not constant",
                Each.Place);
            if (Each.Version >= 0)
                say(Index, isText(Each.Version), version(Each.Version).Place, Each.Version);
            return;
        }
        say(Index, notText(Index) + "nothing is known of what its calls hand over",
            version(Index).Place);
    }

    void sayTwoArguments(int Index, const Argument& First, const Argument& Second) {
        say(Index, notText(Index) + "its calls hand over different numbers", version(Index).Place);
        for (const Argument* pEach : {&First, &Second})
            say(Index, "`" + pEach->Text + "` is " + rangeText(pEach->Value), pEach->Place,
                pEach->Version);
    }

    Recording& m_Target;
    ProgramGraph& m_Program;
    StateReader& m_Reader;
    std::unordered_map<int, std::vector<Argument>> m_Arguments; // by version; looked up only
    const std::vector<int>* m_pRings = nullptr;
    std::unordered_set<unsigned> m_IsLoopHead; // ids of joins
};

// How assignments meet the limits of their types

class SaturationFinder {
public:
    SaturationFinder(Recording& Target, StateReader& Reader) : m_Target(Target), m_Reader(Reader) {}

    void run(ZfCControlFlowGraph& Graph) {
        m_Target.Saturations.clear();
        forEachStatement(Graph, [this](ZfCCfgStatement* pStatement) { examine(pStatement); });
        noteUnreached();
    }

private:
    void examine(ZfCCfgStatement* pStatement) {
        ZfCCfgAssignment* pAssignment = pStatement->isAssignment();
        ZfCCfgSFExpression* pRight =
            pAssignment != nullptr ? pAssignment->getRHS()->isSFExpression() : nullptr;
        if (pRight == nullptr || pStatement->getIsVirtual())
            return;
        const Term* pRoot =
            pRight->getRoot()->isStore() ? pRight->getRoot()->pRight : pRight->getRoot();
        const Type& Of = originalOf(pAssignment->getLHS())->getType();
        if (!Of.SaturatesLow && !Of.SaturatesHigh)
            return;
        const bool IsConversion = pRoot->Op == Operator::Cast && pRoot->pType == &Of;
        const ValueRange Value =
            rangeOfTerm(IsConversion ? pRoot->pLeft : pRoot, RangeSource::Propagation);
        RecordedSaturation& New = m_Target.Saturations.emplace_back();
        New.Statement = m_Reader.stateOf(pStatement->getIndex());
        New.Variable = m_Reader.variableOf(pAssignment->getLHS());
        New.Place = m_Target.Statements[static_cast<std::size_t>(New.Statement)].Place;
        New.Value = rangeOf(Value);
        if (Of.SaturatesLow)
            New.Low = answer(Value.Low < Of.Lower, Value.High < Of.Lower, Value);
        if (Of.SaturatesHigh)
            New.High = answer(Value.High > Of.Upper, Value.Low > Of.Upper, Value);
    }

    static RecordedSaturation::Answer answer(bool IsPossible, bool IsSure,
                                             const ValueRange& Value) {
        if (Value.isEmpty() || !IsPossible)
            return RecordedSaturation::Answer::Never; // a NaN is not clipped
        return IsSure && !Value.MayBeNaN ? RecordedSaturation::Answer::Always
                                         : RecordedSaturation::Answer::May;
    }

    // What stood on the graph before the propagation and does not any more.
    void noteUnreached() {
        if (m_Target.Snapshots.size() < 2)
            return;
        for (const RecordedChange& Each : m_Target.Snapshots.back().Changes) {
            if (Each.What != RecordedChange::Kind::Removed)
                continue;
            const RecordedStatement& Gone =
                m_Target.Statements[static_cast<std::size_t>(Each.Before)];
            if (Gone.Variable < 0 || !Gone.MakesCode)
                continue;
            const RecordedVariable& Of =
                m_Target.Variables[static_cast<std::size_t>(Gone.Variable)];
            if (!Of.SaturatesLow && !Of.SaturatesHigh)
                continue;
            RecordedSaturation& New = m_Target.Saturations.emplace_back();
            New.Statement = Each.Before;
            New.Variable = Gone.Variable;
            New.Place = Gone.Place;
            New.Low = New.High = RecordedSaturation::Answer::NotReached;
        }
    }

    Recording& m_Target;
    StateReader& m_Reader;
};

} // namespace

void explainVariables(Recording& Target, ProgramGraph& Program) {
    VariableExplainer(Target, Program).run();
}

void explainPropagation(Recording& Target, ProgramGraph& Program, StateReader& Reader) {
    VersionExplainer(Target, Program, Reader).run();
    SaturationFinder(Target, Reader).run(Program.getGraph());
}

std::string rangeText(const RecordedRange& Range) {
    switch (Range.What) {
    case Kind::Unknown:
        return "not tracked";
    case Kind::Undetermined:
        return "undetermined";
    case Kind::Constant:
        return numberText(Range.Low);
    case Kind::Range:
        return numberText(Range.Low) + " .. " + numberText(Range.High);
    case Kind::Anything:
        return "any";
    }
    return "";
}

std::vector<ExplainedLine> unfoldExplanation(const Recording& Of, int Version) {
    std::vector<bool> IsTold;
    return unfoldExplanation(Of, Version, IsTold);
}

std::vector<ExplainedLine> unfoldExplanation(const Recording& Of, int Version,
                                             std::vector<bool>& IsTold) {
    struct Pending {
        const RecordedReason* pReason;
        unsigned Depth;
    };
    std::vector<ExplainedLine> Lines;
    std::vector<Pending> Stack;
    const auto tell = [&](int Told, unsigned Depth) {
        IsTold[static_cast<std::size_t>(Told)] = true;
        const std::vector<RecordedReason>& Reasons =
            Of.Versions[static_cast<std::size_t>(Told)].Explanation;
        for (std::size_t i = Reasons.size(); i-- != 0;)
            Stack.push_back({&Reasons[i], i == 0 ? Depth : Depth + 1});
    };
    IsTold.resize(Of.Versions.size(), false);
    if (!IsTold[static_cast<std::size_t>(Version)])
        tell(Version, 0);
    while (!Stack.empty()) {
        const Pending Next = Stack.back();
        Stack.pop_back();
        const int Named = Next.pReason->Version;
        // A line that names a version gives way to what that one says of itself.
        if (Named >= 0 && !IsTold[static_cast<std::size_t>(Named)])
            tell(Named, Next.Depth);
        else
            Lines.push_back({Next.pReason->Text + (Named >= 0 ? " (see above)" : ""),
                             Next.pReason->Place, Next.Depth});
    }
    return Lines;
}

} // namespace hpn
