#include "files/time_axis.hpp"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <cstdlib>

#include "base/number.hpp"

namespace wavkit::tool {
namespace {

constexpr double uneven_step = 0.05;  // of a step, that a time may be off
constexpr std::int64_t most_steps = 1000000000000000000;
constexpr const char* not_even = "the time column is not equally spaced";

/// The decimal of fewest digits near a value, and how many it has.
std::pair<double, int> shortest(double value, double tolerance) {
    for (int digits = 1; digits < 17; ++digits) {
        std::array<char, 40> text{};
        std::snprintf(text.data(), text.size(), "%.*e", digits - 1, value);
        const double rounded = std::strtod(text.data(), nullptr);
        if (std::fabs(rounded - value) <= tolerance) return {rounded, digits};
    }
    return {value, 17};
}

/// "12.5", with as many digits as tell a time from its neighbours.
std::string time_text(double value) {
    std::array<char, 40> text{};
    std::snprintf(text.data(), text.size(), "%.12g", value);
    return text.data();
}

}  // namespace

double simplest(double value, double digit, std::int64_t steps) {
    if (!std::isnormal(value)) return value;
    // A step that the digits hold is itself; another one shows that times are rounded.
    const double held = std::round(value / digit) * digit, noise = 1e-6 * digit;
    if (held > 0 && std::fabs(value - held) <= noise) return shortest(value, noise).first;
    const double tolerance = digit / double(steps);
    const auto [decimal, digits] = shortest(value, tolerance);
    const auto [rate, rate_digits] = shortest(1 / value, tolerance / (value * value));
    return rate_digits < digits ? 1 / rate : decimal;
}

std::optional<RowTime> TimeReader::operator()(std::string_view field,
                                              std::string_view time_of_day) {
    if (plain_) {
        if (const auto value = value_of(field, dialect_)) {
            return RowTime{*value, last_digit(field)};
        }
    }
    auto moment = moment_of(field);
    if (!moment) return std::nullopt;
    if (!time_of_day.empty()) {
        const auto more = moment_of(time_of_day);
        if (!more) return std::nullopt;
        moment->seconds += more->seconds;
        moment->fraction = more->fraction;
        moment->digit = more->digit;
    }
    plain_ = false;
    if (!moment->dated) return RowTime{double(moment->seconds) + moment->fraction, moment->digit};
    if (!origin_) origin_ = moment;
    return RowTime{moment->since(*origin_), moment->digit};
}

void TimeAxis::add(const RowTime& time) {
    digit_ = std::max(digit_ == 0 ? time.digit : std::min(digit_, time.digit),
                      4e-16 * std::fabs(time.value));
    if (step_ > 0) return check(time);
    waiting_.push_back(time);
    if (waiting_.size() == most_waiting) settle();
}

/// The usual step is the median of the first ones.
void TimeAxis::settle() {
    std::vector<double> steps;
    for (std::size_t i = 1; i < waiting_.size(); ++i) {
        steps.push_back(waiting_[i].value - waiting_[i - 1].value);
    }
    if (!steps.empty()) {
        const auto middle = steps.begin() + std::ptrdiff_t((steps.size() - 1) / 2);
        std::ranges::nth_element(steps, middle);
        step_ = *middle;
    }
    first_ = last_ = waiting_.front();
    for (std::size_t i = 1; i < waiting_.size(); ++i) check(waiting_[i]);
    waiting_.clear();
}

void TimeAxis::check(const RowTime& time) {
    const double step = time.value - last_.value;
    if (!(step > 0)) {
        found(time.line, "the time column is not equally spaced and increasing (" +
                             time_text(time.value) + " behind " + time_text(last_.value) + ")");
    } else if (step < 0.5 * step_ && step < step_ - 1.1 * digit_) {
        found(time.line, std::string(not_even) + " (" + time_text(time.value) + " behind " +
                             time_text(last_.value) + ", with steps of " + time_text(step_) + ")");
    }
    // Two rounded times may be off by a digit between them.
    const bool wide = step > std::max(1.5 * step_, step_ + std::min(1.1 * digit_, 0.9 * step_));
    const auto count =
        wide ? std::max<std::int64_t>(std::llround(std::min(step / step_, 9e15)), 1) : 1;
    if (count > 1) {
        if (gap_) ++other_gaps_;
        const auto missing = std::to_string(count - 1) +
                             (count == 2 ? " sample is missing" : " samples are missing");
        if (!gap_) {
            gap_ = {time.line, std::string(not_even) + ": " + missing + " between " +
                                   time_text(last_.value) + " and " + time_text(time.value)};
        }
    }
    steps_ = std::min(steps_ + count, most_steps);
    last_ = time;
}

void TimeAxis::found(std::size_t line, std::string what) {
    if (!uneven_) uneven_ = {line, std::move(what)};
}

void TimeAxis::end() {
    if (!waiting_.empty()) settle();
    if (steps_ == 0) return;
    const double step = (last_.value - first_.value) / double(steps_);
    delta_ = simplest(step, digit_, steps_);
    tolerance_ = std::max(uneven_step * delta_, std::min(0.6 * digit_, 0.45 * delta_));
}

std::optional<TimeAxis::Fault> TimeAxis::fault(bool gaps) const {
    if (uneven_ && (!gaps || !gap_ || uneven_->line <= gap_->line)) return uneven_;
    if (!gaps || !gap_) return uneven_;
    auto fault = *gap_;
    if (other_gaps_ > 0) {
        fault.what += ", and some in " + std::to_string(other_gaps_) +
                      (other_gaps_ == 1 ? " other place" : " other places");
    }
    fault.what += "; --missing hold or linear fills them in";
    return fault;
}

std::optional<std::int64_t> TimeAxis::position(double time) const {
    const double exact = (time - first_.value) / delta_, whole = std::round(exact);
    if (!(std::fabs(exact - whole) * delta_ <= tolerance_) || !(std::fabs(whole) < 9e15)) {
        return std::nullopt;
    }
    return std::int64_t(whole);
}

}  // namespace wavkit::tool
