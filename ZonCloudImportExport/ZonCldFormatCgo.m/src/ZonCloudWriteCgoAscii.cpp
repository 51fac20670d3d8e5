#include "ZonCloudWriteCgoAscii.h"

#include "ZonCloudLineFormat.h"
#include "ZonCloudReadNLSTool.h"

namespace {
const ZonCloudLineFormat PointLine("%f %f %f\n");
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

std::uint64_t ZonCloudWriteCgoAscii::TakeLines(std::uint64_t lines)
{
    if (!_file.IsOpen() || _expected < lines) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    _expected -= lines;
    return 0;
}

void ZonCloudWriteCgoAscii::FormatLine(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char*,
                                       std::uint64_t) const
{
    out.Commit(PointLine.Print(out.Reserve(PointLine.Bound()), xyz));
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
