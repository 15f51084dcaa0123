#include "ModelTestSupport.h"
#include "ZfCCodeGenMessage.h"
#include "ZfCCvDDBaseState.h"
#include "ZfCInternalCheck.h"

namespace {

using Messages = ZfCCodeGenMessage;

// The whole catalogue in order of the numbers; @ marks a message with a source reference.
TEST(Message, EachEntrySendsItsSeverityNumberCategoryAndText) {
    Reports Received;
    const ZfCSrcRef SrcRef("a.hpn", 3, 4);
    const bool AreSent[] = {
        Messages::putCodeGenMessage10000("A", "B"),
        Messages::putCodeGenMessage10001(),
        Messages::putCodeGenMessage10002("A", 0.25),
        Messages::putCodeGenMessage10003("A"),
        Messages::putCodeGenMessage10004("A", "B"),
        Messages::putCodeGenMessage10005("A"),
        Messages::putCodeGenMessage10006(7),
        Messages::putCodeGenMessage10007("A", 7),
        Messages::putCodeGenMessage10008(&SrcRef, "A", 7),
        Messages::putCodeGenMessage10011(),
        Messages::putCodeGenMessage10012(&SrcRef, "A"),
        Messages::putCodeGenMessage10013(),
        Messages::putCodeGenMessage10014(),
        Messages::putCodeGenMessage10015(),
        Messages::putCodeGenMessage10016(),
        Messages::putCodeGenMessage10017(&SrcRef, "A"),
        Messages::putCodeGenMessage10018(),
        Messages::putCodeGenMessage10020("A"),
        Messages::putCodeGenMessage10021(),
        Messages::putCodeGenMessage10022("A"),
        Messages::putCodeGenMessage10023(),
        Messages::putCodeGenMessage10024("A", "B"),
        Messages::putCodeGenMessage10025(),
        Messages::putCodeGenMessage10026("A", "B"),
        Messages::putCodeGenMessage10027("A", "B", "C"),
        Messages::putCodeGenMessage10028("A"),
        Messages::putCodeGenMessage10029("A"),
        Messages::putCodeGenMessage10030(),
        Messages::putCodeGenMessage21652(&SrcRef, "A"),
        Messages::putCodeGenMessage32008(&SrcRef, "A"),
        Messages::putCodeGenMessage32118(&SrcRef, "A", "B"),
        Messages::putCodeGenMessage32221(&SrcRef, "A", "B", "C"),
        Messages::putCodeGenMessage32300(&SrcRef, "A"),
        Messages::putCodeGenMessage99066(),
        Messages::putCodeGenMessage99067(),
        Messages::putCodeGenMessage99068(),
        Messages::putCodeGenMessage99069(),
    };
    for (bool IsSent : AreSent)
        EXPECT_TRUE(IsSent);
    EXPECT_EQ(Received.m_Text, R"(0 10000 General Messages|A Production Code Generator Version B
0 10001 General Messages|HpnSSA Production Code Generator. Copyright by its authors. All rights reserved.
0 10002 General Messages|A                              in    0.25 seconds.
0 10003 General Messages|Target name : A
0 10004 General Messages|A B
0 10005 General Messages|Output file name : A
3 10006 General Messages|Error count exceeds 7.
3 10007 General Messages|Internal error. Error code: A 7. Contact Orvane's technical support team.
3 10008 @General Messages|Internal error. Error code: A 7. Contact Orvane's technical support team.
3 10011 General Messages|Problem in intermediate code conversion made code generation impossible. Refer to the preceding messages.
2 10012 @General Messages|Internal exception in intermediate code conversion made code generation impossible. A.
2 10013 General Messages|Could not read the model. Check the error messages above for further details.
2 10014 General Messages|The code generation process failed. Check the error messages above for further details.
2 10015 General Messages|The code optimization process failed.
2 10016 General Messages|The model analysis failed. Check the error messages above for further details.
3 10017 @General Messages|Could not create A. Check the error messages above for further details.
2 10018 General Messages|The function inlining process failed. Check the error messages above for further details.
3 10020 General Messages|An internal error (LEDA exception: A) has occurred.
2 10021 General Messages|Connection analysis failed. See the error messages above for further details.
2 10022 General Messages|Raised exception: A
2 10023 General Messages|Scale propagation failed. See the error messages above for further details.
2 10024 General Messages|On the RTOS page of the Lumora Main Dialog the option 'A' is set to 'B'. This is invalid for the Prototyping Mode.
3 10025 General Messages|Merge mechanism failed. See the error messages above for further details.
2 10026 General Messages|On the RTOS page of the Lumora Main Dialog the option 'A' is set to 'B'. This is invalid for the production code generation.
2 10027 General Messages|The DLL A has version B, but version C was expected.
1 10028 General Messages|The DLL A is a hotfix version.
2 10029 General Messages|The DLL A is a prerelease version.
2 10030 General Messages|The DLL versions could not be validated.
2 21652 @Extract Bits Block Messages|Validation of range to be extracted has failed. A
2 32008 @AUTOSAR Messages|Function class A is needed for AUTOSAR code generation but is not available in Data Dictionary.
2 32118 @Code Generation from DD|Function A is specified to be generated into module B whose CodeGenerationBasis property is set to DDBased.
2 32221 @Variable Vector Widths Messages|The block is specified with variable vector width, and its signal line is combined with a signal line of block 'A' by Mux block 'B'. This is currently not supported, because the blocks' output variables differ in property 'C'.
1 32300 @RTOS Messages|At least one FileSpecification object of the module has EmitFile set to 'on' and is referenced by RTOS function template A. The EmitFile property is ignored.
3 99066 Internal Messages|The test was successful without any errors.
3 99067 Internal Messages|Test aborted because of one or more fatal errors. See messages above.
7 99068 Internal Messages|Illegal call of test code in release.
3 99069 Internal Messages|File with test options not found.
)");
}

TEST(Message, AMissingParameterIsWrittenOut) {
    Reports Received;
    Messages::putCodeGenMessage10007(nullptr, 7);
    Messages::putCodeGenMessage10004("A", nullptr);
    EXPECT_EQ(Received.m_Text, "3 10007 General Messages|Internal error. Error code: _NULL_ 7. "
                               "Contact Orvane's technical support team.\n"
                               "0 10004 General Messages|A _NULL_\n");
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
