#include "ZonCloudPrintFormat.h"

#include <clocale>
#include <limits>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>
#include <sys/types.h>

#include "ZonCloudNumberPrinter.h"

namespace {

// The C library writes the locale's decimal point; ours is always '.'.
void FixDecimalPoint(std::string& out, std::size_t start)
{
    const std::lconv* conv = std::localeconv();
    const char* point = conv ? conv->decimal_point : nullptr;
    if (!point || !*point || std::strcmp(point, ".") == 0) return;
    const std::size_t at = out.find(point, start);
    if (at != std::string::npos) out.replace(at, std::strlen(point), ".");
}

// Runs snprintf on one directive and appends the result.
template <class T>
bool Emit(std::string& out, const char* directive, T value, bool floating)
{
    char local[256];
    const int n = std::snprintf(local, sizeof local, directive, value);
    if (n < 0) return false;
    const std::size_t start = out.size();
    if (static_cast<std::size_t>(n) < sizeof local) {
        out.append(local, static_cast<std::size_t>(n));
    } else {
        out.resize(start + static_cast<std::size_t>(n) + 1);
        std::snprintf(out.data() + start, static_cast<std::size_t>(n) + 1, directive, value);
        out.resize(start + static_cast<std::size_t>(n));
    }
    if (floating) FixDecimalPoint(out, start);
    return true;
}

enum class Length { None, Char, Short, Long, LongLong, IntMax, Size, PtrDiff, LongDouble };

void StoreCount(std::va_list& args, Length length, std::size_t count)
{
    switch (length) {
        case Length::Char: *va_arg(args, signed char*) = static_cast<signed char>(count); break;
        case Length::Short: *va_arg(args, short*) = static_cast<short>(count); break;
        case Length::Long: *va_arg(args, long*) = static_cast<long>(count); break;
        case Length::LongLong: *va_arg(args, long long*) = static_cast<long long>(count); break;
        case Length::IntMax: *va_arg(args, std::intmax_t*) = static_cast<std::intmax_t>(count); break;
        case Length::Size: *va_arg(args, ssize_t*) = static_cast<ssize_t>(count); break;
        case Length::PtrDiff: *va_arg(args, std::ptrdiff_t*) = static_cast<std::ptrdiff_t>(count); break;
        default: *va_arg(args, int*) = static_cast<int>(count); break;
    }
}

bool EmitSigned(std::string& out, const char* directive, std::va_list& args, Length length)
{
    switch (length) {
        case Length::Long: return Emit(out, directive, va_arg(args, long), false);
        case Length::LongLong: return Emit(out, directive, va_arg(args, long long), false);
        case Length::IntMax: return Emit(out, directive, va_arg(args, std::intmax_t), false);
        case Length::Size: return Emit(out, directive, va_arg(args, ssize_t), false);
        case Length::PtrDiff: return Emit(out, directive, va_arg(args, std::ptrdiff_t), false);
        default: return Emit(out, directive, va_arg(args, int), false);  // hh and h take an int too
    }
}

bool EmitUnsigned(std::string& out, const char* directive, std::va_list& args, Length length)
{
    switch (length) {
        case Length::Long: return Emit(out, directive, va_arg(args, unsigned long), false);
        case Length::LongLong: return Emit(out, directive, va_arg(args, unsigned long long), false);
        case Length::IntMax: return Emit(out, directive, va_arg(args, std::uintmax_t), false);
        case Length::Size: return Emit(out, directive, va_arg(args, std::size_t), false);
        case Length::PtrDiff: return Emit(out, directive, va_arg(args, std::ptrdiff_t), false);
        default: return Emit(out, directive, va_arg(args, unsigned), false);
    }
}

// Appends a number through the module's printer.
template <class T>
void AppendNumber(std::string& out, const ZonNumberConversion& conv, T value)
{
    const std::size_t start = out.size();
    out.resize(start + ZonCloudNumberPrinter::Bound(conv));
    char* end = ZonCloudNumberPrinter::Print(out.data() + start, conv, value);
    out.resize(static_cast<std::size_t>(end - out.data()));
}

long long SignedArgument(std::va_list& args, Length length)
{
    switch (length) {
        case Length::Char: return static_cast<signed char>(va_arg(args, int));
        case Length::Short: return static_cast<short>(va_arg(args, int));
        case Length::Long: return va_arg(args, long);
        case Length::LongLong: return va_arg(args, long long);
        case Length::IntMax: return va_arg(args, std::intmax_t);
        case Length::Size: return va_arg(args, ssize_t);
        case Length::PtrDiff: return va_arg(args, std::ptrdiff_t);
        default: return va_arg(args, int);
    }
}

unsigned long long UnsignedArgument(std::va_list& args, Length length)
{
    switch (length) {
        case Length::Char: return static_cast<unsigned char>(va_arg(args, unsigned));
        case Length::Short: return static_cast<unsigned short>(va_arg(args, unsigned));
        case Length::Long: return va_arg(args, unsigned long);
        case Length::LongLong: return va_arg(args, unsigned long long);
        case Length::IntMax: return va_arg(args, std::uintmax_t);
        case Length::Size: return va_arg(args, std::size_t);
        case Length::PtrDiff: return static_cast<std::make_unsigned_t<std::ptrdiff_t>>(va_arg(args, std::ptrdiff_t));
        default: return va_arg(args, unsigned);
    }
}

// Appends the directive's decimal number to the rebuilt directive.
void AppendNumber(std::string& directive, long value)
{
    char digits[24];
    std::snprintf(digits, sizeof digits, "%ld", value);
    directive += digits;
}

}  // namespace

