// Binary signal files: a short header, then the scalars.
#include <algorithm>
#include <bit>
#include <cstdint>
#include <cstdlib>
#include <cstring>

#include "file/format.hpp"
#include "state.hpp"

namespace wavkit {
namespace {

// The first word of a signal; it tells the format, and by its order in the file the byte order.
constexpr std::uint32_t magic = 0xEB0330BE;
constexpr std::uint32_t magic_doubles_only = 0xEB0110BE;  // oldest format: no type word
constexpr std::uint32_t magic_floats_only = 0xEB0220BE;   // its successor: no type word either

constexpr std::uint32_t type_word_base = 0x0400;  // the scalar's size is its low byte
constexpr std::uint32_t scalar_size_mask = 0xFF;

constexpr std::size_t conversion_bytes = 1 << 16;

constexpr std::uint32_t byte_reversed(std::uint32_t word) {
    return word >> 24 | (word >> 8 & 0xFF00) | (word << 8 & 0xFF0000) | word << 24;
}

constexpr std::uint64_t byte_reversed(std::uint64_t word) {
    return std::uint64_t(byte_reversed(std::uint32_t(word))) << 32 |
           byte_reversed(std::uint32_t(word >> 32));
}

/// Works on the bytes where they lie: a reversed number may be one that loading would alter.
template <class T>
void reverse_bytes(T& number) {
    std::conditional_t<sizeof(T) == 8, std::uint64_t, std::uint32_t> word;
    static_assert(sizeof word == sizeof number);
    std::memcpy(&word, &number, sizeof word);
    word = byte_reversed(word);
    std::memcpy(&number, &word, sizeof word);
}

/// Numbers from a stream, in this machine's byte order or its opposite.
struct Source {
    std::FILE* stream;
    bool reversed = false;

