// What a change of the sampling rate is made of: steps that take a stream of several signals side
// by side, block by block, and give it back at another rate, every sample at its time.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <vector>

#include "base/signal.hpp"

namespace wavkit::tool {

/// Signals side by side, equally long; a complex one counts as two.
using Planes = std::vector<std::vector<double>>;

/// A step. Before the first sample there are zeros; behind the last one whoever feeds it adds them.
class RateStage {
  public:
    virtual ~RateStage() = default;

    /// Takes the samples that follow and puts the outputs that they complete in place of them.
    virtual void pass(Planes& block) = 0;
};

/// A low-pass: edges in cycles an input sample.
struct PassBand {
    double pass, stop, attenuation;
};

/// Keeps every factor-th output of a low-pass.
std::unique_ptr<RateStage> decimation(std::size_t planes, int factor, const PassBand& band);

/// Changes the rate by up / down, each a product of small primes, in the spectrum: a stretch of the
/// signal is transformed, cut off or continued with zeros, and transformed back at its new length.
/// The band ends at half of the lower rate or before.
std::unique_ptr<RateStage> spectral_change(std::size_t planes, int up, int down,
                                           const PassBand& band);

/// Whether lengths that this divides have a fast transform.
bool has_small_primes(std::int64_t n);

/// Where output m lies, in input samples: a whole number and a fraction of one.
struct SamplePlace {
    std::int64_t sample;
    double fraction;
};
using PlaceOf = std::function<SamplePlace(std::int64_t)>;

/// Reads a signal, of which the band up to band.pass counts, at so many places, which ascend.
std::unique_ptr<RateStage> reading_at(std::size_t planes, PlaceOf place, std::int64_t places,
                                      const PassBand& band);

/// The same at places that are `step` apart, without end.
std::unique_ptr<RateStage> reading_evenly(std::size_t planes, PlaceOf place, double step,
                                          const PassBand& band);

}  // namespace wavkit::tool
