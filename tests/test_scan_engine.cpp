// The scan engine must behave exactly like glibc's sscanf under the "C"
// locale, so most tests here are differential: the same format and line go
// through both, and return values and every destination byte must agree.

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <clocale>
#include <cmath>
#include <cstdarg>
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

class Rng {
public:
    explicit Rng(std::uint64_t seed) : _engine(seed) {}
    std::size_t Below(std::size_t n) { return std::uniform_int_distribution<std::size_t>(0, n - 1)(_engine); }
    bool Chance(double p) { return std::uniform_real_distribution<double>(0, 1)(_engine) < p; }
    double AnyDouble()  // every bit pattern: subnormals, huge values, inf, NaN
    {
        const std::uint64_t bits = _engine();
        double d;
        std::memcpy(&d, &bits, sizeof d);
        return d;
    }
    std::string Chars(std::size_t n, const char* alphabet = "0123456789")
    {
        std::string s;
        while (n--)
            s += alphabet[Below(std::strlen(alphabet))];
        return s;
    }
    std::string Maybe(double p, const std::string& s) { return Chance(p) ? s : std::string(); }

private:
    std::mt19937_64 _engine;
};

std::string Format(const char* format, ...) __attribute__((format(printf, 1, 2)));
std::string Format(const char* format, ...)
{
    char buffer[2048];
    va_list args;
    va_start(args, format);
    std::vsnprintf(buffer, sizeof buffer, format, args);
    va_end(args);
    return buffer;
}

std::string Sign(Rng& rng) { return rng.Maybe(0.4, rng.Chars(1, "+-")); }

// Floating-point text in every notation strtod knows, and broken variants of it.
std::string RealText(Rng& rng)
{
    static const char* const kOdd[] = {
        "inf", "INFINITY", "Nan", "nan(123)", "nan()", "nan(x_1", "infinit", "InFin", "in", "i", "n", "na", "infx",
        "infinityx", "nanq", "-", "+", ".", "-.", "+-1", "1e308", "1.7976931348623159e308", "2.2250738585072014e-308",
        "4.9406564584124654e-324", "2.4703282292062327e-324", "2.4703282292062328e-324", "1e-400", "1e400",
        "3.4028236e38", "7e-46", "0e99999", "1e-2147483649", "9007199254740993", "100ergs", "1e", "1e+", "1e-x", "0x",
        "0xg", "0x.p", "0x1p", "0x1p+", "0x.8", "1.2.3", "08", "0x1e3"};
    switch (rng.Below(10)) {
    case 0:
        return Format("%.17g", rng.AnyDouble());
    case 1:
        return Format("%.6f", (rng.Below(2000001) - 1000000.0) / 7.0);
    case 2:
        return Format("%.*e", int(rng.Below(20)), rng.AnyDouble());
    case 3:
        return Format(rng.Chance(0.5) ? "%a" : "%A", rng.AnyDouble());
    case 4:  // short, often incomplete pieces
        return Sign(rng) + rng.Chars(rng.Below(4)) + rng.Maybe(0.6, "." + rng.Chars(rng.Below(4))) +
               rng.Maybe(0.5, rng.Chars(1, "eE") + rng.Maybe(0.5, rng.Chars(1, "+-")) + rng.Chars(rng.Below(4)));
    case 5:
        return Sign(rng) + kOdd[rng.Below(std::size(kOdd))];
    case 6:
        return Sign(rng) + rng.Chars(1, "0") + rng.Chars(1, "xX") + rng.Chars(rng.Below(20), "0123456789abcdefABCDEF") +
               rng.Maybe(0.5, "." + rng.Chars(rng.Below(6), "0123456789abcdef")) +
               rng.Maybe(0.6, rng.Chars(1, "pP") + rng.Maybe(0.5, rng.Chars(1, "+-")) + rng.Chars(rng.Below(5)));
    case 7:  // more digits than 64 bits hold
        return Sign(rng) + rng.Chars(1 + rng.Below(60)) + rng.Maybe(0.7, "." + std::string(rng.Below(40), '0') + rng.Chars(rng.Below(80))) +
               rng.Maybe(0.5, "e" + Sign(rng) + std::to_string(rng.Below(400)));
    case 8:
        return Format("%.*g", int(1 + rng.Below(9)), rng.AnyDouble());
    default:
        return rng.Chars(1 + rng.Below(6), "0123456789.eE+-xXpPinfaINFA");
    }
}

