// Writing signals as text: for programs in full precision, for people as one short line.
#include <algorithm>
#include <charconv>

#include "file/decimal.hpp"
#include "file/format.hpp"

namespace wavkit {
namespace {

/// Text on its way to a stream, gathered in loads of some kilobytes. The stream's own errors stay
/// with the stream.
class TextOutput {
  public:
    explicit TextOutput(std::FILE* stream) : stream_(stream) {}
    ~TextOutput() { flush(); }
    TextOutput(const TextOutput&) = delete;
    TextOutput& operator=(const TextOutput&) = delete;

    void put(char c) {
        make_room();
        *end_++ = c;
    }
    void put(const char* text) {
        for (; *text; ++text) put(*text);
    }
    void put(int number) {
        make_room();
        end_ = std::to_chars(end_, std::end(text_), number).ptr;
    }
    /// As printf's %.{digits}g has it in the C locale.
    template <int digits, class T>
    void put_general(T number) {
        make_room();
        if (char* const end = print_general<digits>(number, end_)) {
            end_ = end;
        } else {
            put(number, std::chars_format::general, digits);
        }
    }
    /// As printf's %.{precision}g or %.{precision}f has it in the C locale.
    template <class T>
    void put(T number, std::chars_format format, int precision) {
        make_room();
        end_ = std::to_chars(end_, std::end(text_), number, format, precision).ptr;
    }

  private:
    static constexpr std::ptrdiff_t longest_number = 48;  // and what is copied along with it

    void make_room() {
        if (std::end(text_) - end_ < longest_number) flush();
    }
    void flush() {
        std::fwrite(text_, 1, std::size_t(end_ - text_), stream_);
        end_ = text_;
    }

    std::FILE* stream_;
    char text_[1 << 14];
    char* end_ = text_;
};

// Significant digits of a text file.
template <Record R>
constexpr int digits = std::same_as<R, dsp> ? 16 : 7;

template <Record R>
void put_header(const R* x, TextOutput& out) {
    out.put("#DSP ASCII data from wavkit package\n");
    out.put(points_label);
    out.put(x->points);
    out.put('\n');
    out.put(complex_label);
    out.put(x->complex);
    out.put('\n');
    out.put(type_label);
    out.put(int(sizeof(scalar<R>)));
    out.put('\n');
    out.put(delta_label);
    out.put_general<digits<R>>(x->delta);
    out.put('\n');
}

/// One line a point.
template <Record R>
void put_data(const R* x, TextOutput& out) {
    const std::size_t numbers_a_line = std::size_t(width(x));
    for (std::size_t i = 0; i < used(x); ++i) {
        out.put_general<digits<R>>(x->data[i]);
        out.put((i + 1) % numbers_a_line ? ' ' : '\n');
    }
}

/// Whole numbers where "%.4g" would lose digits that matter to a reader, short ones elsewhere.
void put_short(double v, TextOutput& out) {
    const bool whole = (v >= 9999 && v <= 999999999) || (v >= -999999999 && v <= -9999);
    if (whole) {
        out.put(v, std::chars_format::fixed, 0);
    } else {
        out.put(v, std::chars_format::general, 4);
    }
}

template <Record R>
void put_extent(const R* x, TextOutput& out) {
    out.put('[');
    put_short(x->points, out);
    out.put('/');
    put_short(x->delta, out);
    out.put(']');
}

template <Record R>
void put_first_points(const R* x, TextOutput& out) {
    constexpr std::size_t shown = 32;
    for (std::size_t i = 0; i < std::min(length(x), shown); ++i) {
        out.put(' ');
        if (x->complex) {
            put_short(bins(x)[i].re, out);
            out.put(',');
            put_short(bins(x)[i].im, out);
        } else {
            put_short(x->data[i], out);
        }
    }
    if (length(x) > shown) out.put(" ...");
    out.put('\n');
}

}  // namespace

template <Record R>
int write_text(const R* x, std::FILE* stream, Parts parts) {
    TextOutput out(stream);
    if (parts.header) put_header(x, out);
    if (parts.data) put_data(x, out);
    return 0;
}

template <Record R>
int write_summary(const R* x, std::FILE* stream, Parts parts) {
    TextOutput out(stream);
    if (parts.header) put_extent(x, out);
    if (parts.data) put_first_points(x, out);
    return 0;
}

template int write_text(const dsp*, std::FILE*, Parts);
template int write_text(const dspf*, std::FILE*, Parts);
template int write_summary(const dsp*, std::FILE*, Parts);
template int write_summary(const dspf*, std::FILE*, Parts);

}  // namespace wavkit
