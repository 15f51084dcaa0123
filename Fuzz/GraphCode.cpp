#include "GraphCode.h"

#include "Model/ZfCCfgSFExpression.h"
#include "Model/ZfCCfgSFProcedureCall.h"
#include "ZfCBasicBlock.h"
#include "ZfCCfgEdgeInfo.h"
#include "ZfCCfgExternCall.h"
#include "ZfCCfgInitAssignment.h"
#include "ZfCCfgParamStatement.h"
#include "ZfCCfgProcedure.h"
#include "ZfCCfgValueReturnStatement.h"
#include "ZfCPhiFunction.h"
#include "ZfCSSAVariable.h"

// From the graph to the machine's arrays.
//
// 1. Slots for all variables of the program, hidden ones included.
// 2. A number for each node and each procedure; the formals whose parameter statements stand.
// 3. Each node's phi functions, statements and condition; then its ways on.
// Versions get their numbers when they are met. Only versions of variables that nothing outside the
// graph changes are numbered: a volatile variable has several definitions that the graph does not
// show.

namespace hpn::fuzz {

namespace {

class GraphReader {
public:
    GraphReader(ProgramGraph& Graph, const CodeOptions& Options, GraphCode& Result)
        : m_Program(Graph), m_Graph(Graph.getGraph()), m_Options(Options), m_Result(Result) {}

    void read() {
        layOutVariables();
        numberNodes();
        findFedFormals();
        for (std::size_t i = 0; i < m_Nodes.size(); ++i)
            readNode(static_cast<std::int32_t>(i));
        findEntries();
    }

private:
    // Step 1

    void layOutVariables() {
        for (const Variable& Each : m_Program.getProgram().Variables)
            layOut(Each);
        for (const Variable& Each : m_Program.getHiddenVariables())
            layOut(Each);
    }
    void layOut(const Variable& Each) {
        Storage Place;
        Place.pVariable = &Each;
        Place.Slot = static_cast<std::int32_t>(m_Result.SlotVariables.size());
        Place.Count = Each.Count == 0 ? 1 : static_cast<std::int32_t>(Each.Count);
        if (m_Result.Variables.size() <= Each.Index)
            m_Result.Variables.resize(Each.Index + 1);
        m_Result.Variables[Each.Index] = Place;
        m_Result.SlotVariables.insert(m_Result.SlotVariables.end(),
                                      static_cast<std::size_t>(Place.Count), &Each);
    }

    // Step 2

