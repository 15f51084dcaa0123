#ifndef GRAPHCODE_H
#define GRAPHCODE_H

#include "Graph/ProgramGraph.h"

#include <cstddef>
#include <cstdint>
#include <string>
#include <unordered_map>
#include <vector>

class ZfCBasicBlock;
class ZfCCfgAssignment;
class ZfCCfgExpression;
class ZfCCfgParamStatement;
class ZfCCfgProcedureCall;
class ZfCCfgSFProcedureCall;
class ZfCCfgStatement;
class ZfCCfgValueReturnStatement;
class ZfCPhiFunction;

namespace hpn::fuzz {

// The graph of a program as it stands at one moment, as arrays that a machine can run quickly:
// expressions in postfix form, statements by kind, nodes by number. `GraphInterpreter` runs it. It
// names variables by slots, one for each scalar and one for each element of an array, and versions
// by numbers. Nothing in it points into the graph, but it names types and externs of the program,
// which must outlive it.

constexpr std::int32_t None = -1;

enum class CodeOp : std::uint8_t {
    Number,      ///< push Number
    Load,        ///< push slot A; B is the version that is read, or None
    LoadInput,   ///< the same of an input; A is the slot, B the variable
    LoadElement, ///< the index is replaced by the element; A is the variable
    Unary,
    Binary,
    Cast,
    SkipIfFalse, ///< `&&` behind its left operand: 0 and on at A if that is 0, else it is dropped
    SkipIfOne,   ///< `||` likewise: 1 and on at A if the left operand is 1
    IsNotZero,   ///< end of `&&`
    IsOne        ///< end of `||`
};

struct CodeStep {
    CodeOp Op = CodeOp::Number;
    Operator Kind = Operator::Number; ///< Unary, Binary
    std::int32_t A = 0;
    std::int32_t B = None;
    double Number = 0.0;
    const Type* pType = nullptr; ///< Cast
};

/// Steps [First, End) of the code leave one number.
struct CodeRange {
    std::int32_t First = 0;
    std::int32_t End = 0;
    bool isEmpty() const { return First == End; }
};

/// What propagation says of one version.
struct Claim {
    enum class Kind : std::uint8_t { Nothing, Constant, Range };
    Kind What = Kind::Nothing;
    double Low = 0.0;
    double High = 0.0;
};

/// One SSA version that takes part in the checks: its variable is neither volatile nor an array.
struct Version {
    std::int32_t Slot = None;
    unsigned Serial = 0; ///< number in the dumps
    Claim Claimed;
    bool IsUndetermined = false; ///< propagation has concluded nothing
};

enum class ActionOp : std::uint8_t {
    Assign,     ///< slot A takes the value; B is the version defined
    Store,      ///< element of variable A: the index first, then the value
    Call,       ///< CallSites[A]
    CallExtern, ///< Externs[A] of the program; B versions from [First] of Operands are read
    Define,    ///< version B begins with what its slot holds (start value, explicit parameter, note
               ///< from a branch)
    Parameter, ///< version B has been handed over by the call
    Phi,       ///< version B is operand [First + way in] of Operands, A of them
    ValueReturn ///< version B is the callee's version A at its exit
};

struct ActionStep {
    ActionOp Op = ActionOp::Assign;
    bool MustFit = false; ///< the value has not been converted to the slot's type and must be one
                          ///< of its numbers
    std::int32_t A = None;
    std::int32_t B = None;
    CodeRange Value;
    CodeRange Index;
    std::int32_t First = 0;
};

enum class NodeKind : std::uint8_t {
    Plain,
    Branch,
    NeverLeft, ///< a way out that is never taken
    StepEnd,   ///< the loop around main
    Exit
};

/// A way to a node, and the place of the edge among the target's control flow in-edges.
struct Way {
    std::int32_t Node = None;
    std::int32_t Position = 0;
};

struct CodeNode {
    NodeKind Kind = NodeKind::Plain;
    bool IsJoin = false; ///< control arrives by other than one edge
    std::int32_t FirstAction = 0;
    std::int32_t EndAction = 0;
    CodeRange Condition;
    Way True; ///< also the only way
    Way False;
    std::uint32_t GraphIndex = 0; ///< of the graph's node, for messages
};

/// One argument of a call.
struct CodeArgument {
    std::int32_t Slot = None;
    const Type* pType = nullptr;
    CodeRange Value; ///< empty: the formal is not passed any more
};

/// What a parameter statement takes over at a call.
struct HandedVersion {
    std::int32_t Given = None; ///< of the caller
    std::int32_t Taken = None; ///< of the callee
};

struct CallSite {
    std::int32_t Procedure = None;
    std::int32_t FirstArgument = 0;
    std::int32_t EndArgument = 0;
    std::int32_t FirstHanded = 0;
    std::int32_t EndHanded = 0;
};

struct CodeProcedure {
    std::string Name;
    const hpn::Procedure* pSource = nullptr; ///< null: "#outside"
    Way Entry;
    bool IsRecursive = false;
    std::vector<std::int32_t> OwnSlots; ///< of an activation, if it is recursive
};

/// Where a variable lives.
struct Storage {
    const Variable* pVariable = nullptr;
    std::int32_t Slot = 0;
    std::int32_t Count = 1;
};

struct GraphCode {
    std::vector<Storage> Variables;             ///< by Variable::Index
    std::vector<const Variable*> SlotVariables; ///< by slot
    std::vector<CodeStep> Code;
    std::vector<ActionStep> Actions;
    std::vector<CodeNode> Nodes;
    std::vector<std::int32_t> Operands; ///< versions
    std::vector<CodeArgument> Arguments;
    std::vector<HandedVersion> Handed;
    std::vector<CallSite> CallSites;
    std::vector<CodeProcedure> Procedures;
    std::vector<Version> Versions;
    std::int32_t MainProcedure = None;
    bool IsSSAForm = false;
    /// What is wrong with the graph itself, found while reading it.
    std::vector<std::string> Faults;
};

/// What the interpreter should check besides running the program.
struct CodeOptions {
    bool IsSSAForm =
        false; ///< known to be, even where no statement shows it any more; else it is found out
    bool ChecksVersions =
        true; ///< reads of versions against the stored variables; not behind hoisting
    bool ChecksClaims = true; ///< constants and ranges of propagation
};

/// Reads a graph at any point of the road. Linear; the graph is not changed.
GraphCode readGraph(ProgramGraph& Graph, const CodeOptions& Options = {});

} // namespace hpn::fuzz

#endif
