#ifndef SECOND_LEDA_H
#define SECOND_LEDA_H

// The graph and container layer once more, in the plainest way the standard library allows: what
// the optimiser asks of the layer, and nothing that it could rely on by accident. Costs are no
// matter here.

#include <cstdlib>
#include <deque>
#include <functional>
#include <list>
#include <map>
#include <memory>
#include <set>
#include <type_traits>
#include <utility>
#include <vector>

namespace leda {

struct avl_tree {};
struct ab_tree {};

using error_handler = void (*)(int, const char*);
inline error_handler std_error_handler = nullptr;

// ---- order of elements ----

struct node_struct;
struct edge_struct;
using node = node_struct*;
using edge = edge_struct*;
inline int compare(const node& a, const node& b);
inline int compare(const edge& a, const edge& b);

template <class T>
struct element {
    const T& value;
    operator const T&() const { return value; }
};

template <class T>
int order_of(const T& a, const T& b) {
    if constexpr (std::is_arithmetic_v<T>)
        return (a > b) - (a < b);
    else
        return compare(element<T>{a}, element<T>{b});
}

template <class T>
struct is_before {
    int (*order)(const T&, const T&) = &order_of<T>;
    bool operator()(const T& a, const T& b) const { return order(a, b) < 0; }
};

// ---- lists ----

template <class T>
struct list_cell {
    T value;
    list_cell* next = nullptr;
    list_cell* previous = nullptr;
};

template <class T>
class list {
public:
    using item = list_cell<T>*;
    class iterator {
    public:
        explicit iterator(item at) : m_at(at), m_next(at ? at->next : nullptr) {}
        T& operator*() const { return m_at->value; }
        iterator& operator++() { return *this = iterator(m_next); }
        bool operator!=(const iterator& other) const { return m_at != other.m_at; }
        bool operator==(const iterator& other) const { return m_at == other.m_at; }

    private:
        item m_at;
        item m_next;
    };

    list() = default;
    list(const list& other) { copy(other); }
    list(list&& other) noexcept { conc(other); }
    list& operator=(const list& other) {
        if (this != &other) {
            clear();
            copy(other);
        }
        return *this;
    }
    list& operator=(list&& other) noexcept {
        if (this != &other) {
            clear();
            conc(other);
        }
        return *this;
    }
    ~list() { clear(); }

    item append(const T& x) { return link(new list_cell<T>{x}, nullptr); }
    item push_back(const T& x) { return append(x); }
    item push(const T& x) { return link(new list_cell<T>{x}, m_first); }
    T pop() { return del(m_first); }
    T pop_back() { return del(m_last); }
    const T& front() const { return m_first->value; }
    T& front() { return m_first->value; }
    const T& back() const { return m_last->value; }
    T& back() { return m_last->value; }
    const T& head() const { return front(); }
    const T& tail() const { return back(); }
    item first() const { return m_first; }
    item last() const { return m_last; }
    item first_item() const { return m_first; }
    item last_item() const { return m_last; }
    item next_item(item at) const { return at ? at->next : nullptr; }
    item succ(item at) const { return next_item(at); }
    item pred(item at) const { return at ? at->previous : nullptr; }
    item stop_item() const { return nullptr; }
    const T& contents(item at) const { return at->value; }
    const T& inf(item at) const { return at->value; }
    T& operator[](item at) { return at->value; }
    const T& operator[](item at) const { return at->value; }
    int size() const { return m_size; }
    int length() const { return m_size; }
    bool empty() const { return m_size == 0; }
    void clear() {
        while (m_first)
            del(m_first);
    }
    T del(item at) {
        (at->previous ? at->previous->next : m_first) = at->next;
        (at->next ? at->next->previous : m_last) = at->previous;
        --m_size;
        T x = at->value;
        delete at;
        return x;
    }
    T del_item(item at) { return del(at); }
    void conc(list& other) noexcept {
        if (!other.m_first)
            return;
        (m_last ? m_last->next : m_first) = other.m_first;
        other.m_first->previous = m_last;
        m_last = other.m_last;
        m_size += other.m_size;
        other.m_first = other.m_last = nullptr;
        other.m_size = 0;
    }
    void split(item at, list& before, list& behind) {
        list first, second;
        bool is_behind = false;
        for (item each = m_first; each; each = each->next) {
            is_behind = is_behind || each == at;
            (is_behind ? second : first).append(each->value);
        }
        clear();
        before = first;
        behind = second;
    }
    item search(const T& x) const {
        for (item each = m_first; each; each = each->next)
            if (each->value == x)
                return each;
        return nullptr;
    }
    void sort(int (*order)(const T&, const T&)) {
        std::list<T> values;
        for (const T& each : *this)
            values.push_back(each);
        values.sort(is_before<T>{order});
        clear();
        for (const T& each : values)
            append(each);
    }
    iterator begin() const { return iterator(m_first); }
    iterator end() const { return iterator(nullptr); }

private:
    item link(item fresh, item behind) {
        fresh->next = behind;
        fresh->previous = behind ? behind->previous : m_last;
        (fresh->previous ? fresh->previous->next : m_first) = fresh;
        (behind ? behind->previous : m_last) = fresh;
        ++m_size;
        return fresh;
    }
    void copy(const list& other) {
        for (item each = other.m_first; each; each = each->next)
            append(each->value);
    }

