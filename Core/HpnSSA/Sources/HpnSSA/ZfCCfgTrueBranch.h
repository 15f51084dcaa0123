#ifndef ZFCCFGTRUEBRANCH_H
#define ZFCCFGTRUEBRANCH_H

#include "ZfCCfgEdgeInfo.h"

// The record of the out-edge that is taken when the block's condition holds.
class HPNSSA_EXPORT ZfCCfgTrueBranch : public ZfCCfgEdgeInfo {
    friend class ZfCCfgFactory;

public:
    ZfCCfgTrueBranch(const ZfCCfgTrueBranch&) = default;
    ZfCCfgTrueBranch& operator=(const ZfCCfgTrueBranch&) = default;

    // This record.
    ZfCCfgTrueBranch* isTrueBranch() override;
    void accept(ZfCCfgVisitor* pVisitor, leda::edge& Edge) override;

protected:
    ZfCCfgTrueBranch();
    ~ZfCCfgTrueBranch() override;
};

#endif
