// Every exported function, called with arguments that its signature asks for.
#pragma once

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstring>
#include <functional>
#include <list>
#include <map>
#include <memory>
#include <span>
#include <string_view>
#include <tuple>

#include "files.hpp"
#include "signals.hpp"

namespace wavkit::test {

/// Functions that take records alone, or for whose numbers 1 and 1/4 do: with those that follow,
/// all that there are.
inline constexpr std::string_view plain =
    "dsp_alloc dsp_append dsp_cmp dsp_copy dsp_copy_at_most dsp_cspline dsp_destroy "
    "dsp_free_internal dsp_init dsp_lib_alloc dsp_lib_free dsp_lib_init dsp_lib_realloc "
    "dsp_version dsp_window_from_str dsp_window_to_str dspb_add dspb_avg_add dspb_conj_mul "
    "dspb_div dspb_inter dspb_max dspb_min dspb_mul dspb_pmul dspb_ritoc dspb_sub dspbs_dot "
    "dspc_cexp dspc_cos dspc_iir dspc_iir_delay dspc_iir_response dspc_iir_state dspc_iir_zpk "
    "dspc_line dspc_octave dspc_octaves dspc_rsmp_cos dspc_seed dspc_weighting dspd_fir dspd_iir "
    "dspf_fclose dspf_fopen dspf_fwrite dspf_fwrite_ascii dsph_levels dsph_rsmp_angle dspi_abs "
    "dspi_acos dspi_addcos dspi_analytic dspi_asin dspi_atan dspi_besi0 dspi_besj0 dspi_besj1 "
    "dspi_besy0 dspi_besy1 dspi_bitrev dspi_bitrev_scale dspi_conj dspi_cos dspi_cosh "
    "dspi_cscale dspi_db dspi_differ dspi_erf dspi_erfc dspi_exp dspi_exp10 dspi_gamma "
    "dspi_hilbert dspi_hwfilt dspi_imag dspi_integ dspi_irfft dspi_lgamma dspi_log dspi_log10 "
    "dspi_mag dspi_magsq dspi_neg dspi_offset dspi_pdiffer dspi_phase dspi_proots dspi_ptor "
    "dspi_pztoc dspi_rdft dspi_real dspi_recip dspi_recon dspi_rev dspi_rfft dspi_rtoc dspi_rtop "
    "dspi_scale dspi_shift dspi_shuffle dspi_sin dspi_sinc dspi_sinh dspi_sort dspi_sqrt "
    "dspi_square dspi_swap_halves dspi_swap_halves2 dspi_tan dspi_tanh dspi_timesi dspi_unwrap "
    "dspi_window_cos dspi_window_gauss dspi_window_sinc dspi_zero dspi_zinter dsps_excess "
    "dsps_gmean dsps_hmean dsps_lin_regres dsps_lin_regres2 dsps_magsq_sum dsps_max dsps_mean "
    "dsps_median dsps_min dsps_pcsolve dsps_peval dsps_pop_stddev dsps_pop_var dsps_proots "
    "dsps_psolve dsps_rms dsps_samp_stddev dsps_samp_var dsps_skew dsps_sum dspu_mag dspu_magsq "
    "dspu_sqrt";

using Cases = std::vector<std::vector<double>>;

/// Every window of the catalogue, in one scale mode or another.
inline Cases each_window() {
    Cases cases{{3, 0}, {14, 4}};
    for (int id = 0; id < 24; ++id) cases.push_back({double(id), double(id % 3)});
    return cases;
}

/// Every average, with a share of the caller's and with one that forgets, of powers.
inline Cases each_average() {
    Cases cases{{1, 1}, {1, 2, 1, -1}};
    for (int type = 1; type < 7; ++type) {
        cases.push_back({double(type), 2});
        cases.push_back({double(type | 0x30), 4, 3, -1, 3});
    }
    return cases;
}

/// The numbers that other functions are given, in the order of their parameters: a case a list.
/// Integers that are not there are 1, scalars 1/4; a number stands for a stream, too.
inline const std::map<std::string, Cases> numbers = {
    {"dsp_interp", {{1}, {3}, {5}}},
    {"dsp_realloc", {{0}, {1}, {300}}},
    {"dsp_window2_enbw", {{6, 100, 17.5}}},
    {"dsp_window2_scale", {{6, 8, 100, 17.5}, {14, 5, 33}}},
    {"dsp_window_enbw", {{14, 10}}},
    {"dsp_window_scale", {{20, 1, 10}}},
    {"dspb_corr", {{3}}},
    {"dspb_cspline_2d", {{0, 0, 0, 0}, {1, 2, 3, 2}}},
    {"dspc_fir", {{3}, {4, 0}, {7, 0.05}}},
    {"dspc_fir2", {{100}, {101}}},
    {"dspc_integrator", {{1, 0.3}, {2, 0.25}}},
    {"dspc_rand", {{0}, {1}, {3}}},
    {"dspc_rsmp", {{2, 0.2, 0.8, 40}}},
    {"dspc_rsmp_pcos", {{3, 0.4, 2}}},
    {"dspd_deci", {{1}, {3}}},
    {"dspd_hampel", {{3, 1, 0, 0}, {18, 3, 2, 1}}},
    {"dspd_iir_zero_phase", {{-1}, {3}}},
    {"dspd_hwfilt", {{0}, {1}, {2}}},
    {"dspd_median", {{3, 1, 1}, {17, 0, 0}, {256, 2, 0}}},
    {"dspd_rsmp", {{3, 2}}},
    {"dspd_rsmp2", {{1}, {3}}},
    {"dspd_savgol", {{5, 2, 1, 1}, {9, 3, 0, 0}}},
    {"dspd_sfir", {{0, 1}, {1, 0}}},
    {"dspf_fread", {{0}, {1}, {2}, {3}, {4}}},
    {"dspf_fwrite2", {{0, 0}, {0, 1}}},
    {"dsph_avg", each_average()},
    {"dsph_corr", {{1, 0}, {3, 1}}},
    {"dsph_cross", {{4, 2, 2, 1}, {5, 7, 14, 0}}},
    {"dsph_dft", {{20, 0}, {2, 1}, {0, 4}, {0, 0x80}}},
    {"dsph_distortion", {{0.25, 3, 0}, {0.2, 2, 2}}},
    {"dsph_fft", {{0, 1, 2, 0}, {0, 1, 0, 1}, {0, 1, 0, 4}, {0, 1, 0, 0x80}, {700, 0.5, 6, 2}}},
    {"dsph_istft", {{0, 8, 3, 0, 1}, {20, 5, 2, 2, 0}}},
    {"dsph_stft", {{2, 8, 3, 0, 1}, {20, 5, 2, 2, 0}}},
    {"dspi_czt", {{7, 0.1, 0.01, 1}, {3, -0.2, 0.3, 1.01}}},
    {"dspi_dct", {{0}, {3}}},
    {"dspi_dft", {{0}, {1}}},
    {"dspi_edge", {{0, 4.5}}},
    {"dspi_fft", {{0}, {1}}},
    {"dspi_irdft", {{0}, {1}}},
    {"dspi_limit", {{2, 3}}},
    {"dspi_orecon", {{0}, {1}}},
    {"dspi_unzpad", {{3, 0x200}}},
    {"dspi_window", each_window()},
    {"dspi_window2", {{2, 8, 3}, {9, 9, 3.5}}},
    {"dspi_window_fir", {{16}, {100}, {101}, {103}}},
    {"dspi_window_kaiser", {{3, 1}}},
    {"dspi_zpad", {{700}}},
    {"dspi_zpad2", {{700, 0x301}}},
    {"dsph_goertzel", {{0}, {2}}},
    {"dsph_response", {{0}, {6}, {7}}},
    {"dsph_zoom", {{5, 0.1, 0.3, 2, 0}, {1, 0.2, 0, 0, 4}}},
    {"dsps_hist", {{0, 2, 6}}},
    {"dsps_peak", {{0, 0}, {0x100, 0}, {0x1200, 2}}},
    {"dsps_peaks", {{1.05, 0.01, 2, 0.01, 0.1, 0.5}}},
    {"dsps_sine_fit", {{0.25, 1}, {0.2, 0}, {0, 0}}},
    {"dspu_subvec", {{1, 3}}},
};

/// Records that may be left out, by their place among those of the function.
inline const std::map<std::string, std::size_t> optional_records = {
    {"dsp_interp", 2},  {"dsp_cspline", 2},     {"dspd_fir", 3},    {"dspd_sfir", 3},
    {"dspd_deci", 3},   {"dspd_hwfilt", 3},     {"dspd_iir", 3},    {"dspd_rsmp", 3},
    {"dspd_rsmp2", 4},  {"dspi_hwfilt", 2},     {"dsph_avg", 2},    {"dsph_corr", 3},
    {"dspb_corr", 3},   {"dsph_distortion", 2}, {"dspd_savgol", 2}, {"dspd_median", 2},
    {"dspd_hampel", 3}, {"dsph_stft", 2},       {"dsph_istft", 2}};

/// Functions that read a whole number behind the history of a stream, where there is one.
inline bool keeps_place(const std::string& name) {
    return name == "dspd_deci" || name == "dspd_rsmp" || name.ends_with("_hwfilt");
}

/// Functions whose last record is a state that knows what it is one of.
inline bool begins_anew(const std::string& name) {
    return name == "dsph_cross" || name == "dsph_goertzel";
}

/// Writes a signal whose header is followed by zeros.
template <class T>
void fill_stream(std::uint32_t magic, std::int32_t n, FILE* stream) {
    const T delta = 1, last = 0;
    const std::int32_t head[] = {n, 0};
    std::fwrite(&magic, sizeof magic, 1, stream);
    std::fwrite(head, sizeof head, 1, stream);
    std::fwrite(&delta, sizeof delta, 1, stream);
    std::fseek(stream, long(sizeof(T)) * (n - 1), SEEK_CUR);
    std::fwrite(&last, sizeof last, 1, stream);
}

/// What streams begin with: a short text and a long one, a signal of either precision, and one that
/// readers take in several steps.
inline void fill_stream(int which, FILE* stream) {
    if (which < 2) {
        for (int i = 0; i < (which ? 2048 : 3); ++i) std::fputs("1 2 ", stream);
    } else if (which == 2) {
        fill_stream<double>(0xEB0110BE, 3, stream);
    } else {
        fill_stream<float>(0xEB0220BE, which == 3 ? 3 : (1 << 20) + 1, stream);
    }
    std::rewind(stream);
}

/// What a call is given, and what it leaves beside its result.
template <Record R>
struct Arguments {
    std::vector<R*> records;  // in the order of the parameters, null for one that is left out
    std::vector<double> numbers;
    std::unique_ptr<FILE, int (*)(FILE*)> stream{nullptr, std::fclose};
    int integer = 0;
    scalar<R> number = 0;
    std::size_t next_record = 0, next_number = 0;
    // What single-precision functions take in double precision: positions or a section, and a
    // state.
    std::array<double, 6> places{0.25, 7.5, 2, 1, 0.5, 0.25};
    dsp positions{1, places.data(), 0, int(places.size()), 0, 0};
    Signal<dsp> state{};

