// Signals changed on their way from one file to another, with a picture of before and after.
#pragma once

#include <functional>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "base/facts.hpp"
#include "measure/block_change.hpp"
#include "show/outline.hpp"

namespace wavkit::tool {

/// What the two panels tell.
struct ComparisonLabels {
    std::string before, after, axis_unit, caption;
    Facts values;
};

/// A signal before and after, as a picture in bounded memory.
class Comparison {
  public:
    /// Of every step-th scalar, between two times if there are any. `together`: at one scale.
    Comparison(ComparisonLabels labels, double delta, const std::vector<double>& times,
               std::size_t step, bool together);

    void add(std::span<const double> in, std::span<const double> out);
    void draw(const std::string& path, const PictureLook& look) const;

  private:
    ComparisonLabels labels_;
    Outline before_, after_;
    std::size_t step_;
    bool together_;
};

/// From where to where, with a picture or without; an output or a picture may be missing.
struct ComparisonFiles {
    std::string in, out, plot;
    std::vector<double> span;  // the times that the picture goes from and to
    ReadOptions reading;
    WriteOptions writing;
    PictureLook look;

    /// Throws where these do not go together. Where nothing else is asked for, not even JSON, the
    /// output is standard output.
    void check(bool json = false);
};

/// One run over all signals of a file.
class ComparedPass {
  public:
    /// `doing` says what is done, for the line of progress.
    ComparedPass(const ComparisonFiles& files, std::string doing);

    /// Has every signal changed by pass().
    void run(const std::function<void(SampleStream&)>& change);

    using Take = std::function<void(std::span<const double> in, std::span<const double> out)>;
    /// What became of a signal, and how its picture is called.
    struct Changed {
        SignalShape shape;
        std::string name;
        bool comparable = true;  // with what it was, at one scale
    };
    /// Hands on, block by block, what `change` makes of a stream.
    void pass(SampleStream& stream, const Changed& changed,
              const std::function<void(const Take&)>& change);

  private:
    const ComparisonFiles& files_;
    std::string doing_;
    InputFile input_;
    bool sound_ = false;
    std::optional<SignalOutput> output_;
    std::optional<Comparison> comparison_;
};

}  // namespace wavkit::tool
