#include "files/csv_columns.hpp"

#include <algorithm>
#include <array>
#include <cmath>

#include "base/number.hpp"
#include "files/moment.hpp"

namespace wavkit::tool {
namespace {

bool names_a_count(std::string_view name) {
    static constexpr std::array<std::string_view, 10> words{
        "sample", "samples", "index", "n", "no", "no.", "nr", "#", "point", "row"};
    return std::ranges::count(words, lower(name)) > 0;
}

/// The part of a complex signal that a name means: 0 re, 1 im.
std::optional<int> part_of_name(std::string_view name) {
    const auto word = lower(name);
    if (word == "re" || word == "real") return 0;
    if (word == "im" || word == "imag" || word == "imaginary") return 1;
    return std::nullopt;
}

class Chooser {
  public:
    Chooser(Table& table, const CsvLayout& layout, const Lines& lines)
        : table_(table), layout_(layout), lines_(lines) {}

    Columns choose() {
        for (const auto& column : layout_.columns) columns_.values.push_back(index_of(column));
        find_time();
        if (columns_.values.empty()) take_the_others();
        if (columns_.values.empty()) fail("no column beside the time");
        const auto& values = columns_.values;
        if (layout_.complex && values.size() != 2) {
            fail("a complex signal takes two columns, not " + std::to_string(values.size()));
        }
        columns_.complex = layout_.complex ||
                           (layout_.pairs && values.size() == 2 && !columns_.time) ||
                           (values.size() == 2 && part_of_name(table_.name(values[0])) == 0 &&
                            part_of_name(table_.name(values[1])) == 1);
        return columns_;
    }

  private:
    [[noreturn]] void fail(const std::string& what) const {
        lines_.fail_at(table_.first_row.number + 1, what);
    }

    std::string field(std::size_t column) const {
        for (const auto& row : table_.sample) {
            if (!is_missing(row[column])) return row[column];
        }
        return {};
    }

    std::size_t index_of(const std::string& wanted) const {
        const auto& headings = table_.headings;
        const auto find = [&](auto equals) -> std::optional<std::size_t> {
            const auto found = std::ranges::find_if(headings, equals);
            if (found == headings.end()) return std::nullopt;
            return std::size_t(found - headings.begin());
        };
        const auto word = lower(wanted);
        const auto whole = lower(heading_of(wanted).name);
        if (const auto exact = find([&](auto& h) { return h.name == wanted; })) return *exact;
        if (const auto any_case = find([&](auto& h) { return lower(h.name) == word; })) {
            return *any_case;
        }
        if (const auto with_unit = find([&](auto& h) {
                return lower(h.name) == whole && h.unit == heading_of(wanted).unit;
            })) {
            return *with_unit;
        }
        const auto number = number_in(wanted);
        if (!number || *number != std::floor(*number) || *number < 1 ||
            *number > double(table_.width)) {
            fail("there is no column '" + wanted + "'" + known_columns());
        }
        return std::size_t(*number) - 1;
    }

    std::string known_columns() const {
        std::string list;
        for (const auto& heading : table_.headings) {
            if (list.size() < 200) list += (list.empty() ? "; there are " : ", ") + heading.name;
        }
        return list;
    }

    bool dated(std::size_t column) const {
        const auto text = field(column);
        return !value_of(text, table_.dialect) && moment_of(text).has_value();
    }

    bool wanted(std::size_t column) const {
        return std::ranges::count(columns_.values, column) > 0;
    }

    void find_time() {
        if (layout_.time) {
            columns_.time = 0;
        } else if (table_.width > 1) {
            find_named_time();
            if (!columns_.time) find_likely_time();
        }
        // An axis that is asked for as a value may be as uneven as any other column.
        if (columns_.time && !layout_.time && wanted(*columns_.time)) columns_.time.reset();
        if (!columns_.time) return;
        const auto next = *columns_.time + 1;
        const auto date = moment_of(field(*columns_.time));
        if (date && date->dated && !date->timed && next < table_.width && dated(next)) {
            columns_.time_of_day = next;
        }
    }

