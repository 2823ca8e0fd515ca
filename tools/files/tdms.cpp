#include "files/tdms.hpp"

#include <algorithm>
#include <cmath>
#include <map>
#include <utility>

#include "base/error.hpp"
#include "base/number.hpp"
#include "files/facts_text.hpp"
#include "files/moment.hpp"
#include "files/raw_samples.hpp"

namespace wavkit::tool {
namespace {

constexpr std::uint64_t lead_in = 28;
constexpr std::uint32_t metadata = 1 << 1, new_list = 1 << 2, raw_data = 1 << 3,
                        interleaved = 1 << 5, big_endian = 1 << 6, daqmx = 1 << 7;
constexpr std::uint32_t no_data = 0xFFFFFFFF, as_before = 0;
constexpr std::uint32_t type_string = 0x20, type_timestamp = 0x44;

/// What is known of a data type by its number.
struct Type {
    std::size_t size = 0;  // 0: of no fixed size
    std::optional<Scalar> scalar;
    bool complex = false;
};

Type type_of(std::uint32_t number) {
    static const std::map<std::uint32_t, Type> types{{1, {1, Scalar::i8}},
                                                     {2, {2, Scalar::i16}},
                                                     {3, {4, Scalar::i32}},
                                                     {4, {8, Scalar::i64}},
                                                     {5, {1, Scalar::u8}},
                                                     {6, {2, Scalar::u16}},
                                                     {7, {4, Scalar::u32}},
                                                     {8, {8, Scalar::u64}},
                                                     {9, {4, Scalar::f32}},
                                                     {10, {8, Scalar::f64}},
                                                     {0x19, {4, Scalar::f32}},
                                                     {0x1A, {8, Scalar::f64}},
                                                     {0x08000C, {8, Scalar::f32, true}},
                                                     {0x10000D, {16, Scalar::f64, true}},
                                                     {11, {16, std::nullopt}},
                                                     {0x1B, {16, std::nullopt}},
                                                     {0x21, {1, Scalar::u8}},
                                                     {type_timestamp, {16, std::nullopt}}};
    const auto found = types.find(number);
    return found == types.end() ? Type() : found->second;
}

/// Goes through the bytes of a segment's metadata.
class Cursor {
  public:
    Cursor(InputFile& input, std::span<const unsigned char> bytes, bool big)
        : input_(input), bytes_(bytes), big_(big) {}

    template <class T>
    T number() {
        return number_at<T>(take(sizeof(T)), big_);
    }

    std::string text() {
        const auto length = number<std::uint32_t>();
        const auto* const from = take(length);
        return {from, from + length};
    }

    /// A time as seconds since 1904 and a fraction of 2^-64.
    Moment moment() {
        const auto first = number<std::uint64_t>(), second = number<std::uint64_t>();
        const auto fraction = big_ ? second : first;
        const auto seconds = std::int64_t(big_ ? first : second);
        constexpr std::int64_t from_1904 = 2082844800, furthest = 1000000000000;
        Moment result;
        result.seconds = std::clamp(seconds, -furthest, furthest) - from_1904;
        result.fraction = std::ldexp(double(fraction), -64);
        result.dated = result.timed = result.utc = true;
        return result;
    }

    double scalar(const Type& type) { return scalar_at(take(type.size), *type.scalar, big_); }

    const unsigned char* take(std::size_t count) {
        if (count > bytes_.size() - at_)
            fail_damaged(input_, "a segment's metadata ends too early");
        return bytes_.data() + std::exchange(at_, at_ + count);
    }

  private:
    InputFile& input_;
    std::span<const unsigned char> bytes_;
    bool big_;
    std::size_t at_ = 0;
};

/// The values of a channel in one segment: equal runs at equal distances.
struct Piece {
    std::uint64_t offset, run, runs, distance;  // in the file; values in a run
    std::uint64_t stride;                       // bytes from a value to the next
    bool big;
};

struct Channel {
    std::string path;
    std::uint32_t type = 0;
    std::uint64_t count = 0, bytes = 0;  // of a chunk
    bool has_index = false, mixed = false;
    std::vector<Piece> pieces;
    std::uint64_t points = 0;
    std::map<std::string, double> numbers;
    std::map<std::string, std::string> texts;
    std::optional<Moment> begin;

