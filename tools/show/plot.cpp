#include "show/plot.hpp"

#include <algorithm>
#include <array>
#include <cmath>
#include <set>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/progress.hpp"
#include "base/text.hpp"
#include "files/output.hpp"
#include "show/axis.hpp"
#include "show/gnuplot.hpp"
#include "show/placement.hpp"

namespace wavkit::tool {
namespace {

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

/// An axis from end to end.
struct Range {
    double low, high;
    double largest() const { return std::max(std::fabs(low), std::fabs(high)); }
};

/// Room for boxes and dots at the ends.
Range x_range(const Curve& curve) {
    if (curve.x_range) return {curve.x_range->first, curve.x_range->second};
    const double low = curve.x.front(), high = curve.x.back();
    double margin = 0.5 * curve.box_width;
    if (curve.style == Style::dots) margin = low < high ? 0.02 * (high - low) : 1;
    return {low - margin, high + margin};
}

/// The range of the height axis: what is far below the highest value is not worth paper.
Range y_range(const Curve& curve) {
    if (curve.range) return {curve.range->first, curve.range->second};
    double top = *std::ranges::max_element(curve.y);
    for (const auto& mark : curve.marked) top = std::max(top, mark.y);
    if (curve.decibels) {
        const double low = std::max(*std::ranges::min_element(curve.y), top - curve.depth);
        return {std::floor(low / 10) * 10, std::ceil((top + 5) / 10) * 10};
    }
    const double low = *std::ranges::min_element(curve.y);
    if (curve.style == Style::dots) {
        const double margin = low < top ? 0.08 * (top - low) : 1;
        return {low - margin, top + margin};
    }
    return {low < 0 ? 1.15 * low : 0, top > 0 ? 1.15 * top : 1};
}

/// A curve on its part of the page.
class Panel {
  public:
    Panel(std::FILE* script, const Curve& curve, const Canvas& canvas, const Box& box)
        : script_(script),
          curve_(curve),
          canvas_(canvas),
          box_(box),
          across_(x_range(curve)),
          upwards_(y_range(curve)),
          x_(axis_scale(curve.x_label, curve.x_unit, across_.largest())),
          y_(axis_scale(curve.y_label, curve.y_unit, upwards_.largest())),
          points_(thinned(curve, columns())) {}

    void write() const {
        std::fputs("unset label\nunset arrow\n", script_);
        canvas_.set_plot_box(script_, box_);
        std::fprintf(script_, "set xlabel %s\nset ylabel %s\n", script_text(x_.label).c_str(),
                     script_text(y_.label).c_str());
        if (curve_.logarithmic) std::fputs("set logscale x\n", script_);
        write_range('x', across_, x_.factor);
        write_range('y', upwards_, y_.factor);
        const bool given = curve_.y_tics > 0;
        std::fprintf(script_, "set ytics %s\n", given ? number(curve_.y_tics).c_str() : "autofreq");
        write_names();
        write_labels();
    }

    void write_plot() const {
        const bool characters = canvas_.characters;
        if (curve_.style == Style::boxes) {
            const double boxes = double(samples_a_step(curve_, columns()));
            std::fprintf(script_, "set boxwidth %s\n",
                         number(boxes * curve_.box_width * x_.factor).c_str());
        }
        write_data("curve", points_);
        if (!curve_.line.empty()) write_data("line", curve_.line);
        std::fputs("plot ", script_);
        if (curve_.style == Style::line && curve_.filled && !curve_.decibels && !characters) {
            std::fputs("$curve with filledcurves y=0 fc rgb '#1f5fa8' fs transparent solid 0.15, ",
                       script_);
        }
        const bool from_below = curve_.style == Style::boxes && curve_.decibels;
        if (characters) {
            static constexpr std::array looks{"lines", "boxes", "points pt '+'"};
            std::fprintf(script_, "$curve with %s", looks[std::size_t(curve_.style)]);
        } else if (from_below) {
            // Boxes of decibels do not stand on 0, which is no floor.
            std::fprintf(script_,
                         "$curve using 1:2:($1-%s):($1+%s):(%s):2 with boxxyerror fs solid 0.35 "
                         "border rgb '#1f5fa8' fc rgb '#1f5fa8'",
                         number(curve_.box_width / 2 * x_.factor).c_str(),
                         number(curve_.box_width / 2 * x_.factor).c_str(),
                         number(upwards_.low * y_.factor).c_str());
        } else {
            static constexpr std::array looks{"lines lw 1.4 lc",
                                              "boxes fs solid 0.35 border rgb '#1f5fa8' fc",
                                              "points pt 7 ps 0.5 lc"};
            std::fprintf(script_, "$curve with %s rgb '#1f5fa8'", looks[std::size_t(curve_.style)]);
        }
        if (!curve_.line.empty()) std::fputs(", $line with lines lw 2 lc rgb '#c0392b'", script_);
        std::fputc('\n', script_);
    }

