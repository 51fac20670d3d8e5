#pragma once
#include <cstdint>
#include <vector>

#include "ZonCloudGridCursor.h"
#include "ZonCloudGridRow.h"
#include "ZonCloudGridRows.h"
#include "ZonCloudReadFile.h"
#include "ZonTieCloudReadFile.h"

// The base of a reader whose file is one grid stored as a table of
// fixed-size rows: the grid walk (rows built a batch at a time on the
// workers, each taken over by an importer), the cloud of the measured nodes,
// both sampled along each row, and the resets a new sampling needs. A format
// gives its analysis, which ends with SetTable, and the fill of one row.
class ZON_CLD_API ZonCloudReadRowTable : public ZonCloudReadFile,
                                         public ZonTieCloudReadGridFile<ZonCloudReadRowTable> {
public:
    explicit ZonCloudReadRowTable(const ZonUnicodeString& fileName);

    // ZonICloudReadFile: the measured nodes, sampled along each row as the rows are.
    void SetSamplingPercent(float percent) override;
    const float* GetPoints(unsigned& count) override;

    // ZonICloudReadGridFile: one grid of the table's rows.
    void BeginGetGrid() override;
    bool NextGrid() override;
    void BeginGetGridPoints() override;
    const float* GetGridPoints(unsigned& count, const unsigned char*& valid) override;
    using ZonCloudReadFile::GetGridPointsInBox;
    using ZonCloudReadFile::GetGridPointsInBoxDouble;

    unsigned GetNumberOfRows();
    unsigned GetNumberOfColumns();

protected:
    // Forgets what was read; the analysis calls it first.
    void ResetRows();
    // The analysis found the table (checked against the file with Fits) and
    // the columns of a row.
    void SetTable(const ZonCloudGridRows::Table& table, std::uint64_t columns);
    std::uint64_t Rows() const { return _table.rows; }
    std::uint64_t Columns() const { return _columns; }

    // Fills `target` with row `row` (from 0) from its bytes, Start included;
    // answers its measured nodes, sampled or not. Runs on worker threads: it
    // changes nothing but `target`.
    virtual std::uint64_t FillRow(std::uint64_t row, const unsigned char* bytes, ZonCloudGridRow& target) const = 0;
    // Called once the whole file has been read (the cloud, or a grid walk to
    // its last row) with the measured nodes of every row.
    virtual void WholeFileRead(std::uint64_t measured, bool asCloud);

    void ListOwnedArrays(ZonCloudOwnedArrays& arrays) override;

private:
    void RequireGrid();

    ZonCloudGridRows::Table _table;
    std::uint64_t _columns = 0;
    ZonCloudGridCursor _cursor;
    ZonCloudGridRows _gridRows;
    const ZonCloudGridRows::Fill _fill;  // FillRow
    std::uint64_t _measuredInWalk = 0;   // measured nodes of the rows given in this walk
    std::vector<float> _cloud;
    bool _cloudRead = false;
};
