#ifndef TESTJOINER_H
#define TESTJOINER_H

#include "Emitter/FlowReader.h"

namespace hpn {

/// Makes one branch of two where the second one only asks on behalf of the first: cases that share
/// their code, nested ifs without else. In C they are joined by `||` or `&&`, which ask in the same
/// order and stop at the same place.
///
///     a? --true--> B          a || b? --true--> B
///     |false                     |false
///     b? --true--> B    ==>      Z
///     |false
///     Z
///
/// Nodes that are left empty vanish; the others keep their order. Linear.
void joinTests(ProcedureFlow& Flow);

} // namespace hpn

#endif
