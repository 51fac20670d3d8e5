#include "ZonCloudWriteCgoAscii.h"

#include "ZonCloudReadNLSTool.h"

namespace {
// The count line of a multi-part file before its total is known.
constexpr const char* Placeholder = "            \n";
}

ZonCloudWriteCgoAscii::ZonCloudWriteCgoAscii(const ZonUnicodeString& fileName) : ZonCloudWritePointLines(fileName) {}

ZonHResult ZonCloudWriteCgoAscii::BeginMultiWrite()
{
    if (!TryOpenStream("w")) return ZON_E_FAIL;
    Print("%s", Placeholder);
    _multiWrite = true;
    _total = 0;
    _expected = 0;
    return ZON_S_OK;
}

ZonHResult ZonCloudWriteCgoAscii::EndMultiWrite()
{
    const std::uint64_t total = _total;
    _multiWrite = false;
    _total = 0;
    if (_file.IsOpen()) {
        Print("**end cloud**\n");
        _file.Seek(0, SEEK_SET);
        Print("%-12d", static_cast<int>(total));
    }
    CloseStream();
    return ZON_S_OK;
}

void ZonCloudWriteCgoAscii::BeginWritePoints(const unsigned& count)
{
    if (_multiWrite) {
        _total += count;
        _expected += count;
        return;
    }
    OpenStream("w");
    Print("%ld\n", static_cast<long>(count));
    _expected = count;
}

void ZonCloudWriteCgoAscii::WritePointLine(double x, double y, double z, const unsigned char*)
{
    if (!_file.IsOpen() || _expected == 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    Print("%f %f %f\n", x, y, z);
    --_expected;
}

void ZonCloudWriteCgoAscii::EndWritePoints()
{
    const bool complete = _expected == 0;
    _expected = 0;
    if (!_multiWrite && _file.IsOpen()) {
        Print("**end cloud**\n");
        CloseStream();
    }
    if (!complete) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
}