    template <class P>
    P next() {
        if constexpr (std::is_arithmetic_v<P>) {
            if (next_number < numbers.size()) return P(numbers[next_number++]);
            return std::integral<P> ? P(1) : P(0.25);
        } else if constexpr (std::same_as<P, int*>) {
            return &integer;
        } else if constexpr (std::same_as<P, scalar<R>*>) {
            return &number;
        } else if constexpr (std::same_as<P, FILE*>) {
            stream.reset(temporary_file());
            fill_stream(next<int>(), stream.get());
            return stream.get();
        } else if constexpr (std::same_as<P, const dsp*> && !std::same_as<R, dsp>) {
            return &positions;
        } else if constexpr (std::same_as<P, dsp*> && !std::same_as<R, dsp>) {
            return state;
        } else {
            return records[next_record++];
        }
    }
};

/// A function with its numbers.
template <Record R>
struct Case {
    std::string name;
    std::vector<bool> is_const;  // of its records
    std::function<int(Arguments<R>&)> call;
    std::vector<double> numbers;
    std::size_t optional;  // place of a record that may be left out, or beyond them
    bool leaves_out;       // whether it is

    bool random() const { return name == "dspc_rand" || name == "dspi_shuffle"; }
    /// Whether no other thread may be inside the library.
    bool alone() const { return name == "dsp_free_internal" || name.starts_with("dsp_lib_"); }
    /// Whether its input is a long stream, whatever its records are.
    bool reads_long() const { return name == "dspf_fread" && numbers[0] == 4; }
    friend std::ostream& operator<<(std::ostream& stream, const Case& c) {
        return stream << c.name << listed(c.numbers)
                      << (c.leaves_out ? " without its optional record" : "");
    }
};

/// One of two functions of the same signature, as the precision asks.
template <Record R, class Function>
constexpr Function* pick(Function* of_double, Function* of_single) {
    return std::same_as<R, dsp> ? of_double : of_single;
}

/// Gives `add` what has no record among its parameters, or is to be called in a way of its own.
template <Record R, class Add>
void add_own_calls(Add add) {
    add("dsp_init", [](R* x) {
        R fresh;
        return status(dsp_init(&fresh) || dsp_copy(x, &fresh));
    });
    add("dsp_alloc", [](R* x) { return status(dsp_alloc(x) || dspi_zero(x)); });
    add("dsp_realloc", [](R* x, int more) {
        const std::size_t had = used(x);
        const int points = x->points;
        x->points += more;
        if (dsp_realloc(x, points, x->complex)) return -1;
        std::ranges::fill(values(x).subspan(had), scalar<R>(0));
        return 0;
    });
    add("dsp_destroy", [](R* x) { return dsp_destroy(x); });
    add("dsp_free_internal", [](R* x) {
        return status(dspi_window(x, DSP_WINDOW_HANN, 0) || dspi_dft(x, 0) || free_internal<R>());
    });
    add("dsp_lib_init", [](R*) { return pick<R>(::dsp_lib_init, ::dspf_lib_init)(); });
    add("dsp_version", [](R*) { return pick<R>(::dsp_version, ::dspf_version)(); });
    add("dsp_lib_alloc", [](R*) {
        void (*hook)(R*);
        return status(dsp_lib_alloc(nullptr, &hook) || dsp_lib_alloc(hook, nullptr));
    });
    add("dsp_lib_realloc", [](R*) {
        void (*hook)(R*, int, int);
        return status(dsp_lib_realloc(nullptr, &hook) || dsp_lib_realloc(hook, nullptr));
    });
    add("dsp_lib_free", [](R*) {
        void (*hook)(R*);
        return status(dsp_lib_free(nullptr, &hook) || dsp_lib_free(hook, nullptr));
    });
    add("dsp_window_to_str", [](int* first, int window) {
        char name[8];
        const int result = pick<R>(::dsp_window_to_str, ::dspf_window_to_str)(window, name, 8);
        *first = name[0];
        return result;
    });
    add("dsp_window_from_str", [](int* window) {
        return pick<R>(::dsp_window_from_str, ::dspf_window_from_str)("Hann", window);
    });
    constexpr auto open_and_close = [](R*) {
        FILE* const file = pick<R>(::dspf_fopen, ::dspff_fopen)(null_device, "rb");
        return file ? pick<R>(::dspf_fclose, ::dspff_fclose)(file) : -1;
    };
    add("dspf_fopen", open_and_close);
    add("dspf_fclose", open_and_close);
    add("dsph_response", [](const R* x, R* out, int kind) {
        Signal<dsp> state;
        return status(dsph_cross(x, x, state, 4, 2, DSP_WINDOW_HANN, 0) ||
                      dsph_response(state, out, kind));
    });
    add("dspc_octave", [](R*) {
        Signal<dsp> rows;
        return pick<R>(::dspc_octave, ::dspfc_octave)(rows, 1000, 3, 48000);
    });
    add("dspc_octaves", [](R*) {
        Signal<dsp> centres;
        return pick<R>(::dspc_octaves, ::dspfc_octaves)(centres, 3, 100, 5000);
    });
    add("dspc_weighting", [](R*) {
        Signal<dsp> rows;
        return pick<R>(::dspc_weighting, ::dspfc_weighting)(rows, DSP_WEIGHTING_A, 48000);
    });
    add("dsph_levels", [](const R* x, R* out) {
        double row[] = {1, 0.5, 0.25, 1, -0.5, 0.25};
        const dsp sections{1, row, 0, int(std::size(row)), 0, 0};
        Signal<dsp> state;
        return dsph_levels(x, out, &sections, 2, 1, state);
    });
    add("dsph_rsmp_angle", [](const R* x, R* out) {
        double at[] = {0.25, 1, 2, 4.5, 7.5};
        const dsp pulses{1, at, 0, int(std::size(at)), 0, 0};
        return dsph_rsmp_angle(x, out, &pulses, 2, 0);
    });
    add("dspc_iir", [](R*) {
        Signal<dsp> rows;
        return pick<R>(::dspc_iir, ::dspfc_iir)(rows, DSP_IIR_ELLIPTIC, DSP_IIR_BAND_PASS, 3, 0.1,
                                                0.2, 1, 40);
    });
    add("dspc_iir_zpk", [](R*) {
        Signal<dsp> roots;
        return pick<R>(::dspc_iir_zpk, ::dspfc_iir_zpk)(roots, DSP_IIR_BESSEL, DSP_IIR_LOW_PASS, 3,
                                                        0.1, 0, 0, 0);
    });
    add("dspc_iir_state", [](R*) {
        std::array row{1.0, 2.0, 1.0, 1.0, -0.5, 0.25};
        const dsp rows{1, row.data(), 0, int(row.size()), 0, 0};
        Signal<dsp> state;
        return pick<R>(::dspc_iir_state, ::dspfc_iir_state)(state, &rows);
    });
    add("dspc_seed", [](R* x) { return status(seed_random<R>(5) || dspc_rand(x, 0)); });
}

/// The cases that the tables have for a function.
inline Cases cases_of(const std::string& name) {
    const auto listed = numbers.find(name);
    if (listed != numbers.end()) return listed->second;
    const bool known = (" " + std::string(plain) + " ").find(" " + name + " ") != name.npos;
    return known ? Cases{{}} : Cases{};
}

/// All cases of all functions.
template <Record R>
std::vector<Case<R>> every_case() {
    std::vector<Case<R>> cases;
    const auto add = [&]<class... P>(const std::string& name, int (*function)(P...)) {
        const auto call = [function](Arguments<R>& arguments) {
            return std::apply(function, std::tuple<P...>{arguments.template next<P>()...});
        };
        std::vector<bool> is_const;
        const auto note = [&]<class Q>(std::type_identity<Q>) {
            if (std::same_as<std::remove_const_t<Q>, R>) is_const.push_back(std::is_const_v<Q>);
        };
        (note(std::type_identity<std::remove_pointer_t<P>>()), ...);
        const auto optional = optional_records.find(name);
        // (In single precision the positions of dspd_rsmp2 are none of the records, nor is the
        // state of dspd_iir.)
        const bool has_optional = optional != optional_records.end() && is_const.size() > 2;
        const auto place =
            has_optional ? std::min(optional->second, is_const.size() - 1) : is_const.size();
        for (const auto& given : cases_of(name)) {
            cases.push_back({name, is_const, call, given, place, false});
            if (has_optional) cases.push_back({name, is_const, call, given, place, true});
        }
    };
    const auto add_twin = [&](const auto& twins) {
        if constexpr (std::same_as<R, dsp>) {
            add(twins.name, twins.of_double);
        } else {
            add(twins.name, twins.of_single);
        }
    };
    each_function(add_twin);
    add_own_calls<R>([&](const char* name, auto call) { add(name, +call); });
    return cases;
}

/// An operand for the given place: ascending positive values, of their own for each place.
template <Record R>
Signal<R> operand(std::size_t place, int n, bool is_complex) {
    Noise noise(place + 1);
    auto x = is_complex ? noise.complex<R>(n) : noise.real<R>(n);
    for (auto& v : values(x.get())) v /= 4;
    for (int i = 0; i < n; ++i) x[i * width<R>(x)] += scalar<R>(1 + i);
    return x;
}

/// A call of a case with operands of its own, which lie over hosts' arrays. `kinds` says which are
/// complex: bit 0 those at even places, bit 1 the others. The record at place `to` is the one at
/// `from`.
template <Record R>
struct Run {
    Run(const Case<R>& which, int n, int kinds, std::size_t to = 0, std::size_t from = 0)
        : of(which) {
        for (std::size_t place = 0; place < of.is_const.size(); ++place) {
            hosts.emplace_back(operand<R>(place, n, kinds >> place % 2 & 1));
            before.push_back(hosts.back().host);
            records.push_back(place == of.optional && of.leaves_out ? nullptr
                                                                    : &hosts.back().record);
        }
        // A short history leaves the place to the zeros behind it.
        if (keeps_place(of.name)) hosts.back().record.points /= 4;
        if (begins_anew(of.name) && of.is_const.size() > 2) hosts.back().record.points = 0;
        if (to != from) records[to] = records[from];
    }

