#include "files/signal_file.hpp"

#include "base/error.hpp"

namespace wavkit::tool {
namespace {

class SignalFile : public SignalSource {
  public:
    using SignalSource::SignalSource;

  private:
    std::unique_ptr<SampleStream> following() override {
        const int first = std::getc(input().stream());
        if (first == EOF) return nullptr;
        std::ungetc(first, input().stream());
        return begins_binary(first) ? binary_signal(input(), number())
                                    : text_signal(input(), number());
    }
};

}  // namespace

std::unique_ptr<SignalSource> open_signal_file(InputFile& input, const ReadOptions& options) {
    // Some editors begin a text with a byte order mark.
    if (input.head(3) == "\xEF\xBB\xBF") std::fseek(input.stream(), 3, SEEK_SET);
    return std::make_unique<SignalFile>(input, options);
}

void fail_at_signal(const InputFile& input, int number) {
    throw Error("cannot read " + input.name() + ": signal " + std::to_string(number) +
                " is damaged or no signal (columns of numbers take --from csv)");
}

}  // namespace wavkit::tool
