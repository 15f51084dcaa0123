#ifndef ZFCCFGINITASSIGNMENT_H
#define ZFCCFGINITASSIGNMENT_H

#include "ZfCCfgAssignment.h"

// The assignment that the library builds by itself: initial values of the main procedure and what a
// branch condition tells. Its right-hand side stays as it is through constant folding.
class HPNSSA_EXPORT ZfCCfgInitAssignment : public ZfCCfgAssignment {
public:
    // Neither side is set.
    ZfCCfgInitAssignment();
    // A copy names the same variable and the same expression.
    ZfCCfgInitAssignment(const ZfCCfgInitAssignment&) = default;
    ZfCCfgInitAssignment& operator=(const ZfCCfgInitAssignment&) = default;

    // Null: it is not cloned.
    ZfCCfgStatement* clone() override;
    void accept(ZfCCfgVisitor* pVisitor) override;
    void foldConstants() override;

protected:
    ~ZfCCfgInitAssignment() override;
};

#endif
