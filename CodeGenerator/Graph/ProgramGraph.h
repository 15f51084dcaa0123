#ifndef PROGRAMGRAPH_H
#define PROGRAMGRAPH_H

#include "Graph/HiddenVariables.h"
#include "Language/Program.h"
#include "Model/Term.h"
#include "Model/ZfCCfgSFVariable.h"
#include "ZfCControlFlowGraph.h"
#include "ZfCSSAControl.h"

#include <deque>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <vector>

class ZfCCfgExternCall;
class ZfCCfgProcedure;

namespace hpn {

/// A label of the program that control reaches, and the node that it begins.
struct LabelPlace {
    SourcePosition Position;
    std::string_view Name;
    const Procedure* pOwner;
    leda::node Node;
};

/// Something about the program that is worth knowing and no mistake.
struct Remark {
    SourcePosition Position;
    std::string Text;
};

/// One run of the optimiser on one program: boots the library, owns the graph, the client's
/// variables and the terms, and takes all of it down again in the right order (graph, variables,
/// shutdown). One at a time in a process.
class ProgramGraph {
public:
    /// Boots the library and fills the graph from a checked program, which must outlive this
    /// object, but for its statements and expressions: nothing refers to them afterwards. One
    /// component for each procedure, every block stamped, every call at the end of a block of its
    /// own, entries set, no exit nodes yet.
    explicit ProgramGraph(const Program& Source);
    ~ProgramGraph();
    ProgramGraph(const ProgramGraph&) = delete;
    ProgramGraph& operator=(const ProgramGraph&) = delete;

    const Program& getProgram() const { return m_Source; }
    ZfCControlFlowGraph& getGraph() { return *m_pGraph; }
    TermArena& getTerms() { return m_Terms; }
    ZfCCfgSFVariable* getVariable(const Variable& Declaration) const;
    /// Locals that the source does not name, in order of making; `pOwner` is the procedure that
    /// they were made in.
    const std::deque<Variable>& getHiddenVariables() const { return m_Hidden.getAll(); }
    /// The declaration behind an extern call statement.
    const Extern* getExtern(const ZfCCfgExternCall* pCall) const;
    /// Where an extern call statement stands in the program text.
    SourcePosition getExternPosition(const ZfCCfgExternCall* pCall) const;
    /// A branch condition that was only put in as a way out that is never taken: the true edge is
    /// always followed. Not emitted.
    bool isNeverLeft(const ZfCCfgExpression* pCondition) const;
    /// Name of the procedure that stands for all callers outside ("#outside"): never emitted.
    static const char* outsideProcedureName() { return "#outside"; }
    /// The source procedure behind a procedure's name on the graph ("#main" for main), or null
    /// (outside, extracted ones).
    const Procedure* findProcedure(const char* Name) const;
    /// The labels as the program was built, in the order of first mention; edits of the graph do
    /// not change them.
    const std::vector<LabelPlace>& getLabels() const { return m_Labels; }
    /// The procedure is exported, or an exported one calls it directly or indirectly.
    bool isReachableFromOutside(const Procedure& Asked) const {
        return m_OutsideReachable[Asked.Index];
    }
    /// Notes a procedure that extraction made, under a name that says where its code comes from.
    void noteExtracted(const std::string& ProcedureName, std::string ReadableName);
    std::size_t countExtracted() const { return m_Extracted.size(); }
    /// The readable name of an extracted procedure; any other name is given back.
    const std::string& readableNameOf(const std::string& ProcedureName) const;
    /// What the passes remarked about the program so far, for the user.
    std::vector<Remark>& getRemarks() { return m_Remarks; }
    /// All calls on the graph, in the order of its nodes.
    std::vector<ZfCCfgProcedureCall*> listCalls() const;
    /// Registers every call on the graph at its callee (for a road without `inlineProcedures`,
    /// which does it itself).
    void appendCalls();
    /// Leads every procedure with several ways into its exit through one last block, so that what
    /// it returns is current at one place when versions are made. For the moment right before SSA
    /// form.
    void joinExits();
    /// Tells that so many edge records may have been given back to the factory by now. What is
    /// still parked when the graph ends would be lost to the process, so the destructor takes it
    /// into use once more.
    void expectParkedEdges(int AtMost) { m_ParkedEdges = AtMost; }

private:
    friend class GraphBuilder;
    void build();
    void takeDown();

    const Program& m_Source;
    ZfCSSAControl m_Control;
    std::unique_ptr<ZfCControlFlowGraph> m_pGraph;
    int m_ParkedEdges = 0; // at most
    HiddenVariables m_Hidden;
    std::vector<std::unique_ptr<ZfCCfgSFVariable>>
        m_Variables; // by Variable::Index, hidden ones behind the others
    std::unordered_map<std::string_view, const Procedure*> m_Procedures;
    TermArena m_Terms;
    struct ExternUse {
        const Extern* pExtern;
        SourcePosition Position;
    };
    std::unordered_map<const ZfCCfgExternCall*, ExternUse> m_Externs;
    std::unordered_set<const ZfCCfgExpression*> m_NeverLeft;
    std::vector<LabelPlace> m_Labels;
    std::vector<bool> m_OutsideReachable;                     // by Procedure::Index
    std::unordered_map<std::string, std::string> m_Extracted; // readable names; looked up only
    std::vector<Remark> m_Remarks;
};

} // namespace hpn

#endif
