#include "show/comparison.hpp"

#include <algorithm>
#include <utility>

#include "base/error.hpp"
#include "base/progress.hpp"
#include "show/labels.hpp"

namespace wavkit::tool {
namespace {

Outline outline(double delta, double start, const std::vector<double>& times) {
    return times.empty() ? Outline(delta, start) : Outline(delta, start, times[0], times[1]);
}

}  // namespace

Comparison::Comparison(ComparisonLabels labels, double delta, const std::vector<double>& times,
                       std::size_t step, bool together)
    : labels_(std::move(labels)),
      before_(outline(delta, labels_.values.start, times)),
      after_(before_),
      step_(step),
      together_(together) {}

void Comparison::add(std::span<const double> in, std::span<const double> out) {
    before_.add(in, step_);
    after_.add(out, step_);
}

void Comparison::draw(const std::string& path, const PictureLook& look) const {
    std::vector panels{before_.curve(), after_.curve()};
    panels[0].title = labels_.before;
    panels[1].title = labels_.after;
    const auto [a, b] = std::pair(*panels[0].range, *panels[1].range);
    for (auto& panel : panels) {
        panel.x_label = "time";
        panel.x_unit = labels_.axis_unit;
        panel.y_label = labels_.values.label("value");
        panel.y_unit = look.unit_of(labels_.values);
        if (together_) panel.range = {std::min(a.first, b.first), std::max(a.second, b.second)};
    }
    if (!together_) panels[1].y_unit.clear();
    panels[0].caption = labels_.caption;
    tool::draw(panels, path, look);
}

void ComparisonFiles::check(bool json) {
    if (!plot.empty()) picture_of_name(plot);
    if (plot.empty() && !span.empty()) throw UsageError("--span is for --plot");
    if (!span.empty() && !(span[0] < span[1])) {
        throw UsageError("--span goes from an earlier to a later time");
    }
    if (out.empty() && plot.empty() && !json) out = "-";
    check_apart(out, plot, json);
    if (!out.empty()) writing.checked_format_for(out);
    if (out.empty() && writing.any()) {
        throw UsageError("--to, --type, --bits and --with-time are for the output that -o names");
    }
}

ComparedPass::ComparedPass(const ComparisonFiles& files, std::string doing)
    : files_(files), doing_(std::move(doing)), input_(files.in) {}

void ComparedPass::run(const std::function<void(SampleStream&)>& change) {
    if (!files_.out.empty()) output_.emplace(files_.out, files_.writing);
    const auto source = open_channels(input_, files_.reading);
    sound_ = source->sound;
    while (auto* const stream = source->next()) change(*stream);
    if (comparison_) comparison_->draw(files_.plot, files_.look);
    if (output_) output_->commit();
}

void ComparedPass::pass(SampleStream& stream, const Changed& changed,
                        const std::function<void(const Take&)>& change) {
    const bool draws = !files_.plot.empty() && !comparison_;
    if (draws && changed.shape.complex) throw DataError("--plot draws real signals only");
    if (draws) {
        const auto facts = stream.facts_of(0);
        comparison_.emplace(ComparisonLabels{short_name(files_.in), changed.name,
                                             facts.axis(sound_ || files_.reading.rate),
                                             files_.reading.chosen(sound_), facts},
                            stream.delta, files_.span, stream.channels, changed.comparable);
    }
    auto* const writer = output_ ? &output_->writer() : nullptr;
    if (writer) writer->begin(changed.shape);
    {
        Progress progress(doing_ + " " + input_.name());
        change([&](std::span<const double> in, std::span<const double> out) {
            if (writer) writer->write(out);
            if (draws) comparison_->add(in, out);
            progress.done(stream.done());
        });
    }
    if (writer) writer->end();
}

}  // namespace wavkit::tool
