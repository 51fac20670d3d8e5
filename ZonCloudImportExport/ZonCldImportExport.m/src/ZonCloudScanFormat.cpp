#include "ZonCloudScanFormat.h"

#include <algorithm>
#include <charconv>
#include <climits>
#include <cstring>
#include <limits>
#include <system_error>

namespace {

constexpr int kEof = -1;

// Character classes of the "C" locale; <cctype> would consult the process locale.
inline bool IsSpace(int c) { return c == ' ' || (c >= '\t' && c <= '\r'); }
inline bool IsDigit(int c) { return static_cast<unsigned>(c - '0') < 10u; }
inline int ToLower(int c) { return (c >= 'A' && c <= 'Z') ? c + ('a' - 'A') : c; }
inline int HexValue(int c)
{
    if (IsDigit(c))
        return c - '0';
    c = ToLower(c);
    return (c >= 'a' && c <= 'f') ? c - 'a' + 10 : -1;
}
inline int Uchar(char c) { return static_cast<unsigned char>(c); }

bool MatchNoCase(const char* p, const char* last, const char* lowerWord)
{
    for (; *lowerWord; ++p, ++lowerWord)
        if (p == last || ToLower(Uchar(*p)) != *lowerWord)
            return false;
    return true;
}

// Number parsing. from_chars does the correctly rounded conversion; what it
// lacks (a decimal point other than '.', the "0x" prefix, saturation on
// overflow and underflow) is handled here.

// Rewrites the mantissa and exponent into "DIGITSeEXP" (or "HEXDIGITSpEXP")
// in a bounded stack buffer, without the decimal point and leading zeros.
// Beyond the kept digits only "is anything non-zero" matters for rounding:
// a halfway point between two doubles has at most 767 significant decimal
// digits, so 800 digits plus a sticky non-zero digit round like the full
// string. Same argument with 32 hexadecimal digits (128 bits).
template <class F>
const char* ParseCompacted(const char* p, const char* last, char decimalPoint, bool hex, F& value) noexcept
{
    constexpr int kKeepDecimal = 800;
    constexpr int kKeepHex = 32;
    const int keep = hex ? kKeepHex : kKeepDecimal;
    char buffer[kKeepDecimal + 32];
    int count = 0;
    bool sticky = false;
    long long dropped = 0;
    long long fractionDigits = 0;

    auto isDigit = [hex](int c) { return hex ? HexValue(c) >= 0 : IsDigit(c); };
    auto take = [&](char c) {
        if (count == 0 && c == '0')
            return;
        if (count < keep) {
            buffer[count++] = c;
        } else {
            ++dropped;
            sticky = sticky || c != '0';
        }
    };

    const char* s = p;
    while (s != last && isDigit(Uchar(*s)))
        take(*s++);
    const bool integerDigits = s != p;
    if (s != last && *s == decimalPoint) {
        const char* f = s + 1;
        while (f != last && isDigit(Uchar(*f))) {
            take(*f++);
            ++fractionDigits;
        }
        if (integerDigits || fractionDigits > 0)
            s = f;
    }
    if (!integerDigits && fractionDigits == 0)
        return nullptr;

    long long exponent = 0;
    if (s != last && ToLower(Uchar(*s)) == (hex ? 'p' : 'e')) {
        const char* e = s + 1;
        bool negative = false;
        if (e != last && (*e == '+' || *e == '-')) {
            negative = *e == '-';
            ++e;
        }
        if (e != last && IsDigit(Uchar(*e))) {
            while (e != last && IsDigit(Uchar(*e))) {
                if (exponent < 1000000000)
                    exponent = exponent * 10 + (*e - '0');
                ++e;
            }
            if (negative)
                exponent = -exponent;
            s = e;
        }
    }

    const int digitWeight = hex ? 4 : 1;
    long long scale = exponent + (dropped - fractionDigits) * digitWeight;
    if (sticky) {
        buffer[count++] = '1';
        scale -= digitWeight;
    }
    if (count == 0) {
        buffer[count++] = '0';
        scale = 0;
    }
    // Past these bounds every mantissa of the buffer's size overflows or
    // vanishes, so clamping keeps the result and from_chars' exponent small.
    const long long bound = hex ? 20000 : 5000;
    scale = scale < -bound ? -bound : (scale > bound ? bound : scale);
    const int digits = count;
    buffer[count++] = hex ? 'p' : 'e';
    const auto written = std::to_chars(buffer + count, buffer + sizeof buffer, scale);
    const auto result = std::from_chars(buffer, written.ptr, value, hex ? std::chars_format::hex : std::chars_format::general);
    if (result.ec == std::errc::result_out_of_range)
        value = digits * digitWeight + scale > 0 ? std::numeric_limits<F>::infinity() : F(0);
    else if (result.ec != std::errc())
        return nullptr;
    return s;
}

template <class F>
const char* ParseReal(const char* first, const char* last, char decimalPoint, F& value) noexcept
{
    const char* p = first;
    while (p != last && IsSpace(Uchar(*p)))
        ++p;
    bool negative = false;
    if (p != last && (*p == '+' || *p == '-')) {
        negative = *p == '-';
        ++p;
    }
    if (p == last)
        return nullptr;

    F v;
    const char* end = nullptr;
    const int c = ToLower(Uchar(*p));
    if (c == 'i') {
        if (!MatchNoCase(p, last, "inf"))
            return nullptr;
        end = MatchNoCase(p + 3, last, "inity") ? p + 8 : p + 3;
        v = std::numeric_limits<F>::infinity();
    } else if (c == 'n') {
        if (!MatchNoCase(p, last, "nan"))
            return nullptr;
        end = p + 3;
        if (end != last && *end == '(') {
            const char* q = end + 1;
            while (q != last && (IsDigit(Uchar(*q)) || (ToLower(Uchar(*q)) >= 'a' && ToLower(Uchar(*q)) <= 'z') || *q == '_'))
                ++q;
            if (q != last && *q == ')')
                end = q + 1;
        }
        v = std::numeric_limits<F>::quiet_NaN();
    } else if (*p == '0' && last - p > 1 && ToLower(Uchar(p[1])) == 'x') {
        end = ParseCompacted(p + 2, last, decimalPoint, true, v);
        if (end == nullptr) {  // "0x" without hexadecimal digits is the number 0
            v = 0;
            end = p + 1;
        }
    } else if (decimalPoint == '.') {
        if (!IsDigit(Uchar(*p)) && *p != '.')
            return nullptr;
        const auto result = std::from_chars(p, last, v, std::chars_format::general);
        if (result.ec == std::errc())
            end = result.ptr;
        else if (result.ec == std::errc::result_out_of_range)
            end = ParseCompacted(p, last, '.', false, v);
        else
            return nullptr;
    } else {
        if (!IsDigit(Uchar(*p)) && *p != decimalPoint)
            return nullptr;
        // Short numbers: a copy with '.' as the decimal point, in which the
        // input's own '.' (an ordinary character here) stops from_chars.
        constexpr std::ptrdiff_t kWindow = 64;
        char window[kWindow];
        const std::ptrdiff_t n = std::min(last - p, kWindow);
        for (std::ptrdiff_t k = 0; k < n; ++k)
            window[k] = p[k] == decimalPoint ? '.' : p[k] == '.' ? '\0' : p[k];
        const auto result = std::from_chars(window, window + n, v, std::chars_format::general);
        // A cut window may have hidden the rest of the number ("1e" of "1e+5").
        if (result.ec == std::errc() && (n == last - p || window + n - result.ptr >= 3))
            end = p + (result.ptr - window);
        else
            end = ParseCompacted(p, last, decimalPoint, false, v);
        if (end == nullptr)
            return nullptr;
    }
    value = negative ? -v : v;
    return end;
}

// Input cursor with stdio's getc/ungetc vocabulary, which keeps the scanning
// code below step-for-step comparable with the reference behaviour.
struct Cursor {
    const char* p;
    const char* end;  // nullptr: the input ends at its NUL only

