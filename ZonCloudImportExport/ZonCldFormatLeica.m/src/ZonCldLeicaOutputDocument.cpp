#include "ZonCldLeicaOutputDocument.h"

#include "ZonObjectRegistry.h"

namespace {
const ZonRegistration Registration("CLD_AsciiRGB_OutputDocument", ZonIExchOutputDocument::InterfaceName,
                                   [] { return std::make_shared<ZonCldLeicaOutputDocument>(); });
}

void ZonCldLeicaOutputDocument::WritePoint(double x, double y, double z, const unsigned char* rgb)
{
    if (rgb)
        _output.Print("%f %f %f %d %d %d \n", x, y, z, rgb[0], rgb[1], rgb[2]);
    else
        _output.Print("%f %f %f\n", x, y, z);
}
