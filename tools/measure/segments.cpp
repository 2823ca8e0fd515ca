#include "measure/segments.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <vector>

#include "base/error.hpp"
#include "measure/prepare.hpp"

namespace wavkit::tool {
namespace {

/// Another stream's slopes, in the manner of take_slope().
class SlopeStream : public SampleStream {
  public:
    explicit SlopeStream(SampleStream& source) : source_(source) {
        delta = source.delta;
        before_.resize(source.complex ? 2 : 1);
        source_.read(before_);
    }

    std::size_t read(std::span<double> values) override {
        const auto width = before_.size();
        samples_.resize(values.size() * width);
        const auto count = source_.read(samples_) / width;
        for (std::size_t i = 0; i < count; ++i) {
            double squares = 0;
            for (std::size_t part = 0; part < width; ++part) {
                const double now = samples_[i * width + part];
                squares += (now - before_[part]) * (now - before_[part]);
                before_[part] = now;
            }
            values[i] = std::sqrt(squares) / delta;
        }
        return count;
    }

    double done() const override { return source_.done(); }

  private:
    SampleStream& source_;
    std::vector<double> before_, samples_;
};

[[noreturn]] void fail_with_too_few(std::size_t samples, std::size_t length) {
    throw DataError("the signal has " + std::to_string(samples) +
                    " samples, fewer than one segment of " + std::to_string(length));
}

/// The first `length` scalars of a stream. Memory grows with what there is: a length that the
/// signal does not have costs none.
std::vector<double> first_segment(SampleStream& stream, std::size_t length) {
    constexpr std::size_t block = 1 << 16;
    std::vector<double> values;
    std::size_t count = 0;
    while (count == values.size() && count < length) {
        values.resize(std::min(length, std::max(block, 2 * count)));
        count += stream.read(std::span(values).subspan(count));
    }
    if (count < length) {
        const std::size_t width = stream.complex ? 2 : 1;
        fail_with_too_few(count / width, length / width);
    }
    return values;
}

}  // namespace

int Segmentation::step() const {
    return std::max(1, int(std::lround(length * (1 - overlap / 100))));
}

void measure_segments(SampleStream& source, const Segmentation& segmentation,
                      const SpectrumSettings& settings,
                      const std::function<void(Spectrum&)>& take) {
    const auto wanted = std::size_t(segmentation.length);
    if (source.length && *source.length < wanted) fail_with_too_few(*source.length, wanted);
    std::unique_ptr<SlopeStream> slopes;
    if (segmentation.slope) slopes = std::make_unique<SlopeStream>(source);
    SampleStream& stream = slopes ? *slopes : source;

    const std::size_t width = stream.complex ? 2 : 1;
    const auto length = std::size_t(segmentation.length) * width;
    const auto step = std::size_t(segmentation.step()) * width;
    auto window = first_segment(stream, length);
    check_finite(window, width);
    Signal x(stream.delta);
    long position = segmentation.length;  // of the next sample to be read
    for (;;) {
        x->complex = stream.complex;
        x->points = segmentation.length;
        check(dsp_alloc(x), "measuring segments");
        std::ranges::copy(window, x->data);
        if (segmentation.detrend) remove_mean(x);
        auto spectrum = measure(x, settings);
        take(spectrum);
        std::copy(window.begin() + std::ptrdiff_t(step), window.end(), window.begin());
        const auto fresh = std::span(window).last(step);
        const auto count = stream.read(fresh);
        check_finite(fresh.first(count), width, position);
        position += long(count / width);
        if (count < fresh.size()) break;
    }
}

void SpectrumAverage::add(Spectrum& spectrum) {
    const long count = average_.bins->points > 0 ? average_.averaged + 1 : 1;
    const int flags =
        int(averaging_.type) | DSP_AVG_POWER | (averaging_.forget > 0 ? DSP_AVG_LIMITED : 0);
    Signal& average = average_.bins;
    check(dsph_avg(spectrum.bins, average, scratch_, flags,
                   int(std::min<long>(count, std::numeric_limits<int>::max())), averaging_.every,
                   -1.0, averaging_.forget),
          "averaging");
    average_.samples = spectrum.samples;
    average_.length = spectrum.length;
    average_.width = spectrum.width;
    average_.window = spectrum.window;
    average_.two_sided = spectrum.two_sided;
    average_.zoomed = spectrum.zoomed;
    average_.first = spectrum.first;
    average_.averaged = count;
}

Spectrum SpectrumAverage::result() {
    for (double& power : average_.bins.values()) power = std::sqrt(power);
    return std::move(average_);
}

}  // namespace wavkit::tool
