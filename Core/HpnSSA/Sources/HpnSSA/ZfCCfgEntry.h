#ifndef ZFCCFGENTRY_H
#define ZFCCFGENTRY_H

#include "ZfCCfgNodeInfo.h"

class ZfCCfgAssignment;
class ZfCCfgVisitor;

// The record of a procedure's entry node, which has no in-edge. It keeps a list of assignments for
// the client; the library only holds, copies and empties it. Made by the factory alone.
class HPNSSA_EXPORT ZfCCfgEntry : public ZfCCfgNodeInfo {
    friend class ZfCCfgFactory;

public:
    ZfCCfgEntry(const ZfCCfgEntry&) = default;
    ZfCCfgEntry& operator=(const ZfCCfgEntry&) = default;

    // This record.
    ZfCCfgEntry* isEntryNode() override;

private:
    ZfCCfgEntry();
    ~ZfCCfgEntry() override;

protected:
    // Clears the assignments and nothing else: a recycled entry node keeps procedure, dominator and
    // frontier of its earlier life until they are set anew.
    void resetData() override;

public:
    // Shows the node to an SSA visitor.
    virtual void accept(ZfCCfgVisitor* pVisitor);

    // Keeps an assignment, which is not owned.
    void append(ZfCCfgAssignment* pAssignment) { m_Assignments.append(pAssignment); }

private:
    leda::list<ZfCCfgAssignment*> m_Assignments;
};

#endif
