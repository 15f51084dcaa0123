#ifndef ZFCCFGEXIT_H
#define ZFCCFGEXIT_H

#include "ZfCCfgNodeInfo.h"

class ZfCCfgVisitor;

// The record of a procedure's exit node, which has no out-edge. Made by the factory alone.
class HPNSSA_EXPORT ZfCCfgExit : public ZfCCfgNodeInfo {
    friend class ZfCCfgFactory;

public:
    ZfCCfgExit(const ZfCCfgExit&) = default;
    ZfCCfgExit& operator=(const ZfCCfgExit&) = default;

    // This record.
    ZfCCfgExit* isExitNode() override;

    // Shows the node to an SSA visitor.
    void accept(ZfCCfgVisitor* pVisitor);

private:
    ZfCCfgExit();
    ~ZfCCfgExit() override;
};

#endif
