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
    void WritePoint(double x, double y, double z, const unsigned char* rgb) override;
    void EndFile() override;

private:
    std::uint64_t _count = 0;  // points of the file being written
};
