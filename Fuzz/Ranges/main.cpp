#include "Ranges/RangeProof.h"

#include <cstdio>
#include <cstring>

/// Prints the table of the proof of the client's interval arithmetic; with --list every case that
/// is wider than it could be. Exit status 1: a range was too narrow.
int main(int Count, char** ppArguments) {
    const bool IsList = Count > 1 && std::strcmp(ppArguments[1], "--list") == 0;
    const std::vector<hpn::proof::Finding> Findings = hpn::proof::proveRanges(IsList);
    const std::string Text =
        IsList ? hpn::proof::printWideCases(Findings) : hpn::proof::printTable(Findings);
    std::fwrite(Text.data(), 1, Text.size(), stdout);
    for (const hpn::proof::Finding& Next : Findings) {
        if (Next.Narrow != 0)
            return 1;
    }
    return 0;
}
