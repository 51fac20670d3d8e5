#pragma once
#include "ZonCldExport.h"
#include "ZonCldPointOutputDocument.h"

// Writes the points of an exchange document as an RGB point file
// (registered as "CLD_AsciiRGB_OutputDocument"): "x y z" for points without
// colour, "x y z R G B " with the point's own colour or its representation's one.
class ZON_CLD_API ZonCldLeicaOutputDocument : public ZonCldPointOutputDocument {
protected:
    void FormatPoint(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb) const override;
};