    item m_first = nullptr;
    item m_last = nullptr;
    int m_size = 0;
};

template <class T>
using slist = list<T>;

template <class T>
class stack {
public:
    void push(const T& x) { m_values.push_back(x); }
    T pop() {
        T x = m_values.back();
        m_values.pop_back();
        return x;
    }
    T& top() { return m_values.back(); }
    const T& top() const { return m_values.back(); }
    bool empty() const { return m_values.empty(); }
    int size() const { return int(m_values.size()); }
    void clear() { m_values.clear(); }

private:
    std::deque<T> m_values;
};

template <class A, class B>
class two_tuple {
public:
    two_tuple() : m_first(), m_second() {}
    two_tuple(const A& a, const B& b) : m_first(a), m_second(b) {}
    A& first() { return m_first; }
    B& second() { return m_second; }
    const A& first() const { return m_first; }
    const B& second() const { return m_second; }

private:
    A m_first;
    B m_second;
};

template <class T>
class array {
public:
    array() = default;
    explicit array(int n) { resize(n); }
    array(int a, int b) { resize(a, b); }
    T& operator[](int i) { return m_values[std::size_t(i - m_low)]; }
    const T& operator[](int i) const { return m_values[std::size_t(i - m_low)]; }
    int size() const { return int(m_values.size()); }
    int low() const { return m_low; }
    int high() const { return m_low + size() - 1; }
    void resize(int n) { resize(0, n - 1); }
    void resize(int a, int b) {
        array former;
        std::swap(former.m_values, m_values);
        former.m_low = m_low;
        m_low = a;
        m_values.resize(std::size_t(b - a + 1));
        for (int i = a; i <= b; ++i)
            if (i >= former.low() && i <= former.high())
                (*this)[i] = former[i];
    }

private:
    std::deque<T> m_values; // a deque of bool holds real ones
    int m_low = 0;
};

// ---- sets, maps and dictionaries ----

// A place in a container of the standard library, or none.
template <class Iterator>
class place {
public:
    place(std::nullptr_t = nullptr) {}
    explicit place(Iterator at) : m_at(at), m_is_there(true) {}
    explicit operator bool() const { return m_is_there; }
    bool operator==(std::nullptr_t) const { return !m_is_there; }
    bool operator!=(std::nullptr_t) const { return m_is_there; }
    bool operator==(const place& other) const {
        return m_is_there == other.m_is_there && (!m_is_there || m_at == other.m_at);
    }
    bool operator!=(const place& other) const { return !(*this == other); }
    Iterator at() const { return m_at; }

private:
    Iterator m_at{};
    bool m_is_there = false;
};

template <class T, class Implementation = avl_tree>
class set {
    using values = std::set<T, is_before<T>>;

public:
    using item = place<typename values::const_iterator>;
    void insert(const T& x) { m_values.insert(x); }
    void del(const T& x) { m_values.erase(x); }
    bool member(const T& x) const { return m_values.count(x) != 0; }
    int size() const { return int(m_values.size()); }
    bool empty() const { return m_values.empty(); }
    void clear() { m_values.clear(); }
    void add(const set& other) { m_values.insert(other.m_values.begin(), other.m_values.end()); }
    void intersect_with(const set& other) {
        for (auto each = m_values.begin(); each != m_values.end();)
            each = other.member(*each) ? std::next(each) : m_values.erase(each);
    }
    set operator+(const set& other) const {
        set result = *this;
        result.add(other);
        return result;
    }
    set operator&(const set& other) const {
        set result = *this;
        result.intersect_with(other);
        return result;
    }
    item first_item() const { return at(m_values.begin()); }
    item next_item(item it) const { return at(std::next(it.at())); }
    item min() const { return first_item(); }
    const T& key(item it) const { return *it.at(); }
    typename values::const_iterator begin() const { return m_values.begin(); }
    typename values::const_iterator end() const { return m_values.end(); }

private:
    item at(typename values::const_iterator it) const {
        return it == m_values.end() ? item() : item(it);
    }
    values m_values;
};

// Kept as a list in the order of insertion with an index; a map has no order to be walked in.
template <class K, class V>
class h_array {
    struct entry {
        K key;
        V value;
    };
    using entries = std::list<entry>;

public:
    using item = place<typename entries::iterator>;
    h_array() : m_default() {}
    explicit h_array(const V& x) : m_default(x) {}
    h_array(const h_array& other) : m_default(other.m_default) { copy(other); }
    h_array& operator=(const h_array& other) {
        if (this != &other) {
            clear();
            m_default = other.m_default;
            copy(other);
        }
        return *this;
    }
    V& operator[](const K& k) {
        const item it = lookup(k);
        return it ? it.at()->value : fast_insert(k, m_default).at()->value;
    }
    item lookup(const K& k) const {
        const auto found = m_index.find(k);
        return found == m_index.end() ? item() : item(found->second);
    }
    item fast_insert(const K& k, const V& v) {
        m_entries.push_back({k, v});
        return item(m_index[k] = std::prev(m_entries.end()));
    }
    void del(const K& k) {
        if (const item it = lookup(k)) {
            m_entries.erase(it.at());
            m_index.erase(k);
        }
    }
    bool defined(const K& k) const { return m_index.count(k) != 0; }
    const K& key(item it) const { return it.at()->key; }
    V& inf(item it) { return it.at()->value; }
    const V& inf(item it) const { return it.at()->value; }
    int size() const { return int(m_entries.size()); }
    bool empty() const { return m_entries.empty(); }
    void clear() {
        m_entries.clear();
        m_index.clear();
    }
    item first_item() const { return at(m_entries.begin()); }
    item next_item(item it) const { return at(std::next(it.at())); }

private:
    void copy(const h_array& other) {
        for (const entry& each : other.m_entries)
            fast_insert(each.key, each.value);
    }
    item at(typename entries::iterator it) const {
        return it == m_entries.end() ? item() : item(it);
    }
    mutable entries m_entries;
    std::map<K, typename entries::iterator> m_index;
    V m_default;
};

template <class K, class V>
class map {
public:
    map() : m_default() {}
    explicit map(const V& x) : m_default(x) {}
    V& operator[](const K& k) { return m_values.emplace(k, m_default).first->second; }
    const V* lookup(const K& k) const {
        const auto found = m_values.find(k);
        return found == m_values.end() ? nullptr : &found->second;
    }
    V* lookup(const K& k) {
        const auto found = m_values.find(k);
        return found == m_values.end() ? nullptr : &found->second;
    }
    bool defined(const K& k) const { return m_values.count(k) != 0; }
    int size() const { return int(m_values.size()); }
    void clear() { m_values.clear(); }
    void clear_entries() { m_values.clear(); }

private:
    std::map<K, V> m_values;
    V m_default;
};

template <class K, class V, class Implementation = ab_tree>
class dictionary {
    using values = std::map<K, V, is_before<K>>;

public:
    using item = place<typename values::iterator>;
    dictionary() = default;
    explicit dictionary(int (*order)(const K&, const K&)) : m_values(is_before<K>{order}) {}
    item lookup(const K& k) const { return at(m_values.find(k)); }
    const K& key(item it) const { return it.at()->first; }
    const V& inf(item it) const { return it.at()->second; }
    V& inf(item it) { return it.at()->second; }
    item insert(const K& k, const V& v) {
        return item(m_values.insert_or_assign(k, v).first);
    }
    void del(const K& k) { m_values.erase(k); }
    void del_item(item it) { m_values.erase(it.at()); }
    int size() const { return int(m_values.size()); }
    bool empty() const { return m_values.empty(); }
    void clear() { m_values.clear(); }
    item first_item() const { return at(m_values.begin()); }
    item next_item(item it) const { return at(std::next(it.at())); }

private:
    item at(typename values::iterator it) const { return it == m_values.end() ? item() : item(it); }
    mutable values m_values;
};

// ---- graphs ----

// Adjacency is a list of handles; a neighbour in it is looked for each time.
using adjacency = std::vector<edge>;
inline edge neighbour(const adjacency& edges, const edge_struct* e, int step) {
    for (int i = 0; i < int(edges.size()); ++i)
        if (edges[std::size_t(i)] == e)
            return i + step >= 0 && i + step < int(edges.size()) ? edges[std::size_t(i + step)]
                                                                 : nullptr;
    return nullptr;
}

struct node_struct {
    edge first_out_edge() const { return out.empty() ? nullptr : out.front(); }
    edge stop_out_edge() const { return nullptr; }
    edge first_out_edge_rev() const { return out.empty() ? nullptr : out.back(); }
    edge stop_out_edge_rev() const { return nullptr; }
    edge first_in_edge() const { return in.empty() ? nullptr : in.front(); }
    edge stop_in_edge() const { return nullptr; }

