#ifndef SOURCEFILES_H
#define SOURCEFILES_H

#include "Language/Program.h"

#include <cstddef>
#include <cstdint>
#include <deque>
#include <string>
#include <string_view>
#include <vector>

namespace hpn {

/// A place as an editor shows it. Both count from 1; the column counts characters, a tab being one.
struct LineAndColumn {
    std::size_t Line = 1;
    std::size_t Column = 1;
};

/// The texts of one program, in the order of reading. Owns them: every view into a text, and so
/// every name in a `Program`, holds as long as this object. Lines are found on demand only, since a
/// program without mistakes never asks for one: the first question about a file costs one pass over
/// it, later ones the logarithm of its lines.
class SourceFiles {
public:
    SourceFiles() = default;
    SourceFiles(const SourceFiles&) = delete;
    SourceFiles& operator=(const SourceFiles&) = delete;

    /// Takes a text over under the name that messages show; gives the file's number.
    std::uint32_t add(std::string Name, std::string Text);
    /// Reads a file from disk. False, with the reason in `Why`, if that is not possible; then
    /// nothing is added.
    bool addFile(const std::string& Path, std::string& Why);
    /// Reads standard input to its end, under the name "<stdin>".
    bool addStandardInput(std::string& Why);

    std::size_t getCount() const { return m_Files.size(); }
    const std::string& getName(std::uint32_t File) const { return m_Files[File].Name; }
    std::string_view getText(std::uint32_t File) const { return m_Files[File].Text; }

    /// Line and column of a place; a place behind the end of the text counts as its end.
    LineAndColumn locate(SourcePosition Position) const;
    /// The line that holds a place, without its line end.
    std::string_view getLineText(SourcePosition Position) const;

private:
    struct SourceFile {
        std::string Name;
        std::string Text;
        mutable std::vector<std::uint32_t> LineStarts; ///< empty until somebody asks
    };

    static const std::vector<std::uint32_t>& lineStarts(const SourceFile& File);
    /// Number of the line, from 0, that holds an offset.
    static std::size_t lineOf(const SourceFile& File, std::uint32_t Offset);

    std::deque<SourceFile> m_Files;
};

/// Length of the well-formed UTF-8 sequence at the start of a text, 0 if there is none (or the text
/// is empty).
std::size_t utf8Length(std::string_view Text);

} // namespace hpn

#endif
