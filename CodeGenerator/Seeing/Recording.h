#ifndef RECORDING_H
#define RECORDING_H

#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

namespace hpn {

// What one run of the optimiser did, as plain data: no pointer into graph, library or program, so
// that it outlives all of them. `Recorder` fills it, `recordingToJson` and the reports read it.
//
// States are shared. A statement, a node or a procedure that a pass leaves alone has one state for
// all snapshots, kept once in a pool and named by its place there; so a recording grows with what
// changes and not with the number of passes times the size of the program.
//
// Numbers that name things: an *index* is a place in one of the pools or tables of `Recording` (-1:
// none); an *id* stays with the same node or statement through all snapshots and means nothing
// else.

/// A place in the sources as an editor shows it, from 1. Line 0: the program text has no such
/// place.
struct RecordedPlace {
    unsigned File = 0; ///< index into Sources
    unsigned Line = 0;
    unsigned Column = 0;

    bool isKnown() const { return Line != 0; }
};

inline bool operator==(const RecordedPlace& a, const RecordedPlace& b) {
    return a.File == b.File && a.Line == b.Line && a.Column == b.Column;
}
inline bool operator!=(const RecordedPlace& a, const RecordedPlace& b) {
    return !(a == b);
}

/// One text of the program.
struct RecordedSource {
    std::string Name;
    std::string Text;
};

/// What is known of a number.
struct RecordedRange {
    enum class Kind : std::uint8_t {
        Unknown,      ///< no propagation has run, or it says nothing (arrays, what changes outside)
        Undetermined, ///< never reached, or a loop that only feeds itself
        Constant,     ///< always Low
        Range,        ///< from Low to High
        Anything      ///< whatever the type can hold
    };
    Kind What = Kind::Unknown;
    double Low = 0.0;
    double High = 0.0;
};

/// What a statement is. The first five, Argument and Condition make code; the others stand on the
/// graph for the analysis alone.
enum class RecordedForm : std::uint8_t {
    Assignment,
    Store, ///< to an array element
    Call,
    ExternCall,
    Argument,     ///< assignment to a former formal, put in by inlining
    Condition,    ///< decides which way control goes; the last one of its node
    InitialValue, ///< of a variable, at the start of main
    Parameter,    ///< what a procedure is handed, over all its calls
    ValueReturn,  ///< what a call leaves in a variable
    Output,       ///< the outside reads an output
    Join,         ///< phi function
    Note          ///< what a branch tells about its variable
};

/// One read of a variable in a statement.
struct RecordedRead {
    int Variable = -1; ///< index into Variables
    int Version = -1;  ///< index into Versions; -1 before SSA form
    RecordedPlace Place;
};

/// One state of a statement or condition.
struct RecordedStatement {
    unsigned Id = 0; ///< of a condition: the same in all snapshots while it stands in its node
    RecordedForm Form = RecordedForm::Assignment;
    bool MakesCode = true;
    std::string Text; ///< in the program's own words; versions as `throttle.3`
    RecordedPlace Place;
    int Variable = -1; ///< it defines; index into Variables
    int Version = -1;  ///< it defines; index into Versions; -1 before SSA form
    std::vector<RecordedRead> Reads;
};

/// One state of a node of the graph.
struct RecordedNode {
    enum class Kind : std::uint8_t { Entry, Exit, Block };
    unsigned Id = 0;
    Kind What = Kind::Block;
    std::vector<int> Statements; ///< indices into Statements; the condition, if any, is the last
    RecordedPlace Place;         ///< of the first statement that has one
};

/// A way from node to node, by ids.
struct RecordedEdge {
    enum class Kind : std::uint8_t {
        Flow,
        True,  ///< taken if the condition holds
        False, ///< taken if not
        Ssa    ///< from a definition to one of its uses
    };
    unsigned From = 0;
    unsigned To = 0;
    Kind What = Kind::Flow;
};

/// A call, by the node that it stands in.
struct RecordedCall {
    unsigned Node = 0;
    std::string Callee; ///< name of the procedure on the graph
    RecordedPlace Place;
};

/// One state of a procedure.
struct RecordedProcedure {
    std::string Name;  ///< on the graph: "#main", "measure", "#outside"
    std::string Title; ///< to show: "main", "measure", "callers outside"
    RecordedPlace Place;
    std::vector<int> Nodes; ///< indices into Nodes, in order of creation
    std::vector<RecordedEdge> Edges;
    std::vector<RecordedCall> Calls;
};

/// What happened to a node between a snapshot and the one before it.
enum class RecordedMark : std::uint8_t { Added, Removed, Changed };

/// What one pass did at one place.
struct RecordedChange {
    enum class Kind : std::uint8_t {
        Added,    ///< a statement that was not there
        Removed,  ///< a statement that is not there any more
        Replaced, ///< another text in its place
        Inlined,  ///< a call whose procedure now stands in its place
        Hoisted   ///< moved in front of its branch
    };
    Kind What = Kind::Replaced;
    int Before = -1; ///< index into Statements; -1 for Added
    int After = -1;  ///< index into Statements; -1 for Removed and Inlined
    unsigned Node = 0;
    std::string Procedure; ///< name of the procedure that it stands in (for Removed: stood)
    std::string Why;       ///< grounds, as a phrase; may be empty
};

/// The program on the graph after one pass; number 0 is the graph as it was built.
struct RecordedSnapshot {
    unsigned Number = 0;
    std::string Pass; ///< name; "asBuilt" for number 0
    std::string Purpose;
    double Seconds = 0.0;                ///< what the pass took
    std::vector<int> Procedures;         ///< indices into Procedures, in order of their entry nodes
    std::vector<RecordedChange> Changes; ///< against the snapshot before, in order of the nodes
    std::vector<std::pair<unsigned, RecordedMark>> Marks; ///< node ids; unmarked: unchanged
    std::size_t NodeCount = 0;
    std::size_t StatementCount = 0; ///< that make code, conditions left out
    std::size_t ConditionCount = 0;
    std::size_t Tally[5] = {}; ///< changes by RecordedChange::Kind
};

/// One line of an explanation. A line that names a version says what is known of it; that version's
/// own explanation goes on from there (`unfoldExplanation` does that).
struct RecordedReason {
    std::string Text;
    RecordedPlace Place; ///< where to look; may be unknown
    int Version = -1;    ///< index into Versions
};

/// One SSA version of a variable, as the last propagation saw it.
struct RecordedVersion {
    int Variable = -1;
    unsigned Number = 0; ///< from 1 for each variable, in order of making
    std::string Name;    ///< "throttle.3"
    int Definition = -1; ///< index into Statements: state right after the propagation (the last one
                         ///< known, if it was removed as never reached)
    bool IsReached = false; ///< its definition was on the graph after the propagation
    RecordedPlace Place;
    RecordedRange Found;
    std::vector<RecordedPlace> Uses;         ///< in the program text, after the propagation
    std::vector<RecordedReason> Explanation; ///< why it is constant, or why not: one step
};

/// One variable of the program, hidden ones included (their names are not in the text).
struct RecordedVariable {
    std::string Name;
    std::string Owner; ///< procedure of a local, formal or result; empty: global
    std::string Kind;  ///< input, output, state, param, local, formal, result
    bool IsHidden = false;
    std::string Type;
    std::string Base; ///< storage: "uint16"
    std::string Unit; ///< of the physical value, from the comment behind the type; may be empty
    bool IsScaled = false;
    double Lsb = 1.0;
    double Offset = 0.0;
    double StorageLow = 0.0; ///< physical numbers that the storage can hold
    double StorageHigh = 0.0;
    bool HasLimits = false; ///< a range was declared
    double Lower = 0.0;
    double Upper = 0.0;
    bool SaturatesLow = false;
    bool SaturatesHigh = false;
    unsigned Count = 0; ///< elements; 0: a scalar
    double Initial = 0.0;
    RecordedPlace Place;
    std::string NotTracked;    ///< why no value is known of it at any place; empty: it is tracked
    std::string KeptBecause;   ///< why its definitions stay though nothing reads them; empty: they
                               ///< may go
    RecordedRange Found;       ///< over all versions
    std::vector<int> Versions; ///< indices into Versions
    std::vector<RecordedPlace> Definitions; ///< as built: where it is assigned
    std::vector<RecordedPlace> Uses;        ///< as built: where it is read
};

/// How an assignment to a saturating variable meets the limits of its type.
struct RecordedSaturation {
    enum class Answer : std::uint8_t { Never, May, Always, NotReached };
    int Statement = -1; ///< index into Statements: state right after the propagation
    int Variable = -1;
    RecordedPlace Place;
    Answer Low = Answer::Never; ///< Never also where that side does not saturate
    Answer High = Answer::Never;
    RecordedRange Value; ///< before it is clipped
};

/// What became of a statement of the program: removed, or still there though nothing reads what it
/// defines.
struct RecordedFate {
    int Statement = -1; ///< index into Statements: its last state
    bool IsRemoved = false;
    unsigned Snapshot = 0; ///< number of the snapshot that lacks it first; kept ones: the last one
    /// Of a kept one: its value reaches code that reads it, over joins, calls or steps.
    bool GoesOn = false;
    /// Of a kept one: no code that is left reads any version of the variable.
    bool LooksUnused = false;
    std::string Why;
    RecordedPlace Because; ///< the place that the grounds point to; may be unknown
};

/// What a compiler would say about a place.
struct RecordedRemark {
    enum class Kind : std::uint8_t {
        Passed,  ///< something was done
        Missed,  ///< something was not done, and why
        Analysis ///< something was found out
    };
    Kind What = Kind::Passed;
    std::string Pass;
    std::string Name; ///< one word for tools: "Inlined", "NotInlined", "ConstantRead"...
    std::string Text;
    RecordedPlace Place;
};

/// The whole of it.
struct Recording {
    std::string Program;
    std::vector<std::string> Assumptions; ///< what holds for this run alone (--set, --range...)
    std::vector<RecordedSource> Sources;
    std::vector<RecordedVariable> Variables;
    std::vector<RecordedVersion> Versions;
    std::vector<RecordedStatement> Statements; ///< pool of states
    std::vector<RecordedNode> Nodes;           ///< pool of states
    std::vector<RecordedProcedure> Procedures; ///< pool of states
    std::vector<RecordedSnapshot> Snapshots;
    std::vector<RecordedFate> Fates;
    std::vector<RecordedSaturation> Saturations;
    std::vector<RecordedRemark> Remarks;
    std::string CodeBefore; ///< C without any pass
    std::string CodeAfter;
};

/// A line of an explanation that has been followed to its end; `Depth` indents it below what it
/// explains.
struct ExplainedLine {
    std::string Text;
    RecordedPlace Place;
    unsigned Depth = 0;
};
/// Follows the explanation of a version through the versions that it names, each one once. The
/// second form also leaves out what has been told before; `IsTold` goes by version and may be empty
/// at first.
std::vector<ExplainedLine> unfoldExplanation(const Recording& Of, int Version);
std::vector<ExplainedLine> unfoldExplanation(const Recording& Of, int Version,
                                             std::vector<bool>& IsTold);

/// Words of the enumerations, as the JSON form writes them.
const char* nameOf(RecordedRange::Kind Kind);
const char* nameOf(RecordedForm Form);
const char* nameOf(RecordedNode::Kind Kind);
const char* nameOf(RecordedEdge::Kind Kind);
const char* nameOf(RecordedMark Mark);
const char* nameOf(RecordedChange::Kind Kind);
const char* nameOf(RecordedSaturation::Answer Answer);
const char* nameOf(RecordedRemark::Kind Kind);

/// A recording as one JSON object; members bear the names of the data model in lower camel case,
/// states are named by index. Same recording, same bytes.
std::string recordingToJson(const Recording& Of);

} // namespace hpn

#endif
