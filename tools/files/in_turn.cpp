#include "files/in_turn.hpp"

#include <algorithm>
#include <utility>
#include <vector>

#include "base/scratch.hpp"

namespace wavkit::tool {
namespace {

constexpr std::size_t buffered_scalars = 1 << 20;

/// Blocks are turned around before they wait, so that each channel is read back in runs.
class InTurnWriter : public BlockWriter {
  public:
    InTurnWriter(std::unique_ptr<BlockWriter> writer, Apart apart)
        : writer_(std::move(writer)), apart_(apart) {}

    void begin(const SignalShape& shape) override {
        shape_ = shape;
        waiting_.reset();
        const bool fits = apart_ == Apart::complex && !shape.complex;
        if (shape.channels == 1 || fits) return writer_->begin(shape);
        waiting_ = scratch();
        buffer_.clear();
        runs_.clear();
    }

    void write(std::span<const double> values) override {
        if (!waiting_) return writer_->write(values);
        buffer_.insert(buffer_.end(), values.begin(), values.end());
        if (buffer_.size() >= buffered_scalars) keep();
    }

    void end() override {
        if (!waiting_) return writer_->end();
        keep();
        auto alone = shape_;
        alone.channels = 1;
        alone.points = 0;
        for (const auto scalars : runs_) *alone.points += scalars / width();
        for (std::size_t c = 0; c < shape_.channels; ++c) {
            alone.facts = {shape_.facts_of(c)};
            writer_->begin(alone);
            hand_on(c);
            writer_->end();
        }
        waiting_.reset();
    }

  private:
    std::size_t width() const { return shape_.complex ? 2 : 1; }

    /// Writes what is buffered, channel by channel.
    void keep() {
        const auto frame = width() * shape_.channels, frames = buffer_.size() / frame;
        if (frames == 0) return;
        run_.resize(frames * width());
        for (std::size_t c = 0; c < shape_.channels; ++c) {
            for (std::size_t i = 0; i < frames; ++i) {
                std::copy_n(&buffer_[i * frame + c * width()], width(), &run_[i * width()]);
            }
            if (std::fwrite(run_.data(), sizeof(double), run_.size(), waiting_.get()) !=
                run_.size()) {
                fail_with_scratch();
            }
        }
        runs_.push_back(run_.size());
        buffer_.clear();
    }

    void hand_on(std::size_t channel) {
        std::size_t block = 0;  // scalars before it
        for (const auto scalars : runs_) {
            run_.resize(scalars);
            const auto at = (block + channel * scalars) * sizeof(double);
            if (std::fseek(waiting_.get(), long(at), SEEK_SET) != 0 ||
                std::fread(run_.data(), sizeof(double), scalars, waiting_.get()) != scalars) {
                fail_with_scratch();
            }
            writer_->write(run_);
            block += scalars * shape_.channels;
        }
    }

    std::unique_ptr<BlockWriter> writer_;
    Apart apart_;
    SignalShape shape_;
    Stream waiting_{nullptr, std::fclose};
    std::vector<double> buffer_, run_;
    std::vector<std::size_t> runs_;  // scalars of a channel in each block
};

}  // namespace

std::unique_ptr<BlockWriter> in_turn(std::unique_ptr<BlockWriter> writer, Apart apart) {
    return std::make_unique<InTurnWriter>(std::move(writer), apart);
}

}  // namespace wavkit::tool