    void numberNodes() {
        m_NodeNumbers.assign(static_cast<std::size_t>(m_Graph.max_node_index()) + 1, None);
        m_Positions.assign(static_cast<std::size_t>(m_Graph.max_edge_index()) + 1, 0);
        for (leda::node v = m_Graph.first_node(); v != nullptr; v = m_Graph.next_node(v)) {
            m_NodeNumbers[static_cast<std::size_t>(m_Graph.index(v))] =
                static_cast<std::int32_t>(m_Nodes.size());
            m_Nodes.push_back(v);
            CodeNode Node;
            Node.GraphIndex = static_cast<std::uint32_t>(m_Graph.index(v));
            std::int32_t Position = 0;
            for (leda::edge e = m_Graph.first_in_edge(v); e != nullptr; e = m_Graph.in_succ(e)) {
                if (m_Graph.inf(e)->isSSAEdge() == nullptr)
                    m_Positions[static_cast<std::size_t>(m_Graph.index(e))] = Position++;
            }
            Node.IsJoin = Position != 1;
            if (m_Graph.inf(v)->isExitNode() != nullptr)
                Node.Kind = NodeKind::Exit;
            if (m_Graph.inf(v)->isEntryNode() != nullptr)
                addProcedure(v);
            m_Result.Nodes.push_back(Node);
        }
    }
    void addProcedure(leda::node Entry) {
        ZfCCfgProcedure* pProcedure = m_Graph.inf(Entry)->getProcedure();
        CodeProcedure Procedure;
        Procedure.Name = pProcedure->getName().cstring();
        Procedure.pSource = m_Program.findProcedure(Procedure.Name.c_str());
        Procedure.IsRecursive = Procedure.pSource != nullptr && Procedure.pSource->IsRecursive;
        const auto Number = static_cast<std::int32_t>(m_Result.Procedures.size());
        m_ProcedureNumbers.emplace(Procedure.Name, Number);
        if (Entry == m_Graph.getStartNode())
            m_Result.MainProcedure = Number;
        if (Procedure.IsRecursive) {
            for (const Storage& Place : m_Result.Variables) {
                const Variable& Own = *Place.pVariable;
                if (Own.pOwner != Procedure.pSource || Own.Kind == VariableKind::Result)
                    continue;
                for (std::int32_t i = 0; i < Place.Count; ++i)
                    Procedure.OwnSlots.push_back(Place.Slot + i);
            }
        }
        m_Result.Procedures.push_back(std::move(Procedure));
        m_Entries.push_back(Entry);
        m_Parameters.emplace_back();
    }
    // An explicit argument is passed while the parameter statement of its formal stands, as in the
    // emitted code.
    void findFedFormals() {
        m_IsFed.assign(m_Result.Variables.size(), false);
        m_Result.IsSSAForm = m_Options.IsSSAForm;
        for (leda::node v : m_Nodes) {
            ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
            if (pBlock == nullptr)
                continue;
            m_Result.IsSSAForm = m_Result.IsSSAForm || !pBlock->getPhiFunctions().empty();
            for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
                noteStatement(pBlock, pStatement);
        }
    }
    void noteStatement(ZfCBasicBlock* pBlock, ZfCCfgStatement* pStatement) {
        if (ZfCCfgAssignment* pAssignment = pStatement->isAssignment()) {
            m_Result.IsSSAForm =
                m_Result.IsSSAForm || pAssignment->getLHS()->isSSAVariable() != nullptr;
            return;
        }
        if (pStatement->isProcedureCall() != nullptr || pStatement->isExternCall() != nullptr)
            return;
        m_Result.IsSSAForm = true;
        ZfCCfgParamStatement* pParameter = pStatement->isParamStatement();
        if (pParameter == nullptr)
            return;
        const auto Found = m_ProcedureNumbers.find(pBlock->getProcedure()->getName().cstring());
        if (Found == m_ProcedureNumbers.end())
            return;
        m_Parameters[static_cast<std::size_t>(Found->second)].push_back(pParameter);
        // Callers of a procedure that assigns its formal have a parameter for it as well, which
        // says nothing of the call.
        const Variable& Taken = originalOf(pParameter->getVariable())->getDeclaration();
        if (Taken.pOwner == m_Result.Procedures[static_cast<std::size_t>(Found->second)].pSource)
            m_IsFed[Taken.Index] = true;
    }

    // Step 3

