#include "csv.hpp"

#include <algorithm>
#include <array>
#include <cctype>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <optional>
#include <string_view>

#include "error.hpp"
#include "progress.hpp"

namespace wavkit::tool {
namespace {

constexpr char blanks = ' ';  // stands for any run of blanks between fields

bool is_blank(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; }

std::string_view trimmed(std::string_view text) {
    while (!text.empty() && is_blank(text.front())) text.remove_prefix(1);
    while (!text.empty() && is_blank(text.back())) text.remove_suffix(1);
    return text;
}

char separator_of(std::string_view line) {
    for (const char c : {';', '\t', ','}) {
        if (line.find(c) != line.npos) return c;
    }
    return blanks;
}

/// Cuts a line into fields, without blanks and quotes around them. A separator at the end of the
/// line, as many programs write it, opens no field.
void split(std::string_view line, char separator, std::vector<std::string_view>& fields) {
    fields.clear();
    line = trimmed(line);
    while (!line.empty()) {
        const auto end = separator == blanks ? line.find_first_of(" \t") : line.find(separator);
        auto field = trimmed(line.substr(0, end));
        if (field.size() >= 2 && field.front() == '"' && field.back() == '"') {
            field = trimmed(field.substr(1, field.size() - 2));
        }
        fields.push_back(field);
        line = end == line.npos ? std::string_view() : trimmed(line.substr(end + 1));
    }
}

std::optional<double> value_of(std::string_view field, bool decimal_comma) {
    std::string with_point;
    if (decimal_comma && field.find(',') != field.npos) {
        with_point = field;
        std::ranges::replace(with_point, ',', '.');
        field = with_point;
    }
    if (!field.empty() && field.front() == '+') field.remove_prefix(1);
    double value = 0;
    const auto [end, error] = std::from_chars(field.data(), field.data() + field.size(), value);
    if (end != field.data() + field.size()) return std::nullopt;
    if (error == std::errc::result_out_of_range) {
        return std::strtod(std::string(field).c_str(), nullptr);
    }
    if (error != std::errc()) return std::nullopt;
    return value;
}

std::string lower(std::string_view text) {
    std::string result(text);
    std::ranges::transform(result, result.begin(),
                           [](unsigned char c) { return char(std::tolower(c)); });
    return result;
}

/// Whether a header calls its first column the axis of the others: "time", "t [s]", "frequency".
bool names_an_axis(std::string_view name) {
    const auto word = lower(name.substr(0, name.find_first_of(" ([_/")));
    return word == "time" || word == "t" || word == "frequency" || word == "f";
}

/// One file on its way into signals.
class CsvReader {
  public:
    CsvReader(InputFile& input, const CsvLayout& layout) : input_(input), layout_(layout) {}

    std::vector<Signal> read() {
        Progress progress("reading " + input_.name());
        char* line = nullptr;
        std::size_t room = 0;
        struct Release {
            char*& line;
            ~Release() { std::free(line); }
        } release{line};
        long bytes = 0;
        for (ssize_t count; (count = getline(&line, &room, input_.stream())) >= 0;) {
            ++line_number_;
            take(trimmed({line, std::size_t(count)}));
            bytes += long(count);
            if (line_number_ % 4096 == 0) progress.done(double(bytes) / double(input_.size()));
        }
        finish_signal();
        return std::move(signals_);
    }

  private:
    [[noreturn]] void fail(std::size_t line, const std::string& what) const {
        throw Error(input_.name() + ":" + std::to_string(line) + ": " + what);
    }

    void take(std::string_view line) {
        if (line.empty()) return finish_signal();
        if (line.front() == '#') return take_comment(line);
        if (width_ == 0) separator_ = separator_of(line);
        split(line, separator_, fields_);
        if (width_ == 0 && take_header()) return;
        if (width_ == 0) choose_columns();
        take_row();
    }

    void take_comment(std::string_view line) {
        double delta;
        const std::string text(line);
        if (std::sscanf(text.c_str(), "# delta = %lf", &delta) == 1) next_delta_ = delta;
    }

    /// Lines without any number, before the first row, are headers; the last one names the columns.
    bool take_header() {
        if (std::ranges::any_of(fields_, [&](auto field) { return value(field).has_value(); })) {
            return false;
        }
        names_.assign(fields_.begin(), fields_.end());
        return true;
    }

    std::optional<double> value(std::string_view field) const {
        return value_of(field, separator_ == ';' || separator_ == '\t');
    }

    /// Settles, at the first row of a signal, which columns are read.
    void choose_columns() {
        width_ = fields_.size();
        has_time_ = layout_.time || (!names_.empty() && names_an_axis(names_[0]));
        columns_.clear();
        for (const auto& column : layout_.columns) columns_.push_back(column_index(column));
        if (columns_.empty()) {
            for (std::size_t i = has_time_ ? 1 : 0; i < width_; ++i) columns_.push_back(i);
            if (columns_.empty()) fail(line_number_, "no column beside the time");
            if (columns_.size() > 2) {
                fail(line_number_, std::to_string(width_) +
                                       " columns; choose with --column, or --time where the first "
                                       "is the time");
            }
        }
        current_ = Signal(next_delta_.value_or(1.0));
    }

