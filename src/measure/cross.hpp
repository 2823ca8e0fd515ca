// What the segments of two signals add up to.
#pragma once

#include "record_view.hpp"

namespace wavkit {

/// The numbers at the start of a state.
struct Count {
    enum : std::size_t { segments, length, step, window, flags, ahead, numbers };
};

/// A state seen as its parts: the sums of |X|^2, |Y|^2 and of conj(X) Y over the segments so far,
/// then the samples of x and of y that a next segment begins with. `ahead` counts these; below 0
/// it counts the samples to be passed over.
class Sums {
  public:
    explicit Sums(double* data) : data_(data) {}

    static std::int64_t scalars(std::int64_t length) {
        return Count::numbers + 4 * (length / 2 + 1) + 2 * length;
    }

    double& operator[](std::size_t count) const { return data_[count]; }
    std::size_t segment() const { return std::size_t(data_[Count::length]); }
    std::size_t bins() const { return segment() / 2 + 1; }
    double* input() const { return data_ + Count::numbers; }
    double* output() const { return input() + bins(); }
    double* re() const { return output() + bins(); }
    double* im() const { return re() + bins(); }
    double* kept(int which) const { return im() + bins() + std::size_t(which) * segment(); }

  private:
    double* data_;
};

}  // namespace wavkit
