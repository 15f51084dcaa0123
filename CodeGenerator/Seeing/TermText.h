#ifndef TERMTEXT_H
#define TERMTEXT_H

#include "Model/Term.h"

#include <string>

namespace hpn {

/// How a report calls the variables of an expression.
class VariableNames {
public:
    virtual ~VariableNames() = default;
    /// Appends the name of an original variable or of a version.
    virtual void appendName(ZfCCfgVariable* pVariable, std::string& Out) = 0;
};

/// Appends a term in the program's own notation, parentheses only where the tree needs them. The
/// height of a term is that of one expression of the source, which the reader limits.
void appendTerm(const Term* pTerm, VariableNames& Names, std::string& Out);
/// Appends what an assignment to a variable of a type stores: the conversion to that very type,
/// which every right-hand side has at its root, goes without saying.
void appendStored(const Term* pRoot, const Type& To, VariableNames& Names, std::string& Out);

} // namespace hpn

#endif
