#include "ZonCloudNumberPrinter.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstring>

namespace {

// Precisions and widths beyond these are left to the C library: no writer
// comes near them, and they bound the buffers here.
constexpr int MaxPrecision = 1000;
constexpr int MaxWidth = 1 << 16;
// Digits of any double in "%f" (309 before the point), point, sign, exponent.
constexpr std::size_t NumberRoom = 330;

constexpr std::uint64_t Pow10[20] = {1ULL,
                                     10ULL,
                                     100ULL,
                                     1000ULL,
                                     10000ULL,
                                     100000ULL,
                                     1000000ULL,
                                     10000000ULL,
                                     100000000ULL,
                                     1000000000ULL,
                                     10000000000ULL,
                                     100000000000ULL,
                                     1000000000000ULL,
                                     10000000000000ULL,
                                     100000000000000ULL,
                                     1000000000000000ULL,
                                     10000000000000000ULL,
                                     100000000000000000ULL,
                                     1000000000000000000ULL,
                                     10000000000000000000ULL};

constexpr char TwoDigits[] =
    "00010203040506070809101112131415161718192021222324252627282930313233343536373839"
    "40414243444546474849505152535455565758596061626364656667686970717273747576777879"
    "8081828384858687888990919293949596979899";

// The last `count` decimal digits of value, zeros in front.
char* WriteDigits(char* out, std::uint64_t value, int count)
{
    char* const end = out + count;
    char* p = end;
    while (p - out >= 2) {
        const std::uint64_t pair = value % 100;
        value /= 100;
        p -= 2;
        std::memcpy(p, TwoDigits + 2 * pair, 2);
    }
    if (p > out) *--p = static_cast<char>('0' + value % 10);
    return end;
}

// "%.<precision>f" of a finite a >= 0 with precision <= 19, from its binary
// value a = m * 2^e: the whole part and the fraction's digits are exact
// integer quotients, and the remainder decides the rounding, ties to even as
// the C library does. False for values of 2^63 and more (to_chars does those).
bool FixedExact(char*& out, double a, int precision)
{
    std::uint64_t bits = 0;
    std::memcpy(&bits, &a, sizeof bits);
    const int field = static_cast<int>(bits >> 52) & 0x7ff;
    std::uint64_t m = bits & ((std::uint64_t{1} << 52) - 1);
    int e = -1074;
    if (field != 0) {
        m |= std::uint64_t{1} << 52;
        e = field - 1075;
    }
    std::uint64_t whole = 0;
    std::uint64_t fraction = 0;
    if (e >= 0) {
        if (e > 10) return false;
        whole = m << e;
    } else if (m != 0) {
        const int k = -e;
        std::uint64_t rest = m;
        if (k < 64) {
            whole = m >> k;
            rest = m & ((std::uint64_t{1} << k) - 1);
        }
        // Below 2^-128 the scaled value stays under a half: all digits are 0.
        if (k < 128) {
            using u128 = unsigned __int128;
            const u128 scaled = static_cast<u128>(rest) * Pow10[precision];
            fraction = static_cast<std::uint64_t>(scaled >> k);
            const u128 remainder = scaled & ((u128{1} << k) - 1);
            const u128 half = u128{1} << (k - 1);
            const std::uint64_t last = precision == 0 ? whole : fraction;
            if (remainder > half || (remainder == half && (last & 1) != 0)) {
                if (precision == 0) ++whole;
                else if (++fraction == Pow10[precision]) {
                    fraction = 0;
                    ++whole;
                }
            }
        }
    }
    out = std::to_chars(out, out + 24, whole).ptr;
    if (precision > 0) {
        *out++ = '.';
        out = WriteDigits(out, fraction, precision);
    }
    return true;
}

bool Uppercase(char conversion) { return conversion == 'F' || conversion == 'E' || conversion == 'G'; }

// The digits of a finite a >= 0 (no sign, no padding).
char* FloatDigits(char* out, const ZonNumberConversion& conv, double a)
{
    const int precision = conv.precision < 0 ? 6 : conv.precision;
    char* const last = out + NumberRoom + static_cast<std::size_t>(precision);
    char* end = out;
    switch (conv.letter) {
        case 'f':
        case 'F':
            if (precision > 19 || !FixedExact(end, a, precision))
                end = std::to_chars(out, last, a, std::chars_format::fixed, precision).ptr;
            if (conv.alt && precision == 0) *end++ = '.';
            return end;
        case 'e':
        case 'E':
            end = std::to_chars(out, last, a, std::chars_format::scientific, precision).ptr;
            if (conv.alt && precision == 0) {
                // "1e+00" becomes "1.e+00".
                std::memmove(out + 2, out + 1, static_cast<std::size_t>(end - out - 1));
                out[1] = '.';
                ++end;
            }
            break;
        default:  // g G
            end = std::to_chars(out, last, a, std::chars_format::general, std::max(precision, 1)).ptr;
            break;
    }
    if (Uppercase(conv.letter))
        for (char* p = out; p != end; ++p)
            if (*p == 'e') *p = 'E';
    return end;
}

// The field: sign, then `zeros` zeros, then the body, padded to the width.
char* Field(char* out, const ZonNumberConversion& conv, char sign, bool zeroPadding, int zeros, const char* body,
            std::size_t size)
{
    const int length = (sign ? 1 : 0) + zeros + static_cast<int>(size);
    const int padding = conv.width > length ? conv.width - length : 0;
    if (!conv.left && !zeroPadding && padding > 0) {
        std::memset(out, ' ', static_cast<std::size_t>(padding));
        out += padding;
    }
    if (sign) *out++ = sign;
    if (!conv.left && zeroPadding) zeros += padding;
    if (zeros > 0) {
        std::memset(out, '0', static_cast<std::size_t>(zeros));
        out += zeros;
    }
    std::memcpy(out, body, size);
    out += size;
    if (conv.left && padding > 0) {
        std::memset(out, ' ', static_cast<std::size_t>(padding));
        out += padding;
    }
    return out;
}

char* Integer(char* out, const ZonNumberConversion& conv, char sign, unsigned long long magnitude)
{
    char digits[24];
    std::size_t size = static_cast<std::size_t>(std::to_chars(digits, digits + sizeof digits, magnitude).ptr - digits);
    // A precision of 0 prints no digit for 0.
    if (conv.precision == 0 && magnitude == 0) size = 0;
    const int zeros = std::max(conv.precision - static_cast<int>(size), 0);
    // A precision turns the '0' flag off.
    return Field(out, conv, sign, conv.zero && conv.precision < 0, zeros, digits, size);
}

}  // namespace

