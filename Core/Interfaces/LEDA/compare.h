#ifndef LEDA_COMPARE_H
#define LEDA_COMPARE_H

#include <cstddef>
#include <cstdint>
#include <type_traits>

namespace leda {

// Comparisons of the layer's ordered containers: negative, 0 or positive, as strcmp.
//
// An element type brings its order as an overload of compare, in namespace leda or in the namespace
// of its class. Such overloads are declared after the containers, so the containers call compare
// with arguments wrapped in key_ref: the lookup by argument types then takes place where a
// container's operation is instantiated, and looks in namespace leda (for key_ref) as well as in
// the namespace of the element's class. A comparison for pointers to a base class serves for
// pointers to its derived classes. There is no general comparison of pointers to fall back to: an
// order of addresses would change from run to run.
inline int compare(const int& a, const int& b) {
    return (a > b) - (a < b);
}
inline int compare(const unsigned int& a, const unsigned int& b) {
    return (a > b) - (a < b);
}
inline int compare(const double& a, const double& b) {
    return (a > b) - (a < b);
}
// A template, so that no pointer turns into a bool and finds an order in it.
template <class T, std::enable_if_t<std::is_same_v<T, bool>, int> = 0>
int compare(const T& a, const T& b) {
    return int(a) - int(b);
}

// An argument that draws the lookup into namespace leda and turns into the element it stands for.
template <class T>
struct key_ref {
    // The element, which must outlive this reference to it.
    const T& value;
    operator const T&() const { return value; }
};

namespace order_detail {

// 0 or 1 as a number that the compiler does not turn into a branch: in a merge the outcome of a
// comparison is too random for one to be predicted.
inline std::size_t number(bool condition) {
    std::size_t result = condition;
#if defined(__GNUC__)
    __asm__("" : "+r"(result));
#endif
    return result;
}

template <class T>
struct no_comparison : std::false_type {};

template <class T>
auto call(const T& a, const T& b, int) -> decltype(compare(key_ref<T>{a}, key_ref<T>{b})) {
    return compare(key_ref<T>{a}, key_ref<T>{b});
}

template <class T>
int call(const T&, const T&, long) {
    static_assert(no_comparison<T>::value, "this element type has no comparison: declare int "
                                           "compare(const T&, const T&) in namespace leda or in "
                                           "the namespace of its class");
    return 0;
}

} // namespace order_detail

// The number that stands for an element in its order, for element types whose comparison is one of
// numbers: of(a) < of(b) exactly if compare(a, b) < 0. A specialisation sets known and gives of;
// it goes in front of the first use of a container with that element type. Containers then read
// each element's number once instead of comparing pairs, which makes merging several times faster.
// Types without it, and pointers to derived classes, are compared pair by pair.
// LEDA_ORDER_NUMBERS says that there is such a thing, for code that also runs on other layers.
#define LEDA_ORDER_NUMBERS 1
template <class T>
struct order_number {
    // Whether elements have numbers, and the number of one.
    static constexpr bool known = std::is_integral_v<T> && sizeof(T) <= 4;
    static std::int64_t of(const T& x) { return static_cast<std::int64_t>(x); }
};

// The order of an element type: what the containers use unless they were given a function.
template <class T>
int key_order(const T& a, const T& b) {
    if constexpr (std::is_arithmetic_v<T>)
        return (a > b) - (a < b);
    else
        return order_detail::call<T>(a, b, 0);
}

} // namespace leda

#endif
