// Dates and times of day as files of measurement write them.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "base/facts.hpp"

namespace wavkit::tool {

/// A date with a time, or a time of the day alone. Seconds count from the start of 1970, or of the
/// day, and are kept apart from their fraction, which loses nothing to them.
struct Moment {
    std::int64_t seconds = 0;
    double fraction = 0;
    bool dated = false, timed = false;
    bool utc = false;  // told with a time zone
    double digit = 1;  // the step of the last digit, in seconds

    double since(const Moment& other) const {
        return double(seconds - other.seconds) + (fraction - other.fraction);
    }
};

/// Reads "2026-03-01T12:00:00.25+01:00", "2026/03/01 12:00", "01.03.2026", "12:00:00,25" and the
/// like.
std::optional<Moment> moment_of(std::string_view text);

/// By how much a second signal starts behind a first one, as far as both are told to begin.
double later_start(const Facts& first, const Facts& second);

/// The moment as ISO 8601 has it, down to nanoseconds; with a Z where its zone is known.
std::string iso_text(const Moment& moment);

}  // namespace wavkit::tool
