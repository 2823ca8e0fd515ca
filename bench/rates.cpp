// Changes of the sampling rate beside soxr and libsamplerate: how exact they are and how fast.
//
// Errors are measured on steady tones: what least squares leave of an output beside a sine of the
// tone's frequency, which no window's side lobes hide. Speed is that of a thread's processor time
// in one run, so that only ratios count.
//
//     bench_rates                the tables
//     bench_rates --curve FILE   gains and aliases over frequency, for rates.gnuplot
#include <samplerate.h>
#include <soxr.h>
#include <wavkit/dsp.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <functional>
#include <numeric>
#include <random>
#include <string>
#include <vector>

#include "measure/rate_change.hpp"

namespace {

using wavkit::tool::RateChange;
using wavkit::tool::RateQuality;
using Samples = std::vector<double>;

/// A converter: the whole of a signal at another rate, each output at its time.
struct Converter {
    std::string name;
    std::function<Samples(const Samples&, double in, double out)> convert;
};

wavkit::tool::RateRatio ratio(double in, double out) { return wavkit::tool::ratio_of(out / in); }

Converter by_wavkit(const std::string& name, const RateQuality& quality) {
    return {name, [=](const Samples& x, double in, double out) {
                RateChange change(1, ratio(in, out), quality);
                const auto first = change.pass(x);
                Samples y(first.begin(), first.end());
                for (auto rest = change.finish(); !rest.empty(); rest = change.finish()) {
                    y.insert(y.end(), rest.begin(), rest.end());
                }
                return y;
            }};
}

Converter by_soxr(const std::string& name, unsigned long recipe) {
    return {name, [=](const Samples& x, double in, double out) {
                Samples y(std::size_t(double(x.size()) * out / in + 100));
                const auto io = soxr_io_spec(SOXR_FLOAT64_I, SOXR_FLOAT64_I);
                const auto quality = soxr_quality_spec(recipe, 0);
                std::size_t done = 0;
                soxr_oneshot(in, out, 1, x.data(), x.size(), nullptr, y.data(), y.size(), &done,
                             &io, &quality, nullptr);
                y.resize(done);
                return y;
            }};
}

Converter by_libsamplerate(const std::string& name, int type) {
    return {name, [=](const Samples& x, double in, double out) {
                const std::vector<float> from(x.begin(), x.end());
                std::vector<float> to(std::size_t(double(x.size()) * out / in + 100));
                SRC_DATA data{};
                data.data_in = from.data();
                data.input_frames = long(from.size());
                data.data_out = to.data();
                data.output_frames = long(to.size());
                data.src_ratio = out / in;
                src_simple(&data, type, 1);
                return Samples(to.begin(), to.begin() + data.output_frames_gen);
            }};
}

const std::vector<Converter>& converters() {
    static const std::vector<Converter> all{
        by_wavkit("wavkit best", wavkit::tool::best_rates),
        by_wavkit("wavkit normal", wavkit::tool::normal_rates), by_soxr("soxr VHQ", SOXR_VHQ),
        by_soxr("soxr HQ", SOXR_HQ), by_libsamplerate("libsamplerate best", SRC_SINC_BEST_QUALITY)};
    return all;
}

Samples tone(std::size_t n, double frequency) {
    Samples x(n);
    for (std::size_t i = 0; i < n; ++i) {
        const long double turns = static_cast<long double>(frequency) * (long double)(i);
        x[i] = double(std::sin(2 * 3.14159265358979323846L * (turns - std::floor(turns))));
    }
    return x;
}

double decibels(double ratio) { return 20 * std::log10(std::max(ratio, 1e-20)); }

double rms(const Samples& x) {
    long double sum = 0;
    for (const double v : x) sum += static_cast<long double>(v) * v;
    return std::sqrt(double(sum / static_cast<long double>(x.size())));
}

/// The middle of an output, free of what happens at its ends.
Samples middle(const Samples& y) {
    const auto cut = std::ptrdiff_t(y.size() / 5);
    return {y.begin() + cut, y.end() - cut};
}

/// Sines of some frequencies and a constant, fitted to y and taken out of it. Returns the
/// amplitude of the first one.
double take_out(Samples& y, const std::vector<double>& frequencies) {
    const std::size_t terms = 2 * frequencies.size() + 1;
    std::vector<std::vector<long double>> columns(terms, std::vector<long double>(y.size(), 1.0L));
    for (std::size_t f = 0; f < frequencies.size(); ++f) {
        for (std::size_t i = 0; i < y.size(); ++i) {
            const long double turns = (long double)(frequencies[f]) * (long double)(i);
            const long double angle = 2 * 3.14159265358979323846L * (turns - std::floor(turns));
            columns[2 * f][i] = std::cos(angle);
            columns[2 * f + 1][i] = std::sin(angle);
        }
    }
    std::vector<std::vector<long double>> a(terms, std::vector<long double>(terms + 1));
    for (std::size_t r = 0; r < terms; ++r) {
        for (std::size_t c = 0; c < terms; ++c) {
            a[r][c] =
                std::inner_product(columns[r].begin(), columns[r].end(), columns[c].begin(), 0.0L);
        }
        a[r][terms] = std::inner_product(columns[r].begin(), columns[r].end(), y.begin(), 0.0L);
    }
    for (std::size_t k = 0; k < terms; ++k) {
        for (std::size_t r = 0; r < terms; ++r) {
            if (r == k) continue;
            const long double factor = a[r][k] / a[k][k];
            for (std::size_t c = k; c <= terms; ++c) a[r][c] -= factor * a[k][c];
        }
    }
    for (std::size_t i = 0; i < y.size(); ++i) {
        long double sum = 0;
        for (std::size_t k = 0; k < terms; ++k) sum += a[k][terms] / a[k][k] * columns[k][i];
        y[i] = double(y[i] - sum);
    }
    return double(std::hypot(a[0][terms] / a[0][0], a[1][terms] / a[1][1]));
}

constexpr std::size_t tone_points = 30000;

struct ToneResult {
    double gain, residual;  // of a sine of amplitude 1
};

ToneResult measure_tone(const Converter& by, double in, double out, double frequency) {
    auto y = middle(by.convert(tone(tone_points, frequency / in), in, out));
    const double gain = take_out(y, {frequency / out});
    return {gain, rms(y) * std::sqrt(2.0)};
}

/// What comes out of a tone that has no place at the new rate.
double measure_alias(const Converter& by, double in, double out, double frequency) {
    return rms(middle(by.convert(tone(tone_points, frequency / in), in, out))) * std::sqrt(2.0);
}

void print_quality(double in, double out) {
    std::printf("\n%g to %g, double: errors of tones at 24 places\n", in, out);
    std::printf("%-20s %22s %14s %10s %12s %12s\n", "", "ripple below 0.9, dB", "at 0.95, dB",
                "residual", "-0.1 dB at", "worst alias");
    const double half = std::min(in, out) / 2;
    for (const auto& by : converters()) {
        double ripple = 0, residual = 0, alias = 0;
        for (int i = 0; i < 24; ++i) {
            const auto at = measure_tone(by, in, out, half * (0.01 + 0.89 * i / 23));
            ripple = std::max(ripple, std::fabs(decibels(at.gain)));
            residual = std::max(residual, at.residual);
        }
        for (int i = 0; i < 24 && in > out; ++i) {
            const double frequency = half + (in / 2 - half) * (0.002 + 0.99 * i / 23);
            alias = std::max(alias, measure_alias(by, in, out, frequency));
        }
        double low = 0.8, high = 1;
        for (int i = 0; i < 12; ++i) {
            const double at = (low + high) / 2;
            const bool passed = decibels(measure_tone(by, in, out, half * at).gain) > -0.1;
            (passed ? low : high) = at;
        }
        const double late = decibels(measure_tone(by, in, out, half * 0.95).gain);
        std::printf("%-20s %22.7f %14.6f %10.0f %12.3f %12.0f\n", by.name.c_str(), ripple, late,
                    decibels(residual), low, decibels(alias));
    }
}

/// The centre of an impulse's response, and what is left of a noise band after a way there and
/// back.
void print_times() {
    std::printf("\nan impulse from 48000 to 44100, there and back, and noise likewise\n");
    for (const auto& by : converters()) {
        Samples x(20000);
        x[9600] = 1;
        const auto y = by.convert(x, 48000, 44100);
        const auto peak = std::max_element(y.begin(), y.end()) - y.begin();
        // Noise in the band, as many tones without a pattern.
        std::mt19937 random(1);
        std::uniform_real_distribution<double> place(0.001, 0.4);
        std::fill(x.begin(), x.end(), 0.0);
        for (int k = 0; k < 40; ++k) {
            const auto sine = tone(x.size(), place(random));
            for (std::size_t i = 0; i < x.size(); ++i) x[i] += sine[i] / 8;
        }
        const auto back = by.convert(by.convert(x, 48000, 44100), 44100, 48000);
        Samples rest(std::min(back.size(), x.size()));
        for (std::size_t i = 0; i < rest.size(); ++i) rest[i] = back[i] - x[i];
        std::printf("%-20s peak at %td (8820 is its time), back within %.0f dB\n", by.name.c_str(),
                    peak, decibels(rms(middle(rest)) / rms(middle(x))));
    }
}

/// The ratios and tones by which libsamplerate tests its best converter, and the signal-to-noise
/// ratios that it asks for there.
void print_sets() {
    struct Set {
        double ratio;
        std::vector<double> tones;
        double wanted;
    };
    const std::vector<Set> sets{
        {3.0, {0.01111111111}, 147},        {0.6, {0.01111111111}, 147},
        {0.3, {0.01111111111}, 148},        {1.0, {0.01111111111}, 155},
        {1.001, {0.01111111111}, 148},      {1.9999, {0.011111, 0.324}, 146},
        {0.456789, {0.012345, 0.457}, 147}, {0.6, {0.011111, 0.45}, 145},
        {1.33, {0.3511111111}, 147}};
    std::printf("\nratios and tones of libsamplerate's tests: signal to noise, dB\n%8s %8s",
                "ratio", "wanted");
    for (const auto& by : converters()) std::printf(" %20s", by.name.c_str());
    std::printf("\n");
    for (const auto& set : sets) {
        std::printf("%8g %8.0f", set.ratio, set.wanted + 30);
        for (const auto& by : converters()) {
            Samples x(tone_points);
            std::vector<double> kept;
            for (const double frequency : set.tones) {
                const auto sine = tone(x.size(), frequency);
                for (std::size_t i = 0; i < x.size(); ++i)
                    x[i] += sine[i] / double(set.tones.size());
                if (frequency / set.ratio < 0.5) kept.push_back(frequency / set.ratio);
            }
            auto y = middle(by.convert(x, 1, set.ratio));
            const double gain = take_out(y, kept);
            std::printf(" %20.0f", decibels(gain / (rms(y) * std::sqrt(2.0))));
        }
        std::printf("\n");
    }
}

double processor_time() {
    timespec now;
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return double(now.tv_sec) + 1e-9 * double(now.tv_nsec);
}

Samples noise(std::size_t n) {
    Samples x(n);
    std::mt19937 random(2);
    std::uniform_real_distribution<double> value(-0.5, 0.5);
    for (auto& v : x) v = value(random);
    return x;
}

/// Converts block after block and gives the seconds of each block in the least of several rounds:
/// all take turns, so that a slow moment of the machine meets everybody.
std::vector<double> least_times(const std::vector<std::function<void()>>& blocks) {
    std::vector<double> least(blocks.size(), 1e9);
    for (int round = 0; round < 25; ++round) {
        for (std::size_t i = 0; i < blocks.size(); ++i) {
            const double start = processor_time();
            for (int k = 0; k < 4; ++k) blocks[i]();
            least[i] = std::min(least[i], (processor_time() - start) / 4);
        }
    }
    return least;
}

/// A converter of soxr at work.
class SoxrStream {
  public:
    SoxrStream(double in, double out, unsigned long recipe, std::size_t block)
        : out_(std::size_t(double(block) * out / in * 2 + 1000)) {
        const auto io = soxr_io_spec(SOXR_FLOAT64_I, SOXR_FLOAT64_I);
        const auto quality = soxr_quality_spec(recipe, 0);
        stream_ = soxr_create(in, out, 1, nullptr, &io, &quality, nullptr);
    }
    ~SoxrStream() { soxr_delete(stream_); }
    SoxrStream(const SoxrStream&) = delete;
    SoxrStream& operator=(const SoxrStream&) = delete;

