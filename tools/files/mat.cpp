#include "files/mat.hpp"

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>
#include <cstring>
#include <limits>
#include <set>
#include <utility>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/text.hpp"
#include "files/csv_row.hpp"
#include "files/facts_text.hpp"
#include "files/mat_format.hpp"
#include "files/time_axis.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t block_points = 1 << 13;

/// Values of one part of a signal: real or imaginary.
struct Plane {
    std::uint64_t offset, stride;  // bytes from a value to the next
};

/// A column of an array, or a row of one that lies on its side.
class MatSignal : public SampleStream {
  public:
    MatSignal(InputFile& input, const MatArray& array, std::uint64_t channel, bool wide, bool big)
        : input_(input), type_(array.type), big_(big) {
        if (array.compressed) copy_ = inflated(input, array);
        const std::uint64_t size = size_of(type_), rows = array.dimensions[0];
        const auto base = array.compressed ? 8 : array.offset;
        const auto first = channel * (wide ? 1 : rows) * size;
        const auto stride = (wide ? rows : 1) * size;
        planes_.push_back({base + array.values_at + first, stride});
        if (array.complex) planes_.push_back({base + array.imaginary_at + first, stride});
        complex = array.complex;
        points_ = wide ? array.dimensions[1] : rows;
        length = std::size_t(points_);
    }

    std::size_t read(std::span<double> values) override {
        const auto width = planes_.size();
        std::size_t done = 0;
        while (done + width <= values.size() && taken_ < points_) {
            const auto most = std::max<std::uint64_t>((1 << 18) / planes_[0].stride, 1);
            const auto count = std::size_t(std::min<std::uint64_t>(
                {(values.size() - done) / width, points_ - taken_, block_points, most}));
            for (std::size_t p = 0; p < width; ++p) take(p, values.subspan(done), count);
            done += count * width;
            taken_ += count;
        }
        return done;
    }

    void skip() override {}  // each signal knows its place

    double done() const override { return double(taken_) / double(points_); }

  private:
    void take(std::size_t part, std::span<double> values, std::size_t count) {
        const auto& plane = planes_[part];
        auto& file = copy_ ? *copy_ : input_;
        const auto bytes = bytes_at(file, plane.offset + taken_ * plane.stride,
                                    (count - 1) * plane.stride + size_of(type_));
        for (std::size_t i = 0; i < count; ++i) {
            values[i * planes_.size() + part] = scalar_at(&bytes[i * plane.stride], type_, big_);
        }
    }

    InputFile& input_;
    std::unique_ptr<InputFile> copy_;  // of what was compressed
    Scalar type_;
    bool big_;
    std::vector<Plane> planes_;
    std::uint64_t points_ = 0, taken_ = 0;
};

class MatFile : public SignalSource {
  public:
    MatFile(InputFile& file, const ReadOptions& reading) : SignalSource(file, reading) {
        const auto header = bytes_at(file, 0, mat::header_size);
        big_ = header[126] == 'M';
        if (number_at<std::uint16_t>(&header[124], big_) == 0x0200) {
            fail_damaged(file, "MATLAB files of version 7.3 are not read; save with -v7");
        }
        arrays_ = mat_arrays(file, big_);
        std::string others;
        for (std::size_t i = 0; i < arrays_.size(); ++i) {
            const auto& array = arrays_[i];
            if (is_signal(array)) signals_.push_back(i);
            if (array.numeric() || array.kind == mat::class_char || array.name.empty()) continue;
            others += (others.empty() ? "" : ", ") + array.name;
        }
        if (!others.empty()) note("no numeric array and left out: " + others);
        find_time();
        tell();
    }

  private:
    /// Numbers that are no parameter of others; a single one has parameters of its own.
    bool is_signal(const MatArray& array) const {
        return array.numeric() && array.dimensions.size() == 2 &&
               (array.count() > 1 || find(array.name + "_delta"));
    }

    const MatArray* find(std::string_view name) const {
        const auto found = std::ranges::find(arrays_, name, &MatArray::name);
        return found == arrays_.end() ? nullptr : &*found;
    }

    std::optional<double> value_of(std::string_view name) const {
        const auto* const array = find(name);
        const auto value = array ? array->scalar(big_) : std::nullopt;
        return value && std::isfinite(*value) ? value : std::nullopt;
    }

    /// A parameter of one array, or of all by one of the usual names.
    std::optional<double> value_for(const MatArray& array, const std::string& what,
                                    std::initializer_list<const char*> usual) {
        if (const auto own = value_of(array.name + "_" + what)) return own;
        for (const char* const name : usual) {
            const auto common = value_of(name);
            if (!common) continue;
            used_.insert(name);
            return common;
        }
        return std::nullopt;
    }

    std::string text_for(const MatArray& array, const std::string& what) const {
        const auto* const text = find(array.name + "_" + what);
        return text ? readable(text->text(big_)) : std::string();
    }

