#include "ZonCloudAsciiLineFormat.h"

#include <cstring>

#include "ZonCloudScanFormat.h"

namespace {

// Character classes of the "C" locale, as the scan engine uses them.
inline bool IsSpace(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }
inline bool IsDigit(char c) { return static_cast<unsigned char>(c - '0') < 10u; }

const char* EndOfText(const char* first, const char* last)
{
    const void* nul = std::memchr(first, '\0', static_cast<std::size_t>(last - first));
    return nul ? static_cast<const char*>(nul) : last;
}

// Powers of ten that a double holds exactly.
constexpr double kExactPowers[] = {1e0,  1e1,  1e2,  1e3,  1e4,  1e5,  1e6,  1e7,  1e8,  1e9,  1e10, 1e11,
                                   1e12, 1e13, 1e14, 1e15, 1e16, 1e17, 1e18, 1e19, 1e20, 1e21, 1e22};

enum class NumberOutcome { Parsed, Failed, Undecided };

// Reads a plain decimal number ([sign] digits [point digits] [exponent]) at p.
// Where glibc's scanf would read further than the number itself (a truncated
// exponent, a hexadecimal prefix) or read something else (inf, nan), the
// answer is left to the engine.
NumberOutcome ScanNumber(const char*& p, const char* end, char decimalPoint, double& value)
{
    const char* s = p;
    bool negative = false;
    if (s != end && (*s == '+' || *s == '-')) negative = *s++ == '-';

    // Mantissa digits without leading zeros; beyond 19 of them the value is
    // left to the full conversion (the sum may then overflow, unused).
    std::uint64_t mantissa = 0;
    const char* integerStart = s;
    while (s != end && *s == '0') ++s;
    const char* significantStart = s;
    while (s != end && IsDigit(*s)) mantissa = mantissa * 10 + static_cast<unsigned>(*s++ - '0');
    std::ptrdiff_t significant = s - significantStart;
    bool anyDigit = s != integerStart;
    if (s != end && (*s == 'x' || *s == 'X')) return NumberOutcome::Undecided;
    long exponent = 0;
    if (s != end && *s == decimalPoint) {
        const char* fractionStart = ++s;
        if (significant == 0)
            while (s != end && *s == '0') ++s;
        const char* fractionSignificant = s;
        while (s != end && IsDigit(*s)) mantissa = mantissa * 10 + static_cast<unsigned>(*s++ - '0');
        significant += s - fractionSignificant;
        exponent = -static_cast<long>(s - fractionStart);
        anyDigit = anyDigit || s != fractionStart;
    }
    if (!anyDigit) {
        // Nothing numeric: "inf", "nan", a lone sign or point are the engine's.
        const char c = p == end ? '\0' : *p;
        const bool maybeNumber = c == '+' || c == '-' || c == decimalPoint || c == 'i' || c == 'I' || c == 'n' ||
                                 c == 'N';
        return maybeNumber ? NumberOutcome::Undecided : NumberOutcome::Failed;
    }
    if (s != end && (*s == 'e' || *s == 'E')) {
        ++s;
        bool negativeExponent = false;
        if (s != end && (*s == '+' || *s == '-')) negativeExponent = *s++ == '-';
        if (s == end || !IsDigit(*s)) return NumberOutcome::Undecided;
        long written = 0;
        for (; s != end && IsDigit(*s); ++s)
            if (written < 100000) written = written * 10 + (*s - '0');
        exponent += negativeExponent ? -written : written;
    }

    if (significant <= 19 && mantissa <= (std::uint64_t{1} << 53) && exponent >= -22 && exponent <= 22) {
        // Both operands are exact doubles: one IEEE operation rounds correctly.
        double v = static_cast<double>(mantissa);
        if (mantissa != 0) v = exponent < 0 ? v / kExactPowers[-exponent] : v * kExactPowers[exponent];
        value = negative ? -v : v;
    } else {
        double v = 0.0;
        if (ZonParseDouble(p, s, decimalPoint, v) != s) return NumberOutcome::Undecided;
        value = v;
    }
    p = s;
    return NumberOutcome::Parsed;
}

}  // namespace

ZonCloudAsciiLineFormat::ZonCloudAsciiLineFormat() = default;
ZonCloudAsciiLineFormat::~ZonCloudAsciiLineFormat() = default;

