#include "files/moment.hpp"

#include <array>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <utility>

#include "base/number.hpp"

namespace wavkit::tool {
namespace {

bool is_digit(char c) { return c >= '0' && c <= '9'; }

/// Takes a number of so many digits off the front of a text.
std::optional<int> take_digits(std::string_view& text, std::size_t least, std::size_t most) {
    int value = 0;
    std::size_t count = 0;
    for (; count < most && count < text.size() && is_digit(text[count]); ++count) {
        value = 10 * value + (text[count] - '0');
    }
    if (count < least) return std::nullopt;
    text.remove_prefix(count);
    return value;
}

bool take(std::string_view& text, std::string_view one_of) {
    if (text.empty() || one_of.find(text.front()) == one_of.npos) return false;
    text.remove_prefix(1);
    return true;
}

/// "2026-03-01", "2026/3/1" or "1.3.2026" in days.
std::optional<std::int64_t> take_date(std::string_view& text) {
    auto rest = text;
    const bool day_first = text.find('.') <= 2;
    auto year = take_digits(rest, day_first ? 1 : 4, day_first ? 2 : 4);
    if (!year || rest.empty()) return std::nullopt;
    const char mark = rest.front();
    if (!take(rest, day_first ? "." : "-/")) return std::nullopt;
    const auto month = take_digits(rest, 1, 2);
    if (!month || !take(rest, {&mark, 1})) return std::nullopt;
    auto day = take_digits(rest, day_first ? 4 : 1, day_first ? 4 : 2);
    if (!day) return std::nullopt;
    if (day_first) std::swap(year, day);
    const std::chrono::year_month_day date{std::chrono::year(*year),
                                           std::chrono::month(unsigned(*month)),
                                           std::chrono::day(unsigned(*day))};
    if (!date.ok()) return std::nullopt;
    text = rest;
    return std::chrono::sys_days(date).time_since_epoch().count();
}

/// "12:00", "12:00:00" or "12:00:00.25".
bool take_time(std::string_view& text, Moment& moment) {
    const auto hour = take_digits(text, 1, 2);
    if (!hour || *hour > 24 || !take(text, ":")) return false;
    const auto minute = take_digits(text, 2, 2);
    if (!minute || *minute > 59) return false;
    moment.seconds += *hour * 3600 + *minute * 60;
    moment.timed = true;
    moment.digit = 60;
    if (!take(text, ":")) return true;
    const auto second = take_digits(text, 2, 2);
    if (!second || *second > 60) return false;
    moment.seconds += *second;
    moment.digit = 1;
    if (!take(text, ".,")) return true;
    std::size_t count = 0;
    while (count < text.size() && is_digit(text[count])) ++count;
    if (count == 0) return false;
    moment.fraction = number_in("0." + std::string(text.substr(0, count))).value_or(0);
    moment.digit = std::pow(10.0, -double(count));
    text.remove_prefix(count);
    return true;
}

/// "Z", "+01:00", "+0100" or nothing.
bool take_zone(std::string_view& text, Moment& moment) {
    if (text.empty()) return true;
    moment.utc = true;
    if (take(text, "Z")) return true;
    const int sign = text.front() == '-' ? 1 : -1;
    if (!take(text, "+-")) return false;
    const auto hours = take_digits(text, 2, 2);
    take(text, ":");
    const auto minutes = take_digits(text, 2, 2);
    if (!hours) return false;
    moment.seconds += sign * (*hours * 3600 + minutes.value_or(0) * 60);
    return true;
}

}  // namespace

std::optional<Moment> moment_of(std::string_view text) {
    Moment moment;
    if (const auto days = take_date(text)) {
        moment.dated = true;
        moment.digit = 86400;
        moment.seconds = *days * 86400;
        if (text.empty()) return moment;
        if (!take(text, "T _")) return std::nullopt;
    }
    const bool zoned = moment.dated;
    if (!take_time(text, moment)) return std::nullopt;
    while (take(text, " ")) {
    }
    if (zoned && !take_zone(text, moment)) return std::nullopt;
    return text.empty() ? std::optional(moment) : std::nullopt;
}

double later_start(const Facts& first, const Facts& second) {
    const auto from = moment_of(first.origin), to = moment_of(second.origin);
    const double places = second.start - first.start;
    return from && to ? places + to->since(*from) : places;
}

std::string iso_text(const Moment& moment) {
    auto seconds = moment.seconds;
    auto nanoseconds = std::int64_t(std::llround(moment.fraction * 1e9));
    seconds += nanoseconds / 1000000000;
    nanoseconds %= 1000000000;
    const std::int64_t days = (seconds - ((seconds % 86400) + 86400) % 86400) / 86400;
    const auto rest = int(seconds - days * 86400);
    const std::chrono::year_month_day date{std::chrono::sys_days(std::chrono::days(days))};
    std::array<char, 80> text{};
    std::snprintf(text.data(), text.size(), "%04d-%02u-%02uT%02d:%02d:%02d", int(date.year()),
                  unsigned(date.month()), unsigned(date.day()), rest / 3600, rest / 60 % 60,
                  rest % 60);
    std::string result = text.data();
    if (nanoseconds > 0) {
        std::snprintf(text.data(), text.size(), ".%09d", int(nanoseconds));
        result += text.data();
        while (result.back() == '0') result.pop_back();
    }
    return moment.utc ? result + "Z" : result;
}

}  // namespace wavkit::tool
