#ifndef ZFCBASICBLOCK_H
#define ZFCBASICBLOCK_H

#include "LEDA/list.h"
#include "ZfCCfgExpression.h"
#include "ZfCCfgNodeInfo.h"
#include "ZfCCfgStatement.h"
#include "ZfCPhiFunction.h"

class ZfCCfgVisitor;

// The record of a node that holds code: phi functions, statements in execution order and at most
// one branch condition.
//
// The graph's edges decide where control goes, the condition decides between the out-edges with a
// true and a false record. The block does not know its node and does not own what it lists. Made by
// the factory alone.
class HPNSSA_EXPORT ZfCBasicBlock : public ZfCCfgNodeInfo {
    friend class ZfCCfgFactory;

public:
    ZfCBasicBlock(const ZfCBasicBlock&) = default;
    ZfCBasicBlock& operator=(const ZfCBasicBlock&) = default;

    // The variables of the phi functions, then those that the statements define, in order.
    // Collected at the first call that finds any and kept from then on: later changes of the block
    // are not seen.
    leda::list<ZfCCfgVariable*> const& getAssignedVariables() override;
    // The variables that phi functions, statements and condition use; collected anew at each call.
    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;
    ZfCBasicBlock* isBasicBlock() override;

    // Does something with each variable of getAssignedVariables, and of getUsedVariables, without
    // making the list or the set of them: for sweeps over all blocks. One that is used by several
    // phi functions or statements, or twice by a phi function, comes several times, in no order.
    template <class TAction>
    void forEachAssignedVariable(TAction Do);
    template <class TAction>
    void forEachUsedVariable(TAction Do);

private:
    ZfCBasicBlock();
    ~ZfCBasicBlock() override;
    void initData() override;
    void resetData() override;

public:
    // The statements in the order of execution, and the phi functions; valid until the block
    // changes.
    leda::list<ZfCCfgStatement*> const& getStatementSeq() { return m_StatementSeq; }
    leda::list<ZfCPhiFunction*> const& getPhiFunctions() { return m_PhiFunctions; }
    // The branch condition or null.
    ZfCCfgExpression* getBranchCond() { return m_pBranchCond; }

    // Add to the end of the statements or of the phi functions. The factory still owns what is
    // added, and the uses and versions of its variables are the caller's to keep in order.
    void append(ZfCCfgStatement* pStmt) { m_StatementSeq.append(pStmt); }
    void append(ZfCPhiFunction* pPhiFunction) { m_PhiFunctions.append(pPhiFunction); }
    void append(leda::list<ZfCCfgStatement*> const& Statements);
    void append(leda::list<ZfCPhiFunction*> const& PhiFunctions);
    // Sets the branch condition; an earlier one is not released, null takes it away.
    void appendBranch(ZfCCfgExpression* pCondition) { m_pBranchCond = pCondition; }

    // Takes a statement or phi function out of the block and ends it; one that is not here is left
    // alone and reported as an assertion.
    void del(ZfCCfgStatement* pStmt);

    // Cuts the block before pStmt: the new block takes pStmt and what follows, all phi functions
    // and the condition. This block itself if pStmt stands first, or, after an internal error, if
    // pStmt is not here.
    ZfCBasicBlock* splitAtStatement(ZfCCfgStatement* pStmt);
    // Cuts the block before its condition, which the new block takes; this block itself if it has
    // no statement.
    ZfCBasicBlock* splitAtCondition();

    // The one phi function or statement, if the block holds nothing else; else null.
    ZfCPhiFunction* isPhiFunction();
    ZfCCfgStatement* isStatement();

    // A new block that shares the one statement or phi function with this one; null for any other
    // block. Whoever needs a copy of the statement as well asks the statement.
    ZfCBasicBlock* clone();

    // Whether it holds neither condition nor phi function nor statement.
    bool isEmpty() {
        return m_pBranchCond == nullptr && m_PhiFunctions.empty() && m_StatementSeq.empty();
    }

    // Show the block to an SSA visitor: before its phi functions, before its condition, at its end.
    void acceptStart(ZfCCfgVisitor* pVisitor);
    void acceptBeforeCondition(ZfCCfgVisitor* pVisitor);
    void acceptEnd(ZfCCfgVisitor* pVisitor);

private:
    leda::list<ZfCCfgStatement*> m_StatementSeq;
    leda::list<ZfCPhiFunction*> m_PhiFunctions;
    ZfCCfgExpression* m_pBranchCond;
    leda::list<ZfCCfgVariable*> m_AssignedVariables; // cache of getAssignedVariables
};

template <class TAction>
void ZfCBasicBlock::forEachAssignedVariable(TAction Do) {
    // A list that has been made counts as it stands.
    if (!m_AssignedVariables.empty()) {
        for (ZfCCfgVariable* pVariable : m_AssignedVariables)
            Do(pVariable);
        return;
    }
    for (ZfCPhiFunction* pPhiFunction : m_PhiFunctions)
        Do(pPhiFunction->getVariable());
    for (ZfCCfgStatement* pStmt : m_StatementSeq)
        for (ZfCCfgVariable* pVariable : pStmt->getDefinedVariables())
            Do(pVariable);
}

template <class TAction>
void ZfCBasicBlock::forEachUsedVariable(TAction Do) {
    for (ZfCPhiFunction* pPhiFunction : m_PhiFunctions) {
        leda::array<ZfCCfgVariable*> const& Operands = pPhiFunction->showReplacementVariables();
        for (int i = 0; i < Operands.size(); ++i)
            Do(Operands[i]);
    }
    for (ZfCCfgStatement* pStmt : m_StatementSeq)
        for (ZfCCfgVariable* pVariable : pStmt->getUsedVariables())
            Do(pVariable);
    if (m_pBranchCond != nullptr)
        for (ZfCCfgVariable* pVariable : m_pBranchCond->getUsedVariables())
            Do(pVariable);
}

#endif
