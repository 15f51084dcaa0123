#include "Seeing/StateReader.h"

#include "Language/NumberText.h"
#include "Model/Conversion.h"
#include "Model/ZfCCfgSFAssignment.h"
#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"

#include <algorithm>
#include <cctype>
#include <cstring>

namespace hpn {

namespace {

// Conditions are no statements and have no number of their own; theirs start here.
constexpr unsigned FirstConditionId = 1U << 30;
constexpr std::size_t LongestUnit = 16;

const char* const KindNames[] = {"input", "output", "state", "param", "local", "formal", "result"};
const char* const BaseNames[] = {"bool",  "int8",   "uint8",   "int16",  "uint16",
                                 "int32", "uint32", "float32", "float64"};

bool isSame(const RecordedRead& a, const RecordedRead& b) {
    return a.Variable == b.Variable && a.Version == b.Version && a.Place == b.Place;
}

bool isSame(const RecordedStatement& a, const RecordedStatement& b) {
    return a.Text == b.Text && a.Form == b.Form && a.MakesCode == b.MakesCode &&
           a.Place == b.Place && a.Version == b.Version && a.Variable == b.Variable &&
           std::equal(a.Reads.begin(), a.Reads.end(), b.Reads.begin(), b.Reads.end(),
                      [](const RecordedRead& x, const RecordedRead& y) { return isSame(x, y); });
}

bool isSame(const RecordedNode& a, const RecordedNode& b) {
    return a.What == b.What && a.Statements == b.Statements;
}

bool isSame(const RecordedProcedure& a, const RecordedProcedure& b) {
    const auto SameEdge = [](const RecordedEdge& x, const RecordedEdge& y) {
        return x.From == y.From && x.To == y.To && x.What == y.What;
    };
    const auto SameCall = [](const RecordedCall& x, const RecordedCall& y) {
        return x.Node == y.Node && x.Callee == y.Callee;
    };
    return a.Nodes == b.Nodes && a.Title == b.Title &&
           std::equal(a.Edges.begin(), a.Edges.end(), b.Edges.begin(), b.Edges.end(), SameEdge) &&
           std::equal(a.Calls.begin(), a.Calls.end(), b.Calls.begin(), b.Calls.end(), SameCall);
}

// The latest state under a key, if the new one is the same; else the new one joins the pool.
template <class Key, class State>
int share(std::unordered_map<Key, int>& Latest, const Key& Of, std::vector<State>& Pool,
          State&& New) {
    const auto [Found, IsNew] = Latest.try_emplace(Of, static_cast<int>(Pool.size()));
    if (!IsNew && isSame(Pool[static_cast<std::size_t>(Found->second)], New))
        return Found->second;
    Found->second = static_cast<int>(Pool.size());
    Pool.push_back(std::forward<State>(New));
    return Found->second;
}

RecordedEdge::Kind kindOf(ZfCCfgEdgeInfo* pEdge) {
    if (pEdge->isSSAEdge() != nullptr)
        return RecordedEdge::Kind::Ssa;
    if (pEdge->isTrueBranch() != nullptr)
        return RecordedEdge::Kind::True;
    return pEdge->isFalseBranch() != nullptr ? RecordedEdge::Kind::False : RecordedEdge::Kind::Flow;
}

std::string_view trim(std::string_view Text) {
    while (!Text.empty() && std::isspace(static_cast<unsigned char>(Text.front())) != 0)
        Text.remove_prefix(1);
    while (!Text.empty() && std::isspace(static_cast<unsigned char>(Text.back())) != 0)
        Text.remove_suffix(1);
    return Text;
}

// So many nodes are looked at for a place; a statement beyond says little about where one stands.
constexpr unsigned FarthestPlace = 64;

// The node in front of or behind a node, if control flow knows just one.
leda::node onlyNeighbour(ZfCControlFlowGraph& Graph, leda::node v, bool IsIn) {
    leda::node Found = nullptr;
    leda::edge e = IsIn ? Graph.first_in_edge(v) : Graph.first_adj_edge(v);
    for (; e != nullptr; e = IsIn ? Graph.in_succ(e) : Graph.adj_succ(e)) {
        if (Graph.inf(e)->isSSAEdge() != nullptr)
            continue;
        if (Found != nullptr)
            return nullptr;
        Found = IsIn ? Graph.source(e) : Graph.target(e);
    }
    return Found;
}

} // namespace

StateReader::StateReader(Recording& Target, const SourceFiles& Sources, ProgramGraph& Program)
    : m_Target(Target), m_Sources(Sources), m_Program(Program), m_Graph(Program.getGraph()) {
    for (const Variable& Each : Program.getProgram().Variables)
        describeVariable(Program.getVariable(Each), false);
    for (const Variable& Each : Program.getHiddenVariables())
        describeVariable(Program.getVariable(Each), true);
    chooseNames();
}

// Tables

void StateReader::describeVariable(ZfCCfgSFVariable* pVariable, bool IsHidden) {
    const Variable& Declared = pVariable->getDeclaration();
    const Type& Of = *Declared.pType;
    const ValueRange Storage = storageRange(Of);
    RecordedVariable& New = m_Target.Variables.emplace_back();
    New.Name = Declared.Name;
    New.Owner = Declared.pOwner != nullptr ? std::string(Declared.pOwner->Name) : "";
    New.Kind = KindNames[static_cast<std::size_t>(Declared.Kind)];
    if (Declared.Kind == VariableKind::Result)
        New.Name = "result"; // has no name in the text
    New.IsHidden = IsHidden;
    New.Type = Of.Name;
    New.Base = BaseNames[static_cast<std::size_t>(Of.Base)];
    New.Unit = findUnit(Of);
    New.IsScaled = Of.IsScaled;
    New.Lsb = Of.Lsb;
    New.Offset = Of.Offset;
    New.StorageLow = Storage.Low;
    New.StorageHigh = Storage.High;
    New.HasLimits = Of.HasRange;
    New.Lower = Of.Lower;
    New.Upper = Of.Upper;
    New.SaturatesLow = Of.SaturatesLow;
    New.SaturatesHigh = Of.SaturatesHigh;
    New.Count = Declared.Count;
    New.Initial = Declared.Initial.empty() ? 0.0 : Declared.Initial.front();
    New.Place = placeOf(Declared.Position);
}

// Procedures may have locals of one name; those are told apart by the procedure's.
void StateReader::chooseNames() {
    std::unordered_map<std::string_view, unsigned> Uses;
    for (const RecordedVariable& Each : m_Target.Variables)
        ++Uses[Each.Name];
    for (const RecordedVariable& Each : m_Target.Variables) {
        const bool IsQualified = Each.Kind == "result" || Uses[Each.Name] > 1;
        m_Names.push_back(IsQualified && !Each.Owner.empty() ? Each.Owner + "::" + Each.Name
                                                             : Each.Name);
    }
}

// The language knows no units, but a type's line often ends with one: `// km/h`. A longer comment
// is prose.
std::string StateReader::findUnit(const Type& Of) const {
    if (Of.IsBuiltIn)
        return "";
    const std::string_view Line = m_Sources.getLineText(Of.Position);
    const std::size_t Start = Line.find("//");
    if (Start == std::string_view::npos)
        return "";
    const std::string_view Comment = trim(Line.substr(Start + 2));
    return Comment.size() <= LongestUnit ? std::string(Comment) : "";
}

void StateReader::noteVersions() {
    std::vector<ZfCCfgVariable*> Versions;
    const auto note = [&Versions](ZfCCfgStatement* pStatement) {
        for (ZfCCfgVariable* pVariable : pStatement->getDefinedVariables())
            if (pVariable->isSSAVariable() != nullptr)
                Versions.push_back(pVariable);
    };
    for (leda::node v = m_Graph.first_node(); v != nullptr; v = m_Graph.next_node(v)) {
        ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
        if (pBlock == nullptr)
            continue;
        for (ZfCPhiFunction* pPhi : pBlock->getPhiFunctions())
            note(pPhi);
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
            note(pStatement);
    }
    std::sort(Versions.begin(), Versions.end(),
              [](ZfCCfgVariable* a, ZfCCfgVariable* b) { return a->getIndex() < b->getIndex(); });
    for (ZfCCfgVariable* pVersion : Versions)
        versionOf(pVersion);
}

int StateReader::versionOf(ZfCCfgVariable* pVariable) {
    if (pVariable == nullptr || pVariable->isSSAVariable() == nullptr)
        return -1;
    const auto [Found, IsNew] =
        m_VersionOf.try_emplace(pVariable->getIndex(), static_cast<int>(m_Target.Versions.size()));
    if (!IsNew)
        return Found->second;
    RecordedVersion& New = m_Target.Versions.emplace_back();
    New.Variable = variableOf(pVariable);
    RecordedVariable& Original = m_Target.Variables[static_cast<std::size_t>(New.Variable)];
    Original.Versions.push_back(Found->second);
    New.Number = static_cast<unsigned>(Original.Versions.size());
    New.Name = m_Names[static_cast<std::size_t>(New.Variable)] + "." + std::to_string(New.Number);
    return Found->second;
}

int StateReader::variableOf(ZfCCfgVariable* pVariable) const {
    return static_cast<int>(originalOf(pVariable)->getDeclaration().Index);
}

void StateReader::appendName(ZfCCfgVariable* pVariable, std::string& Out) {
    const int Version = versionOf(pVariable);
    if (Version >= 0)
        Out += m_Target.Versions[static_cast<std::size_t>(Version)].Name;
    else
        Out += m_Names[static_cast<std::size_t>(variableOf(pVariable))];
}

// What the client made itself, without a text of the program, stands at the very start of the first
// file, where no statement can be.
RecordedPlace StateReader::placeOf(SourcePosition Position) const {
    if (Position.File == 0 && Position.Offset == 0)
        return {};
    const LineAndColumn Place = m_Sources.locate(Position);
    return {Position.File, static_cast<unsigned>(Place.Line), static_cast<unsigned>(Place.Column)};
}

RecordedPlace StateReader::placeOf(ZfCCfgExpression* pExpression) const {
    ZfCCfgSFExpression* pOwn = pExpression != nullptr ? pExpression->isSFExpression() : nullptr;
    return pOwn != nullptr ? placeOf(pOwn->getRoot()->getPosition()) : RecordedPlace{};
}

RecordedPlace StateReader::placeOfCall(ZfCCfgStatement* pCall) const {
    if (ZfCCfgExternCall* pExtern = pCall->isExternCall())
        return placeOf(m_Program.getExternPosition(pExtern));
    ZfCCfgSFProcedureCall* pOwn = pCall->isSFProcedureCall();
    return pOwn != nullptr ? placeOf(pOwn->getPosition()) : RecordedPlace{};
}

std::string StateReader::textOf(const Term* pTerm) {
    std::string Text;
    appendTerm(pTerm, *this, Text);
    return Text;
}

// The library's own expressions name variables or are a value.
std::string StateReader::textOf(ZfCCfgExpression* pExpression) {
    if (pExpression == nullptr)
        return "?";
    if (ZfCCfgSFExpression* pOwn = pExpression->isSFExpression()) {
        const Term* pRoot = pOwn->getRoot();
        return textOf(pRoot->Op == Operator::Cast ? pRoot->pLeft : pRoot);
    }
    std::string Text;
    for (ZfCCfgVariable* pVariable : pExpression->getUsedVariables()) {
        Text += Text.empty() ? "" : ", ";
        appendName(pVariable, Text);
    }
    if (!Text.empty())
        return Text;
    const ZfCCfgValue Value = pExpression->evaluate();
    return Value.isConstant() ? numberText(Value.getValue()) : "unknown";
}

int StateReader::stateOf(unsigned StatementId) const {
    const auto Found = m_StatementOf.find(StatementId);
    return Found != m_StatementOf.end() ? Found->second : -1;
}

// Procedures and nodes

void StateReader::readSnapshot(RecordedSnapshot& Snapshot) {
    if (m_VersionOf.empty())
        noteVersions();
    findProcedures();
    std::vector<RecordedProcedure> States;
    for (leda::node Entry : m_Entries)
        States.push_back(beginProcedure(Entry));
    for (leda::node v = m_Graph.first_node(); v != nullptr; v = m_Graph.next_node(v)) {
        const int Owner = m_Owner[static_cast<std::size_t>(m_Graph.index(v))];
        if (Owner < 0)
            continue;
        RecordedProcedure& State = States[static_cast<std::size_t>(Owner)];
        State.Nodes.push_back(readNode(v));
        readFlow(v, State);
        ++Snapshot.NodeCount;
        for (int Index : m_Target.Nodes[static_cast<std::size_t>(State.Nodes.back())].Statements) {
            const RecordedStatement& Each = m_Target.Statements[static_cast<std::size_t>(Index)];
            if (Each.MakesCode)
                ++(Each.Form == RecordedForm::Condition ? Snapshot.ConditionCount
                                                        : Snapshot.StatementCount);
        }
    }
    for (RecordedProcedure& State : States)
        Snapshot.Procedures.push_back(shareProcedure(std::move(State)));
}

// The blocks that the library puts in bear no procedure, so a node belongs to the entry that
// control flow connects it with, in either direction.
void StateReader::findProcedures() {
    m_Entries.clear();
    std::size_t Size = 0;
    for (leda::node v = m_Graph.first_node(); v != nullptr; v = m_Graph.next_node(v))
        Size = std::max(Size, static_cast<std::size_t>(m_Graph.index(v)) + 1);
    m_Owner.assign(Size, -1);
    std::vector<leda::node> Stack;
    const auto reach = [&](leda::node v, int Owner) {
        int& Place = m_Owner[static_cast<std::size_t>(m_Graph.index(v))];
        if (Place >= 0)
            return;
        Place = Owner;
        Stack.push_back(v);
    };
    for (leda::node v = m_Graph.first_node(); v != nullptr; v = m_Graph.next_node(v)) {
        if (m_Graph.inf(v)->isEntryNode() == nullptr)
            continue;
        const int Owner = static_cast<int>(m_Entries.size());
        m_Entries.push_back(v);
        reach(v, Owner);
        while (!Stack.empty()) {
            const leda::node w = Stack.back();
            Stack.pop_back();
            for (leda::edge e = m_Graph.first_adj_edge(w); e != nullptr; e = m_Graph.adj_succ(e))
                if (m_Graph.inf(e)->isSSAEdge() == nullptr)
                    reach(m_Graph.target(e), Owner);
            for (leda::edge e = m_Graph.first_in_edge(w); e != nullptr; e = m_Graph.in_succ(e))
                if (m_Graph.inf(e)->isSSAEdge() == nullptr)
                    reach(m_Graph.source(e), Owner);
        }
    }
}

RecordedProcedure StateReader::beginProcedure(leda::node Entry) {
    RecordedProcedure State;
    ZfCCfgProcedure* pProcedure = m_Graph.inf(Entry)->getProcedure();
    const WqCXString Name = pProcedure != nullptr ? pProcedure->getName() : WqCXString();
    State.Name = Name.cstring();
    State.Title = m_Program.readableNameOf(State.Name);
    if (const Procedure* pSource = m_Program.findProcedure(State.Name.c_str())) {
        State.Title = pSource->Name;
        State.Place = placeOf(pSource->Position);
    } else if (State.Name == ProgramGraph::outsideProcedureName()) {
        State.Title = "callers outside";
    }
    return State;
}

void StateReader::readFlow(leda::node v, RecordedProcedure& Target) {
    const unsigned From = static_cast<unsigned>(m_Graph.index(v));
    for (leda::edge e = m_Graph.first_adj_edge(v); e != nullptr; e = m_Graph.adj_succ(e))
        Target.Edges.push_back({From, static_cast<unsigned>(m_Graph.index(m_Graph.target(e))),
                                kindOf(m_Graph.inf(e))});
    ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
    if (pBlock == nullptr)
        return;
    for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
        if (ZfCCfgProcedureCall* pCall = pStatement->isProcedureCall())
            Target.Calls.push_back({From, pCall->getName().cstring(), placeOfCall(pCall)});
}

int StateReader::readNode(leda::node v) {
    RecordedNode State;
    State.Id = static_cast<unsigned>(m_Graph.index(v));
    ZfCCfgNodeInfo* pNode = m_Graph.inf(v);
    if (pNode->isEntryNode() != nullptr)
        State.What = RecordedNode::Kind::Entry;
    if (pNode->isExitNode() != nullptr)
        State.What = RecordedNode::Kind::Exit;
    if (ZfCBasicBlock* pBlock = pNode->isBasicBlock()) {
        for (ZfCPhiFunction* pPhi : pBlock->getPhiFunctions())
            State.Statements.push_back(readStatement(pPhi, v));
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
            State.Statements.push_back(readStatement(pStatement, v));
        if (ZfCCfgExpression* pCondition = pBlock->getBranchCond())
            State.Statements.push_back(readCondition(pCondition));
    }
    for (int Index : State.Statements) {
        State.Place = m_Target.Statements[static_cast<std::size_t>(Index)].Place;
        if (State.Place.isKnown())
            break;
    }
    return shareNode(std::move(State));
}

int StateReader::shareProcedure(RecordedProcedure State) {
    const std::string Name = State.Name;
    return share(m_ProcedureOf, Name, m_Target.Procedures, std::move(State));
}

int StateReader::shareNode(RecordedNode State) {
    const unsigned Id = State.Id;
    return share(m_NodeOf, Id, m_Target.Nodes, std::move(State));
}

int StateReader::shareStatement(RecordedStatement State) {
    const unsigned Id = State.Id;
    return share(m_StatementOf, Id, m_Target.Statements, std::move(State));
}

// Statements

int StateReader::readStatement(ZfCCfgStatement* pStatement, leda::node v) {
    RecordedStatement State;
    State.Id = pStatement->getIndex();
    State.MakesCode = false;
    for (ZfCCfgVariable* pVariable : pStatement->getDefinedVariables()) {
        State.Variable = variableOf(pVariable);
        State.Version = versionOf(pVariable);
    }
    describe(pStatement, v, State);
    return shareStatement(std::move(State));
}

void StateReader::describe(ZfCCfgStatement* pStatement, leda::node v, RecordedStatement& State) {
    if (pStatement->isAssignment() != nullptr)
        return describeAssignment(pStatement, v, State);
    if (ZfCCfgExternCall* pCall = pStatement->isExternCall())
        return describeExtern(pCall, State);
    if (pStatement->isProcedureCall() != nullptr)
        return describeCall(pStatement, State);
    if (ZfCCfgParamStatement* pParameter = pStatement->isParamStatement())
        return describeParameter(pParameter, v, State);
    if (ZfCPhiFunction* pPhi = pStatement->isPhiFunction())
        return describeJoin(pPhi, v, State);
    if (ZfCCfgValueReturnStatement* pReturn = pStatement->isValueReturnStatement()) {
        State.Form = RecordedForm::ValueReturn;
        appendName(pReturn->getVariable(), State.Text);
        State.Text += " = " + textOf(pReturn->getExpression()) + " after the call";
        State.Place = placeOfCallAbove(v);
        addReads(pReturn->getExpression(), {}, State);
        return;
    }
    State.Form = RecordedForm::Output;
    State.Text = "output ";
    for (ZfCCfgVariable* pVariable : pStatement->getUsedVariables()) {
        appendName(pVariable, State.Text);
        addRead(pVariable, {}, State);
    }
}

void StateReader::describeAssignment(ZfCCfgStatement* pStatement, leda::node v,
                                     RecordedStatement& State) {
    ZfCCfgAssignment* pAssignment = pStatement->isAssignment();
    ZfCCfgSFExpression* pOwn = pAssignment->getRHS()->isSFExpression();
    State.MakesCode = !pStatement->getIsVirtual();
    const bool IsStore = pOwn != nullptr && pOwn->getRoot()->isStore();
    if (!IsStore) {
        appendName(pAssignment->getLHS(), State.Text);
        State.Text += " = ";
    }
    if (pOwn != nullptr)
        appendStored(pOwn->getRoot(), originalOf(pAssignment->getLHS())->getType(), *this,
                     State.Text);
    else
        State.Text += textOf(pAssignment->getRHS());
    addReads(pAssignment->getRHS(), {}, State);
    if (ZfCCfgSFAssignment* pClients = pStatement->isSFAssignment()) {
        State.Form = IsStore ? RecordedForm::Store : RecordedForm::Assignment;
        State.Place = placeOf(pClients->getPosition());
    } else if (pAssignment->getIsValidConditionAssignment()) {
        State.Form = RecordedForm::Note;
        State.Place = placeOfBranchAbove(v);
    } else if (pOwn != nullptr) {
        State.Form = RecordedForm::Argument;
        State.Place = placeOf(pOwn->getRoot()->getPosition());
    } else {
        State.Form = RecordedForm::InitialValue;
        State.MakesCode = false; // written by the init function
        State.Place = m_Target.Variables[static_cast<std::size_t>(State.Variable)].Place;
    }
}

void StateReader::describeCall(ZfCCfgStatement* pStatement, RecordedStatement& State) {
    ZfCCfgSFProcedureCall* pCall = pStatement->isSFProcedureCall();
    State.Form = RecordedForm::Call;
    State.MakesCode = true;
    State.Text = m_Program.readableNameOf(pStatement->isProcedureCall()->getName().cstring()) + "(";
    if (pCall != nullptr) {
        const char* Separator = "";
        for (const ZfCCfgSFProcedureCall::Argument& Next : pCall->getArguments()) {
            State.Text += Separator + textOf(Next.pExpression);
            addReads(Next.pExpression, {}, State);
            Separator = ", ";
        }
    }
    State.Text += ")";
    State.Place = placeOfCall(pStatement);
}

void StateReader::describeExtern(ZfCCfgExternCall* pCall, RecordedStatement& State) {
    State.Form = RecordedForm::ExternCall;
    State.MakesCode = true;
    State.Place = placeOfCall(pCall);
    const Extern* pExtern = m_Program.getExtern(pCall);
    State.Text = pExtern != nullptr ? std::string(pExtern->Name) + "()" : "extern call";
    for (ZfCCfgVariable* pVariable : pCall->getUsedVariables())
        addRead(pVariable, State.Place, State);
}

void StateReader::describeParameter(ZfCCfgParamStatement* pStatement, leda::node v,
                                    RecordedStatement& State) {
    State.Form = RecordedForm::Parameter;
    State.Place = placeOfProcedure(v);
    appendName(pStatement->getVariable(), State.Text);
    State.Text += " = parameter";
    const char* Separator = ": ";
    auto& Expressions = pStatement->getParamExpressions();
    for (auto Item = Expressions.first_item(); Item; Item = Expressions.next_item(Item)) {
        State.Text += Separator + textOf(Expressions.inf(Item));
        addReads(Expressions.inf(Item), placeOfCall(Expressions.key(Item)), State);
        Separator = " | ";
    }
}

void StateReader::describeJoin(ZfCPhiFunction* pPhi, leda::node v, RecordedStatement& State) {
    State.Form = RecordedForm::Join;
    State.Place = placeBelow(v);
    appendName(pPhi->getVariable(), State.Text);
    State.Text += " = join(";
    const char* Separator = "";
    const leda::array<ZfCCfgVariable*> Operands = pPhi->getReplacementVariables();
    for (int i = Operands.low(); i <= Operands.high(); ++i) {
        State.Text += Separator;
        Separator = ", ";
        if (Operands[i] == nullptr)
            continue;
        appendName(Operands[i], State.Text);
        addRead(Operands[i], {}, State);
    }
    State.Text += ")";
}

int StateReader::readCondition(ZfCCfgExpression* pCondition) {
    const auto [Found, IsNew] = m_Conditions.try_emplace(
        pCondition, FirstConditionId + static_cast<unsigned>(m_Conditions.size()));
    (void)IsNew;
    RecordedStatement State;
    State.Id = Found->second;
    State.Form = RecordedForm::Condition;
    State.MakesCode = pCondition->isSFExpression() != nullptr;
    if (State.MakesCode)
        State.Text = "if (" + textOf(pCondition->isSFExpression()->getRoot()) + ")";
    else
        State.Text = m_Program.isNeverLeft(pCondition) ? "never left" : "another step";
    State.Place = placeOf(pCondition);
    addReads(pCondition, {}, State);
    return shareStatement(std::move(State));
}

void StateReader::addReads(ZfCCfgExpression* pExpression, RecordedPlace Otherwise,
                           RecordedStatement& State) {
    if (pExpression == nullptr)
        return;
    if (ZfCCfgSFExpression* pOwn = pExpression->isSFExpression())
        return addReads(pOwn->getRoot(), State);
    for (ZfCCfgVariable* pVariable : pExpression->getUsedVariables())
        addRead(pVariable, Otherwise, State);
}

void StateReader::addReads(const Term* pTerm, RecordedStatement& State) {
    if (pTerm == nullptr)
        return;
    if (pTerm->hasVariable() && !pTerm->isStore())
        addRead(pTerm->pVariable, placeOf(pTerm->getPosition()), State);
    addReads(pTerm->pLeft, State);
    addReads(pTerm->pRight, State);
}

void StateReader::addRead(ZfCCfgVariable* pVariable, RecordedPlace Place,
                          RecordedStatement& State) {
    State.Reads.push_back({variableOf(pVariable), versionOf(pVariable), Place});
}

// A note stands alone on the edge out of its branch.
RecordedPlace StateReader::placeOfBranchAbove(leda::node v) const {
    for (leda::edge e = m_Graph.first_in_edge(v); e != nullptr; e = m_Graph.in_succ(e)) {
        ZfCBasicBlock* pBlock = m_Graph.inf(m_Graph.source(e))->isBasicBlock();
        if (m_Graph.inf(e)->isSSAEdge() == nullptr && pBlock != nullptr)
            return placeOf(pBlock->getBranchCond());
    }
    return {};
}

// What a call leaves stands behind it, in the same block or in nodes of its own.
RecordedPlace StateReader::placeOfCallAbove(leda::node v) const {
    for (unsigned Steps = 0; Steps < FarthestPlace && v != nullptr; ++Steps) {
        ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
        if (pBlock == nullptr)
            return {};
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
            if (pStatement->isProcedureCall() != nullptr)
                return placeOfCall(pStatement);
        v = onlyNeighbour(m_Graph, v, true);
    }
    return {};
}

// Ways meet in front of the first statement that follows.
RecordedPlace StateReader::placeBelow(leda::node v) const {
    for (unsigned Steps = 0; Steps < FarthestPlace && v != nullptr; ++Steps) {
        ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
        if (pBlock == nullptr)
            return {};
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq()) {
            ZfCCfgSFAssignment* pOwn = pStatement->isSFAssignment();
            const RecordedPlace Place =
                pOwn != nullptr ? placeOf(pOwn->getPosition()) : placeOfCall(pStatement);
            if (Place.isKnown())
                return Place;
        }
        if (pBlock->getBranchCond() != nullptr)
            return placeOf(pBlock->getBranchCond());
        v = onlyNeighbour(m_Graph, v, false);
    }
    return {};
}

RecordedPlace StateReader::placeOfProcedure(leda::node v) const {
    const int Owner = m_Owner[static_cast<std::size_t>(m_Graph.index(v))];
    ZfCCfgProcedure* pProcedure =
        m_Graph.inf(m_Entries[static_cast<std::size_t>(Owner)])->getProcedure();
    const Procedure* pSource = m_Program.findProcedure(pProcedure->getName().cstring());
    return pSource != nullptr ? placeOf(pSource->Position) : RecordedPlace{};
}

} // namespace hpn
