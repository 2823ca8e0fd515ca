// The paper that pictures are drawn on.
#pragma once

#include <CLI/CLI.hpp>
#include <cstdio>
#include <optional>
#include <string>
#include <utility>

#include "base/facts.hpp"
#include "show/placement.hpp"

namespace wavkit::tool {

/// The format of a picture by its name: "-" is a drawing in characters. Throws for others than
/// .png, .svg and .pdf.
enum class Picture { png, svg, pdf, terminal };
Picture picture_of_name(const std::string& path);

/// What a user says of a picture beside its name.
struct PictureLook {
    std::string title, value_unit;
    std::optional<std::pair<int, int>> size;  // in pixels; in a .pdf a hundred are an inch

    /// The unit of the values: the user's, else what is known of them.
    std::string unit_of(const Facts& values) const {
        return value_unit.empty() ? values.unit : value_unit;
    }
    /// Adds the options to a subcommand.
    void declare(CLI::App& command);
};

/// Adds the option --plot, which draws something into a file that it names.
void declare_plot(CLI::App& command, std::string& path, const std::string& what);

/// A page, measured in pixels or characters from its lower left.
class Canvas {
  public:
    Canvas(Picture picture, const PictureLook& look, int width, int height);

    double width, height;
    double letter_width, line_height;  // of its font
    bool characters;

    /// Begins a script: format, font and what all pictures have in common.
    void begin(std::FILE* script) const;

    /// The box of a plot, between margins for its numbers and labels, in one of equal panels.
    Box plot_box(std::size_t panel, std::size_t panels, double right_margin, bool caption) const;
    void set_plot_box(std::FILE* script, const Box& box) const;

    /// A place as scripts take it.
    std::string at(double x, double y) const;

    /// Says something under everything else.
    void write_caption(std::FILE* script, const std::string& text) const;

    /// A title, without its middle where it is wider than the page.
    void write_title(std::FILE* script, const std::string& text) const;

    /// How wide a text is, about.
    double width_of(const std::string& text) const;

  private:
    Picture picture_;
    double font_size_;
};

}  // namespace wavkit::tool
