#ifndef GRAPHBUILDER_H
#define GRAPHBUILDER_H

#include "Graph/FlowSketch.h"
#include "Graph/ProgramGraph.h"

#include <vector>

class ZfCBasicBlock;
class ZfCCfgProcedure;
class ZfCCfgSFExpression;
class ZfCCfgSFProcedureCall;

namespace hpn {

/// Fills a program graph from a checked program, as a client of the library does it: entry nodes,
/// blocks, true and false edges, statements by `new`, arguments by `setParametersOfCall`. Used
/// once, by the constructor of `ProgramGraph`. Linear.
class GraphBuilder {
public:
    explicit GraphBuilder(ProgramGraph& Target);
    void build();

private:
    // Procedures and their flow
    void makeVariables();
    void makeProcedures();
    void buildProcedure(const Procedure& Source);
    void makeBlocks(const FlowSketch& Sketch);
    void linkBlocks(const FlowSketch& Sketch);
    void noteLabels(const Procedure& Source, const FlowSketch& Sketch);
    void buildPrologue(const Procedure& Source, bool ZeroesLocals);
    ZfCCfgExpression* makeCondition(const SketchBlock& Block);
    ZfCBasicBlock* newBlock(leda::node& Node);
    void link(leda::node From, leda::node To, ZfCCfgEdgeInfo* pEdge);

    // Statements
    void buildAction(const Action& Next, ZfCBasicBlock* pBlock);
    void buildAssignment(const Statement& Source, ZfCBasicBlock* pBlock);
    void buildElementAssignment(const Statement& Source, ZfCBasicBlock* pBlock);
    void assignHidden(const Variable& Hidden, Term* pValue, SourcePosition Position,
                      ZfCBasicBlock* pBlock);
    void prepareCall(const Statement& Source, ZfCBasicBlock* pBlock);
    void buildCall(const Statement& Source, ZfCBasicBlock* pBlock);
    void takeResult(const Statement& Source, ZfCBasicBlock* pBlock);
    void callExtern(const Statement& Source, ZfCBasicBlock* pBlock);
    void append(ZfCCfgSFVariable* pLHS, Term* pRHS, SourcePosition Position, ZfCBasicBlock* pBlock);
    void appendStore(const Statement& Source, Term* pIndex, Term* pValue, ZfCBasicBlock* pBlock);
    void handOver(ZfCCfgSFProcedureCall* pCall);

    // Terms
    Term* makeTerm(const Expression* pSource);
    Term* makeElement(const Variable& Array, Term* pIndex, SourcePosition Position);
    Term* convert(const Type* pType, Term* pValue, SourcePosition Position);
    ZfCCfgSFExpression* makeExpression(Term* pRoot);
    ZfCCfgSFVariable* variableOf(const Variable& Declaration);
    const Variable& makeHidden(const char* pStem, SourcePosition Position);

    // What the outside can do
    void buildOutside();
    void callFromOutside(const Procedure& Exported, ZfCBasicBlock* pBlock);
    void markExternVariables();
    void markRecursiveVariables();
    std::vector<bool> findOutsideReachable() const;
    void markOutsideVariables(const std::vector<bool>& Reachable, std::vector<bool>& Touched);
    void markErasable(const std::vector<bool>& Touched);
    void flagCalls(const std::vector<bool>& Reachable);

    ProgramGraph& m_Target;
    const Program& m_Source;
    ZfCControlFlowGraph& m_Graph;
    TermArena& m_Terms;

    std::vector<ZfCCfgProcedure*> m_Procedures;           // by Procedure::Index
    std::vector<std::vector<const Procedure*>> m_Callees; // by Procedure::Index of the caller
    std::vector<ZfCCfgSFProcedureCall*> m_Calls;

    // Of the procedure in hand.
    const Procedure* m_pCurrent = nullptr;
    ZfCCfgProcedure* m_pCurrentProcedure = nullptr;
    std::vector<leda::node> m_Nodes;      // by block of the sketch; null: not reached
    std::vector<ZfCBasicBlock*> m_Blocks; // likewise
    std::vector<const Variable*>
        m_PreparedArguments; // of the next call, by position; null: stands in the call
};

} // namespace hpn

#endif
