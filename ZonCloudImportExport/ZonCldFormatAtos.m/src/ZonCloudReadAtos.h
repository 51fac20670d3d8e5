#pragma once
#include <cstdint>
#include <vector>

#include "ZonCloudGridCursor.h"
#include "ZonCloudGridRow.h"
#include "ZonCloudLineSource.h"
#include "ZonCloudReadFile.h"
#include "ZonICloudReadOptQuality.h"
#include "ZonTieCloudReadFile.h"

// Measurement files of a fringe-projection scanner, binary ("%ATOSBIN") or
// text. Each point carries the camera pixel at which it was seen and a
// quality, so the file is a set of grids: one per measured patch, the grid
// column and row being the pixel column and row divided by the raster steps.
// A point whose quality is not above the minimum is a hole.
//
// The analysis reads every record once (extents, box, qualities) and, in the
// binary form, remembers for each grid row the offsets of its first and last
// record, so that a row is read back from just that span. Nothing of the file
// is kept in memory but that index and the row being delivered.
class ZonCloudReadAtos : public ZonCloudReadFile,
                         public ZonTieCloudReadGridFile<ZonCloudReadAtos>,
                         public ZonICloudReadOptQuality {
public:
    explicit ZonCloudReadAtos(const ZonUnicodeString& fileName);

    // ZonICloudReadFile: the valid points of every grid, as rows deliver them.
    void SetSamplingPercent(float percent) override;
    const float* GetPoints(unsigned& count) override;

    // ZonICloudReadGridFile
    void BeginGetGrid() override;
    bool NextGrid() override;
    void BeginGetGridPoints() override;
    const float* GetGridPoints(unsigned& count, const unsigned char*& valid) override;
    using ZonCloudReadFile::GetGridPointsInBox;
    using ZonCloudReadFile::GetGridPointsInBoxDouble;

    // ZonICloudReadOptQuality
    void SetMinPointQuality(float quality) override;
    void GetMinPointQuality(float& quality) override { quality = _minQuality; }
    void GetQualityRange(double& least, double& greatest) override;

    // Makes grid n (from 1) the current one, its rows starting again; raises
    // "ERR_GridNumberIsInvalid" outside 1 ... number of grids.
    void SelectGrid(int n);
    int GetNumberOfGrids();
    // Rows and columns of grid n (from 1), before sampling.
    void GetGridSize(int n, int& rows, int& columns);
    bool IsBinary();
    // Whether the text form had to be read again with '.' as decimal point.
    bool IsDecimalPointSwitched() const { return _decimalPointSwitched; }
    // The decimal point the process locale would give (a test hook: the
    // locale itself is never read again nor changed).
    void SetNativeDecimalPoint(char point) { _nativePoint = point; }

protected:
    void AnalyseFile() override;

private:
    struct RowSpan {
        std::uint64_t first = UINT64_MAX;  // offset of the row's first record
        std::uint64_t last = 0;            // and of its last
        std::uint64_t records = 0;
    };
    struct Grid {
        std::int64_t minColumn = INT64_MAX, maxColumn = INT64_MIN;
        std::int64_t minRow = INT64_MAX, maxRow = INT64_MIN;
        std::uint32_t stepX = 1, stepY = 1;
        std::uint64_t start = 0;    // first record, or first data line
        std::uint64_t records = 0;  // point records (binary) or point lines (text)
        std::vector<RowSpan> rows;  // binary: by grid row from minRow
        // Binary patches whose rows are not stored one after the other (the
        // spans of the rows overlap): the records of each row, in file order,
        // so that a row never reads the records of others.
        std::vector<std::uint32_t> order;
        std::vector<std::uint64_t> rowStart;  // into order, one per row and one past the last
        std::uint64_t Rows() const { return maxRow < minRow ? 0 : static_cast<std::uint64_t>(maxRow - minRow) + 1; }
        std::uint64_t Columns() const
        {
            return maxColumn < minColumn ? 0 : static_cast<std::uint64_t>(maxColumn - minColumn) + 1;
        }
    };
    // One record of either form, with its grid position.
    struct Record {
        double x, y, z, quality;
        std::int64_t column, row;  // grid column and row
    };

    void ResetAnalysis();
    void AnalyseBinary();
    bool AnalyseText(char decimalPoint);  // false: too many unknown lines
    void Count(Grid& grid, const Record& record);
    bool IsValid(double quality) const { return quality > static_cast<double>(_minQuality); }

    // Fills `row` with row `index` (from 0) of grid `grid`; the text form
    // reads on from `resume` and leaves there where the next row starts.
    void ReadRow(std::size_t grid, std::uint64_t index, ZonCloudGridRow& row, std::uint64_t& resume);
    void ReadBinaryRow(const Grid& grid, std::int64_t gridRow, ZonCloudGridRow& row);
    void IndexUnorderedRows(Grid& grid);
    void ReadTextRow(const Grid& grid, std::int64_t gridRow, ZonCloudGridRow& row, std::uint64_t& resume);
    void Place(const Grid& grid, const Record& record, ZonCloudGridRow& row) const;
    // Calls visit(offset, bytes) for `count` records of _recordSize bytes
    // from `offset`, reading them in large blocks.
    template <class Visit>
    void ForEachRecord(std::uint64_t offset, std::uint64_t count, Visit visit);
    Record Decode(const unsigned char* bytes, const Grid& grid) const;
    bool ParsePoint(const char* first, const char* last, const Grid& grid, Record& record) const;
    void PrepareGrid(std::size_t index);

    std::vector<Grid> _grids;
    bool _binary = false;
    std::uint32_t _recordSize = 0;
    float _minQuality = 0.0f;
    double _leastQuality = 0.0, _greatestQuality = 0.0;
    bool _qualitySeen = false;
    float _low[3] = {}, _high[3] = {};  // box of the valid points while counting
    char _nativePoint;
    char _decimalPoint = '.';
    bool _decimalPointSwitched = false;

    ZonCloudGridCursor _cursor;
    ZonCloudGridRow _row;
    std::uint64_t _textResume = 0;  // text form: where the next row's lines start
    std::vector<unsigned char> _buffer;
    ZonCloudLineSource _lines;

    std::vector<float> _cloud;
    bool _cloudRead = false;
};
