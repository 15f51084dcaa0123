#include "FuzzTestSupport.h"

#include "FuzzRun.h"
#include "Road/RewriteLimiter.h"

#include <gtest/gtest.h>

using namespace hpn;
using namespace hpn::fuzz;

namespace {

// The pass that follows another one on the default road; null after the last.
const Pass* passAfter(std::string_view Name) {
    const PassSequence Order = PassSequence::defaultOrder();
    const std::vector<PassId>& Ids = Order.getPasses();
    if (Name.empty())
        return &passOf(Ids.front());
    for (std::size_t i = 0; i + 1 < Ids.size(); ++i)
        if (passOf(Ids[i]).Name == Name)
            return &passOf(Ids[i + 1]);
    return nullptr;
}

// A change that is held back must leave the program what it was, whichever changes were made before
// it: the interpreter runs it before and after each pass.
TEST(RewriteLimit, ProgramsDoTheSameUnderEveryLimit) {
    FuzzOptions Options;
    Options.PairsEvery = 0; // a limit cuts a changed program at another place
    for (std::uint64_t Seed = 1; Seed <= 40; ++Seed) {
        for (const std::size_t Limit : {0U, 2U, 7U, 20U, 45U, 90U}) {
            Trial Wanted = makeTrial(Seed, Options);
            Wanted.Passes = PassSequence::defaultOrder();
            Wanted.WantsCode = false;
            RewriteLimiter Limiter(Limit);
            Wanted.Tamper = [&Limiter](std::string_view Name, ProgramGraph& Graph) {
                PassStep Next;
                Next.pPass = passAfter(Name);
                if (Next.pPass != nullptr)
                    Limiter.beforePass(Next, Graph);
            };
            const Failure Failed = runTrial(Wanted).Failed;
            ASSERT_FALSE(Failed) << "seed " << Seed << ", limit " << Limit << ": " << Failed.Kind
                                 << " after " << Failed.Pass << " " << Failed.Detail;
        }
    }
}

} // namespace
