// What holds for every exported function: a row in the table, and records that share a buffer.
#include <set>

#include "support/functions.hpp"

namespace wavkit::test {
namespace {

/// Runs `check(case, n, kinds)` for every function, lengths that suit some, and pairings of kinds.
template <Record R, class Check>
void each_call(Check check) {
    for (const auto& c : every_case<R>()) {
        for (const int n : {1, 5, 6, 7, 8, 9, 200}) {
            for (int kinds = 0; kinds < (c.is_const.size() > 1 ? 4 : 2); ++kinds) {
                SCOPED_TRACE(::testing::Message() << c << ' ' << n << " points, kinds " << kinds);
                check(c, n, kinds);
            }
        }
    }
}

/// The names that only one of two sets has.
std::string in_one(const std::set<std::string>& a, const std::set<std::string>& b) {
    std::string names;
    for (const auto& [some, others] : {std::pair(a, b), std::pair(b, a)}) {
        for (const auto& name : some) names += others.contains(name) ? "" : name + " ";
    }
    return names;
}

BOTH_PRECISIONS(EveryFunction, HasARow) {
    std::set<std::string> rows, all(std::begin(declared), std::end(declared)), names;
    std::istringstream words{std::string(plain)};
    for (std::string name; words >> name;) rows.insert(name);
    for (const auto& [name, cases] : numbers) rows.insert(name);
    for (const auto& c : every_case<R>()) names.insert(c.name);
    EXPECT_EQ(in_one(names, rows), "");
    // A name with an f behind dsp is that of a twin, where there is the name without it.
    const std::set<std::string> copy = all;
    for (const auto& name : copy) {
        if (name.starts_with("dspf") && copy.contains("dsp" + name.substr(4))) all.erase(name);
    }
    EXPECT_EQ(in_one(rows, all), "");
    EXPECT_EQ(2 * rows.size(), copy.size());
}

/// Outputs that are an operand, or that share its buffer, get what outputs apart get.
BOTH_PRECISIONS(EveryFunction, WorksInEveryPlace) {
    each_call<R>([](const Case<R>& c, int n, int kinds) {
        each_sharing(c, [&](auto to, auto from) {
            Run<R> apart(c, n, kinds);
            dsp_copy(apart.records[to], apart.records[from]);
            const auto want = apart();
            // The same record, over a host's array or not; a view of the other's block.
            for (const int way : {0, 1, 2, 3}) {
                Run<R> run(c, n, kinds, to, from);
                Signal<R> owner;
                dsp_copy(owner, run.records[from]);
                R view = *owner.get();
                view.alloc = 0;
                if (way > 0) run.records[from] = way == 3 ? &view : owner.get();
                if (way > 0) run.records[to] = way == 2 ? &view : owner.get();
                EXPECT_TRUE(c.random() || same(run(), want)) << to << " in " << from << ' ' << way;
                EXPECT_TRUE(run.kept()) << to << " in " << from << ' ' << way;
                if (way == 2) dsp_destroy(&view);
            }
        });
    });
}

BOTH_PRECISIONS(EveryFunction, HasACaseThatWorks) {
    std::set<std::string> refused{}, worked;
    each_call<R>([&](const Case<R>& c, int n, int kinds) {
        Run<R> run(c, n, kinds);
        run();
        (run.result < 0 ? refused : worked).insert(c.name);
    });
    for (const auto& name : worked) refused.erase(name);
    EXPECT_EQ(refused,
              (std::set<std::string>{"dspi_erf", "dspi_erfc", "dspi_gamma", "dspi_lgamma"}));
}

}  // namespace
}  // namespace wavkit::test
