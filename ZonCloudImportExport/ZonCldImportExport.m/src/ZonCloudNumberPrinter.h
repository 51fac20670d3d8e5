#pragma once
#include <cstddef>

#include "ZonCldExport.h"

// One printf conversion of a number, decoded: flags, field width, precision
// and the conversion letter (d i u f F e E g G).
struct ZonNumberConversion {
    char letter = 'f';
    bool left = false;   // '-'
    bool plus = false;   // '+'
    bool space = false;  // ' '
    bool zero = false;   // '0'
    bool alt = false;    // '#'
    int width = 0;
    int precision = -1;  // none given
};

// The printer every writer's numbers go through: the bytes of snprintf under
// the "C" locale for the same conversion, several times faster, and never
// touching the locale. Digits come from std::to_chars (exact, ties to even,
// as the C library rounds); the common "%.Nf" of a double is printed from its
// binary value with integer arithmetic, which is exact too.
class ZON_CLD_API ZonCloudNumberPrinter {
public:
    // Whether Print takes this conversion; the rest (%#g, huge precisions or
    // widths) is left to the C library.
    static bool Handles(const ZonNumberConversion& conv);
    // The most characters Print can write for conv, whatever the value.
    static std::size_t Bound(const ZonNumberConversion& conv);

    // Write at out, which has room for Bound(conv) characters, and return the
    // end. A floating conversion takes a double, d and i a signed and u an
    // unsigned integer.
    static char* Print(char* out, const ZonNumberConversion& conv, double value);
    static char* Print(char* out, const ZonNumberConversion& conv, long long value);
    static char* Print(char* out, const ZonNumberConversion& conv, unsigned long long value);

    // "%.<precision>f" with no flags or width: the writers' usual number.
    // Room for 330 + precision characters.
    static char* Fixed(char* out, double value, int precision);
};