int ZonCloudAsciiLineFormat::AnalyseLine(const char* first, const char* last, char decimalPoint, Labels& labels)
{
    // Positions count the leading blank as 0, so line[i] is at position i + 1.
    const char* end = EndOfText(first, last);
    const long length = static_cast<long>(end - first) + 1;
    long numberStart[4] = {0, 0, 0, 0};
    long separatorStart[4] = {0, 0, 0, 0};
    int numbers = 0;
    int separators = 0;
    bool inNumber = false;
    bool inSeparator = false;
    for (long position = 0; position < length && numbers + separators < 9; ++position) {
        const char c = position == 0 ? ' ' : first[position - 1];
        // CR and LF are ignored; 'D' neither starts nor ends a number.
        if (c == '\r' || c == '\n' || c == 'D') continue;
        const bool numeric = IsDigit(c) || c == '+' || c == '-' || c == 'E' || c == 'e' || c == decimalPoint;
        if (numeric) {
            if (inNumber) continue;
            if (numbers == 4) return -1;
            numberStart[numbers++] = position;
            inNumber = true;
            inSeparator = false;
        } else {
            if (inSeparator) continue;
            if (separators == 4) return -2;
            separatorStart[separators++] = position;
            inSeparator = true;
            inNumber = false;
        }
    }
    if (numbers < 2 || separators < 2) return -3;

    for (int k = 0; k < 3; ++k) {
        const long labelLength = numberStart[k] - separatorStart[k];
        if (labelLength < 0 || labelLength > MaxLabelLength) return -4 - k;
        char* text = labels.text[k];
        for (long i = 0; i < labelLength; ++i) {
            const long position = separatorStart[k] + i;
            text[i] = position == 0 ? ' ' : first[position - 1];
        }
        text[labelLength] = '\0';
    }

    labels.trailingText = false;
    if (separators == 4) {
        const long runEnd = numbers == 4 ? numberStart[3] : length;
        for (long position = separatorStart[3]; position < runEnd; ++position) {
            const char c = first[position - 1];
            if (c != ' ' && c != '\r' && c != '\n') {
                labels.trailingText = true;
                break;
            }
        }
    }
    return 1;
}

void ZonCloudAsciiLineFormat::Reset()
{
    _kind = 0;
    _expected = 3;
    _fastPath = false;
    _text.clear();
    _steps.clear();
    _engine.reset();
}

void ZonCloudAsciiLineFormat::Build(const Labels& labels)
{
    Reset();
    _fastPath = true;
    for (const char* label : labels.text) {
        for (const char* c = label; *c; ++c) {
            // A label is literal text: a '%' in it must not become a directive.
            if (*c == '%') {
                _text += "%%";
                _fastPath = false;
                continue;
            }
            _text += *c;
            if (IsSpace(*c)) {
                if (_steps.empty() || _steps.back().kind != Step::Space) _steps.push_back({Step::Space, ' '});
            } else {
                _steps.push_back({Step::Literal, *c});
            }
        }
        _text += "%lf";
        _steps.push_back({Step::Number, 0});
    }
    if (labels.trailingText) {
        _text += "%s";
        _steps.push_back({Step::Rest, 0});
        _expected = 4;
    }
    _engine = std::make_unique<ZonCloudScanFormat>(_text);
    _kind = 1;
}

ZonCloudAsciiLineFormat::Outcome ZonCloudAsciiLineFormat::FastParse(const char* first, const char* last,
                                                                  char decimalPoint, double xyz[3]) const
{
    // Parse has cut the line at its first NUL, where the engine stops too.
    const char* p = first;
    auto atEnd = [&p, last] { return p == last; };
    auto skipSpace = [&p, last] {
        while (p != last && IsSpace(*p)) ++p;
    };
    int number = 0;
    for (const Step& step : _steps) {
        switch (step.kind) {
        case Step::Space:
            skipSpace();
            break;
        case Step::Literal:
            if (atEnd() || *p != step.literal) return Outcome::Failed;
            ++p;
            break;
        case Step::Number: {
            skipSpace();
            if (atEnd()) return Outcome::Failed;
            switch (ScanNumber(p, last, decimalPoint, xyz[number])) {
            case NumberOutcome::Parsed: break;
            case NumberOutcome::Failed: return Outcome::Failed;
            case NumberOutcome::Undecided: return Outcome::Undecided;
            }
            ++number;
            break;
        }
        case Step::Rest:
            skipSpace();
            return atEnd() ? Outcome::Failed : Outcome::Parsed;
        }
    }
    return Outcome::Parsed;
}

bool ZonCloudAsciiLineFormat::Parse(const char* first, const char* last, char decimalPoint, double xyz[3]) const
{
    if (_kind == 0) return false;
    if (_fastPath) {
        double values[3];
        const Outcome outcome = FastParse(first, EndOfText(first, last), decimalPoint, values);
        if (outcome == Outcome::Failed) return false;
        if (outcome == Outcome::Parsed) {
            xyz[0] = values[0];
            xyz[1] = values[1];
            xyz[2] = values[2];
            return true;
        }
    }
    double values[3];
    if (ScanWithEngine(first, last, decimalPoint, values) != _expected) return false;
    xyz[0] = values[0];
    xyz[1] = values[1];
    xyz[2] = values[2];
    return true;
}

int ZonCloudAsciiLineFormat::ScanWithEngine(const char* first, const char* last, char decimalPoint,
                                            double xyz[3]) const
{
    if (!_engine) return -1;
    // A piece holds at most 511 characters, so the trailing word fits the
    // stack buffer; longer input (never met when reading) gets its own.
    char rest[512];
    std::vector<char> longRest;
    char* word = rest;
    if (static_cast<std::size_t>(last - first) >= sizeof rest) {
        longRest.resize(static_cast<std::size_t>(last - first) + 1);
        word = longRest.data();
    }
    void* const args[] = {&xyz[0], &xyz[1], &xyz[2], word, nullptr};
    return _engine->Scan(first, last, decimalPoint, args);
}
