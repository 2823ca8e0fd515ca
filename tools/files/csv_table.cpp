#include "files/csv_table.hpp"

#include <algorithm>
#include <array>
#include <cctype>
#include <map>

#include "base/number.hpp"
#include "files/moment.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t most_lines = 300, most_bytes = 1 << 20;  // to look at before reading

struct PeekedLine {
    Lines::Place place;
    std::string text;
    std::size_t block;  // lines between blank ones belong together
};

using Fields = std::vector<std::string_view>;

/// The lines that follow, comments apart.
struct Peeked {
    std::vector<PeekedLine> lines, comments;
};

bool has_digit(std::string_view text) {
    return std::ranges::any_of(text, [](unsigned char c) { return std::isdigit(c) != 0; });
}

Peeked peek(Lines& lines) {
    Peeked peeked;
    std::size_t bytes = 0, block = 0;
    bool parted = false;
    while (peeked.lines.size() < most_lines && bytes < most_bytes && lines.next()) {
        bytes += lines.text().size();
        if (lines.is_empty()) {
            parted = true;
            continue;
        }
        if (std::exchange(parted, false)) ++block;
        auto& list = lines.is_comment() ? peeked.comments : peeked.lines;
        list.push_back({lines.place(), std::string(lines.text()), block});
    }
    return peeked;
}

/// What the fields of a line are.
struct Kinds {
    std::size_t width = 0, numbers = 0, missing = 0, texts = 0;
    bool open = false;  // ends with a separator, behind which a field may be empty

    bool is_row() const { return numbers > 0 && texts == 0; }
    bool is_gap() const { return width > 0 && missing == width; }
    bool has_width(std::size_t wanted) const {
        return width == wanted || (open && width + 1 == wanted);
    }
};

Kinds kinds_of(std::string_view line, const Dialect& dialect, Fields& fields) {
    split(line, dialect.separator, fields);
    Kinds kinds;
    kinds.width = fields.size();
    kinds.open = dialect.separator != blanks && trimmed(line).ends_with(dialect.separator);
    for (const auto field : fields) {
        if (is_missing(field)) {
            ++kinds.missing;
        } else if (value_of(field, dialect) || (has_digit(field) && moment_of(field))) {
            ++kinds.numbers;
        } else {
            ++kinds.texts;
        }
    }
    return kinds;
}

/// The separator under which most lines are rows of numbers, or hold most of them.
Dialect best_dialect(const std::vector<PeekedLine>& lines, const CsvLayout& layout) {
    const bool comma = layout.decimal_comma.value_or(false);
    std::vector<Dialect> candidates{{';', true}, {'\t', true}, {',', comma}, {blanks, true}};
    if (comma) std::swap(candidates[2], candidates[3]);
    if (layout.decimal_comma == false) {
        for (auto& dialect : candidates) dialect.decimal_comma = false;
    }
    Dialect best = candidates.back();
    std::pair<std::size_t, std::size_t> most{0, 0};
    Fields fields;
    for (const auto& dialect : candidates) {
        std::pair<std::size_t, std::size_t> score{0, 0};
        const auto holds = [&](const PeekedLine& line) {
            return dialect.separator == blanks ||
                   line.text.find(dialect.separator) != line.text.npos;
        };
        if (std::ranges::none_of(lines, holds)) continue;
        for (const auto& line : lines) {
            // What may be a decimal comma may also be missing.
            if (dialect.separator != ',' && !holds(line)) continue;
            const auto kinds = kinds_of(line.text, dialect, fields);
            score.first += kinds.is_row() ? 1 : 0;
            score.second += kinds.numbers;
        }
        if (score <= most) continue;
        most = score;
        best = dialect;
    }
    return best;
}

/// The lines of the table that is found, counted in the peeked ones.
struct Found {
    std::size_t first = 0, end = 0;  // rows, as far as they were peeked
    std::size_t width = 0;
};

/// The most frequent width of the lines that fit; of equals, the first.
template <class Fits>
std::size_t usual_width(const std::vector<Kinds>& kinds, std::size_t first, std::size_t end,
                        Fits fits) {
    std::map<std::size_t, std::size_t> counts;
    std::size_t best = 0;
    for (std::size_t i = first; i < end; ++i) {
        if (!fits(kinds[i])) continue;
        ++counts[kinds[i].width];
        if (kinds[i].open) ++counts[kinds[i].width + 1];
    }
    for (std::size_t i = first; i < end; ++i) {
        if (fits(kinds[i]) && counts[kinds[i].width] > counts[best]) best = kinds[i].width;
    }
    return best;
}

