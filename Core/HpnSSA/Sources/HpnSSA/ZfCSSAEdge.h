#ifndef ZFCSSAEDGE_H
#define ZFCSSAEDGE_H

#include "ZfCCfgEdgeInfo.h"

// The record of an edge from a node that defines a variable to a node that uses it. It is no
// control flow.
class HPNSSA_EXPORT ZfCSSAEdge : public ZfCCfgEdgeInfo {
    friend class ZfCCfgFactory;

public:
    ZfCSSAEdge(const ZfCSSAEdge&) = default;
    ZfCSSAEdge& operator=(const ZfCSSAEdge&) = default;

    // This record.
    ZfCSSAEdge* isSSAEdge() override;
    void accept(ZfCCfgVisitor* pVisitor, leda::edge& Edge) override;

protected:
    ZfCSSAEdge();
    ~ZfCSSAEdge() override;
};

#endif
