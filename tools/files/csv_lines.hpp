// The lines of a file, which can be gone back to.
#pragma once

#include <cstdlib>
#include <string>
#include <string_view>

#include "base/error.hpp"
#include "files/csv_row.hpp"
#include "files/input.hpp"

namespace wavkit::tool {

class Lines {
  public:
    explicit Lines(InputFile& input) : input_(input) { here_.offset = std::ftell(input.stream()); }
    ~Lines() { std::free(line_); }
    Lines(const Lines&) = delete;
    Lines& operator=(const Lines&) = delete;

    struct Place {
        long offset = 0;
        std::size_t number = 0;
    };

    bool next() {
        const auto count = getline(&line_, &room_, input_.stream());
        if (count < 0) return false;
        before_ = here_;
        here_.offset += long(count);
        ++here_.number;
        text_ = {line_, std::size_t(count)};
        while (text_.ends_with('\n') || text_.ends_with('\r')) text_.remove_suffix(1);
        return true;
    }

    /// The line without its end.
    std::string_view text() const { return text_; }
    bool is_empty() const { return trimmed(text_).empty(); }
    bool is_comment() const { return trimmed(text_).starts_with('#'); }
    std::size_t number() const { return here_.number; }
    double done() const { return double(here_.offset) / double(input_.size()); }

    /// The place of the line that next() read, to read it again, and of the one behind it.
    Place place() const { return before_; }
    Place behind() const { return here_; }
    void go_to(Place place) {
        std::fseek(input_.stream(), place.offset, SEEK_SET);
        here_ = place;
    }

    const std::string& name() const { return input_.name(); }
    [[noreturn]] void fail(const std::string& what) const { fail_at(number(), what); }
    [[noreturn]] void fail_at(std::size_t line, const std::string& what) const {
        throw Error(input_.name() + ":" + std::to_string(line) + ": " + what);
    }

  private:
    InputFile& input_;
    char* line_ = nullptr;
    std::size_t room_ = 0;
    std::string_view text_;
    Place before_, here_;
};

}  // namespace wavkit::tool
