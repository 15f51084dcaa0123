#ifndef TERM_H
#define TERM_H

#include "Language/Program.h"
#include "Model/ValueRange.h"
#include "ZfCCfgValue.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

class ZfCCfgVariable;

namespace hpn {

/// One node of an expression on the graph. Unlike the syntax tree's `Expression` it names variables
/// of the optimiser (first originals, SSA versions after renaming) and is changed in place by the
/// passes: a read becomes a number, a subtree is folded. Terms live in the `TermArena` of their
/// program graph.
///
/// Meaning of an assignment's root, made by the graph builder: `Cast` to the type of the left-hand
/// variable (or of its element). A store to an array element has the root `Element`-like form
/// `Store`: pLeft the index, pRight the converted value.
///
/// Every pass walks all terms, and a program has about ten for each statement: two of them fill a
/// cache line, which is why they share room where they can.
struct Term {
    /// The operators of the syntax tree, and the store to an element that exists on the graph only.
    Operator Op = Operator::Number;

private:
    std::uint8_t m_File[3] = {}; // low byte first
    std::uint32_t m_Offset = 0;

public:
    /// One of them, by Op.
    union {
        double Number = 0.0;       ///< Number
        ZfCCfgVariable* pVariable; ///< hasVariable()
        const Type* pType;         ///< Cast
    };
    Term* pLeft = nullptr;
    Term* pRight = nullptr;

    /// Variable, Element (the array; of a store the array written).
    bool hasVariable() const { return Op == Operator::Variable || Op == Operator::Element; }
    /// The root of an element store: pLeft the index, pRight the value.
    bool isStore() const { return Op == Operator::Element && pRight != nullptr; }
    /// The place in the source; files are numbered below 2^24.
    SourcePosition getPosition() const {
        return {m_File[0] | std::uint32_t{m_File[1]} << 8 | std::uint32_t{m_File[2]} << 16,
                m_Offset};
    }
    void setPosition(SourcePosition Position) {
        for (unsigned i = 0; i < 3; ++i)
            m_File[i] = static_cast<std::uint8_t>(Position.File >> 8 * i);
        m_Offset = Position.Offset;
    }
};
static_assert(sizeof(Term) <= 32, "two terms fill a cache line");

/// Gives out terms; they go when the arena goes. One at a time in a process, like the graph that it
/// serves.
class TermArena {
public:
    TermArena() { s_pActive = this; }
    ~TermArena() { s_pActive = s_pActive == this ? nullptr : s_pActive; }
    TermArena(const TermArena&) = delete;
    TermArena& operator=(const TermArena&) = delete;
    /// The arena of the present program graph, or null. For copies of statements, which know no
    /// arena.
    static TermArena* active() { return s_pActive; }

    Term* make() {
        if (m_Used == s_ChunkSize)
            addChunk();
        return &m_Chunks.back()[m_Used++];
    }
    Term* makeNumber(double Number);
    Term* makeVariable(ZfCCfgVariable* pVariable);
    Term* makeUnary(Operator Op, Term* pOperand);
    Term* makeBinary(Operator Op, Term* pLeft, Term* pRight);
    Term* makeCast(const Type* pType, Term* pOperand);
    Term* copy(const Term* pTerm);

private:
    static constexpr std::size_t s_ChunkSize = 1024;
    static TermArena* s_pActive;

    void addChunk();

    std::vector<std::unique_ptr<Term[]>> m_Chunks;
    std::size_t m_Used = s_ChunkSize; // terms given out of the last chunk
};

/// Where the range of a variable read comes from.
enum class RangeSource {
    Types,      ///< storage of the declared type alone: holds always
    Propagation ///< what propagation has found, where its value is not undetermined, else the type
};

/// The range of a term's number. A call costs one walk over the term.
ValueRange rangeOfTerm(const Term* pTerm, RangeSource Source);
/// Lattice value under the variables' present values, the number model's operators applied node by
/// node; a result that is not constant becomes one where the range leaves a single number.
ZfCCfgValue valueOfTerm(const Term* pTerm);
/// The same by the operators alone, ranges disregarded: cheaper, and never a constant that the
/// other is not.
ZfCCfgValue latticeValueOfTerm(const Term* pTerm);
/// What the operators give for plain numbers: the number model's arithmetic made total (a zero
/// divisor of `%` gives 0).
double computeUnary(Operator Op, double Operand);
double computeBinary(Operator Op, double Left, double Right);
/// Reads an input somewhere: evaluating it is a side effect.
bool readsInput(const Term* pTerm);
/// The conversion of a `Cast` leaves every number bit for bit that its operand can have, whatever
/// the variables hold.
bool castChangesNothing(const Term* pCast);
/// Folds in place what is constant by its numbers and by the types of what it reads: never changes
/// the number, bit for bit, and never drops the read of an input that C would make. The root
/// conversion of a right-hand side stays unless all of it folds. Whether anything was folded.
bool foldTerm(Term* pTerm);
/// Same shape, same numbers (bit for bit), same original variables.
bool isSameTerm(const Term* a, const Term* b);

} // namespace hpn

#endif
