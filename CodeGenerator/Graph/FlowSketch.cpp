#include "Graph/FlowSketch.h"

// Control flow out of structured statements and jumps.
//
// 1. Walk the statements with a stack of tasks. A compound statement pushes what is to be done
// behind its parts, last first, so
//    each part is walked between the blocks that it joins.
// 2. A case is noted where it stands; the chain of comparisons is made when the switch is left and
// all cases are known.
// 3. Mark what is reached from block 0; the rest is never built.
// 4. Loops without a way out: where no leaving block can be reached, each back edge of a
// depth-first walk gets a block with a
//    way out that is never taken. Every cycle has a back edge, so every block can then reach an end
//    of the procedure.
// Complexity: linear in statements and blocks.

namespace hpn {

namespace {

bool readsOwnVariable(const Expression* pExpression, const Procedure& Owner) {
    if (pExpression == nullptr)
        return false;
    if (pExpression->pVariable != nullptr && pExpression->pVariable->pOwner == &Owner)
        return true;
    return readsOwnVariable(pExpression->pLeft, Owner) ||
           readsOwnVariable(pExpression->pRight, Owner);
}

} // namespace

bool readsInput(const Expression* pExpression) {
    if (pExpression == nullptr)
        return false;
    if (pExpression->pVariable != nullptr && pExpression->pVariable->Kind == VariableKind::Input)
        return true;
    return readsInput(pExpression->pLeft) || readsInput(pExpression->pRight);
}

bool mustPrepareArgument(const Expression* pArgument, const Procedure& Caller,
                         const Procedure& Callee) {
    return readsInput(pArgument) || (&Caller == &Callee && readsOwnVariable(pArgument, Caller));
}

void FlowSketch::draw(const Procedure& Drawn) {
    m_pProcedure = &Drawn;
    m_Blocks.clear();
    m_Actions.clear();
    m_Labels.clear();
    m_LabelOrder.clear();
    m_CanBypassDeclarations = false;
    m_LeavingBlock = SketchBlock::None;
    m_Current = newBlock();
    // Whatever is put in front of the body stands in block 0, where a call would not be alone.
    m_CurrentHasActions = true;
    pushList(Drawn.pBody);
    while (!m_Tasks.empty()) {
        const Task Next = m_Tasks.back();
        m_Tasks.pop_back();
        run(Next);
    }
    markReached();
    openEndlessLoops();
}

// Step 1

void FlowSketch::run(const Task& Next) {
    switch (Next.Kind) {
    case TaskKind::List:
        pushList(Next.pStatement->pNext);
        return visit(Next.pStatement);
    case TaskKind::Enter:
        return enter(Next.First);
    case TaskKind::Start:
        m_Current = Next.First;
        m_CurrentHasActions = false;
        return;
    case TaskKind::JumpTo:
        return jumpTo(Next.First);
    case TaskKind::Branch:
        return branch(Next.pStatement->pCondition, Next.First, Next.Second);
    case TaskKind::LeaveLoop:
        return m_Targets.pop_back();
    case TaskKind::LeaveSwitch:
        return finishSwitch();
    }
}

void FlowSketch::visit(const Statement* pStatement) {
    switch (pStatement->Kind) {
    case StatementKind::Assign:
        return act(ActionKind::Assign, pStatement);
    case StatementKind::LocalDecl:
        if (pStatement->pProcedure != nullptr)
            return visitCall(pStatement);
        if (pStatement->pTarget->Count > 0)
            return;
        return act(pStatement->pValue != nullptr ? ActionKind::Assign : ActionKind::Zero,
                   pStatement, pStatement->pTarget);
    case StatementKind::Call:
        return visitCall(pStatement);
    case StatementKind::If:
        return visitIf(pStatement);
    case StatementKind::While:
        return visitWhile(pStatement);
    case StatementKind::DoWhile:
        return visitDoWhile(pStatement);
    case StatementKind::For:
        return visitFor(pStatement);
    case StatementKind::Switch:
        return visitSwitch(pStatement);
    case StatementKind::Case:
    case StatementKind::Default:
        return visitCase(pStatement);
    case StatementKind::Block:
        return pushList(pStatement->pBody);
    case StatementKind::Empty:
        return;
    default:
        return visitJump(pStatement);
    }
}

void FlowSketch::visitJump(const Statement* pStatement) {
    switch (pStatement->Kind) {
    case StatementKind::Break:
        return jumpTo(m_Targets.back().Break);
    case StatementKind::Continue:
        return jumpTo(m_Targets.back().Continue);
    case StatementKind::Goto:
        m_CanBypassDeclarations = true;
        return jumpTo(blockOfLabel(pStatement->pLabel));
    case StatementKind::Label:
        return enter(blockOfLabel(pStatement));
    default: // return
        if (pStatement->pValue != nullptr)
            act(ActionKind::Return, pStatement);
        return jumpTo(SketchBlock::None);
    }
}

void FlowSketch::visitIf(const Statement* pStatement) {
    const std::int32_t Then = newBlock();
    const std::int32_t Else = pStatement->pElse != nullptr ? newBlock() : SketchBlock::None;
    const std::int32_t Join = newBlock();
    branch(pStatement->pCondition, Then, Else != SketchBlock::None ? Else : Join);
    push(TaskKind::Enter, Join);
    if (Else != SketchBlock::None) {
        pushList(pStatement->pElse);
        push(TaskKind::Start, Else);
        push(TaskKind::JumpTo, Join);
    }
    pushList(pStatement->pBody);
    push(TaskKind::Start, Then);
}

void FlowSketch::visitWhile(const Statement* pStatement) {
    const std::int32_t Head = newBlock();
    const std::int32_t Body = newBlock();
    const std::int32_t Behind = newBlock();
    enter(Head);
    branch(pStatement->pCondition, Body, Behind);
    m_Targets.push_back({Behind, Head});
    push(TaskKind::Start, Behind);
    push(TaskKind::LeaveLoop, SketchBlock::None);
    push(TaskKind::JumpTo, Head);
    pushList(pStatement->pBody);
    push(TaskKind::Start, Body);
}

void FlowSketch::visitDoWhile(const Statement* pStatement) {
    const std::int32_t Body = newBlock();
    const std::int32_t Test = newBlock();
    const std::int32_t Behind = newBlock();
    enter(Body);
    m_Targets.push_back({Behind, Test});
    push(TaskKind::Start, Behind);
    push(TaskKind::LeaveLoop, SketchBlock::None);
    push(TaskKind::Branch, Body, Behind, pStatement);
    push(TaskKind::Enter, Test);
    pushList(pStatement->pBody);
}

void FlowSketch::visitFor(const Statement* pStatement) {
    const std::int32_t Head = newBlock();
    const std::int32_t Body = newBlock();
    const std::int32_t Step = newBlock();
    const std::int32_t Behind = newBlock();
    m_Targets.push_back({Behind, Step});
    push(TaskKind::Start, Behind);
    push(TaskKind::LeaveLoop, SketchBlock::None);
    push(TaskKind::JumpTo, Head);
    pushList(pStatement->pStep);
    push(TaskKind::Enter, Step);
    pushList(pStatement->pBody);
    push(TaskKind::Start, Body);
    if (pStatement->pCondition != nullptr)
        push(TaskKind::Branch, Body, Behind, pStatement);
    else
        push(TaskKind::JumpTo, Body);
    push(TaskKind::Enter, Head);
    pushList(pStatement->pInit);
}

void FlowSketch::visitSwitch(const Statement* pStatement) {
    m_CanBypassDeclarations = true;
    const Variable* pSelector = pStatement->pTarget;
    if (pSelector == nullptr)
        pSelector = &m_Hidden.make("selected", *m_pProcedure, pStatement->Position);
    act(ActionKind::Select, pStatement, pSelector);
    const std::int32_t Behind = newBlock();
    // `continue` in a switch means the loop around it.
    const std::int32_t Continue = m_Targets.empty() ? SketchBlock::None : m_Targets.back().Continue;
    m_Targets.push_back({Behind, Continue});
    m_Switches.push_back({current(), SketchBlock::None, m_Cases.size(), pSelector});
    m_Current = SketchBlock::None;
    push(TaskKind::LeaveSwitch, SketchBlock::None);
    push(TaskKind::Enter, Behind);
    pushList(pStatement->pBody);
}

void FlowSketch::visitCase(const Statement* pStatement) {
    const std::int32_t Block = newBlock();
    enter(Block);
    if (pStatement->Kind == StatementKind::Default)
        m_Switches.back().Default = Block;
    else
        m_Cases.push_back({pStatement, Block});
}

// Step 2

void FlowSketch::finishSwitch() {
    const SwitchFrame Frame = m_Switches.back();
    m_Switches.pop_back();
    const std::int32_t Behind = m_Targets.back().Break;
    m_Targets.pop_back();
    std::int32_t Block = Frame.Dispatch;
    for (std::size_t i = Frame.FirstCase; i < m_Cases.size(); ++i) {
        const std::int32_t Otherwise = newBlock();
        SketchBlock& Comparison = m_Blocks[static_cast<std::size_t>(Block)];
        Comparison.pCondition = m_Cases[i].pStatement->pCondition;
        Comparison.pSelector = Frame.pSelector;
        Comparison.Next = m_Cases[i].Block;
        Comparison.Otherwise = Otherwise;
        Block = Otherwise;
    }
    m_Cases.resize(Frame.FirstCase);
    m_Blocks[static_cast<std::size_t>(Block)].Next =
        Frame.Default != SketchBlock::None ? Frame.Default : Behind;
}

void FlowSketch::visitCall(const Statement* pStatement) {
    if (pStatement->pExtern != nullptr)
        return act(ActionKind::CallExtern, pStatement);
    const Procedure& Callee = *pStatement->pProcedure;
    for (const Expression* p = pStatement->pArguments; p != nullptr; p = p->pNext) {
        if (!mustPrepareArgument(p, *m_pProcedure, Callee))
            continue;
        act(ActionKind::PrepareCall, pStatement);
        break;
    }
    if (m_Current == SketchBlock::None || m_CurrentHasActions)
        enter(newBlock());
    act(ActionKind::Call, pStatement);
    enter(newBlock());
    if (pStatement->pTarget != nullptr)
        act(ActionKind::TakeResult, pStatement);
}

std::int32_t FlowSketch::newBlock() {
    m_Blocks.emplace_back();
    return static_cast<std::int32_t>(m_Blocks.size() - 1);
}

/// The block for what comes next; behind a jump a new one that nothing reaches.
std::int32_t FlowSketch::current() {
    if (m_Current == SketchBlock::None) {
        m_Current = newBlock();
        m_CurrentHasActions = false;
    }
    return m_Current;
}

std::int32_t FlowSketch::blockOfLabel(const Statement* pLabel) {
    const auto Found = m_Labels.find(pLabel);
    if (Found != m_Labels.end())
        return Found->second;
    const std::int32_t Block = newBlock();
    m_Labels.emplace(pLabel, Block);
    m_LabelOrder.emplace_back(pLabel, Block);
    return Block;
}

void FlowSketch::enter(std::int32_t Block) {
    jumpTo(Block);
    m_Current = Block;
    m_CurrentHasActions = false;
}

void FlowSketch::jumpTo(std::int32_t Block) {
    if (m_Current != SketchBlock::None)
        m_Blocks[static_cast<std::size_t>(m_Current)].Next = Block;
    m_Current = SketchBlock::None;
}

void FlowSketch::branch(const Expression* pCondition, std::int32_t IfTrue, std::int32_t IfFalse) {
    SketchBlock& Block = m_Blocks[static_cast<std::size_t>(current())];
    Block.pCondition = pCondition;
    Block.Next = IfTrue;
    Block.Otherwise = IfFalse;
    m_Current = SketchBlock::None;
}

void FlowSketch::act(ActionKind Kind, const Statement* pStatement, const Variable* pVariable) {
    const auto Block = static_cast<std::uint32_t>(current());
    m_Actions.push_back({Kind, Block, pStatement, pVariable});
    m_CurrentHasActions = true;
}

void FlowSketch::push(TaskKind Kind, std::int32_t First, std::int32_t Second,
                      const Statement* pStatement) {
    m_Tasks.push_back({Kind, pStatement, First, Second});
}

void FlowSketch::pushList(const Statement* pFirst) {
    if (pFirst != nullptr)
        push(TaskKind::List, SketchBlock::None, SketchBlock::None, pFirst);
}

// Step 3

void FlowSketch::markReached() {
    std::vector<std::int32_t> Stack = {0};
    m_Blocks[0].IsReached = true;
    while (!Stack.empty()) {
        const SketchBlock& Block = m_Blocks[static_cast<std::size_t>(Stack.back())];
        Stack.pop_back();
        for (const std::int32_t Target : {Block.Next, Block.Otherwise}) {
            if (Target == SketchBlock::None || m_Blocks[static_cast<std::size_t>(Target)].IsReached)
                continue;
            m_Blocks[static_cast<std::size_t>(Target)].IsReached = true;
            Stack.push_back(Target);
        }
    }
}

// Step 4

/// Which blocks can reach one that leaves the procedure: a walk backwards, the in-edges by block in
/// one table.
std::vector<bool> FlowSketch::findLeavable() const {
    const std::size_t Count = m_Blocks.size();
    std::vector<std::size_t> Begin(Count + 2, 0);
    for (const SketchBlock& Block : m_Blocks) {
        for (const std::int32_t Target : {Block.Next, Block.Otherwise}) {
            if (Target != SketchBlock::None)
                ++Begin[static_cast<std::size_t>(Target) + 2];
        }
    }
    for (std::size_t i = 2; i < Begin.size(); ++i)
        Begin[i] += Begin[i - 1];
    std::vector<std::size_t> Sources(Begin.back());
    std::vector<std::size_t> Stack;
    std::vector<bool> Leavable(Count, false);
    for (std::size_t i = 0; i < Count; ++i) {
        for (const std::int32_t Target : {m_Blocks[i].Next, m_Blocks[i].Otherwise}) {
            if (Target != SketchBlock::None)
                Sources[Begin[static_cast<std::size_t>(Target) + 1]++] = i;
        }
        if (m_Blocks[i].Next == SketchBlock::None) {
            Leavable[i] = true;
            Stack.push_back(i);
        }
    }
    while (!Stack.empty()) {
        const std::size_t i = Stack.back();
        Stack.pop_back();
        for (std::size_t s = Begin[i]; s < Begin[i + 1]; ++s) {
            if (Leavable[Sources[s]])
                continue;
            Leavable[Sources[s]] = true;
            Stack.push_back(Sources[s]);
        }
    }
    return Leavable;
}

void FlowSketch::openEndlessLoops() {
    const std::vector<bool> Leavable = findLeavable();
    std::vector<std::uint8_t> Colours(m_Blocks.size(), 0);
    for (std::size_t i = 0; i < Leavable.size(); ++i) {
        if (m_Blocks[i].IsReached && !Leavable[i] && Colours[i] == 0)
            splitBackEdges(static_cast<std::int32_t>(i), Leavable, Colours);
    }
}

/// Depth first from one block that cannot be left. All that it reaches cannot be left either.
/// Colours: 0 new, 1 on the open path, 2 done.
void FlowSketch::splitBackEdges(std::int32_t From, const std::vector<bool>& Leavable,
                                std::vector<std::uint8_t>& Colours) {
    std::vector<std::pair<std::size_t, int>> Path = {{static_cast<std::size_t>(From), 0}};
    Colours[Path.back().first] = 1;
    while (!Path.empty()) {
        const std::size_t i = Path.back().first;
        const int Edge = Path.back().second++;
        if (Edge == 2) {
            Colours[i] = 2;
            Path.pop_back();
            continue;
        }
        const std::int32_t Target = Edge == 0 ? m_Blocks[i].Next : m_Blocks[i].Otherwise;
        if (Target == SketchBlock::None)
            continue;
        const auto t = static_cast<std::size_t>(Target);
        if (Colours[t] == 1) {
            const std::int32_t Exit = neverLeftBlock(Target);
            (Edge == 0 ? m_Blocks[i].Next : m_Blocks[i].Otherwise) = Exit;
        } else if (t < Leavable.size() && Colours[t] == 0) {
            Colours[t] = 1;
            Path.push_back({t, 0});
        }
    }
}

std::int32_t FlowSketch::neverLeftBlock(std::int32_t Target) {
    if (m_LeavingBlock == SketchBlock::None) {
        m_LeavingBlock = newBlock();
        m_Blocks.back().IsReached = true;
    }
    const std::int32_t Exit = newBlock();
    m_Blocks.back().IsReached = true;
    m_Blocks.back().IsNeverLeft = true;
    m_Blocks.back().Next = Target;
    m_Blocks.back().Otherwise = m_LeavingBlock;
    return Exit;
}

} // namespace hpn
