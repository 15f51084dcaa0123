#ifndef LEDA_TUPLE_H
#define LEDA_TUPLE_H

namespace leda {

// A pair of values.
template <class A, class B>
class two_tuple {
public:
    // Both parts get their default value.
    two_tuple() : m_first(), m_second() {}
    two_tuple(const A& a, const B& b) : m_first(a), m_second(b) {}
    const A& first() const { return m_first; }
    A& first() { return m_first; }
    const B& second() const { return m_second; }
    B& second() { return m_second; }

private:
    A m_first;
    B m_second;
};

} // namespace leda

#endif