    int Get()
    {
        if (p == end || *p == '\0')
            return kEof;
        return Uchar(*p++);
    }
    void Unget(int c)
    {
        if (c != kEof)
            --p;
    }
    void SkipSpace()
    {
        while (p != end && IsSpace(Uchar(*p)))
            ++p;
    }
};

enum Outcome { kConverted, kMatchingFailure, kInputFailure };

// Collects the characters glibc's scanf takes for a floating-point field
// (they end up in [start, in.p)); the value is then whatever strtod makes of
// them. That is why "1e+" is consumed whole but reads as 1.
Outcome GatherReal(Cursor& in, int width, char decimalPoint)
{
    const int point = Uchar(decimalPoint);

    // Fast path for plain decimal numbers without a width, the bulk of any
    // file; collects exactly what the general loop below would.
    if (width < 0 && point != 0) {
        const char* q = in.p;
        auto at = [&in](const char* x) { return x != in.end ? Uchar(*x) : 0; };
        int c = at(q);
        if (c == '+' || c == '-')
            c = at(++q);
        if ((IsDigit(c) && !(c == '0' && ToLower(at(q + 1)) == 'x')) || c == point) {
            bool gotDigit = false;
            for (; IsDigit(c); c = at(++q))
                gotDigit = true;
            if (c == point)
                for (c = at(++q); IsDigit(c); c = at(++q))
                    gotDigit = true;
            if (gotDigit && ToLower(c) == 'e') {
                c = at(++q);
                if (c == '+' || c == '-')
                    c = at(++q);
                while (IsDigit(c))
                    c = at(++q);
            }
            in.p = q;
            return kConverted;
        }
    }

    int c = in.Get();
    if (width > 0)
        --width;
    if (c == kEof)
        return kInputFailure;

    int size = 0;  // characters collected
    int last = 0;  // last collected character, exponent marker in lower case
    bool gotSign = false;
    if (c == '-' || c == '+') {
        gotSign = true;
        ++size;
        last = c;
        if (width == 0 || (c = in.Get()) == kEof)
            return kMatchingFailure;
        if (width > 0)
            --width;
    }

    auto expect = [&](char lower) {
        if (width == 0 || (c = in.Get()) == kEof || ToLower(c) != lower)
            return false;
        if (width > 0)
            --width;
        return true;
    };
    if (ToLower(c) == 'n') {
        return expect('a') && expect('n') ? kConverted : kMatchingFailure;
    }
    if (ToLower(c) == 'i') {
        if (!expect('n') || !expect('f'))
            return kMatchingFailure;
        if (width != 0 && (c = in.Get()) != kEof) {
            if (ToLower(c) != 'i') {
                in.Unget(c);
                return kConverted;
            }
            if (width > 0)
                --width;
            // Having started "infinity", glibc insists on finishing it.
            if (!expect('n') || !expect('i') || !expect('t') || !expect('y'))
                return kMatchingFailure;
        }
        return kConverted;
    }

    int expChar = 'e';
    bool hexa = false, gotDigit = false, gotDot = false, gotE = false;
    if (width != 0 && c == '0') {
        ++size;
        last = c;
        c = in.Get();
        if (width > 0)
            --width;
        if (width != 0 && ToLower(c) == 'x') {
            ++size;
            last = c;
            hexa = true;
            expChar = 'p';
            c = in.Get();
            if (width > 0)
                --width;
        } else {
            gotDigit = true;
        }
    }

    for (;;) {
        if (IsDigit(c) || (!gotE && hexa && HexValue(c) >= 0)) {
            last = c;
            gotDigit = true;
        } else if (gotE && last == expChar && (c == '-' || c == '+')) {
            last = c;
        } else if (gotDigit && !gotE && ToLower(c) == expChar) {
            last = expChar;
            gotE = gotDot = true;
        } else if (!gotDot && c == point) {
            last = c;
            gotDot = true;
        } else {
            in.Unget(c);
            break;
        }
        ++size;
        if (width == 0 || (c = in.Get()) == kEof)
            break;
        if (width > 0)
            --width;
    }

    // Nothing but a sign, or nothing but "0x": glibc rejects these before strtod sees them.
    if (size == int(gotSign) || (hexa && size == 2 + int(gotSign)))
        return kMatchingFailure;
    return kConverted;
}

struct IntegerField {
    std::uint64_t magnitude = 0;
    bool negative = false;
    bool overflow = false;
};

// Collects an integer field as glibc's scanf does: sign, then "0x" or "0"
// prefix rules of the base, then digits; at most `width` characters.
Outcome GatherInteger(Cursor& in, int width, int base, IntegerField& field)
{
    int c = in.Get();
    if (c == kEof)
        return kInputFailure;

    int size = 0;
    bool gotSign = false;
    if (c == '-' || c == '+') {
        gotSign = true;
        field.negative = c == '-';
        ++size;
        if (width > 0)
            --width;
        c = in.Get();
    }
    if (width != 0 && c == '0') {
        if (width > 0)
            --width;
        ++size;
        c = in.Get();
        if (width != 0 && ToLower(c) == 'x') {
            if (base == 0)
                base = 16;
            if (base == 16) {  // the 'x' is consumed but is no digit
                if (width > 0)
                    --width;
                c = in.Get();
            }
        } else if (base == 0) {
            base = 8;
        }
    }
    if (base == 0)
        base = 10;

    const std::uint64_t limit = std::numeric_limits<std::uint64_t>::max() / unsigned(base);
    while (c != kEof && width != 0) {
        const int digit = HexValue(c);
        if (digit < 0 || digit >= base)
            break;
        if (field.magnitude > limit || field.magnitude * unsigned(base) > std::numeric_limits<std::uint64_t>::max() - unsigned(digit))
            field.overflow = true;
        else
            field.magnitude = field.magnitude * unsigned(base) + unsigned(digit);
        ++size;
        if (width > 0)
            --width;
        c = in.Get();
    }
    in.Unget(c);
    if (size == 0 || (size == 1 && gotSign))
        return kMatchingFailure;
    return kConverted;
}

// strtol / strtoul on a 64-bit long: saturation, then unsigned negation.
std::uint64_t IntegerValue(const IntegerField& f, bool isSigned)
{
    constexpr std::uint64_t kMaxSigned = std::uint64_t(std::numeric_limits<std::int64_t>::max());
    if (isSigned) {
        if (f.negative)
            return (f.overflow || f.magnitude > kMaxSigned + 1) ? kMaxSigned + 1 : std::uint64_t(0) - f.magnitude;
        return (f.overflow || f.magnitude > kMaxSigned) ? kMaxSigned : f.magnitude;
    }
    if (f.overflow)
        return std::numeric_limits<std::uint64_t>::max();
    return f.negative ? std::uint64_t(0) - f.magnitude : f.magnitude;
}

void StoreInteger(void* destination, ZonCloudScanFormat::ArgKind kind, std::uint64_t v)
{
    switch (kind) {
    case ZonCloudScanFormat::ArgKind::Int8: {
        const auto n = static_cast<std::uint8_t>(v);
        std::memcpy(destination, &n, sizeof n);
        break;
    }
    case ZonCloudScanFormat::ArgKind::Int16: {
        const auto n = static_cast<std::uint16_t>(v);
        std::memcpy(destination, &n, sizeof n);
        break;
    }
    case ZonCloudScanFormat::ArgKind::Int64:
        std::memcpy(destination, &v, sizeof v);
        break;
    default: {
        const auto n = static_cast<std::uint32_t>(v);
        std::memcpy(destination, &n, sizeof n);
        break;
    }
    }
}

struct ArraySource {
    void* const* next;
    void* Next(ZonCloudScanFormat::ArgKind) { return *next++; }
};

struct VaSource {
    std::va_list* args;
    void* Next(ZonCloudScanFormat::ArgKind kind)
    {
        switch (kind) {
        case ZonCloudScanFormat::ArgKind::Int16:
            return va_arg(*args, short*);
        case ZonCloudScanFormat::ArgKind::Int32:
            return va_arg(*args, int*);
        case ZonCloudScanFormat::ArgKind::Int64:
            return va_arg(*args, long long*);
        case ZonCloudScanFormat::ArgKind::Float:
            return va_arg(*args, float*);
        case ZonCloudScanFormat::ArgKind::Double:
            return va_arg(*args, double*);
        default:  // character pointers
            return va_arg(*args, void*);
        }
    }
};

// glibc's read_int: an overflowing width reads as "no width".
int ReadWidth(std::string_view f, std::size_t& i)
{
    int value = 0;
    for (; i < f.size() && IsDigit(Uchar(f[i])); ++i) {
        const int digit = f[i] - '0';
        if (value >= 0)
            value = (value > (INT_MAX - digit) / 10) ? -1 : value * 10 + digit;
    }
    return value;
}

}  // namespace