    void readNode(std::int32_t Number) {
        const leda::node v = m_Nodes[static_cast<std::size_t>(Number)];
        ZfCBasicBlock* pBlock = m_Graph.inf(v)->isBasicBlock();
        if (pBlock == nullptr)
            return;
        CodeNode Node = m_Result.Nodes[static_cast<std::size_t>(Number)];
        Node.FirstAction = static_cast<std::int32_t>(m_Result.Actions.size());
        for (ZfCPhiFunction* pPhi : pBlock->getPhiFunctions())
            readPhi(pPhi);
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq())
            readStatement(pStatement);
        Node.EndAction = static_cast<std::int32_t>(m_Result.Actions.size());
        readWaysOn(v, pBlock->getBranchCond(), Node);
        m_Result.Nodes[static_cast<std::size_t>(Number)] = Node;
    }
    void readWaysOn(leda::node v, ZfCCfgExpression* pCondition, CodeNode& Node) {
        Way Plain;
        for (leda::edge e = m_Graph.first_adj_edge(v); e != nullptr; e = m_Graph.adj_succ(e)) {
            ZfCCfgEdgeInfo* pInfo = m_Graph.inf(e);
            if (pInfo->isSSAEdge() == nullptr)
                (pInfo->isTrueBranch() != nullptr    ? Node.True
                 : pInfo->isFalseBranch() != nullptr ? Node.False
                                                     : Plain) = wayOf(e);
        }
        if (pCondition == nullptr) {
            // Before there are exit nodes, a block without a way on leaves the procedure;
            // afterwards it has one.
            Node.True = Plain.Node != None       ? Plain
                        : Node.True.Node != None ? Node.True
                                                 : Node.False;
            return;
        }
        if (pCondition->isSFExpression() == nullptr) {
            Node.Kind = m_Program.isNeverLeft(pCondition) ? NodeKind::NeverLeft : NodeKind::StepEnd;
            return;
        }
        Node.Kind = NodeKind::Branch;
        Node.Condition = codeOf(pCondition->isSFExpression()->getRoot());
    }
    Way wayOf(leda::edge e) {
        Way Result;
        Result.Node = m_NodeNumbers[static_cast<std::size_t>(m_Graph.index(m_Graph.target(e)))];
        Result.Position = m_Positions[static_cast<std::size_t>(m_Graph.index(e))];
        return Result;
    }
    void findEntries() {
        for (std::size_t i = 0; i < m_Entries.size(); ++i) {
            for (leda::edge e = m_Graph.first_adj_edge(m_Entries[i]); e != nullptr;
                 e = m_Graph.adj_succ(e)) {
                if (m_Graph.inf(e)->isSSAEdge() == nullptr)
                    m_Result.Procedures[i].Entry = wayOf(e);
            }
        }
    }

