// The module's operator new and delete against a counting memory controller: every block that the
// library takes comes back, and the host program's own blocks never pass through it (except where a
// static build was asked to do so).

#include "ZfCCfgAssignment.h"
#include "ZfCCfgFactory.h"
#include "ZfCControlFlowGraph.h"
#include "ZfCMemController.h"
#include "ZfCSSAControl.h"

#include <cstdlib>
#include <gtest/gtest.h>
#include <memory>
#include <set>

namespace {

class CountingController : public ZfCMemController {
public:
    void* allocMemBlock(unsigned int Size) override {
        void* pBlock = std::malloc(Size);
        if (m_BlockCount < MaxBlocks) {
            m_Blocks[m_BlockCount++] = pBlock;
        }
        ++m_Taken;
        return pBlock;
    }

    void freeMemBlock(void* pBlock) override {
        bool IsMine = false;
        for (int i = m_BlockCount - 1; i >= 0 && !IsMine; --i) {
            if (m_Blocks[i] == pBlock) {
                IsMine = true;
                m_Blocks[i] = m_Blocks[--m_BlockCount];
            }
        }
        m_Foreign += IsMine ? 0 : 1;
        std::free(pBlock);
    }

    int getTaken() const { return m_Taken; }
    int getLive() const { return m_BlockCount; }
    int getForeign() const { return m_Foreign; }

private:
    static const int MaxBlocks = 4096;
    void* m_Blocks[MaxBlocks] = {};
    int m_BlockCount = 0;
    int m_Taken = 0;
    int m_Foreign = 0;
};

/// Sets the controller for a scope.
class ControllerScope {
public:
    explicit ControllerScope(ZfCMemController* pController) { pZFMemory = pController; }
    ~ControllerScope() { pZFMemory = nullptr; }
};

/// A statement class of the host program: its code lies in this module.
class HostAssignment : public ZfCCfgAssignment {
public:
    ZfCCfgStatement* clone() override { return nullptr; }
    void foldConstants() override {}
};

void buildAndDropGraph() {
    ZfCSSAControl Control;
    Control.boot();
    {
        ZfCControlFlowGraph Graph;
        ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
        ZfCCfgProcedure* pProcedure = nullptr;
        leda::node Entry = Graph.demandProcedureEntryNode("#main", pProcedure);
        Graph.setStartNode(Entry);
        ZfCBasicBlock* pBlock = pFactory->createBasicBlock();
        pBlock->setProcedure(pProcedure);
        pBlock->append(new HostAssignment);
        pBlock->append(
            new ZfCCfgProcedureCall("a_name_that_is_too_long_for_any_small_string_buffer"));
        pBlock->append(new ZfCCfgInitAssignment);
        Graph.new_edge(Entry, Graph.new_node(pBlock), pFactory->createEdgeInfo());
        Graph.placeExitNodes();
        pFactory->delBasicBlock(pFactory->createBasicBlock());
        pFactory->createValueExpression(ZfCCfgValue(1.0));
    }
    Control.shutdown();
}

TEST(ModuleAllocation, EveryBlockComesBackAndNoneOfTheHosts) {
    CountingController Controller;
    {
        ControllerScope Scope(&Controller);
        buildAndDropGraph();
    }
#ifdef MODULE_HAS_OWN_ALLOCATION
    EXPECT_GT(Controller.getTaken(), 8);
#else
    // The blocks of the library's own classes; containers and strings are the host's.
    EXPECT_GT(Controller.getTaken(), 4);
#endif
    EXPECT_EQ(Controller.getLive(), 0);
    EXPECT_EQ(Controller.getForeign(), 0);
}

#if !defined(MODULE_HAS_OWN_ALLOCATION) || defined(HOST_IS_ANOTHER_MODULE)
TEST(ModuleAllocation, HostsOwnNewIsNotCaptured) {
    CountingController Controller;
    ControllerScope Scope(&Controller);
    {
        auto pNumber = std::make_unique<int>(1);
        std::set<int> Numbers{*pNumber, 2, 3};
        ASSERT_EQ(Numbers.size(), 3u);
        delete[] new char[100];
    }
    EXPECT_EQ(Controller.getTaken(), 0);
    EXPECT_EQ(Controller.getForeign(), 0);
}
#endif

TEST(ModuleAllocation, WithoutControllerTheStandardHeapServes) {
    ASSERT_EQ(pZFMemory, nullptr);
    buildAndDropGraph();
    EXPECT_EQ(ZfCCfgFactory::getInstance(), nullptr);
}

} // namespace