std::string IntegerText(Rng& rng)
{
    switch (rng.Below(4)) {
    case 0:
        return Format("%d", int(rng.Below(2000001)) - 1000000);
    case 1:
        return Sign(rng) + rng.Chars(1 + rng.Below(24));  // up to far beyond 64 bits
    case 2:
        return Sign(rng) + "0" + rng.Chars(1, "xX") + rng.Chars(rng.Below(18), "0123456789abcdefABCDEF");
    default:
        return RealText(rng);
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
            line += format[i] == ' ' ? rng.Chars(rng.Below(3), " \t ") : rng.Chance(0.03) ? rng.Chars(1, "XYZ,;. ") : std::string(1, format[i]);
            continue;
        }
        std::size_t width = 0;
        for (++i; format[i] == '*'; ++i) {}
        for (; std::isdigit(static_cast<unsigned char>(format[i])); ++i)
            width = width * 10 + std::size_t(format[i] - '0');
        while (std::strchr("hlLqjzt", format[i]))
            ++i;
        const char conv = format[i];
        if (conv == '[')
            i = format.find(']', i + 2);
        if (conv != 'n' && conv != 'c')
            line += rng.Maybe(0.2, rng.Chars(1 + rng.Below(2), " \t"));
        if (rng.Chance(0.05))
            line += rng.Chance(0.5) ? Junk(rng) : RealText(rng);
        else if (conv == '%')
            line += '%';
        else if (conv == 'c')
            line += rng.Chars(width ? width : 1, "abc XYZ.,-+019\t");
        else if (conv == 's')
            line += rng.Chars(1 + rng.Below(12), "abcdefXYZ.,-+0123456789_");
        else if (conv == '[')
            line += rng.Chars(rng.Below(10), "0123456789.,eE+-abc \t");
        else if (std::strchr("diuoxX", conv))
            line += IntegerText(rng);
        else if (conv != 'n')
            line += RealText(rng);
    }
    if (rng.Chance(0.1))
        line.resize(rng.Below(line.size() + 1));
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

constexpr std::size_t kMaxSlots = 12;
constexpr std::size_t kSlotBytes = 1024;

// Destinations are sentinel-filled blocks compared byte for byte: what each
// side stores, and what it leaves alone, must agree (doubles bitwise).
struct Scanned {
    int result = 0;
    std::vector<unsigned char> data;

    std::vector<void*> Slots(std::size_t used)
    {
        data.assign(used * kSlotBytes, 0xA5);
        std::vector<void*> p(kMaxSlots, nullptr);
        for (std::size_t i = 0; i < used; ++i)
            p[i] = data.data() + i * kSlotBytes;
        return p;
    }
};

std::string Swapped(std::string s)
{
    for (char& c : s)
        c = c == '.' ? ',' : c == ',' ? '.' : c;
    return s;
}

std::string Difference(const Scanned& expected, const Scanned& actual)
{
    if (expected.result != actual.result)
        return Format("result %d vs %d", expected.result, actual.result);
    const auto at = std::mismatch(expected.data.begin(), expected.data.end(), actual.data.begin()).first - expected.data.begin();
    if (at == std::ptrdiff_t(expected.data.size()))
        return {};
    double e, a;
    std::memcpy(&e, &expected.data[at - at % 8], 8);
    std::memcpy(&a, &actual.data[at - at % 8], 8);
    return Format("slot %zu byte %zu differs (as double %a vs %a)", at / kSlotBytes, at % kSlotBytes, e, a);
}

