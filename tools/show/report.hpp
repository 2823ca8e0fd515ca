// What commands tell about files: as text or JSON, of one file or of several side by side.
#pragma once

#include <CLI/CLI.hpp>
#include <cstdio>
#include <functional>
#include <string>
#include <vector>

#include "base/signal.hpp"
#include "show/json.hpp"

namespace wavkit::tool {

/// What there is to tell about a file, written by the command into one of the two.
class Page {
  public:
    Page();
    ~Page();
    Page(const Page&) = delete;
    Page& operator=(const Page&) = delete;

    /// For the eye.
    std::FILE* text() { return stream_; }
    /// What the text is by now.
    std::string written();

    /// For other programs: of the file, and of each of its signals.
    JsonMembers members;
    std::vector<JsonMembers> signals;

    /// Members that describe a signal, the next one of `signals`, to which a command adds its own.
    JsonMembers& add_signal(const Signal& x);
    JsonMembers& add_signal(bool complex, double points, double delta, const Facts& facts = {});

  private:
    char* bytes_ = nullptr;
    std::size_t size_ = 0;
    std::FILE* stream_;
};

/// Which files, and how they are told of.
struct ReportFiles {
    std::vector<std::string> names;
    bool json = false;
    int jobs = 1;
    bool headings = true;  // the name of each file above its text

    void declare(CLI::App& command);
    void declare_json(CLI::App& command);
    void declare_jobs(CLI::App& command);

    /// Throws where two things would go to standard output, or an output or a picture is asked for
    /// and there are several files to fill it.
    void check_single(const std::string& out, const std::string& picture) const;
};

/// Refuses the name of another format for what is written as CSV alone.
void check_table_name(const std::string& out, const std::string& what);

/// Tells of something that is no file, on standard output.
void report(const std::string& command, bool json, const std::function<void(Page&)>& tell);

/// Tells of every file, in their order, `jobs` at a time. A file of several that cannot be used is
/// told on standard error and does not keep the others back; the exit status is 1 then.
void report_files(const std::string& command, const ReportFiles& files,
                  const std::function<void(const std::string& file, Page&)>& tell);

}  // namespace wavkit::tool
