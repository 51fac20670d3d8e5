#pragma once
#include <cstdint>

#include "ZonCldExport.h"
#include "ZonCldPointOutputDocument.h"

// Writes the points of an exchange document as a Cgo file (registered as
// "CLD_Cgo_OutputDocument"): a placeholder line of twelve blanks, one "x y z"
// line per point, then "**end cloud**"; closing puts the number of points,
// left-aligned, over the placeholder, so the line keeps its length.
class ZON_CLD_API ZonCldCgoOutputDocument : public ZonCldPointOutputDocument {
protected:
    void BeginFile() override;
    void FormatPoint(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb) const override;
    void EndFile() override;
};
