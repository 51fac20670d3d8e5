#pragma once
#include <cstdint>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudReadPointLines.h"

// Reads Cgo ASCII point files: one point per line as three reals (anything
// after them is ignored); the count line, "**end cloud**" and the decimal
// swap are those of every point line file. The file is loaded in the
// precision asked for; the other precision is read again from the first
// point line when it is asked for.
class ZON_CLD_API ZonCloudReadCgoAscii : public ZonCloudReadPointLines {
public:
    explicit ZonCloudReadCgoAscii(const ZonUnicodeString& fileName);

    // ZonICloudReadFile
    const float* GetPoints(unsigned& count) override;
    const double* GetPointsDouble(unsigned& count) override;

protected:
    bool ScanLine(const char* first, const char* last, char decimalPoint, double xyz[3],
                  unsigned char rgb[3]) override;
    void Discard() override;

private:
    // Reads the points again in the precision that was not loaded.
    template <class T>
    void ReadAgain(std::vector<T>& points);

    std::uint64_t _otherCount = 0;  // points of the array read again
    bool _otherRead = false;
};
