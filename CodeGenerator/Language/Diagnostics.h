#ifndef DIAGNOSTICS_H
#define DIAGNOSTICS_H

#include "Language/Program.h"
#include "Language/SourceFiles.h"

#include <cstddef>
#include <string>
#include <vector>

namespace hpn {

/// One message about a program text.
struct Diagnostic {
    bool IsWarning = false;
    SourcePosition Position;
    std::string Text;
};

/// Collects what is wrong with a program. Takes up to 20 errors: after these `isFull` holds,
/// further ones are dropped and the reader stops, since whoever has 20 mistakes mends some of them
/// first. Warnings are counted all and kept up to the same number. Printed in the order of the
/// sources, whichever step of the reader has found them.
class Diagnostics {
public:
    static constexpr std::size_t Limit = 20;

    /// The sources must outlive this object.
    explicit Diagnostics(const SourceFiles& Sources) : m_Sources(Sources) {}

    void error(SourcePosition Position, std::string Text);
    void warning(SourcePosition Position, std::string Text);

    bool hasErrors() const { return m_ErrorCount != 0; }
    /// No further error is taken.
    bool isFull() const { return m_ErrorCount >= Limit; }
    std::size_t getErrorCount() const { return m_ErrorCount; }
    std::size_t getWarningCount() const { return m_WarningCount; }
    /// In the order of discovery.
    const std::vector<Diagnostic>& getMessages() const { return m_Messages; }
    /// "file:line" of a place, for messages that point to a second one.
    std::string describe(SourcePosition Position) const;
    /// All messages as text: `file:line:column: error: text`, the source line, a caret below the
    /// place.
    std::string print() const;

private:
    void printOne(const Diagnostic& Message, std::string& Out) const;

    const SourceFiles& m_Sources;
    std::vector<Diagnostic> m_Messages;
    std::size_t m_ErrorCount = 0;
    std::size_t m_WarningCount = 0;
};

} // namespace hpn

#endif
