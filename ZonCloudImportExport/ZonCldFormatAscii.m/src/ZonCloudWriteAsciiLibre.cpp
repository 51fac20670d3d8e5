#include "ZonCloudWriteAsciiLibre.h"

#include "ZonCloudReadNLSTool.h"

namespace {
// The total of a multi-part file is filled into this many blank columns.
constexpr int TotalWidth = 12;
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

void ZonCloudWriteAsciiLibre::CheckPointExpected()
{
    if (_expected == 0 || _kind != KindPoints || !_file.IsOpen())
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
}

void ZonCloudWriteAsciiLibre::PointLine(double x, double y, double z) { Print("X %f Y %f Z %f\n", x, y, z); }

void ZonCloudWriteAsciiLibre::WritePointLine(double x, double y, double z, const unsigned char*)
{
    CheckPointExpected();
    PointLine(x, y, z);
    --_expected;
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
    for (unsigned i = 0; i < count; ++i) PointLine(points[3 * i], points[3 * i + 1], points[3 * i + 2]);
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