/// The first block with rows of numbers alone, or else with numbers at all.
std::optional<Found> find_rows(const std::vector<PeekedLine>& lines, const Dialect& dialect) {
    Fields fields;
    std::vector<Kinds> kinds;
    kinds.reserve(lines.size());
    for (const auto& line : lines) kinds.push_back(kinds_of(line.text, dialect, fields));
    const auto whole = [](const Kinds& k) { return k.is_row(); };
    const auto mixed = [](const Kinds& k) { return k.numbers > 0; };
    for (const bool strict : {true, false}) {
        for (std::size_t start = 0, end = 0; start < lines.size(); start = end) {
            while (end < lines.size() && lines[end].block == lines[start].block) ++end;
            Found found{start, end, 0};
            found.width = strict ? usual_width(kinds, start, end, whole)
                                 : usual_width(kinds, start, end, mixed);
            if (found.width == 0) continue;
            const auto fits = [&](const Kinds& k) {
                return k.has_width(found.width) && (strict ? whole(k) : mixed(k));
            };
            while (!fits(kinds[found.first])) ++found.first;
            // Rows whose values are missing are rows where a heading or another table ends above.
            while (found.first > 0 && kinds[found.first - 1].is_gap() &&
                   kinds[found.first - 1].has_width(found.width)) {
                --found.first;
            }
            return found;
        }
    }
    return std::nullopt;
}

bool all_digits(std::string_view text) {
    return !text.empty() &&
           std::ranges::all_of(text, [](unsigned char c) { return std::isdigit(c) != 0; });
}

/// Whether "1,5" is one number or two.
enum class CommaMeans { separator, perhaps_separator, perhaps_decimal, decimal };

CommaMeans meaning_of_commas(const std::vector<PeekedLine>& lines, const Found& found) {
    if (found.width > 2) return CommaMeans::separator;
    std::size_t with = 0, without = 0;
    std::optional<std::size_t> length;
    bool same_length = true, leading_zero = false;
    for (std::size_t i = found.first; i < found.end; ++i) {
        const auto line = trimmed(lines[i].text);
        const auto comma = line.find(',');
        if (comma == line.npos) {
            ++without;
            continue;
        }
        ++with;
        auto whole = line.substr(0, comma);
        const auto rest = line.substr(comma + 1);
        if (whole.starts_with('-') || whole.starts_with('+')) whole.remove_prefix(1);
        if (whole == "0" && line.starts_with('-')) leading_zero = true;
        if (!all_digits(whole) || !all_digits(rest)) return CommaMeans::separator;
        leading_zero |= rest.size() > 1 && rest.front() == '0';
        same_length &= !length || *length == rest.size();
        length = rest.size();
    }
    if (with == 0) return CommaMeans::separator;
    if (found.first > 0) {
        const auto above = trimmed(lines[found.first - 1].text);
        if (above.find(',') != above.npos) return CommaMeans::separator;
        if (!number_in(above)) return CommaMeans::decimal;
    }
    if (leading_zero || (with > 1 && without > 0)) return CommaMeans::perhaps_decimal;
    return same_length && *length > 1 && with > 2 ? CommaMeans::perhaps_decimal
                                                  : CommaMeans::perhaps_separator;
}

/// Names and units of the columns from the lines above the rows.
class HeadingFinder {
  public:
    HeadingFinder(Table& table, const Peeked& peeked, std::size_t first_row)
        : table_(table), peeked_(peeked), first_row_(first_row) {}

    void find() {
        std::size_t used = 0;
        if (const auto above = fields_above(0); !above.empty()) {
            const auto names = fields_above(1);
            const bool units =
                std::ranges::all_of(above, [](auto& f) { return f.empty() || is_unit(f); });
            if (units && !names.empty()) {
                used = 2;
                take(names, above);
                table_.guesses.push_back("line " + std::to_string(line_above(0)) +
                                         " is taken for the units of the columns");
            } else if (std::ranges::all_of(above, in_brackets)) {
                used = 1;
                take(std::vector<std::string>(above.size()), above);
            } else {
                used = 1;
                take(above, {});
            }
        } else if (first_row_ == 0) {
            take_comment();
        }
        const auto passed = first_row_ - used;
        if (passed == 0) return;
        table_.guesses.push_back(std::to_string(passed) + (passed == 1 ? " line" : " lines") +
                                 " above the table passed over");
    }

  private:
    std::size_t line_above(std::size_t back) const {
        return peeked_.lines[first_row_ - 1 - back].place.number + 1;
    }

    /// The fields of a line so far above the first row, where they fit the columns.
    std::vector<std::string> fields_above(std::size_t back) const {
        if (first_row_ <= back) return {};
        return fitting(peeked_.lines[first_row_ - 1 - back].text);
    }

