#include "Driver/OutputFiles.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <sys/stat.h>
#include <unistd.h>

// Not every system knows them; both are no more than hints or lie in the nature of the system.
#ifndef O_CLOEXEC
#define O_CLOEXEC 0
#endif
#ifndef O_BINARY
#define O_BINARY 0
#endif

namespace hpn {

namespace {

std::string resolveLinks(const std::string& Path) {
    std::error_code Error;
    const std::filesystem::path Resolved = std::filesystem::weakly_canonical(Path, Error);
    return Error ? Path : Resolved.string();
}

// A name in the same directory, so that renaming cannot fail for lack of a common file system.
std::string temporaryNameOf(const std::string& Path) {
    const std::filesystem::path Full(Path);
    const std::string Name =
        "." + Full.filename().string() + "." + std::to_string(getpid()) + ".tmp";
    return (Full.parent_path() / Name).string();
}

bool isSpecialFile(const std::string& Path) {
    struct stat Status;
    return stat(Path.c_str(), &Status) == 0 && !S_ISREG(Status.st_mode);
}

bool writeAll(int Descriptor, const std::string& Text) {
    std::size_t Done = 0;
    while (Done < Text.size()) {
        const ssize_t Count = ::write(Descriptor, Text.data() + Done, Text.size() - Done);
        if (Count < 0 && errno != EINTR)
            return false;
        Done += Count > 0 ? static_cast<std::size_t>(Count) : 0;
    }
    return true;
}

std::string describeFailure(const std::string& Path) {
    return "cannot write '" + Path + "': " + std::strerror(errno);
}

} // namespace

OutputFiles::~OutputFiles() {
    for (const File& Each : m_Files)
        if (!Each.Temporary.empty())
            ::unlink(Each.Temporary.c_str());
}

void OutputFiles::add(std::string Path, const std::string& Text) {
    m_Files.push_back({resolveLinks(Path), "", &Text});
}

bool OutputFiles::write(std::string& Why) {
    for (File& Each : m_Files)
        if (!writeOne(Each, Why))
            return false;
    for (File& Each : m_Files) {
        if (Each.Temporary.empty())
            continue;
        std::error_code Error;
        std::filesystem::rename(Each.Temporary, Each.Path, Error);
        if (Error) {
            Why = "cannot write '" + Each.Path + "': " + Error.message();
            return false;
        }
        Each.Temporary.clear();
    }
    return true;
}

bool OutputFiles::writeOne(File& Target, std::string& Why) {
    const bool IsDirect = isSpecialFile(Target.Path);
    const std::string Name = IsDirect ? Target.Path : temporaryNameOf(Target.Path);
    const int Flags = O_WRONLY | O_BINARY | O_CLOEXEC | (IsDirect ? 0 : O_CREAT | O_TRUNC);
    const int Descriptor = ::open(Name.c_str(), Flags, 0666);
    if (Descriptor < 0) {
        Why = describeFailure(Target.Path);
        return false;
    }
    if (!IsDirect)
        Target.Temporary = Name;
    const bool IsWritten = writeAll(Descriptor, *Target.pText);
    if (!IsWritten)
        Why = describeFailure(Target.Path);
    if (::close(Descriptor) != 0 && IsWritten) {
        Why = describeFailure(Target.Path);
        return false;
    }
    return IsWritten;
}

bool holdsText(const std::string& Path, const std::string& Text) {
    std::ifstream Stream(Path, std::ios::binary);
    if (!Stream)
        return false;
    const std::string Found{std::istreambuf_iterator<char>(Stream), {}};
    return Found == Text;
}

bool writeStandardOutput(const std::string& Text) {
    return std::fwrite(Text.data(), 1, Text.size(), stdout) == Text.size() &&
           std::fflush(stdout) == 0;
}

} // namespace hpn
