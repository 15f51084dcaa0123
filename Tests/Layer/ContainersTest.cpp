#include "LEDA/leda.h"

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <functional>
#include <gtest/gtest.h>
#include <iterator>
#include <list>
#include <map>
#include <random>
#include <set>
#include <string>
#include <vector>

namespace {

template <class Container>
auto elements(const Container& c) {
    std::vector<typename Container::value_type> result;
    for (const auto& x : c)
        result.push_back(x);
    return result;
}

std::vector<int> vectorOf(const std::set<int>& s) {
    return {s.begin(), s.end()};
}

// An element type whose live objects are counted.
struct Counted {
    static int live;
    int value = 0;
    Counted() { ++live; }
    explicit Counted(int v) : value(v) { ++live; }
    Counted(const Counted& other) : value(other.value) { ++live; }
    Counted& operator=(const Counted&) = default;
    ~Counted() { --live; }
    bool operator==(const Counted& other) const { return value == other.value; }
};
int Counted::live = 0;

// --- list, stack, array
// -------------------------------------------------------------------------------------------------

TEST(List, BehavesAsTheStandardsUnderRandomOperations) {
    std::mt19937 rng(1);
    leda::list<int> a, b;
    std::list<int> x, y;
    for (int step = 0; step < 20000; ++step) {
        switch (rng() % 10) {
        case 0:
        case 1:
        case 2:
            EXPECT_EQ(a.contents(a.append(step)), step);
            x.push_back(step);
            break;
        case 3:
            a.push(step);
            x.push_front(step);
            break;
        case 4:
            if (!x.empty()) {
                ASSERT_EQ(a.pop(), x.front());
                x.pop_front();
            }
            break;
        case 5:
            if (!x.empty()) {
                ASSERT_EQ(a.pop_back(), x.back());
                x.pop_back();
            }
            break;
        case 6:
            if (!x.empty()) {
                auto it = std::next(x.begin(), int(rng() % x.size()));
                ASSERT_EQ(a.del_item(a.search(*it)), *it);
                x.erase(it);
            }
            break;
        case 7: {
            leda::list<int> rest;
            auto cut = std::next(x.begin(), int(rng() % (x.size() + 1)));
            a.split(cut == x.end() ? nullptr : a.search(*cut), a, rest);
            std::list<int> tail;
            tail.splice(tail.end(), x, cut, x.end());
            ASSERT_TRUE(rest.check_consistency());
            b.conc(rest);
            y.splice(y.end(), tail);
            ASSERT_TRUE(rest.empty());
            break;
        }
        case 8:
            a.conc(b);
            x.splice(x.end(), y);
            break;
        case 9:
            a.sort([](const int& p, const int& q) { return p % 100 - q % 100; });
            x.sort([](int p, int q) { return p % 100 < q % 100; });
            break;
        }
        ASSERT_TRUE(a.check_consistency() && b.check_consistency());
        ASSERT_EQ(elements(a), std::vector<int>(x.begin(), x.end()));
        if (x.size() > 60) {
            a = leda::list<int>();
            x.clear();
        }
    }
}

TEST(List, CurrentItemMayBeDeletedInAWalk) {
    leda::list<int> a;
    for (int i = 0; i < 10; ++i)
        a.append(i);
    for (int x : a)
        if (x % 3 == 0)
            a.del(a.search(x));
    EXPECT_EQ(elements(a), (std::vector<int>{1, 2, 4, 5, 7, 8}));
    EXPECT_EQ(a.search(3), nullptr);
}

TEST(Containers, OwnAndReleaseTheirElements) {
    const std::size_t blocks = leda::std_memory_mgr.live_blocks();
    {
        leda::list<Counted> l;
        leda::stack<leda::list<Counted>> s;
        leda::map<int, Counted> m;
        leda::h_array<int, Counted> h;
        leda::dictionary<int, Counted> d;
        leda::array<Counted> a(-2, 40);
        for (int i = 0; i < 50; ++i) {
            l.append(Counted(i));
            s.push(l);
            m[i].value = i;
            h[i].value = i;
            d.insert(i, Counted(i));
        }
        auto l2 = l;
        auto s2 = s;
        auto m2 = m;
        auto h2 = h;
        auto d2 = d;
        auto a2 = a;
        l.pop();
        s.pop();
        h.del(7);
        d.del(7);
        m.clear_entries();
        a.resize(-2, 3);
        m = m2;
        EXPECT_EQ(l2.size(), 50);
        EXPECT_EQ(s2.top().size(), 50);
        EXPECT_EQ(m[49].value, 49);
        EXPECT_EQ(h2.inf(h2.lookup(7)).value, 7);
        EXPECT_EQ(d2.inf(d2.lookup(7)).value, 7);
    }
    EXPECT_EQ(Counted::live, 0);
    EXPECT_EQ(leda::std_memory_mgr.live_blocks(), blocks);
}

TEST(Array, KeepsTheCommonIndicesWhenResized) {
    leda::array<int> a(5);
    for (int i = 0; i < 5; ++i)
        a[i] = 10 + i;
    a.resize(3);
    EXPECT_EQ(a.size(), 3);
    EXPECT_EQ(a[2], 12);
    a.resize(1, 4);
    EXPECT_EQ(a.low(), 1);
    EXPECT_EQ(a.high(), 4);
    EXPECT_EQ(a[2], 12);
    EXPECT_EQ(a[4], 0) << "a new element is a default value";
    EXPECT_EQ(leda::array<int>(0).size(), 0);
}

// --- errors
// -------------------------------------------------------------------------------------------------------------

struct ReportedError {
    int number;
    std::string text;
};

[[noreturn]] void throwReport(int number, const char* text) {
    throw ReportedError{number, text};
}

struct HandlerInstalled {
    leda::error_handler former = leda::std_error_handler;
    explicit HandlerInstalled(leda::error_handler h) { leda::std_error_handler = h; }
    ~HandlerInstalled() { leda::std_error_handler = former; }
};

TEST(Errors, MisuseIsReportedWithHeaderAndLine) {
    HandlerInstalled installed(&throwReport);
    leda::list<int> l;
    leda::stack<int> s;
    const struct {
        std::function<void()> misuse;
        const char* text;
    } cases[] = {
        {[&] { l.front(); }, "list::front(): empty list (list.h:"},
        {[&] { l.back(); }, "list::back(): empty list (list.h:"},
        {[&] { l.pop(); }, "list::front(): empty list (list.h:"},
        {[&] { l.pop_back(); }, "list::back(): empty list (list.h:"},
        {[&] { s.top(); }, "slist<E>::head: empty list (slist.h:"},
        {[&] { s.pop(); }, "slist: pop on empty list. (slist.h:"},
        {[&] { leda::array<int> a(3, 1); }, "array: bad array bounds [3..1] (array.h:"},
        {[&] { leda::array<int> a(-1); }, "array: bad array bounds [0..-2] (array.h:"},
    };
    for (const auto& c : cases) {
        try {
            c.misuse();
            ADD_FAILURE() << "no report of " << c.text;
        } catch (const ReportedError& e) {
            EXPECT_EQ(e.number, 1);
            EXPECT_EQ(e.text.rfind(c.text, 0), 0u) << e.text;
            EXPECT_GT(std::stoi(e.text.substr(std::string(c.text).size())), 0);
            EXPECT_EQ(e.text.back(), ')');
        }
    }
    leda::std_error_handler = [](int, const char*) {};
    EXPECT_EQ(l.pop(), 0) << "a handler that returns gets a default value";
    EXPECT_EQ(l.size(), 0);
}

TEST(ErrorsDeathTest, DefaultHandlerPrintsAndAborts) {
    EXPECT_DEATH(leda::list<int>().pop(), "list::front\\(\\): empty list");
}

// --- set
// ----------------------------------------------------------------------------------------------------------------

TEST(Set, BehavesAsTheStandardsAtEverySize) {
    std::mt19937 rng(2);
    for (int universe : {3, 5, 30, 70, 400, 20000}) {
        leda::set<int> s;
        std::set<int> model;
        for (int step = 0; step < 8 * universe; ++step) {
            const int x = int(rng() % unsigned(universe));
            const bool growing = step / universe % 2 == 0;
            if (rng() % 4 != 0 ? growing : !growing) {
                s.insert(x);
                model.insert(x);
            } else {
                s.del(x);
                model.erase(x);
            }
            ASSERT_EQ(s.size(), int(model.size()));
            ASSERT_EQ(s.member(x), model.count(x) == 1);
            if (step % 5 == 0 && s.size() < 100) { // also a copy of a set that shrank
                ASSERT_EQ(elements(leda::set<int>(s)), vectorOf(model));
            }
            if (step % (universe / 3) == 0) {
                ASSERT_TRUE(s.check_consistency());
                ASSERT_EQ(elements(s), vectorOf(model));
                leda::set<int> copy(s);
                copy.insert(-1);
                ASSERT_EQ(s.size() + 1, copy.size());
                ASSERT_EQ(*copy.begin(), -1);
            }
        }
        for (; !model.empty(); model.erase(model.begin())) { // a large set that shrinks
            if (model.size() < 100) {
                ASSERT_EQ(elements(leda::set<int>(s)), vectorOf(model));
            }
            s.del(*model.begin());
        }
    }
}

TEST(Set, UnionAndIntersectionMatchTheStandardsForAllPairsOfSizes) {
    std::mt19937 rng(3);
    const int sizes[] = {0, 1, 2, 3, 4, 5, 8, 9, 33, 63, 64, 65, 130, 1000, 5000};
    for (int n : sizes)
        for (int m : sizes)
            for (int universe : {std::max(n, m) + 2, 40000}) {
                leda::set<int> a, b;
                std::set<int> x, y;
                while (int(x.size()) < n) {
                    const int e = int(rng() % unsigned(universe));
                    a.insert(e);
                    x.insert(e);
                }
                while (int(y.size()) < m) {
                    const int e = int(rng() % unsigned(universe));
                    b.insert(e);
                    y.insert(e);
                }
                std::vector<int> both, either;
                std::set_intersection(x.begin(), x.end(), y.begin(), y.end(),
                                      std::back_inserter(both));
                std::set_union(x.begin(), x.end(), y.begin(), y.end(), std::back_inserter(either));
                const leda::set<int> joined = a + b, common = a & b;
                ASSERT_EQ(elements(joined), either) << n << " " << m;
                ASSERT_EQ(elements(common), both) << n << " " << m;
                ASSERT_TRUE(joined.check_consistency() && common.check_consistency());
                ASSERT_EQ(elements(a), vectorOf(x)) << "operands stay";
                a = joined;
                a.add(a);
                a.intersect_with(a);
                ASSERT_EQ(elements(a), either);
            }
}

TEST(Set, ItemsSurviveChangesOfOtherElements) {
    for (int n : {4, 50, 3000}) {
        leda::set<int> s;
        for (int i = n; i > 0; --i)
            s.insert(2 * i);
        EXPECT_EQ(s.key(s.min()), 2);
        leda::set_item it = s.first_item();
        for (int i = 1; i <= n; ++i) {
            ASSERT_TRUE(it != nullptr);
            ASSERT_EQ(s.key(it), 2 * i);
            s.insert(2 * i - 1); // moves the item's element
            s.del(2 * i - 2);
            s.del(2 * i - 3);
            ASSERT_EQ(s.key(it), 2 * i);
            it = s.next_item(it);
        }
        EXPECT_TRUE(it == nullptr);
        EXPECT_EQ(s.size(), 2);
    }
    EXPECT_FALSE(leda::set<int>().min());
}

// --- map, h_array, dictionary
// -------------------------------------------------------------------------------------------

TEST(Map, FindsWhatWasPutInAndNothingElse) {
    std::mt19937 rng(4);
    std::vector<int> keys{0, -1, 1 << 30, -2147483647 - 1, 2147483647};
    for (int i = 0; i < 20000; ++i)
        keys.push_back(i % 3 ? int(rng()) : i << 14); // many with equal low bits
    leda::map<int, int> m(-7);
    std::map<int, int> model;
    EXPECT_FALSE(m.defined(0));
    for (int key : keys) {
        EXPECT_EQ(m[key], model.count(key) ? model[key] : -7);
        m[key] = model[key] = int(rng());
    }
    ASSERT_TRUE(m.check_consistency());
    const leda::map<int, int> copy(m);
    m.clear_entries();
    EXPECT_EQ(m.size(), 0);
    EXPECT_EQ(copy.size(), int(model.size()));
    for (int key : keys) {
        ASSERT_EQ(*copy.lookup(key), model[key]);
        ASSERT_FALSE(m.defined(key));
        ASSERT_EQ(copy.defined(key ^ 1), model.count(key ^ 1) == 1);
    }
}

TEST(Map, TakesNodesOfTwoGraphsAndNull) {
    leda::graph g, h;
    leda::map<leda::node, int> m;
    std::vector<leda::node> nodes{nullptr};
    for (int i = 0; i < 2000; ++i) {
        nodes.push_back(g.new_node());
        nodes.push_back(h.new_node());
    }
    for (std::size_t i = 0; i < nodes.size(); ++i)
        m[nodes[i]] = int(i) + 1;
    for (std::size_t i = 0; i < nodes.size(); ++i)
        ASSERT_EQ(m[nodes[i]], int(i) + 1);
    EXPECT_TRUE(m.check_consistency());
    EXPECT_FALSE(m.defined(g.new_node()));
}

TEST(HArray, WalksInTheOrderOfInsertionAtEverySize) {
    std::mt19937 rng(5);
    for (int universe : {6, 12, 500}) {
        leda::h_array<int, int> h(3);
        std::vector<std::pair<int, int>> model;
        for (int step = 0; step < 20 * universe; ++step) {
            const int key = int(rng() % unsigned(universe)) << 7;
            auto it =
                std::find_if(model.begin(), model.end(), [&](auto& p) { return p.first == key; });
            ASSERT_EQ(h.defined(key), it != model.end());
            if (it != model.end() && rng() % 2) {
                ASSERT_EQ(h.inf(h.lookup(key)), it->second);
                h.del(key);
                model.erase(it);
            } else if (it == model.end()) {
                ASSERT_EQ(h[key], 3);
                h[key] = step;
                model.push_back({key, step});
            }
            ASSERT_TRUE(h.check_consistency());
            std::vector<std::pair<int, int>> walked;
            const leda::h_array<int, int> copy(h);
            for (auto i = copy.first_item(); i; i = copy.next_item(i))
                walked.push_back({copy.key(i), copy.inf(i)});
            ASSERT_EQ(walked, model);
        }
    }
}

TEST(Dictionary, BehavesAsTheStandardsUnderRandomOperations) {
    std::mt19937 rng(6);
    for (int universe : {8, 200, 20000}) {
        leda::dictionary<int, int> d(
            [](const int& a, const int& b) { return b < a ? -1 : a < b; }); // descending
        std::map<int, int, std::greater<int>> model;
        std::map<int, leda::dic_item> items;
        for (int step = 0; step < 6 * universe; ++step) {
            const int key = int(rng() % unsigned(universe));
            if (rng() % 8 < (step / universe % 2 ? 2u : 5u)) {
                leda::dic_item it = d.insert(key, step);
                ASSERT_TRUE(!items.count(key) || items[key] == it) << "an item stays";
                items[key] = it;
                model[key] = step;
            } else if (items.count(key) && step % 2) {
                d.del_item(items[key]);
                items.erase(key);
                model.erase(key);
            } else {
                d.del(key);
                items.erase(key);
                model.erase(key);
            }
            ASSERT_EQ(d.lookup(key), items.count(key) ? items[key] : nullptr);
            if (step % (universe / 2) == 0) {
                ASSERT_TRUE(d.check_consistency());
                leda::dictionary<int, int> copy;
                copy.insert(-1, -1);
                copy = d;
                ASSERT_TRUE(copy.check_consistency());
                std::vector<std::pair<int, int>> walked;
                for (leda::dic_item it = copy.first_item(); it; it = copy.next_item(it))
                    walked.push_back({copy.key(it), copy.inf(it)});
                ASSERT_TRUE(std::equal(
                    walked.begin(), walked.end(), model.begin(), model.end(),
                    [](auto& a, auto& b) { return a.first == b.first && a.second == b.second; }));
            }
        }
    }
}

TEST(Dictionary, ClearsWithoutLookingAtItsKeys) {
    static int calls;
    leda::dictionary<int*, int> d([](int* const& a, int* const& b) {
        ++calls;
        return (*a > *b) - (*a < *b);
    });
    std::vector<int> values{3, 1, 2};
    for (int& x : values)
        d.insert(&x, x);
    calls = 0;
    int sum = 0;
    for (leda::dic_item it = d.first_item(); it; it = d.next_item(it))
        sum = 10 * sum + d.inf(it);
    d.clear();
    EXPECT_EQ(sum, 123);
    EXPECT_EQ(calls, 0);
}

TEST(MemoryManager, GivesChunksBackOnlyWhenNothingLives) {
    leda::memory_manager manager;
    std::vector<std::pair<void*, std::size_t>> blocks;
    std::mt19937 rng(8);
    for (int i = 0; i < 5000; ++i) {
        const std::size_t bytes = 1 + rng() % 1500;
        void* block = manager.allocate(bytes);
        ASSERT_EQ(reinterpret_cast<std::uintptr_t>(block) % 8, 0u);
        std::memset(block, i % 251, bytes);
        blocks.push_back({block, bytes});
    }
    for (std::size_t i = 0; i < blocks.size(); ++i) {
        const auto* bytes = static_cast<const unsigned char*>(blocks[i].first);
        ASSERT_TRUE(std::all_of(bytes, bytes + blocks[i].second,
                                [&](unsigned char b) { return b == i % 251; }));
    }
    EXPECT_EQ(manager.live_blocks(), 5000u);
    EXPECT_FALSE(manager.release_chunks());
    for (auto& block : blocks)
        manager.deallocate(block.first, block.second);
    EXPECT_EQ(manager.live_blocks(), 0u);
    EXPECT_TRUE(manager.release_chunks());
    EXPECT_EQ(manager.chunk_bytes(), 0u);
}

} // namespace
