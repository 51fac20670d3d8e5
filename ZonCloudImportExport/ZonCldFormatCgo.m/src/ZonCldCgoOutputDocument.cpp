#include "ZonCldCgoOutputDocument.h"

#include "ZonObjectRegistry.h"

namespace {
const ZonRegistration Registration("CLD_Cgo_OutputDocument", ZonIExchOutputDocument::InterfaceName,
                                   [] { return std::make_shared<ZonCldCgoOutputDocument>(); });
}

void ZonCldCgoOutputDocument::BeginFile()
{
    // The count goes here on closing, when it is known.
    _output.Print("            \n");
    _count = 0;
}

void ZonCldCgoOutputDocument::WritePoint(double x, double y, double z, const unsigned char*)
{
    _output.Print("%f %f %f\n", x, y, z);
    ++_count;
}

void ZonCldCgoOutputDocument::EndFile()
{
    const std::uint64_t count = _count;
    _count = 0;
    _output.Print("**end cloud**\n");
    _output.Seek(0, SEEK_SET);
    _output.Print("%-12d", static_cast<int>(count));
}
