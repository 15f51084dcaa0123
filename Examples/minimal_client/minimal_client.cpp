// The smallest client that goes the whole road: a program by hand, every pass, read back.
#include "ZfCBasicDataType.h"
#include "ZfCCfgIteratorNodesEdges.h"
#include "ZfCCfgVisitorSSADot.h"
#include "ZfCControlFlowGraph.h"
#include "ZfCSSAControl.h"
#include "ZfCSSAVariable.h"
#include <cstdio>
#include <string>
using VariableSet = leda::set<ZfCCfgVariable*, leda::avl_tree>;
static ZfCControlFlowGraph* s_pGraph;
static const auto factory = &ZfCCfgFactory::getInstance;
class ZfCCfgSFVariable : public ZfCCfgVariable { // a float64: 'i'nput, 'o'utput or 's'tate
public:
    ZfCCfgSFVariable(const char* pName, char Kind) : m_pName(pName), m_Kind(Kind) {
        Kind == 'i' ? markAsVolatile() : Kind == 's' ? markAsErasable() : void();
    }
    ZF_DataType* getDataType() override { return ZfCBasicDataType::float64(); }
    ZF_Scaling* getScaling() override { return nullptr; }
    bool isUpperBorderSaturated() override { return false; }
    bool isLowerBorderSaturated() override { return false; }
    double getUpperLimit() override { return 0.0; }
    double getLowerLimit() override { return 0.0; }
    ZfCCfgValue getInitValue() override { return m_Kind == 'i' ? getValue() : ZfCCfgValue(0.0); }
    bool isOutput() override { return m_Kind == 'o'; }
    ZfCCfgSFVariable* isSFVariable() override { return this; }
    const char* const m_pName;
    const char m_Kind;
};
class ZfCCfgSFExpression : public ZfCCfgExpression { // variable op number, or the number alone
public:
    ZfCCfgSFExpression(ZfCCfgVariable* pRead, char Op, double Number)
        : m_pRead(pRead), m_Op(Op), m_Number(Number) {
        factory()->addSFExpression(this);
    }
    VariableSet getUsedVariables() override {
        VariableSet Used;
        if (m_pRead)
            Used.insert(m_pRead);
        return Used;
    }
    void replaceVariable(ZfCCfgVariable* pOld, ZfCCfgVariable* pNew) override {
        m_pRead = m_pRead == pOld ? pNew : m_pRead;
    }
    void replaceConditionWithConstant(double x) override { m_pRead = nullptr, m_Number = x; }
    ZfCCfgValue evaluate() override {
        ZfCCfgValue Read = m_pRead ? m_pRead->getValue() : ZfCCfgValue(0.0), Number(m_Number);
        return m_pRead && m_Op == '=' ? Read == Number : Read + Number;
    }
    ZfCCfgValue getMinimum() override { return evaluate(); }
    ZfCCfgValue getMaximum() override { return evaluate(); }
    void replaceConstantVariables() override { foldConstants(); }
    void replaceConstantCondition() override { foldConstants(); }
    void foldConstants() override {
        if (evaluate().isConstant())
            replaceConditionWithConstant(evaluate().getValue());
    }
    bool isVariableEqualToConstant(ZfCCfgVariable*& p, ZfCCfgValue& Number, bool& Not) override {
        p = m_pRead, Number = ZfCCfgValue(m_Number), Not = false;
        return p && m_Op == '=' && !p->isVolatile() && m_Number != 0.0; // zero has two signs
    }
    void actOnComparisonOutsideBoolRange() override {}
    std::string getText() {
        ZfCSSAVariable* pVersion = m_pRead ? m_pRead->isSSAVariable() : nullptr;
        ZfCCfgVariable* pOriginal = pVersion ? pVersion->getOrigVar() : m_pRead;
        const std::string Number = std::to_string(static_cast<int>(m_Number));
        return m_pRead ? pOriginal->isSFVariable()->m_pName + (m_Op + Number) : Number;
    }
    ZfCCfgVariable* m_pRead;
    char m_Op;
    double m_Number;
};
class ZfCCfgSFAssignment : public ZfCCfgAssignment { // offers nothing to the hoisting
public:
    ZfCCfgSFAssignment(ZfCCfgSFVariable& To, ZfCCfgVariable* pFrom, double Number)
        : m_To(To), m_pFrom(new ZfCCfgSFExpression(pFrom, '+', Number)) {
        setLHS(&To), setRHS(m_pFrom);
    }
    std::string getText() { return std::string(m_To.m_pName) + " = " + m_pFrom->getText(); }
    ZfCCfgSFAssignment* isSFAssignment() override { return this; }
    ZfCCfgStatement* clone() override { return nullptr; } // no pass copies
    void foldConstants() override { m_pFrom->foldConstants(); }
    void accept(ZfCCfgVisitor* p) override { // step 12: the dump, and the code as text
        static_cast<ZfCCfgVisitorSSADot*>(p)->visit(static_cast<ZfCCfgAssignment*>(this));
        std::puts(getText().c_str());
    }
    ZfCCfgSFVariable& m_To;
    ZfCCfgSFExpression* m_pFrom;
};
static leda::node block(ZfCCfgProcedure* pOwner, std::initializer_list<ZfCCfgStatement*> Code) {
    ZfCBasicBlock* pBlock = factory()->createBasicBlock();
    pBlock->setProcedure(pOwner);
    for (ZfCCfgStatement* pStatement : Code)
        pBlock->append(pStatement);
    return s_pGraph->new_node(pBlock);
}
static void branch(leda::node v, ZfCCfgVariable& Read, double x, leda::node True,
                   leda::node False) {
    s_pGraph->inf(v)->isBasicBlock()->appendBranch(new ZfCCfgSFExpression(&Read, '=', x));
    s_pGraph->new_edge(v, True, factory()->createTrueBranch());
    s_pGraph->new_edge(v, False, factory()->createFalseBranch());
}
// main:     x = 2; if (mode == 1) { z = 5; } else { z = x + 7; }
//           if (z == 5) { out = z + 1; } else { scale(x); } // both go on at a shared tail:
//           if (x == 4) { out = 0; }       scale(n): out = n + 10;
int main(int Count, char** ppWords) {
    ZfCSSAControl().boot();
    ZfCCfgSFVariable Mode("mode", 'i'), Out("out", 'o'), X("x", 's'), Z("z", 's'), N("n", 's');
    ZfCControlFlowGraph& G = *(s_pGraph = new ZfCControlFlowGraph);
    using Set = ZfCCfgSFAssignment;
    ZfCCfgProcedure *pMain, *pScale;
    const leda::node M = G.demandProcedureEntryNode("#main", pMain);
    const leda::node R = G.demandProcedureEntryNode("scale", pScale);
    G.setStartNode(M);
    auto* pCall = new ZfCCfgProcedureCall("scale");
    const leda::node A = block(pMain, {new Set(X, nullptr, 2)}), D = block(pMain, {});
    const leda::node B = block(pMain, {new Set(Z, nullptr, 5)}), T = block(pMain, {});
    const leda::node C = block(pMain, {new Set(Z, &X, 7)}), H = block(pMain, {});
    const leda::node E = block(pMain, {new Set(Out, &Z, 1)}), F = block(pMain, {pCall});
    const leda::node I = block(pMain, {new Set(Out, nullptr, 0)}), J = block(pMain, {});
    const leda::node S = block(pScale, {new Set(Out, &N, 10)});
    for (auto [From, To] : {std::pair(M, A), {R, S}, {B, D}, {C, D}, {E, T}, {F, H}, {H, T}})
        G.new_edge(From, To, factory()->createEdgeInfo());
    branch(A, Mode, 1, B, C);
    branch(D, Z, 5, E, F);
    branch(T, X, 4, I, J);
    leda::list<ZfCCfgVariable*> Formals;
    leda::list<ZfCCfgExpression*> Arguments;
    Formals.append(&N), Arguments.append(new ZfCCfgSFExpression(&X, '+', 0));
    G.setParametersOfCall(pCall, Formals, Arguments);
    factory()->delStatement(G.makeProcedureAndCall(T)); // no call beyond those for the jumps
    G.placeExitNodes();
    G.inlineProcedures();
    G.placeLoopAroundMain();
    G.insertValidConditionAssignments();
    G.transformToSSAForm();
    G.divideBasicBlock();
    G.propagateSparseConditionalConstant(true);
    G.replaceConstantConditions();
    G.replaceConstantVariables();
    G.foldConstants();
    G.removeUnusedVarDefs();
    G.hoistCodeOutOfIfElseBranches();
    ZfCCfgVisitorSSADot Dump(&G, true, false);
    Dump.openFile(Count > 1 ? ppWords[1] : "minimal_client");
    ZfCCfgIteratorNodesEdges(&Dump).iterate(&G);
    Dump.closeFile();
    delete s_pGraph;
    ZfCSSAControl().shutdown();
}
