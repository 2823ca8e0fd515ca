#include "files/mat_format.hpp"

#include <zlib.h>

#include <algorithm>
#include <cmath>
#include <limits>
#include <span>

#include "base/error.hpp"
#include "files/facts_text.hpp"

namespace wavkit::tool {
namespace {

constexpr std::uint64_t head_bytes = 4096, block_bytes = 1 << 16;

/// zlib's inflate over a part of a file.
class Inflater {
  public:
    Inflater(InputFile& input, std::uint64_t offset, std::uint64_t size)
        : input_(input), offset_(offset), left_(size) {
        if (inflateInit(&stream_) != Z_OK) throw std::bad_alloc();
    }
    ~Inflater() { inflateEnd(&stream_); }
    Inflater(const Inflater&) = delete;
    Inflater& operator=(const Inflater&) = delete;

    /// Fills as much as there is; fewer bytes only at the end or where the stream is damaged.
    std::size_t read(std::span<unsigned char> to) {
        stream_.next_out = to.data();
        stream_.avail_out = uInt(to.size());
        while (stream_.avail_out > 0 && !ended_) {
            if (stream_.avail_in == 0 && left_ > 0) {
                block_ = bytes_at(input_, offset_, std::min(left_, block_bytes));
                offset_ += block_.size();
                left_ -= block_.size();
                stream_.next_in = block_.data();
                stream_.avail_in = uInt(block_.size());
            }
            ended_ = inflate(&stream_, Z_NO_FLUSH) != Z_OK;
        }
        return to.size() - stream_.avail_out;
    }

  private:
    InputFile& input_;
    std::uint64_t offset_, left_;
    z_stream stream_{};
    std::vector<unsigned char> block_;
    bool ended_ = false;
};

/// A tag and where its bytes lie.
struct Tag {
    std::uint32_t type = 0;
    std::uint64_t size = 0, at = 0, next = 0;
};

/// The tags at the start of an element, as far as its first bytes reach.
class Tags {
  public:
    Tags(const std::vector<unsigned char>& bytes, bool big) : bytes_(bytes), big_(big) {}

    std::optional<Tag> at(std::uint64_t place) const {
        if (place > bytes_.size() || bytes_.size() - place < 8) return std::nullopt;
        const auto word = number_at<std::uint32_t>(&bytes_[place], big_);
        if (word >> 16) return Tag{word & 0xFFFF, std::min(word >> 16, 4u), place + 4, place + 8};
        const std::uint64_t size = number_at<std::uint32_t>(&bytes_[place + 4], big_);
        return Tag{word, size, place + 8, place + 8 + mat::padded(size)};
    }

    bool holds(const Tag& tag) const {
        return tag.at <= bytes_.size() && tag.size <= bytes_.size() - tag.at;
    }

