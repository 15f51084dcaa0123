#include "Model/PendingWarnings.h"

namespace hpn {

std::vector<PendingWarning>& pendingWarnings() {
    static std::vector<PendingWarning> s_Warnings;
    return s_Warnings;
}

} // namespace hpn
