// The library through one set of names in both precisions, for templates over the record.
#pragma once

#include "../../src/record_view.hpp"

namespace wavkit::one_name {

/// The double counterpart of a type of the single-precision interface.
template <class T>
struct AsDouble {
    using type = T;
};
template <>
struct AsDouble<float> {
    using type = double;
};
template <>
struct AsDouble<dspf> {
    using type = dsp;
};
template <class T>
struct AsDouble<const T> {
    using type = const typename AsDouble<T>::type;
};
template <class T>
struct AsDouble<T*> {
    using type = typename AsDouble<T>::type*;
};
template <class Result, class... Args>
struct AsDouble<Result(Args...)> {
    using type = Result(typename AsDouble<Args>::type...);
};

/// A function of the library in both precisions, called or passed on as the record at hand asks.
template <class Double, class Single>
struct Twins;
template <class... D, class... S>
struct Twins<int(D...), int(S...)> {
    const char* name;
    int (*of_double)(D...);
    int (*of_single)(S...);

    int operator()(D... arguments) const { return of_double(arguments...); }
    int operator()(S... arguments) const { return of_single(arguments...); }
    constexpr operator decltype(of_double)() const { return of_double; }
    constexpr operator decltype(of_single)() const { return of_single; }
};
template <class Single>
Twins(const char*, typename AsDouble<Single>::type*, Single*)
    -> Twins<typename AsDouble<Single>::type, Single>;

// Objects, each by the name of its double twin, for all that the public headers declare: made at
// build time.
#include "support/twins.hpp"

template <Record R>
int free_internal() {
    return std::same_as<R, dsp> ? dsp_free_internal() : dspf_free_internal();
}

template <Record R>
int seed_random(std::uint64_t seed) {
    return std::same_as<R, dsp> ? dspc_seed(seed) : dspfc_seed(seed);
}

}  // namespace wavkit::one_name
