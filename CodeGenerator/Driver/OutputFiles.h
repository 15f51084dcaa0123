#ifndef OUTPUTFILES_H
#define OUTPUTFILES_H

#include <string>
#include <vector>

namespace hpn {

/// Files that are written whole or not at all: each text goes to a new file beside its place, and
/// only when all of them are complete they take their names. What does not become a regular file (a
/// device, a pipe) is written directly. Nothing of a failed set is left behind.
class OutputFiles {
public:
    OutputFiles() = default;
    ~OutputFiles();
    OutputFiles(const OutputFiles&) = delete;
    OutputFiles& operator=(const OutputFiles&) = delete;

    /// The text must outlive this object.
    void add(std::string Path, const std::string& Text);
    /// False: nothing has been changed, and `Why` names the file and the reason. A failure while
    /// the complete files take their names, which the system all but excludes, can leave the
    /// earlier ones.
    bool write(std::string& Why);

private:
    struct File {
        std::string Path;      ///< links resolved
        std::string Temporary; ///< empty: not there, or written directly
        const std::string* pText;
    };

    static bool writeOne(File& Target, std::string& Why);

    std::vector<File> m_Files;
};

/// Whether a file already holds just this text.
bool holdsText(const std::string& Path, const std::string& Text);
/// Writes to standard output; false if that failed.
bool writeStandardOutput(const std::string& Text);

} // namespace hpn

#endif
