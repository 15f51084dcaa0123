#ifndef ZFCCFGSTATEMENT_H
#define ZFCCFGSTATEMENT_H

#include "HpnSSAExport.h"
#include "LEDA/list.h"
#include "LEDA/set.h"
#include "ZfCCfgVariable.h"
#include "ZfCModuleAllocation.h"

class ZfCCfgAssignment;
class ZfCCfgExternCall;
class ZfCCfgFactory;
class ZfCCfgOutputStatement;
class ZfCCfgParamStatement;
class ZfCCfgProcedureCall;
class ZfCCfgSFAssignment;
class ZfCCfgSFProcedureCall;
class ZfCCfgValueReturnStatement;
class ZfCCfgVisitor;
class ZfCPhiFunction;

// One element of a basic block: what it defines, what it uses, whether it has side effects, and of
// which kind it is.
//
// Every statement that is built by the default constructor enters itself in the factory, which from
// then on is its only owner: it may be made with a plain new anywhere, is ended by
// ZfCBasicBlock::del, ZfCCfgFactory::delStatement or the factory's release, and is never deleted by
// its maker. A copy has the numbers of its source, is not entered and belongs to its maker.
// ZfCSSAControl::boot must have run before the first statement is made.
//
// A virtual statement stands in the graph for the analysis alone and makes no code.
class HPNSSA_EXPORT ZfCCfgStatement {
    friend class ZfCCfgFactory;

public:
    // The client makes statements with new in its own module and the factory ends them in this one,
    // so their blocks are bound to one pair of allocation functions.
    HPNSSA_MODULE_BLOCKS

    ZfCCfgStatement();
    ZfCCfgStatement(const ZfCCfgStatement&) = default;
    ZfCCfgStatement& operator=(const ZfCCfgStatement&) = default;

    // The kind: the statement itself or null.
    virtual ZfCCfgAssignment* isAssignment();
    virtual ZfCCfgSFAssignment* isSFAssignment();
    virtual ZfCCfgProcedureCall* isProcedureCall();
    virtual ZfCCfgSFProcedureCall* isSFProcedureCall();
    virtual ZfCCfgParamStatement* isParamStatement();
    virtual ZfCCfgValueReturnStatement* isValueReturnStatement();
    virtual ZfCCfgOutputStatement* isOutputStatement();
    virtual ZfCCfgExternCall* isExternCall();
    virtual ZfCPhiFunction* isPhiFunction();

    // The client's last word before the statement is ended or dropped.
    virtual void remove();

    // Moves the statement in front of the branch whose arms both hold it; false if it cannot be
    // moved. The argument becomes true if the next statement of each arm is to be passed over.
    virtual bool hoistOutOfIfElseBranch(bool& SkipNext);

    // Whether executing it does more than define its variables.
    virtual bool hasSideEffects();

    // Whether the target code of both is the same.
    virtual bool generatesSameCode(ZfCCfgStatement* pStatement);

    // A new statement like this one, or null if the kind is not cloned.
    virtual ZfCCfgStatement* clone() = 0;

    // The variables defined and used; fresh sets.
    virtual leda::set<ZfCCfgVariable*, leda::avl_tree> getDefinedVariables() = 0;
    virtual leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() = 0;

    // Shows the statement to a visitor.
    virtual void accept(ZfCCfgVisitor* pVisitor);

protected:
    virtual ~ZfCCfgStatement();

public:
    // Serial numbering starts at 0 again.
    static void boot() { s_GlobIndexCnt = 0; }

    // The serial number, as dumps show it.
    unsigned int getIndex() { return m_Index; }
    // The key of the statement in the factory.
    int getDebugIndex() { return m_DebugIndex; }
    // Whether it stands in the graph for the analysis alone.
    bool getIsVirtual() { return m_IsVirtual; }
    void setIsVirtual(bool IsVirtual) { m_IsVirtual = IsVirtual; }

private:
    unsigned int m_Index;
    int m_DebugIndex;
    bool m_IsVirtual;

    static unsigned int s_GlobIndexCnt;
};

namespace leda {

// Order of statements: null first, then by debug index, so that they are released in order of
// creation.
inline int compare(ZfCCfgStatement* const& pLeft, ZfCCfgStatement* const& pRight) {
    if (pLeft == pRight)
        return 0;
    if (pLeft == nullptr || pRight == nullptr)
        return pLeft == nullptr ? -1 : 1;
    const int Left = pLeft->getDebugIndex();
    const int Right = pRight->getDebugIndex();
    return (Left > Right) - (Left < Right);
}

} // namespace leda

#endif