    /// The first column that is called a time, behind one that counts at most.
    void find_named_time() {
        if (table_.headings.empty()) return;
        for (std::size_t i = 0; i < 2; ++i) {
            if (names_an_axis(table_.name(i))) {
                columns_.time = i;
                return;
            }
            const auto& name = table_.name(i);
            if (!names_a_count(name) && !(i == 0 && name.empty())) return;
        }
    }

    void find_likely_time() {
        if (dated(0)) {
            columns_.time = 0;
            guess("column 1 holds dates or times and is taken for the time");
        } else if (!table_.headings.empty() && seconds_of(table_.headings[0].unit) > 0) {
            columns_.time = 0;
            guess("column 1 is in " + table_.headings[0].unit + " and is taken for the time");
        } else if (table_.headings.empty() && layout_.columns.empty() && !layout_.complex &&
                   ascends_evenly(0, 3)) {
            columns_.time = 0;
            guess(
                "column 1 ascends in equal steps and is taken for the time (otherwise --column "
                "1,2)");
        }
    }

    bool ascends_evenly(std::size_t column, std::size_t rows) const {
        std::vector<double> values;
        double digit = 0;
        for (const auto& row : table_.sample) {
            const auto value = value_of(row[column], table_.dialect);
            if (!value) return false;
            digit = std::max(digit, last_digit(row[column]));
            values.push_back(*value);
        }
        if (values.size() < rows) return false;
        const double step = (values.back() - values.front()) / double(values.size() - 1);
        for (std::size_t i = 1; i < values.size(); ++i) {
            const double off = std::fabs(values[i] - values[i - 1] - step);
            if (off > 0.05 * step && off > std::min(1.1 * digit, 0.5 * step)) return false;
        }
        return step > 0;
    }

    /// All but the axis, a column that counts, and columns without any number.
    void take_the_others() {
        std::vector<std::size_t> candidates;
        for (std::size_t i = 0; i < table_.width; ++i) {
            if (i != columns_.time && i != columns_.time_of_day) candidates.push_back(i);
        }
        leave_out(
            candidates, [&](auto i) { return i == 0 && counts(); }, "counts the rows");
        leave_out(
            candidates, [&](auto i) { return holds_no_number(i); }, "holds no numbers");
        columns_.values = candidates;
    }

    bool counts() const {
        if (table_.headings.empty()) return false;
        const auto& name = table_.name(0);
        return (name.empty() || names_a_count(name)) && (columns_.time || ascends_evenly(0, 2));
    }

    bool holds_no_number(std::size_t column) const {
        const auto is_text = [&](const std::string& field) {
            return !is_missing(field) && !value_of(field, table_.dialect);
        };
        return std::ranges::all_of(table_.sample,
                                   [&](const auto& row) { return is_text(row[column]); });
    }

    template <class Test>
    void leave_out(std::vector<std::size_t>& columns, Test test, const std::string& why) {
        std::vector<std::size_t> kept;
        for (const auto column : columns) {
            if (!test(column)) kept.push_back(column);
        }
        if (kept.empty() || kept.size() == columns.size()) return;
        for (const auto column : columns) {
            if (std::ranges::count(kept, column) > 0) continue;
            guess(shown(column) + " " + why + " and is left out");
        }
        columns = kept;
    }

    std::string shown(std::size_t column) const {
        const auto name = table_.name(column);
        return "column " + (name.empty() ? std::to_string(column + 1) : "'" + name + "'");
    }

    void guess(std::string what) { table_.guesses.push_back(std::move(what)); }

    Table& table_;
    const CsvLayout& layout_;
    const Lines& lines_;
    Columns columns_;
};

}  // namespace

Columns columns_of(Table& table, const CsvLayout& layout, const Lines& lines) {
    return Chooser(table, layout, lines).choose();
}

}  // namespace wavkit::tool
