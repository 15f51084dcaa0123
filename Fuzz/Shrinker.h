#ifndef SHRINKER_H
#define SHRINKER_H

#include "PassTrial.h"

#include <functional>
#include <string>
#include <vector>

namespace hpn::fuzz {

/// Makes a failing program small by leaving parts out as long as it still fails the same way (A.
/// Zeller and R. Hildebrandt, Simplifying and isolating failure-inducing input, IEEE TSE 28(2),
/// 2002, on a hierarchy of parts).
///
/// 1. Passes that are not needed are left out of the order, steps off the end of the run.
/// 2. Blocks, then single lines; a block's head and end without what stands in it.
/// 3. Runs of tokens within a line, with balanced brackets, from long to short.
/// 4. Single operands become 0 or 1.
/// Steps 2 to 4 repeat until nothing goes any more or the attempts are used up. Whether a text is
/// still a program is left to the reader: a failure of the reader is another failure.
class Shrinker {
public:
    /// Tells whether a trial still fails the same way; asked many times.
    using Question = std::function<bool(const Trial&)>;

    Shrinker(Question StillFails, unsigned MostAttempts)
        : m_StillFails(std::move(StillFails)), m_Left(MostAttempts) {}
    Trial shrink(Trial Failing);

private:
    void shrinkPasses();
    void shrinkSteps();
    bool shrinkLines();
    bool shrinkTokens();
    bool shrinkLineTokens(std::size_t Line);
    bool shrinkOperands(std::size_t Line);
    bool tryLines(std::vector<std::string> Lines);
    bool isAccepted(const Trial& Smaller);

    Question m_StillFails;
    unsigned m_Left;
    Trial m_Best;
    std::vector<std::string> m_Lines; // of the best text
};

/// Words, numbers, operators and brackets of a line, without the blanks.
std::vector<std::string> splitTokens(const std::string& Line);

} // namespace hpn::fuzz

#endif
