#pragma once
#include <cstdint>

#include "ZonCloudWritePointLines.h"

// Writes RGB point files: the number of points on the first line, then one
// "x y z R G B" line per point, which the RGB point reader reads back with
// its colours. Points given without a colour are written white. In
// multi-part mode the clouds follow each other without count lines.
class ZON_CLD_API ZonCloudWriteLeica : public ZonCloudWritePointLines {
public:
    explicit ZonCloudWriteLeica(const ZonUnicodeString& fileName);

    // ZonICloudWritePointFile
    void BeginWritePoints(const unsigned& count) override;
    void EndWritePoints() override;

protected:
    std::uint64_t TakeLines(std::uint64_t lines) override;
    void FormatLine(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb,
                    std::uint64_t number) const override;

private:
    std::uint64_t _expected = 0;  // points still to come
};