const char* ZonParseDouble(const char* first, const char* last, char decimalPoint, double& value) noexcept
{
    return ParseReal(first, last, decimalPoint, value);
}

const char* ZonParseFloat(const char* first, const char* last, char decimalPoint, float& value) noexcept
{
    return ParseReal(first, last, decimalPoint, value);
}

ZonCloudScanFormat::ZonCloudScanFormat(std::string_view format)
{
    Compile(format.substr(0, format.find('\0')));
}

void ZonCloudScanFormat::Compile(std::string_view f)
{
    auto at = [&f](std::size_t k) { return k < f.size() ? Uchar(f[k]) : 0; };
    auto fail = [this] {
        Op op;
        op.code = Op::Invalid;
        _ops.push_back(op);
        _valid = false;
    };

    bool pendingSpace = false;
    std::size_t i = 0;
    while (i < f.size()) {
        const int fc = at(i++);
        if (fc != '%') {
            // A white-space run in the format matches any white space, none included.
            if (IsSpace(fc)) {
                pendingSpace = true;
                continue;
            }
            Op op;
            op.code = Op::Literal;
            op.literal = static_cast<char>(fc);
            op.skipSpace = pendingSpace;
            pendingSpace = false;
            _ops.push_back(op);
            continue;
        }

        Op op;
        if (IsDigit(at(i))) {
            op.width = ReadWidth(f, i);
            if (at(i) == '$')
                return fail();
        } else {
            for (;; ++i) {
                if (at(i) == '*')
                    op.suppress = true;
                else if (at(i) != '\'' && at(i) != 'I')
                    break;
            }
            if (IsDigit(at(i)))
                op.width = ReadWidth(f, i);
        }
        if (op.width == 0)
            op.width = -1;

        enum class Size { Default, Char, Short, Long, LongLong, Max, SizeT, PtrDiff };
        Size size = Size::Default;
        switch (at(i)) {
        case 'h':
            size = at(++i) == 'h' ? (++i, Size::Char) : Size::Short;
            break;
        case 'l':
            size = at(++i) == 'l' ? (++i, Size::LongLong) : Size::Long;
            break;
        case 'q':
        case 'L':
            ++i;
            size = Size::LongLong;
            break;
        case 'j':
            ++i;
            size = Size::Max;
            break;
        case 'z':
            ++i;
            size = Size::SizeT;
            break;
        case 't':
            ++i;
            size = Size::PtrDiff;
            break;
        default:
            break;
        }
        if (i >= f.size())
            return fail();

        auto integerKind = [](std::size_t bytes) {
            return bytes == 1 ? ArgKind::Int8 : bytes == 2 ? ArgKind::Int16 : bytes == 4 ? ArgKind::Int32 : ArgKind::Int64;
        };
        std::size_t bytes = sizeof(int);
        switch (size) {
        case Size::Default: bytes = sizeof(int); break;
        case Size::Char: bytes = sizeof(char); break;
        case Size::Short: bytes = sizeof(short); break;
        case Size::Long: bytes = sizeof(long); break;
        case Size::LongLong: bytes = sizeof(long long); break;
        case Size::Max: bytes = sizeof(std::intmax_t); break;
        case Size::SizeT: bytes = sizeof(std::size_t); break;
        case Size::PtrDiff: bytes = sizeof(std::ptrdiff_t); break;
        }
        const bool wide = size == Size::Long || size == Size::LongLong || size == Size::Max || size == Size::SizeT || size == Size::PtrDiff;

        const int conv = at(i++);
        // %c, %[ and %n take the input as it is unless the format had white space before them.
        op.skipSpace = pendingSpace || (conv != '[' && conv != 'c' && conv != 'n');
        pendingSpace = false;
        bool takesArg = !op.suppress;
        switch (conv) {
        case '%':
            op.code = Op::Percent;
            takesArg = false;
            break;
        case 'd':
        case 'i':
        case 'u':
        case 'o':
        case 'x':
        case 'X':
            op.code = Op::Integer;
            op.kind = integerKind(bytes);
            op.isSigned = conv == 'd' || conv == 'i';
            op.base = conv == 'i' ? 0 : conv == 'o' ? 8 : (conv == 'x' || conv == 'X') ? 16 : 10;
            break;
        case 'n':
            op.code = Op::Count;
            op.kind = integerKind(bytes);
            break;
        case 'e':
        case 'E':
        case 'f':
        case 'F':
        case 'g':
        case 'G':
        case 'a':
        case 'A':
            if (size == Size::LongLong)  // long double
                return fail();
            op.code = Op::Real;
            op.kind = wide ? ArgKind::Double : ArgKind::Float;
            break;
        case 's':
        case 'c':
        case '[':
            if (wide)  // wide characters
                return fail();
            op.kind = ArgKind::Chars;
            op.code = conv == 's' ? Op::String : conv == 'c' ? Op::Chars : Op::Set;
            if (conv == '[') {
                // Same reading as glibc: a leading ']' or '-' is a member,
                // "a-z" is a range only when ordered, an unordered one is literal.
                bool notIn = false;
                if (at(i) == '^') {
                    ++i;
                    notIn = true;
                }
                bool member[256] = {};
                if (at(i) == ']' || at(i) == '-')
                    member[at(i++)] = true;
                int c;
                while ((c = at(i++)) != 0 && c != ']') {
                    if (c == '-' && at(i) != 0 && at(i) != ']' && at(i - 2) <= at(i)) {
                        for (int r = at(i - 2); r < at(i); ++r)
                            member[r] = true;
                    } else {
                        member[c] = true;
                    }
                }
                if (c == 0 || _sets.size() > 0xffff)
                    return fail();
                CharSet set{};
                for (int r = 0; r < 256; ++r)
                    if (member[r] != notIn)
                        set.bits[r >> 6] |= std::uint64_t(1) << (r & 63);
                op.set = static_cast<std::uint16_t>(_sets.size());
                _sets.push_back(set);
            }
            break;
        default:
            return fail();
        }
        if (takesArg)
            _argKinds.push_back(op.kind);
        _ops.push_back(op);
    }
    // Trailing white space would only consume input nobody looks at afterwards.
}

