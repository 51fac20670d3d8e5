#pragma once
#include <cstdint>

#include "ZonCloudWritePointLines.h"
#include "ZonICloudWriteScanFile.h"

// Writes clouds and scans as free ASCII text: "X %f Y %f Z %f" lines under a
// "!" comment header, scans between "G08(n)" and "G09" lines, so that the
// free ASCII reader reads the file back (as scans with the delimiters G08 and
// G09, as a cloud without them). In multi-part mode several clouds and scans
// go into one file whose header total is filled in at the end.
class ZON_CLD_API ZonCloudWriteAsciiLibre : public ZonCloudWritePointLines, public ZonICloudWriteScanFile {
public:
    explicit ZonCloudWriteAsciiLibre(const ZonUnicodeString& fileName);

    // ZonICloudWriteFile
    ZonHResult BeginMultiWrite() override;
    ZonHResult EndMultiWrite() override;

    // ZonICloudWritePointFile
    void BeginWritePoints(const unsigned& count) override;
    void EndWritePoints() override;

    // ZonICloudWriteScanFile
    void BeginWriteScans(const unsigned& count) override;
    void WriteScan(const float* points, const unsigned& count) override;
    void WriteScanDouble(const double* points, const unsigned& count) override;
    void EndWriteScans() override;

protected:
    std::uint64_t TakeLines(std::uint64_t lines) override;
    // The format has no colours: the point alone is written.
    void FormatLine(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb,
                    std::uint64_t number) const override;

private:
    enum Kind : std::int32_t { KindNone = 0, KindPoints = 1, KindScans = 2 };

    void WriteHeaderStart();
    void CheckScanExpected();
    template <class T>
    void ScanBlock(const T* points, unsigned count);
    void End(Kind kind);

    std::int32_t _kind = KindNone;
    std::uint32_t _total = 0;       // points written in multi-part mode
    long _totalOffset = 0;          // where the multi-part total goes
    std::uint32_t _expected = 0;    // points or scans still to come
    std::uint32_t _scanCounter = 0; // number of the last scan written in this block
};