    /// A vector of times is the axis of the arrays of its length.
    void find_time() {
        if (signals_.size() < 2) return;
        const auto is_time = [&](std::size_t i) {
            const auto name = lower(arrays_[i].name);
            return (name == "t" || name == "time") && !arrays_[i].complex &&
                   std::ranges::count(arrays_[i].dimensions, 1u) > 0;
        };
        const auto found = std::ranges::find_if(signals_, is_time);
        if (found == signals_.end()) return;
        MatSignal times(input(), arrays_[*found], 0, arrays_[*found].dimensions[0] == 1, big_);
        std::vector<double> block(block_points);
        for (std::size_t count; (count = times.read(block)) > 0;) {
            for (const double t : std::span(block).first(count)) {
                if (std::isfinite(t)) time_.add({t, 1e-12 * std::fabs(t), ++time_points_});
            }
        }
        time_.end();
        if (const auto fault = time_.fault(true)) {
            note(arrays_[*found].name +
                 " is no axis: " + fault->what.substr(0, fault->what.find(';')));
            time_points_ = 0;
            return;
        }
        note(arrays_[*found].name + " is taken for the time");
        signals_.erase(found);
    }

    std::unique_ptr<SampleStream> following() override {
        while (signal_ < signals_.size()) {
            const auto& array = arrays_[signals_[signal_]];
            const auto rows = array.dimensions[0], columns = array.dimensions[1];
            const bool wide = rows > 0 && rows < columns;
            const auto channels = std::max<std::uint64_t>(std::min(rows, columns), 1);
            if (channel_ == 0 && rows > 1 && columns > 1) {
                note(array.name + " of " + std::to_string(rows) + " by " + std::to_string(columns) +
                     " is taken for " + std::to_string(channels) + " signals");
            }
            if (channel_ == channels) {
                channel_ = 0;
                ++signal_;
                continue;
            }
            auto stream = std::make_unique<MatSignal>(input(), array, channel_, wide, big_);
            describe(*stream, array, channels > 1);
            ++channel_;
            tell();
            return stream;
        }
        return nullptr;
    }

    void describe(SampleStream& stream, const MatArray& array, bool several) {
        Facts facts;
        const auto label = text_for(array, "name");
        facts.name = label.empty() ? readable(array.name) : label;
        if (several) facts.name += " " + std::to_string(channel_ + 1);
        facts.unit = text_for(array, "unit");
        facts.axis_unit = text_for(array, "axis");
        facts.origin = text_for(array, "origin");
        facts.beside = channel_ > 0 && !array.complex;
        const auto rate =
            value_for(array, "rate", {"fs", "Fs", "rate", "samplerate", "sample_rate"});
        const auto delta = value_for(array, "delta", {"dt", "delta", "Ts"});
        if (rate && std::isnormal(*rate)) {
            stream.delta = 1 / *rate;
            facts.axis_unit = "s";
        }
        if (delta && std::isnormal(*delta)) stream.delta = *delta;
        facts.start = value_for(array, "start", {"t0", "start"}).value_or(0);
        if (time_points_ > 1 && time_points_ == stream.length) {
            stream.delta = time_.delta();
            facts.start = time_.start();
        }
        stream.facts = {facts};
        for (const auto& name : std::exchange(used_, {})) {
            if (told_.insert(name).second) note(name + " is taken for all signals");
        }
    }

    void note(const std::string& what) { notes_ += (notes_.empty() ? "" : "; ") + what; }

    void tell() {
        if (notes_.empty()) return;
        std::fprintf(stderr, "wavkit: %s: %s\n", readable(input().name()).c_str(),
                     readable(std::exchange(notes_, {})).c_str());
    }

    bool big_ = false;
    std::vector<MatArray> arrays_;
    std::vector<std::size_t> signals_;  // among the arrays
    std::size_t signal_ = 0;
    std::uint64_t channel_ = 0;
    TimeAxis time_;
    std::size_t time_points_ = 0;
    std::set<std::string> used_, told_;
    std::string notes_;
};

/// Bytes of an element, put together lowest byte first.
class Element {
  public:
    void word(std::uint64_t value, int bytes = 4) {
        for (int i = 0; i < bytes; ++i) bytes_ += char(value >> 8 * i & 0xFF);
    }
    void text(std::uint32_t type, std::string_view text) {
        word(type);
        word(text.size());
        bytes_ += text;
        bytes_.resize(mat::padded(bytes_.size()), '\0');
    }
    /// All of a matrix before its values.
    void head(std::uint32_t kind, std::uint64_t rows, std::uint64_t columns,
              const std::string& name) {
        word(mat::uint32);
        word(8);
        word(kind);
        word(0);
        word(mat::int32);
        word(8);
        word(rows);
        word(columns);
        text(mat::int8, name);
    }
    const std::string& bytes() const { return bytes_; }

  private:
    std::string bytes_;
};

void put(std::FILE* to, const std::string& bytes) {
    std::fwrite(bytes.data(), 1, bytes.size(), to);
}

/// Each signal is put together in a file of its own, for its length comes first.
class MatWriter : public BlockWriter {
  public:
    MatWriter(std::FILE* to, bool single, bool compressed)
        : to_(to), single_(single), compressed_(compressed) {
        std::string header = "MATLAB 5.0 MAT-file, written by wavkit";
        header.resize(124, ' ');
        put(to_, header + std::string("\0\1IM", 4));
    }