// One line through sscanf, through the engine with '.', and through the
// engine with ',' on the line and format with '.' and ',' exchanged.
int CheckLine(const std::string& format, const ZonCloudScanFormat& engine, const ZonCloudScanFormat& commaEngine, const std::string& line)
{
    const std::size_t used = std::min(engine.ArgKinds().size() + 1, kMaxSlots);
    Scanned reference, dot, comma;
    auto p = reference.Slots(used);
    reference.result = std::sscanf(line.c_str(), format.c_str(), p[0], p[1], p[2], p[3], p[4], p[5], p[6], p[7], p[8], p[9], p[10], p[11]);
    dot.result = engine.Scan(line.c_str(), '.', dot.Slots(used).data());
    comma.result = commaEngine.Scan(Swapped(line).c_str(), ',', comma.Slots(used).data());
    for (std::size_t k = 0; k + 1 < used; ++k)
        if (commaEngine.ArgKinds()[k] == ZonCloudScanFormat::ArgKind::Chars)
            for (std::size_t b = k * kSlotBytes; b < (k + 1) * kSlotBytes; ++b)
                comma.data[b] = comma.data[b] == '.' ? ',' : comma.data[b] == ',' ? '.' : comma.data[b];

    int failures = 0;
    for (const auto& [point, scanned] : {std::pair{'.', &dot}, std::pair{',', &comma}}) {
        const std::string difference = Difference(reference, *scanned);
        if (!difference.empty()) {
            ADD_FAILURE() << "format \"" << format << "\" line \"" << line << "\" with '" << point << "': " << difference;
            ++failures;
        }
    }
    return failures;
}

class ScanEngine : public ::testing::Test {
protected:
    static void SetUpTestSuite() { std::setlocale(LC_ALL, "C"); }
};

TEST_F(ScanEngine, AgreesWithSscanfOnGeneratedAndHandPickedLines)
{
    Rng rng(20240611);
    int failures = 0;
    for (const char* format : kFormats) {
        const ZonCloudScanFormat engine(format), commaEngine(Swapped(format));
        ASSERT_TRUE(engine.IsValid()) << format;
        for (const char* line : kHandPicked)
            failures += CheckLine(format, engine, commaEngine, line);
        for (int n = 0; n < 700 && failures < 20; ++n)
            failures += CheckLine(format, engine, commaEngine, LineFor(format, rng));
        for (int n = 0; n < 150 && failures < 20; ++n) {
            std::string line;
            for (std::size_t k = rng.Below(5); k > 0; --k)
                line += (rng.Chance(0.5) ? RealText(rng) : Junk(rng)) + rng.Maybe(0.7, " ");
            failures += CheckLine(format, engine, commaEngine, line);
        }
    }
}

