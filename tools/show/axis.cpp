#include "show/axis.hpp"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <string_view>

#include "base/number.hpp"
#include "show/labels.hpp"

namespace wavkit::tool {
namespace {

constexpr std::array prefixes{"f", "p", "n", "µ", "m", "", "k", "M", "G", "T"};
constexpr int smallest_power = -15, largest_power = 12;

/// Whether a unit, or what stands before its slash, takes prefixes.
bool takes_prefixes(const std::string& unit) {
    static constexpr std::array<std::string_view, 19> units{
        "Hz", "s", "V", "A", "W", "Pa",  "m",   "g",    "N", "J",
        "F",  "H", "T", "C", "Ω", "ohm", "Ohm", "Vrms", "S"};
    return std::ranges::count(units, std::string_view(unit).substr(0, unit.find('/'))) > 0;
}

int thousands(double value) {
    return value > 0 && std::isfinite(value) ? 3 * int(std::floor(std::log10(value) / 3)) : 0;
}

/// The power of ten that a prefix stands for; long times keep their seconds.
int prefix_power(double value, const std::string& unit) {
    const int most = unit == "s" ? 0 : largest_power;
    return std::clamp(thousands(value), smallest_power, most);
}

std::string prefix(int power) { return prefixes[std::size_t((power - smallest_power) / 3)]; }

std::string superscript(int number) {
    static constexpr std::array digits{"⁰", "¹", "²", "³", "⁴", "⁵", "⁶", "⁷", "⁸", "⁹"};
    std::string text;
    for (const char c : std::to_string(number))
        text += c == '-' ? "⁻" : digits[std::size_t(c - '0')];
    return text;
}

std::string digits_of(double value, int digits) {
    std::array<char, 32> text;
    std::snprintf(text.data(), text.size(), "%.*g", digits, value);
    // No exponent where it only stands for zeros before the point.
    return number(number_in(text.data()).value_or(value));
}

}  // namespace

AxisScale axis_scale(const std::string& name, const std::string& unit, double largest) {
    // A few zeros are easier to read than a prefix.
    const bool plain = largest >= 0.1 && largest < 1000;
    if (plain || largest == 0 || unit.starts_with("dB")) return {1, with_unit(name, unit)};
    if (takes_prefixes(unit)) {
        const int power = prefix_power(largest, unit);
        return {std::pow(10.0, -power), with_unit(name, prefix(power) + unit)};
    }
    if (largest >= 1e-3 && largest < 1e5) return {1, with_unit(name, unit)};
    const int power = thousands(largest);
    if (power == 0) return {1, with_unit(name, unit)};
    return {std::pow(10.0, -power),
            with_unit(name, "10" + superscript(power) + (unit.empty() ? "" : " " + unit))};
}

std::string with_prefix(double value, const std::string& unit, int digits) {
    if (unit.starts_with("1/")) return digits_of(value, digits) + unit.substr(1);
    if (!takes_prefixes(unit)) {
        return digits_of(value, digits) + (unit.empty() ? "" : " " + unit);
    }
    // Rounded first, for 999.99 is 1000 and takes the next prefix.
    const double rounded = number_in(digits_of(value, digits)).value_or(value);
    const int power = prefix_power(std::fabs(rounded) * (1 + 1e-12), unit);
    return digits_of(value * std::pow(10.0, -power), digits) + " " + prefix(power) + unit;
}

}  // namespace wavkit::tool
