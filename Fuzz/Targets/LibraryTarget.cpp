#include "Targets/Targets.h"

#include "LibraryClient/TestClient.h"
#include "Oracles/Interpreter.h"
#include "Oracles/SSAVerifier.h"

#include "LEDA/graph_alg.h"

#include <algorithm>
#include <vector>

// From bytes to a graph and a road for it.
//
// 1. Plan: for each procedure blocks with statements and any successors, so that loops with several
// entries, self-loops and branches into the middle of anything occur.
// 2. Trim the plan to what the library requires: what is not reached goes, and what cannot reach a
// way out becomes one.
// 3. Build it. Each way of a branch leads through a block of its own.
// 4. Edit: split blocks, delete statements, extract procedures.
// 5. The passes, left out or taken as the bytes say. After each one the form and the outputs.
//
// Recursive programs go the same road; but the interpreter knows no recursion, so that only their
// form is judged. The same for those that do not end within a few hundred blocks.

namespace hpn::fuzz {

namespace {

/// Choices, from the front of the input; behind its end every choice is the first.
class Choices {
public:
    Choices(const std::uint8_t* pData, std::size_t Size) : m_pNext(pData), m_pEnd(pData + Size) {}
    int pick(int Count) { return m_pNext == m_pEnd ? 0 : *m_pNext++ % Count; }
    bool flip() { return pick(2) != 0; }
    bool isOver() const { return m_pNext == m_pEnd; }

private:
    const std::uint8_t* m_pNext;
    const std::uint8_t* m_pEnd;
};

struct PlannedBlock {
    std::string Statements;
    std::string Condition;   ///< empty: no branch
    int Callee = -1;         ///< the block is a call
    std::vector<int> WaysOn; ///< none: leaves the procedure
    bool IsUsed = false;
    leda::node Node = nullptr;
};

using Plan = std::vector<PlannedBlock>;

constexpr int MostProcedures = 4;
constexpr int MostBlocks = 7;
/// Blocks that a program may run through before the passes.
constexpr int LongestRun = 400;
constexpr int LongestRunAfterwards = 40000;

class LibraryTrial {
public:
    LibraryTrial(const std::uint8_t* pData, std::size_t Size) : m_Choices(pData, Size) {
        m_P.output("o1");
        m_P.output("o2");
        m_P.input("in1");
        m_P.input("in2");
        m_P.boolean("f");
        m_P.var("s")->Limit = 3;
    }

    std::string run() {
        passes::Reports Ears(true);
        m_pEars = &Ears;
        makePlans();
        build();
        edit();
        takeRoad();
        return m_Wrong;
    }

private:
    ZfCControlFlowGraph& graph() { return m_P.graph(); }

    // --- 1. Plan ---

    std::string pickVariable() {
        static const char* const Names[] = {"a", "b", "s", "f", "o1", "o2"};
        return Names[m_Choices.pick(6)];
    }
    std::string pickOperand() {
        const int Kind = m_Choices.pick(8);
        return Kind < 3    ? std::to_string(Kind)
               : Kind == 3 ? (m_Choices.flip() ? "in1" : "in2")
                           : pickVariable();
    }
    std::string pickExpression() {
        static const char* const Operators[] = {" + ",  " - ",  " * ", " < ",
                                                " == ", " != ", " & ", " | "};
        std::string Text = (m_Choices.pick(6) == 5 ? "!" : "") + pickOperand();
        if (m_Choices.flip())
            Text += Operators[m_Choices.pick(8)] + pickOperand();
        return Text;
    }
    std::string pickStatements() {
        std::string Text;
        for (int i = m_Choices.pick(4); i > 0; --i) {
            if (m_Choices.pick(8) == 7)
                Text += "extern " + pickVariable() + "; ";
            else
                Text += pickVariable() + " = " + pickExpression() + "; ";
        }
        return Text;
    }
    /// Some forms tell something about a variable in each arm.
    std::string pickCondition() {
        switch (m_Choices.pick(4)) {
        case 0:
            return pickVariable() + " == " + std::to_string(m_Choices.pick(3));
        case 1:
            return pickVariable() + " != " + std::to_string(m_Choices.pick(3));
        case 2:
            return m_Choices.flip() ? "f" : "!f";
        default:
            return pickExpression();
        }
    }

