#ifndef ZFCCFGEXTERNCALL_H
#define ZFCCFGEXTERNCALL_H

#include "ZfCCfgStatement.h"

// The call of code outside the graph. The variables that it reads are its uses. Those that it may
// change are kept for the client but are no definitions: a client has to mark them volatile.
class HPNSSA_EXPORT ZfCCfgExternCall : public ZfCCfgStatement {
public:
    // Copies the list behind the pointer.
    explicit ZfCCfgExternCall(leda::list<ZfCCfgVariable*>* pModifiableVariables);
    ZfCCfgExternCall(const ZfCCfgExternCall&) = default;
    ZfCCfgExternCall& operator=(const ZfCCfgExternCall&) = default;

    ZfCCfgExternCall* isExternCall() override;
    // Null: it is not cloned.
    ZfCCfgStatement* clone() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getDefinedVariables() override;
    leda::set<ZfCCfgVariable*, leda::avl_tree> getUsedVariables() override;
    void accept(ZfCCfgVisitor* pVisitor) override;

protected:
    ~ZfCCfgExternCall() override;

public:
    // What the called code may change, in the order of entry and as often as entered; a copy. The
    // variables are not owned.
    leda::list<ZfCCfgVariable*> getModifiableVariables() { return m_ModifiableVariables; }
    // Tell of one more variable that the called code reads or may change.
    void appendUsedVariable(ZfCCfgVariable* pVariable) { m_UsedVariables.insert(pVariable); }
    void appendModifiableVariable(ZfCCfgVariable* pVariable) {
        m_ModifiableVariables.append(pVariable);
    }
    // Takes pOld out of the used variables and enters pNew, which also happens when pOld is not
    // there. The modifiable variables are never rewritten.
    void replaceVariable(ZfCCfgVariable* pOld, ZfCCfgVariable* pNew);

private:
    leda::list<ZfCCfgVariable*> m_ModifiableVariables;
    leda::set<ZfCCfgVariable*, leda::avl_tree> m_UsedVariables;
};

#endif