    bool is_channel() const { return std::ranges::count(path, '/') > 1; }
};

/// The names in "/'group'/'channel'", in which a quote is written twice.
std::vector<std::string> names_in(const std::string& path) {
    std::vector<std::string> names;
    for (std::size_t i = 0; i < path.size(); ++i) {
        if (path[i] != '\'') continue;
        std::string name;
        for (++i; i < path.size(); ++i) {
            if (path[i] == '\'' && (i + 1 == path.size() || path[i + 1] != '\'')) break;
            if (path[i] == '\'') ++i;
            name += path[i];
        }
        names.push_back(name);
    }
    return names;
}

/// Reads what the segments say, and where they hold their values.
class Index {
  public:
    explicit Index(InputFile& input) : input_(input) {}

    std::vector<Channel> channels() {
        const auto size = std::uint64_t(input_.size());
        for (std::uint64_t at = 0; at < size && size - at >= lead_in;) at = read_segment(at);
        return std::move(channels_);
    }

  private:
    /// Gives the place of the next segment.
    std::uint64_t read_segment(std::uint64_t at) {
        const auto head = bytes_at(input_, at, lead_in);
        if (std::string_view(reinterpret_cast<const char*>(head.data()), 4) != "TDSm") {
            fail_damaged(input_, "a segment begins in the wrong place");
        }
        const auto contents = number_at<std::uint32_t>(&head[4], false);
        const bool big = contents & big_endian;
        if (contents & daqmx) {
            fail_damaged(input_, "it holds raw data of DAQmx, which is not read");
        }
        const auto left = std::uint64_t(input_.size()) - at - lead_in;
        const auto next = number_at<std::uint64_t>(&head[12], big);
        const auto raw = number_at<std::uint64_t>(&head[20], big);
        const bool unfinished = next > left;
        const auto length = unfinished ? left : next;
        if (raw > length) fail_damaged(input_, "a segment is shorter than its metadata");
        if (contents & metadata) read_objects(at + lead_in, raw, big, contents & new_list);
        if (contents & raw_data) {
            add_pieces(at + lead_in + raw, length - raw, big, contents & interleaved);
        }
        if (unfinished) {
            std::fprintf(stderr, "wavkit: %s: the last segment is not finished\n",
                         readable(input_.name()).c_str());
        }
        return at + lead_in + length;
    }

    void read_objects(std::uint64_t offset, std::uint64_t length, bool big, bool fresh) {
        const auto bytes = bytes_at(input_, offset, length);
        Cursor cursor(input_, bytes, big);
        if (fresh) active_.clear();
        for (auto count = cursor.number<std::uint32_t>(); count > 0; --count) {
            const auto path = cursor.text();
            const auto [known, is_new] = by_path_.try_emplace(path, channels_.size());
            if (is_new) channels_.emplace_back().path = path;
            auto& channel = channels_[known->second];
            read_index(channel, cursor);
            if (channel.has_index && std::ranges::count(active_, known->second) == 0) {
                active_.push_back(known->second);
            }
            for (auto left = cursor.number<std::uint32_t>(); left > 0; --left) {
                read_property(channel, cursor);
            }
        }
        lay_out();
    }

    /// How long a chunk is, and a sample of all channels where they are interleaved.
    void lay_out() {
        chunk_ = frame_ = 0;
        equal_ = true;
        for (const auto index : active_) {
            const auto& channel = channels_[index];
            chunk_ = std::min(chunk_ + channel.bytes, std::uint64_t(input_.size()) + 1);
            frame_ += type_of(channel.type).size;
            equal_ = equal_ && channel.count == channels_[active_[0]].count;
        }
    }