  private:
    /// As many points as the picture can tell apart.
    std::size_t columns() const { return canvas_.characters ? 200 : 4000; }

    void write_range(char axis, const Range& range, double factor) const {
        std::fprintf(script_, "set %crange [%s:%s]\n", axis, number(range.low * factor).c_str(),
                     number(range.high * factor).c_str());
    }

    /// Names in place of numbers, as many as there is room for.
    void write_names() const {
        if (curve_.names.empty())
            return std::fputs("set xtics autofreq norotate\n", script_), void();
        const double room = (box_.right - box_.left) / (canvas_.characters ? 7 : 26);
        const auto step = std::size_t(std::ceil(double(curve_.names.size()) / room));
        std::fputs(canvas_.characters ? "set xtics (" : "set xtics rotate by -60 (", script_);
        for (std::size_t i = 0; i < curve_.names.size(); i += step) {
            std::fprintf(script_, "%s%s %zu", i > 0 ? ", " : "",
                         script_text(curve_.names[i]).c_str(), i);
        }
        std::fputs(")\n", script_);
    }

    void write_data(const char* name, const std::vector<Mark>& points) const {
        std::fprintf(script_, "$%s << EOD\n", name);
        auto gap = curve_.gaps.begin();
        for (const auto& [x, y] : points) {
            // Where a line breaks off, another one begins.
            while (gap != curve_.gaps.end() && x >= curve_.x[*gap]) {
                std::fputc('\n', script_);
                ++gap;
            }
            std::fprintf(script_, "%s %s\n", number(x * x_.factor).c_str(),
                         number(y * y_.factor).c_str());
        }
        std::fputs("EOD\n", script_);
    }

    Spot spot(const Mark& mark) const {
        const auto along = [](double value, const Range& range, double low, double high) {
            return low + (value - range.low) / (range.high - range.low) * (high - low);
        };
        return {along(mark.x, across_, box_.left, box_.right),
                along(mark.y, upwards_, box_.bottom, box_.top)};
    }

    /// The frequencies of the peaks, with as many digits as tell them apart.
    std::vector<std::string> names() const {
        std::vector<std::string> result;
        for (int digits = 4; digits <= 9; ++digits) {
            result.clear();
            for (const auto& mark : curve_.marked) {
                result.push_back(with_prefix(mark.x, curve_.x_unit, digits));
            }
            if (std::set(result.begin(), result.end()).size() == result.size()) break;
        }
        return result;
    }

    /// Peaks are marked, and named where there is room.
    void write_labels() const {
        if (curve_.marked.empty()) return;
        Placement free({box_.left, box_.bottom, canvas_.width, box_.top + canvas_.line_height / 2},
                       canvas_.characters ? 2 : 9);
        std::vector<Spot> line;
        for (const auto& point : points_) line.push_back(spot(point));
        free.avoid_curve(line);
        const double radius = canvas_.characters ? 0 : 4;
        for (const auto& mark : curve_.marked) {
            const auto at = spot(mark);
            free.avoid({at.x - radius, at.y - radius, at.x + radius, at.y + radius});
            if (canvas_.characters) continue;
            std::fprintf(script_, "set label '' at %s point pt 7 ps 0.7 lc rgb '#c0392b' front\n",
                         canvas_.at(at.x, at.y).c_str());
        }
        if (!curve_.named) return;
        const auto names = this->names();
        for (std::size_t i = 0; i < names.size(); ++i) {
            // The way up from the other marks stays free for their labels.
            std::vector<Box> others;
            for (const auto& mark : curve_.marked) {
                const auto at = spot(mark);
                if (&mark == &curve_.marked[i]) continue;
                others.push_back(
                    {at.x - radius, at.y, at.x + radius, at.y + 2 * canvas_.line_height});
            }
            write_label(free, curve_.marked[i], names[i], others);
        }
    }

