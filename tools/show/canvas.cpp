#include "show/canvas.hpp"

#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/text.hpp"
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

std::string problem_with_size(const std::string& text, std::pair<int, int>& size) {
    char rest;
    const int found = std::sscanf(text.c_str(), "%dx%d%c", &size.first, &size.second, &rest);
    const auto fits = [](int pixels) { return pixels >= 200 && pixels <= 10000; };
    const bool good = found == 2 && fits(size.first) && fits(size.second);
    return good ? "" : text + " is no size like 1000x560, each from 200 to 10000";
}

}  // namespace

Picture picture_of_name(const std::string& path) {
    if (path == "-") return Picture::terminal;
    const auto extension = std::filesystem::path(path).extension();
    if (extension == ".png") return Picture::png;
    if (extension == ".svg") return Picture::svg;
    if (extension == ".pdf") return Picture::pdf;
    throw UsageError(
        "a picture's name ends in .png, .svg or .pdf, or is - for the terminal, not '" + path +
        "'");
}

void declare_plot(CLI::App& command, std::string& path, const std::string& what) {
    command
        .add_option("--plot", path,
                    "draw " + what + " into a .png, .svg or .pdf file, or - the terminal")
        ->type_name("FILE");
}

void PictureLook::declare(CLI::App& command) {
    const char* const group = "Picture";
    command.add_option("--title", title, "title of the picture (default: what it shows)")
        ->type_name("TEXT")
        ->group(group);
    command
        .add_option_function<std::string>(
            "--size",
            [this](const std::string& text) {
                size.emplace();
                problem_with_size(text, *size);
            },
            "size in pixels (PDF: hundredths of an inch)")
        ->check([](const std::string& text) {
            std::pair<int, int> ignored;
            return problem_with_size(text, ignored);
        })
        ->type_name("WIDTHxHEIGHT")
        ->group(group);
    command.add_option("--value-unit", value_unit, "unit of the values, for labels: V, Pa ...")
        ->type_name("UNIT")
        ->group(group);
}

Canvas::Canvas(Picture picture, const PictureLook& look, int usual_width, int usual_height)
    : characters(picture == Picture::terminal), picture_(picture) {
    const auto size =
        characters ? terminal_size() : look.size.value_or(std::pair(usual_width, usual_height));
    width = size.first;
    height = size.second;
    font_size_ = picture == Picture::png ? 11 : picture == Picture::svg ? 12 : 8;
    letter_width = characters ? 1 : 7.6;
    line_height = characters ? 1 : 17;
}

void Canvas::begin(std::FILE* script) const {
    std::fputs(
        "set encoding utf8\nset key off\nset tics nomirror out\nset border 3\n"
        "set format '%h'\n",
        script);
    const int w = int(width), h = int(height);
    switch (picture_) {
        case Picture::terminal:
            std::fprintf(script, "set terminal dumb noenhanced size %d,%d\n", w, h);
            return;
        case Picture::png:
            std::fprintf(script, "set terminal pngcairo noenhanced size %d,%d font 'Sans,11'\n", w,
                         h);
            break;
        case Picture::svg:
            std::fprintf(script,
                         "set terminal svg noenhanced standalone size %d,%d font 'Sans,12' "
                         "background '#ffffff'\n",
                         w, h);
            break;
        case Picture::pdf:
            std::fprintf(script,
                         "set terminal pdfcairo noenhanced size %gin,%gin font 'Sans,8' "
                         "fontscale 1\n",
                         width / 100, height / 100);
            break;
    }
    std::fputs("set minussign\nset border lc rgb '#555555'\nset title offset 0,-0.3\n", script);
}

Box Canvas::plot_box(std::size_t panel, std::size_t panels, double right_margin,
                     bool caption) const {
    const double below = characters ? 0 : caption ? 1.6 * line_height : 0.2 * line_height;
    const double share = (height - below) / double(panels);
    const double top = height - share * double(panel);
    const double over = characters ? 3 : 2.3 * line_height;
    const double under = characters ? 3 : 3.5 * line_height;
    return {11 * letter_width, top - share + under, width - right_margin - 3 * letter_width,
            top - over};
}

void Canvas::set_plot_box(std::FILE* script, const Box& box) const {
    std::fprintf(script,
                 "set lmargin at screen %s\nset rmargin at screen %s\n"
                 "set bmargin at screen %s\nset tmargin at screen %s\n",
                 number(box.left / width).c_str(), number(box.right / width).c_str(),
                 number(box.bottom / height).c_str(), number(box.top / height).c_str());
}

std::string Canvas::at(double x, double y) const {
    return "screen " + number(x / width) + ",screen " + number(y / height);
}

void Canvas::write_title(std::FILE* script, const std::string& text) const {
    auto shown = printable(text);
    const auto begins_none = [&](std::size_t i) {
        return i < shown.size() && continues_character(shown[i]);
    };
    const double excess = (1.12 * width_of(shown) - width) / letter_width;
    if (excess > -3) {
        auto from = (shown.size() - std::min(shown.size(), std::size_t(excess + 4))) / 2;
        while (begins_none(from)) ++from;
        auto end = from;
        for (double left = excess + 4; left > 0 && end < shown.size(); --left) {
            do ++end;
            while (begins_none(end));
        }
        shown.replace(from, end - from, "…");
    }
    std::fprintf(script, "set title %s\n", script_text(shown).c_str());
}

void Canvas::write_caption(std::FILE* script, const std::string& text) const {
    if (text.empty() || characters) return;
    // Small pictures have it in small letters.
    const double share = std::min(1.0, 0.92 * (width - 4 * letter_width) / width_of(text));
    std::fprintf(script, "set label %s at %s right font ',%.3g' textcolor rgb '#777777'\n",
                 script_text(text).c_str(), at(width - 3 * letter_width, 0.8 * line_height).c_str(),
                 share * font_size_);
}

double Canvas::width_of(const std::string& text) const {
    return double(letters_in(printable(text))) * letter_width;
}

}  // namespace wavkit::tool
