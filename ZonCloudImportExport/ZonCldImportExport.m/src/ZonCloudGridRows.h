#pragma once
#include <cstddef>
#include <cstdint>
#include <functional>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudGridRow.h"

class ZonCloudByteSource;
class ZonCloudOwnedArrays;

// The rows of a grid stored as a table of fixed-size rows (row j's bytes at
// offset + j * rowBytes), built ahead a batch at a time on the workers. The
// rows of a batch are independent, so they are filled (and their fresh pages
// faulted in) on all cores, and each keeps arrays of its own that an importer
// may take over instead of copying them.
class ZON_CLD_API ZonCloudGridRows {
public:
    // Builds row `row` into `target` (Start included) from the row's bytes and
    // answers the number of its measured nodes. It runs on worker threads:
    // it may read the reader's state but change nothing but `target`.
    using Fill = std::function<std::uint64_t(std::uint64_t row, const unsigned char* bytes, ZonCloudGridRow& target)>;

    struct Table {
        std::uint64_t offset = 0;    // of row 0
        std::uint64_t rowBytes = 0;  // from one row to the next
        std::uint64_t rows = 0;
    };

    // Forgets every built row: a walk starts again, or the sampling changed.
    void Clear();
    // Row `row` of the table, built with the batch that starts at it when it
    // is not built yet; `measured` receives what Fill answered for it. The
    // table must lie within the source (the reader checks it with Fits).
    const ZonCloudGridRow& Get(ZonCloudByteSource& source, const Table& table, std::uint64_t row, const Fill& fill,
                               std::uint64_t& measured);
    // Appends the valid points of every row of the table to `cloud`, built in
    // batches of their own (a walk's rows stay as they were); answers the
    // measured nodes of all rows.
    static std::uint64_t AppendAll(ZonCloudByteSource& source, const Table& table, const Fill& fill,
                                   std::vector<float>& cloud);
    // The arrays of the row Get gave last, for the reader's hand-over (an
    // importer takes a row when it gets it).
    void ListOwnedArrays(ZonCloudOwnedArrays& arrays);

private:
    void Build(ZonCloudByteSource& source, const Table& table, std::uint64_t first, const Fill& fill);

    std::vector<ZonCloudGridRow> _batch;
    std::vector<std::uint64_t> _measured;
    std::uint64_t _first = 0;
    std::size_t _delivered = 0;  // in the batch
    std::vector<unsigned char> _bytes;  // a batch's bytes when the source cannot be mapped
};
