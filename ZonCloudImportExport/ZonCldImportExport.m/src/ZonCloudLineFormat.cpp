#include "ZonCloudLineFormat.h"

#include <cstring>

namespace {

// A written number of a width or precision; false when it is absurdly long.
bool ReadNumber(const char*& p, int& value)
{
    value = 0;
    while (*p >= '0' && *p <= '9') {
        if (value > 100'000'000) return false;
        value = value * 10 + (*p++ - '0');
    }
    return true;
}

}  // namespace

ZonCloudLineFormat::ZonCloudLineFormat(const std::string& format)
{
    const char* p = format.c_str();
    Piece piece;
    for (;;) {
        const char* percent = std::strchr(p, '%');
        if (!percent) {
            piece.text += p;
            break;
        }
        piece.text.append(p, static_cast<std::size_t>(percent - p));
        p = percent + 1;
        if (*p == '%') {
            piece.text += '%';
            ++p;
            continue;
        }
        ZonNumberConversion& conv = piece.conv;
        conv = ZonNumberConversion();
        // The grouping flags mean nothing under "C": ZonPrint drops them too.
        for (; *p && std::strchr("-+ #0'I", *p); ++p) {
            if (*p == '-') conv.left = true;
            else if (*p == '+') conv.plus = true;
            else if (*p == ' ') conv.space = true;
            else if (*p == '#') conv.alt = true;
            else if (*p == '0') conv.zero = true;
        }
        if (!ReadNumber(p, conv.width)) return;
        if (*p == '.') {
            ++p;
            if (!ReadNumber(p, conv.precision)) return;
        }
        if (*p == 'l') p += p[1] == 'l' ? 2 : 1;
        conv.letter = *p++;
        if (!ZonCloudNumberPrinter::Handles(conv)) return;
        switch (conv.letter) {
            case 'd':
            case 'i': piece.kind = Kind::Signed; break;
            case 'u': piece.kind = Kind::Unsigned; break;
            default:
                const bool plain = !conv.left && !conv.plus && !conv.space && !conv.zero && !conv.alt && conv.width == 0;
                piece.kind = plain && conv.letter == 'f' ? Kind::Fixed : Kind::Floating;
                if (piece.kind == Kind::Fixed && conv.precision < 0) conv.precision = 6;
                break;
        }
        _bound += piece.text.size() + ZonCloudNumberPrinter::Bound(conv);
        ++_numbers;
        _pieces.push_back(std::move(piece));
        piece = Piece();
    }
    _bound += piece.text.size();
    _pieces.push_back(std::move(piece));
    _valid = true;
}

char* ZonCloudLineFormat::Print(char* out, const double* values) const
{
    for (const Piece& piece : _pieces) {
        std::memcpy(out, piece.text.data(), piece.text.size());
        out += piece.text.size();
        switch (piece.kind) {
            case Kind::None: break;
            case Kind::Fixed: out = ZonCloudNumberPrinter::Fixed(out, *values++, piece.conv.precision); break;
            case Kind::Floating: out = ZonCloudNumberPrinter::Print(out, piece.conv, *values++); break;
            case Kind::Signed:
                out = ZonCloudNumberPrinter::Print(out, piece.conv, static_cast<long long>(*values++));
                break;
            case Kind::Unsigned:
                out = ZonCloudNumberPrinter::Print(out, piece.conv, static_cast<unsigned long long>(*values++));
                break;
        }
    }
    return out;
}

void ZonCloudLineFormat::UseCrLf()
{
    _bound = 0;
    for (Piece& piece : _pieces) {
        std::string text;
        for (const char c : piece.text) {
            if (c == '\n') text += '\r';
            text += c;
        }
        piece.text = std::move(text);
        _bound += piece.text.size() + (piece.kind == Kind::None ? 0 : ZonCloudNumberPrinter::Bound(piece.conv));
    }
}
