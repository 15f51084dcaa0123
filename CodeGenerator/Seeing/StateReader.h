#ifndef STATEREADER_H
#define STATEREADER_H

#include "Graph/ProgramGraph.h"
#include "Language/SourceFiles.h"
#include "Seeing/Recording.h"
#include "Seeing/TermText.h"

#include <string>
#include <unordered_map>
#include <vector>

class ZfCCfgExternCall;
class ZfCCfgExpression;
class ZfCCfgParamStatement;
class ZfCCfgStatement;
class ZfCPhiFunction;

namespace hpn {

/// Reads the graph into the pools of a recording, one snapshot at a time. What has not changed
/// since the snapshot before keeps its state. Only looks: nothing on the graph is changed, nor
/// asked what it keeps for later.
///
/// A version gets its number when it is first seen; those that SSA form brings are numbered in the
/// order of their making, which follows the program text from its start. Cost: one walk over the
/// graph for each snapshot.
class StateReader : public VariableNames {
public:
    /// All three outlive this object. Fills the recording's table of variables.
    StateReader(Recording& Target, const SourceFiles& Sources, ProgramGraph& Program);

    /// Fills in procedures and counts.
    void readSnapshot(RecordedSnapshot& Snapshot);

    void appendName(ZfCCfgVariable* pVariable, std::string& Out) override;
    /// Index of a version; -1 for an original variable.
    int versionOf(ZfCCfgVariable* pVariable);
    int variableOf(ZfCCfgVariable* pVariable) const;
    RecordedPlace placeOf(SourcePosition Position) const;
    RecordedPlace placeOf(ZfCCfgExpression* pExpression) const;
    std::string textOf(ZfCCfgExpression* pExpression);
    std::string textOf(const Term* pTerm);
    /// Index of the latest state of a statement, or -1.
    int stateOf(unsigned StatementId) const;
    /// Where a call or an extern call stands in the text.
    RecordedPlace placeOfCall(ZfCCfgStatement* pCall) const;

private:
    // Version tables
    void describeVariable(ZfCCfgSFVariable* pVariable, bool IsHidden);
    void chooseNames();
    std::string findUnit(const Type& Of) const;
    void noteVersions();

    // Procedures and nodes
    void findProcedures();
    RecordedProcedure beginProcedure(leda::node Entry);
    void readFlow(leda::node v, RecordedProcedure& Target);
    int readNode(leda::node v);
    int shareProcedure(RecordedProcedure State);
    int shareNode(RecordedNode State);
    int shareStatement(RecordedStatement State);

    // Statements
    int readStatement(ZfCCfgStatement* pStatement, leda::node v);
    int readCondition(ZfCCfgExpression* pCondition);
    void describe(ZfCCfgStatement* pStatement, leda::node v, RecordedStatement& State);
    void describeAssignment(ZfCCfgStatement* pStatement, leda::node v, RecordedStatement& State);
    void describeCall(ZfCCfgStatement* pStatement, RecordedStatement& State);
    void describeExtern(ZfCCfgExternCall* pCall, RecordedStatement& State);
    void describeParameter(ZfCCfgParamStatement* pStatement, leda::node v,
                           RecordedStatement& State);
    void describeJoin(ZfCPhiFunction* pPhi, leda::node v, RecordedStatement& State);
    void addReads(ZfCCfgExpression* pExpression, RecordedPlace Otherwise, RecordedStatement& State);
    void addReads(const Term* pTerm, RecordedStatement& State);
    void addRead(ZfCCfgVariable* pVariable, RecordedPlace Place, RecordedStatement& State);
    RecordedPlace placeOfBranchAbove(leda::node v) const;
    RecordedPlace placeOfCallAbove(leda::node v) const;
    RecordedPlace placeBelow(leda::node v) const;
    RecordedPlace placeOfProcedure(leda::node v) const;

    Recording& m_Target;
    const SourceFiles& m_Sources;
    ProgramGraph& m_Program;
    ZfCControlFlowGraph& m_Graph;
    std::vector<std::string> m_Names;                             // by variable, as texts show it
    std::unordered_map<unsigned, int> m_VersionOf;                // by index of the version
    std::unordered_map<unsigned, int> m_StatementOf;              // latest state by id
    std::unordered_map<unsigned, int> m_NodeOf;                   // likewise
    std::unordered_map<std::string, int> m_ProcedureOf;           // likewise, by name
    std::unordered_map<ZfCCfgExpression*, unsigned> m_Conditions; // ids; looked up only
    std::vector<int> m_Owner; // by index of the node: place in the snapshot's procedures, or -1
    std::vector<leda::node> m_Entries; // of the snapshot in hand
};

} // namespace hpn

#endif
