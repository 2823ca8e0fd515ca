// Reading text signals: "#" lines and plain numbers, the same in every locale.
#include <algorithm>
#include <charconv>
#include <cstdint>
#include <optional>
#include <string_view>

#include "file/format.hpp"

namespace wavkit {
namespace {

int next_character(std::FILE* stream) {
#if defined(_WIN32)
    return _getc_nolock(stream);
#elif defined(__unix__) || defined(__APPLE__)
    return getc_unlocked(stream);
#else
    return std::getc(stream);
#endif
}

/// Characters of a stream, the first one visible before it is taken. What is visible at the end
/// goes back: the next signal may begin with it.
class Characters {
  public:
    explicit Characters(std::FILE* stream) : stream_(stream), next_(next_character(stream)) {}

    int peek() const { return next_; }
    void skip() { next_ = next_character(stream_); }
    bool give_back() { return next_ == EOF || std::ungetc(next_, stream_) != EOF; }

  private:
    std::FILE* stream_;
    int next_;
};

/// The same for the characters of a line.
class LineCharacters {
  public:
    explicit LineCharacters(std::string_view line) : rest_(line) {}

    int peek() const { return rest_.empty() ? EOF : static_cast<unsigned char>(rest_.front()); }
    void skip() { rest_.remove_prefix(1); }

  private:
    std::string_view rest_;
};

constexpr bool is_space(int c) { return c == ' ' || (c >= '\t' && c <= '\r'); }
constexpr bool is_digit(int c) { return c >= '0' && c <= '9'; }
constexpr int lower(int c) { return c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c; }
constexpr bool is_letter(int c) { return lower(c) >= 'a' && lower(c) <= 'z'; }
constexpr bool is_hexadecimal(int c) { return is_digit(c) || (lower(c) >= 'a' && lower(c) <= 'f'); }

template <class Source>
void skip_space(Source& in) {
    while (is_space(in.peek())) in.skip();
}

/// Takes a sign, if there is one; tells whether it was '-'.
template <class Source>
bool take_minus(Source& in) {
    const bool negative = in.peek() == '-';
    if (negative || in.peek() == '+') in.skip();
    return negative;
}

/// A decimal number of any length in bounded memory: digits[0] ... digits[n - 1] * 10^exponent.
/// The middle between two neighbouring doubles has at most 767 significant digits, so of those that
/// find no room it matters only whether one of them is not 0.
class Decimal {
  public:
    void add(int digit, bool fraction) {
        if (kept_ == 0 && digit == '0') {
            exponent_ -= fraction;
        } else if (kept_ < capacity) {
            digits_[kept_++] = char(digit);
            exponent_ -= fraction;
        } else {
            exact_ = exact_ && digit == '0';
            exponent_ += !fraction;
        }
    }
    void scale(std::int64_t exponent) { exponent_ += exponent; }

    /// The nearest value; beyond the range an infinity or 0.
    template <class T>
    T value() {
        if (kept_ == 0) return 0;
        const std::int64_t magnitude = exponent_ + kept_;
        if (!exact_) add_last_digit();
        char* end = digits_ + kept_;
        *end++ = 'e';
        end = std::to_chars(end, std::end(digits_), exponent_).ptr;
        T value = 0;
        if (std::from_chars(digits_, end, value).ec == std::errc{}) return value;
        return magnitude > 0 ? std::numeric_limits<T>::infinity() : 0;
    }

  private:
    static constexpr int capacity = 780;

    void add_last_digit() {
        digits_[kept_++] = '1';
        --exponent_;
    }

    char digits_[capacity + 32];  // and room for one digit more and the exponent
    int kept_ = 0;
    bool exact_ = true;
    std::int64_t exponent_ = 0;
};

template <class Source>
bool read_digits(Source& in, Decimal& number, bool fraction) {
    const bool any = is_digit(in.peek());
    for (; is_digit(in.peek()); in.skip()) number.add(in.peek(), fraction);
    return any;
}

/// An integer; whatever lies beyond `limit` becomes the limit.
template <class Source>
bool read_integer(Source& in, std::int64_t& value, std::int64_t limit) {
    const bool negative = take_minus(in);
    if (!is_digit(in.peek())) return false;
    std::int64_t magnitude = 0;
    for (; is_digit(in.peek()); in.skip()) {
        magnitude = std::min(magnitude * 10 + (in.peek() - '0'), limit);
    }
    value = negative ? -magnitude : magnitude;
    return true;
}

template <class T, class Source>
bool read_decimal(Source& in, T& value) {
    constexpr std::int64_t exponent_limit = std::int64_t(1) << 58;
    Decimal number;
    bool any = read_digits(in, number, false);
    if (in.peek() == '.') {
        in.skip();
        any |= read_digits(in, number, true);
    }
    if (!any) return false;
    if (lower(in.peek()) == 'e') {
        in.skip();
        std::int64_t exponent;
        if (!read_integer(in, exponent, exponent_limit)) return false;
        number.scale(exponent);
    }
    value = number.value<T>();
    return true;
}

template <class Source>
bool read_word(Source& in, std::string_view word) {
    for (const char c : word) {
        if (lower(in.peek()) != c) return false;
        in.skip();
    }
    return true;
}

/// "inf" or "infinity"
template <class Source>
bool read_infinity(Source& in) {
    return read_word(in, "inf") && (lower(in.peek()) != 'i' || read_word(in, "inity"));
}

/// "nan" or, as some runtimes print it, "nan(...)"
template <class Source>
bool read_nan(Source& in) {
    if (!read_word(in, "nan")) return false;
    if (in.peek() != '(') return true;
    do in.skip();
    while (is_digit(in.peek()) || is_letter(in.peek()) || in.peek() == '_');
    return read_word(in, ")");
}

/// Reads the longest run of characters that can begin a number, and fails when it is not a whole
/// one: with a single character in view there is no way back to the "1" of "1e+".
template <class T, class Source>
bool read_number(Source& in, T& value) {
    const bool negative = take_minus(in);
    const int first = lower(in.peek());
    bool read;
    if (first == 'i') {
        read = read_infinity(in);
        value = std::numeric_limits<T>::infinity();
    } else if (first == 'n') {
        read = read_nan(in);
        value = std::numeric_limits<T>::quiet_NaN();
    } else {
        read = read_decimal(in, value);
    }
    if (read && negative) value = -value;
    return read;
}

/// The digits of a hexadecimal integer of 32 bits, higher ones lost; it is taken as signed.
template <class T>
bool read_hexadecimal(Characters& in, bool negative, T& value) {
    if (!is_hexadecimal(in.peek())) return false;
    std::uint32_t word = 0;
    for (; is_hexadecimal(in.peek()); in.skip()) {
        const int c = lower(in.peek());
        word = word << 4 | std::uint32_t(is_digit(c) ? c - '0' : c - 'a' + 10);
    }
    value = T(std::int32_t(negative ? 0 - word : word));
    return true;
}

/// A number, or a hexadecimal integer: one that begins like a 0 and goes on with "x".
template <class T>
bool read_value(Characters& in, T& value) {
    const bool negative = in.peek() == '-';
    if (!read_number(in, value)) return false;
    if (value != 0 || in.peek() != 'x') return true;
    in.skip();
    return read_hexadecimal(in, negative, value);
}

/// What the header lines have told so far.
struct Header {
    std::optional<std::int64_t> points, complex;
    bool has_delta = false;

