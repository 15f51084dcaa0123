#include "Targets/Targets.h"

#include "Language/Printer.h"
#include "Language/Reader.h"

#include <memory>
#include <string>

namespace hpn::fuzz {

namespace {

/// A program with all that it has views into.
struct Reading {
    SourceFiles Sources;
    Diagnostics Messages{Sources};
    Program Read;
    bool IsRead = false;

    explicit Reading(std::string Text) {
        std::size_t Begin = 0;
        for (std::size_t End = 0; End != std::string::npos; Begin = End + 1) {
            End = Text.find('\xFE', Begin);
            Sources.add("file" + std::to_string(Sources.getCount()),
                        Text.substr(Begin, End == std::string::npos ? End : End - Begin));
        }
        IsRead = readProgram(Sources, Messages, Read);
    }
};

/// A refused text has an error; every message says something, and about a place in the text.
std::string judgeMessages(const Reading& Of) {
    if (Of.IsRead == Of.Messages.hasErrors())
        return Of.IsRead ? "accepted with errors" : "refused without an error";
    for (const Diagnostic& Message : Of.Messages.getMessages()) {
        const SourcePosition At = Message.Position;
        if (Message.Text.empty())
            return "a message without a text";
        if (At.File >= Of.Sources.getCount() || At.Offset > Of.Sources.getText(At.File).size())
            return "a message beyond the text: " + Message.Text;
    }
    if (Of.Messages.print().empty() != Of.Messages.getMessages().empty())
        return "messages and what is shown of them do not agree";
    return "";
}

} // namespace

std::string judgeReader(const std::uint8_t* pData, std::size_t Size) {
    const Reading First(std::string(reinterpret_cast<const char*>(pData), Size));
    const std::string Wrong = judgeMessages(First);
    if (!Wrong.empty() || !First.IsRead)
        return Wrong;
    const std::string Once = printProgram(First.Read);
    const Reading Second(Once);
    if (!Second.IsRead)
        return "printed, it is refused:\n" + Once + Second.Messages.print();
    const std::string Twice = printProgram(Second.Read);
    return Once == Twice ? "" : "printed:\n" + Once + "\nthen:\n" + Twice;
}

} // namespace hpn::fuzz