template <class Source>
int ZonCloudScanFormat::Run(const char* first, const char* last, char decimalPoint, Source& args) const
{
    Cursor in{first, last};
    int done = 0;
    // An input failure before anything was stored is reported as EOF.
    auto inputFailure = [&done] { return done == 0 ? -1 : done; };

    for (const Op& op : _ops) {
        if (op.skipSpace)
            in.SkipSpace();
        switch (op.code) {
        case Op::Literal:
        case Op::Percent: {
            const int c = in.Get();
            if (c == kEof)
                return inputFailure();
            if (c != (op.code == Op::Percent ? '%' : Uchar(op.literal)))
                return done;
            break;
        }
        case Op::Count:
            if (!op.suppress)
                StoreInteger(args.Next(op.kind), op.kind, std::uint64_t(in.p - first));
            break;
        case Op::Integer: {
            IntegerField field;
            const Outcome outcome = GatherInteger(in, op.width, op.base, field);
            if (outcome == kInputFailure)
                return inputFailure();
            if (outcome == kMatchingFailure)
                return done;
            if (!op.suppress) {
                StoreInteger(args.Next(op.kind), op.kind, IntegerValue(field, op.isSigned));
                ++done;
            }
            break;
        }
        case Op::Real: {
            const char* start = in.p;
            const Outcome outcome = GatherReal(in, op.width, decimalPoint);
            if (outcome == kInputFailure)
                return inputFailure();
            if (outcome == kMatchingFailure)
                return done;
            if (op.kind == ArgKind::Double) {
                double v;
                if (ParseReal(start, in.p, decimalPoint, v) == nullptr)
                    return done;
                if (!op.suppress)
                    std::memcpy(args.Next(op.kind), &v, sizeof v);
            } else {
                float v;
                if (ParseReal(start, in.p, decimalPoint, v) == nullptr)
                    return done;
                if (!op.suppress)
                    std::memcpy(args.Next(op.kind), &v, sizeof v);
            }
            if (!op.suppress)
                ++done;
            break;
        }
        case Op::String: {
            int c = in.Get();
            if (c == kEof)
                return inputFailure();
            char* out = op.suppress ? nullptr : static_cast<char*>(args.Next(op.kind));
            int width = op.width;
            do {
                if (IsSpace(c)) {
                    in.Unget(c);
                    break;
                }
                if (out)
                    *out++ = static_cast<char>(c);
            } while ((width <= 0 || --width > 0) && (c = in.Get()) != kEof);
            if (out) {
                *out = '\0';
                ++done;
            }
            break;
        }
        case Op::Chars: {
            int c = in.Get();
            if (c == kEof)
                return inputFailure();
            char* out = op.suppress ? nullptr : static_cast<char*>(args.Next(op.kind));
            int width = op.width < 0 ? 1 : op.width;
            // A short input fills what it can and still counts as converted.
            do {
                if (out)
                    *out++ = static_cast<char>(c);
            } while (--width > 0 && (c = in.Get()) != kEof);
            if (out)
                ++done;
            break;
        }
        case Op::Set: {
            const CharSet& set = _sets[op.set];
            const char* start = in.p;
            int c = in.Get();
            if (c == kEof)
                return inputFailure();
            char* out = op.suppress ? nullptr : static_cast<char*>(args.Next(op.kind));
            int width = op.width < 0 ? INT_MAX : op.width;
            do {
                if (!set.Has(c)) {
                    in.Unget(c);
                    break;
                }
                if (out)
                    *out++ = static_cast<char>(c);
            } while (--width > 0 && (c = in.Get()) != kEof);
            if (in.p == start)
                return done;
            if (out) {
                *out = '\0';
                ++done;
            }
            break;
        }
        case Op::Invalid:
            return done;
        }
    }
    return done;
}

int ZonCloudScanFormat::Scan(const char* input, char decimalPoint, void* const* args) const
{
    ArraySource source{args};
    return Run(input, nullptr, decimalPoint, source);
}

int ZonCloudScanFormat::Scan(const char* first, const char* last, char decimalPoint, void* const* args) const
{
    ArraySource source{args};
    return Run(first, last, decimalPoint, source);
}

int ZonCloudScanFormat::ScanV(const char* input, char decimalPoint, std::va_list args) const
{
    std::va_list copy;
    va_copy(copy, args);
    VaSource source{&copy};
    const int result = Run(input, nullptr, decimalPoint, source);
    va_end(copy);
    return result;
}

int ZonScan(const char* input, char decimalPoint, const char* format, ...)
{
    const ZonCloudScanFormat compiled(format);
    std::va_list args;
    va_start(args, format);
    const int result = compiled.ScanV(input, decimalPoint, args);
    va_end(args);
    return result;
}