    bool is_complex() const { return complex.value_or(0) != 0; }
    bool is_whole() const { return points && complex && has_delta; }
    /// Whether that many values are all that was declared.
    bool is_reached(std::int64_t values) const {
        return points && values >= *points * (is_complex() ? 2 : 1);
    }
};

/// Whether a line begins with a label; its blanks stand for white space of any length, even none.
bool take_label(LineCharacters& in, std::string_view label) {
    for (const char c : label) {
        if (c == ' ') {
            skip_space(in);
        } else if (in.peek() == c) {
            in.skip();
        } else {
            return false;
        }
    }
    return true;
}

void take_integer(std::string_view line, std::string_view label,
                  std::optional<std::int64_t>& value) {
    constexpr std::int64_t limit = std::int64_t(1) << 32;  // more points than a record can hold
    LineCharacters in(line);
    std::int64_t read;
    if (take_label(in, label) && read_integer(in, read, limit)) value = read;
}

template <Record R>
void take_header_line(std::string_view line, Header& header, R* x) {
    take_integer(line, points_label, header.points);
    take_integer(line, complex_label, header.complex);
    if (header.points) header.points = std::max<std::int64_t>(*header.points, 0);
    LineCharacters in(line);
    scalar<R> delta;
    if (take_label(in, delta_label) && read_number(in, delta)) {
        x->delta = delta;
        header.has_delta = true;
    }
}

/// A "#" line; of a longer one the first 254 characters count.
class Line {
  public:
    explicit Line(Characters& in) {
        for (; in.peek() != '\n' && in.peek() != EOF; in.skip()) {
            if (length_ < sizeof text_) text_[length_++] = char(in.peek());
        }
        if (in.peek() == '\n') in.skip();
    }
    operator std::string_view() const { return {text_, length_}; }

  private:
    char text_[254];
    std::size_t length_ = 0;
};

/// Room for the next values of a text, whose number nobody knows yet.
template <Record R>
bool make_room(R* x, std::int64_t values, int step) {
    if (values > std::numeric_limits<int>::max() - step) return false;
    x->points = int(values) + step;
    return dsp_realloc(x, int(values), 0) == 0;
}

/// Reads values as a flat real sequence, with the header lines before or between them; `values`
/// counts those that were read, also when reading fails.
template <Record R>
bool read_values(R* x, Characters& in, Header& header, std::int64_t& values) {
    constexpr int growth = 1024;
    if (!make_room(x, values, growth)) return false;
    for (;;) {
        skip_space(in);
        const int c = in.peek();
        if (c == EOF) return true;
        // A '#' after the last declared value begins the next signal. A signal without values has
        // no last one: there the header must be whole first.
        if (header.is_reached(values) && (c != '#' || values > 0 || header.is_whole())) return true;
        if (c == '#') {
            take_header_line(Line(in), header, x);
            continue;
        }
        if (!read_value(in, x->data[values])) return false;
        if (++values % growth == 0 && !make_room(x, values, growth)) return false;
    }
}

}  // namespace

template <Record R>
int read_text(R* x, std::FILE* stream) {
    x->complex = 0;
    x->delta = 1;
    Characters in(stream);
    Header header;
    std::int64_t values = 0;
    bool good = read_values(x, in, header, values);
    good = in.give_back() && good;

    if (header.is_complex()) {
        if (values % 2 != 0) x->data[values++] = 0;  // an odd count has room behind it
        x->complex = 1;
        values /= 2;
    }
    x->points = int(values);
    return good && values == header.points.value_or(values) ? 1 : -1;
}

template int read_text(dsp*, std::FILE*);
template int read_text(dspf*, std::FILE*);

}  // namespace wavkit
