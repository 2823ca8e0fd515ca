// Spectra of the segments of a long recording, and their average (P. D. Welch, "The use of fast
// Fourier transform for the estimation of power spectra", 1967).
#pragma once

#include <functional>

#include "files/stream.hpp"
#include "measure/spectrum.hpp"

namespace wavkit::tool {

/// How a recording is cut up.
struct Segmentation {
    int length = 0;        // samples
    double overlap = 50;   // of a segment with the one before, in percent
    bool detrend = false;  // take the mean out of each
    bool slope = false;    // measure |slope| instead of the signal

    int step() const;
};

/// The types of dsph_avg(), all of them over the powers of the bins.
enum class AverageType { last = 0, linear = 1, max = 2, min = 3, harmonic = 4, log = 5, every = 6 };

struct Averaging {
    AverageType type = AverageType::linear;
    int every = 0;   // the n of the type that takes every n-th spectrum
    int forget = 0;  // 0: all spectra count alike; otherwise each weighs 1/forget when it comes
};

/// Measures segment after segment; what is left at the end and fills none is dropped. Throws where
/// there is not even one.
void measure_segments(SampleStream& stream, const Segmentation& segmentation,
                      const SpectrumSettings& settings, const std::function<void(Spectrum&)>& take);

/// An average in the making.
class SpectrumAverage {
  public:
    explicit SpectrumAverage(const Averaging& averaging) : averaging_(averaging) {}

    void add(Spectrum& spectrum);
    /// Root mean square (or what the type makes of the squares) of every bin's magnitude.
    Spectrum result();

  private:
    Averaging averaging_;
    Spectrum average_{};
    Signal scratch_;
};

}  // namespace wavkit::tool
