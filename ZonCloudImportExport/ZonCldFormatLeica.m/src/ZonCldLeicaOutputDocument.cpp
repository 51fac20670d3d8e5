#include "ZonCldLeicaOutputDocument.h"

#include "ZonCloudLineFormat.h"
#include "ZonObjectRegistry.h"

namespace {
const ZonCloudLineFormat PlainLine("%f %f %f\n");
const ZonCloudLineFormat ColorLine("%f %f %f %d %d %d \n");
const ZonRegistration Registration("CLD_AsciiRGB_OutputDocument", ZonIExchOutputDocument::InterfaceName,
                                   [] { return std::make_shared<ZonCldLeicaOutputDocument>(); });
}

void ZonCldLeicaOutputDocument::FormatPoint(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb) const
{
    if (!rgb) {
        out.Commit(PlainLine.Print(out.Reserve(PlainLine.Bound()), xyz));
        return;
    }
    const double values[6] = {xyz[0], xyz[1], xyz[2], static_cast<double>(rgb[0]), static_cast<double>(rgb[1]),
                              static_cast<double>(rgb[2])};
    out.Commit(ColorLine.Print(out.Reserve(ColorLine.Bound()), values));
}
