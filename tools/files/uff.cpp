#include "files/uff.hpp"

#include <algorithm>
#include <array>
#include <cmath>

#include "base/error.hpp"
#include "base/number.hpp"
#include "files/csv_lines.hpp"
#include "files/facts_text.hpp"
#include "files/raw_samples.hpp"
#include "files/time_axis.hpp"

namespace wavkit::tool {
namespace {

/// Columns of a line, without blanks around them.
std::string_view part(std::string_view line, std::size_t first, std::size_t count) {
    return first < line.size() ? trimmed(line.substr(first, count)) : std::string_view();
}

/// Takes the next number off a line. Fields of fixed width may touch each other, and Fortran writes
/// exponents with a D.
std::optional<double> take_field(std::string_view& line) {
    line = line.substr(std::min(line.find_first_not_of(" \t,"), line.size()));
    if (line.empty()) return std::nullopt;
    constexpr std::size_t widest = 40;
    const auto end = line.find_first_of("dD \t");
    if (end >= widest || line[end] == ' ' || line[end] == '\t') return take_number(line);
    std::string text(line.substr(0, widest));
    text[end] = 'e';
    std::string_view rest = text;
    const auto value = take_number(rest);
    line.remove_prefix(text.size() - rest.size());
    return value;
}

/// The header of a data set 58.
struct Header {
    bool binary = false, big = false, even = true, complex = false, wide = false;
    std::uint64_t points = 0, bytes = 0;  // pairs of abscissa and ordinate where uneven
    double start = 0, delta = 1;
    Facts facts;

    std::size_t values_of_point() const { return (complex ? 2 : 1) + (even ? 0 : 1); }
};

/// The lines of a file, set by set.
class Sets {
  public:
    explicit Sets(InputFile& input) : lines_(input) {}

    /// Goes to the values of the next set 58; null at the end.
    std::optional<Header> next() {
        while (lines_.next()) {
            if (!is_end(lines_.text())) continue;
            // The end of one set and the start of another are alike.
            do {
                if (!lines_.next()) return std::nullopt;
            } while (is_end(lines_.text()));
            const auto kind = part(lines_.text(), 0, 6);
            if (kind == "58") return header();
            while (!is_end(lines_.text()) && lines_.next()) {
            }
        }
        return std::nullopt;
    }

    Lines& lines() { return lines_; }
    std::uint64_t offset() const { return std::uint64_t(lines_.behind().offset); }

    /// Behind the bytes of a set.
    void pass(std::uint64_t bytes) {
        auto place = lines_.behind();
        place.offset += long(bytes);
        lines_.go_to(place);
    }

    static bool is_end(std::string_view line) { return trimmed(line) == "-1"; }

  private:
    std::string_view line() {
        if (!lines_.next()) lines_.fail("the data set ends within its header");
        return lines_.text();
    }

    /// Numbers of a line; as many as there should be.
    std::vector<double> numbers(std::string_view text, std::size_t count) const {
        std::vector<double> values;
        while (values.size() < count) {
            const auto value = take_field(text);
            if (!value) lines_.fail("a number is missing in the header of a data set 58");
            values.push_back(*value);
        }
        return values;
    }

    /// A count as the header tells it; no larger than a file may be.
    std::uint64_t count(double value) const {
        if (!(value >= 0 && value <= 9e15)) lines_.fail("a count is out of range");
        return std::uint64_t(value);
    }

    static std::string text_of(std::string_view field) {
        return field.empty() || lower(field) == "none" ? std::string() : readable(field);
    }

    Header header() {
        Header header;
        const auto first = lines_.text();
        header.binary = first.size() > 6 && (first[6] == 'b' || first[6] == 'B');
        if (header.binary) {
            const auto told = numbers(first.substr(7), 4);
            header.big = told[0] == 2;
            if (told[1] != 2) lines_.fail("only numbers of IEEE 754 are read");
            header.bytes = count(told[3]);
        }
        header.facts.name = text_of(part(line(), 0, 80));
        for (int i = 0; i < 5; ++i) line();
        read_data_form(header);
        read_labels(header);
        for (int i = 0; i < 2; ++i) line();
        return header;
    }

    void read_data_form(Header& header) {
        const auto told = numbers(line(), 5);
        const int type = told[0] >= 2 && told[0] <= 6 ? int(told[0]) : 0;
        if (type == 0 || type == 3) lines_.fail("the type of the values is not known");
        header.complex = type > 4;
        header.wide = type % 2 == 0 && type != 2;
        header.points = count(told[1]);
        header.even = told[2] == 1;
        header.start = header.even ? told[3] : 0;
        header.delta = header.even ? told[4] : 1;
        if (!std::isfinite(header.start) || !std::isfinite(header.delta)) {
            lines_.fail("the spacing is not a finite number");
        }
    }

    void read_labels(Header& header) {
        const std::string axis(line());
        const std::string values(line());
        auto& facts = header.facts;
        facts.start = header.start;
        facts.axis_unit = text_of(part(axis, 47, 20));
        const auto kind = part(axis, 0, 10);
        if (facts.axis_unit.empty() && kind == "17") facts.axis_unit = "s";
        if (facts.axis_unit.empty() && kind == "18") facts.axis_unit = "Hz";
        if (facts.name.empty()) facts.name = text_of(part(values, 26, 20));
        facts.unit = text_of(part(values, 47, 20));
    }

    Lines lines_;
};

/// Numbers as text, several to a line.
class TextValues {
  public:
    explicit TextValues(Lines& lines) : lines_(lines) {}

