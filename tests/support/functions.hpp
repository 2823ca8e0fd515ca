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

#include "signals.hpp"

namespace wavkit::test {

/// The numbers that functions are given, in the order of their parameters: a case a list. Integers
/// that are not there are 1, scalars 1/4.
inline const std::map<std::string, std::vector<std::vector<double>>> numbers = {
    {"dsp_interp", {{1}, {3}, {5}}},
    {"dsp_window2_enbw", {{6, 100, 17.5}}},
    {"dsp_window2_scale", {{6, 8, 100, 17.5}, {14, 5, 33}}},
    {"dsp_window_enbw", {{14, 10}}},
    {"dsp_window_scale", {{20, 1, 10}}},
    {"dspb_corr", {{3}}},
    {"dspb_cspline_2d", {{0, 0, 0, 0}, {1, 2, 3, 2}}},
    {"dspc_fir", {{3}, {4, 0}, {7, 0.05}}},
    {"dspc_fir2", {{100}, {101}}},
    {"dspc_rand", {{0}, {1}, {3}}},
    {"dspc_rsmp", {{2, 0.2, 0.8, 40}}},
    {"dspc_rsmp_pcos", {{3, 0.4, 2}}},
    {"dspd_deci", {{1}, {3}}},
    {"dspd_hwfilt", {{0}, {1}, {2}}},
    {"dspd_rsmp", {{3, 2}}},
    {"dspd_rsmp2", {{1}, {3}}},
    {"dspd_sfir", {{0, 1}, {1, 0}}},
    {"dspf_fwrite2", {{0}, {1}}},
    {"dsph_avg", {{1, 1}, {1, 2, 1, -1}, {3, 2}, {4, 2}, {5, 2}, {0x21, 2}, {0x25, 2}}},
    {"dsph_corr", {{1, 0}, {3, 1}}},
    {"dsph_dft", {{20, 0}, {2, 1}, {0, 4}, {0, 0x80}}},
    {"dsph_distortion", {{0.25, 3, 0}, {0.2, 2, 2}}},
    {"dsph_fft", {{0, 1, 2, 0}, {0, 1, 0, 1}, {0, 1, 0, 4}, {0, 1, 0, 0x80}, {700, 0.5, 6, 2}}},
    {"dspi_dct", {{0}, {3}}},
    {"dspi_dft", {{0}, {1}}},
    {"dspi_edge", {{0, 4.5}}},
    {"dspi_fft", {{0}, {1}}},
    {"dspi_irdft", {{0}, {1}}},
    {"dspi_limit", {{2, 3}}},
    {"dspi_orecon", {{0}, {1}}},
    {"dspi_unzpad", {{3, 0x200}}},
    {"dspi_window", {{3, 0}, {14, 4}}},
    {"dspi_window2", {{2, 8, 3}, {9, 9, 3.5}}},
    {"dspi_window_fir", {{16}, {100}, {101}, {103}}},
    {"dspi_window_kaiser", {{3, 1}}},
    {"dspi_zpad", {{700}}},
    {"dspi_zpad2", {{700, 0x301}}},
    {"dsps_hist", {{0, 2, 6}}},
    {"dsps_peak", {{0, 0}, {0x100, 0}, {0x1200, 2}}},
    {"dsps_peaks", {{1.05, 0.01, 2, 0.01, 0.1, 0.5}}},
    {"dsps_sine_fit", {{0.25, 1}, {0.2, 0}, {0, 0}}},
    {"dspu_subvec", {{1, 3}}},
};

/// Records that may be left out, by their place among those of the function.
inline const std::map<std::string, std::size_t> optional_records = {
    {"dsp_interp", 2},     {"dsp_cspline", 2}, {"dspd_fir", 3},  {"dspd_sfir", 3},
    {"dspd_deci", 3},      {"dspd_hwfilt", 3}, {"dspd_rsmp", 3}, {"dspd_rsmp2", 4},
    {"dspi_hwfilt", 2},    {"dsph_avg", 2},    {"dsph_corr", 3}, {"dspb_corr", 3},
    {"dsph_distortion", 2}};

/// Functions that read a whole number behind the history of a stream, where there is one.
inline bool keeps_place(const std::string& name) {
    return name == "dspd_deci" || name == "dspd_rsmp" || name.ends_with("_hwfilt");
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
    std::array<double, 3> places{0.25, 7.5, 2};
    dsp positions{1, places.data(), 0, int(places.size()), 0, 0};

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
            stream.reset(std::tmpfile());
            std::fputs("1 2 3", stream.get());
            std::rewind(stream.get());
            return stream.get();
        } else if constexpr (std::same_as<P, const dsp*> && !std::same_as<R, dsp>) {
            return &positions;
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
    friend std::ostream& operator<<(std::ostream& stream, const Case& c) {
        return stream << c.name << listed(c.numbers)
                      << (c.leaves_out ? " without its optional record" : "");
    }
};

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
        const auto listed = numbers.find(name);
        const auto optional = optional_records.find(name);
        for (const auto& given :
             listed == numbers.end() ? decltype(listed->second){{}} : listed->second) {
            const bool has_optional = optional != optional_records.end();
            // (In single precision the positions of dspd_rsmp2 are none of the records.)
            const auto place =
                has_optional ? std::min(optional->second, is_const.size() - 1) : is_const.size();
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
    std::apply([&](const auto&... twins) { (add_twin(twins), ...); }, every_function);
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
        if (to != from) records[to] = records[from];
    }

    /// Calls; returns the result and all that the function may have written but for scratch.
    std::vector<scalar<R>> operator()() {
        Arguments<R> arguments{records, of.numbers};
        result = of.call(arguments);
        std::vector left{scalar<R>(result), scalar<R>(arguments.integer), arguments.number};
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
        for (auto& x : hosts) dsp_destroy(&x.record);
    }

    const Case<R>& of;
    std::list<Borrowed<R>> hosts;
    std::vector<std::vector<scalar<R>>> before;
    std::vector<R*> records;
    int result = 0;
};

/// Whether two lists are the same bit for bit.
template <class T>
::testing::AssertionResult same(const std::vector<T>& got, const std::vector<T>& want) {
    if (got.size() == want.size() && !std::memcmp(got.data(), want.data(), got.size() * sizeof(T)))
        return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << listed(got) << ", expected " << listed(want);
}

}  // namespace wavkit::test
