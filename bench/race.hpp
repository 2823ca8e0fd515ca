// Races: the library, in every instruction set, beside its peers, in turns of a fraction of a
// millisecond, so that a slow moment of the machine hits everybody.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace wavkit::bench {

using Values = std::vector<double>;

struct Runner {
    std::string name;
    std::function<void()> prepare;   // before every run, in time that does not count; may be empty
    std::function<void(long)> run;   // that many operations
    std::function<Values()> result;  // of the last run
};

/// A cell of a family's table.
struct Race {
    std::string family, line, column;
    double points;
    Runner ours;
    std::vector<Runner> peers;
    double tolerance;  // of results, beside the largest value
    long copies = 1;   // operations from one preparation to the next
    long warm = 0;     // operations before results are compared
};

/// Compares all results, then times everybody.
void race(const Race& race);

/// Has the program run a family when its turn comes.
bool add_family(std::function<void()> run);

/// Whether the command line asks for this line.
bool wanted(const std::string& family, const std::string& line);

/// The numbers of points that it asks for; the last one is drawn unless it chooses.
const std::vector<std::size_t>& sizes();

/// Equally distributed from lo to hi, the same in every run.
double uniform(double lo, double hi);

/// A length that nobody chose, from lo to hi, equally distributed over octaves.
std::size_t drawn(std::size_t lo, std::size_t hi);

}  // namespace wavkit::bench