    int number = 0; // in its graph
    int serial = 0; // of all nodes of the process
    adjacency out, in;
    void* record[1] = {};
};

struct edge_struct {
    edge next_out_edge() const { return neighbour(ends[0]->out, this, 1); }
    edge pred_out_edge() const { return neighbour(ends[0]->out, this, -1); }
    edge next_in_edge() const { return neighbour(ends[1]->in, this, 1); }
    node terminal(int i) const { return ends[i]; }

    int number = 0;
    int serial = 0;
    node ends[2] = {};
    void* record[1] = {};
};

template <class Handle>
int order_of_handles(Handle a, Handle b) {
    if (!a || !b)
        return (a != nullptr) - (b != nullptr);
    return a->number != b->number ? (a->number > b->number) - (a->number < b->number)
                                  : (a->serial > b->serial) - (a->serial < b->serial);
}
inline int compare(const node& a, const node& b) { return order_of_handles(a, b); }
inline int compare(const edge& a, const edge& b) { return order_of_handles(a, b); }

class graph {
public:
    graph() = default;
    graph(int, int) {}
    graph(const graph& other) { copy(other); }
    graph& operator=(const graph& other) {
        if (this != &other) {
            forget();
            copy(other);
        }
        return *this;
    }
    virtual ~graph() = default;
    virtual void clear() { forget(); }

