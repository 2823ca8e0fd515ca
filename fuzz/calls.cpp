// Calls of the library's functions, one after the other on records that they share: those of a
// family, which WAVKIT_FUZZ names, or any. Whatever they are given, nothing undefined happens,
// records hold together, and inputs stay as they were.
#include <sanitizer/lsan_interface.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <functional>
#include <list>
#include <map>
#include <string>
#include <string_view>
#include <tuple>
#include <utility>
#include <vector>

#include "bytes.hpp"
#include "memory.hpp"
#include "support/one_name.hpp"

namespace wavkit::fuzz {
namespace {

/// The functions of a target, by how their names begin; how many an input may call, and the points
/// of its longest records.
struct Family {
    int calls, longest;
    std::vector<std::string_view> beginnings;
};
const std::map<std::string_view, Family> families = {
    {"calls", {16, 128, {"dsp"}}},
    {"design", {4, 1024, {"dspc_", "dspi_window_fir"}}},
    {"filters", {4, 1024, {"dspd_", "dspi_hwfilt", "dspb_corr", "dspb_pmul"}}},
    {"interpolation",
     {4, 1024, {"dsp_interp", "dsp_cspline", "dspb_cspline", "dspb_inter", "dspi_edge"}}},
    {"measures",
     {4,
      1024,
      {"dsph_", "dspbs_", "dsps_peak", "dsps_pop", "dsps_s", "dsps_m", "dsps_l", "dsps_h"}}},
    {"polynomials",
     {4, 64, {"dsps_peval", "dsps_ps", "dsps_pc", "dsps_pr", "dspi_p", "dspb_pmul"}}},
    {"rates", {4, 1024, {"dspd_deci", "dspd_hwfilt", "dspi_hwfilt", "dspd_rsmp", "dspi_zinter"}}},
    {"transforms",
     {4,
      4096,
      {"dspi_fft", "dspi_rfft", "dspi_irfft", "dspi_dft", "dspi_rdft", "dspi_irdft", "dspi_dct",
       "dspi_analytic", "dspi_hilbert", "dspi_bitrev", "dsph_fft", "dsph_dft", "dspi_zpad",
       "dspi_unzpad", "dspi_orecon", "dspi_recon", "dspi_swap"}}},
    {"windows", {4, 1024, {"dspi_window", "dsp_window"}}},
};

const Family* family;

/// Records that may be left out, by their place among those of the function.
const std::map<std::string_view, int> optional_records = {
    {"dsp_interp", 2},  {"dsp_cspline", 2}, {"dspd_fir", 3},   {"dspd_sfir", 3},   {"dspd_deci", 3},
    {"dspd_hwfilt", 3}, {"dspd_rsmp", 3},   {"dspd_rsmp2", 4}, {"dspi_hwfilt", 2}, {"dsph_avg", 2},
    {"dsph_corr", 3},   {"dspb_corr", 3},   {"dspd_iir", 3}};

/// Records that calls share, and hosts' arrays that some of them borrow.
template <Record R>
class Records {
  public:
    static constexpr std::size_t count = 5;

    explicit Records(Bytes& in) {
        for (auto& x : records_) dsp_init(&x);
        for (auto& x : records_) make(x, in);
        if (in.byte() % 4 == 1) make_view(in);
    }
    ~Records() {
        for (auto& x : records_) dsp_destroy(&x);
    }
    Records(const Records&) = delete;
    Records& operator=(const Records&) = delete;

    R& operator[](std::size_t i) { return records_[i % count]; }

    /// Replaces a record by a new one.
    void make(R& x, Bytes& in) {
        dsp_destroy(&x);
        const int shape = in.byte();
        x.complex = shape & 1;
        const int times = shape & 4 ? std::max(2 * in.byte() - 384, 1) : 1;  // short mostly
        x.points = std::min((shape >> 3) * times, family->longest);
        x.delta = shape & 16 ? scalar<R>(1) : in.scalar<scalar<R>>();
        if (shape & 2) {
            x.data = arrays_.emplace_back(used(&x)).data();
        } else {
            FUZZ_REQUIRE(dsp_alloc(&x) == 0);
        }
        fill(values(&x), in);
    }

