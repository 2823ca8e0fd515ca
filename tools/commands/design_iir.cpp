#include "commands/design_iir.hpp"

#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <utility>

#include "base/number.hpp"
#include "files/recording.hpp"
#include "show/bands.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

class Report {
  public:
    Report(const RecursiveDesign& asked, const Signal& sections)
        : asked_(asked),
          sections_(sections),
          roots_(asked.filter.roots()),
          response_(response_of_sections(sections, roots_)) {}

    void print(std::FILE* to) const {
        std::fprintf(to, "design       %s\n", title().c_str());
        for (int k = 0; k < sections_->points; k += DSP_IIR_VALUES) {
            const double* const row = sections_->data + k;
            std::fprintf(to, "section %-5db %22.15g %22.15g %22.15g\n", k / DSP_IIR_VALUES + 1,
                         row[0], row[1], row[2]);
            std::fprintf(to, "%-13sa %22.15g %22.15g %22.15g\n", "", row[3], row[4], row[5]);
        }
        const auto [least, most] = delays();
        std::fprintf(to, "delay        %.6g to %.6g samples where it passes\n", least, most);
        print_bands(to, figures());
    }

    JsonMembers members() const {
        std::vector<std::string> rows;
        for (int k = 0; k < sections_->points; k += DSP_IIR_VALUES) {
            rows.push_back(json_numbers({sections_->data + k, DSP_IIR_VALUES}));
        }
        const int count = (roots_->points - 1) / 2;
        const auto [least, most] = delays();
        JsonMembers all{
            {"design", json_text(asked_.filter.band)},
            {"iir", json_text(asked_.filter.shape.name)},
            {"order", std::to_string(asked_.filter.order())},
            {"parameters", json_numbers(asked_.parameters)},
            {"sections", json_list(rows)},
            {"gain", json_number(roots_->data[0])},
            {"zeros", complex_list(roots_->data + 2, count)},
            {"poles", complex_list(roots_->data + 2 + 2 * std::ptrdiff_t(count), count)},
            {"delay", json_numbers(std::vector{least, most})}};
        for (auto& member : band_members(figures())) all.push_back(std::move(member));
        return all;
    }

    void draw(const std::string& path) const {
        Curve gain = gain_curve(figures(), title()), delay;
        delay.title = "delay where it passes";
        delay.x_label = gain.x_label;
        delay.x_unit = gain.x_unit;
        delay.x_range = gain.x_range;
        delay.y_label = "delay";
        delay.y_unit = "samples";
        delay.filled = false;
        bool shown = false;
        for (std::size_t i = 0; i < response_.delay.size(); ++i) {
            const bool starts = !std::exchange(shown, passes(i)) && shown;
            if (starts && !delay.x.empty()) delay.gaps.push_back(delay.x.size());
            if (!shown) continue;
            delay.x.push_back(gain.x[i]);
            delay.y.push_back(response_.delay[i]);
        }
        // (Rounding may leave a filter with edges near 0 that passes nowhere.)
        std::vector panels{gain};
        if (!delay.x.empty()) panels.push_back(delay);
        tool::draw(panels, path, asked_.look);
    }

  private:
    static std::string complex_list(const double* parts, int count) {
        std::vector<std::string> values;
        values.reserve(std::size_t(count));
        for (int k = 0; k < count; ++k) {
            values.push_back(json_value({parts[2 * k], parts[2 * k + 1]}));
        }
        return json_list(values);
    }

    bool passes(std::size_t i) const { return response_.magnitude[i] >= std::sqrt(0.5); }

    /// The least and the greatest where it passes, up to the edges.
    std::pair<double, double> delays() const {
        double least = INFINITY, most = -INFINITY;
        const auto add = [&](double delay) {
            least = std::min(least, delay);
            most = std::max(most, delay);
        };
        for (std::size_t i = 0; i < response_.delay.size(); ++i) {
            if (passes(i)) add(response_.delay[i]);
        }
        for (const double edge : crossings(response_, response_.magnitude, std::sqrt(0.5))) {
            add(delay_of_sections(sections_, edge));
        }
        return {least, most};
    }

    BandFigures figures() const { return {response_, response_.magnitude, asked_.rate}; }

    std::string title() const {
        std::string text = asked_.filter.band;
        for (const double parameter : asked_.parameters) text += " " + number(parameter);
        if (asked_.filter.shape.name.empty()) return text;
        return text + ", " + asked_.filter.shape.name + " of order " +
               std::to_string(asked_.filter.order());
    }

    const RecursiveDesign& asked_;
    const Signal& sections_;
    Signal roots_;
    SectionResponse response_;
};

}  // namespace

void design_recursive(const RecursiveDesign& asked) {
    auto sections = asked.filter.sections();
    if (asked.rate) sections->delta = 1 / *asked.rate;
    if (!asked.out.empty()) write_recording(asked.out, {&sections, 1}, asked.writing);
    if (!asked.out.empty() && asked.plot.empty() && !asked.json) return;
    const Report design(asked, sections);
    if (!asked.plot.empty()) design.draw(asked.plot);
    if (!asked.plot.empty() && !asked.json) return;
    report("design", asked.json, [&](Page& page) {
        if (asked.json) {
            page.members = design.members();
        } else {
            design.print(page.text());
        }
    });
}

}  // namespace wavkit::tool
