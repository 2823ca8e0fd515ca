// wavkit peaks: where a signal is highest, and how much it stands out there.
#include <wavkit/dsp.h>

#include <array>
#include <cmath>
#include <cstdio>
#include <limits>
#include <memory>
#include <optional>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/options.hpp"
#include "base/progress.hpp"
#include "base/text.hpp"
#include "commands/commands.hpp"
#include "files/output.hpp"
#include "files/recording.hpp"
#include "measure/prepare.hpp"
#include "show/labels.hpp"
#include "show/plot.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

struct PeaksOptions {
    ReportFiles files;
    std::string out, plot;
    std::optional<double> height, threshold, distance, prominence, width;
    double width_at = 50;
    bool valleys = false, samples = false;
    ReadOptions reading;
    PictureLook look;
};

/// What is told of a peak, by its name in JSON and CSV.
struct Column {
    const char* name;
    int value;    // of dsps_peaks()
    bool place;   // on the axis
    bool length;  // along the axis
};

constexpr std::array columns{
    Column{"at", DSP_PEAKS_POSITION, true, false},
    Column{"height", DSP_PEAKS_HEIGHT, false, false},
    Column{"top", DSP_PEAKS_TOP, false, false},
    Column{"prominence", DSP_PEAKS_PROMINENCE, false, false},
    Column{"width", DSP_PEAKS_WIDTH, false, true},
    Column{"left", DSP_PEAKS_LEFT, true, false},
    Column{"right", DSP_PEAKS_RIGHT, true, false},
    Column{"left_base", DSP_PEAKS_LEFT_BASE, true, false},
    Column{"right_base", DSP_PEAKS_RIGHT_BASE, true, false},
    Column{"sample", DSP_PEAKS_INDEX, false, false},
};
constexpr std::size_t printed_columns = 5;

/// What the peaks of a signal stand out of: its values, or magnitudes.
Signal heights_of(const Signal& x) {
    Signal heights;
    check(x->complex ? dspu_mag(x, heights) : dsp_copy(heights, x), "looking at heights");
    return heights;
}

/// The peaks of a signal, in its own units.
class Peaks {
  public:
    Peaks(const Signal& x, const PeaksOptions& options)
        : facts_(x.facts), delta_(x->delta), valleys_(options.valleys) {
        auto heights = heights_of(x);
        if (valleys_) check(dspi_neg(heights), "finding peaks");
        const double unit = options.samples ? 1 : std::fabs(delta_);
        if (options.distance || options.width) {
            check_axis(unit, "set --delta or --rate, or give --samples");
        }
        const double none = std::numeric_limits<double>::quiet_NaN();
        double height = options.height.value_or(none);
        if (valleys_) height = -height;
        Progress progress("finding peaks");
        check(dsps_peaks(heights, rows_, height, options.threshold.value_or(none),
                         options.distance.value_or(none) / unit, options.prominence.value_or(none),
                         options.width.value_or(none) / unit, options.width_at / 100),
              "finding peaks");
    }

    std::size_t count() const { return std::size_t(rows_->points) / DSP_PEAKS_VALUES; }
    double value(std::size_t peak, const Column& column) const {
        const double v = rows_.values()[peak * DSP_PEAKS_VALUES + std::size_t(column.value)];
        const bool is_height = column.value == DSP_PEAKS_HEIGHT || column.value == DSP_PEAKS_TOP;
        if (column.place) return facts_.start + v * delta_;
        return column.length ? v * delta_ : valleys_ && is_height ? -v : v;
    }

  private:
    Signal rows_;
    const Facts& facts_;
    double delta_;
    bool valleys_;
};

void print(std::FILE* to, const Peaks& peaks, const Facts& facts, bool seconds) {
    if (peaks.count() == 0) {
        std::fputs("no peaks\n", to);
        return;
    }
    for (std::size_t c = 0; c < printed_columns; ++c) {
        const bool on_axis = columns[c].place || columns[c].length;
        const auto unit = on_axis ? facts.axis(seconds) : facts.unit;
        std::fprintf(to, "%16s%s", printable(with_unit(columns[c].name, unit)).c_str(),
                     c + 1 < printed_columns ? " " : "\n");
    }
    for (std::size_t k = 0; k < peaks.count(); ++k) {
        for (std::size_t c = 0; c < printed_columns; ++c) {
            std::fprintf(to, "%16.9g%s", peaks.value(k, columns[c]),
                         c + 1 < printed_columns ? " " : "\n");
        }
    }
}

void add_json(JsonMembers& members, const Peaks& peaks) {
    std::vector<std::string> list;
    for (std::size_t k = 0; k < peaks.count(); ++k) {
        JsonMembers peak;
        for (const auto& column : columns) {
            peak.emplace_back(column.name, json_number(peaks.value(k, column)));
        }
        list.push_back(json_object(peak));
    }
    members.emplace_back("peaks", json_list(list));
}

