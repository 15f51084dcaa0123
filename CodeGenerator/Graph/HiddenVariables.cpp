#include "Graph/HiddenVariables.h"

namespace hpn {

const Variable& HiddenVariables::make(const char* pStem, const Procedure& Owner,
                                      SourcePosition Position) {
    m_Names.push_back(std::string(pStem) + "_" + std::to_string(m_Variables.size() + 1));
    Variable& Hidden = m_Variables.emplace_back();
    Hidden.Kind = VariableKind::Local;
    Hidden.Name = m_Names.back();
    Hidden.pType = m_Source.builtIn(BaseType::Float64);
    // The link back is declared for the reader, which still changes procedures; nobody does through
    // this one.
    Hidden.pOwner = const_cast<Procedure*>(&Owner);
    Hidden.Position = Position;
    Hidden.Index = static_cast<std::uint32_t>(m_Source.Variables.size() + m_Variables.size() - 1);
    return Hidden;
}

} // namespace hpn
