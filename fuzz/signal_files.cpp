// Signal files of either format: what the library's readers make of any bytes. What they read, they
// write and read again as the same; of a text, both precisions read as much.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <vector>

#include "bytes.hpp"
#include "support/one_name.hpp"

namespace wavkit::fuzz {
namespace {

using namespace one_name;

struct Stream {
    explicit Stream(std::span<const std::uint8_t> bytes)
        : file(fmemopen(const_cast<std::uint8_t*>(bytes.data()), bytes.size(), "rb")) {}
    ~Stream() { std::fclose(file); }
    Stream(const Stream&) = delete;
    Stream& operator=(const Stream&) = delete;

    std::FILE* file;
};

/// Bit for bit, but for the kind of a NaN.
template <Record R>
bool same(const R& x, const R& y) {
    if (x.points != y.points || x.complex != y.complex) return false;
    for (std::size_t i = 0; i < used(&x); ++i) {
        if (std::isnan(x.data[i])
                ? !std::isnan(y.data[i])
                : x.data[i] != y.data[i] || std::signbit(x.data[i]) != std::signbit(y.data[i]))
            return false;
    }
    return std::isnan(x.delta) ? std::isnan(y.delta) : x.delta == y.delta;
}

template <Record R>
void write_and_read(const R* x) {
    static std::array<std::uint8_t, 1 << 16> room;
    if (used(x) > room.size() / 16) return;
    std::FILE* const out = fmemopen(room.data(), room.size(), "wb");
    FUZZ_REQUIRE(dspf_fwrite(x, out) == 0);
    const auto size = std::size_t(std::ftell(out));
    std::fclose(out);
    Stream in({room.data(), size});
    Temporary<R> back;
    FUZZ_REQUIRE(dspf_fread(back.get(), in.file) == 1);
    FUZZ_REQUIRE(same<R>(*x, *back.get()));
}

/// All signals of a file; how many, and how the last one ended.
template <Record R>
std::pair<int, int> read(std::span<const std::uint8_t> bytes) {
    Stream stream(bytes);
    Temporary<R> x;
    for (int signals = 0;; ++signals) {
        const int result = dspf_fread(x.get(), stream.file);
        FUZZ_REQUIRE(result >= -1 && result <= 1 && x->points >= 0);
        FUZZ_REQUIRE(result == 1 || x->alloc >= 0);
        if (result != 1) return {signals, result};
        FUZZ_REQUIRE(used(x.get()) <= std::size_t(x->alloc));
        write_and_read<R>(x.get());
    }
}

}  // namespace
}  // namespace wavkit::fuzz

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size == 0) return 0;
    const auto of_double = wavkit::fuzz::read<dsp>({data, size});
    const auto of_single = wavkit::fuzz::read<dspf>({data, size});
    // (What single precision rounds to 0, it may find to be the beginning of a hexadecimal
    // integer.)
    const bool hexadecimal = std::find(data, data + size, 'x') != data + size;
    FUZZ_REQUIRE(of_double == of_single || hexadecimal);
    return 0;
}