void write_table(std::FILE* to, const Peaks& peaks) {
    for (const auto& column : columns) {
        std::fprintf(to, "%s%s", &column == &columns[0] ? "" : ",", column.name);
    }
    for (std::size_t k = 0; k < peaks.count(); ++k) {
        for (const auto& column : columns) {
            std::fprintf(to, "%s%s", &column == &columns[0] ? "\n" : ",",
                         number(peaks.value(k, column)).c_str());
        }
    }
    std::fputc('\n', to);
}

Curve curve_of(const Signal& x, const Peaks& peaks, const PeaksOptions& options,
               const std::string& file, bool seconds) {
    const auto heights = heights_of(x);
    Curve curve;
    curve.title = short_name(file);
    curve.x_label = x.facts.axis(seconds) == "Hz" ? "frequency" : seconds ? "time" : "x";
    curve.x_unit = x.facts.axis(seconds);
    curve.y_label = x.facts.label("value");
    curve.y_unit = options.look.unit_of(x.facts);
    curve.filled = false;
    curve.named = false;
    for (int i = 0; i < heights->points; ++i) {
        curve.x.push_back(x.place(i));
        curve.y.push_back(heights->data[i]);
    }
    for (std::size_t k = 0; k < peaks.count(); ++k) {
        curve.marked.push_back({peaks.value(k, columns[0]), peaks.value(k, columns[2])});
    }
    return curve;
}

void tell(const std::string& file, const PeaksOptions& options, Page& page) {
    const auto recording = read_recording(file, options.reading);
    std::optional<OutputFile> output;
    if (!options.out.empty()) output.emplace(options.out);
    std::vector<Curve> curves;
    bool first = true;
    for (const auto& x : recording.signals) {
        auto& members = page.add_signal(x);
        const bool seconds = recording.sound || options.reading.rate;
        const Peaks peaks(x, options);
        if (!options.plot.empty() && x->points > 0) {
            curves.push_back(curve_of(x, peaks, options, file, seconds));
        }
        if (output) {
            if (!first) std::fputc('\n', output->stream());
            write_table(output->stream(), peaks);
        }
        if (options.files.json) {
            add_json(members, peaks);
        } else if (options.plot.empty() && !output) {
            if (!first) std::fputc('\n', page.text());
            print(page.text(), peaks, x.facts, seconds);
        }
        first = false;
    }
    if (output) output->commit();
    if (!curves.empty()) draw(curves, options.plot, options.look);
}

void run(const PeaksOptions& options) {
    if (!options.plot.empty()) picture_of_name(options.plot);
    options.files.check_single(options.out, options.plot);
    check_table_name(options.out, "a list of peaks");
    report_files("peaks", options.files,
                 [&](const std::string& file, Page& page) { tell(file, options, page); });
}

constexpr const char* about =
    R"(A peak is a sample, or several equal ones, above its neighbours. Of all peaks those are kept that are
at least --height high, rise from their neighbours by --threshold, have no higher peak nearer than
--distance, a prominence of at least --prominence, and are at least --width wide, in this order.

The prominence is the height above the higher one of a peak's bases: to either side, the lowest sample
before the signal rises above the peak. The width is taken at half the prominence, or --width-at so
many percent of it below the top. Distances and widths are in the unit of the axis, with --samples
in samples. 'at' and 'top' are those of the parabola through the peak and its neighbours.

Of a complex signal the magnitudes are looked at: wavkit spectrum x.wav -o - | wavkit peaks -.
--valleys finds what is lowest instead; --height is then the greatest height. Every signal of a file
is looked at. -o writes all that is known of the peaks as CSV, --plot draws them.

Examples:
  wavkit peaks ecg.txt --rate 360 --prominence 0.5 --distance 0.3
  wavkit peaks examples/data/sunspots-yearly.txt --distance 7 --plot maxima.png
  wavkit peaks run*.wav --height 0.1 --json --jobs 4)";

}  // namespace

void add_peaks(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "peaks", "Finds peaks by height, steepness, distance, prominence and width.");
    const auto options = std::make_shared<PeaksOptions>();
    options->files.declare(*command);
    const auto declare = [&](const char* name, std::optional<double>& value, const char* about_it,
                             double least) {
        command->add_option(name, value, about_it)
            ->check(number_between(least, 1e300))
            ->type_name("VALUE");
    };
    declare("--height", options->height, "how high", -1e300);
    declare("--threshold", options->threshold, "how far above the neighbouring samples", 0);
    declare("--distance", options->distance, "how far from higher peaks", 0);
    declare("--prominence", options->prominence, "how far above the bases", 0);
    declare("--width", options->width, "how wide", 0);
    command
        ->add_option("--width-at", options->width_at,
                     "percent of the prominence below the top where widths are taken (default: 50)")
        ->check(number_between(0, 100))
        ->type_name("P");
    command->add_flag("--samples", options->samples, "distance and width in samples");
    command->add_flag("--valleys", options->valleys, "find what is lowest");
    command->add_option("-o,--output", options->out, "write CSV; - is standard output")
        ->type_name("FILE");
    declare_plot(*command, options->plot, "signal and peaks");
    options->look.declare(*command);
    options->reading.declare(*command);
    command->footer(about);
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
