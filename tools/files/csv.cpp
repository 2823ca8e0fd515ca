#include "files/csv.hpp"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <limits>
#include <optional>
#include <string_view>

#include "base/error.hpp"
#include "base/number.hpp"
#include "files/csv_columns.hpp"
#include "files/csv_lines.hpp"
#include "files/csv_table.hpp"
#include "files/encoding.hpp"
#include "files/gap_filler.hpp"
#include "files/time_axis.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_values = 8192;
constexpr std::int64_t longest_gap = 10000000;  // rows that --missing puts in one place
constexpr double nothing = std::numeric_limits<double>::quiet_NaN();

/// A file table by table, and a table row by row, as often as it is asked for.
class CsvReader {
  public:
    CsvReader(InputFile& input, const CsvLayout& layout) : lines_(input), layout_(layout) {}

    void guess(const std::string& what) { guesses_.push_back(what); }

    /// Goes to the next table, behind the one before.
    bool next_table() {
        if (end_) lines_.go_to(*end_);
        if (!end_ && !ended_) {
            while (next_row()) {
            }
        }
        auto table = tool::next_table(lines_, layout_);
        if (!table) return false;
        table_ = std::move(*table);
        columns_ = columns_of(table_, layout_, lines_);
        end_.reset();
        delta_ = table_.delta.value_or(1.0);
        settle_facts();
        if (columns_.time) measure_times();
        tell_guesses();
        return true;
    }

    const Columns& columns() const { return columns_; }
    double delta() const { return delta_; }
    double done() const { return lines_.done(); }

    Facts facts(std::size_t column) const {
        auto facts = table_.facts;
        if (!table_.headings.empty() && !columns_.complex) {
            const auto& heading = table_.headings[column];
            const bool usual = lower(heading.name) == "value" && columns_.values.size() == 1;
            if (!usual) facts.name = heading.name;
            facts.unit = heading.unit;
        }
        return facts;
    }

    /// Begins to read some of the columns, at the first row.
    void begin(std::vector<std::size_t> columns) {
        chosen_ = std::move(columns);
        row_.resize(chosen_.size());
        filler_.emplace(layout_.missing, chosen_.size());
        position_ = -1;
        start_rows();
    }

    /// Adds what the next rows hold, until the table ends or there is a block of it.
    void read(std::vector<double>& values) {
        while (values.size() < block_values && next_row()) {
            if (columns_.time && !check_time(values)) continue;
            for (std::size_t i = 0; i < chosen_.size(); ++i) row_[i] = value(chosen_[i]);
            put(values);
        }
        if (!ended_ || filled_) return;
        filled_ = true;
        if (!filler_->finish(values)) lines_.fail("a column holds no values");
    }

  private:
    void start_rows() {
        lines_.go_to(table_.first_row);
        ended_ = filled_ = false;
    }

    void put(std::vector<double>& values) {
        if (layout_.missing == Missing::error) {
            values.insert(values.end(), row_.begin(), row_.end());
        } else {
            filler_->add(row_, values);
        }
    }

    /// False at the end of the table.
    bool next_row() {
        while (!ended_ && lines_.next() && !lines_.is_empty()) {
            if (lines_.is_comment()) continue;
            const char separator = table_.dialect.separator;
            split(lines_.text(), separator, fields_);
            // An empty last field looks like a separator at the end.
            if (fields_.size() + 1 == table_.width && trimmed_end(lines_.text()) == separator) {
                fields_.emplace_back();
            }
            if (fields_.size() != table_.width) {
                lines_.fail("expected " + std::to_string(table_.width) + " fields, found " +
                            std::to_string(fields_.size()));
            }
            return true;
        }
        if (!ended_) end_ = lines_.behind();
        ended_ = true;
        return false;
    }

    static char trimmed_end(std::string_view line) {
        while (line.ends_with(' ')) line.remove_suffix(1);
        return line.empty() ? '\0' : line.back();
    }

