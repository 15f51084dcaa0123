#include "LEDA/allocator.h"
#include "WqCXString.h"
#include "ZF_DataType.h"
#include "ZfAssertionReport.h"
#include "ZfCBasicDataType.h"
#include "ZfCLinearScaling.h"
#include "ZfCMemController.h"
#include "ZfCMessageSink.h"
#include "ZfCPlatformMessageServer.h"
#include "ZfCPooledMemController.h"
#include "ZfCScaleTool.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <gtest/gtest.h>
#include <limits>
#include <random>
#include <sstream>
#include <string>
#include <vector>

namespace {

TEST(String, IsAValueAtEveryLength) {
    std::vector<WqCXString> texts;
    for (std::size_t n = 0; n < 60; ++n) {
        const std::string expected(n, char('a' + n % 26));
        texts.push_back(expected.c_str());
        WqCXString copy(texts.back()), assigned("something longer than what lies in the object");
        assigned = copy;
        assigned = *&assigned;
        ASSERT_STREQ(assigned.cstring(), expected.c_str());
        ASSERT_EQ(assigned.length(), n);
        copy.cstring()[0] = n ? '!' : 0;
        ASSERT_STREQ(texts.back().cstring(), expected.c_str()) << "a copy is independent";
        const WqCXString joined = texts.back() + WqCXString("#") + texts[n / 2];
        ASSERT_EQ(joined.cstring(), expected + "#" + texts[n / 2].cstring());
        std::ostringstream stream;
        stream << joined;
        ASSERT_EQ(stream.str(), joined.cstring());
    }
    EXPECT_STREQ(WqCXString(static_cast<const char*>(nullptr)).cstring(), "");
    EXPECT_STREQ(WqCXString().cstring(), "");
}

TEST(String, ComparesAsUnsignedCharactersAndSignAlone) {
    const char* ascending[] = {"",   "#main", "A", "a", "aa", "aaaaaaaaaaaaaaaaaaaaaaaaaaaaaa",
                               "ab", "\xe4"};
    const int n = int(std::size(ascending));
    for (int i = 0; i < n; ++i)
        for (int j = 0; j < n; ++j) {
            EXPECT_EQ(leda::compare(WqCXString(ascending[i]), WqCXString(ascending[j])),
                      (i > j) - (i < j));
            EXPECT_EQ(WqCXString(ascending[i]) == WqCXString(ascending[j]), i == j);
        }
}

TEST(String, ShowsNumbers) {
    EXPECT_STREQ(WqCXString(0u, false, true).cstring(), "0");
    EXPECT_STREQ(WqCXString(4294967295u, false, true).cstring(), "4294967295");
    EXPECT_STREQ(WqCXString(42u, false, false).cstring(), "0000000042");
    EXPECT_STREQ(WqCXString(255u, true, true).cstring(), "ff");
    EXPECT_STREQ(WqCXString(255u, true, false).cstring(), "000000ff");
}

TEST(ScaleTool, RoundsToTheGridOrCutsOff) {
    const double huge = std::numeric_limits<double>::infinity();
    const struct {
        double lsb, offset, value, rounded, cut;
    } cases[] = {
        {0.5, 0.0, 99.7, 99.5, 99.5},
        {0.5, 0.0, 99.8, 100.0, 99.5},
        // Halves go away from zero.
        {1.0, 0.0, 2.5, 3.0, 2.0},
        {1.0, 0.0, -2.5, -3.0, -2.0},
        // The grid starts at the offset.
        {2.0, 1.0, 4.1, 5.0, 3.0},
        {2.0, 1.0, -3.9, -3.0, -3.0},
        {-2.0, 0.0, 5.0, 6.0, 4.0},
        // No grid, no change.
        {0.0, 1.0, 4.1, 4.1, 4.1},
        {std::nan(""), 0.0, 4.1, 4.1, 4.1},
        {huge, 0.0, 4.1, 4.1, 4.1},
        {0.5, 0.0, -huge, -huge, -huge},
        // Product and sum are rounded one after the other: fused, the first would be half of it.
        {0.1, -0.3, 0.0, 5.551115123125783e-17, -0.09999999999999998},
    };
    for (const auto& c : cases) {
        ZfCLinearScaling scaling(c.lsb, c.offset);
        EXPECT_EQ(ZfCScaleTool::findRepresentedValue(c.value, &scaling), c.rounded)
            << c.value << " on " << c.lsb;
        EXPECT_EQ(ZfCScaleTool::findRepresentedValueDontRound(c.value, &scaling), c.cut)
            << c.value << " on " << c.lsb;
    }
    ZfCLinearScaling scaling(0.5, 0.0);
    EXPECT_TRUE(std::isnan(ZfCScaleTool::findRepresentedValue(std::nan(""), &scaling)));
    EXPECT_EQ(ZfCScaleTool::findRepresentedValue(0.3, nullptr), 0.3);
}

TEST(DataTypes, EachAnswersOneQueryAndOnlyBooleansAreBool) {
    ZfCBasicDataType* const types[] = {
        ZfCBasicDataType::float64(), ZfCBasicDataType::float32(), ZfCBasicDataType::int8(),
        ZfCBasicDataType::uint8(),   ZfCBasicDataType::int16(),   ZfCBasicDataType::uint16(),
        ZfCBasicDataType::int32(),   ZfCBasicDataType::uint32(),  ZfCBasicDataType::boolean()};
    bool (ZF_DataType::*const queries[])() = {&ZF_DataType::isFloat64, &ZF_DataType::isFloat32,
                                              &ZF_DataType::isInt8,    &ZF_DataType::isUInt8,
                                              &ZF_DataType::isInt16,   &ZF_DataType::isUInt16,
                                              &ZF_DataType::isInt32,   &ZF_DataType::isUInt32};
    for (std::size_t i = 0; i < std::size(types); ++i) {
        ZF_DataType* const pBase = types[i]->getBaseDataType();
        ASSERT_NE(pBase, nullptr);
        for (std::size_t j = 0; j < std::size(queries); ++j)
            EXPECT_EQ((pBase->*queries[j])(), i == j) << i << " " << j;
        EXPECT_EQ(types[i]->isBool(), i == 8);
        EXPECT_EQ(types[i]->isBooleanType(), i == 8);
    }
}

struct CollectingSink : ZfCMessageSink {
    std::vector<std::string> received;
    void receiveMessage(tagERR_error_severity_etp Severity, int Number, const ZfCSrcRef* pSrcRef,
                        const char* Category, const char* Text) override {
        std::ostringstream stream;
        stream << int(Severity) << ' ' << Number << ' ' << (pSrcRef ? pSrcRef->getLine() : -1)
               << ' ' << Category << ": " << Text;
        received.push_back(stream.str());
    }
};

TEST(MessageServer, DeliversToTheSinkAndCountsBySeverity) {
    CollectingSink sink;
    ASSERT_EQ(ZfCPlatformMessageServer::setSink(&sink), nullptr);
    ZfCPlatformMessageServer::resetCounts();
    const ZfCSrcRef place("a.hpn", 12, 3);
    ZfCMessageServer* const pServer = ZfCMessageServer::getMessageServer();
    pServer->putMessage(ERR_severity_fatal, 10007, nullptr, "General Messages", "first");
    pServer->putMessage(ERR_severity_fatal, 10017, &place, "General Messages", "second");
    pServer->putInternalMessage(ERR_severity_internal, 99068, nullptr, "Internal Messages",
                                "third");
    EXPECT_EQ(ZfCPlatformMessageServer::setSink(nullptr), &sink);
    EXPECT_EQ(sink.received, (std::vector<std::string>{"3 10007 -1 General Messages: first",
                                                       "3 10017 12 General Messages: second",
                                                       "7 99068 -1 Internal Messages: third"}));
    const int counts[] = {0, 0, 0, 2, 0, 0, 0, 1};
    for (int severity = 0; severity < 8; ++severity)
        EXPECT_EQ(ZfCPlatformMessageServer::getCount(tagERR_error_severity_etp(severity)),
                  unsigned(counts[severity]));

    testing::internal::CaptureStderr();
    for (int severity = 0; severity < 8; ++severity)
        pServer->putMessage(tagERR_error_severity_etp(severity), 1, nullptr, "C", nullptr);
    pServer->putMessage(ERR_severity_error, 10015, &place, "General Messages",
                        "to the error stream");
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "info 1 (C): \nnotice 1 (C): \nerror 1 (C): \nfatal error 1 (C): \nmessage 1 (C): \n"
              "message 1 (C): \nmessage 1 (C): \ninternal 1 (C): \n"
              "a.hpn:12:3: error 10015 (General Messages): to the error stream\n");
}

