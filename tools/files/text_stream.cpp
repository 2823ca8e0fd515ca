// Text signals in blocks. Header lines are read here; the numbers between them, a piece of the text
// at a time, by the library.
#include <algorithm>
#include <optional>
#include <string>

#include "base/error.hpp"
#include "files/stream.hpp"

namespace wavkit::tool {
namespace {

constexpr long piece_size = 1 << 16;
constexpr long long most_points = 1LL << 48;  // more than any file has

bool is_space(int c) { return c == ' ' || (c >= '\t' && c <= '\r'); }

class TextStream : public BlockStream {
  public:
    TextStream(InputFile& input, std::optional<int> signal)
        : input_(input), number_(signal.value_or(1)) {
        for (int found = 0; found < number_; ++found) {
            if (found > 0) skip_signal();
            if (peek() == EOF) fail_without_signal(input.name(), found, number_);
            read_header();
        }
    }

    double done() const override {
        return double(std::ftell(input_.stream())) / double(input_.size());
    }

  private:
    [[noreturn]] void fail(const std::string& what) const {
        throw Error("cannot read " + input_.name() + ": signal " + std::to_string(number_) + what);
    }

    /// The next character that is no white space; it stays in the stream.
    int peek() {
        int c;
        do c = getc_unlocked(input_.stream());
        while (is_space(c));
        if (c != EOF) std::ungetc(c, input_.stream());
        return c;
    }

    /// A '#' line; whether it said anything about the signal.
    bool take_line() {
        std::string line;
        for (int c; (c = getc_unlocked(input_.stream())) != EOF && c != '\n';) {
            if (line.size() < 254) line += char(c);
        }
        long long points;
        int complex_flag;
        double spacing;
        if (std::sscanf(line.c_str(), "#DSP points = %lld", &points) == 1) {
            declared_ = std::clamp(points, 0LL, most_points);
        } else if (std::sscanf(line.c_str(), "#DSP complex = %d", &complex_flag) == 1) {
            complex = complex_flag != 0;
        } else if (std::sscanf(line.c_str(), "#DSP delta = %lf", &spacing) == 1) {
            delta = spacing;
            has_delta_ = true;
        } else {
            return false;
        }
        return true;
    }

    /// The lines before the first value. A signal without values ends where its header does.
    void read_header() {
        declared_.reset();
        has_delta_ = false;
        delta = 1;
        complex = false;
        taken_ = 0;
        while (peek() == '#' && !(declared_ == 0 && has_delta_)) take_line();
    }

    std::optional<long long> values_left() const {
        if (!declared_) return std::nullopt;
        return *declared_ * (complex ? 2 : 1) - taken_;
    }

    /// Some of the text up to the next '#' or the end; never so much that the values of the next
    /// signal could be among it, as a value and what separates it take two characters.
    std::string piece() {
        const auto left = values_left();
        const long most = left ? long(std::min<long long>(piece_size, 2 * *left - 1)) : piece_size;
        std::string text;
        for (int c; (c = getc_unlocked(input_.stream())) != EOF;) {
            if (c == '#' || (long(text.size()) >= most && is_space(c))) {
                std::ungetc(c, input_.stream());
                break;
            }
            text += char(c);
        }
        return text;
    }

    void read_numbers(std::string text, std::vector<double>& block) {
        Signal numbers;
        std::FILE* const stream = fmemopen(text.data(), text.size(), "r");
        if (!stream) throw std::bad_alloc();
        const int result = dspf_fread(numbers, stream);
        std::fclose(stream);
        const auto left = values_left();
        if (result != 1 || numbers->points > left.value_or(numbers->points)) {
            fail(" is damaged or no signal (columns of numbers take --from csv)");
        }
        block.insert(block.end(), numbers.values().begin(), numbers.values().end());
        taken_ += numbers->points;
    }

    void next_block(std::vector<double>& block) override { add_values(block); }

    void add_values(std::vector<double>& block) {
        while (block.empty() && !ended_) {
            const int next = values_left() == 0 ? EOF : peek();
            if (next == EOF) {
                finish(block);
            } else if (next != '#') {
                read_numbers(piece(), block);
            } else if (take_line() && taken_ > 0) {
                fail(" has header lines between its values: 'wavkit convert' puts them in order");
            }
        }
    }

    void finish(std::vector<double>& block) {
        ended_ = true;
        if (complex && taken_ % 2 != 0) {
            block.push_back(0);
            ++taken_;
        }
        if (values_left().value_or(0) != 0) fail(" is damaged: it has fewer values than it says");
        last = peek() == EOF;
    }

    void skip_signal() {
        std::vector<double> block;
        do {
            block.clear();
            add_values(block);
        } while (!block.empty());
        ended_ = false;
    }

    InputFile& input_;
    int number_;
    std::optional<long long> declared_;  // points
    bool has_delta_ = false, ended_ = false;
    long long taken_ = 0;  // values
};

}  // namespace

std::unique_ptr<SampleStream> stream_text(InputFile& input, std::optional<int> signal) {
    return std::make_unique<TextStream>(input, signal);
}

}  // namespace wavkit::tool
