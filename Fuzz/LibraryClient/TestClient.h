#ifndef TESTCLIENT_H
#define TESTCLIENT_H

// A client in small, by which the passes are tested: variables, expressions and statements that do
// just what the library asks of them, and Program, which makes a graph from a short text or node by
// node.
//
//   proc main { x = 1; if c < 3 { call f; } else { x = x + 1; } while i < 2 { i = i + 1; } }
//   proc f { y = x; extern y; }
//
// "main" stands for "#main". A call gets a block of its own, an arm always has a block, and so has
// what follows it. Variables come into being by their first use: int16, initially 0, erasable
// unless the name begins with "fixed".

#include <cctype>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "ZfCBasicDataType.h"
#include "ZfCControlFlowGraph.h"
#include "ZfCMessageSink.h"
#include "ZfCPlatformMessageServer.h"
#include "ZfCSSAControl.h"

namespace passes {

using VariableSet = leda::set<ZfCCfgVariable*, leda::avl_tree>;

class Variable : public ZfCCfgVariable {
public:
    std::string Name;
    ZF_DataType* pType = ZfCBasicDataType::int16();
    ZfCCfgValue Init = ZfCCfgValue(0.0);
    bool Output = false;
    double Limit = 0; // saturated at plus and minus this, unless 0

    ~Variable() override = default;
    ZF_DataType* getDataType() override { return pType; }
    ZF_Scaling* getScaling() override { return nullptr; }
    bool isUpperBorderSaturated() override { return Limit != 0; }
    bool isLowerBorderSaturated() override { return Limit != 0; }
    double getUpperLimit() override { return Limit; }
    double getLowerLimit() override { return -Limit; }
    ZfCCfgValue getInitValue() override { return Init; }
    bool isOutput() override { return Output; }
};

inline ZfCCfgVariable* originalOf(ZfCCfgVariable* pVariable) {
    ZfCSSAVariable* pVersion = pVariable->isSSAVariable();
    return pVersion != nullptr ? pVersion->getOrigVar() : pVariable;
}

// An expression tree: a number (k), a variable (v), or an operator: + - * < = (equal) # (not equal)
// & | !
struct Term {
    char Op = 'k';
    double Number = 0;
    ZfCCfgVariable* pVar = nullptr;
    std::unique_ptr<Term> A, B;
};

class Expression : public ZfCCfgExpression {
public:
    using Lookup = std::function<ZfCCfgValue(ZfCCfgVariable*)>;

    Term Root;
    bool SideEffects = false;
    int OutsideBoolRange = 0; // how often it was told of

    ~Expression() override = default;

    static ZfCCfgValue compute(Term& T, Lookup const& Read) {
        if (T.Op == 'k' || T.Op == 'v')
            return T.Op == 'k' ? ZfCCfgValue(T.Number) : Read(T.pVar);
        ZfCCfgValue A = compute(*T.A, Read);
        if (T.Op == '!')
            return !A;
        ZfCCfgValue B = compute(*T.B, Read);
        switch (T.Op) {
        case '+':
            return A + B;
        case '-':
            return A - B;
        case '*':
            return A * B;
        case '<':
            return A < B;
        case '=':
            return A == B;
        case '#':
            return A != B;
        case '&':
            return A && B;
        default:
            return A || B;
        }
    }

    VariableSet getUsedVariables() override {
        VariableSet Used;
        forAll(Root, [&](Term& T) {
            if (T.Op == 'v')
                Used.insert(T.pVar);
        });
        return Used;
    }
    void replaceVariable(ZfCCfgVariable* pOld, ZfCCfgVariable* pNew) override {
        forAll(Root, [&](Term& T) {
            if (T.Op == 'v' && T.pVar == pOld)
                T.pVar = pNew;
        });
    }
    void replaceConditionWithConstant(double Value) override { Root = number(Value); }
    ZfCCfgValue evaluate() override {
        if (isMarkedAsEvalToNonConst())
            return ZfCCfgValue(eCfgValueNonConstant);
        return compute(Root, [](ZfCCfgVariable* pVar) { return pVar->getValue(); });
    }
    ZfCCfgValue getMinimum() override { return bound(&ZfCCfgVariable::getMinValue); }
    ZfCCfgValue getMaximum() override { return bound(&ZfCCfgVariable::getMaxValue); }
    void replaceConstantVariables() override {
        forAll(Root, [](Term& T) {
            ZfCCfgValue Value =
                T.Op == 'v' ? T.pVar->getValue() : ZfCCfgValue(eCfgValueNonConstant);
            if (Value.isConstant())
                T = number(Value.getValue());
        });
    }
    void replaceConstantCondition() override { foldConstants(); }
    void foldConstants() override {
        ZfCCfgValue Value = evaluate();
        if (Value.isConstant())
            Root = number(Value.getValue());
    }
    ZfCCfgVariable* isVariable(bool& Negated) override {
        Negated = Root.Op == '!';
        Term& T = Negated ? *Root.A : Root;
        return T.Op == 'v' ? T.pVar : nullptr;
    }
    bool isVariableEqualToConstant(ZfCCfgVariable*& pVariable, ZfCCfgValue& Value,
                                   bool& Negated) override {
        if ((Root.Op != '=' && Root.Op != '#') || Root.A->Op != 'v' || Root.B->Op != 'k')
            return false;
        pVariable = Root.A->pVar;
        Value = ZfCCfgValue(Root.B->Number);
        Negated = Root.Op == '#';
        return true;
    }
    bool hasSideEffects() override { return SideEffects; }
    void actOnComparisonOutsideBoolRange() override { ++OutsideBoolRange; }

