#include "ModelTestSupport.h"
#include "ZfCCfgIteratorNodesEdges.h"
#include "ZfCCfgVisitorSSADot.h"
#include "ZfCControlFlowGraph.h"

#include <fstream>
#include <sstream>
#include <unistd.h>

// The walk over a graph and the dump, byte for byte.

namespace {

class Dump : public ZfCCfgVisitorSSADot {
public:
    Dump(ZfCControlFlowGraph* pCfg, bool PrintSSAEdges, bool SimpleOutput)
        : ZfCCfgVisitorSSADot(pCfg, PrintSSAEdges, SimpleOutput) {}
    using ZfCCfgVisitorSSADot::getIndex;
    using ZfCCfgVisitorSSADot::handleSymbolsInStream;
    using ZfCCfgVisitorSSADot::printEdge;
    using ZfCCfgVisitorSSADot::printUsedVariables;
};

class ForeignVisitor : public ZfCCfgVisitor {};

class VisitorTest : public ModelTest {
protected:
    ~VisitorTest() override { endGraph(); }

    void endGraph() { m_pCfg.reset(); }

    // An edge of the given record between two nodes.
    void connect(leda::node v, leda::node w, ZfCCfgEdgeInfo* pEdge) {
        m_pCfg->new_edge(v, w, pEdge);
    }

    leda::node add(ZfCCfgNodeInfo* pNodeInfo) { return m_pCfg->new_node(pNodeInfo); }

    // What a file holds; the file goes.
    static std::string takeFile(const std::string& Name) {
        std::stringstream Text;
        Text << std::ifstream(Name).rdbuf();
        EXPECT_EQ(0, std::remove(Name.c_str())) << Name;
        return Text.str();
    }

    static std::string baseName() {
        return testing::TempDir() + "hpnssa_dump_" + std::to_string(::getpid());
    }

    std::string dump(Dump& Visitor) {
        Visitor.openFile(baseName().c_str());
        ZfCCfgIteratorNodesEdges(&Visitor).iterate(m_pCfg.get());
        Visitor.closeFile();
        return takeFile(baseName() + "_SF_" + std::to_string(Visitor.getIndex()) + ".dot");
    }

    std::string dump(bool PrintSSAEdges = true, bool SimpleOutput = false) {
        Dump Visitor(m_pCfg.get(), PrintSSAEdges, SimpleOutput);
        return dump(Visitor);
    }

    // Every kind of node, statement, expression and edge once. Variables 0 to 7 are plain, but for
    // the markers of 4 and 7.
    void fillWithEverything();