    void read_index(Channel& channel, Cursor& cursor) {
        const auto length = cursor.number<std::uint32_t>();
        if (length == no_data) {
            channel.has_index = false;
            std::erase(active_, by_path_.at(channel.path));
            return;
        }
        if (length == as_before) {
            if (channel.type == 0) fail_damaged(input_, "a channel refers to no earlier segment");
            channel.has_index = true;
            return;
        }
        if (length == 0x69120000 || length == 0x69130000 || length == 0x00001269 ||
            length == 0x00001369) {
            fail_damaged(input_, "it holds raw data of DAQmx, which is not read");
        }
        const auto type = cursor.number<std::uint32_t>();
        const auto dimensions = cursor.number<std::uint32_t>();
        if (dimensions != 1) fail_damaged(input_, "a channel has several dimensions");
        channel.mixed |= channel.type != 0 && channel.type != type;
        channel.type = type;
        channel.count = cursor.number<std::uint64_t>();
        channel.has_index = true;
        const auto size = std::uint64_t(input_.size());
        const auto width = type_of(type).size;
        if (type == type_string) {
            channel.bytes = std::min(cursor.number<std::uint64_t>(), size + 1);
        } else if (width == 0) {
            fail_damaged(input_, "values of type " + std::to_string(type) + " are not known here");
        } else {
            channel.bytes = channel.count > size / width ? size + 1 : channel.count * width;
        }
    }

    void read_property(Channel& channel, Cursor& cursor) {
        const auto name = cursor.text();
        const auto type = cursor.number<std::uint32_t>();
        if (type == type_string) {
            channel.texts[name] = cursor.text();
        } else if (type == type_timestamp) {
            const auto moment = cursor.moment();
            if (name == "wf_start_time") channel.begin = moment;
        } else if (const auto known = type_of(type); known.size > 0) {
            if (known.scalar) {
                channel.numbers[name] = cursor.scalar(known);
            } else {
                cursor.take(known.size);
            }
        } else if (type != 0) {
            fail_damaged(input_,
                         "a property of type " + std::to_string(type) + " is not known here");
        }
    }

    /// Values of the active channels, chunk after chunk.
    void add_pieces(std::uint64_t offset, std::uint64_t length, bool big, bool in_turn) {
        if (in_turn && !equal_) {
            fail_damaged(input_, "interleaved channels have different lengths");
        }
        if (chunk_ == 0 || chunk_ > length) return;
        const auto chunks = length / chunk_;
        for (const auto index : active_) {
            auto& channel = channels_[index];
            const auto width = type_of(channel.type).size;
            if (channel.count > 0 && width > 0) {
                const auto stride = in_turn ? frame_ : width;
                channel.pieces.push_back({offset, channel.count, chunks, chunk_, stride, big});
                channel.points += channel.count * chunks;
            }
            offset += in_turn ? width : channel.bytes;
        }
    }

    InputFile& input_;
    std::vector<Channel> channels_;
    std::map<std::string, std::size_t> by_path_;
    std::vector<std::size_t> active_;  // channels with values in the segment, in their order
    std::uint64_t chunk_ = 0, frame_ = 0;
    bool equal_ = true;  // all of one length
};

class TdmsSignal : public SampleStream {
  public:
    TdmsSignal(InputFile& input, const Channel& channel) : input_(input), channel_(channel) {
        type_ = type_of(channel.type);
        complex = type_.complex;
        length = std::size_t(channel.points);
    }

    std::size_t read(std::span<double> values) override {
        const std::size_t width = complex ? 2 : 1;
        std::size_t done = 0;
        while (done + width <= values.size() && piece_ < channel_.pieces.size()) {
            const auto& piece = channel_.pieces[piece_];
            const auto most = std::max<std::uint64_t>(block_bytes / piece.stride, 1);
            const auto wanted = std::uint64_t((values.size() - done) / width);
            const auto count = std::min({piece.run - at_, most, wanted});
            take(piece, values.subspan(done, std::size_t(count) * width));
            done += std::size_t(count) * width;
            taken_ += count;
            advance(piece, count);
        }
        return done;
    }