    static Term number(double Value) {
        Term T;
        T.Number = Value;
        return T;
    }
    static bool sameTerm(Term const& A, Term const& B) {
        if (A.Op != B.Op || A.Number != B.Number)
            return false;
        if (A.Op == 'v')
            return originalOf(A.pVar) == originalOf(B.pVar);
        return (!A.A || sameTerm(*A.A, *B.A)) && (!A.B || sameTerm(*A.B, *B.B));
    }

private:
    static void forAll(Term& T, std::function<void(Term&)> const& Visit) {
        Visit(T);
        if (T.A)
            forAll(*T.A, Visit);
        if (T.B)
            forAll(*T.B, Visit);
    }
    // A sum has the sum of the bounds; anything else has a range only if it is a constant.
    ZfCCfgValue bound(ZfCCfgValue (ZfCCfgVariable::*pBound)()) {
        if (Root.Op == 'v' || Root.Op == '+')
            return compute(Root, [=](ZfCCfgVariable* pVar) { return (pVar->*pBound)(); });
        ZfCCfgValue Value = evaluate();
        return Value.isConstant() ? Value : ZfCCfgValue(eCfgValueNonConstant);
    }
};

inline Term& termOf(ZfCCfgExpression* pExpression) {
    return static_cast<Expression*>(pExpression)->Root;
}

class Assignment : public ZfCCfgAssignment {
public:
    std::function<bool(bool&)> Hoist; // set by the test that wants it
    int* pRemoved = nullptr;          // counts removals

    ZfCCfgStatement* clone() override { return nullptr; }
    void foldConstants() override { getRHS()->foldConstants(); }
    bool generatesSameCode(ZfCCfgStatement* pOther) override {
        auto* pThat = dynamic_cast<Assignment*>(pOther);
        return pThat != nullptr && originalOf(getLHS()) == originalOf(pThat->getLHS()) &&
               Expression::sameTerm(termOf(getRHS()), termOf(pThat->getRHS()));
    }
    bool hoistOutOfIfElseBranch(bool& IgnoreNextStatement) override {
        IgnoreNextStatement = false;
        return Hoist && Hoist(IgnoreNextStatement);
    }
    void remove() override {
        if (pRemoved != nullptr)
            ++*pRemoved;
    }
};

// Collects what is reported while it lives, and shows internal info or not.
class Reports : public ZfCMessageSink {
public:
    std::vector<std::string> Messages;
    static std::vector<std::string>& assertions() {
        static std::vector<std::string> Texts;
        return Texts;
    }

    explicit Reports(bool IsShown) {
        assertions().clear();
        ZfCPlatformMessageServer::setShowInternalInfo(IsShown);
        ZfCPlatformMessageServer::setSink(this);
        ZfCPlatformMessageServer::setAssertionHook(
            [](const char*, int, const char* Condition) { assertions().push_back(Condition); });
    }
    ~Reports() override {
        ZfCPlatformMessageServer::setShowInternalInfo(false);
        ZfCPlatformMessageServer::setSink(nullptr);
        ZfCPlatformMessageServer::setAssertionHook(nullptr);
    }
    void receiveMessage(tagERR_error_severity_etp, int Number, const ZfCSrcRef*, const char*,
                        const char* Text) override {
        Messages.push_back(std::to_string(Number) + ": " + Text);
    }
    bool silent() const { return Messages.empty() && assertions().empty(); }
};

class Program {
public:
    Program() {
        Control.boot();
        pGraph = std::make_unique<ZfCControlFlowGraph>();
        pFactory = ZfCCfgFactory::getInstance();
    }
    explicit Program(std::string const& Text) : Program() { read(Text); }
    ~Program() {
        // An edge record that is parked when the factory empties is lost to the process: take what
        // extraction has parked back into use, so that a leak checker has nothing to say about it.
        for (int i = 0; i < 200; ++i)
            pFactory->createEdgeInfo();
        pGraph.reset();
        Control.shutdown();
    }

    ZfCControlFlowGraph& graph() { return *pGraph; }

