#ifndef READTEXT_H
#define READTEXT_H

#include "Language/Diagnostics.h"
#include "Language/Printer.h"
#include "Language/Reader.h"
#include "Language/SourceFiles.h"

#include <sstream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

/// One program that has been read, or refused.
class ReadText {
public:
    explicit ReadText(std::string Text) : ReadText({{"t", std::move(Text)}}) {}
    explicit ReadText(const std::vector<std::pair<std::string, std::string>>& Files)
        : m_Messages(m_Sources) {
        for (const auto& [Name, Text] : Files)
            m_Sources.add(Name, Text);
        m_IsRead = hpn::readProgram(m_Sources, m_Messages, m_Program);
    }

    bool isRead() const { return m_IsRead; }
    const hpn::Program& program() const { return m_Program; }
    const hpn::Diagnostics& diagnostics() const { return m_Messages; }
    std::string print() const { return hpn::printProgram(m_Program); }
    /// The messages without their source lines; those on file "t" without its name.
    std::string messages() const {
        std::istringstream Printed(m_Messages.print());
        std::string Result;
        bool IsQuoted = false;
        for (std::string Line; std::getline(Printed, Line);) {
            const bool IsMessage = Line.find(": error: ") != std::string::npos ||
                                   Line.find(": warning: ") != std::string::npos;
            if (IsMessage && !IsQuoted)
                Result += (Line.rfind("t:", 0) == 0 ? Line.substr(2) : Line) + "\n";
            // A message's own lines follow: the source's and the caret's.
            IsQuoted = IsMessage ? true : IsQuoted && Line.find('^') == std::string::npos;
        }
        return Result;
    }

    const hpn::Variable* variable(std::string_view Name) const {
        for (const hpn::Variable& Each : m_Program.Variables)
            if (Each.Name == Name && Each.Kind != hpn::VariableKind::Result)
                return &Each;
        return nullptr;
    }
    const hpn::Procedure* procedure(std::string_view Name) const {
        for (const hpn::Procedure& Each : m_Program.Procedures)
            if (Each.Name == Name)
                return &Each;
        return nullptr;
    }

private:
    hpn::SourceFiles m_Sources;
    hpn::Diagnostics m_Messages;
    hpn::Program m_Program;
    bool m_IsRead = false;
};

#endif