  private:
    const std::vector<unsigned char>& bytes_;
    bool big_;
};

std::optional<Scalar> scalar_of(std::uint32_t type) {
    switch (type) {
        case mat::int8:
            return Scalar::i8;
        case mat::uint8:
        case mat::utf8:
            return Scalar::u8;
        case 3:
            return Scalar::i16;
        case mat::uint16:
        case 17:
            return Scalar::u16;
        case mat::int32:
            return Scalar::i32;
        case mat::uint32:
            return Scalar::u32;
        case mat::single:
            return Scalar::f32;
        case mat::float64:
            return Scalar::f64;
        case 12:
            return Scalar::i64;
        case 13:
            return Scalar::u64;
        default:
            return std::nullopt;
    }
}

/// Reads flags, dimensions and name, and finds the values. False where there are none that can be
/// read as numbers or characters.
bool understand(MatArray& array, std::uint64_t element_size, bool big) {
    const Tags tags(array.head, big);
    const auto flags = tags.at(0);
    if (!flags || flags->size < 8 || !tags.holds(*flags)) return false;
    const auto word = number_at<std::uint32_t>(&array.head[flags->at], big);
    array.kind = word & 0xFF;
    array.complex = word & mat::complex_flag;
    const auto dimensions = tags.at(flags->next);
    if (!dimensions || dimensions->type != mat::int32 || !tags.holds(*dimensions)) return false;
    for (std::uint64_t i = 0; i + 4 <= dimensions->size; i += 4) {
        const auto length = number_at<std::int32_t>(&array.head[dimensions->at + i], big);
        if (length < 0) return false;
        array.dimensions.push_back(std::uint64_t(length));
    }
    const auto name = tags.at(dimensions->next);
    if (!name || !tags.holds(*name)) return false;
    const auto first = array.head.begin() + std::ptrdiff_t(name->at);
    array.name.assign(first, first + std::ptrdiff_t(name->size));
    if (!array.numeric() && array.kind != mat::class_char) return true;  // a name to tell
    const auto values = tags.at(name->next);
    if (!values) return array.count() == 0;
    const auto type = scalar_of(values->type);
    if (!type) return false;
    array.type = *type;
    array.values_at = values->at;
    const auto bytes = array.count() * size_of(*type);
    if (array.count() > element_size || bytes > values->size) return false;
    // The tag of the imaginary part is as long as that of the real part.
    array.imaginary_at = values->next + (values->at % 8 == 0 ? 8 : 4);
    const auto end = array.complex ? array.imaginary_at + bytes : array.values_at + bytes;
    return end <= element_size;
}

}  // namespace

std::uint64_t MatArray::count() const {
    std::uint64_t product = dimensions.empty() ? 0 : 1;
    for (const auto length : dimensions) {
        if (length > 0 && product > std::numeric_limits<std::uint32_t>::max() / length) {
            return std::numeric_limits<std::uint32_t>::max();
        }
        product *= length;
    }
    return product;
}

std::optional<double> MatArray::scalar(bool big) const {
    if (!numeric() || complex || count() != 1 || values_at + size_of(type) > head.size()) {
        return std::nullopt;
    }
    return scalar_at(&head[values_at], type, big);
}

std::string MatArray::text(bool big) const {
    if (kind != mat::class_char || count() > head_bytes / 4) return {};
    std::string result;
    for (std::uint64_t i = 0; i < count(); ++i) {
        const auto at = values_at + i * size_of(type);
        if (at + size_of(type) > head.size()) return {};
        const auto code = std::uint32_t(std::clamp(scalar_at(&head[at], type, big), 0.0, 1e5));
        if (type == Scalar::u8 || type == Scalar::i8) {
            result += char(code);
        } else {
            append_utf8(result, code);
        }
    }
    return result;
}

std::vector<MatArray> mat_arrays(InputFile& input, bool big) {
    std::vector<MatArray> arrays;
    const auto end = std::uint64_t(input.size());
    for (std::uint64_t at = mat::header_size; at < end && end - at >= 8;) {
        const auto tag = bytes_at(input, at, 8);
        const auto type = number_at<std::uint32_t>(tag.data(), big);
        const std::uint64_t size = number_at<std::uint32_t>(&tag[4], big);
        MatArray array;
        array.offset = at + 8;
        array.size = size;
        array.compressed = type == mat::compressed;
        if (size > end - array.offset) fail_damaged(input, "it ends within a variable");
        at = array.offset + (array.compressed ? size : mat::padded(size));
        auto element_size = size;
        if (array.compressed) {
            Inflater inflater(input, array.offset, size);
            array.head.resize(head_bytes + 8);
            array.head.resize(inflater.read(array.head));
            if (array.head.size() < 8 ||
                number_at<std::uint32_t>(array.head.data(), big) != mat::matrix) {
                continue;
            }
            element_size = number_at<std::uint32_t>(&array.head[4], big);
            array.head.erase(array.head.begin(), array.head.begin() + 8);
        } else if (type == mat::matrix) {
            array.head = bytes_at(input, array.offset, std::min(size, head_bytes));
        } else {
            continue;
        }
        // Objects have a form of their own.
        if (!understand(array, element_size, big) && array.numeric()) {
            fail_damaged(input, "variable " + std::to_string(arrays.size() + 1) + " is damaged");
        }
        arrays.push_back(std::move(array));
    }
    return arrays;
}

std::unique_ptr<InputFile> inflated(InputFile& input, const MatArray& array) {
    const auto bytes = array.count() * size_of(array.type);
    const auto end = 8 + (array.complex ? array.imaginary_at : array.values_at) + bytes;
    Inflater inflater(input, array.offset, array.size);
    auto copy = scratch();
    std::vector<unsigned char> block(block_bytes);
    for (std::uint64_t done = 0; done < end;) {
        const auto wanted = std::size_t(std::min<std::uint64_t>(end - done, block.size()));
        const auto count = inflater.read(std::span(block).first(wanted));
        if (std::fwrite(block.data(), 1, count, copy.get()) != count) {
            throw Error("cannot write a temporary file");
        }
        if (count < wanted) fail_damaged(input, "variable " + array.name + " is damaged");
        done += count;
    }
    return std::make_unique<InputFile>(input.name(), std::move(copy));
}

void deflate_into(std::FILE* to, std::FILE* from) {
    const auto put_tag = [&](std::uint64_t size) {
        if (size > std::numeric_limits<std::uint32_t>::max()) {
            throw Error("a variable of a MATLAB file holds 4 GiB at most");
        }
        for (const std::uint64_t word : {std::uint64_t(mat::compressed), size}) {
            for (int shift = 0; shift < 32; shift += 8) std::fputc(int(word >> shift & 0xFF), to);
        }
    };
    const long start = std::ftell(to);
    put_tag(0);
    z_stream stream{};
    if (deflateInit(&stream, Z_DEFAULT_COMPRESSION) != Z_OK) throw std::bad_alloc();
    std::vector<unsigned char> in(block_bytes), out(block_bytes);
    std::uint64_t size = 0;
    std::rewind(from);
    for (int result = Z_OK; result != Z_STREAM_END;) {
        if (stream.avail_in == 0) {
            stream.next_in = in.data();
            stream.avail_in = uInt(std::fread(in.data(), 1, in.size(), from));
        }
        stream.next_out = out.data();
        stream.avail_out = uInt(out.size());
        result = deflate(&stream, std::feof(from) ? Z_FINISH : Z_NO_FLUSH);
        const auto count = out.size() - stream.avail_out;
        size += std::fwrite(out.data(), 1, count, to);
    }
    deflateEnd(&stream);
    std::fseek(to, start, SEEK_SET);
    put_tag(size);
    std::fseek(to, 0, SEEK_END);
}

}  // namespace wavkit::tool