    double value(std::size_t column) const {
        const auto field = fields_[column];
        if (const auto result = value_of(field, table_.dialect)) return *result;
        const std::string text(field);
        if (!is_missing(field)) lines_.fail("'" + text + "' is not a number");
        if (layout_.missing != Missing::error) return nothing;
        const auto name = table_.name(column);
        lines_.fail("the value" + (name.empty() ? "" : " of '" + name + "'") + " is missing" +
                    (text.empty() ? "" : " ('" + text + "')") +
                    "; --missing hold or linear fills it in");
    }

    /// A time of the column on the axis.
    double scaled(double time) const {
        return scale_ < 1 ? time / std::round(1 / scale_) : time * scale_;
    }

    void settle_facts() {
        auto& facts = table_.facts;
        scale_ = 1;
        if (!columns_.time || table_.headings.empty()) return;
        const auto& heading = table_.headings[*columns_.time];
        const double seconds = seconds_of(heading.unit);
        facts.axis_unit = seconds > 0 ? "s" : heading.unit;
        if (heading.unit.empty() && lower(heading.name).starts_with("seconds")) {
            facts.axis_unit = "s";
        }
        if (seconds <= 0 || seconds == 1) return;
        scale_ = seconds;
        guess("times in " + heading.unit + " are taken in seconds");
    }

    std::optional<RowTime> row_time() {
        const auto field = fields_[*columns_.time];
        if (field.empty() && std::ranges::all_of(fields_, is_missing)) return std::nullopt;
        const auto beside = columns_.time_of_day ? fields_[*columns_.time_of_day] : "";
        auto time = (*times_)(field, beside);
        if (!time || !std::isfinite(time->value)) {
            lines_.fail("'" + std::string(field) + "' is no time");
        }
        time->line = lines_.number();
        return time;
    }

    /// The step of the time column is known only at its end: it is read once for the step, and
    /// again, with the values, to see that it keeps to it.
    void measure_times() {
        times_.emplace(table_.dialect);
        axis_ = {};
        start_rows();
        while (next_row()) {
            if (const auto time = row_time()) axis_.add(*time);
        }
        axis_.end();
        if (const auto fault = axis_.fault(layout_.missing == Missing::error)) {
            lines_.fail_at(fault->line, fault->what);
        }
        delta_ = scaled(axis_.delta());
        table_.facts.start = scaled(axis_.start());
        if (const auto& origin = times_->origin()) {
            table_.facts.origin = iso_text(*origin);
            table_.facts.axis_unit = "s";
        }
    }

    /// Puts in the rows that are missing before this one. False for a row of nothing.
    bool check_time(std::vector<double>& values) {
        const auto time = row_time();
        if (!time) return false;
        const auto position = axis_.position(time->value);
        const auto missing = position ? *position - position_ - 1 : 0;
        const bool fits =
            position && (missing == 0 || (missing > 0 && layout_.missing != Missing::error));
        if (!fits) {
            const double expected = axis_.start() + double(position_ + 1) * axis_.delta();
            lines_.fail("the time column is not equally spaced and increasing (" +
                        number(time->value) + " where " + number(expected) + " was expected)");
        }
        if (missing > longest_gap) {
            lines_.fail(std::to_string(missing) + " missing samples are too many to fill in");
        }
        std::ranges::fill(row_, nothing);
        for (std::int64_t i = 0; i < missing; ++i) put(values);
        position_ = *position;
        return true;
    }

    void tell_guesses() {
        guesses_.insert(guesses_.end(), table_.guesses.begin(), table_.guesses.end());
        std::string line;
        for (const auto& what : guesses_) line += (line.empty() ? "" : "; ") + what;
        if (!line.empty()) {
            std::fprintf(stderr, "wavkit: %s: %s\n", readable(lines_.name()).c_str(),
                         readable(line).c_str());
        }
        guesses_.clear();
    }

    Lines lines_;
    const CsvLayout& layout_;
    std::vector<std::string> guesses_;

