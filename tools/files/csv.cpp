#include "files/csv.hpp"

#include <algorithm>
#include <cctype>
#include <charconv>
#include <cmath>
#include <cstdlib>
#include <optional>
#include <string_view>

#include "base/error.hpp"
#include "base/number.hpp"
#include "files/csv_row.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_values = 8192;

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

/// The lines of a file, without the blanks around them.
class Lines {
  public:
    explicit Lines(InputFile& input) : input_(input) {}
    ~Lines() { std::free(line_); }
    Lines(const Lines&) = delete;
    Lines& operator=(const Lines&) = delete;

    struct Place {
        long offset = 0;
        std::size_t number = 0;
    };

    bool next() {
        const auto count = getline(&line_, &room_, input_.stream());
        if (count < 0) return false;
        before_ = here_;
        here_.offset += long(count);
        ++here_.number;
        text_ = trimmed({line_, std::size_t(count)});
        return true;
    }

    std::string_view text() const { return text_; }
    bool is_comment() const { return text_.starts_with('#'); }
    std::size_t number() const { return here_.number; }
    double done() const { return double(here_.offset) / double(input_.size()); }

    /// The place of the line that next() read, to read it again.
    Place place() const { return before_; }
    void go_to(Place place) {
        std::fseek(input_.stream(), place.offset, SEEK_SET);
        here_ = place;
    }

    [[noreturn]] void fail(const std::string& what) const {
        throw Error(input_.name() + ":" + std::to_string(number()) + ": " + what);
    }

  private:
    InputFile& input_;
    char* line_ = nullptr;
    std::size_t room_ = 0;
    std::string_view text_;
    Place before_, here_;
};

/// A file signal by signal, and a signal row by row.
class CsvReader {
  public:
    CsvReader(InputFile& input, const CsvLayout& layout) : lines_(input), layout_(layout) {}

    /// Goes to the first row of the next signal; the one before must have been read to its end.
    bool next_signal() {
        names_.clear();
        std::optional<double> told;
        while (lines_.next()) {
            if (lines_.is_comment()) take_comment(told);
            if (lines_.text().empty() || lines_.is_comment()) continue;
            separator_ = separator_of(lines_.text());
            split(lines_.text(), separator_, fields_);
            if (take_header()) continue;
            const auto first_row = lines_.place();
            choose_columns();
            delta_ = told.value_or(1.0);
            ended_ = false;
            if (has_time_) measure_times();
            lines_.go_to(first_row);
            ended_ = false;
            return true;
        }
        return false;
    }

    /// Adds what the next rows hold, until the signal ends or there is a block of it.
    void read(std::vector<double>& values) {
        while (values.size() < block_values && next_row()) {
            for (const auto column : columns_) values.push_back(required(column));
            if (has_time_) check_time();
        }
    }

    double delta() const { return delta_; }
    bool complex() const { return columns_.size() == 2; }
    double done() const { return lines_.done(); }

  private:
    void take_comment(std::optional<double>& told) const {
        double delta;
        const std::string text(lines_.text());
        if (std::sscanf(text.c_str(), "# delta = %lf", &delta) == 1) told = delta;
    }

    /// Lines without any number, before the first row, are headers; the last one names the columns.
    bool take_header() {
        if (std::ranges::any_of(
                fields_, [&](auto field) { return value_of(field, separator_).has_value(); })) {
            return false;
        }
        names_.assign(fields_.begin(), fields_.end());
        return true;
    }

    /// Settles, at the first row of a signal, which columns are read.
    void choose_columns() {
        width_ = fields_.size();
        columns_.clear();
        for (const auto& column : layout_.columns) columns_.push_back(column_index(column));
        // An axis that is asked for as a value may be as uneven as any other column.
        const bool wanted = std::ranges::count(columns_, 0u) > 0;
        has_time_ = layout_.time || (!wanted && !names_.empty() && names_an_axis(names_[0]));
        if (!columns_.empty()) return;
        for (std::size_t i = has_time_ ? 1 : 0; i < width_; ++i) columns_.push_back(i);
        if (columns_.empty()) lines_.fail("no column beside the time");
        if (columns_.size() > 2) {
            lines_.fail(std::to_string(width_) +
                        " columns; choose with --column, or --time where the first is the time");
        }
    }

    std::size_t column_index(const std::string& column) const {
        const auto named = std::ranges::find(names_, column);
        if (named != names_.end()) return std::size_t(named - names_.begin());
        std::size_t number = 0;
        const auto [end, error] =
            std::from_chars(column.data(), column.data() + column.size(), number);
        if (error != std::errc() || *end != '\0' || number < 1 || number > width_) {
            lines_.fail("there is no column '" + column + "'");
        }
        return number - 1;
    }

    /// False at the end of the signal.
    bool next_row() {
        while (!ended_ && lines_.next() && !lines_.text().empty()) {
            if (lines_.is_comment()) continue;
            split(lines_.text(), separator_, fields_);
            if (fields_.size() != width_) {
                lines_.fail("expected " + std::to_string(width_) + " fields, found " +
                            std::to_string(fields_.size()));
            }
            return true;
        }
        ended_ = true;
        return false;
    }

    double required(std::size_t column) const {
        const auto field = fields_[column];
        const auto result = value_of(field, separator_);
        if (!result) lines_.fail("'" + std::string(field) + "' is not a number");
        return *result;
    }

    /// The step of the time column is known only at its end: it is read once for the step, and
    /// again, with the values, to see that it keeps to it.
    void measure_times() {
        first_time_ = required(0);
        double last = first_time_;
        std::size_t steps = 0;
        for (; next_row(); ++steps) last = required(0);
        if (steps > 0) delta_ = (last - first_time_) / double(steps);
        rows_ = 0;
    }

    /// Each time may be off by a twentieth of a step, which forgives printed times their rounding
    /// and still shows a single missing sample.
    void check_time() {
        constexpr double tolerance = 0.05;
        const double time = required(0), expected = first_time_ + double(rows_++) * delta_;
        if (delta_ > 0 && std::fabs(time - expected) <= tolerance * delta_) return;
        lines_.fail("the time column is not equally spaced and increasing (" + number(time) +
                    " where " + number(expected) + " was expected)");
    }

    Lines lines_;
    const CsvLayout& layout_;

    // The signal being read.
    char separator_ = blanks;
    std::vector<std::string> names_;
    std::vector<std::string_view> fields_;  // of the line
    std::size_t width_ = 0;                 // fields in a row
    std::vector<std::size_t> columns_;
    double delta_ = 1;
    bool has_time_ = false, ended_ = true;
    double first_time_ = 0;
    std::size_t rows_ = 0;  // whose times have been checked
};

class CsvSignal : public BlockStream {
  public:
    explicit CsvSignal(CsvReader& reader) : reader_(reader) {
        delta = reader.delta();
        complex = reader.complex();
    }

    double done() const override { return reader_.done(); }

  private:
    void next_block(std::vector<double>& block) override { reader_.read(block); }

    CsvReader& reader_;
};

class CsvFile : public SignalSource {
  public:
    CsvFile(InputFile& file, const ReadOptions& reading)
        : SignalSource(file, reading), reader_(file, options().csv) {}

  private:
    std::unique_ptr<SampleStream> following() override {
        if (!reader_.next_signal()) return nullptr;
        return std::make_unique<CsvSignal>(reader_);
    }

    CsvReader reader_;
};

}  // namespace

std::unique_ptr<SignalSource> open_csv(InputFile& input, const ReadOptions& options) {
    return std::make_unique<CsvFile>(input, options);
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

}  // namespace wavkit::tool
