#include "ModelTestSupport.h"
#include "ZfCCodeGenMessage.h"
#include "ZfCCvDDBaseState.h"
#include "ZfCInternalCheck.h"

namespace {

using Messages = ZfCCodeGenMessage;

TEST(Message, TextsCarryTheirParametersInOrder) {
    Reports Received;
    const ZfCSrcRef SrcRef("a.hpn", 3, 4);
    Messages::putCodeGenMessage10007("ZfCPhiFunction", 7);
    Messages::putCodeGenMessage10007(nullptr, 7);
    Messages::putCodeGenMessage10002("parse", 0.25);
    Messages::putCodeGenMessage10006(20);
    Messages::putCodeGenMessage10028("hpn");
    Messages::putCodeGenMessage99066();
    EXPECT_EQ(nullptr, Received.m_pSrcRef);
    Messages::putCodeGenMessage32118(&SrcRef, "f", nullptr);
    EXPECT_EQ(&SrcRef, Received.m_pSrcRef);
    Messages::putCodeGenMessage10008(&SrcRef, "M", 1);
    Messages::putCodeGenMessage99068();
    const std::string Support = ". Contact Orvane's technical support team.";
    EXPECT_EQ(
        (std::vector<std::string>{
            "3 10007 General Messages|Internal error. Error code: ZfCPhiFunction 7" + Support,
            "3 10007 General Messages|Internal error. Error code: _NULL_ 7" + Support,
            "0 10002 General Messages|parse                          in    0.25 seconds.",
            "3 10006 General Messages|Error count exceeds 20.",
            "1 10028 General Messages|The DLL hpn is a hotfix version.",
            "3 99066 Internal Messages|The test was successful without any errors.",
            "2 32118 Code Generation from DD|Function f is specified to be generated into module "
            "_NULL_ whose CodeGenerationBasis property is set to DDBased.",
            "3 10008 General Messages|Internal error. Error code: M 1" + Support,
            "7 99068 Internal Messages|Illegal call of test code in release."}),
        Received.m_Messages);
}

// Around the size of the buffer: 16383 characters fit, one more is cut.
TEST(Message, TextThatDoesNotFitEndsInDots) {
    const std::string Start = "Target name : ";
    for (const std::size_t Length : {16382u, 16383u, 16384u, 20000u}) {
        Reports Received;
        const std::string Name(Length - Start.size(), 'x');
        Messages::putCodeGenMessage10003(Name.c_str());
        const std::string Text =
            Received.m_Messages.at(0).substr(std::string("0 10003 General Messages|").size());
        if (Length < 16384)
            EXPECT_EQ(Start + Name, Text);
        else
            EXPECT_EQ((Start + Name).substr(0, 16379) + " ...", Text);
    }
}

TEST(InternalCheck, AssertionsAreForDevelopersInternalErrorsForAll) {
    Reports Received;
    int Evaluations = 0;
    for (const bool IsShown : {false, true}) {
        ZfCPlatformMessageServer::setShowInternalInfo(IsShown);
        ZF_ASSERT(++Evaluations > 1);
        ZF_ASSERT(Evaluations < 2);
        ZF_ASSERT_TEXT(Evaluations == 0, "a text of its own");
        reportInternalError("ZfCBasicBlock", 12);
    }
    EXPECT_EQ(1, Evaluations); // not evaluated for users
    EXPECT_EQ((std::vector<std::string>{"++Evaluations > 1", "a text of its own", "0"}),
              Received.m_Assertions);
    EXPECT_EQ(2u, Received.m_Messages.size());
}

TEST(BaseState, ModelSpecificationAddsToTheDataDictionaryOnly) {
    ZfCCvDDBaseState State;
    State.setToOnlyModel();
    State.updateWithModelSpecification();
    EXPECT_TRUE(State.isOnlyModel() && State.isSpecifiedInModel() && !State.isSpecifiedInDD());
    State.setToOnlyDD();
    EXPECT_TRUE(State.isOnlyDD() && State.isSpecifiedInDD() && !State.isSpecifiedInModel());
    State.updateWithModelSpecification();
    EXPECT_TRUE(State.isOnlyModelAndDD() && State.isSpecifiedInDD() && State.isSpecifiedInModel());
    State.updateWithModelSpecification();
    EXPECT_TRUE(State.isOnlyModelAndDD() && !State.isOnlyDD());
}

} // namespace