    std::size_t column_index(const std::string& column) const {
        const auto named = std::ranges::find(names_, column);
        if (named != names_.end()) return std::size_t(named - names_.begin());
        std::size_t number = 0;
        const auto [end, error] =
            std::from_chars(column.data(), column.data() + column.size(), number);
        if (error != std::errc() || *end != '\0' || number < 1 || number > width_) {
            fail(line_number_, "there is no column '" + column + "'");
        }
        return number - 1;
    }

    void take_row() {
        if (fields_.size() != width_) {
            fail(line_number_, "expected " + std::to_string(width_) + " fields, found " +
                                   std::to_string(fields_.size()));
        }
        for (const auto column : columns_) row_.push_back(required(column));
        if (row_.size() >= 8192) flush();
        if (has_time_) {
            times_.push_back(required(0));
            lines_.push_back(line_number_);
        }
    }

    double required(std::size_t column) const {
        const auto field = fields_[column];
        const auto result = value(field);
        if (!result) fail(line_number_, "'" + std::string(field) + "' is not a number");
        return *result;
    }

    void flush() {
        current_.append(row_);
        row_.clear();
    }

    void finish_signal() {
        if (width_ == 0) return;
        flush();
        if (columns_.size() == 2) current_.pair();
        if (has_time_ && times_.size() > 1) current_->delta = spacing();
        signals_.push_back(std::move(current_));
        current_ = Signal();
        next_delta_.reset();
        width_ = 0;
        names_.clear();
        times_.clear();
        lines_.clear();
    }

    /// The step of the time column. Each time may be off by a twentieth of a step, which forgives
    /// printed times their rounding and still shows a single missing sample.
    double spacing() const {
        constexpr double tolerance = 0.05;
        const double steps = double(times_.size() - 1);
        const double step = (times_.back() - times_.front()) / steps;
        for (std::size_t i = 0; i < times_.size(); ++i) {
            const double expected = times_.front() + double(i) * step;
            if (!(std::fabs(times_[i] - expected) <= tolerance * step)) {
                fail(lines_[i], "the time column is not equally spaced and increasing (" +
                                    number(times_[i]) + " where " + number(expected) +
                                    " was expected)");
            }
        }
        return step;
    }

    InputFile& input_;
    const CsvLayout& layout_;
    std::vector<Signal> signals_;

    std::size_t line_number_ = 0;
    std::vector<std::string_view> fields_;

    // The signal being read.
    char separator_ = blanks;
    std::vector<std::string> names_;
    std::optional<double> next_delta_;
    std::size_t width_ = 0;  // fields in a row; 0 before the first row
    bool has_time_ = false;
    std::vector<std::size_t> columns_;
    Signal current_;
    std::vector<double> row_, times_;
    std::vector<std::size_t> lines_;
};

}  // namespace

std::vector<Signal> read_csv(InputFile& input, const CsvLayout& layout) {
    return CsvReader(input, layout).read();
}

void write_csv(std::FILE* to, std::span<const Signal> signals, bool time) {
    Progress progress("writing");
    for (std::size_t s = 0; s < signals.size(); ++s) {
        const Signal& x = signals[s];
        if (s > 0) std::fputc('\n', to);
        if (!time && x->delta != 1) std::fprintf(to, "# delta = %s\n", number(x->delta).c_str());
        std::fprintf(to, "%s%s\n", time ? "time," : "", x->complex ? "re,im" : "value");
        const auto values = x.values();
        const std::size_t width = x->complex ? 2 : 1;
        for (std::size_t i = 0; i < values.size(); i += width) {
            const auto point = i / width;
            if (time) std::fprintf(to, "%s,", number(double(point) * x->delta).c_str());
            std::fputs(number(values[i]).c_str(), to);
            if (width == 2) std::fprintf(to, ",%s", number(values[i + 1]).c_str());
            std::fputc('\n', to);
            if (i % 8192 == 0) progress.done(double(i) / double(values.size()));
        }
    }
}

bool looks_like_csv(const std::string& head) {
    std::size_t start = 0;
    while (start < head.size()) {
        const auto end = std::min(head.find('\n', start), head.size());
        const auto line = trimmed(std::string_view(head).substr(start, end - start));
        if (!line.empty() && line.front() != '#') return line.find_first_of(",;") != line.npos;
        start = end + 1;
    }
    return false;
}

std::string number(double value) {
    std::array<char, 32> text;
    const auto [end, error] = std::to_chars(text.data(), text.data() + text.size(), value);
    return {text.data(), end};
}

}  // namespace wavkit::tool
