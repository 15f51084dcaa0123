#ifndef LABELEXTRACTION_H
#define LABELEXTRACTION_H

#include "Graph/ProgramGraph.h"

#include <string>
#include <unordered_set>
#include <vector>

namespace hpn {

/// Makes a procedure of each label that is reached from several places, so that the code behind it
/// stands once and is called:
///
///     if (hot) { goto fault; }          if (hot) { main_fault(); return; }
///     ...                               ...
///     fault: lamp = true;               main_fault() { lamp = true; }
///
/// Control does not come back behind such a call: what follows the label lies in the new procedure,
/// down to the end of the old one, whose result, if it has one, is set there as well. Locals that
/// both use become variables of the program's life time when C is written.
///
/// Refused, each with a remark at the label: a label that its own code jumps back to (the loop
/// would become a recursion), code with a loop that is also entered from elsewhere (likewise), a
/// procedure that calls itself (its locals exist once for each call in progress), a label with
/// nothing left to do behind it.
///
/// Works on the graph as it was built, before exit nodes, once. Leaves each call alone in its block
/// and every block stamped with the procedure that it lies in. Cost: linear in the graph for each
/// label that is reached from several places.
class LabelExtraction {
public:
    explicit LabelExtraction(ProgramGraph& Target);
    void run();

private:
    std::vector<LabelPlace> findSharedLabels();
    void noteProcedures();
    void findLoops();
    bool isOnLoop(leda::node v) const;
    void findEnds();
    bool isEnd(leda::node v) const;
    void splitEnds();
    void leaveByItself(leda::edge e);
    void splitBranches();
    void extract(const LabelPlace& Label);
    const char* findObstacle(const LabelPlace& Label);
    void walkRegion(leda::node v);
    bool entersLoopFromElsewhere();
    int findOwner(std::size_t Place, const std::vector<int>& Owners);
    void refuse(const LabelPlace& Label, const char* Why);
    void putCallsAlone();
    void stampProcedures();
    const Procedure* findOrigin(leda::node Entry) const;
    void nameProcedures();
    void markCalls(const std::unordered_set<std::string>& Callees);

    ProgramGraph& m_Target;
    ZfCControlFlowGraph& m_Graph;
    std::vector<ZfCCfgProcedure*> m_OldProcedures; // by index of the node, before the run
    std::vector<bool> m_IsOnLoop;     // by index of the node, as the graph was when the run began
    std::vector<bool> m_IsEnd;        // likewise
    std::vector<leda::node> m_Region; // of the label in hand, in reverse postorder
    std::vector<int> m_PlaceOf;       // place in the region by index of the node, or -1
};

} // namespace hpn

#endif