    void pass(const Samples& x) {
        std::size_t taken = 0, given = 0;
        soxr_process(stream_, x.data(), x.size(), &taken, out_.data(), out_.size(), &given);
    }

  private:
    soxr_t stream_;
    Samples out_;
};

constexpr std::size_t block_points = 1 << 16;

void print_speed() {
    std::printf("\nspeed in blocks of %zu: the time of others as a multiple of 'wavkit best'\n",
                block_points);
    std::printf("%-16s %14s %14s %12s %12s %20s\n", "", "million out/s", "wavkit normal",
                "soxr VHQ", "soxr HQ", "libsamplerate best");
    const auto x = noise(block_points);
    for (const auto& [in, out] : std::vector<std::pair<double, double>>{
             {48000, 44100}, {44100, 96000}, {96000, 44100}, {51200, 48000}, {44100, 44107.3}}) {
        RateChange best(1, ratio(in, out), wavkit::tool::best_rates);
        RateChange normal(1, ratio(in, out), wavkit::tool::normal_rates);
        SoxrStream vhq(in, out, SOXR_VHQ, x.size()), hq(in, out, SOXR_HQ, x.size());
        const std::vector<float> from(x.begin(), x.end());
        std::vector<float> to(std::size_t(double(x.size()) * out / in + 1000));
        int error = 0;
        SRC_STATE* const src = src_new(SRC_SINC_BEST_QUALITY, 1, &error);
        const double to_in = out / in;
        const auto few = std::size_t(4096);
        const auto by_src = [&] {
            SRC_DATA data{};
            data.data_in = from.data();
            data.input_frames = long(few);
            data.data_out = to.data();
            data.output_frames = long(to.size());
            data.src_ratio = to_in;
            src_process(src, &data);
        };
        auto times = least_times({[&] { best.pass(x); }, [&] { normal.pass(x); },
                                  [&] { vhq.pass(x); }, [&] { hq.pass(x); }, by_src});
        src_delete(src);
        times[4] *= double(x.size()) / double(few);
        std::printf("%5g to %-7g %14.0f %14.2f %12.2f %12.2f %20.1f\n", in / 1000, out / 1000,
                    double(x.size()) * to_in / times[0] / 1e6, times[1] / times[0],
                    times[2] / times[0], times[3] / times[0], times[4] / times[0]);
    }
}

struct Record {
    Record() { dsp_init(&record); }
    ~Record() { dsp_destroy(&record); }
    Record(const Record&) = delete;
    Record& operator=(const Record&) = delete;
    operator dsp*() { return &record; }
    dsp* operator->() { return &record; }
    dsp record;
};

dsp borrowed(Samples& x) { return {1, x.data(), 0, int(x.size()), 0, 0}; }

/// dspd_rsmp2() with a kernel of 128 rows: tones at places of a ratio that is none of whole
/// numbers, and its time beside dspd_rsmp() with the same kernel.
void print_any_place() {
    constexpr int rows = 128;
    Record kernel, out, fixed_out, state, fixed_state;
    dspc_rsmp(kernel, rows, 0.45, 0.55, 200);
    const double delay = (kernel->points - 1) / (2.0 * rows), step = 1.0 / std::sqrt(1.3);
    double sum = 0, worst = 0;
    for (int i = 0; i < 24; ++i) {
        const double frequency = 0.5 * (0.01 + 0.89 * i / 23);
        auto x = tone(tone_points, frequency);
        Samples places;
        for (int m = 0; m * step < double(tone_points) - 1000; ++m) {
            places.push_back(500 + delay + m * step);
        }
        const dsp in = borrowed(x), at = borrowed(places);
        dspd_rsmp2(&in, out, kernel, rows, &at, nullptr);
        Samples y(out->data, out->data + out->points);
        take_out(y, {frequency * step});
        const double residual = rms(y) * std::sqrt(2.0);
        sum += residual * residual;
        worst = std::max(worst, residual);
    }
    auto x = noise(1 << 13);
    Samples places;
    for (double p = 0; p < double(x.size()); p += 127.0 / 128) places.push_back(p);
    const dsp in = borrowed(x), at = borrowed(places);
    const auto times =
        least_times({[&] { dspd_rsmp2(&in, out, kernel, rows, &at, state); },
                     [&] { dspd_rsmp(&in, fixed_out, kernel, rows, 127, fixed_state); }});
    std::printf(
        "\nany places (128 rows, 200 dB, tones to 0.9): rms residual %.1f dB, worst tone %.1f "
        "dB; speed %.2f of dspd_rsmp() with the same kernel\n",
        decibels(std::sqrt(sum / 24)), decibels(worst), times[1] / times[0]);
}

/// Half-bands of 120 dB one behind the other, each as wide as what is kept asks for, beside soxr at
/// 2:1. The last one passes nine tenths of the band.
void print_half_bands() {
    std::printf(
        "\ndecimation with half-bands, 120 dB: inputs a second as a multiple of soxr HQ's at "
        "2:1\n");
    auto x = noise(block_points);
    const dsp in = borrowed(x);
    for (const int factor : {2, 4, 8, 16}) {
        int steps = 0;
        while (1 << steps < factor) ++steps;
        const auto count = static_cast<std::size_t>(steps);
        std::vector<Record> taps(count), states(count), outs(count);
        for (int s = 0; s < steps; ++s) {
            const double edge = 0.45 * (1 << (s + 1)) / factor;  // of an output sample
            dspc_rsmp(taps[std::size_t(s)], 2, edge, 1 - edge, 120);
            dspi_scale(taps[std::size_t(s)], 0.5);
        }
        SoxrStream hq(2, 1, SOXR_HQ, x.size());
        const auto decimate = [&] {
            const dsp* from = &in;
            for (std::size_t s = 0; s < taps.size(); ++s) {
                dspd_hwfilt(from, outs[s], taps[s], DSP_HALF_DOWN, states[s]);
                from = outs[s];
            }
        };
        const auto times = least_times({decimate, [&] { hq.pass(x); }});
        std::printf("%4d:1 %6.2f\n", factor, times[1] / times[0]);
    }
}

/// Frequency, then for each converter the gain of a tone and what else comes of it, in dB.
int print_curves(const char* path) {
    std::FILE* const file = std::fopen(path, "w");
    if (!file) return 1;
    const double in = 48000, out = 44100;
    for (int i = 1; i < 200; ++i) {
        const double frequency = in / 2 * (0.7 + 0.3 * i / 200.0);
        std::fprintf(file, "%g", frequency);
        for (const auto& by : converters()) {
            if (frequency < out / 2) {
                const auto at = measure_tone(by, in, out, frequency);
                std::fprintf(file, " %.8f %.2f", decibels(at.gain), decibels(at.residual));
            } else {
                std::fprintf(file, " nan %.2f", decibels(measure_alias(by, in, out, frequency)));
            }
        }
        std::fprintf(file, "\n");
    }
    return std::fclose(file);
}

}  // namespace

int main(int argc, char** argv) {
    if (argc == 3 && std::strcmp(argv[1], "--curve") == 0) return print_curves(argv[2]);
    print_quality(48000, 44100);
    print_quality(44100, 96000);
    print_times();
    print_sets();
    print_speed();
    print_any_place();
    print_half_bands();
    return 0;
}
