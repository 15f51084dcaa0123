#include "Language/SourceFiles.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <utility>

namespace hpn {

namespace {

constexpr std::string_view ByteOrderMark = "\xEF\xBB\xBF";

bool readAll(std::FILE* pFile, std::string& Text, std::string& Why) {
    constexpr std::size_t ChunkSize = 1 << 16;
    std::size_t Size = 0;
    for (;;) {
        Text.resize(Size + ChunkSize);
        const std::size_t Read = std::fread(&Text[Size], 1, ChunkSize, pFile);
        Size += Read;
        if (Read < ChunkSize) {
            break;
        }
    }
    Text.resize(Size);
    if (std::ferror(pFile) != 0) {
        Why = std::strerror(errno);
        return false;
    }
    return true;
}

bool isContinuation(char Byte) {
    return (static_cast<unsigned char>(Byte) & 0xC0U) == 0x80U;
}

/// Length that the first byte of a sequence promises, 0 for a byte that starts none.
std::size_t promisedLength(unsigned char First) {
    if (First < 0x80) {
        return 1;
    }
    if (First >= 0xC2 && First < 0xE0) {
        return 2;
    }
    if (First >= 0xE0 && First < 0xF0) {
        return 3;
    }
    return First >= 0xF0 && First < 0xF5 ? 4 : 0;
}

} // namespace

std::size_t utf8Length(std::string_view Text) {
    if (Text.empty()) {
        return 0;
    }
    const auto First = static_cast<unsigned char>(Text[0]);
    const std::size_t Length = promisedLength(First);
    if (Length == 0 || Length > Text.size() ||
        !std::all_of(Text.begin() + 1, Text.begin() + static_cast<std::ptrdiff_t>(Length),
                     isContinuation)) {
        return 0;
    }
    // Overlong forms, surrogates and numbers behind the last code point show in the second byte.
    const auto Second = Length > 1 ? static_cast<unsigned char>(Text[1]) : 0;
    const bool IsWrong = (First == 0xE0 && Second < 0xA0) || (First == 0xED && Second >= 0xA0) ||
                         (First == 0xF0 && Second < 0x90) || (First == 0xF4 && Second >= 0x90);
    return IsWrong ? 0 : Length;
}

std::uint32_t SourceFiles::add(std::string Name, std::string Text) {
    m_Files.push_back({std::move(Name), std::move(Text), {}});
    return static_cast<std::uint32_t>(m_Files.size() - 1);
}

bool SourceFiles::addFile(const std::string& Path, std::string& Why) {
    std::FILE* pFile = std::fopen(Path.c_str(), "rb");
    if (pFile == nullptr) {
        Why = std::strerror(errno);
        return false;
    }
    std::string Text;
    const bool IsRead = readAll(pFile, Text, Why);
    std::fclose(pFile);
    if (IsRead) {
        add(Path, std::move(Text));
    }
    return IsRead;
}

bool SourceFiles::addStandardInput(std::string& Why) {
    std::string Text;
    if (!readAll(stdin, Text, Why)) {
        return false;
    }
    add("<stdin>", std::move(Text));
    return true;
}

const std::vector<std::uint32_t>& SourceFiles::lineStarts(const SourceFile& File) {
    if (File.LineStarts.empty()) {
        const bool HasMark = File.Text.compare(0, ByteOrderMark.size(), ByteOrderMark) == 0;
        File.LineStarts.push_back(HasMark ? ByteOrderMark.size() : 0);
        for (std::size_t At = File.Text.find('\n'); At != std::string::npos;
             At = File.Text.find('\n', At + 1)) {
            File.LineStarts.push_back(static_cast<std::uint32_t>(At + 1));
        }
    }
    return File.LineStarts;
}

std::size_t SourceFiles::lineOf(const SourceFile& File, std::uint32_t Offset) {
    const std::vector<std::uint32_t>& Starts = lineStarts(File);
    const auto Behind = std::upper_bound(Starts.begin(), Starts.end(), Offset);
    return Behind == Starts.begin() ? 0 : static_cast<std::size_t>(Behind - Starts.begin()) - 1;
}

LineAndColumn SourceFiles::locate(SourcePosition Position) const {
    const SourceFile& File = m_Files[Position.File];
    const std::size_t Line = lineOf(File, Position.Offset);
    const std::string_view Text = getLineText(Position);
    const std::size_t Start = lineStarts(File)[Line];
    const std::size_t Reach =
        Position.Offset > Start ? std::min<std::size_t>(Position.Offset - Start, Text.size()) : 0;
    LineAndColumn Place;
    Place.Line = Line + 1;
    for (std::size_t At = 0; At < Reach;) {
        At += std::max<std::size_t>(utf8Length(Text.substr(At)), 1);
        ++Place.Column;
    }
    return Place;
}

std::string_view SourceFiles::getLineText(SourcePosition Position) const {
    const SourceFile& File = m_Files[Position.File];
    const std::size_t Start = lineStarts(File)[lineOf(File, Position.Offset)];
    const std::string_view Text = File.Text;
    std::string_view Line = Text.substr(Start, Text.find('\n', Start) - Start);
    if (!Line.empty() && Line.back() == '\r') {
        Line.remove_suffix(1);
    }
    return Line;
}

} // namespace hpn
