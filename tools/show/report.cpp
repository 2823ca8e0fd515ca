#include "show/report.hpp"

#include <algorithm>
#include <atomic>
#include <condition_variable>
#include <cstdlib>
#include <exception>
#include <mutex>
#include <new>
#include <optional>
#include <thread>

#include "base/error.hpp"
#include "base/progress.hpp"
#include "base/text.hpp"
#include "files/format.hpp"
#include "files/stream.hpp"
#include "show/plot.hpp"

namespace wavkit::tool {
namespace {

void print(const std::string& text) { std::fwrite(text.data(), 1, text.size(), stdout); }

/// The line of a file, or of what is no file.
std::string json_line(const std::string& command, const std::string* file, const Page& page) {
    JsonMembers line{{"command", json_text(command)}};
    if (file) line.emplace_back("file", json_text(*file));
    line.insert(line.end(), page.members.begin(), page.members.end());
    if (file) {
        std::vector<std::string> signals;
        for (const auto& members : page.signals) signals.push_back(json_object(members));
        line.emplace_back("signals", json_list(signals));
    }
    return json_object(line) + "\n";
}

/// What became of a file.
struct Told {
    std::string text, complaint;
    std::exception_ptr misuse;  // bad usage ends all
};

/// One run over several files. Worker threads take the next file when they have done one; the
/// thread that began prints in the order of the files.
class SeveralFiles {
  public:
    SeveralFiles(const ReportFiles& files, std::function<std::string(const std::string&)> tell)
        : files_(files), tell_(std::move(tell)), told_(files.names.size()) {}

    void run() {
        const auto count = std::min(std::size_t(files_.jobs), told_.size());
        std::vector<std::jthread> workers;
        for (std::size_t i = 0; i < count; ++i) workers.emplace_back([this] { work(); });
        bool failed = false;
        for (std::size_t i = 0; i < told_.size(); ++i) {
            const auto& told = wait_for(i);
            if (told.misuse) {
                next_ = told_.size();
                std::rethrow_exception(told.misuse);
            }
            failed = failed || !told.complaint.empty();
            show(i, told);
        }
        if (failed) throw CLI::RuntimeError(1);
    }

  private:
    void work() {
        for (std::size_t i = next_++; i < files_.names.size(); i = next_++) {
            auto told = outcome(files_.names[i]);
            {
                const std::lock_guard lock(mutex_);
                told_[i] = std::move(told);
                progress_.done(double(++done_) / double(told_.size()));
            }
            more_.notify_one();
        }
    }

    Told outcome(const std::string& file) const {
        try {
            return {tell_(file), {}, nullptr};
        } catch (const UsageError&) {
            return {{}, {}, std::current_exception()};
        } catch (const std::bad_alloc&) {
            return {{}, file + ": out of memory", nullptr};
        } catch (const std::exception& error) {
            return {{}, error.what(), nullptr};
        }
    }

    const Told& wait_for(std::size_t i) {
        std::unique_lock lock(mutex_);
        more_.wait(lock, [&] { return told_[i].has_value(); });
        return *told_[i];
    }

    void show(std::size_t i, const Told& told) {
        if (!told.complaint.empty()) {
            std::fflush(stdout);
            std::fprintf(stderr, "wavkit: %s\n", printable(told.complaint).c_str());
            return;
        }
        if (!files_.json && files_.headings) {
            const auto& name = files_.names[i];
            print((shown_ ? "\n" : "") + (name == "-" ? "standard input" : printable(name)) +
                  ":\n");
        }
        print(told.text);
        shown_ = true;
    }

    const ReportFiles& files_;
    std::function<std::string(const std::string&)> tell_;
    std::vector<std::optional<Told>> told_;
    std::atomic<std::size_t> next_{0};
    std::size_t done_ = 0;
    bool shown_ = false;
    std::mutex mutex_;
    std::condition_variable more_;
    Progress progress_{"working on several files"};
};

}  // namespace

Page::Page() : stream_(open_memstream(&bytes_, &size_)) {
    if (!stream_) throw std::bad_alloc();
}

Page::~Page() {
    std::fclose(stream_);
    std::free(bytes_);
}

std::string Page::written() {
    std::fflush(stream_);
    return {bytes_, size_};
}

JsonMembers& Page::add_signal(const Signal& x) {
    return add_signal(x->complex, x->points, x->delta, x.facts);
}

JsonMembers& Page::add_signal(bool complex, double points, double delta, const Facts& facts) {
    signals.push_back({{"signal", std::to_string(signals.size() + 1)},
                       {"complex", complex ? "true" : "false"},
                       {"points", json_number(points)},
                       {"delta", json_number(delta)}});
    auto& added = signals.back();
    if (facts.start != 0) added.emplace_back("start", json_number(facts.start));
    for (const auto& [name, text] : {std::pair("origin", facts.origin),
                                     {"axis_unit", facts.axis_unit},
                                     {"name", facts.name},
                                     {"unit", facts.unit}}) {
        if (!text.empty()) added.emplace_back(name, json_text(text));
    }
    return added;
}

void ReportFiles::declare(CLI::App& command) {
    command.add_option("FILE", names, "files to read; - is standard input")->required();
    declare_json(command);
    declare_jobs(command);
}

void ReportFiles::declare_json(CLI::App& command) {
    command.add_flag("--json", json, "print JSON, a line for every file");
}

void ReportFiles::declare_jobs(CLI::App& command) {
    command.add_option("--jobs", jobs, "files to work on at the same time (default: 1)")
        ->check(CLI::Range(1, 1024))
        ->type_name("N");
}

void ReportFiles::check_single(const std::string& out, const std::string& picture) const {
    check_apart(out, picture, json);
    if (names.size() < 2) return;
    if (!out.empty()) throw UsageError("-o is for the result of one file");
    if (!picture.empty()) throw UsageError("a picture is for one file");
}

void check_table_name(const std::string& out, const std::string& what) {
    const auto format = out == "-" ? std::nullopt : format_of_name(out);
    if (format.value_or(Format::csv) == Format::csv) return;
    throw UsageError(what + " cannot be written as a " + description(*format) + ", only as CSV");
}

void report(const std::string& command, bool json, const std::function<void(Page&)>& tell) {
    Page page;
    tell(page);
    print(json ? json_line(command, nullptr, page) : page.written());
}

void report_files(const std::string& command, const ReportFiles& files,
                  const std::function<void(const std::string&, Page&)>& tell) {
    check_standard_input(files.names);
    const auto told = [&](const std::string& file) {
        Page page;
        with_data_of(file, [&] { tell(file, page); });
        return files.json ? json_line(command, &file, page) : page.written();
    };
    if (files.names.size() == 1) return print(told(files.names[0]));
    SeveralFiles(files, told).run();
}

}  // namespace wavkit::tool