    /// Reads up to `count` numbers; returns how many came.
    template <class T>
    std::size_t read(T* to, std::size_t count) const {
        const std::size_t came = std::fread(to, sizeof(T), count, stream);
        if (reversed) std::for_each_n(to, came, reverse_bytes<T>);
        return came;
    }
    template <class T>
    bool read(T& number) const {
        if (std::fread(&number, sizeof number, 1, stream) != 1) return false;
        if (reversed) reverse_bytes(number);
        return true;
    }
};

/// Room for one load of stored scalars on their way into the other precision: the thread's, which
/// outlives the call that needed it first.
template <Record R>
void* conversion_buffer() {
    auto& own = thread_state<R>;
    if (!own.conversion) {
        keep_until_thread_ends<R>();
        own.conversion = std::malloc(conversion_bytes);
    }
    return own.conversion;
}

/// Reads scalars of the other precision; returns how many came.
template <class Stored, class T>
std::size_t read_converted(const Source& source, T* to, std::size_t count) {
    using R = std::conditional_t<sizeof(T) == 8, dsp, dspf>;
    auto* const load = static_cast<Stored*>(conversion_buffer<R>());
    if (!load) return 0;
    constexpr std::size_t capacity = conversion_bytes / sizeof(Stored);
    for (std::size_t done = 0;;) {
        const std::size_t wanted = std::min(count - done, capacity);
        const std::size_t came = source.read(load, wanted);
        std::transform(load, load + came, to + done, [](Stored v) { return T(v); });
        done += came;
        if (came < wanted || done == count) return done;
    }
}

template <class T>
std::size_t read_scalars(const Source& source, std::uint32_t scalar_size, T* to,
                         std::size_t count) {
    using Other = std::conditional_t<sizeof(T) == 8, float, double>;
    if (scalar_size == sizeof(T)) return source.read(to, count);
    return read_converted<Other>(source, to, count);
}

template <class T>
bool read_scalar(const Source& source, std::uint32_t scalar_size, T& to) {
    std::conditional_t<sizeof(T) == 8, float, double> other;
    if (scalar_size == sizeof(T)) return source.read(to);
    if (!source.read(other)) return false;
    to = T(other);
    return true;
}

/// Reads the magic and, in the current format, the type word: they settle the byte order of what
/// follows and the size of its scalars.
bool read_format(Source& source, std::uint32_t& scalar_size) {
    std::uint32_t word;
    if (!source.read(word)) return false;
    const auto known = [&] {
        return word == magic || word == magic_doubles_only || word == magic_floats_only;
    };
    if (!known()) {
        word = byte_reversed(word);
        source.reversed = true;
    }
    if (!known()) return false;
    if (word == magic) {
        if (!source.read(word)) return false;
        scalar_size = word & scalar_size_mask;
    } else {
        scalar_size = word == magic_doubles_only ? 8 : 4;
    }
    return scalar_size == 8 || scalar_size == 4;
}

/// Reads `total` points, taking memory as they arrive: a damaged header may promise any number.
/// The record holds the points that came.
template <Record R>
bool read_samples(R* x, std::size_t total, const Source& source, std::uint32_t scalar_size) {
    constexpr std::size_t first_step = 1 << 20;
    constexpr std::size_t largest_block = std::numeric_limits<int>::max();
    const std::size_t scalars = std::size_t(width(x));
    if (total * scalars > largest_block) return false;

    for (std::size_t arrived = 0; arrived < total;) {
        const std::size_t room = std::min(total, std::max(first_step, 2 * arrived));
        x->points = int(room);
        const bool full = arrived ? dsp_realloc(x, int(arrived), x->complex) : dsp_alloc(x);
        x->points = int(arrived);
        if (full) return false;
        const std::size_t came = read_scalars(source, scalar_size, x->data + arrived * scalars,
                                              (room - arrived) * scalars);
        arrived += came / scalars;
        x->points = int(arrived);
        if (arrived < room) return false;
    }
    return true;
}

template <Record R>
bool read_signal(R* x, Source source) {
    std::uint32_t scalar_size;
    std::int32_t points, complex;
    if (!read_format(source, scalar_size)) return false;
    if (!source.read(points) || !source.read(complex)) return false;
    x->complex = complex != 0;
    if (!read_scalar(source, scalar_size, x->delta)) return false;
    return read_samples(x, std::size_t(std::max(points, 0)), source, scalar_size);
}

/// Writes numbers little-endian whatever the machine.
template <class T>
bool put(const T* from, std::size_t count, std::FILE* stream) {
    if (count == 0) return true;
    if constexpr (std::endian::native == std::endian::little) {
        return std::fwrite(from, sizeof(T), count, stream) == count;
    }
    return std::all_of(from, from + count, [stream](T number) {
        reverse_bytes(number);
        return std::fwrite(&number, sizeof number, 1, stream) == 1;
    });
}

template <class T>
bool put(T number, std::FILE* stream) {
    return put(&number, 1, stream);
}

template <Record R>
bool put_header(const R* x, std::FILE* stream) {
    constexpr std::uint32_t type_word = type_word_base | sizeof(scalar<R>);
    return put(magic, stream) && put(type_word, stream) && put(x->points, stream) &&
           put(x->complex, stream) && put(x->delta, stream);
}

template <Record R>
bool put_data(const R* x, std::FILE* stream) {
    return put(x->data, used(x), stream);
}

}  // namespace

template <Record R>
int read_binary(R* x, std::FILE* stream) {
    return read_signal(x, {stream}) ? 1 : -1;
}

template <Record R>
int write_binary(const R* x, std::FILE* stream, Parts parts) {
    if (parts.header && !put_header(x, stream)) return -1;
    if (parts.data && !put_data(x, stream)) return -1;
    return 0;
}

template int read_binary(dsp*, std::FILE*);
template int read_binary(dspf*, std::FILE*);
template int write_binary(const dsp*, std::FILE*, Parts);
template int write_binary(const dspf*, std::FILE*, Parts);

}  // namespace wavkit
