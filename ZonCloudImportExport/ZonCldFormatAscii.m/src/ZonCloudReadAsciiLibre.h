#pragma once
#include <cstdint>
#include <string>
#include <vector>

#include "ZonCloudAsciiLineFormat.h"
#include "ZonCloudLineSource.h"
#include "ZonCloudReadFile.h"
#include "ZonICloudReadOptDelimitor.h"
#include "ZonICloudReadOptDirection.h"
#include "ZonTieCloudReadFile.h"
#include "ZonCloudOwnedArrays.h"

// Free ASCII point files: one point per line, three numbers in a layout of
// labels and separators found from the file itself ("1.5 2.0 3.25",
// "X 1.5 Y 2.0 Z 3.25", "1.5;2.0;3.25"), optionally cut into scans by
// delimiter lines such as "G08(1)" ... "G09". Numbers use the process
// locale's decimal point, or the other one of '.' and ',' when the file only
// reads that way; the locale itself is never touched.
//
// The analysis reads the file once to find the layout and once to count the
// points and their box. The counted points are kept (in the precision asked
// for, while they take no more room than the file) so that delivering the
// cloud does not read the file a third time.
class ZonCloudReadAsciiLibre : public ZonCloudReadFile,
                               public ZonTieCloudReadScanFile<ZonCloudReadAsciiLibre>,
                               public ZonICloudReadOptDelimitor,
                               public ZonICloudReadOptDirection {
public:
    explicit ZonCloudReadAsciiLibre(const ZonUnicodeString& fileName);
    ~ZonCloudReadAsciiLibre() override;

    // ZonICloudReadFile
    void SetSamplingPercent(float percent) override;
    const float* GetPoints(unsigned& count) override;
    const double* GetPointsDouble(unsigned& count) override;
    bool HasDoublePrecision() override { return true; }

    // ZonICloudReadScanFile (one set of scans per file)
    void BeginGetSetOfScans() override;
    bool NextSetOfScans() override;
    void BeginGetScan() override;
    bool NextScan() override;
    const float* GetScanPoints(unsigned& count) override;
    const double* GetScanPointsDouble(unsigned& count) override;
    // The base's scan box queries (the scan interface forwards to them too).
    using ZonCloudReadFile::GetScanPointsInBox;
    using ZonCloudReadFile::GetScanPointsInBoxDouble;

    // ZonICloudReadOptDelimitor: line prefixes that begin and end a scan.
    void SetDelimiters(const ZonUnicodeString& begin, const ZonUnicodeString& end) override;
    void GetDelimiters(ZonUnicodeString& begin, ZonUnicodeString& end) override;

    // ZonICloudReadOptDirection: kept for the caller, not used for reading.
    void SetScanDirection(int direction) override { _scanDirection = direction; }
    void GetScanDirection(int& direction) override { direction = _scanDirection; }

    // Whether the analysis had to read the numbers with the other decimal point.
    bool IsDecimalPointSwitched() const { return _decimalPointSwitched; }
    // The scan format of the point lines (empty before the analysis).
    const std::string& GetLineFormat() const { return _format.Text(); }

protected:
    // What an importer may take over at the end of an import.
    void ListOwnedArrays(ZonCloudOwnedArrays& arrays) override
    {
        arrays.Add(_points);
        arrays.Add(_pointsDouble);
        // Every point kept while counting is the answer itself at 100 %.
        arrays.Add(_keptPoints);
        arrays.Add(_keptPointsDouble);
    }
    void AnalyseFile() override;

private:
    enum class Pass { Done, TooManyUnknown, EndOfFile };

    void ResetAnalysis();
    Pass SearchFormat(char decimalPoint);
    Pass CountPoints(char decimalPoint, double low[3], double high[3]);
    // The same on every core, for large files: `text` is the mapped file.
    Pass CountPointsInChunks(const unsigned char* text, char decimalPoint, double low[3], double high[3]);
    void ReserveKept(std::size_t lineLength);
    void KeepPoints(const float* points, const double* pointsDouble, std::size_t count);
    void KeepRunStart(std::int64_t next);
    void KeepPoint(const double xyz[3]);
    void DropKeptPoints();

    bool StartsWithDelimiter(const char* first, const char* last, const std::string& delimiter) const;
    bool IsDelimiterLine(const char* first, const char* last) const;

    template <class T>
    const T* DeliverPoints(unsigned& count, std::vector<T>& store, const T*& delivered, unsigned& deliveredCount);
    template <class T>
    bool SampleKeptPoints(std::vector<T>& store, const T*& delivered, unsigned& deliveredCount);
    template <class T>
    void ReadPoints(std::vector<T>& store);
    void ReadScan();
    void StartLines(std::uint64_t offset);
    void FreePointArrays();
    void FreeScanArrays();
    void RequireScans();

    // What the analysis found.
    ZonCloudAsciiLineFormat _format;
    std::uint64_t _dataStart = 0;
    char _decimalPoint = '.';
    bool _decimalPointSwitched = false;
    bool _delimitersFound = false;
    std::string _beginDelimiter;
    std::string _endDelimiter;
    int _scanDirection = 0;

    // The points of the counting pass in file order, in one of the two
    // precisions, and where delimiter lines restart the sampling runs.
    std::vector<float> _keptPoints;
    std::vector<double> _keptPointsDouble;
    bool _keeping = false;
    bool _keptAll = false;
    std::size_t _keepLimit = 0;
    std::vector<std::uint32_t> _runStarts;

    // The whole cloud as delivered (may point into the kept points).
    std::vector<float> _points;
    std::vector<double> _pointsDouble;
    const float* _deliveredPoints = nullptr;
    const double* _deliveredPointsDouble = nullptr;
    unsigned _deliveredCount = 0;
    unsigned _deliveredCountDouble = 0;

    // Scan iteration.
    int _scanIndex = -1;
    bool _setBegun = false;
    bool _setDelivered = false;
    bool _scanBegun = false;
    std::uint64_t _scanOffset = 0;
    std::vector<double> _scanPointsDouble;
    std::vector<float> _scanPoints;
    bool _scanHasFloats = false;

    // Pieces as a 512-character fgets buffer receives them: the layouts and
    // limits of this format count lines that way.
    ZonCloudLineSource _lines;
};
