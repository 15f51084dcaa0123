#ifndef CRUNNER_H
#define CRUNNER_H

#include "Oracles/HostShell.h"

#include <filesystem>
#include <fstream>
#include <string>

/// A directory of its own in which C text is compiled by the C compiler and run; it goes with the
/// object unless something failed, so that the text can be looked at.
class CRunner {
public:
    CRunner() : m_Directory(hostshell::makeDirectory("hpn-test")) {}
    ~CRunner() {
        if (!m_Failed)
            std::filesystem::remove_all(m_Directory);
    }
    CRunner(const CRunner&) = delete;
    CRunner& operator=(const CRunner&) = delete;

    const std::filesystem::path& directory() const { return m_Directory; }
    void write(const std::string& Name, const std::string& Text) const {
        std::ofstream(m_Directory / Name, std::ios::binary) << Text;
    }
    /// Compiles "<name>.c", warnings are errors; gives the compiler's messages, empty if all is
    /// well.
    std::string compile(const std::string& Name, const std::string& Options,
                        const std::string& Compiler = "gcc") {
        const std::string Command = "cd " + m_Directory.generic_string() + " && " + Compiler +
                                    " -std=c99 -Wall -Wextra -Werror -I" HPNSSA_SOURCE_DIR
                                    "/CodeGenerator/Runtime " +
                                    Options + " " + Name + ".c -o " + Name + " 2>&1";
        int Status = 0;
        std::string Messages = hostshell::run(Command, Status);
        m_Failed = m_Failed || Status != 0;
        return Status == 0 ? std::string() : Command + "\n" + Messages;
    }
    /// What the program prints; a failure of it is the last line.
    std::string run(const std::string& Name) {
        int Status = 0;
        std::string Output =
            hostshell::run((m_Directory / Name).generic_string() + " 2>&1", Status);
        if (Status != 0) {
            m_Failed = true;
            Output += "status " + std::to_string(Status) + "\n";
        }
        return Output;
    }
    void keep() { m_Failed = true; }

private:
    std::filesystem::path m_Directory;
    bool m_Failed = false;
};

#endif