bool ZonCloudNumberPrinter::Handles(const ZonNumberConversion& conv)
{
    if (conv.precision > MaxPrecision || conv.width > MaxWidth || conv.width < 0) return false;
    switch (conv.letter) {
        case 'd':
        case 'i':
        case 'u':
        case 'f':
        case 'F':
        case 'e':
        case 'E':
            return true;
        case 'g':
        case 'G':
            return !conv.alt;  // '#' keeps the zeros that %g drops: left to the C library
        default:
            return false;
    }
}

std::size_t ZonCloudNumberPrinter::Bound(const ZonNumberConversion& conv)
{
    return static_cast<std::size_t>(std::max(conv.width, 0)) + static_cast<std::size_t>(std::max(conv.precision, 6)) +
           NumberRoom;
}

char* ZonCloudNumberPrinter::Print(char* out, const ZonNumberConversion& conv, double value)
{
    char sign = 0;
    if (std::signbit(value)) sign = '-';
    else if (conv.plus) sign = '+';
    else if (conv.space) sign = ' ';
    const double a = std::fabs(value);
    if (!std::isfinite(a)) {
        const bool upper = Uppercase(conv.letter);
        const char* text = std::isnan(a) ? (upper ? "NAN" : "nan") : (upper ? "INF" : "inf");
        return Field(out, conv, sign, false, 0, text, 3);
    }
    if (conv.width == 0) {
        // Nothing to pad: the digits go straight to out.
        if (sign) *out++ = sign;
        return FloatDigits(out, conv, a);
    }
    char body[NumberRoom + MaxPrecision + 8];
    const char* end = FloatDigits(body, conv, a);
    return Field(out, conv, sign, conv.zero, 0, body, static_cast<std::size_t>(end - body));
}

char* ZonCloudNumberPrinter::Print(char* out, const ZonNumberConversion& conv, long long value)
{
    char sign = 0;
    if (value < 0) sign = '-';
    else if (conv.plus) sign = '+';
    else if (conv.space) sign = ' ';
    // The magnitude of the most negative value too, without overflow.
    const unsigned long long magnitude = value < 0 ? 0ULL - static_cast<unsigned long long>(value)
                                                   : static_cast<unsigned long long>(value);
    return Integer(out, conv, sign, magnitude);
}

char* ZonCloudNumberPrinter::Print(char* out, const ZonNumberConversion& conv, unsigned long long value)
{
    return Integer(out, conv, 0, value);
}

char* ZonCloudNumberPrinter::Fixed(char* out, double value, int precision)
{
    if (std::signbit(value)) *out++ = '-';
    const double a = std::fabs(value);
    if (precision <= 19 && std::isfinite(a) && FixedExact(out, a, precision)) return out;
    ZonNumberConversion conv;
    conv.precision = precision;
    return Print(out, conv, a);
}