    node first_node() const { return m_nodes.first() ? m_nodes.front() : nullptr; }
    node next_node(node v) const { return next_of(m_nodes, v); }
    node stop_node() const { return nullptr; }
    edge first_edge() const { return m_edges.first() ? m_edges.front() : nullptr; }
    edge next_edge(edge e) const { return next_of(m_edges, e); }
    edge stop_edge() const { return nullptr; }
    const list<node>& all_nodes() const { return m_nodes; }
    const list<edge>& all_edges() const { return m_edges; }
    edge first_adj_edge(node v) const { return v->first_out_edge(); }
    edge adj_succ(edge e) const { return e->next_out_edge(); }
    edge first_in_edge(node v) const { return v->first_in_edge(); }
    edge in_succ(edge e) const { return e->next_in_edge(); }
    list<edge> in_edges(node v) const { return as_list(v->in); }
    list<edge> out_edges(node v) const { return as_list(v->out); }
    int indeg(node v) const { return int(v->in.size()); }
    int outdeg(node v) const { return int(v->out.size()); }
    node source(edge e) const { return e->ends[0]; }
    node target(edge e) const { return e->ends[1]; }
    int index(node v) const { return v->number; }
    int index(edge e) const { return e->number; }
    int max_node_index() const { return m_next_node - 1; }
    int max_edge_index() const { return m_next_edge - 1; }
    int number_of_nodes() const { return m_nodes.size(); }
    int number_of_edges() const { return m_edges.size(); }