    /// Lets the operands end at half of their points, or have them all again.
    void halve(bool half) {
        for (std::size_t place = 0; place < records.size(); ++place) {
            R* const x = records[place];
            if (!of.is_const[place] || !x) continue;
            const int all = int(before[place].size()) / width(x);
            x->points = half ? (all + 1) / 2 : all;
        }
    }

    /// Calls; returns the result and all that the function may have written but for scratch.
    std::vector<scalar<R>> operator()() {
        prepare();
        call();
        return outcome();
    }

    void prepare() { arguments.reset(new Arguments<R>{records, of.numbers}); }
    void call() { result = of.call(*arguments); }
    std::vector<scalar<R>> outcome() const {
        std::vector left{scalar<R>(result), scalar<R>(arguments->integer), arguments->number};
        for (std::size_t place = 0; place < records.size(); ++place) {
            const R* x = records[place];
            const bool is_scratch = place == of.optional && of.name.find("corr") != of.name.npos;
            if (of.is_const[place] || !x || result < 0 || is_scratch) continue;
            left.insert(left.end(), {x->delta, scalar<R>(x->points), scalar<R>(x->complex)});
            left.insert(left.end(), x->data, x->data + used(x));
        }
        return left;
    }

    /// Whether the hosts' arrays are as they were, but for states, scratch records and outputs that
    /// still lie there.
    bool kept() const {
        std::size_t place = 0;
        return std::all_of(hosts.begin(), hosts.end(), [&](const Borrowed<R>& x) {
            const bool stays = x.record.data == x.host.data();
            const bool is_state = of.optional < records.size() && records[of.optional] == &x.record;
            const bool may_be_written = is_state || (!of.is_const[place] && stays);
            return x.host == before[place++] || may_be_written;
        });
    }