    void readPhi(ZfCPhiFunction* pPhi) {
        const std::int32_t Defined = definedVersion(pPhi->getVariable());
        if (Defined == None)
            return;
        ActionStep Step;
        Step.Op = ActionOp::Phi;
        Step.B = Defined;
        Step.First = static_cast<std::int32_t>(m_Result.Operands.size());
        leda::array<ZfCCfgVariable*> Operands = pPhi->getReplacementVariables();
        Step.A = Operands.size();
        for (int i = 0; i < Operands.size(); ++i)
            m_Result.Operands.push_back(versionOf(Operands[i]));
        m_Result.Actions.push_back(Step);
    }
    void readStatement(ZfCCfgStatement* pStatement) {
        if (ZfCCfgAssignment* pAssignment = pStatement->isAssignment())
            return readAssignment(pAssignment);
        if (ZfCCfgProcedureCall* pCall = pStatement->isProcedureCall())
            return readCall(pCall);
        if (ZfCCfgExternCall* pExtern = pStatement->isExternCall())
            return readExtern(pExtern);
        if (ZfCCfgParamStatement* pParameter = pStatement->isParamStatement())
            return readParameter(pParameter);
        if (ZfCCfgValueReturnStatement* pReturn = pStatement->isValueReturnStatement())
            readReturn(pReturn);
    }
    // Arguments of the client are assigned to the formal, the library's are versions of the same
    // variable in the caller.
    void readParameter(ZfCCfgParamStatement* pParameter) {
        bool IsExplicit = false;
        auto& Expressions = pParameter->getParamExpressions();
        for (auto Item = Expressions.first_item(); Item != nullptr;
             Item = Expressions.next_item(Item))
            IsExplicit = IsExplicit || (Expressions.inf(Item) != nullptr &&
                                        Expressions.inf(Item)->isSFExpression() != nullptr);
        define(pParameter->getVariable(), IsExplicit ? ActionOp::Define : ActionOp::Parameter);
    }
    void define(ZfCCfgVariable* pVariable, ActionOp Op = ActionOp::Define) {
        const std::int32_t Defined = definedVersion(pVariable);
        if (Defined == None)
            return;
        ActionStep Step;
        Step.Op = Op;
        Step.B = Defined;
        m_Result.Actions.push_back(Step);
    }
    // An assignment with an expression of the library is main's start value: the state is there
    // before the first step. A virtual one says something of a variable and stores nothing.
    void readAssignment(ZfCCfgAssignment* pAssignment) {
        ZfCCfgSFExpression* pRHS =
            pAssignment->getRHS() != nullptr ? pAssignment->getRHS()->isSFExpression() : nullptr;
        if (pAssignment->getIsVirtual() || pRHS == nullptr)
            return define(pAssignment->getLHS());
        const Term* pRoot = pRHS->getRoot();
        const Variable& Target = originalOf(pAssignment->getLHS())->getDeclaration();
        ActionStep Step;
        const Term* pValue = pRoot->isStore() ? pRoot->pRight : pRoot;
        Step.MustFit = pValue->Op != Operator::Cast || pValue->pType != Target.pType;
        if (pRoot->isStore()) {
            Step.Op = ActionOp::Store;
            Step.A = static_cast<std::int32_t>(Target.Index);
            Step.Index = codeOf(pRoot->pLeft);
        } else {
            Step.A = m_Result.Variables[Target.Index].Slot;
            Step.B = definedVersion(pAssignment->getLHS());
        }
        Step.Value = codeOf(pValue);
        m_Result.Actions.push_back(Step);
    }
    void readExtern(ZfCCfgExternCall* pExtern) {
        const Extern* pSource = m_Program.getExtern(pExtern);
        ActionStep Step;
        Step.Op = ActionOp::CallExtern;
        for (std::size_t i = 0; i < m_Program.getProgram().Externs.size(); ++i) {
            if (&m_Program.getProgram().Externs[i] == pSource)
                Step.A = static_cast<std::int32_t>(i);
        }
        Step.First = static_cast<std::int32_t>(m_Result.Operands.size());
        for (ZfCCfgVariable* pVariable : pExtern->getUsedVariables()) {
            const std::int32_t Used = versionOf(pVariable);
            if (Used != None)
                m_Result.Operands.push_back(Used);
        }
        Step.B = static_cast<std::int32_t>(m_Result.Operands.size()) - Step.First;
        m_Result.Actions.push_back(Step);
    }
    void readReturn(ZfCCfgValueReturnStatement* pReturn) {
        const std::int32_t Defined = definedVersion(pReturn->getVariable());
        if (Defined == None)
            return;
        ActionStep Step;
        Step.Op = ActionOp::ValueReturn;
        Step.B = Defined;
        for (ZfCCfgVariable* pVariable : pReturn->getExpression()->getUsedVariables())
            Step.A = versionOf(pVariable);
        m_Result.Actions.push_back(Step);
    }
    void readCall(ZfCCfgProcedureCall* pCall) {
        const auto Found = m_ProcedureNumbers.find(pCall->getName().cstring());
        ActionStep Step;
        Step.Op = ActionOp::Call;
        Step.A = static_cast<std::int32_t>(m_Result.CallSites.size());
        m_Result.Actions.push_back(Step);
        CallSite Site;
        Site.FirstArgument = Site.EndArgument =
            static_cast<std::int32_t>(m_Result.Arguments.size());
        Site.FirstHanded = Site.EndHanded = static_cast<std::int32_t>(m_Result.Handed.size());
        if (Found == m_ProcedureNumbers.end()) {
            m_Result.Faults.push_back("a call names no procedure of the graph");
            m_Result.CallSites.push_back(Site);
            return;
        }
        Site.Procedure = Found->second;
        if (ZfCCfgSFProcedureCall* pOwn = pCall->isSFProcedureCall())
            readArguments(pOwn);
        Site.EndArgument = static_cast<std::int32_t>(m_Result.Arguments.size());
        readHanded(pCall, m_Parameters[static_cast<std::size_t>(Found->second)]);
        Site.EndHanded = static_cast<std::int32_t>(m_Result.Handed.size());
        m_Result.CallSites.push_back(Site);
    }
    void readArguments(ZfCCfgSFProcedureCall* pCall) {
        for (const ZfCCfgSFProcedureCall::Argument& Each : pCall->getArguments()) {
            const Variable& Formal = Each.pFormal->getDeclaration();
            CodeArgument Argument;
            Argument.Slot = m_Result.Variables[Formal.Index].Slot;
            Argument.pType = Formal.pType;
            ZfCCfgSFExpression* pExpression = Each.pExpression->isSFExpression();
            if (pExpression != nullptr && (!m_Result.IsSSAForm || m_IsFed[Formal.Index]))
                Argument.Value = codeOf(pExpression->getRoot());
            m_Result.Arguments.push_back(Argument);
        }
    }
    void readHanded(ZfCCfgProcedureCall* pCall,
                    const std::vector<ZfCCfgParamStatement*>& Parameters) {
        for (ZfCCfgParamStatement* pParameter : Parameters) {
            auto& Expressions = pParameter->getParamExpressions();
            const auto Item = Expressions.lookup(pCall);
            if (Item == nullptr || Expressions.inf(Item) == nullptr) {
                m_Result.Faults.push_back(
                    "a parameter statement has no argument for a call that stands");
                continue;
            }
            ZfCCfgExpression* pExpression = Expressions.inf(Item);
            if (pExpression->isSFExpression() != nullptr)
                continue; // an explicit argument, see above
            for (ZfCCfgVariable* pVariable : pExpression->getUsedVariables()) {
                const HandedVersion Handed{versionOf(pVariable),
                                           versionOf(pParameter->getVariable())};
                if (Handed.Given != None && Handed.Taken != None)
                    m_Result.Handed.push_back(Handed);
            }
        }
    }