std::string s_Report;

TEST(MessageServer, InternalInformationIsASwitchAndAssertionsAreObserved) {
    EXPECT_FALSE(ShowInternalInfo());
    ZfCPlatformMessageServer::setShowInternalInfo(true);
    EXPECT_TRUE(ShowInternalInfo());
    ZfCPlatformMessageServer::setShowInternalInfo(false);
    EXPECT_FALSE(ShowInternalInfo());

    ZfCPlatformMessageServer::setAssertionHook(
        [](const char* File, int Line, const char* Condition) {
            s_Report = std::string(File) + ' ' + std::to_string(Line) + ' ' + Condition;
        });
    ZfReportAssertion("a.cpp", 5, "x == y");
    EXPECT_EQ(s_Report, "a.cpp 5 x == y");
    EXPECT_NE(ZfCPlatformMessageServer::setAssertionHook(nullptr), nullptr);
    testing::internal::CaptureStderr();
    ZfReportAssertion("a.cpp", 6, "0");
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "a.cpp:6: assertion failed: 0\n");
}

TEST(MemoryController, IsNotSetByThePlatform) {
    EXPECT_EQ(pZFMemory, nullptr);
}

// Blocks of all sizes come and go in random order, each filled with a byte of its own: no two
// overlap, each is aligned, and what is given back serves again.
TEST(MemoryController, PooledBlocksKeepTheirBytes) {
    struct Block {
        unsigned char* pBytes;
        unsigned int Size;
        unsigned char Mark;
    };
    ZfCPooledMemController Controller;
    std::mt19937 Random(1);
    std::vector<Block> Live;
    auto giveBack = [&](std::size_t At) {
        const Block Gone = Live[At];
        Live[At] = Live.back();
        Live.pop_back();
        EXPECT_EQ(std::count(Gone.pBytes, Gone.pBytes + Gone.Size, Gone.Mark), Gone.Size);
        Controller.freeMemBlock(Gone.pBytes);
    };
    for (int i = 0; i < 40000; ++i) {
        if (!Live.empty() && Random() % 3 == 0)
            giveBack(Random() % Live.size());
        const unsigned int Size = Random() % 100 == 0 ? Random() % 200000 : Random() % 1200;
        auto* const pBytes = static_cast<unsigned char*>(Controller.allocMemBlock(Size));
        // No object of a size that is no multiple of 16 can need more than 8.
        ASSERT_EQ(reinterpret_cast<std::uintptr_t>(pBytes) %
                      ((std::max(Size, 1u) + 7) / 8 % 2 == 0 ? 16 : 8),
                  0u);
        Live.push_back({pBytes, Size, static_cast<unsigned char>(i)});
        std::fill_n(pBytes, Size, Live.back().Mark);
    }
    while (!Live.empty())
        giveBack(Live.size() - 1);
    Controller.freeMemBlock(nullptr);
}

#if !defined(LEDA_POOLS_OFF)
TEST(MemoryController, PooledBlocksServeAgain) {
    ZfCPooledMemController Controller;
    void* const pFirst = Controller.allocMemBlock(40);
    void* const pSecond = Controller.allocMemBlock(36);
    EXPECT_EQ(static_cast<char*>(pSecond) - static_cast<char*>(pFirst), 40);
    Controller.freeMemBlock(pFirst);
    void* const pOther = Controller.allocMemBlock(64);
    EXPECT_NE(pOther, pFirst);
    EXPECT_EQ(Controller.allocMemBlock(33), pFirst);
    // After the last one it begins anew.
    for (void* pBlock : {pFirst, pSecond, pOther})
        Controller.freeMemBlock(pBlock);
    void* const pAgain = Controller.allocMemBlock(48);
    EXPECT_EQ(static_cast<char*>(Controller.allocMemBlock(48)) - static_cast<char*>(pAgain), 48);
}
#endif

} // namespace
