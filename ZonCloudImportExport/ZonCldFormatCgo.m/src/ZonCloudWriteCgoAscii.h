#pragma once
#include <cstdint>

#include "ZonCloudWritePointLines.h"

// Writes Cgo ASCII point files: the number of points on the first line, one
// "x y z" line per point, and "**end cloud**" at the end. In multi-part mode
// the first line is a placeholder of twelve blanks that the total of all the
// clouds overwrites when the file is completed.
class ZON_CLD_API ZonCloudWriteCgoAscii : public ZonCloudWritePointLines {
public:
    explicit ZonCloudWriteCgoAscii(const ZonUnicodeString& fileName);

    // ZonICloudWriteFile
    ZonHResult BeginMultiWrite() override;
    ZonHResult EndMultiWrite() override;

    // ZonICloudWritePointFile; the format has no colours.
    void BeginWritePoints(const unsigned& count) override;
    void EndWritePoints() override;

protected:
    // The format has no colours: the point alone is written.
    std::uint64_t TakeLines(std::uint64_t lines) override;
    void FormatLine(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb,
                    std::uint64_t number) const override;

private:
    std::uint64_t _expected = 0;  // points still to come
    std::uint64_t _total = 0;     // points announced in multi-part mode
};
