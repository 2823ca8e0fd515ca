// The parts of MATLAB's files of level 5, for reading and writing.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "base/scratch.hpp"
#include "files/input.hpp"
#include "files/raw_samples.hpp"

namespace wavkit::tool {

namespace mat {
constexpr std::uint32_t int8 = 1, uint8 = 2, uint16 = 4, int32 = 5, uint32 = 6, single = 7,
                        float64 = 9, matrix = 14, compressed = 15, utf8 = 16;
constexpr std::uint32_t class_char = 4, class_sparse = 5, class_double = 6, class_single = 7,
                        class_last = 15;
constexpr std::uint32_t complex_flag = 0x0800;
constexpr std::uint64_t header_size = 128;

constexpr std::uint64_t padded(std::uint64_t bytes) { return (bytes + 7) / 8 * 8; }
}  // namespace mat

/// An array of a file, as its element says before the values.
struct MatArray {
    std::string name;
    std::uint32_t kind = 0;  // its class
    bool complex = false;
    std::vector<std::uint64_t> dimensions;
    Scalar type = Scalar::f64;                      // of the values in the file
    std::uint64_t values_at = 0, imaginary_at = 0;  // in the element, behind its own tag
    std::vector<unsigned char> head;                // the first bytes of the element

    // The element in the file.
    std::uint64_t offset = 0, size = 0;
    bool compressed = false;

    bool numeric() const { return kind >= mat::class_double && kind <= mat::class_last; }
    std::uint64_t count() const;
    std::optional<double> scalar(bool big) const;
    std::string text(bool big) const;
};

/// The arrays of a file that can be understood; `big` tells its byte order.
std::vector<MatArray> mat_arrays(InputFile& input, bool big);

/// The element of a compressed array in a file of its own.
std::unique_ptr<InputFile> inflated(InputFile& input, const MatArray& array);

/// Writes a file's bytes as a compressed element; throws where it does not fit one.
void deflate_into(std::FILE* to, std::FILE* from);

}  // namespace wavkit::tool
