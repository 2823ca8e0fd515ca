// Rows of a family: a function of the library and peers that do the same to the same samples.
#pragma once

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <deque>
#include <memory>

#include "library.hpp"
#include "race.hpp"

namespace wavkit::bench {

/// Samples that begin with a cache line, zeros at first.
template <class T>
using Samples = std::shared_ptr<T[]>;

template <class T>
Samples<T> samples(std::size_t count) {
    const std::size_t bytes = (count * sizeof(T) + 127) / 64 * 64;
    void* const block = std::aligned_alloc(64, bytes);
    if (!block) std::abort();
    return {static_cast<T*>(std::memset(block, 0, bytes)), std::free};
}

/// A record of the library's own with room for some samples.
template <Record R>
struct Signal : Temporary<R> {
    explicit Signal(std::size_t points = 0, bool complex = false) {
        this->get()->points = int(points);
        this->get()->complex = complex;
        dsp_alloc(this->get());
    }
    void set(const scalar<R>* from, std::size_t points, bool complex) {
        R* const x = this->get();
        x->delta = 1;
        x->points = int(points);
        x->complex = complex;
        std::memcpy(x->data, from, used(x) * sizeof(scalar<R>));
    }
};

/// What a row works on.
struct Input {
    std::function<double(std::size_t)> value;  // of a scalar
    bool complex = false;
    std::size_t points = 0;  // the row's where 0
};
inline Input real(double lo, double hi) {
    return {[=](std::size_t) { return uniform(lo, hi); }};
}
inline Input complex(double lo, double hi) {
    return {[=](std::size_t) { return uniform(lo, hi); }, true};
}

/// What a peer works on: from `a` and `b` to `y`. Where the library works in place a peer does so
/// in `a`, or goes from `a` to `y` where the samples become of another kind.
template <class T>
struct Operands {
    T *a, *b, *y;
    std::size_t n;  // points of the row
};

template <class T>
struct Peer {
    std::string name;
    std::function<void(Operands<T>)> run;
};

template <class T>
struct Extra {
    std::function<Values(const T*, std::size_t)> digest = {};  // what of a result is compared
    double tolerance = sizeof(T) == 8 ? 1e-9 : 2e-3;
    std::function<void()> before = {};  // every call of the library's, in time that does not count
    long warm = 0;                      // calls before results are compared
};

/// The rows of a family in one precision at one number of points.
template <Record R>
struct Family {
    using T = scalar<R>;
    using Peers = std::vector<Peer<T>>;

    std::string name;
    std::size_t n;

    bool wants(const std::string& line) const { return wanted(name, line + ", double, single"); }

    template <class Ours>
    void row(const std::string& what, const Input& a, const Ours& ours, const Peers& peers,
             const Extra<T>& extra = {}) const {
        row(what, a, Input{}, ours, peers, extra);
    }

    /// `ours` takes a record that it works on in place, or an input and an output, or two inputs
    /// and an output.
    template <class Ours>
    void row(const std::string& what, const Input& in_a, const Input& in_b, const Ours& ours,
             const Peers& peers, const Extra<T>& extra = {}) const {
        const std::string line = what + (sizeof(T) == 8 ? ", double" : ", single");
        if (!wanted(name, line)) return;
        constexpr bool in_place = std::is_invocable_v<Ours, R*>;
        const Source a(in_a, n), b(in_b, n);
        // Short signals are worked on in turn, as many as the first-level cache holds.
        const std::size_t copies =
            in_place && !extra.before ? 1 + 16000 / (a.count * sizeof(T)) : 1;
        const auto x = std::make_shared<std::deque<Signal<R>>>();
        while (x->size() < copies) x->emplace_back(a.points, true);
        const auto second = std::make_shared<Signal<R>>(b.points, b.complex);
        second->set(b.data.get(), b.points, b.complex);
        const auto out = std::make_shared<Signal<R>>();
        const auto failed = std::make_shared<int>();
        const auto reset = [=, before = extra.before] {
            if (before) before();
            for (auto& copy : *x) copy.set(a.data.get(), a.points, a.complex);
        };
        const auto run = [=](long count) {
            for (long i = 0; i < count; ++i) {
                if constexpr (in_place) {
                    *failed |= ours((*x)[std::size_t(i)].get());
                } else if constexpr (std::is_invocable_v<Ours, R*, R*>) {
                    *failed |= ours((*x)[0].get(), out->get());
                } else {
                    *failed |= ours((*x)[0].get(), second->get(), out->get());
                }
            }
        };
        R* const result = in_place ? (*x)[0].get() : out->get();
        const auto digest = [given = extra.digest](const T* data, std::size_t count) {
            return given ? given(data, count) : Values(data, data + count);
        };
        Race all{name,         line,      std::to_string(n), double(n), {}, {}, extra.tolerance,
                 long(copies), extra.warm};
        const auto prepare = [&](auto f) { return in_place ? std::function<void()>(f) : nullptr; };
        all.ours = {"", prepare(reset), run,
                    [=] { return *failed ? Values{} : digest(result->data, used(result)); }};
        // The first result shows how many scalars there are and so whether peers go to `y`.
        use(0);
        reset();
        run(long(copies));
        const std::size_t count = used(result), step = (count + 127) / 64 * 64;
        const bool moves = !in_place || count != a.count;
        const auto work = samples<T>(a.stride * copies + 64), y = samples<T>(step * copies);
        const auto restore = [=] {
            for (std::size_t i = 0; i < copies; ++i) {
                std::memcpy(work.get() + i * a.stride, a.data.get(), a.stride * sizeof(T));
            }
        };
        restore();
        for (const auto& peer : peers) {
            const auto go = [=, points = n, f = peer.run](long times) {
                for (long i = 0; i < times; ++i) {
                    const std::size_t at = in_place ? std::size_t(i) : 0;
                    f({work.get() + at * a.stride, b.data.get(), y.get() + at * step, points});
                }
            };
            all.peers.push_back({peer.name, prepare(restore), go,
                                 [=] { return digest(moves ? y.get() : work.get(), count); }});
        }
        race(all);
    }

  private:
    /// The samples of an input, and some behind them for loops that run over whole vectors.
    struct Source {
        bool complex;
        std::size_t points, count, stride;
        Samples<T> data;

        Source(const Input& input, std::size_t n)
            : complex(input.complex),
              points(input.points ? input.points : n),
              count(points * (complex ? 2 : 1)),
              stride((count + 63) / 64 * 64),
              data(samples<T>(stride)) {
            for (std::size_t i = 0; i < stride && input.value; ++i) data[i] = T(input.value(i));
        }
    };
};

/// Adds a family whose rows are run in both precisions at every size.
template <class Rows>
bool at_every_size(const char* name, Rows rows) {
    return add_family([=] {
        for (const std::size_t n : sizes()) {
            rows(Family<dsp>{name, n});
            rows(Family<dspf>{name, n});
        }
    });
}

}  // namespace wavkit::bench
