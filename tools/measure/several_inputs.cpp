#include "measure/several_inputs.hpp"

#include <algorithm>
#include <cmath>

#include "base/error.hpp"
#include "base/number.hpp"

namespace wavkit::tool {

SeveralInputs::SeveralInputs(const std::vector<std::string>& files, const ReadOptions& options) {
    check_standard_input(files);
    for (const auto& file : files) {
        inputs_.push_back(std::make_unique<InputFile>(file));
        sources_.push_back(open_channels(*inputs_.back(), options));
    }
}

std::span<SampleStream* const> SeveralInputs::next() {
    streams_.clear();
    for (const auto& source : sources_) streams_.push_back(source->next());
    const auto ended = std::ranges::find(streams_, nullptr);
    if (ended != streams_.end()) {
        const auto going = std::ranges::find_if(streams_, [](auto* s) { return s != nullptr; });
        if (going == streams_.end()) return {};
        throw Error(name(std::size_t(going - streams_.begin())) + " holds more signals than " +
                    name(std::size_t(ended - streams_.begin())) + "; choose one with --signal");
    }
    const double delta = streams_[0]->delta;
    for (std::size_t i = 1; i < streams_.size(); ++i) {
        if (std::fabs(streams_[i]->delta - delta) > 1e-6 * std::fabs(delta)) {
            throw Error("the sample spacings differ, " + number(delta) + " in " + name(0) +
                        " and " + number(streams_[i]->delta) + " in " + name(i) +
                        "; resample one, or set --delta or --rate");
        }
    }
    return streams_;
}

double SeveralInputs::done() const {
    double sum = 0;
    for (const auto* stream : streams_) sum += stream ? stream->done() : 1;
    return sum / double(std::max<std::size_t>(streams_.size(), 1));
}

std::size_t FittedStream::read(std::span<double> values) {
    const std::size_t width = complex_ ? 2 : 1, own = stream_.complex ? 2 : 1;
    if (own == width && stream_.channels == channels_) return stream_.read(values);
    const auto points = values.size() / (width * channels_);
    taken_.resize(points * own * stream_.channels);
    const auto got = stream_.read(taken_) / (own * stream_.channels);
    std::ranges::fill(values, 0.0);
    for (std::size_t i = 0; i < got; ++i) {
        for (std::size_t c = 0; c < channels_; ++c) {
            const auto from = i * stream_.channels + (stream_.channels == 1 ? 0 : c);
            std::copy_n(&taken_[from * own], own, &values[(i * channels_ + c) * width]);
        }
    }
    return got * width * channels_;
}

}  // namespace wavkit::tool