    /// After a call that failed: a block that cannot grow is given up on purpose, be it one that a
    /// record came with or had of the call. Of a record that has none any more it is no leak.
    void give_up() const {
        if (std::ranges::all_of(records_, [](const R& x) { return x.data != nullptr; })) return;
        for (const auto block : latest_blocks) {
            __lsan_ignore_object(reinterpret_cast<const void*>(~block));
        }
    }

    /// After a call: what it left must hold together where it succeeded. Where it did not, a record
    /// without its memory begins anew, as one that is too long for further calls does.
    void settle(bool succeeded) {
        for (auto& x : records_) {
            const bool good = holds_together(x);
            FUZZ_REQUIRE(good || !succeeded);
            if (!good || x.points > family->longest) dsp_destroy(&x);
        }
    }

  private:
    /// The first samples are the input's own, the others variations of them.
    static void fill(std::span<scalar<R>> samples, Bytes& in) {
        constexpr std::size_t own = 16;
        for (std::size_t i = 0; i < samples.size(); ++i) {
            samples[i] = i < own ? in.scalar<scalar<R>>() : samples[i % own] + scalar<R>(i % 7);
        }
    }

    /// Makes a record a view of what another one borrows.
    void make_view(Bytes& in) {
        R &x = records_[0], &y = records_[1];
        if (x.alloc > 0 || used(&x) == 0) return;
        const auto first = in.byte() % used(&x);
        dsp_destroy(&y);
        y.complex = in.byte() & 1;
        y.points = int(used(&x) - first) / width(&y);
        y.data = x.data + first;
    }

    bool holds_together(const R& x) const {
        if (x.points < 0 || x.complex < 0 || x.complex > 1 || x.extra != 0) return false;
        if (used(&x) == 0) return true;
        if (!x.data) return false;
        if (x.alloc > 0) return used(&x) <= std::size_t(x.alloc);
        const std::less_equal<> before;
        return std::ranges::any_of(arrays_, [&](const auto& array) {
            return before(array.data(), x.data) &&
                   before(x.data + used(&x), array.data() + array.size());
        });
    }

    std::array<R, count> records_;
    std::list<std::vector<scalar<R>>> arrays_;
};

/// The arguments of a call, one after the other.
template <Record R>
class Arguments {
  public:
    Arguments(std::string_view name, Records<R>& records, Bytes& in)
        : records_(records), in_(in), optional_(optional_records.find(name)) {}

    template <class P>
    P next() {
        if constexpr (std::is_floating_point_v<P>) {
            return in_.scalar<P>();
        } else if constexpr (std::is_integral_v<P>) {
            return P(in_.integer());
        } else if constexpr (std::same_as<P, int*>) {
            return &integer_;
        } else if constexpr (std::same_as<P, scalar<R>*>) {
            return &number_;
        } else if constexpr (std::same_as<P, const dsp*> && !std::same_as<R, dsp>) {
            for (auto& place : places_) place = in_.scalar<double>();
            return &positions_;
        } else if constexpr (std::same_as<P, dsp*> && !std::same_as<R, dsp>) {
            return state_;
        } else {
            return record<P>(in_.byte());
        }
    }

    /// Whether the records that the call only reads are as they were.
    bool inputs_kept() {
        return std::ranges::all_of(inputs_, [&](const Input& input) {
            const R& x = *input.record;
            if (std::ranges::any_of(outputs_, [&](R* out) { return out == &x; })) return true;
            if (input.shared) return true;
            return x.points == input.was.points && x.data == input.was.data &&
                   x.complex == input.was.complex &&
                   std::ranges::equal(std::as_bytes(values(&x)),
                                      std::as_bytes(std::span(input.samples)));
        });
    }
    void note_sharing() {
        for (auto& input : inputs_) {
            input.shared = std::ranges::any_of(
                outputs_, [&](R* out) { return shares_memory<R>(input.record, out); });
        }
    }

