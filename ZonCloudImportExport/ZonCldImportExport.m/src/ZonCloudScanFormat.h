#pragma once
#include <cassert>
#include <cstdarg>
#include <cstddef>
#include <cstdint>
#include <string_view>
#include <type_traits>
#include <vector>

// Locale-free replacement for sscanf.
//
// Readers parse millions of text lines while other imports may run on other
// threads with another decimal point, so nothing here reads or changes the
// process locale: the decimal point is a parameter of every call. Apart from
// that, results, return values and stopping points are those of glibc's
// sscanf under the "C" locale, including its handling of truncated numbers
// ("1e+" reads 1 and consumes three characters, "0x" alone is a matching
// failure, "infinit" is a matching failure, "%5c" on a 3-character input
// stores 3 characters and counts as converted).
//
// Supported directives: white space, literal characters, %%, and
//   %d %i %u %o %x %X                 with hh h l ll L q j z t
//   %f %F %e %E %g %G %a %A           float*, or double* with l j z t
//   %s %c %[...]                      char*
//   %n                                int* (or the integer size given)
// each with optional '*' (suppress) and a field width. The ' and I flags are
// accepted and ignored (the "C" locale has no grouping and no other digits).
// Not supported: long double (%Lf, %llf), wide characters (%lc %ls %l[),
// %p, allocation (%m), positional arguments (%1$d). An unsupported or
// malformed directive ends the scan there, like glibc's matching failure on
// an unknown conversion; IsValid() tells whether the whole format compiled.

// Parses a floating-point number with strtod's syntax: leading white space,
// optional sign, decimal digits with `decimalPoint` and an optional exponent,
// hexadecimal "0x" numbers with a binary exponent, "inf", "infinity", "nan"
// and "nan(chars)" (case-insensitive; the NaN payload is not kept).
// The result is correctly rounded; out-of-range values give +-inf or +-0 as
// strtod does. Never reads at or beyond `last`; a NUL is an ordinary
// non-numeric character. Returns the end of the number, or nullptr (value
// untouched) when there is none.
const char* ZonParseDouble(const char* first, const char* last, char decimalPoint, double& value) noexcept;
const char* ZonParseFloat(const char* first, const char* last, char decimalPoint, float& value) noexcept;

class ZonCloudScanFormat {
public:
    // What a destination pointer must point to, in format order.
    enum class ArgKind : std::uint8_t { Int8, Int16, Int32, Int64, Float, Double, Chars };

    // Compiles the format once; the object is then immutable and Scan may be
    // called concurrently from any number of threads.
    explicit ZonCloudScanFormat(std::string_view format);

    // Like sscanf(input, format, args...) under a locale whose decimal point
    // is `decimalPoint`. `args` are the destinations in order, as sscanf would
    // take them (double* for %lf, float* for %f, int* for %d and %n, char* for
    // %s %c %[). Returns the number of converted values, or -1 when the input
    // ends before the first conversion. Never allocates.
    int Scan(const char* input, char decimalPoint, void* const* args) const;
    // Same on [first, last); a NUL before `last` still ends the input.
    int Scan(const char* first, const char* last, char decimalPoint, void* const* args) const;
    // vsscanf counterpart; pointers are taken with the types listed above.
    int ScanV(const char* input, char decimalPoint, std::va_list args) const;

    template <class... T>
    int operator()(const char* input, char decimalPoint, T*... args) const
    {
        assert(AcceptsArgs<T...>() && "destination types do not match the format");
        void* const pointers[sizeof...(T) + 1] = {static_cast<void*>(args)..., nullptr};
        return Scan(input, decimalPoint, pointers);
    }

    bool IsValid() const noexcept { return _valid; }
    const std::vector<ArgKind>& ArgKinds() const noexcept { return _argKinds; }

    // True when the destination types match the format exactly in number and,
    // for integers, in size.
    template <class... T>
    bool AcceptsArgs() const noexcept
    {
        if (_argKinds.size() != sizeof...(T))
            return false;
        std::size_t i = 0;
        return (Accepts<std::remove_cv_t<T>>(_argKinds[i++]) && ...);
    }

private:
    struct Op {
        enum Code : std::uint8_t { Literal, Percent, Integer, Real, String, Chars, Set, Count, Invalid };
        Code code = Invalid;
        ArgKind kind = ArgKind::Int32;  // destination, when not suppressed
        std::uint8_t base = 10;         // Integer: 0 = from prefix (%i), 8, 10, 16
        bool isSigned = false;          // Integer: strtol rather than strtoul rules
        bool suppress = false;
        bool skipSpace = false;         // skip input white space first
        char literal = 0;
        std::uint16_t set = 0;          // Set: index into _sets
        int width = -1;                 // -1: no maximum
    };
    struct CharSet {
        std::uint64_t bits[4];
        bool Has(int c) const { return (bits[c >> 6] >> (c & 63)) & 1u; }
    };

    template <class T>
    static constexpr bool Accepts(ArgKind kind)
    {
        switch (kind) {
        case ArgKind::Chars:
            return std::is_same_v<T, char> || std::is_same_v<T, signed char> || std::is_same_v<T, unsigned char>;
        case ArgKind::Float:
            return std::is_same_v<T, float>;
        case ArgKind::Double:
            return std::is_same_v<T, double>;
        case ArgKind::Int8:
            return std::is_integral_v<T> && !std::is_same_v<T, bool> && sizeof(T) == 1;
        case ArgKind::Int16:
            return std::is_integral_v<T> && sizeof(T) == 2;
        case ArgKind::Int32:
            return std::is_integral_v<T> && sizeof(T) == 4;
        case ArgKind::Int64:
            return std::is_integral_v<T> && sizeof(T) == 8;
        }
        return false;
    }

    void Compile(std::string_view format);

    template <class Source>
    int Run(const char* first, const char* last, char decimalPoint, Source& args) const;

    std::vector<Op> _ops;
    std::vector<CharSet> _sets;
    std::vector<ArgKind> _argKinds;
    bool _valid = true;
};

// One-shot sscanf replacement. Compiles the format on every call (which
// allocates); keep a ZonCloudScanFormat for formats used on many lines.
int ZonScan(const char* input, char decimalPoint, const char* format, ...);
