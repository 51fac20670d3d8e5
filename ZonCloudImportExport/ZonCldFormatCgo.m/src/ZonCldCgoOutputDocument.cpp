#include "ZonCldCgoOutputDocument.h"

#include "ZonCloudLineFormat.h"
#include "ZonObjectRegistry.h"

namespace {
const ZonCloudLineFormat PointLine("%f %f %f\n");
const ZonRegistration Registration("CLD_Cgo_OutputDocument", ZonIExchOutputDocument::InterfaceName,
                                   [] { return std::make_shared<ZonCldCgoOutputDocument>(); });
}

void ZonCldCgoOutputDocument::BeginFile()
{
    // The count goes here on closing, when it is known.
    _output.Print("            \n");
}

void ZonCldCgoOutputDocument::FormatPoint(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char*) const
{
    out.Commit(PointLine.Print(out.Reserve(PointLine.Bound()), xyz));
}

void ZonCldCgoOutputDocument::EndFile()
{
    _output.Print("**end cloud**\n");
    _output.Seek(0, SEEK_SET);
    _output.Print("%-12d", static_cast<int>(PointsInFile()));
}
