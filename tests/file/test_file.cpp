// Signal files: both formats there and back, what readers forgive and what they refuse.
#include <algorithm>
#include <bit>
#include <climits>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>

#include "support/files.hpp"
#include "support/signals.hpp"

namespace wavkit::test {
namespace {

/// A file of its own, holding the given bytes and read from the first.
class File {
  public:
    explicit File(const std::string& content = "") {
        std::fwrite(content.data(), 1, content.size(), stream_);
        std::rewind(stream_);
    }
    ~File() { dspf_fclose(stream_); }
    File(const File&) = delete;
    File& operator=(const File&) = delete;
    operator FILE*() { return stream_; }

    std::string content() {
        std::string all(std::size_t(std::ftell(stream_)), '\0');
        std::rewind(stream_);
        EXPECT_EQ(std::fread(all.data(), 1, all.size(), stream_), all.size());
        std::rewind(stream_);
        return all;
    }

  private:
    FILE* stream_ = temporary_file();
};

/// As the library itself spells NaN: of that, each C runtime has its own idea.
template <class T>
void tell(std::ostream& told, T number) {
    if (std::isnan(number)) {
        told << (std::signbit(number) ? "-nan" : "nan");
    } else {
        told << number;
    }
}

/// What reading a stream to its end yields: every signal in brackets, a spacing other than 1 behind
/// it, then '.' for the end or the points left by an error and '!'.
template <Record R>
std::string story(const std::string& content) {
    File file(content);
    std::ostringstream told;
    for (;;) {
        Signal<R> x;
        const int result = dspf_fread(x, file);
        if (result == 0) {
            EXPECT_EQ(x->points, 0);
            return told.str() + ".";
        }
        told << '[';
        for (int i = 0; i < x->points; ++i) {
            tell(told << (i ? " " : ""), x->data[i * width(x.get())]);
            if (x->complex) tell(told << ',', x->data[2 * i + 1]);
        }
        told << (x->complex ? "]c" : "]");
        if (x->delta != 1) told << x->delta;
        if (result != 1) return told.str() + "!";
    }
}

template <Record R>
std::string written(const R* x, int flags) {
    File file;
    EXPECT_EQ(dspf_fwrite2(x, file, flags), 0);
    return file.content();
}

/// Reads a signal into a record that borrows its buffer; 0 when it is the expected one.
template <Record R>
int read_back(const std::string& content, const Signal<R>& expected) {
    scalar<R> host[] = {7, 7};
    R x{5, host, 0, 2, 0, 0};
    const int result = dspf_fread(&x, File(content));
    if (result == 1) {
        EXPECT_TRUE(matches<R>(&x, expected));
    }
    EXPECT_EQ(host[0] + host[1], 14);
    dsp_destroy(&x);
    return result == 1 ? 0 : result;
}

struct Text {
    const char *content, *story;
};

BOTH_PRECISIONS(File, ReadsNumbersAsScanfDoes) {
    const Text texts[] = {
        {"", "."},
        {" \n", "[]."},
        {"1 2 3", "[1 2 3]."},
        {"+1\t-.5\v5.\f1e3\r\n1E-2 ", "[1 -0.5 5 1000 0.01]."},
        {"1.5abc", "[1.5]!"},
        {"1 2-3.5.25", "[1 2 -3.5 0.25]."},
        {"4 abc", "[4]!"},
        {"4 -", "[4]!"},
        {"4 +-5", "[4]!"},
        {"4 .", "[4]!"},
        {"4 1e", "[4]!"},
        {"4 1e+.5", "[4]!"},
        {"4 1,5", "[4 1]!"},
        {"inf -INF Infinity +iNf", "[inf -inf inf inf]."},
        {"nan NaN(ind) -nan", "[nan nan -nan]."},
        {"infi", "[]!"},
        {"nan(", "[]!"},
        {"1e999 -1e999 1e-999 0e999999999999999999999", "[inf -inf 0 0]."},
        {"1e99999999999999999999 1e-99999999999999999999", "[inf 0]."},
        {"0x10 0x1F -0x10 +0xa", "[16 31 -16 10]."},
        {"0xFFFFFFFF -0x80000000 0x700000003", "[-1 -2.14748e+09 3]."},
        {"00x7 0.0x8 -0.0x9 0e5x2 1e-999xB", "[7 8 -9 2 11]."},
        {"0x1.5 0 x", "[1 0.5 0]!"},
        {"0xg", "[]!"},
        {"0x", "[]!"},
        {"0X1", "[0]!"},
        {"1x1", "[1]!"},
    };
    for (const auto& [content, expected] : texts) {
        EXPECT_EQ(story<R>(content), expected) << content;
    }
}

BOTH_PRECISIONS(File, RoundsNumbersOfAnyLengthCorrectly) {
    constexpr T step = std::numeric_limits<T>::epsilon();
    char middle[100];  // exactly half way from 1 to its neighbour
    std::snprintf(middle, sizeof middle, "%.60f", double(step / 2));
    middle[0] = '1';
    const std::string zeros(5000, '0');
    File file(middle + (" " + zeros) + middle + zeros + "\n" + middle + zeros + "1 " + "1" + zeros +
              "e-5000 0." + zeros + "25e5001 1" + zeros);
    Signal<R> x;
    ASSERT_EQ(dspf_fread(x, file), 1);
    EXPECT_TRUE(is_real<R>(x, {1, 1, 1 + step, 1, 2.5L, INFINITY}));
}

BOTH_PRECISIONS(File, FollowsTheHeaderLines) {
    const std::string blanks(238, ' '), comment(400, '#');
    const Text texts[] = {
        {"#DSP delta = 0.5\n#DSP complex = 1\n1 2 3 4 5", "[1,2 3,4 5,0]c0.5."},
        {"1 2 #DSP complex = 1\n3#note\n4", "[1,2 3,4]c."},
        {"#DSP complex = 1\n1 2\n#DSP complex = 0", "[1 2]."},
        {"#DSP points = 4\n1 2 3 4 5 6", "[1 2 3 4][5 6]."},
        {"#DSP points = 4\n1 2 3", "[1 2 3]!"},
        {"1 2 3\n#DSP points = 2\n", "[1 2 3]!"},
        {"#DSP complex = 1\n#DSP points = 2\n1 2 3", "[1,2 3,0]c."},
        {"#DSP complex = 1\n#DSP points = 2\n1 2 3 4 5 6", "[1,2 3,4]c[5 6]."},
        {"#DSP points = -7\n#DSP delta = 2\n1 2", "[]2[1 2]."},
        {"#DSP points = 99999999999999999999\n1", "[1]!"},
        {"#DSP points = 1\n7 #DSP points = 2\n8 9 \n", "[7][8 9]."},
        {"#DSPpoints=+2 of three\n#DSP  delta\t=\t-1e-1x\n1 2", "[1 2]-0.1."},
        {"# DSP points = 5\n#DSP delta = e\n#DSP complex = x\n1", "[1]."},
        {"1\n#DSP delta = 3", "[1]3."},
        {"#", "[]."},
    };
    for (const auto& [content, expected] : texts) {
        EXPECT_EQ(story<R>(content), expected) << content;
    }
    EXPECT_EQ(story<R>(comment + "\n1\n" + comment), "[1].");
    EXPECT_EQ(story<R>("#DSP points = 2" + blanks + "1\n7 8"), "[7 8].");
    EXPECT_EQ(story<R>("#DSP delta = " + blanks + "123456\n5"), "[5]123.");
}

BOTH_PRECISIONS(File, SignalsFollowEachOther) {
    Noise noise;
    const Signal<R> signals[] = {noise.real<R>(1), Signal<R>(), noise.complex<R>(1500),
                                 complex<R>({}, 0.25), real<R>({1e10L, -1e-10L}, 0.001)};
    for (const int format : {0, 1}) {
        File file;
        for (const auto& x : signals) {
            EXPECT_EQ(format ? dspf_fwrite_ascii(x, file) : dspf_fwrite(x, file), 0);
        }
        std::rewind(file);
        Signal<R> y;
        for (const auto& x : signals) {
            ASSERT_EQ(dspf_fread(y, file), 1);
            EXPECT_TRUE(matches<R>(y, x, format ? 5 : 0));
            EXPECT_EQ(y->delta, x->delta);
        }
        EXPECT_EQ(dspf_fread(y, file), 0);
    }
}

BOTH_PRECISIONS(File, WritesText) {
    const bool is_double = sizeof(T) == 8;
    const auto x = complex<R>({{1, -0.5L}, {1 / 3.0L, 0}, {1e-10L, INFINITY}}, 1 / 3.0);
    const std::string third = is_double ? "0.3333333333333333" : "0.3333333";
    const std::string header =
        "#DSP ASCII data from wavkit package\n#DSP points = 3\n"
        "#DSP complex = 1\n#DSP type = " +
        std::string(is_double ? "8" : "4") + "\n#DSP delta = " + third + "\n";
    const std::string data = "1 -0.5\n" + third + " 0\n1e-10 inf\n";
    EXPECT_EQ(written<R>(x, 1), header + data);
    EXPECT_EQ(written<R>(x, 0x101), data);
    EXPECT_EQ(written<R>(x, 0x201), header);
    EXPECT_EQ(written<R>(x, 0x301), "");
    EXPECT_EQ(written<R>(x, 2), "[3/0.3333] 1,-0.5 0.3333,0 1e-10,inf\n");
    EXPECT_EQ(written<R>(x, 0x102), " 1,-0.5 0.3333,0 1e-10,inf\n");
    EXPECT_EQ(written<R>(x, 0x202), "[3/0.3333]");
    EXPECT_EQ(written<R>(real<R>({}), 2), "[0/1]\n");
    EXPECT_EQ(written<R>(real<R>({NAN, -INFINITY}), 0x101), "nan\n-inf\n");
    EXPECT_EQ(written<R>(real<R>({9998.75L, 9999, -9999, 65536.5L, 999999936, 1e9L, -12345}), 2),
              "[7/1] 9999 9999 -9999 65536 999999936 1e+09 -12345\n");
    auto ramp = real<R>(std::vector<long double>(32, 7), 0.001);
    std::string sevens;
    for (int i = 0; i < 32; ++i) sevens.append(" 7");
    EXPECT_EQ(written<R>(ramp, 2), "[32/0.001]" + sevens + "\n");
    ASSERT_EQ(dsp_append(ramp, real<R>(std::vector<long double>(8, 9))), 0);
    EXPECT_EQ(written<R>(ramp, 2), "[40/0.001]" + sevens + " ...\n");
    ramp->points = -1;
    EXPECT_EQ(written<R>(ramp, 0x101), "");
    EXPECT_EQ(written<R>(ramp, 0x102), "\n");
}

/// The bytes of a number in either byte order.
template <class T>
std::string bytes(T number, bool big_endian) {
    std::string text(sizeof number, '\0');
    std::memcpy(text.data(), &number, sizeof number);
    if (big_endian != (std::endian::native == std::endian::big)) {
        std::reverse(text.begin(), text.end());
    }
    return text;
}

/// A binary signal of one complex point (1.5, -2.5) with spacing 0.25.
template <class T>
std::string binary(std::uint32_t magic, bool big, int points = 1, std::uint32_t type = sizeof(T)) {
    const std::string typed = magic == 0xEB0330BE ? bytes(type, big) : "";
    return bytes(magic, big) + typed + bytes(points, big) + bytes(1, big) + bytes(T(0.25), big) +
           bytes(T(1.5), big) + bytes(T(-2.5), big);
}

BOTH_PRECISIONS(File, ReadsEveryBinaryFormat) {
    const std::uint32_t current = 0xEB0330BE, doubles = 0xEB0110BE, floats = 0xEB0220BE;
    const auto x = complex<R>({{1.5L, -2.5L}}, 0.25);
    EXPECT_EQ(written<R>(x, 0), binary<T>(current, false, 1, 0x400 + sizeof(T)));
    EXPECT_EQ(written<R>(x, 0x100), binary<T>(current, false).substr(16 + sizeof(T)));
    EXPECT_EQ(written<R>(x, 0x200),
              binary<T>(current, false, 1, 0x400 + sizeof(T)).substr(0, 16 + sizeof(T)));
    for (const bool big : {false, true}) {
        EXPECT_EQ(story<R>(binary<double>(current, big) + binary<float>(current, big) +
                           binary<double>(doubles, big) + binary<float>(floats, big)),
                  "[1.5,-2.5]c0.25[1.5,-2.5]c0.25[1.5,-2.5]c0.25[1.5,-2.5]c0.25.");
        for (const auto& whole : {binary<double>(current, big), binary<float>(floats, big)}) {
            for (std::size_t n = 1; n < whole.size(); ++n) {
                const std::string cut = story<R>(whole.substr(0, n));
                EXPECT_EQ(cut.substr(0, 2) + cut.back(), "[]!") << n << " bytes";
            }
        }
        EXPECT_EQ(story<R>(binary<double>(current, big, 1, 2)), "[]!");
        EXPECT_EQ(story<R>(binary<double>(current, big, 0).substr(0, 24)), "[]c0.25.");
        EXPECT_EQ(story<R>(binary<double>(current, big, -5).substr(0, 24)), "[]c0.25.");
        EXPECT_EQ(story<R>(binary<double>(current, big, 2)), "[1.5,-2.5]c0.25!");
        EXPECT_EQ(story<R>(binary<double>(current ^ 0x010000, big)), "[]!");
    }
}

BOTH_PRECISIONS(File, TakesMemoryAsDataArrives) {
    for (const int promised : {INT_MAX / 2, INT_MAX}) {
        Signal<R> y;
        EXPECT_EQ(dspf_fread(y, File(binary<float>(0xEB0330BE, false, promised))), -1);
        EXPECT_LT(y->alloc, 1 << 22);
    }
    std::vector<std::complex<long double>> samples(1100000);
    for (std::size_t i = 0; i < samples.size(); ++i) samples[i] = {1 / float(i + 1), float(i)};
    const auto x = complex<R>(samples);
    const std::string doubles = written<dsp>(complex<dsp>(samples), 0);
    const std::string floats = written<dspf>(complex<dspf>(samples), 0);
    EXPECT_EQ(read_back<R>(doubles, x), 0);
    EXPECT_EQ(read_back<R>(floats, x), 0);
}

BOTH_PRECISIONS(File, ReportsWhatCannotBeWritten) {
    FILE* const only_read = dspf_fopen(null_device, "r");
    ASSERT_NE(only_read, nullptr);
    const auto x = real<R>({1, 2});
    for (const int flags : {0, 0x100, 0x200, 3, 0xFF}) {
        EXPECT_EQ(dspf_fwrite2(x, only_read, flags), -1) << flags;
    }
    EXPECT_EQ(dspf_fwrite_ascii(x, only_read), 0);
    EXPECT_EQ(dspf_fwrite(Signal<R>(), only_read), -1);
    EXPECT_EQ(dspf_fwrite2(Signal<R>(), only_read, 0x100), 0);
    std::clearerr(only_read);  // which some runtimes report once more as they close
    EXPECT_EQ(dspff_fclose(only_read), 0);
}

TEST(FileStreams, MayBeLongerThanTwoGigabytes) {
    const std::string path = ::testing::TempDir() + "wavkit-long-file";
    std::ofstream(path, std::ios::binary).put('1');
    std::filesystem::resize_file(path, (std::uintmax_t(1) << 31) + 16);
    std::string ones;
    for (int i = 0; i < 100; ++i) ones += " 1";
    std::ofstream(path, std::ios::binary | std::ios::app) << "#DSP points = 100\n"
                                                          << ones << " 7 8";
    if (FILE* const file = dspf_fopen(path.c_str(), "rb")) {
        std::fseek(file, INT_MAX, SEEK_SET);
        std::fseek(file, 17, SEEK_CUR);
        Signal<dsp> x;
        EXPECT_EQ(dspf_fread(x, file), 1);
        EXPECT_TRUE(is_real<dsp>(x, std::vector<long double>(100, 1)));
        EXPECT_EQ(dspf_fread(x, file), 1);
        EXPECT_TRUE(is_real<dsp>(x, {7, 8}));
        dspf_fclose(file);
    } else {
        ADD_FAILURE() << "it cannot be opened";
    }
    std::filesystem::remove(path);
}

TEST(FileStreams, DashMeansTheStandardStreams) {
    for (const auto open : {dspf_fopen, dspff_fopen}) {
        EXPECT_EQ(open("-", "r"), stdin);
        EXPECT_EQ(open("-", "r+b"), stdin);
        EXPECT_EQ(open("-", "wb"), stdout);
        EXPECT_EQ(open("-", "a"), nullptr);
        EXPECT_EQ(open("-", ""), nullptr);
        EXPECT_EQ(open("-no-such-file", "r"), nullptr);
    }
    EXPECT_EQ(dspf_fclose(stdin), 0);
    EXPECT_EQ(dspff_fclose(stdout), 0);
    EXPECT_EQ(std::fflush(stdout), 0);
    EXPECT_GE(std::fputs("", stdout), 0);
}

}  // namespace
}  // namespace wavkit::test
