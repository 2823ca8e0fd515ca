#include "files/encoding.hpp"

#include <cerrno>
#include <cstring>
#include <string_view>

#include "base/error.hpp"
#include "base/scratch.hpp"
#include "files/facts_text.hpp"

namespace wavkit::tool {
namespace {

constexpr std::string_view mark8 = "\xEF\xBB\xBF", little = "\xFF\xFE", big = "\xFE\xFF";

/// Takes UTF-16 in pieces of any length.
class Utf16 {
  public:
    explicit Utf16(bool big_endian) : big_(big_endian) {}

    void take(std::string_view bytes, std::string& text) {
        for (const char c : bytes) {
            const std::uint32_t byte = static_cast<unsigned char>(c);
            if (!half_) {
                half_ = byte + 1;
                continue;
            }
            const auto first = half_ - 1;
            half_ = 0;
            take(big_ ? first << 8 | byte : byte << 8 | first, text);
        }
    }

  private:
    void take(std::uint32_t unit, std::string& text) {
        const bool high = unit >> 10 == 0x36, low = unit >> 10 == 0x37;
        if (low && high_) {
            append_utf8(text, 0x10000 + ((high_ & 0x3FF) << 10) + (unit & 0x3FF));
        } else if (!high && !low && unit != 0xFEFF) {
            append_utf8(text, unit);
        }
        high_ = high ? unit : 0;
    }

    bool big_;
    std::uint32_t half_ = 0, high_ = 0;
};

}  // namespace

EncodingGuess encoding_of(const std::string& head) {
    if (head.starts_with(mark8)) return {Encoding::utf8_marked, true};
    if (head.starts_with(little)) return {Encoding::utf16_little, true};
    if (head.starts_with(big)) return {Encoding::utf16_big, true};
    // Digits and separators of UTF-16 have a zero beside each.
    std::size_t even = 0, odd = 0;
    for (std::size_t i = 0; i < head.size(); ++i) {
        if (head[i] == '\0') ++(i % 2 ? odd : even);
    }
    const auto most = head.size() / 2 * 9 / 10;
    const bool text = head.size() >= 8 && !head.starts_with(std::string_view("\0\0", 2));
    if (text && odd > most && even == 0) return {Encoding::utf16_little, false};
    if (text && even > most && odd == 0) return {Encoding::utf16_big, false};
    return {};
}

std::string decoded(const std::string& bytes, Encoding encoding) {
    if (encoding == Encoding::utf8) return bytes;
    if (encoding == Encoding::utf8_marked) return bytes.substr(mark8.size());
    std::string text;
    Utf16(encoding == Encoding::utf16_big).take(bytes, text);
    return text;
}

std::unique_ptr<InputFile> decoded(InputFile& input, Encoding encoding) {
    auto copy = scratch();
    std::string bytes(1 << 16, '\0'), text;
    Utf16 units(encoding == Encoding::utf16_big);
    std::size_t count;
    while ((count = std::fread(bytes.data(), 1, bytes.size(), input.stream())) > 0) {
        text.clear();
        units.take(std::string_view(bytes).substr(0, count), text);
        if (std::fwrite(text.data(), 1, text.size(), copy.get()) != text.size()) {
            throw Error("cannot read " + input.name() + ": " + std::strerror(errno));
        }
    }
    return std::make_unique<InputFile>(input.name(), std::move(copy));
}

}  // namespace wavkit::tool
