#include "Seeing/ReportLayout.h"

#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>

#include <chrono>
#include <random>
#include <thread>

#ifdef _WIN32
#include <windows.h>
#else
#include <csignal>
#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

extern char** environ;
#endif

namespace hpn {

namespace {

constexpr double PixelsPerInch = 72.0;

// The plain format carries a colour through untouched, which tells the kinds of edges apart.
const char* colourOf(char What) {
    return What == 't' ? "green" : What == 'n' ? "red" : "black";
}

char kindOf(const std::string& Colour) {
    return Colour == "green" ? 't' : Colour == "red" ? 'n' : 'f';
}

int pixels(double Inches) {
    return static_cast<int>(std::lround(Inches * PixelsPerInch));
}

bool readBox(std::istringstream& Line, double Height, PlacedPicture& Result) {
    std::size_t Number = 0;
    double X = 0.0;
    double Y = 0.0;
    double BoxWidth = 0.0;
    double BoxHeight = 0.0;
    if (!(Line >> Number >> X >> Y >> BoxWidth >> BoxHeight) || Number >= Result.Boxes.size())
        return false;
    Result.Boxes[Number] = {pixels(X - BoxWidth / 2), pixels(Height - Y - BoxHeight / 2),
                            pixels(BoxWidth), pixels(BoxHeight)};
    return true;
}

bool readEdge(std::istringstream& Line, double Height, PlacedPicture& Result) {
    PlacedPicture::Edge Edge;
    std::size_t Count = 0;
    if (!(Line >> Edge.From >> Edge.To >> Count))
        return false;
    for (std::size_t i = 0; i < Count; ++i) {
        double X = 0.0;
        double Y = 0.0;
        if (!(Line >> X >> Y))
            return false;
        Edge.Path += i == 0 ? "M" : i == 1 ? "C" : " ";
        Edge.Path += std::to_string(pixels(X)) + "," + std::to_string(pixels(Height - Y));
    }
    std::string Style;
    std::string Colour;
    Line >> Style >> Colour;
    Edge.What = kindOf(Colour);
    Result.Edges.push_back(std::move(Edge));
    return true;
}

// A directory of its own for each run; gone with its contents afterwards.
class ScratchDirectory {
public:
    ScratchDirectory() {
        std::error_code Error;
        const std::filesystem::path Parent = std::filesystem::temp_directory_path(Error);
        std::random_device Random;
        for (int Attempt = 0; !Error && Attempt < 10 && m_Path.empty(); ++Attempt) {
            const std::filesystem::path Path = Parent / ("hpncg-" + std::to_string(Random()));
            if (std::filesystem::create_directory(Path, Error))
                m_Path = Path.string();
        }
    }
    ~ScratchDirectory() {
        std::error_code Error;
        if (!m_Path.empty())
            std::filesystem::remove_all(m_Path, Error);
    }
    ScratchDirectory(const ScratchDirectory&) = delete;
    ScratchDirectory& operator=(const ScratchDirectory&) = delete;