    void makePlans() {
        const int Procedures = 1 + m_Choices.pick(MostProcedures);
        m_IsRecursive = m_Choices.pick(16) == 15;
        for (int i = 0; i < Procedures; ++i) {
            Plan Next(std::size_t(1 + m_Choices.pick(MostBlocks)));
            for (PlannedBlock& Block : Next)
                planBlock(Block, i, Procedures, int(Next.size()));
            trim(Next);
            m_Plans.push_back(std::move(Next));
        }
    }
    void planBlock(PlannedBlock& Block, int Procedure, int Procedures, int Blocks) {
        const int Kind = m_Choices.isOver() ? 0 : m_Choices.pick(8);
        const int FirstCallee = m_IsRecursive ? 1 : Procedure + 1;
        if (Kind == 1 && FirstCallee < Procedures)
            Block.Callee = FirstCallee + m_Choices.pick(Procedures - FirstCallee);
        else
            Block.Statements = pickStatements();
        if (Kind == 0)
            return;
        Block.WaysOn.push_back(m_Choices.pick(Blocks));
        if (Kind >= 4 && Block.Callee < 0) {
            Block.Condition = pickCondition();
            Block.WaysOn.push_back(m_Choices.pick(Blocks));
        }
    }

    // --- 2. Trim ---

    void trim(Plan& Blocks) {
        for (bool IsChanged = true; IsChanged;)
            IsChanged = breakEndlessLoop(Blocks);
        for (PlannedBlock& Block : Blocks)
            Block.IsUsed = false;
        mark(Blocks, 0);
    }
    void mark(Plan& Blocks, int First) {
        std::vector<int> Stack{First};
        while (!Stack.empty()) {
            PlannedBlock& Block = Blocks[std::size_t(Stack.back())];
            Stack.pop_back();
            if (!Block.IsUsed)
                Stack.insert(Stack.end(), Block.WaysOn.begin(), Block.WaysOn.end());
            Block.IsUsed = true;
        }
    }
    /// The first block that no way leads out of becomes one that leaves.
    bool breakEndlessLoop(Plan& Blocks) {
        for (std::size_t i = 0; i < Blocks.size(); ++i) {
            for (PlannedBlock& Block : Blocks)
                Block.IsUsed = false;
            mark(Blocks, int(i));
            const bool Leaves =
                std::any_of(Blocks.begin(), Blocks.end(), [](const PlannedBlock& Block) {
                    return Block.IsUsed && Block.WaysOn.empty();
                });
            if (!Leaves) {
                Blocks[i].WaysOn.clear();
                Blocks[i].Condition.clear();
                return true;
            }
        }
        return false;
    }

    // --- 3. Build ---

    static std::string nameOf(int Procedure) {
        return Procedure == 0 ? "#main" : "p" + std::to_string(Procedure);
    }
    void build() {
        for (std::size_t i = 0; i < m_Plans.size(); ++i) {
            const leda::node Entry = m_P.entry(nameOf(int(i)));
            for (PlannedBlock& Block : m_Plans[i])
                makeBlock(Block);
            // An output that main never writes has no output statement to tell its number.
            const leda::node First = i == 0 ? m_P.block("o1 = o1; o2 = o2;") : m_P.block();
            m_P.edge(Entry, First);
            m_P.edge(First, m_Plans[i][0].Node);
            for (PlannedBlock& Block : m_Plans[i])
                connect(Block, m_Plans[i]);
        }
        expect(!hasReported(), "building");
    }
    void makeBlock(PlannedBlock& Block) {
        if (!Block.IsUsed)
            return;
        Block.Node =
            m_P.block(Block.Statements + (Block.Condition.empty() ? "" : "?" + Block.Condition));
        if (Block.Callee >= 0) {
            auto* pCall = new ZfCCfgProcedureCall(nameOf(Block.Callee).c_str());
            pCall->setIsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(m_IsRecursive);
            m_P.blockOf(Block.Node)->append(pCall);
        }
    }
    void connect(PlannedBlock& Block, Plan& Blocks) {
        if (!Block.IsUsed)
            return;
        const auto target = [&](int i) {
            return Blocks[std::size_t(Block.WaysOn[std::size_t(i)])].Node;
        };
        if (Block.Condition.empty()) {
            if (!Block.WaysOn.empty())
                m_P.edge(Block.Node, target(0));
            return;
        }
        const leda::node Then = m_P.block(), Else = m_P.block();
        m_P.trueEdge(Block.Node, Then);
        m_P.falseEdge(Block.Node, Else);
        m_P.edge(Then, target(0));
        m_P.edge(Else, target(1));
    }

