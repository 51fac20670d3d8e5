// The scan engine must behave exactly like glibc's sscanf under the "C"
// locale, so most tests here are differential: the same format and line go
// through both, and return values and every destination byte must agree.

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <bit>
#include <cctype>
#include <clocale>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <memory>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "DecimalPointGuard.h"
#include "ZonCloudScanFormat.h"

namespace {

struct Rng {
    std::mt19937_64 engine;
    std::size_t Below(std::size_t n) { return engine() % n; }
    bool Chance(double p) { return double(engine() % 1000) < p * 1000; }
    double AnyDouble() { return std::bit_cast<double>(std::uint64_t(engine())); }  // subnormals, huge, inf, NaN too
    std::string Chars(std::size_t n, const char* alphabet = "0123456789")
    {
        std::string s(n, ' ');
        for (char& c : s) c = alphabet[Below(std::strlen(alphabet))];
        return s;
    }
    std::string Maybe(double p, const std::string& s) { return Chance(p) ? s : std::string(); }
    std::string Sign() { return Maybe(0.4, Chars(1, "+-")); }
    std::string Exponent(const char* letters, std::size_t digits) { return Maybe(0.5, Chars(1, letters) + Sign() + Chars(Below(digits))); }
};

template <class... Args>
std::string Format(const char* format, Args... args)
{
    char buffer[2048];
    std::snprintf(buffer, sizeof buffer, format, args...);
    return buffer;
}

// Floating-point text in every notation strtod knows, and broken variants of it.
std::string RealText(Rng& rng)
{
    static const char* const kOdd[] = {
        "inf", "INFINITY", "Nan", "nan(123)", "nan()", "nan(x_1", "infinit", "InFin", "in", "i", "n", "na", "infx", "nanq",
        "-", "+", ".", "-.", "+-1", "1e308", "1.7976931348623159e308", "2.2250738585072014e-308", "4.9406564584124654e-324",
        "2.4703282292062327e-324", "2.4703282292062328e-324", "1e-400", "1e400", "3.4028236e38", "7e-46", "0e99999",
        "1e-2147483649", "9007199254740993", "100ergs", "1e", "1e+", "1e-x", "0x", "0xg", "0x.p", "0x1p", "0x1p+", "0x.8",
        "0x1e3", "1.2.3", "08"};
    const char* const hex = "0123456789abcdefABCDEF";
    const std::string sign = rng.Sign();
    switch (rng.Below(8)) {
    case 0: return Format(rng.Chance(0.5) ? "%.*g" : "%.*e", int(rng.Below(20)), rng.AnyDouble());
    case 1: return Format(rng.Chance(0.5) ? "%a" : "%A", rng.AnyDouble());
    case 2: return Format("%.6f", (double(rng.Below(2000001)) - 1000000.0) / 7.0);
    case 3: return sign + kOdd[rng.Below(std::size(kOdd))];
    case 4:  // short, often incomplete pieces
        return sign + rng.Chars(rng.Below(4)) + rng.Maybe(0.6, "." + rng.Chars(rng.Below(4))) + rng.Exponent("eE", 4);
    case 5:
        return sign + "0" + rng.Chars(1, "xX") + rng.Chars(rng.Below(20), hex) + rng.Maybe(0.5, "." + rng.Chars(rng.Below(6), hex)) +
               rng.Exponent("pP", 5);
    case 6:  // more digits than 64 bits hold
        return sign + rng.Chars(1 + rng.Below(60)) + rng.Maybe(0.7, "." + std::string(rng.Below(40), '0') + rng.Chars(rng.Below(80))) +
               rng.Exponent("e", 4);
    default: return rng.Chars(1 + rng.Below(6), "0123456789.eE+-xXpPinfaINFA");
    }
}

std::string Junk(Rng& rng) { return rng.Chars(1 + rng.Below(5), " \t,;.:xXyYzZeE+-0123456789abcpPinf%#()_"); }

// A line shaped after the format, with occasional damage, so that both the
// success paths and every kind of failure are reached.
std::string LineFor(const std::string& format, Rng& rng)
{
    std::string line;
    for (std::size_t i = 0; i < format.size(); ++i) {
        if (format[i] != '%') {
            line += format[i] == ' ' ? rng.Chars(rng.Below(3), " \t") : rng.Chance(0.03) ? rng.Chars(1, "XYZ,;. ") : format.substr(i, 1);
            continue;
        }
        std::size_t width = 0;
        for (++i; format[i] == '*'; ++i) {}
        for (; std::isdigit(static_cast<unsigned char>(format[i])); ++i) width = width * 10 + std::size_t(format[i] - '0');
        while (std::strchr("hlLqjzt", format[i])) ++i;
        const char conv = format[i];
        if (conv == '[') i = format.find(']', i + 2);
        if (conv != 'n' && conv != 'c') line += rng.Maybe(0.2, rng.Chars(1 + rng.Below(2), " \t"));
        if (rng.Chance(0.05)) line += rng.Chance(0.5) ? Junk(rng) : RealText(rng);
        else if (conv == '%') line += '%';
        else if (conv == 'c') line += rng.Chars(width ? width : 1, "abc XYZ.,-+019\t");
        else if (conv == 's' || conv == '[') line += rng.Chars(rng.Below(12), "abcXYZ.,eE-+0123456789_ \t");
        else if (std::strchr("diuoxX", conv) && rng.Chance(0.5)) line += rng.Sign() + rng.Chars(1 + rng.Below(24));  // beyond 64 bits
        else if (conv != 'n') line += RealText(rng);
    }
    if (rng.Chance(0.1)) line.resize(rng.Below(line.size() + 1));
    return line + rng.Maybe(0.1, Junk(rng));
}

const char* const kFormats[] = {
    " X %lf Y %lf Z %lf", "%lf %lf %lf %s", "%40c", "%6d", "%24lf", "%7f", "%n", "%lf%n", " %lf %lf %lf",
    "%lf,%lf,%lf%n", "%lf;%lf;%lf %n", "%f %f %f %d %d %d", "%le %lg %la %lE%n", "%e%n%g%n", "%3lf%2lf%n",
    "%10lf%10lf%10lf%n", "%*lf %lf %n", "%d %i %u %x %o %n", "%hhd %hd %ld %lld %hhu %jd %zu%n", "%6d%6d%n",
    "%2i%3x%n", "%s%n %c%n", "%5s%3c%n", "%[^,],%lf%n", "%[0-9.eE+-]%n", "%*[ \t]%lf%n", " %% %d%%%n", "X%dY%n",
    "%c%c%c", "%40c%n", "%lf%*s%lf%n", "#%d:%lf", "%lf %n %lf %n", "%1lf%n", "%2lf%n", "%4lf%n", "%9lf%n",
    "%8f%n", "%ld%n", "%d.%d%n", "%*d %d", "%s %s %s", "%n%d%n", "%lf %n%c%n", "%*c%c%n", "%2s%n%3[a-c]%n",
    "%lg%lg%lg", "%f%n", "%5lu%n%lo%n", "%F %G %A%n", "%[a-ab]%n",
};

const char* const kHandPicked[] = {
    "", " ", "   \t ", "100ergs", "1e", "1e+", "1e+x", "1ex", "0x", "0xg", "0x.p", "0x1p", "0x1p+3", ".5", "5.", "-.5",
    "+-5", "-inf", "infinit", "infx", "infinity", "nan(1)", "in", "1.2.3", "-", ".", " -", "-x", ".e5", "12.5", "0x12",
    "08", "4294967297", "99999999999999999999", "-99999999999999999999", " X 1.5 Y 2.5 Z 3.5", "X1Y2Z3",
    "  X  -1e-3Y+.5  Z 7.", "1,2,3", "1;2;3", "1.5 2.5 3.5 name", "% 5%", "%5", "#12:3.5", "abc", "a b c",
    "12345678901234567890123456789 1", "1.000000000000000000000000000000000000001", "0.1 0.2 0.3",
    "-0 -0.0 -0e0", "1e308 1e309 1e-324", "0x1.fffffffffffff8p0", "   1.25\t-2.5\n3.75  ",
};

constexpr std::size_t kMaxSlots = 12, kSlotBytes = 1024;

template <class Char>
Char SwapPoint(Char c)
{
    return c == '.' ? ',' : c == ',' ? '.' : c;
}

std::string Swapped(std::string s)
{
    std::transform(s.begin(), s.end(), s.begin(), SwapPoint<char>);
    return s;
}

// One line through sscanf, through the engine with '.' on an unterminated copy
// (ASan reports any read past the line), and through the engine with ',' on
// the line and format with '.' and ',' exchanged. Destinations are
// sentinel-filled blocks compared byte for byte: what each side stores, and
// what it leaves alone, must agree (doubles bitwise).
int CheckLine(const std::string& format, const ZonCloudScanFormat& engine, const ZonCloudScanFormat& commaEngine, const std::string& line)
{
    const std::size_t used = std::min(engine.ArgKinds().size() + 1, kMaxSlots);
    std::vector<unsigned char> data[3];
    std::vector<void*> p[3];
    for (int s = 0; s < 3; ++s) {
        data[s].assign(used * kSlotBytes, 0xA5);
        p[s].assign(kMaxSlots, nullptr);
        for (std::size_t i = 0; i < used; ++i) p[s][i] = data[s].data() + i * kSlotBytes;
    }
    const std::unique_ptr<char[]> copy(new char[line.size()]);  // exactly sized
    std::memcpy(copy.get(), line.data(), line.size());
    const int results[3] = {
        std::sscanf(line.c_str(), format.c_str(), p[0][0], p[0][1], p[0][2], p[0][3], p[0][4], p[0][5], p[0][6], p[0][7], p[0][8], p[0][9], p[0][10], p[0][11]),
        engine.Scan(copy.get(), copy.get() + line.size(), '.', p[1].data()), commaEngine.Scan(Swapped(line).c_str(), ',', p[2].data())};
    for (std::size_t k = 0; k + 1 < used; ++k)  // text taken from the line holds the exchanged characters
        if (commaEngine.ArgKinds()[k] == ZonCloudScanFormat::ArgKind::Chars)
            std::transform(&data[2][k * kSlotBytes], &data[2][k * kSlotBytes] + kSlotBytes, &data[2][k * kSlotBytes], SwapPoint<unsigned char>);
    int failures = 0;
    for (const int s : {1, 2}) {
        if (results[s] == results[0] && data[s] == data[0]) continue;
        const auto at = std::mismatch(data[0].begin(), data[0].end(), data[s].begin()).first - data[0].begin();
        ADD_FAILURE() << "format \"" << format << "\" line \"" << line << "\" with '" << ".,"[s - 1] << "': result " << results[0]
                      << " vs " << results[s] << ", first different byte " << at << " (slot " << at / kSlotBytes << ")";
        ++failures;
    }
    return failures;
}

class ScanEngine : public ::testing::Test {
protected:
    static void SetUpTestSuite() { std::setlocale(LC_ALL, "C"); }
};

TEST_F(ScanEngine, AgreesWithSscanfOnGeneratedAndHandPickedLines)
{
    Rng rng{std::mt19937_64(20240611)};
    int failures = 0;
    for (const char* format : kFormats) {
        const ZonCloudScanFormat engine(format), commaEngine(Swapped(format));
        ASSERT_TRUE(engine.IsValid()) << format;
        for (const char* line : kHandPicked) failures += CheckLine(format, engine, commaEngine, line);
        for (int n = 0; n < 800 && failures < 20; ++n) {
            // Mostly lines shaped after the format; some free mixtures of numbers and junk.
            std::string line = n % 5 ? LineFor(format, rng) : "";
            for (std::size_t k = n % 5 ? 0 : rng.Below(5); k > 0; --k)
                line += (rng.Chance(0.5) ? RealText(rng) : Junk(rng)) + rng.Maybe(0.7, " ");
            failures += CheckLine(format, engine, commaEngine, line);
        }
    }
}

// Two imports at once with different decimal points must not disturb each
// other: both threads share one compiled format and use it with '.' and ','.
TEST_F(ScanEngine, ConcurrentScansWithDifferentDecimalPoints)
{
    const std::string format = " %lf %lf %lf";
    const ZonCloudScanFormat engine(format);
    std::atomic<int> failures{0};
    auto work = [&](std::uint64_t seed) {
        Rng rng{std::mt19937_64(seed)};
        for (int n = 0; n < 30000 && failures < 20; ++n) failures += CheckLine(format, engine, engine, LineFor(format, rng));
    };
    std::thread first(work, 1), second(work, 2);
    first.join();
    second.join();
}

// The glibc behaviours that decide how a file line reads, pinned here so that
// they hold whatever C library the tests run on.
TEST_F(ScanEngine, DocumentedQuirksHoldIndependentlyOfTheHostLibrary)
{
    const double untouched = std::numeric_limits<double>::quiet_NaN();
    const double inf = std::numeric_limits<double>::infinity();
    // A NaN value: the destination is left untouched; consumed -1: the %n is not reached.
    const struct {
        const char *format, *line;
        char point;
        int result;
        double value;
        int consumed;
    } cases[] = {
        {"%lf%n", "100ergs", '.', 1, 100, 4},  // the 'e' is taken, strtod stops before it
        {"%lf%n", "1e+x", '.', 1, 1, 3}, {"%lf%n", "0x", '.', 0, untouched, -1}, {"%lf%n", "0x.p", '.', 1, 0, 3},
        {"%lf%n", "infinit", '.', 0, untouched, -1}, {"%lf%n", "-Infinity!", '.', 1, -inf, 9},
        {"%lf%n", "-nan(1_a)x", '.', 1, untouched, 4},  // unlike strtod, no payload is taken
        {"%lf%n", " \t", '.', -1, untouched, -1}, {"%3lf%n", "-inf", '.', 0, untouched, -1},
        {"%24lf%n", "1.00000000000000000000000000009", '.', 1, 1, 24}, {"%lf%n", "-1e400", '.', 1, -inf, 6},
        {"%lf%n", "1,5", ',', 1, 1.5, 3}, {"%lf%n", "1.5", ',', 1, 1, 1}, {"%lf%n", "-0x1,8p1", ',', 1, -3, 8},
    };
    for (const auto& c : cases) {
        double value = untouched;
        int consumed = -1;
        EXPECT_EQ(ZonCloudScanFormat(c.format)(c.line, c.point, &value, &consumed), c.result) << c.line;
        EXPECT_TRUE(std::isnan(c.value) ? std::isnan(value) : value == c.value) << c.line << ": " << value;
        EXPECT_EQ(consumed, c.consumed) << c.line;
    }

    int a = -1, b = -1, n = -1;
    EXPECT_EQ(ZonScan("12.5", '.', "%d%n", &a, &n), 1);
    EXPECT_EQ(std::to_string(a) + "/" + std::to_string(n), "12/2");
    EXPECT_EQ(ZonScan("-1234567", '.', "%6d%n", &a, &n), 1);
    EXPECT_EQ(std::to_string(a) + "/" + std::to_string(n), "-12345/6");
    EXPECT_EQ(ZonScan("5", '.', "%*d %d", &b), -1);  // a suppressed field is no conversion
    char text[48];
    std::memset(text, '#', sizeof text);
    EXPECT_EQ(ZonScan("abc", '.', "%40c%n", text, &n), 1);  // a short field still counts
    EXPECT_EQ(std::string(text, 5) + std::to_string(n), "abc##3");
    EXPECT_EQ(ZonScan("0123456789012345678901234567890123456789XY", '.', "%40c%n", text, &n), 1);
    EXPECT_EQ(std::string(text + 38, 3) + std::to_string(n), "89#40");  // no terminator added
}

TEST_F(ScanEngine, ArgumentCheckingAndUnsupportedDirectives)
{
    const ZonCloudScanFormat format(" X %lf Y %f %d %40c %n %*d %hhd %ld");
    EXPECT_TRUE((format.AcceptsArgs<double, float, int, char, int, signed char, long>()));
    EXPECT_FALSE((format.AcceptsArgs<float, float, int, char, int, signed char, long>()));
    EXPECT_FALSE((format.AcceptsArgs<double, float, int, char, int, signed char, short>()));
    // Unsupported directives end the scan where they stand.
    for (const char* bad : {"%d %Lf", "%d %ls", "%d %1$d", "%d %ms", "%d %p", "%d %", "%d %[abc"}) {
        const ZonCloudScanFormat f(bad);
        EXPECT_FALSE(f.IsValid()) << bad;
        int v[2] = {0, 0};
        void* const args[] = {&v[0], &v[1]};
        EXPECT_EQ(f.Scan("7 8", '.', args) * 10 + v[0], 17) << bad;
    }
}

bool SameReal(double a, double b) { return std::isnan(a) ? std::isnan(b) && std::signbit(a) == std::signbit(b) : std::memcmp(&a, &b, sizeof a) == 0; }

// One number text against strtod and strtof, with '.' and (exchanged) ',', from an unterminated copy.
int CheckNumber(const std::string& text)
{
    char *endDouble, *endFloat;
    const double refDouble = std::strtod(text.c_str(), &endDouble);
    const float refFloat = std::strtof(text.c_str(), &endFloat);
    const std::ptrdiff_t refLength = endDouble - text.c_str(), refFloatLength = endFloat - text.c_str();
    int failures = 0;
    for (const char point : {'.', ','}) {
        const std::string input = point == '.' ? text : Swapped(text);
        const std::vector<char> buffer(input.begin(), input.end());
        const char *first = buffer.data(), *last = first + buffer.size();
        double d = -42;
        float f = -42;
        const char* end = ZonParseDouble(first, last, point, d);
        const char* endF = ZonParseFloat(first, last, point, f);
        if ((refLength == 0 ? !end : end && end - first == refLength && SameReal(d, refDouble)) &&
            (refFloatLength == 0 ? !endF : endF && endF - first == refFloatLength && SameReal(f, refFloat)))
            continue;
        ADD_FAILURE() << ++failures << ": \"" << input << "\" with '" << point << "': strtod " << Format("%a", refDouble) << " got "
                      << Format("%a length %td", d, end ? end - first : -1) << ", strtof " << Format("%a", double(refFloat));
    }
    return failures;
}

TEST_F(ScanEngine, ParseDoubleAgreesWithStrtod)
{
    Rng rng{std::mt19937_64(99)};
    int failures = 0;
    for (int n = 0; n < 20000 && failures < 20; ++n) {
        std::string text = rng.Maybe(0.1, " \t") + RealText(rng) + rng.Maybe(0.2, Junk(rng));
        if (rng.Chance(0.3)) text.resize(rng.Below(text.size() + 1));
        failures += CheckNumber(text);
    }
    // Decimal and hexadecimal strings at, just below and just above the
    // midpoint between two neighbouring doubles, longer than any shortcut handles.
    for (int n = 0; n < 1000 && failures < 20; ++n) {
        double d = std::fabs(rng.AnyDouble());
        if (!std::isfinite(d) || rng.Chance(0.2)) d = std::ldexp(double(rng.Below(1u << 20)), -1074);  // subnormals
        if (d == std::numeric_limits<double>::max()) continue;
        const long double mid = (static_cast<long double>(d) + std::nextafter(d, HUGE_VAL)) / 2;  // exact
        const std::string exact = Format("%.780Le", mid), hex = Format("%La", mid);
        const std::string mantissa = exact.substr(0, exact.find('e')), exponent = exact.substr(exact.find('e'));
        std::string below = mantissa;
        const std::size_t last = below.find_last_not_of('0');
        if (below[last] != '.') --below[last];
        for (const std::string& text : {exact, mantissa + "0000000000000000000000001" + exponent, mantissa.substr(0, last + 1) + exponent,
                                        below + std::string(400, '9') + exponent, hex,
                                        hex.substr(0, hex.find('p')) + "000000000000000000000000000000000000001" + hex.substr(hex.find('p'))})
            failures += CheckNumber(text);
    }
}

TEST(DecimalPointGuardTest, SwitchesBetweenPointAndCommaWithoutTouchingTheLocale)
{
    for (const char start : {'.', ',', ';'}) {
        SCOPED_TRACE(start);
        const bool switchable = start != ';';
        DecimalPointGuard guard(start);
        EXPECT_EQ(guard.Switch(), switchable);
        EXPECT_EQ(guard.DecimalPoint(), SwapPoint(start));
        EXPECT_EQ(guard.IsSwitched(), switchable);
        EXPECT_EQ(guard.Switch(), switchable);  // a second switch goes back
        EXPECT_TRUE(guard.DecimalPoint() == start && !guard.IsSwitched());
        guard.Switch();
        guard.Restore();
        guard.Restore();  // nothing pending: no change
        EXPECT_TRUE(guard.DecimalPoint() == start && !guard.IsSwitched());
    }
    std::setlocale(LC_ALL, "C");
    DecimalPointGuard fromLocale;
    EXPECT_TRUE(fromLocale.Switch());
    EXPECT_EQ(fromLocale.DecimalPoint(), ',');
    EXPECT_STREQ(std::localeconv()->decimal_point, ".");  // the process locale is left alone
}

}  // namespace
