#pragma once
#include <cstddef>
#include <string>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudNumberPrinter.h"

// A printf format decoded once, for lines printed millions of times: text,
// "%%", and number conversions (d i u f F e E g G with their flags, a written
// width and precision, and an l or ll length). It prints exactly what
// ZonPrint prints for the same arguments. A format with anything else ('*',
// %s, %c, ...) is not valid here, and its users keep ZonPrint.
class ZON_CLD_API ZonCloudLineFormat {
public:
    ZonCloudLineFormat() = default;
    explicit ZonCloudLineFormat(const std::string& format);

    bool IsValid() const { return _valid; }
    // The number of values Print takes.
    std::size_t Arguments() const { return _numbers; }
    // The most characters one line can have.
    std::size_t Bound() const { return _bound; }

    // Writes the line at out (room for Bound() characters) and returns its end.
    // values holds one number per conversion; an integer conversion prints
    // the value's whole part (colours and counts are exact in a double).
    char* Print(char* out, const double* values) const;

    // Changes every "\n" of the literal text into "\r\n", for formats whose
    // lines end with CR LF (numbers never hold a line end).
    void UseCrLf();

private:
    enum class Kind { None, Fixed, Floating, Signed, Unsigned };
    struct Piece {
        std::string text;  // literal text before the conversion
        ZonNumberConversion conv;
        Kind kind = Kind::None;  // None: the text that ends the line
    };

    std::vector<Piece> _pieces;
    std::size_t _numbers = 0;
    std::size_t _bound = 0;
    bool _valid = false;
};