    void begin(const SignalShape& shape) override {
        shape_ = shape;
        name_ = identifier(shape.facts_of(0).name);
        parts_.clear();
        for (int i = 0; i < (shape.complex ? 2 : 1); ++i) parts_.push_back(scratch());
        points_ = 0;
    }

    void write(std::span<const double> values) override {
        for (std::size_t p = 0; p < parts_.size(); ++p) {
            Element part;
            for (std::size_t i = p; i < values.size(); i += parts_.size()) {
                if (single_) {
                    part.word(std::bit_cast<std::uint32_t>(float(values[i])));
                } else {
                    part.word(std::bit_cast<std::uint64_t>(values[i]), 8);
                }
            }
            if (std::fwrite(part.bytes().data(), 1, part.bytes().size(), parts_[p].get()) !=
                part.bytes().size()) {
                throw Error("cannot write a temporary file");
            }
        }
        points_ += values.size() / parts_.size();
    }

    void end() override {
        const auto element = scratch();
        put_signal(element.get());
        take(element.get());
        const auto facts = shape_.facts_of(0);
        put_number("delta", shape_.delta);
        if (facts.start != 0) put_number("start", facts.start);
        put_text("origin", facts.origin);
        put_text("axis", facts.axis_unit);
        put_text("unit", facts.unit);
        if (facts.name != name_) put_text("name", facts.name);
    }

  private:
    /// A name that MATLAB accepts, different from those before.
    std::string identifier(const std::string& name) {
        std::string word;
        for (const char c : name) {
            const bool fits =
                (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9');
            if (fits) {
                word += c;
            } else if (!word.empty() && word.back() != '_') {
                word += '_';
            }
        }
        while (word.ends_with('_')) word.pop_back();
        if (word.empty() || (word[0] >= '0' && word[0] <= '9')) word = "x" + word;
        word.resize(std::min<std::size_t>(word.size(), 40));
        auto unique = word;
        for (int i = 2; !names_.insert(unique).second; ++i) unique = word + std::to_string(i);
        return unique;
    }

    void put_signal(std::FILE* to) {
        const std::uint64_t size = points_ * (single_ ? 4 : 8);
        if (points_ > std::uint64_t(std::numeric_limits<std::int32_t>::max()) ||
            size * parts_.size() > 0xFFFFFF00) {
            throw Error("a variable of a MATLAB file holds 4 GiB at most");
        }
        Element head;
        head.head((single_ ? mat::class_single : mat::class_double) |
                      (shape_.complex ? mat::complex_flag : 0),
                  points_, 1, name_);
        Element tag;
        tag.word(mat::matrix);
        tag.word(head.bytes().size() + parts_.size() * (8 + mat::padded(size)));
        put(to, tag.bytes() + head.bytes());
        for (const auto& part : parts_) {
            Element values;
            values.word(single_ ? mat::single : mat::float64);
            values.word(size);
            put(to, values.bytes());
            std::rewind(part.get());
            if (!copy_rest(part.get(), to)) throw Error("cannot copy a temporary file");
            put(to, std::string(mat::padded(size) - size, '\0'));
        }
    }

    void take(std::FILE* element) {
        if (compressed_) return deflate_into(to_, element);
        std::rewind(element);
        if (!copy_rest(element, to_)) throw Error("cannot copy a temporary file");
    }

    void put_variable(const std::string& bytes) {
        Element tag;
        tag.word(mat::matrix);
        tag.word(bytes.size());
        put(to_, tag.bytes() + bytes);
    }

    void put_number(const std::string& what, double value) {
        Element element;
        element.head(mat::class_double, 1, 1, name_ + "_" + what);
        element.word(mat::float64);
        element.word(8);
        element.word(std::bit_cast<std::uint64_t>(value), 8);
        put_variable(element.bytes());
    }

    void put_text(const std::string& what, const std::string& text) {
        if (text.empty()) return;
        Element element;
        element.head(mat::class_char, 1, letters_in(text), name_ + "_" + what);
        element.text(mat::utf8, text);
        put_variable(element.bytes());
    }

    std::FILE* to_;
    bool single_, compressed_;
    SignalShape shape_;
    std::string name_;
    std::set<std::string> names_;
    std::vector<Stream> parts_;  // real and imaginary values
    std::uint64_t points_ = 0;
};

}  // namespace

bool looks_like_mat(const std::string& head) {
    if (head.size() < mat::header_size) return false;
    const auto end = std::string_view(head).substr(124, 4);
    return end == std::string_view("\0\1IM", 4) || end == std::string_view("\1\0MI", 4) ||
           end == std::string_view("\0\2IM", 4);
}

std::unique_ptr<SignalSource> open_mat(InputFile& input, const ReadOptions& options) {
    return std::make_unique<MatFile>(input, options);
}

std::unique_ptr<BlockWriter> mat_writer(std::FILE* to, bool single, bool compressed) {
    return std::make_unique<MatWriter>(to, single, compressed);
}

}  // namespace wavkit::tool
