#ifndef ZFCCFGFALSEBRANCH_H
#define ZFCCFGFALSEBRANCH_H

#include "ZfCCfgEdgeInfo.h"

// The record of the out-edge that is taken when the block's condition does not hold.
class HPNSSA_EXPORT ZfCCfgFalseBranch : public ZfCCfgEdgeInfo {
    friend class ZfCCfgFactory;

public:
    ZfCCfgFalseBranch(const ZfCCfgFalseBranch&) = default;
    ZfCCfgFalseBranch& operator=(const ZfCCfgFalseBranch&) = default;

    // This record.
    ZfCCfgFalseBranch* isFalseBranch() override;
    void accept(ZfCCfgVisitor* pVisitor, leda::edge& Edge) override;

protected:
    ZfCCfgFalseBranch();
    ~ZfCCfgFalseBranch() override;
};

#endif
