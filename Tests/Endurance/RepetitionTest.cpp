// What a run of the library leaves in the process: nothing, but edge records that were given back
// and never taken out again.

#include "EnduranceSupport.h"

#include "ZfCCfgFactory.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <unistd.h>
#include <vector>

namespace {

using namespace endurance;

struct Footprint {
    long Blocks;
    std::size_t LayerBlocks;
    std::size_t HeapBytes;

    explicit Footprint(const CountingController& Controller)
        : Blocks(Controller.getLive()), LayerBlocks(leda::std_memory_mgr.live_blocks()),
          HeapBytes(heapBytes()) {}
};

// A thousand runs, or as many as ENDURANCE_ROUNDS says.
int countRounds() {
    const char* pWanted = std::getenv("ENDURANCE_ROUNDS");
    return pWanted != nullptr ? std::atoi(pWanted) : 1000;
}

TEST(Repetition, AThousandRunsLeaveNoByteAndGiveTheSameCode) {
    CountingController Controller;
    const ControllerScope Scope(&Controller);
    const hpn::PassSequence Passes = wholeRoad();
    const std::string First = runRoad(SmallProgram, Passes);
    ASSERT_NE(First, "");
    for (int i = 0; i < 3; ++i)
        runRoad(SmallProgram, Passes); // tables that the process makes once are there by now
    const long Taken = Controller.getTaken();
    const Footprint Before(Controller);
    const int Rounds = countRounds();
    bool IsSame = true;
    for (int i = 0; i < Rounds; ++i)
        IsSame = runRoad(SmallProgram, Passes) == First && IsSame;
    const Footprint After(Controller);
    EXPECT_TRUE(IsSame);
    EXPECT_GT(Controller.getTaken(), Taken + Rounds);
    EXPECT_EQ(After.Blocks, Before.Blocks);
    EXPECT_EQ(After.LayerBlocks, Before.LayerBlocks);
    // malloc counts a few freed blocks that it keeps at hand as given out; one block lost in each
    // run would be 32 bytes each.
    EXPECT_LT(After.HeapBytes, Before.HeapBytes + 4096 + 16 * std::size_t(Rounds));
}

TEST(Repetition, TheCountersSeeASingleLostBlock) {
    CountingController Controller;
    const ControllerScope Scope(&Controller);
    void* const pSmall = ::operator new(8); // unlike a new expression never left out
    void* const pLarge = ::operator new(5000);
    const long Blocks = Controller.getLive();
    const std::size_t HeapBytes = heapBytes();
    ::operator delete(pLarge);
    const std::size_t HeapBytesAfter = heapBytes();
    ::operator delete(pSmall);
    const long BlocksAfter = Controller.getLive();
    EXPECT_EQ(Blocks, 2);
    EXPECT_EQ(BlocksAfter, 0);
    EXPECT_GE(HeapBytes, HeapBytesAfter + 5000);
}

// The controller owns what the library loses, and frees it.
class KeepingController : public CountingController {
public:
    ~KeepingController() override {
        for (void* pBlock : m_Blocks)
            std::free(pBlock);
    }
    void* allocMemBlock(unsigned int Size) override {
        void* pBlock = CountingController::allocMemBlock(Size);
        for (void*& Place : m_Blocks) {
            if (Place == nullptr) {
                Place = pBlock;
                break;
            }
        }
        return pBlock;
    }
    void freeMemBlock(void* pBlock) override {
        for (void*& Place : m_Blocks)
            Place = Place == pBlock ? nullptr : Place;
        CountingController::freeMemBlock(pBlock);
    }

private:
    void* m_Blocks[64] = {};
};

TEST(Repetition, OnlyParkedEdgeRecordsAreLost) {
    KeepingController Controller;
    const ControllerScope Scope(&Controller);
    const long Blocks = Controller.getLive();
    const std::size_t LayerBlocks = leda::std_memory_mgr.live_blocks();
    ZfCSSAControl Control;
    Control.boot();
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    pFactory->delEdgeInfo(pFactory->createEdgeInfo());
    pFactory->delEdgeInfo(pFactory->createTrueBranch());
    pFactory->delEdgeInfo(pFactory->createFalseBranch());
    pFactory->delEdgeInfo(pFactory->createSSAEdge());
    pFactory->delBasicBlock(pFactory->createBasicBlock());
    pFactory->delEntryNode(pFactory->createEntryNode());
    pFactory->delExitNode(pFactory->createExitNode());
    pFactory->delProcedure(pFactory->createProcedure());
    pFactory->delValueExpression(pFactory->createValueExpression());
    pFactory->delExplicitVarUse(pFactory->createExplicitVarUse());
    pFactory->createEdgeInfo(); // takes the parked one
    Control.shutdown();
    EXPECT_EQ(Controller.getLive(), Blocks + 3);
    EXPECT_EQ(leda::std_memory_mgr.live_blocks(), LayerBlocks);
}

// All dumps of a run, in the order of the passes; the visitor's serial number, which runs on for
// the life of the process, stands in the files' names alone.
std::vector<std::string> dumpsOfRun(const std::filesystem::path& Directory, std::string& Code) {
    std::filesystem::remove_all(Directory);
    std::filesystem::create_directories(Directory);
    hpn::DumpObserver Observer(Directory.string(), Directory.string());
    Code = runRoad(SmallProgram, wholeRoad(), &Observer);
    std::vector<std::string> Names;
    for (const auto& Entry : std::filesystem::directory_iterator(Directory))
        Names.push_back(Entry.path().string());
    std::sort(Names.begin(), Names.end());
    std::vector<std::string> Texts;
    for (const std::string& Name : Names) {
        std::ostringstream Text;
        Text << std::ifstream(Name, std::ios::binary).rdbuf();
        Texts.push_back(Text.str());
    }
    std::filesystem::remove_all(Directory);
    return Texts;
}

// Node, variable, version and block numbers are those of a fresh process in every run.
TEST(Repetition, TheSecondClientOfAProcessSeesTheSameNumbers) {
    const std::filesystem::path Directory = "hpn_endurance_" + std::to_string(getpid());
    std::string Codes[2];
    const std::vector<std::string> First = dumpsOfRun(Directory, Codes[0]);
    const std::vector<std::string> Second = dumpsOfRun(Directory, Codes[1]);
    EXPECT_EQ(First.size(), 2 * (hpn::PassCount + 1));
    EXPECT_EQ(First, Second);
    EXPECT_EQ(Codes[0], Codes[1]);
}

} // namespace
