#ifndef ZFCCVDDBASESTATE_H
#define ZFCCVDDBASESTATE_H

#include "HpnSSAExport.h"

// Where a property of the code generator is specified: in the data dictionary, in the model, or in
// both. No pass of the library uses it.
class HPNSSA_EXPORT ZfCCvDDBaseState {
public:
    // Specified in the data dictionary only.
    ZfCCvDDBaseState() : m_State(eOnlyDD) {}

    // Set the state, whatever it was.
    void setToOnlyDD() { m_State = eOnlyDD; }
    void setToOnlyModel() { m_State = eOnlyModel; }
    void setToModelAndDD() { m_State = eModelAndDD; }
    // The model specifies it too: what was only in the data dictionary is then in both.
    void updateWithModelSpecification() {
        if (m_State == eOnlyDD)
            m_State = eModelAndDD;
    }

    // Whether the state is exactly this one.
    bool isOnlyDD() { return m_State == eOnlyDD; }
    bool isOnlyModel() { return m_State == eOnlyModel; }
    bool isOnlyModelAndDD() { return m_State == eModelAndDD; }
    // Whether the data dictionary, or the model, specifies it, alone or together with the other.
    bool isSpecifiedInDD() { return m_State == eOnlyDD || m_State == eModelAndDD; }
    bool isSpecifiedInModel() { return m_State == eOnlyModel || m_State == eModelAndDD; }

private:
    enum tagZfECvDDBaseState { eOnlyDD = 0, eOnlyModel = 1, eModelAndDD = 2 };

    tagZfECvDDBaseState m_State;
};

#endif
