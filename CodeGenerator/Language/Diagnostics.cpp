#include "Language/Diagnostics.h"

#include <algorithm>
#include <string_view>
#include <utility>

namespace hpn {

namespace {

constexpr std::size_t LongestLine = 160; ///< characters of a source line that a message shows
constexpr std::size_t ShownBefore = 100; ///< of a longer line: as many before the place

/// The characters of a line; what a terminal cannot show is replaced, so that the caret stays below
/// its place.
std::vector<std::string_view> splitCharacters(std::string_view Line) {
    std::vector<std::string_view> Characters;
    while (!Line.empty()) {
        const std::size_t Length = utf8Length(Line);
        const auto First = static_cast<unsigned char>(Line[0]);
        const bool IsShown = Length != 0 && (First >= 0x20 || First == '\t') && First != 0x7F;
        Characters.push_back(IsShown ? Line.substr(0, Length) : std::string_view("?"));
        Line.remove_prefix(Length == 0 ? 1 : Length);
    }
    return Characters;
}

/// The source line, cut to a window around the place if it is long, and the caret.
void printLine(std::string_view Line, std::size_t Column, std::string& Out) {
    const std::vector<std::string_view> Characters = splitCharacters(Line);
    std::size_t Begin = 0;
    if (Characters.size() > LongestLine && Column > ShownBefore) {
        Begin = Column - ShownBefore;
    }
    const std::size_t End = std::min(Characters.size(), Begin + LongestLine);
    const std::string_view Cut = "...";
    std::string Caret;
    if (Begin > 0) {
        Out += Cut;
        Caret.append(Cut.size(), ' ');
    }
    for (std::size_t At = Begin; At < End; ++At) {
        Out += Characters[At];
        if (At + 1 < Column) {
            Caret += Characters[At] == "\t" ? '\t' : ' ';
        }
    }
    if (End < Characters.size()) {
        Out += Cut;
    }
    Out += '\n';
    Out += Caret;
    Out += "^\n";
}

} // namespace

void Diagnostics::error(SourcePosition Position, std::string Text) {
    if (isFull()) {
        return;
    }
    ++m_ErrorCount;
    m_Messages.push_back({false, Position, std::move(Text)});
}

void Diagnostics::warning(SourcePosition Position, std::string Text) {
    if (m_WarningCount++ < Limit) {
        m_Messages.push_back({true, Position, std::move(Text)});
    }
}

std::string Diagnostics::describe(SourcePosition Position) const {
    return m_Sources.getName(Position.File) + ':' + std::to_string(m_Sources.locate(Position).Line);
}

void Diagnostics::printOne(const Diagnostic& Message, std::string& Out) const {
    if (m_Sources.getCount() == 0) {
        Out += "error: " + Message.Text + '\n';
        return;
    }
    const LineAndColumn Place = m_Sources.locate(Message.Position);
    Out += m_Sources.getName(Message.Position.File);
    Out += ':' + std::to_string(Place.Line) + ':' + std::to_string(Place.Column);
    Out += Message.IsWarning ? ": warning: " : ": error: ";
    Out += Message.Text + '\n';
    printLine(m_Sources.getLineText(Message.Position), Place.Column, Out);
}

std::string Diagnostics::print() const {
    std::vector<const Diagnostic*> Ordered;
    for (const Diagnostic& Message : m_Messages) {
        Ordered.push_back(&Message);
    }
    std::stable_sort(Ordered.begin(), Ordered.end(),
                     [](const Diagnostic* pLeft, const Diagnostic* pRight) {
                         return std::make_pair(pLeft->Position.File, pLeft->Position.Offset) <
                                std::make_pair(pRight->Position.File, pRight->Position.Offset);
                     });
    std::string Out;
    for (const Diagnostic* pMessage : Ordered) {
        printOne(*pMessage, Out);
    }
    if (isFull()) {
        Out += "stopped after " + std::to_string(Limit) + " errors\n";
    }
    if (m_WarningCount > Limit) {
        Out += std::to_string(m_WarningCount - Limit) + " further warnings are not shown\n";
    }
    return Out;
}

} // namespace hpn
