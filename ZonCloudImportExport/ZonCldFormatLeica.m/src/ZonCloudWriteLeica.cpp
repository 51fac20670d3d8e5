#include "ZonCloudWriteLeica.h"

#include "ZonCloudReadNLSTool.h"

namespace {
const unsigned char White[3] = {255, 255, 255};
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

void ZonCloudWriteLeica::WritePointLine(double x, double y, double z, const unsigned char* rgb)
{
    if (!rgb) rgb = White;
    if (!_file.IsOpen() || _expected == 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    Print("%f %f %f %d %d %d\n", x, y, z, rgb[0], rgb[1], rgb[2]);
    --_expected;
}

void ZonCloudWriteLeica::EndWritePoints()
{
    const bool complete = _expected == 0;
    _expected = 0;
    if (!_multiWrite) CloseStream();
    if (!complete) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
}
