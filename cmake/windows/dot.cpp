#include "Oracles/HostShell.h"

#include <fcntl.h>
#include <io.h>
#include <iostream>

// Graphviz for programs that run under wine: hands its words and its input to the dot of the
// machine that tests.
int main(int argc, char** argv) {
    _setmode(_fileno(stdin), _O_BINARY);
    _setmode(_fileno(stdout), _O_BINARY);
    const std::string Directory = hostshell::makeDirectory("dot");
    std::ofstream(Directory + "/graph", std::ios::binary) << std::cin.rdbuf();
    std::string Command = "dot";
    for (int i = 1; i < argc; ++i)
        Command += std::string(" ") + argv[i];
    int Status = 0;
    std::cout << hostshell::run(Command + " <" + Directory + "/graph 2>/dev/null", Status);
    std::filesystem::remove_all(Directory);
    return Status;
}
