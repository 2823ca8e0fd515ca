#include "files/npy.hpp"

#include <algorithm>
#include <bit>
#include <cctype>
#include <map>
#include <utility>

#include "base/error.hpp"
#include "base/number.hpp"
#include "files/facts_text.hpp"
#include "files/raw_samples.hpp"

namespace wavkit::tool {
namespace {

constexpr std::string_view magic = "\x93NUMPY";

/// The header, a dictionary as Python writes it.
class Header {
  public:
    Header(InputFile& input, std::string text) : input_(input), text_(std::move(text)) {}

    RawLayout layout(std::vector<std::uint64_t>& shape) const {
        RawLayout layout;
        take_type(layout);
        const auto order = behind("fortran_order");
        layout.planar = order.starts_with("True");
        if (!layout.planar && !order.starts_with("False")) fail();
        shape = numbers_of(behind("shape"));
        return layout;
    }

  private:
    [[noreturn]] void fail() const { fail_damaged(input_, "its header is damaged"); }

    /// What follows a key.
    std::string_view behind(const std::string& key) const {
        auto at = text_.find("'" + key + "'");
        if (at == text_.npos) fail();
        at = text_.find(':', at);
        if (at != text_.npos) at = text_.find_first_not_of(" :", at);
        if (at == text_.npos) fail();
        return std::string_view(text_).substr(at);
    }

    void take_type(RawLayout& layout) const {
        static const std::map<std::string, Scalar, std::less<>> types{
            {"i1", Scalar::i8},  {"u1", Scalar::u8},  {"b1", Scalar::u8},  {"i2", Scalar::i16},
            {"u2", Scalar::u16}, {"i4", Scalar::i32}, {"u4", Scalar::u32}, {"i8", Scalar::i64},
            {"u8", Scalar::u64}, {"f2", Scalar::f16}, {"f4", Scalar::f32}, {"f8", Scalar::f64},
            {"c8", Scalar::f32}, {"c16", Scalar::f64}};
        const auto rest = behind("descr");
        const auto end = rest.find('\'', 1);
        const auto type = rest.starts_with('\'') && end != rest.npos ? rest.substr(1, end - 1)
                                                                     : std::string_view();
        const auto found = type.size() < 3 ? types.end() : types.find(type.substr(1));
        if (found == types.end()) {
            const auto shown = type.empty() ? std::string("fields") : "'" + std::string(type) + "'";
            fail_damaged(input_, "an array of " + shown + " holds no numbers that are known here");
        }
        layout.type = found->second;
        layout.complex = type[1] == 'c';
        layout.big = type[0] == '>' || (type[0] == '=' && big_endian_machine());
    }

    std::vector<std::uint64_t> numbers_of(std::string_view text) const {
        const auto end = text.find(')');
        if (!text.starts_with('(') || end == text.npos) fail();
        text = text.substr(1, end - 1);
        std::vector<std::uint64_t> numbers;
        while (!text.empty()) {
            std::uint64_t value = 0;
            std::size_t digits = 0;
            for (; digits < text.size() && std::isdigit(static_cast<unsigned char>(text[digits]));
                 ++digits) {
                if (digits > 17) fail();
                value = 10 * value + std::uint64_t(text[digits] - '0');
            }
            if (digits == 0) fail();
            numbers.push_back(value);
            text.remove_prefix(digits);
            text.remove_prefix(std::min(text.find_first_not_of(", L"), text.size()));
        }
        return numbers;
    }

    InputFile& input_;
    std::string text_;
};

class NpyFile : public SignalSource {
  public:
    NpyFile(InputFile& file, const ReadOptions& reading, bool together)
        : SignalSource(file, reading), together_(together) {
        read_header();
        check_size(file, layout_);
        together_ = together && !layout_.complex;
    }

  private:
    void read_header() {
        const auto start = bytes_at(input(), 0, 10);
        const bool wide = start[6] > 1;
        const auto length = wide ? number_at<std::uint32_t>(bytes_at(input(), 8, 4).data(), false)
                                 : std::uint32_t(number_at<std::uint16_t>(&start[8], false));
        const std::uint64_t text_at = wide ? 12 : 10;
        const auto text = bytes_at(input(), text_at, length);
        std::vector<std::uint64_t> shape;
        layout_ = Header(input(), {text.begin(), text.end()}).layout(shape);
        layout_.offset = text_at + length;
        take_shape(shape);
    }

