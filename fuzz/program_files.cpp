// Recordings of every format: what the program's readers make of any bytes. In steps of any size
// they read the same; signal files they read as the library does.
#include <sys/mman.h>
#include <unistd.h>

#include <cmath>
#include <cstdio>

#include "base/error.hpp"
#include "bytes.hpp"
#include "files/recording.hpp"

namespace wavkit::fuzz {
namespace {

using namespace wavkit::tool;

using File = std::span<const std::uint8_t>;

/// A file without a name, since libsndfile asks for a descriptor.
Stream stream_of(File bytes) {
    const int file = memfd_create("input", 0);
    FUZZ_REQUIRE(file >= 0 && write(file, bytes.data(), bytes.size()) == ssize_t(bytes.size()));
    Stream stream(fdopen(file, "r+b"), std::fclose);
    std::rewind(stream.get());
    return stream;
}

/// The options that a file is read with, from its last bytes where these say so.
ReadOptions take_options(File& bytes) {
    constexpr std::uint8_t mark = 0xA5;
    constexpr std::size_t size = 5;
    ReadOptions options;
    if (bytes.size() < size || bytes.back() != mark) return options;
    Bytes in(bytes.data() + bytes.size() - size, size);
    bytes = bytes.first(bytes.size() - size);
    const auto format = in.byte(), flags = in.byte(), column = in.byte(), choice = in.byte();
    if (format < 10) options.format = Format(format % 9);
    options.csv.time = flags & 1;
    options.csv.complex = flags & 2;
    options.csv.pairs = flags & 4;
    if (flags & 8) options.csv.decimal_comma = bool(flags & 16);
    options.csv.missing = Missing(flags >> 5 & 1 ? 1 + (flags >> 6 & 1) : 0);
    options.csv.skip = column >> 6;
    if (column & 1) options.csv.columns = {std::to_string(column >> 1 & 7)};
    if (choice & 1) options.channel = 1 + (choice >> 1 & 3);
    if (choice & 8) options.signal = 1 + (choice >> 4 & 3);
    if (choice & 64) options.rate = 1000;
    return options;
}

/// What a reader tells of a file.
struct Told {
    struct One {
        double delta;
        bool complex;
        std::vector<double> values;
    };
    std::vector<One> signals;
    bool refused = false, sound = false;
};

Told read(File bytes, const ReadOptions& options, bool together, std::size_t step) {
    Told told;
    try {
        InputFile input("input", stream_of(bytes));
        const auto source = together ? open_channels(input, options) : open_signals(input, options);
        told.sound = source->sound;
        std::vector<double> block;
        while (auto* const stream = source->next()) {
            auto& one = told.signals.emplace_back(Told::One{stream->delta, stream->complex, {}});
            block.resize(std::max<std::size_t>(step / stream->width(), 1) * stream->width());
            while (const auto count = stream->read(block)) {
                one.values.insert(one.values.end(), block.begin(), block.begin() + long(count));
            }
        }
    } catch (const Error&) {
        told.refused = true;
    } catch (const UsageError&) {
        told.refused = true;
    }
    return told;
}

Told read_by_library(File bytes) {
    Told told;
    const auto stream = stream_of(bytes);
    for (Signal x;;) {
        const int result = dspf_fread(x, stream.get());
        told.refused = result < 0;
        if (result != 1) return told;
        const auto values = x.values();
        told.signals.push_back({x->delta, bool(x->complex), {values.begin(), values.end()}});
    }
}

bool same(double a, double b) { return a == b || (std::isnan(a) && std::isnan(b)); }

/// Whether two readers agree: on all signals, and on the rest, if it is none.
bool agree(const Told& a, const Told& b) {
    if (a.refused != b.refused) return false;
    return a.refused || std::ranges::equal(a.signals, b.signals, [](auto& x, auto& y) {
               return same(x.delta, y.delta) && x.complex == y.complex &&
                      std::ranges::equal(x.values, y.values, same);
           });
}

}  // namespace
}  // namespace wavkit::fuzz

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using namespace wavkit::fuzz;
    File bytes(data, size);
    const auto options = take_options(bytes);
    const auto whole = read(bytes, options, true, 1 << 10);
    // (Of a sound that is cut short, libsndfile's last values depend on the step.)
    if (size % 4 == 1 && !whole.sound) FUZZ_REQUIRE(agree(whole, read(bytes, options, true, 3)));
    if (size % 4 == 2) read(bytes, options, false, 1 << 10);
    const bool plain = !options.signal && !options.rate && bytes.size() > 3;
    const bool marked = plain && bytes[0] == 0xEF;
    if (plain && !marked && options.format == wavkit::tool::Format::text) {
        auto by_library = read_by_library(bytes);
        by_library.refused |= by_library.signals.empty();
        FUZZ_REQUIRE(agree(whole, by_library));
    }
    return 0;
}
