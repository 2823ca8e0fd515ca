// Binary signals in blocks: their header, and what the samples are made of; see wavkit/file.h.
#include <algorithm>
#include <array>
#include <bit>
#include <cstdint>
#include <cstring>

#include "files/signal_file.hpp"

namespace wavkit::tool {
namespace {

// The first word tells what follows: a type word with the size of a scalar, or without one doubles
// or floats.
constexpr std::uint32_t typed = 0xEB0330BE, doubles = 0xEB0110BE, floats = 0xEB0220BE;
constexpr bool is_magic(std::uint32_t word) {
    return word == typed || word == doubles || word == floats;
}

constexpr std::size_t block_values = 1 << 14;

class BinarySignal : public SampleStream {
  public:
    BinarySignal(InputFile& input, int number) : input_(input), number_(number) {
        read_header();
        end_ = std::ftell(file()) + long(total_ * scalar_size_);
        if (end_ > input_.size()) fail_at_signal(input_, number_);
    }

    std::size_t read(std::span<double> values) override {
        std::size_t done = 0;
        while (done < values.size() && taken_ < total_) {
            const auto wanted = std::min({values.size() - done, total_ - taken_, block_values});
            const auto block = values.subspan(done, wanted);
            const auto count =
                scalar_size_ == 8 ? read_scalars<double>(block) : read_scalars<float>(block);
            done += count;
            taken_ += count;
            if (count < wanted) fail_at_signal(input_, number_);
        }
        return done;
    }

    void skip() override {
        if (taken_ < total_) std::fseek(file(), end_, SEEK_SET);
        taken_ = total_;
    }

    double done() const override { return double(std::ftell(file())) / double(input_.size()); }

  private:
    std::FILE* file() const { return input_.stream(); }

    template <class T>
    T field() {
        std::array<unsigned char, sizeof(T)> bytes;
        if (std::fread(bytes.data(), bytes.size(), 1, file()) != 1) {
            fail_at_signal(input_, number_);
        }
        if (swapped_) std::ranges::reverse(bytes);
        return std::bit_cast<T>(bytes);
    }

    void read_header() {
        auto magic = field<std::uint32_t>();
        if (!is_magic(magic)) {
            swapped_ = true;
            std::fseek(file(), -long(sizeof magic), SEEK_CUR);
            magic = field<std::uint32_t>();
        }
        if (!is_magic(magic)) fail_at_signal(input_, number_);
        scalar_size_ = magic == typed ? field<std::uint32_t>() & 0xFF : magic == doubles ? 8 : 4;
        if (scalar_size_ != 8 && scalar_size_ != 4) fail_at_signal(input_, number_);
        length = std::size_t(std::max(field<std::int32_t>(), 0));
        complex = field<std::int32_t>() != 0;
        delta = scalar_size_ == 8 ? field<double>() : double(field<float>());
        total_ = *length * (complex ? 2 : 1);
    }

    template <class T>
    std::size_t read_scalars(std::span<double> values) {
        bytes_.resize(values.size() * sizeof(T));
        const auto count = std::fread(bytes_.data(), sizeof(T), values.size(), file());
        for (std::size_t i = 0; i < count; ++i) {
            std::array<unsigned char, sizeof(T)> scalar;
            std::memcpy(scalar.data(), &bytes_[i * sizeof(T)], sizeof(T));
            if (swapped_) std::ranges::reverse(scalar);
            values[i] = double(std::bit_cast<T>(scalar));
        }
        return count;
    }

    InputFile& input_;
    int number_;
    bool swapped_ = false;
    std::size_t scalar_size_ = 8, total_ = 0, taken_ = 0;
    long end_ = 0;  // of the signal in the file
    std::vector<unsigned char> bytes_;
};

}  // namespace

bool begins_binary(int byte) { return byte == int(typed >> 24) || byte == int(typed & 0xFF); }

std::unique_ptr<SampleStream> binary_signal(InputFile& input, int number) {
    return std::make_unique<BinarySignal>(input, number);
}

}  // namespace wavkit::tool
