#pragma once
#include <cstdarg>
#include <cstdio>
#include <string>

#include "ZonCldExport.h"

// Locale-free replacement for the printf family, for writers.
//
// Files we write must read back on any machine, so every floating-point
// conversion (%f %F %e %E %g %G %a %A) uses '.' as its decimal point whatever
// the process locale says, and the grouping flag (') is ignored. Everything
// else is exactly what the C library's printf gives: flags, field widths and
// precisions (also as '*'), length modifiers (hh h l ll q j z t L), %d %i %u
// %o %x %X %c %s %p %n and %%. A malformed or unsupported directive is copied
// to the output as it stands, and no argument is taken for it.

// Appends to `out`; returns the number of characters appended.
ZON_CLD_API int ZonPrintV(std::string& out, const char* format, std::va_list args);
ZON_CLD_API int ZonPrint(std::string& out, const char* format, ...) __attribute__((format(printf, 2, 3)));
// fprintf counterpart: returns the number of characters written, or -1 when
// the stream refused them (errno tells why). A refusal is how a full disk
// shows, so the result must be looked at; writers go through
// ZonCloudOutputFile, which does.
[[nodiscard]] ZON_CLD_API int ZonPrintFile(std::FILE* file, const char* format, ...)
    __attribute__((format(printf, 2, 3)));
[[nodiscard]] ZON_CLD_API int ZonPrintFileV(std::FILE* file, const char* format, std::va_list args);
// The formatted text as a string.
ZON_CLD_API std::string ZonFormat(const char* format, ...) __attribute__((format(printf, 1, 2)));
