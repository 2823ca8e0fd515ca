// The program: measures all families, or what the command line asks for, and writes the results.
#include "race.hpp"

#include <fftw3.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <limits>
#include <map>
#include <random>
#include <regex>
#include <sstream>

#include "library.hpp"

extern "C" void openblas_set_num_threads(int);

namespace wavkit::bench {
namespace {

std::map<std::string, std::string> options = {
    {"filter", "."},                      // a regular expression, of "family line"
    {"sizes", "256,4096,65536,1048576"},  // points of signals
    {"rounds", "5"},                      // turns of everybody in a race
    {"seed", ""},                         // of drawn lengths; the time where empty
    {"library", ""},                      // ../lib/libwavkit.so beside the program where empty
    {"output", "/dev/stdout"},            // gets the results
    {"about", ""},                        // machine and build, kept with the results
};

std::vector<std::string> sets;
std::ofstream output;
int cells = 0, wrong = 0;

constexpr double slice = 1e-4;  // seconds of a turn, at least

double now() {
    using namespace std::chrono;
    return duration<double>(steady_clock::now().time_since_epoch()).count();
}

/// What reading the clock costs.
double clock_cost() {
    double least = 1;
    for (int i = 0; i < 1000; ++i) {
        const double start = now();
        least = std::min(least, now() - start);
    }
    return least;
}

/// One side of a race, with what it takes to fill a turn.
struct Side {
    const Runner& runner;
    std::size_t set;
    long copies;
    long count = 1;  // of runs after a preparation each, or of operations where there is none
    double best = std::numeric_limits<double>::infinity();

    /// The seconds of a turn; those of an operation go into `best`.
    double turn() {
        static const double cost = clock_cost();
        const long runs = runner.prepare ? count : 1, operations = runner.prepare ? copies : count;
        double taken = 0;
        use(set);
        for (long i = 0; i < runs; ++i) {
            if (runner.prepare) runner.prepare();
            const double start = now();
            runner.run(operations);
            taken += now() - start - cost;
        }
        best = std::min(best, std::max(taken, 1e-9) / double(runs * operations));
        return taken;
    }

    void fill_turn() {
        double taken = turn();
        while ((taken = turn()) < slice / 4 && count < 1 << 20) count *= 4;
        count = std::max(1L, long(double(count) * slice / std::max(taken, 1e-9)));
    }

