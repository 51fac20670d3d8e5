#pragma once
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

class ZonCloudScanFormat;

// The layout of the point lines of a free ASCII file: three numbers, each
// after its own label, optionally followed by text. It is found by looking
// at one line (AnalyseLine), turned into a scan format (Build), and then
// decides for every other line whether it is a point (Parse).
class ZonCloudAsciiLineFormat {
public:
    // Label buffers hold 80 characters with their terminator.
    static constexpr int MaxLabelLength = 79;

    struct Labels {
        char text[3][MaxLabelLength + 1] = {};
        bool trailingText = false;
    };

    ZonCloudAsciiLineFormat();
    ~ZonCloudAsciiLineFormat();
    ZonCloudAsciiLineFormat(const ZonCloudAsciiLineFormat&) = delete;
    ZonCloudAsciiLineFormat& operator=(const ZonCloudAsciiLineFormat&) = delete;

    // Classifies the line [first, last) as if one blank stood before it (so a
    // line starting with a digit has a blank first label); a NUL ends it.
    // 1: a point line, labels filled. -1: more than four numbers; -2: more
    // than four separator runs; -3: no second number or nothing between the
    // first two; -4, -5, -6: the first, second or third label cannot be cut
    // out (or is longer than a label buffer).
    static int AnalyseLine(const char* first, const char* last, char decimalPoint, Labels& labels);

    // label 1, "%lf", label 2, "%lf", label 3, "%lf", and "%s" with trailing text.
    void Build(const Labels& labels);
    void Reset();
    // 0 before Build, 1 once built from labels.
    int Kind() const { return _kind; }
    // The scan format, as the scan engine receives it.
    const std::string& Text() const { return _text; }

    // True when the line converts every value of the format (3, or 4 with
    // trailing text); the point is then in xyz.
    bool Parse(const char* first, const char* last, char decimalPoint, double xyz[3]) const;
    // The scan engine's own answer (what Parse must agree with): the number of
    // converted values, or -1 when the input ends before the first.
    int ScanWithEngine(const char* first, const char* last, char decimalPoint, double xyz[3]) const;

private:
    enum class Outcome { Parsed, Failed, Undecided };
    struct Step {
        enum Kind : std::uint8_t { Space, Literal, Number, Rest } kind;
        char literal;
    };

    // Decides the plain cases (decimal numbers, literal labels) without the
    // engine, with exactly its answers; anything unusual stays undecided.
    Outcome FastParse(const char* first, const char* last, char decimalPoint, double xyz[3]) const;

    int _kind = 0;
    int _expected = 3;
    bool _fastPath = false;
    std::string _text;
    std::vector<Step> _steps;
    std::unique_ptr<ZonCloudScanFormat> _engine;
};