    /// Frequency and period, or where there is little room the frequency alone, rather than far
    /// off.
    void write_label(Placement& free, const Mark& mark, const std::string& name,
                     std::span<const Box> others) const {
        const auto at = spot(mark);
        const double x = std::fabs(mark.x), near = 4 * canvas_.line_height;
        const auto both = x > 0 ? name + " (" + with_prefix(1 / x, curve_.unit, 4) + ")" : name;
        std::optional<Box> box;
        std::string text;
        for (const double reach : {near, canvas_.height}) {
            for (const auto& wanted : {both, name}) {
                if (box) continue;
                text = wanted;
                box = free.place(at, canvas_.width_of(text), canvas_.line_height, others, reach);
            }
        }
        if (!box) return;
        const double middle = (box->bottom + box->top) / 2;
        const bool before = box->right <= at.x;
        std::fprintf(script_, "set label %s at %s %s front textcolor rgb '#333333'\n",
                     script_text(text).c_str(),
                     canvas_.at(before ? box->right : box->left, middle).c_str(),
                     before ? "right" : "left");
        const double aside = std::max({box->left - at.x, at.x - box->right, 0.0});
        const double apart = std::max(aside, std::max(box->bottom - at.y, 0.0));
        if (canvas_.characters || apart < 14) return;
        const bool above = at.x > box->left && at.x < box->right;
        const double end_x = above ? at.x : at.x <= box->left ? box->left - 2 : box->right + 2;
        std::fprintf(script_, "set arrow from %s to %s nohead lw 0.7 lc rgb '#999999' front\n",
                     canvas_.at(at.x, at.y).c_str(),
                     canvas_.at(end_x, above ? box->bottom : middle).c_str());
    }

    std::FILE* script_;
    const Curve& curve_;
    const Canvas& canvas_;
    Box box_;
    Range across_, upwards_;
    AxisScale x_, y_;
    std::vector<Mark> points_;
};

}  // namespace

void check_apart(const std::string& out, const std::string& picture, bool json) {
    if (int(json) + int(out == "-") + int(picture == "-") < 2) return;
    throw UsageError("standard output takes only one of --json, -o - and --plot -");
}

void draw(const Curve& curve, const std::string& path, const PictureLook& look) {
    draw({&curve, 1}, path, look);
}

void draw(std::span<const Curve> panels, const std::string& path, const PictureLook& look) {
    for (const auto& curve : panels) {
        if (curve.x.empty() || (curve.x.size() < 2 && curve.style == Style::line)) {
            throw DataError("there are too few points to draw");
        }
    }
    const Canvas canvas(picture_of_name(path), look, 1000, panels.size() > 1 ? 880 : 560);
    const auto& caption = panels.front().caption;
    OutputFile picture(path);
    {
        Progress progress("drawing");
        const auto script = scratch();
        std::FILE* const to = script.get();
        canvas.begin(to);
        if (!canvas.characters) std::fputs("set grid lc rgb '#e0e0e0' lt 1\n", to);
        if (panels.size() > 1) std::fputs("set multiplot\n", to);
        for (std::size_t i = 0; i < panels.size(); ++i) {
            const bool named = i == 0 && !look.title.empty();
            canvas.write_title(to, named ? look.title : panels[i].title);
            const Panel panel(to, panels[i], canvas,
                              canvas.plot_box(i, panels.size(), 0, !caption.empty()));
            panel.write();
            if (i == 0) canvas.write_caption(to, caption);
            panel.write_plot();
        }
        run_gnuplot(to, picture.stream());
        if (canvas.characters && !caption.empty()) {
            std::fprintf(picture.stream(), "%s\n", printable(caption).c_str());
        }
    }
    picture.commit();
}

}  // namespace wavkit::tool
