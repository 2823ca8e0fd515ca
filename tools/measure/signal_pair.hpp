// Two signals read sample by sample beside each other: of two files, or two channels of one.
#pragma once

#include <memory>
#include <span>
#include <string>
#include <vector>

#include "files/input.hpp"
#include "files/stream.hpp"

namespace wavkit::tool {

class SignalPair {
  public:
    /// The first signals of two files, or without a second one the first two of one. Throws where
    /// there are none, or they are complex, or of different spacing or beginning.
    SignalPair(const std::string& first, const std::string& second, const ReadOptions& options);

    /// The next samples of both, as many of either; none at the end of the shorter one. Throws for
    /// values that are not finite.
    struct Blocks {
        std::span<const double> x, y;
    };
    Blocks next();

    /// Tells, on standard error, of signals that nobody took, and of samples without a partner.
    void tell_of_rest();

    double delta() const { return delta_; }
    const Facts& facts(std::size_t which) const { return facts_[which]; }
    bool sound() const { return sources_[0]->sound; }
    double done() const { return streams_[0]->done(); }

  private:
    void open(const std::string& file, const ReadOptions& options, bool beside);
    void check() const;
    std::size_t read(std::size_t which);

    std::vector<std::unique_ptr<InputFile>> inputs_;
    std::vector<std::unique_ptr<SignalSource>> sources_;
    std::vector<SampleStream*> streams_;  // one that holds both, or one each
    std::vector<double> whole_;           // the first signal, where the second comes behind it
    std::size_t taken_ = 0;               // of that
    double delta_ = 1;
    Facts facts_[2];
    std::vector<double> values_[2], block_;
    std::size_t samples_ = 0;
    bool uneven_ = false;
};

}  // namespace wavkit::tool