  private:
    struct Input {
        const R* record;
        R was;
        std::vector<scalar<R>> samples;
        bool shared = false;
    };

    template <class P>
    P record(std::uint8_t choice) {
        const bool optional = optional_ != optional_records.end() && optional_->second == place_++;
        if (optional && choice >= 128) return nullptr;
        R& x = records_[choice];
        if constexpr (std::same_as<P, const R*>) {
            const auto samples = values(&x);
            inputs_.push_back({&x, x, {samples.begin(), samples.end()}});
        } else {
            outputs_.push_back(&x);
        }
        return &x;
    }

    Records<R>& records_;
    Bytes& in_;
    std::map<std::string_view, int>::const_iterator optional_;
    int place_ = 0;
    std::vector<Input> inputs_;
    std::vector<R*> outputs_;
    int integer_ = 0;
    scalar<R> number_ = 0;
    std::array<double, 6> places_{};  // a row of sections, too
    dsp positions_{1, places_.data(), 0, int(places_.size()), 0, 0};
    Temporary<dsp> state_;  // of calls in single precision
};

template <Record R>
using Call = std::function<void(Records<R>&, Bytes&)>;

template <Record R, class... P>
void call(std::string_view name, int (*function)(P...), Records<R>& records, Bytes& in) {
    Arguments<R> arguments(name, records, in);
    const std::tuple<P...> given{arguments.template next<P>()...};
    arguments.note_sharing();
    const int result = std::apply(function, given);
    if (result < 0) records.give_up();
    FUZZ_REQUIRE(result == 0 || result == -1);
    FUZZ_REQUIRE(arguments.inputs_kept());
    records.settle(result == 0);
}

/// The calls of the family.
template <Record R>
std::vector<Call<R>> calls_of_family() {
    std::vector<Call<R>> calls;
    const auto add = [&]<class... P>(std::string_view name, int (*function)(P...)) {
        const auto begins = [&](std::string_view beginning) { return name.starts_with(beginning); };
        if (std::ranges::none_of(family->beginnings, begins)) return;
        if constexpr (!(std::same_as<P, std::FILE*> || ...)) {
            calls.push_back(
                [=](Records<R>& records, Bytes& in) { call<R>(name, function, records, in); });
        }
    };
    const auto add_twin = [&](const auto& twins) {
        if constexpr (std::same_as<R, dsp>) {
            add(twins.name, twins.of_double);
        } else {
            add(twins.name, twins.of_single);
        }
    };
    one_name::each_function(add_twin);
    return calls;
}

template <Record R>
void run(Bytes& in) {
    static const auto calls = calls_of_family<R>();
    Records<R> records(in);
    for (int i = 0; i < family->calls && !in.empty(); ++i) {
        if (const int renewed = in.byte(); renewed < 32) records.make(records[renewed], in);
        calls[in.byte() % calls.size()](records, in);
    }
}

}  // namespace
}  // namespace wavkit::fuzz

extern "C" {
int LLVMFuzzerInitialize(int*, char***) {
    const char* const name = std::getenv("WAVKIT_FUZZ");
    const auto found = wavkit::fuzz::families.find(name ? name : "calls");
    FUZZ_REQUIRE(found != wavkit::fuzz::families.end());
    wavkit::fuzz::family = &found->second;
    return 0;
}

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    wavkit::fuzz::Bytes in(data, size);
    if (in.byte() & 1) {
        wavkit::fuzz::run<dsp>(in);
    } else {
        wavkit::fuzz::run<dspf>(in);
    }
    return 0;
}
}
