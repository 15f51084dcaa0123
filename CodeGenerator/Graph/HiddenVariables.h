#ifndef HIDDENVARIABLES_H
#define HIDDENVARIABLES_H

#include "Language/Program.h"

#include <deque>
#include <string>

namespace hpn {

/// Variables that the source does not name: the value that a switch compares, an index or argument
/// that must be evaluated once. Each is a float64 local of a procedure, which holds every number of
/// an expression unchanged (zero loses its sign, which nothing that reads a hidden variable can
/// tell). Their indices go on behind those of the program. Addresses are stable.
class HiddenVariables {
public:
    explicit HiddenVariables(const Program& Source) : m_Source(Source) {}
    HiddenVariables(const HiddenVariables&) = delete;
    HiddenVariables& operator=(const HiddenVariables&) = delete;

    /// A new one; its name is the stem and a number, and unique among the hidden ones.
    const Variable& make(const char* pStem, const Procedure& Owner, SourcePosition Position);
    const std::deque<Variable>& getAll() const { return m_Variables; }

private:
    const Program& m_Source;
    std::deque<Variable> m_Variables;
    std::deque<std::string> m_Names;
};

} // namespace hpn

#endif