    void take_shape(const std::vector<std::uint64_t>& shape) {
        if (shape.size() > 2) {
            fail_damaged(input(), "an array of " + std::to_string(shape.size()) +
                                      " dimensions is no signal");
        }
        layout_.points = shape.empty() ? 1 : shape[0];
        if (shape.size() < 2) return;
        layout_.channels = shape[1];
        const bool turned = shape[0] < shape[1];
        if (turned) {
            // Rows of C are planes, and so are columns of Fortran.
            std::swap(layout_.points, layout_.channels);
            layout_.planar = !layout_.planar;
        }
        if (layout_.channels == 0) fail_damaged(input(), "there is no signal in an empty array");
        const auto of = [](std::uint64_t count, const std::string& what) {
            return std::to_string(count) + what + (count == 1 ? "" : "s");
        };
        std::fprintf(stderr, "wavkit: %s: the array of shape (%s, %s) is taken for %s of %s\n",
                     readable(input().name()).c_str(), std::to_string(shape[0]).c_str(),
                     std::to_string(shape[1]).c_str(), of(layout_.channels, " signal").c_str(),
                     of(layout_.points, " sample").c_str());
    }

    std::unique_ptr<SampleStream> following() override {
        const auto index = std::size_t(number() - 1);
        if (index >= (together_ ? 1 : layout_.channels)) return nullptr;
        return raw_stream(input(), layout_, together_ ? std::nullopt : std::optional(index));
    }

    RawLayout layout_;
    bool together_;
};

/// The header is written last, when the number of samples is known; its length is settled before.
class NpyWriter : public BlockWriter {
  public:
    NpyWriter(std::FILE* to, bool single) : to_(to), single_(single) {}

    void begin(const SignalShape& shape) override {
        if (std::exchange(begun_, true)) {
            throw Error(
                "one signal, or several of one length side by side, fit an array; choose "
                "with --signal");
        }
        tell_of_lost_spacing(shape.delta);
        tell_of_lost_start(shape.facts_of(0));
        shape_ = shape;
        put_header();
    }

    void write(std::span<const double> values) override {
        scalars_ += values.size();
        bytes_.clear();
        for (const double value : values) {
            if (single_) {
                put(std::bit_cast<std::uint32_t>(float(value)));
            } else {
                put(std::bit_cast<std::uint64_t>(value));
            }
        }
        std::fwrite(bytes_.data(), 1, bytes_.size(), to_);
    }

    void end() override {
        std::fseek(to_, 0, SEEK_SET);
        put_header();
        std::fseek(to_, 0, SEEK_END);
    }

  private:
    template <class T>
    void put(T bits) {
        for (std::size_t i = 0; i < sizeof(T); ++i) {
            bytes_.push_back(static_cast<unsigned char>(bits >> 8 * i));
        }
    }

    void put_header() {
        const char* const type =
            shape_.complex ? (single_ ? "<c8" : "<c16") : (single_ ? "<f4" : "<f8");
        const auto points = scalars_ / shape_.width();
        std::string text = "{'descr': '" + std::string(type) +
                           "', 'fortran_order': False, 'shape': (" + std::to_string(points) + ",";
        if (shape_.channels > 1) text += " " + std::to_string(shape_.channels);
        text += "), }";
        text.resize(117, ' ');
        text += '\n';
        std::fwrite(magic.data(), 1, magic.size(), to_);
        std::fwrite("\1\0\x76\0", 1, 4, to_);
        std::fwrite(text.data(), 1, text.size(), to_);
    }

    std::FILE* to_;
    bool single_, begun_ = false;
    SignalShape shape_;
    std::size_t scalars_ = 0;
    std::vector<unsigned char> bytes_;
};

}  // namespace

bool looks_like_npy(const std::string& head) { return head.starts_with(magic); }

std::unique_ptr<SignalSource> open_npy(InputFile& input, const ReadOptions& options,
                                       bool together) {
    return std::make_unique<NpyFile>(input, options, together);
}

std::unique_ptr<BlockWriter> npy_writer(std::FILE* to, bool single) {
    return std::make_unique<NpyWriter>(to, single);
}

}  // namespace wavkit::tool