    Variable* var(std::string const& Name) {
        std::unique_ptr<Variable>& pVar = Variables[Name];
        if (!pVar) {
            pVar = std::make_unique<Variable>();
            pVar->Name = Name;
            if (Name.rfind("fixed", 0) != 0)
                pVar->markAsErasable();
        }
        return pVar.get();
    }
    Variable* output(std::string const& Name) {
        var(Name)->Output = true;
        return var(Name);
    }
    Variable* input(std::string const& Name) {
        var(Name)->markAsVolatile();
        return var(Name);
    }
    Variable* boolean(std::string const& Name) {
        var(Name)->pType = ZfCBasicDataType::boolean();
        return var(Name);
    }

    // --- Node by node ---

    leda::node entry(std::string const& Name) {
        leda::node v = pGraph->demandProcedureEntryNode(Name.c_str(), pProcedure);
        if (Name == "#main")
            pGraph->setStartNode(v);
        return v;
    }
    // A block with the statements of the text, and the condition behind a question mark.
    leda::node block(std::string const& Text = "") {
        ZfCBasicBlock* pBlock = pFactory->createBasicBlock();
        pBlock->setProcedure(pProcedure);
        leda::node v = pGraph->new_node(pBlock);
        std::size_t Mark = Text.find('?');
        Source = Text.substr(0, Mark) + "}";
        At = 0;
        readStatements(v);
        if (Mark != std::string::npos)
            blockOf(v)->appendBranch(expression(Text.substr(Mark + 1)));
        return v;
    }
    ZfCBasicBlock* blockOf(leda::node v) { return pGraph->inf(v)->isBasicBlock(); }
    leda::edge edge(leda::node v, leda::node w) {
        return pGraph->new_edge(v, w, pFactory->createEdgeInfo());
    }
    leda::edge trueEdge(leda::node v, leda::node w) {
        return pGraph->new_edge(v, w, pFactory->createTrueBranch());
    }
    leda::edge falseEdge(leda::node v, leda::node w) {
        return pGraph->new_edge(v, w, pFactory->createFalseBranch());
    }

    Expression* expression(std::string const& Text) {
        Source = Text + ";";
        At = 0;
        return readExpression();
    }

    // --- The road ---

    // The client's duty where inlining does not run.
    void registerCalls() {
        for (ZfCCfgProcedureCall* pCall : calls())
            procedure(pCall->getName().cstring())->appendCall(pCall);
    }
    void toSSA(bool WithLoop = false) {
        pGraph->placeExitNodes();
        registerCalls();
        if (WithLoop)
            pGraph->placeLoopAroundMain();
        pGraph->transformToSSAForm();
    }
    void propagate(bool RemoveDeadCode, bool WithLoop = false) {
        toSSA(WithLoop);
        pGraph->divideBasicBlock();
        pGraph->propagateSparseConditionalConstant(RemoveDeadCode);
    }

    // --- Looking at it ---

    ZfCCfgProcedure* procedure(std::string const& Name) {
        ZfCCfgProcedure* pFound = nullptr;
        pGraph->demandProcedureEntryNode(Name.c_str(), pFound);
        return pFound;
    }
    // All statements and phi functions, in node order.
    std::vector<std::pair<leda::node, ZfCCfgStatement*>> statements() {
        std::vector<std::pair<leda::node, ZfCCfgStatement*>> Found;
        for (leda::node v : pGraph->all_nodes())
            if (ZfCBasicBlock* pBlock = blockOf(v)) {
                for (ZfCPhiFunction* pPhi : pBlock->getPhiFunctions())
                    Found.emplace_back(v, pPhi);
                for (ZfCCfgStatement* pStmt : pBlock->getStatementSeq())
                    Found.emplace_back(v, pStmt);
            }
        return Found;
    }
    std::vector<ZfCCfgProcedureCall*> calls() {
        std::vector<ZfCCfgProcedureCall*> Found;
        for (auto& Item : statements())
            if (ZfCCfgProcedureCall* pCall = Item.second->isProcedureCall())
                Found.push_back(pCall);
        return Found;
    }
    // What the definitions of a variable hold, in node order: "1 2 top bottom".
    std::string valuesOf(std::string const& Name) {
        std::string Text;
        for (auto& Item : statements())
            for (ZfCCfgVariable* pVar : Item.second->getDefinedVariables())
                if (originalOf(pVar) == var(Name))
                    Text += (Text.empty() ? "" : " ") + show(pVar->getValue());
        return Text;
    }
    static std::string show(ZfCCfgValue Value) {
        if (!Value.isConstant())
            return Value.isUndetermined() ? "top" : "bottom";
        return std::to_string(int(Value.getValue()));
    }

