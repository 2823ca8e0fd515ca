// Pictures of curves, drawn by gnuplot.
#pragma once

#include <optional>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include "base/mark.hpp"
#include "show/canvas.hpp"

namespace wavkit::tool {

enum class Style { line, boxes, dots };

struct Curve {
    std::string title, x_label, y_label;
    std::string x_unit, y_unit;  // beside the labels; they may get a prefix
    std::string caption;         // what there is to know about it, under the picture
    std::vector<double> x, y;
    Style style = Style::line;
    double box_width = 0;            // of boxes, which stand on their x
    std::vector<std::string> names;  // of the places 0, 1, 2 ... in place of numbers
    std::vector<Mark> line;          // a straight line's two ends, drawn across
    bool decibels = false;
    double depth = 150;        // decibels worth showing below the highest value
    bool filled = true;        // down to 0, unless in decibels
    bool logarithmic = false;  // over the logarithm of x, which is above 0 then
    double y_tics = 0;         // between the numbers at the height axis; 0: as it suits
    // Of the axes, where the points do not choose them.
    std::optional<std::pair<double, double>> range, x_range;
    std::vector<std::size_t> gaps;  // points that begin a line of their own
    std::string unit;               // of the period, for the labels of the peaks
    std::vector<Mark> marked;       // peaks to mark
    bool named = true;              // and to label with their place
};

/// Throws where two of JSON, an output and a picture would go to standard output.
void check_apart(const std::string& out, const std::string& picture, bool json = false);

/// Draws a curve into a file, completely or not at all; "-" is standard output.
void draw(const Curve& curve, const std::string& path, const PictureLook& look = {});

/// The same with several curves, each in a panel below the one before.
void draw(std::span<const Curve> panels, const std::string& path, const PictureLook& look = {});

}  // namespace wavkit::tool
