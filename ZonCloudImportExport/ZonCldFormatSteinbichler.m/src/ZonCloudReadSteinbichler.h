#pragma once
#include <cstdint>
#include <vector>

#include "ZonCloudGridCursor.h"
#include "ZonCloudGridRow.h"
#include "ZonCloudLineSource.h"
#include "ZonCloudReadFile.h"
#include "ZonCloudSampler.h"
#include "ZonTieCloudReadFile.h"

// Point files of a fringe-projection scanner: after a byte-order mark, a
// linked list of subsets, each a block of keyword lines followed by binary
// point records and, optionally, a scan table or a pixel table. The first
// subset decides what the file is: scans (a scan table), grids (a pixel
// table) or a plain cloud; every other subset must be of the same kind.
//
// Each subset is one set of scans or one grid. Coordinates are delivered as
// stored; the placement and orientation of each subset are kept for the
// caller (GetSubsets).
class ZonCloudReadSteinbichler : public ZonCloudReadFile,
                                 public ZonTieCloudReadScanFile<ZonCloudReadSteinbichler>,
                                 public ZonTieCloudReadGridFile<ZonCloudReadSteinbichler> {
public:
    // How reals in the headers are read: undecided until a value with a
    // fractional part settles between the process locale's decimal point and
    // the "C" one.
    enum class Separator { Undecided, Native, C };

    struct ScanEntry {
        std::uint32_t first = 0, count = 0;  // point indices within the subset
    };
    // One row of a pixel table: consecutive table entries of the same row.
    struct PixelRow {
        std::uint64_t entry = 0, entries = 0;  // first table entry and their number
        std::uint64_t record = 0, records = 0; // first point record and their number (one per column present)
    };
    struct Subset {
        std::uint64_t header = 0;     // offset of the keyword lines
        std::uint64_t points = 0;     // NUMBER_OF_POINTS
        std::uint64_t firstDataByte = 0;
        bool hasFirstDataByte = false;
        bool integer = false;         // DATA_TYPE INTEGER: thousandths
        double bounds[6] = {};        // MINIMUM_X, MAXIMUM_X, ... MAXIMUM_Z
        unsigned boundsGiven = 0;     // one bit per bound
        bool hasBox = false;          // all six were given
        ZonMathBox box;               // widened header box, or the box of the points
        double placement[3][4] = {};  // TRANSFORMATION_ROW1 to 3
        unsigned placementRows = 0;
        bool hasPlacement = false;
        double orientation[4] = {};
        bool hasOrientation = false;
        std::uint64_t scans = 0, scanTable = 0;
        bool hasScans = false, hasScanTable = false;
        std::uint64_t maxX = 0, maxY = 0, pixelTable = 0;
        bool hasMaxX = false, hasMaxY = false, hasPixelTable = false;
        double rasterX = 0.0, rasterY = 0.0;
        bool hasRasterX = false, hasRasterY = false;
        std::uint64_t next = 0;  // NEXT_SUBSET

        bool IsScanned() const { return hasScans && hasScanTable; }
        bool IsGridded() const { return hasMaxX && hasMaxY && hasPixelTable; }
        std::vector<ScanEntry> scanEntries;
        std::vector<PixelRow> pixelRows;
    };

    explicit ZonCloudReadSteinbichler(const ZonUnicodeString& fileName);

    // ZonICloudReadFile
    void SetSamplingPercent(float percent) override;
    const float* GetPoints(unsigned& count) override;

    // ZonICloudReadScanFile: one set of scans per subset, one scan per entry of its table.
    void BeginGetSetOfScans() override;
    bool NextSetOfScans() override;
    void BeginGetScan() override;
    bool NextScan() override;
    const float* GetScanPoints(unsigned& count) override;
    using ZonCloudReadFile::GetScanPointsInBox;
    using ZonCloudReadFile::GetScanPointsInBoxDouble;

    // ZonICloudReadGridFile: one grid per subset, PIXEL_TABLE_MAX_Y rows of
    // PIXEL_TABLE_MAX_X slots each.
    void BeginGetGrid() override;
    bool NextGrid() override;
    void BeginGetGridPoints() override;
    const float* GetGridPoints(unsigned& count, const unsigned char*& valid) override;
    using ZonCloudReadFile::GetGridPointsInBox;
    using ZonCloudReadFile::GetGridPointsInBoxDouble;

    const std::vector<Subset>& GetSubsets();
    Separator GetSeparator() const { return _separator; }
    // The decimal point the process locale would give (a test hook: the
    // locale itself is never read again nor changed).
    void SetNativeDecimalPoint(char point) { _nativePoint = point; }

protected:
    void AnalyseFile() override;

private:
    void ReadHeader(Subset& subset);
    void ReadReals(const char* first, const char* last, double* values, int count);
    std::uint64_t ReadCount(const char* first, const char* last) const;
    void CheckTables(Subset& subset);
    void BoxOfPoints(Subset& subset);

    // Calls visit(x, y, z) for `count` records of the subset from record `index`.
    template <class Visit>
    void ForEachPoint(const Subset& subset, std::uint64_t index, std::uint64_t count, Visit visit);
    // Marks in _present the columns that a pixel row lists.
    void MarkColumns(const Subset& subset, const PixelRow& row);
    void FillRow(const Subset& subset, std::uint64_t rowIndex);
    void RequireType(int type, const char* code);

    std::vector<Subset> _subsets;
    Separator _separator = Separator::Undecided;
    char _nativePoint;
    ZonCloudLineSource _lines;
    std::vector<unsigned char> _buffer;
    std::vector<unsigned char> _present;  // columns present in the row being read

    // Scans
    bool _setsBegun = false, _scansBegun = false, _hasSet = false, _hasScan = false;
    std::size_t _nextSet = 0, _set = 0, _nextScan = 0, _scan = 0;
    std::vector<float> _scanPoints;

    // Grids
    ZonCloudGridCursor _cursor;
    ZonCloudGridRow _row;

    std::vector<float> _cloud;
    bool _cloudRead = false;
};
