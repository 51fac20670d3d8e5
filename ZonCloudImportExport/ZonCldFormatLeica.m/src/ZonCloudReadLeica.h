#pragma once
#include "ZonCldExport.h"
#include "ZonCloudReadPointLines.h"
#include "ZonICloudReadOptColor.h"

// Reads RGB point files: one point per line as x y z, optionally followed by
// a colour R G B (0 to 255), or by an intensity and then the colour; the
// count line, "**end cloud**" and the decimal swap are those of every point
// line file. Colours come through GetPointColors when they are kept (the
// default); a query in the precision that was not loaded loads the file again.
class ZON_CLD_API ZonCloudReadLeica : public ZonCloudReadPointLines, public ZonICloudReadOptColor {
public:
    explicit ZonCloudReadLeica(const ZonUnicodeString& fileName);

    // ZonICloudReadOptColor
    void SetKeepColors(bool keep) override;
    bool GetKeepColors() override { return _keepColors; }

    // ZonICloudReadFile
    const float* GetPoints(unsigned& count) override;
    const double* GetPointsDouble(unsigned& count) override;
    const unsigned char* GetPointColors(unsigned& count) override;

protected:
    bool ScanLine(const char* first, const char* last, char decimalPoint, double xyz[3],
                  unsigned char rgb[3]) override;
};