    std::map<std::string, std::unique_ptr<Variable>> Variables;
    ZfCCfgFactory* pFactory = nullptr;

private:
    char peek() {
        while (std::isspace(static_cast<unsigned char>(Source[At])))
            ++At;
        return Source[At];
    }
    bool accept(std::string const& Token) {
        peek();
        if (Source.compare(At, Token.size(), Token) != 0)
            return false;
        At += Token.size();
        return true;
    }
    std::string word() {
        peek();
        std::size_t Begin = At;
        while (std::isalnum(static_cast<unsigned char>(Source[At])) || Source[At] == '_')
            ++At;
        return Source.substr(Begin, At - Begin);
    }

    std::unique_ptr<Term> readOperand() {
        auto pTerm = std::make_unique<Term>();
        if (accept("!")) {
            pTerm->Op = '!';
            pTerm->A = readOperand();
        } else if (std::isdigit(static_cast<unsigned char>(peek()))) {
            pTerm->Number = std::stod(word());
        } else {
            pTerm->Op = 'v';
            pTerm->pVar = var(word());
        }
        return pTerm;
    }
    // Operators have one precedence and bind to the left.
    Expression* readExpression() {
        std::unique_ptr<Term> pLeft = readOperand();
        for (;;) {
            auto pTerm = std::make_unique<Term>();
            if (accept("=="))
                pTerm->Op = '=';
            else if (accept("!="))
                pTerm->Op = '#';
            else if (std::string("+-*<&|").find(peek()) != std::string::npos)
                pTerm->Op = Source[At++];
            else
                break;
            pTerm->A = std::move(pLeft);
            pTerm->B = readOperand();
            pLeft = std::move(pTerm);
        }
        auto* pExpression = new Expression();
        pExpression->Root = std::move(*pLeft);
        pFactory->addSFExpression(pExpression);
        return pExpression;
    }

    void read(std::string const& Text) {
        std::string All = Text + " ";
        for (std::size_t Position = 0;
             (Position = All.find("proc ", Position)) != std::string::npos;) {
            Source = All;
            At = Position + 5;
            std::string Name = word();
            leda::node v = entry(Name == "main" ? "#main" : Name);
            leda::node First = newBlock();
            edge(v, First);
            accept("{");
            readStatements(First);
            Position = At;
        }
    }
    leda::node newBlock() {
        ZfCBasicBlock* pBlock = pFactory->createBasicBlock();
        pBlock->setProcedure(pProcedure);
        return pGraph->new_node(pBlock);
    }
    // Answers the block that is open at the closing brace.
    leda::node readStatements(leda::node v) {
        while (!accept("}"))
            v = readStatement(v);
        return v;
    }
    leda::node readStatement(leda::node v) {
        std::string Name = word();
        if (Name == "if")
            return readIf(v);
        if (Name == "while")
            return readWhile(v);
        if (Name == "call")
            return readCall(v);
        if (Name == "extern") {
            leda::list<ZfCCfgVariable*> None;
            auto* pCall = new ZfCCfgExternCall(&None);
            pCall->appendUsedVariable(var(word()));
            blockOf(v)->append(pCall);
        } else {
            accept("=");
            auto* pAssignment = new Assignment();
            pAssignment->setLHS(var(Name));
            pAssignment->setRHS(readExpression());
            blockOf(v)->append(pAssignment);
        }
        accept(";");
        return v;
    }
    leda::node readIf(leda::node v) {
        blockOf(v)->appendBranch(readExpression());
        leda::node Then = newBlock();
        trueEdge(v, Then);
        accept("{");
        leda::node ThenEnd = readStatements(Then);
        leda::node Else = newBlock();
        falseEdge(v, Else);
        leda::node ElseEnd = Else;
        if (accept("else")) {
            accept("{");
            ElseEnd = readStatements(Else);
        }
        leda::node Join = newBlock();
        edge(ThenEnd, Join);
        edge(ElseEnd, Join);
        return Join;
    }
    leda::node readWhile(leda::node v) {
        leda::node Head = newBlock();
        edge(v, Head);
        blockOf(Head)->appendBranch(readExpression());
        leda::node Body = newBlock();
        trueEdge(Head, Body);
        accept("{");
        edge(readStatements(Body), Head);
        leda::node Behind = newBlock();
        falseEdge(Head, Behind);
        return Behind;
    }
    leda::node readCall(leda::node v) {
        leda::node Call = newBlock();
        edge(v, Call);
        blockOf(Call)->append(new ZfCCfgProcedureCall(word().c_str()));
        accept(";");
        leda::node Behind = newBlock();
        edge(Call, Behind);
        return Behind;
    }

    ZfCSSAControl Control;
    std::unique_ptr<ZfCControlFlowGraph> pGraph;
    ZfCCfgProcedure* pProcedure = nullptr; // of the blocks that are made
    std::string Source;
    std::size_t At = 0;
};

} // namespace passes

#endif
