#include "show/plot.hpp"

#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <filesystem>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/progress.hpp"
#include "files/output.hpp"
#include "show/gnuplot.hpp"

namespace wavkit::tool {
namespace {

/// The terminal's width and height in characters.
std::pair<int, int> terminal_size() {
    winsize size{};
    if (ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) != 0 || size.ws_col < 40 || size.ws_row < 12) {
        return {100, 28};
    }
    return {size.ws_col, std::min<int>(size.ws_row - 1, 40)};
}

/// Samples that share a step of a picture with so many columns.
std::size_t samples_a_step(const Curve& curve, std::size_t columns) {
    const std::size_t n = curve.x.size();
    return n > 2 * columns ? (n + columns - 1) / columns : 1;
}

/// At most `columns` steps, each with its lowest and highest value in the order in which they
/// come, so that no peak is lost. Of boxes, which would hide one another, the highest suffices.
std::vector<Mark> thinned(const Curve& curve, std::size_t columns) {
    std::vector<Mark> points;
    const std::size_t n = curve.x.size();
    const std::size_t step = samples_a_step(curve, columns);
    for (std::size_t start = 0; start < n; start += step) {
        const auto first = curve.y.begin() + std::ptrdiff_t(start);
        const auto last = curve.y.begin() + std::ptrdiff_t(std::min(n, start + step));
        auto [low, high] = std::minmax_element(first, last);
        if (curve.style == Style::boxes) low = high;
        if (high < low) std::swap(low, high);
        for (const auto at : {low, high}) {
            points.push_back({curve.x[std::size_t(at - curve.y.begin())], *at});
            if (low == high) break;
        }
    }
    return points;
}

void write_data(std::FILE* script, const char* name, const std::vector<Mark>& points) {
    std::fprintf(script, "$%s << EOD\n", name);
    for (const auto& [x, y] : points) {
        std::fprintf(script, "%s %s\n", number(x).c_str(), number(y).c_str());
    }
    std::fputs("EOD\n", script);
}

void write_range(std::FILE* script, char axis, double low, double high) {
    std::fprintf(script, "set %crange [%s:%s]\n", axis, number(low).c_str(), number(high).c_str());
}

/// Room for boxes and dots at the ends.
void write_x_range(std::FILE* script, const Curve& curve) {
    const double low = curve.x.front(), high = curve.x.back();
    double margin = 0.5 * curve.box_width;
    if (curve.style == Style::dots) margin = low < high ? 0.02 * (high - low) : 1;
    write_range(script, 'x', low - margin, high + margin);
}

/// The range of the height axis: what is far below the highest value is not worth paper.
void write_y_range(std::FILE* script, const Curve& curve) {
    const bool given = curve.y_tics > 0;
    std::fprintf(script, "set ytics %s\n", given ? number(curve.y_tics).c_str() : "autofreq");
    const double top = *std::ranges::max_element(curve.y);
    if (curve.range) return write_range(script, 'y', curve.range->first, curve.range->second);
    if (!curve.decibels) {
        const double low = *std::ranges::min_element(curve.y);
        if (curve.style == Style::dots) {
            const double margin = low < top ? 0.08 * (top - low) : 1;
            return write_range(script, 'y', low - margin, top + margin);
        }
        return write_range(script, 'y', low < 0 ? 1.15 * low : 0, top > 0 ? 1.15 * top : 1);
    }
    const double low = std::max(*std::ranges::min_element(curve.y), top - curve.depth);
    write_range(script, 'y', std::floor(low / 10) * 10, std::ceil((top + 5) / 10) * 10);
}

std::string peak_label(const Curve& curve, const Mark& mark) {
    std::array<char, 64> numbers;
    std::snprintf(numbers.data(), numbers.size(), "%.4g (%.4g", mark.x, 1 / std::fabs(mark.x));
    return numbers.data() + (curve.unit.empty() ? "" : " " + curve.unit) + ")";
}

void write_labels(std::FILE* script, const Curve& curve, bool characters) {
    const double right_part = curve.x.front() + 0.75 * (curve.x.back() - curve.x.front());
    for (const auto& mark : curve.marked) {
        const bool left = mark.x < right_part;
        const std::string aside = characters ? "1,0" : "0.8,0.3";
        std::fprintf(
            script, "set label %s at %s,%s %s offset %s%s front%s\n",
            quoted(peak_label(curve, mark)).c_str(), number(mark.x).c_str(), number(mark.y).c_str(),
            left ? "left" : "right", left ? "" : "-", aside.c_str(),
            characters ? "" : " point pt 7 ps 0.7 lc rgb '#c0392b' textcolor rgb '#333333'");
    }
}

void write_plot(std::FILE* script, const Curve& curve, std::size_t columns, bool characters) {
    if (curve.style == Style::boxes) {
        const double boxes = double(samples_a_step(curve, columns));
        std::fprintf(script, "set boxwidth %s\n", number(boxes * curve.box_width).c_str());
    }
    write_data(script, "curve", thinned(curve, columns));
    if (!curve.line.empty()) write_data(script, "line", curve.line);
    std::fputs("plot ", script);
    if (curve.style == Style::line && curve.filled && !curve.decibels && !characters) {
        std::fputs("$curve with filledcurves y=0 fc rgb '#1f5fa8' fs transparent solid 0.15, ",
                   script);
    }
    if (characters) {
        static constexpr std::array looks{"lines", "boxes", "points pt '+'"};
        std::fprintf(script, "$curve with %s", looks[std::size_t(curve.style)]);
    } else {
        static constexpr std::array looks{"lines lw 1.4 lc",
                                          "boxes fs solid 0.35 border rgb '#1f5fa8' fc",
                                          "points pt 7 ps 0.5 lc"};
        std::fprintf(script, "$curve with %s rgb '#1f5fa8'", looks[std::size_t(curve.style)]);
    }
    if (!curve.line.empty()) std::fputs(", $line with lines lw 2 lc rgb '#c0392b'", script);
    std::fputc('\n', script);
}

void write_terminal(std::FILE* script, Picture picture, std::size_t panels) {
    std::fputs("set encoding utf8\nset key off\nset tics nomirror out\nset border 3\n", script);
    if (picture == Picture::terminal) {
        const auto [width, height] = terminal_size();
        std::fprintf(script, "set terminal dumb noenhanced size %d,%d\n", width, height);
    } else {
        const bool png = picture == Picture::png;
        std::fprintf(script, "set terminal %s noenhanced size 1000,%d font 'Sans,%d'%s\n",
                     png ? "pngcairo" : "svg", panels > 1 ? 840 : 560, png ? 11 : 13,
                     png ? "" : " background '#ffffff'");
        std::fputs("set grid lc rgb '#e0e0e0' lt 1\nset border lc rgb '#555555'\n", script);
    }
    if (panels > 1) std::fprintf(script, "set multiplot layout %zu,1\n", panels);
}

void write_panel(std::FILE* script, const Curve& curve, bool characters) {
    std::fprintf(script, "unset label\nset title %s\nset xlabel %s\nset ylabel %s\n",
                 quoted(curve.title).c_str(), quoted(curve.x_label).c_str(),
                 quoted(curve.y_label).c_str());
    write_x_range(script, curve);
    write_y_range(script, curve);
    write_labels(script, curve, characters);
    write_plot(script, curve, characters ? 200 : 4000, characters);
}

}  // namespace