    Table table_;
    Columns columns_;
    std::optional<Lines::Place> end_;  // of the table, once it has been read
    double delta_ = 1, scale_ = 1;     // of times to the axis
    std::optional<TimeReader> times_;
    TimeAxis axis_;

    // The rows as they are read.
    std::vector<std::size_t> chosen_;
    std::vector<std::string_view> fields_;  // of the line
    std::vector<double> row_;
    std::optional<GapFiller> filler_;
    std::int64_t position_ = -1;  // of the row on the axis
    bool ended_ = true, filled_ = true;
};

/// Some columns of a table.
class CsvSignal : public BlockStream {
  public:
    CsvSignal(CsvReader& reader, const std::vector<std::size_t>& columns) : reader_(reader) {
        delta = reader.delta();
        complex = reader.columns().complex;
        channels = complex ? 1 : columns.size();
        for (const auto column : columns) facts.push_back(reader.facts(column));
        reader.begin(columns);
    }

    /// Other columns are read from the first row, and other tables from the end of this one.
    void skip() override {}

    double done() const override { return reader_.done(); }

  private:
    void next_block(std::vector<double>& block) override { reader_.read(block); }

    CsvReader& reader_;
};

class CsvFile : public SignalSource {
  public:
    CsvFile(InputFile& file, const ReadOptions& reading, bool together)
        : SignalSource(file, reading),
          together_(together),
          decoded_(in_utf8(file)),
          reader_(decoded_ ? *decoded_ : file, options().csv) {
        if (encoding_.encoding > Encoding::utf8_marked && !encoding_.marked) {
            reader_.guess("the text is taken for UTF-16");
        }
    }

  private:
    std::unique_ptr<InputFile> in_utf8(InputFile& file) {
        encoding_ = encoding_of(file.head(4096));
        if (encoding_.encoding > Encoding::utf8_marked) return decoded(file, encoding_.encoding);
        if (encoding_.marked) std::fseek(file.stream(), 3, SEEK_SET);
        return nullptr;
    }

    std::unique_ptr<SampleStream> following() override {
        if (left_.empty()) {
            if (!reader_.next_table()) return nullptr;
            left_ = reader_.columns().values;
        }
        std::vector<std::size_t> columns = std::exchange(left_, {});
        if (!together_ && !reader_.columns().complex) {
            left_.assign(columns.begin() + 1, columns.end());
            columns.resize(1);
        }
        return std::make_unique<CsvSignal>(reader_, columns);
    }

    bool together_;
    EncodingGuess encoding_;
    std::unique_ptr<InputFile> decoded_;  // where the file is in another encoding
    CsvReader reader_;
    std::vector<std::size_t> left_;  // columns of the table that have not been asked for
};

/// Whether a line may begin a plain list of numbers.
bool begins_with_number(std::string_view line) {
    const std::string word(line.substr(0, line.find_first_of(" \t")));
    char* end = nullptr;
    std::strtod(word.c_str(), &end);
    return end != word.c_str();
}

}  // namespace

std::unique_ptr<SignalSource> open_csv(InputFile& input, const ReadOptions& options,
                                       bool together) {
    return std::make_unique<CsvFile>(input, options, together);
}

bool looks_like_csv(const std::string& head) {
    bool told = false;
    std::size_t start = 0;
    while (start < head.size()) {
        const auto end = std::min(head.find('\n', start), head.size());
        const auto line = trimmed(std::string_view(head).substr(start, end - start));
        start = end + 1;
        if (line.starts_with("#DSP")) return false;
        if (line.starts_with("# delta =") || line.starts_with("# start =")) told = true;
        if (line.empty() || line.starts_with('#')) continue;
        // Of a text signal, a header may stand behind the first value as well.
        if (line.find_first_of(",;:") != line.npos || !begins_with_number(line)) return true;
        return told && head.find("\n#DSP") == head.npos;
    }
    return false;
}

}  // namespace wavkit::tool
