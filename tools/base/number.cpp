#include "base/number.hpp"

#include <array>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstdlib>

namespace wavkit::tool {

std::string number(double value) {
    std::array<char, 32> text;
    const auto [end, error] = std::to_chars(text.data(), text.data() + text.size(), value);
    return {text.data(), end};
}

std::string rounded(double value) {
    if (std::isnan(value)) return "nan";  // without a sign
    double short_value = value;
    for (int digits = 1; digits <= 9; ++digits) {
        std::array<char, 32> text{};
        std::snprintf(text.data(), text.size(), "%.*g", digits, value);
        short_value = std::strtod(text.data(), nullptr);
        if (!(std::fabs(short_value - value) > 5e-9 * std::fabs(value))) break;
    }
    return number(short_value);
}

double time_of(double sample, double delta) {
    const double rate = std::round(1 / delta);
    return 1 / rate == delta ? sample / rate : sample * delta;
}

std::optional<double> take_number(std::string_view& text) {
    if (text.starts_with('+')) text.remove_prefix(1);
    double value = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (error == std::errc::result_out_of_range) {
        value = std::strtod(std::string(text.data(), end).c_str(), nullptr);
    } else if (error != std::errc()) {
        return std::nullopt;
    }
    text.remove_prefix(std::size_t(end - text.data()));
    return value;
}

std::optional<double> number_in(std::string_view text) {
    const auto value = take_number(text);
    return text.empty() ? value : std::nullopt;
}

}  // namespace wavkit::tool
