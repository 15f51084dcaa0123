// What libFuzzer calls; built once for each target, whose function HPN_TARGET names.

#include "Targets/Targets.h"

#include <cstdio>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* pData, std::size_t Size) {
    const std::string Wrong = hpn::fuzz::HPN_TARGET(pData, Size);
    if (!Wrong.empty()) {
        std::fprintf(stderr, "%s\n", Wrong.c_str());
        std::abort();
    }
    return 0;
}
