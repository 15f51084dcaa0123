#include "Graph/ProcessMemory.h"

#include "ZfCPooledMemController.h"

#include <cstdlib>
#ifdef __GLIBC__
#include <malloc.h>
#endif

namespace hpn {

void usePooledMemory() {
    static ZfCPooledMemController s_Controller;
    pZFMemory = &s_Controller;
#if defined(__GLIBC__)
    // Tables of a pass are large and short-lived. By default the heap gives each of them back to
    // the system, which clears the same pages again for the next.
    mallopt(M_MMAP_THRESHOLD, 1 << 30);
    mallopt(M_TRIM_THRESHOLD, 1 << 30);
    mallopt(M_TOP_PAD, 1 << 24);
#endif
}

} // namespace hpn
