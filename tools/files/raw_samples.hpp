// Samples as plain scalars in a file, of any type, byte order and arrangement.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "files/stream.hpp"

namespace wavkit::tool {

enum class Scalar { i8, u8, i16, u16, i32, u32, i64, u64, f16, f32, f64 };

std::size_t size_of(Scalar type);

/// Whether this machine stores the highest byte first.
bool big_endian_machine();

/// A number of another file's byte order.
template <class T>
T number_at(const unsigned char* bytes, bool big);
double scalar_at(const unsigned char* bytes, Scalar type, bool big);

/// Reads so many bytes from a place of a file; throws where it ends before.
std::vector<unsigned char> bytes_at(InputFile& input, std::uint64_t offset, std::uint64_t count);

/// Throws, to tell that a file contradicts itself.
[[noreturn]] void fail_damaged(const InputFile& input, const std::string& what);

/// Where samples lie.
struct RawLayout {
    Scalar type = Scalar::f64;
    bool big = false;      // highest byte first
    bool complex = false;  // pairs of scalars
    bool planar = false;   // one channel behind the other, instead of sample by sample in turn
    std::uint64_t offset = 0, points = 0, channels = 1;

    std::size_t item() const { return size_of(type) * (complex ? 2 : 1); }
};

/// Throws where a file is shorter than the layout says.
void check_size(InputFile& input, const RawLayout& layout);

/// A channel, or all of real samples as channels of one stream.
std::unique_ptr<SampleStream> raw_stream(InputFile& input, const RawLayout& layout,
                                         std::optional<std::size_t> channel);

}  // namespace wavkit::tool
