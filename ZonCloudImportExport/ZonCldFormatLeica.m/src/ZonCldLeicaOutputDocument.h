#pragma once
#include "ZonCldExport.h"
#include "ZonCldPointOutputDocument.h"

// Writes the points of an exchange document as an RGB point file
// (registered as "CLD_AsciiRGB_OutputDocument"): "x y z" for points without
// colour, "x y z R G B " with the point's own colour or its representation's one.
class ZON_CLD_API ZonCldLeicaOutputDocument : public ZonCldPointOutputDocument {
protected:
    void WritePoint(double x, double y, double z, const unsigned char* rgb) override;
};
