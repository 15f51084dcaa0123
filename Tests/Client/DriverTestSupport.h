#ifndef DRIVERTESTSUPPORT_H
#define DRIVERTESTSUPPORT_H

#include "Oracles/HostShell.h"

#include <filesystem>
#include <fstream>
#include <map>
#include <string>

/// Runs the built driver in a directory of its own, which goes with the object.
class DriverRun {
public:
    DriverRun() : m_Directory(hostshell::makeDirectory("hpncg-test")) {}
    ~DriverRun() {
        std::error_code Ignored;
        std::filesystem::remove_all(m_Directory, Ignored);
    }
    DriverRun(const DriverRun&) = delete;
    DriverRun& operator=(const DriverRun&) = delete;

    /// Exit status of `hpncg ARGUMENTS` in the directory, through a shell; `Before` stands in front
    /// of the command.
    int run(const std::string& Arguments, const std::string& Before = "") {
        return hostshell::status("cd " + m_Directory + " && " + Before + " " + driver() + " " +
                                 Arguments + " >stdout 2>stderr");
    }
    std::string output() const { return read("stdout"); }
    std::string errors() const { return read("stderr"); }

    void write(const std::string& Name, const std::string& Text) const {
        std::ofstream(m_Directory + "/" + Name, std::ios::binary) << Text;
    }
    std::string read(const std::string& Name) const { return readFile(m_Directory + "/" + Name); }
    const std::string& directory() const { return m_Directory; }

    /// Every file below a directory by its name, with its text.
    std::map<std::string, std::string> files(const std::string& Name = "") const {
        std::map<std::string, std::string> Result;
        const std::filesystem::path Root = std::filesystem::path(m_Directory) / Name;
        for (const auto& Entry : std::filesystem::recursive_directory_iterator(Root))
            if (Entry.is_regular_file())
                Result[Entry.path().lexically_relative(Root).generic_string()] =
                    readFile(Entry.path());
        return Result;
    }

    static std::string readFile(const std::filesystem::path& Path) {
        return hostshell::readFile(Path);
    }
    /// The driver of the same build as this test.
    static std::string driver() {
#ifdef _WIN32
        return HPNSSA_SOURCE_DIR "/cmake/windows/run-windows-program " HPNCG_PATH;
#else
        return HPNCG_PATH;
#endif
    }

private:
    std::string m_Directory;
};

#endif
