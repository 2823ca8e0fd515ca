// How exact the single-precision functions are, for every float there is:
//     all_floats [--every=N] [NAME ...]
// N takes one block of neighbouring floats in N. A function takes about a minute of two processors.
//
// The reference is the C library's function in double precision, whose own error is nothing beside
// a float's last place. Where a result saturates it is not compared. A line a function: the largest
// error in units in the last place, where it is, and how many results are not the nearest float.
// It ends with status 1 if one is further from the reference than it is allowed to be.
#include <algorithm>
#include <atomic>
#include <bit>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <mutex>
#include <thread>
#include <vector>

#include "wavkit/dsp.h"

namespace {

constexpr double big = 1e15;  // where single-precision results saturate
constexpr float smallest = std::numeric_limits<float>::min();
constexpr float largest = std::numeric_limits<float>::max();

struct Function {
    const char* name;
    int (*apply)(dspf*);
    double (*reference)(double);
    float low = -largest, high = largest;  // arguments to compare
    double allowed = 1;                    // units in the last place
};

double exact_sinc(double x) { return x == 0 ? 1 : std::sin(x) / x; }
double exact_square(double x) { return x * x; }
double exact_reciprocal(double x) { return 1 / x; }
double exact_power_of_ten(double x) { return std::exp2(x * 3.32192809488736234787); }

const Function functions[] = {
    {"exp", dspfi_exp, std::exp},
    {"exp10", dspfi_exp10, exact_power_of_ten, -46, 15},
    {"log", dspfi_log, std::log, smallest},
    {"log10", dspfi_log10, std::log10, smallest},
    {"sin", dspfi_sin, std::sin},
    {"cos", dspfi_cos, std::cos},
    {"tan", dspfi_tan, std::tan},
    {"asin", dspfi_asin, std::asin, -1, 1},
    {"acos", dspfi_acos, std::acos, -1, 1},
    {"atan", dspfi_atan, std::atan},
    {"sinh", dspfi_sinh, std::sinh, -34.5f, 34.5f},
    {"cosh", dspfi_cosh, std::cosh, -34.5f, 34.5f},
    {"tanh", dspfi_tanh, std::tanh},
    {"sinc", dspfi_sinc, exact_sinc, -largest, largest, 2},
    {"sqrt", dspfi_sqrt, std::sqrt, 0},
    {"square", dspfi_square, exact_square},
    {"recip", dspfi_recip, exact_reciprocal},
};

/// The distance of two neighbouring floats where this value lies.
double unit_at(double value) {
    const auto exponent = std::bit_cast<std::uint64_t>(value) >> 52 & 0x7ff;
    return std::bit_cast<double>((std::max<std::uint64_t>(exponent, 1023 - 126) - 23) << 52);
}

struct Worst {
    double error = 0;
    float argument = 0;
    std::uint64_t compared = 0, not_nearest = 0;

    void take(float argument_, float result, double exact) {
        if (!(std::fabs(exact) < big) || std::fabs(result) >= float(big)) return;
        ++compared;
        not_nearest += result != float(exact);
        const double off = std::fabs(double(result) - exact) / unit_at(exact);
        if (off <= error) return;
        error = off;
        argument = argument_;
    }
    void join(const Worst& other) {
        compared += other.compared;
        not_nearest += other.not_nearest;
        if (other.error <= error) return;
        error = other.error;
        argument = other.argument;
    }
};

constexpr std::uint64_t block = 1 << 12, blocks = (std::uint64_t(1) << 32) / block;

/// Compares every so many blocks of floats of neighbouring bits until none is left.
Worst compare_blocks(const Function& f, std::uint64_t every, std::atomic<std::uint64_t>& next) {
    std::vector<float> arguments(block), results(block);
    Worst worst;
    for (std::uint64_t b = every * next++; b < blocks; b = every * next++) {
        std::size_t n = 0;
        for (std::uint64_t i = 0; i < block; ++i) {
            const auto x = std::bit_cast<float>(std::uint32_t(b * block + i));
            if (x >= f.low && x <= f.high) arguments[n++] = x;
        }
        std::copy_n(arguments.begin(), n, results.begin());
        dspf record{1, results.data(), 0, int(n), 0, 0};
        if (f.apply(&record)) std::abort();
        for (std::size_t i = 0; i < n; ++i)
            worst.take(arguments[i], results[i], f.reference(arguments[i]));
    }
    return worst;
}

Worst compare(const Function& f, std::uint64_t every) {
    std::atomic<std::uint64_t> next{0};
    std::mutex joining;
    Worst worst;
    std::vector<std::thread> threads(std::max(1u, std::thread::hardware_concurrency()));
    for (auto& thread : threads) {
        thread = std::thread([&] {
            const Worst part = compare_blocks(f, every, next);
            const std::lock_guard lock(joining);
            worst.join(part);
        });
    }
    for (auto& thread : threads) thread.join();
    return worst;
}

}  // namespace

int main(int count, char** names) {
    bool good = true;
    std::uint64_t every = 1;
    constexpr char every_option[] = "--every=";
    constexpr std::size_t option_length = sizeof every_option - 1;
    if (count > 1 && std::strncmp(names[1], every_option, option_length) == 0) {
        every = std::max(1ULL, std::strtoull(names[1] + option_length, nullptr, 10));
        ++names;
        --count;
    }
    std::printf("function   worst error at                 floats not the nearest\n");
    for (const auto& f : functions) {
        const auto is_wanted = [&f](const char* name) { return std::strcmp(name, f.name) == 0; };
        if (count > 1 && std::none_of(names + 1, names + count, is_wanted)) continue;
        const Worst worst = compare(f, every);
        good = good && worst.compared > 0 && worst.error <= f.allowed;
        std::printf("%-10s %11.4f %-16.9g %10llu %6.3f %%\n", f.name, worst.error,
                    double(worst.argument), (unsigned long long)worst.compared,
                    100 * double(worst.not_nearest) / double(worst.compared));
        std::fflush(stdout);
    }
    return good ? 0 : 1;
}