    Variable m_Variables[8];
    std::unique_ptr<ZfCControlFlowGraph> m_pCfg = std::make_unique<ZfCControlFlowGraph>();
};

void VisitorTest::fillWithEverything() {
    Variable* const v = m_Variables;
    ZfCCfgProcedure* const pProcedure = factory().createProcedure();
    pProcedure->setName("#main");
    ZfCCfgEntry* const pEntry = factory().createEntryNode();
    pEntry->setProcedure(pProcedure);
    ZfCBasicBlock* const pBlock = factory().createBasicBlock();
    v[4].markAsArray();
    v[4].markAsVolatile();
    v[7].markAsErasable();

    ZfCPhiFunction* const pPhi = new ZfCPhiFunction(&v[1], 2);
    pPhi->setReplacementVariable(0, &v[3]);
    pPhi->setReplacementVariable(1, &v[2]);
    pBlock->append(pPhi);

    ZfCCfgInitAssignment* const pInit = new ZfCCfgInitAssignment;
    pInit->setLHS(&v[4]);
    pInit->setRHS(factory().createValueExpression(ZfCCfgValue(0.123456789)));
    pBlock->append(pInit);

    leda::list<ZfCCfgVariable*> None;
    pBlock->append(new ZfCCfgExternCall(&None));
    ZfCCfgProcedureCall* const pCall = new ZfCCfgProcedureCall("f");
    ZfCCfgProcedureCall* const pOutsideCall = new ZfCCfgProcedureCall("g");
    pOutsideCall->setIsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(true);
    pBlock->append(pCall);
    pBlock->append(pOutsideCall);

    ZfCCfgValueReturnStatement* const pReturn = new ZfCCfgValueReturnStatement(&v[5]);
    ZfCCfgExplicitVarUse* const pUse = factory().createExplicitVarUse();
    pUse->addVariable(&v[6]);
    pReturn->setExpression(pUse);
    pBlock->append(pReturn);

    ZfCCfgParamStatement* const pParam = new ZfCCfgParamStatement(&v[7]);
    pParam->setParamExpression(pCall, factory().createValueExpression());
    pParam->setParamExpression(pOutsideCall,
                               factory().createValueExpression(ZfCCfgValue(eCfgValueNonConstant)));
    pBlock->append(pParam);
    pBlock->append(new ZfCCfgOutputStatement(&v[0]));

    Expression* const pCondition = new Expression;
    factory().addSFExpression(pCondition);
    pCondition->m_Used.insert(&v[2]);
    pCondition->m_Used.insert(&v[0]);
    pBlock->appendBranch(pCondition);

    const leda::node e = add(pEntry);
    const leda::node n = add(pBlock);
    const leda::node empty = add(factory().createBasicBlock());
    const leda::node x = add(factory().createExitNode());
    connect(e, n, factory().createEdgeInfo());
    connect(n, empty, factory().createTrueBranch());
    connect(n, x, factory().createFalseBranch());
    connect(n, empty, factory().createSSAEdge());
    connect(empty, x, factory().createEdgeInfo());
}

TEST_F(VisitorTest, FullDumpShowsEveryKindOfObject) {
    fillWithEverything();
    EXPECT_EQ("digraph G {\n"
              "size = \"100,100\";\n"
              "  Node_0[label = \"EN_0\\n#main\", color=green];\n"
              "  Node_1[label = \"{BB_1"
              " | PhiFct(ind:0): Var_1 () = ( Var_2 (),  Var_3 (), )"
              " | InitAss(ind:1): Def:( Var_4 ( A  V ))  = 0.123457(c)"
              " | ExternCall((ind:2):"
              " | ProcCall(ind:3):f"
              " | ProcCall(ind:4):g (no Inlining)"
              " | VRStmt(ind:5): Var_5 () =  eVarUse:  Var_6 ()"
              " | PaStmt(ind:6): Var_7 ( E )(0(un)) = (0(un), 0(nc), )"
              " | OutStmt(ind:7): Var_0 ()"
              "| Branch: Use:( Var_0 (), Var_2 (),) Exp"
              "}\", shape=record ];\n"
              "  Node_2[label = \"{BB_2}\", shape=record  , style=filled, fillcolor=yellow];\n"
              "  Node_3[label = \"EX_3\", color=red];\n"
              "Node_0 -> Node_1;\n"
              "Node_1 -> Node_2[label=\"true\", color = green];\n"
              "Node_1 -> Node_3[label=\"false\", color = red];\n"
              "Node_1 -> Node_2[label=\"ssa\", color = blue];\n"
              "Node_2 -> Node_3;\n"
              "\n}\n",
              dump());
}

TEST_F(VisitorTest, SimpleDumpLeavesOutMarkersAndMeaninglessNumbers) {
    fillWithEverything();
    const std::string Text = dump(false, true);
    for (const char* Part :
         {" | PhiFct(ind:0): Var_1 = ( Var_2,  Var_3, )", " | InitAss(ind:1): Var_4 = 0.123457(c)",
          " | PaStmt(ind:6): Var_7((un)) = ((un), (nc), )", "| Branch: Use:( Var_0, Var_2,) Exp"})
        EXPECT_NE(std::string::npos, Text.find(Part)) << Part;
    // Without SSA edges that one line is gone and no other.
    std::string WithEdges = dump(true, true);
    const std::string Line = "Node_1 -> Node_2[label=\"ssa\", color = blue];\n";
    WithEdges.erase(WithEdges.find(Line), Line.size());
    EXPECT_EQ(WithEdges, Text);
}

TEST_F(VisitorTest, EmptyGraphIsAFrameAndASecondVisitorHasTheNextNumber) {
    EXPECT_EQ("digraph G {\nsize = \"100,100\";\n\n}\n", dump());
    const unsigned int Index = Dump(nullptr, true, false).getIndex();
    endGraph();
    m_Control.shutdown();
    m_Control.boot(); // starts all other numbers anew
    EXPECT_EQ(Index + 1, Dump(nullptr, true, false).getIndex());
}

TEST_F(VisitorTest, VisitorThatIsNoSSAVisitorSeesNothing) {
    fillWithEverything();
    ForeignVisitor Visitor;
    ZfCCfgIteratorNodesEdges Walker(&Visitor);
    Walker.iterate(m_pCfg.get());
    m_Variables[0].accept(&Visitor);
    m_Variables[0].accept(nullptr);
    EXPECT_EQ(4, m_pCfg->number_of_nodes());
}

TEST_F(VisitorTest, FileThatCannotBeOpenedSwallowsTheDump) {
    fillWithEverything();
    Dump Visitor(m_pCfg.get(), true, false);
    Visitor.openFile("/nowhere/at/all");
    ZfCCfgIteratorNodesEdges(&Visitor).iterate(m_pCfg.get());
    Visitor.closeFile();
    EXPECT_TRUE(m_Reports.m_Messages.empty());
}

TEST_F(VisitorTest, TableHasOneRowForEachPrintedVariableByRisingIndex) {
    ZfCCfgValue Value = 2.5;
    m_Variables[5].setVarValueAndAdjustCfgValue(Value);
    m_Variables[7].markAsArray();
    m_Variables[7].markAsErasable();
    m_Variables[7].markAsVolatile();
    struct Plain : Variable {
        ZfCCfgSFVariable* isSFVariable() override { return nullptr; }
    } Other;
    ZfCSSAVariable* const pVersion = factory().createSSAVariable(&m_Variables[5]);
    factory().delSSAVariable(pVersion);
    EXPECT_EQ(pVersion,
              factory().createSSAVariable(&m_Variables[5])); // index 10, still sorted by 9 in sets
    Dump Visitor(nullptr, true, false);
    const auto table = [&Visitor] {
        Visitor.printAllVariables(baseName().c_str());
        return takeFile(baseName() + "_SF_" + std::to_string(Visitor.getIndex()) + ".html");
    };
    const std::string Head =
        "<html>\n<table border=\"1\">\n"
        "  <tr><td colspan=\"6\" align=center><h1>Used Variables</h1></td></tr>\n"
        "  <tr><td>Variable</td><td>Type</td><td>Value</td><td>Array</td>"
        "<td>Erasable</td><td>Volatile</td></tr>\n";
    EXPECT_EQ(Head + "</table>\n</html>", table());
    Visitor.visit(pVersion);
    for (const int i : {7, 2, 5, 2})
        m_Variables[i].accept(&Visitor);
    Other.accept(&Visitor);
    const std::string Unmarked = "<td>&#160;</td><td>&#160;</td><td> &#160;</td></tr>\n";
    EXPECT_EQ(Head + "  <tr><td>Var_2_</td><td>SF</td><td>(un)</td>" + Unmarked +
                  "  <tr><td>Var_5_</td><td>SF</td><td>2.5(c)</td>" + Unmarked +
                  "  <tr><td>Var_7_</td><td>SF</td><td>(nc)</td>"
                  "<td>X</td><td>X</td><td> X</td></tr>\n"
                  "  <tr><td>Var_8_</td><td>NA</td><td>(un)</td>" +
                  Unmarked + "  <tr><td>Var_10_</td><td>SSA (Orig: Var_5_)</td><td>(un)</td>" +
                  Unmarked + "</table>\n</html>",
              table());
}

TEST_F(VisitorTest, LabelSymbolsAreMasked) {
    Dump Visitor(nullptr, true, false);
    std::stringstream In;
    std::ostringstream Out;
    In << "a<b|c>d\\\n{}";
    Visitor.handleSymbolsInStream(In, Out);
    EXPECT_EQ("a\\<b\\|c\\>d\\\n{}", Out.str());
}

} // namespace