    bool isThere() const { return !m_Path.empty(); }
    std::string file(const char* Name) const { return m_Path + "/" + Name; }

private:
    std::string m_Path;
};

#ifdef _WIN32

HANDLE openInherited(const std::string& Name, DWORD Access, DWORD Disposition) {
    SECURITY_ATTRIBUTES Inherited = {sizeof(SECURITY_ATTRIBUTES), nullptr, TRUE};
    return CreateFileA(Name.c_str(), Access, FILE_SHARE_READ, &Inherited, Disposition,
                       FILE_ATTRIBUTE_NORMAL, nullptr);
}

DotAnswer runProcess(const std::string& Input, const std::string& Output, double Seconds) {
    STARTUPINFOA Start = {};
    Start.cb = sizeof Start;
    Start.dwFlags = STARTF_USESTDHANDLES;
    Start.hStdInput = openInherited(Input, GENERIC_READ, OPEN_EXISTING);
    Start.hStdOutput = openInherited(Output, GENERIC_WRITE, CREATE_ALWAYS);
    Start.hStdError = openInherited("NUL", GENERIC_WRITE, OPEN_EXISTING);
    std::string Command = "dot.exe -Tplain";
    PROCESS_INFORMATION Process = {};
    const bool IsStarted = CreateProcessA(nullptr, Command.data(), nullptr, nullptr, TRUE, 0,
                                          nullptr, nullptr, &Start, &Process) != 0;
    for (HANDLE Each : {Start.hStdInput, Start.hStdOutput, Start.hStdError})
        CloseHandle(Each);
    if (!IsStarted)
        return DotAnswer::NotThere;
    DWORD Status = 1;
    const bool IsInTime =
        WaitForSingleObject(Process.hProcess, static_cast<DWORD>(Seconds * 1000)) == WAIT_OBJECT_0;
    if (!IsInTime) {
        TerminateProcess(Process.hProcess, 1);
        WaitForSingleObject(Process.hProcess, INFINITE);
    }
    GetExitCodeProcess(Process.hProcess, &Status);
    CloseHandle(Process.hThread);
    CloseHandle(Process.hProcess);
    if (!IsInTime)
        return DotAnswer::TooSlow;
    return Status == 0 ? DotAnswer::Done : DotAnswer::Failed;
}

#else

int startDot(const std::string& Input, const std::string& Output, pid_t& Process) {
    posix_spawn_file_actions_t Files;
    posix_spawn_file_actions_init(&Files);
    posix_spawn_file_actions_addopen(&Files, 0, Input.c_str(), O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&Files, 1, Output.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    posix_spawn_file_actions_addopen(&Files, 2, "/dev/null", O_WRONLY, 0);
    std::string Name = "dot";
    std::string Form = "-Tplain";
    char* Arguments[] = {Name.data(), Form.data(), nullptr};
    const int Error = posix_spawnp(&Process, "dot", &Files, nullptr, Arguments, environ);
    posix_spawn_file_actions_destroy(&Files);
    return Error;
}

DotAnswer waitFor(pid_t Process, double Seconds) {
    using Clock = std::chrono::steady_clock;
    const Clock::time_point End = Clock::now() + std::chrono::duration_cast<Clock::duration>(
                                                     std::chrono::duration<double>(Seconds));
    int Status = 0;
    while (waitpid(Process, &Status, WNOHANG) == 0) {
        if (Clock::now() >= End) {
            kill(Process, SIGKILL);
            waitpid(Process, &Status, 0);
            return DotAnswer::TooSlow;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(3));
    }
    return WIFEXITED(Status) && WEXITSTATUS(Status) == 0 ? DotAnswer::Done : DotAnswer::Failed;
}

DotAnswer runProcess(const std::string& Input, const std::string& Output, double Seconds) {
    pid_t Process = 0;
    if (startDot(Input, Output, Process) != 0)
        return DotAnswer::NotThere;
    return waitFor(Process, Seconds);
}

#endif

} // namespace

std::string writeDot(const LayoutTask& Task) {
    std::string Text = "digraph{nodesep=0.3;ranksep=0.4;node[shape=box,fixedsize=true,label=\"\"];"
                       "edge[arrowsize=0.7];\n";
    for (std::size_t i = 0; i < Task.Boxes.size(); ++i) {
        char Line[96];
        std::snprintf(Line, sizeof Line, "%zu[width=%.3f,height=%.3f];\n", i,
                      Task.Boxes[i].Width / PixelsPerInch, Task.Boxes[i].Height / PixelsPerInch);
        Text += Line;
    }
    for (const LayoutTask::Edge& Each : Task.Edges)
        Text += std::to_string(Each.From) + "->" + std::to_string(Each.To) +
                "[color=" + colourOf(Each.What) + "];\n";
    return Text + "}\n";
}

bool readPlain(const std::string& Text, std::size_t BoxCount, PlacedPicture& Result) {
    Result = PlacedPicture();
    Result.Boxes.resize(BoxCount);
    std::istringstream Lines(Text);
    double Height = 0.0;
    for (std::string Row; std::getline(Lines, Row);) {
        std::istringstream Line(Row);
        std::string Word;
        Line >> Word;
        if (Word == "stop")
            return true;
        if (Word == "graph") {
            double Scale = 0.0;
            double Width = 0.0;
            Line >> Scale >> Width >> Height;
            Result.Width = pixels(Width);
            Result.Height = pixels(Height);
        } else if (Word == "node" && !readBox(Line, Height, Result)) {
            return false;
        } else if (Word == "edge" && !readEdge(Line, Height, Result)) {
            return false;
        }
    }
    return false;
}

DotAnswer runDot(const std::string& Dot, double Seconds, std::string& Plain) {
    const ScratchDirectory Scratch;
    if (!Scratch.isThere())
        return DotAnswer::Failed;
    if (!(std::ofstream(Scratch.file("in")) << Dot << std::flush))
        return DotAnswer::Failed;
    const DotAnswer Answer = runProcess(Scratch.file("in"), Scratch.file("out"), Seconds);
    if (Answer != DotAnswer::Done)
        return Answer;
    std::ostringstream Text;
    Text << std::ifstream(Scratch.file("out")).rdbuf();
    Plain = Text.str();
    return DotAnswer::Done;
}

} // namespace hpn