    // Versions

    std::int32_t versionOf(ZfCCfgVariable* pVariable) {
        if (!m_Options.ChecksVersions || pVariable == nullptr ||
            pVariable->isSSAVariable() == nullptr)
            return None;
        ZfCCfgSFVariable* pOriginal = originalOf(pVariable);
        if (pOriginal->isVolatile() || pOriginal->isArray())
            return None;
        const std::size_t Serial = pVariable->getIndex();
        if (m_VersionNumbers.size() <= Serial)
            m_VersionNumbers.resize(Serial + 1, None);
        if (m_VersionNumbers[Serial] == None) {
            m_VersionNumbers[Serial] = static_cast<std::int32_t>(m_Result.Versions.size());
            Version Made;
            Made.Slot = m_Result.Variables[pOriginal->getDeclaration().Index].Slot;
            Made.Serial = pVariable->getIndex();
            m_Result.Versions.push_back(Made);
        }
        return m_VersionNumbers[Serial];
    }
    std::int32_t definedVersion(ZfCCfgVariable* pVariable) {
        const std::int32_t Number = versionOf(pVariable);
        if (Number == None || !m_Options.ChecksClaims)
            return Number;
        Version& Defined = m_Result.Versions[static_cast<std::size_t>(Number)];
        Defined.Claimed = claimOf(pVariable);
        Defined.IsUndetermined = pVariable->getValue().isUndetermined();
        return Number;
    }
    static Claim claimOf(ZfCCfgVariable* pVariable) {
        Claim Result;
        const ZfCCfgValue& Value = pVariable->getValue();
        if (Value.isConstant()) {
            Result.What = Claim::Kind::Constant;
            Result.Low = Result.High = Value.getValue();
            return Result;
        }
        const ZfCCfgValue Minimum = pVariable->getMinValue();
        const ZfCCfgValue Maximum = pVariable->getMaxValue();
        if (Value.isUndetermined() || !Minimum.isConstant() || !Maximum.isConstant())
            return Result;
        Result.What = Claim::Kind::Range;
        Result.Low = Minimum.getValue();
        Result.High = Maximum.getValue();
        return Result;
    }

