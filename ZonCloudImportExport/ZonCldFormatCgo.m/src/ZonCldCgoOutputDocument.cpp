#include "ZonCldCgoOutputDocument.h"

#include "ZonCloudPrintFormat.h"
#include "ZonObjectRegistry.h"

namespace {
const ZonRegistration Registration("CLD_Cgo_OutputDocument", ZonIExchOutputDocument::InterfaceName,
                                   [] { return std::make_shared<ZonCldCgoOutputDocument>(); });
}

void ZonCldCgoOutputDocument::BeginFile()
{
    // The count goes here on closing, when it is known.
    ZonPrintFile(_stream, "            \n");
    _count = 0;
}

void ZonCldCgoOutputDocument::WritePoint(double x, double y, double z, const unsigned char*)
{
    ZonPrintFile(_stream, "%f %f %f\n", x, y, z);
    ++_count;
}

void ZonCldCgoOutputDocument::EndFile()
{
    ZonPrintFile(_stream, "**end cloud**\n");
    if (std::fseek(_stream, 0, SEEK_SET) == 0) ZonPrintFile(_stream, "%-12d", static_cast<int>(_count));
    _count = 0;
}
