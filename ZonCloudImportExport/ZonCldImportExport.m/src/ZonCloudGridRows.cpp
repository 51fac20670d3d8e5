#include "ZonCloudGridRows.h"

#include <algorithm>

#include "ZonCloudByteSource.h"
#include "ZonCloudOwnedArrays.h"
#include "ZonCloudWorkerPool.h"

namespace {
// File bytes per batch: enough to keep the cores busy for a while, few enough
// that a caller who copies the rows instead of taking them holds little more.
constexpr std::uint64_t BatchBytes = std::uint64_t{4} << 20;
// Below this a batch is filled on the calling thread: starting a worker
// would cost more than it saves.
constexpr std::uint64_t ParallelBytes = std::uint64_t{256} << 10;
}  // namespace

void ZonCloudGridRows::Clear()
{
    _batch.clear();
    _measured.clear();
    _first = 0;
    _delivered = 0;
    std::vector<unsigned char>().swap(_bytes);
}

const ZonCloudGridRow& ZonCloudGridRows::Get(ZonCloudByteSource& source, const Table& table, std::uint64_t row,
                                             const Fill& fill, std::uint64_t& measured)
{
    // A row whose arrays were taken over is built again if it is asked for again.
    if (row < _first || row - _first >= _batch.size() || !_batch[row - _first].IsWhole())
        Build(source, table, row, fill);
    _delivered = static_cast<std::size_t>(row - _first);
    measured = _measured[_delivered];
    return _batch[_delivered];
}

std::uint64_t ZonCloudGridRows::AppendAll(ZonCloudByteSource& source, const Table& table, const Fill& fill,
                                          std::vector<float>& cloud)
{
    ZonCloudGridRows rows;
    std::uint64_t measured = 0;
    for (std::uint64_t row = 0; row < table.rows; ++row) {
        std::uint64_t inRow = 0;
        rows.Get(source, table, row, fill, inRow).AppendValid(cloud);
        measured += inRow;
    }
    return measured;
}

void ZonCloudGridRows::Build(ZonCloudByteSource& source, const Table& table, std::uint64_t first, const Fill& fill)
{
    const std::uint64_t perBatch = std::max<std::uint64_t>(1, BatchBytes / std::max<std::uint64_t>(1, table.rowBytes));
    const std::uint64_t count = std::min(perBatch, table.rows - first);
    const std::uint64_t offset = table.offset + first * table.rowBytes;
    const std::uint64_t bytes = count * table.rowBytes;
    _first = first;
    // Rows kept from the batch before reuse their arrays (unless taken over).
    _batch.resize(static_cast<std::size_t>(count));
    _measured.assign(static_cast<std::size_t>(count), 0);

    const unsigned char* base = source.Map();
    const bool mapped = base != nullptr;
    if (mapped) {
        base += offset;
    } else {
        _bytes.resize(static_cast<std::size_t>(bytes));
        source.Seek(offset);
        source.Read(_bytes.data(), _bytes.size());
        base = _bytes.data();
    }
    ZonCloudWorkerPool::Run(
        static_cast<std::size_t>(count),
        [&](std::size_t i) { _measured[i] = fill(first + i, base + i * table.rowBytes, _batch[i]); },
        bytes < ParallelBytes ? 1 : 0);
    // The mapped rows are read: they count as read and need not stay resident.
    if (mapped) source.Unneeded(offset, bytes);
}

void ZonCloudGridRows::ListOwnedArrays(ZonCloudOwnedArrays& arrays)
{
    if (_delivered < _batch.size()) _batch[_delivered].ListArrays(arrays);
}