    Values result(long warm) {
        use(set);
        for (long i = 0; i < warm; ++i) runner.run(1);
        if (runner.prepare) runner.prepare();
        runner.run(copies);
        return runner.result();
    }
};

/// The largest difference, beside the largest value.
double difference(const Values& a, const Values& b) {
    if (a.size() != b.size() || a.empty()) return std::numeric_limits<double>::infinity();
    double most = 0, largest = 0;
    for (std::size_t i = 0; i < a.size(); ++i) {
        const double apart = std::fabs(a[i] - b[i]);
        if (!(apart <= most)) most = apart;  // NaN stays
        largest = std::max(largest, std::fabs(b[i]));
    }
    return largest > 0 ? most / largest : most;
}

void compare(const Race& race, std::vector<Side>& sides) {
    const Values expected = sides.front().result(race.warm);
    for (std::size_t i = 1; i < sides.size(); ++i) {
        const double apart = difference(sides[i].result(race.warm), expected);
        if (apart <= race.tolerance) continue;
        ++wrong;
        std::fprintf(stderr, "WRONG: %s: %s, %s: %s differs from %s by %g\n", race.family.c_str(),
                     race.line.c_str(), race.column.c_str(),
                     (i < sets.size() ? sets[i] : sides[i].runner.name).c_str(), sets[0].c_str(),
                     apart);
    }
}

std::string json(const std::vector<Side>& sides, std::size_t first, std::size_t end) {
    std::ostringstream text;
    for (std::size_t i = first; i < end; ++i) {
        text << (i > first ? ", \"" : "{\"") << (i < sets.size() ? sets[i] : sides[i].runner.name)
             << "\": " << sides[i].best;
    }
    return text.str() + "}";
}

std::vector<std::function<void()>>& families() {
    static std::vector<std::function<void()>> all;
    return all;
}

int run(int argc, char** argv) {
    for (int i = 1; i < argc; ++i) {
        const std::string word = argv[i];
        const auto end = word.find('=');
        const auto option = options.find(word.substr(0, end).erase(0, 2));
        if (end == std::string::npos || option == options.end()) {
            std::fprintf(stderr, "Usage: %s [OPTION=VALUE ...], the options and what they are:\n",
                         argv[0]);
            for (const auto& [name, value] : options) {
                std::fprintf(stderr, "  --%s=%s\n", name.c_str(), value.c_str());
            }
            return 2;
        }
        option->second = word.substr(end + 1);
    }
    if (options["seed"].empty()) options["seed"] = std::to_string(std::time(nullptr));
    const auto beside = std::filesystem::read_symlink("/proc/self/exe").parent_path();
    if (options["library"].empty()) options["library"] = beside / "../lib/libwavkit.so";
    sets = load_sets(options["library"]);
    openblas_set_num_threads(1);
    fftw_set_timelimit(20);
    fftwf_set_timelimit(20);
    output.open(options["output"]);
    output << "{\"about\": \"" << options["about"] << "\", \"seed\": " << options["seed"]
           << ", \"cells\": [";
    for (const auto& family : families()) family();
    output << "\n]}\n";
    if (wrong) std::fprintf(stderr, "%d results are WRONG\n", wrong);
    return wrong ? 1 : 0;
}

}  // namespace

bool add_family(std::function<void()> run) {
    families().push_back(std::move(run));
    return true;
}

bool wanted(const std::string& family, const std::string& line) {
    static const std::regex filter(options["filter"]);
    return std::regex_search(family + " " + line, filter);
}

const std::vector<std::size_t>& sizes() {
    static const auto all = [] {
        std::vector<std::size_t> numbers;
        std::istringstream text(options["sizes"]);
        for (std::string n; std::getline(text, n, ',');) numbers.push_back(std::stoul(n));
        if (numbers == std::vector<std::size_t>{256, 4096, 65536, 1048576}) {
            numbers.push_back(drawn(100, 1 << 20));
        }
        return numbers;
    }();
    return all;
}

double uniform(double lo, double hi) {
    static std::mt19937_64 bits(1);
    return std::uniform_real_distribution<double>(lo, hi)(bits);
}

std::size_t drawn(std::size_t lo, std::size_t hi) {
    static std::mt19937_64 bits(std::stoull(options["seed"]));
    std::uniform_real_distribution<double> octaves(std::log2(double(lo)), std::log2(double(hi)));
    return std::size_t(std::exp2(octaves(bits)));
}

void race(const Race& race) {
    std::vector<Side> sides;
    for (std::size_t set = 0; set < sets.size(); ++set) {
        sides.push_back({race.ours, set, race.copies});
    }
    for (const Runner& peer : race.peers) sides.push_back({peer, sets.size() - 1, race.copies});
    compare(race, sides);
    for (Side& side : sides) side.fill_turn();
    // What takes long is not repeated as often.
    double taken = 0;
    for (int round = 0; round < std::stoi(options["rounds"]) && (round < 2 || taken < 1); ++round) {
        for (Side& side : sides) taken += side.turn();
    }
    output << (cells++ ? ",\n" : "\n") << "{\"family\": \"" << race.family << "\", \"line\": \""
           << race.line << "\", \"column\": \"" << race.column << "\", \"points\": " << race.points
           << ", \"sets\": " << json(sides, 0, sets.size())
           << ", \"peers\": " << json(sides, sets.size(), sides.size()) << "}" << std::flush;
}

}  // namespace wavkit::bench

int main(int argc, char** argv) { return wavkit::bench::run(argc, argv); }
