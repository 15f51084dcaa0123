// Programs on which the road once went on for ever, or reported an inconsistency that was none.

#include "Graph/ProgramGraph.h"
#include "Language/Reader.h"
#include "Road/PassRunner.h"
#include "ZfCPlatformMessageServer.h"

#include <gtest/gtest.h>

namespace {

using namespace hpn;

/// Assertions that the library has reported since the last look.
int s_Assertions = 0;

class InternalInfoScope {
public:
    InternalInfoScope() {
        s_Assertions = 0;
        ZfCPlatformMessageServer::setAssertionHook(
            [](const char*, int, const char*) { ++s_Assertions; });
        ZfCPlatformMessageServer::setShowInternalInfo(true);
    }
    ~InternalInfoScope() {
        ZfCPlatformMessageServer::setShowInternalInfo(false);
        ZfCPlatformMessageServer::setAssertionHook(nullptr);
    }
};

// Without inlining, so that the flow over calls is put to the test.
const char* const Propagation = "placeExitNodes,placeLoopAroundMain,transformToSSAForm,"
                                "divideBasicBlock,propagateSparseConditionalConstant";

void runRoad(const char* Text, const char* List = Propagation) {
    SourceFiles Sources;
    Sources.add("test.hpn", Text);
    Diagnostics Messages(Sources);
    Program Source;
    ASSERT_TRUE(readProgram(Sources, Messages, Source)) << Messages.print();
    const InternalInfoScope Scope;
    ProgramGraph Graph(Source);
    PassSequence Passes;
    std::string Message;
    ASSERT_TRUE(PassSequence::parse(List, Passes, Message)) << Message;
    PassRunner Runner(Graph);
    EXPECT_TRUE(Runner.run(Passes));
    EXPECT_EQ(s_Assertions, 0);
}

// A comparison that is decided by a range makes a state constant; with the state constant, an
// operand that is not yet determined comes to the fore and hides the range again.
TEST(RoadTermination, ConclusionsAreNotTakenBack) {
    runRoad("state float64 s4; state float64 s5 = 1; output float64 o;\n"
            "proc p9(float64 a10) { if (0) s4 = 0; s5 = a10 > -1; o = s5; }\n"
            "proc main() { p9(0); p9(1); if (0) return; p9(s4 > s5); }\n");
}

TEST(RoadTermination, SeveralWaysOutReturnOneVersion) {
    runRoad("state uint8 x; output uint8 o;\n"
            "proc p() { if (x > 3) { x = 0; return; } x = x + 1; }\n"
            "proc main() { p(); o = x; p(); }\n");
}

// One join inside the other, both reached by a branch.
TEST(RoadTermination, NestedExtractionKeepsEachBlockInItsProcedure) {
    runRoad("proc main() { if (0) goto a; a: if (0) { if (0) goto b; b: } if (0) { } }\n",
            "makeProcedureAndCall,placeExitNodes");
}

} // namespace
