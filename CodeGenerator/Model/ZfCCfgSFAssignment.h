#ifndef ZFCCFGSFASSIGNMENT_H
#define ZFCCFGSFASSIGNMENT_H

#include "Language/Program.h"
#include "ZfCCfgAssignment.h"

/// The client's assignment: `variable = expression`, or a store to an array element, whose index
/// stands in the right-hand side (a store's root term). Made with `new`; the factory owns it.
class ZfCCfgSFAssignment : public ZfCCfgAssignment {
public:
    explicit ZfCCfgSFAssignment(hpn::SourcePosition Position);

    hpn::SourcePosition getPosition() const { return m_Position; }

    ZfCCfgSFAssignment* isSFAssignment() override;
    bool generatesSameCode(ZfCCfgStatement* pOther) override;
    bool hoistOutOfIfElseBranch(bool& IgnoreNextStatement) override;
    void remove() override;
    ZfCCfgStatement* clone() override;
    void accept(ZfCCfgVisitor* pVisitor) override;
    void foldConstants() override;

protected:
    ~ZfCCfgSFAssignment() override;

private:
    hpn::SourcePosition m_Position;
};

#endif
