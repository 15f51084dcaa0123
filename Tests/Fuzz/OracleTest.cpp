#include "FuzzTestSupport.h"

#include "Metamorph.h"

#include "Model/ZfCCfgSFExpression.h"
#include "Shrinker.h"
#include "ZfCBasicBlock.h"
#include "ZfCCfgAssignment.h"
#include "ZfCPhiFunction.h"
#include "ZfCSSAVariable.h"

#include <algorithm>
#include <gtest/gtest.h>

// Faults put into the graph on purpose: the oracle must see each of them, and say of what kind it
// is.

using namespace hpn;
using namespace hpn::fuzz;
using namespace hpn::fuzz::test;

namespace {

const char* const Program = "input bool on;\n"
                            "output uint8 shown = 0;\n"
                            "state uint8 kept = 4;\n"
                            "extern seen reads(shown);\n"
                            "proc note(uint8 what) {\n"
                            "  if (what > 2) { shown = what; } else { shown = kept; }\n"
                            "}\n"
                            "proc main() {\n"
                            "  local uint8 level = 0;\n"
                            "  if (on) { level = 3; } else { level = kept + 1; }\n"
                            "  kept = level;\n"
                            "  note(level);\n"
                            "  note(kept + 1);\n"
                            "  seen();\n"
                            "}\n";

template <class Found>
bool forEachStatement(ProgramGraph& Graph, Found Edit) {
    ZfCControlFlowGraph& Nodes = Graph.getGraph();
    for (leda::node v = Nodes.first_node(); v != nullptr; v = Nodes.next_node(v)) {
        ZfCBasicBlock* pBlock = Nodes.inf(v)->isBasicBlock();
        for (ZfCCfgStatement* pStatement :
             pBlock != nullptr ? pBlock->getStatementSeq() : leda::list<ZfCCfgStatement*>()) {
            if (Edit(pBlock, pStatement))
                return true;
        }
    }
    return false;
}

ZfCCfgAssignment* assignmentTo(ZfCCfgStatement* pStatement, const char* pName) {
    ZfCCfgAssignment* pAssignment = pStatement->isAssignment();
    const bool IsIt = pAssignment != nullptr &&
                      pAssignment->getRHS()->isSFExpression() != nullptr &&
                      originalOf(pAssignment->getLHS())->getDeclaration().Name == pName;
    return IsIt ? pAssignment : nullptr;
}

std::string kindAfter(const char* pPass, const std::function<bool(ProgramGraph&)>& Break) {
    Trial Wanted = trialOf(Program);
    Wanted.Run.Steps = 8;
    bool IsBroken = false;
    Wanted.Tamper = [&](std::string_view Pass, ProgramGraph& Graph) {
        if (Pass == pPass)
            IsBroken = Break(Graph);
    };
    const TrialResult Result = runTrial(Wanted);
    EXPECT_TRUE(IsBroken) << "nothing was broken after " << pPass;
    EXPECT_EQ(pPass, Result.Failed.Pass) << Result.Failed.Detail;
    return Result.Failed.Kind;
}

TEST(Oracle, AcceptsTheSoundProgram) {
    const TrialResult Result = runTrial(trialOf(Program));
    EXPECT_EQ("", Result.Failed.Kind) << Result.Failed.Detail;
    EXPECT_EQ(1u, Result.Counts.Passes[static_cast<std::size_t>(PassId::RemoveUnusedVarDefs)]);
}

// Programs that were optimised wrongly once.
TEST(Oracle, AcceptsWhatWasWrongOnce) {
    for (const char* pText : {"input bool in; output bool o; state float32 s;\n"
                              "proc f() { s = 1e39; s = s / s; }\n"
                              "proc main() { s = 0; if (in) { f(); f(); } o = s == 0; }\n",
                              "proc p(float32 a) { a /= a; }\n"
                              "proc main() { p(1e39); }\n"}) {
        for (std::uint64_t Stimulus = 1; Stimulus < 5; ++Stimulus) {
            Trial Wanted = trialOf(pText);
            Wanted.Run.Steps = 8;
            Wanted.Run.StimulusSeed = Stimulus;
            const TrialResult Result = runTrial(Wanted);
            EXPECT_EQ("", Result.Failed.Kind) << pText << Result.Failed.Detail;
        }
    }
}

TEST(Oracle, SeesAChangedConstant) {
    EXPECT_EQ("outputs", kindAfter("foldConstants", [](ProgramGraph& Graph) {
                  return forEachStatement(Graph, [&](ZfCBasicBlock*, ZfCCfgStatement* pStatement) {
                      ZfCCfgAssignment* pShown = assignmentTo(pStatement, "shown");
                      if (pShown == nullptr)
                          return false;
                      // Shaped like a real store, so that nothing but the number is wrong.
                      auto* pWrong = new ZfCCfgSFExpression(
                          Graph.getTerms().makeCast(&originalOf(pShown->getLHS())->getType(),
                                                    Graph.getTerms().makeNumber(77.0)));
                      ZfCCfgFactory::getInstance()->addSFExpression(pWrong);
                      pShown->setRHS(pWrong);
                      return true;
                  });
              }));
}

TEST(Oracle, SeesALostStatement) {
    EXPECT_EQ("verifier: an operand has no definition (node )",
              kindAfter("divideBasicBlock", [](ProgramGraph& Graph) {
                  return forEachStatement(Graph,
                                          [](ZfCBasicBlock* pBlock, ZfCCfgStatement* pStatement) {
                                              if (assignmentTo(pStatement, "kept") == nullptr)
                                                  return false;
                                              pBlock->del(pStatement);
                                              return true;
                                          });
              }));
}

// The versions of both operands are defined where the verifier wants them; only an execution shows
// that they changed places. The variable itself is not touched, so no output can show it.
TEST(Oracle, SeesTheWrongVersionAtAUse) {
    const std::string Kind = kindAfter("transformToSSAForm", [](ProgramGraph& Graph) {
        ZfCCfgVariable* pFirst = nullptr;
        return forEachStatement(Graph, [&](ZfCBasicBlock*, ZfCCfgStatement* pStatement) {
            if (ZfCCfgAssignment* pLevel = assignmentTo(pStatement, "level"))
                pFirst = pFirst == nullptr ? pLevel->getLHS() : pFirst; // the 0 at the declaration
            ZfCCfgAssignment* pKept = assignmentTo(pStatement, "kept");
            if (pKept == nullptr || pFirst == nullptr)
                return false;
            for (ZfCCfgVariable* pUsed : pKept->getRHS()->getUsedVariables())
                pKept->getRHS()->replaceVariable(pUsed, pFirst);
            return true;
        });
    });
    EXPECT_EQ("version: a read names the wrong version", Kind);
}

TEST(Oracle, SeesAClaimThatDoesNotHold) {
    EXPECT_EQ("claimed constant",
              kindAfter("propagateSparseConditionalConstant", [](ProgramGraph& Graph) {
                  return forEachStatement(Graph, [](ZfCBasicBlock*, ZfCCfgStatement* pStatement) {
                      ZfCCfgAssignment* pKept = assignmentTo(pStatement, "kept");
                      ZfCCfgValue Wrong(9.0);
                      if (pKept != nullptr)
                          pKept->getLHS()->setVarValueAndAdjustCfgValue(Wrong);
                      return pKept != nullptr;
                  });
              }));
    EXPECT_EQ("claimed range",
              kindAfter("propagateSparseConditionalConstant", [](ProgramGraph& Graph) {
                  return forEachStatement(Graph, [](ZfCBasicBlock*, ZfCCfgStatement* pStatement) {
                      ZfCCfgAssignment* pKept = assignmentTo(pStatement, "kept");
                      if (pKept == nullptr)
                          return false;
                      ZfCCfgValue Unknown(eCfgValueNonConstant);
                      pKept->getLHS()->setVarValueAndAdjustCfgValue(Unknown);
                      pKept->getLHS()->setMinValueAndDestroyOld(ZfCCfgValue(200.0));
                      pKept->getLHS()->setMaxValueAndDestroyOld(ZfCCfgValue(201.0));
                      return true;
                  });
              }));
}

TEST(Oracle, SeesWhatTheLibraryReports) {
    EXPECT_EQ("assertion in Z",
              kindAfter("placeExitNodes", [](ProgramGraph& Graph) {
                  // A statement that stands in no block.
                  Graph.getGraph().splitAtStatement(Graph.getGraph().getStartNode(), nullptr);
                  return true;
              }).substr(0, 14));
}

// ---- pairs ----

bool isDeclared(ProgramGraph& Graph, std::string_view Name) {
    const auto& All = Graph.getProgram().Variables;
    return std::any_of(All.begin(), All.end(),
                       [&](const Variable& Each) { return Each.Name == Name; });
}

/// Says something else of `shown` in one of the two programs than propagation has found, which
/// is 4.
std::string kindOfPair(PairKind Kind, ZfCCfgValue Said,
                       const std::function<bool(ProgramGraph&)>& IsTheOther) {
    Trial Wanted = trialOf(
        "input uint8 on;\noutput uint8 shown = 0;\nstate uint8 kept = 4;\n"
        "proc main() {\n  kept = 4;\n  if (OFF) {\n    kept = on;\n  }\n  shown = kept;\n}\n"
        "param bool OFF = false;\n");
    EXPECT_EQ("", runTrial(Wanted).Failed.Kind);
    Wanted.Pair = Kind;
    EXPECT_EQ("", runTrial(Wanted).Failed.Kind);
    Wanted.Tamper = [&](std::string_view Pass, ProgramGraph& Graph) {
        if (Pass != "propagateSparseConditionalConstant")
            return;
        forEachStatement(Graph, [&](ZfCBasicBlock*, ZfCCfgStatement* pStatement) {
            ZfCCfgAssignment* pShown = assignmentTo(pStatement, "shown");
            pShown = pShown != nullptr ? pShown : assignmentTo(pStatement, "znwohs_");
            if (pShown != nullptr && IsTheOther(Graph))
                pShown->getLHS()->setVarValueAndAdjustCfgValue(Said);
            return pShown != nullptr;
        });
    };
    const TrialResult Result = runTrial(Wanted);
    EXPECT_EQ(1u, Result.Counts.Pairs[static_cast<std::size_t>(Kind)]);
    return Result.Failed.Kind;
}

TEST(Oracle, SeesConclusionsThatHangOnNamesOrGrowWithTheInputs) {
    EXPECT_EQ("pair renamed: claimed constant",
              kindOfPair(PairKind::Renamed, ZfCCfgValue(0.0),
                         [](ProgramGraph& Graph) { return !isDeclared(Graph, "kept"); }));
    EXPECT_EQ(
        "pair widened: shown ",
        kindOfPair(PairKind::Widened, ZfCCfgValue(eCfgValueNonConstant), [](ProgramGraph& Graph) {
            return Graph.getProgram().Variables.front().pType->Base == BaseType::UInt8;
        }));
}

TEST(Oracle, OtherProgramsDoTheSame) {
    for (const PairKind Kind :
         {PairKind::Reordered, PairKind::DeadCode, PairKind::PassOff, PairKind::Twice}) {
        Trial Wanted = trialOf(Program);
        Wanted.Pair = Kind;
        Trial Other;
        ASSERT_TRUE(makeVariant(Wanted, Other)) << nameOfPair(Kind);
        EXPECT_TRUE(Other.Text != Wanted.Text ||
                    listPasses(Other.Passes) != listPasses(Wanted.Passes))
            << nameOfPair(Kind);
        EXPECT_EQ("", runTrial(Wanted).Failed.Kind) << nameOfPair(Kind);
    }
}

// ---- shrinking ----

TEST(Shrinker, KeepsWhatTheFailureNeeds) {
    Trial Failing =
        trialOf("input uint8 i;\nproc main() {\n  if (i > 3) {\n    while (i == 1) {\n "
                "     i = (2 + 3) * 4;\n    }\n  } else {\n    i = 7;\n  }\n  switch (i) {\n"
                "    case 1:\n      i = 9;\n    default:\n  }\n}\n");
    const auto Holds = [](const std::string& Text, const char* pPart) {
        return Text.find(pPart) != std::string::npos;
    };
    unsigned Asked = 0;
    Shrinker Smaller(
        [&](const Trial& Each) {
            ++Asked;
            const std::string& Text = Each.Text;
            return Holds(Text, "while") && Holds(Text, "9") &&
                   Holds(Text, "switch") == (Holds(Text, "case") && Holds(Text, "default")) &&
                   std::count(Text.begin(), Text.end(), '{') ==
                       std::count(Text.begin(), Text.end(), '}') &&
                   Each.Passes.contains(PassId::DivideBasicBlock);
        },
        2000);
    const Trial Small = Smaller.shrink(Failing);
    EXPECT_EQ("while {\n    }\n9\n", Small.Text);
    EXPECT_EQ("placeExitNodes,transformToSSAForm,divideBasicBlock", listPasses(Small.Passes));
    EXPECT_EQ(1u, Small.Run.Steps);
    EXPECT_LT(Asked, 2000u);
}

} // namespace
