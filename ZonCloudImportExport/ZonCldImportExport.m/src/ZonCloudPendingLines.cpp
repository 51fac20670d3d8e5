#include "ZonCloudPendingLines.h"

#include <utility>

#include "ZonCloudBlockWriter.h"

namespace {
constexpr std::size_t RecordsPerBlock = 8192;
// Enough blocks per batch to keep every worker busy.
constexpr std::size_t RecordsPerBatch = 16 * RecordsPerBlock;
}  // namespace

ZonCloudPendingLines::ZonCloudPendingLines(std::size_t recordSize, Format format)
    : _recordSize(recordSize), _format(std::move(format))
{
}

double* ZonCloudPendingLines::Add(ZonCloudOutputFile& file)
{
    if (_records.size() >= RecordsPerBatch * _recordSize) Flush(file);
    if (_records.empty()) _records.reserve(RecordsPerBatch * _recordSize);
    _records.resize(_records.size() + _recordSize);
    return _records.data() + _records.size() - _recordSize;
}

void ZonCloudPendingLines::Flush(ZonCloudOutputFile& file)
{
    const std::size_t count = _records.size() / _recordSize;
    if (count == 0) return;
    // Gone from here whatever happens: a failed write has removed the file.
    std::vector<double> records;
    records.swap(_records);
    ZonCloudBlockWriter::Write(file, count, RecordsPerBlock, [&](ZonCloudTextBuffer& text, std::size_t begin, std::size_t end) {
        for (std::size_t i = begin; i < end; ++i) _format(text, records.data() + i * _recordSize);
    });
    // The room is kept for the next batch.
    records.clear();
    _records.swap(records);
}
