#ifndef ZFCCFGSFPROCEDURECALL_H
#define ZFCCFGSFPROCEDURECALL_H

#include "Language/Program.h"
#include "ZfCCfgProcedureCall.h"

#include <vector>

class ZfCCfgExpression;
class ZfCCfgSFVariable;

/// The client's call of a procedure of the program. Its explicit arguments are the callee's
/// parameter statements' business while the optimiser works; the call keeps the same expressions by
/// formal, so that the emitter finds them without the procedure's list of parameter statements,
/// which holds stale pointers once unused ones were removed. The factory owns call and expressions.
class ZfCCfgSFProcedureCall : public ZfCCfgProcedureCall {
public:
    struct Argument {
        ZfCCfgSFVariable* pFormal;
        ZfCCfgExpression* pExpression;
    };

    /// `pCallee` is null for a procedure that extraction made.
    ZfCCfgSFProcedureCall(WqCXString Name, const hpn::Procedure* pCallee,
                          hpn::SourcePosition Position);

    const hpn::Procedure* getCallee() const { return m_pCallee; }
    hpn::SourcePosition getPosition() const { return m_Position; }
    void appendArgument(ZfCCfgSFVariable* pFormal, ZfCCfgExpression* pExpression);
    const std::vector<Argument>& getArguments() const { return m_Arguments; }

    ZfCCfgSFProcedureCall* isSFProcedureCall() override;
    /// The same callee with the same arguments, on original variables.
    bool generatesSameCode(ZfCCfgStatement* pOther) override;
    bool hoistOutOfIfElseBranch(bool& IgnoreNextStatement) override;
    void remove() override;

protected:
    ~ZfCCfgSFProcedureCall() override;

private:
    const hpn::Procedure* m_pCallee;
    hpn::SourcePosition m_Position;
    std::vector<Argument> m_Arguments;
};

#endif
