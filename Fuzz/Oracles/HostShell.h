#ifndef HOSTSHELL_H
#define HOSTSHELL_H

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#ifdef _WIN32
#include <chrono>
#include <process.h>
#include <thread>
#else
#include <sys/wait.h>
#include <unistd.h>
#endif

/// The shell of the machine that builds and tests: what the tests let the C compiler and the driver
/// do goes through it. Tests built for Windows run under wine, which has neither shell nor
/// compiler: they put their commands into the folder HPN_SHELL_FOLDER, where Scripts/test-windows
/// takes them, runs them, and puts the answers.
namespace hostshell {

inline std::string readFile(const std::filesystem::path& Path) {
    std::ifstream Stream(Path, std::ios::binary);
    return {std::istreambuf_iterator<char>(Stream), {}};
}

#ifdef _WIN32

inline std::string folder() {
    const char* pFolder = std::getenv("HPN_SHELL_FOLDER");
    return pFolder != nullptr ? pFolder : "/tmp";
}

inline std::string uniqueName() {
    static unsigned s_Count = 0;
    return std::to_string(::_getpid()) + "-" + std::to_string(++s_Count);
}

/// Runs a command; gives what it prints, and its exit status.
inline std::string run(const std::string& Command, int& Status) {
    const std::string Name = folder() + "/" + uniqueName();
    std::ofstream(Name + ".begun", std::ios::binary) << Command;
    std::filesystem::rename(Name + ".begun", Name + ".command");
    while (!std::filesystem::exists(Name + ".status"))
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    Status = std::atoi(readFile(Name + ".status").c_str());
    const std::string Output = readFile(Name + ".output");
    // A later process may get this one's number, and must not find its answers.
    std::filesystem::remove(Name + ".output");
    std::filesystem::remove(Name + ".status");
    return Output;
}

/// A new directory, by a name that also the shell understands.
inline std::string makeDirectory(const std::string& Purpose) {
    const std::string Name = folder() + "/" + Purpose + "-" + uniqueName();
    std::filesystem::create_directory(Name);
    return Name;
}

#else

/// Runs a command; gives what it prints, and its exit status (-1: it was ended).
inline std::string run(const std::string& Command, int& Status) {
    std::string Output;
    std::FILE* pPipe = ::popen(Command.c_str(), "r");
    char Buffer[4096];
    while (const std::size_t Count =
               pPipe != nullptr ? std::fread(Buffer, 1, sizeof Buffer, pPipe) : 0)
        Output.append(Buffer, Count);
    const int Ended = pPipe != nullptr ? ::pclose(pPipe) : -1;
    Status = WIFEXITED(Ended) ? WEXITSTATUS(Ended) : -1;
    return Output;
}

/// A new directory, by a name that also the shell understands.
inline std::string makeDirectory(const std::string& Purpose) {
    std::string Name = (std::filesystem::temp_directory_path() / (Purpose + "-XXXXXX")).string();
    return ::mkdtemp(Name.data()) != nullptr ? Name : "";
}

#endif

/// The exit status of a command that has nothing to print.
inline int status(const std::string& Command) {
    int Status = 0;
    run(Command, Status);
    return Status;
}

} // namespace hostshell

#endif