    // Expressions, by recursion over the height of one expression

    CodeRange codeOf(const Term* pTerm) {
        CodeRange Result;
        Result.First = static_cast<std::int32_t>(m_Result.Code.size());
        append(pTerm);
        Result.End = static_cast<std::int32_t>(m_Result.Code.size());
        return Result;
    }
    CodeStep& newStep(CodeOp Op) {
        m_Result.Code.emplace_back();
        m_Result.Code.back().Op = Op;
        return m_Result.Code.back();
    }
    void append(const Term* pTerm) {
        switch (pTerm->Op) {
        case Operator::Number:
            newStep(CodeOp::Number).Number = pTerm->Number;
            return;
        case Operator::Variable:
            return appendRead(pTerm->pVariable);
        case Operator::Element:
            append(pTerm->pLeft);
            newStep(CodeOp::LoadElement).A =
                static_cast<std::int32_t>(originalOf(pTerm->pVariable)->getDeclaration().Index);
            return;
        case Operator::Cast:
            append(pTerm->pLeft);
            newStep(CodeOp::Cast).pType = pTerm->pType;
            return;
        case Operator::LogicalAnd:
            return appendShortCircuit(pTerm, CodeOp::SkipIfFalse, CodeOp::IsNotZero);
        case Operator::LogicalOr:
            return appendShortCircuit(pTerm, CodeOp::SkipIfOne, CodeOp::IsOne);
        default:
            append(pTerm->pLeft);
            if (pTerm->pRight != nullptr)
                append(pTerm->pRight);
            newStep(pTerm->pRight != nullptr ? CodeOp::Binary : CodeOp::Unary).Kind = pTerm->Op;
        }
    }
    void appendRead(ZfCCfgVariable* pVariable) {
        const Variable& Read = originalOf(pVariable)->getDeclaration();
        CodeStep& Step =
            newStep(Read.Kind == VariableKind::Input ? CodeOp::LoadInput : CodeOp::Load);
        Step.A = m_Result.Variables[Read.Index].Slot;
        Step.B = Read.Kind == VariableKind::Input ? static_cast<std::int32_t>(Read.Index)
                                                  : versionOf(pVariable);
    }
    void appendShortCircuit(const Term* pTerm, CodeOp Skip, CodeOp End) {
        append(pTerm->pLeft);
        const std::size_t Place = m_Result.Code.size();
        newStep(Skip);
        append(pTerm->pRight);
        newStep(End);
        m_Result.Code[Place].A = static_cast<std::int32_t>(m_Result.Code.size());
    }

    ProgramGraph& m_Program;
    ZfCControlFlowGraph& m_Graph;
    const CodeOptions& m_Options;
    GraphCode& m_Result;
    std::vector<leda::node> m_Nodes;
    std::vector<std::int32_t> m_NodeNumbers;                      // by index of the graph's node
    std::vector<std::int32_t> m_Positions;                        // by index of the graph's edge
    std::vector<std::int32_t> m_VersionNumbers;                   // by serial number of the version
    std::vector<leda::node> m_Entries;                            // by procedure
    std::vector<std::vector<ZfCCfgParamStatement*>> m_Parameters; // likewise: those that stand
    std::unordered_map<std::string, std::int32_t> m_ProcedureNumbers;
    std::vector<bool> m_IsFed; // by Variable::Index
};

} // namespace

GraphCode readGraph(ProgramGraph& Graph, const CodeOptions& Options) {
    GraphCode Result;
    GraphReader(Graph, Options, Result).read();
    return Result;
}

} // namespace hpn::fuzz
