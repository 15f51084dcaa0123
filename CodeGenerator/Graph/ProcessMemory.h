#ifndef PROCESSMEMORY_H
#define PROCESSMEMORY_H

namespace hpn {

/// Sets a process up for the memory of program graphs: the optimiser's records come from pools, and
/// what the standard heap gets back stays in the process. For programs that optimise and end; to be
/// called once, before the first graph.
void usePooledMemory();

} // namespace hpn

#endif
