#ifndef FLOWSKETCH_H
#define FLOWSKETCH_H

#include "Graph/HiddenVariables.h"

#include <cstdint>
#include <unordered_map>
#include <utility>
#include <vector>

namespace hpn {

/// What a block of the sketch does, in order of execution.
enum class ActionKind : std::uint8_t {
    Assign,      ///< pStatement: an assignment, or a declaration with an initialiser
    Zero,        ///< pVariable becomes 0
    Select,      ///< pVariable takes the value of a switch
    PrepareCall, ///< arguments that cannot stand in the call go into hidden variables
    Call,        ///< of a procedure, alone in its block
    TakeResult,  ///< of the call in front
    CallExtern,
    Return ///< the result variable takes the value
};

struct Action {
    ActionKind Kind;
    std::uint32_t Block;
    const Statement* pStatement;
    const Variable* pVariable;
};

/// A block of the sketch. Without a condition control goes to Next, or leaves the procedure if that
/// is none. The two ways of a condition never lead to the same block: an arm without code has an
/// empty block of its own. Where both edges of a dead branch ended in one phi function, the
/// optimiser could not tell which operands go with them, and a living one would be lost.
struct SketchBlock {
    static constexpr std::int32_t None = -1;

    const Expression* pCondition = nullptr; ///< decides between Next (true) and Otherwise
    const Variable* pSelector = nullptr;    ///< the condition is that this equals pCondition
    bool IsNeverLeft = false; ///< a way out that is never taken: Otherwise leaves the procedure
    bool IsReached = false;
    std::int32_t Next = None;
    std::int32_t Otherwise = None;
};

/// The control flow of one procedure as plain tables, made from the syntax tree before the
/// optimiser's graph: here it is known what nothing reaches and which loops are never left, before
/// anything is made that cannot be unmade.
///
///     syntax tree --sketch--> blocks and actions --GraphBuilder--> nodes, edges and statements
///
/// Block 0 is the first one; nothing jumps to it. Statements are walked with an explicit stack of
/// tasks, so nesting costs no stack; all steps are linear. One object serves one procedure after
/// the other and keeps its storage.
class FlowSketch {
public:
    explicit FlowSketch(HiddenVariables& Hidden) : m_Hidden(Hidden) {}

    /// Sketches a procedure; what was there is gone.
    void draw(const Procedure& Drawn);

    const std::vector<SketchBlock>& getBlocks() const { return m_Blocks; }
    /// In order of execution within each block; unreached blocks included.
    const std::vector<Action>& getActions() const { return m_Actions; }
    /// Control can come past a declaration, by a goto or a case.
    bool canBypassDeclarations() const { return m_CanBypassDeclarations; }
    /// Each label with the block that it begins, in the order of first mention; a label without a
    /// goto is there as well.
    const std::vector<std::pair<const Statement*, std::int32_t>>& getLabels() const {
        return m_LabelOrder;
    }

private:
    enum class TaskKind : std::uint8_t {
        List,
        Enter,
        Start,
        JumpTo,
        Branch,
        LeaveLoop,
        LeaveSwitch
    };
    struct Task {
        TaskKind Kind;
        const Statement* pStatement; // List: first of the rest; Branch: whose condition
        std::int32_t First;          // block; Branch: if true
        std::int32_t Second;         // Branch: if false
    };
    struct JumpTargets {
        std::int32_t Break;
        std::int32_t Continue;
    };
    struct SwitchFrame {
        std::int32_t Dispatch;
        std::int32_t Default;
        std::size_t FirstCase;
        const Variable* pSelector;
    };
    struct CaseLabel {
        const Statement* pStatement;
        std::int32_t Block;
    };

    void run(const Task& Next);
    void visit(const Statement* pStatement);
    void visitIf(const Statement* pStatement);
    void visitWhile(const Statement* pStatement);
    void visitDoWhile(const Statement* pStatement);
    void visitFor(const Statement* pStatement);
    void visitSwitch(const Statement* pStatement);
    void visitCase(const Statement* pStatement);
    void visitCall(const Statement* pStatement);
    void visitJump(const Statement* pStatement);
    void finishSwitch();

    std::int32_t newBlock();
    std::int32_t current();
    std::int32_t blockOfLabel(const Statement* pLabel);
    void enter(std::int32_t Block);
    void jumpTo(std::int32_t Block);
    void branch(const Expression* pCondition, std::int32_t IfTrue, std::int32_t IfFalse);
    void act(ActionKind Kind, const Statement* pStatement, const Variable* pVariable = nullptr);
    void push(TaskKind Kind, std::int32_t First, std::int32_t Second = SketchBlock::None,
              const Statement* pStatement = nullptr);
    void pushList(const Statement* pFirst);

    void markReached();
    void openEndlessLoops();
    std::vector<bool> findLeavable() const;
    void splitBackEdges(std::int32_t From, const std::vector<bool>& Leavable,
                        std::vector<std::uint8_t>& Colours);
    std::int32_t neverLeftBlock(std::int32_t Target);

    HiddenVariables& m_Hidden;
    const Procedure* m_pProcedure = nullptr;
    std::vector<SketchBlock> m_Blocks;
    std::vector<Action> m_Actions;
    std::vector<std::pair<const Statement*, std::int32_t>> m_LabelOrder;
    bool m_CanBypassDeclarations = false;

    // Valid while drawing.
    std::int32_t m_Current = SketchBlock::None; // none: control does not get here
    std::int32_t m_LeavingBlock = SketchBlock::None;
    bool m_CurrentHasActions = false;
    std::vector<Task> m_Tasks;
    std::vector<JumpTargets> m_Targets;
    std::vector<SwitchFrame> m_Switches;
    std::vector<CaseLabel> m_Cases;
    std::unordered_map<const Statement*, std::int32_t> m_Labels;
};

/// The argument has to be evaluated before the call: it reads an input, or a variable of the
/// procedure itself that the same call gives a new value.
bool mustPrepareArgument(const Expression* pArgument, const Procedure& Caller,
                         const Procedure& Callee);
/// The expression reads an input.
bool readsInput(const Expression* pExpression);

} // namespace hpn

#endif