    std::vector<std::string> fitting(std::string_view line) const {
        Fields fields;
        const char separator = table_.dialect.separator;
        split(line, separator, fields);
        // Between blanks a name may have some of its own, as the name of a single column and
        // units do.
        if (separator == blanks && table_.width == 1) fields = {trimmed(line)};
        if (separator == blanks) join_units(fields);
        while (fields.size() > table_.width && fields.back().empty()) fields.pop_back();
        if (fields.size() + 1 == table_.width && trimmed(line).ends_with(','))
            fields.emplace_back();
        const bool any = std::ranges::any_of(fields, [](auto f) { return !f.empty(); });
        if (fields.size() != table_.width || !any) return {};
        return {fields.begin(), fields.end()};
    }

    static bool in_brackets(std::string_view field) {
        return field.size() > 2 && ((field.front() == '(' && field.back() == ')') ||
                                    (field.front() == '[' && field.back() == ']'));
    }

    static void join_units(Fields& fields) {
        for (std::size_t i = 1; i < fields.size(); ++i) {
            if (!fields[i].starts_with('(') && !fields[i].starts_with('[')) continue;
            const char* const first = fields[i - 1].data();
            const char* const last = fields[i].data() + fields[i].size();
            fields[i - 1] = {first, std::size_t(last - first)};
            fields.erase(fields.begin() + std::ptrdiff_t(i));
            --i;
        }
    }

    void take(const std::vector<std::string>& names, const std::vector<std::string>& units) {
        for (std::size_t i = 0; i < names.size(); ++i) {
            auto heading = heading_of(names[i]);
            if (!units.empty() && !units[i].empty()) {
                const bool bare =
                    std::string_view("([").find(units[i].front()) == std::string_view::npos;
                heading.unit = readable(bare ? units[i] : units[i].substr(1, units[i].size() - 2));
            }
            table_.headings.push_back(heading);
        }
    }

    /// "# time, voltage", as some programs write headers.
    void take_comment() {
        if (peeked_.comments.empty() || table_.width < 2) return;
        const auto& comment = peeked_.comments.back();
        const auto text = trimmed(std::string_view(comment.text));
        if (text.find('=') != text.npos) return;
        take(fitting(trimmed(text.substr(1))), {});
        if (!table_.headings.empty()) {
            table_.guesses.push_back("the comment in line " +
                                     std::to_string(comment.place.number + 1) +
                                     " is taken for the names of the columns");
        }
    }

    Table& table_;
    const Peeked& peeked_;
    std::size_t first_row_;
};

/// Takes in what comments above the rows tell of the signals.
void take_comments(Table& table, std::vector<PeekedLine>& comments) {
    std::erase_if(comments, [&](auto& c) { return c.place.offset > table.first_row.offset; });
    for (const auto& comment : comments) {
        double delta = 0;
        if (std::sscanf(comment.text.c_str(), " # delta = %lf", &delta) == 1) table.delta = delta;
        take_fact(trimmed(comment.text), table.facts);
    }
}

/// Settles whether a comma separates columns; false where it does not.
bool commas_separate(Table& table, const std::vector<PeekedLine>& lines, const Found& found) {
    const auto meaning = meaning_of_commas(lines, found);
    if (meaning == CommaMeans::perhaps_separator) {
        table.guesses.emplace_back(
            "commas are taken to separate columns (otherwise --decimal comma)");
    }
    if (meaning < CommaMeans::perhaps_decimal) return true;
    table.dialect = {blanks, true};
    table.guesses.emplace_back("commas are taken for decimal points (otherwise --decimal point)");
    return false;
}

}  // namespace

std::optional<Table> next_table(Lines& lines, const CsvLayout& layout) {
    for (int i = 0; i < layout.skip && lines.number() < std::size_t(layout.skip); ++i) {
        if (!lines.next()) return std::nullopt;
    }
    auto peeked = peek(lines);
    Table table;
    table.dialect = best_dialect(peeked.lines, layout);
    auto found = find_rows(peeked.lines, table.dialect);
    if (found && table.dialect.separator == ',' && !layout.decimal_comma &&
        layout.columns.empty() && !layout.time && !layout.complex &&
        !commas_separate(table, peeked.lines, *found)) {
        found = find_rows(peeked.lines, table.dialect);
    }
    if (!found) return std::nullopt;
    table.width = found->width;
    table.first_row = peeked.lines[found->first].place;
    take_comments(table, peeked.comments);
    HeadingFinder(table, peeked, found->first).find();
    Fields fields;
    for (auto i = found->first; i < found->end; ++i) {
        split(peeked.lines[i].text, table.dialect.separator, fields);
        fields.resize(table.width);
        table.sample.emplace_back(fields.begin(), fields.end());
    }
    lines.go_to(table.first_row);
    return table;
}

}  // namespace wavkit::tool
