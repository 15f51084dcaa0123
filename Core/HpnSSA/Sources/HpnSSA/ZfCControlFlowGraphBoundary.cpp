// Boundary statements: the flow of values over the edge of a procedure made visible.
//
// Before SSA form every variable is global in kind. So that a call needs no special case later,
//
// 1. "#main" begins with an initial assignment for each of its variables,
// 2. every other procedure begins with a parameter statement for each of its variables, with one
//    argument expression for each call,
// 3. a value return statement stands behind a call for each variable that the callee defines, and
// 4. "#main" ends with an output statement for each output variable.
//
// "Its variables" are those of the summaries, callees included. Initial and last blocks are made
// for these statements, so entry and exit nodes stay free of them.
//
// Linear in the statements that are made, which are procedures times variables at worst.

#include "ZfCControlFlowGraph.h"

#include "ZfCInternalCheck.h"

using VariableSet = leda::set<ZfCCfgVariable*, leda::avl_tree>;

void ZfCControlFlowGraph::initVariablesAfterEntryNodes() {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    for (auto Item = m_Procedures.first_item(); Item; Item = m_Procedures.next_item(Item)) {
        ZfCCfgProcedure* pProcedure = m_Procedures.inf(Item);
        // Step 1: the initial block.
        leda::node EntryNode = pProcedure->getEntryNode();
        ZfCBasicBlock* pBasicBlock = pFactory->createBasicBlock();
        pBasicBlock->setProcedure(pProcedure);
        leda::node w = new_node(pBasicBlock);
        // Steps 2 and 3: it comes between the entry node and the procedure's code.
        leda::list<leda::edge> OutEdges = out_edges(EntryNode);
        for (leda::edge e : OutEdges) {
            move_edge(e, w, target(e));
        }
        new_edge(EntryNode, w, pFactory->createEdgeInfo());
        // Step 4: every variable that the procedure or its callees touch.
        VariableSet VariablesToInit = pProcedure->getDefinedVariables();
        VariablesToInit.add(pProcedure->getUsedVariables());
        // Step 5: the values come from the start of the program, or from the calls.
        if (EntryNode == getStartNode()) {
            addVarInits(w, std::move(VariablesToInit));
        } else {
            addParamStatements(w, std::move(VariablesToInit), pProcedure);
        }
    }
}

void ZfCControlFlowGraph::addVarInits(leda::node v, VariableSet Variables) {
    ZfCBasicBlock* pBasicBlock = inf(v)->isBasicBlock();
    ZF_ASSERT(pBasicBlock);
    for (ZfCCfgVariable* pVar : Variables) {
        auto* pAssignment = new ZfCCfgInitAssignment();
        ZfCCfgValue InitValue = pVar->getInitValue();
        pAssignment->setLHS(pVar);
        pAssignment->setRHS(ZfCCfgFactory::getInstance()->createValueExpression(InitValue));
        pBasicBlock->append(pAssignment);
    }
}

void ZfCControlFlowGraph::addParamStatements(leda::node v, VariableSet Variables,
                                             ZfCCfgProcedure* pProcedure) {
    // Step 1.
    ZfCBasicBlock* pBasicBlock = inf(v)->isBasicBlock();
    ZF_ASSERT(pBasicBlock);
    // Step 2: nothing may be assumed of an argument that outside code can pass.
    bool IsCallableFromOutside = pProcedure->isDirectlyOrIndirectlyCallableFromOutside();
    // Step 3: the client's parameters come first, with the arguments that they have already.
    leda::list<ZfCCfgParamStatement*> ParamStatements = pProcedure->getParamStatements();
    while (!ParamStatements.empty()) {
        ZfCCfgParamStatement* pParamStatement = ParamStatements.pop();
        pBasicBlock->append(pParamStatement);
        Variables.del(pParamStatement->getVariable());
    }
    // Step 4.
    leda::list<ZfCCfgProcedureCall*> ProcedureCalls = pProcedure->getCalls();
    // Step 5: any other variable passes itself, in an expression of its own for each call.
    for (ZfCCfgVariable* pVar : Variables) {
        auto* pParamStatement = new ZfCCfgParamStatement(pVar);
        for (ZfCCfgProcedureCall* pProcedureCall : ProcedureCalls) {
            ZfCCfgExplicitVarUse* pExpression =
                ZfCCfgFactory::getInstance()->createExplicitVarUse(IsCallableFromOutside);
            pExpression->addVariable(pVar);
            pParamStatement->setParamExpression(pProcedureCall, pExpression);
        }
        pBasicBlock->append(pParamStatement);
        pProcedure->appendParamStatement(pParamStatement);
    }
}

