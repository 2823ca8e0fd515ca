// Reading text signals: "#" lines and plain numbers, the same in every locale.
#include <algorithm>
#include <bit>
#include <charconv>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <optional>
#include <string_view>

#include "file/format.hpp"
#include "file/powers_of_ten.hpp"

#if defined(__unix__) || defined(__APPLE__)
#include <sys/stat.h>
#endif

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

/// Whether any number of characters can go back into a stream.
bool can_go_back([[maybe_unused]] std::FILE* stream) {
#if defined(__unix__) || defined(__APPLE__)
    struct stat about;
    return fstat(fileno(stream), &about) == 0 && S_ISREG(about.st_mode);
#else
    return false;
#endif
}

/// Characters of a stream, the first one visible before it is taken. What is visible at the end
/// goes back: the next signal may begin with it.
class Characters {
  public:
    explicit Characters(std::FILE* stream) : stream_(stream) { fetch_one(); }

    int peek() const { return next_ == end_ ? EOF : static_cast<unsigned char>(*next_); }
    void skip() {
        if (++next_ == end_) fetch_one();
    }

    /// What is in view. Where that is little, it becomes more if `values` numbers still have to
    /// come: they take that many characters at least, with a separator between each two. So a
    /// signal as declared never brings a character of the next one into view, apart from the one
    /// behind its last value.
    std::string_view look_ahead(std::int64_t values) {
        const std::size_t rest = std::size_t(end_ - next_);
        if (rest < enough && !at_end_) {
            const auto least = std::min<std::int64_t>(values, capacity) * 2 - 1;
            const std::size_t total = std::min(std::size_t(least), capacity);
            if (total >= enough && is_bulk()) fetch(rest, total - rest);
        }
        return {next_, std::size_t(end_ - next_)};
    }
    void skip(std::size_t n) {
        next_ += n - 1;
        skip();
    }

    bool give_back() {
        const auto rest = end_ - next_;
        if (rest == 0) return true;
        if (rest == 1) return std::ungetc(peek(), stream_) != EOF;
        return std::fseek(stream_, -long(rest), SEEK_CUR) == 0;
    }

  private:
    static constexpr std::size_t capacity = 1 << 14;
    static constexpr std::size_t enough = 64;

    void fetch_one() {
        const int c = next_character(stream_);
        next_ = end_ = text_;
        at_end_ = c == EOF;
        if (!at_end_) *end_++ = char(c);
    }
    void fetch(std::size_t rest, std::size_t more) {
        std::memmove(text_, next_, rest);
        const std::size_t came = std::fread(text_ + rest, 1, more, stream_);
        at_end_ = came < more;
        next_ = text_;
        end_ = text_ + rest + came;
    }
    bool is_bulk() {
        if (!bulk_) bulk_ = can_go_back(stream_);
        return *bulk_;
    }

    std::FILE* stream_;
    char* next_;
    char* end_;
    bool at_end_;
    std::optional<bool> bulk_;
    char text_[capacity];
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

/// The number of eight digits, the first one in the lowest byte: neighbours become pairs, pairs
/// fours, fours one number. Zero bytes in front count as digits 0.
constexpr std::uint64_t joined(std::uint64_t eight) {
    eight &= 0x0F0F0F0F0F0F0F0F;
    eight = (eight * 10 + (eight >> 8)) & 0x00FF00FF00FF00FF;
    eight = (eight * 100 + (eight >> 16)) & 0x0000FFFF0000FFFF;
    return (eight * 10000 + (eight >> 32)) & 0xFFFFFFFF;
}

/// Has bits in those bytes up to the first other one, counted from the lowest, that are no digits.
constexpr std::uint64_t other_than_digits(std::uint64_t eight) {
    constexpr std::uint64_t each = 0x0101010101010101;  // '0' is 0x30, and '9' + 6 is 0x3F
    return (eight & (eight + each * 6) & each * 0xF0) ^ each * '0';
}

/// A plain decimal number while it is being read: digits * 10^exponent. Of more than 19 digits, the
/// number of those that are sure to fit, only the count is right.
struct PlainDecimal {
    std::uint64_t digits = 0;
    int count = 0;
    int exponent = 0;

    void take_digit(char c) { digits = digits * 10 + std::uint64_t(c - '0'); }

    /// Takes the digits before the point: few, mostly.
    const char* take_whole(const char* at, const char* end) {
        const char* const begin = at;
        for (; at != end && is_digit(*at); ++at) take_digit(*at);
        count += int(at - begin);
        return at;
    }

    /// Takes those behind it, eight at a time where the machine has the first byte lowest.
    const char* take_fraction(const char* at, const char* end) {
        constexpr std::uint64_t scale[] = {1, 10, 100, 1000, 10000, 100000, 1000000, 10000000};
        const char* const begin = at;
        if constexpr (std::endian::native == std::endian::little) {
            for (std::uint64_t eight; end - at >= 8; at += 8) {
                std::memcpy(&eight, at, 8);
                if (const std::uint64_t others = other_than_digits(eight)) {
                    const int run = std::countr_zero(others) / 8;
                    // Half of the shift at a time: of no digits nothing stays.
                    digits =
                        digits * scale[run] + joined(eight << (32 - 4 * run) << (32 - 4 * run));
                    at += run;
                    break;
                }
                digits = digits * 100000000 + joined(eight);
            }
        }
        for (; at != end && is_digit(*at); ++at) take_digit(*at);
        count += int(at - begin);
        exponent -= int(at - begin);
        return at;
    }