    // --- 4. Edit ---

    void edit() {
        for (int i = m_Choices.pick(5); i > 0; --i) {
            const leda::node v = pickBlock();
            switch (m_Choices.pick(4)) {
            case 0:
                split(v);
                break;
            case 1:
                splitCondition(v);
                break;
            case 2:
                deleteStatement(v);
                break;
            default:
                extract(v);
            }
            expect(!hasReported() && graph().checkConsistency() && !hasReported(), "an edit");
        }
    }
    leda::node pickBlock() {
        std::vector<leda::node> Blocks;
        for (leda::node v : graph().all_nodes())
            if (m_P.blockOf(v) != nullptr)
                Blocks.push_back(v);
        return Blocks[std::size_t(m_Choices.pick(int(std::min<std::size_t>(Blocks.size(), 256))))];
    }
    ZfCCfgStatement* pickStatement(leda::node v) {
        std::vector<ZfCCfgStatement*> Statements;
        for (ZfCCfgStatement* pStmt : m_P.blockOf(v)->getStatementSeq())
            Statements.push_back(pStmt);
        return Statements.empty() ? nullptr
                                  : Statements[std::size_t(m_Choices.pick(int(Statements.size())))];
    }
    void split(leda::node v) {
        ZfCCfgStatement* pStmt = pickStatement(v);
        if (pStmt == nullptr)
            return;
        const leda::node w = graph().splitAtStatement(v, pStmt);
        expect(m_P.blockOf(w)->getStatementSeq().front() == pStmt, "splitAtStatement");
    }
    void splitCondition(leda::node v) {
        ZfCCfgExpression* pCondition = m_P.blockOf(v)->getBranchCond();
        if (pCondition == nullptr)
            return;
        const leda::node w = graph().splitAtCondition(v);
        expect(m_P.blockOf(w)->getBranchCond() == pCondition &&
                   m_P.blockOf(w)->getStatementSeq().empty(),
               "splitAtCondition");
        expect(graph().findBranchNode(v, pCondition) == w, "findBranchNode");
    }
    void deleteStatement(leda::node v) {
        ZfCCfgStatement* pStmt = pickStatement(v);
        if (pStmt != nullptr && pStmt->isProcedureCall() == nullptr && !writesOutput(pStmt))
            m_P.blockOf(v)->del(pStmt);
    }
    bool writesOutput(ZfCCfgStatement* pStmt) {
        ZfCCfgAssignment* pAssignment = pStmt->isAssignment();
        return pAssignment != nullptr && pAssignment->getLHS()->isOutput();
    }
    /// Joins of a procedure without loops only: what a loop leads back to would become a recursion,
    /// and what stands behind the entry node is a procedure already.
    void extract(leda::node v) {
        leda::node_array<int> Component(graph(), 0);
        const bool HasLoop =
            leda::STRONG_COMPONENTS(graph(), Component) != graph().number_of_nodes();
        if (HasLoop || hasSelfLoop() || graph().indeg(v) < 2)
            return;
        ZfCCfgProcedureCall* pUnused = graph().makeProcedureAndCall(v);
        m_P.pFactory->delStatement(pUnused);
        putCallsAlone();
        stampProcedures();
    }
    bool hasSelfLoop() {
        for (leda::edge e : graph().all_edges())
            if (graph().source(e) == graph().target(e))
                return true;
        return false;
    }
    void putCallsAlone() {
        for (leda::node v : graph().all_nodes()) {
            ZfCBasicBlock* pBlock = m_P.blockOf(v);
            if (pBlock != nullptr && pBlock->getStatementSeq().size() > 1 &&
                pBlock->getStatementSeq().back()->isProcedureCall() != nullptr)
                graph().splitAtStatement(v, pBlock->getStatementSeq().back());
        }
    }
    /// A block that extraction makes for a call can bear the stamp of another procedure.
    void stampProcedures() {
        leda::node_array<int> Component(graph(), 0);
        const int Count = leda::COMPONENTS(graph(), Component);
        std::vector<ZfCCfgProcedure*> Procedures(std::size_t(Count), nullptr);
        for (leda::node v : graph().all_nodes())
            if (graph().inf(v)->isEntryNode() != nullptr)
                Procedures[std::size_t(Component[v])] = graph().inf(v)->getProcedure();
        for (leda::node v : graph().all_nodes())
            graph().inf(v)->setProcedure(Procedures[std::size_t(Component[v])]);
    }

