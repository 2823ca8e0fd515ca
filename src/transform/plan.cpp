// Lays out, once a length, what the passes read: radices, and twiddles in the order of their use.
#include "transform/plan.hpp"

#include <bit>
#include <new>

#if __has_include(<unistd.h>)
#include <unistd.h>
#endif

#include "kernel/pair_passes.hpp"
#include "transform/roots.hpp"

namespace wavkit {
namespace {

using kernel::has_twiddles_by_lanes;
using kernel::lanes;
using kernel::Matrix;
using kernel::Passes;
using kernel::strip_width;

/// Bytes of the last cache, or what most processors have at least.
std::size_t last_cache() {
#if defined(_SC_LEVEL3_CACHE_SIZE)
    const long bytes = sysconf(_SC_LEVEL3_CACHE_SIZE);
    if (bytes > 0) return std::size_t(bytes);
#endif
    return std::size_t(2) << 20;
}

/// The longest powers of two that go through passes: data and workspace take the last cache.
template <class T>
std::size_t longest_direct() {
    static const std::size_t longest = std::bit_floor(last_cache() / (4 * sizeof(T)));
    return longest;
}

/// Whether butterflies of eight samples and their twiddles have room in the registers.
constexpr bool many_registers = kernel::register_bytes == 64;

/// The values that tables hold, one after the other; or, on a dry run without memory, their number.
template <class T>
class Writer {
  public:
    explicit Writer(T* memory) : memory_(memory) {}

    T* here() const { return memory_ ? memory_ + used_ : nullptr; }
    std::size_t used() const { return used_; }
    void skip(std::size_t scalars) { used_ += scalars; }
    void align() { used_ = aligned_count<T>(used_); }

    void put(Bin<T> root) {
        if (memory_) memory_[used_] = root.re, memory_[used_ + 1] = root.im;
        used_ += 2;
    }
    /// All cosines of lanes(0), lanes(1), ..., then all negated sines.
    template <class Lane>
    void put_lanes(std::size_t count, Lane lane) {
        for (std::size_t i = 0; memory_ && i < count; ++i) {
            const Bin<T> root = lane(i);
            memory_[used_ + i] = root.re;
            memory_[used_ + count + i] = root.im;
        }
        used_ += 2 * count;
    }

