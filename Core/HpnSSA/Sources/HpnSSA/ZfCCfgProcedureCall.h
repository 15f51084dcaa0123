#ifndef ZFCCFGPROCEDURECALL_H
#define ZFCCFGPROCEDURECALL_H

#include "WqCXString.h"
#include "ZfCCfgStatement.h"

// The call of a procedure of the graph, bound to it by name.
//
// A call itself defines and uses nothing: its arguments stand in the callee's parameter statements,
// keyed by the call, and the values that come back in the value return statements behind it.
class HPNSSA_EXPORT ZfCCfgProcedureCall : public ZfCCfgStatement {
public:
    // A call without a name, and one of the procedure of that name; the procedure need not exist
    // yet. Neither is marked as callable from outside.
    ZfCCfgProcedureCall();
    ZfCCfgProcedureCall(WqCXString Name);
    // A copy calls the same procedure, but no parameter statement has arguments for it.
    ZfCCfgProcedureCall(const ZfCCfgProcedureCall&) = default;
    ZfCCfgProcedureCall& operator=(const ZfCCfgProcedureCall&) = default;

    ZfCCfgProcedureCall* isProcedureCall() override;
    // Null: it is not cloned.
    ZfCCfgStatement* clone() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getDefinedVariables() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;
    void accept(ZfCCfgVisitor* pVisitor) override;

protected:
    ~ZfCCfgProcedureCall() override;

public:
    // The variables that take the results of the call.
    virtual leda::set<ZfCCfgVariable*, leda::avl_tree> getVarsDefinedByFctReturn();
    // Whether the callee can also be called from outside the generated code.
    virtual bool isCallToDirectlyOrIndirectlyFromOutsideCallableFcn();

    // The name of the callee, under which the graph's dictionary has it.
    WqCXString getName() { return m_Name; }
    void setName(WqCXString Name) { m_Name = Name; }
    // Marks the call; the callee is then never dissolved into its caller. Before the call lists are
    // filled.
    void setIsCallToDirectlyOrIndirectlyFromOutsideCallableFcn(bool IsCallable) {
        m_IsCallToDirectlyOrIndirectlyFromOutsideCallableFcn = IsCallable;
    }

private:
    WqCXString m_Name;
    bool m_IsCallToDirectlyOrIndirectlyFromOutsideCallableFcn;
};

#endif
