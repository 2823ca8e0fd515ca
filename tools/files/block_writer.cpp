#include "files/block_writer.hpp"

#include <wavkit/dsp.h>

#include <limits>
#include <string>
#include <vector>

#include "base/error.hpp"
#include "base/number.hpp"
#include "base/scratch.hpp"
#include "files/facts_text.hpp"
#include "files/in_turn.hpp"
#include "files/mat.hpp"
#include "files/npy.hpp"
#include "files/sound.hpp"
#include "files/writing.hpp"

namespace wavkit::tool {
namespace {

constexpr int data_alone = 0x100, header_alone = 0x200;

int put(const dsp& x, std::FILE* to, int flags) { return dspf_fwrite2(&x, to, flags); }
int put(const dspf& x, std::FILE* to, int flags) { return dspff_fwrite2(&x, to, flags); }

/// Binary and text signal files. Their headers promise a number of points: where it is not known
/// before the end, a binary header is corrected in its place, and a text, whose header would not
/// keep its length, waits in a file of its own.
template <class Record>
class SignalFileWriter : public BlockWriter {
    using Scalar = std::remove_pointer_t<decltype(Record::data)>;

  public:
    SignalFileWriter(std::FILE* to, bool text) : to_(to), text_(text) {}

    void begin(const SignalShape& shape) override {
        facts_ = shape.facts_of(0);
        if (!text_) tell_of_lost_start(facts_);
        part_ = {Scalar(shape.delta), nullptr, 0, int(shape.points.value_or(0)), shape.complex, 0};
        promised_ = shape.points.value_or(0);
        points_ = 0;
        header_at_ = std::ftell(to_);
        if (text_ && !shape.points) {
            waiting_ = scratch();
        } else {
            put_header(promised_);
        }
    }

    void write(std::span<const double> values) override {
        const std::size_t count = values.size() / (part_.complex ? 2 : 1);
        constexpr std::size_t most = std::numeric_limits<int>::max();
        if (count > most - points_) throw Error("more than 2147483647 samples in one signal");
        points_ += count;
        samples_.assign(values.begin(), values.end());
        part_.data = samples_.data();
        part_.points = int(count);
        put(part_, waiting_ ? waiting_.get() : to_, format() | data_alone);
    }

    void end() override {
        if (waiting_) {
            put_header(points_);
            std::rewind(waiting_.get());
            if (!copy_rest(waiting_.get(), to_)) throw Error("cannot copy a temporary file");
            waiting_.reset();
        } else if (points_ != promised_) {
            if (text_) throw Error("the signal has another length than its source says");
            std::fseek(to_, header_at_, SEEK_SET);
            put_header(points_);
            std::fseek(to_, 0, SEEK_END);
        }
    }

  private:
    int format() const { return text_ ? 1 : 0; }

    void put_header(std::size_t points) {
        part_.points = int(points);
        put(part_, to_, format() | header_alone);
        if (text_) write_facts(to_, facts_, true);
    }

    std::FILE* to_;
    bool text_;
    Facts facts_;
    Record part_{};  // borrows the samples of a block
    std::vector<Scalar> samples_;
    std::size_t promised_ = 0, points_ = 0;
    long header_at_ = 0;
    Stream waiting_{nullptr, std::fclose};
};

/// Signals side by side or one after the other, each with a header; values have as many digits as
/// it takes to read the same one again, and times as many as a double holds for certain.
class CsvWriter : public BlockWriter {
  public:
    CsvWriter(std::FILE* to, bool time) : to_(to), time_(time) {}

    void begin(const SignalShape& shape) override {
        if (!first_) std::fputc('\n', to_);
        first_ = false;
        shape_ = shape;
        point_ = 0;
        auto facts = shape.facts_of(0);
        if (time_) {
            facts.start = 0;
            facts.axis_unit.clear();
        } else if (shape.delta != 1) {
            std::fprintf(to_, "# delta = %s\n", number(shape.delta).c_str());
        }
        write_facts(to_, facts, shape.complex);
        if (time_) {
            std::fprintf(to_, "%s,", field(heading("time", shape.facts_of(0).axis_unit)).c_str());
        }
        if (shape.complex) std::fputs("re,im", to_);
        for (std::size_t c = 0; c < shape.channels && !shape.complex; ++c) {
            std::fprintf(to_, "%s%s", c > 0 ? "," : "", field(heading_of_channel(c)).c_str());
        }
        std::fputc('\n', to_);
    }

    void write(std::span<const double> values) override {
        const std::size_t width = shape_.width();
        const double start = shape_.facts_of(0).start;
        for (std::size_t i = 0; i < values.size(); i += width, ++point_) {
            if (time_) std::fprintf(to_, "%.15g,", start + double(point_) * shape_.delta);
            for (std::size_t c = 0; c < width; ++c) {
                if (c > 0) std::fputc(',', to_);
                std::fputs(number(values[i + c]).c_str(), to_);
            }
            std::fputc('\n', to_);
        }
    }

    void end() override {}

  private:
    std::string heading_of_channel(std::size_t c) const {
        const auto facts = shape_.facts_of(c);
        // A first column that is called time would be read as one.
        const bool misleading = c == 0 && !time_ && names_an_axis(facts.name);
        if (!facts.name.empty() && !misleading) return heading(facts.name, facts.unit);
        return heading(shape_.channels > 1 ? "value " + std::to_string(c + 1) : "value",
                       facts.unit);
    }

    /// In quotes where a field holds a separator or begins like a comment.
    static std::string field(const std::string& text) {
        if (text.find_first_of(",;\t\"") == text.npos && !text.starts_with('#')) return text;
        std::string result = "\"";
        for (const char c : text) result += c == '"' ? '\'' : c;
        return result + '"';
    }

    std::FILE* to_;
    bool time_, first_ = true;
    SignalShape shape_;
    std::size_t point_ = 0;
};

}  // namespace

std::unique_ptr<BlockWriter> block_writer(std::FILE* to, Format format,
                                          const WriteOptions& options) {
    if (is_sound(format)) return sound_writer(to, format, options.samples);
    if (format == Format::csv) {  // where one complex signal has two columns
        return in_turn(std::make_unique<CsvWriter>(to, options.time), Apart::complex);
    }
    if (format == Format::npy) return npy_writer(to, options.single.value_or(false));
    if (format == Format::mat) {
        return mat_writer(to, options.single.value_or(false), options.compressed);
    }
    const bool text = format == Format::text;
    if (options.single.value_or(false)) {
        return std::make_unique<SignalFileWriter<dspf>>(to, text);
    }
    return std::make_unique<SignalFileWriter<dsp>>(to, text);
}

}  // namespace wavkit::tool
