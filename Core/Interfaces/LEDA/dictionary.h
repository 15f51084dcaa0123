#ifndef LEDA_DICTIONARY_H
#define LEDA_DICTIONARY_H

#include "LEDA/allocator.h"
#include "LEDA/compare.h"
#include "LEDA/sorted_chunks.h"

#include <cstddef>
#include <type_traits>
#include <utility>

namespace leda {

struct ab_tree {}; // names the usual implementation of a dictionary; the layer has one only

// Position of an entry in a dictionary: stays valid while the entry stays; null behind the end.
struct ab_tree_node {
    // The neighbours in ascending order of keys; null at the ends.
    ab_tree_node* succ = nullptr; // in ascending key order
    ab_tree_node* pred = nullptr;
};
// The form in which operations take and answer a position.
using dic_item = ab_tree_node*;

// Sorted dictionary from keys to informations, in the order of a given function or of the key
// type's own comparison (LEDA/compare.h).
//
// The entries are blocks of the layer's pools, linked in ascending order; sorted chunks over them,
// with copies of small keys, find one in O(log n). Inserting behind the greatest key is O(1): keys
// mostly come that way. The walk is linear, may delete the item it stands on once the next was
// fetched, and needs no comparison; neither does clear, so that keys which point to objects already
// destroyed do no harm there.
template <class K, class V, class Impl = ab_tree>
class dictionary {
    struct entry : ab_tree_node {
        entry(const K& k, const V& v) : key(k), value(v) {}
        K key;
        V value;
    };
    // What the chunks hold: a small key is copied beside its entry, so that a search does not touch
    // the entries.
    struct near_key {
        K copy;
        entry* target;
        const K& key() const { return copy; }
    };
    struct far_key {
        entry* target;
        const K& key() const { return target->key; }
    };
    static constexpr bool is_small = std::is_trivially_copyable_v<K> && sizeof(K) <= 8;
    using slot = std::conditional_t<is_small, near_key, far_key>;
    using chunks = sorted_chunks<slot>;
    using position = typename chunks::position;

public:
    // An order of keys: negative, 0 or positive, as strcmp.
    using comparison = int (*)(const K&, const K&);

    // Empty, in the order of the key type or in the given one.
    dictionary() : m_order(&key_order<K>) {}
    explicit dictionary(comparison cmp) : m_order(cmp) {}
    // A copy has entries of its own and the same order. Linear.
    dictionary(const dictionary& other) : m_order(other.m_order) { append_all(other); }
    dictionary& operator=(const dictionary& other);
    ~dictionary() { clear(); }

    // The item of the key or null.
    dic_item lookup(const K& key) const;
    // Key and information of an item, which must not be null.
    const K& key(dic_item it) const { return static_cast<entry*>(it)->key; }
    const V& inf(dic_item it) const { return static_cast<entry*>(it)->value; }
    V& inf(dic_item it) { return static_cast<entry*>(it)->value; }

    // Makes an entry; of a key that is present the information is replaced and the key kept.
    dic_item insert(const K& key, const V& value);
    // Removes the entry of the key, if there is one.
    void del(const K& key);
    void del_item(dic_item it) { del(key(it)); }

    // Number of entries.
    int size() const { return m_index.size(); }
    bool empty() const { return m_index.size() == 0; }
    // Removes all entries; every item is stale afterwards.
    void clear();
    // Items in ascending order of keys; null at the end.
    dic_item first_item() const { return m_first; }
    dic_item next_item(dic_item it) const { return it ? it->succ : nullptr; }

    // True if keys ascend strictly, and the links of both directions agree with the index. Linear.
    bool check_consistency() const;

private:
    bool find(const K& key, position& p) const;
    static slot slot_for(entry* e);
    void append_all(const dictionary& other);
    void link_behind(ab_tree_node* before, ab_tree_node* it);

    comparison m_order;
    chunks m_index;
    ab_tree_node* m_first = nullptr;
    ab_tree_node* m_last = nullptr;
};

template <class K, class V, class Impl>
dictionary<K, V, Impl>& dictionary<K, V, Impl>::operator=(const dictionary& other) {
    if (this != &other) {
        clear();
        m_order = other.m_order;
        append_all(other);
    }
    return *this;
}

template <class K, class V, class Impl>
dic_item dictionary<K, V, Impl>::lookup(const K& key) const {
    position p;
    return find(key, p) ? m_index.at(p).target : nullptr;
}

template <class K, class V, class Impl>
dic_item dictionary<K, V, Impl>::insert(const K& key, const V& value) {
    position p;
    if (find(key, p)) {
        entry* present = m_index.at(p).target;
        present->value = value;
        return present;
    }
    entry* fresh = pool_new<entry>(key, value);
    link_behind(p.slot ? m_index.at({p.chunk, p.slot - 1}).target : nullptr, fresh);
    m_index.insert(p, slot_for(fresh));
    return fresh;
}

template <class K, class V, class Impl>
void dictionary<K, V, Impl>::del(const K& key) {
    position p;
    if (!find(key, p))
        return;
    entry* gone = m_index.at(p).target;
    m_index.erase(p);
    (gone->pred ? gone->pred->succ : m_first) = gone->succ;
    (gone->succ ? gone->succ->pred : m_last) = gone->pred;
    pool_delete(gone);
}

template <class K, class V, class Impl>
void dictionary<K, V, Impl>::clear() {
    for (ab_tree_node* it = m_first; it;) {
        ab_tree_node* next = it->succ;
        pool_delete(static_cast<entry*>(it));
        it = next;
    }
    m_index.clear();
    m_first = m_last = nullptr;
}

template <class K, class V, class Impl>
bool dictionary<K, V, Impl>::check_consistency() const {
    if (!m_index.check_consistency(
            [this](const slot& a, const slot& b) { return m_order(a.key(), b.key()) < 0; }))
        return false;
    ab_tree_node* before = nullptr;
    position p = m_index.first();
    for (ab_tree_node* it = m_first; it; it = it->succ, p = m_index.next(p)) {
        if (!m_index.valid(p) || m_index.at(p).target != it || it->pred != before)
            return false;
        before = it;
    }
    return !m_index.valid(p) && before == m_last;
}

template <class K, class V, class Impl>
bool dictionary<K, V, Impl>::find(const K& key, position& p) const {
    return m_index.find([this, &key](const slot& s) { return m_order(key, s.key()); }, p);
}

template <class K, class V, class Impl>
typename dictionary<K, V, Impl>::slot dictionary<K, V, Impl>::slot_for(entry* e) {
    if constexpr (is_small)
        return {e->key, e};
    else
        return {e};
}

template <class K, class V, class Impl>
void dictionary<K, V, Impl>::append_all(const dictionary& other) {
    for (ab_tree_node* it = other.m_first; it; it = it->succ) {
        entry* fresh = pool_new<entry>(other.key(it), other.inf(it));
        link_behind(m_last, fresh);
        m_index.append(slot_for(fresh));
    }
}

// Links an entry in behind another, or first if there is none before it.
template <class K, class V, class Impl>
void dictionary<K, V, Impl>::link_behind(ab_tree_node* before, ab_tree_node* it) {
    it->pred = before;
    it->succ = before ? before->succ : m_first;
    (before ? before->succ : m_first) = it;
    (it->succ ? it->succ->pred : m_last) = it;
}

} // namespace leda

#endif
