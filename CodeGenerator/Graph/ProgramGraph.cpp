#include "Graph/ProgramGraph.h"

#include "Graph/GraphBuilder.h"
#include "ZfCCfgExternCall.h"
#include "ZfCCfgProcedure.h"

#include <utility>

namespace hpn {

ProgramGraph::ProgramGraph(const Program& Source) : m_Source(Source), m_Hidden(Source) {
    m_Control.boot();
    try {
        build();
    } catch (...) { // memory has run out
        takeDown();
        throw;
    }
}

ProgramGraph::~ProgramGraph() {
    takeDown();
}

void ProgramGraph::build() {
    m_pGraph = std::make_unique<ZfCControlFlowGraph>();
    for (const Procedure& Known : m_Source.Procedures) {
        if (!Known.IsMain)
            m_Procedures.emplace(Known.Name, &Known);
    }
    GraphBuilder(*this).build();
}

// The graph's end empties the factory, whose versions still name the client's variables; the
// variables' sets of nodes use the library until they end.
void ProgramGraph::takeDown() {
    for (int i = 0; i < m_ParkedEdges; ++i)
        ZfCCfgFactory::getInstance()->createEdgeInfo();
    m_pGraph.reset();
    m_Variables.clear();
    m_Control.shutdown();
    // The next graph's memory is in order again, and its program's text may have it first.
    leda::std_memory_mgr.release_chunks();
}

ZfCCfgSFVariable* ProgramGraph::getVariable(const Variable& Declaration) const {
    return m_Variables[Declaration.Index].get();
}

const Extern* ProgramGraph::getExtern(const ZfCCfgExternCall* pCall) const {
    const auto Found = m_Externs.find(pCall);
    return Found != m_Externs.end() ? Found->second.pExtern : nullptr;
}

SourcePosition ProgramGraph::getExternPosition(const ZfCCfgExternCall* pCall) const {
    const auto Found = m_Externs.find(pCall);
    return Found != m_Externs.end() ? Found->second.Position : SourcePosition{};
}

bool ProgramGraph::isNeverLeft(const ZfCCfgExpression* pCondition) const {
    return m_NeverLeft.count(pCondition) != 0;
}

const Procedure* ProgramGraph::findProcedure(const char* Name) const {
    const std::string_view Wanted = Name;
    if (Wanted == "#main")
        return m_Source.pMain;
    const auto Found = m_Procedures.find(Wanted);
    return Found != m_Procedures.end() ? Found->second : nullptr;
}

void ProgramGraph::noteExtracted(const std::string& ProcedureName, std::string ReadableName) {
    m_Extracted[ProcedureName] = std::move(ReadableName);
}

const std::string& ProgramGraph::readableNameOf(const std::string& ProcedureName) const {
    const auto Found = m_Extracted.find(ProcedureName);
    return Found != m_Extracted.end() ? Found->second : ProcedureName;
}

std::vector<ZfCCfgProcedureCall*> ProgramGraph::listCalls() const {
    std::vector<ZfCCfgProcedureCall*> Calls;
    for (leda::node v = m_pGraph->first_node(); v != m_pGraph->stop_node();
         v = m_pGraph->next_node(v)) {
        ZfCBasicBlock* pBlock = m_pGraph->inf(v)->isBasicBlock();
        if (pBlock == nullptr)
            continue;
        for (ZfCCfgStatement* pStatement : pBlock->getStatementSeq()) {
            if (ZfCCfgProcedureCall* pCall = pStatement->isProcedureCall())
                Calls.push_back(pCall);
        }
    }
    return Calls;
}

void ProgramGraph::appendCalls() {
    for (ZfCCfgProcedureCall* pCall : listCalls()) {
        ZfCCfgProcedure* pCallee = nullptr;
        m_pGraph->demandProcedureEntryNode(pCall->getName(), pCallee);
        pCallee->appendCall(pCall);
    }
}

void ProgramGraph::joinExits() {
    ZfCControlFlowGraph& Graph = *m_pGraph;
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    const leda::list<leda::node> Nodes = Graph.all_nodes();
    for (leda::node Exit : Nodes) {
        if (Graph.inf(Exit)->isExitNode() == nullptr || Graph.indeg(Exit) < 2)
            continue;
        ZfCBasicBlock* pLast = pFactory->createBasicBlock();
        pLast->setProcedure(Graph.inf(Exit)->getProcedure());
        leda::node Last = Graph.new_node(pLast);
        const leda::list<leda::edge> InEdges = Graph.in_edges(Exit);
        for (leda::edge e : InEdges)
            Graph.move_edge(e, Graph.source(e), Last);
        Graph.new_edge(Last, Exit, pFactory->createEdgeInfo());
    }
}

} // namespace hpn
