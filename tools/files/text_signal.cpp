// Text signals in blocks. Header lines are read here; the numbers between them, a piece of the text
// at a time, by the library.
#include <algorithm>
#include <array>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "base/error.hpp"
#include "base/signal.hpp"
#include "files/facts_text.hpp"
#include "files/signal_file.hpp"

namespace wavkit::tool {
namespace {

constexpr long piece_size = 1 << 16;
constexpr long long most_points = 1LL << 48;  // more than any file has

constexpr std::string_view white_space = " \t\n\v\f\r";
bool is_space(int c) { return c == ' ' || (c >= '\t' && c <= '\r'); }

class TextSignal final : public BlockStream {
  public:
    TextSignal(InputFile& input, int number) : input_(input), number_(number) {
        facts.resize(1);
        while (next_part() == Part::line) take_line();
        if (!line_among_values()) return;
        // A line among the values or behind them counts for all of them, so that they are read
        // twice.
        const long first_value = std::ftell(file());
        skip();
        end_ = std::ftell(file());
        std::fseek(file(), first_value, SEEK_SET);
        counted_ = std::exchange(taken_, 0);
        line_at_ = 0;
        ended_ = false;
    }

    double done() const override { return double(std::ftell(file())) / double(input_.size()); }

  private:
    enum class Part { line, values, end };

    std::FILE* file() const { return input_.stream(); }
    int get() const { return getc_unlocked(file()); }

    /// What comes behind the white space; its first character stays in the stream.
    Part next_part() const {
        int c;
        do c = get();
        while (is_space(c));
        if (c == EOF) return Part::end;
        std::ungetc(c, file());
        if (values_left() > 0) return c == '#' ? Part::line : Part::values;
        // A '#' behind the last value begins the next signal. A signal without values has no last
        // one: there the header must be whole first.
        const bool whole = has_complex_ && has_delta_;
        return c == '#' && taken_ == 0 && !whole ? Part::line : Part::end;
    }

    long long values_left() const {
        if (counted_) return *counted_ - taken_;
        return declared_.value_or(most_points) * (complex ? 2 : 1) - taken_;
    }

    /// A '#' line. Once all lines have been seen, those among the values tell nothing new.
    void take_line() {
        std::string line;
        for (int c; (c = get()) != EOF && c != '\n';) {
            if (line.size() < 254) line += char(c);
        }
        if (counted_) return;
        long long whole;
        double spacing;
        if (take_fact(line, facts.front())) return;
        if (std::sscanf(line.c_str(), "#DSP points = %lld", &whole) == 1) {
            declared_ = std::clamp(whole, 0LL, most_points);
        } else if (std::sscanf(line.c_str(), "#DSP complex = %lld", &whole) == 1) {
            complex = whole != 0;
            has_complex_ = true;
        } else if (std::sscanf(line.c_str(), "#DSP delta = %lf", &spacing) == 1) {
            Signal told;  // read as the library reads a number
            parse(line, told);
            delta = told->delta;
            has_delta_ = true;
        }
    }

    /// The offset of the next '#', or of the end; the file stays where it is.
    long next_line() const {
        const long here = std::ftell(file());
        std::array<char, 4096> block;
        long offset = here;
        while (const auto count = std::fread(block.data(), 1, block.size(), file())) {
            const auto first = std::find(block.begin(), block.begin() + count, '#');
            offset += first - block.begin();
            if (first != block.begin() + count) break;
        }
        std::fseek(file(), here, SEEK_SET);
        return offset;
    }

    /// Whether a '#' may come before the last value; the file stays at the first one. Between white
    /// space there is at least one value.
    bool line_among_values() {
        const long here = std::ftell(file());
        line_at_ = next_line();
        if (line_at_ == input_.size() || !declared_) return line_at_ < input_.size();
        long long words = 0;
        bool in_word = false;
        for (long at = here; at < line_at_ && words < values_left(); ++at) {
            const bool space = is_space(get());
            words += !in_word && !space ? 1 : 0;
            in_word = !space;
        }
        std::fseek(file(), here, SEEK_SET);
        return words < values_left();
    }

    /// Some of the text up to the next '#' or the end, and no part of a number.
    std::string piece() {
        const long here = std::ftell(file());
        if (line_at_ <= here) line_at_ = next_line();
        std::string text(std::size_t(std::min(piece_size, line_at_ - here)), '\0');
        text.resize(std::fread(text.data(), 1, text.size(), file()));
        if (here + long(text.size()) == line_at_) return text;
        const auto space = text.find_last_of(white_space);
        if (space != text.npos) {
            text.resize(space);
            std::fseek(file(), here + long(space), SEEK_SET);
        } else {
            const auto at_line = [&] { return here + long(text.size()) == line_at_; };
            for (int c; !at_line() && !is_space(c = get());) text += char(c);
        }
        return text;
    }

    /// Reads all numbers of a text, or with a header as many as that declares; gives the number of
    /// characters that are left, or -1 where something else is among them.
    static long parse(std::string text, Signal& numbers) {
        // (What would begin a binary signal is no number here.)
        if (!text.empty() && begins_binary(static_cast<unsigned char>(text.front()))) return -1;
        std::FILE* const stream = fmemopen(text.data(), text.size(), "r");
        if (!stream) throw std::bad_alloc();
        const int result = dspf_fread(numbers, stream);
        const long rest = long(text.size()) - std::ftell(stream);
        std::fclose(stream);
        return result == 1 ? rest : -1;
    }

    void read_numbers(std::vector<double>& block) {
        const auto text = piece();
        const auto left = values_left();
        Signal numbers;
        long rest = parse(text, numbers);
        if ((rest < 0 || numbers->points > left) && left <= long(text.size())) {
            // Behind its last value another signal begins, whatever it is.
            rest = parse("#DSP points = " + std::to_string(left) + "\n" + text, numbers);
            std::fseek(file(), -rest, SEEK_CUR);
        }
        if (rest < 0) fail_at_signal(input_, number_);
        block.insert(block.end(), numbers.values().begin(), numbers.values().end());
        taken_ += numbers->points;
    }

    void next_block(std::vector<double>& block) override {
        while (block.empty() && !ended_) {
            const auto part = next_part();
            if (part == Part::values) read_numbers(block);
            if (part == Part::line) take_line();
            if (part == Part::end) finish(block);
        }
    }

    void finish(std::vector<double>& block) {
        ended_ = true;
        const long long width = complex ? 2 : 1, odd = taken_ % width;
        block.resize(std::size_t(odd));  // a last imaginary part of 0
        if (declared_ && *declared_ * width != taken_ + odd) {
            throw Error("cannot read " + input_.name() + ": signal " + std::to_string(number_) +
                        " is damaged: it has " + (*declared_ * width < taken_ ? "more" : "fewer") +
                        " values than it says");
        }
        if (counted_) std::fseek(file(), end_, SEEK_SET);
    }

    InputFile& input_;
    int number_;
    std::optional<long long> declared_;  // points, by the header
    std::optional<long long> counted_;   // values, once they have been seen
    bool has_complex_ = false, has_delta_ = false, ended_ = false;
    long long taken_ = 0;  // values
    long line_at_ = 0;     // the next '#' of the file, or one that is passed
    long end_ = 0;         // in the file, of a signal that is read twice
};

}  // namespace

std::unique_ptr<SampleStream> text_signal(InputFile& input, int number) {
    return std::make_unique<TextSignal>(input, number);
}

}  // namespace wavkit::tool