    void skip() override {}  // each channel knows its places

    double done() const override { return double(taken_) / double(channel_.points); }

  private:
    static constexpr std::uint64_t block_bytes = 1 << 16;

    void take(const Piece& piece, std::span<double> values) {
        const std::size_t width = complex ? 2 : 1, count = values.size() / width;
        const auto from = piece.offset + run_ * piece.distance + at_ * piece.stride;
        const auto bytes = bytes_at(input_, from, (count - 1) * piece.stride + type_.size);
        for (std::size_t i = 0; i < count; ++i) {
            for (std::size_t p = 0; p < width; ++p) {
                values[i * width + p] =
                    scalar_at(&bytes[i * piece.stride + p * size_of(*type_.scalar)], *type_.scalar,
                              piece.big);
            }
        }
    }

    void advance(const Piece& piece, std::uint64_t count) {
        at_ += count;
        if (at_ < piece.run) return;
        at_ = 0;
        if (++run_ < piece.runs) return;
        run_ = 0;
        ++piece_;
    }

    InputFile& input_;
    const Channel& channel_;
    Type type_;
    std::size_t piece_ = 0;
    std::uint64_t run_ = 0, at_ = 0, taken_ = 0;
};

class TdmsFile : public SignalSource {
  public:
    TdmsFile(InputFile& file, const ReadOptions& reading) : SignalSource(file, reading) {
        for (auto& channel : Index(file).channels()) {
            if (!channel.is_channel() || channel.type == 0) continue;
            if (!type_of(channel.type).scalar || channel.mixed) {
                std::fprintf(stderr,
                             "wavkit: %s: channel %s holds no plain numbers and is left out\n",
                             readable(file.name()).c_str(), readable(channel.path).c_str());
                continue;
            }
            channels_.push_back(std::move(channel));
        }
    }

  private:
    static std::string group_of(const Channel& channel) {
        const auto names = names_in(channel.path);
        return names.empty() ? std::string() : names[0];
    }

    std::string name_of(const Channel& channel) const {
        const auto names = names_in(channel.path);
        if (names.size() < 2) return channel.path;
        const bool several = std::ranges::any_of(
            channels_, [&](const auto& other) { return group_of(other) != names[0]; });
        return several ? names[0] + "/" + names[1] : names[1];
    }

    static std::string text(const Channel& channel, const std::string& property) {
        const auto found = channel.texts.find(property);
        return found == channel.texts.end() ? std::string() : readable(found->second);
    }

    std::unique_ptr<SampleStream> following() override {
        const auto index = std::size_t(number() - 1);
        if (index >= channels_.size()) return nullptr;
        const auto& channel = channels_[index];
        auto stream = std::make_unique<TdmsSignal>(input(), channel);
        Facts facts;
        facts.name = readable(name_of(channel));
        facts.unit = text(channel, "unit_string");
        const auto& numbers = channel.numbers;
        const auto step = numbers.find("wf_increment"), start = numbers.find("wf_start_offset");
        if (step != numbers.end() && std::isnormal(step->second)) {
            stream->delta = step->second;
            facts.axis_unit = text(channel, "wf_xunit_string");
            if (facts.axis_unit.empty()) facts.axis_unit = "s";
        }
        if (start != numbers.end() && std::isfinite(start->second)) facts.start = start->second;
        if (channel.begin) facts.origin = iso_text(*channel.begin);
        if (index > 0) {
            const auto& before = channels_[index - 1];
            facts.beside = group_of(before) == group_of(channel) && before.points == channel.points;
        }
        stream->facts = {facts};
        return stream;
    }

    std::vector<Channel> channels_;
};

}  // namespace

bool looks_like_tdms(const std::string& head) { return head.starts_with("TDSm"); }

std::unique_ptr<SignalSource> open_tdms(InputFile& input, const ReadOptions& options) {
    return std::make_unique<TdmsFile>(input, options);
}

}  // namespace wavkit::tool