    // --- 5. The road ---

    void takeRoad() {
        const int Omitted = m_Choices.pick(256);
        const auto wants = [Omitted](int Bit) { return (Omitted >> Bit & 1) == 0; };
        graph().placeExitNodes();
        joinExits();
        const bool Inlines = wants(0);
        if (!Inlines)
            m_P.registerCalls();
        if (wants(1))
            graph().placeLoopAroundMain();
        expect(!hasReported() && graph().checkConsistency() && !hasReported(), "placing exits");
        m_Expected = outputs(LongestRun);
        m_IsJudgedByOutputs = !m_IsRecursive && m_Expected.find("too many") == std::string::npos;
        if (Inlines) {
            graph().inlineProcedures();
            judge("inlining", false);
        }
        if (wants(2))
            graph().insertValidConditionAssignments();
        graph().transformToSSAForm();
        judge("transformation", true);
        graph().divideBasicBlock();
        judge("division", true);
        if (wants(1) && wants(3))
            propagate(wants);
        if (wants(6)) {
            graph().removeUnusedVarDefs();
            judge("removal of unused definitions", true);
        }
        graph().hoistCodeOutOfIfElseBranches();
        judge("hoisting", true);
    }
    /// Returned values are renamed along the first way into an exit node; a second one would find
    /// versions already, so there is only one.
    void joinExits() {
        for (leda::node v : leda::list<leda::node>(graph().all_nodes())) {
            if (graph().inf(v)->isExitNode() == nullptr || graph().indeg(v) < 2)
                continue;
            const leda::node Last = m_P.block();
            m_P.blockOf(Last)->setProcedure(graph().inf(v)->getProcedure());
            for (leda::edge e : leda::list<leda::edge>(graph().in_edges(v)))
                graph().move_edge(e, graph().source(e), Last);
            m_P.edge(Last, v);
        }
    }
    template <class Wants>
    void propagate(const Wants& wants) {
        graph().propagateSparseConditionalConstant(wants(4));
        judge("propagation", true);
        if (!wants(5))
            return;
        graph().replaceConstantConditions();
        judge("constant conditions", true);
        graph().replaceConstantVariables();
        judge("constant variables", true);
        graph().foldConstants();
        judge("folding", true);
    }

    std::string outputs(int LongestRun) {
        std::string Text;
        for (unsigned Seed = 0; Seed < 2; ++Seed)
            for (int Rounds = 1; Rounds <= 3 && !m_IsRecursive; Rounds += 2)
                Text += passes::Interpreter(m_P, Seed, Rounds, LongestRun).run() + "\n";
        return Text;
    }
    bool hasReported() { return !m_pEars->silent(); }
    void judge(const char* pPass, bool IsSSA) {
        expect(!hasReported(), pPass);
        const std::string Violations = IsSSA ? passes::verifySSA(graph()) : "";
        expect(Violations.empty(), pPass, Violations);
        if (!m_IsJudgedByOutputs || !m_Wrong.empty())
            return;
        const std::string Found = outputs(LongestRunAfterwards);
        expect(Found == m_Expected, pPass, m_Expected + "became\n" + Found);
    }
    /// Keeps the first thing that is wrong.
    void expect(bool IsRight, const char* pStep, const std::string& Detail = "") {
        if (IsRight || !m_Wrong.empty())
            return;
        m_Wrong = std::string("after ") + pStep + "\n" + Detail;
        for (const std::string& Text : m_pEars->Messages)
            m_Wrong += Text + "\n";
        for (const std::string& Text : passes::Reports::assertions())
            m_Wrong += "assertion " + Text + "\n";
    }

    Choices m_Choices;
    passes::Program m_P;
    passes::Reports* m_pEars = nullptr;
    std::vector<Plan> m_Plans;
    bool m_IsRecursive = false;
    bool m_IsJudgedByOutputs = false;
    std::string m_Expected;
    std::string m_Wrong;
};

} // namespace

std::string judgeLibrary(const std::uint8_t* pData, std::size_t Size) {
    return LibraryTrial(pData, Size).run();
}

} // namespace hpn::fuzz
