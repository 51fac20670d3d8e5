#include "ZonCloudWriteLeica.h"

#include "ZonCloudLineFormat.h"
#include "ZonCloudReadNLSTool.h"

namespace {
const unsigned char White[3] = {255, 255, 255};
const ZonCloudLineFormat PointLine("%f %f %f %d %d %d\n");
}

ZonCloudWriteLeica::ZonCloudWriteLeica(const ZonUnicodeString& fileName) : ZonCloudWritePointLines(fileName) {}

void ZonCloudWriteLeica::BeginWritePoints(const unsigned& count)
{
    if (_multiWrite) {
        _expected += count;
        return;
    }
    OpenStream("w");
    Print("%ld\n", static_cast<long>(count));
    _expected = count;
}

std::uint64_t ZonCloudWriteLeica::TakeLines(std::uint64_t lines)
{
    if (!_file.IsOpen() || _expected < lines) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    _expected -= lines;
    return 0;
}

void ZonCloudWriteLeica::FormatLine(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb,
                                    std::uint64_t) const
{
    if (!rgb) rgb = White;
    const double values[6] = {xyz[0], xyz[1], xyz[2], static_cast<double>(rgb[0]), static_cast<double>(rgb[1]),
                              static_cast<double>(rgb[2])};
    out.Commit(PointLine.Print(out.Reserve(PointLine.Bound()), values));
}

void ZonCloudWriteLeica::EndWritePoints()
{
    const bool complete = _expected == 0;
    _expected = 0;
    if (!_multiWrite) CloseStream();
    if (!complete) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
}
