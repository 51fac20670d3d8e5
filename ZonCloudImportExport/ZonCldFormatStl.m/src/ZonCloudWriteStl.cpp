#include "ZonCloudWriteStl.h"

#include <cerrno>

#include "ZonCldSTLBinaryFormat.h"
#include "ZonCloudReadNLSTool.h"

ZonCloudWriteStl::ZonCloudWriteStl(const ZonUnicodeString& fileName) : ZonCloudWriteFile(fileName) {}

ZonHResult ZonCloudWriteStl::BeginMultiWrite()
{
    if (!TryOpenStream("w+b")) return ZON_E_FAIL;
    _headerPending = true;
    _multiWrite = true;
    return ZON_S_OK;
}

void ZonCloudWriteStl::BeginWriteTriangles(const unsigned& count)
{
    if (!_file.IsOpen()) {
        // Opened for update: a later announcement reads the count back.
        OpenStream("w+b");
        _headerPending = true;
    }
    ZonCldSTLBinaryFormat::AnnounceTriangles(_file, _headerPending, count, _reverseBytes);
    _expected += count;
}

void ZonCloudWriteStl::WriteTriangle(const float vertices[9])
{
    if (!_file.IsOpen()) {
        errno = EBADF;
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
    }
    if (_expected == 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    float normal[3];
    ZonCldSTLBinaryFormat::Normal(vertices, normal);
    ZonCldSTLBinaryFormat::WriteFacet(_file, normal, vertices, _reverseBytes);
    --_expected;
}

void ZonCloudWriteStl::EndWriteTriangles()
{
    const bool complete = _expected == 0;
    _expected = 0;
    // The file stays open for the next announcement; what is written so far
    // must reach the disk now, as the destructor that closes it
    // cannot report a loss.
    if (_file.IsOpen()) _file.Flush();
    if (!complete) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
}