    void release() {
        arguments.reset();
        for (auto& x : hosts) dsp_destroy(&x.record);
    }

    const Case<R>& of;
    std::list<Borrowed<R>> hosts;
    std::vector<std::vector<scalar<R>>> before;
    std::vector<R*> records;
    std::unique_ptr<Arguments<R>> arguments;
    int result = 0;
};

/// Runs `share(to, from)` for every place of an output with every place of an operand that it may
/// share a buffer with.
template <Record R, class Share>
void each_sharing(const Case<R>& c, Share share) {
    if (c.name == "dsp_append") return;  // shares in ways of its own
    for (std::size_t to = 0; to < c.is_const.size(); ++to) {
        for (std::size_t from = 0; from < c.is_const.size(); ++from) {
            const bool left_out = c.leaves_out && (from == c.optional || to == c.optional);
            if (!c.is_const[to] && c.is_const[from] && !left_out) share(to, from);
        }
    }
}

/// Whether two lists are the same bit for bit.
template <class T>
::testing::AssertionResult same(const std::vector<T>& got, const std::vector<T>& want) {
    if (got.size() == want.size() && !std::memcmp(got.data(), want.data(), got.size() * sizeof(T)))
        return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << listed(got) << ", expected " << listed(want);
}

}  // namespace wavkit::test
