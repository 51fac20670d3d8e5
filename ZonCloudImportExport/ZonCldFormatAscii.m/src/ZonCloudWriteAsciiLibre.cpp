#include "ZonCloudWriteAsciiLibre.h"

#include <type_traits>

#include "ZonCloudLineFormat.h"
#include "ZonCloudReadNLSTool.h"

namespace {
// The total of a multi-part file is filled into this many blank columns.
constexpr int TotalWidth = 12;
const ZonCloudLineFormat PointLine("X %f Y %f Z %f\n");
}  // namespace

ZonCloudWriteAsciiLibre::ZonCloudWriteAsciiLibre(const ZonUnicodeString& fileName) : ZonCloudWritePointLines(fileName) {}

void ZonCloudWriteAsciiLibre::WriteHeaderStart()
{
    Print("!\n");
    Print("! ASCII %s\n", ZonCloudReadNLSTool::GeneratedBy().c_str());
    Print("!\n");
}

// The "=" signs of the cloud and scan headers are aligned differently: each
// header pads "Point Format" to the width of its own total line.
void ZonCloudWriteAsciiLibre::BeginWritePoints(const unsigned& count)
{
    if (_kind > KindPoints) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    _kind = KindPoints;
    if (_multiWrite) {
        _total += count;
        _expected = count;
        return;
    }
    OpenStream("w");
    WriteHeaderStart();
    Print("! Without Scans\n");
    Print("! Point Format           = 'X %%f Y %%f Z %%f'\n");
    Print("!\n");
    Print("! Total number of points = %ld\n", static_cast<long>(count));
    Print("!\n");
    _expected = count;
}

std::uint64_t ZonCloudWriteAsciiLibre::TakeLines(std::uint64_t lines)
{
    if (_expected < lines || _kind != KindPoints || !_file.IsOpen())
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    _expected -= static_cast<std::uint32_t>(lines);
    return 0;
}

void ZonCloudWriteAsciiLibre::FormatLine(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char*,
                                         std::uint64_t) const
{
    out.Commit(PointLine.Print(out.Reserve(PointLine.Bound()), xyz));
}

void ZonCloudWriteAsciiLibre::End(Kind kind)
{
    const bool complete = _expected == 0 && _kind == kind;
    _kind = KindNone;
    _expected = 0;
    if (!_multiWrite) CloseStream();
    if (!complete) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
}

void ZonCloudWriteAsciiLibre::EndWritePoints() { End(KindPoints); }

void ZonCloudWriteAsciiLibre::BeginWriteScans(const unsigned& count)
{
    if (_kind != KindNone && _kind != KindScans) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    _kind = KindScans;
    if (!_multiWrite) {
        OpenStream("w");
        WriteHeaderStart();
        Print("! Begin Scan Delimitor  = G08\n");
        Print("! End Scan Delimitor    = G09\n");
        Print("! Point Format          = 'X %%f Y %%f Z %%f'\n");
        Print("!\n");
        Print("! Total number of scans = %ld\n", static_cast<long>(count));
        Print("!\n");
    }
    _scanCounter = 0;
    _expected = count;
}

void ZonCloudWriteAsciiLibre::CheckScanExpected()
{
    if (_expected == 0 || _kind != KindScans || !_file.IsOpen())
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
}

template <class T>
void ZonCloudWriteAsciiLibre::ScanBlock(const T* points, unsigned count)
{
    CheckScanExpected();
    if (count > 0 && !points) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    ++_scanCounter;
    Print("G08(%d)\n", static_cast<int>(_scanCounter));
    Run run;
    if constexpr (std::is_same_v<T, float>) run.single = points;
    else run.dual = points;
    run.count = count;
    WriteLines(run, 0);
    Print("G09\n");
    if (_multiWrite) _total += count;
    --_expected;
}

void ZonCloudWriteAsciiLibre::WriteScan(const float* points, const unsigned& count) { ScanBlock(points, count); }

void ZonCloudWriteAsciiLibre::WriteScanDouble(const double* points, const unsigned& count)
{
    ScanBlock(points, count);
}

void ZonCloudWriteAsciiLibre::EndWriteScans() { End(KindScans); }

ZonHResult ZonCloudWriteAsciiLibre::BeginMultiWrite()
{
    if (!TryOpenStream("w")) return ZON_E_FAIL;
    WriteHeaderStart();
    Print("! Without Scans\n");
    Print("! Point Format           = 'X %%f Y %%f Z %%f'\n");
    Print("!\n");
    Print("! Total number of points = ");
    _totalOffset = _file.Tell();
    Print("%*s\n", TotalWidth, "");
    Print("!\n");
    _total = 0;
    _multiWrite = true;
    return ZON_S_OK;
}

ZonHResult ZonCloudWriteAsciiLibre::EndMultiWrite()
{
    const std::uint32_t total = _total;
    _total = 0;
    _multiWrite = false;
    if (_file.IsOpen()) {
        _file.Seek(_totalOffset, SEEK_SET);
        Print("%-12d", static_cast<int>(total));
    }
    CloseStream();
    return ZON_S_OK;
}