    node new_node() {
        m_all_nodes.push_back(std::make_unique<node_struct>());
        const node v = m_all_nodes.back().get();
        v->number = m_next_node++;
        v->serial = next_serial();
        m_nodes.append(v);
        return v;
    }
    edge new_edge(node v, node w) {
        m_all_edges.push_back(std::make_unique<edge_struct>());
        const edge e = m_all_edges.back().get();
        e->number = m_next_edge++;
        e->serial = next_serial();
        e->ends[0] = v;
        e->ends[1] = w;
        v->out.push_back(e);
        w->in.push_back(e);
        m_edges.append(e);
        return e;
    }
    void del_node(node v) {
        while (!v->out.empty())
            del_edge(v->out.front());
        while (!v->in.empty())
            del_edge(v->in.front());
        m_nodes.del(m_nodes.search(v));
    }
    void del_edge(edge e) {
        take_out(e->ends[0]->out, e);
        take_out(e->ends[1]->in, e);
        m_edges.del(m_edges.search(e));
    }
    void move_edge(edge e, node v, node w) {
        if (e->ends[0] != v) {
            take_out(e->ends[0]->out, e);
            v->out.push_back(e);
            e->ends[0] = v;
        }
        if (e->ends[1] != w) {
            take_out(e->ends[1]->in, e);
            w->in.push_back(e);
            e->ends[1] = w;
        }
    }

private:
    static int next_serial() {
        static int s_serial = 0;
        return ++s_serial;
    }
    template <class Handle>
    static Handle next_of(const list<Handle>& handles, Handle x) {
        const auto at = x ? handles.search(x) : nullptr;
        return at && at->next ? at->next->value : nullptr;
    }
    static list<edge> as_list(const adjacency& edges) {
        list<edge> result;
        for (edge e : edges)
            result.append(e);
        return result;
    }
    static void take_out(adjacency& edges, edge e) {
        for (auto at = edges.begin(); at != edges.end(); ++at)
            if (*at == e) {
                edges.erase(at);
                return;
            }
    }
    void forget() {
        m_nodes.clear();
        m_edges.clear();
        m_all_nodes.clear();
        m_all_edges.clear();
        m_next_node = m_next_edge = 0;
    }
    void copy(const graph& other) {
        std::map<node, node> copies;
        std::map<edge, edge> edges;
        for (node v : other.m_nodes) {
            copies[v] = new_node();
            copies[v]->record[0] = v->record[0];
        }
        for (edge e : other.m_edges) {
            edges[e] = new_edge(copies[e->ends[0]], copies[e->ends[1]]);
            edges[e]->record[0] = e->record[0];
        }
        // The order of the adjacency is that of the original, whatever moved there.
        for (node v : other.m_nodes) {
            for (std::size_t i = 0; i < v->out.size(); ++i)
                copies[v]->out[i] = edges[v->out[i]];
            for (std::size_t i = 0; i < v->in.size(); ++i)
                copies[v]->in[i] = edges[v->in[i]];
        }
    }

    list<node> m_nodes;
    list<edge> m_edges;
    // Deleted ones stay until clear: a stale handle answers.
    std::vector<std::unique_ptr<node_struct>> m_all_nodes;
    std::vector<std::unique_ptr<edge_struct>> m_all_edges;
    int m_next_node = 0;
    int m_next_edge = 0;
};

template <class N, class E>
class GRAPH : public graph {
public:
    GRAPH() = default;
    GRAPH(int n, int m) : graph(n, m) {}
    const N& inf(node v) const { return of<N>(v->record); }
    const E& inf(edge e) const { return of<E>(e->record); }
    N& operator[](node v) { return of<N>(v->record); }
    E& operator[](edge e) { return of<E>(e->record); }
    const N& operator[](node v) const { return of<N>(v->record); }
    const E& operator[](edge e) const { return of<E>(e->record); }
    void assign(node v, const N& x) { of<N>(v->record) = x; }
    void assign(edge e, const E& x) { of<E>(e->record) = x; }
    node new_node() { return new_node(N()); }
    node new_node(const N& x) {
        const node v = graph::new_node();
        ::new (static_cast<void*>(v->record)) N(x);
        return v;
    }
    edge new_edge(node v, node w) { return new_edge(v, w, E()); }
    edge new_edge(node v, node w, const E& x) {
        const edge e = graph::new_edge(v, w);
        ::new (static_cast<void*>(e->record)) E(x);
        return e;
    }

private:
    template <class T>
    static T& of(void* (&record)[1]) {
        static_assert(sizeof(T) <= sizeof(record), "records are pointers");
        return *std::launder(reinterpret_cast<T*>(record));
    }
};

// A number for each node of the graph as it was when the array was made.
template <class T>
class node_array {
public:
    node_array() = default;
    explicit node_array(const graph& g) { init(g); }
    node_array(const graph& g, const T& x) { init(g, x); }
    void init(const graph& g) { init(g, T()); }
    void init(const graph& g, const T& x) {
        m_values.assign(std::size_t(g.max_node_index() + 1), x);
    }
    T& operator[](node v) { return m_values[std::size_t(v->number)]; }
    const T& operator[](node v) const { return m_values[std::size_t(v->number)]; }

private:
    std::deque<T> m_values;
};

} // namespace leda


#include "LEDA/graph_alg.h"

#endif