  private:
    T* memory_;
    std::size_t used_ = 0;
};

/// The prime numbers that passes take beside 2.
constexpr std::size_t odd_primes[] = {3, 5, 7, 11, 13, 17, 19, 23, 29, 31};

/// Appends the radices of 2^exponent: as many eights as leave fours only, the eights first.
template <class T>
void add_eights(Passes<T>& passes, int exponent) {
    while (exponent > 4 || exponent == 3) {
        passes.radices[std::size_t(passes.count++)] = 8;
        exponent -= 3;
    }
    for (; exponent > 1; exponent -= 2) passes.radices[std::size_t(passes.count++)] = 4;
    if (exponent == 1) passes.radices[std::size_t(passes.count++)] = 2;
}

/// The same as fours, and a last eight or two where the exponent is odd.
template <class T>
void add_fours(Passes<T>& passes, int exponent, bool alone) {
    const bool eight = alone && exponent % 2 == 1 && exponent >= 3;
    for (int left = eight ? exponent - 3 : exponent; left > 1; left -= 2) {
        passes.radices[std::size_t(passes.count++)] = 4;
    }
    if (exponent % 2 == 1) passes.radices[std::size_t(passes.count++)] = eight ? 8 : 2;
}

/// The passes of a length, powers of two first.
template <class T>
Passes<T> factorised(std::size_t n, bool eights) {
    Passes<T> passes{.points = n};
    const int exponent = std::countr_zero(n);
    std::size_t odd = n >> exponent;
    if (eights) {
        add_eights(passes, exponent);
    } else {
        add_fours(passes, exponent, odd == 1);
    }
    for (const std::size_t radix : odd_primes) {
        for (; odd % radix == 0; odd /= radix) {
            passes.radices[std::size_t(passes.count++)] = static_cast<unsigned char>(radix);
        }
    }
    return passes;
}

/// Whether whole vectors go through all passes: the first one fills them, and what
/// follows brings the stride to a multiple of them.
template <class T>
bool fills(const Passes<T>& passes) {
    constexpr std::size_t vector = lanes<T>;
    std::size_t stride = passes.radices[0];
    if (passes.count < 2 || (stride != 4 && stride != 8) || passes.points / stride < vector) {
        return false;
    }
    if (passes.radices[std::size_t(passes.count) - 1] > kernel::largest_radix_over_blocks)
        return false;
    for (int i = 1; stride % vector != 0; ++i) {
        const std::size_t radix = passes.radices[std::size_t(i)];
        const bool short_pass = (radix == 4 || radix == 8) && (stride == 4 || stride == 8);
        if (i + 1 >= passes.count || !short_pass || passes.points / radix % vector != 0) {
            return false;
        }
        stride *= radix;
    }
    return true;
}

/// Appends a radix if it divides what is left.
template <class T>
void add_once(Passes<T>& passes, std::size_t& left, std::size_t radix) {
    if (left % radix != 0) return;
    passes.radices[std::size_t(passes.count++)] = static_cast<unsigned char>(radix);
    left /= radix;
}

/// Appends a radix as often as it divides what is left.
template <class T>
void add_factor(Passes<T>& passes, std::size_t& left, std::size_t radix) {
    for (; left % radix == 0; left /= radix) {
        passes.radices[std::size_t(passes.count++)] = static_cast<unsigned char>(radix);
    }
}

/// How often a factor divides n.
constexpr int multiplicity(std::size_t n, std::size_t factor) {
    return n % factor == 0 ? 1 + multiplicity(n / factor, factor) : 0;
}

/// Few passes over pairs: large radices where they have room in the registers, powers of two first.
template <class T>
Passes<T> factorised_for_pairs(std::size_t n) {
    if (!many_registers) return factorised<T>(n, false);
    Passes<T> passes{.points = n};
    std::size_t left = n;
    // What sixteens leave: 8 and 4 rather than 16 and 2, 8 and 8 rather than 16 and 4.
    const int exponent = std::countr_zero(left);
    if (exponent % 4 == 2 && exponent > 2) add_once(passes, left, 8);
    if (exponent % 4 == 1 && exponent > 1) add_once(passes, left, 4);
    add_factor(passes, left, 16);
    for (const std::size_t radix : {8, 4, 2}) add_once(passes, left, radix);
    if (multiplicity(left, 3) % 2 == 1) add_once(passes, left, 15);
    add_factor(passes, left, 9);
    for (const std::size_t prime : odd_primes) add_factor(passes, left, prime);
    return passes;
}

template <class T>
Passes<T> passes_of(std::size_t n) {
    for (const bool eights : {true, false}) {
        if (eights && !many_registers) continue;
        auto passes = factorised<T>(n, eights);
        passes.blocks = fills(passes);
        if (passes.blocks) {
            choose_passes_over_blocks(passes);
            return passes;
        }
    }
    auto passes = factorised_for_pairs<T>(n);
    if (passes.count > 0) choose_passes_over_pairs(passes);
    return passes;
}

/// Twiddles of all passes but the last, those of a pass shorter than a vector lane by lane.
/// `stride` samples side by side belong to transforms of their own; `step` is how far apart the
/// roots of the passes lie among those of the whole.
template <class T>
void write_twiddles(Passes<T>& passes, const Roots<T>& roots, std::size_t stride, std::size_t step,
                    Writer<T>& to) {
    to.align();
    passes.twiddles = to.here();
    std::size_t n = passes.points;
    constexpr std::size_t vector = lanes<T>;
    for (int i = 0; i + 1 < passes.count; ++i) {
        const std::size_t radix = passes.radices[std::size_t(i)], part = n / radix;
        const std::size_t butterflies = part * stride;
        const auto root = [&](std::size_t p, std::size_t k) {
            return to.here() ? roots(std::int64_t(p * k * step)) : Bin<T>{};
        };
        if (has_twiddles_by_lanes(passes, stride)) {
            for (std::size_t first = 0; first < butterflies; first += vector) {
                const auto start = kernel::vector_start(first, vector, butterflies);
                for (std::size_t k = 1; k < radix; ++k) {
                    to.put_lanes(vector, [&](std::size_t lane) {
                        return roots(std::int64_t((start + lane) / stride * k * step));
                    });
                }
            }
        } else if (stride == 1) {
            for (std::size_t k = 1; k < radix; ++k) {
                for (std::size_t p = 0; p < part; ++p) to.put(root(p, k));
            }
        } else {
            for (std::size_t p = passes.blocks ? 1 : 0; p < part; ++p) {
                for (std::size_t k = 1; k < radix; ++k) to.put(root(p, k));
            }
        }
        n = part;
        stride *= radix;
        step *= radix;
    }
}

template <class T>
void write_matrix(Matrix<T>& matrix, const Roots<T>& roots, Writer<T>& to) {
    const std::size_t n = matrix.points(), mask = n - 1, width = strip_width<T>;
    const auto root = [&](std::size_t k) {
        return to.here() ? roots(std::int64_t(k & mask)) : Bin<T>{};
    };
    write_twiddles(matrix.of_rows, roots, width, matrix.columns, to);
    write_twiddles(matrix.of_columns, roots, width, matrix.rows, to);
    to.align();
    matrix.rotations = to.here();
    for (std::size_t k = 0; k < matrix.rows; ++k) {
        for (std::size_t b = 0; b < width; b += lanes<T>) {
            to.put_lanes(lanes<T>, [&](std::size_t lane) { return root((b + lane) * k); });
        }
    }
    matrix.coarse_roots = to.here();
    for (std::size_t k = 0; k < n; k += std::size_t(1) << matrix.fine_bits) to.put(root(k));
    matrix.fine_roots = to.here();
    for (std::size_t k = 0; k < std::size_t(1) << matrix.fine_bits; ++k) to.put(root(k));
}

template <class T>
Matrix<T> matrix_of(std::size_t n) {
    const int exponent = std::countr_zero(n);
    Matrix<T> matrix;
    matrix.columns = std::size_t(1) << exponent / 2;
    matrix.rows = n / matrix.columns;
    matrix.fine_bits = exponent / 2;
    for (auto* passes : {&matrix.of_rows, &matrix.of_columns}) {
        *passes =
            factorised<T>(passes == &matrix.of_rows ? matrix.rows : matrix.columns, many_registers);
        passes->blocks = true;
    }
    return matrix;
}

/// e^(-pi i k^2 / n), and its conjugate around index 0 of the convolution, wrapped at its end.
template <class T>
void write_chirp(Transform<T>& t, const Roots<T>& roots, Writer<T>& to) {
    const auto n = std::size_t(t.points), length = t.convolution_points;
    to.align();
    auto* const chirp = reinterpret_cast<Bin<T>*>(to.here());
    t.chirp = to.here();
    to.skip(2 * n);
    to.align();
    auto* const filter = reinterpret_cast<Bin<T>*>(to.here());
    t.filter = to.here();
    to.skip(2 * length);
    if (!chirp) return;
    std::size_t square = 0;  // k^2 mod 2n, carried so that it never overflows
    for (std::size_t k = 0; k < n; ++k) {
        chirp[k] = roots(std::int64_t(square));
        square = (square + 2 * k + 1) % (2 * n);
    }
    std::fill(filter, filter + length, Bin<T>{0, 0});
    filter[0] = {1, 0};
    for (std::size_t k = 1; k < n; ++k) filter[k] = filter[length - k] = conj(chirp[k]);
}

template <class T>
void write_tables(Transform<T>& t, const Roots<T>& roots, const Roots<T>& chirp_roots,
                  Writer<T>& to) {
    if (t.matrix.rows) {
        write_matrix(t.matrix, roots, to);
    } else {
        write_twiddles(t.passes, roots, 1, 1, to);
    }
    if (t.convolution_points) write_chirp(t, chirp_roots, to);
}

/// The header of the block: everything but the tables.
template <class T>
Transform<T> shape_of(int n) {
    Transform<T> t{};
    t.points = n;
    t.convolution_points = is_smooth(n) ? 0 : convolution_points(n);
    const std::size_t inner = t.convolution_points ? t.convolution_points : std::size_t(n);
    if (std::has_single_bit(inner) && inner > longest_direct<T>()) {
        t.matrix = matrix_of<T>(inner);
        t.work_scalars = kernel::work_scalars(t.matrix);
    } else {
        t.passes = passes_of<T>(inner);
        t.work_scalars = 2 * inner;
    }
    t.work_scalars = aligned_count<T>(t.work_scalars) + 2 * t.convolution_points;
    return t;
}

}  // namespace

bool is_smooth(int n, int largest) {
    if (n < 1) return false;
    n >>= std::countr_zero(unsigned(n));
    for (const auto prime : odd_primes) {
        const int radix = int(prime);
        if (radix > largest) break;
        while (n % radix == 0) n /= radix;
    }
    return n == 1;
}

std::size_t convolution_points(int n) {
    constexpr std::size_t shortest = 512;  // below it other lengths than powers of two cost more
    const std::size_t least = 2 * std::size_t(n) - 2, power = std::bit_ceil(least);
    for (const std::size_t sixteenths : {9, 10, 12}) {
        const std::size_t shorter = power / 16 * sixteenths;
        if (shorter >= std::max(least, shortest)) return shorter;
    }
    return power;
}

template <class T>
Transform<T>* plan_transform(int n) {
    auto t = shape_of<T>(n);
    const Roots<T> roots(t.convolution_points ? std::int64_t(t.convolution_points) : n);
    const Roots<T> chirp_roots(t.convolution_points ? 2 * std::int64_t(n) : 1);
    if (!roots || !chirp_roots) return nullptr;
    Writer<T> count(nullptr);
    write_tables(t, roots, chirp_roots, count);

    constexpr std::size_t header = aligned_count<T>(sizeof(Transform<T>) / sizeof(T) + 1);
    T* const block = new_aligned<T>(header + count.used());
    if (!block) return nullptr;
    Writer<T> to(block + header);
    write_tables(t, roots, chirp_roots, to);
    return new (block) Transform<T>(t);
}

template Transform<double>* plan_transform(int);
template Transform<float>* plan_transform(int);

}  // namespace wavkit
