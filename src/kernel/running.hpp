// Running sums and differences in vectors. `Step` is the distance of a value from the one before
// it: 1 in real signals, 2 in complex ones, whose parts are two signals in turn.
#pragma once

#include "kernel/lanes.hpp"

namespace wavkit::kernel {
namespace {

/// The V lanes that begin `Step` lanes before the second of two vectors.
template <int V, int Step>
struct Before {
    static constexpr int lane(int i) { return V - Step + i; }
};

/// The last `Step` lanes over and over.
template <int V, int Step>
struct Last {
    static constexpr int lane(int i) { return V - Step + i % Step; }
};

/// What lies `Step` lanes before `now` when `before` came before it.
template <int Step, class V>
WAVKIT_LANES V lanes_before(V now, V before) {
    return shuffle<count<V>, Before<count<V>, Step>>(before, now);
}

/// The last value of each of the signals in turn, in all its lanes.
template <int Step, class V>
WAVKIT_LANES V last_of(V v) {
    return shuffle<count<V>, Last<count<V>, Step>>(v, v);
}

/// Each lane with all before it that belong to its signal.
template <int Step, class V>
WAVKIT_LANES V running_sum(V v) {
    if constexpr (Step >= count<V>) {
        return v;
    } else {
        return running_sum<2 * Step>(v + lanes_before<Step>(v, V{}));
    }
}

}  // namespace
}  // namespace wavkit::kernel