int ZonPrintV(std::string& out, const char* format, std::va_list arguments)
{
    // A local copy, so that the helpers can take it by reference on every ABI.
    std::va_list args;
    va_copy(args, arguments);
    const std::size_t initial = out.size();
    std::string directive;
    const char* p = format;
    while (*p) {
        if (*p != '%') {
            const char* next = std::strchr(p, '%');
            const std::size_t n = next ? static_cast<std::size_t>(next - p) : std::strlen(p);
            out.append(p, n);
            p += n;
            continue;
        }
        const char* start = p++;
        if (*p == '%') {
            out += '%';
            ++p;
            continue;
        }
        // Rebuild the directive for one snprintf call, with '*' resolved and
        // the grouping flags dropped.
        // The same directive is decoded for the module's number printer.
        directive.assign("%");
        ZonNumberConversion conv;
        bool convValid = true;
        while (*p && std::strchr("-+ #0'I", *p)) {
            if (*p != '\'' && *p != 'I') directive += *p;
            conv.left |= *p == '-';
            conv.plus |= *p == '+';
            conv.space |= *p == ' ';
            conv.alt |= *p == '#';
            conv.zero |= *p == '0';
            ++p;
        }
        const auto readNumber = [&](int& value) {
            value = 0;
            for (; *p >= '0' && *p <= '9'; ++p) {
                directive += *p;
                if (value > 100'000'000) convValid = false;
                else value = value * 10 + (*p - '0');
            }
        };
        if (*p == '*') {
            const int width = va_arg(args, int);
            AppendNumber(directive, width);
            // A negative width left-aligns, as in printf.
            if (width < 0) conv.left = true;
            if (width == std::numeric_limits<int>::min()) convValid = false;
            else conv.width = width < 0 ? -width : width;
            ++p;
        } else {
            readNumber(conv.width);
        }
        if (*p == '.') {
            directive += *p++;
            if (*p == '*') {
                const int precision = va_arg(args, int);
                // A negative precision counts as none, as in printf.
                if (precision >= 0) AppendNumber(directive, precision);
                else directive.pop_back();
                conv.precision = precision < 0 ? -1 : precision;
                ++p;
            } else {
                readNumber(conv.precision);
            }
        }
        Length length = Length::None;
        const char* lengthStart = p;
        switch (*p) {
            case 'h': length = (p[1] == 'h') ? Length::Char : Length::Short; p += (p[1] == 'h') ? 2 : 1; break;
            case 'l': length = (p[1] == 'l') ? Length::LongLong : Length::Long; p += (p[1] == 'l') ? 2 : 1; break;
            case 'q': length = Length::LongLong; ++p; break;
            case 'j': length = Length::IntMax; ++p; break;
            case 'z': length = Length::Size; ++p; break;
            case 't': length = Length::PtrDiff; ++p; break;
            case 'L': length = Length::LongDouble; ++p; break;
            default: break;
        }
        directive.append(lengthStart, static_cast<std::size_t>(p - lengthStart));
        const char conversion = *p;
        bool done = false;
        conv.letter = conversion;
        const bool fast = convValid && ZonCloudNumberPrinter::Handles(conv);
        if (conversion && fast && (conversion == 'd' || conversion == 'i') && length != Length::LongDouble) {
            AppendNumber(out, conv, SignedArgument(args, length));
            done = true;
            ++p;
        } else if (conversion && fast && conversion == 'u' && length != Length::LongDouble) {
            AppendNumber(out, conv, UnsignedArgument(args, length));
            done = true;
            ++p;
        } else if (conversion && fast && conversion != 'd' && conversion != 'i' && conversion != 'u' &&
                   (length == Length::None || length == Length::Long)) {
            AppendNumber(out, conv, va_arg(args, double));
            done = true;
            ++p;
        } else if (conversion) {
            directive += conversion;
            switch (conversion) {
                case 'd':
                case 'i': done = EmitSigned(out, directive.c_str(), args, length); break;
                case 'u':
                case 'o':
                case 'x':
                case 'X': done = EmitUnsigned(out, directive.c_str(), args, length); break;
                case 'f':
                case 'F':
                case 'e':
                case 'E':
                case 'g':
                case 'G':
                case 'a':
                case 'A':
                    if (length == Length::LongDouble)
                        done = Emit(out, directive.c_str(), va_arg(args, long double), true);
                    else if (length == Length::None || length == Length::Long)
                        done = Emit(out, directive.c_str(), va_arg(args, double), true);
                    break;
                case 'c':
                    if (length == Length::None) done = Emit(out, directive.c_str(), va_arg(args, int), false);
                    break;
                case 's':
                    if (length == Length::None) {
                        const char* text = va_arg(args, const char*);
                        done = Emit(out, directive.c_str(), text ? text : "(null)", false);
                    }
                    break;
                case 'p': done = Emit(out, directive.c_str(), va_arg(args, void*), false); break;
                case 'n':
                    StoreCount(args, length, out.size() - initial);
                    done = true;
                    break;
                default: break;
            }
            ++p;
        }
        if (!done) out.append(start, static_cast<std::size_t>(p - start));
    }
    va_end(args);
    return static_cast<int>(out.size() - initial);
}

int ZonPrint(std::string& out, const char* format, ...)
{
    std::va_list args;
    va_start(args, format);
    const int n = ZonPrintV(out, format, args);
    va_end(args);
    return n;
}

int ZonPrintFileV(std::FILE* file, const char* format, std::va_list args)
{
    // One buffer per thread: writers print millions of short lines.
    thread_local std::string text;
    text.clear();
    ZonPrintV(text, format, args);
    if (!file || std::fwrite(text.data(), 1, text.size(), file) != text.size()) return -1;
    return static_cast<int>(text.size());
}

int ZonPrintFile(std::FILE* file, const char* format, ...)
{
    std::va_list args;
    va_start(args, format);
    const int n = ZonPrintFileV(file, format, args);
    va_end(args);
    return n;
}

std::string ZonFormat(const char* format, ...)
{
    std::string text;
    std::va_list args;
    va_start(args, format);
    ZonPrintV(text, format, args);
    va_end(args);
    return text;
}
