#include "files/facts_text.hpp"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdint>
#include <map>
#include <utility>
#include <vector>

#include "base/number.hpp"
#include "base/text.hpp"
#include "files/csv_row.hpp"

namespace wavkit::tool {
namespace {

const std::map<std::string, double, std::less<>>& time_units() {
    static const std::map<std::string, double, std::less<>> units{{"s", 1},
                                                                  {"sec", 1},
                                                                  {"secs", 1},
                                                                  {"second", 1},
                                                                  {"seconds", 1},
                                                                  {"ms", 1e-3},
                                                                  {"msec", 1e-3},
                                                                  {"us", 1e-6},
                                                                  {"usec", 1e-6},
                                                                  {"µs", 1e-6},
                                                                  {"\u03bcs", 1e-6},
                                                                  {"ns", 1e-9},
                                                                  {"nsec", 1e-9},
                                                                  {"ps", 1e-12},
                                                                  {"min", 60},
                                                                  {"minute", 60},
                                                                  {"minutes", 60},
                                                                  {"h", 3600},
                                                                  {"hr", 3600},
                                                                  {"hour", 3600},
                                                                  {"hours", 3600},
                                                                  {"milliseconds", 1e-3},
                                                                  {"microseconds", 1e-6},
                                                                  {"nanoseconds", 1e-9}};
    return units;
}

/// Units that stand in a row of their own without brackets.
bool is_known_unit(std::string_view text) {
    static constexpr std::array<std::string_view, 64> units{
        "V",   "mV",   "µV",   "uV",    "kV",    "Volt", "Volts", "volts", "A",   "mA",
        "µA",  "uA",   "nA",   "kA",    "W",     "mW",   "kW",    "Hz",    "kHz", "MHz",
        "GHz", "Pa",   "hPa",  "kPa",   "MPa",   "bar",  "mbar",  "psi",   "N",   "kN",
        "Nm",  "N·m",  "g",    "kg",    "m",     "mm",   "µm",    "um",    "nm",  "cm",
        "km",  "m/s",  "mm/s", "m/s2",  "m/s^2", "m/s²", "mm/s2", "mm/s²", "°C",  "degC",
        "°F",  "K",    "deg",  "°",     "rad",   "%",    "dB",    "dBm",   "dBV", "Ohm",
        "Ω",   "kOhm", "rpm",  "counts"};
    return std::ranges::count(units, text) > 0 || seconds_of(text) > 0;
}

bool is_utf8(std::string_view text) {
    while (!text.empty()) {
        const auto length = character_length(text);
        if (length == 0) return false;
        text.remove_prefix(length);
    }
    return true;
}

std::string_view behind(std::string_view line, std::string_view what) {
    line = trimmed(line.substr(1));
    if (!line.starts_with(what)) return {};
    line = trimmed(line.substr(what.size()));
    return line.starts_with('=') ? trimmed(line.substr(1)) : std::string_view();
}

}  // namespace

void write_facts(std::FILE* to, const Facts& facts, bool with_names) {
    if (facts.start != 0) std::fprintf(to, "# start = %s\n", number(facts.start).c_str());
    const std::pair<const char*, std::string> texts[] = {{"origin", facts.origin},
                                                         {"axis", facts.axis_unit},
                                                         {"name", with_names ? facts.name : ""},
                                                         {"unit", with_names ? facts.unit : ""}};
    for (const auto& [what, text] : texts) {
        if (!text.empty()) std::fprintf(to, "# %s = %s\n", what, readable(text).c_str());
    }
}

bool take_fact(std::string_view line, Facts& facts) {
    if (!line.starts_with('#')) return false;
    if (const auto start = behind(line, "start"); !start.empty()) {
        const auto value = number_in(start);
        if (value) facts.start = *value;
        return value.has_value();
    }
    const std::pair<const char*, std::string*> texts[] = {{"origin", &facts.origin},
                                                          {"axis", &facts.axis_unit},
                                                          {"name", &facts.name},
                                                          {"unit", &facts.unit}};
    for (const auto& [what, text] : texts) {
        const auto told = behind(line, what);
        if (told.empty()) continue;
        *text = readable(told);
        return true;
    }
    return false;
}

Heading heading_of(std::string_view text) {
    text = trimmed(text);
    static constexpr std::array<std::pair<char, char>, 2> brackets{{{'(', ')'}, {'[', ']'}}};
    for (const auto& [open, close] : brackets) {
        const auto at = text.rfind(open);
        if (text.empty() || text.back() != close || at == text.npos || at == 0) continue;
        return {readable(trimmed(text.substr(0, at))),
                readable(trimmed(text.substr(at + 1, text.size() - at - 2)))};
    }
    for (const char mark : {'/', '_'}) {
        const auto at = text.find(mark);
        if (at == text.npos || at == 0) continue;
        const auto name = trimmed(text.substr(0, at)), unit = trimmed(text.substr(at + 1));
        const bool fits =
            mark == '/' ? is_known_unit(unit) : names_an_axis(name) && seconds_of(unit) > 0;
        if (fits) return {readable(name), readable(unit)};
    }
    return {readable(text), {}};
}

std::string heading(const std::string& name, const std::string& unit) {
    return readable(unit.empty() ? name : name + " (" + unit + ")");
}

bool is_unit(std::string_view text) {
    text = trimmed(text);
    if (text.size() >= 2 && ((text.front() == '(' && text.back() == ')') ||
                             (text.front() == '[' && text.back() == ']'))) {
        return true;
    }
    return is_known_unit(text);
}

double seconds_of(std::string_view unit) {
    const auto found = time_units().find(unit);
    if (found != time_units().end()) return found->second;
    const auto small = time_units().find(lower(unit));
    // "MS" and "S" are written by instruments; megaseconds and siemens have no axis.
    return small != time_units().end() ? small->second : 0;
}

bool names_an_axis(std::string_view text) {
    static constexpr std::array<std::string_view, 12> axes{
        "time",   "timestamp", "datetime", "date", "zeit",      "temps",
        "tiempo", "seconds",   "elapsed",  "utc",  "frequency", "freq"};
    const auto name = lower(text.substr(0, text.find_first_of("([/")));
    std::vector<std::string_view> words;
    for (std::size_t from = 0; from < name.size();) {
        const auto to = std::min(name.find_first_of(" _-.:", from), name.size());
        if (to > from) words.push_back(std::string_view(name).substr(from, to - from));
        from = to + 1;
    }
    if (words.empty()) return false;
    // A single letter is an axis only by itself or with its unit.
    if (words[0] == "t" || words[0] == "f") {
        return words.size() == 1 || (words.size() == 2 && seconds_of(words[1]) > 0);
    }
    return std::ranges::any_of(words, [](auto w) { return std::ranges::count(axes, w) > 0; });
}

std::string readable(std::string_view text) {
    // The characters that Windows-1252 has where Latin-1 has control characters.
    static constexpr std::array<char16_t, 32> between{
        0x20AC, 0x20,   0x201A, 0x192,  0x201E, 0x2026, 0x2020, 0x2021, 0x2C6,  0x2030, 0x160,
        0x2039, 0x152,  0x20,   0x17D,  0x20,   0x20,   0x2018, 0x2019, 0x201C, 0x201D, 0x2022,
        0x2013, 0x2014, 0x2DC,  0x2122, 0x161,  0x203A, 0x153,  0x20,   0x17E,  0x178};
    const bool whole = is_utf8(text);
    std::string result;
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x20 || byte == 0x7F) {
            result += ' ';
        } else if (byte < 0x80 || whole) {
            result += c;
        } else {
            append_utf8(result, byte < 0xA0 ? between[byte - 0x80] : byte);
        }
    }
    return result;
}

void append_utf8(std::string& text, std::uint32_t code) {
    const auto tail = [&](unsigned shift) { text += char(0x80 | (code >> shift & 0x3F)); };
    if (code < 0x80) {
        text += char(code);
    } else if (code < 0x800) {
        text += char(0xC0 | code >> 6);
        tail(0);
    } else if (code < 0x10000) {
        text += char(0xE0 | code >> 12);
        tail(6);
        tail(0);
    } else {
        text += char(0xF0 | code >> 18);
        tail(12);
        tail(6);
        tail(0);
    }
}

void tell_of_lost_spacing(double delta) {
    if (delta == 1) return;
    std::fprintf(stderr, "wavkit: this format holds no spacing: that of the signal, %s, is lost\n",
                 number(delta).c_str());
}

void tell_of_lost_start(const Facts& facts) {
    if (!facts.placed()) return;
    const auto start = facts.origin.empty() ? number(facts.start)
                       : facts.start == 0   ? facts.origin
                                            : number(facts.start) + " after " + facts.origin;
    std::fprintf(stderr,
                 "wavkit: this format holds no start: that the signal begins at %s is lost (--to "
                 "text and csv keep it)\n",
                 readable(start).c_str());
}

}  // namespace wavkit::tool