Picture picture_of_name(const std::string& path) {
    if (path == "-") return Picture::terminal;
    const auto extension = std::filesystem::path(path).extension();
    if (extension == ".png") return Picture::png;
    if (extension == ".svg") return Picture::svg;
    throw UsageError("a picture's name ends in .png or .svg, or is - for the terminal, not '" +
                     path + "'");
}

void check_apart(const std::string& out, const std::string& picture) {
    if (out != "-" || picture != "-") return;
    throw UsageError("standard output takes only one of -o - and --plot -");
}

void draw(const Curve& curve, const std::string& path) { draw({&curve, 1}, path); }

void draw(std::span<const Curve> panels, const std::string& path) {
    for (const auto& curve : panels) {
        if (curve.x.empty() || (curve.x.size() < 2 && curve.style == Style::line)) {
            throw Error("there are too few points to draw");
        }
    }
    const auto format = picture_of_name(path);
    OutputFile picture(path);
    {
        Progress progress("drawing");
        const auto script = scratch();
        write_terminal(script.get(), format, panels.size());
        for (const auto& curve : panels) {
            write_panel(script.get(), curve, format == Picture::terminal);
        }
        run_gnuplot(script.get(), picture.stream());
    }
    picture.commit();
}

}  // namespace wavkit::tool
