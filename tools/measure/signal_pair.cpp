#include "measure/signal_pair.hpp"

#include <algorithm>
#include <cmath>
#include <cstdio>

#include "base/error.hpp"
#include "base/number.hpp"
#include "files/moment.hpp"
#include "measure/prepare.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_points = 1 << 15;

}  // namespace

SignalPair::SignalPair(const std::string& first, const std::string& second,
                       const ReadOptions& options) {
    if (first == "-" && second == "-") {
        throw UsageError(
            "standard input can be one of the two; two channels of it take a single -");
    }
    open(first, options, second.empty());
    if (!second.empty()) open(second, options, false);
    delta_ = streams_[0]->delta;
    facts_[0] = streams_[0]->facts_of(0);
    facts_[1] = second.empty() ? streams_[0]->facts_of(1) : streams_[1]->facts_of(0);
    if (second.empty() && streams_[0]->channels < 2) {
        if (streams_[0]->complex) check();
        whole_ = read_rest(*streams_[0]);
        auto* const next = sources_[0]->next();
        if (!next) throw Error("there is one signal in " + first + "; name a second file");
        streams_[0] = next;
        facts_[1] = next->facts_of(0);
    }
    check();
}

void SignalPair::open(const std::string& file, const ReadOptions& options, bool beside) {
    inputs_.push_back(std::make_unique<InputFile>(file));
    sources_.push_back(beside ? open_channels(*inputs_.back(), options)
                              : open_signals(*inputs_.back(), options));
    streams_.push_back(sources_.back()->next());
}

void SignalPair::check() const {
    for (const auto* const stream : streams_) {
        if (stream->complex) throw DataError("the response between complex signals is not defined");
        if (std::fabs(stream->delta - delta_) > 1e-6 * std::fabs(delta_)) {
            throw Error("the sample spacings differ, " + number(delta_) + " and " +
                        number(stream->delta) + "; set --delta or --rate");
        }
    }
    const double later = later_start(facts_[0], facts_[1]);
    if (std::fabs(later) > 0.5 * std::fabs(delta_)) {
        throw Error("the second signal begins " + rounded(later) +
                    " behind the first; cut them to begin together, or set --start");
    }
}

/// Reads a block of one of the two, as far as there is one.
std::size_t SignalPair::read(std::size_t which) {
    auto& values = values_[which];
    values.resize(block_points);
    if (which == 0 && !whole_.empty()) {
        const auto count = std::min(block_points, whole_.size() - taken_);
        std::copy_n(whole_.begin() + std::ptrdiff_t(taken_), count, values.begin());
        taken_ += count;
        return count;
    }
    if (streams_.size() == 2) return streams_[which]->read(values);
    if (!whole_.empty()) return streams_[0]->read(values);
    // Side by side in one stream: both are there once the first one is.
    const auto width = streams_[0]->channels;
    if (which == 0) {
        block_.resize(block_points * width);
        block_.resize(streams_[0]->read(block_));
    }
    const auto count = block_.size() / width;
    for (std::size_t i = 0; i < count; ++i) values[i] = block_[i * width + which];
    return count;
}

SignalPair::Blocks SignalPair::next() {
    if (uneven_) return {};
    const auto first = read(0), second = read(1), count = std::min(first, second);
    uneven_ = first != second;
    for (auto& values : values_) {
        values.resize(count);
        check_finite(values, 1, long(samples_));
    }
    samples_ += count;
    return {values_[0], values_[1]};
}

void SignalPair::tell_of_rest() {
    if (uneven_) {
        std::fprintf(stderr,
                     "wavkit: the signals are of different length: the first %zu samples "
                     "of each were taken\n",
                     samples_);
    }
    if (streams_.size() == 1 && streams_[0]->channels > 2) {
        std::fprintf(stderr, "wavkit: using the first two of %zu channels\n",
                     streams_[0]->channels);
    }
    if (sources_.size() < 2) return;
    for (const auto& source : sources_) tell_of_others(*source);
}

}  // namespace wavkit::tool