    /// The nearest value, by one product with a power of ten; false where the 64 bits of the power
    /// do not tell it.
    template <class T>
    bool round([[maybe_unused]] bool negative, [[maybe_unused]] T& value) const {
#if defined(__SIZEOF_INT128__)
        using Limits = std::numeric_limits<T>;
        using Word = std::conditional_t<sizeof(T) == 8, std::uint64_t, std::uint32_t>;
        constexpr int mantissa = Limits::digits - 1, bias = Limits::max_exponent - 1;
        if (count > 19 || exponent < lowest_power || exponent > highest_power) return false;
        if (digits == 0) {
            value = negative ? -T(0) : T(0);
            return true;
        }
        const int zeros = std::countl_zero(digits);
        const Scaled scaled(digits << zeros, exponent);
        const auto high = std::uint64_t(scaled.product >> 64);
        const int shift = 63 - Limits::digits + int(high >> 63);
        const int binary = scaled.exponent - zeros + 64 + shift + mantissa;
        if (binary <= -bias || binary >= bias) return false;
        // What lies below the high word matters next to the middle of two neighbours alone.
        const std::uint64_t half = std::uint64_t(1) << (shift - 1);
        const std::uint64_t rest = high & (2 * half - 1);
        std::uint64_t rounded = (high >> shift) + (rest > half);
        if (rest - (half - 1) < 2 && !scaled.round(64 + shift, rounded)) return false;
        // The highest bit of the mantissa adds one to the exponent, as it does when it is carried.
        const Word sign = Word(negative) << (8 * sizeof(T) - 1);
        value = std::bit_cast<T>((Word(binary + bias - 1) << mantissa) + Word(rounded) + sign);
        return true;
#else
        return false;
#endif
    }
};

/// Reads a number as nearly all are: decimal, of moderate length, white space behind it. Returns
/// how many characters it takes, 0 for anything else.
template <class T>
std::size_t read_plain(std::string_view text, T& value) {
    const char *at = text.data(), *const end = at + text.size();
    if (at == end) return 0;
    const bool negative = *at == '-';
    at += negative;
    const char* const unsigned_part = at;

    PlainDecimal number;
    at = number.take_whole(at, end);
    if (at != end && *at == '.') at = number.take_fraction(at + 1, end);
    if (number.count == 0) return 0;
    if (at != end && lower(*at) == 'e') {
        if (++at != end && *at == '+') ++at;
        if (at == end || (at[-1] == '+' && !is_digit(*at))) return 0;
        int exponent;
        const auto read = std::from_chars(at, end, exponent);
        if (read.ec != std::errc{} || std::abs(exponent) > 9999) return 0;
        number.exponent += exponent;
        at = read.ptr;
    }
    if (at == end || !is_space(*at)) return 0;

    if (!number.round(negative, value)) [[unlikely]] {
        if (std::from_chars(unsigned_part, at, value).ec != std::errc{}) return 0;
        if (negative) value = -value;
    }
    return std::size_t(at - text.data());
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
    /// How many values have to come after so many; any number where none was declared.
    std::int64_t wanted_after(std::int64_t values) const {
        if (!points) return std::numeric_limits<int>::max();
        return *points * (is_complex() ? 2 : 1) - values;
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
    scalar<R> delta = 0;
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

/// Reads plain numbers as far as they are in view, at most so many as have room in `to` and as have
/// to come; returns how many.
template <class T>
std::size_t read_run(Characters& in, std::int64_t wanted, std::span<T> to) {
    const std::string_view view = in.look_ahead(wanted);
    const char *at = view.data(), *const end = at + view.size();
    const std::size_t most = std::size_t(std::min<std::int64_t>(wanted, std::int64_t(to.size())));
    std::size_t count = 0;
    for (; count < most; ++count) {
        const char* number = at;
        while (number != end && is_space(*number)) ++number;
        const std::size_t length = read_plain({number, end}, to[count]);
        if (length == 0) break;
        at = number + length;
    }
    if (at != view.data()) in.skip(std::size_t(at - view.data()));
    return count;
}

/// Room for the next values of a text, of which `wanted` are said to come: for no more than there
/// are already.
template <Record R>
bool make_room(R* x, std::int64_t values, std::int64_t wanted) {
    constexpr std::int64_t least = 1024, most = std::numeric_limits<int>::max();
    if (values > most - least) return false;
    x->points = int(std::min(values + std::max(std::min(values, wanted), least), most));
    return dsp_realloc(x, int(values), 0) == 0;
}

/// Reads values as a flat real sequence, with the header lines before or between them; `values`
/// counts those that were read, also when reading fails.
template <Record R>
bool read_values(R* x, Characters& in, Header& header, std::int64_t& values) {
    for (;;) {
        const std::int64_t wanted = header.wanted_after(values);
        if (values >= x->points && !make_room(x, values, wanted)) return false;
        skip_space(in);
        const int c = in.peek();
        if (c == EOF) return true;
        // A '#' after the last declared value begins the next signal. A signal without values has
        // no last one: there the header must be whole first.
        if (wanted <= 0 && (c != '#' || values > 0 || header.is_whole())) return true;
        if (c == '#') {
            take_header_line(Line(in), header, x);
            continue;
        }
        const std::span room(x->data + values, std::size_t(x->points - values));
        if (const std::size_t count = read_run(in, wanted, room)) {
            values += std::int64_t(count);
            continue;
        }
        if (!read_value(in, x->data[values])) return false;
        ++values;
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
