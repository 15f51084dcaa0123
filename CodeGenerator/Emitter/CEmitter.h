#ifndef CEMITTER_H
#define CEMITTER_H

#include <string>

namespace hpn {

class ProgramGraph;

struct EmitOptions {
    /// Put in front of every name at file scope, inputs, outputs and procedures included: several
    /// programs in one image.
    std::string Prefix;
};

/// The C text of a program.
struct EmittedProgram {
    std::string Source;
    bool NeedsRuntime = false; ///< it includes hpn_runtime.h
};

/// Reads a program's graph back as C99. The graph may stand before, between or after any of the
/// passes: what is emitted is what stands in the blocks, SSA versions under the names of their
/// variables; boundary statements, phi functions and virtual statements leave no trace. Emitted are
/// `<program>_init`, which sets every variable to its declared value, `<program>_step`, the body of
/// main, and a static function for each procedure that is still called (external linkage: an
/// exported one). Outputs, inputs and what an extern touches are external, inputs volatile;
/// everything else is static or local.
///
/// The graph is not changed. The same graph gives the same bytes. Cost: near-linear in the size of
/// the graph.
EmittedProgram emitProgram(ProgramGraph& Graph, const EmitOptions& Options = {});

} // namespace hpn

#endif
