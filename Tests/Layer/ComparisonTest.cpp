#include "LEDA/leda.h"

#include <gtest/gtest.h>
#include <string>
#include <vector>

// Containers are named with classes that are not known yet, and filled in objects whose addresses
// ascend while their numbers descend: a container that compares addresses shows the wrong order.
struct LateVariable;
struct DerivedVariable;
namespace client {
struct Signal;
}

struct Holder {
    leda::set<LateVariable*, leda::avl_tree> variables;
    leda::dictionary<client::Signal*, int, leda::ab_tree> signals;
    leda::set<leda::node> nodes;
};

struct LateVariable {
    int number = 0;
};
struct DerivedVariable : LateVariable {
    double more = 0;
};
namespace client {
struct Signal {
    int number = 0;
};
int compare(Signal* const& a, Signal* const& b) {
    return a->number - b->number;
}
} // namespace client

namespace {

template <class Element>
std::vector<Element> descending(int n) {
    std::vector<Element> elements(static_cast<std::size_t>(n));
    for (int i = 0; i < n; ++i)
        elements[std::size_t(i)].number = n - i;
    return elements;
}

template <class Set>
bool ascends(const Set& s) {
    int last = 0;
    for (auto* element : s)
        if (element->number != ++last)
            return false;
    return last == s.size();
}

} // namespace

TEST(Comparison, DeclaredLaterInTheLayersNamespaceIsUsed) {
    for (int n : {3, 40, 500}) {
        auto elements = descending<LateVariable>(n);
        Holder holder;
        for (auto& element : elements)
            holder.variables.insert(&element);
        EXPECT_TRUE(ascends(holder.variables)) << n;
        EXPECT_TRUE(ascends(leda::set<LateVariable*>(holder.variables) + holder.variables));
    }
}

TEST(Comparison, OfTheBaseServesForPointersToADerivedClass) {
    auto elements = descending<DerivedVariable>(100);
    leda::set<DerivedVariable*> s;
    for (auto& element : elements)
        s.insert(&element);
    EXPECT_TRUE(ascends(s));
}

TEST(Comparison, InTheNamespaceOfTheElementsClassIsUsed) {
    auto elements = descending<client::Signal>(100);
    Holder holder;
    leda::set<client::Signal*> s;
    for (auto& element : elements) {
        s.insert(&element);
        holder.signals.insert(&element, element.number);
    }
    EXPECT_TRUE(ascends(s));
    int last = 0;
    for (leda::dic_item it = holder.signals.first_item(); it; it = holder.signals.next_item(it))
        EXPECT_EQ(holder.signals.inf(it), ++last);
    EXPECT_EQ(last, 100);
}

TEST(Comparison, SetsOfNodesAscendByCreation) {
    leda::graph g;
    std::vector<leda::node> nodes;
    for (int i = 0; i < 200; ++i)
        nodes.push_back(g.new_node());
    Holder holder;
    for (std::size_t i = nodes.size(); i-- > 0;)
        holder.nodes.insert(nodes[i]);
    g.del_node(nodes[50]);
    int index = 0;
    for (leda::node v : holder.nodes)
        EXPECT_EQ(v->index(), index++);
    EXPECT_TRUE(holder.nodes.member(nodes[50])) << "a deleted node keeps its place";
}

TEST(Comparison, OfNumbersCoversTheirWholeRange) {
    EXPECT_LT(leda::compare(-2147483647 - 1, 2147483647), 0);
    EXPECT_GT(leda::compare(4294967295u, 0u), 0);
    EXPECT_LT(leda::compare(0.25, 0.5), 0);
    EXPECT_EQ(leda::compare(true, true), 0);
    EXPECT_GT(leda::compare(true, false), 0);
}

// Behind all uses, as a client's header may be.
namespace leda {
int compare(LateVariable* const& a, LateVariable* const& b) {
    return a->number - b->number;
}
} // namespace leda