void ZfCControlFlowGraph::placeValueReturnStatements() {
    for (leda::node v = first_node(); v != stop_node(); v = next_node(v)) {
        // Step 1.
        ZfCCfgNodeInfo* pInf = inf(v);
        if (pInf == nullptr) {
            reportInternalError("ZfCControlFlowGraph", __LINE__);
            continue;
        }
        // Step 2. What is appended on the way comes behind the statement in hand and is no call,
        // so the list needs no copy. A call of something unknown defines nothing.
        ZfCBasicBlock* pBasicBlock = pInf->isBasicBlock();
        if (pBasicBlock == nullptr) {
            continue;
        }
        for (ZfCCfgStatement* pStmt : pBasicBlock->getStatementSeq()) {
            ZfCCfgProcedureCall* pCall = pStmt->isProcedureCall();
            if (pCall == nullptr) {
                continue;
            }
            if (auto Item = m_Procedures.lookup(pCall->getName())) {
                ZfCCfgProcedure* pCallee = m_Procedures.inf(Item);
                addValueReturnStatements(pBasicBlock, pCallee->getDefinedVariables(), pCallee);
            }
        }
    }
}

void ZfCControlFlowGraph::addValueReturnStatements(ZfCBasicBlock* pBasicBlock,
                                                   VariableSet Variables,
                                                   ZfCCfgProcedure* pProcedure) {
    for (ZfCCfgVariable* pVar : Variables) {
        auto* pValueReturnStatement = new ZfCCfgValueReturnStatement(pVar);
        ZfCCfgExplicitVarUse* pExpression = ZfCCfgFactory::getInstance()->createExplicitVarUse();
        pExpression->addVariable(pVar);
        pValueReturnStatement->setExpression(pExpression);
        pBasicBlock->append(pValueReturnStatement);
        pProcedure->appendValueReturnStatement(pValueReturnStatement);
    }
}

void ZfCControlFlowGraph::placeOutputStatements() {
    ZfCCfgFactory* pFactory = ZfCCfgFactory::getInstance();
    // Step 1.
    ZfCCfgProcedure* pProcedure = m_Procedures.inf(m_Procedures.lookup("#main"));
    leda::node ExitNode = pProcedure->getExitNode();
    // Step 2: the last block.
    ZfCBasicBlock* pBasicBlock = pFactory->createBasicBlock();
    pBasicBlock->setProcedure(pProcedure);
    leda::node w = new_node(pBasicBlock);
    leda::list<leda::edge> InEdges = in_edges(ExitNode);
    for (leda::edge e : InEdges) {
        move_edge(e, source(e), w);
    }
    new_edge(w, ExitNode, pFactory->createEdgeInfo());
    // Step 3: a set, so an output that is both defined and used counts once.
    VariableSet OutputVariables;
    VariableSet Variables = pProcedure->getDefinedVariables();
    Variables.add(pProcedure->getUsedVariables());
    for (ZfCCfgVariable* pVariable : Variables) {
        if (pVariable->isOutput()) {
            OutputVariables.insert(pVariable);
        }
    }
    // Step 4.
    for (ZfCCfgVariable* pVariable : OutputVariables) {
        pBasicBlock->append(new ZfCCfgOutputStatement(pVariable));
    }
}
