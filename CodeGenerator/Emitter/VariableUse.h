#ifndef VARIABLEUSE_H
#define VARIABLEUSE_H

#include "Emitter/ExpressionWriter.h"
#include "Emitter/FlowReader.h"

#include <string>
#include <vector>

namespace hpn {

/// Which functions of the C text read and write which variables: decides what has to be declared,
/// and where. Functions are numbers.
class VariableUse {
public:
    static constexpr int Nowhere = -1;
    static constexpr int Several = -2;

    void add(int Function, const ProcedureFlow& Flow);
    /// A variable is read or written by something else than the items: parameters, calls'
    /// arguments.
    void addRead(int Function, const Variable* pVariable);
    void addWrite(int Function, const Variable* pVariable);
    /// The reads of an argument for a formal.
    void addArgument(int Function, const Term* pTerm, const Variable* pFormal);

    /// Every variable that is read or written, in the order of first mention.
    const std::vector<const Variable*>& getAll() const { return m_All; }
    bool isRead(const Variable* pVariable) const { return recordOf(pVariable).IsRead; }
    bool isUsed(const Variable* pVariable) const { return recordOf(pVariable).Function != Nowhere; }
    /// The only function that uses it, `Several` or `Nowhere`.
    int onlyFunction(const Variable* pVariable) const { return recordOf(pVariable).Function; }

private:
    struct Record {
        int Function = Nowhere;
        bool IsRead = false;
    };

    template <class Write>
    void addReads(int Function, const Term* pTerm, bool IsStored, Write&& write);

    Record& note(int Function, const Variable* pVariable);
    Record recordOf(const Variable* pVariable) const {
        return pVariable->Index < m_Records.size() ? m_Records[pVariable->Index] : Record();
    }

    std::string m_Scratch;         // text that only serves to see what is read
    std::vector<Record> m_Records; // by Variable::Index
    std::vector<const Variable*> m_All;
};

/// Of the variables given, those that a procedure can read before it has written them, in the order
/// given.
std::vector<const Variable*> liveAtEntry(const ProcedureFlow& Flow,
                                         const std::vector<const Variable*>& Candidates);

} // namespace hpn

#endif