    double next() {
        while (true) {
            rest_ = rest_.substr(std::min(rest_.find_first_not_of(" \t"), rest_.size()));
            if (!rest_.empty()) break;
            if (!lines_.next() || Sets::is_end(lines_.text())) {
                lines_.fail("the data set has fewer values than it says");
            }
            rest_ = lines_.text();
        }
        const auto value = take_field(rest_);
        if (!value) lines_.fail("'" + readable(rest_.substr(0, 20)) + "' is not a number");
        return *value;
    }

  private:
    Lines& lines_;
    std::string_view rest_;
};

/// Numbers as bytes; an uneven abscissa is in single precision where the size tells so.
class ByteValues {
  public:
    ByteValues(InputFile& input, const Header& header, std::uint64_t offset)
        : input_(input), header_(header), offset_(offset) {
        const auto width = header.values_of_point();
        size_ = header.wide ? 8 : 4;
        const bool narrow =
            header.wide && !header.even && header.bytes == header.points * (4 + (width - 1) * 8);
        abscissa_ = narrow ? 4 : size_;
        const auto point = width * size_ - (narrow ? 4 : 0);
        const auto size = std::uint64_t(input.size());
        if (offset > size || header.points > (size - offset) / point) {
            fail_damaged(input, "it is shorter than it says");
        }
        end_ = offset + header.points * point;
    }

    double next() {
        const auto width = header_.values_of_point();
        const bool abscissa = !header_.even && index_ % width == 0;
        ++index_;
        const auto size = abscissa ? abscissa_ : size_;
        if (used_ + size > bytes_.size()) {
            offset_ += used_;
            bytes_ = bytes_at(input_, offset_, std::min<std::uint64_t>(end_ - offset_, 1 << 16));
            used_ = 0;
        }
        const auto* const at = bytes_.data() + used_;
        used_ += size;
        return scalar_at(at, size == 8 ? Scalar::f64 : Scalar::f32, header_.big);
    }

  private:
    InputFile& input_;
    Header header_;
    std::uint64_t offset_, end_ = 0, index_ = 0;
    std::size_t size_ = 4, abscissa_ = 4, used_ = 0;
    std::vector<unsigned char> bytes_;
};

class UffSignal : public SampleStream {
  public:
    UffSignal(InputFile& input, Sets& sets, const Header& header)
        : input_(input), sets_(sets), header_(header), first_(sets.lines().behind()) {
        complex = header.complex;
        length = std::size_t(header.points);
        delta = header.delta;
        facts = {header.facts};
        if (!header.binary &&
            header.points > std::uint64_t(input.size()) / header.values_of_point()) {
            fail_damaged(input, "it is shorter than it says");
        }
        restart();
        if (!header.even) measure_abscissas();
    }

    std::size_t read(std::span<double> values) override {
        const std::size_t width = complex ? 2 : 1;
        const auto count = std::min<std::uint64_t>(values.size() / width, header_.points - taken_);
        for (std::uint64_t i = 0; i < count; ++i) {
            if (!header_.even) check_abscissa();
            for (std::size_t p = 0; p < width; ++p) values[std::size_t(i) * width + p] = value();
            ++taken_;
        }
        return std::size_t(count) * width;
    }

    void skip() override {
        if (header_.binary) {
            sets_.lines().go_to(first_);
            sets_.pass(header_.bytes);
        }
    }

    double done() const override { return double(taken_) / double(header_.points); }

  private:
    void restart() {
        sets_.lines().go_to(first_);
        if (header_.binary) {
            bytes_.emplace(input_, header_, std::uint64_t(first_.offset));
        } else {
            text_.emplace(sets_.lines());
        }
    }

    double value() { return bytes_ ? bytes_->next() : text_->next(); }

    /// The spacing of abscissas is in none of the headers.
    void measure_abscissas() {
        for (std::uint64_t i = 0; i < header_.points; ++i) {
            const double x = value();
            if (!std::isfinite(x)) sets_.lines().fail("an abscissa is not a finite number");
            axis_.add({x, 1.2e-7 * std::fabs(x), sets_.lines().number()});
            for (std::size_t p = 1; p < header_.values_of_point(); ++p) value();
        }
        axis_.end();
        if (const auto fault = axis_.fault(true)) sets_.lines().fail_at(fault->line, fault->what);
        delta = axis_.delta();
        facts[0].start = axis_.start();
        restart();
    }

    void check_abscissa() {
        if (axis_.position(value()) != std::int64_t(taken_)) {
            sets_.lines().fail("the abscissas are not equally spaced");
        }
    }

    InputFile& input_;
    Sets& sets_;
    Header header_;
    Lines::Place first_;
    std::optional<TextValues> text_;
    std::optional<ByteValues> bytes_;
    TimeAxis axis_;
    std::uint64_t taken_ = 0;
};

class UffFile : public SignalSource {
  public:
    UffFile(InputFile& file, const ReadOptions& reading)
        : SignalSource(file, reading), sets_(file) {}

  private:
    std::unique_ptr<SampleStream> following() override {
        const auto header = sets_.next();
        if (!header) return nullptr;
        return std::make_unique<UffSignal>(input(), sets_, *header);
    }

    Sets sets_;
};

}  // namespace

bool looks_like_uff(const std::string& head) {
    const auto end = head.find('\n');
    if (end == head.npos || !head.starts_with("    -1")) return false;
    if (!trimmed(std::string_view(head).substr(6, end - 6)).empty()) return false;
    const auto number = part(std::string_view(head).substr(end + 1, 6), 0, 6);
    return !number.empty() &&
           std::ranges::all_of(number, [](char c) { return c >= '0' && c <= '9'; });
}

std::unique_ptr<SignalSource> open_uff(InputFile& input, const ReadOptions& options) {
    return std::make_unique<UffFile>(input, options);
}

}  // namespace wavkit::tool
