// wavkit window: what a window of the catalogue is like.
#include <wavkit/dsp.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <memory>
#include <optional>

#include "base/error.hpp"
#include "base/options.hpp"
#include "base/scales.hpp"
#include "commands/commands.hpp"
#include "files/recording.hpp"
#include "measure/windows.hpp"
#include "show/plot.hpp"
#include "show/report.hpp"

namespace wavkit::tool {
namespace {

constexpr int bins_in_picture = 16;

struct WindowOptions {
    std::string name, out, plot;
    WriteOptions writing;
    PictureLook look;
    int points = 1024;
    bool json = false;
};

/// The samples, 1 at the centre, in the order of time.
Signal samples_of(int window, int points) {
    Signal w;
    w->points = points;
    check(dsp_alloc(w), "making the window");
    std::ranges::fill(w.values(), 1.0);
    check(dspi_window(w, window, DSP_SCALE_PEAK | DSP_SCALE_NO_ROTATION), "making the window");
    return w;
}

/// The response to a sine some bins aside, 1 on the bin itself.
struct Response {
    Signal magnitude;  // `per_bin` values a bin, from 0 up to half the sampling rate
    int per_bin;
};

/// Zeros resolve the lobes: a lobe's top is then found to 0.01 dB. Windows longer than some ten
/// thousand samples all have the same lobes.
Response response_of(int window, int points) {
    constexpr int fineness = 32, longest = 1 << 15;
    Response response{{}, fineness};
    Signal& y = response.magnitude;
    y = samples_of(window, std::min(points, longest));
    check(dspi_zpad(y, fineness * y->points) || dspi_rdft(y) || dspi_mag(y),
          "measuring the window");
    const double top = y->data[0];
    for (double& value : y.values()) value /= top;
    return response;
}

/// The highest value beyond the main lobe, which a flat window's ripple at the top does not end.
std::optional<double> highest_sidelobe(const Response& response) {
    const auto y = response.magnitude.values();
    std::size_t i = 0;
    while (i < y.size() && y[i] > 0.5) ++i;
    while (i + 1 < y.size() && y[i + 1] < y[i]) ++i;
    if (i + 1 >= y.size()) return std::nullopt;
    return *std::max_element(y.begin() + std::ptrdiff_t(i), y.end());
}

/// The greatest error of an amplitude, in decibels, for a sine up to half a bin aside.
double scalloping_loss(const Response& response) {
    double worst = 0;
    for (int i = 0; i <= response.per_bin / 2; ++i) {
        worst = std::max(worst, std::fabs(decibels(response.magnitude->data[i])));
    }
    return worst;
}

void tell(int window, const Signal& w, Page& page) {
    const double gain = statistic(dsps_mean, w), rms = statistic(dsps_rms, w);
    const auto response = response_of(window, w->points);
    const auto sidelobe = highest_sidelobe(response);
    const double noise_bandwidth = rms * rms / (gain * gain), loss = scalloping_loss(response);
    const auto name = window_names()[std::size_t(window)];
    page.members = {{"window", json_text(name)},
                    {"points", std::to_string(w->points)},
                    {"coherent_gain", json_number(gain)},
                    {"noise_bandwidth", json_number(noise_bandwidth)},
                    {"highest_sidelobe_db", sidelobe ? json_number(decibels(*sidelobe)) : "null"},
                    {"scalloping_loss_db", json_number(loss)}};
    auto* const to = page.text();
    std::fprintf(to, "window            %s, %d points\n", name.c_str(), w->points);
    std::fprintf(to, "coherent gain     %.6f\n", gain);
    std::fprintf(to, "noise bandwidth   %.4f bins\n", noise_bandwidth);
    if (sidelobe) {
        std::fprintf(to, "highest sidelobe  %.2f dB\n", decibels(*sidelobe));
    } else {
        std::fputs("highest sidelobe  none\n", to);
    }
    std::fprintf(to, "scalloping loss   %.4f dB\n", loss);
}

void draw_response(int window, int points, const std::string& path, const PictureLook& look) {
    const auto response = response_of(window, points);
    const int reach = std::min(response.magnitude->points - 1, bins_in_picture * response.per_bin);
    Curve curve;
    curve.title = window_names()[std::size_t(window)] + ", " + std::to_string(points) + " points";
    curve.x_label = "bins";
    curve.y_label = "response";
    curve.y_unit = "dB re maximum";
    curve.decibels = true;
    curve.depth = 150;
    for (int i = -reach; i <= reach; ++i) {
        curve.x.push_back(double(i) / response.per_bin);
        // A zero between two lobes would have no place on the axis.
        curve.y.push_back(decibels(std::max(response.magnitude->data[std::abs(i)], 1e-15)));
    }
    draw(curve, path, look);
}

void run(const WindowOptions& options) {
    if (!options.plot.empty()) picture_of_name(options.plot);
    if (options.out.empty() && options.writing.format) {
        throw UsageError("--to is for the output that -o names");
    }
    if (!options.out.empty()) options.writing.format_for(options.out);
    check_apart(options.out, options.plot, options.json);
    const int window = window_of_name(options.name);
    const auto w = samples_of(window, options.points);
    if (!options.out.empty()) write_recording(options.out, {&w, 1}, options.writing);
    if (!options.plot.empty()) draw_response(window, w->points, options.plot, options.look);
    if (!options.json && !(options.out.empty() && options.plot.empty())) return;
    report("window", options.json, [&](Page& page) { tell(window, w, page); });
}

}  // namespace

void add_window(CLI::App& program) {
    auto* const command = program.add_subcommand(
        "window", "Shows a window of the catalogue: figures, samples, response.");
    const auto options = std::make_shared<WindowOptions>();
    command->add_option("NAME", options->name, "the window")->required()->type_name("");
    command->add_option("--points", options->points, "length of the window (default: 1024)")
        ->check(CLI::Range(1, 1 << 24))
        ->type_name("N");
    command->add_flag("--json", options->json, "print JSON");
    command->add_option("-o,--output", options->out, "write the samples; - is standard output")
        ->type_name("FILE");
    add_choice(*command, "--to", options->writing.format, written_formats(),
               "format of the output (default: by its name)");
    declare_plot(*command, options->plot, "main lobe and sidelobes");
    options->look.declare(*command);
    command->footer(
        "The coherent gain is the mean of the samples, whose centre is 1; the noise bandwidth is "
        "that of\nthe rectangular filter that lets as much white noise through; the scalloping "
        "loss is the greatest\nerror of an amplitude up to half a bin beside a bin.\n\nWindows:\n" +
        window_list() +
        "\n\nExamples:\n"
        "  wavkit window flattop\n"
        "  wavkit window kaiser90 --points 256 -o kaiser.csv\n"
        "  wavkit window hann --plot hann.png");
    command->callback([options] { run(*options); });
}

}  // namespace wavkit::tool