TEST_F(ScanEngine, DocumentedQuirksHoldIndependentlyOfTheHostLibrary)
{
    const double untouched = std::numeric_limits<double>::quiet_NaN();
    const double inf = std::numeric_limits<double>::infinity();
    const struct {
        const char* format;
        const char* line;
        char point;
        int result;
        double value;  // NaN: destination untouched
        int consumed;  // -1: %n not reached
    } cases[] = {
        {"%lf%n", "100ergs", '.', 1, 100, 4},  // the 'e' is taken, strtod stops before it
        {"%lf%n", "1e+x", '.', 1, 1, 3},
        {"%lf%n", "0x", '.', 0, untouched, -1},
        {"%lf%n", "0x.p", '.', 1, 0, 3},
        {"%lf%n", "infinit", '.', 0, untouched, -1},
        {"%lf%n", "-Infinity!", '.', 1, -inf, 9},
        {"%lf%n", " \t", '.', -1, untouched, -1},
        {"%3lf%n", "-inf", '.', 0, untouched, -1},
        {"%24lf%n", "1.00000000000000000000000000009", '.', 1, 1, 24},
        {"%lf%n", "1,5", ',', 1, 1.5, 3},
        {"%lf%n", "1.5", ',', 1, 1, 1},
        {"%lf%n", "-0x1,8p1", ',', 1, -3, 8},
        {"%lf%n", "-1e400", '.', 1, -inf, 6},
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
    EXPECT_EQ(a * 10 + n, 122);
    EXPECT_EQ(ZonScan("5", '.', "%*d %d", &b), -1);  // a suppressed field is no conversion
    char text[48];
    std::memset(text, '#', sizeof text);
    EXPECT_EQ(ZonScan("abc", '.', "%40c%n", text, &n), 1);  // a short field still counts
    EXPECT_EQ(std::string(text, 5) + std::to_string(n), "abc##3");
    EXPECT_EQ(ZonScan("0123456789012345678901234567890123456789XY", '.', "%40c%n", text, &n), 1);
    EXPECT_EQ(std::string(text + 38, 3) + std::to_string(n), "89#40");  // no terminator added
}

TEST_F(ScanEngine, RangeInputStopsAtItsEnd)
{
    const std::string text = "1.5 -2.25 3e2 4";
    const ZonCloudScanFormat format("%lf %lf %lf");
    for (std::size_t length = 0; length <= text.size(); ++length) {
        // Exactly sized, unterminated copy: ASan reports any read past it.
        std::unique_ptr<char[]> buffer(new char[length + !length]);
        std::memcpy(buffer.get(), text.data(), length);
        double v[3] = {}, expected[3] = {};
        void* const args[] = {&v[0], &v[1], &v[2]};
        EXPECT_EQ(format.Scan(buffer.get(), buffer.get() + length, '.', args),
                  std::sscanf(text.substr(0, length).c_str(), "%lf %lf %lf", &expected[0], &expected[1], &expected[2]));
        EXPECT_EQ(std::memcmp(v, expected, sizeof v), 0) << length;
    }
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

// Two imports at once with different decimal points must not disturb each other.
TEST_F(ScanEngine, ConcurrentScansWithDifferentDecimalPoints)
{
    Rng rng(7);
    struct Line {
        std::string dot, comma;
        int result;
        double v[3];
    };
    std::vector<Line> lines(20000);
    auto coordinate = [&rng] { return (double(rng.Below(2000000001)) - 1e9) / 1e3; };
    for (Line& l : lines) {
        l.dot = rng.Chance(0.9) ? Format(" %.6f %.6f %.6f", coordinate(), coordinate(), coordinate())
                                : RealText(rng) + " " + RealText(rng) + " " + RealText(rng);
        l.comma = Swapped(l.dot);
        std::fill(l.v, l.v + 3, -1.0);
        l.result = std::sscanf(l.dot.c_str(), " %lf %lf %lf", &l.v[0], &l.v[1], &l.v[2]);
    }
    const ZonCloudScanFormat format(" %lf %lf %lf");
    std::atomic<int> mismatches{0};
    auto work = [&](char point) {
        for (int round = 0; round < 3; ++round)
            for (const Line& l : lines) {
                double v[3] = {-1, -1, -1};
                if (format((point == '.' ? l.dot : l.comma).c_str(), point, &v[0], &v[1], &v[2]) != l.result || std::memcmp(v, l.v, sizeof v) != 0)
                    ++mismatches;
            }
    };
    std::thread dot(work, '.'), comma(work, ',');
    dot.join();
    comma.join();
    EXPECT_EQ(mismatches.load(), 0);
}

bool SameReal(double a, double b) { return std::isnan(a) ? std::isnan(b) && std::signbit(a) == std::signbit(b) : std::memcmp(&a, &b, sizeof a) == 0; }

// One number text against strtod and strtof, with '.' and (swapped) ','.
int CheckNumber(const std::string& text)
{
    char* end;
    const double refDouble = std::strtod(text.c_str(), &end);
    const std::ptrdiff_t refLength = end - text.c_str();
    const float refFloat = std::strtof(text.c_str(), &end);
    const std::ptrdiff_t refFloatLength = end - text.c_str();

    int failures = 0;
    for (const char point : {'.', ','}) {
        const std::string input = point == '.' ? text : Swapped(text);
        const std::vector<char> buffer(input.begin(), input.end());  // unterminated
        const char* first = buffer.data();
        double d = -42;
        float f = -42;
        const char* endDouble = ZonParseDouble(first, first + buffer.size(), point, d);
        const char* endFloat = ZonParseFloat(first, first + buffer.size(), point, f);
        const bool ok = (refLength == 0 ? !endDouble : endDouble && endDouble - first == refLength && SameReal(d, refDouble)) &&
                        (refFloatLength == 0 ? !endFloat : endFloat && endFloat - first == refFloatLength && SameReal(f, refFloat));
        if (!ok)
            ADD_FAILURE() << ++failures << ": \"" << input << "\" with '" << point << "': strtod " << Format("%a", refDouble) << " got "
                          << Format("%a length %td", d, endDouble ? endDouble - first : -1) << ", strtof " << Format("%a", double(refFloat));
    }
    return failures;
}

TEST_F(ScanEngine, ParseDoubleAgreesWithStrtod)
{
    Rng rng(99);
    int failures = 0;
    for (int n = 0; n < 30000 && failures < 20; ++n) {
        std::string text = rng.Maybe(0.1, " \t") + RealText(rng) + rng.Maybe(0.2, Junk(rng));
        if (rng.Chance(0.3))
            text.resize(rng.Below(text.size() + 1));
        failures += CheckNumber(text);
    }
}

// Decimal strings at, just below and just above the midpoint between two
// neighbouring doubles, longer than any shortcut can handle.
TEST_F(ScanEngine, ParseDoubleRoundsLongHalfwayCasesCorrectly)
{
    Rng rng(5);
    int failures = 0;
    for (int n = 0; n < 1500 && failures < 20; ++n) {
        double d = std::fabs(rng.AnyDouble());
        if (!std::isfinite(d) || rng.Chance(0.2))
            d = std::ldexp(double(rng.Below(1u << 20)), -1074);  // subnormals
        if (d == std::numeric_limits<double>::max())
            continue;
        const long double mid = (static_cast<long double>(d) + std::nextafter(d, HUGE_VAL)) / 2;  // exact
        const std::string exact = Format("%.780Le", mid);
        const std::string mantissa = exact.substr(0, exact.find('e')), exponent = exact.substr(exact.find('e'));
        failures += CheckNumber(exact);
        failures += CheckNumber(mantissa + "0000000000000000000000001" + exponent);
        failures += CheckNumber(mantissa.substr(0, mantissa.find_last_not_of('0') + 1) + exponent);
        std::string below = mantissa;
        const std::size_t last = below.find_last_not_of('0');
        if (below[last] != '.') {
            --below[last];
            failures += CheckNumber(below + std::string(400, '9') + exponent);
        }
        const std::string hex = Format("%La", mid);
        failures += CheckNumber(hex);
        failures += CheckNumber(hex.substr(0, hex.find('p')) + "000000000000000000000000000000000000001" + hex.substr(hex.find('p')));
    }
}

TEST(DecimalPointGuardTest, SwitchesBetweenPointAndCommaAndRestores)
{
    for (const char start : {'.', ',', ';'}) {
        const bool switchable = start != ';';
        const char other = start == '.' ? ',' : start == ',' ? '.' : start;
        DecimalPointGuard guard(start);
        EXPECT_EQ(guard.Switch(), switchable);
        EXPECT_EQ(std::string() + guard.DecimalPoint() + (guard.IsSwitched() ? "s" : ""), std::string() + other + (switchable ? "s" : ""));
        EXPECT_EQ(guard.Switch(), switchable);  // a second switch goes back
        EXPECT_EQ(guard.DecimalPoint(), start);
        EXPECT_FALSE(guard.IsSwitched());
        guard.Switch();
        guard.Restore();
        EXPECT_EQ(guard.DecimalPoint(), start);
        EXPECT_FALSE(guard.IsSwitched());
        guard.Restore();  // nothing pending: no change
        EXPECT_EQ(guard.DecimalPoint(), start);
    }

    std::setlocale(LC_ALL, "C");
    DecimalPointGuard fromLocale;
    EXPECT_EQ(fromLocale.DecimalPoint(), '.');
    EXPECT_TRUE(fromLocale.Switch());
    EXPECT_EQ(fromLocale.DecimalPoint(), ',');
    EXPECT_STREQ(std::localeconv()->decimal_point, ".");  // the process locale is left alone
}

}  // namespace
